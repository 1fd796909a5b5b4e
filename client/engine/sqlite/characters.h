// Characters of UTF-8 texts, counted by their first bytes. Any text is taken; nothing here allocates.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <string_view>

namespace engine::sqlite {

inline bool BeginsCharacter(char c) { return (static_cast<unsigned char>(c) & 0xC0) != 0x80; }

inline std::int64_t CharacterCount(std::string_view text) {
    return static_cast<std::int64_t>(std::count_if(text.begin(), text.end(), BeginsCharacter));
}

// The byte at which the character with this index, from 0, begins; the size when there are fewer.
inline std::size_t ByteOf(std::string_view text, std::int64_t character) {
    std::size_t at = 0;
    for (; at < text.size(); ++at)
        if (BeginsCharacter(text[at]) && character-- == 0) break;
    return at;
}

}  // namespace engine::sqlite
