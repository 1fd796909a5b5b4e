// UTF-8 and UTF-16 (low byte first), for the driver and for libkelpci: between each other, and cut to whole characters.
// UTF-8 is what the standard allows: overlong forms, surrogates and what lies above U+10FFFF are malformed. Lengths and
// limits are bytes, in UTF-16, too. ASCII, which nearly all texts are, goes eight characters at a time. Any thread.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>

namespace utf {

// Appends the whole text. False when it is malformed: what came before is in `out` then.
bool ToUtf8(const void* utf16, std::size_t bytes, std::string& out);
bool ToUtf16(std::string_view utf8, std::string& out);
// The same for a text to be shown: a byte that is no part of a character becomes U+FFFD.
void ToUtf16Replacing(std::string_view utf8, std::string& out);

// The length of the longest beginning that fits into `room` bytes and tears no character apart.
inline std::size_t WholeUtf8(std::string_view text, std::size_t room) {
    if (text.size() <= room) return text.size();
    while (room > 0 && (static_cast<unsigned char>(text[room]) & 0xC0) == 0x80) --room;
    return room;
}

// The bytes of a UTF-16 text before its first zero pair, looking no further than `limit` bytes.
inline std::size_t Utf16Length(const void* text, std::size_t limit) {
    const auto* bytes = static_cast<const char*>(text);
    std::size_t length = 0;
    while (length + 1 < limit && (bytes[length] != 0 || bytes[length + 1] != 0)) length += 2;
    return length;
}

// A conversion under way: what is left to read and where to write. Each step leaves both behind the last whole
// character.
struct Conversion {
    const unsigned char* input;
    const unsigned char* input_end;
    unsigned char* output;
    unsigned char* output_end;
    bool truncated = false;
    bool substituted = false;

    [[nodiscard]] std::size_t Unread() const { return static_cast<std::size_t>(input_end - input); }
    [[nodiscard]] std::size_t Room() const { return static_cast<std::size_t>(output_end - output); }
};

// Until the input is read or the output is full. What is malformed becomes U+FFFD: a byte of UTF-8, a unit of UTF-16.
void ConvertUtf8ToUtf16(Conversion& conversion);
void ConvertUtf16ToUtf8(Conversion& conversion);

}  // namespace utf
