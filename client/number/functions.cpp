// Exponential, trigonometric and hyperbolic functions, made from those of binary reals. An argument is longer than the
// result where the function needs it so.
#include <iterator>

#include "handles/errors.h"
#include "number/binary.h"
#include "number/digits.h"
#include "number/number.h"

namespace number {

namespace {

bool ReachesPowers(const BigReal& x) { return !x.IsZero() && x.Exponent() > kBeyondPowers; }

// e^x, e^-x
BigReal Reciprocal(const BigReal& x) { return BigReal::FromInteger(x.Count(), 1) / x; }

using Compute = Errno (*)(const Digits& argument, int limbs, BigReal* result, long* lost_bits);

Errno ComputeExp(const Digits& argument, int limbs, BigReal* result, long*) {
    const BigReal x = BigReal::FromDigits(limbs, argument);
    if (ReachesPowers(x)) return x.IsNegative() ? errors::kNumberUnderflow : errors::kNumberOverflow;
    *result = Exponential(x);
    return 0;
}

Errno ComputeHypSin(const Digits& argument, int limbs, BigReal* result, long*) {
    const BigReal x = BigReal::FromDigits(limbs, argument);
    if (ReachesPowers(x)) return errors::kNumberOverflow;
    *result = HyperbolicSine(x);
    return 0;
}

Errno ComputeHypCos(const Digits& argument, int limbs, BigReal* result, long*) {
    const BigReal x = BigReal::FromDigits(limbs, argument);
    if (ReachesPowers(x)) return errors::kNumberOverflow;
    const BigReal power = Exponential(x);
    *result = (power + Reciprocal(power)).Times2(-1);
    return 0;
}

// sinh / sqrt(1 + sinh^2)
Errno ComputeHypTan(const Digits& argument, int limbs, BigReal* result, long*) {
    const BigReal x = BigReal::FromDigits(limbs, argument), one = BigReal::FromInteger(limbs, 1);
    if (ReachesPowers(x)) {
        *result = x.IsNegative() ? one.Negated() : one;
        return 0;
    }
    const BigReal sine = HyperbolicSine(x);
    *result = sine / (one + sine * sine).SquareRoot();
    return 0;
}

// Sine and cosine of an argument of any size: so many quarter turns are taken off that at most pi/4 is left. An argument
// next to a multiple of pi/2 loses bits to that.
Angle TurnBack(const Digits& argument, int limbs, long* lost_bits) {
    const BigReal rough = BigReal::FromDigits(1, argument);
    if (rough.IsZero() || rough.Exponent() < 0) {
        const Angle angle = SineAndCosine(BigReal::FromDigits(limbs, argument).Magnitude());
        return {argument.negative ? angle.sine.Negated() : angle.sine, angle.cosine};
    }
    const int precision = limbs + 2 + static_cast<int>(rough.Exponent() / BigReal::kLimbBits);
    const BigReal x = BigReal::FromDigits(precision, argument), half_pi = BigReal::HalfPi(precision);
    unsigned quarter = 0;
    const BigReal turns = (x / half_pi).Nearest(&quarter);
    const BigReal rest = x - turns * half_pi;
    *lost_bits = std::max(-rest.Exponent() - BigReal::kLimbBits, 0L);
    const Angle angle = SineAndCosine(rest.Magnitude().WithLimbs(limbs));
    const BigReal sine = rest.IsNegative() ? angle.sine.Negated() : angle.sine;
    switch (quarter) {
        case 0: return {sine, angle.cosine};
        case 1: return {angle.cosine, sine.Negated()};
        case 2: return {sine.Negated(), angle.cosine.Negated()};
        default: return {angle.cosine.Negated(), sine};
    }
}

Errno ComputeSin(const Digits& argument, int limbs, BigReal* result, long* lost_bits) {
    *result = TurnBack(argument, limbs, lost_bits).sine;
    return 0;
}

Errno ComputeCos(const Digits& argument, int limbs, BigReal* result, long* lost_bits) {
    *result = TurnBack(argument, limbs, lost_bits).cosine;
    return 0;
}

Errno ComputeTan(const Digits& argument, int limbs, BigReal* result, long* lost_bits) {
    const Angle angle = TurnBack(argument, limbs, lost_bits);
    *result = angle.sine / angle.cosine;
    return 0;
}

// The angle of the point (x, y), from -pi to pi.
BigReal AngleOf(const BigReal& y, const BigReal& x) {
    const int count = y.Count();
    const BigReal half_pi = BigReal::HalfPi(count);
    BigReal angle = x.IsZero() ? half_pi : ArcTangent(y.Magnitude() / x.Magnitude());
    if (x.IsNegative()) angle = half_pi.Times2(1) - angle;
    return y.IsNegative() ? angle.Negated() : angle;
}

Errno ComputeArcTan(const Digits& argument, int limbs, BigReal* result, long*) {
    *result = AngleOf(BigReal::FromDigits(limbs, argument), BigReal::FromInteger(limbs, 1));
    return 0;
}

bool IsBeyondOne(const Digits& digits) {
    Digits one;
    one.words[0] = 1ull << 56;
    one.exponent = 0;
    return CompareMagnitude(digits, one) > 0;
}

// sqrt(1 - x^2) = sqrt((1 - x)(1 + x)). Next to 1 the difference loses up to 133 bits, so it has three limbs more.
BigReal OtherSide(const Digits& x, int limbs) {
    const int precision = limbs + 3;
    const BigReal real = BigReal::FromDigits(precision, x), one = BigReal::FromInteger(precision, 1);
    return ((one - real) * (one + real)).SquareRoot().WithLimbs(limbs);
}

Errno ComputeArcSin(const Digits& argument, int limbs, BigReal* result, long*) {
    if (IsBeyondOne(argument)) return errors::kBadNumber;
    *result = AngleOf(BigReal::FromDigits(limbs, argument), OtherSide(argument, limbs));
    return 0;
}

Errno ComputeArcCos(const Digits& argument, int limbs, BigReal* result, long*) {
    if (IsBeyondOne(argument)) return errors::kBadNumber;
    *result = AngleOf(OtherSide(argument, limbs), BigReal::FromDigits(limbs, argument));
    return 0;
}

Errno Apply(Compute compute, const OCINumber& value, OCINumber* result) {
    Digits digits;
    if (const Errno error = Unpack(value, &digits)) return error;
    return Evaluate([&](int limbs, BigReal* real, long* lost) { return compute(digits, limbs, real, lost); }, result);
}

}  // namespace

Errno Exp(const OCINumber& value, OCINumber* result) noexcept { return Apply(ComputeExp, value, result); }
Errno Sin(const OCINumber& value, OCINumber* result) noexcept { return Apply(ComputeSin, value, result); }
Errno Cos(const OCINumber& value, OCINumber* result) noexcept { return Apply(ComputeCos, value, result); }
Errno Tan(const OCINumber& value, OCINumber* result) noexcept { return Apply(ComputeTan, value, result); }
Errno ArcSin(const OCINumber& value, OCINumber* result) noexcept { return Apply(ComputeArcSin, value, result); }
Errno ArcCos(const OCINumber& value, OCINumber* result) noexcept { return Apply(ComputeArcCos, value, result); }
Errno ArcTan(const OCINumber& value, OCINumber* result) noexcept { return Apply(ComputeArcTan, value, result); }
Errno HypSin(const OCINumber& value, OCINumber* result) noexcept { return Apply(ComputeHypSin, value, result); }
Errno HypCos(const OCINumber& value, OCINumber* result) noexcept { return Apply(ComputeHypCos, value, result); }
Errno HypTan(const OCINumber& value, OCINumber* result) noexcept { return Apply(ComputeHypTan, value, result); }

Errno ArcTan2(const OCINumber& y, const OCINumber& x, OCINumber* result) noexcept {
    Digits y_digits, x_digits;
    if (const Errno error = Unpack(y, &y_digits)) return error;
    if (const Errno error = Unpack(x, &x_digits)) return error;
    if (y_digits.IsZero() && x_digits.IsZero()) return errors::kBadNumber;
    return Evaluate(
        [&](int limbs, BigReal* real, long*) -> Errno {
            *real = AngleOf(BigReal::FromDigits(limbs, y_digits), BigReal::FromDigits(limbs, x_digits));
            return 0;
        },
        result);
}

}  // namespace number
