// Decimal numbers in their 22-byte form: arithmetic, functions, and conversions from and to integers, reals and plain
// text. Text by a format model is in number/format.h.
//
// A number holds at most 20 digits of base 100, so 39 or 40 decimal digits. Every result is the exact value rounded
// once to that many digits, half away from zero. Every function checks its operands first, answers 0 or a published
// error number and writes its result on success only; the result may be one of the operands. Nothing here throws, locks
// or keeps state that another thread can see.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>

#include "handles/errors.h"
#include "oci.h"

namespace number {

using Errno = int;  // a published error number; 0: success

constexpr int kMaxDigits = 40;  // decimal digits of a number, at most

// Shapes of functions, for tables of them.
using Unary = Errno (*)(const OCINumber& value, OCINumber* result) noexcept;
using Binary = Errno (*)(const OCINumber& left, const OCINumber& right, OCINumber* result) noexcept;
using Scaled = Errno (*)(const OCINumber& value, int amount, OCINumber* result) noexcept;
using Tested = Errno (*)(const OCINumber& value, int* result) noexcept;

// Well-formed bytes; the two infinities are well-formed.
bool IsValid(const OCINumber& value) noexcept;

void SetZero(OCINumber* result) noexcept;
void SetPi(OCINumber* result) noexcept;

Errno Assign(const OCINumber& value, OCINumber* result) noexcept;
Errno Abs(const OCINumber& value, OCINumber* result) noexcept;
Errno Neg(const OCINumber& value, OCINumber* result) noexcept;
Errno Ceil(const OCINumber& value, OCINumber* result) noexcept;
Errno Floor(const OCINumber& value, OCINumber* result) noexcept;
Errno Inc(const OCINumber& value, OCINumber* result) noexcept;  // above 100^21 - 2 the value counts as 0
Errno Dec(const OCINumber& value, OCINumber* result) noexcept;

Errno Compare(const OCINumber& left, const OCINumber& right, int* result) noexcept;  // -1, 0, 1
Errno Sign(const OCINumber& value, int* result) noexcept;                            // -1, 0, 1
Errno IsInt(const OCINumber& value, int* result) noexcept;                           // 0, 1
Errno IsZero(const OCINumber& value, int* result) noexcept;                          // 0, 1

Errno Add(const OCINumber& left, const OCINumber& right, OCINumber* result) noexcept;
Errno Sub(const OCINumber& left, const OCINumber& right, OCINumber* result) noexcept;
Errno Mul(const OCINumber& left, const OCINumber& right, OCINumber* result) noexcept;
Errno Div(const OCINumber& left, const OCINumber& right, OCINumber* result) noexcept;
Errno Mod(const OCINumber& left, const OCINumber& right, OCINumber* result) noexcept;  // exact; the sign of `left`

Errno Round(const OCINumber& value, int places, OCINumber* result) noexcept;  // digits after the point, or -before it
Errno Trunc(const OCINumber& value, int places, OCINumber* result) noexcept;
Errno Prec(const OCINumber& value, int digits, OCINumber* result) noexcept;  // to so many significant digits, 1 or more
Errno Shift(const OCINumber& value, int digits, OCINumber* result) noexcept;  // times 10 to the power of `digits`

Errno Sqrt(const OCINumber& value, OCINumber* result) noexcept;
Errno IntPower(const OCINumber& base, int exponent, OCINumber* result) noexcept;
Errno Power(const OCINumber& base, const OCINumber& exponent, OCINumber* result) noexcept;
Errno Exp(const OCINumber& value, OCINumber* result) noexcept;
Errno Ln(const OCINumber& value, OCINumber* result) noexcept;
Errno Log(const OCINumber& base, const OCINumber& value, OCINumber* result) noexcept;

Errno Sin(const OCINumber& value, OCINumber* result) noexcept;  // radians
Errno Cos(const OCINumber& value, OCINumber* result) noexcept;
Errno Tan(const OCINumber& value, OCINumber* result) noexcept;
Errno ArcSin(const OCINumber& value, OCINumber* result) noexcept;
Errno ArcCos(const OCINumber& value, OCINumber* result) noexcept;
Errno ArcTan(const OCINumber& value, OCINumber* result) noexcept;
Errno ArcTan2(const OCINumber& y, const OCINumber& x, OCINumber* result) noexcept;
Errno HypSin(const OCINumber& value, OCINumber* result) noexcept;
Errno HypCos(const OCINumber& value, OCINumber* result) noexcept;
Errno HypTan(const OCINumber& value, OCINumber* result) noexcept;

// Integers. A fraction is dropped; what does not fit is kNumberOverflow or kNumberUnderflow (too small, negative into
// unsigned).
void FromInt64(std::int64_t value, OCINumber* result) noexcept;
void FromUint64(std::uint64_t value, OCINumber* result) noexcept;
Errno ToInt64(const OCINumber& value, std::int64_t* result) noexcept;
Errno ToUint64(const OCINumber& value, std::uint64_t* result) noexcept;
// The same for 1, 2, 4 or 8 bytes in native order, which need no alignment.
bool IsIntegerLength(std::size_t length) noexcept;
void FromInteger(const void* value, std::size_t length, bool is_signed, OCINumber* result) noexcept;
Errno ToInteger(const OCINumber& value, std::size_t length, bool is_signed, void* result) noexcept;

// Reals. From: the shortest decimal that reads back as the same real; an infinity is kNumberOverflow, a NaN kBadNumber.
// To: the nearest real, ties to even; infinities stay so. What becomes zero or infinite only by its size is an error.
Errno FromFloat(float value, OCINumber* result) noexcept;
Errno FromDouble(double value, OCINumber* result) noexcept;
Errno FromLongDouble(long double value, OCINumber* result) noexcept;
// The same, rounded to the digits that a double keeps of every number: 0.1 + 0.2 is 0.3.
constexpr int kRealDigits = 15;
Errno FromReal15(double value, OCINumber* result) noexcept;
Errno ToFloat(const OCINumber& value, float* result) noexcept;
Errno ToDouble(const OCINumber& value, double* result) noexcept;
Errno ToLongDouble(const OCINumber& value, long double* result) noexcept;
// By the decimal digits of the float: 0.1f is 0.1, not 0.100000001490116.
double WidenByDigits(float value) noexcept;

// Plain text: the shortest exact text, "-.5", "1200", "1.5E-60". No zero stands before the point; the exponent form is
// taken when the fixed form needs more than 40 places.
constexpr std::size_t kMaxPlainText = 48;
// Writes at most kMaxPlainText characters, no terminator.
Errno ToPlainText(const OCINumber& value, char decimal, char* text, std::size_t* length) noexcept;
// Reads blanks, sign, digits with a point, exponent, blanks. kInvalidNumber for anything else, kNumericOverflow when
// too large; what is too small to hold is 0.
Errno FromPlainText(std::string_view text, char decimal, OCINumber* result) noexcept;

}  // namespace number
