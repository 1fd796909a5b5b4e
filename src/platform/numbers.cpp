// Decimal numbers from text, and a sleep.
#include "platform/numbers.h"

#include <algorithm>
#include <chrono>
#include <cstdlib>
#include <thread>

static_assert(sizeof(long long) == sizeof(std::int64_t));

std::int64_t StrToInt64(const char* text) {
    return std::strtoll(text, nullptr, 10);
}

std::uint64_t StrToUint64(const char* text) {
    return std::strtoull(text, nullptr, 10);
}

void SleepMilliseconds(std::int64_t milliseconds) {
    // A century, so that the end of the sleep can be counted in nanoseconds.
    constexpr std::int64_t kLongest = std::int64_t{100} * 365 * 24 * 60 * 60 * 1000;
    if (milliseconds <= 0) return;
    std::this_thread::sleep_for(std::chrono::milliseconds(std::min(milliseconds, kLongest)));
}
