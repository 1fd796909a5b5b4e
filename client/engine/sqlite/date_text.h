// The text form in which this engine keeps dates.
#pragma once

#include <array>
#include <cstddef>
#include <string_view>

#include "date/date.h"

namespace engine::sqlite {

using DateText = std::array<char, date::kMaxEngineText>;

// A time alone goes without the part of the date and the blank behind it. The view is of `text`.
inline std::string_view WriteDate(const date::DateTime& value, DateText& text) {
    constexpr std::size_t kDatePart = 11;
    const std::size_t length = date::ToEngineText(value, text.data());
    const std::string_view written(text.data(), length);
    return value.month == 0 ? written.substr(kDatePart) : written;
}

}  // namespace engine::sqlite
