// Large objects at the door. Offsets and lengths are bytes and offsets count from 0; characters, gaps, buffers, opening
// and closing are the library's business.
//
// A row brings a large object as a Datum of Kind::lob, a view like any other: the store makes a Lob of it, which stays.
// A Lob of a column reads what the column held when the row was fetched; one that its statement locked or changed
// (select ... for update, returning) what it holds now, and may be written by the transaction that it was fetched in.
// What is written is part of that transaction and seen by the next statement of the connection at the latest. What
// cannot be read any more is refused: 22922 where the row is gone, 22924 where the value of that time is. A temporary
// object lives as long as somebody holds it, whatever becomes of transactions.
//
// Threads: as the connection has it. A Lob may be given up from any thread at any time, even when its connection is
// gone; any call answers 22275 then, but those on temporary ones.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <span>

#include "engine/datum.h"
#include "handles/status.h"

namespace engine {

enum class LobKind : std::uint8_t { characters, bytes };    // characters are UTF-8
constexpr std::byte FillerOf(LobKind kind) { return kind == LobKind::characters ? std::byte{' '} : std::byte{}; }
// Values of no more bytes may be held in memory as one; longer ones go in pieces.
constexpr std::uint64_t kHeldWhole = std::uint64_t{8} << 20;

class Lob {
public:
    virtual ~Lob() = default;

    [[nodiscard]] virtual LobKind Kind() const = 0;
    [[nodiscard]] virtual bool IsTemporary() const = 0;
    // Whether both are the same object: the same temporary one, or one column of one row.
    [[nodiscard]] virtual bool IsSame(const Lob& other) const = 0;
    // Another number each time the bytes may have become others. Nothing that was known of them before holds then.
    [[nodiscard]] virtual std::uint64_t Version() const = 0;

    virtual Status Length(std::uint64_t& bytes) = 0;
    // Up to out.size() bytes from `offset` on; `read` is less only at the end, and 0 behind it.
    virtual Status Read(std::uint64_t offset, std::span<std::byte> out, std::size_t& read) = 0;

    // Whether it may be written now: 22920 when its row is not locked, 22990 when it is of an earlier transaction.
    virtual Status CheckWrite() = 0;
    // Over what stands there, and on behind the end; a gap before `offset` is filled with zero bytes or blanks, by kind.
    // 22925 for more than the engine can hold.
    virtual Status Write(std::uint64_t offset, std::span<const std::byte> in) = 0;
    virtual Status Trim(std::uint64_t bytes) = 0;    // to a length that is not above its own
};

class LobStore {
public:
    virtual ~LobStore() = default;
    virtual Status CreateTemporary(LobKind kind, std::shared_ptr<Lob>& lob) = 0;
    // Of a value of Kind::lob, while its views hold. `brief`: it is let go before they end, and nothing need be kept.
    virtual Status Take(const Datum& value, bool brief, std::shared_ptr<Lob>& lob) = 0;
    // Whether a placeholder's value may be a Datum of Kind::lob with a Lob at `data`, which is read while its row runs:
    // one of more than kHeldWhole bytes, of the placeholder's kind.
    [[nodiscard]] virtual bool TakesObjects() const { return false; }
};

// Makes `to` hold what `from` does from there on: `bytes` of it, or as many as there are.
Status CopyBytes(Lob& from, std::uint64_t from_offset, Lob& to, std::uint64_t to_offset, std::uint64_t bytes);

}  // namespace engine
