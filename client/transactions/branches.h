// The branches of global transactions that the process knows: one list for all databases, call families and threads.
//
// A branch is at rest, or held: by a session that works in it, or by a call that is about to end it. Only who holds it
// touches what is in it; who wants it meanwhile waits. A branch at rest keeps its transaction open on a connection of
// its own, in its Work; branches that are tightly coupled share one Work, so that one of them at a time is held. One
// that rests longer than its timeout allows is rolled back.
#pragma once

#include <chrono>
#include <condition_variable>
#include <cstdint>
#include <list>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <thread>
#include <vector>

#include "engine/engine.h"
#include "handles/status.h"

namespace transactions {

using Clock = std::chrono::steady_clock;

enum class Coupling : std::uint8_t { tight, loose };

// The transaction behind a branch, or behind several.
struct Work {
    std::unique_ptr<engine::Connection> connection;    // at rest: where it is open; null when nothing was begun
    bool began = false;     // the engine's transaction was seen
    bool held = false;      // of the list, as is the next
    std::thread::id holder; // when held: who waits for himself need not
    std::uint32_t branches = 1;    // that are not finished
    // Why it is to be rolled back, which the next call answers: its work is lost, or was given up. 0: it is not.
    int doom = 0;
};

enum class Rest : std::uint8_t { idle, suspended, prepared };

struct Branch {
    const std::string database;    // Database::Identity
    const engine::Xid xid;
    const std::string user;
    const Coupling coupling;
    const std::chrono::seconds timeout;    // 0: it may rest for ever
    std::shared_ptr<Work> work;
    Rest rest = Rest::idle;                // changed by Release alone
    bool migrates = false;                 // suspended: any thread may take it up
    const void* suspended_by = nullptr;    // else who this stands for
    std::optional<Clock::time_point> deadline = {};    // of the list: at rest, when it is rolled back
};
using BranchPointer = std::shared_ptr<Branch>;

// What names a branch, and who asks.
struct BranchKey {
    std::string database;
    engine::Xid xid;
};

// What identifies the database for branches.
std::string IdentityOf(const engine::Database& database);

class Branches {
public:
    static Branches& Process();
    ~Branches();

    // A new branch, held. 24757 when there is one of the name, 24772 when the global transaction has branches that are
    // coupled otherwise, 25351 when one that it is coupled with is held.
    Status Create(const BranchKey& key, const std::string& user, Coupling coupling, std::chrono::seconds timeout,
                  BranchPointer& held);
    // Holds a branch, waiting for it at most so long: 24756 when there is none, 25351 when it stays held. The thread that
    // holds it does not wait.
    Status Hold(const BranchKey& key, Clock::duration wait, BranchPointer& held);
    // Lets a held branch rest; its time starts, unless it is prepared.
    void Release(const BranchPointer& held, Rest rest) noexcept;
    // Ends a held branch. Others that share its work, if any, are doomed with it unless the work goes on.
    void Remove(const BranchPointer& held, int doom_of_others) noexcept;

    [[nodiscard]] bool AnySuspendedBy(const void* who) const;
    // The prepared ones of a database, in the order of their beginning.
    [[nodiscard]] std::vector<engine::Xid> Prepared(const std::string& database) const;

private:
    [[nodiscard]] BranchPointer Find(const BranchKey& key) const;
    void StartClock(Branch& branch);
    void Watch(const std::stop_token& stop);
    // The transactions to end of branches whose time is over, and when to look again.
    Clock::time_point Expire(std::vector<std::unique_ptr<engine::Connection>>& ended);

    mutable std::mutex mutex_;    // of the list and of what is the list's in branches; no engine is called under it
    std::condition_variable changed_;
    std::list<BranchPointer> branches_;
    std::jthread watcher_;        // runs from the first timeout on; ends before the list goes
};

}  // namespace transactions
