// Reading levels: physical lines joined to command lines, echoed, tokenized and dispatched; scripts within scripts.
#include "loop/script.h"

#include <sys/resource.h>
#include <sys/stat.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <new>

#include "core/messages.h"
#include "loop/dispatch.h"
#include "loop/tokenizer.h"
#include "objects/memory.h"

namespace {

constexpr size_t kContinuedAtLeast = 4;  // a shorter text is never continued, whatever it ends in

// What one level owns. The line is cleared before a command is read, but not after a blank line or a comment: a quote
// without its partner may run on into what such a line has left. Only what has been written to is cleared.
class Level {
public:
    explicit Level(std::FILE* stream) : stream_(stream) {}
    void Run();

private:
    bool ReadCommandLine();
    bool ReadPhysicalLine(size_t fill);
    void ClearLine();

    std::FILE* stream_;
    size_t dirty_ = 0;  // bytes of the line that may not be zero
    char line_[kLineSize] = {};
    TokenVector tokens_;
};

void Level::ClearLine() {
    std::memset(line_, 0, dirty_);
    dirty_ = 0;
}

// Reads up to and with the next newline to `fill`, as far as the buffer goes. False at the end of the input.
bool Level::ReadPhysicalLine(size_t fill) {
    size_t end = fill;
    int character = 0;
    flockfile(stream_);
    while (end < kLineSize - 1 && character != '\n' && (character = getc_unlocked(stream_)) != EOF)
        line_[end++] = static_cast<char>(character);
    const bool failed = ferror(stream_) != 0;
    funlockfile(stream_);
    line_[end] = '\0';
    dirty_ = std::max(dirty_, end);
    return end != fill && !failed;
}

// Reads a line with those that continue it, and echoes it.
bool Level::ReadCommandLine() {
    MessageText(kOutput, "> ");
    size_t length = 0;
    for (;;) {
        if (!ReadPhysicalLine(length)) return false;
        length = std::strlen(line_);
        if (length < kContinuedAtLeast || std::strcmp(line_ + length - 2, "\\\n") != 0) break;
        length -= 2;
        line_[length] = '\0';
    }
    MessageText(kOutput, {line_, length});
    return true;
}

void Level::Run() {
    while (ReadCommandLine()) {
        char* start = line_ + std::strspn(line_, " \t");
        if (*start == '\0' || *start == '\n' || *start == '#') continue;
        const int count = Tokenize(line_, start, tokens_);
        if (Dispatch(count, tokens_.Words()) == kStopLoop) return;
        ClearLine();
    }
}

// Half of the stack is left to the commands and to the library they call.
size_t StackForLevels() {
    constexpr size_t kUnlimited = size_t{64} << 20;
    rlimit limit{};
    if (getrlimit(RLIMIT_STACK, &limit) != 0 || limit.rlim_cur == RLIM_INFINITY) return kUnlimited;
    return limit.rlim_cur / 2;
}

// Whether the stack has room for another level of scripts.
bool RoomForAnotherLevel() {
    static const size_t kRoom = StackForLevels();
    static const char* const first = static_cast<const char*>(__builtin_frame_address(0));
    const auto* here = static_cast<const char*>(__builtin_frame_address(0));
    return static_cast<size_t>(std::abs(first - here)) < kRoom;
}

// Opens a script for reading; null for what cannot be read, a folder too, which the system would only refuse later.
std::FILE* OpenScript(const char* name) {
    std::FILE* file = std::fopen(name, "r");
    struct stat status;
    if (file == nullptr || fstat(fileno(file), &status) != 0 || !S_ISDIR(status.st_mode)) return file;
    std::fclose(file);
    return nullptr;
}

}  // namespace

void ReadAndEvaluateScript(std::FILE* stream) {
    const Memory<void> room(GetMem(sizeof(Level)));
    if (room == nullptr) return;
    auto* level = new (room.get()) Level(stream);
    level->Run();
    level->~Level();
}

void ReadScript(const CommandRow& row, int count, char** words) {
    // With a blank at the end that no other usage text has: logs hold it.
    if (count != 2) return Message(kError, "Invalid Syntax: %s \n", row.usage);
    if (!RoomForAnotherLevel()) return Message(kError, "Scripts are nested too deeply to read: %s !\n", words[1]);
    std::FILE* file = OpenScript(words[1]);
    if (file == nullptr) return Message(kError, "Could not open file: %s !\n", words[1]);
    ReadAndEvaluateScript(file);
    std::fclose(file);
}
