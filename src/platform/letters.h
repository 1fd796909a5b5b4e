// Letters: tests and letter case without regard to the locale. Case is known for ASCII and, in UTF-8, for the accented
// letters of western Europe, which is what the names of months and days need.
#pragma once

#include <cstddef>
#include <string_view>

namespace letters {

constexpr bool IsDigit(char c) { return c >= '0' && c <= '9'; }
constexpr bool IsLetter(char c) { return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z'); }
// Letters, and the bytes that letters beyond ASCII are made of.
constexpr bool IsWordByte(char c) { return IsLetter(c) || static_cast<unsigned char>(c) >= 0x80; }
constexpr char ToUpper(char c) { return c >= 'a' && c <= 'z' ? static_cast<char>(c - 'a' + 'A') : c; }

// The byte at `index` as it is when its character is written large.
constexpr char UpperByte(std::string_view text, std::size_t index) {
    const char c = text[index];
    if (index == 0 || text[index - 1] != '\xC3') return ToUpper(c);
    const auto trail = static_cast<unsigned char>(c);
    return trail >= 0xA0 && trail <= 0xBE && trail != 0xB7 ? static_cast<char>(trail - 0x20) : c;
}

// Whether `text` begins with `prefix`, letter case aside.
constexpr bool StartsWithFolded(std::string_view text, std::string_view prefix) {
    if (text.size() < prefix.size()) return false;
    for (std::size_t i = 0; i < prefix.size(); ++i) {
        if (UpperByte(text, i) != UpperByte(prefix, i)) return false;
    }
    return true;
}

constexpr bool EqualFolded(std::string_view left, std::string_view right) {
    return left.size() == right.size() && StartsWithFolded(left, right);
}

// Takes up to `most` digits off the front of a text; how many, and their value.
constexpr std::size_t TakeDigits(std::string_view& text, std::size_t most, int* value) {
    std::size_t count = 0;
    *value = 0;
    for (const char c : text.substr(0, most)) {
        if (!IsDigit(c)) break;
        *value = *value * 10 + (c - '0');
        ++count;
    }
    text.remove_prefix(count);
    return count;
}

constexpr std::string_view WithoutLeadingBlanks(std::string_view text) {
    const std::size_t first = text.find_first_not_of(' ');
    return first == std::string_view::npos ? std::string_view() : text.substr(first);
}

// The characters, not bytes, of a text in UTF-8.
constexpr std::size_t CharacterCount(std::string_view text) {
    std::size_t count = 0;
    for (const char c : text) count += (static_cast<unsigned char>(c) & 0xC0) != 0x80;
    return count;
}

}  // namespace letters
