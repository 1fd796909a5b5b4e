// Reading the columns of tables, and looking them up.
#include "engine/sqlite/table_columns.h"

#include <algorithm>
#include <cctype>
#include <new>
#include <utility>

#include "engine/sqlite/coercion.h"
#include "engine/sqlite/column_types.h"
#include "engine/sqlite/connection.h"
#include "engine/sqlite/pieces.h"

namespace engine::sqlite {
namespace {

std::vector<TableColumn> ReadColumns(sqlite3* database, const std::string& schema, const std::string& table) {
    std::vector<TableColumn> columns;
    sqlite3_stmt* compiled = nullptr;
    const char* sql = schema.empty() ? "select name, type from pragma_table_info(?1)"
                                     : "select name, type from pragma_table_info(?1, ?2)";
    if (sqlite3_prepare_v2(database, sql, -1, &compiled, nullptr) == SQLITE_NOMEM) throw std::bad_alloc();
    const StatementHandle statement(compiled);
    if (!compiled) return columns;
    sqlite3_bind_text(compiled, 1, table.data(), static_cast<int>(table.size()), SQLITE_STATIC);
    if (!schema.empty()) sqlite3_bind_text(compiled, 2, schema.data(), static_cast<int>(schema.size()), SQLITE_STATIC);
    int code = SQLITE_OK;
    while ((code = sqlite3_step(compiled)) == SQLITE_ROW) {
        const auto* name = reinterpret_cast<const char*>(sqlite3_column_text(compiled, 0));
        const auto* declared = reinterpret_cast<const char*>(sqlite3_column_text(compiled, 1));
        if (!name || !declared) throw std::bad_alloc();
        TableColumn column;
        column.name = name;
        column.declared = declared;
        column.concerned = ReadDeclaredType(column.declared, column.column) && Coercion::Concerns(column.column);
        column.column.name = UpperCase(column.name);
        columns.push_back(std::move(column));
    }
    if ((code & 0xFF) == SQLITE_NOMEM) throw std::bad_alloc();
    return columns;
}

}  // namespace

std::size_t ReadTable(sqlite3* database, const std::vector<std::string_view>& pieces, std::size_t at,
                      std::vector<TableColumn>& columns) {
    columns.clear();
    if (at >= pieces.size()) return at;
    std::string schema;
    std::string name = PlainName(pieces[at++]);
    if (at + 1 < pieces.size() && pieces[at] == ".") {
        schema = std::exchange(name, PlainName(pieces[at + 1]));
        at += 2;
    }
    columns = ReadColumns(database, schema, name);
    return at;
}

const TableColumn* FindColumn(const std::vector<TableColumn>& columns, std::string_view name) {
    const std::string plain = PlainName(name);
    const auto found = std::find_if(columns.begin(), columns.end(), [&](const TableColumn& column) {
        return sqlite3_stricmp(column.name.c_str(), plain.c_str()) == 0;
    });
    return found == columns.end() ? nullptr : &*found;
}

std::string UpperCase(std::string text) {
    for (char& c : text) c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    return text;
}

std::string Literal(std::string_view text) {
    std::string literal = "'";
    for (const char c : text) literal.append(c == '\'' ? 2 : 1, c);
    return literal += '\'';
}

}  // namespace engine::sqlite
