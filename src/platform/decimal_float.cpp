// Decimal floats: the fields of their bytes, and texts read digit by digit, rounded, brought into range.
#include "platform/decimal_float.h"

#include <cctype>
#include <charconv>
#include <cstdint>

namespace decimal_float {
namespace {

struct Format {
    int digits;
    int coefficient_bits;  // of the usual form
    int exponent_bits;
    int bias;              // of the exponent; its negative is the lowest exponent
    int highest_exponent;  // of a coefficient that uses all digits
};
constexpr Format kDecimal64 = {Digits(8), 53, 10, 398, 369};
constexpr Format kDecimal128 = {Digits(16), 113, 14, 6176, 6111};

constexpr const Format& FormatOf(std::size_t size) {
    return size == 8 ? kDecimal64 : kDecimal128;
}

Coefficient PowerOfTen(int exponent) {
    Coefficient power = 1;
    while (exponent-- > 0) power *= 10;
    return power;
}

// --- Bytes -----------------------------------------------------------------------------------------------------------

Coefficient LoadBits(const void* bytes, std::size_t size) {
    Coefficient bits = 0;
    for (std::size_t index = size; index-- > 0;) bits = bits << 8 | static_cast<const std::uint8_t*>(bytes)[index];
    return bits;
}

void StoreBits(Coefficient bits, std::size_t size, void* bytes) {
    for (std::size_t index = 0; index < size; ++index, bits >>= 8)
        static_cast<std::uint8_t*>(bytes)[index] = static_cast<std::uint8_t>(bits);
}

// --- Texts -----------------------------------------------------------------------------------------------------------

// Takes the digits one by one; those beyond what the format holds only move the exponent and decide the rounding.
class DigitReader {
public:
    explicit DigitReader(const Format& format) : format_(format) {}

    // False when the text holds no digit or something else than digits and one point.
    bool Read(std::string_view text) {
        bool any = false, fraction = false;
        for (const char character : text) {
            if (character == '.' && !fraction) {
                fraction = true;
                continue;
            }
            if (std::isdigit(static_cast<unsigned char>(character)) == 0) return false;
            any = true;
            Take(character - '0');
            if (fraction) --exponent;
        }
        return any;
    }

    Coefficient coefficient = 0;
    int exponent = 0;
    bool round_up = false;  // for those who keep all digits

private:
    void Take(int digit) {
        if (taken_ < format_.digits) {
            coefficient = coefficient * 10 + static_cast<unsigned>(digit);
            if (coefficient != 0) ++taken_;
            return;
        }
        if (taken_ == format_.digits) round_up = digit >= 5;
        ++taken_;
        ++exponent;
    }

    const Format& format_;
    int taken_ = 0;  // significant digits seen
};

bool ReadExponent(std::string_view text, int& exponent) {
    if (text.starts_with('+')) text.remove_prefix(1);
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), exponent);
    constexpr int kSane = 1000000;
    return error == std::errc() && end == text.data() + text.size() && exponent > -kSane && exponent < kSane;
}

bool ReadParts(std::string_view text, const Format& format, Parts& value, bool& round_up) {
    value.negative = text.starts_with('-');
    if (value.negative || text.starts_with('+')) text.remove_prefix(1);
    const size_t mark = text.find_first_of("eE");
    DigitReader digits(format);
    int exponent = 0;
    if (!digits.Read(text.substr(0, mark))) return false;
    if (mark != std::string_view::npos && !ReadExponent(text.substr(mark + 1), exponent)) return false;
    value.coefficient = digits.coefficient;
    round_up = digits.round_up;
    value.exponent = digits.exponent + exponent;
    return true;
}

// Brings coefficient and exponent into the format's range, rounded once: where more digits go, the first of them decides.
// False when the value is too large for it.
bool Fit(Parts& value, bool round_up, const Format& format) {
    const Coefficient limit = PowerOfTen(format.digits);
    if (round_up && value.exponent >= -format.bias) ++value.coefficient;
    if (value.coefficient == limit) {  // rounding carried over
        value.coefficient /= 10;
        ++value.exponent;
    }
    if (value.coefficient == 0) value.exponent = 0;
    while (value.exponent > format.highest_exponent && value.coefficient < limit / 10) {
        value.coefficient *= 10;
        --value.exponent;
    }
    if (value.exponent > format.highest_exponent) return false;
    const int below = -format.bias - value.exponent;
    if (below > format.digits) value.coefficient = 0;
    if (below > 0) {
        const Coefficient unit = PowerOfTen(below > format.digits ? 0 : below);
        value.coefficient = (value.coefficient + unit / 2) / unit;
        value.exponent = -format.bias;
    }
    return true;
}

}  // namespace

// A coefficient of more bits than the usual form has begins with 100. Two set bits behind the sign say so: the exponent
// stands two bits lower then, and those three are left out. Infinities and NaNs begin with four set bits.
Parts Unpack(const void* bytes, std::size_t size) {
    const Format& format = FormatOf(size);
    const Coefficient bits = LoadBits(bytes, size);
    const int sign = format.coefficient_bits + format.exponent_bits;
    const auto field = [bits](int from, int count) {
        return static_cast<unsigned>(bits >> from & ((Coefficient{1} << count) - 1));
    };
    Parts parts;
    parts.negative = field(sign, 1) != 0;
    int low = format.coefficient_bits;
    if (field(sign - 2, 2) == 3) {
        const bool special = field(sign - 4, 4) == 15;
        parts.nan = special && field(sign - 5, 1) != 0;
        parts.infinite = special && !parts.nan;
        low -= 2;
        parts.coefficient = Coefficient{4} << low;
    }
    parts.exponent = static_cast<int>(field(low, format.exponent_bits)) - format.bias;
    parts.coefficient |= bits & ((Coefficient{1} << low) - 1);
    if (parts.coefficient >= PowerOfTen(format.digits)) parts.coefficient = 0;
    return parts;
}

void Pack(const Parts& parts, std::size_t size, void* bytes) {
    const Format& format = FormatOf(size);
    const int sign = format.coefficient_bits + format.exponent_bits;
    const auto exponent = static_cast<Coefficient>(parts.exponent + format.bias);
    const Coefficient top = Coefficient{parts.negative} << sign;
    if (parts.coefficient >> format.coefficient_bits == 0)
        return StoreBits(top | exponent << format.coefficient_bits | parts.coefficient, size, bytes);
    const int low = format.coefficient_bits - 2;
    const Coefficient rest = parts.coefficient & ((Coefficient{1} << low) - 1);
    StoreBits(top | Coefficient{3} << (sign - 2) | exponent << low | rest, size, bytes);
}

bool FromText(std::string_view text, std::size_t size, void* bytes) {
    const Format& format = FormatOf(size);
    Parts value;
    bool round_up = false;
    if (!ReadParts(text, format, value, round_up) || !Fit(value, round_up, format)) return false;
    Pack(value, size, bytes);
    return true;
}

}  // namespace decimal_float
