// Binary floating point of up to 28 limbs, on the stack: what the functions without an exact decimal result are computed
// with. Each value carries its own precision, a result has the lesser one of its operands and is off by at most a few
// units of the last bit (of the larger operand's, where a sum cancels). Only functions of GMP that work on the caller's
// arrays are used, so nothing allocates, fails or keeps state.
#pragma once

#include <gmp.h>

#include <cstdint>
#include <cstring>

#include "number/digits.h"

namespace number {

static_assert(sizeof(mp_limb_t) == sizeof(std::uint64_t) && GMP_NAIL_BITS == 0);

class BigReal {
public:
    static constexpr int kMaxLimbs = 28;
    static constexpr int kLimbBits = 64;

    explicit BigReal(int limbs) : count_(limbs) {}  // 0
    BigReal(const BigReal& other) : BigReal(other.count_) { *this = other; }
    BigReal& operator=(const BigReal& other);

    // limbs x 2^scale as a whole number, the least significant limb first.
    static BigReal FromWhole(int precision, const mp_limb_t* limbs, mp_size_t size, long scale);
    static BigReal FromInteger(int precision, long value);
    static BigReal FromDouble(int precision, double value);  // finite
    static BigReal FromDigits(int precision, const Digits& digits);
    static BigReal HalfPi(int precision);
    static BigReal Ln2(int precision);

    [[nodiscard]] int Count() const { return count_; }
    [[nodiscard]] bool IsZero() const { return zero_; }
    [[nodiscard]] bool IsNegative() const { return negative_; }
    // For a value that is not 0: 2^(Exponent() - 1) <= |value| < 2^Exponent().
    [[nodiscard]] long Exponent() const { return exponent_; }
    [[nodiscard]] double ToDouble() const;  // to some 50 bits; the exponent must fit
    [[nodiscard]] const mp_limb_t* Limbs() const { return limbs_; }

    [[nodiscard]] BigReal WithLimbs(int precision) const;  // cut or filled up
    [[nodiscard]] BigReal Times2(long power) const;        // 2^power times the value
    [[nodiscard]] BigReal Negated() const { return WithSign(!negative_); }
    [[nodiscard]] BigReal Magnitude() const { return WithSign(false); }
    [[nodiscard]] BigReal SquareRoot() const;  // of a value that is not negative
    // The nearest whole number, and its remainder by 4 (0 to 3). Of a value that has bits behind the point.
    [[nodiscard]] BigReal Nearest(unsigned* quarter) const;

    // The bits behind the point of a value from 0 to below 1, in `Count()` limbs; and back.
    void ToFraction(mp_limb_t* fraction) const;
    static BigReal FromFraction(int precision, const mp_limb_t* fraction);

    friend BigReal operator+(const BigReal& a, const BigReal& b);
    friend BigReal operator-(const BigReal& a, const BigReal& b) { return a + b.Negated(); }
    friend BigReal operator*(const BigReal& a, const BigReal& b);
    friend BigReal operator/(const BigReal& a, const BigReal& b);  // b is not 0

private:
    [[nodiscard]] BigReal WithSign(bool negative) const;
    [[nodiscard]] const mp_limb_t* Top(int limbs) const { return limbs_ + count_ - limbs; }
    void Take(const mp_limb_t* limbs, mp_size_t size);
    static BigReal AddMagnitudes(const BigReal& larger, const BigReal& smaller, int count);
    static BigReal SubtractMagnitudes(const BigReal& larger, const BigReal& smaller, int count);

    int count_;
    bool zero_ = true;
    bool negative_ = false;
    long exponent_ = 0;            // value = 0.limbs x 2^exponent
    mp_limb_t limbs_[kMaxLimbs];   // the most significant last, its first bit set; nothing for 0
};

// The value rounded to a number's digits. `good_bits`: it is off by at most 1 in 2^good_bits of itself. False when that
// leaves the rounding open; with `tie` it is taken for half then, and goes up. The exponent is below 500 bits.
bool ToDigits(const BigReal& real, long good_bits, bool tie, Digits* digits);

}  // namespace number
