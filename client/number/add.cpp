// Addition and subtraction, straight on the base-100 digits.
#include "number/add_wide.h"
#include "number/digits.h"
#include "number/number.h"

namespace number {

namespace {

const bool can_add_wide = CanAddWide();  // false before it is asked, which only costs time

// Whether ShiftRight(digits, count) drops a digit that is not 0.
bool DropsDigits(const Digits& digits, int count) {
    return count > kUnpackedDigits - static_cast<int>(CountDigits(digits)) && !digits.IsZero();
}

// |larger| + |smaller|, with the sign of the larger. Digits below the guard digits cannot change a rounding half up.
Errno AddMagnitudes(Digits larger, Digits smaller, OCINumber* result) {
    ShiftRight(&smaller, larger.exponent - smaller.exponent);
    TakeCarry(&larger, AddInto(&larger, smaller));
    return RoundAndPack(&larger, result);
}

// |larger| - |smaller|. When digits of the smaller are dropped, the difference is the next lower one: the operands are
// then so far apart that at most one leading digit cancels, and the guard digits hold what rounding needs.
Errno SubtractMagnitudes(Digits larger, Digits smaller, OCINumber* result) {
    const int shift = larger.exponent - smaller.exponent;
    const bool dropped = shift > kUnpackedDigits - kMantissaDigits && DropsDigits(smaller, shift);
    ShiftRight(&smaller, shift);
    SubtractFrom(&larger, smaller, dropped);
    if (larger.words[0] >> 56 == 0) Normalize(&larger);
    return RoundAndPack(&larger, result);
}

Errno AddSigned(const Digits& a, const Digits& b, OCINumber* result) {
    if (a.negative == b.negative)
        return a.exponent < b.exponent ? AddMagnitudes(b, a, result) : AddMagnitudes(a, b, result);
    return CompareMagnitude(a, b) < 0 ? SubtractMagnitudes(b, a, result) : SubtractMagnitudes(a, b, result);
}

// The common case, without a detour through memory: numbers of one sign whose first digits have the same weight, and no
// rounding. False when it is another case; the result is untouched then.
template <bool kNegative>
[[gnu::always_inline]] inline bool AddAligned(const OCINumber& left, const OCINumber& right, OCINumber* result) {
    Digits a, b;
    if (!HasMantissa(left) || !HasMantissa(right)) return false;
    if (Decode<kNegative>(left.OCINumberPart, &a) | Decode<kNegative>(right.OCINumberPart, &b)) return false;
    const auto carry = static_cast<unsigned>(AddInto(&a, b));
    constexpr std::uint64_t kTwentieth = 0xFFull << 32;
    const bool is_full = a.exponent == kMaxExponent || (a.words[2] & kTwentieth) != 0;
    if (is_full && carry) return false;
    Encode<kNegative>(a, carry, result);
    return true;
}

// The same for the difference, unless leading digits cancel.
template <bool kNegative>
[[gnu::always_inline]] inline bool SubtractAligned(const OCINumber& left, const OCINumber& right, OCINumber* result) {
    Digits a, b;
    if (!HasMantissa(left) || !HasMantissa(right)) return false;
    if (Decode<kNegative>(left.OCINumberPart, &a) | Decode<kNegative>(right.OCINumberPart, &b)) return false;
    const bool below = SubtractFrom(&a, b);
    if (below) {
        b = a;
        a = Digits{.exponent = b.exponent};
        SubtractFrom(&a, b);
    }
    if (a.words[0] >> 56 == 0) return false;
    if (below)
        Encode<!kNegative>(a, 0, result);
    else
        Encode<kNegative>(a, 0, result);
    return true;
}

// left + right, or left - right when `flip` says so. Never inlined: the common case needs few registers.
[[gnu::noinline]] Errno AddAny(const OCINumber& left, const OCINumber& right, bool flip, OCINumber* result) {
    Digits a, b;
    if (const Errno error = Unpack(left, &a)) return error;
    if (const Errno error = Unpack(right, &b)) return error;
    b.negative = b.negative != flip;
    return AddSigned(a, b, result);
}

}  // namespace

Errno Add(const OCINumber& left, const OCINumber& right, OCINumber* result) noexcept {
    return can_add_wide ? AddWide(left, right, result) : AddNarrow(left, right, result);
}

Errno AddNarrow(const OCINumber& left, const OCINumber& right, OCINumber* result) noexcept {
    if (left.OCINumberPart[1] == right.OCINumberPart[1]) {
        const bool negative = left.OCINumberPart[1] < 128;
        if (negative ? AddAligned<true>(left, right, result) : AddAligned<false>(left, right, result)) return 0;
    }
    return AddAny(left, right, false, result);
}

Errno Sub(const OCINumber& left, const OCINumber& right, OCINumber* result) noexcept {
    if (left.OCINumberPart[1] == right.OCINumberPart[1]) {
        const bool negative = left.OCINumberPart[1] < 128;
        if (negative ? SubtractAligned<true>(left, right, result) : SubtractAligned<false>(left, right, result))
            return 0;
    }
    return AddAny(left, right, true, result);
}

}  // namespace number
