// Texts into decimal64 and decimal128: digits read one by one, rounded, brought into range, encoded.
#include <cctype>
#include <charconv>
#include <cstring>

#include "objects/decimal_float.h"

namespace {

__extension__ using Coefficient = unsigned __int128;

struct Format {
    int digits;
    int bias;              // of the exponent; its negative is the lowest exponent
    int highest_exponent;  // of a coefficient that uses all digits
};
constexpr Format kDecimal64 = {16, 398, 369};
constexpr Format kDecimal128 = {34, 6176, 6111};

struct Decimal {
    bool negative = false;
    Coefficient coefficient = 0;
    int exponent = 0;
};

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
        if (round_up_) ++coefficient;
        return any;
    }

    Coefficient coefficient = 0;
    int exponent = 0;

private:
    void Take(int digit) {
        if (taken_ < format_.digits) {
            coefficient = coefficient * 10 + static_cast<unsigned>(digit);
            if (coefficient != 0) ++taken_;
            return;
        }
        if (taken_ == format_.digits) round_up_ = digit >= 5;
        ++taken_;
        ++exponent;
    }

    const Format& format_;
    int taken_ = 0;  // significant digits seen
    bool round_up_ = false;
};

bool ReadExponent(std::string_view text, int& exponent) {
    if (!text.empty() && text[0] == '+') text.remove_prefix(1);
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), exponent);
    constexpr int kSane = 1000000;
    return error == std::errc() && end == text.data() + text.size() && exponent > -kSane && exponent < kSane;
}

bool ReadDecimal(std::string_view text, const Format& format, Decimal& value) {
    if (!text.empty() && (text[0] == '-' || text[0] == '+')) {
        value.negative = text[0] == '-';
        text.remove_prefix(1);
    }
    const size_t mark = text.find_first_of("eE");
    DigitReader digits(format);
    int exponent = 0;
    if (!digits.Read(text.substr(0, mark))) return false;
    if (mark != std::string_view::npos && !ReadExponent(text.substr(mark + 1), exponent)) return false;
    value.coefficient = digits.coefficient;
    value.exponent = digits.exponent + exponent;
    return true;
}

Coefficient PowerOfTen(int exponent) {
    Coefficient power = 1;
    while (exponent-- > 0) power *= 10;
    return power;
}

// Brings coefficient and exponent into the format's range. False when the value is too large for it.
bool Fit(Decimal& value, const Format& format) {
    const Coefficient limit = PowerOfTen(format.digits);
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

uint64_t Encode64(const Decimal& value) {
    const auto coefficient = static_cast<uint64_t>(value.coefficient);
    const auto exponent = static_cast<uint64_t>(value.exponent + kDecimal64.bias);
    const uint64_t sign = uint64_t{value.negative} << 63;
    if (coefficient >> 53 == 0) return sign | exponent << 53 | coefficient;
    // The three highest bits of a larger coefficient are always 100; two set bits in front of the exponent say so.
    return sign | uint64_t{3} << 61 | exponent << 51 | (coefficient & ((uint64_t{1} << 51) - 1));
}

Coefficient Encode128(const Decimal& value) {
    const auto exponent = static_cast<Coefficient>(value.exponent + kDecimal128.bias);
    return Coefficient{value.negative} << 127 | exponent << 113 | value.coefficient;
}

}  // namespace

bool DecimalFloatFromText(std::string_view text, uint32_t size, unsigned char* bytes) {
    const Format& format = size == 8 ? kDecimal64 : kDecimal128;
    Decimal value;
    if (!ReadDecimal(text, format, value) || !Fit(value, format)) return false;
    if (size == 8) {
        const uint64_t encoded = Encode64(value);
        std::memcpy(bytes, &encoded, sizeof encoded);
    } else {
        const Coefficient encoded = Encode128(value);
        std::memcpy(bytes, &encoded, sizeof encoded);
    }
    return true;
}
