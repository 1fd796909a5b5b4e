// The exported number functions where no command reaches: lists with a hole, texts longer than most, halves of characters.
#include "support/call_fixture.h"

namespace {

struct NumberCalls : CallFixture, testing::WithParamInterface<ub4> {
    NumberCalls() : CallFixture(GetParam()) {}

    // A text in the form of the environment.
    [[nodiscard]] static std::string Bytes(const std::string& ascii) {
        if (GetParam() != OCI_UTF16) return ascii;
        std::string units;
        for (const char c : ascii) units.append({c, '\0'});
        return units;
    }
    sword FromText(const std::string& bytes, const std::string& model, OCINumber* value) {
        return OCINumberFromText(err_, Text(bytes), static_cast<ub4>(bytes.size()), Text(model),
                                 static_cast<ub4>(model.size()), nullptr, 0, value);
    }
};

INSTANTIATE_TEST_SUITE_P(Forms, NumberCalls, testing::Values(OCI_DEFAULT, OCI_UTF16));

TEST_P(NumberCalls, ListsLongTextsAndHalves) {
    OCINumber value;
    MUST(FromText(Bytes("255"), Bytes("999"), &value));
    const OCINumber* values[] = {&value, nullptr};
    double reals[2] = {};
    EXPECT_EQ(Answer(OCINumberToRealArray(err_, values, 2, 8, reals)), 21560);
    EXPECT_EQ(reals[0], 255) << "what comes before is converted";
    EXPECT_EQ(Answer(OCINumberToReal(err_, &value, 3, reals)), 21560);
    const std::string wide = Bytes(std::string(300, 'X'));
    std::string shown(1000, '#');
    ub4 size = 1000;
    EXPECT_EQ(OCINumberToText(err_, &value, Text(wide), static_cast<ub4>(wide.size()), nullptr, 0, &size,
                              reinterpret_cast<OraText*>(shown.data())), OCI_SUCCESS);
    EXPECT_EQ(shown.substr(0, size), Bytes(std::string(299, ' ') + "FF"));
    EXPECT_EQ(shown[size], '#');
    const std::string half("\x00\xDC", 2);
    if (GetParam() == OCI_UTF16) {
        EXPECT_EQ(Answer(FromText(half, Bytes("9"), &value)), 24501);
        EXPECT_EQ(Answer(FromText(Bytes("1"), half, &value)), 24501);
    }
}

}  // namespace
