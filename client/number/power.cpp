// Logarithms and powers.
#include "handles/errors.h"
#include "number/binary.h"
#include "number/digits.h"
#include "number/number.h"

namespace number {

namespace {

constexpr int kGuardBits = 3;  // what a few roundings can cost

// The natural logarithm of a positive number, off by at most 4 in 2^precision of itself. Next to 1 it is taken of the
// difference, which is exact.
void NaturalLogarithm(const OCINumber& value, const Digits& digits, Real* real) {
    Real argument(real->Bits() + 2);
    OCINumber difference, one;
    Digits difference_digits;
    const bool near_one =
        digits.exponent == 0 ? DigitAt(digits, 0) == 1 : digits.exponent == -1 && DigitAt(digits, 0) >= 50;
    FromInt64(1, &one);
    if (near_one && Sub(value, one, &difference) == 0 && Unpack(difference, &difference_digits) == 0) {
        ToReal(difference_digits, &argument);
        mpfr_log1p(*real, argument, MPFR_RNDN);
    } else {
        ToReal(digits, &argument);
        mpfr_log(*real, argument, MPFR_RNDN);
    }
}

Errno UnpackPositive(const OCINumber& value, Digits* digits) {
    if (const Errno error = Unpack(value, digits)) return error;
    return digits->IsZero() || digits->negative ? errors::kBadNumber : 0;
}

bool IsOdd(const Digits& digits) {
    const int units = digits.exponent;  // the index of the units digit
    return units >= 0 && units < kMantissaDigits && DigitAt(digits, units) % 2 == 1;
}

// base^exponent for a base that is not 0 and an exponent with an exact binary form or enough bits.
Errno Raise(Digits base, const Digits& exponent, OCINumber* result) {
    const bool negative = base.negative && IsOdd(exponent);
    base.negative = false;
    // A relative error of the base counts as often as the exponent says; one of the exponent by the size of the
    // result's logarithm, which is below 2^9 where the result is a number.
    const mpfr_exp_t extra = std::max<mpfr_exp_t>(RoughExponent(exponent) + 1, 0) + 2;
    return Evaluate(
        [&](mpfr_prec_t precision, Real* real) {
            Real base_real(precision + extra), exponent_real(precision + 12);
            ToReal(base, &base_real);
            ToReal(exponent, &exponent_real);
            mpfr_pow(*real, base_real, exponent_real, MPFR_RNDN);
            if (negative) mpfr_neg(*real, *real, MPFR_RNDN);
            return precision - kGuardBits;
        },
        result);
}

Errno PowerOf(const Digits& base, const Digits& exponent, bool whole_exponent, OCINumber* result) {
    if (exponent.IsZero()) {
        FromInt64(1, result);
        return 0;
    }
    if (base.IsZero()) {
        if (exponent.negative) return errors::kDividedByZero;
        SetZero(result);
        return 0;
    }
    if (base.negative && !whole_exponent) return errors::kBadNumber;
    return Raise(base, exponent, result);
}

}  // namespace

Errno Ln(const OCINumber& value, OCINumber* result) noexcept {
    Digits digits;
    if (const Errno error = UnpackPositive(value, &digits)) return error;
    return Evaluate(
        [&](mpfr_prec_t precision, Real* real) {
            NaturalLogarithm(value, digits, real);
            return precision - kGuardBits;
        },
        result);
}

Errno Log(const OCINumber& base, const OCINumber& value, OCINumber* result) noexcept {
    Digits base_digits, value_digits;
    if (const Errno error = UnpackPositive(base, &base_digits)) return error;
    if (const Errno error = UnpackPositive(value, &value_digits)) return error;
    return Evaluate(
        [&](mpfr_prec_t precision, Real* real) {
            Real base_logarithm(precision + kGuardBits), value_logarithm(precision + kGuardBits);
            NaturalLogarithm(base, base_digits, &base_logarithm);
            NaturalLogarithm(value, value_digits, &value_logarithm);
            if (base_logarithm.IsZero())
                mpfr_set_nan(*real);  // there is no base 1
            else
                mpfr_div(*real, value_logarithm, base_logarithm, MPFR_RNDN);
            return precision - kGuardBits;
        },
        result);
}

Errno IntPower(const OCINumber& base, int exponent, OCINumber* result) noexcept {
    OCINumber number;
    FromInt64(exponent, &number);
    return Power(base, number, result);
}

Errno Power(const OCINumber& base, const OCINumber& exponent, OCINumber* result) noexcept {
    Digits base_digits, exponent_digits;
    if (const Errno error = Unpack(base, &base_digits)) return error;
    if (const Errno error = Unpack(exponent, &exponent_digits)) return error;
    int whole = 0;
    if (const Errno error = IsInt(exponent, &whole)) return error;
    return PowerOf(base_digits, exponent_digits, whole != 0, result);
}

}  // namespace number
