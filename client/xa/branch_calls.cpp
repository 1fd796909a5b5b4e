// The state machine of branches, as a thread of control sees it.
#include "xa/branch_calls.h"

#include <algorithm>

#include "handles/errors.h"
#include "transactions/work.h"
#include "transactions/xid.h"
#include "xa/resource_manager.h"

namespace xa {
namespace {

using transactions::Branches;
using transactions::BranchKey;
using transactions::BranchPointer;
using transactions::Family;
using transactions::Hold;
using transactions::Rest;

constexpr std::chrono::seconds kJoinWait{60};    // for a branch that another thread works in

// What a call needs: arguments in order, an open manager, the turn on its session.
class Call {
public:
    Call(int rmid, const XID* given, xa_long flags, xa_long known) {
        if (flags & TMASYNC) return;
        answer = XAER_INVAL;
        if (flags & ~known || (given && !transactions::ReadXid(*given, xid))) return;
        answer = XAER_PROTO;
        manager = FindManager(rmid);
        if (!manager) return;
        answer = XAER_RMFAIL;
        ServiceContext* const service = manager->GetService();
        if (!service) return;
        turn.emplace(*service);
        if (!turn->link) answer = {XAER_RMFAIL, turn->status};
    }

    [[nodiscard]] Link& GetLink() const { return *turn->link; }
    [[nodiscard]] BranchKey Key() const { return {transactions::IdentityOf(GetLink().Database()), xid}; }
    // The branch that this manager's thread of control works in.
    [[nodiscard]] BranchPointer Working() const {
        const auto* working = transactions::WorkingIn(GetLink());
        return working && working->GetFamily() == Family::xa ? working->Get() : nullptr;
    }
    [[nodiscard]] bool WorksInIt() const {
        const BranchPointer working = Working();
        return working && working->xid == xid;
    }
    [[nodiscard]] bool Suspended(const transactions::Branch& branch) const {
        return branch.rest == Rest::suspended && branch.suspended_by == manager.get();
    }

    Answer answer = XAER_ASYNC;    // where `turn` has no link
    engine::Xid xid;
    ManagerPointer manager;
    std::optional<SessionTurn> turn;
};

// Runs the call's body once all of that is there.
template <class Body>
Answer Run(int rmid, const XID* xid, xa_long flags, xa_long known, Body body) {
    Call call(rmid, xid, flags, known);
    return call.turn && call.turn->link ? body(call) : call.answer;
}

// Of a branch that the process does not know: one that the engine keeps is prepared.
Answer Unknown(const Call& call) {
    std::vector<engine::Xid> prepared;
    if (Status status = transactions::Recover(call.GetLink(), prepared); !status.Ok()) return AnswerOf(status);
    return std::ranges::find(prepared, call.xid) == prepared.end() ? XAER_NOTA : XAER_PROTO;
}

// Holds a branch that nobody works in and that is not suspended, for a call that ends it: XAER_PROTO otherwise.
Answer HoldAtRest(const Call& call, BranchPointer& held) {
    Status status = Branches::Process().Hold(call.Key(), {}, held);
    if (!status.Ok()) return AnswerOf(std::move(status));
    if (held->rest != Rest::suspended) return XA_OK;
    Branches::Process().Release(held, held->rest);
    return XAER_PROTO;
}

// ---- Associations

Answer StartNew(const Call& call) {
    const transactions::NewBranch branch{call.xid, transactions::Coupling::loose,
                                         call.manager->GetInfo().session_timeout,
                                         engine::TransactionMode::read_write};
    return AnswerOf(transactions::Begin(call.GetLink(), branch, Family::xa));
}

Answer TakeUpAgain(const Call& call, xa_long flags) {
    BranchPointer held;
    Status status = Branches::Process().Hold(call.Key(), flags & TMNOWAIT ? std::chrono::seconds(0) : kJoinWait, held);
    if (status.Number() == errors::kNoSuchTransaction) return Unknown(call);
    if (!status.Ok()) return {flags & TMNOWAIT ? XA_RETRY : XAER_PROTO, std::move(status)};
    Hold hold(call.GetLink(), held, false);
    const bool resumable = call.Suspended(*held) || (held->rest == Rest::suspended && held->migrates);
    if (flags & TMRESUME ? !resumable : held->rest != Rest::idle) return XAER_PROTO;
    if (held->user != call.GetLink().user) return {XAER_RMERR, Error(errors::kOtherUsersBranch)};
    if (held->work->doom != 0) return AnswerOf(Error(held->work->doom));
    transactions::TakeUp(call.GetLink(), held, Family::xa);
    hold.Over();
    return XA_OK;
}

// The work is given up: nothing is left to lock.
void Doom(engine::Connection* engine, transactions::Branch& branch) {
    if (engine) (void)engine->Rollback();
    if (branch.work->doom == 0) branch.work->doom = errors::kBranchRolledBack;
}

Answer EndWork(const Call& call, xa_long flags) {
    Link& link = call.GetLink();
    const BranchPointer branch = call.Working();
    if (flags & TMFAIL) Doom(&link.Engine(), *branch);
    branch->migrates = flags & TMMIGRATE;
    branch->suspended_by = branch->migrates ? nullptr : call.manager.get();
    int doom = 0;
    Status status = transactions::Leave(link, flags & TMSUSPEND ? Rest::suspended : Rest::idle, &doom);
    if (status.Ok() && !(flags & TMFAIL) && doom != 0) return AnswerOf(Error(doom));
    return AnswerOf(std::move(status));
}

Answer EndSuspended(const Call& call, xa_long flags) {
    BranchPointer held;
    Status status = Branches::Process().Hold(call.Key(), {}, held);
    if (status.Number() == errors::kNoSuchTransaction) return Unknown(call);
    if (!status.Ok()) return AnswerOf(std::move(status));
    Hold hold(call.GetLink(), held, false);
    if (!call.Suspended(*held) || flags & TMSUSPEND) return XAER_PROTO;
    if (flags & TMFAIL) Doom(held->work->connection.get(), *held);
    hold.Over();
    Branches::Process().Release(held, Rest::idle);
    return XA_OK;
}

}  // namespace

Answer Start(const XID* xid, int rmid, xa_long flags) {
    if (!xid || (flags & TMJOIN && flags & TMRESUME)) return flags & TMASYNC ? XAER_ASYNC : XAER_INVAL;
    return Run(rmid, xid, flags, TMJOIN | TMRESUME | TMNOWAIT, [flags](Call& call) -> Answer {
        if (call.Working()) return {XAER_PROTO, Error(errors::kInBranchAlready)};
        if (call.GetLink().branch || call.GetLink().InLocalTransaction()) return XAER_OUTSIDE;
        return flags & (TMJOIN | TMRESUME) ? TakeUpAgain(call, flags) : StartNew(call);
    });
}

Answer End(const XID* xid, int rmid, xa_long flags) {
    const xa_long how = flags & (TMSUSPEND | TMSUCCESS | TMFAIL);
    const bool one = how == TMSUSPEND || how == TMSUCCESS || how == TMFAIL;
    if (!xid || !one || (flags & TMMIGRATE && how != TMSUSPEND)) return flags & TMASYNC ? XAER_ASYNC : XAER_INVAL;
    return Run(rmid, xid, flags, TMSUSPEND | TMSUCCESS | TMFAIL | TMMIGRATE, [flags](Call& call) {
        return call.WorksInIt() ? EndWork(call, flags) : EndSuspended(call, flags);
    });
}

Answer Rollback(const XID* xid, int rmid, xa_long flags) {
    if (!xid) return XAER_INVAL;
    return Run(rmid, xid, flags, TMNOFLAGS, [](Call& call) -> Answer {
        BranchPointer held;
        Answer answer = HoldAtRest(call, held);
        if (answer.code == XAER_NOTA) return AnswerOf(transactions::RollBackUnknown(call.GetLink(), call.xid));
        if (answer.code != XA_OK) return answer;
        Hold hold(call.GetLink(), held, false);
        return AnswerOf(transactions::RollBack(hold));
    });
}

Answer Prepare(const XID* xid, int rmid, xa_long flags) {
    if (!xid) return XAER_INVAL;
    return Run(rmid, xid, flags, TMNOFLAGS, [](Call& call) -> Answer {
        BranchPointer held;
        Answer answer = HoldAtRest(call, held);
        if (answer.code == XAER_NOTA) return Unknown(call);
        if (answer.code != XA_OK) return answer;
        Hold hold(call.GetLink(), held, false);
        return held->rest == Rest::prepared ? Answer(XAER_PROTO) : AnswerOf(transactions::Prepare(hold));
    });
}

Answer Commit(const XID* xid, int rmid, xa_long flags) {
    if (!xid) return XAER_INVAL;
    return Run(rmid, xid, flags, TMONEPHASE | TMNOWAIT, [flags](Call& call) -> Answer {
        BranchPointer held;
        const bool one_phase = flags & TMONEPHASE;
        Answer answer = HoldAtRest(call, held);
        if (answer.code == XAER_NOTA)
            return one_phase ? Unknown(call) : AnswerOf(transactions::CommitUnknown(call.GetLink(), call.xid));
        if (answer.code != XA_OK) return answer;
        Hold hold(call.GetLink(), held, false);
        return AnswerOf(one_phase ? transactions::CommitOnePhase(hold) : transactions::CommitPrepared(hold));
    });
}

// No branch here is completed heuristically: one that is known is not to be forgotten yet.
Answer Forget(const XID* xid, int rmid, xa_long flags) {
    if (!xid) return XAER_INVAL;
    return Run(rmid, xid, flags, TMNOFLAGS, [](Call& call) -> Answer {
        BranchPointer held;
        const Answer answer = HoldAtRest(call, held);
        if (answer.code == XAER_NOTA) return Unknown(call);
        if (answer.code == XA_OK) Branches::Process().Release(held, held->rest);
        return XAER_PROTO;
    });
}

Answer Recover(XID* xids, xa_long& count, int rmid, xa_long flags) {
    const xa_long room = std::exchange(count, 0);
    if (room < 0 || (!xids && room > 0)) return flags & TMASYNC ? XAER_ASYNC : XAER_INVAL;
    return Run(rmid, nullptr, flags, TMSTARTRSCAN | TMENDRSCAN, [&](Call& call) -> Answer {
        ResourceManager::Scan& scan = call.manager->scan;
        if (flags & TMSTARTRSCAN) {
            std::vector<engine::Xid> found;
            if (Status status = transactions::Recover(call.GetLink(), found); !status.Ok())
                return AnswerOf(std::move(status));
            scan = {true, std::move(found), 0};
        }
        if (!scan.open) return XAER_INVAL;
        for (; count < room && scan.next < scan.found.size(); ++count)
            xids[count] = transactions::WriteXid(scan.found[scan.next++]);
        if (flags & TMENDRSCAN) scan = {};
        return XA_OK;
    });
}

}  // namespace xa
