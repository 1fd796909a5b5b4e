// Scaling by powers of ten between numbers and MPFR's reals, and the decision on a rounding.
#include "number/binary.h"

#include <cmath>
#include <memory>
#include <vector>

#include "number/limbs.h"

namespace number {

namespace {

constexpr int kMostPower = 200;  // from the last digit of the smallest number to the units, and some more
constexpr int kFractionBits = 64;  // behind the last digit, when a rounding is decided
constexpr mpfr_prec_t kScaledPrecision = 216;  // 40 digits, the fraction and some more

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
    if (power >= 0) mpfr_mul(*to, from, PowerOfTen(power), rounding);
    else mpfr_div(*to, from, PowerOfTen(-power), rounding);
}

class Integer {
public:
    Integer() { mpz_init2(value_, 320); }
    ~Integer() { mpz_clear(value_); }
    Integer(const Integer&) = delete;
    Integer& operator=(const Integer&) = delete;
    operator mpz_ptr() { return value_; }

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
    constexpr mpfr_prec_t kDigitBits = 133;  // 100^20 < 2^133
    if (good_bits < kDigitBits + 12) return false;
    Real scaled(kScaledPrecision);
    Integer value;
    int exponent = EstimateExponent(real);
    for (;;) {
        // Toward zero, so that a wrong exponent shows as one, whatever is cut.
        Scale(real, 2 * (kMantissaDigits - 1 - exponent), MPFR_RNDZ, &scaled);
        mpfr_mul_2ui(scaled, scaled, kFractionBits, MPFR_RNDN);
        mpfr_get_z(value, scaled, MPFR_RNDZ);
        mpz_abs(value, value);
        const mp_size_t size = static_cast<mp_size_t>(mpz_size(value));
        // The fraction fills the lowest limb; above it stand 39 or 40 digits, if the exponent was right.
        mp_limb_t whole[4] = {};
        const mp_limb_t* limbs = mpz_limbs_read(value);
        for (mp_size_t i = 1; i < size && i <= 3; ++i) whole[i - 1] = limbs[i];
        const std::uint64_t fraction = size > 0 ? limbs[0] : 0;
        Digits found;
        const std::uint64_t low = mpn_divrem_1(whole, 0, whole, 3, kLimb);
        const std::uint64_t middle = mpn_divrem_1(whole, 0, whole, 3, kLimb);
        if (size > 4 || whole[1] != 0 || whole[0] >= 100'000'000) {
            ++exponent;
            continue;
        }
        if (whole[0] < 1'000'000) {
            --exponent;
            continue;
        }
        // 8 + 16 + 16 digits: moved to the front they fill the first 20 places.
        found.words[0] = WordOfLimb(whole[0] * 100'000'000 + middle / 100'000'000);
        found.words[1] = WordOfLimb(middle % 100'000'000 * 100'000'000 + low / 100'000'000);
        found.words[2] = WordOfLimb(low % 100'000'000 * 100'000'000);
        found.exponent = exponent;
        found.negative = mpfr_sgn(static_cast<mpfr_srcptr>(real)) < 0;
        constexpr std::uint64_t kHalf = 1ull << (kFractionBits - 1);
        const mpfr_prec_t doubt_bits = std::max<mpfr_prec_t>(kDigitBits + kFractionBits - good_bits, 0) + 2;
        const std::uint64_t distance = fraction < kHalf ? kHalf - fraction : fraction - kHalf;
        const bool certain = distance >> doubt_bits != 0;
        if (!certain && !tie) return false;
        if (certain ? fraction >= kHalf : tie) Increment(&found, kMantissaDigits - 1);
        *digits = found;
        return true;
    }
}

}  // namespace number
