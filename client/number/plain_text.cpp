// Numbers to and from text without a format.
#include "number/decimal.h"

namespace number {

namespace {

constexpr int kMostPlaces = 40;       // of the fixed form
constexpr int kHugeExponent = 10'000'000;

// Writes one run of characters after another; the caller's room is known to be enough.
class Writer {
public:
    explicit Writer(char* text) : start_(text), at_(text) {}
    void Put(char c) { *at_++ = c; }
    void Put(std::string_view run) {
        std::memcpy(at_, run.data(), run.size());
        at_ += run.size();
    }
    void Zeros(int count) {
        for (; count > 0; --count) Put('0');
    }
    [[nodiscard]] std::size_t Length() const { return static_cast<std::size_t>(at_ - start_); }

private:
    char* start_;
    char* at_;
};

void PutFixed(const Decimal& value, char decimal, Writer* out) {
    const std::string_view digits = value.Text();
    const auto whole = static_cast<std::size_t>(std::clamp(value.point, 0, value.count));
    out->Put(digits.substr(0, whole));
    out->Zeros(value.point - value.count);
    if (value.point >= value.count) return;
    out->Put(decimal);
    out->Zeros(-value.point);
    out->Put(digits.substr(whole));
}

void PutScientific(const Decimal& value, char decimal, Writer* out) {
    const std::string_view digits = value.Text();
    out->Put(digits.front());
    if (digits.size() > 1) {
        out->Put(decimal);
        out->Put(digits.substr(1));
    }
    int exponent = value.point - 1;
    out->Put('E');
    out->Put(exponent < 0 ? '-' : '+');
    exponent = exponent < 0 ? -exponent : exponent;
    if (exponent >= 100) out->Put(static_cast<char>('0' + exponent / 100));
    out->Put(static_cast<char>('0' + exponent / 10 % 10));
    out->Put(static_cast<char>('0' + exponent % 10));
}

// Digits with a point in them, as one run: what stands before the point may hold leading zeros.
struct Mantissa {
    char kept[2 * kUnpackedDigits];  // from the first digit that is not 0
    std::size_t count = 0;
    int point = 0;                   // of `kept`
    bool any = false;
};

bool IsDigit(char c) { return c >= '0' && c <= '9'; }

const char* ReadMantissa(const char* at, const char* end, char decimal, Mantissa* mantissa) {
    bool after_point = false;
    for (; at != end; ++at) {
        if (IsDigit(*at)) {
            mantissa->any = true;
            const bool significant = mantissa->count > 0 || *at != '0';
            if (significant && mantissa->count < sizeof mantissa->kept) mantissa->kept[mantissa->count++] = *at;
            if (after_point) mantissa->point -= !significant;
            else mantissa->point += significant;
        } else if (*at == decimal && !after_point) {
            after_point = true;
        } else {
            break;
        }
    }
    return at;
}

// Reads E, sign and digits; leaves *exponent and the position alone when digits are missing.
const char* ReadExponent(const char* at, const char* end, int* exponent) {
    if (at == end || (*at != 'e' && *at != 'E')) return at;
    const char* digit = at + 1;
    const bool negative = digit != end && *digit == '-';
    if (digit != end && (*digit == '-' || *digit == '+')) ++digit;
    if (digit == end || !IsDigit(*digit)) return at;
    int value = 0;
    for (; digit != end && IsDigit(*digit); ++digit) value = std::min(value * 10 + (*digit - '0'), kHugeExponent);
    *exponent = negative ? -value : value;
    return digit;
}

const char* SkipBlanks(const char* at, const char* end) {
    while (at != end && (*at == ' ' || (*at >= '\t' && *at <= '\r'))) ++at;
    return at;
}

}  // namespace

bool ReadPlain(std::string_view text, char decimal, OCINumber* result, Errno* error) noexcept {
    const char* const end = text.data() + text.size();
    const char* at = SkipBlanks(text.data(), end);
    const bool negative = at != end && *at == '-';
    if (at != end && (*at == '-' || *at == '+')) ++at;
    Mantissa mantissa;
    at = ReadMantissa(at, end, decimal, &mantissa);
    if (!mantissa.any) return false;
    int exponent = 0;
    at = ReadExponent(at, end, &exponent);
    if (SkipBlanks(at, end) != end) return false;
    *error = FromDecimal({mantissa.kept, mantissa.count}, mantissa.point + exponent, negative, result);
    return true;
}

Errno FromPlainText(std::string_view text, char decimal, OCINumber* result) noexcept {
    Errno error;
    if (!ReadPlain(text, decimal, result, &error)) return kInvalidNumber;
    if (error == kUnderflow) SetZero(result);
    return error == kOverflow ? kNumericOverflow : 0;
}

Errno ToPlainText(const OCINumber& value, char decimal, char* text, std::size_t* length) noexcept {
    Digits digits;
    Writer out(text);
    if (const Errno error = Unpack(value, &digits)) {
        if (error == kBadNumber) return error;
        if (value.OCINumberPart[1] == 0) out.Put('-');
        out.Put('~');
    } else if (digits.IsZero()) {
        out.Put('0');
    } else {
        const Decimal number = ToDecimal(digits);
        const int places = std::max(number.point, number.count) - std::min(number.point, 0);
        if (number.negative) out.Put('-');
        if (places > kMostPlaces) PutScientific(number, decimal, &out);
        else PutFixed(number, decimal, &out);
    }
    *length = out.Length();
    return 0;
}

}  // namespace number
