// Row ids: which row of which table, as applications see it. The text has 18 characters of base 64, most significant
// first: six for the table, twelve for the row. The binary form (SQLT_RID) has 10 bytes in the same order.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>

namespace rowid {

struct RowId {
    std::uint32_t table;    // the table's number in the session
    std::int64_t row;       // the engine's row number
    bool operator==(const RowId&) const = default;
};

constexpr std::size_t kTextLength = 18;
constexpr std::size_t kByteLength = 10;

// Writes kTextLength characters, no terminator; answers their number.
std::size_t ToText(const RowId& value, char* text) noexcept;
// False for what is no text of a row id; blanks around it are allowed.
bool FromText(std::string_view text, RowId* value) noexcept;

// Writes kByteLength bytes. False when the table's number needs more than the two bytes there are for it.
bool ToBytes(const RowId& value, std::uint8_t* bytes) noexcept;
RowId FromBytes(const std::uint8_t* bytes) noexcept;

}  // namespace rowid
