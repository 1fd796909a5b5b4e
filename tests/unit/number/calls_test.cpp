// The exported number functions: what they answer to missing handles and pointers, which record they leave, and texts
// in UTF-16 environments.
#include "support/call_fixture.h"

namespace {

struct NumberCalls : CallFixture, testing::WithParamInterface<ub4> {
    NumberCalls() : CallFixture(GetParam()) {}
    [[nodiscard]] bool Utf16() const { return GetParam() == OCI_UTF16; }

    // A text in the form of the environment.
    [[nodiscard]] std::string Bytes(const std::string& ascii) const {
        if (!Utf16()) return ascii;
        std::string units;
        for (const char c : ascii) units.append({c, '\0'});
        return units;
    }

    OCINumber Number(const std::string& text) {
        OCINumber value{};
        const std::string bytes = Bytes(text), model = Bytes(std::string(text.size(), '9'));
        EXPECT_EQ(FromText(bytes, model, &value), OCI_SUCCESS) << text;
        return value;
    }
    sword FromText(const std::string& bytes, const std::string& model, OCINumber* value) {
        return OCINumberFromText(err_, reinterpret_cast<const OraText*>(bytes.data()), static_cast<ub4>(bytes.size()),
                                 reinterpret_cast<const OraText*>(model.data()), static_cast<ub4>(model.size()),
                                 nullptr, 0, value);
    }
};

INSTANTIATE_TEST_SUITE_P(Forms, NumberCalls, testing::Values(OCI_DEFAULT, OCI_UTF16));

}  // namespace

TEST_P(NumberCalls, TheRecordNamesTheMalformedNumber) {
    OCINumber one = Number("1"), malformed{}, result;
    EXPECT_EQ(Answer(OCINumberMul(err_, &one, &malformed, &result)), 22060);
    OraText text[400] = {};
    ASSERT_EQ(OCIErrorGet(err_, 1, nullptr, nullptr, text, sizeof text, OCI_HTYPE_ERROR), OCI_SUCCESS);
    const std::string wanted = Bytes("number 2");
    EXPECT_NE(std::string(reinterpret_cast<char*>(text), sizeof text).find(wanted), std::string::npos);
}

TEST_P(NumberCalls, TextsInTheFormOfTheEnvironment) {
    const OCINumber value = Number("-1234.5");
    const std::string model = Bytes("L9G999D99"),
                      settings = Bytes("NLS_NUMERIC_CHARACTERS='',.'' NLS_CURRENCY=''EUR''");
    const std::string wanted = Bytes("-EUR1.234,50");
    const auto write = [&](ub4* size, OraText* text) {
        return OCINumberToText(err_, &value, reinterpret_cast<const OraText*>(model.data()),
                               static_cast<ub4>(model.size()), reinterpret_cast<const OraText*>(settings.data()),
                               static_cast<ub4>(settings.size()), size, text);
    };
    OraText text[64];
    ub4 size = sizeof text;
    ASSERT_EQ(write(&size, text), OCI_SUCCESS);
    EXPECT_EQ(std::string(reinterpret_cast<char*>(text), size), wanted);
    size = static_cast<ub4>(wanted.size()) - 1;
    EXPECT_EQ(Answer(write(&size, text)), 22059);
    size = static_cast<ub4>(-1);
    EXPECT_EQ(Answer(write(&size, text)), 21560);
    const OCINumber* values[] = {&value, nullptr};
    double reals[2] = {};
    EXPECT_EQ(Answer(OCINumberToRealArray(err_, values, 2, 8, reals)), 21560);
    EXPECT_EQ(reals[0], -1234.5) << "what comes before is converted";
    OCINumber other{};
    size = sizeof text;
    EXPECT_EQ(Answer(OCINumberFromReal(err_, reals, 3, &other)), 21560);
    EXPECT_EQ(Answer(OCINumberToReal(err_, &value, 3, reals)), 21560);
    OCINumberSetZero(err_, &other);
    EXPECT_EQ(other.OCINumberPart[1], 128);
    const OCINumber small = Number("255");
    const std::string wide = Bytes(std::string(300, 'X'));    // longer than most texts
    std::string shown(1000, '#');
    size = 1000;
    EXPECT_EQ(OCINumberToText(err_, &small, reinterpret_cast<const OraText*>(wide.data()), static_cast<ub4>(wide.size()),
                              nullptr, 0, &size, reinterpret_cast<OraText*>(shown.data())), OCI_SUCCESS);
    EXPECT_EQ(shown.substr(0, size), Bytes(std::string(299, ' ') + "FF"));
    OCINumber result;
    EXPECT_EQ(Answer(FromText(Bytes("1x"), Bytes("99"), &result)), 22062);
    EXPECT_EQ(Answer(FromText(Bytes("1"), Bytes("Q"), &result)), 22061);
    if (Utf16()) {
        const std::string half("\x00\xDC", 2);
        EXPECT_EQ(Answer(FromText(half, Bytes("9"), &result)), 24501);
        EXPECT_EQ(Answer(FromText(Bytes("1"), half, &result)), 24501);
    }
}
