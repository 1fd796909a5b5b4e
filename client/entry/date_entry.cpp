// The date package: calendar functions on OCIDate.
#include <string>

#include "date/date.h"
#include "date/format.h"
#include "date/zone.h"
#include "entry/model_arguments.h"
#include "handles/errors.h"
#include "handles/gate.h"

namespace {

// A date made from a date: change(value, result).
template <class Change>
sword MakeDate(OCIError* err, const OCIDate* given, OCIDate* out, Change change) {
    return EnterError(err, [&](ErrorHandle&) -> Status {
        if (!given || !out) return Error(errors::kNullArgument);
        date::DateTime result;
        if (const int number = change(date::FromOciDate(*given), &result)) return Error(number);
        date::ToOciDate(result, out);
        return {};
    });
}

// A number from two dates: measure(left, right). Both must be valid.
template <class Number, class Measure>
sword MeasureDates(OCIError* err, const OCIDate* left, const OCIDate* right, Number* out, Measure measure) {
    return EnterError(err, [&](ErrorHandle&) -> Status {
        if (!left || !right || !out) return Error(errors::kNullArgument);
        const date::DateTime first = date::FromOciDate(*left), second = date::FromOciDate(*right);
        if (const int number = date::Validate(first)) return Error(number);
        if (const int number = date::Validate(second)) return Error(number);
        *out = measure(first, second);
        return {};
    });
}

}  // namespace

sword OCIDateAddDays(OCIError* err, const OCIDate* given, sb4 days, OCIDate* out) {
    return MakeDate(err, given, out,
                    [days](const auto& value, auto* result) { return date::AddDays(value, days, result); });
}

sword OCIDateAddMonths(OCIError* err, const OCIDate* given, sb4 months, OCIDate* out) {
    return MakeDate(err, given, out,
                    [months](const auto& value, auto* result) { return date::AddMonths(value, months, result); });
}

// A copy, of dates that do not exist as well.
sword OCIDateAssign(OCIError* err, const OCIDate* from, OCIDate* to) {
    return MakeDate(err, from, to, [](const auto& value, auto* result) { return *result = value, 0; });
}

sword OCIDateLastDay(OCIError* err, const OCIDate* given, OCIDate* out) {
    return MakeDate(err, given, out, [](const auto& value, auto* result) { return date::LastDay(value, result); });
}

sword OCIDateNextDay(OCIError* err, const OCIDate* given, const OraText* day, ub4 dayLen, OCIDate* out) {
    return EnterError(err, [&](ErrorHandle& error) -> Status {
        if (!given || !day || !out) return Error(errors::kNullArgument);
        const CallText name(error.Env(), day, dayLen, false);
        if (!name.Valid()) return Error(errors::kBadText);
        int day_of_week = 0;
        if (const int number = date::WeekdayFromName(name.View(), date::kEnglish, &day_of_week)) return Error(number);
        date::DateTime result;
        if (const int number = date::NextDay(date::FromOciDate(*given), day_of_week, &result)) return Error(number);
        date::ToOciDate(result, out);
        return {};
    });
}

sword OCIDateCheck(OCIError* err, const OCIDate* given, uword* flags) {
    return EnterError(err, [&](ErrorHandle&) -> Status {
        if (!given || !flags) return Error(errors::kNullArgument);
        *flags = date::Check(date::FromOciDate(*given));
        return {};
    });
}

sword OCIDateCompare(OCIError* err, const OCIDate* date1, const OCIDate* date2, sword* out) {
    return MeasureDates(err, date1, date2, out, date::Compare);
}

sword OCIDateDaysBetween(OCIError* err, const OCIDate* date1, const OCIDate* date2, sb4* days) {
    return MeasureDates(err, date1, date2, days, date::DaysBetween);
}

sword OCIDateSysDate(OCIError* err, OCIDate* out) {
    return EnterError(err, [&](ErrorHandle&) -> Status {
        if (!out) return Error(errors::kNullArgument);
        date::DateTime now;
        if (const int number = date::Now(&now)) return Error(number);
        date::ToOciDate(now, out);
        return {};
    });
}

sword OCIDateFromText(OCIError* err, const OraText* str, ub4 strLen, const OraText* fmt, ub1 fmtLen,
                      const OraText* lang, ub4 langLen, OCIDate* out) {
    return EnterError(err, [&](ErrorHandle& error) -> Status {
        if (!str || !out) return Error(errors::kNullArgument);
        const CallText text(error.Env(), str, strLen, false);
        if (!text.Valid()) return Error(errors::kBadText);
        ModelArguments arguments(error.Env(), date::kShortDateModel, fmt, fmtLen, lang, langLen);
        if (const int number = arguments.Resolve()) return Error(number);
        date::DateTime value;
        if (const int number =
                date::FromText(text.View(), arguments.Model(), arguments.Language(), date::Scope::date, &value)) {
            return Error(number);
        }
        date::ToOciDate(value, out);
        return {};
    });
}

sword OCIDateToText(OCIError* err, const OCIDate* given, const OraText* fmt, ub1 fmtLen, const OraText* lang,
                    ub4 langLen, ub4* bufsize, OraText* buf) {
    return EnterError(err, [&](ErrorHandle& error) -> Status {
        if (!given || !bufsize || !buf) return Error(errors::kNullArgument);
        const date::DateTime value = date::FromOciDate(*given);
        if (const int number = date::Validate(value)) return Error(number);
        ModelArguments arguments(error.Env(), date::kShortDateModel, fmt, fmtLen, lang, langLen);
        if (const int number = arguments.Resolve()) return Error(number);
        std::string text;
        Status written = DateText(value, arguments, date::Scope::date, text);
        return written.Ok() ? WriteText(error.Env(), text, bufsize, buf) : written;
    });
}
