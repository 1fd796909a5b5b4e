// Arithmetic on numbers, against exact fractions.
#include <gtest/gtest.h>

#include <cmath>

#include "number/add_wide.h"
#include "number/format.h"
#include "reference.h"

namespace {

// Runs `function` and compares error or bytes with what the exact result must be rounded to.
void ExpectRounded(const char* name, number::Errno error, const OCINumber& got, Fraction& exact,
                   const std::string& operands) {
    OCINumber wanted;
    const number::Errno wanted_error = exact.Rounded(&wanted);
    ASSERT_EQ(error, wanted_error) << name << " " << operands;
    if (!error) {
        ASSERT_EQ(got, wanted) << name << " " << operands;
    }
}

// Two numbers of 40 digits; what their product has behind its 40th digit is 50...01 or 49...9.
void NextToTie(RandomNumbers& numbers, OCINumber* a, OCINumber* b) {
    std::string digits = "9";
    while (digits.size() < 39) digits += static_cast<char>('0' + numbers.Below(10));
    digits += '7';
    *a = Number(digits);
    mpz_t inverse, product, power;
    mpz_init_set_str(inverse, digits.c_str(), 10);
    mpz_init_set_str(product, numbers.Below(4) ? "5000000000000000000000000000000000000001"
                                               : "4999999999999999999999999999999999999999", 10);
    mpz_init_set_str(power, "10000000000000000000000000000000000000000", 10);
    mpz_invert(inverse, inverse, power);
    mpz_mul(product, product, inverse);
    mpz_mod(product, product, power);
    char text[45];
    *b = Number(mpz_get_str(text, 10, product));
    mpz_clears(inverse, product, power, nullptr);
}

// *value = the whole number next to it toward zero.
void CutToWhole(Fraction& value) {
    mpz_tdiv_q(mpq_numref(static_cast<mpq_ptr>(value)), mpq_numref(static_cast<mpq_ptr>(value)),
               mpq_denref(static_cast<mpq_ptr>(value)));
    mpz_set_ui(mpq_denref(static_cast<mpq_ptr>(value)), 1);
}

}  // namespace

TEST(NumberArithmetic, FourOperationsRoundTheExactResultOnce) {
    const struct {
        const char* name;
        number::Binary function;
        void (*exact)(mpq_ptr, mpq_srcptr, mpq_srcptr);
    } operations[] = {
        {"add", number::Add, mpq_add}, {"sub", number::Sub, mpq_sub}, {"mul", number::Mul, mpq_mul},
        {"div", number::Div, mpq_div}};
    RandomNumbers numbers(1);
    for (int i = 0; i < 4000; ++i) {
        const int spread = i % 4 == 0 ? 62 : i % 4 == 1 ? 0 : 12;
        OCINumber a = numbers.Next(spread), b = i % 10 == 0 ? a : numbers.Next(spread);
        if (i % 20 == 0) number::Neg(a, &b);
        if (i % 20 == 4) NextToTie(numbers, &a, &b);
        if (i % 5 == 1 && number::Mul(numbers.Next(spread), b, &a) != 0) a = b;    // next to a short quotient
        for (const auto& operation : operations) {
            Fraction left(a), right(b), exact;
            operation.exact(exact, left, right);
            OCINumber got;
            const number::Errno error = operation.function(a, b, &got);
            ASSERT_NO_FATAL_FAILURE(ExpectRounded(operation.name, error, got, exact, Shown(a) + " " + Shown(b)));
        }
    }
}

// Both ways of adding, on bytes of which some are malformed: one answer.
TEST(NumberArithmetic, TheTwoWaysOfAddingAgree) {
    if (!number::CanAddWide()) GTEST_SKIP() << "this machine has one way only";
    RandomNumbers numbers(6);
    for (int i = 0; i < 200000; ++i) {
        OCINumber operands[2] = {numbers.Next(1), numbers.Next(i % 2)};
        if (i % 3 == 0) operands[1] = operands[0];
        for (OCINumber& operand : operands) {
            constexpr ub1 kBytes[] = {0, 1, 2, 3, 20, 21, 22, 50, 51, 100, 101, 102, 103, 128, 254, 255};
            if (numbers.Below(100) == 0) operand = OCINumber{{2, operand.OCINumberPart[1], 102}};  // no digit at all
            if (numbers.Below(4) == 0)
                operand.OCINumberPart[numbers.Below(numbers.Below(4) ? 22 : 4)] = kBytes[numbers.Below(16)];
        }
        OCINumber narrow{{77}}, wide{{77}};
        const number::Errno narrow_error = number::AddNarrow(operands[0], operands[1], &narrow);
        ASSERT_EQ(number::AddWide(operands[0], operands[1], &wide), narrow_error)
            << ::testing::PrintToString(operands[0].OCINumberPart) << ::testing::PrintToString(operands[1].OCINumberPart);
        ASSERT_EQ(wide, narrow) << Shown(operands[0]) << " + " << Shown(operands[1]);
        if (narrow_error) continue;
        ASSERT_EQ(number::AddWide(operands[0], operands[1], &operands[0]), 0);
        ASSERT_EQ(operands[0], narrow) << "into the first operand";
    }
}

TEST(NumberArithmetic, RemainderIsExactAndHasTheSignOfTheFirst) {
    RandomNumbers numbers(2);
    for (int i = 0; i < 2000; ++i) {
        const OCINumber a = numbers.Next(i % 2 ? 62 : 10), b = numbers.Next(i % 2 ? 62 : 10);
        Fraction left(a), right(b), quotient, exact;
        mpq_div(quotient, left, right);
        CutToWhole(quotient);
        mpq_mul(quotient, quotient, right);
        mpq_sub(exact, left, quotient);
        OCINumber got;
        ASSERT_NO_FATAL_FAILURE(ExpectRounded("mod", number::Mod(a, b, &got), got, exact, Shown(a) + " " + Shown(b)));
    }
}

TEST(NumberArithmetic, RoundingAndCuttingAtAnyPlace) {
    RandomNumbers numbers(3);
    for (int i = 0; i < 4000; ++i) {
        const OCINumber a = numbers.Next(i % 3 ? 10 : 62);
        const int places = numbers.Below(60) - 30;
        Fraction scale(Number("1")), half(Number("0.5")), scaled(a), rounded;
        for (int power = 0; power < (places < 0 ? -places : places); ++power)
            mpz_mul_ui(mpq_numref(static_cast<mpq_ptr>(scale)), mpq_numref(static_cast<mpq_ptr>(scale)), 10);
        if (places < 0) mpq_inv(scale, scale);
        mpq_mul(scaled, scaled, scale);
        if (mpq_sgn(static_cast<mpq_ptr>(scaled)) < 0)
            mpq_sub(rounded, scaled, half);
        else
            mpq_add(rounded, scaled, half);
        CutToWhole(rounded);
        CutToWhole(scaled);
        mpq_div(rounded, rounded, scale);
        mpq_div(scaled, scaled, scale);
        const std::string shown = Shown(a) + " at " + std::to_string(places);
        OCINumber got;
        ASSERT_NO_FATAL_FAILURE(ExpectRounded("round", number::Round(a, places, &got), got, rounded, shown));
        ASSERT_NO_FATAL_FAILURE(ExpectRounded("trunc", number::Trunc(a, places, &got), got, scaled, shown));
        Fraction moved(a);
        for (int power = 0; power < places; ++power) mpq_mul(moved, moved, Fraction(Number("10")));
        for (int power = 0; power > places; --power) mpq_div(moved, moved, Fraction(Number("10")));
        ASSERT_NO_FATAL_FAILURE(ExpectRounded("shift", number::Shift(a, places, &got), got, moved, shown));
    }
}

TEST(NumberArithmetic, SquareRootOfASquareAndBetweenNeighbours) {
    RandomNumbers numbers(4);
    for (int i = 0; i < 2000; ++i) {
        OCINumber a = numbers.Next(i % 2 ? 60 : 5), root;
        ASSERT_EQ(number::Abs(a, &a), 0);
        ASSERT_EQ(number::Sqrt(a, &root), 0);
        // root is right when (root - half a unit)^2 <= a < (root + half a unit)^2.
        OCINumber unit{{2, root.OCINumberPart[1], 2}}, half_unit;
        ASSERT_EQ(number::Shift(unit, -38, &unit), 0);
        ASSERT_EQ(number::Div(unit, Number("2"), &half_unit), 0);
        Fraction low(root), high(root), half(half_unit), value(a);
        mpq_sub(low, low, half);
        mpq_add(high, high, half);
        mpq_mul(low, low, low);
        mpq_mul(high, high, high);
        ASSERT_LE(mpq_cmp(low, value), 0) << Shown(a);
        ASSERT_LT(mpq_cmp(value, high), 0) << Shown(a);
    }
}

TEST(NumberArithmetic, UnaryFunctionsAtTheirEdges) {
    const struct { number::Unary function; const char* value; const char* result; } cases[] = {
        {number::Ceil, "0.0000001", "1"}, {number::Ceil, "-0.9", "0"}, {number::Ceil, "1E-130", "1"},
        {number::Ceil, "99.5", "100"}, {number::Floor, "-1E-130", "-1"}, {number::Floor, "-99.5", "-100"},
        {number::Floor, "9.99", "9"}, {number::Ceil, "1E100", "1E100"}, {number::Inc, "99", "100"},
        {number::Dec, "0", "-1"}, {number::Dec, "100", "99"}, {number::Inc, "1E42", "1"}, {number::Dec, "1E125", "-1"},
        {number::Inc, "-1E42", "-1E42"}, {number::Abs, "-5", "5"}, {number::Neg, "0", "0"},
        {number::Inc, "9999999999999999999999999999999999999999", "1E40"}};
    for (const auto& c : cases) {
        OCINumber got;
        ASSERT_EQ(c.function(Number(c.value), &got), 0) << c.value;
        EXPECT_EQ(got, Number(c.result)) << c.value;
    }
}

TEST(NumberArithmetic, PrecisionCountsFromTheFirstDigit) {
    const struct { const char* value; int digits; const char* result; } cases[] = {
        {"123.456", 4, "123.5"}, {"9.96", 2, "10"}, {"0.0099999", 2, "0.01"}, {"95", 1, "100"}, {"-1.5", 1, "-2"},
        {"12345", 40, "12345"}, {"0", 3, "0"}, {"0.05", 1, "0.05"}, {"5", 2000000000, "5"}};
    for (const auto& c : cases) {
        OCINumber got;
        ASSERT_EQ(number::Prec(Number(c.value), c.digits, &got), 0) << c.value;
        EXPECT_EQ(got, Number(c.result)) << c.value << " to " << c.digits;
    }
    OCINumber got;
    EXPECT_EQ(number::Prec(Number("1"), 0, &got), 21560);
    EXPECT_EQ(number::Shift(Number("1"), 2147483647, &got), 22053);
    EXPECT_EQ(number::Shift(Number("1"), -2147483647 - 1, &got), 22054);
    EXPECT_EQ(number::Round(Number("1"), -2147483647 - 1, &got), 0);
    EXPECT_EQ(got, Number("0"));
}

TEST(NumberArithmetic, RangeAndDomainErrors) {
    const struct { number::Binary function; const char* left; const char* right; number::Errno error; } cases[] = {
        {number::Add, "9.9E125", "9.9E125", 22053}, {number::Mul, "1E100", "1E26", 22053},
        {number::Mul, "1E-100", "1E-31", 22054}, {number::Sub, "1.01E-130", "1E-130", 22054},
        {number::Div, "1", "0", 22056}, {number::Div, "0", "0", 22056}, {number::Mod, "5", "0", 22056},
        {number::Div, "1E-100", "1E31", 22054}, {number::Div, "0", "-5", 0}};
    for (const auto& c : cases) {
        OCINumber got;
        EXPECT_EQ(c.function(Number(c.left), Number(c.right), &got), c.error) << c.left << " " << c.right;
    }
}

TEST(NumberArithmetic, BytesThatAreNoNumber) {
    const OCINumber malformed[] = {{{0, 128}},         {{255, 193, 2}},   {{1, 129}},          {{1, 193}},
                                   // One digit too many, if what lies behind were one.
                                   {{22, 193, 2, 2, 2, 2, 2, 2, 2, 2, 2, 2, 2, 2, 2, 2, 2, 2, 2, 2, 2, 2}},
                                   {{2, 193, 0}},      {{2, 193, 102}},   {{2, 255, 102}},
                                   {{3, 193, 2, 255}}, {{3, 62, 1, 102}}, {{3, 62, 103, 102}}, {{2, 62, 102}}};
    const number::Unary unary[] = {number::Assign, number::Abs, number::Neg, number::Ceil, number::Floor, number::Inc, number::Dec,
                                   number::Sqrt, number::Exp, number::Ln, number::Sin, number::Cos, number::Tan, number::ArcSin,
                                   number::ArcCos, number::ArcTan, number::HypSin, number::HypCos, number::HypTan};
    const number::Binary binary[] = {number::Add, number::Sub, number::Mul, number::Div, number::Mod,
                                     number::Power, number::Log, number::ArcTan2};
    const OCINumber two = Number("2");
    for (const OCINumber& value : malformed) {
        OCINumber got;
        int tested = 0;
        double real = 0;
        EXPECT_FALSE(number::IsValid(value)) << int{value.OCINumberPart[0]} << " " << int{value.OCINumberPart[1]};
        for (const auto& function : unary) EXPECT_EQ(function(value, &got), 22060) << &function - unary;
        for (const auto& function : binary)
            EXPECT_TRUE(function(value, two, &got) == 22060 && function(two, value, &got) == 22060) << &function - binary;
        for (const number::Scaled function : {number::Round, number::Trunc, number::Prec, number::Shift, number::IntPower})
            EXPECT_EQ(function(value, 1, &got), 22060);
        for (const number::Tested function : {number::Sign, number::IsInt, number::IsZero})
            EXPECT_EQ(function(value, &tested), 22060);
        EXPECT_EQ(number::Compare(value, two, &tested), 22060);
        EXPECT_EQ(number::Compare(two, value, &tested), 22060);
        EXPECT_EQ(number::ToDouble(value, &real), 22060);
    }
}

TEST(NumberArithmetic, BytesOfKnownValues) {
    const struct { const char* value; OCINumber bytes; } cases[] = {
        {"0", {{1, 0x80}}}, {"1", {{2, 0xC1, 2}}}, {"100", {{2, 0xC2, 2}}}, {"0.01", {{2, 0xC0, 2}}},
        {"-1", {{3, 0x3E, 0x64, 0x66}}}, {"-5", {{3, 0x3E, 0x60, 0x66}}}, {"123.45", {{4, 0xC2, 2, 0x18, 0x2E}}},
        {"-123.45", {{5, 0x3D, 0x64, 0x4E, 0x38, 0x66}}}, {"1E-130", {{2, 0x80, 2}}}};
    for (const auto& c : cases) EXPECT_EQ(Number(c.value), c.bytes) << c.value;
    OCINumber pi;
    number::SetPi(&pi);
    EXPECT_EQ(pi, Number("3.1415926535897932384626433832795028842"));
}

// Unused bytes, leading zeros and a missing terminator come from callers that build numbers themselves.
TEST(NumberArithmetic, UnusualBytesOfTheSameValue) {
    const struct { OCINumber bytes; const char* value; } cases[] = {
        {{{2, 193, 6, 255, 0, 102, 7, 7, 7, 7, 7, 7, 7, 7, 7, 7, 7, 7, 7, 7, 7, 7}}, "5"}, {{{3, 194, 1, 6}}, "5"},
        {{{2, 62, 96}}, "-5"}, {{{3, 193, 6, 1}}, "5"}, {{{2, 193, 1}}, "0"}, {{{2, 128, 1}}, "0"}};
    for (const auto& c : cases) {
        OCINumber got;
        ASSERT_EQ(number::Add(c.bytes, Number("1"), &got), 0) << c.value;
        OCINumber wanted;
        ASSERT_EQ(number::Add(Number(c.value), Number("1"), &wanted), 0);
        EXPECT_EQ(got, wanted) << c.value;
    }
}

TEST(NumberArithmetic, InfinitiesCompareButDoNotCompute) {
    const OCINumber plus{{2, 255, 101}}, minus{{1, 0}};
    int order = 0;
    ASSERT_EQ(number::Compare(minus, Number("-9E125"), &order), 0);
    EXPECT_EQ(order, -1);
    ASSERT_EQ(number::Compare(plus, plus, &order), 0);
    EXPECT_EQ(order, 0);
    OCINumber got;
    ASSERT_EQ(number::Neg(plus, &got), 0);
    EXPECT_EQ(got, minus);
    ASSERT_EQ(number::Neg(minus, &got), 0);
    EXPECT_EQ(got, plus);
    const struct { OCINumber value; int sign; const char* text; number::Errno integer; } cases[] = {{plus, 1, "~", 22053}, {{{1, 0, 7}}, -1, "-~", 22054}};
    for (const auto& c : cases) {
        int sign = 0, whole = 1, zero = 1;
        double real = 0;
        std::uint64_t bits = 0;
        got = Number("7");
        EXPECT_EQ(number::Abs(c.value, &got) + number::Sign(c.value, &sign) + number::IsInt(c.value, &whole) +
                      number::IsZero(c.value, &zero) + number::ToDouble(c.value, &real), 0);
        EXPECT_EQ(got, plus) << c.text;
        EXPECT_TRUE(sign == c.sign && whole == 0 && zero == 0 && real == c.sign * HUGE_VAL) << c.text;
        EXPECT_EQ(Shown(c.value), c.text);
        char text[4] = "";
        std::size_t length = 0;
        EXPECT_EQ(number::ToText(c.value, "999", {}, text, 3, &length), 0);
        EXPECT_STREQ(text, c.text) << "by any model";
        EXPECT_EQ(number::ToInteger(c.value, 8, true, &bits), c.integer);
    }
    EXPECT_EQ(number::Add(plus, minus, &got), 22053);
    EXPECT_EQ(number::Cos(plus, &got), 22053);
}
