// Conversions from and to the integers of the machine.
#include <limits>

#include "handles/errors.h"
#include "number/digits.h"
#include "number/limbs.h"
#include "number/number.h"

namespace number {

namespace {

void FromMagnitude(std::uint64_t magnitude, bool negative, OCINumber* result) {
    if (magnitude == 0) return SetZero(result);
    Digits digits;
    digits.words[0] = WordOfLimb(magnitude / kLimb);
    digits.words[1] = WordOfLimb(magnitude % kLimb);
    digits.exponent = 2 * kDigitsPerLimb - 1;
    digits.negative = negative;
    Normalize(&digits);
    Pack(digits, result);
}

// The whole part of a magnitude, or false when it needs more than 64 bits.
bool ToMagnitude(Digits* digits, std::uint64_t* magnitude) {
    constexpr int kWidest = 9;  // exponent of 1.8E19
    *magnitude = 0;
    if (digits->exponent < 0) return true;
    if (digits->exponent > kWidest) return false;
    ShiftRight(digits, 2 * kDigitsPerLimb - 1 - digits->exponent);
    const Wide value = Wide{LimbOfWord(digits->words[0])} * kLimb + LimbOfWord(digits->words[1]);
    *magnitude = static_cast<std::uint64_t>(value);
    return value >> 64 == 0;
}

template <class Integer> Errno ToBounded(const OCINumber& value, Integer* result) {
    Digits digits;
    if (Unpack(value, &digits) == errors::kBadNumber) return errors::kBadNumber;
    if (IsInfinite(value)) return value.OCINumberPart[1] == 0 ? errors::kNumberUnderflow : errors::kNumberOverflow;
    const bool negative = digits.negative;
    const Errno range = negative ? errors::kNumberUnderflow : errors::kNumberOverflow;
    constexpr auto kHighest = static_cast<std::uint64_t>(std::numeric_limits<Integer>::max());
    constexpr std::uint64_t kLowest = std::numeric_limits<Integer>::is_signed ? kHighest + 1 : 0;
    std::uint64_t magnitude;
    if (!ToMagnitude(&digits, &magnitude) || magnitude > (negative ? kLowest : kHighest)) return range;
    *result = static_cast<Integer>(negative ? 0 - magnitude : magnitude);
    return 0;
}

template <class Integer> void ReadAs(const void* bytes, OCINumber* result) {
    Integer value;
    std::memcpy(&value, bytes, sizeof value);
    if constexpr (std::numeric_limits<Integer>::is_signed)
        FromInt64(value, result);
    else
        FromUint64(value, result);
}

template <class Integer> Errno WriteAs(const OCINumber& value, void* bytes) {
    Integer integer;
    if (const Errno error = ToBounded(value, &integer)) return error;
    std::memcpy(bytes, &integer, sizeof integer);
    return 0;
}

struct Width {
    std::size_t length;
    void (*read[2])(const void*, OCINumber*);  // unsigned, signed
    Errno (*write[2])(const OCINumber&, void*);
};
constexpr Width kWidths[] = {
    {1, {ReadAs<std::uint8_t>, ReadAs<std::int8_t>}, {WriteAs<std::uint8_t>, WriteAs<std::int8_t>}},
    {2, {ReadAs<std::uint16_t>, ReadAs<std::int16_t>}, {WriteAs<std::uint16_t>, WriteAs<std::int16_t>}},
    {4, {ReadAs<std::uint32_t>, ReadAs<std::int32_t>}, {WriteAs<std::uint32_t>, WriteAs<std::int32_t>}},
    {8, {ReadAs<std::uint64_t>, ReadAs<std::int64_t>}, {WriteAs<std::uint64_t>, WriteAs<std::int64_t>}},
};

const Width* FindWidth(std::size_t length) {
    for (const Width& width : kWidths)
        if (width.length == length) return &width;
    return nullptr;
}

}  // namespace

void FromInt64(std::int64_t value, OCINumber* result) noexcept {
    const auto bits = static_cast<std::uint64_t>(value);
    FromMagnitude(value < 0 ? 0 - bits : bits, value < 0, result);
}

void FromUint64(std::uint64_t value, OCINumber* result) noexcept { FromMagnitude(value, false, result); }

Errno ToInt64(const OCINumber& value, std::int64_t* result) noexcept { return ToBounded(value, result); }

Errno ToUint64(const OCINumber& value, std::uint64_t* result) noexcept { return ToBounded(value, result); }

bool IsIntegerLength(std::size_t length) noexcept { return FindWidth(length) != nullptr; }

void FromInteger(const void* value, std::size_t length, bool is_signed, OCINumber* result) noexcept {
    FindWidth(length)->read[is_signed](value, result);
}

Errno ToInteger(const OCINumber& value, std::size_t length, bool is_signed, void* result) noexcept {
    return FindWidth(length)->write[is_signed](value, result);
}

}  // namespace number
