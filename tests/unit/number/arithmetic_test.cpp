// Arithmetic on numbers, against exact fractions.
#include <gtest/gtest.h>

#include "number/add_wide.h"
#include "reference.h"

namespace {

// Two numbers of 40 digits; what their product has behind its 40th digit is 50...01 or 49...9.
void NextToTie(RandomNumbers& numbers, OCINumber* a, OCINumber* b) {
    std::string digits = "9";
    while (digits.size() < 39) digits += static_cast<char>('0' + numbers.Below(10));
    digits += '7';
    *a = Number(digits);
    const mpz_class power("1" + std::string(40, '0'));
    const mpz_class tail(numbers.Below(4) ? "5" + std::string(38, '0') + "1" : "4" + std::string(39, '9'));
    mpz_class inverse(digits);
    mpz_invert(inverse.get_mpz_t(), inverse.get_mpz_t(), power.get_mpz_t());
    *b = Number(mpz_class(tail * inverse % power).get_str());
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
            mpq_class exact;
            operation.exact(exact.get_mpq_t(), Exact(a).get_mpq_t(), Exact(b).get_mpq_t());
            OCINumber got = a, wanted;    // a result may take its operand's place
            const number::Errno wanted_error = Rounded(exact, &wanted);
            ASSERT_NO_FATAL_FAILURE(ExpectResult(operation.name + (" " + Shown(a) + " ") + Shown(b),
                                                 operation.function(got, b, &got), got, wanted_error, wanted));
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
