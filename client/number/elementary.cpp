// Each function brings its argument near to 0, sums a power series there in fixed point, and leads the sum back. The
// machine's own functions give the first 50 bits where an inverse is wanted; a series gives what is missing.
#include "number/elementary.h"

#include <bit>
#include <cmath>

namespace number {

namespace {

using Limbs = mp_limb_t[BigReal::kMaxLimbs];

constexpr long kNear = -8;  // arguments below 2^-8 go straight to a series

// A power series in x: the ratio of each term to the one before is x times multiplier(j) / divisor(j), from j = 1.
struct Series {
    mp_limb_t (*multiplier)(mp_limb_t j);  // null: 1
    mp_limb_t (*divisor)(mp_limb_t j);
    bool alternates;
};
constexpr Series kExponential{nullptr, [](mp_limb_t j) { return j; }, false};
constexpr Series kSine{nullptr, [](mp_limb_t j) { return 2 * j * (2 * j + 1); }, true};
constexpr Series kHyperbolicSine{nullptr, [](mp_limb_t j) { return 2 * j * (2 * j + 1); }, false};
constexpr Series kVersine{nullptr, [](mp_limb_t j) { return (2 * j - 1) * 2 * j; }, true};
constexpr Series kArcTangent{[](mp_limb_t j) { return 2 * j - 1; }, [](mp_limb_t j) { return 2 * j + 1; }, true};
constexpr Series kAreaTangent{[](mp_limb_t j) { return 2 * j - 1; }, [](mp_limb_t j) { return 2 * j + 1; }, false};

// The high half of a product of fractions.
void Multiply(const mp_limb_t* a, const mp_limb_t* b, mp_size_t count, mp_limb_t* product) {
    mp_limb_t whole[2 * BigReal::kMaxLimbs];
    mpn_mul_n(whole, a, b, count);
    mpn_copyi(product, whole + count, count);
}
void Square(const mp_limb_t* a, mp_size_t count, mp_limb_t* square) {
    mp_limb_t whole[2 * BigReal::kMaxLimbs];
    mpn_sqr(whole, a, count);
    mpn_copyi(square, whole + count, count);
}

// How many terms are above the last bit of x, a fraction below one half.
mp_limb_t CountTerms(const Series& series, const mp_limb_t* x, mp_size_t count) {
    mp_size_t top = count;
    while (top > 0 && x[top - 1] == 0) --top;
    if (top == 0) return 0;
    const long zeros = (count - top) * BigReal::kLimbBits + std::countl_zero(x[top - 1]);
    mp_limb_t terms = 0;
    for (long bits = 0; bits < count * BigReal::kLimbBits;) {
        ++terms;
        bits += zeros + (series.multiplier ? 0 : static_cast<long>(std::bit_width(series.divisor(terms))) - 1);
    }
    return terms;
}

// The sum of all terms but the first, which is 1, as the fraction that is added to it or, in a series that alternates,
// taken from it: from the last, sum = x * multiplier / divisor * (1 +- sum).
void Sum(const Series& series, const mp_limb_t* x, mp_size_t count, mp_limb_t* sum) {
    mpn_zero(sum, count);
    for (mp_limb_t j = CountTerms(series, x, count); j > 0; --j) {
        Limbs next;
        Multiply(x, sum, count, next);
        if (series.alternates)
            mpn_sub_n(next, x, next, count);
        else
            mpn_add_n(next, x, next, count);
        if (series.multiplier) mpn_mul_1(next, next, count, series.multiplier(j));
        mpn_divrem_1(sum, 0, next, count, series.divisor(j));
    }
}

// 1 + fraction
BigReal OneAnd(const mp_limb_t* fraction, int count) {
    mp_limb_t limbs[BigReal::kMaxLimbs + 1];
    mpn_copyi(limbs, fraction, count);
    limbs[count] = 1;
    return BigReal::FromWhole(count, limbs, count + 1, -BigReal::kLimbBits * count);
}

// 1 - fraction
BigReal OneLess(const mp_limb_t* fraction, int count) {
    mp_limb_t limbs[BigReal::kMaxLimbs];
    const mp_limb_t below_one = mpn_neg(limbs, fraction, count);
    return below_one ? BigReal::FromFraction(count, limbs) : BigReal::FromInteger(count, 1);
}

// x times the sum of a series in the square of x, which is below 2^-8.
BigReal OddSeries(const Series& series, const BigReal& x) {
    const int count = x.Count();
    Limbs square, sum;
    (x * x).ToFraction(square);
    Sum(series, square, count, sum);
    return x * (series.alternates ? OneLess(sum, count) : OneAnd(sum, count));
}

}  // namespace

// x = k ln 2 + r; the series of r / 2^halvings is squared so many times. All sums stay below 1 since e^r is below 2.
BigReal Exponential(const BigReal& x) {
    const int count = x.Count();
    if (x.IsZero()) return BigReal::FromInteger(count, 1);
    const BigReal ln2 = BigReal::Ln2(count);
    constexpr double kLn2 = 0.693147180559945309;
    auto k = static_cast<long>(std::floor(x.ToDouble() / kLn2));
    BigReal rest = x - ln2 * BigReal::FromInteger(count, k);
    if (rest.IsNegative()) {
        rest = rest + ln2;
        --k;
    } else if (!(rest - ln2).IsNegative()) {
        rest = rest - ln2;
        ++k;
    }
    const int halvings = 9 + count;
    Limbs fraction, sum, square;
    rest.Times2(-halvings).ToFraction(fraction);
    Sum(kExponential, fraction, count, sum);
    for (int i = 0; i < halvings; ++i) {  // (1 + s)^2 = 1 + 2s + s^2
        Square(sum, count, square);
        mpn_lshift(sum, sum, count, 1);
        mpn_add_n(sum, sum, square, count);
    }
    return OneAnd(sum, count).Times2(k);
}

BigReal HyperbolicSine(const BigReal& x) {
    if (x.IsZero() || x.Exponent() < kNear) return OddSeries(kHyperbolicSine, x);
    const BigReal power = Exponential(x);
    return (power - BigReal::FromInteger(x.Count(), 1) / power).Times2(-1);
}

// Twice the area tangent of x / (2 + x).
BigReal LogarithmNextToOne(const BigReal& x) {
    return OddSeries(kAreaTangent, x / (BigReal::FromInteger(x.Count(), 2) + x)).Times2(1);
}

// y = m 2^k with m next to 1, and log m = a + log(m / e^a) for the machine's logarithm a of m.
BigReal Logarithm(const BigReal& y) {
    constexpr double kRootOfHalf = 0.70710678118654752;
    const int count = y.Count();
    long k = y.Exponent();
    BigReal m = y.Times2(-k);
    if (m.ToDouble() < kRootOfHalf) {
        m = m.Times2(1);
        --k;
    }
    const BigReal near = BigReal::FromDouble(count, std::log(m.ToDouble()));
    const BigReal power = Exponential(near);
    const BigReal missing = OddSeries(kAreaTangent, (m - power) / (m + power)).Times2(1);
    return BigReal::Ln2(count) * BigReal::FromInteger(count, k) + (near + missing);
}

// The versine 1 - cos of x / 2^halvings, doubled so many times by 1 - cos 2x = 4v - 2v^2; sin^2 = 2v - v^2.
Angle SineAndCosine(const BigReal& x) {
    const int count = x.Count();
    if (x.IsZero()) return {x, BigReal::FromInteger(count, 1)};
    const long halvings = std::max(x.Exponent() - kNear, 0L);
    const BigReal small = x.Times2(-halvings);
    Limbs fraction, versine, square;
    (small * small).ToFraction(fraction);
    Sum(kVersine, fraction, count, versine);
    for (long i = 0; i < halvings; ++i) {
        Square(versine, count, square);
        mpn_lshift(versine, versine, count, 1);
        mpn_sub_n(versine, versine, square, count);
        mpn_lshift(versine, versine, count, 1);
    }
    BigReal cosine = OneLess(versine, count);
    if (halvings == 0) return {OddSeries(kSine, x), cosine};
    Square(versine, count, square);
    mpn_lshift(versine, versine, count, 1);
    mpn_sub_n(versine, versine, square, count);
    return {BigReal::FromFraction(count, versine).SquareRoot(), cosine};
}

// From 0 to 1: atan x = a + atan((x cos a - sin a) / (cos a + x sin a)) for the machine's arc tangent a.
static BigReal ArcTangentToOne(const BigReal& x) {
    if (x.IsZero() || x.Exponent() < kNear) return OddSeries(kArcTangent, x);
    const BigReal near = BigReal::FromDouble(x.Count(), std::atan(x.ToDouble()));
    const Angle angle = SineAndCosine(near);
    return near + OddSeries(kArcTangent, (x * angle.cosine - angle.sine) / (angle.cosine + x * angle.sine));
}

BigReal ArcTangent(const BigReal& x) {
    if (x.IsZero() || x.Exponent() <= 0) return ArcTangentToOne(x);
    return BigReal::HalfPi(x.Count()) - ArcTangentToOne(BigReal::FromInteger(x.Count(), 1) / x);
}

}  // namespace number
