// Limbs of 16 decimal digits, which multiplication and division work on: a word of eight base-100 digits and its limb
// hold the same value.
#pragma once

#include <cstdint>

#include "number/digits.h"

namespace number {

constexpr std::uint64_t kLimb = 10'000'000'000'000'000u;
constexpr int kDigitsPerLimb = 8;  // of base 100

// The number that the eight digits of a word spell.
inline std::uint64_t LimbOfWord(std::uint64_t word) {
    word = (word >> 8 & 0x00FF00FF00FF00FFu) * 100 + (word & 0x00FF00FF00FF00FFu);
    word = (word >> 16 & 0x0000FFFF0000FFFFu) * 10'000 + (word & 0x0000FFFF0000FFFFu);
    return (word >> 32) * 100'000'000 + (word & 0xFFFFFFFFu);
}

// The eight digits of a limb. Halves, then quarters, are split at once; a division by 10000 or 100 is a multiplication
// that is exact for the range.
inline std::uint64_t WordOfLimb(std::uint64_t limb) {
    const std::uint64_t high = limb / 100'000'000;
    const std::uint64_t low = limb - high * 100'000'000;
    const std::uint64_t high_upper = high * 3'518'437'209u >> 45;
    const std::uint64_t low_upper = low * 3'518'437'209u >> 45;
    const std::uint64_t upper = high_upper << 32 | low_upper;
    const std::uint64_t lower = (high - high_upper * 10'000) << 32 | (low - low_upper * 10'000);
    const std::uint64_t upper_hundreds = upper * 5243 >> 19 & 0x0000007F0000007Fu;
    const std::uint64_t lower_hundreds = lower * 5243 >> 19 & 0x0000007F0000007Fu;
    return upper_hundreds << 24 | (upper - upper_hundreds * 100) << 16 | lower_hundreds << 8 |
           (lower - lower_hundreds * 100);
}

// value / kLimb or one less, for value < 2^108.
inline std::uint64_t EstimateQuotient(Wide value) {
    constexpr auto kReciprocal = static_cast<std::uint64_t>((Wide{1} << 117) / kLimb);
    return static_cast<std::uint64_t>(Wide{static_cast<std::uint64_t>(value >> 44)} * kReciprocal >> 64) >> 9;
}

// value / kLimb for value < 2^108, with the rest in *rest.
inline std::uint64_t DivideByLimb(Wide value, std::uint64_t* rest) {
    const std::uint64_t quotient = EstimateQuotient(value);
    const std::uint64_t remainder = static_cast<std::uint64_t>(value) - quotient * kLimb;
    const std::uint64_t more = remainder >= kLimb;
    *rest = remainder - (more ? kLimb : 0);
    return quotient + more;
}

}  // namespace number
