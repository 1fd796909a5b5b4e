// UTF-8 to UTF-16 with the low byte first, and back, without a converter's overhead.
#pragma once

#include <cstddef>

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
