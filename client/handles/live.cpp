// The set of living objects: a hash table from pointer to kind. Readers take no lock: a slot is a pair of atomics, a
// table that grew is published anew and the old one kept, since a reader may still be looking at it. Writers hold a
// mutex.
#include <atomic>
#include <memory>
#include <vector>

#include "handles/object.h"

namespace live {
namespace {

using Key = std::uintptr_t;
constexpr Key kEmpty = 0;
constexpr Key kErased = 1;    // no object lies there
constexpr std::size_t kFirstCapacity = 1024;

struct Slot {
    std::atomic<Key> key{kEmpty};
    std::atomic<Kind> kind{Kind::none};
};

struct Table {
    explicit Table(unsigned bits_of_capacity)
        : shift(64 - bits_of_capacity), mask((std::size_t{1} << bits_of_capacity) - 1), slots(new Slot[mask + 1]) {}

    [[nodiscard]] std::size_t Home(Key key) const {
        return static_cast<std::size_t>((key * std::uint64_t{0x9E3779B97F4A7C15}) >> shift);
    }
    [[nodiscard]] std::size_t Next(std::size_t index) const { return (index + 1) & mask; }
    [[nodiscard]] std::size_t Previous(std::size_t index) const { return (index - 1) & mask; }

    const unsigned shift;
    const std::size_t mask;
    const std::unique_ptr<Slot[]> slots;
};

constinit std::atomic<const Table*> current{nullptr};

// What only writers touch.
struct Writer {
    std::mutex mutex;
    std::vector<std::unique_ptr<Table>> tables;    // the last is in use, the others are retired
    std::size_t living = 0;
    std::size_t occupied = 0;    // living or erased slots
};

// Never destroyed: objects may be freed while the process ends.
Writer& TheWriter() {
    static auto* writer = new Writer;
    return *writer;
}

void Put(Table& table, Key key, Kind kind, std::size_t& occupied) {
    std::size_t index = table.Home(key);
    for (;; index = table.Next(index)) {
        const Key found = table.slots[index].key.load(std::memory_order_relaxed);
        if (found == kEmpty) ++occupied;
        if (found == kEmpty || found == kErased) break;
    }
    table.slots[index].kind.store(kind, std::memory_order_relaxed);
    table.slots[index].key.store(key, std::memory_order_release);
}

unsigned BitsFor(std::size_t living) {
    unsigned bits = 10;
    while ((std::size_t{1} << bits) < living * 4) ++bits;
    return bits;
}

// Publishes a table with room for one more: larger when many live, else only rid of erased slots.
void Rebuild(Writer& writer) {
    static_assert(kFirstCapacity == std::size_t{1} << 10);
    auto table = std::make_unique<Table>(BitsFor(writer.living + 1));
    writer.tables.reserve(writer.tables.size() + 1);
    std::size_t occupied = 0;
    if (!writer.tables.empty()) {
        const Table& old = *writer.tables.back();
        for (std::size_t index = 0; index <= old.mask; ++index) {
            const Key key = old.slots[index].key.load(std::memory_order_relaxed);
            if (key != kEmpty && key != kErased) {
                Put(*table, key, old.slots[index].kind.load(std::memory_order_relaxed), occupied);
            }
        }
    }
    writer.occupied = occupied;
    current.store(table.get(), std::memory_order_release);
    writer.tables.push_back(std::move(table));
}

}  // namespace

Kind KindOf(const void* pointer) noexcept {
    const Key key = reinterpret_cast<Key>(pointer);
    const Table* table = current.load(std::memory_order_acquire);
    if (!table || key <= kErased) return Kind::none;
    for (std::size_t index = table->Home(key);; index = table->Next(index)) {
        const Key found = table->slots[index].key.load(std::memory_order_acquire);
        if (found == key) return table->slots[index].kind.load(std::memory_order_relaxed);
        if (found == kEmpty) return Kind::none;
    }
}

void Insert(const void* pointer, Kind kind) {
    Writer& writer = TheWriter();
    const std::lock_guard lock(writer.mutex);
    if (writer.tables.empty() || (writer.occupied + 1) * 2 > writer.tables.back()->mask) Rebuild(writer);
    Put(*writer.tables.back(), reinterpret_cast<Key>(pointer), kind, writer.occupied);
    ++writer.living;
}

void Retype(const void* pointer, Kind kind) noexcept {
    const Key key = reinterpret_cast<Key>(pointer);
    Writer& writer = TheWriter();
    const std::lock_guard lock(writer.mutex);
    Table& table = *writer.tables.back();
    std::size_t index = table.Home(key);
    while (table.slots[index].key.load(std::memory_order_relaxed) != key) index = table.Next(index);
    table.slots[index].kind.store(kind, std::memory_order_release);
}

void Erase(const void* pointer) noexcept {
    const Key key = reinterpret_cast<Key>(pointer);
    Writer& writer = TheWriter();
    const std::lock_guard lock(writer.mutex);
    if (writer.tables.empty()) return;
    Table& table = *writer.tables.back();
    std::size_t index = table.Home(key);
    for (;; index = table.Next(index)) {
        const Key found = table.slots[index].key.load(std::memory_order_relaxed);
        if (found == kEmpty) return;
        if (found == key) break;
    }
    table.slots[index].key.store(kErased, std::memory_order_release);
    --writer.living;
    if (table.slots[table.Next(index)].key.load(std::memory_order_relaxed) != kEmpty) return;
    // No search passes here any more: the erased slots that end this run become empty.
    for (; table.slots[index].key.load(std::memory_order_relaxed) == kErased; index = table.Previous(index)) {
        table.slots[index].key.store(kEmpty, std::memory_order_release);
        --writer.occupied;
    }
}

}  // namespace live
