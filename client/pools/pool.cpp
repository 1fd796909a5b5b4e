// Pools: taking, coming back, waiting, and the end.
#include "pools/pool.h"

#include <algorithm>
#include <utility>

#include "handles/errors.h"
#include "handles/object.h"
#include "oci.h"
#include "sessions/session.h"

using Clock = std::chrono::steady_clock;

// ---- Places

PoolPlace::PoolPlace(std::shared_ptr<Pool> pool, engine::Credentials credentials)
    : pool_(std::move(pool)), credentials_(std::move(credentials)) {
    node_.emplace_back();
}

PoolPlace::~PoolPlace() {
    const Pool::Lock lock(pool_->mutex_);
    if (!busy_) return;
    pool_->Exit(*this);
    pool_->WakeNext();
}

bool PoolPlace::Serve(Session& session, const std::shared_ptr<Link>& link) noexcept {
    const Pool::Lock lock(pool_->mutex_);
    if (pool_->stopped_) return false;
    session_ = &session;
    link_ = link;
    return true;
}

// The pool may go with the last of its places: who locks it holds it.
void PoolPlace::TakeBack(Connected connected, GivingBack how) noexcept {
    const std::shared_ptr<Pool> pool = pool_;
    Pool::RestingList node = std::move(node_), gone;
    if (how.tag) tag_ = std::move(*how.tag);
    used_ = true;
    bool keep = !how.drop && !connected.connection->Broken();
    node.front() = {std::move(connected), Clock::now()};
    const Pool::Lock lock(pool->mutex_);
    pool->Exit(*this);
    keep = keep && !pool->stopped_ && pool->Total() < pool->size_.most;
    Pool::RestingList& to = keep ? pool->resting_ : gone;
    to.splice(to.end(), node);
    pool->TakeExpired(gone);
    pool->WakeNext();
}

// ---- Counting

Pool::Pool(PoolPlan plan, PoolSize size, std::shared_ptr<const PoolSettings> settings)
    : plan_(std::move(plan)), settings_(std::move(settings)), size_(size) {}

std::uint32_t Pool::Total() const { return static_cast<std::uint32_t>(resting_.size()) + busy_ + opening_; }

void Pool::Enter(PoolPlace& place) noexcept {
    ++busy_;
    place.busy_ = true;
    place.previous_ = nullptr;
    place.next_ = first_busy_;
    if (first_busy_) first_busy_->previous_ = &place;
    first_busy_ = &place;
}

void Pool::Exit(PoolPlace& place) noexcept {
    --busy_;
    place.busy_ = false;
    place.session_ = nullptr;
    if (place.previous_) place.previous_->next_ = place.next_;
    else first_busy_ = place.next_;
    if (place.next_) place.next_->previous_ = place.previous_;
}

// What has rested too long, as far as more than the least are there. Nobody watches the clock: it is looked at when
// something else happens.
void Pool::TakeExpired(RestingList& expired) noexcept {
    const std::chrono::seconds most(settings_->idle_seconds.load(std::memory_order_relaxed));
    if (most.count() == 0) return;
    const Clock::time_point now = Clock::now();
    while (!resting_.empty() && Total() > size_.least && now - resting_.front().since >= most)
        expired.splice(expired.end(), resting_, resting_.begin());
}

Pool::Counts Pool::Count() noexcept {
    RestingList expired;
    const Lock lock(mutex_);
    TakeExpired(expired);
    return {static_cast<std::uint32_t>(resting_.size()) + busy_, busy_, size_};
}

void Pool::Resize(const PoolSize& size) noexcept {
    RestingList surplus;
    const Lock lock(mutex_);
    size_ = size;
    while (!resting_.empty() && Total() > size_.most) surplus.splice(surplus.end(), resting_, resting_.begin());
    WakeNext();
}

// ---- Opening

// Places promised under the lock to connections that are opened without it. What is not used is given back.
class Pool::Opening {
public:
    Opening(Pool& pool, std::uint32_t count) : pool_(pool), count_(count) {}
    ~Opening() {
        if (count_ == 0) return;
        const Lock lock(pool_.mutex_);
        pool_.opening_ -= count_;
        pool_.WakeNext();
    }
    Opening(const Opening&) = delete;
    Opening& operator=(const Opening&) = delete;

    [[nodiscard]] std::uint32_t Left() const { return count_; }

    // The connection is in use; or it rests, where `rests` is its node. False when the pool has gone.
    bool Admit(PoolPlace& place, RestingList* rests) noexcept {
        const Lock lock(pool_.mutex_);
        if (pool_.stopped_) return false;
        --count_;
        --pool_.opening_;
        if (rests) pool_.resting_.splice(pool_.resting_.begin(), *rests);
        else pool_.Enter(place);
        pool_.WakeNext();
        return true;
    }

    // Opens the rest, to rest; an error ends it.
    Status OpenAll() {
        while (count_ > 0) {
            Connected connected;
            if (Status status = pool_.Connect(pool_.plan_.own, connected); status.Failed()) return status;
            PoolPlace& place = PlaceOf(connected);
            RestingList node = std::move(place.node_);
            node.front() = {std::move(connected), Clock::now()};
            if (!Admit(place, &node)) return Error(pool_.plan_.gone);
        }
        return {};
    }

private:
    Pool& pool_;
    std::uint32_t count_;
};

Status Pool::Connect(const engine::Credentials& credentials, Connected& connected) {
    connected.database = plan_.database;
    connected.place = std::make_unique<PoolPlace>(shared_from_this(), credentials);
    if (!credentials.external) connected.user = credentials.user;
    return plan_.database->Connect(credentials, nullptr, connected.connection);
}

Status Pool::Fill() {
    std::uint32_t missing = 0;
    {
        const Lock lock(mutex_);
        if (!stopped_ && Total() < size_.least) missing = size_.least - Total();
        opening_ += missing;
    }
    Opening opening(*this, missing);
    const Status status = opening.OpenAll();
    if (!status.Failed()) return {};
    return opening.Left() < missing ? Warning(errors::kSomeSessionsStarted, status.Detail()) : status;
}

// ---- Taking

const engine::Credentials& Pool::WhoBegins(const engine::Credentials& named) const {
    return plan_.one_user ? plan_.own : named;
}

// Of those that the user may have, from the last one back: one of the tag, else one without a tag, else any, as far as
// the wish allows.
Pool::RestingList::iterator Pool::Choose(const engine::Credentials& credentials, const SessionWish& wish) {
    auto best = resting_.end();
    int best_rank = 0;
    for (auto at = resting_.end(); at != resting_.begin();) {
        --at;
        const PoolPlace& place = PlaceOf(at->connected);
        if (wish.fresh && place.used_) continue;
        if (!plan_.one_user && !(place.credentials_ == credentials)) continue;
        if (place.tag_ == wish.tag) return at;
        const int rank = place.tag_.empty() ? 2 : wish.any_tag ? 1 : 0;
        if (rank <= best_rank) continue;
        best = at;
        best_rank = rank;
    }
    return best;
}

// A resting connection, or places for connections to open: where all places are taken, that of one which rests and
// does not suit.
Status Pool::TakeOrReserve(const engine::Credentials& credentials, const SessionWish& wish, Connected& connected,
                           std::uint32_t& to_open) {
    RestingList taken, gone;
    Lock lock(mutex_);
    Status status = AwaitTurn(lock);
    if (status.Failed()) return status;
    TakeExpired(gone);
    const auto chosen = Choose(credentials, wish);
    if (chosen != resting_.end()) {
        taken.splice(taken.end(), resting_, chosen);
        PoolPlace& place = PlaceOf(taken.front().connected);
        Enter(place);
        connected = std::move(taken.front().connected);
        place.node_ = std::move(taken);
    } else {
        if (Total() >= size_.most && !resting_.empty()) gone.splice(gone.end(), resting_, resting_.begin());
        const std::uint32_t room = size_.most - std::min(size_.most, Total());
        const bool own = credentials == plan_.own;
        to_open = std::max(1U, own ? std::min(room, size_.step) : 1U);
        opening_ += to_open;
    }
    if (Total() > size_.most) status = Warning(errors::kPoolSizeExceeded);
    WakeNext();
    return status;
}

// One that the server has closed while it rested goes, and another is taken.
Status Pool::Take(const engine::Credentials& named, const SessionWish& wish, Connected& connected) {
    const engine::Credentials& credentials = WhoBegins(named);
    for (;;) {
        std::uint32_t to_open = 0;
        Connected taken;
        Status status = TakeOrReserve(credentials, wish, taken, to_open);
        if (status.Failed()) return status;
        if (to_open == 0) {
            if (taken.connection->Broken()) continue;
            connected = std::move(taken);
            return status;
        }
        Opening opening(*this, to_open);
        const Status opened = Connect(credentials, taken);
        if (opened.Failed()) return opened;
        if (!opening.Admit(PlaceOf(taken), nullptr)) return Error(plan_.gone);
        connected = std::move(taken);
        try {
            (void)opening.OpenAll();    // the rest of the step is for later callers: none of it is missed now
        } catch (...) {
        }
        return status;
    }
}

// ---- Waiting

Status Pool::AwaitTurn(Lock& lock) {
    if (stopped_) return Error(plan_.gone);
    const std::uint8_t mode = settings_->get_mode.load(std::memory_order_relaxed);
    const bool waits = plan_.may_wait && (mode == OCI_SPOOL_ATTRVAL_WAIT || mode == OCI_SPOOL_ATTRVAL_TIMEDWAIT);
    if (Available() && !(waits && first_waiter_)) return {};
    if (waits) return Wait(lock, mode == OCI_SPOOL_ATTRVAL_TIMEDWAIT);
    return mode == OCI_SPOOL_ATTRVAL_FORCEGET ? Status() : Error(plan_.none_left);
}

Status Pool::Wait(Lock& lock, bool timed) {
    Waiter me;
    (last_waiter_ ? last_waiter_->next : first_waiter_) = &me;
    last_waiter_ = &me;
    const auto until =
        Clock::now() + std::chrono::milliseconds(settings_->wait_milliseconds.load(std::memory_order_relaxed));
    const auto served = [&] { return stopped_ || (first_waiter_ == &me && Available()); };
    bool came = true;
    if (timed) came = me.turn.wait_until(lock, until, served);
    else me.turn.wait(lock, served);
    Leave(me);
    if (stopped_) return Error(plan_.gone);
    if (came) return {};
    WakeNext();    // who is first now may have been woken for nothing before
    return Error(errors::kGetTimedOut);
}

void Pool::Leave(Waiter& waiter) noexcept {
    Waiter* before = nullptr;
    for (Waiter* at = first_waiter_; at != &waiter; at = at->next) before = at;
    (before ? before->next : first_waiter_) = waiter.next;
    if (last_waiter_ == &waiter) last_waiter_ = before;
}

void Pool::WakeNext() noexcept {
    if (first_waiter_ && Available()) first_waiter_->turn.notify_one();
}

// ---- The end

void Pool::Stop() noexcept {
    const Lock lock(mutex_);
    StopAll();
}

void Pool::StopAll() noexcept {
    stopped_ = true;
    for (Waiter* waiter = first_waiter_; waiter; waiter = waiter->next) waiter->turn.notify_one();
}

bool Pool::StopUnlessUsed() noexcept {
    const Lock lock(mutex_);
    if (busy_ > 0 || opening_ > 0) return false;
    StopAll();
    return true;
}

void Pool::Close() noexcept {
    Stop();
    RestingList gone;
    const Lock lock(mutex_);
    gone.swap(resting_);
}

bool Pool::NextToDrop(Session*& session, std::shared_ptr<Link>& link) noexcept {
    const Lock lock(mutex_);
    for (const PoolPlace* place = first_busy_; place; place = place->next_) {
        session = place->session_;
        link = place->link_.lock();
        if (session && link) return true;
    }
    return false;
}

bool Pool::Serves(const Link& link) noexcept {
    const Lock lock(mutex_);
    for (const PoolPlace* place = first_busy_; place; place = place->next_)
        if (place->session_ && place->link_.lock().get() == &link) return true;
    return false;
}

// A session that another thread ends or frees does so under its link's lock.
void Pool::DropSessions() noexcept {
    Session* session = nullptr;
    std::shared_ptr<Link> link;
    while (NextToDrop(session, link)) {
        link->Cancel();
        const SerialLock serial(link->Serial());
        if (Serves(*link)) session->Drop();
    }
}
