// Pool handles: creating and destroying, names, attributes.
#include "pools/pool_handle.h"

#include <algorithm>
#include <atomic>
#include <map>
#include <utility>

#include "handles/attributes.h"
#include "handles/errors.h"
#include "oci.h"

namespace {

constexpr std::uint32_t kDefaultCacheSize = 20;

constexpr PoolNumbers kConnectionPoolNumbers = {
    .exists = errors::kPoolExists,
    .none_to_reinitialize = errors::kNoPoolToReinitialize,
    .bad_size = errors::kBadPoolSize,
    .in_use = errors::kPoolInUse,
    .none_left = errors::kNoConnectionLeft,
    .none_of_that_name = errors::kNoConnectionPool,
    .bad_database = errors::kPoolBadDatabase,
    .bad_user = errors::kPoolBadUser,
};

constexpr PoolNumbers kSessionPoolNumbers = {
    .exists = errors::kSessionPoolExists,
    .none_to_reinitialize = errors::kNoSessionPoolToReinitialize,
    .bad_size = errors::kBadSessionCount,
    .in_use = errors::kSessionPoolInUse,
    .none_left = errors::kNoSessionLeft,
    .none_of_that_name = errors::kNoSessionPool,
    .bad_database = 0,
    .bad_user = 0,
};

// ---- Names

struct Named {
    const Environment* environment;
    Kind kind;
    std::shared_ptr<Pool> pool;
};
using Names = std::map<std::string, Named, std::less<>>;
std::mutex names_mutex;

// Of the process: a name is never given twice. Never destroyed, for threads that run longer than main does.
Names& AllNames() {
    static Names* const names = new Names;
    return *names;
}

// "SPOOL_1": the kind, and a number of its own.
std::string NewName(const Environment& environment, Kind kind, const std::shared_ptr<Pool>& pool) {
    static std::atomic<std::uint64_t> last{0};
    std::string name = (kind == Kind::session_pool ? "SPOOL_" : "CPOOL_") + std::to_string(++last);
    const std::lock_guard lock(names_mutex);
    AllNames().emplace(name, Named{&environment, kind, pool});
    return name;
}

void Forget(const std::string& name) noexcept {
    Names::node_type gone;
    const std::lock_guard lock(names_mutex);
    gone = AllNames().extract(name);
}

}  // namespace

Status FindPool(const Environment& environment, Kind kind, std::string_view name, std::shared_ptr<Pool>& pool) {
    const std::lock_guard lock(names_mutex);
    const Names& names = AllNames();
    const auto found = names.find(name);
    if (found == names.end() || found->second.environment != &environment || found->second.kind != kind)
        return Error(kind == Kind::session_pool ? errors::kNoSessionPool : errors::kNoConnectionPool);
    pool = found->second.pool;
    return {};
}

// ---- Creating and destroying

PoolHandle::~PoolHandle() {
    if (const std::shared_ptr<Pool> pool = Part()) pool->Close();
}

std::shared_ptr<Pool> PoolHandle::GetPool() const {
    const std::lock_guard lock(mutex_);
    return pool_;
}

bool PoolHandle::InUse() const {
    const std::shared_ptr<Pool> pool = GetPool();
    return pool && pool->Count().busy > 0;
}

void PoolHandle::Withdrawn() noexcept {
    if (const std::shared_ptr<Pool> pool = GetPool()) pool->Stop();
}

// Takes the pool from the handle, and its name.
std::shared_ptr<Pool> PoolHandle::Part() noexcept {
    std::shared_ptr<Pool> pool;
    std::string name;
    {
        const std::lock_guard lock(mutex_);
        pool.swap(pool_);
        name.swap(name_);
    }
    if (pool) Forget(name);
    return pool;
}

// What is opened at once has a limit: no machine holds what a negative number asks for.
Status PoolHandle::CheckSize(const PoolSize& size) const {
    constexpr std::uint32_t kMostAtOnce = 10000;
    const bool fits = size.most > 0 && size.least <= size.most && (size.step > 0 || size.least == size.most) &&
                      size.least <= kMostAtOnce && std::min(size.step, size.most) <= kMostAtOnce;
    return fits ? Status() : Error(numbers_.bad_size);
}

Status PoolHandle::MakePool(Request& request, std::shared_ptr<Pool>& pool) const {
    std::unique_ptr<engine::Database> database;
    Status status = engine::Open(request.database, database);
    if (status.Failed()) return numbers_.bad_database ? Error(numbers_.bad_database, status.Detail()) : status;
    PoolPlan plan{std::move(database), std::move(request.database), std::move(request.own), request.one_user,
                  Env().Threaded(),    numbers_.none_left,          numbers_.none_of_that_name};
    pool = std::make_shared<Pool>(std::move(plan), request.size, settings_);
    return status;
}

Status PoolHandle::CreatePool(Request request) {
    {
        const std::lock_guard lock(mutex_);
        if (pool_ || creating_) return Error(numbers_.exists);
        creating_ = true;
    }
    struct Creation {    // what does not come to an end leaves nothing
        PoolHandle& handle;
        std::shared_ptr<Pool> pool;
        std::string name;
        bool done = false;
        ~Creation() {
            if (!done) Forget(name);
            if (!done && pool) pool->Close();
            const std::lock_guard lock(handle.mutex_);
            handle.creating_ = false;
        }
    } creation{*this, nullptr, {}};
    Status status = CheckSize(request.size);
    const bool fill = request.fill, caches = request.caches;
    if (status.Ok()) status = MakePool(request, creation.pool);
    if (status.Failed()) return status;
    if (fill) status = creation.pool->Fill();
    const bool bad_user = status.Number() == errors::kBadLogon;
    if (status.Failed()) return bad_user && numbers_.bad_user ? Error(numbers_.bad_user, status.Detail()) : status;
    creation.name =
        NewName(Env(), Type() == OCI_HTYPE_SPOOL ? Kind::session_pool : Kind::connection_pool, creation.pool);
    std::string converted;
    shown_name_ = TextOut(Env(), creation.name, converted);
    if (caches && settings_->cache_size == 0) settings_->cache_size = kDefaultCacheSize;
    const std::lock_guard lock(mutex_);
    pool_ = creation.pool;
    name_ = creation.name;
    creation.done = true;
    return status;
}

Status PoolHandle::Reinitialize(const PoolSize& size) {
    const std::shared_ptr<Pool> pool = GetPool();
    if (!pool) return Error(numbers_.none_to_reinitialize);
    Status status = CheckSize(size);
    if (status.Failed()) return status;
    pool->Resize(size);
    return pool->Plan().one_user || Type() == OCI_HTYPE_CPOOL ? pool->Fill() : status;
}

Status PoolHandle::DestroyPool(bool force) {
    const std::shared_ptr<Pool> pool = GetPool();
    if (!pool) return Error(errors::kNoPool);
    if (!force && !pool->StopUnlessUsed()) return Error(numbers_.in_use);
    if (Part() != pool) return Error(errors::kNoPool);    // another thread was faster
    pool->Close();
    if (force) pool->DropSessions();
    return {};
}

// ---- Attributes

namespace {

using Counts = Pool::Counts;

template <std::uint32_t Counts::*count>
Status GetCount(PoolHandle& handle, AttributeValue& value) {
    const std::shared_ptr<Pool> pool = handle.GetPool();
    value.integer = pool ? pool->Count().*count : 0;
    return {};
}
template <std::uint32_t PoolSize::*number>
Status GetSize(PoolHandle& handle, AttributeValue& value) {
    const std::shared_ptr<Pool> pool = handle.GetPool();
    value.integer = pool ? pool->Count().size.*number : 0;
    return {};
}
template <auto setting>
Status GetSetting(PoolHandle& handle, AttributeValue& value) {
    value.integer = handle.Settings().*setting;
    return {};
}
template <std::atomic<std::uint32_t> PoolSettings::*setting>
Status SetSetting(PoolHandle& handle, const AttributeValue& value) {
    handle.Settings().*setting = static_cast<std::uint32_t>(value.integer);
    return {};
}

Status SetGetMode(PoolHandle& handle, const AttributeValue& value) {
    if (value.integer > OCI_SPOOL_ATTRVAL_TIMEDWAIT) return Error(errors::kBadValue);
    handle.Settings().get_mode = static_cast<std::uint8_t>(value.integer);
    return {};
}

// A connection pool waits, or it does not.
Status SetNoWait(PoolHandle& handle, const AttributeValue& value) {
    handle.Settings().get_mode = value.integer ? OCI_SPOOL_ATTRVAL_NOWAIT : OCI_SPOOL_ATTRVAL_WAIT;
    return {};
}

using P = PoolHandle;
using S = PoolSettings;
constexpr AttributeRow kConnectionPoolRows[] = {
    {OCI_ATTR_CONN_NOWAIT, Shape::ub1, Get<P, GetSetting<&S::get_mode>>, Set<P, SetNoWait>},
    {OCI_ATTR_CONN_BUSY_COUNT, Shape::ub4, Get<P, GetCount<&Counts::busy>>, nullptr},
    {OCI_ATTR_CONN_OPEN_COUNT, Shape::ub4, Get<P, GetCount<&Counts::open>>, nullptr},
    {OCI_ATTR_CONN_TIMEOUT, Shape::ub4, Get<P, GetSetting<&S::idle_seconds>>, Set<P, SetSetting<&S::idle_seconds>>},
    {OCI_ATTR_CONN_MIN, Shape::ub4, Get<P, GetSize<&PoolSize::least>>, nullptr},
    {OCI_ATTR_CONN_MAX, Shape::ub4, Get<P, GetSize<&PoolSize::most>>, nullptr},
    {OCI_ATTR_CONN_INCR, Shape::ub4, Get<P, GetSize<&PoolSize::step>>, nullptr},
};

constexpr AttributeRow kSessionPoolRows[] = {
    {OCI_ATTR_SPOOL_STMTCACHESIZE, Shape::ub4, Get<P, GetSetting<&S::cache_size>>, Set<P, SetSetting<&S::cache_size>>},
    {OCI_ATTR_SPOOL_TIMEOUT, Shape::ub4, Get<P, GetSetting<&S::idle_seconds>>, Set<P, SetSetting<&S::idle_seconds>>},
    {OCI_ATTR_SPOOL_GETMODE, Shape::ub1, Get<P, GetSetting<&S::get_mode>>, Set<P, SetGetMode>},
    {OCI_ATTR_SPOOL_BUSY_COUNT, Shape::ub4, Get<P, GetCount<&Counts::busy>>, nullptr},
    {OCI_ATTR_SPOOL_OPEN_COUNT, Shape::ub4, Get<P, GetCount<&Counts::open>>, nullptr},
    {OCI_ATTR_SPOOL_MIN, Shape::ub4, Get<P, GetSize<&PoolSize::least>>, nullptr},
    {OCI_ATTR_SPOOL_MAX, Shape::ub4, Get<P, GetSize<&PoolSize::most>>, nullptr},
    {OCI_ATTR_SPOOL_INCR, Shape::ub4, Get<P, GetSize<&PoolSize::step>>, nullptr},
    {OCI_ATTR_SPOOL_WAIT_TIMEOUT, Shape::ub4, Get<P, GetSetting<&S::wait_milliseconds>>,
     Set<P, SetSetting<&S::wait_milliseconds>>},
};

}  // namespace

ConnectionPool::ConnectionPool(const Origin& origin) : PoolHandle(origin, kConnectionPoolNumbers) {}
SessionPool::SessionPool(const Origin& origin) : PoolHandle(origin, kSessionPoolNumbers) {}
std::span<const AttributeRow> ConnectionPool::Attributes() const { return kConnectionPoolRows; }
std::span<const AttributeRow> SessionPool::Attributes() const { return kSessionPoolRows; }
