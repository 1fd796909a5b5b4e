// The columns of a table as they are declared, asked of SQLite each time: another connection may change them. On the
// connection's thread. Throws bad_alloc where SQLite finds no memory, so that no column is taken for unknown.
#pragma once

#include <sqlite3.h>

#include <string>
#include <string_view>
#include <vector>

#include "engine/engine.h"
#include "engine/table_list.h"

namespace engine::sqlite {

struct TableColumn {
    std::string name;
    std::string declared;    // its type's words
    Column column;           // described from them; the name in upper case
    bool concerned = false;  // values for the column are looked at
};

// The column of that name, which may be quoted, of a table or view; false when there is none. A row id is none.
bool ReadColumn(sqlite3* database, const TableName& table, std::string_view name, TableColumn& column);

// What "*" stands for, as a compiled query tells it; none when there is no such table or view.
std::vector<TableColumn> AllColumns(sqlite3* database, const TableName& table);

// The columns that an insert without names gives values to, in their order; none when there is no such table.
std::vector<TableColumn> InsertableColumns(sqlite3* database, const TableName& table);

std::string UpperCase(std::string text);

// A text as an SQL literal; a name in double quotes.
std::string Literal(std::string_view text);
std::string QuotedName(std::string_view name);

}  // namespace engine::sqlite
