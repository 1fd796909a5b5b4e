// Interval descriptors. The type of intervals of years and months is also that of the general datetime, so that its
// descriptors can hold either; each of the two is unset until a call has stored it.
#pragma once

#include <optional>

#include "date/descriptor.h"
#include "date/interval.h"

// An interval of the descriptor's own span.
struct IntervalPlace {
    explicit IntervalPlace(date::Span span_of_type) : span(span_of_type) {}
    const date::Span span;
    std::optional<date::Interval> value;
};

class IntervalDescriptor : public Object {
public:
    static constexpr Kind kKind = Kind::interval;
    explicit IntervalDescriptor(const Origin& origin) : Object(origin) {}
    IntervalPlace place{date::Span::day_second};
};

class GeneralDescriptor : public DateTimeDescriptor {
public:
    using DateTimeDescriptor::DateTimeDescriptor;
    IntervalPlace place{date::Span::year_month};
};

// The interval of a living descriptor that has one, or null.
IntervalPlace* FindInterval(const void* pointer) noexcept;
