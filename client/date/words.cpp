// Numbers in English words.
#include "date/words.h"

#include <cstring>

namespace date {
namespace {

constexpr std::string_view kSmall[] = {
    "zero", "one", "two", "three", "four", "five", "six", "seven", "eight", "nine", "ten", "eleven", "twelve",
    "thirteen", "fourteen", "fifteen", "sixteen", "seventeen", "eighteen", "nineteen"};
constexpr std::string_view kTens[] = {"",      "",      "twenty",  "thirty", "forty",
                                      "fifty", "sixty", "seventy", "eighty", "ninety"};

// Endings that do not simply get a "th".
constexpr struct { std::string_view cardinal, ordinal; } kOrdinals[] = {
    {"one", "first"}, {"two", "second"}, {"three", "third"}, {"five", "fifth"}, {"eight", "eighth"}, {"nine", "ninth"},
    {"twelve", "twelfth"}, {"y", "ieth"}};

}  // namespace

void Words::Append(std::string_view text) noexcept {
    std::memcpy(text_.data() + length_, text.data(), text.size());
    length_ += text.size();
}

void Words::Put(std::string_view word) noexcept {
    if (!View().empty()) Append(" ");
    Append(word);
}

void Words::BelowHundred(int value) noexcept {
    if (value < 20) return Put(kSmall[value]);
    Put(kTens[value / 10]);
    if (value % 10 == 0) return;
    Append("-");
    Append(kSmall[value % 10]);
}

void Words::BelowThousand(int value) noexcept {
    if (value >= 100) {
        Put(kSmall[value / 100]);
        Put("hundred");
    }
    if (value % 100 > 0 || value == 0) BelowHundred(value % 100);
}

void Words::Number(int value) noexcept {
    if (value >= 1'000'000) {
        Put(kSmall[value / 1'000'000]);
        Put("million");
    }
    if (value % 1'000'000 >= 1000) {
        BelowThousand(value % 1'000'000 / 1000);
        Put("thousand");
    }
    if (value % 1000 > 0 || value == 0) BelowThousand(value % 1000);
}

// By hundreds, but for the first years of a millennium.
void Words::Year(int value) noexcept {
    if (value < 100 || value % 1000 < 10) return Number(value);
    BelowHundred(value / 100);
    if (value % 100 == 0) return Put("hundred");
    BelowHundred(value % 100);
}

void Words::MakeOrdinal() noexcept {
    for (const auto& row : kOrdinals) {
        if (!View().ends_with(row.cardinal)) continue;
        length_ -= row.cardinal.size();
        return Append(row.ordinal);
    }
    Append("th");
}

}  // namespace date
