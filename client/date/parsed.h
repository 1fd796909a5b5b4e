// The fields that a text gave, and the one date and time that they mean together.
#pragma once

#include <array>
#include <string_view>

#include "date/model.h"

namespace date {

// Fields that say the same thing share a slot: year, month, weekday, hour24 (with hour12 beside it), half_day, ...
class Parsed {
public:
    // Notes that the model names a field: the error of a field that is named twice or beside one it excludes.
    Errno Claim(const Element& element) noexcept;

    // Takes a field's value; what is out of its range is the field's error. `digits`: how many were read.
    Errno Set(const Element& element, int value, std::size_t digits) noexcept;
    void SetFraction(std::uint32_t nanosecond) noexcept { nanosecond_ = nanosecond; }
    void SetZoneSign(bool west) noexcept { west_ = west; }
    void SetRegion(std::string_view region) noexcept { region_ = region; }

    // Fields not given: the current year and month, day 1, time 0.
    Errno Resolve(DateTime* result) const noexcept;

private:
    [[nodiscard]] bool Has(Field slot) const { return given_[static_cast<std::size_t>(slot)]; }
    [[nodiscard]] int Get(Field slot) const { return values_[static_cast<std::size_t>(slot)]; }
    [[nodiscard]] bool BeforeChrist() const { return Get(Field::era) < 0; }
    void Put(Field slot, int value);
    Errno ResolveDate(DateTime* result) const noexcept;
    Errno ResolveTime(DateTime* result) const noexcept;
    Errno ResolveZone(DateTime* result) const noexcept;
    Errno CheckAgainst(const DateTime& value) const noexcept;

    std::array<bool, static_cast<std::size_t>(Field::count)> claimed_{};
    std::array<bool, static_cast<std::size_t>(Field::count)> given_{};
    std::array<int, static_cast<std::size_t>(Field::count)> values_{};
    std::uint32_t nanosecond_ = 0;
    bool signed_year_ = false;
    bool whole_day_hour_ = false;    // HH24
    bool west_ = false;
    std::string_view region_;
};

// The slot of a field.
Field SlotOf(Field field) noexcept;

}  // namespace date
