// Bytes of any number that can be read and written anywhere: a few in memory, more in chunks that all of a connection
// share: up to 32 MB of them in memory, the others in a temporary file. What is given up is used again, and an empty file
// takes no room; nor does a gap.
//
// Threads: one at a time for what it holds; it may go in any thread.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <mutex>
#include <span>
#include <vector>

#include "handles/status.h"

namespace engine {

class ChunkFile {
public:
    static constexpr std::size_t kChunk = std::size_t{1} << 16;

    ChunkFile() = default;
    ~ChunkFile();
    ChunkFile(const ChunkFile&) = delete;
    ChunkFile& operator=(const ChunkFile&) = delete;

    Status Take(std::uint32_t& chunk);    // its bytes are anything
    void GiveBack(std::span<const std::uint32_t> chunks) noexcept;
    Status Read(std::uint32_t chunk, std::size_t at, std::span<std::byte> out) const;
    Status Write(std::uint32_t chunk, std::size_t at, std::span<const std::byte> in) const;
    // A chunk's bytes; null: they lie in the file.
    [[nodiscard]] std::byte* Memory(std::uint32_t chunk) const {
        return chunk < kInMemory ? memory_[chunk].get() : nullptr;
    }

private:
    static constexpr std::uint32_t kInMemory = 512;    // the first so many chunks

    std::mutex mutex_;    // of all but the bytes
    std::array<std::unique_ptr<std::byte[]>, kInMemory> memory_;
    int file_ = -1;       // set once, when the first chunk is taken that lies there
    std::uint32_t count_ = 0;
    std::vector<std::uint32_t> free_;
};

class ChunkedBytes {
public:
    // Gaps read as `filler`.
    ChunkedBytes(std::shared_ptr<ChunkFile> file, std::byte filler) : file_(std::move(file)), filler_(filler) {}
    ~ChunkedBytes() { GiveBack(0); }
    ChunkedBytes(const ChunkedBytes&) = delete;
    ChunkedBytes& operator=(const ChunkedBytes&) = delete;

    [[nodiscard]] std::uint64_t Size() const { return size_; }
    Status Read(std::uint64_t offset, std::span<std::byte> out, std::size_t& read) const;
    // A failure in the middle leaves what is behind the old end away.
    Status Write(std::uint64_t offset, std::span<const std::byte> in);
    void Trim(std::uint64_t size) noexcept;    // to no more than its size
    // Where nothing is yet: so many bytes, put in place by `read`, part by part.
    using Reader = std::function<Status(std::uint64_t offset, std::span<std::byte> out)>;
    Status Fill(std::uint64_t size, const Reader& read);

private:
    static constexpr std::size_t kInMemory = 4096;
    static constexpr std::uint32_t kGap = ~std::uint32_t{0};
    Status MoveToFile();
    Status FillChunk(std::uint32_t chunk, std::size_t from) const;
    void GiveBack(std::size_t first) noexcept;

    const std::shared_ptr<ChunkFile> file_;
    const std::byte filler_;
    std::vector<std::byte> memory_;         // all of it, while there are no chunks
    std::vector<std::uint32_t> chunks_;     // behind size_ a chunk is anything
    std::uint64_t size_ = 0;
};

}  // namespace engine
