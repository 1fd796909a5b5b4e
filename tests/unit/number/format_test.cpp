// Numbers to and from texts longer than most.
#include "number/format.h"

#include <gtest/gtest.h>

#include "reference.h"

namespace {

// The plain text of the number, or the error's number.
std::string Parsed(std::string_view text, std::string_view model) {
    OCINumber value;
    const number::Errno error = number::FromText(text, model, {}, &value);
    return error ? "error " + std::to_string(error) : Shown(value);
}

}  // namespace

TEST(NumberFormats, LongModelsAndTexts) {
    std::size_t needed = 0;
    EXPECT_EQ(number::ToText(Number("1E30"), std::string(9000, '9'), {}, nullptr, 0, &needed), 22059);
    EXPECT_EQ(needed, 9001u);
    EXPECT_EQ(Parsed(std::string(2000, '0') + "5.5", std::string(2001, '9') + ".9"), "5.5");
    EXPECT_EQ(Parsed(std::string(9000, '9'), std::string(9000, '9')), "error 22053");
    EXPECT_EQ(Parsed("1" + std::string(99, '0'), std::string(100, '9')), "1E+99");
}

TEST(NumberPlainText, LongTextsAndOtherPoints) {
    OCINumber got;
    ASSERT_EQ(number::FromPlainText("0." + std::string(9000, '0') + "1", '.', &got), 0);
    EXPECT_EQ(got, Number("0"));
    EXPECT_EQ(number::FromPlainText(std::string(9000, '7'), '.', &got), 1426);
    EXPECT_EQ(number::FromPlainText("", '.', &got), 1722);
    ASSERT_EQ(number::FromPlainText("1,5", ',', &got), 0);
    EXPECT_EQ(got, Number("1.5"));
}
