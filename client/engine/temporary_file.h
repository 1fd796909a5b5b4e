// Temporary files without a name, and transfers that are whole or fail: 1653 without room, 1115 for any other reason.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>

#include "handles/status.h"

namespace engine {

// In TMPDIR or /tmp. The caller closes it.
Status OpenTemporaryFile(int& file);
// Whatever is not there to be read is a failure.
Status ReadTemporaryFile(int file, std::uint64_t offset, std::span<std::byte> out);
Status WriteTemporaryFile(int file, std::uint64_t offset, std::span<const std::byte> in);

}  // namespace engine
