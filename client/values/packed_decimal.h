// Packed decimals: two digits a byte, the sign in the low half of the last one (C or D). `size` bytes hold 2 * size - 1
// digits; `precision`, when not 0, allows no more than that. `scale` digits stand behind the point.
#pragma once

#include <cstddef>
#include <cstdint>

struct OCINumber;

namespace values {

// Rounded half away from zero to the scale; 1457 when more digits remain than fit. Nothing is written then.
int ToPackedDecimal(const OCINumber& number, int precision, int scale, void* bytes, std::size_t size);
// 1413 for what is no packed decimal.
int FromPackedDecimal(const void* bytes, std::size_t size, int scale, OCINumber* number);

}  // namespace values
