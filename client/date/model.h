// A format model taken apart, element by element: what each element names, how it is written, and the marks between.
#pragma once

#include <cstdint>
#include <string_view>

#include "date/format.h"
#include "handles/errors.h"

namespace date {

enum class Field : std::uint8_t {
    end,            // of the model
    mark,           // one blank or punctuation character
    quoted,         // text between quotes
    fill, exact,    // FM, FX: switches
    long_date, short_date, short_time,    // DL, DS, TS: stand for a model of the language
    year, rounded_year, comma_year, spelled_year, iso_year, century, era,
    quarter, month, short_month_name, month_name, roman_month,
    week_of_year, week_of_month, iso_week,
    day_of_year, day, weekday, short_day_name, day_name, julian,
    half_day, hour12, hour24, minute, second, second_of_day,
    fraction, radix, zone_hour, zone_minute, zone_region, zone_short_name,
    count
};

// How the letters of an element were written, and so how its result is.
enum class LetterCase : std::uint8_t { upper, capitalized, lower };

struct Element {
    Field field = Field::end;
    std::uint8_t width = 0;      // digits of a number; the point's digits of a fraction, 0 when not said
    bool has_sign = false;       // SYYYY, SYEAR, SCC
    bool numeric = false;
    bool input = true;           // may stand in a model for reading
    bool timestamp = false;      // has no meaning in a date
    bool ordinal = false;        // TH
    bool spelled = false;        // SP
    bool dotted = false;         // A.M., B.C.
    LetterCase letters = LetterCase::upper;
    std::string_view text;       // of a mark or quoted text; else the element as written
};

// Reads a model from the left. Copy one to look ahead.
class Model {
public:
    explicit Model(std::string_view text) : rest_(text) {}

    // The next element; Field::end behind the last. kBadElement for what is none.
    Errno Next(Scope scope, Element* element) noexcept;

private:
    bool TakeQuoted(Element* element) noexcept;
    bool TakeNamed(Element* element) noexcept;
    void TakeSuffixes(Element* element) noexcept;
    std::string_view rest_;
};

}  // namespace date
