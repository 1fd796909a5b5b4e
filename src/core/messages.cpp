// The one writer: formats to standard output, flushes the stream a message is meant for. Any thread.
#include "core/messages.h"

#include <stdio_ext.h>
#include <sys/single_threaded.h>
#include <unistd.h>

#include <cstdarg>
#include <cstdio>

namespace {

// Holds the longest line a script can echo, with its prompt, and then some.
constexpr size_t kOutputRoom = 64 * 1024;
char output_room[kOutputRoom];

void Flush(Stream stream) {
    std::fflush(stream == kOutput ? stdout : stderr);
}

// Writes past the buffer where nothing waits in it: most of the log is whole lines, and a row of a large result costs
// little more than its write. Answers how much was written; what was not is for the buffer to keep.
size_t WriteAtOnce(std::string_view text) {
    const bool alone = __libc_single_threaded;    // locks nobody waits for cost as much as a value
    if (!alone) flockfile(stdout);
    const ssize_t written = __fpending(stdout) == 0 ? write(STDOUT_FILENO, text.data(), text.size()) : 0;
    if (!alone) funlockfile(stdout);
    return written > 0 ? static_cast<size_t>(written) : 0;
}

}  // namespace

void PrepareMessages() {
    std::setvbuf(stdout, output_room, _IOFBF, kOutputRoom);
}

void Message(Stream stream, const char* format, ...) {
    va_list arguments;
    va_start(arguments, format);
    std::vprintf(format, arguments);
    va_end(arguments);
    Flush(stream);
}

void MessageText(Stream stream, std::string_view text) {
    const size_t written = stream == kOutput ? WriteAtOnce(text) : 0;
    if (written > 0 && written == text.size()) return;
    text.remove_prefix(written);
    std::fwrite(text.data(), 1, text.size(), stdout);
    Flush(stream);
}

void InvalidSyntax(const char* usage) {
    Message(kError, "Invalid Syntax: %s\n", usage);
}

Line& Line::Hex(const void* bytes, size_t length) {
    constexpr char kDigits[] = "0123456789ABCDEF";
    const auto* byte = static_cast<const unsigned char*>(bytes);
    for (size_t index = 0; index < length; ++index) {
        text_.push_back(kDigits[byte[index] >> 4]);
        text_.push_back(kDigits[byte[index] & 15]);
    }
    return *this;
}

Line& Line::Format(const char* format, ...) {
    char room[256];
    va_list arguments;
    va_start(arguments, format);
    va_list again;
    va_copy(again, arguments);
    const auto length = static_cast<size_t>(std::vsnprintf(room, sizeof room, format, arguments));
    va_end(arguments);
    if (length < sizeof room) {
        text_.append(room, length);
    } else {
        const size_t start = text_.size();
        text_.resize(start + length + 1);
        std::vsnprintf(text_.data() + start, length + 1, format, again);
        text_.pop_back();
    }
    va_end(again);
    return *this;
}

void Line::Print(Stream stream) {
    MessageText(stream, text_);
    text_.clear();
}
