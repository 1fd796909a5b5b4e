#include "values/packed_decimal.h"

#include <algorithm>
#include <string_view>

#include "handles/errors.h"
#include "number/number.h"
#include "oci.h"
#include "platform/packed_decimal.h"
#include "values/conversion.h"

namespace values {

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

    WritePackedDecimal(digits, negative, bytes, size);
    return 0;
}

int FromPackedDecimal(const void* bytes, std::size_t size, int scale, OCINumber* number) {
    char text[1 + number::kMaxDigits] = {'-', '0'};
    bool negative = false;
    std::size_t count = 0;
    const int result = ReadPackedDecimal(bytes, size, &negative, text + 1, number::kMaxDigits, &count);
    if (result == kDecimalTooShort) return errors::kNumericOverflow;
    if (result != kDecimalDone) return errors::kBadPackedDecimal;
    const std::string_view signed_text(text, 1 + std::max<std::size_t>(count, 1));
    if (number::FromPlainText(signed_text.substr(negative ? 0 : 1), '.', number) != 0) return errors::kBadPackedDecimal;
    return number::Shift(*number, -scale, number) != 0 ? errors::kNumericOverflow : 0;
}

}  // namespace values
