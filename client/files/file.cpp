// Files over the C library's streams. The standard ones are the process's own, so that what is written there comes in
// order with what the application writes.
#include "files/file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <limits>
#include <system_error>
#include <utility>

#include "handles/errors.h"
#include "oci_constants.h"

namespace {

// What the system says and the number it gets; anything else is kCannotAccess.
constexpr struct { int error; int number; } kSystemErrors[] = {
    {EINVAL, errors::kInvalidFileArgument}, {EEXIST, errors::kFileExists},    {ENOENT, errors::kNoSuchFile},
    {EIO, errors::kFileInputOutput},        {ENOSPC, errors::kFileNoSpace},   {EDQUOT, errors::kFileNoSpace},
    {EACCES, errors::kAccessDenied},        {EPERM, errors::kAccessDenied},   {EROFS, errors::kAccessDenied},
    {EISDIR, errors::kIsDirectory},         {EFBIG, errors::kFileTooLarge},
    {EOVERFLOW, errors::kFileTooLarge},     {ENOMEM, errors::kOutOfMemory}};

Status SystemError(const std::string& name, int error) {
    int number = errors::kCannotAccess;
    for (const auto& row : kSystemErrors) {
        if (row.error == error) number = row.number;
    }
    return Error(number, name + ": " + std::system_category().message(error));
}

Status InvalidArgument(const char* what) { return Error(errors::kInvalidFileArgument, what); }

// By open mode. A stream that appends must know, or it takes its position for another after it has written.
constexpr const char* kStreamModes[] = {nullptr, "r", "w", "r+"};
constexpr const char* kAppendingModes[] = {nullptr, "r", "a", "a+"};
constexpr int kAccessModes[] = {0, O_RDONLY, O_WRONLY, O_RDWR};

// Emptying is left for when nothing else can fail.
int OpenFlags(std::uint32_t mode, std::uint32_t create) {
    int flags = kAccessModes[mode] | O_CLOEXEC;
    if (create != OCI_FILE_EXIST) flags |= O_CREAT;
    if (create & OCI_FILE_EXCL) flags |= O_EXCL;
    return flags;
}

// Empties a file; pipes and devices hold nothing.
bool Empty(const std::string& name, int descriptor, std::uint32_t mode) {
    const int failed = mode & OCI_FILE_WRITE_ONLY ? ftruncate(descriptor, 0) : truncate(name.c_str(), 0);
    return failed == 0 || errno == EINVAL;
}

bool IsDirectory(int descriptor) {
    struct stat status {};
    return fstat(descriptor, &status) == 0 && S_ISDIR(status.st_mode);
}

}  // namespace

File::~File() { (void)GiveUpStream(); }

// The calls on an open file, one at a time: body().
template <class Body>
Status File::InTurn(Body body) {
    const LongCall wait;
    const std::lock_guard lock(mutex_);
    return stream_ ? body() : Error(errors::kInvalidFileObject);
}

Status File::Use(std::FILE* stream, std::uint32_t mode, bool standard) {
    stream_ = stream;
    standard_ = standard;
    readable_ = mode & OCI_FILE_READ_ONLY;
    writable_ = mode & OCI_FILE_WRITE_ONLY;
    return {};
}

Status File::Open(const std::string& name, std::uint32_t mode, std::uint32_t create, std::uint32_t type) {
    constexpr std::uint32_t kAllCreateFlags = OCI_FILE_CREATE | OCI_FILE_EXCL | OCI_FILE_TRUNCATE | OCI_FILE_APPEND;
    name_ = name;
    if (type == OCI_FILE_STDIN) return Use(stdin, OCI_FILE_READ_ONLY, true);
    if (type == OCI_FILE_STDOUT) return Use(stdout, OCI_FILE_WRITE_ONLY, true);
    if (type == OCI_FILE_STDERR) return Use(stderr, OCI_FILE_WRITE_ONLY, true);
    if (mode < OCI_FILE_READ_ONLY || mode > OCI_FILE_READ_WRITE) return InvalidArgument("unknown open mode");
    if (create & ~kAllCreateFlags) return InvalidArgument("unknown create flag");
    const LongCall wait;    // for the other end of a pipe
    const int descriptor = open(name.c_str(), OpenFlags(mode, create), 0666);
    if (descriptor < 0) return SystemError(name, errno);
    if (IsDirectory(descriptor)) {
        close(descriptor);
        return SystemError(name, EISDIR);
    }
    std::FILE* stream = fdopen(descriptor, create & OCI_FILE_APPEND ? kAppendingModes[mode] : kStreamModes[mode]);
    if (!stream) {
        const int error = errno;
        close(descriptor);
        if (create & OCI_FILE_EXCL) unlink(name.c_str());    // nobody else's
        return SystemError(name, error);
    }
    Status status = Use(stream, mode, false);    // who owns it closes it
    return (create & OCI_FILE_TRUNCATE) && !Empty(name, descriptor, mode) ? SystemError(name, errno) : status;
}

int File::GiveUpStream() noexcept {
    std::FILE* stream = std::exchange(stream_, nullptr);
    if (!stream) return 0;
    errno = 0;
    const bool failed = standard_ ? writable_ && std::fflush(stream) != 0 : std::fclose(stream) != 0;
    if (!failed) return 0;
    return errno != 0 ? errno : EIO;
}

Status File::Close() {
    return InTurn([this] {
        const int error = GiveUpStream();
        return error != 0 ? SystemError(name_, error) : Status();
    });
}

void File::Turn(Last next) {
    if (!standard_ && last_ != Last::other && last_ != next) fseeko(stream_, 0, SEEK_CUR);
    last_ = next;
}

Status File::Read(void* buffer, std::uint32_t size, std::uint32_t* count) {
    return InTurn([&]() -> Status {
        if (!readable_) return Error(errors::kAccessDenied, name_ + ": not open for reading");
        Turn(Last::read);
        *count = static_cast<std::uint32_t>(std::fread(buffer, 1, size, stream_));
        const bool failed = *count < size && std::ferror(stream_);
        const int error = errno;
        if (*count < size) std::clearerr(stream_);    // what is appended later can still be read
        return failed ? SystemError(name_, error) : Status();
    });
}

Status File::Write(const void* data, std::uint32_t size, std::uint32_t* count) {
    return InTurn([&]() -> Status {
        if (!writable_) return Error(errors::kAccessDenied, name_ + ": not open for writing");
        Turn(Last::write);
        *count = static_cast<std::uint32_t>(std::fwrite(data, 1, size, stream_));
        if (*count == size) return {};
        const int error = errno;
        std::clearerr(stream_);
        return SystemError(name_, error);
    });
}

Status File::Seek(std::uint32_t origin, std::uint64_t offset, int direction) {
    return InTurn([&]() -> Status {
        if (origin < OCI_FILE_SEEK_BEGINNING || origin > OCI_FILE_SEEK_END)
            return InvalidArgument("unknown seek origin");
        const bool forward = direction == OCI_FILE_FORWARD;
        if (!forward && direction != OCI_FILE_BACKWARD) return InvalidArgument("unknown seek direction");
        if (offset > std::uint64_t{std::numeric_limits<std::int64_t>::max()})
            return InvalidArgument("offset too large");
        constexpr int kOrigins[] = {0, SEEK_SET, SEEK_CUR, SEEK_END};
        const auto distance = static_cast<off_t>(offset);
        if (fseeko(stream_, forward ? distance : -distance, kOrigins[origin]) == 0) return {};
        return SystemError(name_, errno);
    });
}

Status File::Flush() {
    return InTurn([&]() -> Status {
        if (!writable_) return {};
        return std::fflush(stream_) == 0 ? Status() : SystemError(name_, errno);
    });
}

Status FileExists(const std::string& name, bool* exists) {
    struct stat status {};
    *exists = stat(name.c_str(), &status) == 0;
    return *exists || errno == ENOENT || errno == ENOTDIR ? Status() : SystemError(name, errno);
}

Status FileLength(const std::string& name, std::uint64_t* length) {
    struct stat status {};
    if (stat(name.c_str(), &status) != 0) return SystemError(name, errno);
    if (S_ISDIR(status.st_mode)) return SystemError(name, EISDIR);
    *length = static_cast<std::uint64_t>(status.st_size);
    return {};
}
