// SQLite's row numbers as row ids: two zero bytes, then the number, most significant byte first.
#pragma once

#include <cstddef>
#include <cstdint>

#include "engine/row_id.h"

namespace engine::sqlite {

constexpr std::size_t kRowNumberAt = 2;

inline std::int64_t RowNumber(const RowId& row) {
    std::uint64_t number = 0;
    for (std::size_t index = kRowNumberAt; index < row.bytes.size(); ++index) number = number << 8 | row.bytes[index];
    return static_cast<std::int64_t>(number);
}

inline RowId RowIdOf(std::int64_t number) {
    RowId row;
    auto rest = static_cast<std::uint64_t>(number);
    for (std::size_t index = row.bytes.size(); index-- > kRowNumberAt; rest >>= 8) {
        row.bytes[index] = static_cast<std::uint8_t>(rest & 0xFF);
    }
    return row;
}

}  // namespace engine::sqlite
