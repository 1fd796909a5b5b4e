// The bridge to MPFR, where functions without an exact decimal result are computed: a number as a binary real of any
// precision, and back, with the question whether its decimal rounding is certain.
#pragma once

#include <mpfr.h>

#include "handles/errors.h"
#include "number/digits.h"
#include "number/number.h"

namespace number {

class Real {
public:
    explicit Real(mpfr_prec_t bits) { mpfr_init2(value_, bits); }
    ~Real() { mpfr_clear(value_); }
    Real(const Real&) = delete;
    Real& operator=(const Real&) = delete;

    operator mpfr_ptr() { return value_; }
    operator mpfr_srcptr() const { return value_; }

    [[nodiscard]] bool IsRegular() const { return mpfr_regular_p(value_) != 0; }  // not 0, infinite or NaN
    [[nodiscard]] bool IsZero() const { return mpfr_zero_p(value_) != 0; }
    [[nodiscard]] bool IsInfinite() const { return mpfr_inf_p(value_) != 0; }
    [[nodiscard]] bool IsNan() const { return mpfr_nan_p(value_) != 0; }
    [[nodiscard]] mpfr_prec_t Bits() const { return mpfr_get_prec(value_); }

    // For a value that is not 0: 2^(Exponent() - 1) <= |value| < 2^Exponent().
    [[nodiscard]] mpfr_exp_t Exponent() const { return mpfr_get_exp(value_); }

private:
    mpfr_t value_;
};

// The value rounded to the precision of *real: off by at most 1 in 2^precision of itself, exact where it fits.
void ToReal(const Digits& digits, Real* real);

// A rough binary exponent, at most 1 below or above that of the value, which is not 0.
mpfr_exp_t RoughExponent(const Digits& digits);

constexpr mpfr_prec_t kFirstPrecision = 176;
// A value that is this many bits close to a tie is one: no function of numbers of 40 digits comes nearer otherwise.
constexpr mpfr_prec_t kLastPrecision = 2048;

// Rounds a real to a number's digits. `good_bits` says how far it can be trusted: it is off by at most 1 in 2^good_bits
// of itself. False when that leaves the rounding open; `tie` then decides for half up.
bool ToDigits(const Real& real, mpfr_prec_t good_bits, bool tie, Digits* digits);

// Computes with more and more bits until the rounding is certain. compute(precision, Real*) -> good bits.
template <class Compute> Errno Evaluate(Compute compute, OCINumber* result) {
    for (mpfr_prec_t precision = kFirstPrecision;; precision *= 2) {
        mpfr_clear_flags();
        Real real(precision);
        const mpfr_prec_t good_bits = compute(precision, &real);
        if (real.IsNan()) return errors::kBadNumber;
        if (real.IsZero()) {
            if (mpfr_underflow_p()) return errors::kNumberUnderflow;
            SetZero(result);
            return 0;
        }
        constexpr mpfr_exp_t kBeyond = 450;  // 2^420 is 1E126
        if (real.IsInfinite() || real.Exponent() > kBeyond) return errors::kNumberOverflow;
        if (real.Exponent() < -kBeyond) return errors::kNumberUnderflow;
        Digits digits;
        if (ToDigits(real, good_bits, precision > kLastPrecision, &digits)) return Pack(digits, result);
    }
}

}  // namespace number
