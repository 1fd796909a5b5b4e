// Numbers to and from integers, reals, plain text and decimal floats.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <limits>

#include "number/decimal_float.h"
#include "reference.h"

TEST(NumberIntegers, WhatNoIntegerHolds) {
    std::uint64_t bits = 0;
    EXPECT_EQ(number::ToInteger(Number("1E30"), 8, true, &bits), 22053);
    EXPECT_EQ(number::ToInteger(Number("-1E125"), 8, true, &bits), 22054);
    EXPECT_EQ(number::ToInteger(Number("1"), 3, true, &bits), 22057);
    EXPECT_EQ(number::ToInteger(Number("-9223372036854775809"), 8, true, &bits), 22054);
    EXPECT_EQ(number::ToInteger(Number("9223372036854775808"), 8, true, &bits), 22053);
    EXPECT_EQ(number::ToInteger(Number("-1"), 8, false, &bits), 22054);
    EXPECT_EQ(number::ToInteger(Number("-0.5"), 1, false, &bits), 0);
    EXPECT_EQ(bits, 0u);
}

TEST(NumberReals, ShortestDecimalOfTheReal) {
    const struct { double value; const char* number; } cases[] = {
        {0.1, "0.1"}, {-2.5e-5, "-0.000025"}, {1e23, "1E23"}, {5e-130, "5E-130"}, {0.0, "0"}, {-0.0, "0"},
        {123456789012345680.0, "123456789012345680"}, {1.0 / 3, "0.3333333333333333"}};
    for (const auto& c : cases) {
        OCINumber got;
        ASSERT_EQ(number::FromDouble(c.value, &got), 0) << c.value;
        EXPECT_EQ(got, Number(c.number)) << c.value;
    }
    OCINumber got;
    ASSERT_EQ(number::FromFloat(0.1f, &got), 0);
    EXPECT_EQ(got, Number("0.1"));
    EXPECT_EQ(number::FromDouble(1e126, &got), 22053);
    EXPECT_EQ(number::FromDouble(-std::numeric_limits<double>::infinity(), &got), 22053);
    EXPECT_EQ(number::FromDouble(std::nan(""), &got), 22060);
    EXPECT_EQ(number::FromDouble(5e-324, &got), 22054);
}

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

TEST(NumberReals, ThereAndBackThroughEveryWidth) {
    for (const double value : {1.1, -1e-100, 9.87654321e100, 3.0}) {
        OCINumber number;
        double back = 0;
        long double wide = 0;
        ASSERT_EQ(number::FromDouble(value, &number), 0);
        ASSERT_EQ(number::ToDouble(number, &back), 0);
        EXPECT_EQ(back, value);
        ASSERT_EQ(number::FromLongDouble(static_cast<long double>(value) / 3, &number), 0);
        ASSERT_EQ(number::ToLongDouble(number, &wide), 0);
        EXPECT_EQ(wide, static_cast<long double>(value) / 3);
    }
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

TEST(NumberPlainText, Writes) {
    const struct { const char* number; const char* text; } cases[] = {
        {"0", "0"}, {"-0.5", "-.5"}, {"1200", "1200"}, {"0.001", ".001"},
        {"1E39", "1000000000000000000000000000000000000000"}, {"1E40", "1E+40"},
        {"1E-40", ".0000000000000000000000000000000000000001"}, {"1E-41", "1E-41"}, {"-1.5E100", "-1.5E+100"},
        {"-123456789012345678901234567890.1234567890", "-123456789012345678901234567890.123456789"}};
    for (const auto& c : cases) EXPECT_EQ(Shown(Number(c.number)), c.text);
    RandomNumbers numbers(22);
    for (int i = 0; i < 2000; ++i) {
        const OCINumber value = numbers.Next(62);
        ASSERT_EQ(Number(Shown(value)), value) << Shown(value);
    }
}

TEST(NumberDecimalFloat, KnownBytes) {
    const struct { const char* number; std::size_t size; std::uint64_t high, low; } cases[] = {
        {"1", 8, 0, 0x31C0000000000001}, {"-7.5", 8, 0, 0xB1A000000000004B},
        {"9999999999999999", 8, 0, 0x6C7386F26FC0FFFF}, {"-9999999999999999", 8, 0, 0xEC7386F26FC0FFFF},
        {"0", 8, 0, 0x31C0000000000000},
        {"1", 16, 0x3040000000000000, 1}, {"-1E-130", 16, 0xAF3C000000000000, 1},
        {"9999999999999999999999999999999999", 16, 0x3041ED09BEAD87C0, 0x378D8E63FFFFFFFF}};
    for (const auto& c : cases) {
        std::uint64_t words[2] = {};
        OCINumber back;
        ASSERT_EQ(number::ToDecimalFloat(Number(c.number), c.size, words), 0) << c.number;
        EXPECT_EQ(words[0], c.low) << c.number;
        EXPECT_EQ(words[1], c.high) << c.number;
        ASSERT_EQ(number::FromDecimalFloat(words, c.size, &back), 0) << c.number;
        EXPECT_EQ(back, Number(c.number));
    }
}

TEST(NumberDecimalFloat, RoundsToItsDigitsAndRefusesWhatIsNoNumber) {
    std::uint64_t words[2] = {};
    OCINumber got;
    ASSERT_EQ(number::ToDecimalFloat(Number("0.12345678901234565"), 8, words), 0);
    ASSERT_EQ(number::FromDecimalFloat(words, 8, &got), 0);
    EXPECT_EQ(got, Number("0.1234567890123457"));
    const struct { std::uint64_t bits; number::Errno error; } special[] = {{0x7800000000000000, 22053},   // infinity
                   {0xF800000000000000, 22053},   // and below zero
                   {0x7C00000000000000, 22060}, {0xFC00000000000000, 22060},  // NaN
                   {0x5FE0000000000001, 22053},   // 1E369
                   {0x0000000000000001, 22054},  // 1E-398
                   {0x6FFFFFFFFFFFFFFF, 0}};                  // a coefficient of more than 16 digits counts as 0
    for (const auto& c : special) EXPECT_EQ(number::FromDecimalFloat(&c.bits, 8, &got), c.error) << std::hex << c.bits;
    EXPECT_EQ(got, Number("0"));
}
