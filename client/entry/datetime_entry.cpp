// The datetime package: calls on datetime descriptors. Each published function and its twin whose name ends in NS do
// the same. Fractions are nanoseconds, or microseconds when kelpcli.ini says so.
#include "date/fraction.h"
#include "entry/call_text.h"
#include "entry/datetime_values.h"

sword OCIDateTimeAssign(dvoid* hndl, OCIError* err, const OCIDateTime* from, OCIDateTime* to) {
    return EnterDateTimes(hndl, err, from, to, [](const auto& source, auto& target) { return target.Assign(source); });
}

sword OCIDateTimeCheck(dvoid* hndl, OCIError* err, const OCIDateTime* date, ub4* flags) {
    return EnterDateTime(hndl, err, date, [flags](Environment&, const DateTimeDescriptor& descriptor) -> Status {
        if (!flags) return Error(errors::kNullArgument);
        *flags = descriptor.Check();
        return {};
    });
}

sword OCIDateTimeCompare(dvoid* hndl, OCIError* err, const OCIDateTime* date1, const OCIDateTime* date2, sword* out) {
    return EnterDateTimes(hndl, err, date1, date2, [out](const auto& left, const auto& right) {
        return out ? DateTimeDescriptor::Compare(left, right, out) : Error(errors::kNullArgument);
    });
}

sword OCIDateTimeConstruct(dvoid* hndl, OCIError* err, OCIDateTime* date, sb2 year, ub1 month, ub1 day, ub1 hour,
                           ub1 min, ub1 sec, ub4 fsec, OraText* tz, size_t tzLen) {
    return EnterDateTime(hndl, err, date, [&](Environment& environment, DateTimeDescriptor& descriptor) -> Status {
        date::DateTime fields{.year = year, .month = month, .day = day, .hour = hour, .minute = min, .second = sec};
        if (!date::FractionToNanoseconds(fsec, &fields.nanosecond)) return Error(errors::kBadFraction);
        const CallText zone(environment, tz, tzLen, false);
        return zone.Valid() ? descriptor.Construct(fields, zone.View()) : Error(errors::kBadText);
    });
}

sword OCIDateTimeGetDate(dvoid* hndl, OCIError* err, const OCIDateTime* date, sb2* year, ub1* month, ub1* day) {
    return EnterDateTime(hndl, err, date, [&](Environment&, const DateTimeDescriptor& descriptor) -> Status {
        if (!year || !month || !day) return Error(errors::kNullArgument);
        date::DateTime value;
        Status got = descriptor.GetDate(&value);
        if (!got.Ok()) return got;
        *year = value.year;
        *month = value.month;
        *day = value.day;
        return {};
    });
}

sword OCIDateTimeGetTime(dvoid* hndl, OCIError* err, OCIDateTime* date, ub1* hour, ub1* min, ub1* sec, ub4* fsec) {
    return EnterDateTime(hndl, err, date, [&](Environment&, const DateTimeDescriptor& descriptor) -> Status {
        if (!hour || !min || !sec || !fsec) return Error(errors::kNullArgument);
        date::DateTime value;
        Status got = descriptor.GetTime(&value);
        if (!got.Ok()) return got;
        *hour = value.hour;
        *min = value.minute;
        *sec = value.second;
        *fsec = date::NanosecondsToFraction(value.nanosecond);
        return {};
    });
}

sword OCI_datetimeSetDate(dvoid* hndl, OCIError* err, OCIDateTime* date, sb2 year, ub1 month, ub1 day) {
    return EnterDateTime(hndl, err, date, [&](Environment&, DateTimeDescriptor& descriptor) {
        return descriptor.SetDate({.year = year, .month = month, .day = day});
    });
}

sword OCI_datetimeSetTime(dvoid* hndl, OCIError* err, OCIDateTime* date, ub1 hour, ub1 min, ub1 sec, ub4 fsec) {
    return EnterDateTime(hndl, err, date, [&](Environment&, DateTimeDescriptor& descriptor) -> Status {
        date::DateTime time{.hour = hour, .minute = min, .second = sec};
        if (!date::FractionToNanoseconds(fsec, &time.nanosecond)) return Error(errors::kBadFraction);
        return descriptor.SetTime(time);
    });
}

sword OCIDateTimeAssignNS(dvoid* hndl, OCIError* err, const OCIDateTime* from, OCIDateTime* to) {
    return OCIDateTimeAssign(hndl, err, from, to);
}

sword OCIDateTimeCheckNS(dvoid* hndl, OCIError* err, const OCIDateTime* date, ub4* flags) {
    return OCIDateTimeCheck(hndl, err, date, flags);
}

sword OCIDateTimeCompareNS(dvoid* hndl, OCIError* err, const OCIDateTime* date1, const OCIDateTime* date2, sword* out) {
    return OCIDateTimeCompare(hndl, err, date1, date2, out);
}

sword OCIDateTimeConstructNS(dvoid* hndl, OCIError* err, OCIDateTime* date, sb2 year, ub1 month, ub1 day, ub1 hour,
                             ub1 min, ub1 sec, ub4 fsec, OraText* tz, size_t tzLen) {
    return OCIDateTimeConstruct(hndl, err, date, year, month, day, hour, min, sec, fsec, tz, tzLen);
}

sword OCIDateTimeGetDateNS(dvoid* hndl, OCIError* err, const OCIDateTime* date, sb2* year, ub1* month, ub1* day) {
    return OCIDateTimeGetDate(hndl, err, date, year, month, day);
}

sword OCIDateTimeGetTimeNS(dvoid* hndl, OCIError* err, OCIDateTime* date, ub1* hour, ub1* min, ub1* sec, ub4* fsec) {
    return OCIDateTimeGetTime(hndl, err, date, hour, min, sec, fsec);
}
