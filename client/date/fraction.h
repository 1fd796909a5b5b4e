// Fractions of a second as the datetime calls take and give them: nanoseconds, or microseconds when the key `fraction`
// in section `kelpci` of kelpcli.ini says so. The key is read once, at the first call.
#pragma once

#include <cstdint>

namespace date {

// False when the fraction is a second or more.
bool FractionToNanoseconds(std::uint32_t fraction, std::uint32_t* nanosecond);
std::uint32_t NanosecondsToFraction(std::uint32_t nanosecond);

}  // namespace date
