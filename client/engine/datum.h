// Datum: one value on its way between an engine and the application, as a view. A Datum owns nothing; `data` is
// borrowed and valid as long as the call that filled it says.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>

namespace engine {

enum class Kind : std::uint8_t {
    null,       // no value
    integer,    // 64-bit signed, in `integer`
    real,       // IEEE double, in `real`
    decimal,    // a decimal number: the 22 bytes of an OCINumber at `data`
    text,       // UTF-8, `length` bytes at `data`; a decimal, date or timestamp column of an engine may arrive so
    bytes,      // `length` bytes at `data`
    timestamp,  // date and time in the engine's text form: "YYYY-MM-DD HH:MM:SS[.fffffffff][ +hh:mm]", at `data`
    lob,        // a large object: `integer` is the engine's number of it
    row_id,     // `integer` is the engine's row number, `length` the table's number in the session
    cursor      // a result set: `integer` is an index into the query's cursors
};

struct Datum {
    Kind kind = Kind::null;
    std::uint32_t length = 0;
    union {
        std::int64_t integer = 0;
        double real;
        const void* data;
    };

    [[nodiscard]] std::string_view Text() const { return {static_cast<const char*>(data), length}; }
};

}  // namespace engine
