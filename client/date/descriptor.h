// Datetime descriptors: a value, and by the descriptor's type the parts of it that exist.
#pragma once

#include <string_view>

#include "date/date.h"
#include "date/interval.h"
#include "handles/object.h"
#include "handles/status.h"

class DateTimeDescriptor : public Object {
public:
    static constexpr Kind kKind = Kind::datetime;
    explicit DateTimeDescriptor(const Origin& origin) : Object(origin) {}

    [[nodiscard]] bool HasDate() const;
    [[nodiscard]] bool HasTime() const;

    // The value; its missing parts are zero. Unset until something was stored.
    [[nodiscard]] const date::DateTime& Value() const { return value_; }
    [[nodiscard]] bool IsSet() const { return is_set_; }

    // Takes fields as they were given, in the zone that `zone` names: empty means that of the process. Fields of parts
    // that the type lacks are ignored; the others are checked.
    Status Construct(const date::DateTime& fields, std::string_view zone);
    // Takes a value of any type: parts that the type lacks are dropped, and a zone is added or resolved as the type
    // asks. Error 1878 when the value lacks a date and the type has one.
    Status Store(const date::DateTime& value);
    Status Assign(const DateTimeDescriptor& from);

    Status SetDate(const date::DateTime& date);    // year, month, day
    Status SetTime(const date::DateTime& time);    // the rest, but for the zone
    Status GetDate(date::DateTime* value) const;   // error 1878 when the type has no date, 1866 when unset
    Status GetTime(date::DateTime* value) const;

    // Minutes east of Greenwich. Error 1878 for a value without a zone.
    Status ZoneOffset(int* minutes) const;
    // The format model that text calls use when they are given none.
    [[nodiscard]] std::string_view UsualModel() const;
    // Takes another's value moved by an interval.
    Status Move(const DateTimeDescriptor& from, const date::Interval& interval);

    // What is wrong with the value, in the bits of OCIDateTimeCheck: nothing but being unset can be.
    [[nodiscard]] date::Flags Check() const;
    // Error 1870 when one has a date and the other none.
    static Status Compare(const DateTimeDescriptor& left, const DateTimeDescriptor& right, int* result);

private:
    enum class Zone { none, optional, wanted, local };
    [[nodiscard]] Zone ZoneRule() const;
    Status Replace(const date::DateTime& value);

    date::DateTime value_;
    bool is_set_ = false;
};
