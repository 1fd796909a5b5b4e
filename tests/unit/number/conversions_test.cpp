// Numbers to reals, and plain text to numbers.
#include <gtest/gtest.h>

#include <cmath>

#include "reference.h"

TEST(NumberReals, NearestRealOfTheNumber) {
    RandomNumbers numbers(21);
    for (int i = 0; i < 2000; ++i) {
        const OCINumber value = numbers.Next(i % 2 ? 60 : 3);
        double real = 0;
        ASSERT_EQ(number::ToDouble(value, &real), 0) << Shown(value);
        // Exactly: |value - real| is not larger than |value - its neighbours|.
        Fraction exact(value), distance;
        mpq_set_d(distance, real);
        mpq_sub(distance, distance, exact);
        mpq_abs(distance, distance);
        for (const double toward : {-HUGE_VAL, HUGE_VAL}) {
            Fraction other;
            mpq_set_d(other, std::nextafter(real, toward));
            mpq_sub(other, other, exact);
            mpq_abs(other, other);
            ASSERT_LE(mpq_cmp(distance, other), 0) << Shown(value);
        }
    }
    float real = 0;
    EXPECT_EQ(number::ToFloat(Number("3.4028235E38"), &real), 0);
    EXPECT_EQ(number::ToFloat(Number("3.5E38"), &real), 22053);
    EXPECT_EQ(number::ToFloat(Number("-1E-60"), &real), 22054);
    EXPECT_EQ(number::ToFloat(Number("1.0000000596046447753906251"), &real), 0);
    EXPECT_EQ(real, std::nextafter(1.0f, 2.0f)) << "just above a tie of two floats, though not of two doubles";
}

TEST(NumberPlainText, Reads) {
    const std::string long_fraction = "0." + std::string(9000, '0') + "1", long_whole(9000, '7');
    const struct { std::string_view text; number::Errno error; const char* number; } cases[] = {
        {"  +1.50 ", 0, "1.5"}, {".5", 0, "0.5"}, {"5.", 0, "5"}, {"-0", 0, "0"}, {"1e3", 0, "1000"},
        {"1E-3", 0, "0.001"}, {"00012", 0, "12"}, {"0e999999999999", 0, "0"}, {"1e-999999999999", 0, "0"},
        {long_fraction, 0, "0"}, {"99999999999999999999999999999999999999995", 0, "1E41"}, {"", 1722, ""},
        {" ", 1722, ""}, {".", 1722, ""}, {"-", 1722, ""}, {"1e", 1722, ""}, {"1e+", 1722, ""}, {"1.2.3", 1722, ""},
        {"1 2", 1722, ""}, {"--1", 1722, ""}, {"1x", 1722, ""}, {"1,5", 1722, ""}, {"0x10", 1722, ""},
        {"1e126", 1426, ""}, {"1e999999999999", 1426, ""}, {long_whole, 1426, ""}};
    for (const auto& c : cases) {
        OCINumber got{{21, 193, 8}};  // nothing that a row wants
        ASSERT_EQ(number::FromPlainText(c.text, '.', &got), c.error) << c.text.substr(0, 50);
        if (!c.error) {
            EXPECT_EQ(got, Number(c.number)) << c.text.substr(0, 50);
        }
    }
    OCINumber got;
    ASSERT_EQ(number::FromPlainText("1,5", ',', &got), 0);
    EXPECT_EQ(got, Number("1.5"));
}
