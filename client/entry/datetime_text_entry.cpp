// Datetimes as text, with their zones, and with intervals.
#include <limits>

#include "date/zone.h"
#include "entry/datetime_values.h"
#include "entry/model_arguments.h"

namespace {

date::Scope ScopeOf(const DateTimeDescriptor& descriptor) {
    return descriptor.Type() == OCI_DTYPE_DATE ? date::Scope::date : date::Scope::timestamp;
}

// The other descriptor moved by an interval, forwards or back.
sword Move(dvoid* hndl, OCIError* err, const OCIDateTime* from, const OCIInterval* by, bool back, OCIDateTime* to) {
    return EnterDateTimes(hndl, err, from, to, [&](const DateTimeDescriptor& source, DateTimeDescriptor& target) {
        date::Interval interval;
        Status found = FindValue(by, interval);
        if (!found.Ok()) return found;
        return target.Move(source, back ? date::Negative(interval) : interval);
    });
}

std::string OffsetText(int minutes) {
    const auto two_digits = [](int number) {
        return std::string{static_cast<char>('0' + number / 10), static_cast<char>('0' + number % 10)};
    };
    const int distance = minutes < 0 ? -minutes : minutes;
    return (minutes < 0 ? '-' : '+') + two_digits(distance / 60) + ':' + two_digits(distance % 60);
}

}  // namespace

sword OCIDateTimeFromText(dvoid* hndl, OCIError* err, const OraText* str, size_t strLen, const OraText* fmt,
                          ub1 fmtLen, const OraText* lang, size_t langLen, OCIDateTime* out) {
    return EnterDateTime(hndl, err, out, [&](Environment& environment, DateTimeDescriptor& descriptor) -> Status {
        if (!str) return Error(errors::kNullArgument);
        const CallText text(environment, str, strLen, false);
        if (!text.Valid()) return Error(errors::kBadText);
        ModelArguments arguments(environment, descriptor.UsualModel(), fmt, fmtLen, lang, langLen);
        if (const int number = arguments.Resolve()) return Error(number);
        date::DateTime value;
        const int number =
            date::FromText(text.View(), arguments.Model(), arguments.Language(), ScopeOf(descriptor), &value);
        return number ? Error(number) : descriptor.Store(value);
    });
}

sword OCIDateTimeToText(dvoid* hndl, OCIError* err, const OCIDateTime* date, const OraText* fmt, ub1 fmtLen, ub1 fsprec,
                        const OraText* lang, size_t langLen, ub4* bufsize, OraText* buf) {
    return EnterDateTime(hndl, err, date, [&](Environment& environment, DateTimeDescriptor& descriptor) -> Status {
        if (!bufsize || !buf) return Error(errors::kNullArgument);
        if (!descriptor.IsSet() || (descriptor.HasDate() && descriptor.Value().month == 0))
            return Error(errors::kInvalidDateTime);
        if (fsprec > 9) return Error(errors::kBadPrecision);
        ModelArguments arguments(environment, descriptor.UsualModel(), fmt, fmtLen, lang, langLen);
        if (const int number = arguments.Resolve()) return Error(number);
        std::string text;
        Status written = DateText(descriptor.Value(), arguments, ScopeOf(descriptor), text, fsprec);
        return written.Ok() ? WriteText(environment, text, bufsize, buf) : written;
    });
}

sword OCIDateTimeConvert(dvoid* hndl, OCIError* err, OCIDateTime* from, OCIDateTime* to) {
    return OCIDateTimeAssign(hndl, err, from, to);
}

sword OCIDateTimeSysTimeStamp(dvoid* hndl, OCIError* err, OCIDateTime* out) {
    return EnterDateTime(hndl, err, out, [](Environment&, DateTimeDescriptor& descriptor) -> Status {
        date::DateTime now;
        if (const int number = date::Now(&now)) return Error(number);
        if (const int number = date::SetZone({}, &now)) return Error(number);
        return descriptor.Store(now);
    });
}

sword OCIDateTimeGetTimeZoneOffset(dvoid* hndl, OCIError* err, const OCIDateTime* date, sb1* hour, sb1* minute) {
    return EnterDateTime(hndl, err, date, [&](Environment&, const DateTimeDescriptor& descriptor) -> Status {
        if (!hour || !minute) return Error(errors::kNullArgument);
        int minutes = 0;
        Status got = descriptor.ZoneOffset(&minutes);
        if (!got.Ok()) return got;
        *hour = static_cast<sb1>(minutes / 60);
        *minute = static_cast<sb1>(minutes % 60);
        return {};
    });
}

// The region's name, or the offset where there is none.
sword OCIDateTimeGetTimeZoneName(dvoid* hndl, OCIError* err, const OCIDateTime* date, ub1* buf, ub4* buflen) {
    return EnterDateTime(hndl, err, date, [&](Environment& environment, const DateTimeDescriptor& descriptor) -> Status {
        if (!buf || !buflen) return Error(errors::kNullArgument);
        int minutes = 0;
        Status got = descriptor.ZoneOffset(&minutes);
        if (!got.Ok()) return got;
        const std::string_view region = date::RegionName(descriptor.Value());
        return WriteText(environment, region.empty() ? OffsetText(minutes) : std::string(region), buflen, buf);
    });
}

// An interval of days and seconds; the months between two moments are no fixed count of either.
sword OCIDateTimeSubtract(dvoid* hndl, OCIError* err, OCIDateTime* date1, OCIDateTime* date2, OCIInterval* result) {
    return EnterDateTimes(hndl, err, date1, date2, [&](const auto& left, const auto& right) -> Status {
        IntervalPlace* place = nullptr;
        Status found = FindDescriptor(result, place);
        if (!found.Ok()) return found;
        if (place->span != date::Span::day_second) return Error(errors::kBadInterval);
        if (!left.IsSet() || !right.IsSet()) return Error(errors::kInvalidDateTime);
        date::Interval difference;
        if (const int number = date::Subtract(left.Value(), right.Value(), &difference)) return Error(number);
        place->value = difference;
        return {};
    });
}

sword OCIDateTimeIntervalAdd(dvoid* hndl, OCIError* err, OCIDateTime* date, OCIInterval* interval, OCIDateTime* out) {
    return Move(hndl, err, date, interval, false, out);
}

sword OCIDateTimeIntervalSub(dvoid* hndl, OCIError* err, OCIDateTime* date, OCIInterval* interval, OCIDateTime* out) {
    return Move(hndl, err, date, interval, true, out);
}
