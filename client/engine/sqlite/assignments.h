// Where a statement stores values: insert ... values, insert ... select, update ... set, on conflict do update, also
// behind `with`; the defaults of columns that are literals. Forms that are not understood are left as they are: triggers
// are.
#pragma once

#include <sqlite3.h>

#include "engine/sqlite/names.h"
#include "engine/sqlite/value_targets.h"
#include "handles/status.h"

namespace engine::sqlite {

// Refuses a definition with a default that its column would not take.
Status FindAssignments(sqlite3* database, StatementReading& reading, ValueTargets& targets);

}  // namespace engine::sqlite
