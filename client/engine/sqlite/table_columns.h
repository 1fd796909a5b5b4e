// The columns of a table as they are declared, asked of SQLite each time: another connection may change them. On the
// connection's thread. Throws bad_alloc where SQLite finds no memory, so that no column is taken for unknown.
#pragma once

#include <sqlite3.h>

#include <string>
#include <string_view>
#include <vector>

#include "engine/engine.h"

namespace engine::sqlite {

struct TableColumn {
    std::string name;
    std::string declared;    // its type's words
    Column column;           // described from them; the name in upper case
    bool concerned = false;  // values for the column are looked at
};

// Reads the name of a table, "name" or "schema.name", at pieces[at], and the columns of that table, none when there is
// no such table. Answers where the text goes on.
std::size_t ReadTable(sqlite3* database, const std::vector<std::string_view>& pieces, std::size_t at,
                      std::vector<TableColumn>& columns);

// The column of that name, which may be quoted; null when there is none.
const TableColumn* FindColumn(const std::vector<TableColumn>& columns, std::string_view name);

std::string UpperCase(std::string text);

// A text as an SQL literal.
std::string Literal(std::string_view text);

}  // namespace engine::sqlite
