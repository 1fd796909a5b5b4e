// Packed decimal, for the driver and for libkelpci: two digits a byte, most significant first; the low half of the last
// byte is the sign, C, A, E or F for plus, D or B for minus. A value of precision p takes p / 2 + 1 bytes and means its
// digits times 10^-scale. Any thread.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>

constexpr std::size_t PackedDecimalSize(std::uint32_t precision) {
    return precision / 2 + 1;
}

enum DecimalResult : int {
    kDecimalDone = 0,
    kDecimalBadDigit = 1,     // a half byte that is no digit
    kDecimalBadSign = 2,      // a closing half byte that is no sign
    kDecimalTooShort = 3,     // the text does not fit its area
    kDecimalBadText = 4,      // not a decimal number
    kDecimalOverflow = 5      // more digits before the point than the precision leaves room for
};

// Sign and significant digits of `size` bytes. At most `room` digits are written, leading zeros left out; more are
// kDecimalTooShort. The sign of zero may be minus.
int ReadPackedDecimal(const void* packed, std::size_t size, bool* negative, char* digits, std::size_t room,
                      std::size_t* count);
// Fills `size` bytes: the digits, at most 2 * size - 1, and zeros before them.
void WritePackedDecimal(std::string_view digits, bool negative, void* packed, std::size_t size);

// Writes sign, digits and point, such as "-0.05", with as many places as the scale says and a terminator. On failure
// the area holds the text so far, terminated (nothing when the capacity is 0).
int DecimalToText(const unsigned char* packed, std::uint32_t precision, std::int32_t scale, char* text,
                  std::size_t capacity);

// Reads an optional sign, digits with an optional point and an optional exponent, blanks around. Places beyond the
// scale are rounded, half away from zero. On failure `packed` is left as it was.
int TextToDecimal(const char* text, unsigned char* packed, std::uint32_t precision, std::int32_t scale);
