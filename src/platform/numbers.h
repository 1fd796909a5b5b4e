// Reading decimal numbers: optional leading blanks and sign, then digits up to the first other character; 0 when there
// are none. A number out of range is the nearest one in range. Also a sleep. Any thread.
#pragma once

#include <cstdint>

std::int64_t StrToInt64(const char* text);
// A minus sign is read modulo 2^64, as C reads unsigned numbers: "-1" is the largest one.
std::uint64_t StrToUint64(const char* text);

// Returns at once for 0 and below; a signal does not shorten it.
void SleepMilliseconds(std::int64_t milliseconds);
