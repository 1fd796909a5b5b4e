// Reading a file, and replacing it so that nobody ever sees half of it.
#include "platform/whole_file.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <climits>
#include <cstdlib>
#include <string_view>

namespace {

constexpr std::size_t kLargestFile = std::size_t{16} << 20;

class Descriptor {
public:
    explicit Descriptor(int number) : number_(number) {}
    ~Descriptor() { if (number_ >= 0) close(number_); }
    Descriptor(const Descriptor&) = delete;
    Descriptor& operator=(const Descriptor&) = delete;
    [[nodiscard]] int Get() const { return number_; }

private:
    int number_;
};

bool WriteAll(int descriptor, std::string_view content) {
    while (!content.empty()) {
        const ssize_t written = write(descriptor, content.data(), content.size());
        if (written < 0 && errno == EINTR) continue;
        if (written <= 0) return false;
        content.remove_prefix(static_cast<std::size_t>(written));
    }
    return true;
}

// The path with its links followed, as far as it exists.
std::string Followed(const std::string& path) {
    char resolved[PATH_MAX];
    return realpath(path.c_str(), resolved) ? resolved : path;
}

std::string DirectoryOf(const std::string& path) {
    const std::size_t slash = path.rfind('/');
    return slash == path.npos ? "." : path.substr(0, slash + 1);
}

// Gives the file the owner, where that is allowed, and the permissions of the one it replaces, if there is one.
bool TakeOver(int descriptor, const std::string& path) {
    struct stat old {};
    if (stat(path.c_str(), &old) != 0) return errno == ENOENT;
    if (fchown(descriptor, old.st_uid, old.st_gid) != 0 && errno != EPERM) return false;
    return fchmod(descriptor, old.st_mode & 07777) == 0;
}

}  // namespace

bool ReadWholeFile(const std::string& path, std::string& content) {
    content.clear();
    const Descriptor file(open(path.c_str(), O_RDONLY | O_CLOEXEC));
    if (file.Get() < 0) return errno == ENOENT;
    char block[8192];
    for (;;) {
        const ssize_t count = read(file.Get(), block, sizeof block);
        if (count < 0 && errno == EINTR) continue;
        if (count < 0) return false;
        if (count == 0) return true;
        content.append(block, static_cast<std::size_t>(count));
        if (content.size() > kLargestFile) return false;
    }
}

DirectoryLock::DirectoryLock(const std::string& path_of_file)
    : path_(Followed(path_of_file)),
      descriptor_(open(DirectoryOf(path_).c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC)) {
    while (descriptor_ >= 0 && flock(descriptor_, LOCK_EX) != 0 && errno == EINTR) {}
}

DirectoryLock::~DirectoryLock() {
    if (descriptor_ >= 0) close(descriptor_);
}

bool DirectoryLock::Replace(const std::string& content) const {
    const std::string temporary = path_ + ".new";
    unlink(temporary.c_str());    // left by a crash: nobody else writes here while the lock is held
    const Descriptor file(open(temporary.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666));
    if (file.Get() < 0) return false;
    const bool written = WriteAll(file.Get(), content) && TakeOver(file.Get(), path_) && fsync(file.Get()) == 0 &&
                         rename(temporary.c_str(), path_.c_str()) == 0;
    if (!written) {
        unlink(temporary.c_str());
        return false;
    }
    fsync(descriptor_);    // of the directory: a power failure may otherwise bring the old file back
    return true;
}
