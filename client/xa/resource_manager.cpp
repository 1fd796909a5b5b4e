// Opening, finding and closing resource managers.
#include "xa/resource_manager.h"

#include <algorithm>
#include <atomic>
#include <cstring>
#include <list>
#include <mutex>

#include "handles/errors.h"
#include "handles/in_flight.h"
#include "oci.h"
#include "transactions/work.h"

namespace xa {
namespace {

// Never destroyed: what is still open when the process ends goes with it.
std::mutex list_mutex;
std::list<ManagerPointer>& List() {
    static auto* const list = new std::list<ManagerPointer>;
    return *list;
}

std::uint64_t ThisThread() {
    static std::atomic<std::uint64_t> last{0};
    static thread_local const std::uint64_t number = ++last;
    return number;
}

// The first that fits, among those of this thread, then among those of the process.
template <class Fits>
std::vector<ManagerPointer> Find(Fits fits) {
    const std::lock_guard lock(list_mutex);
    std::vector<ManagerPointer> found;
    for (const std::uint64_t thread : {ThisThread(), std::uint64_t{0}}) {
        for (const ManagerPointer& manager : List())
            if (fits(*manager, thread)) found.push_back(manager);
        if (!found.empty()) break;
    }
    return found;
}

}  // namespace

ResourceManager::ResourceManager(int rmid, Info info)
    : rmid_(rmid), info_(std::move(info)), thread_(info_.threads ? ThisThread() : 0) {}

ResourceManager::~ResourceManager() {
    const CallInFlight call;
    if (Environment* const environment = GetEnvironment()) Destroy(environment);
}

Environment* ResourceManager::GetEnvironment() const { return environment_.Get(); }
ServiceContext* ResourceManager::GetService() const { return service_.Get(); }

// Branches leave the session and come back with connections of their own: a database with one connection is refused.
Answer ResourceManager::LogOn() {
    const ProcessDefaults defaults = GetProcessDefaults();
    const std::uint32_t mode = defaults.mode | OCI_THREADED;
    Environment* const environment = Environment::Open(mode, Environment::SetsOf(mode), defaults.memory, 0);
    if (!environment) return {XAER_RMERR, Error(errors::kOutOfMemory)};
    environment_.Set(environment);
    auto* const service = Create<ServiceContext>(*environment, OCI_HTYPE_SVCCTX, 0);
    service_.Set(service);
    if (Status status = service->LogOn({info_.server, {}}, info_.credentials, ServiceContext::EndedBy::logoff);
        !status.Ok())
        return {CodeOf(status.Number()), std::move(status)};
    const SessionTurn turn(*service);
    if (!turn.link) return {XAER_RMFAIL, turn.status};
    if (turn.link->Database().Identity().empty()) return {XAER_RMERR, Error(errors::kUnsupported)};
    return XA_OK;
}

Status ResourceManager::LogOff() {
    ServiceContext* const service = GetService();
    if (!service) return {};
    service->TakeBack();
    return service->GetSession() ? service->LogOff() : Status();    // the application has logged it off itself
}

ManagerPointer FindManager(int rmid) {
    const auto found =
        Find([rmid](const ResourceManager& manager, std::uint64_t thread) { return manager.IsOf(rmid, thread); });
    return found.empty() ? nullptr : found.front();
}

ManagerPointer FindManager(std::string_view name) {
    const auto found =
        Find([name](const ResourceManager& manager, std::uint64_t thread) { return manager.IsNamed(name, thread); });
    return found.size() == 1 ? found.front() : nullptr;
}

// A name leads to one session: a second manager of that name is refused. Opening twice does nothing.
Answer Open(int rmid, const char* text, xa_long flags) {
    if (flags & TMASYNC) return XAER_ASYNC;
    if (flags != TMNOFLAGS || !text || strnlen(text, MAXINFOSIZE) == MAXINFOSIZE) return XAER_INVAL;
    Info info;
    if (!ReadInfo(text, info)) return XAER_INVAL;
    if (FindManager(rmid)) return XA_OK;
    if (!info.name.empty() && FindManager(std::string_view(info.name))) return XAER_INVAL;
    auto manager = std::make_shared<ResourceManager>(rmid, std::move(info));
    Answer answer = manager->LogOn();
    if (answer.code != XA_OK) return answer;
    const std::lock_guard lock(list_mutex);
    List().push_back(std::move(manager));
    return answer;
}

Answer Close(int rmid, xa_long flags) {
    if (flags & TMASYNC) return XAER_ASYNC;
    if (flags != TMNOFLAGS) return XAER_INVAL;
    const ManagerPointer manager = FindManager(rmid);
    if (!manager) return XA_OK;
    if (transactions::Branches::Process().AnySuspendedBy(manager.get())) return XAER_PROTO;
    Status status = manager->LogOff();
    if (status.Number() == errors::kEndsInBranch) return XAER_PROTO;
    {
        const std::lock_guard lock(list_mutex);
        List().remove(manager);
    }
    return status.Failed() && status.Number() != errors::kNotLoggedOn ? AnswerOf(std::move(status)) : Answer(XA_OK);
}

}  // namespace xa
