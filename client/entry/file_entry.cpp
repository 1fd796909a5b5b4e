// The file package: 8 calls, and its initialisation. A file is found once, in the gate's call; its own lock puts the
// calls of several threads into an order.
#include <string>

#include "files/file.h"
#include "handles/errors.h"
#include "handles/package.h"

namespace {

constexpr ub4 kLargestArea = 256U << 20;    // bytes at once; a length beyond that is a mistake, and nothing to be read

constinit Package the_package{errors::kInvalidFileArgument, "the file package is not initialised"};

// Calls on an open file: body(file).
template <class Body>
sword EnterFile(void* handle, OCIError* err, OCIFileObject* pointer, Body body) {
    return the_package.Enter(handle, err, [&](Environment&) -> Status {
        File* file = Live<File>(pointer);
        return file ? body(*file) : Error(errors::kInvalidFileObject);
    });
}

// The file of a name in a directory; both are closed with a zero, and the directory may be missing.
Status FullName(const Environment& environment, const OraText* name, const OraText* path, std::string& full) {
    if (!name) return Error(errors::kInvalidFileArgument, "no file name");
    const TextIn file(environment, name, TextLength(environment, name));
    const TextIn directory(environment, path, path ? TextLength(environment, path) : 0);
    if (!file.Valid() || !directory.Valid()) return Error(errors::kBadText);
    full = directory.View();
    if (!full.empty() && full.back() != '/') full += '/';
    full += file.View();
    return {};
}

// Calls that ask about a file by its name: ask(name, answer).
template <class Answer, class Wanted, class Ask>
sword AskFile(void* handle, OCIError* err, const OraText* name, const OraText* path, Wanted* out, Ask ask) {
    return the_package.Enter(handle, err, [&](const Environment& environment) -> Status {
        if (!out) return Error(errors::kInvalidFileArgument, "no place for the result");
        std::string full;
        Status named = FullName(environment, name, path, full);
        if (!named.Ok()) return named;
        Answer answer{};
        Status asked = ask(full, &answer);
        if (asked.Ok()) *out = static_cast<Wanted>(answer);
        return asked;
    });
}

Status OpenFile(Environment& environment, OCIFileObject** out, const OraText* name, const OraText* path, ub4 mode,
                ub4 create, ub4 type) {
    if (!out) return Error(errors::kInvalidFileArgument, "no place for the file object");
    std::string full;
    const bool standard = type >= OCI_FILE_STDIN && type <= OCI_FILE_STDERR;
    Status named = standard ? Status() : FullName(environment, name, path, full);
    if (!named.Ok()) return named;
    Made<File> file(Create<File>(environment, 0, 0));
    Status opened = file->Open(standard ? "standard file" : full, mode, create, type);
    if (opened.Ok()) *out = AsHandle<OCIFileObject>(file.release());
    return opened;
}

Status CheckArea(const void* area, ub4 size, const ub4* count) {
    if (!area || !count) return Error(errors::kInvalidFileArgument, "no area or no place for its count");
    return size > kLargestArea ? Error(errors::kInvalidFileArgument, "length too large") : Status();
}

}  // namespace

sword OCIFileInit(dvoid* hndl, OCIError* err) {
    return EnterHandle(hndl, err, [](Environment&) { return the_package.Init(), Status(); });
}

sword OCIFileTerm(dvoid* hndl, OCIError* err) {
    return EnterHandle(hndl, err, [](Environment&) { return the_package.Term(); });
}

sword OCIFileOpen(dvoid* hndl, OCIError* err, OCIFileObject** out, OraText* name, OraText* path, ub4 mode, ub4 create,
                  ub4 type) {
    return the_package.Enter(hndl, err, [&](Environment& environment) {
        return OpenFile(environment, out, name, path, mode, create, type);
    });
}

// The object is gone even when what it still had to write found no room.
sword OCIFileClose(dvoid* hndl, OCIError* err, OCIFileObject* file) {
    return EnterFile(hndl, err, file, [](File& open) {
        const Made<File> gone(&open);
        return open.Close();
    });
}

sword OCIFileFlush(dvoid* hndl, OCIError* err, OCIFileObject* file) {
    return EnterFile(hndl, err, file, [](File& open) { return open.Flush(); });
}

sword OCIFileRead(dvoid* hndl, OCIError* err, OCIFileObject* file, dvoid* buf, ub4 bufLen, ub4* bytesRead) {
    return EnterFile(hndl, err, file, [&](File& open) {
        Status checked = CheckArea(buf, bufLen, bytesRead);
        return checked.Ok() ? open.Read(buf, bufLen, bytesRead) : checked;
    });
}

sword OCIFileWrite(dvoid* hndl, OCIError* err, OCIFileObject* file, dvoid* buf, ub4 bufLen, ub4* bytesWritten) {
    return EnterFile(hndl, err, file, [&](File& open) {
        Status checked = CheckArea(buf, bufLen, bytesWritten);
        return checked.Ok() ? open.Write(buf, bufLen, bytesWritten) : checked;
    });
}

// A direction that the caller cut to eight bits is none of the two whatever its sign.
sword OCIFileSeek(dvoid* hndl, OCIError* err, OCIFileObject* file, uword origin, ubig_ora offset, sb1 direction) {
    return EnterFile(hndl, err, file, [&](File& open) { return open.Seek(origin, offset, direction); });
}

sword OCIFileExists(dvoid* hndl, OCIError* err, OraText* name, OraText* path, ub1* flag) {
    return AskFile<bool>(hndl, err, name, path, flag, FileExists);
}

sword OCIFileGetLength(dvoid* hndl, OCIError* err, OraText* name, OraText* path, ubig_ora* len) {
    return AskFile<std::uint64_t>(hndl, err, name, path, len, FileLength);
}
