// A number as decimal digits, which text, reals and decimal floats are made from.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstring>
#include <string_view>

#include "handles/errors.h"
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

// Rounded to a number's digits and packed. Of a longer text than Decimal holds, the first digits are enough: what
// follows does not change a rounding half up. Leading zeros are allowed.
Errno FromDecimal(std::string_view digits, int point, bool negative, OCINumber* result) noexcept;

inline bool IsDigit(char c) { return c >= '0' && c <= '9'; }

// Takes the digits of a number one by one, however many.
class DigitReader {
public:
    void Add(char digit, bool after_point) {
        any_ = true;
        const bool significant = count_ > 0 || digit != '0';
        if (significant && count_ < sizeof kept_) kept_[count_++] = digit;
        if (after_point)
            point_ -= !significant;
        else
            point_ += significant;
    }
    [[nodiscard]] bool Any() const { return any_; }
    // The number of the digits times 10^exponent.
    Errno Finish(int exponent, bool negative, OCINumber* result) const {
        return FromDecimal({kept_, count_}, point_ + exponent, negative, result);
    }

private:
    char kept_[2 * kUnpackedDigits];  // from the first that is not 0
    std::size_t count_ = 0;
    int point_ = 0;
    bool any_ = false;
};

// Writes one run of characters after another into an area. What does not fit is counted only.
class Writer {
public:
    Writer(char* text, std::size_t capacity) : text_(text), capacity_(capacity) {}
    void Put(char c) {
        if (length_ < capacity_) text_[length_] = c;
        ++length_;
    }
    void Put(std::string_view run) {
        if (!run.empty() && length_ < capacity_)  // an empty one may have no address
            std::memcpy(text_ + length_, run.data(), std::min(run.size(), capacity_ - length_));
        length_ += run.size();
    }
    void Repeat(char c, std::ptrdiff_t count) {
        for (; count > 0; --count) Put(c);
    }
    [[nodiscard]] std::size_t Length() const { return length_; }
    [[nodiscard]] bool Overflowed() const { return length_ > capacity_; }

private:
    char* text_;
    std::size_t capacity_;
    std::size_t length_ = 0;
};

// The magnitude as digits and a point, or as one digit, a point, the others and an exponent of two places or more.
int FixedPlaces(const Decimal& value);  // digits of the fixed form
void PutFixed(const Decimal& value, char decimal, Writer* out);
void PutScientific(const Decimal& value, char decimal, Writer* out);
void PutExponent(int exponent, Writer* out);

// Reads E, sign and digits; where they are missing, leaves *exponent and the position alone.
const char* ReadExponent(const char* at, const char* end, int* exponent);

// Reads blanks, sign, digits with a point, exponent, blanks; false when the text is anything else. *error is
// kNumberOverflow or kNumberUnderflow for a number out of range.
bool ReadPlain(std::string_view text, char decimal, OCINumber* result, Errno* error) noexcept;

}  // namespace number
