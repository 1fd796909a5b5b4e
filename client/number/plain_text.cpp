// Numbers to and from text without a format.
#include "handles/errors.h"
#include "number/decimal.h"

namespace number {

namespace {

constexpr int kMostPlaces = 40;  // of the fixed form
constexpr int kHugeExponent = 10'000'000;

}  // namespace

int FixedPlaces(const Decimal& value) { return std::max(value.point, value.count) - std::min(value.point, 0); }

void PutFixed(const Decimal& value, char decimal, Writer* out) {
    if (value.count == 0) {
        out->Put('0');
        return;
    }
    const std::string_view digits = value.Text();
    const auto whole = static_cast<std::size_t>(std::clamp(value.point, 0, value.count));
    out->Put(digits.substr(0, whole));
    out->Repeat('0', value.point - value.count);
    if (value.point >= value.count) return;
    out->Put(decimal);
    out->Repeat('0', -value.point);
    out->Put(digits.substr(whole));
}

void PutExponent(int exponent, Writer* out) {
    out->Put('E');
    out->Put(exponent < 0 ? '-' : '+');
    exponent = exponent < 0 ? -exponent : exponent;
    if (exponent >= 100) out->Put(static_cast<char>('0' + exponent / 100));
    out->Put(static_cast<char>('0' + exponent / 10 % 10));
    out->Put(static_cast<char>('0' + exponent % 10));
}

void PutScientific(const Decimal& value, char decimal, Writer* out) {
    const std::string_view digits = value.count > 0 ? value.Text() : "0";
    out->Put(digits.front());
    if (digits.size() > 1) {
        out->Put(decimal);
        out->Put(digits.substr(1));
    }
    PutExponent(value.count > 0 ? value.point - 1 : 0, out);
}

namespace {

const char* ReadMantissa(const char* at, const char* end, char decimal, DigitReader* digits) {
    bool after_point = false;
    for (; at != end; ++at) {
        if (IsDigit(*at)) {
            digits->Add(*at, after_point);
        } else if (*at == decimal && !after_point) {
            after_point = true;
        } else {
            break;
        }
    }
    return at;
}

}  // namespace

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

namespace {

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
    DigitReader digits;
    at = ReadMantissa(at, end, decimal, &digits);
    if (!digits.Any()) return false;
    int exponent = 0;
    at = ReadExponent(at, end, &exponent);
    if (SkipBlanks(at, end) != end) return false;
    *error = digits.Finish(exponent, negative, result);
    return true;
}

Errno FromPlainText(std::string_view text, char decimal, OCINumber* result) noexcept {
    Errno error;
    if (!ReadPlain(text, decimal, result, &error)) return errors::kInvalidNumber;
    if (error == errors::kNumberUnderflow) SetZero(result);
    return error == errors::kNumberOverflow ? errors::kNumericOverflow : 0;
}

Errno ToPlainText(const OCINumber& value, char decimal, char* text, std::size_t* length) noexcept {
    Digits digits;
    Writer out(text, kMaxPlainText);
    if (const Errno error = Unpack(value, &digits)) {
        if (error == errors::kBadNumber) return error;
        if (value.OCINumberPart[1] == 0) out.Put('-');
        out.Put('~');
    } else {
        const Decimal number = ToDecimal(digits);
        if (number.negative) out.Put('-');
        if (FixedPlaces(number) > kMostPlaces)
            PutScientific(number, decimal, &out);
        else
            PutFixed(number, decimal, &out);
    }
    *length = out.Length();
    return 0;
}

}  // namespace number
