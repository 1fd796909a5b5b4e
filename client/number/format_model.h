// A number format, taken apart. Only what holds for the whole model is kept; the digit places stay in the text.
#pragma once

#include <string_view>

#include "handles/errors.h"
#include "number/number.h"

namespace number {

struct FormatModel {
    enum class Kind { fixed, shortest, shortest_scientific, hexadecimal, roman };
    enum class Sign { before, leading_s, trailing_s, trailing_minus, brackets };
    enum class Currency { none, leading, trailing, point };

    Kind kind = Kind::fixed;
    Sign sign = Sign::before;
    Currency currency = Currency::none;
    char currency_element = 0;  // '$', 'L', 'C' or 'U'
    bool fill = true;           // false with FM: no blanks, no needless zeros
    bool blank_zero = false;    // B
    bool scientific = false;    // EEEE
    bool lower_case = false;    // of RN and X
    char point = 0;             // '.', 'D', 'V', the element of a currency that stands for it, or 0
    int places_before = 0;      // digit places
    int places_after = 0;       // behind the point or the V
    int zeros_before = 0;       // places before the point, or the end with V, that are always digits
    int zeros_after = 0;        // places after it up to the last 0
    bool groups = false;
    std::string_view whole;  // the elements before the point: 9, 0, comma and G count, others are passed over
};

// kBadNumberFormat for unknown or misplaced elements. The model keeps a view of the text.
Errno ParseFormat(std::string_view text, FormatModel* model) noexcept;

// Roman numerals: the largest, and how long they get.
constexpr int kLargestRoman = 3999;
constexpr int kRomanWidth = 15;
struct RomanDigit {
    int value;
    std::string_view letters;
};
constexpr RomanDigit kRomanDigits[] = {{1000, "M"}, {900, "CM"}, {500, "D"}, {400, "CD"}, {100, "C"},
                                       {90, "XC"},  {50, "L"},   {40, "XL"}, {10, "X"},   {9, "IX"},
                                       {5, "V"},    {4, "IV"},   {1, "I"}};
// The one spelling of 1 to kLargestRoman, in capitals.
std::string_view SpellRoman(int value, char (&letters)[kRomanWidth]);

// The elements in the whole part that something is printed for.
inline bool IsPlace(char element) { return element == '9' || element == '0'; }
inline bool IsGroup(char element) { return element == ',' || element == 'G' || element == 'g'; }

}  // namespace number
