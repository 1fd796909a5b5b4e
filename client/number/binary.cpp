// Scaling by powers of ten between numbers and MPFR's reals, and the decision on a rounding.
#include "number/binary.h"

#include <cmath>
#include <memory>
#include <vector>

#include "number/limbs.h"

namespace number {

namespace {

constexpr int kMostPower = 200;          // from the last digit of the smallest number to the units, and some more
constexpr mpfr_prec_t kDigitBits = 133;  // 100^20 < 2^133

// 10^i, exact; made once and only read afterwards.
const Real& PowerOfTen(int i) {
    static const std::vector<std::unique_ptr<Real>> powers = [] {
        std::vector<std::unique_ptr<Real>> made;
        for (int power = 0; power <= kMostPower; ++power) {
            made.push_back(std::make_unique<Real>(power * 7 / 3 + 8));  // log2(5) bits a power
            mpfr_ui_pow_ui(*made.back(), 10, static_cast<unsigned long>(power), MPFR_RNDN);
        }
        return made;
    }();
    return *powers[static_cast<std::size_t>(i)];
}

// *to = from * 10^power
void Scale(const Real& from, int power, mpfr_rnd_t rounding, Real* to) {
    if (power >= 0)
        mpfr_mul(*to, from, PowerOfTen(power), rounding);
    else
        mpfr_div(*to, from, PowerOfTen(-power), rounding);
}

class Integer {
public:
    explicit Integer(mp_size_t limbs) { mpz_init2(value_, static_cast<mp_bitcnt_t>(limbs) * 64); }
    ~Integer() { mpz_clear(value_); }
    Integer(const Integer&) = delete;
    Integer& operator=(const Integer&) = delete;
    operator mpz_ptr() { return value_; }
    [[nodiscard]] const mp_limb_t* Limbs() const { return mpz_limbs_read(value_); }
    [[nodiscard]] mp_size_t Count() const { return static_cast<mp_size_t>(mpz_size(value_)); }

private:
    mpz_t value_;
};

// MPFR keeps constants like pi for each thread; they go when the thread does.
struct ThreadCaches {
    ~ThreadCaches() { mpfr_free_cache2(MPFR_FREE_LOCAL_CACHE); }
};
void FreeCachesAtThreadEnd() {
    thread_local const ThreadCaches caches;
    static_cast<void>(&caches);
}

// The power of 100 of the first digit; may be one off next to a power of 100.
int EstimateExponent(const Real& real) {
    long binary = 0;
    const double mantissa = mpfr_get_d_2exp(&binary, real, MPFR_RNDZ);
    constexpr double kLog100Of2 = 0.150514997831990598;
    return static_cast<int>(std::floor((static_cast<double>(binary) + std::log2(std::fabs(mantissa))) * kLog100Of2));
}

// Takes 39 or 40 digits, which fill the first 20 places; false with the direction to go when they are more or fewer.
bool TakeWhole(const mp_limb_t* limbs, mp_size_t count, Digits* digits, int* step) {
    mp_limb_t whole[3] = {};
    for (mp_size_t i = 0; i < count && i < 3; ++i) whole[i] = limbs[i];
    const std::uint64_t low = mpn_divrem_1(whole, 0, whole, 3, kLimb);
    const std::uint64_t middle = mpn_divrem_1(whole, 0, whole, 3, kLimb);
    constexpr std::uint64_t kHalfLimb = 100'000'000;
    *step = count > 3 || whole[1] != 0 || whole[0] >= kHalfLimb ? 1 : whole[0] < kHalfLimb / 100 ? -1 : 0;
    if (*step != 0) return false;
    digits->words[0] = WordOfLimb(whole[0] * kHalfLimb + middle / kHalfLimb);
    digits->words[1] = WordOfLimb(middle % kHalfLimb * kHalfLimb + low / kHalfLimb);
    digits->words[2] = WordOfLimb(low % kHalfLimb * kHalfLimb);
    return true;
}

// How many bits the distance of a binary fraction from one half has.
mpfr_prec_t DistanceFromHalf(const mp_limb_t* fraction, mp_size_t count) {
    constexpr mp_limb_t kTop = mp_limb_t{1} << 63;
    const bool above = (fraction[count - 1] & kTop) != 0;
    for (mp_size_t i = count; i-- > 0;) {
        mp_limb_t limb = above ? fraction[i] : ~fraction[i];
        if (i == count - 1) limb &= ~kTop;
        if (limb != 0) return i * 64 + static_cast<mpfr_prec_t>(std::bit_width(limb));
    }
    return 0;
}

}  // namespace

void ToReal(const Digits& digits, Real* real) {
    FreeCachesAtThreadEnd();
    if (digits.IsZero()) {
        mpfr_set_zero(*real, 1);
        return;
    }
    Real whole(144);
    mpfr_set_ui(whole, LimbOfWord(digits.words[0]), MPFR_RNDN);
    mpfr_mul_ui(whole, whole, kLimb, MPFR_RNDN);
    mpfr_add_ui(whole, whole, LimbOfWord(digits.words[1]), MPFR_RNDN);
    if (const std::uint64_t low = LimbOfWord(digits.words[2])) {
        mpfr_mul_ui(whole, whole, 100'000'000, MPFR_RNDN);
        mpfr_add_ui(whole, whole, low / 100'000'000, MPFR_RNDN);
        Scale(whole, 2 * (digits.exponent + 1 - kMantissaDigits), MPFR_RNDN, real);
    } else {
        Scale(whole, 2 * (digits.exponent + 1 - 2 * kDigitsPerLimb), MPFR_RNDN, real);
    }
    if (digits.negative) mpfr_neg(*real, *real, MPFR_RNDN);
}

mpfr_exp_t RoughExponent(const Digits& digits) {
    constexpr double kLog2Of100 = 6.643856189774724;
    const double leading = std::log2(static_cast<double>(DigitAt(digits, 0) * 100 + DigitAt(digits, 1)) / 100);
    return static_cast<mpfr_exp_t>(std::floor(digits.exponent * kLog2Of100 + leading)) + 1;
}

bool ToDigits(const Real& real, mpfr_prec_t good_bits, bool tie, Digits* digits) {
    if (good_bits < kDigitBits + 12) return false;
    const mp_size_t fraction_limbs = std::max<mpfr_prec_t>((good_bits - kDigitBits) / 64, 1);
    const mpfr_prec_t fraction_bits = 64 * fraction_limbs;
    Real scaled(kDigitBits + fraction_bits + 16);
    Integer value(fraction_limbs + 4);
    Digits found;
    found.negative = mpfr_signbit(static_cast<mpfr_srcptr>(real)) != 0;
    found.exponent = EstimateExponent(real);
    for (int step = 1; step != 0; found.exponent += step) {
        // Toward zero, so that a wrong exponent shows as one, whatever is cut.
        Scale(real, 2 * (kMantissaDigits - 1 - found.exponent), MPFR_RNDZ, &scaled);
        mpfr_mul_2si(scaled, scaled, fraction_bits, MPFR_RNDZ);
        mpfr_get_z(value, scaled, MPFR_RNDZ);
        TakeWhole(value.Limbs() + fraction_limbs, value.Count() - fraction_limbs, &found, &step);
    }
    const mpfr_prec_t doubt_bits = std::max<mpfr_prec_t>(kDigitBits + fraction_bits - good_bits, 0) + 3;
    const bool certain = DistanceFromHalf(value.Limbs(), fraction_limbs) > doubt_bits;
    if (!certain && !tie) return false;
    const bool above_half = value.Limbs()[fraction_limbs - 1] >> 63 != 0;
    if (above_half || !certain) Increment(&found, kMantissaDigits - 1);
    *digits = found;
    return true;
}

}  // namespace number
