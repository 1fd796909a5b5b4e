// Values in PostgreSQL's binary form, which is big-endian: numeric, timestamps, row ids.
//
// The calendar is the server's: Gregorian for all time. Dates keep their fields, so that 1 March 1500 is that date on
// both sides; times have microseconds.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string_view>
#include <type_traits>

#include "date/date.h"
#include "engine/row_id.h"
#include "number/number.h"
#include "oci.h"

namespace engine::postgres {

template <class T>
T Swapped(T value) {
    if constexpr (sizeof value == 2) return static_cast<T>(__builtin_bswap16(static_cast<std::uint16_t>(value)));
    else if constexpr (sizeof value == 4) return static_cast<T>(__builtin_bswap32(static_cast<std::uint32_t>(value)));
    else return static_cast<T>(__builtin_bswap64(static_cast<std::uint64_t>(value)));
}
// An integer of the server's, and one for it.
template <class T>
T Get(const char* bytes) {
    T value;
    std::memcpy(&value, bytes, sizeof value);
    return Swapped(value);
}
template <class T>
void Put(T value, char* bytes) {
    value = Swapped(value);
    std::memcpy(bytes, &value, sizeof value);
}

// Numeric. To: at most kMaxNumeric bytes, whose number it answers. From: answers whether the value is a 64-bit integer
// (`integer`) or a number (`number`), or the published number of why it is neither: NaN, or out of a number's range.
constexpr std::size_t kMaxNumeric = 64;
std::size_t NumericFrom(const OCINumber& number, char* bytes) noexcept;    // 0: malformed
struct NumericValue {
    bool is_integer = false;
    std::int64_t integer = 0;
    OCINumber number;
};
int NumericTo(std::string_view bytes, NumericValue& value) noexcept;

// Microseconds from 2000-01-01 00:00:00 on. 0, or the published number of what is out of range.
int MicrosecondsFrom(const date::DateTime& value, std::int64_t& microseconds) noexcept;    // the zone is ignored
int MicrosecondsTo(std::int64_t microseconds, date::DateTime& value) noexcept;
int DaysTo(std::int32_t days, date::DateTime& value) noexcept;
// The same as moments, with the zone.
int MomentFrom(const date::DateTime& value, std::int64_t& microseconds) noexcept;
int MomentTo(std::int64_t microseconds, date::DateTime& value) noexcept;

// Row ids: block and offset, behind two zero bytes and two of the block's height, as one number of 8 bytes.
constexpr std::size_t kTupleIdSize = 6;
RowId RowIdOf(const char* tuple_id) noexcept;
void TupleIdOf(const RowId& row, char* tuple_id) noexcept;

}  // namespace engine::postgres
