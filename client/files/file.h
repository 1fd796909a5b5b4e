// Open files of the file package, and what can be asked of a file by its name. Errors carry the package's number and
// the system's own words. Threads that use a file take turns; once one has closed it the others are told that it is no
// file (30153). What a file waits for, such as a pipe, keeps nothing that others free meanwhile.
#pragma once

#include <cstdint>
#include <cstdio>
#include <mutex>
#include <string>

#include "handles/object.h"
#include "handles/status.h"

class File : public Object {
public:
    static constexpr Kind kKind = Kind::file;
    explicit File(const Origin& origin) : Object(origin) {}
    ~File() override;

    // Opens the file of a name or, by type, one of the standard files; the other types are alike. `mode` is one of the
    // published ones, `create` any of theirs together.
    Status Open(const std::string& name, std::uint32_t mode, std::uint32_t create, std::uint32_t type);
    // Ends the use of the file; what could not be written shows now at the latest. The standard files stay open. Throws
    // std::bad_alloc, but is closed then.
    Status Close();

    Status Read(void* buffer, std::uint32_t size, std::uint32_t* count);
    Status Write(const void* data, std::uint32_t size, std::uint32_t* count);
    Status Seek(std::uint32_t origin, std::uint64_t offset, int direction);
    Status Flush();

private:
    template <class Body>
    Status InTurn(Body body);
    int GiveUpStream() noexcept;    // the system's error, 0 for none

    enum class Last { other, read, write };
    void Turn(Last next);    // the stream must be told when reading and writing take turns
    Status Use(std::FILE* stream, std::uint32_t mode, bool standard);

    std::mutex mutex_;
    std::FILE* stream_ = nullptr;    // null before it is opened and once it is closed
    std::string name_;    // for error texts
    bool readable_ = false;
    bool writable_ = false;
    bool standard_ = false;
    Last last_ = Last::other;
};

Status FileExists(const std::string& name, bool* exists);
Status FileLength(const std::string& name, std::uint64_t* length);
