// Uses of numbers that SQLite would answer as something else: texts beside ||, of which a number kept as a blob would be
// its bytes, casts to integers, which cut where a column rounds, and casts of what is no number, which would be 0.
#pragma once

#include "engine/sqlite/value_targets.h"

namespace engine::sqlite {

struct StatementReading;

// What stands beside || becomes kelp_text(...), unless it is known to be no number; what is cast to an integer,
// kelp_whole(...). In queries, changes, create table as and views.
void FindNumberUses(StatementReading& reading, ValueTargets& targets);

}  // namespace engine::sqlite
