// The unit of fractions.
#include "date/fraction.h"

#include <string_view>

#include "platform/ini.h"

namespace date {
namespace {

constexpr std::uint32_t kSecond = 1'000'000'000;    // in nanoseconds

// Nanoseconds of one unit.
std::uint32_t Unit() {
    static const std::uint32_t unit = [] {
        char value[16];
        IniReadString("kelpcli.ini", "kelpci", "fraction", "nanoseconds", value, sizeof value);
        return std::string_view(value) == "microseconds" ? 1000U : 1U;
    }();
    return unit;
}

}  // namespace

bool FractionToNanoseconds(std::uint32_t fraction, std::uint32_t* nanosecond) {
    if (fraction >= kSecond / Unit()) return false;
    *nanosecond = fraction * Unit();
    return true;
}

std::uint32_t NanosecondsToFraction(std::uint32_t nanosecond) { return nanosecond / Unit(); }

}  // namespace date
