// A number as decimal digits, which text, reals and decimal floats are made from.
#pragma once

#include <string_view>

#include "number/digits.h"
#include "number/number.h"

namespace number {

// value = 0.digits x 10^point. The digits are characters without zeros at either end; none for zero.
struct Decimal {
    char digits[2 * kUnpackedDigits];
    int count = 0;
    int point = 0;
    bool negative = false;

    [[nodiscard]] std::string_view Text() const { return {digits, static_cast<std::size_t>(count)}; }
};

// Of digits that come from a number.
Decimal ToDecimal(const Digits& digits) noexcept;

// Rounded to a number's digits and packed. Of a longer text than Decimal holds, the first digits are enough: what follows
// does not change a rounding half up. Leading zeros are allowed.
Errno FromDecimal(std::string_view digits, int point, bool negative, OCINumber* result) noexcept;

// Reads blanks, sign, digits with a point, exponent, blanks; false when the text is anything else. *error is kOverflow or
// kUnderflow for a number out of range.
bool ReadPlain(std::string_view text, char decimal, OCINumber* result, Errno* error) noexcept;

}  // namespace number
