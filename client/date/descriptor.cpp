// Datetime descriptors: which parts a type has, and what storing does with the others.
#include "date/descriptor.h"

#include "date/format.h"
#include "date/interval_descriptor.h"
#include "date/zone.h"
#include "handles/errors.h"
#include "oci_constants.h"

namespace {

// The general type has the number of an interval: all parts, with a zone when one is given.
constexpr TypeCode kGeneralType = OCI_DTYPE_INTERVAL_YM;

void DropDate(date::DateTime* value) { value->year = 0, value->month = value->day = 0; }

void DropTime(date::DateTime* value) {
    value->hour = value->minute = value->second = 0;
    value->nanosecond = 0;
}

void DropZone(date::DateTime* value) {
    value->has_zone = false;
    value->zone_minutes = 0;
    value->region = 0;
}

}  // namespace

bool DateTimeDescriptor::HasDate() const { return Type() != OCI_DTYPE_TIME && Type() != OCI_DTYPE_TIME_TZ; }
bool DateTimeDescriptor::HasTime() const { return Type() != OCI_DTYPE_DATE; }

DateTimeDescriptor::Zone DateTimeDescriptor::ZoneRule() const {
    switch (Type()) {
        case kGeneralType: return Zone::optional;
        case OCI_DTYPE_TIME_TZ:
        case OCI_DTYPE_TIMESTAMP_TZ: return Zone::wanted;
        case OCI_DTYPE_TIMESTAMP_LTZ: return Zone::local;
        default: return Zone::none;
    }
}

// Checks and takes a value that has all parts of the type and none else but a zone.
Status DateTimeDescriptor::Replace(const date::DateTime& value) {
    if (const int number = HasDate() ? date::ValidateDate(value) : 0) return Error(number);
    if (const int number = date::ValidateTime(value)) return Error(number);
    value_ = value;
    is_set_ = true;
    return {};
}

Status DateTimeDescriptor::Construct(const date::DateTime& fields, std::string_view zone) {
    date::DateTime value = fields;
    if (!HasDate()) DropDate(&value);
    if (!HasTime()) DropTime(&value);
    if (const int number = HasDate() ? date::Validate(value) : date::ValidateTime(value)) return Error(number);
    const Zone rule = ZoneRule();
    if (rule == Zone::wanted || (rule == Zone::optional && !zone.empty())) {
        if (const int number = date::SetZone(zone, &value)) return Error(number);
    }
    return Replace(value);
}

Status DateTimeDescriptor::Store(const date::DateTime& given) {
    date::DateTime value = given;
    const Zone rule = ZoneRule();
    if (HasDate() && value.month == 0) return Error(errors::kNoSuchField);
    if (rule == Zone::local && value.has_zone) {
        if (const int number = date::ToLocal(value, &value)) return Error(number);
    }
    if (rule == Zone::wanted && !value.has_zone) {
        if (const int number = date::SetZone({}, &value)) return Error(number);
    }
    if (rule == Zone::none || rule == Zone::local) DropZone(&value);
    if (!HasDate()) DropDate(&value);
    if (!HasTime()) DropTime(&value);
    return Replace(value);
}

Status DateTimeDescriptor::Assign(const DateTimeDescriptor& from) {
    return from.is_set_ ? Store(from.value_) : Error(errors::kInvalidDateTime);
}

Status DateTimeDescriptor::SetDate(const date::DateTime& date) {
    if (!HasDate()) return Error(errors::kNoSuchField);
    date::DateTime value = value_;
    value.year = date.year;
    value.month = date.month;
    value.day = date.day;
    if (const int number = date::ValidateDate(value)) return Error(number);
    if (value.region != 0) {    // another day may have another offset
        if (const int number = date::SetZone(date::RegionName(value), &value)) return Error(number);
    }
    return Replace(value);
}

// A descriptor that has no date yet keeps the time for when it gets one.
Status DateTimeDescriptor::SetTime(const date::DateTime& time) {
    if (!HasTime()) return Error(errors::kNoSuchField);
    date::DateTime value = value_;
    value.hour = time.hour;
    value.minute = time.minute;
    value.second = time.second;
    value.nanosecond = time.nanosecond;
    if (const int number = date::ValidateTime(value)) return Error(number);
    if (value.region != 0) {
        if (const int number = date::SetZone(date::RegionName(value), &value)) return Error(number);
    }
    value_ = value;
    is_set_ = true;
    return {};
}

Status DateTimeDescriptor::GetDate(date::DateTime* value) const {
    if (!HasDate()) return Error(errors::kNoSuchField);
    if (!is_set_ || value_.month == 0) return Error(errors::kInvalidDateTime);
    *value = value_;
    return {};
}

Status DateTimeDescriptor::GetTime(date::DateTime* value) const {
    if (!HasTime()) return Error(errors::kNoSuchField);
    if (!is_set_) return Error(errors::kInvalidDateTime);
    *value = value_;
    return {};
}

date::Flags DateTimeDescriptor::Check() const {
    return (HasDate() ? date::CheckDate(value_) : 0) | (HasTime() ? date::CheckTime(value_) : 0);
}

Status DateTimeDescriptor::Compare(const DateTimeDescriptor& left, const DateTimeDescriptor& right, int* result) {
    if (!left.is_set_ || !right.is_set_) return Error(errors::kInvalidDateTime);
    if (left.HasDate() != right.HasDate()) return Error(errors::kNotComparable);
    const int number = date::CompareMoments(left.value_, right.value_, result);
    return number ? Error(number) : Status();
}

Status DateTimeDescriptor::ZoneOffset(int* minutes) const {
    if (!is_set_) return Error(errors::kInvalidDateTime);
    if (!value_.has_zone && ZoneRule() != Zone::local) return Error(errors::kNoSuchField);
    date::DateTime value = value_;
    if (const int number = value.has_zone ? 0 : date::SetZone({}, &value)) return Error(number);
    *minutes = value.zone_minutes;
    return {};
}

std::string_view DateTimeDescriptor::UsualModel() const {
    switch (Type()) {
        case OCI_DTYPE_DATE: return date::kDateModel;
        case OCI_DTYPE_TIME: return date::kTimeModel;
        case OCI_DTYPE_TIME_TZ: return date::kTimeZoneModel;
        default: return value_.has_zone ? date::kTimestampZoneModel : date::kTimestampModel;
    }
}

Status DateTimeDescriptor::Move(const DateTimeDescriptor& from, const date::Interval& interval) {
    if (!from.is_set_) return Error(errors::kInvalidDateTime);
    date::DateTime moved;
    if (const int number = date::AddInterval(from.value_, interval, &moved)) return Error(number);
    return Store(moved);
}

IntervalPlace* FindInterval(const void* pointer) noexcept {
    if (auto* interval = Live<IntervalDescriptor>(pointer)) return &interval->place;
    auto* general = Live<DateTimeDescriptor>(pointer);
    return general && general->Type() == kGeneralType ? &static_cast<GeneralDescriptor*>(general)->place : nullptr;
}
