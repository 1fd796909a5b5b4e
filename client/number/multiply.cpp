// Multiplication and division on limbs of 16 digits, most significant first.
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

// The first digits of a product whose value is 0.words x 100^(exponent + 1): 22 right ones, which rounding needs, of 24.
void MultiplyMantissas(const std::uint64_t (&a)[3], const std::uint64_t (&b)[3], std::uint64_t (&words)[3]) {
    const Product product(a, b);
    product.Digits24(product.EstimatedCarry(), words);
    const bool may_carry = (words[2] & 0xFF00) == 99 << 8 && (words[2] & 0xFF) >= 98;
    if (may_carry) product.Digits24(product.ExactCarry(), words);
}

// Schoolbook division: the divisor is scaled until its first limb is large, so that each estimate of a quotient limb from
// leading limbs is at most two too large.
class Divisor {
public:
    explicit Divisor(const std::uint64_t (&words)[3])
        : factor_(kLimb / (LimbOfWord(words[0]) + 1)) {
        Scale(words, &limbs_);
    }

    // Scales the dividend the same way; one limb is set in front.
    void Scale(const std::uint64_t (&words)[3], std::uint64_t (*limbs)[4]) const {
        std::uint64_t carry = 0;
        for (int i = 2; i >= 0; --i) carry = DivideByLimb(Wide{LimbOfWord(words[i])} * factor_ + carry, &(*limbs)[i + 1]);
        (*limbs)[0] = carry;
    }

    // The quotient's next limb: divides four limbs and leaves the rest, shifted up by a limb.
    std::uint64_t NextLimb(std::uint64_t (*rest)[4]) const {
        std::uint64_t(&r)[4] = *rest;
        const Wide top = Wide{r[0]} * kLimb + r[1];
        Wide estimate = top / limbs_[1];
        Wide left = top - estimate * limbs_[1];
        while (estimate >= kLimb || estimate * limbs_[2] > left * kLimb + r[2]) {
            --estimate;
            left += limbs_[1];
            if (left >= kLimb) break;
        }
        auto quotient = static_cast<std::uint64_t>(estimate);
        if (Subtract(quotient, rest)) {
            --quotient;
            AddBack(rest);
        }
        r[0] = r[1];
        r[1] = r[2];
        r[2] = r[3];
        r[3] = 0;
        return quotient;
    }

private:
    // rest -= quotient x divisor; answers whether that went below zero (the rest is then kept modulo kLimb^4).
    bool Subtract(std::uint64_t quotient, std::uint64_t (*rest)[4]) const {
        std::uint64_t carry = 0;
        for (int i = 3; i >= 1; --i) {
            std::uint64_t product;
            carry = DivideByLimb(Wide{quotient} * limbs_[i] + carry, &product);
            if ((*rest)[i] < product) {
                (*rest)[i] += kLimb;
                ++carry;
            }
            (*rest)[i] -= product;
        }
        const bool below = (*rest)[0] < carry;
        (*rest)[0] = 0;
        return below;
    }

    void AddBack(std::uint64_t (*rest)[4]) const {
        std::uint64_t carry = 0;
        for (int i = 3; i >= 1; --i) {
            std::uint64_t sum = (*rest)[i] + limbs_[i] + carry;
            carry = sum >= kLimb;
            if (carry) sum -= kLimb;
            (*rest)[i] = sum;
        }
    }

    std::uint64_t factor_;
    std::uint64_t limbs_[4];  // the first is 0
};

// The first digits of a quotient; what the rest would add below the guard digits does not change a rounding half up.
void DivideMantissas(const Digits& a, const Digits& b, Digits* quotient) {
    const Divisor divisor(b.words);
    std::uint64_t rest[4];
    divisor.Scale(a.words, &rest);
    const std::uint64_t whole = divisor.NextLimb(&rest);  // below 100
    for (std::uint64_t& word : quotient->words) word = WordOfLimb(divisor.NextLimb(&rest));
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
    if (product.words[0] >> 56 == 0) Normalize(&product);
    return RoundAndPack(&product, result);
}

Errno Div(const OCINumber& left, const OCINumber& right, OCINumber* result) noexcept {
    Digits a, b;
    if (const Errno error = Unpack(left, &a)) return error;
    if (const Errno error = Unpack(right, &b)) return error;
    if (b.IsZero()) return kDividedByZero;
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
