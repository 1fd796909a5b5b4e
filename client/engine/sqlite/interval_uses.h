// Where a statement uses intervals, which are kept as integers: a use that would take one for a number is refused.
#pragma once

#include <sqlite3.h>

#include <string_view>
#include <vector>

#include "engine/sqlite/value_targets.h"
#include "handles/status.h"

namespace engine::sqlite {

// The functions that cast to intervals; no other makes any.
inline constexpr std::string_view kSpanPrefix = "kelp_span_";

// Each name of a column of intervals and each cast to one must stand where an interval may: compared with one, ordered
// or grouped by, counted, the least or greatest, by itself in a select list, which is noted; or where its text does,
// which is put there. 932 for any other place.
Status FindIntervalUses(sqlite3* database, std::string_view sql, const std::vector<std::string_view>& pieces,
                        ValueTargets& targets);

}  // namespace engine::sqlite
