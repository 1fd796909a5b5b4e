// Dates to text by a model.
#include <cstring>

#include "date/language.h"
#include "platform/letters.h"
#include "date/model.h"
#include "date/words.h"
#include "date/zone.h"
#include "handles/errors.h"

namespace date {
namespace {

constexpr std::string_view kRomanMonths[] = {"i",   "ii",   "iii", "iv", "v",  "vi",
                                             "vii", "viii", "ix",  "x",  "xi", "xii"};
constexpr std::size_t kRomanWidth = 4;

// Counts what does not fit as well, so that the size needed is known.
class Writer {
public:
    Writer(char* text, std::size_t capacity) : text_(text), capacity_(capacity) {}

    [[nodiscard]] std::size_t Length() const { return length_; }

    void Put(char c) {
        if (length_ < capacity_) text_[length_] = c;
        ++length_;
    }

    void Put(std::string_view text) {
        for (const char c : text) Put(c);
    }

    void PutDigits(unsigned value, unsigned width) {
        char digits[10];
        unsigned count = 0;
        for (; value > 0 || count == 0; value /= 10) digits[count++] = static_cast<char>('0' + value % 10);
        for (unsigned i = count; i < width; ++i) Put('0');
        while (count > 0) Put(digits[--count]);
    }

    // A text in small letters, written as an element's letters are.
    void PutCased(std::string_view text, LetterCase letters) {
        bool word_start = true;
        for (std::size_t i = 0; i < text.size(); ++i) {
            const bool large = letters == LetterCase::upper || (letters == LetterCase::capitalized && word_start);
            Put(large ? letters::UpperByte(text, i) : text[i]);
            if (text[i] != '\xC3') word_start = text[i] == ' ' || text[i] == '-';
        }
    }

    void PutBlanks(std::size_t count) {
        for (; count > 0; --count) Put(' ');
    }

private:
    char* text_;
    std::size_t capacity_;
    std::size_t length_ = 0;
};

// The year and week that the international standard counts: a week belongs to the year that has its Thursday.
struct IsoWeek {
    int year;
    int week;
};

IsoWeek ToIsoWeek(const DateTime& value) {
    const DayNumber day = ToDayNumber(value);
    DateTime thursday;
    FromDayNumber(day + 3 - (DayOfWeek(day) + 6) % 7, &thursday);
    return {thursday.year, (DayOfYear(thursday) - 1) / 7 + 1};
}

// The published count behind J leaves 365 days to a year 0 that the calendar does not have: 1 is 1 January 4712 BC.
int JulianDay(const DateTime& value) { return ToDayNumber(value) - (value.year < 0 ? 365 : 0); }

int SecondOfDay(const DateTime& value) { return (value.hour * 60 + value.minute) * 60 + value.second; }

int NumberOf(Field field, const DateTime& value) {
    const int absolute_year = value.year < 0 ? -value.year : value.year;
    switch (field) {
        case Field::year:
        case Field::rounded_year:
        case Field::comma_year:
        case Field::spelled_year: return absolute_year;
        case Field::iso_year: return ToIsoWeek(value).year < 0 ? -ToIsoWeek(value).year : ToIsoWeek(value).year;
        case Field::century: return (absolute_year + 99) / 100;
        case Field::quarter: return (value.month - 1) / 3 + 1;
        case Field::month: return value.month;
        case Field::week_of_year: return (DayOfYear(value) - 1) / 7 + 1;
        case Field::week_of_month: return (value.day - 1) / 7 + 1;
        case Field::iso_week: return ToIsoWeek(value).week;
        case Field::day_of_year: return DayOfYear(value);
        case Field::day: return value.day;
        case Field::weekday: return DayOfWeek(ToDayNumber(value)) + 1;
        case Field::julian: return JulianDay(value);
        case Field::hour12: return (value.hour + 11) % 12 + 1;
        case Field::hour24: return value.hour;
        case Field::minute: return value.minute;
        case Field::second: return value.second;
        case Field::second_of_day: return SecondOfDay(value);
        default: return 0;
    }
}

int LastDigits(int number, unsigned width) {
    int modulus = 1;
    for (unsigned i = 0; i < width; ++i) modulus *= 10;
    return number % modulus;
}

std::string_view OrdinalEnding(int number) {
    if (number / 10 % 10 == 1) return "th";
    constexpr std::string_view kEndings[] = {"th", "st", "nd", "rd"};
    return number % 10 < 4 ? kEndings[number % 10] : "th";
}

class Formatter {
public:
    Formatter(const DateTime& value, const Language& language, Scope scope, int fraction_digits, Writer& writer)
        : value_(value), language_(language), scope_(scope), fraction_digits_(fraction_digits), writer_(writer) {}

    Errno Run(std::string_view text) {
        Model model(text);
        Element element;
        for (;;) {
            if (const Errno number = model.Next(scope_, &element)) return number;
            if (element.field == Field::end) return error_;
            if (value_.month == 0 && NeedsDate(element.field)) return errors::kNoSuchField;
            Put(element);
        }
    }

private:
    static bool NeedsDate(Field field) { return field >= Field::year && field < Field::half_day; }

    void Put(const Element& element) {
        if (element.numeric) return PutNumber(element);
        switch (element.field) {
            case Field::mark:
            case Field::quoted: return writer_.Put(element.text);
            case Field::fill: filled_ = !filled_; return;
            case Field::long_date: return PutPart(language_.long_date);
            case Field::short_date: return PutPart(language_.short_date);
            case Field::short_time: return PutPart(language_.short_time);
            case Field::comma_year: return PutCommaYear();
            case Field::spelled_year: return PutSpelledYear(element);
            case Field::era: return PutMarked(value_.year < 0 ? "bc" : "ad", element);
            case Field::half_day: return PutMarked(value_.hour < 12 ? "am" : "pm", element);
            case Field::month_name: return PutName(language_.months[Month()], NameWidth(language_.months), element);
            case Field::short_month_name:
                return PutName(language_.short_months[Month()], NameWidth(language_.short_months), element);
            case Field::day_name: return PutName(language_.days[Weekday()], NameWidth(language_.days), element);
            case Field::short_day_name:
                return PutName(language_.short_days[Weekday()], NameWidth(language_.short_days), element);
            case Field::roman_month: return PutName(kRomanMonths[Month()], kRomanWidth, element);
            case Field::radix: return writer_.Put('.');
            case Field::fraction: return PutFraction(element.width);
            default: return PutZone(element.field);
        }
    }

    [[nodiscard]] std::size_t Month() const { return value_.month - std::size_t{1}; }
    [[nodiscard]] std::size_t Weekday() const { return static_cast<std::size_t>(DayOfWeek(ToDayNumber(value_))); }

    // A model that an element stands for; its switches end with it, and FM before it stays on.
    void PutPart(std::string_view model) {
        const bool filled = filled_;
        if (!filled && model.starts_with("fm")) model.remove_prefix(2);
        error_ = Run(model);    // which are well-formed, but a time alone has no date
        filled_ = filled;
    }

    // Of years a model may ask for the last digits; the hundredth century has three and keeps them.
    void PutNumber(const Element& element) {
        int number = NumberOf(element.field, value_);
        if (element.field != Field::century) number = LastDigits(number, element.width);
        if (element.has_sign) PutSign();
        if (!element.spelled) {
            writer_.PutDigits(static_cast<unsigned>(number), filled_ ? element.width : 1);
            const bool upper = element.letters == LetterCase::upper;
            if (element.ordinal) {
                writer_.PutCased(OrdinalEnding(number), upper ? LetterCase::upper : LetterCase::lower);
            }
            return;
        }
        Words words;
        words.Number(number);
        if (element.ordinal) words.MakeOrdinal();
        writer_.PutCased(words.View(), element.letters);
    }

    void PutSign() {
        if (value_.year < 0) writer_.Put('-');
        else if (filled_) writer_.Put(' ');
    }

    void PutCommaYear() {
        const auto year = static_cast<unsigned>(NumberOf(Field::comma_year, value_));
        writer_.PutDigits(year / 1000, 1);
        writer_.Put(',');
        writer_.PutDigits(year % 1000, 3);
    }

    void PutSpelledYear(const Element& element) {
        if (element.has_sign) PutSign();
        Words words;
        words.Year(NumberOf(Field::spelled_year, value_));
        writer_.PutCased(words.View(), element.letters);
    }

    // Two letters, with points after them or not.
    void PutMarked(std::string_view letters, const Element& element) {
        if (!element.dotted) return writer_.PutCased(letters, element.letters);
        const LetterCase second = element.letters == LetterCase::capitalized ? LetterCase::lower : element.letters;
        writer_.PutCased(letters.substr(0, 1), element.letters);
        writer_.Put('.');
        writer_.PutCased(letters.substr(1), second);
        writer_.Put('.');
    }

    void PutName(std::string_view name, std::size_t width, const Element& element) {
        writer_.PutCased(name, element.letters);
        if (filled_) writer_.PutBlanks(width - letters::CharacterCount(name));
    }

    // Without a number of digits: microseconds, unless the value has more.
    void PutFraction(unsigned digits) {
        if (digits == 0 && fraction_digits_ >= 0) digits = static_cast<unsigned>(fraction_digits_);
        else if (digits == 0) digits = value_.nanosecond % 1000 == 0 ? 6 : 9;
        unsigned fraction = value_.nanosecond;
        for (unsigned i = digits; i < 9; ++i) fraction /= 10;
        if (digits > 0) writer_.PutDigits(fraction, digits);
    }

    // A value without a zone is in that of the process.
    void PutZone(Field field) {
        DateTime zoned = value_;
        if (!zoned.has_zone && !error_) error_ = SetZone({}, &zoned);
        switch (field) {
            case Field::zone_hour: return PutZoneHour(zoned.zone_minutes);
            case Field::zone_minute: return PutZoneMinute(zoned.zone_minutes);
            case Field::zone_short_name: return writer_.Put(ZoneAbbreviation(zoned));
            case Field::zone_region:
                if (const std::string_view name = RegionName(zoned); !name.empty()) return writer_.Put(name);
                PutZoneHour(zoned.zone_minutes);
                writer_.Put(':');
                return PutZoneMinute(zoned.zone_minutes);
            default: return;    // FX says nothing here
        }
    }

    void PutZoneHour(int minutes) {
        writer_.Put(minutes < 0 ? '-' : '+');
        writer_.PutDigits(static_cast<unsigned>(minutes < 0 ? -minutes : minutes) / 60, 2);
    }

    void PutZoneMinute(int minutes) {
        writer_.PutDigits(static_cast<unsigned>(minutes < 0 ? -minutes : minutes) % 60, 2);
    }

    const DateTime& value_;
    const Language& language_;
    Scope scope_;
    int fraction_digits_;
    Writer& writer_;
    bool filled_ = true;    // leading zeros and trailing blanks
    Errno error_ = 0;       // a zone that could not be told, or a date that is none
};

}  // namespace

Errno ToText(const DateTime& value, std::string_view model, const Language& language, Scope scope, char* text,
             std::size_t capacity, std::size_t* length, int fraction_digits) noexcept {
    Writer writer(text, capacity);
    if (const Errno number = Formatter(value, language, scope, fraction_digits, writer).Run(model)) return number;
    *length = writer.Length();
    return writer.Length() > capacity ? errors::kBufferTooSmall : 0;
}

}  // namespace date
