// Datum: one value on its way between an engine and the application, as a view. A Datum owns nothing; what `data`
// points to is borrowed and valid as long as the call that filled it says.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>

#include "date/date.h"
#include "engine/row_id.h"

struct OCINumber;

namespace engine {

enum class Kind : std::uint8_t {
    null,       // no value; of a placeholder's kind: not known yet
    integer,    // 64-bit signed, in `integer`
    real,       // IEEE double, in `real`; single-precision values arrive so, too
    decimal,    // a decimal number: an OCINumber at `data`
    text,       // UTF-8, `length` bytes at `data`; also what lies in a typed column without being of its type
    bytes,      // `length` bytes at `data`
    timestamp,  // date, time, fraction, zone: a date::DateTime at `data`; dates arrive so, too
    lob,        // a large object: its locator, `length` bytes at `data`; going in the object itself (lobs.h)
    row_id,     // a RowId at `data`
    cursor,     // a result set, `length` bytes at `data`: it goes nowhere
    moment      // of a placeholder's kind alone: timestamps that go with their zones
};
constexpr std::size_t kKinds = static_cast<std::size_t>(Kind::cursor) + 1;

struct Datum {
    Kind kind = Kind::null;
    std::uint32_t length = 0;    // bytes at `data`; 0 for integers and reals
    union {
        std::int64_t integer = 0;
        double real;
        const void* data;
    };

    [[nodiscard]] std::string_view Text() const { return {static_cast<const char*>(data), length}; }
    [[nodiscard]] const OCINumber& Number() const { return *static_cast<const OCINumber*>(data); }
    [[nodiscard]] const date::DateTime& Timestamp() const { return *static_cast<const date::DateTime*>(data); }
    [[nodiscard]] const RowId& Row() const { return *static_cast<const RowId*>(data); }
};

}  // namespace engine
