// Multiplication on limbs of 16 digits, most significant first; division on binary words, limb by limb of the quotient.
#include "handles/errors.h"
#include "number/digits.h"
#include "number/limbs.h"
#include "number/number.h"

namespace number {

namespace {

// The columns of a product, from the highest.
struct Product {
    Wide columns[5];

    Product(const std::uint64_t (&a)[3], const std::uint64_t (&b)[3]) {
        const std::uint64_t a0 = LimbOfWord(a[0]), a1 = LimbOfWord(a[1]), a2 = LimbOfWord(a[2]);
        const std::uint64_t b0 = LimbOfWord(b[0]), b1 = LimbOfWord(b[1]), b2 = LimbOfWord(b[2]);
        columns[0] = Wide{a0} * b0;
        columns[1] = Wide{a0} * b1 + Wide{a1} * b0;
        columns[2] = Wide{a0} * b2 + Wide{a1} * b1 + Wide{a2} * b0;
        columns[3] = Wide{a1} * b2 + Wide{a2} * b1;
        columns[4] = Wide{a2} * b2;
    }

    // The first 24 digits, given what the lower columns carry into the second.
    void Digits24(std::uint64_t carry, std::uint64_t (&words)[3]) const {
        std::uint64_t high, low;
        const Wide column = columns[0] + DivideByLimb(columns[1] + carry, &low);
        words[0] = WordOfLimb(DivideByLimb(column, &high));
        words[1] = WordOfLimb(high);
        words[2] = WordOfLimb(low);
    }

    [[nodiscard]] std::uint64_t ExactCarry() const {
        std::uint64_t rest;
        const Wide column = columns[3] + DivideByLimb(columns[4], &rest);
        return DivideByLimb(columns[2] + DivideByLimb(column, &rest), &rest);
    }

    // At most two too small.
    [[nodiscard]] std::uint64_t EstimatedCarry() const {
        return EstimateQuotient(columns[2] + EstimateQuotient(columns[3]));
    }
};

// The first digits of a product whose value is 0.words x 100^(exponent + 1): 22 right ones, which rounding needs,
// of 24.
void MultiplyMantissas(const std::uint64_t (&a)[3], const std::uint64_t (&b)[3], std::uint64_t (&words)[3]) {
    const Product product(a, b);
    product.Digits24(product.EstimatedCarry(), words);
    const bool may_carry = (words[2] & 0xFF00) == 99 << 8 && (words[2] & 0xFF) >= 98;
    if (may_carry) product.Digits24(product.ExactCarry(), words);
}

// A mantissa as a binary number of three words, the least significant first.
struct Binary {
    std::uint64_t words[3];

    explicit Binary(const std::uint64_t (&digits)[3]) {
        constexpr std::uint64_t kHalfLimb = 100'000'000;
        const Wide high = Wide{LimbOfWord(digits[0])} * kLimb + LimbOfWord(digits[1]);
        const Wide low = Wide{static_cast<std::uint64_t>(high)} * kHalfLimb + LimbOfWord(digits[2]) / kHalfLimb;
        const Wide rest = (high >> 64) * kHalfLimb + (low >> 64);
        words[0] = static_cast<std::uint64_t>(low);
        words[1] = static_cast<std::uint64_t>(rest);
        words[2] = static_cast<std::uint64_t>(rest >> 64);
    }
};

// Divides by a mantissa limb by limb. Divisor and rest are shifted until the divisor's first bit is set, and a
// reciprocal of its first word gives each quotient limb at most two too large.
class Divider {
public:
    Divider(const Binary& dividend, const Binary& divisor) {
        const auto* v = divisor.words;
        shift_ = v[2] != 0 ? std::countl_zero(v[2]) : 64 + std::countl_zero(v[1]);
        Shift(divisor, &divisor_[0]);
        Shift(dividend, &rest_[0]);
        reciprocal_ = static_cast<std::uint64_t>((Wide{~divisor_[2]} << 64 | ~0ull) / divisor_[2]);
    }

    // The quotient of the rest, below 10^16; what is left is the rest from then on.
    std::uint64_t Quotient() {
        std::uint64_t quotient = Estimate(rest_[3], rest_[2]);
        Wide product = 0, difference = 0;
        std::uint64_t borrow = 0;
        for (int i = 0; i < 3; ++i) {
            product = Wide{quotient} * divisor_[i] + (product >> 64);
            difference = Wide{rest_[i]} - static_cast<std::uint64_t>(product) - borrow;
            rest_[i] = static_cast<std::uint64_t>(difference);
            borrow = static_cast<std::uint64_t>(difference >> 64) & 1;
        }
        rest_[3] -= static_cast<std::uint64_t>(product >> 64) + borrow;
        for (; rest_[3] != 0; --quotient) AddBack();
        return quotient;
    }

    std::uint64_t NextLimb() {
        Wide product = 0;
        for (int i = 0; i < 3; ++i) {
            product = Wide{rest_[i]} * kLimb + (product >> 64);
            rest_[i] = static_cast<std::uint64_t>(product);
        }
        rest_[3] = static_cast<std::uint64_t>(product >> 64);
        return Quotient();
    }

private:
    // At most three words are needed before the shift, four after it.
    void Shift(const Binary& from, std::uint64_t* to) const {
        const int bits = shift_ & 63;
        const std::uint64_t* w = from.words;
        const std::uint64_t shifted[4] = {w[0] << bits, w[1] << bits | w[0] >> 1 >> (63 - bits),
                                          w[2] << bits | w[1] >> 1 >> (63 - bits), w[2] >> 1 >> (63 - bits)};
        const int skipped = shift_ / 64;
        to[0] = skipped ? 0 : shifted[0];
        for (int i = 1; i < 4; ++i) to[i] = shifted[i - skipped];
    }

    // (high, low) / first word of the divisor, by its reciprocal.
    [[nodiscard]] std::uint64_t Estimate(std::uint64_t high, std::uint64_t low) const {
        const std::uint64_t divisor = divisor_[2];
        const Wide product = Wide{reciprocal_} * high + (Wide{high} << 64 | low);
        std::uint64_t quotient = static_cast<std::uint64_t>(product >> 64) + 1;
        std::uint64_t rest = low - quotient * divisor;
        if (rest > static_cast<std::uint64_t>(product)) {
            --quotient;
            rest += divisor;
        }
        return quotient + (rest >= divisor);
    }

    void AddBack() {
        Wide sum = 0;
        for (int i = 0; i < 3; ++i) {
            sum = Wide{rest_[i]} + divisor_[i] + (sum >> 64);
            rest_[i] = static_cast<std::uint64_t>(sum);
        }
        rest_[3] += static_cast<std::uint64_t>(sum >> 64);
    }

    int shift_;
    std::uint64_t reciprocal_;
    std::uint64_t divisor_[4];  // the last is 0
    std::uint64_t rest_[4];
};

// The first digits of a quotient; what the rest would add below the guard digits does not change a rounding half up.
void DivideMantissas(const Digits& a, const Digits& b, Digits* quotient) {
    Divider divider{Binary(a.words), Binary(b.words)};
    const std::uint64_t whole = divider.Quotient();  // below 100
    for (std::uint64_t& word : quotient->words) word = WordOfLimb(divider.NextLimb());
    quotient->exponent = a.exponent - b.exponent - 1;
    if (whole == 0) return;
    ShiftRight(quotient, 1);
    quotient->words[0] |= whole << 56;
    ++quotient->exponent;
}

}  // namespace

Errno Mul(const OCINumber& left, const OCINumber& right, OCINumber* result) noexcept {
    Digits a, b;
    if (const Errno error = Unpack(left, &a)) return error;
    if (const Errno error = Unpack(right, &b)) return error;
    if (a.IsZero() || b.IsZero()) {
        SetZero(result);
        return 0;
    }
    Digits product;
    MultiplyMantissas(a.words, b.words, product.words);
    product.exponent = a.exponent + b.exponent + 1;
    product.negative = a.negative != b.negative;
    CloseGap(&product);
    return RoundAndPack(&product, result);
}

Errno Div(const OCINumber& left, const OCINumber& right, OCINumber* result) noexcept {
    Digits a, b;
    if (const Errno error = Unpack(left, &a)) return error;
    if (const Errno error = Unpack(right, &b)) return error;
    if (b.IsZero()) return errors::kDividedByZero;
    if (a.IsZero()) {
        SetZero(result);
        return 0;
    }
    Digits quotient;
    DivideMantissas(a, b, &quotient);
    quotient.negative = a.negative != b.negative;
    return RoundAndPack(&quotient, result);
}

}  // namespace number
