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
