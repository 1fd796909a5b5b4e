// The forms of a date that need no model: OCIDate, the seven bytes, the engines' text.
#include "date/date.h"
#include "handles/errors.h"
#include "oci_types.h"
#include "platform/letters.h"

namespace date {
namespace {

char* PutTwo(char* text, unsigned value) {
    text[0] = static_cast<char>('0' + value / 10 % 10);
    text[1] = static_cast<char>('0' + value % 10);
    return text + 2;
}

char* PutFraction(char* text, std::uint32_t nanosecond) {
    *text++ = '.';
    for (std::uint32_t place = 100'000'000; nanosecond > 0; place /= 10) {
        *text++ = static_cast<char>('0' + nanosecond / place);
        nanosecond %= place;
    }
    return text;
}

char* PutZone(char* text, int minutes) {
    *text++ = ' ';
    *text++ = minutes < 0 ? '-' : '+';
    const auto distance = static_cast<unsigned>(minutes < 0 ? -minutes : minutes);
    text = PutTwo(text, distance / 60);
    *text++ = ':';
    return PutTwo(text, distance % 60);
}

// Reads an engine's text from the left. A member that does not find what it looks for moves nothing.
class Reader {
public:
    explicit Reader(std::string_view text) : text_(text) {}

    [[nodiscard]] bool AtEnd() const { return text_.empty(); }

    bool Take(char wanted) {
        if (!text_.starts_with(wanted)) return false;
        text_.remove_prefix(1);
        return true;
    }

    // One to `most` digits.
    bool Number(std::size_t most, int* value) { return letters::TakeDigits(text_, most, value) > 0; }

    bool SmallNumber(std::uint8_t* value) {
        int number = 0;
        if (!Number(2, &number)) return false;
        *value = static_cast<std::uint8_t>(number);
        return true;
    }

    // Any number of digits; what is below a nanosecond is dropped.
    bool Fraction(std::uint32_t* nanosecond) {
        const std::size_t before = text_.size();
        std::uint32_t place = 100'000'000;
        for (*nanosecond = 0; !text_.empty() && letters::IsDigit(text_.front()); text_.remove_prefix(1), place /= 10) {
            *nanosecond += place * static_cast<std::uint32_t>(text_.front() - '0');
        }
        return text_.size() < before;
    }

private:
    std::string_view text_;
};

bool ReadTimeAfterHour(Reader& reader, DateTime* value) {
    if (!reader.Take(':') || !reader.SmallNumber(&value->minute)) return false;
    if (reader.Take(':') && !reader.SmallNumber(&value->second)) return false;
    return !reader.Take('.') || reader.Fraction(&value->nanosecond);
}

// Seconds of an offset, as zones had them before 1900, are dropped.
bool ReadZone(Reader& reader, DateTime* value) {
    reader.Take(' ');
    value->has_zone = true;
    if (reader.Take('Z')) return true;
    const bool west = reader.Take('-');
    int hours = 0, minutes = 0, seconds = 0;
    if ((!west && !reader.Take('+')) || !reader.Number(2, &hours)) return false;
    if (reader.Take(':') || !reader.AtEnd()) {
        if (!reader.Number(2, &minutes)) return false;
        if (reader.Take(':') && !reader.Number(2, &seconds)) return false;
    }
    value->zone_minutes = static_cast<std::int16_t>((west ? -1 : 1) * (hours * 60 + minutes));
    return hours < 16 && minutes < 60;
}

bool ReadTime(Reader& reader, DateTime* value) {
    return ReadTimeAfterHour(reader, value) && (reader.AtEnd() || ReadZone(reader, value)) && reader.AtEnd();
}

bool ReadDateAfterYear(Reader& reader, DateTime* value) {
    if (!reader.SmallNumber(&value->month) || !reader.Take('-') || !reader.SmallNumber(&value->day)) return false;
    if (reader.AtEnd()) return true;
    return (reader.Take(' ') || reader.Take('T')) && reader.SmallNumber(&value->hour) && ReadTime(reader, value);
}

// "YYYY-MM-DD", with " HH:MM:SS" behind it or not, at once: nearly all dates in tables are written so. Changes the value
// for no other text. What it reads is not validated.
bool ReadPlain(std::string_view text, DateTime* value) {
    constexpr std::size_t kDate = 10, kWithTime = 19;
    const bool has_time = text.size() == kWithTime;
    if (!has_time && text.size() != kDate) return false;
    bool fits = text[4] == '-' && text[7] == '-' && (!has_time || (text[10] == ' ' && text[13] == ':' && text[16] == ':'));
    const auto two = [&](std::size_t at) {
        const auto tens = static_cast<unsigned>(text[at] - '0'), ones = static_cast<unsigned>(text[at + 1] - '0');
        fits &= tens <= 9 && ones <= 9;
        return static_cast<std::uint8_t>(tens * 10 + ones);
    };
    DateTime read;
    read.year = static_cast<std::int16_t>(two(0) * 100);
    read.year = static_cast<std::int16_t>(read.year + two(2));
    read.month = two(5);
    read.day = two(8);
    if (has_time) {
        read.hour = two(11);
        read.minute = two(14);
        read.second = two(17);
    }
    if (fits) *value = read;
    return fits;
}

}  // namespace

DateTime FromOciDate(const OCIDate& value) noexcept {
    DateTime result;
    result.year = value.OCIDateYYYY;
    result.month = value.OCIDateMM;
    result.day = value.OCIDateDD;
    result.hour = value.OCIDateTime.OCITimeHH;
    result.minute = value.OCIDateTime.OCITimeMI;
    result.second = value.OCIDateTime.OCITimeSS;
    return result;
}

void ToOciDate(const DateTime& value, OCIDate* result) noexcept {
    result->OCIDateYYYY = value.year;
    result->OCIDateMM = value.month;
    result->OCIDateDD = value.day;
    result->OCIDateTime = {value.hour, value.minute, value.second};
}

Errno FromBytes(const std::uint8_t* bytes, DateTime* result) noexcept {
    DateTime value;
    value.year = static_cast<std::int16_t>((bytes[0] - 100) * 100 + (bytes[1] - 100));
    value.month = bytes[2];
    value.day = bytes[3];
    value.hour = static_cast<std::uint8_t>(bytes[4] - 1);    // 0 becomes 255, which no check lets pass
    value.minute = static_cast<std::uint8_t>(bytes[5] - 1);
    value.second = static_cast<std::uint8_t>(bytes[6] - 1);
    if (const Errno number = Validate(value)) return number;
    *result = value;
    return 0;
}

void ToBytes(const DateTime& value, std::uint8_t* bytes) noexcept {
    bytes[0] = static_cast<std::uint8_t>(value.year / 100 + 100);    // division towards 0: -4712 is 53, 88
    bytes[1] = static_cast<std::uint8_t>(value.year % 100 + 100);
    bytes[2] = value.month;
    bytes[3] = value.day;
    bytes[4] = static_cast<std::uint8_t>(value.hour + 1);
    bytes[5] = static_cast<std::uint8_t>(value.minute + 1);
    bytes[6] = static_cast<std::uint8_t>(value.second + 1);
}

std::size_t ToEngineText(const DateTime& value, char* text) noexcept {
    char* end = text;
    if (value.year < 0) *end++ = '-';
    const auto year = static_cast<unsigned>(value.year < 0 ? -value.year : value.year);
    end = PutTwo(PutTwo(end, year / 100), year);
    *end++ = '-';
    end = PutTwo(end, value.month);
    *end++ = '-';
    end = PutTwo(end, value.day);
    *end++ = ' ';
    end = PutTwo(end, value.hour);
    *end++ = ':';
    end = PutTwo(end, value.minute);
    *end++ = ':';
    end = PutTwo(end, value.second);
    if (value.nanosecond > 0) end = PutFraction(end, value.nanosecond);
    if (value.has_zone) end = PutZone(end, value.zone_minutes);
    return static_cast<std::size_t>(end - text);
}

Errno FromEngineText(std::string_view text, DateTime* result) noexcept {
    DateTime value;
    if (ReadPlain(text, &value)) {
        if (const Errno number = Validate(value)) return number;
        *result = value;
        return 0;
    }
    constexpr std::string_view kBeforeChrist = " BC";
    const bool named_era = text.ends_with(kBeforeChrist);
    if (named_era) text.remove_suffix(kBeforeChrist.size());
    Reader reader(text);
    const bool before_christ = reader.Take('-') || named_era;
    int first = 0;
    if (!reader.Number(6, &first)) return errors::kTextMismatch;
    if (first > kMaxYear) return errors::kBadYear;
    if (reader.Take('-')) {
        value.year = static_cast<std::int16_t>(before_christ ? -first : first);
        if (!ReadDateAfterYear(reader, &value)) return errors::kTextMismatch;
        if (const Errno number = Validate(value)) return number;
    } else {
        value.hour = static_cast<std::uint8_t>(first);
        if (first > 99 || before_christ || !ReadTime(reader, &value)) return errors::kTextMismatch;
        if (const Errno number = ValidateTime(value)) return number;
    }
    *result = value;
    return 0;
}

}  // namespace date
