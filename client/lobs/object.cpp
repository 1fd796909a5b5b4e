#include "lobs/object.h"

#include <algorithm>
#include <array>
#include <cstring>

#include "handles/errors.h"
#include "platform/utf.h"

namespace lobs {
namespace {

bool Begins(char byte) { return (static_cast<unsigned char>(byte) & 0xC0) != 0x80; }

std::span<std::byte> Bytes(std::string& text) { return std::as_writable_bytes(std::span(text)); }
std::span<const std::byte> Bytes(std::string_view text) { return std::as_bytes(std::span(text)); }

constexpr std::size_t kWords = 128;    // whose counts fit into a byte each
constexpr std::uint64_t kOnes = 0x0101010101010101;

// The bytes that go on with a character, of which the highest two bits are 10, eight at a time.
std::uint64_t CountContinuations(const char* text) {
    std::array<std::uint64_t, kWords> words;
    std::memcpy(words.data(), text, sizeof words);
    std::uint64_t counts = 0;
    for (const std::uint64_t word : words) counts += (word >> 7) & ~(word >> 6) & kOnes;
    constexpr std::uint64_t kPairs = 0x00FF00FF00FF00FF;
    return (((counts & kPairs) + ((counts >> 8) & kPairs)) * 0x0001000100010001) >> 48;
}

}  // namespace

std::uint64_t CountCharacters(std::string_view text) {
    std::uint64_t count = text.size();
    for (; text.size() >= kWords * 8; text.remove_prefix(kWords * 8)) count -= CountContinuations(text.data());
    return count - text.size() + static_cast<std::uint64_t>(std::count_if(text.begin(), text.end(), Begins));
}

LargeObject::LargeObject(LobDescriptor& descriptor, values::Located located) : located_(std::move(located)) {
    if (!located_.kept) {
        located_.kept = std::make_shared<LocatorState>();
        descriptor.Set(located_);
    }
    state_ = std::static_pointer_cast<LocatorState>(located_.kept);
}

// Places of another version are forgotten.
void LargeObject::Refresh() {
    if (state_->version == Lob().Version()) return;
    state_->version = Lob().Version();
    state_->last = {};
    state_->end.reset();
}

Status LargeObject::Length(std::uint64_t& units) {
    if (!HasCharacters()) return Lob().Length(units);
    std::uint64_t bytes = 0;
    if (Status status = Lob().Length(bytes); status.Failed()) return status;    // that it can be read at all
    Refresh();
    if (state_->end) return units = state_->end->units, Status();
    const LocatorState::Place before = state_->last;
    Status status = Seek(~std::uint64_t{0}, bytes, units);
    state_->last = before;
    return status;
}

Status LargeObject::Seek(std::uint64_t units, std::uint64_t& bytes, std::uint64_t& reached) {
    if (!HasCharacters()) {
        Status status = Lob().Length(bytes);
        bytes = reached = std::min(bytes, units);
        return status;
    }
    Refresh();
    if (state_->end && state_->end->units <= units) state_->last = *state_->end;
    LocatorState::Place place = state_->last.units <= units ? state_->last : LocatorState::Place();
    if (place.units == units) {
        bytes = place.bytes;
        reached = units;
        return {};
    }
    std::string block(kBlock, '\0');
    for (;;) {
        std::size_t read = 0;
        if (Status status = Lob().Read(place.bytes, Bytes(block), read); status.Failed()) return status;
        const std::string_view text(block.data(), read);
        const std::uint64_t here = CountCharacters(text);
        if (read == 0 || place.units + here > units) {
            // The unit begins in this block, or the end is reached.
            std::uint64_t left = units - place.units;
            std::size_t at = 0;
            while (at < read && (!Begins(text[at]) || left-- > 0)) ++at;
            place.bytes += at;
            place.units = read == 0 ? place.units : units;
            if (read == 0) state_->end = place;
            break;
        }
        place.units += here;
        place.bytes += read;
    }
    state_->last = place;
    bytes = place.bytes;
    reached = place.units;
    return {};
}

void LargeObject::Remember(std::uint64_t units, std::uint64_t bytes) {
    Refresh();
    state_->last = {units, bytes};
}

Status LargeObject::Read(std::uint64_t bytes, std::size_t most_bytes, std::uint64_t most_units, std::string& text,
                    std::uint64_t& units) {
    units = 0;
    const std::uint64_t widest = HasCharacters() ? 4 : 1;
    const std::uint64_t wanted = most_units > most_bytes / widest ? most_bytes : most_units * widest;
    // Of characters one byte more: the last one may go on there.
    text.resize(static_cast<std::size_t>(wanted) + (HasCharacters() && wanted > 0 ? 1 : 0));
    std::size_t read = 0;
    if (Status status = Lob().Read(bytes, Bytes(text), read); status.Failed()) return status;
    text.resize(read);
    if (!HasCharacters()) return units = read, Status();
    if (read > wanted) text.resize(utf::WholeUtf8(text, static_cast<std::size_t>(wanted)));
    units = CountCharacters(text);
    for (std::size_t at = text.size(); units > most_units;) {
        if (!Begins(text[--at])) continue;
        text.resize(at);
        --units;
    }
    return {};
}

// Moves the bytes from `from` up to the end to another place; they may overlap.
Status LargeObject::Move(std::uint64_t from, std::uint64_t to, std::uint64_t end) {
    std::string block(kBlock, '\0');
    for (std::uint64_t left = end - from; left > 0;) {
        const auto part = static_cast<std::size_t>(std::min<std::uint64_t>(left, kBlock));
        const std::uint64_t done = to > from ? left - part : end - from - left;
        std::size_t read = 0;
        Status status = Lob().Read(from + done, Bytes(block).first(part), read);
        if (status.Ok()) status = Lob().Write(to + done, Bytes(block).first(read));
        if (status.Failed()) return status;
        left -= part;
    }
    return {};
}

// The bytes [from, to) give way to others, perhaps another number of them.
Status LargeObject::Splice(std::uint64_t from, std::uint64_t to, std::string_view data) {
    std::uint64_t end = 0;
    if (Status status = Lob().Length(end); status.Failed()) return status;
    const std::uint64_t behind = from + data.size();
    const bool moves = to < end;
    if (moves && behind > to) {
        if (Status status = Move(to, behind, end); status.Failed()) return status;
    }
    Status status = Lob().Write(from, Bytes(data));
    if (status.Ok() && moves && behind < to) status = Move(to, behind, end);
    if (status.Ok() && behind < to) status = Lob().Trim(end - (to - behind));
    return status;
}

Status LargeObject::Replace(std::uint64_t at, std::string_view data, std::uint64_t units) {
    if (Status status = Lob().CheckWrite(); status.Failed()) return status;
    if (at > kMostUnits || units > kMostUnits - at) return Error(errors::kPastLobLimit);
    std::uint64_t from = 0;
    std::uint64_t reached = 0;
    if (Status status = Seek(at, from, reached); status.Failed()) return status;
    std::uint64_t to = from;
    std::uint64_t replaced = 0;
    if (reached == at) {
        if (Status status = Seek(at + units, to, replaced); status.Failed()) return status;
    }
    const std::optional<LocatorState::Place> end = state_->end;
    from += at - reached;    // a gap has units of one byte
    to = std::max(to, from);
    if (Status status = Splice(from, to, data); status.Failed()) return status;
    Refresh();
    state_->last = {at + units, from + data.size()};
    if (!end) return {};
    const bool is_last = at + units >= end->units;
    state_->end = is_last ? state_->last : LocatorState::Place{end->units, end->bytes + data.size() - (to - from)};
    return {};
}

Status LargeObject::Trim(std::uint64_t units) {
    if (Status status = Lob().CheckWrite(); status.Failed()) return status;
    std::uint64_t bytes = 0;
    std::uint64_t reached = 0;
    if (Status status = Seek(units, bytes, reached); status.Failed()) return status;
    return reached < units ? Error(errors::kTrimTooLong) : Lob().Trim(bytes);
}

Status LargeObject::Erase(std::uint64_t at, std::uint64_t& units) {
    if (Status status = Lob().CheckWrite(); status.Failed()) return status;
    std::uint64_t length = 0;
    if (Status status = Length(length); status.Failed()) return status;
    units = at < length ? std::min(units, length - at) : 0;
    const std::string filler(static_cast<std::size_t>(std::min<std::uint64_t>(units, kBlock)), HasCharacters() ? ' ' : '\0');
    for (std::uint64_t done = 0; done < units;) {
        const auto part = static_cast<std::size_t>(std::min<std::uint64_t>(units - done, filler.size()));
        if (Status status = Replace(at + done, std::string_view(filler).substr(0, part), part); status.Failed()) return status;
        done += part;
    }
    return {};
}

}  // namespace lobs
