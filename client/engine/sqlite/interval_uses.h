// Where a statement uses intervals, which are kept as integers: a use that would take one for a number is refused.
#pragma once

#include <string_view>

#include "engine/sqlite/value_targets.h"
#include "handles/status.h"

namespace engine::sqlite {

struct StatementReading;

// The functions that cast to intervals; no other makes any.
inline constexpr std::string_view kSpanPrefix = "kelp_span_";

// Each name of a column of intervals and each cast to one must stand where an interval may: compared with one, ordered
// or grouped by, counted, the least or greatest, by itself in a select list, which is noted; or where its text does,
// which is put there. 932 for any other place.
Status FindIntervalUses(StatementReading& reading, ValueTargets& targets);

}  // namespace engine::sqlite
