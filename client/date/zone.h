// Time zones: offsets like "+05:30" and regions like "Europe/Paris", whose rules are read from the system's zone data.
// A region is known by a small number that stays the same for the life of the process. Safe from several threads.
//
// What needs rules for the first time reads them, which may lack memory or a file handle: 1019, and nothing is kept of
// that; the next call tries again. "The zone of the process" may be read so by every function that answers an Errno.
#pragma once

#include <cstdint>
#include <string_view>

#include "date/date.h"

namespace date {

// Gives `value`, whose date and time are local, the zone that a text names: "+hh:mm", "-hh:mm" or a region. In a region
// the offset is the one in force at that local time; of an hour that comes twice the first is meant, one that is
// skipped counts with the offset before it. A time without a date has the offset of today. Empty: the zone of the process.
Errno SetZone(std::string_view zone, DateTime* value) noexcept;

// Gives it an offset, from 12 hours west to 14 hours east.
Errno SetOffset(bool west, int hours, int minutes, DateTime* value) noexcept;

// The name of a value's region; empty without one.
std::string_view RegionName(const DateTime& value) noexcept;
// The short name in force in its region ("CEST"); empty without one. The view lives as long as the process.
std::string_view ZoneAbbreviation(const DateTime& value) noexcept;

// -1, 0, 1 by the moment that is meant; a value without a zone counts as one in the zone of the process.
Errno CompareMoments(const DateTime& left, const DateTime& right, int* order) noexcept;

// The same moment seen at an offset, or in the zone of the process.
Errno ToOffset(const DateTime& value, int zone_minutes, DateTime* result) noexcept;
Errno ToLocal(const DateTime& value, DateTime* result) noexcept;

// The value that many seconds later: with a region, in the offset that is in force there then. 1841 outside of the
// calendar. The fraction stays.
Errno MoveMoment(const DateTime& value, std::int64_t seconds, DateTime* result) noexcept;
// Seconds from `right` to `left`, fractions aside; of times without dates 1878.
Errno SecondsBetween(const DateTime& left, const DateTime& right, std::int64_t* seconds) noexcept;

// The clock in the zone of the process, without a zone.
Errno Now(DateTime* result) noexcept;

}  // namespace date
