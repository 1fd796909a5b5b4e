// What the number tests share: numbers from literals, random numbers of awkward digits, and the number that an exact
// fraction must be rounded to, worked out with whole numbers alone.
#pragma once

#include <gmpxx.h>
#include <gtest/gtest.h>

#include <cstdlib>
#include <cstring>
#include <random>
#include <string>
#include <string_view>

#include "number/number.h"

inline bool operator==(const OCINumber& a, const OCINumber& b) { return std::memcmp(&a, &b, sizeof a) == 0; }

inline std::string Shown(const OCINumber& value) {
    char text[number::kMaxPlainText];
    std::size_t length = 0;
    if (number::ToPlainText(value, '.', text, &length)) return "malformed";
    return {text, length};
}

inline void PrintTo(const OCINumber& value, std::ostream* out) { *out << Shown(value); }

inline OCINumber Number(std::string_view literal) {
    OCINumber value{};
    number::FromPlainText(literal, '.', &value);
    return value;
}

// Lays out digits of base 100, of which the first and the last are not 0.
inline OCINumber Composed(const int* digits, int count, int exponent, bool negative) {
    OCINumber value{};
    ub1* bytes = value.OCINumberPart;
    const bool closed = negative && count < 20;
    bytes[0] = static_cast<ub1>(count + 1 + closed);
    bytes[1] = static_cast<ub1>(negative ? 62 - exponent : 193 + exponent);
    for (int i = 0; i < count; ++i) bytes[2 + i] = static_cast<ub1>(negative ? 101 - digits[i] : digits[i] + 1);
    if (closed) bytes[2 + count] = 102;
    return value;
}

inline mpq_class Hundreds(int power) {
    mpz_class scale;
    mpz_ui_pow_ui(scale.get_mpz_t(), 100, static_cast<unsigned long>(std::abs(power)));
    return power < 0 ? mpq_class(1, scale) : mpq_class(scale);
}

inline mpq_class Exact(const OCINumber& value) {
    const int count = value.OCINumberPart[0];
    const bool negative = value.OCINumberPart[1] < 128;
    mpz_class digits;
    int last = 2;
    for (; last <= count && !(negative && value.OCINumberPart[last] == 102); ++last)
        digits = digits * 100 + (negative ? 101 - value.OCINumberPart[last] : value.OCINumberPart[last] - 1);
    const int exponent = negative ? 62 - value.OCINumberPart[1] : value.OCINumberPart[1] - 193;
    return count == 1 ? mpq_class() : mpq_class(negative ? -digits : digits) * Hundreds(exponent - (last - 3));
}

// The nearest number of 20 base-100 digits, half away from zero; or the error for its range.
inline number::Errno Rounded(mpq_class value, OCINumber* result) {
    *result = OCINumber{{1, 128}};
    const int sign = sgn(value);
    if (sign == 0) return 0;
    value = abs(value);
    int exponent = 0;
    while (value >= 100) value /= 100, ++exponent;
    while (value < 1) value *= 100, --exponent;
    value *= Hundreds(19);
    mpz_class whole = (value.get_num() * 2 + value.get_den()) / value.get_den() / 2;    // floor(value + 1/2)
    if (whole >= Hundreds(20)) whole /= 100, ++exponent;
    int digits[20], count = 20;
    for (int i = 19; i >= 0; --i, whole /= 100) digits[i] = static_cast<int>(mpz_class(whole % 100).get_si());
    while (digits[count - 1] == 0) --count;
    *result = Composed(digits, count, exponent, sign < 0);
    return exponent > 62 ? 22053 : exponent < -65 ? 22054 : 0;
}

// What a function answered, and what it should have.
inline void ExpectResult(const std::string& what, number::Errno error, const OCINumber& got, number::Errno wanted_error,
                         const OCINumber& wanted) {
    ASSERT_EQ(error, wanted_error) << what;
    if (!error) {
        ASSERT_EQ(got, wanted) << what;
    }
}

// Random numbers whose digits are often 0, 1, 49, 50 or 99, where carries and roundings happen.
class RandomNumbers {
public:
    explicit RandomNumbers(unsigned seed) : engine_(seed) {}

    int Below(int limit) { return static_cast<int>(engine_() % static_cast<unsigned>(limit)); }

    // With an exponent of base 100 from -spread to spread.
    OCINumber Next(int spread) {
        static constexpr int kCounts[] = {1, 2, 5, 10, 18, 19, 20, 20};
        static constexpr int kAwkward[] = {0, 1, 49, 50, 99};
        const int count = kCounts[Below(8)];
        const bool negative = Below(3) == 0, awkward = Below(2) == 0;
        const int exponent = Below(2 * spread + 1) - spread;
        int digits[20];
        for (int i = 0; i < count; ++i) {
            digits[i] = awkward ? kAwkward[Below(5)] : Below(100);
            if (digits[i] == 0 && (i == 0 || i == count - 1)) digits[i] = 1;
        }
        return Composed(digits, count, exponent, negative);
    }

private:
    std::mt19937 engine_;
};
