// Chunks of a temporary file, and bytes put together from them.
#include "engine/chunked_bytes.h"

#include <unistd.h>

#include <algorithm>
#include <cstring>
#include <string>

#include "engine/temporary_file.h"

namespace engine {
namespace {

std::uint64_t Place(std::uint32_t chunk, std::size_t at) { return std::uint64_t{chunk} * ChunkFile::kChunk + at; }

}  // namespace

// ---- The file

ChunkFile::~ChunkFile() {
    if (file_ >= 0) ::close(file_);
}

// Whoever gives chunks back needs no memory for it: there is room for all of them.
Status ChunkFile::Take(std::uint32_t& chunk) {
    const std::lock_guard lock(mutex_);
    if (free_.empty()) {
        if (free_.capacity() <= count_) free_.reserve(std::max<std::size_t>(16, 2 * std::size_t{count_} + 1));
        if (count_ < kInMemory) {
            memory_[count_] = std::make_unique_for_overwrite<std::byte[]>(kChunk);
        } else if (file_ < 0) {
            if (Status status = OpenTemporaryFile(file_); status.Failed()) return status;
        }
        chunk = count_++;
        return {};
    }
    chunk = free_.back();
    free_.pop_back();
    return {};
}

void ChunkFile::GiveBack(std::span<const std::uint32_t> chunks) noexcept {
    if (chunks.empty()) return;
    const std::lock_guard lock(mutex_);
    free_.insert(free_.end(), chunks.begin(), chunks.end());
    if (free_.size() < count_) return;
    free_.clear();
    for (std::uint32_t chunk = 0; chunk < std::min(count_, kInMemory); ++chunk) memory_[chunk] = nullptr;
    count_ = 0;
    if (file_ >= 0) (void)!::ftruncate(file_, 0);
}

Status ChunkFile::Read(std::uint32_t chunk, std::size_t at, std::span<std::byte> out) const {
    const std::byte* const bytes = Memory(chunk);
    if (!bytes) return ReadTemporaryFile(file_, Place(chunk - kInMemory, at), out);
    std::copy_n(bytes + at, out.size(), out.begin());
    return {};
}

Status ChunkFile::Write(std::uint32_t chunk, std::size_t at, std::span<const std::byte> in) const {
    std::byte* const bytes = Memory(chunk);
    if (!bytes) return WriteTemporaryFile(file_, Place(chunk - kInMemory, at), in);
    std::copy(in.begin(), in.end(), bytes + at);    // nothing may be no place at all
    return {};
}

// ---- The bytes

Status ChunkedBytes::Read(std::uint64_t offset, std::span<std::byte> out, std::size_t& read) const {
    read = 0;
    if (offset >= size_) return {};
    const auto length = static_cast<std::size_t>(std::min<std::uint64_t>(out.size(), size_ - offset));
    if (chunks_.empty()) {
        std::memcpy(out.data(), memory_.data() + offset, length);
        read = length;
        return {};
    }
    while (read < length) {
        const std::size_t at = (offset + read) % ChunkFile::kChunk;
        const std::size_t part = std::min(length - read, ChunkFile::kChunk - at);
        const std::uint32_t chunk = chunks_[static_cast<std::size_t>((offset + read) / ChunkFile::kChunk)];
        const std::span<std::byte> place = out.subspan(read, part);
        if (chunk == kGap) std::fill(place.begin(), place.end(), filler_);
        else if (Status status = file_->Read(chunk, at, place); status.Failed()) return status;
        read += part;
    }
    return {};
}

Status ChunkedBytes::MoveToFile() {
    chunks_.reserve(1);
    std::uint32_t chunk = 0;
    if (Status status = file_->Take(chunk); status.Failed()) return status;
    chunks_.push_back(chunk);
    Status status = file_->Write(chunk, 0, memory_);
    if (status.Failed()) {
        file_->GiveBack(chunks_);
        chunks_.clear();
        return status;
    }
    std::vector<std::byte>().swap(memory_);
    return status;
}

// The rest of a chunk, from some byte on.
Status ChunkedBytes::FillChunk(std::uint32_t chunk, std::size_t from) const {
    const std::vector<std::byte> fillers(ChunkFile::kChunk - from, filler_);
    return file_->Write(chunk, from, fillers);
}

Status ChunkedBytes::Write(std::uint64_t offset, std::span<const std::byte> in) {
    constexpr std::size_t kChunk = ChunkFile::kChunk;
    const std::uint64_t end = offset + in.size();
    if (in.empty()) return {};
    if (chunks_.empty() && end <= kInMemory) {
        if (end > memory_.size()) memory_.resize(static_cast<std::size_t>(end), filler_);
        std::copy(in.begin(), in.end(), memory_.begin() + static_cast<std::ptrdiff_t>(offset));
        size_ = memory_.size();
        return {};
    }
    if (chunks_.empty()) {
        if (Status status = MoveToFile(); status.Failed()) return status;
    }
    if (offset > size_) {    // what is left of the last chunk belongs to the gap
        const auto last = static_cast<std::size_t>(size_ / kChunk);
        chunks_.resize(std::max(chunks_.size(), static_cast<std::size_t>(offset / kChunk)), kGap);
        if (last < chunks_.size() && chunks_[last] != kGap) {
            if (Status status = FillChunk(chunks_[last], size_ % kChunk); status.Failed()) return status;
        }
    }
    for (std::size_t done = 0; done < in.size();) {
        const auto index = static_cast<std::size_t>((offset + done) / kChunk);
        const std::size_t at = (offset + done) % kChunk;
        const std::size_t part = std::min(in.size() - done, kChunk - at);
        if (index == chunks_.size()) chunks_.push_back(kGap);
        std::uint32_t& chunk = chunks_[index];
        if (chunk == kGap) {
            std::uint32_t taken = 0;
            if (Status status = file_->Take(taken); status.Failed()) return status;
            chunk = taken;
            if (part < kChunk) {
                if (Status status = FillChunk(chunk, 0); status.Failed()) return status;
            }
        }
        if (Status status = file_->Write(chunk, at, in.subspan(done, part)); status.Failed()) return status;
        done += part;
    }
    size_ = std::max(size_, end);
    return {};
}

void ChunkedBytes::GiveBack(std::size_t first) noexcept {
    const auto gaps = std::remove(chunks_.begin() + static_cast<std::ptrdiff_t>(first), chunks_.end(), kGap);
    chunks_.erase(gaps, chunks_.end());
    file_->GiveBack(std::span(chunks_).subspan(first));
    chunks_.resize(first);
}

// What a chunk in memory takes is read into it.
Status ChunkedBytes::Fill(std::uint64_t size, const Reader& read) {
    constexpr std::size_t kChunk = ChunkFile::kChunk;
    if (size <= kInMemory) {
        memory_.resize(static_cast<std::size_t>(size));
        Status status = size > 0 ? read(0, memory_) : Status();
        if (status.Failed()) memory_.clear();
        else size_ = size;
        return status;
    }
    chunks_.reserve(static_cast<std::size_t>((size + kChunk - 1) / kChunk));
    std::vector<std::byte> block;    // on the way to the file
    while (size_ < size) {
        const auto part = static_cast<std::size_t>(std::min<std::uint64_t>(size - size_, kChunk));
        std::uint32_t chunk = 0;
        if (Status status = file_->Take(chunk); status.Failed()) return status;
        chunks_.push_back(chunk);
        std::byte* const bytes = file_->Memory(chunk);
        if (!bytes) block.resize(kChunk);
        const std::span<std::byte> place(bytes ? bytes : block.data(), part);
        Status status = read(size_, place);
        if (status.Ok() && !bytes) status = file_->Write(chunk, 0, place);
        if (status.Failed()) return status;
        size_ += part;
    }
    return {};
}

void ChunkedBytes::Trim(std::uint64_t size) noexcept {
    size_ = size;
    if (chunks_.empty()) {
        memory_.resize(static_cast<std::size_t>(size_));
        return;
    }
    const auto needed = static_cast<std::size_t>((size_ + ChunkFile::kChunk - 1) / ChunkFile::kChunk);
    const std::size_t kept = std::max<std::size_t>(needed, 1);
    if (kept >= chunks_.size()) return;
    GiveBack(kept);
}

}  // namespace engine
