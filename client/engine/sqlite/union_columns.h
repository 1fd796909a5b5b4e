// The columns of several queries with UNION between them, of which SQLite tells those of one alone: each is what holds the
// values of all. On the connection's thread.
#pragma once

#include <sqlite3.h>

#include <string_view>
#include <vector>

#include "engine/engine.h"

namespace engine::sqlite {

// Describes anew what was described by one of the queries. False for any other statement, and where a part cannot be described by
// itself. `untyped` gets those whose values agree on no type.
bool DescribeUnion(sqlite3* database, std::string_view sql, std::vector<Column>& columns, std::vector<bool>& untyped);

}  // namespace engine::sqlite
