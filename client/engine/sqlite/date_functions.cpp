// Functions of dates, and trunc and round, which are of numbers, too. A null argument makes a null; results are dates
// without fraction and zone.
#include <algorithm>
#include <string>

#include "date/format.h"
#include "engine/pieces.h"
#include "engine/sqlite/function_values.h"
#include "handles/errors.h"

namespace engine::sqlite {
namespace {

constexpr std::int64_t kSecondsOfDay = 86400;

int SecondOfDay(const date::DateTime& value) { return (value.hour * 60 + value.minute) * 60 + value.second; }

void ReturnWholeDate(sqlite3_context* context, date::DateTime value, int failure) {
    if (failure != 0) return Refuse(context, failure);
    value.nanosecond = 0;
    value.has_zone = false;
    ReturnDate(context, value);
}

// add_months(date, months)
void AddMonths(sqlite3_context* context, int count, Arguments arguments) {
    if (AnyNull(count, arguments)) return sqlite3_result_null(context);
    date::DateTime date;
    std::int64_t months = 0;
    int failure = ReadDate(arguments[0], date);
    if (failure == 0) failure = ReadWhole(arguments[1], months);
    if (failure == 0) failure = date::AddMonths(date, months, &date);
    ReturnWholeDate(context, date, failure);
}

// last_day(date)
void LastDay(sqlite3_context* context, int count, Arguments arguments) {
    if (AnyNull(count, arguments)) return sqlite3_result_null(context);
    date::DateTime date;
    int failure = ReadDate(arguments[0], date);
    if (failure == 0) failure = date::LastDay(date, &date);
    ReturnWholeDate(context, date, failure);
}

// A weekday by its name, or by its number from 1, which is Sunday.
int ReadWeekday(sqlite3_value* value, int& day_of_week) {
    if (!IsNumber(value)) return date::WeekdayFromName(TextOf(value), date::kEnglish, &day_of_week);
    std::int64_t number = 0;
    if (ReadWhole(value, number) != 0 || number < 1 || number > 7) return errors::kBadWeekday;
    day_of_week = static_cast<int>(number) - 1;
    return 0;
}

// next_day(date, weekday)
void NextDay(sqlite3_context* context, int count, Arguments arguments) {
    if (AnyNull(count, arguments)) return sqlite3_result_null(context);
    date::DateTime date;
    int day_of_week = 0;
    int failure = ReadDate(arguments[0], date);
    if (failure == 0) failure = ReadWeekday(arguments[1], day_of_week);
    if (failure == 0) failure = date::NextDay(date, day_of_week, &date);
    ReturnWholeDate(context, date, failure);
}

bool IsLastDay(const date::DateTime& value) { return value.day == date::DaysInMonth(value.year, value.month); }

// Whole months between the same days of a month and between last days; else with a fraction of 31 days.
void MonthsBetween(const date::DateTime& left, const date::DateTime& right, OCINumber& months) {
    const auto month_number = [](const date::DateTime& value) {
        const int year = value.year < 0 ? value.year + 1 : value.year;    // there is no year 0
        return year * 12 + value.month;
    };
    number::FromInt64(month_number(left) - month_number(right), &months);
    if (left.day == right.day || (IsLastDay(left) && IsLastDay(right))) return;
    OCINumber part;
    OCINumber whole;
    number::FromInt64((left.day - right.day) * kSecondsOfDay + SecondOfDay(left) - SecondOfDay(right), &part);
    number::FromInt64(31 * kSecondsOfDay, &whole);
    (void)number::Div(part, whole, &part);    // numbers of this size
    (void)number::Add(months, part, &months);
}

// months_between(date, date)
void MonthsBetweenDates(sqlite3_context* context, int count, Arguments arguments) {
    if (AnyNull(count, arguments)) return sqlite3_result_null(context);
    date::DateTime left;
    date::DateTime right;
    OCINumber months;
    int failure = ReadDate(arguments[0], left);
    if (failure == 0) failure = ReadDate(arguments[1], right);
    if (failure != 0) return Refuse(context, failure);
    MonthsBetween(left, right, months);
    ReturnNumber(context, months);
}

void ToMidnight(date::DateTime& value) { value.hour = value.minute = value.second = 0; }

int ToDayOf(date::DateTime& value, int month, int day) {
    value.month = static_cast<std::uint8_t>(month);
    value.day = static_cast<std::uint8_t>(day);
    ToMidnight(value);
    return 0;
}

// Back to the day that is a multiple of seven days behind `first`.
int ToWeekFrom(date::DateTime& value, date::DayNumber first) {
    ToMidnight(value);
    const date::DayNumber day = date::ToDayNumber(value);
    return date::AddDays(value, -(((day - first) % 7 + 7) % 7), &value);
}

int ToCentury(date::DateTime& value) {
    const int year = value.year;
    const int first = year > 0 ? (year - 1) / 100 * 100 + 1 : -((-year + 99) / 100 * 100);
    if (first < date::kMinYear) return errors::kBadYear;
    value.year = static_cast<std::int16_t>(first);
    return ToDayOf(value, 1, 1);
}
int ToYear(date::DateTime& value) { return ToDayOf(value, 1, 1); }
int ToQuarter(date::DateTime& value) { return ToDayOf(value, (value.month - 1) / 3 * 3 + 1, 1); }
int ToMonth(date::DateTime& value) { return ToDayOf(value, value.month, 1); }
int ToDay(date::DateTime& value) { return ToDayOf(value, value.month, value.day); }
int ToSunday(date::DateTime& value) {
    ToMidnight(value);
    return date::AddDays(value, -date::DayOfWeek(date::ToDayNumber(value)), &value);
}
int ToMonday(date::DateTime& value) {
    ToMidnight(value);
    return date::AddDays(value, -((date::DayOfWeek(date::ToDayNumber(value)) + 6) % 7), &value);
}
int ToWeekOfYear(date::DateTime& value) { return ToWeekFrom(value, date::ToDayNumber(value.year, 1, 1)); }
int ToWeekOfMonth(date::DateTime& value) { return ToWeekFrom(value, date::ToDayNumber(value.year, value.month, 1)); }
int ToHour(date::DateTime& value) {
    value.minute = value.second = 0;
    return 0;
}
int ToMinute(date::DateTime& value) {
    value.second = 0;
    return 0;
}

struct UnitRow {
    std::string_view word;
    int (*cut)(date::DateTime&);
};

constexpr UnitRow kUnits[] = {
    {"cc", ToCentury}, {"scc", ToCentury},
    {"yyyy", ToYear}, {"syyyy", ToYear}, {"year", ToYear}, {"syear", ToYear},
    {"yyy", ToYear}, {"yy", ToYear}, {"y", ToYear},
    {"q", ToQuarter},
    {"month", ToMonth}, {"mon", ToMonth}, {"mm", ToMonth}, {"rm", ToMonth},
    {"ww", ToWeekOfYear}, {"iw", ToMonday}, {"w", ToWeekOfMonth},
    {"ddd", ToDay}, {"dd", ToDay}, {"j", ToDay},
    {"day", ToSunday}, {"dy", ToSunday}, {"d", ToSunday},
    {"hh", ToHour}, {"hh12", ToHour}, {"hh24", ToHour},
    {"mi", ToMinute},
};

int CutDate(std::string_view unit, date::DateTime& value) {
    const auto* row = std::find_if(std::begin(kUnits), std::end(kUnits),
                                   [&](const UnitRow& candidate) { return IsWord(unit, candidate.word); });
    return row == std::end(kUnits) ? errors::kBadUnit : row->cut(value);
}

// A number cut or rounded to places behind the point, or before it; to whole ones without the second argument.
template <auto operation>
void ToPlaces(sqlite3_context* context, int count, Arguments arguments) {
    if (AnyNull(count, arguments)) return sqlite3_result_null(context);
    OCINumber number;
    std::int64_t places = 0;
    int failure = ReadNumber(arguments[0], number);
    if (failure == 0 && count > 1) failure = ReadWhole(arguments[1], places);
    constexpr std::int64_t kMostPlaces = 1000;    // beyond any place that a number has
    places = std::clamp(places, -kMostPlaces, kMostPlaces);
    if (failure == 0) failure = operation(number, static_cast<int>(places), &number);
    if (failure != 0) return Refuse(context, failure);
    ReturnNumber(context, number);
}

// trunc(date), trunc(date, unit), trunc(number), trunc(number, places). With a unit any text is to be a date.
void Trunc(sqlite3_context* context, int count, Arguments arguments) {
    if (AnyNull(count, arguments)) return sqlite3_result_null(context);
    date::DateTime date;
    const bool by_unit = count > 1 && sqlite3_value_type(arguments[1]) == SQLITE_TEXT && !IsNumber(arguments[0]);
    if (by_unit || IsDate(arguments[0], date)) {
        int failure = ReadDate(arguments[0], date);
        if (failure == 0) failure = CutDate(count > 1 ? TextOf(arguments[1]) : "dd", date);
        return ReturnWholeDate(context, date, failure);
    }
    ToPlaces<number::Trunc>(context, count, arguments);
}

constexpr FunctionRow kRows[] = {
    {"add_months", 2, 2, SQLITE_DETERMINISTIC, AddMonths, "date"},
    {"last_day", 1, 1, SQLITE_DETERMINISTIC, LastDay, "date"},
    {"next_day", 2, 2, SQLITE_DETERMINISTIC, NextDay, "date"},
    {"months_between", 2, 2, SQLITE_DETERMINISTIC, MonthsBetweenDates, "number"},
    {"trunc", 1, 2, SQLITE_DETERMINISTIC, Trunc, "", 1},
    {"round", 1, 2, SQLITE_DETERMINISTIC, ToPlaces<number::Round>, "number"},
};

}  // namespace

std::span<const FunctionRow> DateFunctions() { return kRows; }

}  // namespace engine::sqlite
