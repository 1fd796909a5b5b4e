// What a language says for months, days and dates. Names are UTF-8 and in small letters; a model says how they are
// written.
#pragma once

#include <array>
#include <cstddef>
#include <string_view>

#include "date/format.h"
#include "platform/letters.h"

namespace date {

using MonthNames = std::array<std::string_view, 12>;
using DayNames = std::array<std::string_view, 7>;    // from Sunday

struct Language {
    std::array<std::string_view, 2> names;    // that applications call it by, upper case
    MonthNames months;
    MonthNames short_months;
    DayNames days;
    DayNames short_days;
    std::string_view long_date;     // the model that DL stands for
    std::string_view short_date;    // DS
    std::string_view short_time;    // TS
};

// To how many characters names of a list are filled up.
template <std::size_t count>
constexpr std::size_t NameWidth(const std::array<std::string_view, count>& names) {
    std::size_t width = 0;
    for (const std::string_view name : names) width = letters::CharacterCount(name) > width ? letters::CharacterCount(name) : width;
    return width;
}

// The index of the longest name, full or short, that `text` begins with, letter case aside, and its bytes; -1 for none.
template <std::size_t count>
int FindName(const std::array<std::string_view, count>& full, const std::array<std::string_view, count>& brief,
             std::string_view text, std::size_t* length) noexcept;

}  // namespace date
