// Pools, and sessions that are got and released, out of pools or by themselves.
#include <memory>
#include <string>

#include "entry/logon_text.h"
#include "handles/errors.h"
#include "handles/gate.h"
#include "oci.h"
#include "pools/pool_handle.h"
#include "sessions/service_context.h"

namespace {

// ---- Creating and destroying

struct PoolTexts {
    const OraText* database;
    ub4 database_length;
    const OraText* user;
    ub4 user_length;
    const OraText* password;
    ub4 password_length;
};

Status ReadRequest(const Environment& environment, const PoolTexts& texts, PoolHandle::Request& request) {
    Status status = ReadCredentials(environment, texts.user, texts.user_length, texts.password, texts.password_length,
                                    request.own);
    if (status.Failed() && request.own.user.empty() && !request.own.password.empty())
        return Error(errors::kNoUserName);
    return status.Ok() ? ReadDatabase(environment, texts.database, texts.database_length, request.database) : status;
}

// The rest of a create, once its mode is known.
template <class Length>
Status CreatePool(PoolHandle& handle, const PoolTexts& texts, PoolHandle::Request request, bool reinitialize,
                  OraText** name, Length* length) {
    Status status;
    if (reinitialize) {
        status = handle.Reinitialize(request.size);
    } else {
        status = ReadRequest(handle.Env(), texts, request);
        if (status.Ok()) status = handle.CreatePool(std::move(request));
    }
    if (status.Failed()) return status;
    const std::string_view shown = handle.Name();
    if (name) *name = reinterpret_cast<OraText*>(const_cast<char*>(shown.data()));
    if (length) *length = static_cast<Length>(shown.size());
    return status;
}

// The pool handle must be of the environment: the names of pools are.
template <class P, class Body>
sword EnterPool(OCIEnv* env, void* pool, OCIError* err, Body body, const char* name = __builtin_FUNCTION()) noexcept {
    return EnterUnlocked<Environment>(env, err, [&](Environment& environment) {
        P* handle = Live<P>(pool);
        const LongCall may_take_long;
        return handle && &handle->Env() == &environment ? body(*handle) : InvalidHandle();
    }, name);
}

template <class P>
sword DestroyPool(void* pool, OCIError* err, ub4 mode, ub4 force, const char* name = __builtin_FUNCTION()) noexcept {
    return EnterUnlocked<P>(pool, err, [&](P& handle) {
        const LongCall may_take_long;
        return mode & ~force ? Error(errors::kBadPoolDestroyMode) : handle.DestroyPool(mode != OCI_DEFAULT);
    }, name);
}

// ---- Getting a session

constexpr ub4 kFromPools = OCI_SESSGET_SPOOL | OCI_SESSGET_CPOOL;
constexpr ub4 kPurities = OCI_SESSGET_PURITY_NEW | OCI_SESSGET_PURITY_SELF;
constexpr ub4 kGetModes = kFromPools | kPurities | OCI_SESSGET_STMTCACHE | OCI_SESSGET_CREDEXT |
                          OCI_SESSGET_SPOOL_MATCHANY;

Status CheckGetMode(ub4 mode) {
    if (mode & OCI_SESSGET_CREDPROXY) return Error(errors::kProxyUnsupported);
    if (mode & OCI_SESSGET_SYSDBA) {    // nobody here is one; the mode is not for pools anyway
        return Error(mode & kFromPools ? errors::kBadMode : errors::kInsufficientPrivileges);
    }
    const bool excluded = (mode & kFromPools) == kFromPools || (mode & kPurities) == kPurities ||
                          (mode & OCI_SESSGET_SPOOL_MATCHANY && !(mode & OCI_SESSGET_SPOOL));
    return mode & ~kGetModes || excluded ? Error(errors::kBadMode) : Status();
}

struct GetRequest {
    engine::Credentials credentials;
    std::string database;    // or the pool's name
    SessionWish wish;
};

Status ReadCredentials(const Session* authentication, ub4 mode, engine::Credentials& credentials) {
    if (authentication) {
        credentials.user = authentication->user;
        credentials.password = authentication->password;
    }
    if (!(mode & OCI_SESSGET_CREDEXT)) return CheckCredentials(credentials);
    credentials = {"", "", true};
    return {};
}

// The target: a database, or a pool and the wish for its session. `cache` is set to the size of the cache; where no user
// is named it is the pool's own.
Status FindTarget(const Environment& environment, GetRequest& request, ub4 mode, ServiceContext::Target& target,
                  ub4& cache) {
    if (mode & OCI_SESSGET_STMTCACHE) cache = ServiceContext::kDefaultCacheSize;
    if (!(mode & kFromPools)) {
        target.database = request.database;
        return {};
    }
    std::shared_ptr<Pool> pool;
    const Kind kind = mode & OCI_SESSGET_SPOOL ? Kind::session_pool : Kind::connection_pool;
    Status status = FindPool(environment, kind, request.database, pool);
    if (status.Failed()) return status;
    // The means of the system are not what all sessions of this pool are begun with.
    if (mode & OCI_SESSGET_CREDEXT && pool->Plan().one_user && !pool->Plan().own.external)
        return Error(errors::kBadMode);
    if (const ub4 size = pool->Settings().cache_size) cache = size;
    if (request.credentials.external && !(mode & OCI_SESSGET_CREDEXT)) request.credentials = pool->Plan().own;
    target.source = std::make_shared<PoolSource>(std::move(pool), request.wish);
    return status;
}

struct GetResult {
    OCISvcCtx** service;
    OraText** tag;
    ub4* tag_length;
    boolean* found;
};

// The tag that a session came with; none when the pool has gone meanwhile, and its place with it.
std::string TagOf(const Session* session) {
    const std::shared_ptr<Link> link = session ? session->ShareLink() : nullptr;
    if (!link) return {};
    const SerialLock lock(link->Serial());
    return link->Place() ? static_cast<const PoolPlace*>(link->Place())->Tag() : std::string();
}

// The tag as the application reads it; whether it is the one that was wished for.
void ShowTag(ServiceContext& service, const std::string& wished, const GetResult& result) {
    const std::string tag = TagOf(service.GetSession());
    std::string converted;
    service.tag = TextOut(service.Env(), tag, converted);
    if (result.tag) *result.tag = tag.empty() ? nullptr : reinterpret_cast<OraText*>(service.tag.data());
    if (result.tag_length) *result.tag_length = static_cast<ub4>(service.tag.size());
    if (result.found) *result.found = tag == wished ? TRUE : FALSE;
}

Status GetSession(Environment& environment, GetRequest& request, ub4 mode, const GetResult& result) {
    ServiceContext::Target target;
    ub4 cache = 0;
    Status status = FindTarget(environment, request, mode, target, cache);
    if (status.Failed()) return status;
    Made<ServiceContext> made(Create<ServiceContext>(environment, OCI_HTYPE_SVCCTX, 0));
    status = made->LogOn(target, request.credentials, ServiceContext::EndedBy::release);
    if (status.Failed()) return status;
    made->statement_cache_size = cache;
    ShowTag(*made, request.wish.tag, result);
    *result.service = AsHandle<OCISvcCtx>(made.release());
    return status;
}

}  // namespace

sword OCIConnectionPoolCreate(OCIEnv* env, OCIError* err, OCICPool* pool, OraText** nameOut, sb4* nameLenOut,
                              const OraText* db, sb4 dbLen, ub4 min, ub4 max, ub4 incr, const OraText* user,
                              sb4 userLen, const OraText* pw, sb4 pwLen, ub4 mode) {
    return EnterPool<ConnectionPool>(env, pool, err, [&](ConnectionPool& handle) -> Status {
        if (mode != OCI_DEFAULT && mode != OCI_CPOOL_REINITIALIZE) return Error(errors::kBadPoolCreateMode);
        const bool reinitialize = mode == OCI_CPOOL_REINITIALIZE;
        if (!reinitialize && (dbLen < 0 || userLen < 0 || pwLen < 0)) return Error(errors::kBadPoolSize);
        const PoolTexts texts{db, static_cast<ub4>(dbLen), user, static_cast<ub4>(userLen), pw,
                              static_cast<ub4>(pwLen)};
        PoolHandle::Request request;
        request.size = {min, max, incr};
        request.fill = true;
        return CreatePool(handle, texts, std::move(request), reinitialize, nameOut, nameLenOut);
    });
}

sword OCIConnectionPoolDestroy(OCICPool* pool, OCIError* err, ub4 mode) {
    return DestroyPool<ConnectionPool>(pool, err, mode, OCI_DEFAULT);
}

sword OCISessionPoolCreate(OCIEnv* env, OCIError* err, OCISPool* pool, OraText** nameOut, ub4* nameLenOut,
                           const OraText* db, ub4 dbLen, ub4 min, ub4 max, ub4 incr, OraText* user, ub4 userLen,
                           OraText* pw, ub4 pwLen, ub4 mode) {
    return EnterPool<SessionPool>(env, pool, err, [&](SessionPool& handle) -> Status {
        constexpr ub4 kModes = OCI_SPC_REINITIALIZE | OCI_SPC_HOMOGENEOUS | OCI_SPC_STMTCACHE | OCI_SPC_NO_RLB;
        if (mode & ~kModes) return Error(errors::kBadPoolCreateMode);
        PoolHandle::Request request;
        request.size = {min, max, incr};
        request.one_user = request.fill = mode & OCI_SPC_HOMOGENEOUS;
        request.caches = mode & OCI_SPC_STMTCACHE;
        return CreatePool(handle, {db, dbLen, user, userLen, pw, pwLen}, std::move(request),
                          mode & OCI_SPC_REINITIALIZE, nameOut, nameLenOut);
    });
}

sword OCISessionPoolDestroy(OCISPool* pool, OCIError* err, ub4 mode) {
    return DestroyPool<SessionPool>(pool, err, mode, OCI_SPD_FORCE);
}

sword OCISessionGet(OCIEnv* env, OCIError* err, OCISvcCtx** svcOut, OCIAuthInfo* auth, OraText* poolOrDb, ub4 poolLen,
                    const OraText* tag, ub4 tagLen, OraText** tagOut, ub4* tagLenOut, boolean* found, ub4 mode) {
    return EnterUnlocked<Environment>(env, err, [&](Environment& environment) -> Status {
        const Session* authentication = Live<Session>(auth);
        if (auth && !authentication) return InvalidHandle();
        const LongCall may_take_long;
        if (!svcOut) return Error(errors::kNullArgument);
        Status status = CheckGetMode(mode);
        GetRequest request;
        if (status.Ok()) status = ReadCredentials(authentication, mode, request.credentials);
        if (status.Ok()) status = ReadDatabase(environment, poolOrDb, poolLen, request.database);
        if (status.Ok()) status = ReadText(environment, tag, tagLen, request.wish.tag);
        if (status.Failed()) return status;
        request.wish.any_tag = mode & OCI_SESSGET_SPOOL_MATCHANY;
        request.wish.fresh = mode & OCI_SESSGET_PURITY_NEW || (authentication && authentication->purity == 1);
        return GetSession(environment, request, mode, {svcOut, tagOut, tagLenOut, found});
    });
}

// The context goes with its session.
sword OCISessionRelease(OCISvcCtx* svc, OCIError* err, OraText* tag, ub4 tagLen, ub4 mode) {
    return EnterUnlocked<ServiceContext>(svc, err, [&](ServiceContext& service) -> Status {
        const LongCall may_take_long;
        if (mode & ~static_cast<ub4>(OCI_SESSRLS_DROPSESS | OCI_SESSRLS_RETAG)) return Error(errors::kBadMode);
        GivingBack how;
        how.drop = mode & OCI_SESSRLS_DROPSESS;
        Status status;
        if (mode & OCI_SESSRLS_RETAG) status = ReadText(service.Env(), tag, tagLen, how.tag.emplace());
        if (status.Failed()) return status;
        const bool obtained = service.Obtained();
        status = service.Release(std::move(how));
        if (obtained && !service.Obtained()) Destroy(&service);
        return status;
    });
}
