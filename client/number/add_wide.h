// The two ways of adding. AddNarrow takes all numbers on every machine, eight digits in a word. AddWide takes two numbers
// of one sign and one exponent, the common case, with all digits in a vector register of 32 bytes, where the machine has
// one, and hands every other case on to AddNarrow.
#pragma once

#include "number/number.h"
#include "oci.h"

namespace number {

bool CanAddWide() noexcept;  // whether this machine has such registers

// As Add.
Errno AddWide(const OCINumber& left, const OCINumber& right, OCINumber* result) noexcept;  // where CanAddWide()
Errno AddNarrow(const OCINumber& left, const OCINumber& right, OCINumber* result) noexcept;

}  // namespace number
