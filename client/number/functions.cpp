// Exponential, trigonometric and hyperbolic functions. Each is a row: how to compute it, which arguments it takes, and
// how an error of the argument, which is rounded to binary, grows on the way to the result.
#include "handles/errors.h"
#include "number/binary.h"
#include "number/digits.h"
#include "number/number.h"

namespace number {

namespace {

using Exponent = mpfr_exp_t;

struct Function {
    int (*compute)(mpfr_ptr, mpfr_srcptr, mpfr_rnd_t);
    // Bits that the argument gets beyond those of the result, by its exponent.
    Exponent (*extra_bits)(Exponent x);
    // A bound of log2 of the slope, by the exponents of argument and result.
    Exponent (*slope)(Exponent x, Exponent y);
    bool to_one = false;  // takes -1 to 1 only
};

Exponent None(Exponent) { return 2; }
Exponent WholeBits(Exponent x) { return std::max<Exponent>(x, 0) + 2; }
Exponent Flat(Exponent, Exponent) { return 0; }
Exponent LikeResult(Exponent, Exponent y) { return y; }
Exponent AtLeastOne(Exponent, Exponent y) { return std::max<Exponent>(y, 0) + 1; }
Exponent Inverse(Exponent x, Exponent) { return std::min<Exponent>(-x, 0) + 1; }
// 1 + y^2
Exponent Squared(Exponent, Exponent y) { return std::max<Exponent>(2 * y, 0) + 1; }
// 1 / sqrt(1 - x^2), where 1 - |x| is at least 1E-40; the result may be as small as 1E-20.
Exponent NearOne(Exponent x) { return x >= 0 ? 140 : 2; }
Exponent SteepNearOne(Exponent x, Exponent) { return x >= 0 ? 67 : 1; }

constexpr Function kExp{mpfr_exp, WholeBits, LikeResult};
constexpr Function kSin{mpfr_sin, WholeBits, Flat};
constexpr Function kCos{mpfr_cos, WholeBits, Flat};
constexpr Function kTan{mpfr_tan, WholeBits, Squared};
constexpr Function kArcSin{mpfr_asin, NearOne, SteepNearOne, true};
constexpr Function kArcCos{mpfr_acos, NearOne, SteepNearOne, true};
constexpr Function kArcTan{mpfr_atan, None, Inverse};
constexpr Function kHypSin{mpfr_sinh, WholeBits, AtLeastOne};
constexpr Function kHypCos{mpfr_cosh, WholeBits, LikeResult};
constexpr Function kHypTan{mpfr_tanh, None, Inverse};

bool IsBeyondOne(const Digits& digits) {
    Digits one;
    one.words[0] = 1ull << 56;
    one.exponent = 0;
    return CompareMagnitude(digits, one) > 0;
}

Errno Apply(const Function& function, const OCINumber& value, OCINumber* result) {
    Digits digits;
    if (const Errno error = Unpack(value, &digits)) return error;
    if (function.to_one && IsBeyondOne(digits)) return errors::kBadNumber;
    const Exponent extra = function.extra_bits(digits.IsZero() ? 0 : RoughExponent(digits) + 1);
    return Evaluate(
        [&](mpfr_prec_t precision, Real* real) {
            Real argument(precision + extra);
            ToReal(digits, &argument);
            function.compute(*real, argument, MPFR_RNDN);
            if (!argument.IsRegular() || !real->IsRegular()) return precision - 1;
            // |error of argument| <= 2^(x - bits), times the slope, against 2^(y - 1).
            const Exponent x = argument.Exponent(), y = real->Exponent();
            return std::min<mpfr_prec_t>(precision + extra - x - function.slope(x, y) + y - 1, precision) - 1;
        },
        result);
}

}  // namespace

Errno Exp(const OCINumber& value, OCINumber* result) noexcept { return Apply(kExp, value, result); }
Errno Sin(const OCINumber& value, OCINumber* result) noexcept { return Apply(kSin, value, result); }
Errno Cos(const OCINumber& value, OCINumber* result) noexcept { return Apply(kCos, value, result); }
Errno Tan(const OCINumber& value, OCINumber* result) noexcept { return Apply(kTan, value, result); }
Errno ArcSin(const OCINumber& value, OCINumber* result) noexcept { return Apply(kArcSin, value, result); }
Errno ArcCos(const OCINumber& value, OCINumber* result) noexcept { return Apply(kArcCos, value, result); }
Errno ArcTan(const OCINumber& value, OCINumber* result) noexcept { return Apply(kArcTan, value, result); }
Errno HypSin(const OCINumber& value, OCINumber* result) noexcept { return Apply(kHypSin, value, result); }
Errno HypCos(const OCINumber& value, OCINumber* result) noexcept { return Apply(kHypCos, value, result); }
Errno HypTan(const OCINumber& value, OCINumber* result) noexcept { return Apply(kHypTan, value, result); }

Errno ArcTan2(const OCINumber& y, const OCINumber& x, OCINumber* result) noexcept {
    Digits y_digits, x_digits;
    if (const Errno error = Unpack(y, &y_digits)) return error;
    if (const Errno error = Unpack(x, &x_digits)) return error;
    if (y_digits.IsZero() && x_digits.IsZero()) return errors::kBadNumber;
    return Evaluate(
        [&](mpfr_prec_t precision, Real* real) {
            Real y_real(precision + 2), x_real(precision + 2);
            ToReal(y_digits, &y_real);
            ToReal(x_digits, &x_real);
            mpfr_atan2(*real, y_real, x_real, MPFR_RNDN);
            return precision - 3;
        },
        result);
}

}  // namespace number
