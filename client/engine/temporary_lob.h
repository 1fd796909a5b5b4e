// Temporary large objects, for every engine: bytes of a file of the connection's.
#pragma once

#include <memory>

#include "engine/chunked_bytes.h"
#include "engine/lobs.h"

namespace engine {

class TemporaryLob final : public Lob {
public:
    TemporaryLob(LobKind kind, std::shared_ptr<ChunkFile> file) : kind_(kind), bytes_(std::move(file), FillerOf(kind)) {}

    [[nodiscard]] LobKind Kind() const override { return kind_; }
    [[nodiscard]] bool IsTemporary() const override { return true; }
    [[nodiscard]] bool IsSame(const Lob& other) const override { return this == &other; }
    [[nodiscard]] std::uint64_t Version() const override { return version_; }
    Status Length(std::uint64_t& bytes) override { return bytes = bytes_.Size(), Status(); }
    Status Read(std::uint64_t offset, std::span<std::byte> out, std::size_t& read) override {
        return bytes_.Read(offset, out, read);
    }
    Status CheckWrite() override { return {}; }
    Status Write(std::uint64_t offset, std::span<const std::byte> in) override {
        ++version_;
        return bytes_.Write(offset, in);
    }
    Status Trim(std::uint64_t bytes) override {
        ++version_;
        bytes_.Trim(bytes);
        return {};
    }

private:
    const LobKind kind_;
    std::uint64_t version_ = 1;
    ChunkedBytes bytes_;
};

}  // namespace engine
