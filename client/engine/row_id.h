// Row ids at the door: which row of which table, in bytes that only the engine reads. Equal bytes are the same row.
#pragma once

#include <array>
#include <cstdint>

namespace engine {

struct RowId {
    std::array<std::uint8_t, 10> bytes{};
    bool operator==(const RowId&) const = default;
};

}  // namespace engine
