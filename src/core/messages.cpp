// The one writer: formats to standard output, flushes the stream a message is meant for.
#include "core/messages.h"

#include <cstdarg>
#include <cstdio>

namespace {

// Holds the longest line a script can echo, with its prompt, and then some.
constexpr size_t kOutputRoom = 64 * 1024;
char output_room[kOutputRoom];

void Flush(Stream stream) {
    std::fflush(stream == kOutput ? stdout : stderr);
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
    const int length = std::vsnprintf(room, sizeof room, format, arguments);
    va_end(arguments);
    if (length > 0 && static_cast<size_t>(length) < sizeof room) {
        text_.append(room, static_cast<size_t>(length));
    } else if (length > 0) {
        const size_t start = text_.size();
        text_.resize(start + static_cast<size_t>(length) + 1);
        std::vsnprintf(text_.data() + start, static_cast<size_t>(length) + 1, format, again);
        text_.pop_back();
    }
    va_end(again);
    return *this;
}

void Line::Print(Stream stream) {
    MessageText(stream, text_);
    text_.clear();
}
