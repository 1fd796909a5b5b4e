// Intervals: a span of years and months, or one of days down to nanoseconds. All parts of one have the same sign; years
// and days have at most nine digits (1873 beyond). Functions answer 0 or a published error number and write results on
// success only; a result may be one of the operands. Nothing here throws or allocates.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>

#include "date/date.h"

namespace date {

enum class Span : std::uint8_t { year_month, day_second };

struct Interval {
    Span span = Span::day_second;
    std::int64_t whole = 0;         // months or seconds
    std::int32_t nanosecond = 0;    // below a second, with the sign of the whole; 0 in months

    bool operator==(const Interval&) const = default;
};

// The parts as applications see them. Each within its limits (1850, 1851, 1871, 1880; months 1843), all of one sign
// (1867).
struct DaySecond { std::int64_t day, hour, minute, second, nanosecond; };
struct YearMonth { std::int64_t year, month; };
Errno FromParts(const DaySecond& parts, Interval* result) noexcept;
Errno FromParts(const YearMonth& parts, Interval* result) noexcept;
DaySecond DaySecondOf(const Interval& value) noexcept;
YearMonth YearMonthOf(const Interval& value) noexcept;

// 1870 for two of different spans.
Errno Add(const Interval& left, const Interval& right, Interval* result) noexcept;
Errno Compare(const Interval& left, const Interval& right, int* order) noexcept;
Interval Negative(const Interval& value) noexcept;
// Rounds the fraction half away from zero to `digits` places, 0 to 9.
Errno RoundFraction(const Interval& value, int digits, Interval* result) noexcept;

// "+02-03", "-01 02:03:04.500000": the leading part with `leading` digits at least (1873 when it has more; 30088 for
// more than nine), the fraction rounded to `fraction` digits, without its point when that is 0. No terminator;
// *length is set on success.
constexpr std::size_t kMaxIntervalText = 32;
Errno ToText(const Interval& value, unsigned leading, unsigned fraction, char* text, std::size_t* length) noexcept;
// As many digits as the years or days have, two at least.
unsigned LeadingDigits(const Interval& value) noexcept;
// Reads "[+-]years[-months]" or "[+-]days[ hours[:minutes[:seconds[.fraction]]]]", blanks around it aside. 1867 for
// what is written otherwise.
Errno FromText(std::string_view text, Span span, Interval* result) noexcept;

// A date moved by an interval. By months: 1839 where that month has no such day. By days and seconds: the moment moves,
// a region's offset with it.
Errno AddInterval(const DateTime& value, const Interval& interval, DateTime* result) noexcept;
// From one moment to another, as days and seconds; one without a zone counts in the zone of the process beside one
// that has one.
Errno Subtract(const DateTime& left, const DateTime& right, Interval* result) noexcept;

}  // namespace date
