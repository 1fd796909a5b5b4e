// The unpacked form that arithmetic works on: 24 base-100 digits, one a byte, in three 64-bit words whose most
// significant byte is the first digit. A number fills the first 20; the last four are guard digits. Whole words are
// added and subtracted at once; a byte that passes 99 is mended by the 156 that separates base 100 from base 256.
#pragma once

#include <algorithm>
#include <array>
#include <bit>
#include <cstdint>
#include <cstring>

#include "handles/errors.h"
#include "number/number.h"
#include "oci.h"

namespace number {

constexpr int kMantissaDigits = 20;  // base-100 digits of a number
constexpr int kUnpackedDigits = 24;
constexpr int kMinExponent = -65;  // of the first digit, as a power of 100
constexpr int kMaxExponent = 62;
constexpr int kZeroExponent = -1000;  // lets zero take part in additions as something very small

struct Digits {
    std::uint64_t words[3] = {};   // zero: all zero; else the first byte is not 0
    int exponent = kZeroExponent;  // value = 0.words x 100^(exponent + 1)
    bool negative = false;

    [[nodiscard]] bool IsZero() const { return words[0] == 0; }
};

__extension__ using Wide = unsigned __int128;

namespace detail {

constexpr std::uint64_t Repeat(std::uint64_t byte) { return byte * 0x0101010101010101u; }

constexpr std::uint8_t kTerminator = 102;  // closes a negative mantissa of fewer than 20 digits
constexpr std::uint64_t kHighBits = Repeat(0x80);

// Words with a byte in the place of each of the first `count` digits.
struct alignas(32) Lanes {
    std::uint64_t words[4] = {};
};
constexpr Lanes Fill(unsigned count, std::uint64_t byte) {
    Lanes lanes;
    for (unsigned i = 0; i < count; ++i) lanes.words[i / 8] |= byte << (56 - i % 8 * 8);
    return lanes;
}

// What coding needs for a count of digits. A digit d is stored as d + 1, or in a negative number as 101 - d, which is
// ~(d + 154), with a terminator after the last.
struct alignas(64) Coding {
    Lanes mask;
    Lanes bias;
};
struct CodingTable {
    Coding rows[2][kUnpackedDigits + 1];  // positive, negative
};
constexpr CodingTable MakeDecoding() {
    CodingTable table;
    for (unsigned count = 0; count <= kUnpackedDigits; ++count) {
        table.rows[0][count] = {Fill(count, 0xFF), Fill(count, 1)};
        table.rows[1][count] = {Fill(count, 0xFF), Fill(count, 154)};
    }
    return table;
}
struct EncodingTable {
    Lanes rows[2][kMantissaDigits + 1];
};
constexpr EncodingTable MakeEncoding() {
    EncodingTable table;
    for (unsigned count = 0; count <= kMantissaDigits; ++count) {
        table.rows[0][count] = Fill(count, 1);
        table.rows[1][count] = Fill(count, 101);
        if (count < kMantissaDigits)
            table.rows[1][count].words[count / 8] |= std::uint64_t{kTerminator} << (56 - count % 8 * 8);
    }
    return table;
}
inline constexpr CodingTable kDecoding = MakeDecoding();
inline constexpr EncodingTable kEncoding = MakeEncoding();

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

// *a += b and *a -= b over all digits, from a carry or borrow of 0 or 1 into the last; answer the one out of the first.
// The words are added in binary, each digit of *a raised by 156 so that it carries as a digit does. A lane that did not
// carry is then still raised, at least 156, while one that did is below 100: its high bit tells. A lane that borrowed
// got 256 where it should have got 100, which its high bit tells as well.
inline std::uint64_t Lower(std::uint64_t word) { return word - ((word & detail::kHighBits) >> 7) * 156; }

[[gnu::always_inline]] inline std::uint64_t AddInto(Digits* a, const Digits& b, std::uint64_t carry = 0) {
    const std::uint64_t raise = detail::Repeat(156);
    const std::uint64_t a2 = a->words[2] + raise, a1 = a->words[1] + raise, a0 = a->words[0] + raise;
    const std::uint64_t sum2 = a2 + b.words[2] + carry, carry2 = sum2 < a2;
    const std::uint64_t sum1 = a1 + b.words[1] + carry2, carry1 = sum1 < a1;
    const std::uint64_t sum0 = a0 + b.words[0] + carry1, carry0 = sum0 < a0;
    a->words[2] = Lower(sum2);
    a->words[1] = Lower(sum1);
    a->words[0] = Lower(sum0);
    return carry0;
}

[[gnu::always_inline]] inline std::uint64_t SubtractFrom(Digits* a, const Digits& b, std::uint64_t borrow = 0) {
    const std::uint64_t a2 = a->words[2], a1 = a->words[1], a0 = a->words[0];
    const std::uint64_t taken2 = b.words[2] + borrow, borrow2 = a2 < taken2;
    const std::uint64_t taken1 = b.words[1] + borrow2, borrow1 = a1 < taken1;
    const std::uint64_t taken0 = b.words[0] + borrow1, borrow0 = a0 < taken0;
    a->words[2] = Lower(a2 - taken2);
    a->words[1] = Lower(a1 - taken1);
    a->words[0] = Lower(a0 - taken0);
    return borrow0;
}

inline std::uint8_t DigitAt(const Digits& digits, int index) {
    const auto i = static_cast<unsigned>(index);
    return static_cast<std::uint8_t>(digits.words[i / 8] >> (56 - i % 8 * 8));
}

// Digits up to the last that is not 0.
[[gnu::always_inline]] inline unsigned CountDigits(const Digits& digits) {
    const auto trailing = [](std::uint64_t word) { return static_cast<unsigned>(std::countr_zero(word)) / 8; };
    if (digits.words[2]) return 24 - trailing(digits.words[2]);
    if (digits.words[1]) return 16 - trailing(digits.words[1]);
    return digits.words[0] ? 8 - trailing(digits.words[0]) : 0;
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

// Puts a carry out of the first digit, 0 or 1, in front of it; without a branch, since sums toss a coin.
[[gnu::always_inline]] inline void TakeCarry(Digits* digits, std::uint64_t carry) {
    std::uint64_t* w = digits->words;
    const std::uint64_t bits = carry * 8;
    w[2] = w[2] >> bits | w[1] << 1 << (63 - bits);
    w[1] = w[1] >> bits | w[0] << 1 << (63 - bits);
    w[0] = w[0] >> bits | carry << 56;
    digits->exponent += static_cast<int>(carry);
}

// Adds one unit of the digit at `index`; 99...9 becomes 1 with a higher exponent.
inline void Increment(Digits* digits, int index) {
    const auto i = static_cast<unsigned>(index);
    Digits unit;
    unit.words[i / 8] = 1ull << (56 - i % 8 * 8);
    if (DigitAt(*digits, index) != 99) {
        digits->words[i / 8] += unit.words[i / 8];
        return;
    }
    TakeCarry(digits, AddInto(digits, unit));
}

// Moves the digits left by one if the first is 0 and the second is not; without a branch, since products toss a coin.
inline void CloseGap(Digits* digits) {
    std::uint64_t* w = digits->words;
    const unsigned gap = w[0] >> 56 == 0;
    const unsigned bits = gap * 8;
    w[0] = w[0] << bits | w[1] >> 1 >> (63 - bits);
    w[1] = w[1] << bits | w[2] >> 1 >> (63 - bits);
    w[2] <<= bits;
    digits->exponent -= static_cast<int>(gap);
}

// Cuts to the 20 digits of a number, half up; as often up as not, so without a branch but for a carry out of the last
// word.
inline void RoundToMantissa(Digits* digits) {
    const std::uint64_t up = DigitAt(*digits, kMantissaDigits) >= 50;
    const std::uint64_t raised = (digits->words[2] & ~0xFFFFFFFFull) + detail::Repeat(156);
    const std::uint64_t sum = raised + (up << 32);
    digits->words[2] = Lower(sum);
    if (sum >= raised) return;
    Digits carried;
    carried.words[1] = 1;
    TakeCarry(digits, AddInto(digits, carried));
}

// What is neither finite nor malformed: count 1 with exponent byte 0, or count 2 with the bytes 255 and 101.
inline bool IsInfinite(const OCINumber& value) {
    const std::uint8_t* bytes = value.OCINumberPart;
    return (bytes[0] == 1 && bytes[1] == 0) || (bytes[0] == 2 && bytes[1] == 255 && bytes[2] == 101);
}

namespace detail {
// Zero, infinities, leading zeros, malformed bytes.
Errno UnpackRare(const OCINumber& value, Digits* digits) noexcept;
}  // namespace detail

inline bool HasMantissa(const OCINumber& value) { return value.OCINumberPart[0] - 2u < kMantissaDigits; }

// Reads the mantissa of a number of that sign, which has 1 to 20 digits; answers 0, or not 0 for all that UnpackRare is
// for. Written out word by word, and inlined so that the words stay in registers: this is half of an addition.
template <bool kNegative>
[[gnu::always_inline]] inline std::uint64_t Decode(const std::uint8_t* bytes, Digits* digits) {
    using namespace detail;
    unsigned count = bytes[0] - 1u;
    if (kNegative) count -= bytes[1 + count] == kTerminator;
    constexpr std::uint64_t kInvert = kNegative ? ~0ull : 0;
    const Coding& coding = kDecoding.rows[kNegative][count];
    const std::uint64_t* mask = coding.mask.words;
    const std::uint64_t* bias = coding.bias.words;
    const std::uint64_t w0 = ((Load<std::uint64_t>(bytes + 2) ^ kInvert) & mask[0]) - bias[0];
    const std::uint64_t w1 = ((Load<std::uint64_t>(bytes + 10) ^ kInvert) & mask[1]) - bias[1];
    const std::uint64_t w2 = ((std::uint64_t{Load<std::uint32_t>(bytes + 18)} << 32 ^ kInvert) & mask[2]) - bias[2];
    digits->words[0] = w0;
    digits->words[1] = w1;
    digits->words[2] = w2;
    digits->exponent = kNegative ? 62 - bytes[1] : bytes[1] - 193;
    digits->negative = kNegative;
    // A byte that is no digit leaves a lane above 99, its own or one before; so does a first digit of 0, less 1.
    return ((w0 - (1ull << 56)) | (w0 + Repeat(28)) | w1 | (w1 + Repeat(28)) | w2 | (w2 + Repeat(28))) & kHighBits;
}

// Writes normalized digits, of which the last four are 0, as a number of that sign; the exponent fits. A carry out of
// the first digit, 0 or 1, goes in front of them, and the last of 20 digits leaves: the words are stored a byte further
// on, each over the end of the one behind it.
template <bool kNegative>
[[gnu::always_inline]] inline void Encode(const Digits& digits, unsigned carry, OCINumber* result) {
    using namespace detail;
    std::uint8_t* bytes = result->OCINumberPart;
    const unsigned count = CountDigits(digits);
    const std::uint64_t* bias = kEncoding.rows[kNegative][count].words;
    const std::uint64_t* w = digits.words;
    const int exponent = digits.exponent + static_cast<int>(carry);
    bytes[0] = static_cast<std::uint8_t>(count + carry + 1 + (kNegative && count + carry < kMantissaDigits));
    bytes[1] = static_cast<std::uint8_t>(kNegative ? 62 - exponent : 193 + exponent);
    bytes[2] = kNegative ? 100 : 2;
    Store(bytes + 18, static_cast<std::uint32_t>((kNegative ? bias[2] - w[2] : bias[2] + w[2]) >> 32 >> carry * 8));
    Store(bytes + 10 + carry, kNegative ? bias[1] - w[1] : bias[1] + w[1]);
    Store(bytes + 2 + carry, kNegative ? bias[0] - w[0] : bias[0] + w[0]);
}

// kBadNumber for malformed bytes, kNumberOverflow for an infinity.
inline Errno Unpack(const OCINumber& value, Digits* digits) noexcept {
    const std::uint8_t* bytes = value.OCINumberPart;
    if (!HasMantissa(value)) return detail::UnpackRare(value, digits);
    const std::uint64_t rare = bytes[1] < 128 ? Decode<true>(bytes, digits) : Decode<false>(bytes, digits);
    return rare ? detail::UnpackRare(value, digits) : 0;
}

void SetInfinity(bool negative, OCINumber* result) noexcept;

// Writes normalized digits, of which the last four are 0. kNumberOverflow or kNumberUnderflow when the exponent does
// not fit.
inline Errno Pack(const Digits& digits, OCINumber* result) noexcept {
    if (digits.IsZero()) {
        SetZero(result);
        return 0;
    }
    if (digits.exponent > kMaxExponent) return errors::kNumberOverflow;
    if (digits.exponent < kMinExponent) return errors::kNumberUnderflow;
    if (digits.negative)
        Encode<true>(digits, 0, result);
    else
        Encode<false>(digits, 0, result);
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
