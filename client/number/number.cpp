// Sign, comparison and the other functions that only look at a number, and the rare cases of packing and unpacking.
#include "number/number.h"

#include <cstring>

#include "handles/errors.h"
#include "number/digits.h"

namespace number {

namespace detail {

Errno UnpackRare(const OCINumber& value, Digits* digits) noexcept {
    const std::uint8_t* bytes = value.OCINumberPart;
    *digits = Digits{};
    if (IsInfinite(value)) return errors::kNumberOverflow;
    if (bytes[0] == 1) return bytes[1] == 128 ? 0 : errors::kBadNumber;
    if (bytes[0] == 0 || bytes[0] > kMantissaDigits + 1) return errors::kBadNumber;
    const bool negative = bytes[1] < 128;
    int count = bytes[0] - 1;
    if (negative && bytes[1 + count] == kTerminator) --count;
    if (count == 0) return errors::kBadNumber;
    Digits raw;
    raw.exponent = negative ? 62 - bytes[1] : bytes[1] - 193;
    raw.negative = negative;
    for (int i = 0; i < count; ++i) {
        const int digit = negative ? 101 - bytes[2 + i] : bytes[2 + i] - 1;
        if (digit < 0 || digit > 99) return errors::kBadNumber;
        const auto place = static_cast<unsigned>(i);
        raw.words[place / 8] |= static_cast<std::uint64_t>(digit) << (56 - place % 8 * 8);
    }
    Normalize(&raw);
    *digits = raw;
    return 0;
}

}  // namespace detail

namespace {

// Whether the digits end at or before the units.
bool IsWhole(const Digits& digits) { return static_cast<int>(CountDigits(digits)) <= digits.exponent + 1; }

bool IsNegativeInfinity(const OCINumber& value) { return value.OCINumberPart[1] == 0; }

}  // namespace

bool IsValid(const OCINumber& value) noexcept {
    Digits digits;
    return Unpack(value, &digits) != errors::kBadNumber;
}

void SetInfinity(bool negative, OCINumber* result) noexcept {
    *result = negative ? OCINumber{{1, 0}} : OCINumber{{2, 255, 101}};
}

void SetZero(OCINumber* result) noexcept { *result = OCINumber{{1, 128}}; }

void SetPi(OCINumber* result) noexcept {
    // 3.14159265358979323846264338327950288420, less the last zero.
    *result = OCINumber{{21, 193, 4, 15, 16, 93, 66, 36, 90, 80, 33, 39, 47, 27, 44, 39, 33, 80, 51, 29, 85, 21}};
}

Errno Assign(const OCINumber& value, OCINumber* result) noexcept {
    if (!IsValid(value)) return errors::kBadNumber;
    OCINumber assigned{};
    std::memcpy(assigned.OCINumberPart, value.OCINumberPart, 1U + value.OCINumberPart[0]);
    *result = assigned;
    return 0;
}

Errno Abs(const OCINumber& value, OCINumber* result) noexcept {
    Digits digits;
    if (Unpack(value, &digits) == errors::kBadNumber) return errors::kBadNumber;
    if (IsInfinite(value)) {
        SetInfinity(false, result);
        return 0;
    }
    digits.negative = false;
    return Pack(digits, result);
}

Errno Neg(const OCINumber& value, OCINumber* result) noexcept {
    Digits digits;
    if (Unpack(value, &digits) == errors::kBadNumber) return errors::kBadNumber;
    if (IsInfinite(value)) {
        SetInfinity(!IsNegativeInfinity(value), result);
        return 0;
    }
    digits.negative = !digits.negative;
    return Pack(digits, result);
}

Errno Compare(const OCINumber& left, const OCINumber& right, int* result) noexcept {
    Digits a, b;
    if (Unpack(left, &a) == errors::kBadNumber || Unpack(right, &b) == errors::kBadNumber) return errors::kBadNumber;
    const auto rank = [](const OCINumber& value, const Digits& digits) {
        if (IsInfinite(value)) return IsNegativeInfinity(value) ? -2 : 2;
        return digits.IsZero() ? 0 : digits.negative ? -1 : 1;
    };
    const int a_rank = rank(left, a), b_rank = rank(right, b);
    if (a_rank != b_rank) {
        *result = a_rank < b_rank ? -1 : 1;
    } else {
        const int magnitude = CompareMagnitude(a, b);
        *result = a_rank < 0 ? -magnitude : magnitude;
    }
    return 0;
}

Errno Sign(const OCINumber& value, int* result) noexcept {
    Digits digits;
    if (Unpack(value, &digits) == errors::kBadNumber) return errors::kBadNumber;
    if (IsInfinite(value))
        *result = IsNegativeInfinity(value) ? -1 : 1;
    else
        *result = digits.IsZero() ? 0 : digits.negative ? -1 : 1;
    return 0;
}

Errno IsInt(const OCINumber& value, int* result) noexcept {
    Digits digits;
    if (Unpack(value, &digits) == errors::kBadNumber) return errors::kBadNumber;
    *result = !IsInfinite(value) && (digits.IsZero() || IsWhole(digits));
    return 0;
}

Errno IsZero(const OCINumber& value, int* result) noexcept {
    Digits digits;
    if (Unpack(value, &digits) == errors::kBadNumber) return errors::kBadNumber;
    *result = !IsInfinite(value) && digits.IsZero();
    return 0;
}

}  // namespace number
