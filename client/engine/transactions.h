// Transactions at the door: how they begin, and the names and states of global ones.
#pragma once

#include <array>
#include <cstdint>
#include <cstring>

namespace engine {

// How a transaction that is begun explicitly behaves. One that a statement begins is read_write.
enum class TransactionMode : std::uint8_t { read_write, read_only, serializable };

// The name of a branch of a global transaction, as the X/Open interface has it.
struct Xid {
    static constexpr std::int32_t kNone = -1;
    std::int32_t format = kNone;
    std::uint8_t global_length = 0;    // at most 64
    std::uint8_t branch_length = 0;    // at most 64
    std::array<char, 128> data{};      // the global part, then the branch's

    [[nodiscard]] std::size_t Length() const { return std::size_t{global_length} + branch_length; }
    bool operator==(const Xid& other) const {
        return format == other.format && global_length == other.global_length &&
               branch_length == other.branch_length && std::memcmp(data.data(), other.data.data(), Length()) == 0;
    }
};

}  // namespace engine
