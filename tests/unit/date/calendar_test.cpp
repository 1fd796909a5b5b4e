// The calendar, its arithmetic and checks, and the forms of dates without a model.
#include <gtest/gtest.h>

#include <vector>

#include "date/date.h"
#include "oci.h"

namespace {

using namespace date;

DateTime Day(int year, int month, int day) {
    return {.year = static_cast<std::int16_t>(year),
            .month = static_cast<std::uint8_t>(month),
            .day = static_cast<std::uint8_t>(day)};
}

std::string EngineText(const DateTime& value) {
    char text[kMaxEngineText];
    return {text, ToEngineText(value, text)};
}

std::string DateOf(const DateTime& value) { return EngineText(value).substr(0, EngineText(value).find(' ')); }

DateTime Read(std::string_view text) {
    DateTime value;
    EXPECT_EQ(FromEngineText(text, &value), 0) << text;
    return value;
}

TEST(Calendar, CountsEveryDayOnce) {
    DateTime day = Day(-4712, 1, 1), next;
    int wrong = 0;
    for (DayNumber number = 366; number < 5373484; ++number, day = next) {
        FromDayNumber(number + 1, &next);
        const bool same_month = next.month == day.month && next.day > day.day;
        const bool next_month = next.day == 1 && (next.month == day.month % 12 + 1);
        wrong += ToDayNumber(day) != number || ValidateDate(day) != 0 || !(same_month || next_month);
    }
    EXPECT_EQ(wrong, 0);
    EXPECT_EQ(day, Day(9999, 12, 31));
}

// Numbers and weekdays as almanacs have them.
TEST(Calendar, KnownDays) {
    const struct { DateTime day; DayNumber number; int day_of_week; } cases[] = {
        {Day(-4712, 1, 1), 366, 3},      {Day(-44, 3, 15), 1705426, 3},   {Day(-1, 12, 31), 1721423, 5},
        {Day(1, 1, 1), 1721424, 6},      {Day(1066, 10, 14), 2110701, 6}, {Day(1582, 10, 4), 2299160, 4},
        {Day(1582, 10, 15), 2299161, 5}, {Day(1858, 11, 17), 2400001, 3}, {Day(1900, 3, 1), 2415080, 4},
        {Day(2000, 1, 1), 2451545, 6},   {Day(2024, 2, 29), 2460370, 4},  {Day(9999, 12, 31), 5373484, 5}};
    for (const auto& c : cases) {
        EXPECT_EQ(ToDayNumber(c.day), c.number) << DateOf(c.day);
        EXPECT_EQ(DayOfWeek(c.number), c.day_of_week) << DateOf(c.day);
    }
    EXPECT_EQ(DayOfYear(Day(1582, 12, 31)), 355);
    EXPECT_EQ(DayOfYear(Day(1900, 12, 31)), 365);
    EXPECT_EQ(DayOfYear(Day(1500, 12, 31)), 366);
    EXPECT_EQ(DayOfYear(Day(-5, 12, 31)), 366);
}

TEST(Calendar, FlagsAndErrorOfEachField) {
    constexpr Flags kDay = OCI_DATE_INVALID_DAY, kMonth = OCI_DATE_INVALID_MONTH, kYear = OCI_DATE_INVALID_YEAR;
    const struct { DateTime value; Flags flags; Errno number; } cases[] = {
        {Day(2024, 2, 29), 0, 0}, {Day(2023, 2, 29), kDay, 1839}, {Day(1900, 2, 29), kDay, 1839},
        {Day(1500, 2, 29), 0, 0}, {Day(-5, 2, 29), 0, 0}, {Day(-4, 2, 29), kDay, 1839}, {Day(2024, 4, 31), kDay, 1839},
        {Day(2024, 1, 32), kDay, 1847}, {Day(2024, 1, 0), kDay | OCI_DATE_DAY_BELOW_VALID, 1847},
        {Day(2024, 0, 1), kMonth | OCI_DATE_MONTH_BELOW_VALID, 1843}, {Day(2024, 13, 31), kMonth, 1843}, {Day(2024, 12, 32), kDay, 1847},
        {{.year = 2024, .month = 12, .day = 31, .hour = 23, .minute = 59, .second = 59}, 0, 0},
        {Day(0, 1, 1), OCI_DATE_YEAR_ZERO, 1841}, {Day(-4713, 1, 1), kYear | OCI_DATE_YEAR_BELOW_VALID, 1841},
        {Day(10000, 1, 1), kYear, 1841}, {Day(1582, 10, 5), OCI_DATE_DAY_MISSING_FROM_1582, 1864},
        {Day(1582, 10, 14), OCI_DATE_DAY_MISSING_FROM_1582, 1864},
        {{.year = 2024, .month = 1, .day = 1, .hour = 24}, OCI_DATE_INVALID_HOUR, 1850},
        {{.year = 2024, .month = 1, .day = 1, .minute = 60}, OCI_DATE_INVALID_MINUTE, 1851},
        {{.year = 2024, .month = 1, .day = 1, .second = 60}, OCI_DATE_INVALID_SECOND, 1852},
        {{.year = 2024, .month = 1, .day = 1, .nanosecond = 1'000'000'000}, 0, 1880},
        {{.year = 0, .month = 13, .day = 0, .hour = 99, .minute = 99, .second = 99},
         OCI_DATE_YEAR_ZERO | kMonth | kDay | OCI_DATE_DAY_BELOW_VALID | OCI_DATE_INVALID_HOUR |
             OCI_DATE_INVALID_MINUTE | OCI_DATE_INVALID_SECOND,
         1841}};
    for (const auto& c : cases) {
        EXPECT_EQ(Check(c.value), c.flags) << EngineText(c.value);
        EXPECT_EQ(Validate(c.value), c.number) << EngineText(c.value);
    }
}

TEST(Calendar, AddsMonths) {
    const struct { const char* day; std::int64_t months; const char* result; } cases[] = {
        {"2019-12-31", 2, "2020-02-29"},    {"2020-02-29", 2, "2020-04-30"},   {"2020-04-30", -1, "2020-03-31"},
        {"2023-01-30", 1, "2023-02-28"},    {"2023-01-28", 1, "2023-02-28"},   {"2024-02-28", 12, "2025-02-28"},
        {"0001-01-15", -1, "-0001-12-15"},  {"-0001-12-31", 2, "0001-02-28"},  {"1582-09-04", 1, "1582-10-04"},
        {"1582-09-10", 1, "1582-10-15"},    {"1582-10-31", -12, "1581-10-31"}, {"2024-01-31", 0, "2024-01-31"},
        {"-4712-01-31", 176531, "9999-12-31"}, {"-4712-02-01", -1, "-4712-01-01"}};
    for (const auto& c : cases) {
        DateTime result;
        EXPECT_EQ(AddMonths(Read(c.day), c.months, &result), 0) << c.day;
        EXPECT_EQ(DateOf(result), c.result) << c.day << " and " << c.months;
    }
}

TEST(Calendar, ResultsOutOfRange) {
    DateTime result = Day(1999, 9, 9);
    EXPECT_EQ(AddDays(Day(9999, 12, 31), 1, &result), 1841);
    EXPECT_EQ(AddDays(Day(-4712, 1, 1), -1, &result), 1841);
    EXPECT_EQ(AddDays(Day(2024, 1, 1), INT64_MAX, &result), 1841);
    EXPECT_EQ(AddDays(Day(2024, 1, 1), INT64_MIN, &result), 1841);
    EXPECT_EQ(AddMonths(Day(9999, 12, 1), 1, &result), 1841);
    EXPECT_EQ(AddMonths(Day(-4712, 1, 1), -1, &result), 1841);
    EXPECT_EQ(AddMonths(Day(2024, 1, 1), INT32_MIN, &result), 1841);
    EXPECT_EQ(NextDay(Day(9999, 12, 31), 0, &result), 1841);
    EXPECT_EQ(result, Day(1999, 9, 9));
    EXPECT_EQ(AddDays(Day(-4712, 1, 2), -1, &result), 0);
    EXPECT_EQ(result, Day(-4712, 1, 1));
    EXPECT_EQ(LastDay(Day(2024, 2, 10), &result), 0);
    EXPECT_EQ(result, Day(2024, 2, 29));
    EXPECT_EQ(DaysBetween(Day(2024, 3, 1), result), 1);
}

TEST(Calendar, RoundsTheFractionAndCarries) {
    const struct { const char* value; int digits; const char* result; } cases[] = {
        {"2024-02-28 12:00:00.123456789", 9, "2024-02-28 12:00:00.123456789"},
        {"2024-02-28 12:00:00.123456789", 12, "2024-02-28 12:00:00.123456789"},
        {"2024-02-28 12:00:00.123456789", 8, "2024-02-28 12:00:00.12345679"},
        {"2024-02-28 12:00:00.123456499", 6, "2024-02-28 12:00:00.123456"},
        {"2024-02-28 12:00:00.1234565", 6, "2024-02-28 12:00:00.123457"},
        {"2024-02-28 12:00:00.99949", 3, "2024-02-28 12:00:00.999"},
        {"2024-02-28 12:00:00.9995", 3, "2024-02-28 12:00:01"},
        {"2024-02-28 12:00:00.499999999", 0, "2024-02-28 12:00:00"},
        {"2024-02-28 12:00:00.5", 0, "2024-02-28 12:00:01"}, {"2024-02-28 12:00:59.5", 0, "2024-02-28 12:01:00"},
        {"2024-02-28 12:59:59.99", 1, "2024-02-28 13:00:00"}, {"2024-02-28 23:59:59.99", 1, "2024-02-29 00:00:00"},
        {"2023-02-28 23:59:59.999999999 +05:30", 8, "2023-03-01 00:00:00 +05:30"},
        {"1999-12-31 23:59:59.6", 0, "2000-01-01 00:00:00"}, {"-0001-12-31 23:59:59.6", 0, "0001-01-01 00:00:00"},
        {"1582-10-04 23:59:59.6", 0, "1582-10-15 00:00:00"}, {"23:59:59.6", 0, "0000-00-00 00:00:00"}};
    for (const auto& c : cases) {
        DateTime value = Read(c.value);
        EXPECT_EQ(RoundFraction(value, c.digits, &value), 0) << c.value;
        EXPECT_EQ(EngineText(value), c.result) << c.value << " to " << c.digits;
    }
    DateTime last = Read("9999-12-31 23:59:59.5");
    EXPECT_EQ(RoundFraction(last, 0, &last), 1841);
    EXPECT_EQ(EngineText(last), "9999-12-31 23:59:59.5");
}

TEST(Calendar, OrdersByDateTimeAndFraction) {
    const char* ascending[] = {"-4712-01-01",         "-0044-03-15",           "-0001-12-31",
                               "0001-01-01",          "1999-12-31 23:59:59",   "2000-01-01",
                               "2000-01-01 00:00:01", "2000-01-01 00:00:01.5", "2000-01-01 00:00:01.500000001",
                               "2000-01-01 00:01:00", "2000-01-01 01:00:00",   "2000-01-02",
                               "2000-02-01"};
    for (std::size_t i = 0; i < std::size(ascending); ++i) {
        for (std::size_t j = 0; j < std::size(ascending); ++j)
            EXPECT_EQ(Compare(Read(ascending[i]), Read(ascending[j])), i < j ? -1 : i > j) << i << ' ' << j;
    }
}

TEST(DateForms, SevenBytes) {
    const struct { const char* text; std::vector<std::uint8_t> bytes; } cases[] = {
        {"2024-02-29 13:05:00", {0x78, 0x7C, 2, 29, 14, 6, 1}}, {"-4712-01-01 00:00:00", {53, 88, 1, 1, 1, 1, 1}},
        {"9999-12-31 23:59:59", {199, 199, 12, 31, 24, 60, 60}}, {"0001-01-01 00:00:00", {100, 101, 1, 1, 1, 1, 1}}};
    for (const auto& c : cases) {
        std::uint8_t bytes[kDateBytes];
        ToBytes(Read(c.text), bytes);
        EXPECT_EQ(std::vector(bytes, bytes + kDateBytes), c.bytes) << c.text;
        DateTime back;
        EXPECT_EQ(FromBytes(c.bytes.data(), &back), 0) << c.text;
        EXPECT_EQ(EngineText(back), c.text);
    }
}

TEST(DateForms, EngineTextIsReadInAllItsShapes) {
    const struct { const char* text; const char* canonical; } cases[] = {
        {"2024-02-29", "2024-02-29 00:00:00"}, {"2024-2-9", "2024-02-09 00:00:00"},
        {"2024-02-29T13:05", "2024-02-29 13:05:00"}, {"2024-02-29 13:05:09.250", "2024-02-29 13:05:09.25"},
        {"2024-02-29 13:05:09.1234567891", "2024-02-29 13:05:09.123456789"},
        {"2024-02-29 13:05:09.000000001 -08:30", "2024-02-29 13:05:09.000000001 -08:30"},
        {"2024-02-29 13:05:09+05", "2024-02-29 13:05:09 +05:00"},
        {"2024-02-29 13:05:09+0530", "2024-02-29 13:05:09 +05:30"},
        {"1880-02-29 13:05:09+00:09:21", "1880-02-29 13:05:09 +00:09"},
        {"2024-02-29 13:05:09Z", "2024-02-29 13:05:09 +00:00"}, {"0044-03-15 12:00:00 BC", "-0044-03-15 12:00:00"},
        {"0044-03-15 BC", "-0044-03-15 00:00:00"}, {"-0044-03-15 12:00:00", "-0044-03-15 12:00:00"},
        {"23:59:58.5", "0000-00-00 23:59:58.5"}};
    for (const auto& c : cases) EXPECT_EQ(EngineText(Read(c.text)), c.canonical) << c.text;
}

TEST(DateForms, EngineTextThatIsRefused) {
    const struct { const char* text; Errno number; } cases[] = {
        {"", 1861}, {"-", 1861}, {"2024", 1861}, {"2024-", 1861}, {"2024-02", 1861}, {"2024--01", 1861}, {"2024-02-", 1861},
        {"2024-02-29 12::05", 1861}, {"2024-02-29 12:05:", 1861}, {"2024-02-29 :05", 1861}, {"2024-02-29x", 1861},
        {"2024-02-1:", 1861}, {"2024-02-0:", 1861},
        {"2024-02-29 ", 1861}, {"2024-02-29 12", 1861}, {"2024-02-29 12:00:00.", 1861}, {"2024-02-29 12:00:00 +", 1861},
        {"2024-02-29 12:00:00 +1:", 1861}, {"2024-02-29 12:00:00 +16:00", 1861}, {"2024-02-29 12:00:00 +05:030", 1861},
        {"2024-02-29 12:00:00 +05:30:030", 1861}, {"2024-02-29 12:00:00 +05:60", 1861}, {"2024x02-29", 1861}, {"2024-02x29", 1861},
        {"2024-02-29x12:00:00", 1861}, {"2024-02-29 12x00:00", 1861}, {"2024-02-29 12:00x00", 1861}, {"2024-02-:1", 1861}, {"2024-02-29 12:00:00 +05:30x", 1861},
        {"-12:00", 1861}, {"100:00", 1861}, {"12345678-01-01", 1841}, {"10000-01-01", 1841}, {"0000-01-01", 1841},
        {"2023-02-29", 1839}, {"2024-13-01", 1843}, {"24:00", 1850}, {"2024-02-29 12:60:00", 1851},
        {"1582-10-10", 1864}};
    for (const auto& c : cases) {
        DateTime value;
        EXPECT_EQ(FromEngineText(c.text, &value), c.number) << c.text;
    }
}

}  // namespace
