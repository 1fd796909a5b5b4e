// Transactions: starting, leaving and ending them. What works on the session takes its turn itself.
#include <span>
#include <vector>

#include "handles/gate.h"
#include "oci.h"
#include "transactions/transaction.h"

namespace {

template <class Body>
sword EnterSession(OCISvcCtx* svc, OCIError* err, Body body, const char* name = __builtin_FUNCTION()) noexcept {
    return EnterUnlocked<ServiceContext>(svc, err, [&](ServiceContext& service) -> Status {
        const LongCall may_take_long;
        const SessionTurn turn(service);
        return turn.link ? body(service, *turn.link) : turn.status;
    }, name);
}

// A call whose one argument is flags.
sword EnterWithFlags(OCISvcCtx* svc, OCIError* err, ub4 flags,
                     Status (*call)(ServiceContext& service, Link& link, std::uint32_t flags),
                     const char* name = __builtin_FUNCTION()) noexcept {
    return EnterSession(svc, err, [&](ServiceContext& service, Link& link) { return call(service, link, flags); }, name);
}

}  // namespace

sword OCITransStart(OCISvcCtx* svc, OCIError* err, uword timeout, ub4 flags) {
    return EnterSession(svc, err, [&](ServiceContext& service, Link& link) {
        return transactions::Start(service, link, timeout, flags);
    });
}

sword OCITransDetach(OCISvcCtx* svc, OCIError* err, ub4 flags) {
    return EnterWithFlags(svc, err, flags, transactions::Detach);
}

sword OCITransPrepare(OCISvcCtx* svc, OCIError* err, ub4 flags) {
    return EnterWithFlags(svc, err, flags, transactions::Prepare);
}

sword OCITransForget(OCISvcCtx* svc, OCIError* err, ub4 flags) {
    return EnterWithFlags(svc, err, flags, transactions::Forget);
}

sword OCITransCommit(OCISvcCtx* svc, OCIError* err, ub4 flags) {
    return EnterWithFlags(svc, err, flags, transactions::Commit);
}

sword OCITransRollback(OCISvcCtx* svc, OCIError* err, ub4 flags) {
    return EnterWithFlags(svc, err, flags, transactions::Rollback);
}

namespace {

struct PreparedBranch {
    TransactionHandle* handle;
    ErrorHandle* error;
};

// False when one of the handles is none.
bool Collect(OCITrans** txns, OCIError** errs, std::span<PreparedBranch> branches) {
    for (PreparedBranch& branch : branches) {
        branch = {Live<TransactionHandle>(*txns++), Live<ErrorHandle>(*errs++)};
        if (!branch.handle || !branch.error) return false;
        branch.error->Begin("OCITransMultiPrepare");
    }
    return true;
}

// The worst of the results.
sword PrepareAll(ServiceContext& service, std::span<const PreparedBranch> branches) {
    const LongCall may_take_long;
    const SessionTurn turn(service);
    sword worst = OCI_SUCCESS;
    for (const PreparedBranch& branch : branches) {
        const sword code = Guard(branch.error->list, [&] {
            return turn.link ? transactions::PrepareOneOf(*turn.link, *branches.front().handle, *branch.handle)
                             : turn.status;
        });
        if (worst == OCI_SUCCESS || code < 0) worst = code;
    }
    return worst;
}

}  // namespace

// Each branch has its own error handle, and is prepared whatever becomes of the others.
sword OCITransMultiPrepare(OCISvcCtx* svc, ub4 branches, OCITrans** txns, OCIError** errs) {
    const CallInFlight call;
    auto* service = Live<ServiceContext>(svc);
    ErrorHandle* const first = errs && branches > 0 ? Live<ErrorHandle>(errs[0]) : nullptr;
    if (!service || !txns || !first) return OCI_INVALID_HANDLE;
    sword result = OCI_INVALID_HANDLE;
    const sword failed = Guard(first->list, [&]() -> Status {
        std::vector<PreparedBranch> all(branches);
        if (Collect(txns, errs, all)) result = PrepareAll(*service, all);
        return {};
    });
    return failed == OCI_SUCCESS ? result : failed;
}
