// What is asked for, and whether it is the time for it.
#include "transactions/transaction.h"

#include <algorithm>
#include <bit>
#include <cstring>
#include <optional>

#include "handles/errors.h"
#include "oci.h"
#include "transactions/work.h"
#include "transactions/xid.h"

namespace transactions {
namespace {

// ---- What is asked for

struct StartRequest {
    bool resumes = false;
    engine::TransactionMode mode = engine::TransactionMode::read_write;
    Coupling coupling = Coupling::tight;
    bool separable = false;
};

Status ReadIsolation(std::uint32_t bits, engine::TransactionMode& mode) {
    switch (bits) {
        case 0:
        case OCI_TRANS_READWRITE: return {};
        case OCI_TRANS_READONLY: mode = engine::TransactionMode::read_only; return {};
        case OCI_TRANS_SERIALIZABLE: mode = engine::TransactionMode::serializable; return {};
        default: return Error(errors::kBadIsolationFlags);
    }
}

Status ReadStartFlags(std::uint32_t flags, StartRequest& request) {
    constexpr std::uint32_t kUnsupported = OCI_TRANS_PROMOTE | OCI_TRANS_NOMIGRATE | OCI_TRANS_OTSRESUME;
    constexpr std::uint32_t kStarts = OCI_TRANS_NEW | OCI_TRANS_JOIN | OCI_TRANS_RESUME | OCI_TRANS_PROMOTE;
    constexpr std::uint32_t kOthers = kUnsupported | OCI_TRANS_SEPARABLE;
    const std::uint32_t start = flags & OCI_TRANS_STARTMASK, type = flags & OCI_TRANS_TYPEMASK;
    const std::uint32_t isolation = flags & OCI_TRANS_ISOLMASK;
    if (std::popcount(start) != 1 || start & ~kStarts) return Error(errors::kBadStartFlags);
    if (flags & OCI_TRANS_OTHRMASK & ~kOthers) return Error(errors::kBadStartFlags);
    if (flags & kUnsupported) return Error(errors::kFlagsUnsupported);
    if (std::popcount(type) > 1 || type & ~std::uint32_t{OCI_TRANS_TIGHT | OCI_TRANS_LOOSE})
        return Error(errors::kBadTypeFlags);
    request.resumes = start != OCI_TRANS_NEW;
    if (request.resumes && isolation != 0) return Error(errors::kResumeWithIsolation);
    if (request.resumes && type == OCI_TRANS_LOOSE) return Error(errors::kBadLooseFlags);
    request.coupling = type == OCI_TRANS_LOOSE ? Coupling::loose : Coupling::tight;
    request.separable = flags & OCI_TRANS_SEPARABLE;
    return ReadIsolation(isolation, request.mode);
}

// The identifier of a handle; nothing without a handle, or where it names none.
Status NameOf(const TransactionHandle* handle, std::optional<engine::Xid>& name) {
    if (!handle) return {};
    XID given;
    static_assert(sizeof given == TransactionHandle::kXidSize);
    std::memcpy(&given, handle->xid.data(), sizeof given);
    engine::Xid xid;
    if (ReadXid(given, xid)) name = xid;
    else if (std::ranges::any_of(handle->xid, [](char byte) { return byte != 0; })) return Error(errors::kBadValue);
    else if (!handle->name.empty()) name = XidOfName(handle->name);
    return {};
}

Status CheckFlags(std::uint32_t flags, std::uint32_t known) {
    return flags & ~known ? Error(errors::kBadMode) : Status();
}

// Calls of this family answer one number for whatever a branch was rolled back for.
Status Told(Status status) {
    return status.Number() == errors::kLockTimedOut ? Error(errors::kBranchRolledBack) : status;
}

// ---- Whether it is the time for it

// The branch that the session works in, for a call that is about no other; `otherwise` where the handle names another.
Status Current(ServiceContext& service, Link& link, int in_xa, int otherwise, WorkingBranch*& working) {
    std::optional<engine::Xid> name;
    if (Status status = NameOf(service.GetTransaction(), name); !status.Ok()) return status;
    working = WorkingIn(link);
    if (!working) return Error(link.InLocalTransaction() ? errors::kTransactionIsLocal : errors::kNoTransaction);
    if (working->GetFamily() == Family::xa) return Error(in_xa);
    return name && !(*name == working->Get()->xid) ? Error(otherwise) : Status();
}

// A branch at rest, which another family may have suspended.
Status HoldNamed(Link& link, const engine::Xid& xid, Clock::duration wait, BranchPointer& held) {
    Status status = Branches::Process().Hold({IdentityOf(link.Database()), xid}, wait, held);
    if (!status.Ok() || held->rest != Rest::suspended) return status;
    Branches::Process().Release(held, held->rest);
    return Error(errors::kAttachedElsewhere);
}

// ---- Starting

Status StartLocal(Link& link, const StartRequest& request) {
    if (request.resumes) return Error(errors::kLocalMustBeNew);
    if (request.mode != engine::TransactionMode::read_write) {
        if (Status status = link.Engine().Begin(request.mode); !status.Ok()) return status;
    }
    link.local_started = true;    // the first change begins it for the engine
    return {};
}

Status Resume(Link& link, const engine::Xid& xid, std::uint32_t timeout) {
    BranchPointer held;
    if (Status status = HoldNamed(link, xid, std::chrono::seconds(timeout), held); !status.Ok()) return status;
    Hold hold(link, held, false);
    if (held->user != link.user) return Error(errors::kOtherUsersBranch);
    if (held->rest == Rest::prepared) return Error(errors::kCommitProtocol);
    if (held->work->doom != 0) {
        Status rolled_back = RollBack(hold);
        return rolled_back.Ok() ? Error(errors::kBranchRolledBack) : rolled_back;
    }
    TakeUp(link, held, Family::calls);
    hold.Over();
    return {};
}

}  // namespace

Status Start(ServiceContext& service, Link& link, std::uint32_t timeout, std::uint32_t flags) {
    StartRequest request;
    if (Status status = ReadStartFlags(flags, request); !status.Ok()) return status;
    std::optional<engine::Xid> name;
    if (Status status = NameOf(service.GetTransaction(), name); !status.Ok()) return status;
    if (WorkingIn(link)) return Error(errors::kInBranchAlready);
    if (link.InLocalTransaction()) return Error(errors::kTransactionActive);
    Status status = !name             ? StartLocal(link, request)
                    : request.resumes ? Resume(link, *name, timeout)
                                      : Begin(link, {*name, request.coupling, std::chrono::seconds(timeout), request.mode},
                                               Family::calls);
    if (!status.Ok() || !request.separable) return status;
    return Warning(errors::kFlagsUnsupported, "the transaction is not separated after each call");
}

Status Detach(ServiceContext& service, Link& link, std::uint32_t flags) {
    if (Status status = CheckFlags(flags, OCI_DEFAULT); !status.Ok()) return status;
    WorkingBranch* working = nullptr;
    Status status = Current(service, link, errors::kNotMigratable, errors::kNotAttached, working);
    return status.Ok() ? Leave(link, Rest::idle) : status;
}

// ---- Ending

Status Prepare(ServiceContext& service, Link& link, std::uint32_t flags) {
    if (Status status = CheckFlags(flags, OCI_DEFAULT); !status.Ok()) return status;
    WorkingBranch* working = nullptr;
    Status status = Current(service, link, errors::kEndsInBranch, errors::kNotAttached, working);
    if (!status.Ok()) return status;
    Hold hold(link, working->Get(), true);
    return Told(Prepare(hold));
}

Status PrepareOneOf(Link& link, const TransactionHandle& first, const TransactionHandle& handle) {
    std::optional<engine::Xid> name, name_of_first;
    if (Status status = NameOf(&handle, name); !status.Ok()) return status;
    if (Status status = NameOf(&first, name_of_first); !status.Ok()) return status;
    if (!name) return Error(errors::kTransactionIsLocal);
    if (!name_of_first || !SameTransaction(*name, *name_of_first)) return Error(errors::kDifferentTransactions);
    WorkingBranch* const working = WorkingIn(link);
    if (working && working->Get()->xid == *name) {
        if (working->GetFamily() == Family::xa) return Error(errors::kEndsInBranch);
        Hold hold(link, working->Get(), true);
        return Told(Prepare(hold));
    }
    BranchPointer held;
    if (Status status = HoldNamed(link, *name, {}, held); !status.Ok()) return status;
    Hold hold(link, held, false);
    return held->rest == Rest::prepared ? Error(errors::kCommitProtocol) : Told(Prepare(hold));
}

Status Commit(ServiceContext& service, Link& link, std::uint32_t flags) {
    constexpr std::uint32_t kWrites =
        OCI_TRANS_WRITEBATCH | OCI_TRANS_WRITEIMMED | OCI_TRANS_WRITEWAIT | OCI_TRANS_WRITENOWAIT;
    if (Status status = CheckFlags(flags, kWrites | OCI_TRANS_TWOPHASE); !status.Ok()) return status;
    const bool prepared = flags & OCI_TRANS_TWOPHASE;
    if (WorkingIn(link)) {
        WorkingBranch* working = nullptr;
        Status status = Current(service, link, errors::kEndsInBranch, errors::kRecoversInTransaction, working);
        if (!status.Ok()) return status;
        Hold hold(link, working->Get(), true);
        return Told(prepared ? CommitPrepared(hold) : CommitOnePhase(hold));
    }
    std::optional<engine::Xid> name;
    if (Status status = NameOf(service.GetTransaction(), name); !status.Ok()) return status;
    if (!name) return link.Commit();
    if (link.InLocalTransaction()) return prepared ? Error(errors::kRecoversInTransaction) : link.Commit();
    BranchPointer held;
    Status status = HoldNamed(link, *name, {}, held);
    if (status.Number() == errors::kNoSuchTransaction) return prepared ? CommitUnknown(link, *name) : link.Commit();
    if (!status.Ok()) return status;
    Hold hold(link, held, false);
    return Told(prepared ? CommitPrepared(hold) : CommitOnePhase(hold));
}

Status Rollback(ServiceContext& service, Link& link, std::uint32_t flags) {
    if (Status status = CheckFlags(flags, OCI_DEFAULT); !status.Ok()) return status;
    if (WorkingIn(link)) {
        WorkingBranch* working = nullptr;
        Status status = Current(service, link, errors::kEndsInBranch, errors::kRecoversInTransaction, working);
        if (!status.Ok()) return status;
        Hold hold(link, working->Get(), true);
        return RollBack(hold);
    }
    if (link.InLocalTransaction()) return link.Rollback();
    std::optional<engine::Xid> name;
    if (Status status = NameOf(service.GetTransaction(), name); !status.Ok()) return status;
    if (!name) return link.Rollback();
    BranchPointer held;
    Status status = HoldNamed(link, *name, {}, held);
    if (status.Number() == errors::kNoSuchTransaction) return RollBackUnknown(link, *name);
    if (!status.Ok()) return status;
    Hold hold(link, held, false);
    return RollBack(hold);
}

// Nothing here ends a branch by itself, so that there is none to forget.
Status Forget(ServiceContext& service, Link& link, std::uint32_t flags) {
    if (Status status = CheckFlags(flags, OCI_DEFAULT); !status.Ok()) return status;
    if (WorkingIn(link)) return Error(errors::kForgetsActive);
    if (link.InLocalTransaction()) return Error(errors::kTransactionIsLocal);
    std::optional<engine::Xid> name;
    if (Status status = NameOf(service.GetTransaction(), name); !status.Ok()) return status;
    if (!name) return Error(errors::kNoTransaction);
    BranchPointer held;
    Status status = Branches::Process().Hold({IdentityOf(link.Database()), *name}, {}, held);
    if (status.Number() == errors::kAttachedElsewhere) return Error(errors::kForgetsActive);
    if (status.Ok()) {
        const Hold hold(link, held, false);
        return Error(held->rest == Rest::prepared ? errors::kForgetsPrepared : errors::kForgetsActive);
    }
    std::vector<engine::Xid> prepared;
    if (Status recovered = Recover(link, prepared); !recovered.Ok()) return recovered;
    return std::ranges::find(prepared, *name) == prepared.end() ? status : Error(errors::kForgetsPrepared);
}

}  // namespace transactions
