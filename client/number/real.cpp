// Conversions from and to the reals of the machine. Both ways go through decimal text, where the standard library
// rounds correctly; nothing here depends on the locale, since no text holds a point.
#include <charconv>
#include <cmath>
#include <cstdlib>
#include <limits>

#include "handles/errors.h"
#include "number/decimal.h"
#include "number/number.h"

namespace number {

namespace {

constexpr std::size_t kMaxText = 64;

// With the digits that tell it from other reals, or with so many places after the first digit.
template <class Real, class... Places> Errno FromReal(Real value, OCINumber* result, Places... places) {
    if (std::isnan(value)) return errors::kBadNumber;
    if (std::isinf(value)) return errors::kNumberOverflow;
    char text[kMaxText];
    const auto end = std::to_chars(text, text + sizeof text, value, std::chars_format::scientific, places...).ptr;
    Errno error = 0;
    ReadPlain({text, static_cast<std::size_t>(end - text)}, '.', result, &error);
    return error;
}

Errno Read(const char* text, const char* end, double* value) {
    std::from_chars(text, end, *value);    // which holds the largest number, and the smallest
    return 0;
}
Errno Read(const char* text, const char* end, float* value) {
    return std::from_chars(text, end, *value).ec == std::errc{} ? 0 : errors::kNumberOverflow;
}
Errno Read(const char* text, const char*, long double* value) {
    *value = std::strtold(text, nullptr);
    return 0;
}

template <class Real> Errno ToReal(const OCINumber& value, Real* result) {
    Digits digits;
    if (Unpack(value, &digits) == errors::kBadNumber) return errors::kBadNumber;
    if (IsInfinite(value)) {
        *result = value.OCINumberPart[1] == 0 ? -std::numeric_limits<Real>::infinity()
                                              : std::numeric_limits<Real>::infinity();
        return 0;
    }
    if (digits.IsZero()) {
        *result = 0;
        return 0;
    }
    const Decimal decimal = ToDecimal(digits);
    char text[kMaxText];
    char* at = text;
    if (decimal.negative) *at++ = '-';
    at = std::copy_n(decimal.digits, decimal.count, at);
    *at++ = 'e';
    at = std::to_chars(at, text + sizeof text - 1, decimal.point - decimal.count).ptr;
    *at = '\0';
    if (Read(text, at, result)) return decimal.point > 0 ? errors::kNumberOverflow : errors::kNumberUnderflow;
    return 0;
}

}  // namespace

Errno FromFloat(float value, OCINumber* result) noexcept { return FromReal(value, result); }
Errno FromDouble(double value, OCINumber* result) noexcept { return FromReal(value, result); }
Errno FromLongDouble(long double value, OCINumber* result) noexcept { return FromReal(value, result); }
Errno FromReal15(double value, OCINumber* result) noexcept { return FromReal(value, result, kRealDigits - 1); }
Errno ToFloat(const OCINumber& value, float* result) noexcept { return ToReal(value, result); }
Errno ToDouble(const OCINumber& value, double* result) noexcept { return ToReal(value, result); }
Errno ToLongDouble(const OCINumber& value, long double* result) noexcept { return ToReal(value, result); }

double WidenByDigits(float value) noexcept {
    char text[kMaxText];
    const auto end = std::to_chars(text, text + sizeof text, value).ptr;
    double widened = value;
    std::from_chars(text, end, widened);
    return widened;
}

}  // namespace number
