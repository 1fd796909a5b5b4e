#include "legacy/bridges.h"

#include <cstring>

#include "legacy/cursors.h"

namespace legacy {
namespace {

// The login has a context of its own with the server and the session of the one that lends them.
int OpenLent(Login& login, ServiceContext& service) {
    if (!login.Open()) return errors::kOutOfMemory;
    const CallInFlight call;
    auto* const environment = Live<Environment>(login.environment);
    if (!environment) return errors::kOutOfMemory;
    auto* const own = Create<ServiceContext>(*environment, OCI_HTYPE_SVCCTX, 0);
    login.service = AsHandle<OCISvcCtx>(own);
    login.lender = AsHandle<OCISvcCtx>(&service);
    (void)own->SetServer(service.GetServer());
    (void)own->SetSession(service.GetSession());
    return 0;
}

Status Lend(Lda_Def* area, ServiceContext& service) {
    const auto login = std::make_shared<Login>();
    if (const int failed = OpenLent(*login, service)) return Error(failed);
    if (Status status = service.Lend(login->loan); !status.Ok()) return status;
    try {
        Enter(area, login);
    } catch (...) {
        service.TakeBack();
        throw;
    }
    return {};
}

// A context for the session of a login of olog's: the living one that `out` points to, or a new one.
Status TakeOver(Login& login, OCISvcCtx** out, ErrorHandle& error) {
    auto* const from = Live<ServiceContext>(login.service);
    if (!from) return Error(errors::kNotConnected);
    auto* service = Live<ServiceContext>(*out);
    Made<ServiceContext> made;
    if (!service) {
        made.reset(Create<ServiceContext>(error.Env(), OCI_HTYPE_SVCCTX, 0));
        service = made.get();
    }
    if (Status status = service->TakeOver(*from); status.Failed()) return status;
    *out = AsHandle<OCISvcCtx>(service);
    (void)made.release();
    return {};
}

Status TakeBack(const Login& login, OCISvcCtx** out) {
    auto* const lender = Live<ServiceContext>(login.lender);
    if (!lender) return InvalidHandle();
    lender->TakeBack();
    *out = login.lender;
    return {};
}

// Nothing of the session's own ends but results.
Status GiveBack(Lda_Def* area, Login& login, OCISvcCtx** out, ErrorHandle& error) {
    if (login.IsBusy()) return Error(errors::kOperationActive);
    if (!out) return Error(errors::kNullArgument);
    if (login.borrowed) return Error(errors::kNoModeSwitch);
    std::vector<std::shared_ptr<Cursor>> cursors;
    cursors.reserve(CountCursors(login));    // nothing fails once the session has moved
    if (Status status = login.lender ? TakeBack(login, out) : TakeOver(login, out, error); status.Failed()) return status;
    (void)ForgetLogin(area, cursors);
    EndResults(cursors);
    login.ended = true;
    return {};
}

// What the call answers stands in the area, too.
template <class Body>
Status Noted(Lda_Def& area, Body&& body) {
    Status status;
    try {
        status = body();
    } catch (...) {
        status = Caught();
    }
    (void)SetResult(area, Function::none, status.Number());
    return status;
}

}  // namespace

// A maker: it writes into an area that is not known.
Status LendTo(Lda_Def* area, ServiceContext& service) {
    std::shared_ptr<Link> link;
    Status status = service.Require(link);
    if (!area) return status.Ok() ? Error(errors::kNullArgument) : status;
    if (FindCursor(area)) return Error(errors::kInvalidCursor);
    if (FindLogin(area)) return Error(OnLogin(area, [](Login&) { return errors::kAlreadyLoggedOn; }));
    std::memset(area, 0, sizeof *area);
    return Noted(*area, [&] { return status.Ok() ? Lend(area, service) : status; });
}

Status BringBack(Lda_Def* area, OCISvcCtx** out, ErrorHandle& error) {
    const std::shared_ptr<Login> login = FindLogin(area);
    if (!login) return InvalidHandle();
    const std::lock_guard turn(login->turn);
    if (login->ended) return InvalidHandle();
    return Noted(*area, [&] { return GiveBack(area, *login, out, error); });
}

}  // namespace legacy
