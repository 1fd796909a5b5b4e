// The columns of a select or returning list that hold large objects, or very long values, of a table's rows. Such an item is rewritten so that
// SQLite delivers the row's number instead of the value, which then is read where it lies, as far as it is wanted. What a
// delete returns comes as values: its rows are gone by then.
// Other items, and those of queries over several tables, of groups and the like, come as values.
#pragma once

#include <sqlite3.h>

#include <memory>
#include <string_view>
#include <vector>

#include "engine/sqlite/lob_store.h"
#include "engine/sqlite/value_targets.h"

namespace engine::sqlite {

struct LobItem {
    std::size_t index;    // of the column in the list
    std::shared_ptr<const LobColumn> column;
};

// Whether it is a table whose rows have numbers of their own, and where it lies. Throws bad_alloc.
bool FindNumberedTable(sqlite3* database, TableName& table);

// Adds the edits to those of the statement, which is compiled as it was written. None where there is nothing to rewrite.
std::vector<LobItem> FindLobItems(sqlite3* database, sqlite3_stmt* compiled, std::string_view sql, LobStore& store,
                                  ValueTargets& targets);

}  // namespace engine::sqlite
