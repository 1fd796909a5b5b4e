// The unpacked form that arithmetic works on: 24 base-100 digits, one a byte, in three 64-bit words whose most significant
// byte is the first digit. A number fills the first 20; the last four are guard digits. Whole words are added and
// subtracted at once; a byte that passes 99 is mended by the 156 that separates base 100 from base 256.
#pragma once

#include <algorithm>
#include <array>
#include <bit>
#include <cstdint>
#include <cstring>

#include "number/number.h"
#include "oci.h"

namespace number {

constexpr int kMantissaDigits = 20;   // base-100 digits of a number
constexpr int kUnpackedDigits = 24;
constexpr int kMinExponent = -65;     // of the first digit, as a power of 100
constexpr int kMaxExponent = 62;
constexpr int kZeroExponent = -1000;  // lets zero take part in additions as something very small

struct Digits {
    std::uint64_t words[3] = {};      // zero: all zero; else the first byte is not 0
    int exponent = kZeroExponent;     // value = 0.words x 100^(exponent + 1)
    bool negative = false;

    [[nodiscard]] bool IsZero() const { return words[0] == 0; }
};

namespace detail {

constexpr std::uint64_t Repeat(std::uint64_t byte) { return byte * 0x0101010101010101u; }

constexpr std::uint8_t kTerminator = 102;  // closes a negative mantissa of fewer than 20 digits
constexpr std::uint64_t kHighBits = Repeat(0x80);

// By the count of digits: which bytes of the words they fill, and where the terminator stands.
struct WordTable {
    std::uint64_t rows[kUnpackedDigits + 1][4] = {};
};
constexpr WordTable MakeMasks() {
    WordTable table;
    for (unsigned count = 0; count <= kUnpackedDigits; ++count)
        for (unsigned i = 0; i < count; ++i) table.rows[count][i / 8] |= 0xFFull << (56 - i % 8 * 8);
    return table;
}
constexpr WordTable MakeTerminators() {
    WordTable table;
    for (unsigned count = 0; count < kMantissaDigits; ++count)
        table.rows[count][count / 8] = std::uint64_t{kTerminator} << (56 - count % 8 * 8);
    return table;
}
inline constexpr WordTable kMasks = MakeMasks();
inline constexpr WordTable kTerminators = MakeTerminators();

inline std::uint64_t BigEndian(std::uint64_t word) {
    if constexpr (std::endian::native == std::endian::little) return __builtin_bswap64(word);
    return word;
}
inline std::uint32_t BigEndian(std::uint32_t word) {
    if constexpr (std::endian::native == std::endian::little) return __builtin_bswap32(word);
    return word;
}
template <class Word> Word Load(const std::uint8_t* bytes) {
    Word word;
    std::memcpy(&word, bytes, sizeof word);
    return BigEndian(word);
}
template <class Word> void Store(std::uint8_t* bytes, Word word) {
    word = BigEndian(word);
    std::memcpy(bytes, &word, sizeof word);
}

}  // namespace detail

// a + b + carry, digit by digit; carry is 0 or 1, in and out.
inline std::uint64_t AddDigits(std::uint64_t a, std::uint64_t b, std::uint64_t* carry) {
    const std::uint64_t biased = a + detail::Repeat(156);
    const std::uint64_t sum = biased + b + *carry;
    const std::uint64_t carried = ((biased & b) | ((biased | b) & ~sum)) & detail::kHighBits;
    *carry = carried >> 63;
    return sum - ((~carried & detail::kHighBits) >> 7) * 156;
}

// a - b - borrow, digit by digit; borrow is 0 or 1, in and out.
inline std::uint64_t SubtractDigits(std::uint64_t a, std::uint64_t b, std::uint64_t* borrow) {
    const std::uint64_t difference = a - b - *borrow;
    const std::uint64_t borrowed = ((~a & b) | (~(a ^ b) & difference)) & detail::kHighBits;
    *borrow = borrowed >> 63;
    return difference - (borrowed >> 7) * 156;
}

inline std::uint8_t DigitAt(const Digits& digits, int index) {
    const auto i = static_cast<unsigned>(index);
    return static_cast<std::uint8_t>(digits.words[i / 8] >> (56 - i % 8 * 8));
}

// Digits up to the last that is not 0.
inline int CountDigits(const Digits& digits) {
    if (digits.words[2]) return 24 - std::countr_zero(digits.words[2]) / 8;
    if (digits.words[1]) return 16 - std::countr_zero(digits.words[1]) / 8;
    if (digits.words[0]) return 8 - std::countr_zero(digits.words[0]) / 8;
    return 0;
}

// Moves the digits `count` places (0 or more) to the right; those that leave are dropped. The exponent stays.
inline void ShiftRight(Digits* digits, int count) {
    std::uint64_t* w = digits->words;
    if (count >= kUnpackedDigits) {
        w[0] = w[1] = w[2] = 0;
        return;
    }
    for (; count >= 8; count -= 8) {
        w[2] = w[1];
        w[1] = w[0];
        w[0] = 0;
    }
    if (count == 0) return;
    const int bits = count * 8;
    w[2] = w[2] >> bits | w[1] << (64 - bits);
    w[1] = w[1] >> bits | w[0] << (64 - bits);
    w[0] >>= bits;
}

// Moves the digits left until the first is not 0, and counts the exponent down.
inline void Normalize(Digits* digits) {
    std::uint64_t* w = digits->words;
    int moved = 0;
    for (; w[0] == 0 && moved < kUnpackedDigits; moved += 8) {
        w[0] = w[1];
        w[1] = w[2];
        w[2] = 0;
    }
    if (moved == kUnpackedDigits) {
        *digits = Digits{};
        return;
    }
    if (const int bits = std::countl_zero(w[0]) / 8 * 8; bits > 0) {
        w[0] = w[0] << bits | w[1] >> (64 - bits);
        w[1] = w[1] << bits | w[2] >> (64 - bits);
        w[2] <<= bits;
        moved += bits / 8;
    }
    digits->exponent -= moved;
}

// Adds one unit of the digit at `index`; 99...9 becomes 1 with a higher exponent.
inline void Increment(Digits* digits, int index) {
    const auto i = static_cast<unsigned>(index);
    std::uint64_t unit[3] = {};
    unit[i / 8] = 1ull << (56 - i % 8 * 8);
    std::uint64_t carry = 0;
    for (int word = 2; word >= 0; --word)
        digits->words[word] = AddDigits(digits->words[word], unit[word], &carry);
    if (carry == 0) return;
    ShiftRight(digits, 1);
    digits->words[0] |= 1ull << 56;
    ++digits->exponent;
}

// Keeps the first `count` digits (0 to 24).
inline void KeepDigits(Digits* digits, int count) {
    for (int word = 0; word < 3; ++word) digits->words[word] &= detail::kMasks.rows[count][word];
    if (digits->IsZero()) *digits = Digits{};
}

// Cuts to the 20 digits of a number, half up.
inline void RoundToMantissa(Digits* digits) {
    const bool up = DigitAt(*digits, kMantissaDigits) >= 50;
    digits->words[2] &= detail::kMasks.rows[kMantissaDigits][2];
    if (up) Increment(digits, kMantissaDigits - 1);
}

// What is neither finite nor malformed: count 1 with exponent byte 0, or count 2 with the bytes 255 and 101.
inline bool IsInfinite(const OCINumber& value) {
    const std::uint8_t* bytes = value.OCINumberPart;
    return (bytes[0] == 1 && bytes[1] == 0) || (bytes[0] == 2 && bytes[1] == 255 && bytes[2] == 101);
}

namespace detail {
Errno UnpackRare(const OCINumber& value, Digits* digits) noexcept;  // zero, infinities, leading zeros, malformed bytes
}

// kBadNumber for malformed bytes, kOverflow for an infinity.
inline Errno Unpack(const OCINumber& value, Digits* digits) noexcept {
    using namespace detail;
    const std::uint8_t* bytes = value.OCINumberPart;
    unsigned count = bytes[0] - 1u;
    if (count - 1u >= kMantissaDigits) return UnpackRare(value, digits);
    const bool negative = bytes[1] < 128;
    if (negative) count -= bytes[1 + count] == kTerminator;
    // Bytes past the end count as the digit 0, whatever they hold. A byte that is no digit leaves its lane above 99.
    const std::uint64_t(&mask)[4] = kMasks.rows[count];
    const std::uint64_t none = negative ? Repeat(101) : Repeat(1);
    const std::uint64_t raw[3] = {(Load<std::uint64_t>(bytes + 2) & mask[0]) | (none & ~mask[0]),
                                  (Load<std::uint64_t>(bytes + 10) & mask[1]) | (none & ~mask[1]),
                                  (std::uint64_t{Load<std::uint32_t>(bytes + 18)} << 32 & mask[2]) | (none & ~mask[2])};
    std::uint64_t wrong = 0;
    for (int word = 0; word < 3; ++word) {
        digits->words[word] = negative ? none - raw[word] : raw[word] - none;
        wrong |= digits->words[word] | (digits->words[word] + Repeat(28));
    }
    digits->exponent = negative ? 62 - bytes[1] : bytes[1] - 193;
    digits->negative = negative;
    if ((wrong & kHighBits) || digits->words[0] >> 56 == 0) return UnpackRare(value, digits);
    return 0;
}

void SetInfinity(bool negative, OCINumber* result) noexcept;

// Writes normalized digits, of which the last four are 0. kOverflow or kUnderflow when the exponent does not fit.
inline Errno Pack(const Digits& digits, OCINumber* result) noexcept {
    using namespace detail;
    std::uint8_t* bytes = result->OCINumberPart;
    if (digits.IsZero()) {
        SetZero(result);
        return 0;
    }
    if (digits.exponent > kMaxExponent) return kOverflow;
    if (digits.exponent < kMinExponent) return kUnderflow;
    const int count = CountDigits(digits);
    const std::uint64_t(&mask)[4] = kMasks.rows[count];
    const std::uint64_t* w = digits.words;
    if (!digits.negative) {
        bytes[0] = static_cast<std::uint8_t>(count + 1);
        bytes[1] = static_cast<std::uint8_t>(193 + digits.exponent);
        Store(bytes + 2, w[0] + (Repeat(1) & mask[0]));
        Store(bytes + 10, w[1] + (Repeat(1) & mask[1]));
        Store(bytes + 18, static_cast<std::uint32_t>((w[2] + (Repeat(1) & mask[2])) >> 32));
        return 0;
    }
    const std::uint64_t(&end)[4] = kTerminators.rows[count];
    bytes[0] = static_cast<std::uint8_t>(std::min(count + 2, kMantissaDigits + 1));
    bytes[1] = static_cast<std::uint8_t>(62 - digits.exponent);
    Store(bytes + 2, ((Repeat(101) & mask[0]) - w[0]) | end[0]);
    Store(bytes + 10, ((Repeat(101) & mask[1]) - w[1]) | end[1]);
    Store(bytes + 18, static_cast<std::uint32_t>((((Repeat(101) & mask[2]) - w[2]) | end[2]) >> 32));
    return 0;
}

// Rounds to 20 digits and writes them.
inline Errno RoundAndPack(Digits* digits, OCINumber* result) noexcept {
    RoundToMantissa(digits);
    return Pack(*digits, result);
}

// -1, 0 or 1, without regard to the signs.
inline int CompareMagnitude(const Digits& a, const Digits& b) {
    if (a.exponent != b.exponent) return a.exponent < b.exponent ? -1 : 1;
    for (int word = 0; word < 3; ++word)
        if (a.words[word] != b.words[word]) return a.words[word] < b.words[word] ? -1 : 1;
    return 0;
}

}  // namespace number
