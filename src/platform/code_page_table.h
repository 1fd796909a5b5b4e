// The code pages that can be converted: number, the converter's name for it, and bytes of its smallest unit.
// Any thread.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>

struct CodePage {
    std::uint32_t number;
    const char* name;
    std::size_t unit = 1;
};

// Null when the number is not known.
const CodePage* FindCodePage(std::uint32_t number);

// The code page of a character set as a locale names it; null when there is none.
const CodePage* FindCharacterSet(std::string_view name);
