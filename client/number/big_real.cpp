// Arithmetic on the limbs, the way from and to decimal digits, and the decision on a rounding.
#include "number/big_real.h"

#include <algorithm>
#include <bit>
#include <cmath>

#include "number/limbs.h"

namespace number {

namespace {

constexpr int kLimbBits = BigReal::kLimbBits;

// pi/2 / 2 and the natural logarithm of 2 as fractions, the least significant limb first.
constexpr mp_limb_t kHalfPi[BigReal::kMaxLimbs] = {
    0x3995497CEA956AE5u, 0xDE2BCBF695581718u, 0xB5C55DF06F4C52C9u, 0x9B2783A2EC07A28Fu,
    0xE39E772C180E8603u, 0x32905E462E36CE3Bu, 0xF1746C08CA18217Cu, 0x670C354E4ABC9804u,
    0x9ED529077096966Du, 0x1C62F356208552BBu, 0x83655D23DCA3AD96u, 0x69163FA8FD24CF5Fu,
    0x98DA48361C55D39Au, 0xC2007CB8A163BF05u, 0x49286651ECE45B3Du, 0xAE9F24117C4B1FE6u,
    0xEE386BFB5A899FA5u, 0x0BFF5CB6F406B7EDu, 0xF44C42E9A637ED6Bu, 0xE485B576625E7EC6u,
    0x4FE1356D6D51C245u, 0x302B0A6DF25F1437u, 0xEF9519B3CD3A431Bu, 0x514A08798E3404DDu,
    0x020BBEA63B139B22u, 0x29024E088A67CC74u, 0xC4C6628B80DC1CD1u, 0xC90FDAA22168C234u,
};
constexpr mp_limb_t kLn2[BigReal::kMaxLimbs] = {
    0x0C480A5417350D2Cu, 0x074DB6015CFE7AA3u, 0x6A9C7F8A5E148E82u, 0x25669B333564A337u,
    0x4C1A1E0BD1D6095Du, 0xCCCC4E659393514Cu, 0xC943E732B479CD33u, 0x17460775DB8990E5u,
    0x7D2E23DE1400B396u, 0xEE569D6DFC1EFA15u, 0x610D30F88FE551A2u, 0x07F4CA11FB5BFB90u,
    0xDA2D97C50F3FD5C6u, 0x655FA1872F20E3A2u, 0xF5DFA6BD38303248u, 0x72CE87B19D6548CAu,
    0x256FA0EC7657F74Bu, 0xB9EA9BC3B136603Bu, 0x1ACBDA11317C387Eu, 0x3E96CA16224AE8C5u,
    0x27573B291169B825u, 0xED2EAE35C1382144u, 0x559552FB4AFA1B10u, 0xE7B876206DEBAC98u,
    0x8A0D175B8BAAFA2Bu, 0x40F343267298B62Du, 0xC9E3B39803F2F6AFu, 0xB17217F7D1CF79ABu,
};

constexpr int kMostPower = 92;   // of 100, between the last digit of any number, or one just out of range, and the units
constexpr int kPowerLimbs = 7;   // of 25^92

// 25^i; 100^i is that and 2i bits.
struct Power {
    mp_limb_t limbs[kPowerLimbs];
    mp_size_t count;
};
struct Powers {
    Power rows[kMostPower + 1];
};
constexpr Powers MakePowers() {
    Powers powers{};
    powers.rows[0] = {{1}, 1};
    for (int i = 1; i <= kMostPower; ++i) {
        Power& power = powers.rows[i];
        power = powers.rows[i - 1];
        Wide carry = 0;
        for (mp_size_t limb = 0; limb < power.count; ++limb) {
            carry += Wide{power.limbs[limb]} * 25;
            power.limbs[limb] = static_cast<mp_limb_t>(carry);
            carry >>= kLimbBits;
        }
        if (carry) power.limbs[power.count++] = static_cast<mp_limb_t>(carry);
    }
    return powers;
}
constexpr Powers kPowers = MakePowers();

constexpr mp_size_t kMostScaled = BigReal::kMaxLimbs + 2 * kPowerLimbs + 4;

// A whole number with a binary exponent: what scaling by a power of 100 leaves.
struct WholeProduct {
    mp_limb_t limbs[kMostScaled];
    mp_size_t count = 0;
    long scale = 0;  // value = limbs x 2^scale

    void Trim() {
        while (count > 0 && limbs[count - 1] == 0) --count;
    }
};

// whole x 100^power; a quotient is cut to `precision` limbs or one more.
void ScaleBy100(const mp_limb_t* whole, mp_size_t size, int power, int precision, WholeProduct* result) {
    const Power& factor = kPowers.rows[power < 0 ? -power : power];
    result->scale = 2L * power;
    if (power >= 0) {
        if (size >= factor.count)
            mpn_mul(result->limbs, whole, size, factor.limbs, factor.count);
        else
            mpn_mul(result->limbs, factor.limbs, factor.count, whole, size);
        result->count = size + factor.count;
    } else {
        const mp_size_t zeros = std::max<mp_size_t>(precision + factor.count - size, 0);
        mp_limb_t dividend[kMostScaled] = {}, rest[kPowerLimbs];
        std::copy_n(whole, size, dividend + zeros);
        mpn_tdiv_qr(result->limbs, rest, 0, dividend, size + zeros, factor.limbs, factor.count);
        result->count = size + zeros - factor.count + 1;
        result->scale -= kLimbBits * zeros;
    }
    result->Trim();
}

// Takes 39 or 40 digits, which fill the first 20 places; false with the direction to go when they are more or fewer.
bool TakeWhole(const mp_limb_t* limbs, mp_size_t count, Digits* digits, int* step) {
    mp_limb_t whole[3] = {};
    std::copy_n(limbs, std::min<mp_size_t>(count, 3), whole);
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
long DistanceFromHalf(const mp_limb_t* fraction, mp_size_t count) {
    constexpr mp_limb_t kTop = mp_limb_t{1} << 63;
    const bool above = (fraction[count - 1] & kTop) != 0;
    for (mp_size_t i = count; i-- > 0;) {
        mp_limb_t limb = above ? fraction[i] : ~fraction[i];
        if (i == count - 1) limb &= ~kTop;
        if (limb != 0) return i * kLimbBits + static_cast<long>(std::bit_width(limb));
    }
    return 0;
}

// The power of 100 of the first digit; may be one off next to a power of 100.
int EstimateExponent(const BigReal& real) {
    constexpr double kLog100Of2 = 0.150514997831990598;
    const double mantissa = std::fabs(real.Times2(-real.Exponent()).ToDouble());
    return static_cast<int>(std::floor((static_cast<double>(real.Exponent()) + std::log2(mantissa)) * kLog100Of2));
}

}  // namespace

BigReal& BigReal::operator=(const BigReal& other) {
    count_ = other.count_;
    zero_ = other.zero_;
    negative_ = other.negative_;
    exponent_ = other.exponent_;
    if (!zero_) mpn_copyi(limbs_, other.limbs_, count_);
    return *this;
}

// Sets the magnitude to 0.limbs x 2^exponent_.
void BigReal::Take(const mp_limb_t* limbs, mp_size_t size) {
    for (; size > 0 && limbs[size - 1] == 0; --size) exponent_ -= kLimbBits;
    zero_ = size == 0;
    if (zero_) return;
    const int shift = std::countl_zero(limbs[size - 1]);
    exponent_ -= shift;
    const mp_size_t kept = std::min<mp_size_t>(size, count_), low = count_ - kept;
    const mp_limb_t* const from = limbs + size - kept;
    if (low > 0) mpn_zero(limbs_, low);
    if (shift == 0) {
        mpn_copyi(limbs_ + low, from, kept);
        return;
    }
    mpn_lshift(limbs_ + low, from, kept, static_cast<unsigned>(shift));
    if (size > kept) limbs_[0] |= from[-1] >> (kLimbBits - shift);
}

BigReal BigReal::FromWhole(int precision, const mp_limb_t* limbs, mp_size_t size, long scale) {
    BigReal result(precision);
    result.exponent_ = scale + kLimbBits * size;
    result.Take(limbs, size);
    return result;
}

BigReal BigReal::FromInteger(int precision, long value) {
    const mp_limb_t magnitude = value < 0 ? 0 - static_cast<mp_limb_t>(value) : static_cast<mp_limb_t>(value);
    return FromWhole(precision, &magnitude, 1, 0).WithSign(value < 0);
}

BigReal BigReal::FromDouble(int precision, double value) {
    constexpr int kBits = 53;
    int exponent = 0;
    const double mantissa = std::frexp(value, &exponent);
    return FromInteger(precision, static_cast<long>(std::ldexp(mantissa, kBits))).Times2(exponent - kBits);
}

BigReal BigReal::FromDigits(int precision, const Digits& digits) {
    mp_limb_t whole[3];
    const Wide high = Wide{LimbOfWord(digits.words[0])} * kLimb + LimbOfWord(digits.words[1]);
    constexpr std::uint64_t kHalfLimb = 100'000'000;
    const Wide low = Wide{static_cast<std::uint64_t>(high)} * kHalfLimb + LimbOfWord(digits.words[2]) / kHalfLimb;
    const Wide rest = (high >> kLimbBits) * kHalfLimb + (low >> kLimbBits);
    whole[0] = static_cast<mp_limb_t>(low);
    whole[1] = static_cast<mp_limb_t>(rest);
    whole[2] = static_cast<mp_limb_t>(rest >> kLimbBits);
    if (digits.IsZero()) return BigReal(precision);
    WholeProduct scaled;
    ScaleBy100(whole, 3, digits.exponent - (kMantissaDigits - 1), precision, &scaled);
    return FromWhole(precision, scaled.limbs, scaled.count, scaled.scale).WithSign(digits.negative);
}

BigReal BigReal::HalfPi(int precision) {
    return FromWhole(precision, kHalfPi + kMaxLimbs - precision, precision, 1 - kLimbBits * precision);
}

BigReal BigReal::Ln2(int precision) {
    return FromWhole(precision, kLn2 + kMaxLimbs - precision, precision, -kLimbBits * precision);
}

double BigReal::ToDouble() const {
    if (zero_) return 0;
    const double mantissa = std::ldexp(static_cast<double>(limbs_[count_ - 1]), -kLimbBits);
    return std::ldexp(negative_ ? -mantissa : mantissa, static_cast<int>(exponent_));
}

BigReal BigReal::WithLimbs(int precision) const {
    if (zero_) return BigReal(precision);
    return FromWhole(precision, limbs_, count_, exponent_ - kLimbBits * count_).WithSign(negative_);
}

BigReal BigReal::Times2(long power) const {
    BigReal result(*this);
    result.exponent_ += power;
    return result;
}

BigReal BigReal::WithSign(bool negative) const {
    BigReal result(*this);
    result.negative_ = negative && !zero_;
    return result;
}

BigReal BigReal::SquareRoot() const {
    if (zero_) return *this;
    // Twice the limbs, moved so that the exponent is even.
    mp_limb_t square[2 * kMaxLimbs] = {};
    const long odd = exponent_ & 1;
    if (odd)
        square[count_ - 1] = mpn_rshift(square + count_, limbs_, count_, 1);
    else
        mpn_copyi(square + count_, limbs_, count_);
    mp_limb_t root[kMaxLimbs];
    mpn_sqrtrem(root, nullptr, square, 2 * count_);
    return FromWhole(count_, root, count_, (exponent_ + odd) / 2 - kLimbBits * count_);
}

BigReal BigReal::Nearest(unsigned* quarter) const {
    *quarter = 0;
    BigReal result(count_);
    if (zero_ || exponent_ < 0) return result;
    const long behind = kLimbBits * count_ - exponent_;  // bits behind the point
    // Half is added at the first bit behind the point, then those bits are cleared.
    mp_limb_t limbs[kMaxLimbs + 1];
    const auto place = static_cast<unsigned>(behind - 1);
    limbs[count_] = 0;
    mpn_copyi(limbs, limbs_, count_);
    const mp_size_t limb = place / kLimbBits;
    limbs[count_] = mpn_add_1(limbs + limb, limbs_ + limb, count_ - limb, mp_limb_t{1} << (place % kLimbBits));
    const mp_size_t units = behind / kLimbBits;
    const auto bit = static_cast<unsigned>(behind % kLimbBits);
    mpn_zero(limbs, units);
    limbs[units] = limbs[units] >> bit << bit;
    mp_limb_t low = limbs[units] >> bit;
    if (bit == kLimbBits - 1) low |= limbs[units + 1] << 1;
    *quarter = static_cast<unsigned>(low & 3);
    if (negative_) *quarter = (4 - *quarter) & 3;
    return FromWhole(count_, limbs, count_ + 1, exponent_ - kLimbBits * count_).WithSign(negative_);
}

void BigReal::ToFraction(mp_limb_t* fraction) const {
    mpn_zero(fraction, count_);
    const auto down = static_cast<unsigned long>(-exponent_);
    const auto skipped = static_cast<mp_size_t>(down / kLimbBits);
    if (zero_ || skipped >= count_) return;
    const auto bits = static_cast<unsigned>(down % kLimbBits);
    if (bits == 0)
        mpn_copyi(fraction, limbs_ + skipped, count_ - skipped);
    else
        mpn_rshift(fraction, limbs_ + skipped, count_ - skipped, bits);
}

BigReal BigReal::FromFraction(int precision, const mp_limb_t* fraction) {
    return FromWhole(precision, fraction, precision, -kLimbBits * precision);
}

BigReal BigReal::AddMagnitudes(const BigReal& larger, const BigReal& smaller, int count) {
    mp_limb_t sum[kMaxLimbs + 1];
    BigReal shifted(count);
    shifted = smaller.WithLimbs(count).Times2(-larger.exponent_);
    shifted.ToFraction(sum);
    sum[count] = mpn_add_n(sum, larger.Top(count), sum, count);
    return FromWhole(count, sum, count + 1, larger.exponent_ - kLimbBits * count).WithSign(larger.negative_);
}

BigReal BigReal::SubtractMagnitudes(const BigReal& larger, const BigReal& smaller, int count) {
    mp_limb_t difference[kMaxLimbs];
    BigReal shifted(count);
    shifted = smaller.WithLimbs(count).Times2(-larger.exponent_);
    shifted.ToFraction(difference);
    mpn_sub_n(difference, larger.Top(count), difference, count);
    return FromWhole(count, difference, count, larger.exponent_ - kLimbBits * count).WithSign(larger.negative_);
}

BigReal operator+(const BigReal& a, const BigReal& b) {
    const int count = std::min(a.count_, b.count_);
    if (b.zero_) return a.WithLimbs(count);
    if (a.zero_) return b.WithLimbs(count);
    const bool a_larger =
        a.exponent_ != b.exponent_ ? a.exponent_ > b.exponent_ : mpn_cmp(a.Top(count), b.Top(count), count) >= 0;
    const BigReal &larger = a_larger ? a : b, &smaller = a_larger ? b : a;
    return a.negative_ == b.negative_ ? BigReal::AddMagnitudes(larger, smaller, count)
                                      : BigReal::SubtractMagnitudes(larger, smaller, count);
}

BigReal operator*(const BigReal& a, const BigReal& b) {
    const int count = std::min(a.count_, b.count_);
    if (a.zero_ || b.zero_) return BigReal(count);
    mp_limb_t product[2 * BigReal::kMaxLimbs];
    mpn_mul_n(product, a.Top(count), b.Top(count), count);
    BigReal result(count);
    result.exponent_ = a.exponent_ + b.exponent_;
    result.negative_ = a.negative_ != b.negative_;
    result.Take(product, 2 * count);
    return result;
}

BigReal operator/(const BigReal& a, const BigReal& b) {
    const int count = std::min(a.count_, b.count_);
    if (a.zero_) return BigReal(count);
    mp_limb_t dividend[2 * BigReal::kMaxLimbs] = {};
    mp_limb_t quotient[BigReal::kMaxLimbs + 1], rest[BigReal::kMaxLimbs];
    mpn_copyi(dividend + count, a.Top(count), count);
    mpn_tdiv_qr(quotient, rest, 0, dividend, 2 * count, b.Top(count), count);
    BigReal result(count);
    result.exponent_ = a.exponent_ - b.exponent_ + BigReal::kLimbBits;
    result.negative_ = a.negative_ != b.negative_;
    result.Take(quotient, count + 1);
    return result;
}

bool ToDigits(const BigReal& real, long good_bits, bool tie, Digits* digits) {
    constexpr long kDigitBits = 133;  // 100^20 < 2^133
    if (good_bits < kDigitBits + 12) return false;
    Digits found;
    WholeProduct scaled;
    mp_limb_t* const value = scaled.limbs;
    mp_size_t fraction_limbs = 0;
    found.negative = real.IsNegative();
    found.exponent = EstimateExponent(real);
    for (int step = 1; step != 0; found.exponent += step) {
        // Toward zero, so that a wrong exponent shows as one, whatever is cut.
        ScaleBy100(real.Limbs(), real.Count(), kMantissaDigits - 1 - found.exponent, real.Count(), &scaled);
        scaled.scale += real.Exponent() - kLimbBits * real.Count();
        // The point between two limbs.
        if (const auto behind = static_cast<unsigned long>(-scaled.scale) % kLimbBits) {
            value[scaled.count] = mpn_lshift(value, value, scaled.count, static_cast<unsigned>(kLimbBits - behind));
            ++scaled.count;
            scaled.scale -= static_cast<long>(kLimbBits - behind);
            scaled.Trim();
        }
        fraction_limbs = -scaled.scale / kLimbBits;
        TakeWhole(value + fraction_limbs, scaled.count - fraction_limbs, &found, &step);
    }
    const long doubt_bits = std::max<long>(kDigitBits + kLimbBits * fraction_limbs - good_bits, 0) + 3;
    const bool certain = DistanceFromHalf(value, fraction_limbs) > doubt_bits;
    if (!certain && !tie) return false;
    const bool above_half = value[fraction_limbs - 1] >> 63 != 0;
    if (above_half || !certain) Increment(&found, kMantissaDigits - 1);
    *digits = found;
    return true;
}

}  // namespace number
