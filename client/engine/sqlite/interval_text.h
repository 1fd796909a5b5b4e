// Intervals as columns keep them, which are integers: months or nanoseconds; and the text that they are shown as.
#pragma once

#include <array>
#include <cstdint>
#include <string_view>

#include "date/interval.h"
#include "engine/engine.h"

namespace engine::sqlite {

// False for more nanoseconds than the integer holds.
bool KeepInterval(const date::Interval& interval, std::int64_t& kept);

// With the digits of the column, or as many as it takes; a view of `text`. Empty for what is no interval's number.
using IntervalText = std::array<char, date::kMaxIntervalText>;
std::string_view WriteInterval(std::int64_t kept, const Column& column, IntervalText& text);

}  // namespace engine::sqlite
