// Connections and user sessions: logon, server attach, session begin, password change, versions, ping, break, reset.
// What begins or ends a session, or works on one, enters without the gate's lock and takes the locks of sessions/
// itself, one link's at a time: a session may be another context's, and another thread may end it meanwhile.
#include <string>

#include "entry/logon_text.h"
#include "handles/errors.h"
#include "handles/gate.h"
#include "oci.h"
#include "pools/pool_handle.h"
#include "sessions/service_context.h"

namespace {

constexpr ub4 kPasswordChangeLogsOn = OCI_AUTH;

Status CheckLogonMode(ub4 mode) {
    constexpr ub4 kPools = OCI_LOGON2_CPOOL | OCI_LOGON2_SPOOL;
    if (mode & OCI_LOGON2_PROXY) return Error(errors::kProxyUnsupported);
    if (mode & ~(kPools | OCI_LOGON2_STMTCACHE) || (mode & kPools) == kPools) return Error(errors::kBadMode);
    return {};
}

// What the context is to be attached to: a database, or a pool of that name. `cache` is set to the pool's cache size;
// where no user is named it is the pool's own.
Status FindTarget(const Environment& environment, std::string_view name, ub4 mode, engine::Credentials& credentials,
                  ServiceContext::Target& target, ub4& cache) {
    if (mode & OCI_LOGON2_STMTCACHE) cache = ServiceContext::kDefaultCacheSize;
    if (!(mode & (OCI_LOGON2_CPOOL | OCI_LOGON2_SPOOL))) {
        target.database = name;
        return {};
    }
    std::shared_ptr<Pool> pool;
    const Kind kind = mode & OCI_LOGON2_SPOOL ? Kind::session_pool : Kind::connection_pool;
    Status status = FindPool(environment, kind, name, pool);
    if (status.Failed()) return status;
    if (const ub4 size = pool->Settings().cache_size) cache = size;
    if (credentials.external) credentials = pool->Plan().own;
    target.source = std::make_shared<PoolSource>(std::move(pool), SessionWish());
    return status;
}

struct LogonTexts {
    const OraText* user;
    ub4 user_length;
    const OraText* password;
    ub4 password_length;
    const OraText* database;
    ub4 database_length;
};

// Logs on in the context that *out points to, or in a new one, which a failure takes away again.
Status LogOn(Environment& environment, OCISvcCtx** out, const LogonTexts& texts, ub4 mode) {
    if (!out) return Error(errors::kNullArgument);
    Status status = CheckLogonMode(mode);
    if (status.Failed()) return status;
    engine::Credentials credentials;
    std::string database;
    status =
        ReadCredentials(environment, texts.user, texts.user_length, texts.password, texts.password_length, credentials);
    if (status.Ok()) status = ReadDatabase(environment, texts.database, texts.database_length, database);
    ServiceContext::Target target;
    ub4 cache = 0;
    if (status.Ok()) status = FindTarget(environment, database, mode, credentials, target, cache);
    if (status.Failed()) return status;

    auto* service = Live<ServiceContext>(*out);
    Made<ServiceContext> made;
    if (!service) {
        made.reset(Create<ServiceContext>(environment, OCI_HTYPE_SVCCTX, 0));
        service = made.get();
    }
    status = service->LogOn(target, credentials, ServiceContext::EndedBy::logoff);
    if (status.Failed()) return status;
    if (cache > 0) service->statement_cache_size = cache;
    *out = AsHandle<OCISvcCtx>(service);
    (void)made.release();
    return status;
}

Status AttachToPool(Server& server, std::string_view name) {
    std::shared_ptr<Pool> pool;
    Status status = FindPool(server.Env(), Kind::connection_pool, name, pool);
    if (status.Failed()) return status;
    return server.Attach(std::make_shared<PoolSource>(std::move(pool), SessionWish()));
}

Status BeginSession(ServiceContext& service, Session& session, ub4 kind, ub4 mode) {
    Server* server = service.GetServer();
    if (!server || !server->Attached()) return Error(errors::kAttachFirst);
    engine::Credentials credentials{session.user, session.password, kind == OCI_CRED_EXT};
    if (kind == OCI_CRED_PROXY) return Error(errors::kProxyUnsupported);
    if (kind != OCI_CRED_RDBMS && kind != OCI_CRED_EXT) return Error(errors::kBadCredentials);
    Status status = credentials.external ? Status() : CheckCredentials(credentials);
    if (status.Ok()) status = session.Begin(*server, credentials);
    if (status.Ok() && mode & OCI_STMT_CACHE && service.statement_cache_size == 0) {
        service.statement_cache_size = ServiceContext::kDefaultCacheSize;
    }
    return status;
}

// Begins a session with the old password, changes it, and takes the session into the context.
Status ChangePasswordAndLogOn(ServiceContext& service, const std::string& user, const std::string& old_password,
                              const std::string& new_password) {
    Server* server = nullptr;
    Status status = service.Lent() ? Error(errors::kNoModeSwitch) : service.RequireServer(server);
    if (status.Failed()) return status;
    Session* set = service.GetSession();
    Session& session = set ? *set : service.OwnSession();
    const Status begun = session.Begin(*server, {user, old_password, false});
    const bool before = begun.Number() == errors::kAlreadyAuthenticated;
    if (begun.Failed() && !before) return begun;
    status = session.ChangePassword(user, old_password, new_password);
    if (before) return status;
    if (status.Failed()) {
        session.Drop();
        return status;
    }
    session.user = user;
    return service.SetSession(&session);
}

struct PasswordTexts {
    std::string user;
    std::string old_password;
    std::string new_password;
};

Status ChangePassword(ServiceContext& service, PasswordTexts& texts, ub4 mode) {
    if (texts.new_password.empty()) return Error(errors::kNoNewPassword);
    if (mode & kPasswordChangeLogsOn) {
        if (texts.user.empty()) return Error(errors::kBadLogon);
        return ChangePasswordAndLogOn(service, texts.user, texts.old_password, texts.new_password);
    }
    const SessionTurn turn(service);
    if (turn.status.Failed()) return turn.status;
    if (texts.user.empty()) texts.user = turn.link->user;
    if (texts.user.empty()) return Error(errors::kBadLogon);
    return turn.link->Engine().ChangePassword(texts.user, texts.old_password, texts.new_password);
}

// The version text of the server that a service context or a server handle is attached to.
Status VersionText(Object& object, std::string& text) {
    Server* server = nullptr;
    if (object.Type() == OCI_HTYPE_SERVER) {
        server = static_cast<Server*>(&object);
    } else if (Status status = static_cast<ServiceContext&>(object).RequireServer(server); status.Failed()) {
        return status;
    }
    const std::shared_ptr<engine::Database> database = server->AttachedDatabase();
    if (!database) return Error(errors::kNotConnected);
    text = database->Version();
    return {};
}

sword EnterLogOn(OCIEnv* env, OCIError* err, OCISvcCtx** out, const LogonTexts& texts, ub4 mode,
                 const char* name = __builtin_FUNCTION()) noexcept {
    return Enter<Environment>(env, err, [&](Environment& environment) {
        const LongCall may_take_long;
        return LogOn(environment, out, texts, mode);
    }, name);
}

// Calls on the links that a service context or a server handle has; needs at least an attached server. Takes no lock:
// OCIBreak comes from another thread while a call holds it.
sword EnterLinks(dvoid* handle, OCIError* errhp, void (*act)(Link&),
                 const char* name = __builtin_FUNCTION()) noexcept {
    return EnterError(errhp, [&](ErrorHandle&) -> Status {
        Object* object = LiveOneOf(handle, Kind::server, Kind::service_context);
        if (!object) return InvalidHandle();
        if (object->Type() == OCI_HTYPE_SVCCTX) {
            auto& service = static_cast<ServiceContext&>(*object);
            if (service.Lent()) return Error(errors::kNoModeSwitch);
            Server* server = nullptr;
            const Session* session = service.GetSession();
            const std::shared_ptr<Link> link = session ? session->ShareLink() : nullptr;
            if (!link) return service.RequireServer(server);
            act(*link);
            return {};
        }
        const auto& server = static_cast<Server&>(*object);
        if (!server.Attached()) return Error(errors::kNotConnected);
        for (const std::shared_ptr<Link>& link : server.Links()) act(*link);
        return {};
    }, name);
}

}  // namespace

sword OCILogon(OCIEnv* env, OCIError* err, OCISvcCtx** svcOut, const OraText* user, ub4 userLen, const OraText* pw,
               ub4 pwLen, const OraText* db, ub4 dbLen) {
    return EnterLogOn(env, err, svcOut, {user, userLen, pw, pwLen, db, dbLen}, OCI_DEFAULT);
}

sword OCILogon2(OCIEnv* env, OCIError* err, OCISvcCtx** svcOut, const OraText* user, ub4 userLen, const OraText* pw,
                ub4 pwLen, const OraText* db, ub4 dbLen, ub4 mode) {
    return EnterLogOn(env, err, svcOut, {user, userLen, pw, pwLen, db, dbLen}, mode);
}

sword OCILogoff(OCISvcCtx* svc, OCIError* err) {
    return EnterUnlocked<ServiceContext>(svc, err, [](ServiceContext& service) {
        const LongCall may_take_long;
        return service.LogOff();
    });
}

sword OCIServerAttach(OCIServer* srv, OCIError* err, const OraText* db, sb4 dbLen, ub4 mode) {
    return Enter<Server>(srv, err, [&](Server& server) -> Status {
        const LongCall may_take_long;
        if (mode != OCI_DEFAULT && mode != OCI_CPOOL) return Error(errors::kBadMode);
        if (dbLen < 0) return Error(errors::kNullArgument);
        std::string database;
        Status status = ReadDatabase(server.Env(), db, static_cast<ub4>(dbLen), database);
        if (status.Ok() && mode == OCI_CPOOL) return AttachToPool(server, database);
        return status.Ok() ? server.Attach(database) : status;
    });
}

// The mode is not looked at: applications pass modes of environments here.
sword OCIServerDetach(OCIServer* srv, OCIError* err, ub4) {
    return Enter<Server>(srv, err, [](Server& server) {
        const LongCall may_take_long;
        return ServiceContext::IsOfObtained(server) ? Error(errors::kMustRelease) : server.Detach();
    });
}

sword OCISessionBegin(OCISvcCtx* svc, OCIError* err, OCISession* ses, ub4 credentials, ub4 mode) {
    return EnterUnlocked<ServiceContext>(svc, err, [&](ServiceContext& service) {
        auto* session = Live<Session>(ses);
        const LongCall may_take_long;
        return session ? BeginSession(service, *session, credentials, mode) : InvalidHandle();
    });
}

sword OCISessionEnd(OCISvcCtx* svc, OCIError* err, OCISession* ses, ub4) {
    return EnterUnlocked<ServiceContext>(svc, err, [&](const ServiceContext& service) {
        auto* session = Live<Session>(ses);
        const LongCall may_take_long;
        if (!session) return InvalidHandle();
        if (service.Lent() && service.GetSession() == session) return Error(errors::kNoModeSwitch);
        return ServiceContext::IsOfObtained(*session) ? Error(errors::kMustRelease) : session->End();
    });
}

sword OCIPasswordChange(OCISvcCtx* svc, OCIError* err, const OraText* user, ub4 userLen, const OraText* oldPw,
                        ub4 oldLen, const OraText* newPw, sb4 newLen, ub4 mode) {
    return EnterUnlocked<ServiceContext>(svc, err, [&](ServiceContext& service) {
        const LongCall may_take_long;
        PasswordTexts texts;
        const Environment& environment = service.Env();
        Status status = ReadText(environment, user, userLen, texts.user);
        if (status.Ok()) status = ReadText(environment, oldPw, oldLen, texts.old_password);
        if (status.Ok()) status = ReadText(environment, newPw, static_cast<ub4>(newLen), texts.new_password);
        return status.Ok() ? ChangePassword(service, texts, mode) : status;
    });
}

sword OCIServerVersion(dvoid* hndl, OCIError* err, OraText* buf, ub4 bufsize, ub1 type) {
    return Enter<Object>(hndl, err, [&](Object& object) -> Status {
        if (object.Type() != type || (type != OCI_HTYPE_SVCCTX && type != OCI_HTYPE_SERVER)) return InvalidHandle();
        if (!buf || bufsize == 0) return Error(errors::kNullArgument);
        std::string text;
        Status status = VersionText(object, text);
        if (status.Ok()) TextToBuffer(object.Env(), text, buf, bufsize);    // cut to what fits
        return status;
    });
}

sword OCIPing(OCISvcCtx* svc, OCIError* err, ub4) {
    return EnterUnlocked<ServiceContext>(svc, err, [](ServiceContext& service) {
        const LongCall may_take_long;
        const SessionTurn turn(service);
        return turn.link ? turn.link->Engine().Ping() : turn.status;
    });
}

sword OCIBreak(dvoid* svcOrServer, OCIError* err) {
    return EnterLinks(svcOrServer, err, [](Link& link) { link.Cancel(); });
}

sword OCIReset(dvoid* svcOrServer, OCIError* err) {
    return EnterLinks(svcOrServer, err, [](Link& link) { link.ForgetCancel(); });
}
