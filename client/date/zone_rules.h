// The rules of one time zone: which offset from Greenwich holds at a moment. Read from compiled zone files (RFC 8536)
// or from a rule text as the variable TZ has it. Moments are seconds since 1970 at Greenwich; wall times are the
// seconds that a clock there would show, counted alike.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "date/date.h"

namespace date {

constexpr DayNumber kEpochDay = 2440588;    // 1 January 1970

struct ZoneState {
    std::int32_t offset = 0;          // seconds east of Greenwich
    std::string_view abbreviation;    // borrowed from the rules
};

// A rule text: "CET-1CEST,M3.5.0,M10.5.0/3".
class RecurringRules {
public:
    static std::optional<RecurringRules> Parse(std::string_view text);
    [[nodiscard]] ZoneState At(std::int64_t moment) const;

private:
    friend class RecurringRulesReader;
    // When summer time begins or ends: a day of the year and the wall time on it.
    struct Change {
        enum class Kind : std::uint8_t { weekday_of_month, day_without_leap, day } kind = Kind::day;
        int month = 0, week = 0, weekday = 0;    // week 5: the last
        int day = 0;                             // 1 to 365 without 29 February, or 0 to 365 with it
        int second = 7200;
        [[nodiscard]] std::int64_t WallTime(int year) const;
    };

    std::string standard_name_, summer_name_;
    std::int32_t standard_offset_ = 0, summer_offset_ = 0;
    bool has_summer_ = false;
    Change to_summer_, to_standard_;
};

class ZoneRules {
public:
    // Nothing when the file's bytes are no zone.
    static std::optional<ZoneRules> FromFile(std::string_view bytes);
    static std::optional<ZoneRules> FromText(std::string_view text);

    [[nodiscard]] ZoneState At(std::int64_t moment) const;
    // Of a wall time that comes twice the first is meant; one that is skipped has the state before it.
    [[nodiscard]] ZoneState AtWallTime(std::int64_t wall) const;

private:
    friend class ZoneFileReader;
    struct Type {
        std::int32_t offset;
        std::uint8_t abbreviation;    // where it begins in abbreviations_
    };
    [[nodiscard]] ZoneState StateOf(const Type& type) const;

    std::vector<std::int64_t> moments_;       // of changes, ascending
    std::vector<std::uint8_t> types_;         // in force from each of them
    std::vector<Type> all_types_;
    std::string abbreviations_;               // closed with zeros
    std::optional<RecurringRules> after_;     // behind the last change
};

}  // namespace date
