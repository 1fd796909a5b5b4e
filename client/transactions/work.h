// What is done with a branch that is held: a session takes it up and leaves it, and it is prepared, committed and rolled
// back. One way for all engines: where prepared branches are not the engine's, the process holds their transactions
// open.
//
// Threads: the caller holds the serial lock of the link.
#pragma once

#include "sessions/link.h"
#include "transactions/branches.h"

namespace transactions {

// Who began the branch that a session works in: each family ends what it began.
enum class Family : std::uint8_t { calls, xa };

// The branch that a session works in, on its link. It is rolled back with the session's connection.
class WorkingBranch final : public LinkBranch {
public:
    WorkingBranch(BranchPointer branch, Family family) : branch_(std::move(branch)), family_(family) {}
    ~WorkingBranch() override;

    Status Check(bool in_transaction) override;
    [[nodiscard]] const BranchPointer& Get() const { return branch_; }
    [[nodiscard]] Family GetFamily() const { return family_; }
    void Set(BranchPointer branch) noexcept { branch_ = std::move(branch); }
    BranchPointer Take() noexcept { return std::move(branch_); }    // it goes on without the session

private:
    BranchPointer branch_;
    const Family family_;
};

// Null when the session works in none.
inline WorkingBranch* WorkingIn(const Link& link) { return static_cast<WorkingBranch*>(link.branch.get()); }

// A held branch, and whether it is the one that the link's session works in. One that is not rests again when this goes.
class Hold {
public:
    Hold(Link& its_link, BranchPointer held, bool is_working)
        : link(its_link), branch(std::move(held)), working(is_working) {}
    ~Hold() { if (!working && !over_) Branches::Process().Release(branch, branch->rest); }
    Hold(const Hold&) = delete;
    Hold& operator=(const Hold&) = delete;

    Link& link;
    const BranchPointer branch;
    const bool working;
    void Over() { over_ = true; }    // it is not held any more

private:
    bool over_ = false;
};

// The session, in no transaction of its own, begins a new branch, or takes a held one up.
struct NewBranch {
    engine::Xid xid;
    Coupling coupling;
    std::chrono::seconds timeout;
    engine::TransactionMode mode;
};
Status Begin(Link& link, const NewBranch& branch, Family family);
void TakeUp(Link& link, const BranchPointer& held, Family family);
// The session leaves the branch that it works in. On failure it still works in it: 24782 where the database has one
// connection. `doom`: why the branch that is left is to be rolled back, if it is.
Status Leave(Link& link, Rest rest, int* doom = nullptr);

// Each finishes the branch or lets it rest; only a failure that has changed nothing leaves a working one as it was. A
// branch that is doomed is rolled back, and why is the answer.
Status Prepare(Hold& hold);           // a warning, 24767, when there was nothing to commit: it is finished
Status CommitOnePhase(Hold& hold);
Status CommitPrepared(Hold& hold);
Status RollBack(Hold& hold);

// Branches that the list does not know, of engines that keep them: 24756 where there is none of the name.
Status CommitUnknown(Link& link, const engine::Xid& xid);
Status RollBackUnknown(Link& link, const engine::Xid& xid);
// All that are prepared in the link's database.
Status Recover(Link& link, std::vector<engine::Xid>& prepared);

}  // namespace transactions
