// Addition and subtraction, straight on the base-100 digits.
#include "number/digits.h"
#include "number/number.h"

namespace number {

namespace {

// Whether ShiftRight(digits, count) drops a digit that is not 0.
bool DropsDigits(const Digits& digits, int count) {
    return count > kUnpackedDigits - CountDigits(digits) && !digits.IsZero();
}

// |larger| + |smaller|. Digits below the guard digits cannot change a rounding half up.
void AddMagnitudes(Digits* larger, Digits* smaller) {
    ShiftRight(smaller, larger->exponent - smaller->exponent);
    std::uint64_t carry = 0;
    for (int word = 2; word >= 0; --word)
        larger->words[word] = AddDigits(larger->words[word], smaller->words[word], &carry);
    if (carry == 0) return;
    ShiftRight(larger, 1);
    larger->words[0] |= 1ull << 56;
    ++larger->exponent;
}

// |larger| - |smaller|. When digits of the smaller are dropped, the difference is the next lower one: the operands are
// then so far apart that at most one leading digit cancels, and the guard digits hold what rounding needs.
void SubtractMagnitudes(Digits* larger, Digits* smaller) {
    const int shift = larger->exponent - smaller->exponent;
    std::uint64_t borrow = shift > kUnpackedDigits - kMantissaDigits && DropsDigits(*smaller, shift);
    ShiftRight(smaller, shift);
    for (int word = 2; word >= 0; --word)
        larger->words[word] = SubtractDigits(larger->words[word], smaller->words[word], &borrow);
    if (larger->words[0] >> 56 == 0) Normalize(larger);
}

Errno AddSigned(Digits* a, Digits* b, OCINumber* result) {
    if (a->negative == b->negative) {
        if (a->exponent < b->exponent) std::swap(a, b);
        AddMagnitudes(a, b);
    } else {
        if (CompareMagnitude(*a, *b) < 0) std::swap(a, b);
        SubtractMagnitudes(a, b);
    }
    return RoundAndPack(a, result);
}

}  // namespace

Errno Add(const OCINumber& left, const OCINumber& right, OCINumber* result) noexcept {
    Digits a, b;
    if (const Errno error = Unpack(left, &a)) return error;
    if (const Errno error = Unpack(right, &b)) return error;
    return AddSigned(&a, &b, result);
}

Errno Sub(const OCINumber& left, const OCINumber& right, OCINumber* result) noexcept {
    Digits a, b;
    if (const Errno error = Unpack(left, &a)) return error;
    if (const Errno error = Unpack(right, &b)) return error;
    b.negative = !b.negative;
    return AddSigned(&a, &b, result);
}

}  // namespace number
