// Decimal floating-point values of 16 and 34 digits: IEEE 754 decimal64 and decimal128, the coefficient as a binary
// integer, little-endian.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

// The value as the server writes it: a statement on the default environment, over a service context made from it, so
// that the log shows what the database means. `type` is SQLT_BFLOAT or SQLT_BDOUBLE. Returns the return code of the
// call that failed, or OCI_SUCCESS.
int DecimalFloatText(int type, const unsigned char* data, uint32_t size, std::string& text);

// The value of a text such as -12.5E-3, rounded half away from zero to the digits that `size` bytes (8 or 16) hold.
// False when the text is no number or too large.
bool DecimalFloatFromText(std::string_view text, uint32_t size, unsigned char* bytes);
