// The interval package: calls on interval descriptors. What a descriptor cannot hold, and one that is not set, is 1867.
// Fractions have the unit of the datetime calls.
#include <cstring>
#include <limits>

#include "date/fraction.h"
#include "entry/call_text.h"
#include "entry/datetime_values.h"
#include "entry/model_arguments.h"

namespace {

Status Store(IntervalPlace& place, const date::Interval& value) {
    if (place.span != value.span) return Error(errors::kBadInterval);
    place.value = value;
    return {};
}

// Sets `result` to what make(environment, span, value) answers with 0.
template <class Make>
sword MakeInterval(void* handle, OCIError* err, OCIInterval* result, Make make) {
    return EnterHandle(handle, err, [&](Environment& environment) -> Status {
        IntervalPlace* place = nullptr;
        Status found = FindDescriptor(result, place);
        if (!found.Ok()) return found;
        date::Interval value;
        const int number = make(environment, place->span, value);
        return number ? Error(number) : Store(*place, value);
    });
}

// Calls on an interval that is set: body(environment, value).
template <class Body>
sword EnterInterval(void* handle, OCIError* err, const OCIInterval* pointer, Body body) {
    return EnterHandle(handle, err, [&](Environment& environment) -> Status {
        date::Interval value;
        Status found = FindValue(pointer, value);
        return found.Ok() ? body(environment, value) : found;
    });
}

// Calls on two: body(first, second).
template <class Body>
sword EnterIntervals(void* handle, OCIError* err, const OCIInterval* first, const OCIInterval* second, Body body) {
    return EnterInterval(handle, err, first, [&](Environment&, const date::Interval& one) -> Status {
        date::Interval other;
        Status found = FindValue(second, other);
        return found.Ok() ? body(one, other) : found;
    });
}

// The sum of two, in a descriptor.
sword Sum(void* handle, OCIError* err, const OCIInterval* first, const OCIInterval* second, bool subtract,
          OCIInterval* result) {
    return EnterIntervals(handle, err, first, second, [&](const date::Interval& one, const date::Interval& other) {
        IntervalPlace* place = nullptr;
        Status found = FindDescriptor(result, place);
        if (!found.Ok()) return found;
        date::Interval sum;
        const int number = date::Add(one, subtract ? date::Negative(other) : other, &sum);
        return number ? Error(number) : Store(*place, sum);
    });
}

// A fraction as the application counts it, with its sign.
bool ToNanoseconds(sb4 fraction, std::int64_t* nanosecond) {
    std::uint32_t magnitude = 0;
    if (fraction == std::numeric_limits<sb4>::min()) return false;
    if (!date::FractionToNanoseconds(static_cast<std::uint32_t>(fraction < 0 ? -fraction : fraction), &magnitude))
        return false;
    *nanosecond = fraction < 0 ? -std::int64_t{magnitude} : magnitude;
    return true;
}
sb4 ToFraction(std::int64_t nanosecond) {
    const auto magnitude = static_cast<std::uint32_t>(nanosecond < 0 ? -nanosecond : nanosecond);
    const auto fraction = static_cast<sb4>(date::NanosecondsToFraction(magnitude));
    return nanosecond < 0 ? -fraction : fraction;
}

// The zero that closes the text is written when there is room for it.
Status WriteInterval(const Environment& environment, const date::Interval& value, ub1 leading, ub1 fraction,
                     OraText* buffer, size_t size, size_t* length) {
    char text[date::kMaxIntervalText];
    std::size_t count = 0;
    if (const int number = date::ToText(value, leading, fraction, text, &count)) return Error(number);
    auto room = static_cast<ub4>(std::min<size_t>(size, std::numeric_limits<ub4>::max()));
    Status written = WriteText(environment, {text, count}, &room, buffer);
    *length = room;
    const std::size_t zero = std::size_t{environment.Utf16() ? 2U : 1U};
    if (written.Ok() && size - room >= zero) std::memset(buffer + room, 0, zero);
    return written;
}

}  // namespace

sword OCIIntervalSetDaySecond(dvoid* hndl, OCIError* err, sb4 day, sb4 hour, sb4 minute, sb4 second, sb4 fraction,
                              OCIInterval* result) {
    return MakeInterval(hndl, err, result, [&](Environment&, date::Span, date::Interval& value) -> int {
        std::int64_t nanosecond = 0;
        if (!ToNanoseconds(fraction, &nanosecond)) return errors::kBadFraction;
        return date::FromParts(date::DaySecond{day, hour, minute, second, nanosecond}, &value);
    });
}

sword OCIIntervalSetYearMonth(dvoid* hndl, OCIError* err, sb4 year, sb4 month, OCIInterval* result) {
    return MakeInterval(hndl, err, result, [&](Environment&, date::Span, date::Interval& value) {
        return date::FromParts(date::YearMonth{year, month}, &value);
    });
}

sword OCIIntervalGetDaySecond(dvoid* hndl, OCIError* err, sb4* day, sb4* hour, sb4* minute, sb4* second, sb4* fraction,
                              const OCIInterval* interval) {
    return EnterInterval(hndl, err, interval, [&](Environment&, const date::Interval& value) -> Status {
        if (!day || !hour || !minute || !second || !fraction) return Error(errors::kNullArgument);
        if (value.span != date::Span::day_second) return Error(errors::kBadInterval);
        const date::DaySecond parts = date::DaySecondOf(value);
        *day = static_cast<sb4>(parts.day);
        *hour = static_cast<sb4>(parts.hour);
        *minute = static_cast<sb4>(parts.minute);
        *second = static_cast<sb4>(parts.second);
        *fraction = ToFraction(parts.nanosecond);
        return {};
    });
}

sword OCIIntervalGetYearMonth(dvoid* hndl, OCIError* err, sb4* year, sb4* month, const OCIInterval* interval) {
    return EnterInterval(hndl, err, interval, [&](Environment&, const date::Interval& value) -> Status {
        if (!year || !month) return Error(errors::kNullArgument);
        if (value.span != date::Span::year_month) return Error(errors::kBadInterval);
        const date::YearMonth parts = date::YearMonthOf(value);
        *year = static_cast<sb4>(parts.year);
        *month = static_cast<sb4>(parts.month);
        return {};
    });
}

sword OCIIntervalFromText(dvoid* hndl, OCIError* err, const OraText* text, size_t length, OCIInterval* result) {
    return MakeInterval(hndl, err, result, [&](Environment& environment, date::Span span, date::Interval& value) {
        if (!text) return errors::kNullArgument;
        const CallText given(environment, text, length, false);
        return given.Valid() ? date::FromText(given.View(), span, &value) : errors::kBadText;
    });
}

sword OCIIntervalToText(dvoid* hndl, OCIError* err, const OCIInterval* interval, ub1 lfprec, ub1 fsprec, OraText* buffer,
                        size_t buflen, size_t* resultlen) {
    return EnterInterval(hndl, err, interval, [&](Environment& environment, const date::Interval& value) {
        if (!buffer || !resultlen) return Error(errors::kNullArgument);
        return WriteInterval(environment, value, lfprec, fsprec, buffer, buflen, resultlen);
    });
}

sword OCIIntervalAdd(dvoid* hndl, OCIError* err, OCIInterval* addend1, OCIInterval* addend2, OCIInterval* result) {
    return Sum(hndl, err, addend1, addend2, false, result);
}

sword OCIIntervalSubtract(dvoid* hndl, OCIError* err, OCIInterval* minuend, OCIInterval* subtrahend,
                          OCIInterval* result) {
    return Sum(hndl, err, minuend, subtrahend, true, result);
}

sword OCIIntervalCompare(dvoid* hndl, OCIError* err, OCIInterval* inter1, OCIInterval* inter2, sword* result) {
    return EnterIntervals(hndl, err, inter1, inter2, [&](const date::Interval& one, const date::Interval& other) {
        if (!result) return Error(errors::kNullArgument);
        const int number = date::Compare(one, other, result);
        return number ? Error(number) : Status();
    });
}

sword OCIIntervalAssign(dvoid* hndl, OCIError* err, const OCIInterval* from, OCIInterval* to) {
    return EnterInterval(hndl, err, from, [&](Environment&, const date::Interval& value) {
        IntervalPlace* place = nullptr;
        Status found = FindDescriptor(to, place);
        return found.Ok() ? Store(*place, value) : found;
    });
}

// What is set is right: the flags are 0.
sword OCIIntervalCheck(dvoid* hndl, OCIError* err, const OCIInterval* interval, ub4* valid) {
    return EnterInterval(hndl, err, interval, [&](Environment&, const date::Interval&) -> Status {
        if (!valid) return Error(errors::kNullArgument);
        *valid = 0;
        return {};
    });
}
