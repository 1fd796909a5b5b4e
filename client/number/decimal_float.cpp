// Numbers between their own form and decimal floats, whose bytes the platform reads and writes.
#include "number/decimal_float.h"

#include "handles/errors.h"
#include "number/decimal.h"
#include "platform/decimal_float.h"

namespace number {

Errno FromDecimalFloat(const void* bytes, std::size_t size, OCINumber* result) noexcept {
    const decimal_float::Parts parts = decimal_float::Unpack(bytes, size);
    if (parts.nan) return errors::kBadNumber;
    if (parts.infinite) return errors::kNumberOverflow;
    char text[kMaxDigits];
    char* at = text + sizeof text;
    for (Wide rest = parts.coefficient; rest != 0; rest /= 10)
        *--at = static_cast<char>('0' + static_cast<int>(rest % 10));
    const auto count = static_cast<std::size_t>(text + sizeof text - at);
    return FromDecimal({at, count}, parts.exponent + static_cast<int>(count), parts.negative, result);
}

Errno ToDecimalFloat(const OCINumber& value, std::size_t size, void* bytes) noexcept {
    OCINumber rounded;
    Digits digits;
    if (const Errno error = Prec(value, decimal_float::Digits(size), &rounded)) return error;
    if (const Errno error = Unpack(rounded, &digits)) return error;
    const Decimal decimal = ToDecimal(digits);
    decimal_float::Parts parts;
    parts.negative = decimal.negative;
    parts.exponent = decimal.point - decimal.count;
    for (const char digit : decimal.Text())
        parts.coefficient = parts.coefficient * 10 + static_cast<unsigned>(digit - '0');
    decimal_float::Pack(parts, size, bytes);
    return 0;
}

}  // namespace number
