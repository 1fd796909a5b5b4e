#include "values/packed_decimal.h"

#include <algorithm>
#include <string_view>

#include "handles/errors.h"
#include "number/number.h"
#include "oci.h"
#include "values/conversion.h"

namespace values {
namespace {

constexpr std::size_t kMaxDigits = number::kMaxDigits;
constexpr std::uint8_t kPlus = 0xC;
constexpr std::uint8_t kMinus = 0xD;

}  // namespace

int ToPackedDecimal(const OCINumber& number, int precision, int scale, void* bytes, std::size_t size) {
    OCINumber shifted;
    if (number::Round(number, scale, &shifted) != 0 || number::Shift(shifted, scale, &shifted) != 0)
        return errors::kDoesNotFit;
    char text[number::kMaxPlainText];
    std::size_t length = 0;
    if (number::ToPlainText(shifted, '.', text, &length) != 0) return errors::kDoesNotFit;
    std::string_view digits(text, length);
    const bool negative = digits.front() == '-';
    digits.remove_prefix(negative);
    std::size_t room = size * 2 - 1;
    if (precision > 0) room = std::min(room, static_cast<std::size_t>(precision));
    if (digits.size() > room || digits.find_first_not_of("0123456789") != std::string_view::npos)
        return errors::kDoesNotFit;

    auto* out = static_cast<std::uint8_t*>(bytes);
    std::fill_n(out, size, std::uint8_t{0});
    out[size - 1] = negative ? kMinus : kPlus;
    for (std::size_t half = 1; !digits.empty(); ++half, digits.remove_suffix(1)) {
        std::uint8_t& byte = out[size - 1 - half / 2];
        byte = static_cast<std::uint8_t>(byte | (digits.back() - '0') << (half % 2 * 4));
    }
    return 0;
}

int FromPackedDecimal(const void* bytes, std::size_t size, int scale, OCINumber* number) {
    const auto* in = static_cast<const std::uint8_t*>(bytes);
    char text[kMaxDigits + 1];
    std::size_t length = 0;
    const std::uint8_t sign = in[size - 1] & 15;
    if (sign < 10) return errors::kBadPackedDecimal;
    if (sign == 0xD || sign == 0xB) text[length++] = '-';
    const std::size_t first_digit = length;
    for (std::size_t half = 0; half < size * 2 - 1; ++half) {
        const int digit = half % 2 == 0 ? in[half / 2] >> 4 : in[half / 2] & 15;
        if (digit > 9) return errors::kBadPackedDecimal;
        if (digit == 0 && length == first_digit) continue;
        if (length == kMaxDigits) return errors::kNumericOverflow;
        text[length++] = static_cast<char>('0' + digit);
    }
    if (length == first_digit) text[length++] = '0';
    if (number::FromPlainText({text, length}, '.', number) != 0) return errors::kBadPackedDecimal;
    return number::Shift(*number, -scale, number) != 0 ? errors::kNumericOverflow : 0;
}

}  // namespace values
