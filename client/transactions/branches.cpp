// Finding, waiting for and expiring branches.
#include "transactions/branches.h"

#include <algorithm>

#include "handles/errors.h"
#include "transactions/xid.h"

namespace transactions {

std::string IdentityOf(const engine::Database& database) {
    std::string identity = database.Identity();
    if (identity.empty()) identity = "@" + std::to_string(reinterpret_cast<std::uintptr_t>(&database));
    return identity;
}

Branches& Branches::Process() {
    static Branches branches;
    return branches;
}

Branches::~Branches() {
    const std::lock_guard lock(mutex_);
    watcher_.request_stop();
    changed_.notify_all();
}

BranchPointer Branches::Find(const BranchKey& key) const {
    const auto found = std::ranges::find_if(branches_, [&key](const BranchPointer& branch) {
        return branch->database == key.database && branch->xid == key.xid;
    });
    return found == branches_.end() ? nullptr : *found;
}

Status Branches::Create(const BranchKey& key, const std::string& user, Coupling coupling,
                        std::chrono::seconds timeout, BranchPointer& held) {
    auto work = std::make_shared<Work>();
    auto branch = std::make_shared<Branch>(Branch{key.database, key.xid, user, coupling, timeout, work});
    const std::lock_guard lock(mutex_);
    if (Find(key)) return Error(errors::kDuplicateXid);
    for (const BranchPointer& other : branches_) {
        if (other->database != key.database || !SameTransaction(other->xid, key.xid)) continue;
        if (other->coupling != coupling) return Error(errors::kMixedCoupling);
        if (coupling == Coupling::tight && other->rest != Rest::prepared) branch->work = other->work;
    }
    if (branch->work->held) return Error(errors::kAttachedElsewhere);
    branches_.push_back(branch);
    if (branch->work != work) ++branch->work->branches;
    branch->work->held = true;
    branch->work->holder = std::this_thread::get_id();
    held = std::move(branch);
    return {};
}

Status Branches::Hold(const BranchKey& key, Clock::duration wait, BranchPointer& held) {
    const auto until = Clock::now() + wait;
    std::unique_lock lock(mutex_);
    for (;;) {
        BranchPointer branch = Find(key);
        if (!branch) return Error(errors::kNoSuchTransaction);
        if (!branch->work->held) {
            branch->work->held = true;
            branch->work->holder = std::this_thread::get_id();
            branch->deadline.reset();
            held = std::move(branch);
            return {};
        }
        const bool waits = branch->work->holder != std::this_thread::get_id() && wait.count() > 0;
        if (!waits || (changed_.wait_until(lock, until) == std::cv_status::timeout && branch->work->held))
            return Error(errors::kAttachedElsewhere);
    }
}

void Branches::StartClock(Branch& branch) {
    if (branch.timeout.count() == 0 || branch.rest == Rest::prepared || branch.work->doom != 0) return;
    branch.deadline = Clock::now() + branch.timeout;
    if (!watcher_.joinable()) watcher_ = std::jthread([this](const std::stop_token& stop) { Watch(stop); });
}

void Branches::Release(const BranchPointer& held, Rest rest) noexcept {
    const std::lock_guard lock(mutex_);
    held->rest = rest;
    held->work->held = false;
    try {
        StartClock(*held);
    } catch (...) {    // without a thread it rests for ever
    }
    changed_.notify_all();
}

void Branches::Remove(const BranchPointer& held, int doom_of_others) noexcept {
    const std::lock_guard lock(mutex_);
    branches_.remove(held);
    held->work->held = false;
    --held->work->branches;
    if (doom_of_others != 0) held->work->doom = doom_of_others;
    changed_.notify_all();
}

bool Branches::AnySuspendedBy(const void* who) const {
    const std::lock_guard lock(mutex_);
    return std::ranges::any_of(branches_, [who](const BranchPointer& branch) {
        return !branch->work->held && branch->rest == Rest::suspended && branch->suspended_by == who;
    });
}

std::vector<engine::Xid> Branches::Prepared(const std::string& database) const {
    const std::lock_guard lock(mutex_);
    std::vector<engine::Xid> prepared;
    for (const BranchPointer& branch : branches_)
        if (branch->database == database && branch->rest == Rest::prepared) prepared.push_back(branch->xid);
    return prepared;
}

// ---- Time

Clock::time_point Branches::Expire(std::vector<std::unique_ptr<engine::Connection>>& ended) {
    const auto now = Clock::now();
    auto next = now + std::chrono::hours(1);
    for (const BranchPointer& branch : branches_) {
        if (!branch->deadline) continue;
        if (*branch->deadline > now || branch->work->held) {    // coupled with one that works: its time comes
            next = std::min(next, std::max(*branch->deadline, now + std::chrono::milliseconds(100)));
            continue;
        }
        branch->deadline.reset();
        branch->work->doom = errors::kLockTimedOut;
        ended.push_back(std::move(branch->work->connection));
    }
    return next;
}

void Branches::Watch(const std::stop_token& stop) {
    std::unique_lock lock(mutex_);
    while (!stop.stop_requested()) {
        std::vector<std::unique_ptr<engine::Connection>> ended;
        const auto next = Expire(ended);
        if (!ended.empty()) {
            lock.unlock();
            ended.clear();    // rolls back
            lock.lock();
            changed_.notify_all();
            continue;
        }
        changed_.wait_until(lock, next);
    }
}

}  // namespace transactions
