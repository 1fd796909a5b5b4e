// Connecting: parameters, settings of a session, what the server tells of itself.
#include "engine/postgres/home.h"

#include <utility>

#include "engine/pieces.h"
#include "engine/postgres/schema.h"
#include "handles/errors.h"

namespace engine::postgres {
namespace {

// Texts come in UTF-8, dates and intervals in the form that is read here; a lock is waited for as long as on other engines, unless
// the URL says otherwise. What follows is what the server tells of itself.
constexpr const char* kPrime =
    "select pg_catalog.set_config('client_encoding', 'UTF8', false), pg_catalog.set_config('datestyle', 'ISO, DMY', false),"
    " pg_catalog.set_config('bytea_output', 'hex', false), pg_catalog.set_config('intervalstyle', 'sql_standard', false),"
    " pg_catalog.set_config('standard_conforming_strings', 'on', false),"
    " case when pg_catalog.current_setting('lock_timeout') = '0'"
    " then pg_catalog.set_config('lock_timeout', '2000', false) end,"
    " pg_catalog.current_setting('server_version'), pg_catalog.current_setting('max_prepared_transactions')::int > 0,"
    " pg_catalog.version(),"
    " pg_catalog.obj_description(pg_catalog.to_regnamespace('kelp')::oid, 'pg_namespace'),"
    " pg_catalog.has_database_privilege(pg_catalog.current_database(), 'create')"
    " and pg_catalog.current_setting('server_version_num')::int >= 140000"
    " and not pg_catalog.pg_is_in_recovery()";
enum : int { kServerVersion = 6, kTwoPhase = 7, kBanner = 8, kSchema = 9, kMayMakeSchema = 10 };

// What stands in the schema goes before the server's own, and behind the user's.
constexpr const char* kSetPath =
    "select pg_catalog.set_config('search_path', pg_catalog.concat_ws(', ', nullif("
    "pg_catalog.current_setting('search_path'), ''), 'kelp', 'pg_catalog'), false)"
    " where pg_catalog.to_regnamespace('kelp') is not null";

constexpr const char* kUnknownVersion = "10 or later, PostgreSQL: nobody has logged on yet";

}  // namespace

std::string RoleName(std::string_view name) {
    const bool is_quoted = name.size() >= 2 && name.front() == '"' && name.back() == '"';
    return is_quoted ? std::string(name.substr(1, name.size() - 2)) : Lower(name);
}

// A refused user is an answer, too.
Status Home::Attach() {
    std::unique_ptr<Wire> wire;
    Status status = Log({"", "", true}, nullptr, wire);
    if (status.Number() == errors::kBadLogon) return {};
    const std::lock_guard lock(mutex_);
    spare_ = std::move(wire);
    return status;
}

Status Home::Connect(const Credentials& credentials, std::shared_ptr<const StopRequest> stop,
                     std::unique_ptr<Wire>& wire) {
    if (credentials.external) {
        const std::lock_guard lock(mutex_);
        wire = std::move(spare_);
    }
    if (wire) {
        wire->Obey(stop);
        wire->Sync();
        if (wire->Drain().Ok()) return {};
        wire.reset();    // it has waited for too long
    }
    return Log(credentials, std::move(stop), wire);
}

Status Home::Log(const Credentials& credentials, std::shared_ptr<const StopRequest> stop, std::unique_ptr<Wire>& wire) {
    const bool has_zero = (credentials.user + credentials.password).find('\0') != std::string::npos;
    if (has_zero) return Refused(errors::kBadLogon);
    Parameters parameters{{{"dbname", url_}, {"fallback_application_name", "libkelpci"}, {"client_encoding", "UTF8"}}};
    if (!credentials.external) {
        const std::string role = RoleName(credentials.user);
        if (role.empty()) return Refused(errors::kBadLogon);    // libpq would take another
        parameters.values.emplace_back("user", role);
        parameters.values.emplace_back("password", credentials.password);
    }
    std::unique_ptr<Wire> made;
    Status status = Wire::Connect(parameters, std::move(stop), made);
    if (status.Ok()) status = Prime(*made);
    if (status.Ok()) wire = std::move(made);
    return status;
}

Status Home::Prime(Wire& wire) {
    Result result;
    Status status = wire.Run(kPrime, &result);
    if (!status.Ok()) return status;
    const auto column = [&](int index) { return std::string(PQgetvalue(result.get(), 0, index)); };
    if (column(kSchema) != kSchemaVersion && column(kMayMakeSchema) == "t") MakeSchema(wire);
    if (status = wire.Run(kSetPath); !status.Ok()) return status;
    two_phase_.store(column(kTwoPhase) == "t", std::memory_order_relaxed);
    const std::string version = column(kServerVersion) + " KELP server engine, " + column(kBanner);
    std::string where = wire.Where();
    const std::lock_guard lock(mutex_);
    version_ = version;
    where_ = std::move(where);
    return status;
}

// Without it the server's own meaning is all there is: what fails is answered by the statements that need it.
void Home::MakeSchema(Wire& wire) { wire.RunScript(kSchemaCommands); }

std::string Home::Where() {
    const std::lock_guard lock(mutex_);
    return where_.empty() ? url_ : where_;
}

std::string Home::Version() {
    const std::lock_guard lock(mutex_);
    return version_.empty() ? kUnknownVersion : version_;
}

}  // namespace engine::postgres
