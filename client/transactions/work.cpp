// Taking up and leaving, and both phases.
#include "transactions/work.h"

#include <utility>

#include "handles/errors.h"

namespace transactions {
namespace {

// Where the branch's transaction is; null when nothing was begun.
engine::Connection* EngineOf(const Hold& hold) {
    return hold.working ? &hold.link.Engine() : hold.branch->work->connection.get();
}

// A transaction that was there, and is not, was lost on the way.
void Note(Work& work, bool in_transaction) {
    if (in_transaction) work.began = true;
    else if (work.began && work.doom == 0) work.doom = errors::kBranchRolledBack;
}

bool KeepsPrepared(Link& link) { return link.Database().GetCapabilities().two_phase; }

// A connection that has done its part serves the session's next branch.
void KeepSpare(Link& link, const Branch& branch, std::unique_ptr<engine::Connection> connection) noexcept {
    if (!connection || link.spare || branch.user != link.user) return;
    if (!connection->InTransaction() && !connection->Broken()) link.spare = std::move(connection);
}

Status TakeSpare(Link& link, std::unique_ptr<engine::Connection>& connection) {
    connection = std::move(link.spare);
    if (connection) return {};
    Status status = link.Engine().Another(std::make_shared<engine::StopRequest>(), connection);
    return status.Number() == errors::kUnsupported ? Error(errors::kNotMigratable) : status;
}

// The open transaction leaves the link with its connection.
Status SetAside(Link& link, Work& work) {
    if (!link.Engine().InTransaction()) return {};
    auto undisturbed = std::make_shared<const engine::StopRequest>();
    std::unique_ptr<engine::Connection> next;
    if (Status status = TakeSpare(link, next); !status.Ok()) return status;
    work.connection = link.Exchange(std::move(next));
    work.connection->Obey(std::move(undisturbed));
    return {};
}

void GoOnWithout(Link& link) noexcept {
    if (WorkingBranch* const working = WorkingIn(link)) (void)working->Take();
    link.branch.reset();
}

// The transaction is over, or others go on with it.
void Finish(Hold& hold, int doom_of_others) noexcept {
    Work& work = *hold.branch->work;
    if (hold.working) GoOnWithout(hold.link);
    else if (doom_of_others != 0 || work.branches <= 1) KeepSpare(hold.link, *hold.branch, std::move(work.connection));
    Branches::Process().Remove(hold.branch, doom_of_others);
    hold.Over();
}

void LetRest(Hold& hold, Rest rest) noexcept {
    if (hold.working) GoOnWithout(hold.link);
    Branches::Process().Release(hold.branch, rest);
    hold.Over();
}

// After a failure of the transaction's connection: what is not lost stays as it was.
Status Failed(Hold& hold, Status status) {
    if (!EngineOf(hold)->InTransaction()) Finish(hold, errors::kBranchRolledBack);
    return status;
}

Status RollBackDoomed(Hold& hold) {
    const int doom = hold.branch->work->doom;
    if (engine::Connection* const engine = EngineOf(hold)) (void)engine->Rollback();
    Finish(hold, doom);
    return Error(doom);
}

// A connection of the link's that is in no transaction: its own, or the spare one.
Status Idle(Link& link, engine::Connection*& idle) {
    idle = &link.Engine();
    if (!idle->InTransaction()) return {};
    if (!link.spare) {
        if (Status status = TakeSpare(link, link.spare); !status.Ok()) return status;
    }
    idle = link.spare.get();
    return {};
}

Status FinishUnknown(Link& link, const engine::Xid& xid, Status (engine::Connection::*finish)(const engine::Xid&)) {
    if (!KeepsPrepared(link)) return Error(errors::kNoSuchTransaction);
    engine::Connection* idle = nullptr;
    if (Status status = Idle(link, idle); !status.Ok()) return status;
    return (idle->*finish)(xid);
}

// Ends a prepared branch, wherever it is kept.
Status FinishPrepared(Hold& hold, Status (engine::Connection::*of_kept)(const engine::Xid&),
                      Status (engine::Connection::*of_open)()) {
    engine::Connection* const open = hold.branch->work->connection.get();
    Status status = open ? (open->*of_open)() : FinishUnknown(hold.link, hold.branch->xid, of_kept);
    const bool gone = open ? !open->InTransaction() : status.Number() == errors::kNoSuchTransaction;
    if (!status.Ok() && !gone) return status;
    Finish(hold, 0);
    return status;
}

}  // namespace

WorkingBranch::~WorkingBranch() {
    if (branch_) Branches::Process().Remove(branch_, errors::kBranchRolledBack);
}

Status WorkingBranch::Check(bool in_transaction) {
    Note(*branch_->work, in_transaction);
    return branch_->work->doom == 0 ? Status() : Error(errors::kBranchRolledBack);
}

// What is not begun to its end goes with `working`.
Status Begin(Link& link, const NewBranch& branch, Family family) {
    auto working = std::make_unique<WorkingBranch>(nullptr, family);
    BranchPointer held;
    bool kept = false;
    Status status = link.Engine().KeepsPrepared(branch.xid, kept);
    if (!status.Ok()) return status;
    if (kept) return Error(errors::kDuplicateXid);
    status = Branches::Process().Create({IdentityOf(link.Database()), branch.xid}, link.user, branch.coupling, branch.timeout,
                                        held);
    if (!status.Ok()) return status;
    working->Set(held);
    if (branch.mode != engine::TransactionMode::read_write && !held->work->connection) {
        if (status = link.Engine().Begin(branch.mode); !status.Ok()) {
            Branches::Process().Remove(working->Take(), 0);
            return status;
        }
    }
    if (held->work->connection) KeepSpare(link, *held, link.Exchange(std::move(held->work->connection)));
    link.branch = std::move(working);
    return {};
}

void TakeUp(Link& link, const BranchPointer& held, Family family) {
    auto working = std::make_unique<WorkingBranch>(held, family);
    if (held->work->connection) KeepSpare(link, *held, link.Exchange(std::move(held->work->connection)));
    link.branch = std::move(working);
}

Status Leave(Link& link, Rest rest, int* doom) {
    Hold hold(link, WorkingIn(link)->Get(), true);
    Note(*hold.branch->work, link.Engine().InTransaction());
    if (Status status = SetAside(link, *hold.branch->work); !status.Ok()) return status;
    if (doom) *doom = hold.branch->work->doom;    // from here on it may be another's
    LetRest(hold, rest);
    return {};
}

Status Prepare(Hold& hold) {
    Work& work = *hold.branch->work;
    engine::Connection* const engine = EngineOf(hold);
    Note(work, engine && engine->InTransaction());
    if (work.doom != 0) return RollBackDoomed(hold);
    if (work.branches > 1) {    // the last one of them prepares what all have done
        if (hold.working) {
            if (Status status = SetAside(hold.link, work); !status.Ok()) return status;
        }
        Finish(hold, 0);
        return Warning(errors::kBranchReadOnly);
    }
    bool changed = engine && engine->InTransaction();
    if (changed && KeepsPrepared(hold.link)) {
        bool read_only = false;
        if (Status status = engine->Prepare(hold.branch->xid, read_only); !status.Ok())
            return Failed(hold, std::move(status));
        changed = !read_only;
        if (!hold.working) KeepSpare(hold.link, *hold.branch, std::move(work.connection));
    } else if (changed) {
        if (Status status = engine->MakeReady(changed); !status.Ok()) return Failed(hold, std::move(status));
        if (changed && hold.working) {
            if (Status status = SetAside(hold.link, work); !status.Ok()) return status;
        }
        if (!changed) (void)engine->Rollback();    // it has read, or locked
    }
    if (changed) LetRest(hold, Rest::prepared);
    else Finish(hold, 0);
    return changed ? Status() : Warning(errors::kBranchReadOnly);
}

Status CommitOnePhase(Hold& hold) {
    Work& work = *hold.branch->work;
    engine::Connection* const engine = EngineOf(hold);
    Note(work, engine && engine->InTransaction());
    if (hold.branch->rest == Rest::prepared) return Error(errors::kCommitProtocol);
    if (work.doom != 0) return RollBackDoomed(hold);
    if (work.branches > 1) return Error(errors::kCommitProtocol);
    if (engine) {
        if (Status status = engine->Commit(); !status.Ok()) return Failed(hold, std::move(status));
    }
    Finish(hold, 0);
    return {};
}

Status CommitPrepared(Hold& hold) {
    if (hold.branch->rest != Rest::prepared) return Error(errors::kCommitProtocol);
    return FinishPrepared(hold, &engine::Connection::CommitPrepared, &engine::Connection::Commit);
}

Status RollBack(Hold& hold) {
    if (hold.branch->rest == Rest::prepared)
        return FinishPrepared(hold, &engine::Connection::RollbackPrepared, &engine::Connection::Rollback);
    engine::Connection* const engine = EngineOf(hold);
    if (engine && engine->InTransaction()) {
        if (Status status = engine->Rollback(); !status.Ok()) return Failed(hold, std::move(status));
    }
    Finish(hold, errors::kBranchRolledBack);
    return {};
}

Status CommitUnknown(Link& link, const engine::Xid& xid) {
    return FinishUnknown(link, xid, &engine::Connection::CommitPrepared);
}

Status RollBackUnknown(Link& link, const engine::Xid& xid) {
    return FinishUnknown(link, xid, &engine::Connection::RollbackPrepared);
}

Status Recover(Link& link, std::vector<engine::Xid>& prepared) {
    if (!KeepsPrepared(link)) {
        prepared = Branches::Process().Prepared(IdentityOf(link.Database()));
        return {};
    }
    engine::Connection* idle = nullptr;
    if (Status status = Idle(link, idle); !status.Ok()) return status;
    return idle->Recover(prepared);
}

}  // namespace transactions
