// The schema that a session has asked for: it stands first in the server's search path. A path that is set within a
// transaction goes with what is undone of it, and is set anew before the next call.
#include "engine/postgres/connection.h"
#include "engine/postgres/lob_store.h"
#include "engine/postgres/types.h"
#include "handles/errors.h"

namespace engine::postgres {
namespace {

constexpr const char* kFind = "select pg_catalog.quote_ident(nspname) from pg_catalog.pg_namespace where nspname = $1";

std::string First(const Result& result) { return PQntuples(result.get()) > 0 ? PQgetvalue(result.get(), 0, 0) : ""; }

}  // namespace

Status PgConnection::UseSchema(std::string& schema) {
    Result result;
    if (schema.empty()) {
        Status status = Ask("select pg_catalog.current_schema()", {}, result);
        if (status.Ok()) schema = ShownName(First(result));
        return status;
    }
    if (Status status = Ask(kFind, {StoredName(schema)}, result); !status.Ok()) return status;
    if (First(result).empty()) return Refused(errors::kNoSuchSchema);
    schema_ = std::make_shared<const std::string>(First(result));
    return SetPath();
}

void PgConnection::PreferSchemaOf(const Connection* other) noexcept {
    const auto* connection = dynamic_cast<const PgConnection*>(other);
    std::shared_ptr<const std::string> wanted = connection ? connection->schema_ : nullptr;
    if (wanted == schema_) return;
    schema_ = std::move(wanted);
    path_stands_ = false;
}

Status PgConnection::SetPath() {
    Result result;
    struct Standing {
        bool& stands;
        bool set = false;
        ~Standing() { stands = set; }
    } standing{path_stands_};
    path_stands_ = true;    // for what is asked meanwhile
    Status status = own_path_.empty() ? Ask("select pg_catalog.current_setting('search_path')", {}, result) : Status();
    if (status.Ok() && own_path_.empty()) own_path_ = First(result);
    const std::string path = schema_ ? *schema_ + (own_path_.empty() ? "" : ", ") + own_path_ : own_path_;
    if (status.Ok()) status = Ask("select pg_catalog.set_config('search_path', $1, false)", {path}, result);
    standing.set = status.Ok();
    path_may_go_ = in_transaction_;
    return status;
}

// Some of the transaction, or all of it.
void PgConnection::SomethingUndone(std::uint64_t since) noexcept {
    lobs_->Undone(since);
    if (path_may_go_) path_stands_ = false;
}

}  // namespace engine::postgres
