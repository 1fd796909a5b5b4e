// The register of the areas that are known, and the handles behind them.
#include "legacy/areas.h"

#include <algorithm>
#include <cstddef>
#include <new>
#include <unordered_map>

#include "handles/gate.h"
#include "legacy/unfinished.h"
#include "sessions/service_context.h"
#include "statements/statement.h"

namespace legacy {
namespace {

// Never destroyed: calls may come while the process ends. Needs no memory to be there.
struct Register {
    std::mutex mutex;
    std::unordered_map<const void*, std::shared_ptr<Login>> logins;
    std::unordered_map<const void*, std::shared_ptr<Cursor>> cursors;
};

Register& Known() {
    alignas(Register) static std::byte room[sizeof(Register)];
    static auto* const known = new (room) Register;
    return *known;
}

template <class Value>
std::shared_ptr<Value> Find(const std::unordered_map<const void*, std::shared_ptr<Value>>& areas, const void* area) {
    const std::lock_guard lock(Known().mutex);
    const auto found = areas.find(area);
    return found == areas.end() ? nullptr : found->second;
}

// Logins whose lenders are gone go when somebody looks.
void ForgetOver() noexcept {
    const auto next = [] {
        const std::lock_guard lock(Known().mutex);
        const auto found = std::find_if(Known().logins.begin(), Known().logins.end(),
                                        [](const auto& known) { return known.second->Over(); });
        return found == Known().logins.end() ? nullptr : found->first;
    };
    while (const void* const area = next()) {
        try {
            std::vector<std::shared_ptr<Cursor>> cursors;
            if (const std::shared_ptr<Login> login = ForgetLogin(area, cursors)) EndLogin(*login, cursors);
        } catch (const std::bad_alloc&) {    // the next one who looks
            return;
        }
    }
}

}  // namespace

Login::Login() = default;

Login::~Login() {
    StopUnfinished();
    if (environment) (void)OCIHandleFree(environment, OCI_HTYPE_ENV);
}

// A context that was freed may not be destroyed yet; as long as the loan lasts no other one has its place.
bool Login::Over() const noexcept {
    if (!lender || loan.expired()) return lender;
    const CallInFlight call;
    return !Live<ServiceContext>(lender);
}

bool Login::Open() {
    dvoid* handle = nullptr;
    if (OCIEnvCreate(&environment, OCI_THREADED, nullptr, nullptr, nullptr, nullptr, 0, nullptr) != OCI_SUCCESS) {
        return false;
    }
    if (OCIHandleAlloc(environment, &handle, OCI_HTYPE_ERROR, 0, nullptr) != OCI_SUCCESS) return false;
    error = static_cast<OCIError*>(handle);
    return true;
}

Cursor::~Cursor() {
    if (row_id) (void)OCIDescriptorFree(row_id, OCI_DTYPE_ROWID);
    if (statement) (void)OCIHandleFree(statement, OCI_HTYPE_STMT);
    if (error) (void)OCIHandleFree(error, OCI_HTYPE_ERROR);
}

bool Cursor::Open() {
    dvoid* handle = nullptr;
    if (OCIHandleAlloc(login->environment, &handle, OCI_HTYPE_ERROR, 0, nullptr) != OCI_SUCCESS) return false;
    error = static_cast<OCIError*>(handle);
    if (OCIHandleAlloc(login->environment, &handle, OCI_HTYPE_STMT, 0, nullptr) != OCI_SUCCESS) return false;
    statement = static_cast<OCIStmt*>(handle);
    if (OCIDescriptorAlloc(login->environment, &handle, OCI_DTYPE_ROWID, 0, nullptr) != OCI_SUCCESS) return false;
    row_id = static_cast<OCIRowid*>(handle);
    const CallInFlight call;
    if (auto* const opened = Live<Statement>(statement)) opened->kept_row = std::make_unique<KeptRow>();
    return true;
}

std::shared_ptr<Login> FindLogin(const void* area) {
    std::shared_ptr<Login> login = Find(Known().logins, area);
    if (!login || !login->Over()) return login;
    ForgetOver();
    return nullptr;
}

std::shared_ptr<Cursor> FindCursor(const void* area) {
    std::shared_ptr<Cursor> cursor = Find(Known().cursors, area);
    if (!cursor || !cursor->login->Over()) return cursor;
    ForgetOver();
    return nullptr;
}

void EndLogin(Login& login, const std::vector<std::shared_ptr<Cursor>>& cursors) noexcept {
    const std::lock_guard turn(login.turn);
    login.StopUnfinished();
    for (const auto& cursor : cursors) cursor->ended = true;
    login.ended = true;
}

void Enter(const void* area, std::shared_ptr<Login> login) {
    ForgetOver();
    const std::lock_guard lock(Known().mutex);
    Known().logins[area] = std::move(login);
}

void Enter(const void* area, std::shared_ptr<Cursor> cursor) {
    const std::lock_guard lock(Known().mutex);
    Known().cursors[area] = std::move(cursor);
}

std::size_t CountCursors(const Login& login) {
    const std::lock_guard lock(Known().mutex);
    return static_cast<std::size_t>(std::count_if(Known().cursors.begin(), Known().cursors.end(), [&login](const auto& known) {
        return known.second->login.get() == &login;
    }));
}

void ForgetCursor(const void* area) {
    const std::lock_guard lock(Known().mutex);
    Known().cursors.erase(area);
}

std::shared_ptr<Login> ForgetLogin(const void* area, std::vector<std::shared_ptr<Cursor>>& cursors) {
    const std::lock_guard lock(Known().mutex);
    const auto found = Known().logins.find(area);
    if (found == Known().logins.end()) return nullptr;
    std::size_t count = 0;
    for (const auto& [unused, cursor] : Known().cursors) count += cursor->login == found->second;
    cursors.reserve(count);    // nothing fails below
    std::shared_ptr<Login> login = std::move(found->second);
    Known().logins.erase(found);
    for (auto at = Known().cursors.begin(); at != Known().cursors.end();) {
        if (at->second->login == login) {
            cursors.push_back(std::move(at->second));
            at = Known().cursors.erase(at);
        } else {
            ++at;
        }
    }
    return login;
}

}  // namespace legacy
