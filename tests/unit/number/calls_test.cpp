// The exported number functions: what they answer to missing handles and pointers, which record they leave, and texts
// in UTF-16 environments.
#include <gtest/gtest.h>

#include <cstring>
#include <string>

#include "oci.h"

namespace {

class NumberCalls : public testing::TestWithParam<ub4> {
protected:
    void SetUp() override {
        ASSERT_EQ(OCIEnvCreate(&environment_, GetParam(), nullptr, nullptr, nullptr, nullptr, 0, nullptr), OCI_SUCCESS);
        ASSERT_EQ(OCIHandleAlloc(environment_, reinterpret_cast<dvoid**>(&error_), OCI_HTYPE_ERROR, 0, nullptr),
                  OCI_SUCCESS);
    }
    void TearDown() override { OCIHandleFree(environment_, OCI_HTYPE_ENV); }

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
        return OCINumberFromText(error_, reinterpret_cast<const OraText*>(bytes.data()), static_cast<ub4>(bytes.size()),
                                 reinterpret_cast<const OraText*>(model.data()), static_cast<ub4>(model.size()),
                                 nullptr, 0, value);
    }

    // The number of the last record, 0 when there is none.
    sb4 Recorded() {
        sb4 code = 0;
        return OCIErrorGet(error_, 1, nullptr, &code, nullptr, 0, OCI_HTYPE_ERROR) == OCI_NO_DATA ? 0 : code;
    }

    OCIEnv* environment_ = nullptr;
    OCIError* error_ = nullptr;
};

INSTANTIATE_TEST_SUITE_P(Forms, NumberCalls, testing::Values(OCI_DEFAULT, OCI_UTF16));

}  // namespace

TEST_P(NumberCalls, TheRecordNamesTheMalformedNumber) {
    OCINumber one = Number("1"), malformed{}, result;
    EXPECT_EQ(OCINumberMul(error_, &one, &malformed, &result), OCI_ERROR);
    EXPECT_EQ(Recorded(), 22060);
    OraText text[400] = {};
    ASSERT_EQ(OCIErrorGet(error_, 1, nullptr, nullptr, text, sizeof text, OCI_HTYPE_ERROR), OCI_SUCCESS);
    const std::string wanted = Bytes("number 2");
    EXPECT_NE(std::string(reinterpret_cast<char*>(text), sizeof text).find(wanted), std::string::npos);
}

TEST_P(NumberCalls, TextsInTheFormOfTheEnvironment) {
    const OCINumber value = Number("-1234.5");
    const std::string model = Bytes("L9G999D99"),
                      settings = Bytes("NLS_NUMERIC_CHARACTERS='',.'' NLS_CURRENCY=''EUR''");
    const std::string wanted = Bytes("-EUR1.234,50");
    const auto write = [&](ub4* size, OraText* text) {
        return OCINumberToText(error_, &value, reinterpret_cast<const OraText*>(model.data()),
                               static_cast<ub4>(model.size()), reinterpret_cast<const OraText*>(settings.data()),
                               static_cast<ub4>(settings.size()), size, text);
    };
    OraText text[64];
    ub4 size = sizeof text;
    ASSERT_EQ(write(&size, text), OCI_SUCCESS);
    EXPECT_EQ(std::string(reinterpret_cast<char*>(text), size), wanted);
    size = static_cast<ub4>(wanted.size()) - 1;
    EXPECT_EQ(write(&size, text), OCI_ERROR);
    EXPECT_EQ(Recorded(), 22059);
    size = static_cast<ub4>(-1);
    EXPECT_EQ(write(&size, text), OCI_ERROR);
    EXPECT_EQ(Recorded(), 21560);
    const OCINumber* values[] = {&value, nullptr};
    double reals[2] = {};
    EXPECT_EQ(OCINumberToRealArray(error_, values, 2, 8, reals), OCI_ERROR);
    EXPECT_EQ(Recorded(), 21560);
    EXPECT_EQ(reals[0], -1234.5) << "what comes before is converted";
    const auto answer = [&](sword code) { return code == OCI_ERROR ? Recorded() : code; };
    OCINumber other{};
    size = sizeof text;
    EXPECT_EQ(answer(OCINumberFromReal(error_, reals, 3, &other)), 21560);
    EXPECT_EQ(answer(OCINumberToReal(error_, &value, 3, reals)), 21560);
    OCINumberSetZero(error_, &other);
    EXPECT_EQ(other.OCINumberPart[1], 128);
    const OCINumber small = Number("255");
    const std::string wide = Bytes(std::string(300, 'X'));    // longer than most texts
    std::string shown(1000, '#');
    size = 1000;
    EXPECT_EQ(OCINumberToText(error_, &small, reinterpret_cast<const OraText*>(wide.data()), static_cast<ub4>(wide.size()),
                              nullptr, 0, &size, reinterpret_cast<OraText*>(shown.data())), OCI_SUCCESS);
    EXPECT_EQ(shown.substr(0, size), Bytes(std::string(299, ' ') + "FF"));
    OCINumber result;
    EXPECT_EQ(FromText(Bytes("1x"), Bytes("99"), &result), OCI_ERROR);
    EXPECT_EQ(Recorded(), 22062);
    EXPECT_EQ(FromText(Bytes("1"), Bytes("Q"), &result), OCI_ERROR);
    EXPECT_EQ(Recorded(), 22061);
    if (Utf16()) {
        const std::string half("\x00\xDC", 2);
        EXPECT_EQ(answer(FromText(half, Bytes("9"), &result)), 24501);
        EXPECT_EQ(answer(FromText(Bytes("1"), half, &result)), 24501);
    }
}
