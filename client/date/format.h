// Dates and times to and from text by a format model: YYYY MON DD HH24 and so on, and the names of months and days in
// the languages the library knows. Texts and models are UTF-8.
#pragma once

#include <cstddef>
#include <string_view>

#include "date/date.h"
#include "handles/errors.h"

namespace date {

// The models that hold when the application gives none.
constexpr std::string_view kDateModel = "DD-MON-RR";                             // character data to and from DATE
constexpr std::string_view kTimestampModel = "DD-MON-RR HH.MI.SSXFF AM";
constexpr std::string_view kTimestampZoneModel = "DD-MON-RR HH.MI.SSXFF AM TZR";
constexpr std::string_view kTimeModel = "HH.MI.SSXFF AM";
constexpr std::string_view kTimeZoneModel = "HH.MI.SSXFF AM TZR";
constexpr std::string_view kShortDateModel = "DD-MON-YY";                        // OCIDateToText, OCIDateFromText

// Names in a language. English is first in the list and the one for "no language".
struct Language;
extern const Language& kEnglish;
const Language* FindLanguage(std::string_view name) noexcept;    // null when unknown; letter case is ignored

// What a model may name.
enum class Scope : unsigned char { date, timestamp };

// Writes the value's text. *length is set on success, and on kBufferTooSmall to the size that is needed. No
// terminator is written. The value must be valid. fraction_digits: how many an FF without a number of digits writes; -1:
// microseconds, unless the value has more.
Errno ToText(const DateTime& value, std::string_view model, const Language& language, Scope scope, char* text,
             std::size_t capacity, std::size_t* length, int fraction_digits = -1) noexcept;

// Reads a text that fits the model. Fields that the model does not name: the current year and month, day 1, time 0.
Errno FromText(std::string_view text, std::string_view model, const Language& language, Scope scope,
               DateTime* result) noexcept;

// The weekday that a name or its short form stands for, 0 is Sunday; kBadWeekday.
Errno WeekdayFromName(std::string_view name, const Language& language, int* day_of_week) noexcept;

}  // namespace date
