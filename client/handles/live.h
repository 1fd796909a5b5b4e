// The set of living objects: a hash table of words, each an object's address and its kind in one, so that a place that
// is freed and taken by another object never answers a kind that is not its object's. Readers take no lock and read
// nothing but the table; writers hold a mutex. A table that grew, or got rid of erased words, is published anew; the
// old one is freed when no call that looks up can be reading it. Asked inside a call in flight only.
#pragma once

#include <atomic>
#include <bit>
#include <cstddef>
#include <cstdint>

#include "handles/in_flight.h"

// One value for each class that Live can ask for. A class may serve several type codes.
enum class Kind : std::uint8_t {
    none,
    environment, error, service_context, statement, bind, define, describe, server, session, transaction,
    connection_pool, session_pool, plain_handle, descriptor_array,
    lob, snapshot, result_set, parameter, row_id, datetime, interval, plain_descriptor,
    string, raw, file, thread_mutex, thread_key, thread_id, thread_handle,
    description
};

namespace live {

// Objects lie at multiples of 16 and their addresses have less than 60 bits: the address without its four zeros, then
// eight bits for the kind. Of any other pointer the four low bits come to stand on top, where no word has any.
using Word = std::uint64_t;
constexpr unsigned kKindBits = 8;
constexpr Word kEmpty = 0;
constexpr Word kErased = ~Word{0} << kKindBits;    // no object lies there

inline Word AddressOf(const void* pointer) {
    return std::rotr(static_cast<Word>(reinterpret_cast<std::uintptr_t>(pointer)), 4);
}
constexpr Word AddressIn(Word word) { return word >> kKindBits; }
constexpr Kind KindIn(Word word) { return static_cast<Kind>(word & 0xFF); }

using Slot = std::atomic<Word>;

struct Table {
    unsigned shift;
    std::size_t mask;
    Slot* slots;

    [[nodiscard]] std::size_t Home(Word address) const {
        return static_cast<std::size_t>((address * Word{0x9E3779B97F4A7C15}) >> shift);
    }
    [[nodiscard]] std::size_t Next(std::size_t index) const { return (index + 1) & mask; }
    [[nodiscard]] std::size_t Previous(std::size_t index) const { return (index - 1) & mask; }
};

extern constinit std::atomic<const Table*> current;    // never null

inline Kind Find(const void* pointer) noexcept {
    const Word address = AddressOf(pointer);
    const Table& table = *current.load(std::memory_order_acquire);
    for (std::size_t index = table.Home(address);; index = table.Next(index)) {
        const Word word = table.slots[index].load(std::memory_order_acquire);
        if (AddressIn(word) == address) return KindIn(word);
        if (word == kEmpty) return Kind::none;
    }
}

// Kind::none when it is no living object.
inline Kind KindOf(const void* pointer) noexcept {
    if (!in_flight::Closed()) return Find(pointer);
    const CallInFlight call;    // the LongCall is open as long as it looks
    return Find(pointer);
}

// Goes up with each object that is erased or gets another kind, before the eraser's barrier: who has found some living
// need not look again while it stands.
extern constinit std::atomic<std::uint64_t> erased_objects;

// What a thread found last of a kind that nearly all calls ask for, and erased_objects before it looked. While that
// stands the object is in the set, and reading it is as good as reading the set: the proof in in_flight.h holds for it.
struct Found {
    const void* pointer = nullptr;
    std::uint64_t erased = ~std::uint64_t{0};    // that it never is: nothing found yet
};
constexpr int kRemembered = 3;
constexpr int RememberedAt(Kind kind) {    // -1: it is not
    return kind == Kind::error ? 0 : kind == Kind::statement ? 1 : kind == Kind::service_context ? 2 : -1;
}
[[gnu::tls_model("initial-exec")]] extern constinit thread_local Found last_found[kRemembered];
bool FindAndRemember(const void* pointer, Kind kind) noexcept;

// Whether it is a living object of that kind.
template <Kind kind>
[[gnu::always_inline]] inline bool Is(const void* pointer) noexcept {
    if constexpr (constexpr int at = RememberedAt(kind); at < 0) {
        return KindOf(pointer) == kind;
    } else {
        if (in_flight::Closed()) [[unlikely]] return KindOf(pointer) == kind;
        const Found& last = last_found[at];
        const bool stands = last.pointer == pointer && last.erased == erased_objects.load(std::memory_order_acquire);
        if (stands) [[likely]] return true;
        return FindAndRemember(pointer, kind);
    }
}

// The object must not be in the set. Throws std::bad_alloc and changes nothing then.
void Insert(const void* pointer, Kind kind);
bool Erase(const void* pointer) noexcept;    // false when it is not in the set
// Nothing for an object that another thread has erased. As Kind::none an object stays in the set, but is not found.
void Retype(const void* pointer, Kind kind) noexcept;
bool Contains(const void* pointer) noexcept;    // of any kind, Kind::none too
std::size_t TableCount() noexcept;              // tables that are not freed yet, the one in use included

}  // namespace live
