// Links: who uses them, and their end.
#include "sessions/link.h"

#include <utility>

#include "handles/errors.h"
#include "handles/object.h"

std::shared_ptr<Link> LinkShare::Share() const {
    const std::lock_guard lock(mutex_);
    return link_;
}

std::shared_ptr<std::recursive_mutex> LinkShare::Serial() const {
    const std::shared_ptr<Link> link = Share();
    return link ? link->Serial() : nullptr;
}

std::shared_ptr<Link> LinkShare::Set(std::shared_ptr<Link> link) noexcept {
    const std::lock_guard lock(mutex_);
    return std::exchange(link_, std::move(link));
}

LinkUser::~LinkUser() { Use(nullptr); }

// The share changes last: whoever destroys the user waits for the lock of the link that it shows.
void LinkUser::Use(std::shared_ptr<Link> link) noexcept {
    if (link == UsedLink()) return;
    if (UsedLink()) UsedLink()->Remove(*this);
    if (link) link->Add(*this);
    link_.Set(std::move(link));
}

Link::Link(bool threaded)
    : lobs(std::make_shared<values::LobSession>()),
      stop_(std::make_shared<engine::StopRequest>()),
      serial_(threaded ? std::make_shared<std::recursive_mutex>() : nullptr) {
    lobs->serial = serial_;
}

void Link::Open(Connected connected) noexcept {
    database_ = std::move(connected.database);
    user = std::move(connected.user);
    place_ = std::move(connected.place);
    statement_cache = std::move(connected.statement_cache);
    const std::lock_guard lock(cancel_mutex_);
    connection_ = std::move(connected.connection);
    connection_->Obey(stop_);
    lobs->store = connection_->Lobs();
}

Link::~Link() { Close(); }

void Link::Add(LinkUser& user) noexcept {
    const std::lock_guard lock(users_mutex_);
    user.next_ = first_user_;
    if (first_user_) first_user_->previous_ = &user;
    first_user_ = &user;
}

void Link::Remove(LinkUser& user) noexcept {
    const std::lock_guard lock(users_mutex_);
    if (user.previous_) user.previous_->next_ = user.next_;
    else if (first_user_ == &user) first_user_ = user.next_;
    if (user.next_) user.next_->previous_ = user.previous_;
    user.previous_ = user.next_ = nullptr;
}

LinkUser* Link::AnyUser() noexcept {
    const std::lock_guard lock(users_mutex_);
    return first_user_;
}

void Link::Cancel() noexcept {
    const std::lock_guard lock(cancel_mutex_);
    stop_->Ask();
    if (connection_) connection_->Interrupt();
}

void Link::Answered(const Status& status) noexcept {
    if (status.Number() == errors::kCancelled) (void)stop_->Take();
}

namespace {

// Answers whether there were any.
bool CloseOpened(values::LobSession& lobs) noexcept {
    return std::erase_if(lobs.opened, [](const auto& opened) { return !opened.lob->IsTemporary(); }) > 0;
}

}  // namespace

Status Link::CheckBranch(bool ends_transaction) {
    if (!branch) return {};
    return ends_transaction ? Error(errors::kEndsInBranch) : branch->Check(connection_->InTransaction());
}

Status Link::Commit() {
    if (branch) return Error(errors::kEndsInBranch);
    Status status = connection_->Commit();
    local_started = local_started && connection_->InTransaction();
    const bool ended = !connection_->InTransaction();
    return ended && CloseOpened(*lobs) && status.Ok() ? Warning(errors::kOpenLobsWarning) : status;
}

Status Link::Rollback() {
    if (branch) return Error(errors::kEndsInBranch);
    local_started = false;
    Status status = connection_->Rollback();
    if (!connection_->InTransaction()) CloseOpened(*lobs);
    return status;
}

void Link::DropUsers(void (LinkUser::*told)() noexcept) noexcept {
    while (LinkUser* user = AnyUser()) {
        (user->*told)();
        user->Use(nullptr);
    }
}

std::unique_ptr<engine::Connection> Link::Exchange(std::unique_ptr<engine::Connection> next) noexcept {
    DropUsers(&LinkUser::ConnectionChanged);
    statement_cache.reset();
    next->Obey(stop_);
    next->PreferSchemaOf(connection_.get());
    const std::lock_guard lock(cancel_mutex_);
    connection_.swap(next);
    lobs->store = connection_->Lobs();
    lobs->stream = nullptr;
    CloseOpened(*lobs);
    return next;
}

void Link::Close() noexcept {
    const SerialLock serial(serial_);    // calls on statements of the link may be running
    const Connected gone = TakeApart();
}

void Link::GiveBack(GivingBack how) noexcept {
    const SerialLock serial(serial_);
    Connected connected = TakeApart();
    if (connected.connection) connected.connection->PreferSchemaOf(nullptr);    // the next session has asked for none
    if (LinkPlace* place = connected.place.get()) place->TakeBack(std::move(connected), std::move(how));
}

// What goes does so in the hands of the caller, after the lock.
Connected Link::TakeApart() noexcept {
    DropUsers(&LinkUser::LinkClosed);
    branch.reset();
    spare.reset();
    lobs->store = nullptr;
    lobs->opened.clear();
    lobs->buffered.clear();
    lobs->stream = nullptr;
    const std::lock_guard lock(cancel_mutex_);
    return {database_, user, std::move(place_), std::move(connection_), std::move(statement_cache)};
}
