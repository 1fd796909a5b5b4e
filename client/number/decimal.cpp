// Between base-100 digits and decimal characters.
#include "number/decimal.h"

#include <array>

namespace number {

namespace {

struct Pairs {
    char text[200];
};
constexpr Pairs MakePairs() {
    Pairs pairs{};
    for (int i = 0; i < 100; ++i) {
        pairs.text[2 * i] = static_cast<char>('0' + i / 10);
        pairs.text[2 * i + 1] = static_cast<char>('0' + i % 10);
    }
    return pairs;
}
constexpr Pairs kPairs = MakePairs();

// The four base-100 digits of eight characters.
std::uint64_t PairUp(const char* text) {
    std::uint64_t word = detail::Load<std::uint64_t>(reinterpret_cast<const std::uint8_t*>(text)) - detail::Repeat('0');
    word = (word >> 8 & 0x00FF00FF00FF00FFu) * 10 + (word & 0x00FF00FF00FF00FFu);
    word = (word | word >> 8) & 0x0000FFFF0000FFFFu;
    return (word | word >> 16) & 0xFFFFFFFFu;
}

}  // namespace

Decimal ToDecimal(const Digits& digits) noexcept {
    Decimal decimal;
    const int pairs = static_cast<int>(CountDigits(digits));
    if (pairs == 0) return decimal;
    char text[2 * kUnpackedDigits];
    for (int i = 0; i < pairs; ++i) std::memcpy(text + 2 * i, kPairs.text + 2 * DigitAt(digits, i), 2);
    const int leading = text[0] == '0';
    const int trailing = text[2 * pairs - 1] == '0';
    decimal.count = 2 * pairs - leading - trailing;
    std::memcpy(decimal.digits, text + leading, static_cast<std::size_t>(decimal.count));
    decimal.point = 2 * (digits.exponent + 1) - leading;
    decimal.negative = digits.negative;
    return decimal;
}

Errno FromDecimal(std::string_view digits, int point, bool negative, OCINumber* result) noexcept {
    const std::size_t zeros = std::min(digits.find_first_not_of('0'), digits.size());
    digits.remove_prefix(zeros);
    point = std::clamp(point, -100'000, 100'000) - static_cast<int>(zeros);
    if (digits.empty()) {
        SetZero(result);
        return 0;
    }
    char text[2 * kUnpackedDigits];
    std::memset(text, '0', sizeof text);
    const std::size_t odd = point % 2 != 0;  // the first pair has one digit
    std::memcpy(text + odd, digits.data(), std::min(digits.size(), sizeof text - odd));
    Digits packed;
    for (int word = 0; word < 3; ++word)
        packed.words[word] = PairUp(text + 16 * word) << 32 | PairUp(text + 16 * word + 8);
    packed.exponent = (point + static_cast<int>(odd)) / 2 - 1;
    packed.negative = negative;
    return RoundAndPack(&packed, result);
}

}  // namespace number
