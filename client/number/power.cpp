// Logarithms and powers.
#include "handles/errors.h"
#include "number/binary.h"
#include "number/digits.h"
#include "number/number.h"

namespace number {

namespace {

// The natural logarithm of a positive number. Next to 1 it is taken of the difference, which is exact.
BigReal NaturalLogarithm(const OCINumber& value, const Digits& digits, int limbs) {
    constexpr long kNear = -8;
    OCINumber difference, one;
    Digits difference_digits;
    FromInt64(1, &one);
    Sub(value, one, &difference);
    Unpack(difference, &difference_digits);
    const BigReal real = BigReal::FromDigits(limbs, difference_digits);
    if (real.IsZero() || real.Exponent() <= kNear) return LogarithmNextToOne(real);
    return Logarithm(BigReal::FromDigits(limbs, digits));
}

Errno UnpackPositive(const OCINumber& value, Digits* digits) {
    if (const Errno error = Unpack(value, digits)) return error;
    return digits->IsZero() || digits->negative ? errors::kBadNumber : 0;
}

bool IsOdd(const Digits& digits) {
    const int units = digits.exponent;  // the index of the units digit
    return units < kMantissaDigits && DigitAt(digits, units) % 2 == 1;
}

// base^exponent = e^(exponent log base) for a base that is not 0. An error of the product is one of the result as often
// as the product is long, so it is computed with a limb more.
Errno Raise(const OCINumber& base, const Digits& exponent, bool negative, OCINumber* result) {
    Digits digits;
    OCINumber magnitude;
    Abs(base, &magnitude);
    Unpack(magnitude, &digits);
    return Evaluate(
        [&](int limbs, BigReal* real, long*) -> Errno {
            const BigReal product =
                BigReal::FromDigits(limbs + 1, exponent) * NaturalLogarithm(magnitude, digits, limbs + 1);
            if (!product.IsZero() && product.Exponent() > kBeyondPowers)
                return product.IsNegative() ? errors::kNumberUnderflow : errors::kNumberOverflow;
            const BigReal power = Exponential(product).WithLimbs(limbs);
            *real = negative ? power.Negated() : power;
            return 0;
        },
        result);
}

}  // namespace

Errno Ln(const OCINumber& value, OCINumber* result) noexcept {
    Digits digits;
    if (const Errno error = UnpackPositive(value, &digits)) return error;
    return Evaluate(
        [&](int limbs, BigReal* real, long*) -> Errno {
            *real = NaturalLogarithm(value, digits, limbs);
            return 0;
        },
        result);
}

Errno Log(const OCINumber& base, const OCINumber& value, OCINumber* result) noexcept {
    Digits base_digits, value_digits;
    if (const Errno error = UnpackPositive(base, &base_digits)) return error;
    if (const Errno error = UnpackPositive(value, &value_digits)) return error;
    return Evaluate(
        [&](int limbs, BigReal* real, long*) -> Errno {
            const BigReal divisor = NaturalLogarithm(base, base_digits, limbs);
            if (divisor.IsZero()) return errors::kBadNumber;  // there is no base 1
            *real = NaturalLogarithm(value, value_digits, limbs) / divisor;
            return 0;
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
    if (exponent_digits.IsZero()) {
        FromInt64(1, result);
        return 0;
    }
    if (base_digits.IsZero()) {
        if (exponent_digits.negative) return errors::kDividedByZero;
        SetZero(result);
        return 0;
    }
    if (base_digits.negative && !whole) return errors::kBadNumber;
    return Raise(base, exponent_digits, base_digits.negative && IsOdd(exponent_digits), result);
}

}  // namespace number
