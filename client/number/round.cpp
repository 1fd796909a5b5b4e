// Rounding and cutting at a decimal place, moving the point, and counting up and down.
#include "handles/errors.h"
#include "number/digits.h"
#include "number/number.h"

namespace number {

namespace {

constexpr int kManyPlaces = 1000;  // beyond any place that a number has

enum class Toward { nearest, zero, above, below };

int Clamp(int amount) { return std::clamp(amount, -kManyPlaces, kManyPlaces); }

void SetDigit(Digits* digits, int index, int value) {
    const auto i = static_cast<unsigned>(index);
    const unsigned shift = 56 - i % 8 * 8;
    std::uint64_t& word = digits->words[i / 8];
    word = (word & ~(0xFFull << shift)) | static_cast<std::uint64_t>(value) << shift;
}

// The decimal digits that a number has before its point, if its mantissa began with two: 2 for 1 to 99, 0 for 0.01 to
// 0.99.
int PlacesBeforePoint(const Digits& digits) { return 2 * (digits.exponent + 1); }

// Adds a unit of the decimal digit at `place`, counted from the start of the mantissa.
void IncrementDecimal(Digits* digits, int place) {
    const int index = place / 2;
    if (place % 2 == 1) {
        Increment(digits, index);
        return;
    }
    const int digit = DigitAt(*digits, index) + 10;  // the units of this digit are 0 already
    if (digit < 100) {
        SetDigit(digits, index, digit);
        return;
    }
    SetDigit(digits, index, digit - 100);
    if (index > 0) {
        Increment(digits, index - 1);
        return;
    }
    ShiftRight(digits, 1);  // 95 became 100
    SetDigit(digits, 0, 1);
    ++digits->exponent;
}

// Keeps `kept` decimal digits from the start of the mantissa, whose first may be 0, and drops the others toward
// `toward`. A `kept` of 0 or less leaves nothing or one unit of the place.
void KeepDecimals(Digits* digits, int kept, Toward toward) {
    if (digits->IsZero() || kept >= 2 * kMantissaDigits) return;
    const int room = kept < 1 ? 1 - kept / 2 : 0;  // zeros in front, so that there is a place to keep
    ShiftRight(digits, room);
    digits->exponent += room;
    kept += 2 * room;
    const int index = kept / 2;
    const bool splits = kept % 2 == 1;
    const int last = DigitAt(*digits, index);
    const int dropped = splits ? last % 10 : last / 10;
    const int count = static_cast<int>(CountDigits(*digits));
    if (room == 0 && (count <= index || (splits && dropped == 0 && count == index + 1))) return;
    const bool up = toward == Toward::nearest ? dropped >= 5
                                              : toward != Toward::zero && (toward == Toward::below) == digits->negative;
    if (splits) SetDigit(digits, index, last - dropped);
    for (int word = 0; word < 3; ++word)
        digits->words[word] &= detail::kDecoding.rows[0][index + splits].mask.words[word];
    if (up) IncrementDecimal(digits, kept - 1);
    Normalize(digits);
}

Errno ToPlaces(const OCINumber& value, int places, Toward toward, OCINumber* result) {
    Digits digits;
    if (const Errno error = Unpack(value, &digits)) return error;
    KeepDecimals(&digits, Clamp(places) + PlacesBeforePoint(digits), toward);
    return Pack(digits, result);
}

// value + or - 1; what is above 100^21 - 2 counts as 0.
Errno Count(const OCINumber& value, bool up, OCINumber* result) {
    Digits digits;
    if (const Errno error = Unpack(value, &digits)) return error;
    OCINumber counted, one;
    FromInt64(1, &one);
    if (!digits.negative && digits.exponent >= kMantissaDigits + 1)
        SetZero(&counted);
    else
        counted = value;
    return up ? Add(counted, one, result) : Sub(counted, one, result);
}

}  // namespace

Errno Round(const OCINumber& value, int places, OCINumber* result) noexcept {
    return ToPlaces(value, places, Toward::nearest, result);
}

Errno Trunc(const OCINumber& value, int places, OCINumber* result) noexcept {
    return ToPlaces(value, places, Toward::zero, result);
}

Errno Ceil(const OCINumber& value, OCINumber* result) noexcept { return ToPlaces(value, 0, Toward::above, result); }

Errno Floor(const OCINumber& value, OCINumber* result) noexcept { return ToPlaces(value, 0, Toward::below, result); }

Errno Prec(const OCINumber& value, int digits, OCINumber* result) noexcept {
    Digits parts;
    if (const Errno error = Unpack(value, &parts)) return error;
    if (digits < 1) return errors::kNullArgument;
    const int leading_zero = DigitAt(parts, 0) < 10;
    KeepDecimals(&parts, Clamp(digits) + leading_zero, Toward::nearest);
    return Pack(parts, result);
}

Errno Shift(const OCINumber& value, int digits, OCINumber* result) noexcept {
    Digits parts;
    if (const Errno error = Unpack(value, &parts)) return error;
    if (parts.IsZero()) return Pack(parts, result);
    const int amount = Clamp(digits);
    const bool odd = amount % 2 != 0;
    parts.exponent += (amount - (odd && amount < 0)) / 2;  // rounded down; a multiplication by 10 is left if odd
    if (odd) {
        const Digits source = parts;
        const bool longer = DigitAt(source, 0) >= 10;
        parts.exponent += longer;
        for (int i = 0; i <= kMantissaDigits; ++i) {  // a number has no digit behind these
            const int left = longer ? (i == 0 ? 0 : DigitAt(source, i - 1)) : DigitAt(source, i);
            const int right = DigitAt(source, longer ? i : i + 1);
            SetDigit(&parts, i, left % 10 * 10 + right / 10);
        }
    }
    return RoundAndPack(&parts, result);
}

Errno Inc(const OCINumber& value, OCINumber* result) noexcept { return Count(value, true, result); }

Errno Dec(const OCINumber& value, OCINumber* result) noexcept { return Count(value, false, result); }

}  // namespace number
