// Packed decimal to and from digits and texts. Any thread.
#include "platform/packed_decimal.h"

#include <algorithm>
#include <string>
#include <string_view>

namespace {

constexpr int kPlus = 0xC;
constexpr int kMinus = 0xD;

// A bounded text that stays terminated.
class Writer {
public:
    Writer(char* text, std::size_t capacity) : text_(text), capacity_(capacity) {
        if (capacity_ > 0) text_[0] = '\0';
    }
    void Put(char character) {
        if (length_ + 1 >= capacity_) {
            full_ = true;
            return;
        }
        text_[length_++] = character;
        text_[length_] = '\0';
    }
    [[nodiscard]] bool Full() const { return full_; }

private:
    char* text_;
    std::size_t capacity_;
    std::size_t length_ = 0;
    bool full_ = false;
};

int Half(const unsigned char* packed, std::size_t index) {
    return index % 2 == 0 ? packed[index / 2] >> 4 : packed[index / 2] & 0xF;
}

bool IsDigit(char character) {
    return character >= '0' && character <= '9';
}

bool IsBlank(char character) {
    return character == ' ' || character == '\t';
}

// A decimal number as read: 0.DIGITS times 10^point, without leading zeros.
struct Decimal {
    bool negative = false;
    std::string digits;
    std::int64_t point = 0;
};

// The number behind 'e', held within bounds that no precision and scale reach.
bool ReadExponent(std::string_view& rest, std::int64_t& exponent) {
    constexpr std::int64_t kBound = 1'000'000;
    const bool negative = rest.starts_with('-');
    if (rest.starts_with('-') || rest.starts_with('+')) rest.remove_prefix(1);
    if (rest.empty() || !IsDigit(rest[0])) return false;
    for (; !rest.empty() && IsDigit(rest[0]); rest.remove_prefix(1))
        exponent = std::min(exponent * 10 + (rest[0] - '0'), kBound);
    if (negative) exponent = -exponent;
    return true;
}

bool ReadDecimal(std::string_view rest, Decimal& decimal) {
    while (!rest.empty() && IsBlank(rest.front())) rest.remove_prefix(1);
    while (!rest.empty() && IsBlank(rest.back())) rest.remove_suffix(1);
    decimal.negative = rest.starts_with('-');
    if (rest.starts_with('-') || rest.starts_with('+')) rest.remove_prefix(1);
    bool any = false;
    bool after_point = false;
    for (; !rest.empty() && (IsDigit(rest[0]) || (rest[0] == '.' && !after_point)); rest.remove_prefix(1)) {
        if (rest[0] == '.') {
            after_point = true;
            continue;
        }
        any = true;
        const bool leading_zero = rest[0] == '0' && decimal.digits.empty();
        if (!leading_zero) decimal.digits += rest[0];
        if (leading_zero && after_point) --decimal.point;
        if (!leading_zero && !after_point) ++decimal.point;
    }
    if (!any) return false;
    std::int64_t exponent = 0;
    if (rest.starts_with('e') || rest.starts_with('E')) {
        rest.remove_prefix(1);
        if (!ReadExponent(rest, exponent)) return false;
    }
    decimal.point += exponent;
    return rest.empty();
}

// The first `count` digits, rounded by the next one and filled with zeros.
std::string Rounded(const std::string& digits, std::int64_t count) {
    if (count < 0) return "";
    const auto wanted = static_cast<std::size_t>(count);
    std::string kept = digits.substr(0, wanted);
    kept.resize(wanted, '0');
    if (wanted >= digits.size() || digits[wanted] < '5') return kept;
    std::size_t index = wanted;
    while (index > 0 && kept[index - 1] == '9') kept[--index] = '0';
    if (index > 0) ++kept[index - 1];
    else kept.insert(0, 1, '1');
    return kept;
}

// Whether the closing half byte is a sign, and which.
bool ReadSign(const unsigned char* packed, std::size_t size, bool& negative) {
    const int sign = packed[size - 1] & 0xF;
    negative = sign == kMinus || sign == 0xB;
    return sign >= 0xA;
}

}  // namespace

int ReadPackedDecimal(const void* packed, std::size_t size, bool* negative, char* digits, std::size_t room,
                      std::size_t* count) {
    const auto* const bytes = static_cast<const unsigned char*>(packed);
    *count = 0;
    if (!ReadSign(bytes, size, *negative)) return kDecimalBadSign;
    for (std::size_t half = 0; half < 2 * size - 1; ++half) {
        const int digit = Half(bytes, half);
        if (digit > 9) return kDecimalBadDigit;
        if (digit == 0 && *count == 0) continue;
        if (*count == room) return kDecimalTooShort;
        digits[(*count)++] = static_cast<char>('0' + digit);
    }
    return kDecimalDone;
}

void WritePackedDecimal(std::string_view digits, bool negative, void* packed, std::size_t size) {
    auto* const bytes = static_cast<unsigned char*>(packed);
    std::fill_n(bytes, size, static_cast<unsigned char>(0));
    bytes[size - 1] = static_cast<unsigned char>(negative ? kMinus : kPlus);
    for (std::size_t half = 1; !digits.empty(); ++half, digits.remove_suffix(1)) {
        unsigned char& byte = bytes[size - 1 - half / 2];
        byte = static_cast<unsigned char>(byte | (digits.back() - '0') << (half % 2 * 4));
    }
}

int DecimalToText(const unsigned char* packed, std::uint32_t precision, std::int32_t scale, char* text,
                  std::size_t capacity) {
    Writer writer(text, capacity);
    const std::size_t count = 2 * PackedDecimalSize(precision) - 1;    // digits, an unused leading one included
    bool negative = false;
    if (!ReadSign(packed, PackedDecimalSize(precision), negative)) return kDecimalBadSign;

    const auto end = static_cast<std::int64_t>(count);
    const std::int64_t point = end - scale;    // index of the first digit behind the point; may lie outside
    bool zero = true;
    for (std::size_t index = 0; index < count; ++index) zero = zero && Half(packed, index) == 0;
    if (negative && !zero) writer.Put('-');

    const std::int64_t first = zero ? point - 1 : std::min<std::int64_t>(0, point - 1);
    bool started = false;
    for (std::int64_t index = first; index < std::max(end, point); ++index) {
        const bool outside = index < 0 || index >= end;
        const int digit = outside ? 0 : Half(packed, static_cast<std::size_t>(index));
        if (digit > 9) return kDecimalBadDigit;
        if (index == point) writer.Put('.');
        started = started || digit != 0 || index >= point - 1;
        if (started) writer.Put(static_cast<char>('0' + digit));
        if (writer.Full()) return kDecimalTooShort;
    }
    return kDecimalDone;
}

int TextToDecimal(const char* text, unsigned char* packed, std::uint32_t precision, std::int32_t scale) {
    Decimal decimal;
    if (!ReadDecimal(text, decimal)) return kDecimalBadText;
    const std::int64_t count = decimal.digits.empty() ? 0 : decimal.point + scale;
    if (count > precision) return kDecimalOverflow;
    const std::string digits = Rounded(decimal.digits, count);
    if (digits.size() > precision) return kDecimalOverflow;

    const bool negative = decimal.negative && digits.find_first_not_of('0') != std::string::npos;
    WritePackedDecimal(digits, negative, packed, PackedDecimalSize(precision));
    return kDecimalDone;
}
