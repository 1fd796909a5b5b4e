#include "engine/lobs.h"

#include <algorithm>
#include <vector>

namespace engine {
namespace {

constexpr std::size_t kBlock = std::size_t{1} << 18;

}  // namespace

Status CopyBytes(Lob& from, std::uint64_t from_offset, Lob& to, std::uint64_t to_offset, std::uint64_t bytes) {
    std::vector<std::byte> block(static_cast<std::size_t>(std::min<std::uint64_t>(bytes, kBlock)));
    for (std::uint64_t done = 0; done < bytes;) {
        const std::span wanted(block.data(), static_cast<std::size_t>(std::min<std::uint64_t>(bytes - done, block.size())));
        std::size_t read = 0;
        Status status = from.Read(from_offset + done, wanted, read);
        if (status.Ok() && read > 0) status = to.Write(to_offset + done, wanted.first(read));
        if (status.Failed() || read == 0) return status;
        done += read;
    }
    return {};
}

}  // namespace engine
