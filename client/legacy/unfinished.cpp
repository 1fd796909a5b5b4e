#include "legacy/unfinished.h"

#include "sessions/service_context.h"

namespace legacy {

// A session whose handles know no threads is not given to another one.
std::shared_ptr<Link> LinkToLeave(const Login& login) noexcept {
    const CallInFlight call;
    const auto* const service = Live<ServiceContext>(login.service);
    const Server* const server = service ? service->GetServer() : nullptr;
    if (!server || !server->NonBlocking()) return nullptr;
    const Session* const session = service->GetSession();
    std::shared_ptr<Link> link = session ? session->ShareLink() : nullptr;
    const bool can = link && link->Serial() && link->Database().GetCapabilities().statement_waits;
    return can ? std::move(link) : nullptr;
}

bool IsRefused(const Cursor& cursor, Function function) noexcept {
    const Login& login = *cursor.login;
    return login.unfinished ? !login.unfinished->Is(cursor, function) : login.IsBusy(&cursor);
}

// The session's handles may be gone: the link is not.
void Login::StopUnfinished() noexcept {
    if (!unfinished) return;
    unfinished->Stop();
    unfinished = nullptr;    // waits
}

}  // namespace legacy
