// Dates and times of day: the value itself, its calendar, and the forms without a format model: the 8-byte OCIDate, the
// 7-byte DATE and the text in which engines keep it. Text by a format model is in date/format.h, time zones are in
// date/zone.h.
//
// The calendar is the historical one: Julian days to 4 October 1582, Gregorian ones from 15 October 1582, none between,
// and no year 0 (-1 is 1 BC). Functions answer 0 or a published error number and write results on success only; a
// result may be one of the operands. Nothing here throws or allocates.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>

struct OCIDate;

namespace date {

using Errno = int;    // a published error number; 0: success

constexpr int kMinYear = -4712;
constexpr int kMaxYear = 9999;

// A date, a time, or both. Which parts count is the holder's business; parts that do not count are zero. With a zone,
// date and time are local to it.
struct DateTime {
    std::int16_t year = 0;
    std::uint8_t month = 0;
    std::uint8_t day = 0;
    std::uint8_t hour = 0;
    std::uint8_t minute = 0;
    std::uint8_t second = 0;
    bool has_zone = false;
    std::int16_t zone_minutes = 0;     // east of Greenwich
    std::uint16_t region = 0;          // a region of date/zone.h; 0: an offset only
    std::uint32_t nanosecond = 0;

    bool operator==(const DateTime&) const = default;
};

// What is wrong with a value: the bits of OCIDateCheck, 0 when nothing is. CheckDate looks at the date alone.
using Flags = std::uint32_t;
Flags CheckDate(const DateTime& value) noexcept;
Flags CheckTime(const DateTime& value) noexcept;
inline Flags Check(const DateTime& value) noexcept { return CheckDate(value) | CheckTime(value); }

// The same as the error number of the first field that is wrong: year, month, day, hour, minute, second, fraction.
Errno ValidateDate(const DateTime& value) noexcept;
Errno ValidateTime(const DateTime& value) noexcept;
Errno Validate(const DateTime& value) noexcept;

// Days in one unbroken count, the astronomers' Julian day number: 1 January 4712 BC is 366 (no year 0 is counted),
// 15 October 1582 is 2299161, 31 December 9999 is 5373484.
using DayNumber = std::int32_t;
DayNumber ToDayNumber(int year, int month, int day) noexcept;
void FromDayNumber(DayNumber number, DateTime* value) noexcept;    // sets year, month and day alone
inline DayNumber ToDayNumber(const DateTime& value) noexcept { return ToDayNumber(value.year, value.month, value.day); }
int DaysInMonth(int year, int month) noexcept;                     // the last day's number: 31 in October 1582
int DayOfWeek(DayNumber number) noexcept;                          // 0 is Sunday
int DayOfYear(const DateTime& value) noexcept;                     // from 1

// Arithmetic; the time of day stays. Operands must be valid.
Errno AddDays(const DateTime& value, std::int64_t days, DateTime* result) noexcept;
Errno AddMonths(const DateTime& value, std::int64_t months, DateTime* result) noexcept;    // last day stays last day
Errno MoveMonths(const DateTime& value, std::int64_t months, DateTime* result) noexcept;   // same day, or 1839
Errno LastDay(const DateTime& value, DateTime* result) noexcept;
Errno NextDay(const DateTime& value, int day_of_week, DateTime* result) noexcept;          // 0 is Sunday
// Rounds the fraction half up to `digits` places, 0 to 9. A full second is carried into the time, the date and the
// year (1841 behind the last second of 9999).
Errno RoundFraction(const DateTime& value, int digits, DateTime* result) noexcept;
std::int32_t DaysBetween(const DateTime& left, const DateTime& right) noexcept;            // times of day ignored
// -1, 0, 1 by date, time and fraction as they stand; zones are date/zone.h's.
int Compare(const DateTime& left, const DateTime& right) noexcept;

// OCIDate. Any field may be out of range; a fraction and a zone are lost on the way out.
DateTime FromOciDate(const OCIDate& value) noexcept;
void ToOciDate(const DateTime& value, OCIDate* result) noexcept;

// The seven bytes of SQLT_DAT. From: refuses bytes that are no date. To: the value must be valid.
constexpr std::size_t kDateBytes = 7;
Errno FromBytes(const std::uint8_t* bytes, DateTime* result) noexcept;
void ToBytes(const DateTime& value, std::uint8_t* bytes) noexcept;

// The engines' text: "YYYY-MM-DD HH:MM:SS", then the fraction without its trailing zeros if there is one, then
// " +hh:mm" with a zone; "-YYYY-..." before the common era. Texts without a zone and of the common era order as their
// values do.
constexpr std::size_t kMaxEngineText = 40;
std::size_t ToEngineText(const DateTime& value, char* text) noexcept;    // no terminator; answers the length
// Reads that and what engines write besides: a date alone, a time alone (the date is 0 then), T for the blank, the zone
// without its blank, as +hh, +hhmm or Z, and " BC" at the end. Fields are checked.
Errno FromEngineText(std::string_view text, DateTime* result) noexcept;

}  // namespace date
