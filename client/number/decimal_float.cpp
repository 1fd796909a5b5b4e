// Decimal floating point of 8 and 16 bytes: sign, exponent and an integer coefficient.
#include "number/decimal_float.h"

#include "handles/errors.h"
#include "number/decimal.h"

namespace number {

namespace {

struct Form {
    int digits;
    int coefficient_bits;  // of the usual form
    int exponent_bits;
    int bias;
};
constexpr Form kForm64{16, 53, 10, 398};
constexpr Form kForm128{34, 113, 14, 6176};

Wide PowerOfTen(int exponent) {
    Wide power = 1;
    for (; exponent > 0; --exponent) power *= 10;
    return power;
}

struct Parts {
    bool negative;
    bool special;  // infinity or NaN
    bool nan;
    int exponent;
    Wide coefficient;
};

Parts Split(Wide bits, const Form& form) {
    const int sign = form.coefficient_bits + form.exponent_bits;
    const auto field = [bits](int from, int count) {
        return static_cast<unsigned>(bits >> from & ((Wide{1} << count) - 1));
    };
    Parts parts{};
    parts.negative = field(sign, 1) != 0;
    int low = form.coefficient_bits;
    if (field(sign - 2, 2) == 3) {  // the exponent is two bits lower, the coefficient begins with 100
        parts.special = field(sign - 4, 4) == 15;
        parts.nan = field(sign - 5, 1) != 0;
        low -= 2;
        parts.coefficient = Wide{4} << low;
    }
    parts.exponent = static_cast<int>(field(low, form.exponent_bits)) - form.bias;
    parts.coefficient |= bits & ((Wide{1} << low) - 1);
    if (parts.coefficient >= PowerOfTen(form.digits)) parts.coefficient = 0;  // not canonical
    return parts;
}

Wide Join(const Parts& parts, const Form& form) {
    const int sign = form.coefficient_bits + form.exponent_bits;
    const Wide exponent = static_cast<unsigned>(parts.exponent + form.bias);
    const Wide top = Wide{parts.negative} << sign;
    if (parts.coefficient >> form.coefficient_bits == 0)
        return top | exponent << form.coefficient_bits | parts.coefficient;
    const int low = form.coefficient_bits - 2;
    return top | Wide{3} << (sign - 2) | exponent << low | (parts.coefficient & ((Wide{1} << low) - 1));
}

// The bytes are little-endian whatever the machine is.
Wide LoadBits(const void* bytes, std::size_t size) {
    Wide bits = 0;
    for (std::size_t i = size; i-- > 0;) bits = bits << 8 | static_cast<const std::uint8_t*>(bytes)[i];
    return bits;
}
void StoreBits(Wide bits, std::size_t size, void* bytes) {
    for (std::size_t i = 0; i < size; ++i, bits >>= 8)
        static_cast<std::uint8_t*>(bytes)[i] = static_cast<std::uint8_t>(bits);
}

}  // namespace

Errno FromDecimalFloat(const void* bytes, std::size_t size, OCINumber* result) noexcept {
    const Form& form = size == kDecimal64Size ? kForm64 : kForm128;
    const Parts parts = Split(LoadBits(bytes, size), form);
    if (parts.special) return parts.nan ? errors::kBadNumber : errors::kNumberOverflow;
    char text[kMaxDigits];
    char* at = text + sizeof text;
    for (Wide rest = parts.coefficient; rest != 0; rest /= 10)
        *--at = static_cast<char>('0' + static_cast<int>(rest % 10));
    const auto count = static_cast<std::size_t>(text + sizeof text - at);
    return FromDecimal({at, count}, parts.exponent + static_cast<int>(count), parts.negative, result);
}

Errno ToDecimalFloat(const OCINumber& value, std::size_t size, void* bytes) noexcept {
    const Form& form = size == kDecimal64Size ? kForm64 : kForm128;
    OCINumber rounded;
    Digits digits;
    if (const Errno error = Prec(value, form.digits, &rounded)) return error;
    if (const Errno error = Unpack(rounded, &digits)) return error;
    const Decimal decimal = ToDecimal(digits);
    Parts parts{};
    parts.negative = decimal.negative;
    parts.exponent = decimal.point - decimal.count;
    for (const char digit : decimal.Text())
        parts.coefficient = parts.coefficient * 10 + static_cast<unsigned>(digit - '0');
    StoreBits(Join(parts, form), size, bytes);
    return 0;
}

}  // namespace number
