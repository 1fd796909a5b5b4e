// Decimal floating-point values of 16 and 34 digits, for the driver and for libkelpci: IEEE 754 decimal64 and
// decimal128, the coefficient as a binary integer, little-endian whatever the machine is. A size is 8 or 16 bytes,
// which need no alignment. Any thread.
#pragma once

#include <cstddef>
#include <string_view>

namespace decimal_float {

__extension__ using Coefficient = unsigned __int128;

// coefficient * 10^exponent. A coefficient with more digits than the size holds stands for 0.
struct Parts {
    bool negative = false;
    bool infinite = false;  // `nan` aside, nothing else counts where one of these is set
    bool nan = false;
    int exponent = 0;
    Coefficient coefficient = 0;
};

// The most digits that a coefficient of the size has.
constexpr int Digits(std::size_t size) {
    return size == 8 ? 16 : 34;
}

Parts Unpack(const void* bytes, std::size_t size);
// Coefficient and exponent must be in the size's range.
void Pack(const Parts& parts, std::size_t size, void* bytes);

// The value of a text such as -12.5E-3, rounded half away from zero to the size's digits. False when the text is no
// number or too large; nothing is written then.
bool FromText(std::string_view text, std::size_t size, void* bytes);

}  // namespace decimal_float
