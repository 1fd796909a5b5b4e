// Reading the columns of tables, and looking them up.
#include "engine/sqlite/table_columns.h"

#include <algorithm>
#include <cctype>
#include <new>
#include <utility>

#include "engine/pieces.h"
#include "engine/sqlite/coercion.h"
#include "engine/sqlite/column_types.h"
#include "engine/sqlite/connection.h"

namespace engine::sqlite {
namespace {

StatementHandle Compile(sqlite3* database, const std::string& sql) {
    sqlite3_stmt* compiled = nullptr;
    if (sqlite3_prepare_v2(database, sql.c_str(), static_cast<int>(sql.size()), &compiled, nullptr) == SQLITE_NOMEM)
        throw std::bad_alloc();
    return StatementHandle(compiled);
}

TableColumn Described(const char* name, const char* declared) {
    if (!name) throw std::bad_alloc();
    TableColumn column;
    column.name = name;
    column.declared = declared ? declared : "";
    column.concerned = ReadDeclaredType(column.declared, column.column) && Coercion::Concerns(column.column);
    column.column.name = UpperCase(column.name);
    return column;
}

bool IsRowId(const std::string& name) {
    constexpr const char* kNames[] = {"rowid", "oid", "_rowid_"};
    return std::any_of(std::begin(kNames), std::end(kNames),
                       [&](const char* row_id) { return sqlite3_stricmp(name.c_str(), row_id) == 0; });
}

// A column of a view, or one that is called like a row id: a compiled query tells them.
bool ReadByQuery(sqlite3* database, const TableName& table, const std::string& name, TableColumn& column) {
    for (TableColumn& told : AllColumns(database, table)) {
        if (sqlite3_stricmp(told.name.c_str(), name.c_str()) != 0) continue;
        column = std::move(told);
        return true;
    }
    return false;
}

// SQLite's answer about a table that is no view, or its column; `declared` is set on success.
int Ask(sqlite3* database, const TableName& table, const char* column, const char*& declared) {
    const int code =
        sqlite3_table_column_metadata(database, table.schema.empty() ? nullptr : table.schema.c_str(),
                                      table.name.c_str(), column, &declared, nullptr, nullptr, nullptr, nullptr);
    if ((code & 0xFF) == SQLITE_NOMEM) throw std::bad_alloc();
    return code;
}

}  // namespace

bool ReadColumn(sqlite3* database, const TableName& table, std::string_view name, TableColumn& column) {
    const std::string plain = PlainName(name);
    const char* declared = nullptr;
    if (!IsRowId(plain)) {
        if (Ask(database, table, plain.c_str(), declared) == SQLITE_OK) {
            column = Described(plain.c_str(), declared);
            return true;
        }
        if (Ask(database, table, nullptr, declared) == SQLITE_OK) return false;
    }
    return ReadByQuery(database, table, plain, column);
}

// The engine's own list leaves out those that are calculated.
std::vector<TableColumn> AllColumns(sqlite3* database, const TableName& table) {
    std::vector<TableColumn> columns;
    const std::string schema = table.schema.empty() ? "" : QuotedName(table.schema) + '.';
    const StatementHandle query = Compile(database, "select * from " + schema + QuotedName(table.name));
    for (int index = 0; index < sqlite3_column_count(query.get()); ++index)
        columns.push_back(Described(sqlite3_column_name(query.get(), index), sqlite3_column_decltype(query.get(), index)));
    return columns;
}

std::vector<TableColumn> InsertableColumns(sqlite3* database, const TableName& table) {
    std::vector<TableColumn> columns;
    const StatementHandle list =
        Compile(database, "select name, type from pragma_table_info(" + Literal(table.name) +
                              (table.schema.empty() ? "" : ", " + Literal(table.schema)) + ")");
    if (!list) return columns;
    int code = SQLITE_OK;
    while ((code = sqlite3_step(list.get())) == SQLITE_ROW) {
        const auto text = [&](int index) {
            return reinterpret_cast<const char*>(sqlite3_column_text(list.get(), index));
        };
        columns.push_back(Described(text(0), text(1)));
    }
    if ((code & 0xFF) == SQLITE_NOMEM) throw std::bad_alloc();
    return columns;
}

std::string UpperCase(std::string text) {
    for (char& c : text) c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    return text;
}

std::string QuotedName(std::string_view name) {
    std::string quoted = "\"";
    for (const char c : name) quoted.append(c == '"' ? 2 : 1, c);
    return quoted += '"';
}

std::string Literal(std::string_view text) {
    std::string literal = "'";
    for (const char c : text) literal.append(c == '\'' ? 2 : 1, c);
    return literal += '\'';
}

}  // namespace engine::sqlite
