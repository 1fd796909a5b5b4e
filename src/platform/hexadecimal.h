// Reading and writing hexadecimal digits.
#pragma once

#include <string>
#include <string_view>

// -1 for what is none.
constexpr int HexDigit(char c) {
    if (c >= '0' && c <= '9') return c - '0';
    if (c >= 'A' && c <= 'F') return c - 'A' + 10;
    if (c >= 'a' && c <= 'f') return c - 'a' + 10;
    return -1;
}

// Two digits, in upper case, for each byte, behind what the text holds.
inline void AppendHex(std::string_view bytes, std::string& text) {
    constexpr std::string_view kDigits = "0123456789ABCDEF";
    for (const char byte : bytes) {
        text.push_back(kDigits[static_cast<unsigned char>(byte) >> 4]);
        text.push_back(kDigits[static_cast<unsigned char>(byte) & 15]);
    }
}
