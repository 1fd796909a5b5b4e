// What a change returns, kept as it is. On the thread that compiles the statement.
#pragma once

#include <sqlite3.h>

#include <string_view>

#include "engine/sqlite/value_targets.h"

namespace engine::sqlite {

// SQLite makes reals of all columns that a change returns as they are, where the table's first one has reals: keeps them
// by a plus before each. Whether there is any; what lists the types then is the statement as it was written.
bool KeepReturned(sqlite3* database, sqlite3_stmt* compiled, std::string_view sql, ValueTargets& targets);

}  // namespace engine::sqlite
