// The calendar: day numbers, checks, arithmetic. The two conversions between dates and day numbers are the usual
// integer formulas for the Julian and the Gregorian calendar, on years that astronomers count (1 BC is 0).
#include "date/date.h"

#include <tuple>

#include "handles/errors.h"
#include "oci_constants.h"

namespace date {
namespace {

constexpr DayNumber kFirstGregorianDay = 2299161;    // 15 October 1582
constexpr int kReformYear = 1582;
constexpr int kReformMonth = 10;
constexpr int kLastJulianDay = 4;
constexpr int kFirstGregorianDayOfMonth = 15;
constexpr DayNumber kMinDay = 366;                   // 1 January 4712 BC
constexpr DayNumber kMaxDay = 5373484;               // 31 December 9999

int AstronomicalYear(int year) { return year > 0 ? year : year + 1; }
int CalendarYear(int astronomical_year) { return astronomical_year > 0 ? astronomical_year : astronomical_year - 1; }

bool IsGregorian(int year, int month, int day) {
    return std::tuple(year, month, day) > std::tuple(kReformYear, kReformMonth, kLastJulianDay);
}

bool IsLeap(int year) {
    const int astronomical = AstronomicalYear(year);
    if (astronomical % 4 != 0) return false;
    return year <= kReformYear || year % 100 != 0 || year % 400 == 0;
}

bool IsMissing(int year, int month, int day) {
    return year == kReformYear && month == kReformMonth && day > kLastJulianDay && day < kFirstGregorianDayOfMonth;
}

Flags Pair(bool below, bool above, Flags invalid, Flags below_valid) {
    return below ? invalid | below_valid : above ? invalid : 0;
}

// The first of the month, `months` after that of `value`, and whether the year can be had.
bool MoveMonths(const DateTime& value, std::int64_t months, int* year, int* month) {
    constexpr int kFirstYear = kMinYear + 1;    // as astronomers count it
    const std::int64_t moved = 12 * (AstronomicalYear(value.year) - kFirstYear) + value.month - 1 + months;
    if (moved < 0 || moved / 12 > kMaxYear - kFirstYear) return false;
    *year = CalendarYear(static_cast<int>(moved / 12) + kFirstYear);
    *month = static_cast<int>(moved % 12) + 1;
    return true;
}

void SetDay(int year, int month, int day, DateTime* value) {
    value->year = static_cast<std::int16_t>(year);
    value->month = static_cast<std::uint8_t>(month);
    value->day = static_cast<std::uint8_t>(day);
}

// Whether that led to the next day's first second.
bool AddSecond(DateTime* value) {
    if (++value->second < 60) return false;
    value->second = 0;
    if (++value->minute < 60) return false;
    value->minute = 0;
    if (++value->hour < 24) return false;
    value->hour = 0;
    return true;
}

}  // namespace

Flags CheckDate(const DateTime& value) noexcept {
    Flags flags = Pair(value.year < kMinYear, value.year > kMaxYear, OCI_DATE_INVALID_YEAR, OCI_DATE_YEAR_BELOW_VALID);
    if (value.year == 0) flags |= OCI_DATE_YEAR_ZERO;
    const Flags month = Pair(value.month < 1, value.month > 12, OCI_DATE_INVALID_MONTH, OCI_DATE_MONTH_BELOW_VALID);
    const int last_day = month ? 31 : DaysInMonth(value.year, value.month);
    flags |= month | Pair(value.day < 1, value.day > last_day, OCI_DATE_INVALID_DAY, OCI_DATE_DAY_BELOW_VALID);
    if (IsMissing(value.year, value.month, value.day)) flags |= OCI_DATE_DAY_MISSING_FROM_1582;
    return flags;
}

Flags CheckTime(const DateTime& value) noexcept {
    return Pair(false, value.hour > 23, OCI_DATE_INVALID_HOUR, 0) |
           Pair(false, value.minute > 59, OCI_DATE_INVALID_MINUTE, 0) |
           Pair(false, value.second > 59, OCI_DATE_INVALID_SECOND, 0);
}

Errno ValidateDate(const DateTime& value) noexcept {
    if (value.year < kMinYear || value.year > kMaxYear || value.year == 0) return errors::kBadYear;
    if (value.month < 1 || value.month > 12) return errors::kBadMonth;
    if (value.day < 1 || value.day > 31) return errors::kBadDay;
    if (value.day > 28 && value.day > DaysInMonth(value.year, value.month)) return errors::kBadDayForMonth;
    return IsMissing(value.year, value.month, value.day) ? errors::kNotInCalendar : 0;
}

Errno ValidateTime(const DateTime& value) noexcept {
    if (value.hour > 23) return errors::kBadHour;
    if (value.minute > 59) return errors::kBadMinute;
    return value.second > 59 ? errors::kBadSecond : 0;
}

Errno Validate(const DateTime& value) noexcept {
    const Errno number = ValidateDate(value);
    return number ? number : ValidateTime(value);
}

DayNumber ToDayNumber(int year, int month, int day) noexcept {
    const int before_march = month < 3;
    const int shifted_year = AstronomicalYear(year) + 4800 - before_march;
    const int day_of_year = (153 * (month + 12 * before_march - 3) + 2) / 5 + day;
    const int julian = day_of_year + 365 * shifted_year + shifted_year / 4;
    if (!IsGregorian(year, month, day)) return julian - 32083;
    return julian - shifted_year / 100 + shifted_year / 400 - 32045;
}

void FromDayNumber(DayNumber number, DateTime* value) noexcept {
    int shifted = number + 1401;
    if (number >= kFirstGregorianDay) shifted += (4 * number + 274277) / 146097 * 3 / 4 - 38;
    const int quarter_days = 4 * shifted + 3;
    const int fifths = 5 * (quarter_days % 1461 / 4) + 2;
    const int month = (fifths / 153 + 2) % 12 + 1;
    SetDay(CalendarYear(quarter_days / 1461 - 4716 + (14 - month) / 12), month, fifths % 153 / 5 + 1, value);
}

int DaysInMonth(int year, int month) noexcept {
    constexpr int kDays[] = {31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
    return month == 2 && IsLeap(year) ? 29 : kDays[month - 1];
}

int DayOfWeek(DayNumber number) noexcept { return (number + 1) % 7; }

int DayOfYear(const DateTime& value) noexcept { return ToDayNumber(value) - ToDayNumber(value.year, 1, 1) + 1; }

Errno AddDays(const DateTime& value, std::int64_t days, DateTime* result) noexcept {
    if (const Errno number = Validate(value)) return number;
    const DayNumber day = ToDayNumber(value);
    if (days < kMinDay - day || days > kMaxDay - day) return errors::kBadYear;
    *result = value;
    FromDayNumber(day + static_cast<DayNumber>(days), result);
    return 0;
}

// A day that falls among the missing ones of October 1582 becomes the first after them.
Errno AddMonths(const DateTime& value, std::int64_t months, DateTime* result) noexcept {
    if (const Errno number = Validate(value)) return number;
    int year = 0, month = 0;
    if (!MoveMonths(value, months, &year, &month)) return errors::kBadYear;
    const int last_day = DaysInMonth(year, month);
    int day = value.day;
    if (day > last_day || day == DaysInMonth(value.year, value.month)) day = last_day;
    if (IsMissing(year, month, day)) day = kFirstGregorianDayOfMonth;
    *result = value;
    SetDay(year, month, day, result);
    return 0;
}

Errno MoveMonths(const DateTime& value, std::int64_t months, DateTime* result) noexcept {
    if (const Errno number = Validate(value)) return number;
    int year = 0, month = 0;
    if (!MoveMonths(value, months, &year, &month)) return errors::kBadYear;
    DateTime moved = value;
    SetDay(year, month, value.day, &moved);
    if (const Errno number = ValidateDate(moved)) return number;
    *result = moved;
    return 0;
}

Errno LastDay(const DateTime& value, DateTime* result) noexcept {
    if (const Errno number = Validate(value)) return number;
    *result = value;
    result->day = static_cast<std::uint8_t>(DaysInMonth(value.year, value.month));
    return 0;
}

Errno NextDay(const DateTime& value, int day_of_week, DateTime* result) noexcept {
    if (const Errno number = Validate(value)) return number;
    const int days = (day_of_week - DayOfWeek(ToDayNumber(value)) + 7) % 7;
    return AddDays(value, days == 0 ? 7 : days, result);
}

Errno RoundFraction(const DateTime& value, int digits, DateTime* result) noexcept {
    if (const Errno number = Validate(value)) return number;
    constexpr std::uint32_t kSecond = 1'000'000'000;
    std::uint32_t unit = kSecond;
    for (int place = 0; place < digits; ++place) unit /= 10;
    const std::uint32_t rounded = (value.nanosecond + unit / 2) / unit * unit;
    DateTime moved = value;
    moved.nanosecond = rounded % kSecond;
    if (rounded == kSecond && AddSecond(&moved)) {
        if (const Errno number = AddDays(moved, 1, &moved)) return number;
    }
    *result = moved;
    return 0;
}

std::int32_t DaysBetween(const DateTime& left, const DateTime& right) noexcept {
    return ToDayNumber(left) - ToDayNumber(right);
}

int Compare(const DateTime& left, const DateTime& right) noexcept {
    const auto fields = [](const DateTime& value) {
        return std::tie(value.year, value.month, value.day, value.hour, value.minute, value.second, value.nanosecond);
    };
    return (fields(left) > fields(right)) - (fields(left) < fields(right));
}

}  // namespace date
