// A large object in units of its own: characters of UTF-8, or bytes. Counted from 0 here. The place of a character is
// found by counting from the last place that was found, as long as nobody has changed the object since.
//
// Threads: under the serial lock of the object's session.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>

#include "engine/lobs.h"
#include "handles/status.h"
#include "values/lob_descriptor.h"

namespace lobs {

constexpr std::uint64_t kMostUnits = std::uint64_t{1} << 36;    // 24281 beyond
constexpr std::size_t kBlock = std::size_t{1} << 16;

// Characters that begin in a text of UTF-8.
std::uint64_t CountCharacters(std::string_view text);

// A write that waits in the client (OCILobEnableBuffering).
struct WriteBuffer {
    std::uint64_t first = 0;    // unit
    std::uint64_t units = 0;    // 0: nothing waits
    std::string data;
};

// What is known of one locator's object; kept with the locator.
struct LocatorState {
    struct Place {
        std::uint64_t units = 0;
        std::uint64_t bytes = 0;
    };
    std::uint64_t version = 0;           // of the object that the places hold for
    Place last;
    std::optional<Place> end;
    std::optional<WriteBuffer> buffer;    // buffering is on
};

class LargeObject {
public:
    LargeObject() = default;
    // The locator's state is made where it has none, and kept with it.
    LargeObject(LobDescriptor& descriptor, values::Located located);
    // Of no locator.
    explicit LargeObject(std::shared_ptr<engine::Lob> lob)
        : located_{std::move(lob), nullptr, false, nullptr}, state_(std::make_shared<LocatorState>()) {}

    [[nodiscard]] engine::Lob& Lob() const { return *located_.lob; }
    [[nodiscard]] const values::Located& Located() const { return located_; }
    [[nodiscard]] LocatorState& State() const { return *state_; }
    [[nodiscard]] bool HasCharacters() const { return located_.lob->Kind() == engine::LobKind::characters; }
    [[nodiscard]] bool IsSame(const LargeObject& other) const { return Lob().IsSame(other.Lob()); }

    Status Length(std::uint64_t& units);
    // The first byte of a unit, or the end: `reached` is less than `units` then.
    Status Seek(std::uint64_t units, std::uint64_t& bytes, std::uint64_t& reached);
    // Whole units from a byte on, up to most bytes and units; `text` is overwritten. Shorter at the end alone.
    Status Read(std::uint64_t bytes, std::size_t most_bytes, std::uint64_t most_units, std::string& text,
                std::uint64_t& units);
    // That a unit begins there, for who has read up to it.
    void Remember(std::uint64_t units, std::uint64_t bytes);
    // Puts `units` units in the place of as many, and on behind the end; a gap is filled with zero bytes or blanks.
    Status Replace(std::uint64_t at, std::string_view data, std::uint64_t units);
    Status Trim(std::uint64_t units);                           // 22926
    Status Erase(std::uint64_t at, std::uint64_t& units);       // answers how many there were

private:
    void Refresh();
    Status Splice(std::uint64_t from, std::uint64_t to, std::string_view data);
    Status Move(std::uint64_t from, std::uint64_t to, std::uint64_t end);

    values::Located located_;
    std::shared_ptr<LocatorState> state_;
};

}  // namespace lobs
