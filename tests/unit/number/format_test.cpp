// Numbers to and from text by a model.
#include "number/format.h"

#include <gtest/gtest.h>

#include "reference.h"

namespace {

// The text, or the error's number.
std::string Formatted(std::string_view literal, std::string_view model) {
    char text[200];
    std::size_t length = 0;
    const number::Errno error = number::ToText(Number(literal), model, {}, text, sizeof text, &length);
    return error ? std::to_string(error) : std::string(text, length);
}

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

TEST(NumberFromText, WhatToTextWroteComesBack) {
    RandomNumbers numbers(31);
    for (const char* model : {"9999.99", "0999.90", "$9,999.99", "S9999.99", "9999.99S", "9999.99MI", "9999.99PR",
                              "FM9999.99", "L9999.99", "9G999D99", "FM$0,999.09PR", "B9999.90"}) {
        for (int i = 0; i < 100; ++i) {
            OCINumber value = numbers.Next(0), wanted;
            ASSERT_EQ(number::Round(value, 2, &wanted), 0);
            const std::string text = Formatted(Shown(value), model);
            EXPECT_EQ(Parsed(text, model), Shown(wanted)) << "'" << text << "' by " << model;
        }
    }
}
