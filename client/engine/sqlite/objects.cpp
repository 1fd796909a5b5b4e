// Describing tables, views, schemas and the database itself. SQLite's schemas are main, temp and what is attached;
// names are the same in either letter case and shown in upper case, as the names of columns are.
#include <cctype>
#include <filesystem>
#include <initializer_list>
#include <new>
#include <string>
#include <vector>

#include "engine/pieces.h"
#include "engine/sqlite/accounts.h"
#include "engine/sqlite/connection.h"
#include "engine/sqlite/describe.h"
#include "handles/errors.h"

namespace engine::sqlite {
namespace {

std::string Upper(std::string_view text) {
    std::string upper(text);
    for (char& c : upper) c = static_cast<char>(c >= 'a' && c <= 'z' ? c - 'a' + 'A' : c);
    return upper;
}

// In backquotes: a name in double quotes would count as one that the application wrote.
std::string Quoted(std::string_view name) {
    std::string quoted = "`";
    for (const char c : name) quoted.append(c == '`' ? 2 : 1, c);
    return quoted += '`';
}

// Hands each row of a query to `take`.
template <class Take>
Status Rows(sqlite3* database, const std::string& sql, std::string_view bound, Take take) {
    sqlite3_stmt* compiled = nullptr;
    int code = sqlite3_prepare_v2(database, sql.c_str(), static_cast<int>(sql.size()), &compiled, nullptr);
    const StatementHandle statement(compiled);
    if (code == SQLITE_OK && sqlite3_bind_parameter_count(compiled) > 0) {
        code = sqlite3_bind_text(compiled, 1, bound.data(), static_cast<int>(bound.size()), SQLITE_STATIC);
    }
    if (code == SQLITE_OK) code = sqlite3_step(compiled);
    for (; code == SQLITE_ROW; code = sqlite3_step(compiled)) take(compiled);
    return code == SQLITE_DONE ? Status() : Failure(database, code);
}

std::string TextAt(sqlite3_stmt* row, int column) {
    const auto* text = reinterpret_cast<const char*>(sqlite3_column_text(row, column));
    return text ? text : throw std::bad_alloc();
}

// The texts of the first column.
Status Texts(sqlite3* database, const std::string& sql, std::string_view bound, std::vector<std::string>& texts) {
    return Rows(database, sql, bound, [&texts](sqlite3_stmt* row) { texts.push_back(TextAt(row, 0)); });
}

// In the order in which SQLite looks for a name.
Status Schemas(sqlite3* database, std::vector<std::string>& schemas) {
    return Texts(database, "select name from pragma_database_list order by name <> 'temp', seq", {}, schemas);
}

struct Found {
    std::string schema;
    std::string type;    // "table", "view"; empty: there is none
};

Status Find(sqlite3* database, const std::string& schema, const std::string& name, Found& found) {
    std::vector<std::string> schemas;
    Status status = Schemas(database, schemas);
    for (const std::string& candidate : schemas) {
        if (status.Failed() || !found.type.empty()) break;
        if (!schema.empty() && sqlite3_stricmp(schema.c_str(), candidate.c_str()) != 0) continue;
        std::vector<std::string> types;
        status = Texts(database, "select type from " + Quoted(candidate) + ".sqlite_schema where type in ('table', 'view')"
                       " and name = ?1 collate nocase", name, types);
        if (!types.empty()) found = {candidate, types.front()};
    }
    return status;
}

Status DescribeTable(sqlite3* database, const Found& found, const std::string& name, ObjectDescription& object) {
    const std::string sql = "select * from " + Quoted(found.schema) + '.' + Quoted(name);
    sqlite3_stmt* compiled = nullptr;
    const int code = sqlite3_prepare_v2(database, sql.c_str(), static_cast<int>(sql.size()), &compiled, nullptr);
    const StatementHandle statement(compiled);
    if (code != SQLITE_OK) return Failure(database, code);
    std::vector<bool> untyped;
    DescribeColumns(database, compiled, sql, object.columns, untyped);
    object.kind = found.type == "view" ? ObjectKind::view : ObjectKind::table;
    object.schema = Upper(found.schema);
    object.name = Upper(name);
    object.temporary = found.schema == "temp";
    const auto take = [&object](sqlite3_stmt* row) {
        object.number = static_cast<std::uint32_t>(sqlite3_column_int64(row, 0));
        object.first_page = static_cast<std::uint32_t>(sqlite3_column_int64(row, 1));
        object.index_only = sqlite3_column_int(row, 2) != 0;
    };
    return Rows(database, "select s.rowid, s.rootpage, l.wr from " + Quoted(found.schema) + ".sqlite_schema s, "
                "pragma_table_list l where s.type in ('table', 'view') and s.name = ?1 collate nocase and "
                "l.name = s.name and l.schema = '" + found.schema + "'", name, take);
}

Status DescribeSchema(sqlite3* database, const std::string& name, ObjectDescription& object) {
    std::vector<std::string> schemas;
    Status status = Schemas(database, schemas);
    if (status.Failed()) return status;
    for (const std::string& schema : schemas) {
        if (sqlite3_stricmp(schema.c_str(), name.c_str()) != 0) continue;
        const auto take = [&object](sqlite3_stmt* row) {
            object.members.push_back(TextAt(row, 0));
            object.member_kinds.push_back(TextAt(row, 1) == "view" ? ObjectKind::view : ObjectKind::table);
        };
        status = Rows(database, "select upper(name), type from " + Quoted(schema) + ".sqlite_schema where type in "
                      "('table', 'view') and name not like 'sqlite\\_%' escape '\\' and name <> 'kelp_accounts' order by 1",
                      {}, take);
        object.kind = ObjectKind::schema;
        object.name = Upper(schema);
        return status;
    }
    return Error(errors::kNoSuchObject);
}

std::string DatabaseName(const SqliteConnection& connection) {
    return Upper(connection.Private() ? "memory" : std::filesystem::path(connection.File()).stem().string());
}

Status DescribeDatabase(SqliteConnection& connection, const std::string& name, ObjectDescription& object) {
    object.name = DatabaseName(connection);
    if (Upper(name) != object.name) return Error(errors::kNoSuchObject);
    object.kind = ObjectKind::database;
    Status status = Schemas(connection.Database(), object.members);
    for (std::string& schema : object.members) schema = Upper(schema);
    return status;
}

}  // namespace

Status SqliteConnection::Describe(std::string_view name, ObjectKind kind, ObjectDescription& object) {
    const Trusted trusted(*this);    // what the accounts' columns are is no secret
    const bool wants_table = kind == ObjectKind::table || kind == ObjectKind::view;
    const Status missing = Error(wants_table ? errors::kNoSuchTable : errors::kNoSuchObject);
    ObjectDescription described;
    Status status;
    ObjectName parts;
    if (!ReadObjectName(name, parts)) return missing;
    const std::string plain = PlainName(parts.name);
    if (kind == ObjectKind::schema || kind == ObjectKind::database) {
        if (!parts.schema.empty()) return missing;
        status = kind == ObjectKind::schema ? DescribeSchema(Database(), plain, described)
                                            : DescribeDatabase(*this, plain, described);
    } else if (wants_table || kind == ObjectKind::any) {
        Found found;
        status = Find(Database(), PlainName(parts.schema), plain, found);
        if (status.Failed()) return status;
        if (found.type.empty()) return missing;
        status = DescribeTable(Database(), found, plain, described);
        if (kind != ObjectKind::any && described.kind != kind && status.Ok()) return missing;
    } else {
        return missing;    // neither sequences nor synonyms
    }
    if (status.Ok()) object = std::move(described);
    return status;
}

// SQLite looks in its schemas in an order of its own, and makes everything in this one.
Status SqliteConnection::UseSchema(std::string& schema) {
    if (!schema.empty() && Upper(schema) != "MAIN") return Error(errors::kNoSuchSchema);
    schema = "MAIN";
    return {};
}

}  // namespace engine::sqlite
