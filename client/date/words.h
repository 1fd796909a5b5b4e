// Numbers in English words, small letters: "forty-two", "forty-second", and years as they are spoken: "nineteen
// ninety-nine".
#pragma once

#include <array>
#include <cstddef>
#include <string_view>

namespace date {

class Words {
public:
    void Number(int value) noexcept;    // 0 to 9,999,999
    void Year(int value) noexcept;      // 1 to 9999
    void MakeOrdinal() noexcept;        // of the last word
    [[nodiscard]] std::string_view View() const { return {text_.data(), length_}; }

private:
    void Put(std::string_view word) noexcept;    // after a blank, unless it is the first
    void Append(std::string_view text) noexcept;
    void BelowHundred(int value) noexcept;
    void BelowThousand(int value) noexcept;

    std::array<char, 128> text_{};    // the longest number below ten millions has 90 letters as an ordinal
    std::size_t length_ = 0;
};

}  // namespace date
