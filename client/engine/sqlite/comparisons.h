// Values that a statement compares with a column: where hired > :1, where code in ('a ', :2), where :3 <= day. SQLite
// compares dates as the texts that they are kept as, and blanks at the end of a text count; the columns' types know
// better.
#pragma once

#include "engine/sqlite/value_targets.h"
#include "handles/status.h"

namespace engine::sqlite {

struct StatementReading;

// Adds the comparisons of queries and changes, wherever they stand, whose one side is a column, or a call that answers a
// date. Refuses what SQLite would answer as something else: 933 for a comparison of a comparison, 932 where a date's
// column cannot be told from another of its name.
Status FindComparisons(StatementReading& reading, ValueTargets& targets);

}  // namespace engine::sqlite
