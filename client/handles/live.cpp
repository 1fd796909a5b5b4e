// Writing into the set of living objects.
//
// How much memory it takes: a table is at most half full and has at most eight words a living object when it is made
// (1024 at least). One that is replaced is freed at the next replacement, unless a call that looks up has been running
// since: so there are one table or two, and further ones only while such a call runs.
#include "handles/live.h"

#include <cassert>
#include <memory>
#include <mutex>
#include <vector>

namespace live {
namespace {

constexpr unsigned kFirstBits = 10;

// A table and the slots that it owns.
struct OwnedTable {
    explicit OwnedTable(unsigned bits)
        : slots(new Slot[std::size_t{1} << bits]{}), table{64 - bits, (std::size_t{1} << bits) - 1, slots.get()} {}

    const std::unique_ptr<Slot[]> slots;
    const Table table;
    in_flight::Epoch retired = 0;    // once it is replaced
};

constinit Slot no_slots[2];
constinit const Table kNoObjects{63, 1, no_slots};

// What only writers touch.
struct Writer {
    std::mutex mutex;
    std::vector<std::unique_ptr<OwnedTable>> tables;    // the last is in use, the others are replaced
    std::size_t living = 0;
    std::size_t occupied = 0;    // living or erased words

    [[nodiscard]] const Table& InUse() const { return tables.empty() ? kNoObjects : tables.back()->table; }
};

// Never destroyed: objects may be freed while the process ends. Nor made, which would need memory.
union Undying {
    constexpr Undying() : writer() {}
    ~Undying() {}
    Writer writer;
};
constinit Undying undying;

Writer& TheWriter() { return undying.writer; }

void Put(const Table& table, Word word, std::size_t& occupied) {
    std::size_t index = table.Home(AddressIn(word));
    for (;; index = table.Next(index)) {
        const Word found = table.slots[index].load(std::memory_order_relaxed);
        if (found == kEmpty) ++occupied;
        if (found == kEmpty || found == kErased) break;
    }
    table.slots[index].store(word, std::memory_order_release);
}

// The slot of an object; null when the table has it not.
Slot* FindSlot(const Table& table, const void* pointer) {
    const Word address = AddressOf(pointer);
    for (std::size_t index = table.Home(address);; index = table.Next(index)) {
        const Word found = table.slots[index].load(std::memory_order_relaxed);
        if (AddressIn(found) == address) return &table.slots[index];
        if (found == kEmpty) return nullptr;
    }
}

unsigned BitsFor(std::size_t living) {
    unsigned bits = kFirstBits;
    while ((std::size_t{1} << bits) < living * 4) ++bits;
    return bits;
}

// Publishes a table with room for one more: larger when many live, else only rid of erased words.
void Rebuild(Writer& writer) {
    auto owned = std::make_unique<OwnedTable>(BitsFor(writer.living + 1));
    writer.tables.reserve(writer.tables.size() + 1);
    std::size_t occupied = 0;
    const Table& old = writer.InUse();
    for (std::size_t index = 0; index <= old.mask; ++index) {
        const Word word = old.slots[index].load(std::memory_order_relaxed);
        if (word != kEmpty && word != kErased) Put(owned->table, word, occupied);
    }
    writer.occupied = occupied;
    current.store(&owned->table, std::memory_order_release);
    std::erase_if(writer.tables,
                  [](const auto& table) { return table->retired && in_flight::AllLeft(table->retired); });
    if (!writer.tables.empty()) writer.tables.back()->retired = in_flight::Retire();
    writer.tables.push_back(std::move(owned));
}

// Under the writer's mutex.
void CountErased() {
    erased_objects.store(erased_objects.load(std::memory_order_relaxed) + 1, std::memory_order_release);
}

}  // namespace

constinit std::atomic<const Table*> current{&kNoObjects};
constinit std::atomic<std::uint64_t> erased_objects{0};
[[gnu::tls_model("initial-exec")]] constinit thread_local Found last_found[kRemembered];

// Counts before it looks: what is erased meanwhile is not remembered for long.
bool FindAndRemember(const void* pointer, Kind kind) noexcept {
    const std::uint64_t erased = erased_objects.load(std::memory_order_acquire);
    if (Find(pointer) != kind) return false;
    last_found[RememberedAt(kind)] = {pointer, erased};
    return true;
}

void Insert(const void* pointer, Kind kind) {
    Writer& writer = TheWriter();
    const std::lock_guard lock(writer.mutex);
    if (writer.tables.empty() || (writer.occupied + 1) * 2 > writer.InUse().mask) Rebuild(writer);
    assert(AddressOf(pointer) >> (64 - kKindBits) == 0);
    Put(writer.InUse(), AddressOf(pointer) << kKindBits | static_cast<Word>(kind), writer.occupied);
    ++writer.living;
}

void Retype(const void* pointer, Kind kind) noexcept {
    Writer& writer = TheWriter();
    const std::lock_guard lock(writer.mutex);
    Slot* slot = FindSlot(writer.InUse(), pointer);
    if (!slot) return;
    slot->store(AddressOf(pointer) << kKindBits | static_cast<Word>(kind), std::memory_order_release);
    CountErased();
}

bool Contains(const void* pointer) noexcept {
    Writer& writer = TheWriter();
    const std::lock_guard lock(writer.mutex);
    return FindSlot(writer.InUse(), pointer) != nullptr;
}

std::size_t TableCount() noexcept {
    const std::lock_guard lock(TheWriter().mutex);
    return TheWriter().tables.size();
}

bool Erase(const void* pointer) noexcept {
    Writer& writer = TheWriter();
    const std::lock_guard lock(writer.mutex);
    const Table& table = writer.InUse();
    Slot* slot = FindSlot(table, pointer);
    if (!slot) return false;
    slot->store(kErased, std::memory_order_release);
    CountErased();
    --writer.living;
    auto index = static_cast<std::size_t>(slot - table.slots);
    if (table.slots[table.Next(index)].load(std::memory_order_relaxed) != kEmpty) return true;
    // No search passes here any more: the erased words that end this run become empty.
    for (; table.slots[index].load(std::memory_order_relaxed) == kErased; index = table.Previous(index)) {
        table.slots[index].store(kEmpty, std::memory_order_release);
        --writer.occupied;
    }
    return true;
}

}  // namespace live
