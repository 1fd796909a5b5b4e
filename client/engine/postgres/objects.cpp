// Describing tables, views, sequences, schemas and the database, from the catalogue; changing passwords.
#include <cstdlib>
#include <memory>
#include <string>
#include <vector>

#include "engine/pieces.h"
#include "engine/postgres/connection.h"
#include "engine/postgres/types.h"
#include "handles/errors.h"

namespace engine::postgres {
namespace {

struct Freeing {
    void operator()(char* text) const noexcept { PQfreemem(text); }
};
using LibpqText = std::unique_ptr<char, Freeing>;

std::string Text(const Result& result, int row, int column) { return PQgetvalue(result.get(), row, column); }
std::int64_t Integer(const Result& result, int column) {
    return std::strtoll(PQgetvalue(result.get(), 0, column), nullptr, 10);
}
std::string ShownText(const Result& result, int row, int column) { return ShownName(Text(result, row, column)); }

ObjectKind KindOf(char relation) {
    switch (relation) {
        case 'v':
        case 'm': return ObjectKind::view;
        case 'S': return ObjectKind::sequence;
        default: return ObjectKind::table;
    }
}

// The relation of that name: in the schema, or in the first one of the search path.
constexpr const char* kFind =
    "select c.oid, c.relkind, n.nspname, c.relname from pg_catalog.pg_class c"
    " join pg_catalog.pg_namespace n on n.oid = c.relnamespace where c.relname = $1"
    " and case when $2 = '' then pg_catalog.pg_table_is_visible(c.oid) else n.nspname = $2 end"
    " and c.relkind in ('r', 'p', 'f', 'v', 'm', 'S')";
constexpr const char* kSequence =
    "select seqincrement, seqmin, seqmax from pg_catalog.pg_sequence where seqrelid = $1::oid";
constexpr const char* kSchema = "select nspname from pg_catalog.pg_namespace where nspname = $1";
constexpr const char* kMembers =
    "select c.relname, c.relkind from pg_catalog.pg_class c join pg_catalog.pg_namespace n on n.oid = c.relnamespace"
    " where n.nspname = $1 and c.relkind in ('r', 'p', 'f', 'v', 'm', 'S') order by 1";
constexpr const char* kDatabase = "select pg_catalog.current_database() where pg_catalog.current_database() = $1";
constexpr const char* kSchemas =
    "select nspname from pg_catalog.pg_namespace where nspname !~ '^pg_(toast|temp)' order by 1";

}  // namespace

Status PgConnection::Describe(std::string_view name, ObjectKind kind, ObjectDescription& object) {
    const bool wants_table = kind == ObjectKind::table || kind == ObjectKind::view;
    const Status missing = Refused(wants_table ? errors::kNoSuchTable : errors::kNoSuchObject);
    ObjectName parts;
    if (!ReadObjectName(name, parts)) return missing;
    const std::string schema = StoredName(parts.schema), plain = StoredName(parts.name);
    Result found;
    Result rows;
    ObjectDescription described;
    Status status;
    if (kind == ObjectKind::schema || kind == ObjectKind::database) {
        const bool is_schema = kind == ObjectKind::schema;
        if (!schema.empty()) return missing;
        if (status = Ask(is_schema ? kSchema : kDatabase, {plain}, found); !status.Ok()) return status;
        if (PQntuples(found.get()) == 0) return missing;
        if (status = is_schema ? Ask(kMembers, {plain}, rows) : Ask(kSchemas, {}, rows); !status.Ok()) return status;
        described.kind = kind;
        described.name = ShownText(found, 0, 0);
        for (int row = 0; row < PQntuples(rows.get()); ++row) {
            described.members.push_back(ShownText(rows, row, 0));
            if (is_schema) described.member_kinds.push_back(KindOf(*PQgetvalue(rows.get(), row, 1)));
        }
        object = std::move(described);
        return status;
    }
    status = Ask(kFind, {plain, schema}, found);
    if (!status.Ok()) return status;
    if (PQntuples(found.get()) == 0) return missing;
    described.kind = KindOf(*PQgetvalue(found.get(), 0, 1));
    if (kind != ObjectKind::any && described.kind != kind) return missing;
    described.schema = ShownText(found, 0, 2);
    described.name = ShownText(found, 0, 3);
    const bool is_sequence = described.kind == ObjectKind::sequence;
    if (!is_sequence) {
        Table table;
        status = ReadTable(static_cast<Oid>(std::stoul(Text(found, 0, 0))), table);
        for (TableColumn& column : table.columns)
            if (!column.name.empty()) described.columns.push_back(std::move(column.described));
    } else {
        status = Ask(kSequence, {Text(found, 0, 0)}, rows);
    }
    if (!status.Ok()) return status;
    if (is_sequence && PQntuples(rows.get()) == 1) {
        described.sequence_step = Integer(rows, 0);
        described.sequence_least = Integer(rows, 1);
        described.sequence_most = Integer(rows, 2);
    }
    object = std::move(described);
    return status;
}

// ---- Passwords

Status PgConnection::ChangePassword(const std::string& user, const std::string& old_password,
                                    const std::string& new_password) {
    if (in_transaction_) return Refused(24754, "a rollback would undo it");
    if (new_password.find('\0') != std::string::npos) return Refused(errors::kBadLogon);
    const std::string role = RoleName(user);
    Result found;
    Status status = Ask("select 1 from pg_catalog.pg_roles where rolname = $1", {role}, found);
    if (status.Ok() && PQntuples(found.get()) == 0) status = Refused(errors::kBadLogon);
    if (!status.Ok()) return status;
    std::unique_ptr<class Wire> proof;
    status = home_->Connect({user, old_password, false}, nullptr, proof);
    if (status.Number() == errors::kBadLogon) return Refused(errors::kBadOldPassword);
    if (!status.Ok()) return status;
    // What is sent is what the server keeps of a password.
    const LibpqText kept(PQencryptPasswordConn(wire_->Libpq(), new_password.c_str(), role.c_str(), "scram-sha-256"));
    const LibpqText name(PQescapeIdentifier(wire_->Libpq(), role.data(), role.size()));
    if (!kept || !name) return Refused(errors::kOutOfMemory);
    status = wire_->Run((std::string("alter role ") + name.get() + " password '" + kept.get() + "'").c_str());
    if (status.Ok() && RoleName(credentials_.user) == role) credentials_.password = new_password;
    return status;
}

}  // namespace engine::postgres
