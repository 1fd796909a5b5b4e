// Square root and remainder, on whole binary numbers: exact, by the functions of GMP that work on the caller's arrays.
#include <gmp.h>

#include "handles/errors.h"
#include "number/digits.h"
#include "number/limbs.h"
#include "number/number.h"

namespace number {

namespace {

static_assert(sizeof(mp_limb_t) == sizeof(std::uint64_t) && GMP_NAIL_BITS == 0);

// A whole number of at most 20 + 127 base-100 digits: the span between the largest and the smallest operand.
class Whole {
public:
    Whole() = default;

    // The 20 digits of a mantissa.
    explicit Whole(const Digits& digits) {
        Append(kLimb, LimbOfWord(digits.words[0]));
        Append(kLimb, LimbOfWord(digits.words[1]));
        Append(100'000'000, LimbOfWord(digits.words[2]) / 100'000'000);
    }

    // Multiplies by 100^count.
    void Scale(int count) {
        for (; count >= kDigitsPerLimb; count -= kDigitsPerLimb) Append(kLimb, 0);
        for (; count > 0; --count) Append(100, 0);
    }

    [[nodiscard]] Whole Root() const {
        Whole root;
        root.count_ = (count_ + 1) / 2;
        mpn_sqrtrem(root.limbs_, nullptr, limbs_, count_);
        return root;
    }

    // What a division by `divisor`, which is not 0 and not larger, leaves.
    [[nodiscard]] Whole Rest(const Whole& divisor) const {
        Whole rest;
        mp_limb_t quotient[kMaxLimbs];
        rest.count_ = divisor.count_;
        mpn_tdiv_qr(quotient, rest.limbs_, 0, limbs_, count_, divisor.limbs_, divisor.count_);
        rest.Trim();
        return rest;
    }

    // The digits of a value below 100^24 whose last digit has the weight 100^weight.
    [[nodiscard]] Digits TakeDigits(int weight) {
        Digits digits;
        for (int word = 2; word >= 0 && count_ > 0; --word) {
            digits.words[word] = WordOfLimb(mpn_divrem_1(limbs_, 0, limbs_, count_, kLimb));
            Trim();
        }
        digits.exponent = weight + kUnpackedDigits - 1;
        Normalize(&digits);
        return digits;
    }

private:
    static constexpr mp_size_t kMaxLimbs = 20;

    // *this * factor + low
    void Append(std::uint64_t factor, std::uint64_t low) {
        if (count_ == 0) {
            limbs_[0] = low;
            count_ = 1;
            return;
        }
        const mp_limb_t carry = mpn_mul_1(limbs_, limbs_, count_, factor) + mpn_add_1(limbs_, limbs_, count_, low);
        if (carry) limbs_[count_++] = carry;
    }
    void Trim() {
        while (count_ > 0 && limbs_[count_ - 1] == 0) --count_;
    }

    mp_limb_t limbs_[kMaxLimbs];
    mp_size_t count_ = 0;
};

}  // namespace

Errno Sqrt(const OCINumber& value, OCINumber* result) noexcept {
    Digits digits;
    if (const Errno error = Unpack(value, &digits)) return error;
    if (digits.IsZero()) return Pack(digits, result);
    if (digits.negative) return errors::kBadNumber;
    // Scaled so that the weight of the last digit is even and the root has the 21 digits that rounding needs.
    const int weight = digits.exponent - (kMantissaDigits - 1);
    const int scale = kMantissaDigits + 2 + (weight % 2 != 0);
    Whole whole(digits);
    whole.Scale(scale);
    Digits root = whole.Root().TakeDigits((weight - scale) / 2);
    return RoundAndPack(&root, result);
}

Errno Mod(const OCINumber& left, const OCINumber& right, OCINumber* result) noexcept {
    Digits a, b;
    if (const Errno error = Unpack(left, &a)) return error;
    if (const Errno error = Unpack(right, &b)) return error;
    if (b.IsZero()) return errors::kDividedByZero;
    if (CompareMagnitude(a, b) < 0) return Pack(a, result);
    Whole dividend(a);
    dividend.Scale(a.exponent - b.exponent);
    Digits rest = dividend.Rest(Whole(b)).TakeDigits(b.exponent - (kMantissaDigits - 1));
    rest.negative = a.negative;
    return Pack(rest, result);
}

}  // namespace number
