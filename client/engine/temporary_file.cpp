#include "engine/temporary_file.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <string>

#include "handles/errors.h"

namespace engine {
namespace {

Status FileFailed(const char* words) {
    const bool full = errno == ENOSPC || errno == EDQUOT || errno == EFBIG;
    return Error(full ? errors::kNoRoom : errors::kInputOutputError, words);
}

// A transfer that is cut short goes on; `move` answers like pwrite.
template <class Move>
bool All(std::size_t size, Move move) {
    for (std::size_t done = 0; done < size;) {
        errno = 0;
        const ssize_t moved = move(done);
        if (moved <= 0) {
            if (moved < 0 && errno == EINTR) continue;
            return false;
        }
        done += static_cast<std::size_t>(moved);
    }
    return true;
}

}  // namespace

Status OpenTemporaryFile(int& file) {
    const char* folder = std::getenv("TMPDIR");
    const std::string beginning = folder && *folder ? folder : "/tmp";
    file = ::open(beginning.c_str(), O_TMPFILE | O_RDWR | O_CLOEXEC, 0600);
    if (file >= 0) return {};
    std::string name = beginning + "/kelp-rows-XXXXXX";    // the folder's file system may know no unnamed files
    file = ::mkostemp(name.data(), O_CLOEXEC);
    if (file < 0) return FileFailed("no temporary file");
    ::unlink(name.c_str());
    return {};
}

Status ReadTemporaryFile(int file, std::uint64_t offset, std::span<std::byte> out) {
    const bool read = All(out.size(), [&](std::size_t done) {
        return ::pread(file, out.data() + done, out.size() - done, static_cast<off_t>(offset + done));
    });
    return read ? Status() : FileFailed("a temporary file cannot be read");
}

Status WriteTemporaryFile(int file, std::uint64_t offset, std::span<const std::byte> in) {
    const bool written = All(in.size(), [&](std::size_t done) {
        return ::pwrite(file, in.data() + done, in.size() - done, static_cast<off_t>(offset + done));
    });
    return written ? Status() : FileFailed("a temporary file cannot be written");
}

}  // namespace engine
