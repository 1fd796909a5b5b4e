#include "statements/row_buffer.h"

#include <algorithm>
#include <cstring>

#include "oci.h"

namespace {

constexpr std::size_t kBlockSize = 64 * 1024;

// How many bytes stand at `data`.
std::size_t BytesOf(const engine::Datum& value) {
    switch (value.kind) {
        case engine::Kind::decimal: return OCI_NUMBER_SIZE;
        case engine::Kind::text:
        case engine::Kind::bytes:
        case engine::Kind::timestamp: return value.length;
        default: return 0;
    }
}

}  // namespace

void RowBuffer::Clear() {
    blocks_.clear();
    rows_.clear();
    block_used_ = block_size_ = 0;
}

void* RowBuffer::Reserve(std::size_t size) {
    size = (size + alignof(engine::Datum) - 1) / alignof(engine::Datum) * alignof(engine::Datum);
    if (size > block_size_ - block_used_) {
        const std::size_t wanted = std::max(size, kBlockSize);
        blocks_.push_back(std::make_unique_for_overwrite<std::byte[]>(wanted));
        block_size_ = wanted;
        block_used_ = 0;
    }
    void* place = blocks_.back().get() + block_used_;
    block_used_ += size;
    return place;
}

void RowBuffer::Append(std::span<const engine::Datum> values) {
    columns_ = values.size();
    std::size_t size = values.size_bytes();
    for (const engine::Datum& value : values) size += BytesOf(value);
    auto* headers = static_cast<engine::Datum*>(Reserve(size));
    auto* bytes = reinterpret_cast<char*>(headers + values.size());
    std::copy(values.begin(), values.end(), headers);
    for (std::size_t index = 0; index < values.size(); ++index) {
        engine::Datum& value = headers[index];
        const std::size_t length = BytesOf(value);
        if (length == 0) continue;
        std::memcpy(bytes, value.data, length);
        value.data = bytes;
        bytes += length;
    }
    rows_.push_back(headers);
}
