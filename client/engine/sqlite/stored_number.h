// How numbers lie in a database: an integer when the value is one and fits 64 bits, a real when it has at most 15
// significant digits, else a blob: four bytes that mark it, then the number's bytes without the leading count. Blobs of
// numbers sort as the numbers do, but behind all integers and reals, and SQL cannot compute with them. Pure
// functions; any thread.
#pragma once

#include <sqlite3.h>

#include <cstddef>
#include <cstdint>
#include <string_view>

#include "oci.h"

namespace engine::sqlite {

struct StoredNumber {
    enum class Form : std::uint8_t { null, integer, real, blob };
    Form form = Form::null;    // null: bytes that are no number
    std::uint8_t length = 0;
    std::int64_t integer = 0;
    double real = 0;
    unsigned char blob[4 + OCI_NUMBER_SIZE];

    static StoredNumber From(const OCINumber& number);
    static StoredNumber Blob(const OCINumber& number);    // in that form, whatever it is
};

// A column of binary digits (float, real, double precision) has a whole number in 64 bits as a real, where one holds it.
inline bool IsWholeReal(double value) {
    constexpr double kEnd = 9223372036854775808.0;
    return value > -kEnd && value < kEnd && static_cast<double>(static_cast<std::int64_t>(value)) == value;
}

// Reads a blob back; false when it is not one of a number.
bool ReadNumberBlob(std::string_view blob, OCINumber& number);

}  // namespace engine::sqlite
