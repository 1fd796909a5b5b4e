// The calls on dates and datetime descriptors.
#include "support/call_fixture.h"

namespace {

OCIDate Date(int year, int month, int day, int hour = 0, int minute = 0, int second = 0) {
    return {static_cast<sb2>(year),
            static_cast<ub1>(month),
            static_cast<ub1>(day),
            {static_cast<ub1>(hour), static_cast<ub1>(minute), static_cast<ub1>(second)}};
}

class DateCalls : public CallFixture {
protected:
    OCIDateTime* NewDateTime(ub4 type) const { return NewDescriptor<OCIDateTime>(type); }

    sword Construct(OCIDateTime* target, const char* zone = nullptr, ub4 fraction = 0) {
        return OCIDateTimeConstructNS(env_, err_, target, 2024, 7, 15, 13, 14, 15, fraction,
                                      zone ? Text(zone) : nullptr, zone ? std::strlen(zone) : 0);
    }

    // Year, month, day or the error's number; hour, minute, second, fraction alike.
    std::string DateOf(OCIDateTime* value) {
        sb2 year = 0;
        ub1 month = 0, day = 0;
        const sword code = OCIDateTimeGetDateNS(env_, err_, value, &year, &month, &day);
        if (code != OCI_SUCCESS) return std::to_string(Answer(code));
        return std::to_string(year) + '-' + std::to_string(month) + '-' + std::to_string(day);
    }
    std::string TimeOf(OCIDateTime* value) {
        ub1 hour = 0, minute = 0, second = 0;
        ub4 fraction = 0;
        const sword code = OCIDateTimeGetTimeNS(env_, err_, value, &hour, &minute, &second, &fraction);
        if (code != OCI_SUCCESS) return std::to_string(Answer(code));
        return std::to_string(hour) + ':' + std::to_string(minute) + ':' + std::to_string(second) + '.' +
               std::to_string(fraction);
    }
};

TEST_F(DateCalls, TextsAreWrittenToTheByte) {
    const OCIDate day = Date(2024, 2, 9);
    char area[12] = "...........";
    ub4 size = 9;
    EXPECT_EQ(Answer(OCIDateToText(err_, &day, nullptr, 0, nullptr, 0, &size, Text(area))), 0);
    EXPECT_STREQ(area, "09-FEB-24..");
    size = 8;
    EXPECT_EQ(Answer(OCIDateToText(err_, &day, Text("YYYY-MM-DD"), 10, nullptr, 0, &size, Text(area))), 22059);
    EXPECT_EQ(size, 10u);
    EXPECT_STREQ(area, "09-FEB-24..");
    std::string model, long_text(20000, '\0');
    while (model.size() <= 248) model += "JSPTH ";
    size = 20000;
    EXPECT_EQ(Answer(OCIDateToText(err_, &day, Text(model), static_cast<ub1>(model.size()), Text("FRENCH"), 6, &size,
                                   Text(long_text))), 0);
    EXPECT_GT(size, 2500u);
    // Lengths beyond the closing zero do no harm.
    OCIDate out{};
    EXPECT_EQ(Answer(OCIDateFromText(err_, Text("29/02/2024"), kHuge, Text("DD/MM/YYYY"), 255, nullptr, 0, &out)), 0);
    EXPECT_EQ(out.OCIDateYYYY, 2024);
    Reopen(OCI_UTF16);
    char16_t units[10] = u"?????????";
    size = 18;
    EXPECT_EQ(Answer(OCIDateToText(err_, &day, Text(u"FMDD MONTH"), 20, Text(u"german"), 12, &size, Text(units))), 0);
    EXPECT_EQ(std::u16string(units), u"9 FEBRUAR");
}

TEST_F(DateCalls, TypesHaveTheirParts) {
    const char *const day = "2024-7-15", *const time = "13:14:15.250000000";
    const struct { ub4 type; const char* date; const char* time; sb4 zone; bool own_zone = false; } cases[] = {
        {OCI_DTYPE_DATE, day, "1878", 1878}, {OCI_DTYPE_TIME, "1878", time, 1878}, {OCI_DTYPE_TIME_TZ, "1878", time, 0, true},
        {OCI_DTYPE_TIMESTAMP, day, time, 1878}, {OCI_DTYPE_TIMESTAMP_TZ, day, time, 0, true},
        {OCI_DTYPE_TIMESTAMP_LTZ, day, time, 0}, {OCI_DTYPE_INTERVAL_YM, day, time, 0, true},
    };    // the last is the general type
    for (const auto& c : cases) {
        OCIDateTime* value = NewDateTime(c.type);
        const bool has_date = std::string_view(c.date) != "1878", has_time = std::string_view(c.time) != "1878";
        EXPECT_EQ(DateOf(value), has_date ? "1866" : "1878") << c.type << " unset";
        EXPECT_EQ(TimeOf(value), has_time ? "1866" : "1878") << c.type << " unset";
        EXPECT_EQ(Answer(OCI_datetimeSetTime(env_, err_, value, 1, 2, 3, 4)), has_time ? 0 : 1878) << c.type;
        EXPECT_EQ(DateOf(value), has_date ? "1866" : "1878") << c.type << " has a time alone";
        OraText shown[9];
        ub4 room = sizeof shown;
        EXPECT_EQ(Answer(OCIDateTimeToText(env_, err_, value, Text("SS"), 2, 0, nullptr, 0, &room, shown)),
                  has_date ? 1866 : 0) << c.type;
        EXPECT_EQ(Answer(Construct(value, "+02:00", 250000000)), 0) << c.type;
        EXPECT_EQ(DateOf(value), c.date) << c.type;
        EXPECT_EQ(TimeOf(value), c.time) << c.type;
        EXPECT_EQ(Answer(OCI_datetimeSetDate(env_, err_, value, -44, 3, 15)), has_date ? 0 : 1878) << c.type;
        EXPECT_EQ(Answer(OCI_datetimeSetTime(env_, err_, value, 1, 2, 3, 4)), has_time ? 0 : 1878) << c.type;
        EXPECT_EQ(Answer(OCI_datetimeSetTime(env_, err_, value, 24, 2, 3, 4)), has_time ? 1850 : 1878) << c.type;
        ub4 flags = 1;
        EXPECT_EQ(Answer(OCIDateTimeCheckNS(env_, err_, value, &flags)), 0) << c.type;
        EXPECT_EQ(flags, 0u) << c.type;
        EXPECT_EQ(DateOf(value), has_date ? "-44-3-15" : "1878") << c.type;
        EXPECT_EQ(TimeOf(value), has_time ? "1:2:3.4" : "1878") << c.type;
        sb1 hour = 99, minute = 0;
        EXPECT_EQ(Answer(OCIDateTimeGetTimeZoneOffset(env_, err_, value, &hour, &minute)), c.zone) << c.type;
        EXPECT_TRUE(!c.own_zone || hour == 2) << c.type << ' ' << int{hour};
    }
}

// What comes of a moment of +05:30 in each type, and of that in a moment without a zone.
TEST_F(DateCalls, AssignmentKeepsTheTypesParts) {
    const struct { ub4 type; const char *date, *time; sb4 zone, back; } cases[] = {
        {OCI_DTYPE_DATE, "2024-7-15", "1878", 1878, 0}, {OCI_DTYPE_TIME, "1878", "13:14:15.5", 1878, 1878},
        {OCI_DTYPE_TIMESTAMP, "2024-7-15", "13:14:15.5", 1878, 0},
        {OCI_DTYPE_TIMESTAMP_TZ, "2024-7-15", "13:14:15.5", 0, 0}};
    OCIDateTime* zoned = NewDateTime(OCI_DTYPE_TIMESTAMP_TZ);
    sb1 hour = 0, minute = 0;
    MUST(Answer(Construct(zoned, "Asia/Kolkata", 5)));
    for (const auto& c : cases) {
        OCIDateTime* value = NewDateTime(c.type);
        OCIDateTime* stamp = NewDateTime(OCI_DTYPE_TIMESTAMP);
        SHOULD(Answer(OCIDateTimeAssign(env_, err_, zoned, value)),
               Answer(OCIDateTimeAssign(env_, err_, value, value)));
        EXPECT_EQ(DateOf(value), c.date) << c.type;
        EXPECT_EQ(TimeOf(value), c.time) << c.type;
        EXPECT_EQ(Answer(OCIDateTimeGetTimeZoneOffset(env_, err_, value, &hour, &minute)), c.zone) << c.type;
        EXPECT_EQ(Answer(OCIDateTimeAssign(env_, err_, value, stamp)), c.back) << c.type;
    }
    OCIDateTime* local = NewDateTime(OCI_DTYPE_TIMESTAMP_LTZ);
    sword order = 9;
    SHOULD(Answer(OCIDateTimeAssign(env_, err_, zoned, local)),
           Answer(OCIDateTimeCompare(env_, err_, zoned, local, &order)));
    EXPECT_EQ(order, 0) << "the same moment";
}

TEST_F(DateCalls, TimesAloneAreComparedWithTheirLike) {
    OCIDateTime* moment = NewDateTime(OCI_DTYPE_TIMESTAMP_TZ);
    OCIDateTime* time = NewDateTime(OCI_DTYPE_TIME);
    OCIDateTime* set_time = NewDateTime(OCI_DTYPE_TIME);
    sword order = 9;
    MUST(Answer(Construct(moment, "+05:30")), Answer(Construct(time)),
         Answer(OCI_datetimeSetTime(env_, err_, set_time, 13, 14, 15, 0)));
    EXPECT_EQ(Answer(OCIDateTimeCompare(env_, err_, time, set_time, &order)), 0);
    EXPECT_EQ(order, 0);
    EXPECT_EQ(Answer(OCIDateTimeCompare(env_, err_, moment, time, &order)), 1870);
}

// Whatever stands behind a zone of length 0, and before a closing zero in a longer one, it is that of the session.
TEST_F(DateCalls, AZoneWithoutLengthIsThatOfTheSession) {
    OCIDateTime* plain = NewDateTime(OCI_DTYPE_TIMESTAMP_TZ);
    OCIDateTime* other = NewDateTime(OCI_DTYPE_TIMESTAMP_TZ);
    ASSERT_EQ(Answer(Construct(plain)), 0);
    const struct { const char* zone; std::size_t length; } cases[] = {{"+13:45", 0}, {"", 0}, {"\0+13:45", 7}};
    for (const auto& c : cases) {
        sword order = 9;
        EXPECT_EQ(Answer(OCIDateTimeConstruct(env_, err_, other, 2024, 7, 15, 13, 14, 15, 0, Text(c.zone), c.length)), 0);
        EXPECT_EQ(Answer(OCIDateTimeCompare(env_, err_, plain, other, &order)), 0);
        EXPECT_EQ(order, 0) << c.length;
    }
}

}  // namespace
