// Character sets by their published numbers, and texts between them and UTF-8. Of a set of single bytes a table is made
// at its first use, out of what iconv says of each byte, and kept for the life of the process: converting asks iconv
// nothing and works from any thread. 871 is taken as UTF-8 whole, 2000 is UTF-16 with the high byte first.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

struct CharacterSet;

namespace charset {

constexpr std::uint16_t kUtf8 = 873;

// Null when the number is unknown, or iconv knows no such set. Throws std::bad_alloc.
const CharacterSet* Find(std::uint16_t id);
// The number of a name, letter case aside; 0 for none.
std::uint16_t IdOf(std::string_view name) noexcept;
// The set of the locale that the process's variables name; UTF-8 where that is none of ours, or plain ASCII.
std::uint16_t IdOfLocale() noexcept;

std::uint16_t Id(const CharacterSet& set) noexcept;
std::string_view Name(const CharacterSet& set) noexcept;
int MostBytes(const CharacterSet& set) noexcept;       // of a character
bool IsFixedWidth(const CharacterSet& set) noexcept;
bool IsUtf8(const CharacterSet& set) noexcept;
bool IsUtf16(const CharacterSet& set) noexcept;        // of either byte order: units of two bytes
std::string_view Blank(const CharacterSet& set) noexcept;    // of two bytes

// Appends the whole text. False for what is no text in the set.
bool ToUtf8(const CharacterSet& set, std::string_view text, std::string& utf8);
// The same of a text that comes in parts: what one begins of a UTF-16 character waits in `torn` for the next.
bool PartToUtf8(const CharacterSet& set, std::string_view part, bool last, std::string& torn, std::string& utf8);
// Whether a unit of two bytes begins a pair.
bool BeginsPair(const CharacterSet& set, std::string_view unit) noexcept;
// Appends; what the set lacks becomes '?'. False when the UTF-8 is malformed: a '?' (U+FFFD in UTF-16) stands for it.
bool FromUtf8(const CharacterSet& set, std::string_view utf8, std::string& text);
// The length of the longest beginning that fits into `room` bytes and tears no character apart.
std::size_t Whole(const CharacterSet& set, std::string_view text, std::size_t room) noexcept;

}  // namespace charset
