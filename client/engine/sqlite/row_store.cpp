// Rows in blocks of memory and, beyond a limit, of a temporary file.
#include "engine/sqlite/row_store.h"

#include "handles/errors.h"

#include <algorithm>
#include <cstring>

namespace engine::sqlite {
namespace {

constexpr std::size_t kBlockSize = std::size_t{1} << 18;
constexpr std::size_t kMemoryLimit = std::size_t{32} << 20;

bool HasBytes(Kind kind) {
    return kind == Kind::text || kind == Kind::bytes || kind == Kind::timestamp || kind == Kind::decimal;
}

std::size_t Aligned(std::size_t size) { return (size + alignof(Datum) - 1) / alignof(Datum) * alignof(Datum); }

}  // namespace

// A row is its data one after another: each a Datum, its bytes behind it.
Status RowStore::Add(std::span<const Datum> values) {
    std::size_t size = 0;
    for (const Datum& value : values) size += sizeof(Datum) + (HasBytes(value.kind) ? Aligned(value.length) : 0);
    if (!blocks_.empty() && blocks_.back().size - blocks_.back().used < size && in_memory_ > kMemoryLimit) {
        Status status = Spill(blocks_.back());
        if (status.Failed()) return status;
    }
    char* at = Reserve(size);
    for (const Datum& value : values) {
        std::memcpy(at, &value, sizeof value);
        at += sizeof value;
        if (!HasBytes(value.kind)) continue;
        if (value.length > 0) std::memcpy(at, value.data, value.length);
        at += Aligned(value.length);
    }
    return {};
}

char* RowStore::Reserve(std::size_t size) {
    if (blocks_.empty() || blocks_.back().size - blocks_.back().used < size) {
        Block block;
        block.size = std::max(size, kBlockSize);
        block.bytes.reset(new char[block.size]);
        in_memory_ += block.size;
        blocks_.push_back(std::move(block));
    }
    Block& last = blocks_.back();
    char* at = last.bytes.get() + last.used;
    last.used += size;
    return at;
}

Status RowStore::Spill(Block& block) {
    if (!file_) file_.reset(std::tmpfile());
    if (!file_ || std::fseek(file_.get(), 0, SEEK_END) != 0)
        return Error(errors::kInputOutputError, "no temporary file");
    block.file_offset = std::ftell(file_.get());
    if (block.file_offset < 0 || std::fwrite(block.bytes.get(), 1, block.used, file_.get()) != block.used) {
        return Error(errors::kInputOutputError, "cannot write a temporary file");
    }
    in_memory_ -= block.size;
    block.bytes.reset();
    return {};
}

Status RowStore::Load(Block& block) {
    std::unique_ptr<char[]> bytes(new char[block.used]);
    if (std::fseek(file_.get(), block.file_offset, SEEK_SET) != 0 ||
        std::fread(bytes.get(), 1, block.used, file_.get()) != block.used) {
        return Error(errors::kInputOutputError, "cannot read a temporary file");
    }
    block.bytes = std::move(bytes);
    return {};
}

bool RowStore::Next(std::span<Datum> values, Status& status) {
    while (block_ < blocks_.size() && offset_ == blocks_[block_].used) {
        blocks_[block_].bytes.reset();
        ++block_;
        offset_ = 0;
    }
    if (block_ == blocks_.size()) return false;
    Block& block = blocks_[block_];
    if (!block.bytes) {
        status = Load(block);
        if (status.Failed()) return false;
    }
    for (Datum& value : values) {
        std::memcpy(&value, block.bytes.get() + offset_, sizeof value);
        offset_ += sizeof value;
        if (!HasBytes(value.kind)) continue;
        value.data = block.bytes.get() + offset_;
        offset_ += Aligned(value.length);
    }
    return true;
}

void RowStore::Clear() noexcept {
    blocks_.clear();
    file_.reset();
    in_memory_ = block_ = offset_ = 0;
}

}  // namespace engine::sqlite
