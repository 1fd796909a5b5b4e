// Intervals: arithmetic on months, or on seconds with nanoseconds, and the text of both.
#include "date/interval.h"

#include <algorithm>

#include "platform/letters.h"
#include "date/zone.h"
#include "handles/errors.h"

namespace date {
namespace {

constexpr std::int64_t kSecond = 1'000'000'000;    // in nanoseconds
constexpr std::int64_t kDay = 86400;
constexpr std::int64_t kMostLeading = 999'999'999;
constexpr unsigned kMostDigits = 9;

std::int64_t Leading(const Interval& value) {
    return std::abs(value.whole) / (value.span == Span::year_month ? 12 : kDay);
}

Errno Take(const Interval& value, Interval* result) {
    if (Leading(value) > kMostLeading) return errors::kLeadingPrecision;
    *result = value;
    return 0;
}

// Seconds and nanoseconds brought to one sign, and the latter below a second.
Errno TakeSeconds(std::int64_t seconds, std::int64_t nanoseconds, Interval* result) {
    seconds += nanoseconds / kSecond;
    nanoseconds %= kSecond;
    if (seconds > 0 && nanoseconds < 0) --seconds, nanoseconds += kSecond;
    if (seconds < 0 && nanoseconds > 0) ++seconds, nanoseconds -= kSecond;
    return Take({Span::day_second, seconds, static_cast<std::int32_t>(nanoseconds)}, result);
}

// One part: how far from zero it may be, and the error beyond. The parts before it tell the sign.
struct Part { std::int64_t value, most; Errno error; };

template <std::size_t count>
Errno Check(const Part (&parts)[count]) {
    bool above = false, below = false;
    for (const Part& part : parts) {
        if (part.value > part.most || part.value < -part.most) return part.error;
        above |= part.value > 0;
        below |= part.value < 0;
    }
    return above && below ? errors::kBadInterval : 0;
}

// The last `count` digits of a number.
char* PutDigits(std::int64_t number, unsigned count, char* at) {
    for (unsigned place = count; place-- > 0; number /= 10) at[place] = static_cast<char>('0' + number % 10);
    return at + count;
}

class Reader {
public:
    explicit Reader(std::string_view text) : rest_(text) {}

    bool Take(char c) {
        if (!rest_.starts_with(c)) return false;
        rest_.remove_prefix(1);
        return true;
    }
    void SkipBlanks() { while (Take(' ')) {} }
    [[nodiscard]] bool AtEnd() const { return rest_.empty(); }

    // Digits; zeros before them do not count. False where none stand.
    bool Number(std::int64_t* value) {
        const std::size_t digits = DigitCount();
        for (*value = 0; !rest_.empty() && letters::IsDigit(rest_.front()); rest_.remove_prefix(1))
            *value = std::min<std::int64_t>(*value * 10 + (rest_.front() - '0'), kSecond);
        return digits > 0;
    }
    // The digits behind the point; false for more than nine.
    bool Fraction(std::int64_t* nanoseconds) {
        const std::size_t digits = DigitCount();
        if (digits > kMostDigits || !Number(nanoseconds)) return false;
        for (std::size_t place = digits; place < kMostDigits; ++place) *nanoseconds *= 10;
        return true;
    }

private:
    [[nodiscard]] std::size_t DigitCount() const {
        return static_cast<std::size_t>(std::find_if_not(rest_.begin(), rest_.end(), letters::IsDigit) - rest_.begin());
    }
    std::string_view rest_;
};

Errno ReadYearMonth(Reader& reader, YearMonth* parts) {
    if (!reader.Number(&parts->year)) return errors::kBadInterval;
    if (reader.Take('-') && !reader.Number(&parts->month)) return errors::kBadInterval;
    return 0;
}

Errno ReadDaySecond(Reader& reader, DaySecond* parts) {
    if (!reader.Number(&parts->day)) return errors::kBadInterval;
    reader.SkipBlanks();
    if (!reader.Number(&parts->hour)) return 0;
    if (reader.Take(':') && !reader.Number(&parts->minute)) return errors::kBadInterval;
    if (reader.Take(':') && !reader.Number(&parts->second)) return errors::kBadInterval;
    if (reader.Take('.') && !reader.Fraction(&parts->nanosecond)) return errors::kBadFraction;
    return 0;
}

template <class Parts, Errno (*read)(Reader&, Parts*)>
Errno ReadParts(Reader& reader, bool negative, Interval* result) {
    Parts parts{};
    if (const Errno number = read(reader, &parts)) return number;
    reader.SkipBlanks();
    if (!reader.AtEnd()) return errors::kBadInterval;
    Interval value;
    if (const Errno number = FromParts(parts, &value)) return number;
    *result = negative ? Negative(value) : value;
    return 0;
}

}  // namespace

Errno FromParts(const DaySecond& parts, Interval* result) noexcept {
    const Errno number = Check({{parts.day, kMostLeading, errors::kLeadingPrecision},
                                {parts.hour, 23, errors::kBadHour},
                                {parts.minute, 59, errors::kBadMinute},
                                {parts.second, 59, errors::kSecondsBelow60},
                                {parts.nanosecond, kSecond - 1, errors::kBadFraction}});
    if (number) return number;
    const std::int64_t seconds = ((parts.day * 24 + parts.hour) * 60 + parts.minute) * 60 + parts.second;
    *result = {Span::day_second, seconds, static_cast<std::int32_t>(parts.nanosecond)};
    return 0;
}

Errno FromParts(const YearMonth& parts, Interval* result) noexcept {
    const Errno number = Check({{parts.year, kMostLeading, errors::kLeadingPrecision},
                                {parts.month, 11, errors::kBadMonth}});
    if (number) return number;
    *result = {Span::year_month, parts.year * 12 + parts.month, 0};
    return 0;
}

DaySecond DaySecondOf(const Interval& value) noexcept {
    const std::int64_t seconds = value.whole;
    return {seconds / kDay, seconds / 3600 % 24, seconds / 60 % 60, seconds % 60, value.nanosecond};
}

YearMonth YearMonthOf(const Interval& value) noexcept { return {value.whole / 12, value.whole % 12}; }

Errno Add(const Interval& left, const Interval& right, Interval* result) noexcept {
    if (left.span != right.span) return errors::kNotComparable;
    const std::int64_t whole = left.whole + right.whole;
    if (left.span == Span::year_month) return Take({Span::year_month, whole, 0}, result);
    return TakeSeconds(whole, std::int64_t{left.nanosecond} + right.nanosecond, result);
}

Errno Compare(const Interval& left, const Interval& right, int* order) noexcept {
    if (left.span != right.span) return errors::kNotComparable;
    const std::pair one(left.whole, left.nanosecond), other(right.whole, right.nanosecond);
    *order = (one > other) - (one < other);
    return 0;
}

Interval Negative(const Interval& value) noexcept { return {value.span, -value.whole, -value.nanosecond}; }

Errno RoundFraction(const Interval& value, int digits, Interval* result) noexcept {
    std::int64_t unit = kSecond;
    for (int place = 0; place < digits && unit > 1; ++place) unit /= 10;    // a column may be declared with more
    const std::int64_t half = value.nanosecond < 0 ? -(unit / 2) : unit / 2;
    if (value.span == Span::year_month) return Take(value, result);
    return TakeSeconds(value.whole, (value.nanosecond + half) / unit * unit, result);
}

unsigned LeadingDigits(const Interval& value) noexcept {
    const std::int64_t leading = value.span == Span::year_month ? YearMonthOf(value).year : DaySecondOf(value).day;
    unsigned digits = 2;
    for (std::int64_t rest = (leading < 0 ? -leading : leading) / 100; rest > 0; rest /= 10) ++digits;
    return digits;
}

Errno ToText(const Interval& value, unsigned leading, unsigned fraction, char* text, std::size_t* length) noexcept {
    if (leading > kMostDigits || fraction > kMostDigits) return errors::kBadPrecision;
    Interval shown;
    if (const Errno number = RoundFraction(value, static_cast<int>(fraction), &shown)) return number;
    char* at = text;
    *at++ = shown.whole < 0 || shown.nanosecond < 0 ? '-' : '+';
    if (shown.whole < 0 || shown.nanosecond < 0) shown = Negative(shown);
    std::int64_t limit = 1;
    for (unsigned digit = 0; digit < leading; ++digit) limit *= 10;
    if (Leading(shown) >= limit) return errors::kLeadingPrecision;
    at = PutDigits(Leading(shown), std::max(leading, 1U), at);
    if (shown.span == Span::year_month) {
        *at++ = '-';
        at = PutDigits(shown.whole % 12, 2, at);
    } else {
        const DaySecond parts = DaySecondOf(shown);
        *at++ = ' ';
        at = PutDigits(parts.hour, 2, at);
        *at++ = ':';
        at = PutDigits(parts.minute, 2, at);
        *at++ = ':';
        at = PutDigits(parts.second, 2, at);
        std::int64_t digits = parts.nanosecond;
        for (unsigned place = fraction; place < kMostDigits; ++place) digits /= 10;
        if (fraction > 0) *at++ = '.';
        at = PutDigits(digits, fraction, at);
    }
    *length = static_cast<std::size_t>(at - text);
    return 0;
}

Errno FromText(std::string_view text, Span span, Interval* result) noexcept {
    Reader reader(text);
    reader.SkipBlanks();
    const bool negative = reader.Take('-');
    if (!negative) reader.Take('+');
    return span == Span::year_month ? ReadParts<YearMonth, ReadYearMonth>(reader, negative, result)
                                    : ReadParts<DaySecond, ReadDaySecond>(reader, negative, result);
}

Errno AddInterval(const DateTime& value, const Interval& interval, DateTime* result) noexcept {
    DateTime moved;
    if (interval.span == Span::year_month) {
        if (const Errno number = MoveMonths(value, interval.whole, &moved)) return number;
        if (const Errno number = moved.region ? SetZone(RegionName(moved), &moved) : 0) return number;
        *result = moved;
        return 0;
    }
    std::int64_t nanosecond = std::int64_t{value.nanosecond} + interval.nanosecond, seconds = interval.whole;
    if (nanosecond < 0) nanosecond += kSecond, --seconds;
    if (nanosecond >= kSecond) nanosecond -= kSecond, ++seconds;
    if (const Errno number = MoveMoment(value, seconds, &moved)) return number;
    moved.nanosecond = static_cast<std::uint32_t>(nanosecond);
    *result = moved;
    return 0;
}

Errno Subtract(const DateTime& left, const DateTime& right, Interval* result) noexcept {
    std::int64_t seconds = 0;
    if (const Errno number = SecondsBetween(left, right, &seconds)) return number;
    return TakeSeconds(seconds, std::int64_t{left.nanosecond} - std::int64_t{right.nanosecond}, result);
}

}  // namespace date
