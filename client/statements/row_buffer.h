// The rows of a scrollable result, kept one after another in blocks that never move: a row is its values' headers and
// then their bytes.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <span>
#include <vector>

#include "engine/datum.h"

class RowBuffer {
public:
    void Clear();
    void Append(std::span<const engine::Datum> values);
    [[nodiscard]] std::uint64_t Size() const { return rows_.size(); }
    // The values of a row, counted from 0; valid until Clear.
    [[nodiscard]] std::span<const engine::Datum> Row(std::uint64_t index) const { return {rows_[index], columns_}; }

private:
    void* Reserve(std::size_t size);

    std::vector<std::unique_ptr<std::byte[]>> blocks_;
    std::size_t block_used_ = 0;
    std::size_t block_size_ = 0;
    std::vector<const engine::Datum*> rows_;
    std::size_t columns_ = 0;
};
