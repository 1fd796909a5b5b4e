// The commands of the library's file package. Command thread only.
#include <algorithm>

#include "commands/families.h"
#include "commands/shared/handle_call.h"
#include "core/messages.h"
#include "objects/memory.h"
#include "objects/registry.h"
#include "platform/client_library.h"
#include "report/trace.h"

namespace {

OCIFileObject* FindFile(const char* word) {
    return Resolve<OCIFileObject>(Kind::file, word);
}

// --- The package -----------------------------------------------------------------------------------------------------

constexpr PackageCall kPackageCalls[] = {
    {{Code::ocifileinit, Words(3), "OCIFileInit hEnv hError"}, &ClientLibrary::OCIFileInit},
    {{Code::ocifileterm, Words(3), "OCIFileTerm hEnv hError"}, &ClientLibrary::OCIFileTerm},
};

// --- An open file ----------------------------------------------------------------------------------------------------

struct FileCommand : CommandRow {
    LibraryFunction<sword(void*, OCIError*, OCIFileObject*)> ClientLibrary::*function;
    bool frees_name;
};
constexpr FileCommand kFileCommands[] = {
    {{Code::ocifileclose, Words(4), "OCIFileClose hEnv hError hFile"}, &ClientLibrary::OCIFileClose, true},
    {{Code::ocifileflush, Words(4), "OCIFileFlush hEnv hError hFile"}, &ClientLibrary::OCIFileFlush, false},
};
void RunFile(const FileCommand& row, int, char** words) {
    const EnvironmentAndError handles(words);
    OCIFileObject* const file = FindFile(words[3]);
    const sword rc = Call(row.function, handles.environment, handles.error, file);
    TraceAndReport(row.code, words[3], handles.error, rc);
    if (rc == OCI_SUCCESS && row.frees_name) Release(Kind::file, words[3]);
}

// Words that are none of their table's reach the library as what stands for "not found": for the type, that is how a
// plain file is asked for.
void RunOpen(const CommandRow& row, int, char** words) {
    const char* const name = words[3];
    const EnvironmentAndError handles(words);
    if (CheckInUse(Kind::file, name)) return;
    TextArgument file_name;
    TextArgument path;
    if (!SetClosedText(file_name, words[4]) || !SetClosedText(path, words[5])) return;
    const ub4 mode = static_cast<ub4>(DecodeKeyword(words[6], FileOpenModeKeywords));
    const ub4 create = static_cast<ub4>(DecodeKeyword(words[7], FileCreateKeywords));
    const ub4 type = static_cast<ub4>(DecodeKeyword(words[8], FileStdKeywords));
    NewObject<OCIFileObject> file(name, NullName::is_refused);
    const sword rc = Call(&ClientLibrary::OCIFileOpen, handles.environment, handles.error, file.Place(),
                          file_name.Text(), path.Text(), mode, create, type);
    TraceAndReport(row.code, name, handles.error, rc);
    if (rc == OCI_SUCCESS) file.Enter(Kind::file, handles.environment);
}

// Read in one go, at most this much: a larger length, or one below 0, is cut to it.
constexpr ub4 kLargestRead = 16u << 20;

void RunRead(const CommandRow& row, int count, char** words) {
    const EnvironmentAndError handles(words);
    OCIFileObject* const file = FindFile(words[3]);
    const ub4 length = std::min(static_cast<ub4>(DecodeNumber(words[4])), kLargestRead);
    const Memory<char> area(static_cast<char*>(GetMem(length)));
    if (area == nullptr) return;
    char* const buffer = Place(*area, count, words, 5);
    ub4 bytes_read = 0;
    ub4* const bytes_read_place = Place(bytes_read, count, words, 6);
    const sword rc = Call(&ClientLibrary::OCIFileRead, handles.environment, handles.error, file, buffer, length,
                          bytes_read_place);
    TraceAndReport(row.code, words[3], handles.error, rc);
    if (rc != OCI_SUCCESS || bytes_read_place == nullptr) return;
    Message(kOutput, "Bytes read - %u\n", bytes_read);
    if (buffer == nullptr) return;
    Line line;
    line.Text({buffer, std::min(bytes_read, length)}).Character('\n').Print();
}

void RunWrite(const CommandRow& row, int count, char** words) {
    const EnvironmentAndError handles(words);
    OCIFileObject* const file = FindFile(words[3]);
    TextArgument data;
    if (!data.SetBytes(words[4], DecodeLong(words[5]))) return;  // "null" is data like any other
    ub4 bytes_written = 0;
    ub4* const bytes_written_place = Place(bytes_written, count, words, 6);
    const sword rc = Call(&ClientLibrary::OCIFileWrite, handles.environment, handles.error, file, data.Text(),
                          data.Length(), bytes_written_place);
    TraceAndReport(row.code, words[3], handles.error, rc);
    if (rc == OCI_SUCCESS && bytes_written_place != nullptr) Message(kOutput, "Bytes written - %u\n", bytes_written);
}

// Unknown words for origin and direction reach the library as what stands for "not found", cut to the argument's width.
void RunSeek(const CommandRow& row, int, char** words) {
    const EnvironmentAndError handles(words);
    OCIFileObject* const file = FindFile(words[3]);
    const uword origin = static_cast<uword>(DecodeKeyword(words[4], FileSeekKeywords));
    const ubig_ora offset = static_cast<ubig_ora>(DecodeLong(words[5]));
    const sb1 direction = static_cast<sb1>(DecodeKeyword(words[6], FileDirectionKeywords));
    const sword rc = Call(&ClientLibrary::OCIFileSeek, handles.environment, handles.error, file, origin, offset,
                          direction);
    TraceAndReport(row.code, words[3], handles.error, rc);
}

// --- A file by its name ----------------------------------------------------------------------------------------------

template <class Answer> struct NamedFileCommand : CommandRow {
    LibraryFunction<sword(void*, OCIError*, OraText*, OraText*, Answer*)> ClientLibrary::*function;
};
constexpr NamedFileCommand<ub1> kExistenceCommands[] = {
    {{Code::ocifileexists, WordsBetween(5, 6), "OCIFileExists hEnv hError filename path [flag]"},
     &ClientLibrary::OCIFileExists},
};
constexpr NamedFileCommand<ubig_ora> kLengthCommands[] = {
    {{Code::ocifilegetlength, WordsBetween(5, 6), "OCIFileGetLength hEnv hError filename path [plen]"},
     &ClientLibrary::OCIFileGetLength},
};
template <class Answer> void RunNamedFile(const NamedFileCommand<Answer>& row, int count, char** words) {
    const EnvironmentAndError handles(words);
    TextArgument name;
    TextArgument path;
    if (!SetClosedText(name, words[3]) || !SetClosedText(path, words[4])) return;
    Answer answer = 0;
    Answer* const place = Place(answer, count, words, 5);
    const sword rc = Call(row.function, handles.environment, handles.error, name.Text(), path.Text(), place);
    TraceAndReport(row.code, "", handles.error, rc);
    if (rc == OCI_SUCCESS && place != nullptr) Message(kOutput, "%ld\n", static_cast<long>(answer));
}

constexpr PlainCommand kOtherFileCommands[] = {
    {{Code::ocifileopen, Words(9), "OCIFileOpen hEnv hError hFile filename path mode create type"}, RunOpen},
    {{Code::ocifileread, Words(5, 7), "OCIFileRead hEnv hError hFile bufl [buffer bytesread]"}, RunRead},
    {{Code::ocifilewrite, WordsBetween(6, 7), "OCIFileWrite hEnv hError hFile data datalen [byteswritten]"}, RunWrite},
    {{Code::ocifileseek, Words(7), "OCIFileSeek hEnv hError hFile origin offset dir"}, RunSeek},
};

}  // namespace

void AddFileCommands(HandlerTable& handlers) {
    handlers.Add<RunPackageCall>(kPackageCalls);
    handlers.Add<RunFile>(kFileCommands);
    handlers.Add<RunNamedFile<ub1>>(kExistenceCommands);
    handlers.Add<RunNamedFile<ubig_ora>>(kLengthCommands);
    handlers.Add(kOtherFileCommands);
}
