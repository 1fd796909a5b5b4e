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

TEST(NumberPlainText, LongTextsAndOtherPoints) {
    OCINumber got;
    ASSERT_EQ(number::FromPlainText("0." + std::string(9000, '0') + "1", '.', &got), 0);
    EXPECT_EQ(got, Number("0"));
    EXPECT_EQ(number::FromPlainText(std::string(9000, '7'), '.', &got), 1426);
    EXPECT_EQ(number::FromPlainText("", '.', &got), 1722);
    ASSERT_EQ(number::FromPlainText("1,5", ',', &got), 0);
    EXPECT_EQ(got, Number("1.5"));
}
