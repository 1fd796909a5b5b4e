// From fields to a date.
#include "date/parsed.h"

#include "date/zone.h"
#include "handles/errors.h"

namespace date {
namespace {

// What is said of a slot that a model names twice.
constexpr struct { Field slot; Errno number; } kTwice[] = {
    {Field::year, 1812}, {Field::hour24, 1813}, {Field::half_day, 1814}, {Field::era, 1815}, {Field::month, 1816},
    {Field::weekday, 1817}};

constexpr struct { Field field; int lowest, highest; Errno number; } kRanges[] = {
    {Field::month, 1, 12, errors::kBadMonth},
    {Field::day, 1, 31, errors::kBadDay},
    {Field::day_of_year, 1, 366, 1848},
    {Field::weekday, 1, 7, errors::kBadWeekday},
    {Field::julian, 1, 5373484, 1854},
    {Field::hour12, 1, 12, 1849},
    {Field::hour24, 0, 23, errors::kBadHour},
    {Field::minute, 0, 59, errors::kBadMinute},
    {Field::second, 0, 59, errors::kBadSecond},
    {Field::second_of_day, 0, 86399, 1853}};

// Two digits mean the year next to now: in the half of a century that lies nearer.
int RoundedYear(int two_digits, int current) {
    const int nearest = (current + 50) / 100 * 100;    // century
    return nearest + two_digits - (two_digits < 50 ? 0 : 100);
}

// Fewer than four digits mean a year that begins as the current one does.
int CompletedYear(int digits, unsigned width, int current) {
    int modulus = 1;
    for (unsigned i = 0; i < width; ++i) modulus *= 10;
    return current - current % modulus + digits;
}

// A number as the published Julian day count has it (see docs), as a day; 1864 in the year 0 that it leaves room for.
Errno FromJulianDay(int julian, DayNumber* day) {
    constexpr int kYearZero = 1721059, kYearOne = 1721424;
    *day = julian >= kYearOne ? julian : julian + 365;
    return julian >= kYearZero && julian < kYearOne ? errors::kNotInCalendar : 0;
}

}  // namespace

Field SlotOf(Field field) noexcept {
    switch (field) {
        case Field::rounded_year:
        case Field::comma_year: return Field::year;
        case Field::short_month_name:
        case Field::month_name:
        case Field::roman_month: return Field::month;
        case Field::short_day_name:
        case Field::day_name: return Field::weekday;
        case Field::hour12: return Field::hour24;
        default: return field;
    }
}

Errno Parsed::Claim(const Element& element) noexcept {
    const Field slot = SlotOf(element.field);
    const auto is_claimed = [this](Field field) { return claimed_[static_cast<std::size_t>(field)]; };
    if (is_claimed(slot)) {
        for (const auto& row : kTwice) {
            if (row.slot == slot) return row.number;
        }
        return errors::kElementTwice;
    }
    claimed_[static_cast<std::size_t>(slot)] = true;
    if (element.field == Field::hour24) whole_day_hour_ = true;
    if (element.field == Field::year) signed_year_ = element.has_sign;
    if (is_claimed(Field::julian) && is_claimed(Field::day_of_year)) return errors::kJulianWithDayOfYear;
    if (whole_day_hour_ && is_claimed(Field::half_day)) return errors::kHour24WithHalfDay;
    return signed_year_ && is_claimed(Field::era) ? errors::kSignedYearWithEra : 0;
}

void Parsed::Put(Field slot, int value) {
    given_[static_cast<std::size_t>(slot)] = true;
    values_[static_cast<std::size_t>(slot)] = value;
}

Errno Parsed::Set(const Element& element, int value, std::size_t digits) noexcept {
    const Field slot = SlotOf(element.field);
    const Field ranged = element.field == Field::hour12 ? Field::hour12 : slot;
    for (const auto& row : kRanges) {
        if (row.field == ranged && (value < row.lowest || value > row.highest)) return row.number;
    }
    if (element.field == Field::hour12) value %= 12;
    const bool rounded = element.field == Field::rounded_year && digits <= 2;
    const bool completed = element.field == Field::year && element.width < 4 && digits <= element.width;
    if (rounded || completed) {
        DateTime now;
        if (const Errno number = Now(&now)) return number;
        value = rounded ? RoundedYear(value, now.year) : CompletedYear(value, element.width, now.year);
    }
    Put(slot, value);
    return 0;
}

Errno Parsed::ResolveDate(DateTime* result) const noexcept {
    DateTime now;
    if (!Has(Field::year) || !Has(Field::month)) {
        if (const Errno number = Now(&now)) return number;
    }
    result->year = static_cast<std::int16_t>(Has(Field::year) ? Get(Field::year) : now.year);
    if (BeforeChrist()) result->year = static_cast<std::int16_t>(-result->year);
    result->month = static_cast<std::uint8_t>(Has(Field::month) ? Get(Field::month) : now.month);
    result->day = static_cast<std::uint8_t>(Has(Field::day) ? Get(Field::day) : 1);
    if (Has(Field::julian)) {
        DayNumber day = 0;
        if (const Errno number = FromJulianDay(Get(Field::julian), &day)) return number;
        FromDayNumber(day, result);
    } else if (Has(Field::day_of_year)) {
        *result = {.year = result->year, .month = 1, .day = 1};
        if (const Errno number = ValidateDate(*result)) return number;
        const int year = result->year;
        FromDayNumber(ToDayNumber(*result) + Get(Field::day_of_year) - 1, result);
        if (result->year != year) return 1848;
    }
    const Errno number = ValidateDate(*result);
    return number ? number : CheckAgainst(*result);
}

// Fields that were given although others already tell the day must agree with them.
Errno Parsed::CheckAgainst(const DateTime& value) const noexcept {
    const int year = BeforeChrist() ? -Get(Field::year) : Get(Field::year);
    if (Has(Field::year) && year != value.year) return 1831;
    if (Has(Field::month) && Get(Field::month) != value.month) return 1833;
    if (Has(Field::day) && Get(Field::day) != value.day) return 1834;
    return Has(Field::weekday) && Get(Field::weekday) != DayOfWeek(ToDayNumber(value)) + 1 ? 1835 : 0;
}

Errno Parsed::ResolveTime(DateTime* result) const noexcept {
    const bool afternoon = Get(Field::half_day) > 0;
    int hour = Get(Field::hour24) + (afternoon ? 12 : 0);
    int minute = Get(Field::minute), second = Get(Field::second);
    if (Has(Field::second_of_day)) {
        const int all = Get(Field::second_of_day);
        if (Has(Field::hour24) && hour != all / 3600) return 1836;
        if (Has(Field::minute) && minute != all / 60 % 60) return 1837;
        if (Has(Field::second) && second != all % 60) return 1838;
        hour = all / 3600;
        minute = all / 60 % 60;
        second = all % 60;
    }
    result->hour = static_cast<std::uint8_t>(hour);
    result->minute = static_cast<std::uint8_t>(minute);
    result->second = static_cast<std::uint8_t>(second);
    result->nanosecond = nanosecond_;
    return 0;
}

Errno Parsed::ResolveZone(DateTime* result) const noexcept {
    if (!region_.empty()) return SetZone(region_, result);
    if (!Has(Field::zone_hour)) return 0;
    return SetOffset(west_, Get(Field::zone_hour), Get(Field::zone_minute), result);
}

Errno Parsed::Resolve(DateTime* result) const noexcept {
    DateTime value;
    if (const Errno number = ResolveDate(&value)) return number;
    if (const Errno number = ResolveTime(&value)) return number;
    if (const Errno number = ResolveZone(&value)) return number;
    *result = value;
    return 0;
}

}  // namespace date
