// Uses of numbers that SQLite would answer as something else: texts beside ||, of which a number kept as a blob would be
// its bytes, casts to integers, which cut where a column rounds, casts to texts, and casts of what is no number, or is kept
// as a blob, which would be 0.
#pragma once

#include "engine/sqlite/value_targets.h"

namespace engine::sqlite {

struct StatementReading;

// What stands beside || becomes kelp_text(...), unless it is known to be no number, of a binary_double kelp_exact_text(...);
// what is cast to an integer becomes kelp_whole(...), to other numbers kelp_real(...). In queries, changes, create table as and
// views.
void FindNumberUses(StatementReading& reading, ValueTargets& targets);

}  // namespace engine::sqlite
