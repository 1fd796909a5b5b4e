// The elements of format models, one row each.
#include "date/model.h"

#include "platform/letters.h"
#include "handles/errors.h"

namespace date {
namespace {

enum Traits : std::uint8_t { kPlain = 0, kNumeric = 1, kSigned = 2, kOutputOnly = 4, kTimestamp = 8, kDotted = 16,
                           kSpelled = 32 };

struct Row {
    std::string_view name;
    Field field;
    std::uint8_t width;
    std::uint8_t traits;
};

// Order matters: an element is the first row that the model goes on with, so longer names stand before their
// beginnings.
constexpr Row kRows[] = {
    {"A.D.", Field::era, 0, kDotted},
    {"AD", Field::era, 0, kPlain},
    {"A.M.", Field::half_day, 0, kDotted},
    {"AM", Field::half_day, 0, kPlain},
    {"B.C.", Field::era, 0, kDotted},
    {"BC", Field::era, 0, kPlain},
    {"CC", Field::century, 2, kNumeric | kOutputOnly},
    {"DAY", Field::day_name, 0, kPlain},
    {"DDD", Field::day_of_year, 3, kNumeric},
    {"DD", Field::day, 2, kNumeric},
    {"DL", Field::long_date, 0, kOutputOnly},
    {"DSP", Field::weekday, 1, kNumeric | kSpelled | kOutputOnly},    // not DS and a P
    {"DS", Field::short_date, 0, kOutputOnly},
    {"DY", Field::short_day_name, 0, kPlain},
    {"D", Field::weekday, 1, kNumeric},
    {"FF1", Field::fraction, 1, kTimestamp},
    {"FF2", Field::fraction, 2, kTimestamp},
    {"FF3", Field::fraction, 3, kTimestamp},
    {"FF4", Field::fraction, 4, kTimestamp},
    {"FF5", Field::fraction, 5, kTimestamp},
    {"FF6", Field::fraction, 6, kTimestamp},
    {"FF7", Field::fraction, 7, kTimestamp},
    {"FF8", Field::fraction, 8, kTimestamp},
    {"FF9", Field::fraction, 9, kTimestamp},
    {"FF", Field::fraction, 0, kTimestamp},
    {"FM", Field::fill, 0, kPlain},
    {"FX", Field::exact, 0, kPlain},
    {"HH12", Field::hour12, 2, kNumeric},
    {"HH24", Field::hour24, 2, kNumeric},
    {"HH", Field::hour12, 2, kNumeric},
    {"IW", Field::iso_week, 2, kNumeric | kOutputOnly},
    {"IYYY", Field::iso_year, 4, kNumeric | kOutputOnly},
    {"IYY", Field::iso_year, 3, kNumeric | kOutputOnly},
    {"IY", Field::iso_year, 2, kNumeric | kOutputOnly},
    {"I", Field::iso_year, 1, kNumeric | kOutputOnly},
    {"J", Field::julian, 7, kNumeric},
    {"MI", Field::minute, 2, kNumeric},
    {"MM", Field::month, 2, kNumeric},
    {"MONTH", Field::month_name, 0, kPlain},
    {"MON", Field::short_month_name, 0, kPlain},
    {"P.M.", Field::half_day, 0, kDotted},
    {"PM", Field::half_day, 0, kPlain},
    {"Q", Field::quarter, 1, kNumeric | kOutputOnly},
    {"RM", Field::roman_month, 0, kPlain},
    {"RRRR", Field::rounded_year, 4, kNumeric},
    {"RR", Field::rounded_year, 2, kNumeric},
    {"SCC", Field::century, 2, kNumeric | kSigned | kOutputOnly},
    {"SSSSS", Field::second_of_day, 5, kNumeric},
    {"SS", Field::second, 2, kNumeric},
    {"SYEAR", Field::spelled_year, 0, kSigned | kOutputOnly},
    {"SYYYY", Field::year, 4, kNumeric | kSigned},
    {"TS", Field::short_time, 0, kOutputOnly},
    {"TZD", Field::zone_short_name, 0, kTimestamp},
    {"TZH", Field::zone_hour, 2, kTimestamp},
    {"TZM", Field::zone_minute, 2, kTimestamp},
    {"TZR", Field::zone_region, 0, kTimestamp},
    {"WW", Field::week_of_year, 2, kNumeric | kOutputOnly},
    {"W", Field::week_of_month, 1, kNumeric | kOutputOnly},
    {"X", Field::radix, 0, kTimestamp},
    {"Y,YYY", Field::comma_year, 4, kPlain},
    {"YEAR", Field::spelled_year, 0, kOutputOnly},
    {"YYYY", Field::year, 4, kNumeric},
    {"YYY", Field::year, 3, kNumeric},
    {"YY", Field::year, 2, kNumeric},
    {"Y", Field::year, 1, kNumeric},
};

bool IsMark(char c) { return c >= ' ' && c < '\x7f' && !letters::IsLetter(c) && !letters::IsDigit(c); }

LetterCase CaseOf(std::string_view written) {
    if (written.front() != letters::ToUpper(written.front())) return LetterCase::lower;
    for (const char c : written.substr(1)) {
        if (letters::IsLetter(c)) return c == letters::ToUpper(c) ? LetterCase::upper : LetterCase::capitalized;
    }
    return LetterCase::upper;
}

}  // namespace

Errno Model::Next(Scope scope, Element* element) noexcept {
    *element = {};
    if (rest_.empty()) return 0;
    if (rest_.front() == '"') return TakeQuoted(element) ? 0 : errors::kBadElement;
    if (IsMark(rest_.front())) {
        element->field = Field::mark;
        element->text = rest_.substr(0, 1);
        rest_.remove_prefix(1);
        return 0;
    }
    if (!TakeNamed(element)) return errors::kBadElement;
    return element->timestamp && scope == Scope::date ? errors::kBadElement : 0;
}

bool Model::TakeQuoted(Element* element) noexcept {
    const std::size_t end = rest_.find('"', 1);
    if (end == std::string_view::npos) return false;
    element->field = Field::quoted;
    element->text = rest_.substr(1, end - 1);
    rest_.remove_prefix(end + 1);
    return true;
}

bool Model::TakeNamed(Element* element) noexcept {
    for (const Row& row : kRows) {
        if (!letters::StartsWithFolded(rest_, row.name)) continue;
        element->letters = CaseOf(rest_);
        rest_.remove_prefix(row.name.size());
        element->field = row.field;
        element->width = row.width;
        element->numeric = row.traits & kNumeric;
        element->has_sign = row.traits & kSigned;
        element->input = !(row.traits & kOutputOnly);
        element->timestamp = row.traits & kTimestamp;
        element->dotted = row.traits & kDotted;
        element->spelled = row.traits & kSpelled;
        if (element->numeric) TakeSuffixes(element);
        return true;
    }
    return false;
}

// TH and SP, in either order.
void Model::TakeSuffixes(Element* element) noexcept {
    for (int i = 0; i < 2; ++i) {
        if (!element->ordinal && letters::StartsWithFolded(rest_, "TH")) element->ordinal = true;
        else if (!element->spelled && letters::StartsWithFolded(rest_, "SP")) element->spelled = true;
        else return;
        element->input = false;
        rest_.remove_prefix(2);
    }
}

}  // namespace date
