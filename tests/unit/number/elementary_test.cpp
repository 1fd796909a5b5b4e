// The functions of binary reals, at every precision that they are asked for, against MPFR.
#include "number/elementary.h"

#include <gtest/gtest.h>
#include <mpfr.h>

#include "reference.h"

namespace {

using number::BigReal;

constexpr mpfr_prec_t kReferenceBits = 4000;
constexpr int kPrecisions[] = {4, 5, 8, 9, 18, 19};  // limbs: those of the attempts, and with one more

class Real {
public:
    Real() { mpfr_init2(value_, kReferenceBits); }
    explicit Real(const BigReal& real) : Real() {
        mpfr_set_zero(value_, 1);
        if (real.IsZero()) return;
        for (int i = real.Count() - 1; i >= 0; --i) {
            mpfr_mul_2ui(value_, value_, 64, MPFR_RNDN);
            mpfr_add_ui(value_, value_, real.Limbs()[i], MPFR_RNDN);
        }
        mpfr_mul_2si(value_, value_, real.Exponent() - 64 * real.Count(), MPFR_RNDN);
        if (real.IsNegative()) mpfr_neg(value_, value_, MPFR_RNDN);
    }
    ~Real() { mpfr_clear(value_); }
    Real(const Real&) = delete;
    Real& operator=(const Real&) = delete;
    operator mpfr_ptr() { return value_; }

private:
    mpfr_t value_;
};

// The bits of `got` that are right.
long RightBits(const BigReal& got, Real& wanted) {
    Real difference(got);
    mpfr_sub(difference, difference, wanted, MPFR_RNDN);
    if (mpfr_zero_p(static_cast<mpfr_ptr>(difference))) return kReferenceBits;
    if (mpfr_zero_p(static_cast<mpfr_ptr>(wanted))) return 0;
    return mpfr_get_exp(wanted) - mpfr_get_exp(difference);
}

BigReal SineOf(const BigReal& x) { return number::SineAndCosine(x).sine; }
BigReal CosineOf(const BigReal& x) { return number::SineAndCosine(x).cosine; }

BigReal Read(int limbs, const OCINumber& value) {
    number::Digits digits;
    EXPECT_EQ(number::Unpack(value, &digits), 0);
    return BigReal::FromDigits(limbs, digits);
}

}  // namespace

TEST(BinaryReals, FunctionsAreRightToTheBitsTheyPromise) {
    const struct {
        const char* name;
        BigReal (*function)(const BigReal&);
        int (*reference)(mpfr_ptr, mpfr_srcptr, mpfr_rnd_t);
        std::vector<const char*> arguments;
    } rows[] = {
        {"exp", number::Exponential, mpfr_exp,
         {"0", "1E-130", "-1E-130", "1E-20", "-1E-20", ".69314718055994530941723212145817656808",
          ".6931471805599453094172321214581765680755", "-.6931471805599453094172321214581765680755", "1", "-1", "290.12",
          "-299.4", "4095.999", "-4095.999"}},
        {"sinh", number::HyperbolicSine, mpfr_sinh,
         {"0", "1E-130", "-1E-9", ".0039", ".00390625", "-.0040", ".0078", ".0079", "1", "-290", "4095"}},
        {"log1p", number::LogarithmNextToOne, mpfr_log1p,
         {"0", "1E-130", "-1E-39", "1E-19", ".00390624", "-.00390624", "-.0001"}},
        {"log", number::Logarithm, mpfr_log,
         {"1.00390626", ".99609374", ".7071067811865475", ".7071067811865476", "1.4142135623730950",
          "1.4142135623730951", "2", "10", "1E125", "1E-130", ".5"}},
        {"sin", SineOf, mpfr_sin, {"0", "1E-130", "1E-20", ".0039", ".00390625", ".0040", ".0079", ".5", ".999999999"}},
        {"cos", CosineOf, mpfr_cos, {"0", "1E-130", "1E-20", ".0039", ".00390625", ".0040", ".0079", ".5", ".999999999"}},
        {"atan", number::ArcTangent, mpfr_atan,
         {"0", "1E-130", ".0039", ".00390625", ".0079", ".5", ".99999999999999999999999999999999999999", "1",
          "1.00000000000000000000000000000000000001", "1.9999", "2", "3", "1E20", "1E125"}}};
    for (const auto& row : rows) {
        for (const char* argument : row.arguments) {
            for (const int limbs : kPrecisions) {
                const BigReal x = Read(limbs, Number(argument));
                Real wanted(x);
                row.reference(wanted, wanted, MPFR_RNDN);
                EXPECT_GE(RightBits(row.function(x), wanted), 64 * limbs - number::kLostBits)
                    << row.name << " " << argument << " with " << limbs << " limbs";
            }
        }
    }
}

TEST(BinaryReals, NearestWholeNumberAndItsQuarter) {
    const struct { const char* value; const char* nearest; unsigned quarter; } cases[] = {
        {"0", "0", 0}, {".4999", "0", 0}, {".5", "1", 1}, {"1.4", "1", 1}, {"1.5", "2", 2}, {"-1.6", "-2", 2},
        {"-1.2", "-1", 3}, {"2.7", "3", 3}, {"3.9", "4", 0}, {"1E30", "1E30", 0},
        {"18446744073709551615.7", "18446744073709551616", 0}, {"9223372036854775807.2", "9223372036854775807", 3},
        {"340282366920938463463374607431768211455", "340282366920938463463374607431768211455", 3}};
    for (const auto& c : cases) {
        for (const int limbs : kPrecisions) {
            unsigned quarter = 9;
            const BigReal nearest = Read(limbs, Number(c.value)).Nearest(&quarter);
            EXPECT_TRUE((nearest - Read(limbs, Number(c.nearest))).IsZero()) << c.value << " with " << limbs;
            EXPECT_EQ(quarter, c.quarter) << c.value << " with " << limbs;
        }
    }
}
