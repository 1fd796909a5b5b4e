// Intervals, and datetimes as text and with intervals, as an application calls for them. What moments and differences
// come to was worked out with another calendar program.
#include "support/call_fixture.h"

namespace {

struct IntervalCalls : CallFixture {
    // "years-months" or "days h:m:s.f"; the error's number where it cannot be read.
    OCIInterval* Read(std::string_view text, bool months, sb4* number) {
        auto* interval = NewDescriptor<OCIInterval>(months ? OCI_DTYPE_INTERVAL_YM : OCI_DTYPE_INTERVAL_DS);
        *number = Answer(OCIIntervalFromText(env_, err_, Text(text), text.size(), interval));
        return interval;
    }
    OCIInterval* Read(std::string_view text, bool months = false) {
        sb4 number = 0;
        OCIInterval* interval = Read(text, months, &number);
        EXPECT_EQ(number, 0) << text;
        return interval;
    }
    std::string Shown(const OCIInterval* interval, ub1 leading = 9, ub1 fraction = 9) {
        char text[40] = "";
        size_t length = 0;
        const sb4 number =
            Answer(OCIIntervalToText(env_, err_, interval, leading, fraction, Text(text), sizeof text, &length));
        return number ? std::to_string(number) : std::string(text, length);
    }
    OCIDateTime* Moment(std::string_view text, ub4 type = OCI_DTYPE_TIMESTAMP_TZ) {
        auto* moment = NewDescriptor<OCIDateTime>(type);
        std::string model = "YYYY-MM-DD HH24:MI:SS";
        if (text.find('.') != std::string_view::npos) model += ".FF";
        if (type == OCI_DTYPE_TIMESTAMP_TZ) model += " TZR";
        EXPECT_EQ(Answer(OCIDateTimeFromText(env_, err_, Text(text), text.size(), Text(model),
                                             static_cast<ub1>(model.size()), nullptr, 0, moment)), 0) << text;
        return moment;
    }
    std::string Shown(const OCIDateTime* moment, std::string_view model, ub1 digits = 9) {
        OraText text[80];
        ub4 size = sizeof text;
        const sb4 number = Answer(OCIDateTimeToText(env_, err_, moment, Text(model), static_cast<ub1>(model.size()),
                                                    digits, nullptr, 0, &size, text));
        return number ? std::to_string(number) : std::string(reinterpret_cast<char*>(text), size);
    }
};

TEST_F(IntervalCalls, TextsAreReadAndWritten) {
    const struct { bool months; const char* text; ub1 leading, fraction; const char* shown; } cases[] = {
        {true, "2-3", 2, 0, "+02-03"}, {true, "  -002-11  ", 1, 0, "-2-11"}, {true, "+7", 0, 0, "1873"},
        {true, "-0-0", 0, 9, "+0-00"}, {true, "1-12", 2, 0, "1843"}, {true, "999999999-11", 9, 0, "+999999999-11"},
        {true, "100-0", 2, 0, "1873"}, {true, "1-2", 10, 0, "30088"},
        {false, "1 02:03:04.5", 2, 6, "+01 02:03:04.500000"}, {false, "-1  02:03:04.5", 2, 0, "-01 02:03:05"},
        {false, "-0 0:0:0.999999999", 2, 9, "-00 00:00:00.999999999"}, {false, "5", 1, 1, "+5 00:00:00.0"},
        {false, "9 23:59:59.95", 1, 1, "1873"}, {false, "9 23:59:59.95", 2, 1, "+10 00:00:00.0"},
        {false, "9 23:59:59.94", 1, 1, "+9 23:59:59.9"}, {false, "999999999 23:59:59.9", 9, 0, "1873"},
        {false, "-0 0:0:0.4", 2, 0, "+00 00:00:00"}, {false, "5", 1, 10, "30088"}, {false, "1 2::4", 1, 0, "1867"},
        {false, "1 2:3:.4", 1, 0, "1867"}, {false, "1 2:3:4.", 1, 0, "1880"}, {false, "1 2:3:4.1234567890", 1, 0, "1880"}};
    for (const auto& c : cases) {
        sb4 number = 0;
        const OCIInterval* interval = Read(c.text, c.months, &number);
        EXPECT_EQ(number ? std::to_string(number) : Shown(interval, c.leading, c.fraction), c.shown) << c.text;
    }
    char area[] = "????????";
    size_t length = 0;
    EXPECT_EQ(Answer(OCIIntervalToText(env_, err_, Read("2-3", true), 2, 0, Text(area), 5, &length)), 22059);
    EXPECT_EQ(length, 6u);
    EXPECT_EQ(Answer(OCIIntervalToText(env_, err_, Read("2-3", true), 2, 0, Text(area), 6, &length)), 0);
    EXPECT_STREQ(area, "+02-03??");
    for (const size_t room : {size_t{7}, size_t{1} << 32}) {
        EXPECT_EQ(Answer(OCIIntervalToText(env_, err_, Read("2-3", true), 2, 0, Text(area), room, &length)), 0);
        EXPECT_STREQ(area, "+02-03") << room;
        area[6] = '?';
    }
}

TEST_F(IntervalCalls, PartsHaveLimitsAndOneSign) {
    const struct { sb4 day, hour, minute, second, fraction; const char* shown; } cases[] = {
        {1, 2, 3, 4, 5, "+000000001 02:03:04.000000005"}, {-1, -2, 0, 0, -5, "-000000001 02:00:00.000000005"},
        {999999999, 23, 59, 59, 999999999, "+999999999 23:59:59.999999999"}, {1000000000, 0, 0, 0, 0, "1873"},
        {0, 24, 0, 0, 0, "1850"}, {0, 0, -60, 0, 0, "1851"}, {0, 0, 0, 60, 0, "1871"}, {0, 0, 0, 0, 1000000000, "1880"},
        {0, 0, 0, 0, -2147483647 - 1, "1880"}, {1, -1, 0, 0, 0, "1867"}, {0, 0, 0, 1, -1, "1867"}};
    for (const auto& c : cases) {
        auto* interval = NewDescriptor<OCIInterval>(OCI_DTYPE_INTERVAL_DS);
        const sb4 number =
            Answer(OCIIntervalSetDaySecond(env_, err_, c.day, c.hour, c.minute, c.second, c.fraction, interval));
        EXPECT_EQ(number ? std::to_string(number) : Shown(interval), c.shown) << c.day << ' ' << c.hour;
        sb4 parts[5] = {};
        if (number) continue;
        EXPECT_GT(std::strlen(c.shown), 4u) << "should have been refused";
        EXPECT_EQ(Answer(OCIIntervalGetDaySecond(env_, err_, parts, parts + 1, parts + 2, parts + 3, parts + 4,
                                                 interval)), 0);
        EXPECT_EQ(std::memcmp(parts, &c.day, sizeof parts), 0) << c.shown;
    }
    auto* days = NewDescriptor<OCIInterval>(OCI_DTYPE_INTERVAL_DS);
    auto* months = NewDescriptor<OCIInterval>(OCI_DTYPE_INTERVAL_YM);
    sb4 year = 0, month = 0;
    EXPECT_EQ(Shown(days), "1867");    // unset
    EXPECT_EQ(Answer(OCIIntervalSetYearMonth(env_, err_, 1, 2, days)), 1867);
    EXPECT_EQ(Answer(OCIIntervalSetDaySecond(env_, err_, 1, 2, 3, 4, 5, months)), 1867);
    EXPECT_EQ(Answer(OCIIntervalSetYearMonth(env_, err_, 0, 12, months)), 1843);
    EXPECT_EQ(Answer(OCIIntervalSetYearMonth(env_, err_, 1000000000, 0, months)), 1873);
    EXPECT_EQ(Answer(OCIIntervalSetYearMonth(env_, err_, -3, -11, months)), 0);
    EXPECT_EQ(Answer(OCIIntervalGetYearMonth(env_, err_, &year, &month, months)), 0);
    EXPECT_EQ(year * 100 + month, -311);
    EXPECT_EQ(Answer(OCIIntervalGetYearMonth(env_, err_, &year, &month, Read("1"))), 1867);
    EXPECT_EQ(Answer(OCIIntervalAssign(env_, err_, months, days)), 1867);
    auto* copy = NewDescriptor<OCIInterval>(OCI_DTYPE_INTERVAL_YM);
    EXPECT_EQ(Answer(OCIIntervalAssign(env_, err_, months, copy)), 0);
    EXPECT_EQ(Shown(copy, 1), "-3-11");
}

TEST_F(IntervalCalls, WhatIsUnset) {
    OCIDateTime* moment = Moment("2024-07-15 00:00:00 -03:30");
    auto* unset = NewDescriptor<OCIDateTime>(OCI_DTYPE_TIMESTAMP);
    auto* none = NewDescriptor<OCIInterval>(OCI_DTYPE_INTERVAL_DS);
    ub4 flags = 7;
    EXPECT_EQ(Shown(unset, ""), "1866");
    EXPECT_EQ(Answer(OCIIntervalCheck(env_, err_, none, &flags)), 1867);
    EXPECT_EQ(Answer(OCIDateTimeSubtract(env_, err_, unset, moment, none)), 1866);
    EXPECT_EQ(Answer(OCIDateTimeSubtract(env_, err_, moment, unset, none)), 1866);
    EXPECT_EQ(Answer(OCIIntervalCheck(env_, err_, Read("1"), &flags)), 0);
    EXPECT_EQ(flags, 0u);
    MUST(Answer(OCI_datetimeSetTime(env_, err_, unset, 1, 2, 3, 4)));
    EXPECT_EQ(Shown(unset, "SS"), "1866") << "a time without a date";
}

TEST_F(IntervalCalls, SumsCarryAndCompare) {
    const struct { const char* left; const char* right; const char* sum; const char* difference; sword order; } cases[] = {
        {"1 23:59:59.999999999", "0 0:0:0.000000001", "+000000002 00:00:00.000000000", "+000000001 23:59:59.999999998", 1},
        {"0 0:0:0.5", "1 0:0:0.75", "+000000001 00:00:01.250000000", "-000000001 00:00:00.250000000", -1},
        {"0 0:0:1", "0 0:0:0.25", "+000000000 00:00:01.250000000", "+000000000 00:00:00.750000000", 1},
        {"-0 0:0:1", "0 0:0:0.25", "-000000000 00:00:00.750000000", "-000000000 00:00:01.250000000", -1},
        {"-0 0:0:0.25", "-0 0:0:0.5", "-000000000 00:00:00.750000000", "+000000000 00:00:00.250000000", 1},
        {"-0 0:0:1", "0 0:0:0.000000001", "-000000000 00:00:00.999999999", "-000000000 00:00:01.000000001", -1},
        {"-2", "-2", "-000000004 00:00:00.000000000", "+000000000 00:00:00.000000000", 0},
        {"999999999", "1", "1873", "+999999998 00:00:00.000000000", 1}};
    for (const auto& c : cases) {
        OCIInterval* left = Read(c.left);
        OCIInterval* right = Read(c.right);
        auto* out = NewDescriptor<OCIInterval>(OCI_DTYPE_INTERVAL_DS);
        const sb4 sum = Answer(OCIIntervalAdd(env_, err_, left, right, out));
        EXPECT_EQ(sum ? std::to_string(sum) : Shown(out), c.sum) << c.left;
        EXPECT_EQ(Answer(OCIIntervalSubtract(env_, err_, left, right, out)), 0);
        EXPECT_EQ(Shown(out), c.difference) << c.left;
        sword order = 9;
        EXPECT_EQ(Answer(OCIIntervalCompare(env_, err_, left, right, &order)), 0);
        EXPECT_EQ(order, c.order) << c.left;
    }
    OCIInterval* months = Read("1-11", true);
    EXPECT_EQ(Answer(OCIIntervalAdd(env_, err_, months, Read("0-1", true), months)), 0);
    EXPECT_EQ(Shown(months, 1), "+2-00");
    sword order = 0;
    EXPECT_EQ(Answer(OCIIntervalCompare(env_, err_, months, Read("1"), &order)), 1870);
    EXPECT_EQ(Answer(OCIIntervalAdd(env_, err_, months, Read("1"), months)), 1870);
    auto* stamp = reinterpret_cast<OCIInterval*>(NewDescriptor<OCIDateTime>(OCI_DTYPE_TIMESTAMP));
    for (const OCIInterval* none : {Bogus<OCIInterval>(), stamp})
        EXPECT_EQ(OCIIntervalAssign(env_, err_, none, months), OCI_INVALID_HANDLE);
}

TEST_F(IntervalCalls, MomentsMove) {
    const struct { const char* from; const char* by; bool months, back; const char* to; } cases[] = {
        {"2024-02-29 10:00:00 +00:00", "1-0", true, false, "1839"},
        {"2024-02-29 10:00:00 +00:00", "4-0", true, false, "2028-02-29 10:00:00.000000000 +00:00"},
        {"2024-01-31 10:00:00 +00:00", "0-1", true, true, "2023-12-31 10:00:00.000000000 +00:00"},
        {"2024-01-31 10:00:00 +00:00", "0-1", true, false, "1839"},
        {"9999-12-01 10:00:00 +00:00", "0-1", true, false, "1841"},
        {"2024-02-28 23:59:59.999999 -05:00", "1 0:0:0.000001", false, false, "2024-03-01 00:00:00.000000000 -05:00"},
        {"2024-03-01 00:00:00 +00:00", "0 0:0:0.000000001", false, true, "2024-02-29 23:59:59.999999999 +00:00"},
        {"9999-12-31 23:59:59 +00:00", "0 0:0:1", false, false, "1841"},
        {"2024-03-31 01:30:00 Europe/Paris", "0 1:0", false, false, "2024-03-31 03:30:00.000000000 +02:00"},
        {"2024-10-27 02:30:00 Europe/Paris", "0 1:0", false, false, "2024-10-27 02:30:00.000000000 +01:00"},
        {"2024-07-15 12:00:00 Europe/Paris", "184", false, false, "2025-01-15 11:00:00.000000000 +01:00"},
        {"2024-07-15 12:00:00 Europe/Paris", "0-6", true, false, "2025-01-15 12:00:00.000000000 +01:00"}};
    for (const auto& c : cases) {
        auto* moment = Moment(c.from);
        const auto move = c.back ? OCIDateTimeIntervalSub : OCIDateTimeIntervalAdd;
        const sb4 number = Answer(move(env_, err_, moment, Read(c.by, c.months), moment));
        EXPECT_EQ(number ? std::to_string(number) : Shown(moment, "YYYY-MM-DD HH24:MI:SS.FF TZH:TZM"), c.to) << c.from;
    }
}

TEST_F(IntervalCalls, DifferencesOfMoments) {
    const struct { const char* left; const char* right; const char* difference; } cases[] = {
        {"2024-03-01 00:00:00 +00:00", "2024-02-28 23:59:59.5 +00:00", "+000000001 00:00:00.500000000"},
        {"2000-01-01 00:00:00 +00:00", "2024-07-15 13:14:15 +00:00", "-000008962 13:14:15.000000000"},
        {"2024-01-01 00:00:00 +05:30", "2024-01-01 00:00:00 -01:00", "-000000000 06:30:00.000000000"},
        {"2024-10-28 00:00:00 Europe/Paris", "2024-10-27 00:00:00 Europe/Paris", "+000000001 01:00:00.000000000"}};
    auto* out = NewDescriptor<OCIInterval>(OCI_DTYPE_INTERVAL_DS);
    for (const auto& c : cases) {
        EXPECT_EQ(Answer(OCIDateTimeSubtract(env_, err_, Moment(c.left), Moment(c.right), out)), 0);
        EXPECT_EQ(Shown(out), c.difference) << c.left;
    }
    auto* months = NewDescriptor<OCIInterval>(OCI_DTYPE_INTERVAL_YM);
    EXPECT_EQ(Answer(OCIDateTimeSubtract(env_, err_, Moment(cases[0].left), Moment(cases[0].right), months)), 1867);
}

TEST_F(IntervalCalls, TextsAndZonesOfMoments) {
    auto* moment = Moment("2024-07-15 13:14:15.98765 Europe/Paris");
    auto* any = NewDescriptor<OCIDateTime>(OCI_DTYPE_INTERVAL_YM);    // of a datetime of any kind
    EXPECT_EQ(Answer(OCIDateTimeConvert(env_, err_, moment, any)), 0);
    for (const auto* shown : {moment, any})
        EXPECT_EQ(Shown(shown, "", 3), "15-JUL-24 01.14.15.987 PM Europe/Paris");
    EXPECT_EQ(Shown(moment, "SS.FF", 0), "15.");
    EXPECT_EQ(Shown(moment, "SS.FF2", 9), "15.98");
    EXPECT_EQ(Shown(moment, "SS", 10), "30088");
    const struct { const char* text; const char* name; int hour, minute, winter; } zones[] = {
        {"2024-07-15 00:00:00 Europe/Paris", "Europe/Paris", 2, 0, 1}, {"2024-07-15 00:00:00 -03:30", "-03:30", -3, -30, -3},
        {"2024-07-15 00:00:00 +00:00", "+00:00", 0, 0, 0}, {"2024-07-15 00:00:00 +14:00", "+14:00", 14, 0, 14}};
    auto* plain = Moment("2024-07-15 00:00:00.5", OCI_DTYPE_TIMESTAMP);
    for (const auto& c : zones) {
        sb1 hour = 0, minute = 0, winter = 99;
        ub1 name[20];
        ub4 size = sizeof name;
        EXPECT_EQ(Answer(OCIDateTimeGetTimeZoneOffset(env_, err_, Moment(c.text), &hour, &minute)), 0);
        EXPECT_EQ(Answer(OCIDateTimeGetTimeZoneName(env_, err_, Moment(c.text), name, &size)), 0);
        EXPECT_EQ(std::string(reinterpret_cast<char*>(name), size), c.name);
        EXPECT_EQ(hour * 100 + minute, c.hour * 100 + c.minute) << c.name;
        OCIDateTime* later = Moment(c.text);
        EXPECT_EQ(Answer(OCI_datetimeSetDate(env_, err_, later, 2025, 1, 15)), 0);
        EXPECT_EQ(Answer(OCIDateTimeGetTimeZoneOffset(env_, err_, later, &winter, &minute)), 0);
        EXPECT_EQ(winter, c.winter) << c.name;
        size = 5;
        EXPECT_EQ(Answer(OCIDateTimeGetTimeZoneName(env_, err_, moment, name, &size)), 22059);
        EXPECT_EQ(size, 12u);
        EXPECT_EQ(Answer(OCIDateTimeGetTimeZoneName(env_, err_, plain, name, &size)), 1878);
    }
    auto* date = NewDescriptor<OCIDateTime>(OCI_DTYPE_DATE);
    EXPECT_EQ(Answer(OCIDateTimeConstruct(env_, err_, date, 2024, 7, 16, 13, 14, 15, 0, nullptr, 0)), 0);
    EXPECT_EQ(Shown(date, "DD HH24:MI:SS"), "16 00:00:00");
    EXPECT_EQ(Shown(date, "FF"), "1821");
    EXPECT_EQ(Answer(OCIDateTimeFromText(env_, err_, Text("5"), 1, Text("FF"), 2, nullptr, 0, date)), 1821);
    auto* time = NewDescriptor<OCIDateTime>(OCI_DTYPE_TIME);
    EXPECT_EQ(Answer(OCI_datetimeSetTime(env_, err_, time, 7, 8, 9, 0)), 0);
    EXPECT_EQ(Shown(time, "PM HH24:MI:SS SSSSS FF \"x\""), "AM 07:08:09 25689 000000000 x");
    for (const char* model : {"YYYY", "J", "MON", "DAY", "RM", "DL", "DS \"x\"", "fmDL", "DL TZH"})
        EXPECT_EQ(Shown(time, model), "1878") << model;
}

// Which parts each type has, and what it drops.
TEST_F(IntervalCalls, TypesOfMoments) {
    auto* tokyo = Moment("2024-07-15 10:20:30.5 Asia/Tokyo");
    auto* out = NewDescriptor<OCIInterval>(OCI_DTYPE_INTERVAL_DS);
    const struct { ub4 type; const char *made, *converted; sb4 date, time, compared, zone, moved; } cases[] = {
        {OCI_DTYPE_DATE, "16-JUL-24", "15-JUL-24", 0, 1878, 0, 1878, 0},
        {OCI_DTYPE_TIME, "01.14.15.000000 PM", "10.20.30.500000 AM", 1878, 0, 1870, 1878, 1878},
        {OCI_DTYPE_TIME_TZ, "01.14.15.000000 PM Asia/Tokyo", "10.20.30.500000 AM Asia/Tokyo", 1878, 0, 1870, 0, 1878},
        {OCI_DTYPE_TIMESTAMP, "16-JUL-24 01.14.15.000000 PM", "15-JUL-24 10.20.30.500000 AM", 0, 0, 0, 1878, 0},
        {OCI_DTYPE_TIMESTAMP_LTZ, "16-JUL-24 01.14.15.000000 PM", nullptr, 0, 0, 0, 0, 0}};    // by the zone of the process
    for (const auto& c : cases) {
        auto* value = NewDescriptor<OCIDateTime>(c.type);
        ub4 flags = 0, fraction = 0;
        sb2 year = 0;
        ub1 month = 0, day = 0, second = 0;
        sb1 hour = 0, minute = 0;
        sword order = 0;
        EXPECT_EQ(Answer(OCIDateTimeGetTimeZoneOffset(env_, err_, value, &hour, &minute)), 1866);
        EXPECT_EQ(Answer(OCIDateTimeIntervalAdd(env_, err_, value, Read("1"), value)), 1866);
        EXPECT_EQ(Answer(OCIDateTimeConstruct(env_, err_, value, 2024, 7, 16, 13, 14, 15, 0, Text("Asia/Tokyo"), 10)), 0);
        EXPECT_EQ(Shown(value, "", 6), c.made);
        EXPECT_EQ(Answer(OCIDateTimeCheck(env_, err_, value, &flags)), 0);
        EXPECT_EQ(flags, 0U) << c.type;
        EXPECT_EQ(Answer(OCIDateTimeConvert(env_, err_, tokyo, value)), 0);
        if (c.converted) { EXPECT_EQ(Shown(value, "", 6), c.converted); }
        EXPECT_EQ(Answer(OCI_datetimeSetDate(env_, err_, value, 2025, 1, 15)), c.date);
        EXPECT_EQ(Answer(OCIDateTimeGetDate(env_, err_, value, &year, &month, &day)), c.date);
        EXPECT_EQ(Answer(OCI_datetimeSetTime(env_, err_, value, 1, 2, 3, 0)), c.time);
        EXPECT_EQ(Answer(OCIDateTimeGetTime(env_, err_, value, &month, &day, &second, &fraction)), c.time);
        EXPECT_EQ(Answer(OCIDateTimeCompare(env_, err_, value, tokyo, &order)), c.compared);
        EXPECT_EQ(Answer(OCIDateTimeGetTimeZoneOffset(env_, err_, value, &hour, &minute)), c.zone);
        if (c.type == OCI_DTYPE_TIME_TZ) { EXPECT_EQ(hour * 60 + minute, 540) << "not that of the year 0"; }
        EXPECT_EQ(Answer(OCIDateTimeSubtract(env_, err_, value, tokyo, out)), c.moved);
        EXPECT_EQ(Answer(OCIDateTimeSubtract(env_, err_, tokyo, value, out)), c.moved);
        EXPECT_EQ(Answer(OCIDateTimeIntervalAdd(env_, err_, value, Read("1"), value)), c.moved);
    }
}

}  // namespace
