// Decimal floating point of 16 and 34 digits (external types 21 and 22): IEEE 754 decimal64 and decimal128 with the
// coefficient as a binary integer, little-endian, which is what the compiler's own decimal types hold on this machine.
#pragma once

#include <cstddef>

#include "handles/errors.h"
#include "number/number.h"

namespace number {

constexpr std::size_t kDecimal64Size = 8;
constexpr std::size_t kDecimal128Size = 16;

// `size` is 8 or 16; the bytes need no alignment. From: an infinity is kNumberOverflow, a NaN kBadNumber. To: rounded
// half away from zero to 16 or 34 digits.
Errno FromDecimalFloat(const void* bytes, std::size_t size, OCINumber* result) noexcept;
Errno ToDecimalFloat(const OCINumber& value, std::size_t size, void* bytes) noexcept;

}  // namespace number
