#include "statements/execute_locks.h"

#include <algorithm>
#include <utility>

#include "handles/environment.h"
#include "handles/in_flight.h"
#include "sessions/service_context.h"

namespace {

void WaitFor(std::recursive_mutex& mutex) {
    if (mutex.try_lock()) return;
    const LongCall wait;
    mutex.lock();
}

void GiveUp(std::recursive_mutex& mutex) noexcept {
    mutex.unlock();
    in_flight::GaveUpLock();
}

}  // namespace

ExecuteLocks::ExecuteLocks(ServiceContext& service, Statement& statement, const ExecuteArguments& arguments) {
    if (!statement.Env().Threaded() && !service.Env().Threaded()) {
        target_.status = service.Require(target_.link);
        return;
    }
    try {
        while (!Hold(service, statement, arguments)) {}
    } catch (...) {
        Unlock();
        throw;
    }
}

// False, with nothing held, when others are needed: something was moved to another link meanwhile, or a target's lock
// is among them.
bool ExecuteLocks::Hold(ServiceContext& service, Statement& statement, const ExecuteArguments& arguments) {
    service_ = service.Serial();
    statement_ = statement.Serial();
    if (statement_ == service_) statement_ = nullptr;
    Lock();
    std::vector<Mutex> targets = LocksOfTargets(statement, arguments);
    const Mutex own = statement.Serial();
    const bool statement_held = !own || own == service_ || own == statement_;
    target_.status = service.Require(target_.link);
    const bool link_held = !target_.link || !target_.link->Serial() || target_.link->Serial() == service_;
    if (statement_held && link_held && targets == targets_) return true;
    Unlock();
    targets_ = std::move(targets);
    return false;
}

std::vector<ExecuteLocks::Mutex> ExecuteLocks::LocksOfTargets(const Statement& statement,
                                                             const ExecuteArguments& arguments) const {
    std::vector<Statement*> statements;
    statement.CollectResultTargets(arguments, statements);
    std::vector<Mutex> locks;
    for (Statement* target : statements) {
        Mutex mutex = target->Serial();
        if (!mutex) mutex = target->LockAlone();    // whoever gives it a session's result first
        const bool held = mutex == service_ || mutex == statement_;
        if (!held && std::find(locks.begin(), locks.end(), mutex) == locks.end()) locks.push_back(std::move(mutex));
    }
    return locks;
}

void ExecuteLocks::Lock() {
    if (statement_ || !targets_.empty()) return LockAll();
    if (service_) WaitFor(*service_);
    held_ = true;
}

// Waits for one at a time, holding nothing, and tries the others then.
void ExecuteLocks::LockAll() {
    std::vector<std::recursive_mutex*> all;
    if (service_) all.push_back(service_.get());
    if (statement_) all.push_back(statement_.get());
    for (const Mutex& mutex : targets_) all.push_back(mutex.get());
    for (std::size_t waited_for = 0;;) {
        WaitFor(*all[waited_for]);
        std::size_t failed = 0;
        while (failed < all.size() && (failed == waited_for || all[failed]->try_lock())) ++failed;
        if (failed == all.size()) break;
        for (std::size_t index = 0; index < failed; ++index)
            if (index != waited_for) GiveUp(*all[index]);
        GiveUp(*all[waited_for]);
        waited_for = failed;
    }
    held_ = true;
}

void ExecuteLocks::Unlock() noexcept {
    if (!std::exchange(held_, false)) return;
    if (service_) GiveUp(*service_);
    if (statement_) GiveUp(*statement_);
    for (const Mutex& mutex : targets_) GiveUp(*mutex);
}
