// What the number tests share: numbers from literals, random numbers of awkward digits, and the number that an exact
// fraction must be rounded to, worked out with whole numbers alone.
#pragma once

#include <gmp.h>

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

// An exact fraction.
class Fraction {
public:
    Fraction() { mpq_init(value_); }
    explicit Fraction(const OCINumber& value) : Fraction() {
        const int count = value.OCINumberPart[0];
        const bool negative = value.OCINumberPart[1] < 128;
        if (count == 1) return;
        int last = 0;
        for (int i = 2; i <= count; ++i) {
            const int byte = value.OCINumberPart[i];
            if (negative && byte == 102) break;
            mpz_mul_ui(mpq_numref(value_), mpq_numref(value_), 100);
            mpz_add_ui(mpq_numref(value_), mpq_numref(value_),
                       static_cast<unsigned long>(negative ? 101 - byte : byte - 1));
            last = i;
        }
        Scale((negative ? 62 - value.OCINumberPart[1] : value.OCINumberPart[1] - 193) - (last - 2));
        if (negative) mpq_neg(value_, value_);
    }
    ~Fraction() { mpq_clear(value_); }
    Fraction(const Fraction&) = delete;
    Fraction& operator=(const Fraction&) = delete;
    operator mpq_ptr() { return value_; }

    // Multiplies by 100^power.
    void Scale(int power) {
        mpq_t factor;
        mpq_init(factor);
        mpz_ui_pow_ui(mpq_numref(factor), 100, static_cast<unsigned long>(power < 0 ? -power : power));
        if (power < 0)
            mpq_div(value_, value_, factor);
        else
            mpq_mul(value_, value_, factor);
        mpq_clear(factor);
    }

    // The nearest number of 20 base-100 digits, half away from zero; or the error for its range.
    number::Errno Rounded(OCINumber* result) {
        std::memset(result, 0, sizeof *result);
        const int sign = mpq_sgn(value_);
        if (sign == 0) {
            *result = OCINumber{{1, 128}};
            return 0;
        }
        mpq_abs(value_, value_);
        int exponent = 0;
        while (mpq_cmp_ui(value_, 100, 1) >= 0) Scale(-1), ++exponent;
        while (mpq_cmp_ui(value_, 1, 1) < 0) Scale(1), --exponent;
        Scale(19);
        mpz_t whole, limit;
        mpz_inits(whole, limit, nullptr);
        mpz_mul_ui(whole, mpq_numref(value_), 2);  // floor(value + 1/2)
        mpz_add(whole, whole, mpq_denref(value_));
        mpz_fdiv_q(whole, whole, mpq_denref(value_));
        mpz_fdiv_q_ui(whole, whole, 2);
        mpz_ui_pow_ui(limit, 100, 20);
        if (mpz_cmp(whole, limit) >= 0) {
            mpz_fdiv_q_ui(whole, whole, 100);
            ++exponent;
        }
        unsigned long digits[20];
        for (int i = 19; i >= 0; --i) digits[i] = mpz_fdiv_q_ui(whole, whole, 100);
        mpz_clears(whole, limit, nullptr);
        if (exponent > 62) return 22053;
        if (exponent < -65) return 22054;
        Write(digits, exponent, sign < 0, result);
        return 0;
    }

private:
    static void Write(const unsigned long (&digits)[20], int exponent, bool negative, OCINumber* result) {
        int count = 20;
        while (digits[count - 1] == 0) --count;
        ub1* bytes = result->OCINumberPart;
        bytes[0] = static_cast<ub1>(count + 1 + (negative && count < 20));
        bytes[1] = static_cast<ub1>(negative ? 62 - exponent : 193 + exponent);
        for (int i = 0; i < count; ++i) bytes[2 + i] = static_cast<ub1>(negative ? 101 - digits[i] : digits[i] + 1);
        if (negative && count < 20) bytes[2 + count] = 102;
    }

    mpq_t value_;
};

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
        OCINumber value{};
        ub1* bytes = value.OCINumberPart;
        for (int i = 0; i < count; ++i) {
            int digit = awkward ? kAwkward[Below(5)] : Below(100);
            if (digit == 0 && (i == 0 || i == count - 1)) digit = 1;
            bytes[2 + i] = static_cast<ub1>(negative ? 101 - digit : digit + 1);
        }
        bytes[0] = static_cast<ub1>(count + 1 + (negative && count < 20));
        bytes[1] = static_cast<ub1>(negative ? 62 - exponent : 193 + exponent);
        if (negative && count < 20) bytes[2 + count] = 102;
        return value;
    }

private:
    std::mt19937 engine_;
};
