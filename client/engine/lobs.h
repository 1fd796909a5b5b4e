// Large objects at the door. A locator is bytes that only the engine reads; the store it came from resolves it. Offsets
// and lengths are bytes, offsets count from 0; characters are the library's business. What is written is part of the
// connection's transaction, and visible to it at once.
//
// A locator fetched from a column is good until the transaction that it was fetched in ends, or, outside of one, until
// the connection's next change; one that changes its column's value needs its row locked or written by the transaction.
// A temporary object lives until it is freed or the connection ends, whatever becomes of transactions. A locator that
// is neither answers 22275. Copying bytes of a locator makes another name of the same object.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <vector>

#include "handles/status.h"

namespace engine {

enum class LobKind : std::uint8_t { characters, bytes };
using Locator = std::span<const std::byte>;

class LobStore {
public:
    virtual ~LobStore() = default;

    virtual Status CreateTemporary(LobKind kind, std::vector<std::byte>& locator) = 0;
    virtual Status FreeTemporary(Locator lob) = 0;
    virtual bool IsTemporary(Locator lob) = 0;

    virtual Status Length(Locator lob, std::uint64_t& bytes) = 0;
    // Up to out.size() bytes from `offset` on; `read` is less only at the end, and 0 behind it.
    virtual Status Read(Locator lob, std::uint64_t offset, std::span<std::byte> out, std::size_t& read) = 0;
    // Over what stands there, and on behind the end; a gap before `offset` is filled as by Erase.
    virtual Status Write(Locator lob, std::uint64_t offset, std::span<const std::byte> in) = 0;
    virtual Status Append(Locator lob, std::span<const std::byte> in) = 0;
    virtual Status Trim(Locator lob, std::uint64_t bytes) = 0;    // to a length that is not above its own
    // Fills with zero bytes or blanks, by its kind; `erased` is less than `bytes` only at the end.
    virtual Status Erase(Locator lob, std::uint64_t offset, std::uint64_t bytes, std::uint64_t& erased) = 0;
    virtual Status Copy(Locator to, std::uint64_t to_offset, Locator from, std::uint64_t from_offset,
                        std::uint64_t bytes) = 0;
};

}  // namespace engine
