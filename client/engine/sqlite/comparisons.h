// Values that a statement compares with a column: where hired > :1, where code in ('a ', :2), where :3 <= day.
#pragma once

#include <sqlite3.h>

#include <string_view>

#include "engine/sqlite/assignments.h"

namespace engine::sqlite {

// Adds the comparisons of a statement's conditions whose column all its tables agree on. Comparisons in the select list
// and within larger expressions stay as they are.
void FindComparisons(sqlite3* database, std::string_view sql, ValueTargets& targets);

}  // namespace engine::sqlite
