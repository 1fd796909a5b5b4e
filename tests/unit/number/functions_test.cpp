// The functions that have no exact decimal result, against MPFR at a precision that leaves no doubt.
#include <gmpxx.h>
#include <mpfr.h>

#include <atomic>

#include "reference.h"
#include "support/at_once.h"

namespace {

constexpr mpfr_prec_t kReferenceBits = 2000;

class Reference {
public:
    Reference() { mpfr_init2(value_, kReferenceBits); }
    explicit Reference(const OCINumber& value) : Reference() {
        mpfr_set_q(value_, Exact(value).get_mpq_t(), MPFR_RNDN);
    }
    ~Reference() { mpfr_clear(value_); }
    Reference(const Reference&) = delete;
    Reference& operator=(const Reference&) = delete;
    operator mpfr_ptr() { return value_; }

    // compute(value), noting whether it was too small even for MPFR.
    template <class Compute> void Set(Compute compute) {
        mpfr_clear_flags();
        compute(static_cast<mpfr_ptr>(value_));
        underflow_ = mpfr_underflow_p() != 0;
    }

    // Compares a computed number with this value.
    void Expect(const char* name, number::Errno error, const OCINumber& got, const std::string& operands) {
        OCINumber wanted;
        number::Errno wanted_error;
        if (mpfr_inf_p(value_) || (mpfr_regular_p(value_) && mpfr_get_exp(value_) > 500)) {
            wanted_error = 22053;
        } else if (underflow_ || (mpfr_regular_p(value_) && mpfr_get_exp(value_) < -500)) {
            wanted_error = 22054;
        } else {
            mpq_class exact;
            mpfr_get_q(exact.get_mpq_t(), value_);
            wanted_error = Rounded(exact, &wanted);
        }
        ExpectResult(name + (" " + operands), error, got, wanted_error, wanted);
    }

private:
    mpfr_t value_;
    bool underflow_ = false;
};

struct Function { const char* name; number::Unary function; int (*reference)(mpfr_ptr, mpfr_srcptr, mpfr_rnd_t); };
constexpr Function kFunctions[] = {{"exp", number::Exp, mpfr_exp},        {"sin", number::Sin, mpfr_sin},
                                   {"cos", number::Cos, mpfr_cos},        {"tan", number::Tan, mpfr_tan},
                                   {"arctan", number::ArcTan, mpfr_atan}, {"hypsin", number::HypSin, mpfr_sinh},
                                   {"hypcos", number::HypCos, mpfr_cosh}, {"hyptan", number::HypTan, mpfr_tanh}};
constexpr Function kPartial[] = {{"arcsin", number::ArcSin, mpfr_asin}, {"arccos", number::ArcCos, mpfr_acos},
                                 {"ln", number::Ln, mpfr_log}};

void ExpectFunction(const Function& row, const OCINumber& value) {
    OCINumber got;
    const number::Errno error = row.function(value, &got);
    Reference reference(value);
    reference.Set([&](mpfr_ptr real) { row.reference(real, real, MPFR_RNDN); });
    reference.Expect(row.name, error, got, Shown(value));
}

void ExpectEverywhere(const OCINumber& value) {
    for (const Function& row : kFunctions) ASSERT_NO_FATAL_FAILURE(ExpectFunction(row, value));
    for (const Function& row : kPartial) {
        OCINumber got;
        if (row.function == number::Ln ? Exact(value) > 0 : abs(Exact(value)) <= 1) {
            ASSERT_NO_FATAL_FAILURE(ExpectFunction(row, value));
        } else {
            ASSERT_EQ(row.function(value, &got), 22060) << row.name << " " << Shown(value);
        }
    }
}

}  // namespace

TEST(NumberFunctions, AtRandomArguments) {
    RandomNumbers numbers(11);
    for (int i = 0; i < 300; ++i) ASSERT_NO_FATAL_FAILURE(ExpectEverywhere(numbers.Next(i % 4 == 0 ? 60 : 1)));
}

// For each weight of the last digit the number of 39 digits that comes nearest: a numerator of the continued fraction of
// pi/2 in such units.
TEST(NumberFunctions, NearestToMultiplesOfHalfAPi) {
    const mpz_class limit("1" + std::string(39, '0'));
    for (int weight = -38; weight <= 86; ++weight) {
        Reference rest;
        mpfr_const_pi(rest, MPFR_RNDN);
        mpfr_div_2ui(rest, rest, 1, MPFR_RNDN);
        Reference unit;
        mpfr_ui_pow_ui(unit, 10, static_cast<unsigned long>(weight < 0 ? -weight : weight), MPFR_RNDN);
        if (weight < 0)
            mpfr_mul(rest, rest, unit, MPFR_RNDN);
        else
            mpfr_div(rest, rest, unit, MPFR_RNDN);
        mpz_class last = 0, next = 1, quotient;
        for (;;) {
            mpfr_get_z(quotient.get_mpz_t(), rest, MPFR_RNDD);
            last += quotient * next;
            swap(last, next);
            if (next >= limit) break;
            mpfr_sub_z(rest, rest, quotient.get_mpz_t(), MPFR_RNDN);
            mpfr_ui_div(rest, 1, rest, MPFR_RNDN);
        }
        const OCINumber value = Number(last.get_str() + "E" + std::to_string(weight));
        for (const Function& row : kFunctions) ASSERT_NO_FATAL_FAILURE(ExpectFunction(row, value));
    }
}

TEST(NumberFunctions, FunctionsOfTwoNumbers) {
    RandomNumbers numbers(12);
    for (int i = 0; i < 300; ++i) {
        OCINumber a = numbers.Next(i % 3 == 0 ? 30 : 2), b = numbers.Next(i % 5 == 0 ? 60 : 1), got;
        const std::string operands = Shown(a) + " " + Shown(b);
        Reference a_real(a), b_real(b), result;
        result.Set([&](mpfr_ptr real) { mpfr_atan2(real, a_real, b_real, MPFR_RNDN); });
        ASSERT_NO_FATAL_FAILURE(result.Expect("arctan2", number::ArcTan2(a, b, &got), got, operands));
        number::Abs(a, &a);
        mpfr_abs(a_real, a_real, MPFR_RNDN);
        result.Set([&](mpfr_ptr real) { mpfr_pow(real, a_real, b_real, MPFR_RNDN); });
        ASSERT_NO_FATAL_FAILURE(result.Expect("power", number::Power(a, b, &got), got, operands));
        number::Abs(b, &b);
        mpfr_abs(b_real, b_real, MPFR_RNDN);
        mpfr_log(a_real, a_real, MPFR_RNDN);
        mpfr_log(b_real, b_real, MPFR_RNDN);
        if (mpfr_zero_p(static_cast<mpfr_ptr>(a_real))) continue;
        result.Set([&](mpfr_ptr real) { mpfr_div(real, b_real, a_real, MPFR_RNDN); });
        ASSERT_NO_FATAL_FAILURE(result.Expect("log", number::Log(a, b, &got), got, operands));
    }
}

TEST(NumberFunctions, FromSeveralThreads) {
    OCINumber wanted;
    ASSERT_EQ(number::Sin(Number("2"), &wanted), 0);
    std::atomic<int> wrong = 0;
    AtOnce(8, [&](int) {
        for (int i = 0; i < 50; ++i) {
            OCINumber got;
            wrong += number::Sin(Number("2"), &got) != 0 || !(got == wanted);
        }
    });
    EXPECT_EQ(wrong, 0);
}
