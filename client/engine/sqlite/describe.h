// What SQLite and the text of a statement tell about its columns, and about what it does. On the connection's thread.
#pragma once

#include <sqlite3.h>

#include <span>
#include <string>
#include <vector>

#include "engine/engine.h"
#include "engine/sqlite/errors.h"

namespace engine::sqlite {

// What a statement does to rows, by its first word, or by the one behind with ...
Verb VerbOf(std::string_view sql);

// Describes the columns of a compiled statement, whose placeholders were written so. `untyped` says which ones only a value
// can tell more about.
void DescribeColumns(sqlite3* database, sqlite3_stmt* statement, std::string_view sql, std::vector<Column>& columns,
                     std::vector<bool>& untyped, std::span<const std::string> written = {});

// The type of a column without a declaration, from a value.
void DescribeValue(sqlite3_value* value, Column& column);

}  // namespace engine::sqlite
