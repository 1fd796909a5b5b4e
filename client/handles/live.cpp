// Writing into the set of living objects. Readers take no lock: a slot is a pair of atomics, a table that grew is
// published anew and the old one kept, since a reader may still be looking at it. Writers hold a mutex.
#include <atomic>
#include <memory>
#include <vector>

#include "handles/object.h"

namespace live {
namespace {

constexpr unsigned kFirstBits = 10;

// A table and the slots that it owns.
struct OwnedTable {
    explicit OwnedTable(unsigned bits)
        : slots(new Slot[std::size_t{1} << bits]), table{64 - bits, (std::size_t{1} << bits) - 1, slots.get()} {}

    const std::unique_ptr<Slot[]> slots;
    const Table table;
};

constinit Slot no_slots[2];
constinit const Table kNoObjects{63, 1, no_slots};

// What only writers touch.
struct Writer {
    std::mutex mutex;
    std::vector<std::unique_ptr<OwnedTable>> tables;    // the last is in use, the others are retired
    std::size_t living = 0;
    std::size_t occupied = 0;    // living or erased slots

    [[nodiscard]] const Table& InUse() const { return tables.empty() ? kNoObjects : tables.back()->table; }
};

// Never destroyed: objects may be freed while the process ends.
Writer& TheWriter() {
    static auto* writer = new Writer;
    return *writer;
}

void Put(const Table& table, Key key, Kind kind, std::size_t& occupied) {
    std::size_t index = table.Home(key);
    for (;; index = table.Next(index)) {
        const Key found = table.slots[index].key.load(std::memory_order_relaxed);
        if (found == kEmpty) ++occupied;
        if (found == kEmpty || found == kErased) break;
    }
    table.slots[index].kind.store(kind, std::memory_order_relaxed);
    table.slots[index].key.store(key, std::memory_order_release);
}

// The slot of a key; null when the table has it not.
Slot* FindSlot(const Table& table, Key key) {
    for (std::size_t index = table.Home(key);; index = table.Next(index)) {
        const Key found = table.slots[index].key.load(std::memory_order_relaxed);
        if (found == key) return &table.slots[index];
        if (found == kEmpty) return nullptr;
    }
}

unsigned BitsFor(std::size_t living) {
    unsigned bits = kFirstBits;
    while ((std::size_t{1} << bits) < living * 4) ++bits;
    return bits;
}

// Publishes a table with room for one more: larger when many live, else only rid of erased slots.
void Rebuild(Writer& writer) {
    auto owned = std::make_unique<OwnedTable>(BitsFor(writer.living + 1));
    writer.tables.reserve(writer.tables.size() + 1);
    std::size_t occupied = 0;
    const Table& old = writer.InUse();
    for (std::size_t index = 0; index <= old.mask; ++index) {
        const Key key = old.slots[index].key.load(std::memory_order_relaxed);
        if (key != kEmpty && key != kErased) {
            Put(owned->table, key, old.slots[index].kind.load(std::memory_order_relaxed), occupied);
        }
    }
    writer.occupied = occupied;
    current.store(&owned->table, std::memory_order_release);
    writer.tables.push_back(std::move(owned));
}

}  // namespace

constinit std::atomic<const Table*> current{&kNoObjects};

void Insert(const void* pointer, Kind kind) {
    Writer& writer = TheWriter();
    const std::lock_guard lock(writer.mutex);
    if (writer.tables.empty() || (writer.occupied + 1) * 2 > writer.tables.back()->table.mask) Rebuild(writer);
    Put(writer.tables.back()->table, reinterpret_cast<Key>(pointer), kind, writer.occupied);
    ++writer.living;
}

void Retype(const void* pointer, Kind kind) noexcept {
    Writer& writer = TheWriter();
    const std::lock_guard lock(writer.mutex);
    Slot* slot = FindSlot(writer.InUse(), reinterpret_cast<Key>(pointer));
    if (slot) slot->kind.store(kind, std::memory_order_release);
}

bool Contains(const void* pointer) noexcept {
    Writer& writer = TheWriter();
    const std::lock_guard lock(writer.mutex);
    return FindSlot(writer.InUse(), reinterpret_cast<Key>(pointer)) != nullptr;
}

bool Erase(const void* pointer) noexcept {
    Writer& writer = TheWriter();
    const std::lock_guard lock(writer.mutex);
    const Table& table = writer.InUse();
    Slot* slot = FindSlot(table, reinterpret_cast<Key>(pointer));
    if (!slot) return false;
    slot->key.store(kErased, std::memory_order_release);
    --writer.living;
    auto index = static_cast<std::size_t>(slot - table.slots);
    if (table.slots[table.Next(index)].key.load(std::memory_order_relaxed) != kEmpty) return true;
    // No search passes here any more: the erased slots that end this run become empty.
    for (; table.slots[index].key.load(std::memory_order_relaxed) == kErased; index = table.Previous(index)) {
        table.slots[index].key.store(kEmpty, std::memory_order_release);
        --writer.occupied;
    }
    return true;
}

}  // namespace live
