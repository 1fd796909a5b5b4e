// Finding the datetime and interval descriptors that a call names. A descriptor that is no living one is refused like
// any bad handle; null is a missing argument.
#pragma once

#include "date/interval_descriptor.h"
#include "handles/errors.h"
#include "handles/gate.h"

inline Status FindDescriptor(const OCIDateTime* pointer, DateTimeDescriptor*& descriptor) {
    if (!pointer) return Error(errors::kNullArgument);
    descriptor = Live<DateTimeDescriptor>(pointer);
    return descriptor ? Status() : InvalidHandle();
}

inline Status FindDescriptor(const OCIInterval* pointer, IntervalPlace*& place) {
    if (!pointer) return Error(errors::kNullArgument);
    place = FindInterval(pointer);
    return place ? Status() : InvalidHandle();
}

// An interval that is set. Error 1867 else.
inline Status FindValue(const OCIInterval* pointer, date::Interval& value) {
    IntervalPlace* place = nullptr;
    Status found = FindDescriptor(pointer, place);
    if (!found.Ok()) return found;
    if (!place->value) return Error(errors::kBadInterval);
    value = *place->value;
    return {};
}

// Calls on one descriptor: body(environment, descriptor).
template <class Body>
sword EnterDateTime(void* handle, OCIError* err, const OCIDateTime* pointer, Body body) {
    return EnterHandle(handle, err, [&](Environment& environment) -> Status {
        DateTimeDescriptor* descriptor = nullptr;
        Status found = FindDescriptor(pointer, descriptor);
        return found.Ok() ? body(environment, *descriptor) : found;
    });
}

// Calls on two: body(first, second).
template <class Body>
sword EnterDateTimes(void* handle, OCIError* err, const OCIDateTime* first, const OCIDateTime* second, Body body) {
    return EnterDateTime(handle, err, first, [&](Environment&, DateTimeDescriptor& one) -> Status {
        DateTimeDescriptor* other = nullptr;
        Status found = FindDescriptor(second, other);
        return found.Ok() ? body(one, *other) : found;
    });
}
