// Rows kept one after another and read in any order: what is left of an open query before its connection writes, the
// rows of a scrollable query, a row that waits for its pieces. Up to 32 MB stay in memory, what is beyond lies in a
// temporary file. Every row has as many values as the first. One thread at a time.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <span>
#include <vector>

#include "engine/datum.h"
#include "handles/status.h"

namespace engine {

class RowStore {
public:
    RowStore() = default;
    ~RowStore();
    RowStore(const RowStore&) = delete;
    RowStore& operator=(const RowStore&) = delete;

    // Copies a row, all of it or, when memory or the disk fails (std::bad_alloc, a Status), nothing.
    Status Add(std::span<const Datum> values);
    // Fills `values` with views of row `index`, from 0 and below Size(). They hold until the next call on the store. A
    // failure leaves the store as it was, and the row can be asked for again.
    Status Read(std::uint64_t index, std::span<Datum> values);
    [[nodiscard]] std::uint64_t Size() const { return size_; }
    void Clear() noexcept;    // gives the memory and the file up

private:
    // Rows grow from the front of `bytes`, their offsets from its end towards them.
    struct Block {
        std::unique_ptr<std::byte[]> bytes;    // null: in the file
        std::size_t room = 0;
        std::size_t used = 0;                  // bytes of rows
        std::uint32_t rows = 0;
        std::uint64_t first_row = 0;
        std::uint64_t file_offset = 0;
    };
    struct LoadedBlock {
        std::unique_ptr<std::byte[]> bytes;
        std::size_t room = 0;
        std::size_t index = kNone;
    };
    static constexpr std::size_t kNone = ~std::size_t{0};

    static bool Fits(const Block& block, std::size_t size);
    Status NewBlock(std::size_t size);
    Status Spill(Block& block);
    Status OpenFile();
    Status Load(std::size_t index, const std::byte*& bytes);
    [[nodiscard]] std::size_t BlockOf(std::uint64_t row) const;

    std::vector<Block> blocks_;
    std::uint64_t size_ = 0;
    std::size_t in_memory_ = 0;      // bytes of the blocks there
    std::size_t reading_ = 0;        // the block of the row that was read last
    LoadedBlock loaded_;             // the last one that came back from the file
    int file_ = -1;
    std::uint64_t file_size_ = 0;
};

}  // namespace engine
