// Rows in blocks of memory and, beyond a limit, of a temporary file. A row is its Datums, each with its bytes behind it.
#include "engine/row_store.h"

#include <unistd.h>

#include <algorithm>
#include <cstring>
#include <type_traits>

#include "engine/temporary_file.h"

namespace engine {
namespace {

constexpr std::size_t kFirstBlock = std::size_t{1} << 12;      // most stores hold a few rows
constexpr std::size_t kLargestBlock = std::size_t{1} << 18;
constexpr std::size_t kMemoryLimit = std::size_t{32} << 20;

using Offset = std::uint32_t;    // of a row in its block; a row that is larger than a block stands alone in its own
static_assert(std::is_trivially_copyable_v<Datum> && std::is_trivially_copyable_v<date::DateTime> &&
              std::is_trivially_copyable_v<RowId>);
static_assert(alignof(date::DateTime) <= alignof(Datum));

bool HasBytes(Kind kind) { return kind > Kind::real; }

constexpr std::size_t Aligned(std::size_t size) {
    return (size + alignof(Datum) - 1) / alignof(Datum) * alignof(Datum);
}

std::size_t SizeOf(std::span<const Datum> values) {
    std::size_t size = values.size_bytes();
    for (const Datum& value : values) size += HasBytes(value.kind) ? Aligned(value.length) : 0;
    return size;
}

void Copy(std::span<const Datum> values, std::byte* at) {
    for (const Datum& value : values) {
        std::memcpy(at, &value, sizeof value);
        at += sizeof value;
        if (!HasBytes(value.kind)) continue;
        if (value.length > 0) std::memcpy(at, value.data, value.length);
        at += Aligned(value.length);
    }
}

void View(const std::byte* at, std::span<Datum> values) {
    for (Datum& value : values) {
        std::memcpy(&value, at, sizeof value);
        at += sizeof value;
        if (!HasBytes(value.kind)) continue;
        value.data = at;
        at += Aligned(value.length);
    }
}

}  // namespace

RowStore::~RowStore() { Clear(); }

bool RowStore::Fits(const Block& block, std::size_t size) {
    const std::size_t taken = block.used + block.rows * sizeof(Offset);
    return block.bytes && block.room - taken >= size + sizeof(Offset);
}

Status RowStore::Add(std::span<const Datum> values) {
    const std::size_t size = SizeOf(values);
    if (blocks_.empty() || !Fits(blocks_.back(), size)) {
        Status status = NewBlock(size);
        if (status.Failed()) return status;
    }
    Block& block = blocks_.back();
    const auto offset = static_cast<Offset>(block.used);
    Copy(values, block.bytes.get() + block.used);
    block.used += size;
    ++block.rows;
    std::memcpy(block.bytes.get() + block.room - block.rows * sizeof offset, &offset, sizeof offset);
    ++size_;
    return {};
}

// Blocks grow with the store; the last one goes to the file when there are enough in memory.
Status RowStore::NewBlock(std::size_t size) {
    if (blocks_.size() == blocks_.capacity()) blocks_.reserve(std::max<std::size_t>(4, 2 * blocks_.size()));
    const std::size_t usual = blocks_.empty() ? kFirstBlock : std::min(2 * blocks_.back().room, kLargestBlock);
    const std::size_t room = std::max(Aligned(size + sizeof(Offset)), usual);
    if (!blocks_.empty() && in_memory_ + room > kMemoryLimit) {
        Status status = Spill(blocks_.back());
        if (status.Failed()) return status;
    }
    Block block;
    block.bytes = std::make_unique_for_overwrite<std::byte[]>(room);
    block.room = room;
    block.first_row = size_;
    in_memory_ += room;
    blocks_.push_back(std::move(block));
    return {};
}

Status RowStore::OpenFile() { return file_ >= 0 ? Status() : OpenTemporaryFile(file_); }

// The block is given up last, so that one that could not be written stays where it is.
Status RowStore::Spill(Block& block) {
    if (!block.bytes) return {};
    Status status = OpenFile();
    if (status.Failed()) return status;
    status = WriteTemporaryFile(file_, file_size_, {block.bytes.get(), block.room});
    if (status.Failed()) return status;
    block.file_offset = file_size_;
    file_size_ += block.room;
    in_memory_ -= block.room;
    block.bytes.reset();
    return {};
}

Status RowStore::Load(std::size_t index, const std::byte*& bytes) {
    const Block& block = blocks_[index];
    if (loaded_.index != index) {
        loaded_.index = kNone;
        if (loaded_.room < block.room) {
            loaded_.room = 0;
            loaded_.bytes = std::make_unique_for_overwrite<std::byte[]>(block.room);
            loaded_.room = block.room;
        }
        Status status = ReadTemporaryFile(file_, block.file_offset, {loaded_.bytes.get(), block.room});
        if (status.Failed()) return status;
        loaded_.index = index;
    }
    bytes = loaded_.bytes.get();
    return {};
}

// The block of the last row or the one behind it, nearly always.
std::size_t RowStore::BlockOf(std::uint64_t row) const {
    for (std::size_t index = reading_; index < std::min(reading_ + 2, blocks_.size()); ++index) {
        const Block& block = blocks_[index];
        if (row >= block.first_row && row - block.first_row < block.rows) return index;
    }
    const auto behind = std::upper_bound(blocks_.begin(), blocks_.end(), row,
                                         [](std::uint64_t wanted, const Block& block) { return wanted < block.first_row; });
    return static_cast<std::size_t>(behind - blocks_.begin()) - 1;
}

Status RowStore::Read(std::uint64_t index, std::span<Datum> values) {
    const std::size_t number = BlockOf(index);
    const Block& block = blocks_[number];
    const std::byte* bytes = block.bytes.get();
    if (!bytes) {
        Status status = Load(number, bytes);
        if (status.Failed()) return status;
    }
    reading_ = number;
    Offset offset = 0;
    std::memcpy(&offset, bytes + block.room - (index - block.first_row + 1) * sizeof offset, sizeof offset);
    View(bytes + offset, values);
    return {};
}

void RowStore::Clear() noexcept {
    std::vector<Block>().swap(blocks_);
    loaded_ = {};
    if (file_ >= 0) ::close(file_);
    file_ = -1;
    size_ = file_size_ = 0;
    in_memory_ = reading_ = 0;
}

}  // namespace engine
