// Reading and asking zone rules. Files are not trusted: every count and index is checked.
#include "date/zone_rules.h"

#include <algorithm>

#include "date/date.h"
#include "platform/letters.h"

namespace date {
namespace {

constexpr std::int64_t kDay = 86400;

std::int64_t DaysSinceEpoch(int year, int month, int day) { return ToDayNumber(year, month, day) - kEpochDay; }

int YearOf(std::int64_t moment) {
    const std::int64_t day = (moment - (moment % kDay + kDay) % kDay) / kDay + kEpochDay;
    DateTime value;
    FromDayNumber(static_cast<DayNumber>(std::clamp<std::int64_t>(day, 366, 5373484)), &value);
    return value.year;
}

}  // namespace

// Reads a rule text from the left.
class RecurringRulesReader {
public:
    explicit RecurringRulesReader(std::string_view text) : rest_(text) {}

    bool Read(RecurringRules* rules) {
        if (!Name(&rules->standard_name_) || !Offset(&rules->standard_offset_)) return false;
        if (rest_.empty()) return true;
        rules->has_summer_ = true;
        if (!Name(&rules->summer_name_)) return false;
        rules->summer_offset_ = rules->standard_offset_ + 3600;
        if (!rest_.empty() && rest_.front() != ',' && !Offset(&rules->summer_offset_)) return false;
        if (rest_.empty()) rest_ = ",M3.2.0,M11.1.0";
        return Change(&rules->to_summer_) && Change(&rules->to_standard_) && rest_.empty();
    }

private:
    bool Take(char wanted) {
        if (!rest_.starts_with(wanted)) return false;
        rest_.remove_prefix(1);
        return true;
    }

    bool Number(int* value) { return letters::TakeDigits(rest_, 4, value) > 0; }

    bool Name(std::string* name) {
        const bool bracketed = Take('<');
        std::size_t length = 0;
        while (length < rest_.size() && (bracketed ? rest_[length] != '>' : letters::IsLetter(rest_[length]))) ++length;
        *name = rest_.substr(0, length);
        rest_.remove_prefix(length);
        return length >= 3 && (!bracketed || Take('>'));
    }

    bool Time(int* seconds) {
        const bool negative = Take('-');
        if (!negative) Take('+');
        int hours = 0, minutes = 0, rest = 0;
        if (!Number(&hours) || hours > 167) return false;
        if (Take(':') && (!Number(&minutes) || minutes > 59)) return false;
        if (Take(':') && (!Number(&rest) || rest > 59)) return false;
        *seconds = (hours * 60 + minutes) * 60 + rest;
        if (negative) *seconds = -*seconds;
        return true;
    }

    // The text counts westwards.
    bool Offset(std::int32_t* offset) {
        int west = 0;
        if (!Time(&west)) return false;
        *offset = -west;
        return true;
    }

    // Month, week and weekday.
    bool WeekdayOfMonth(RecurringRules::Change* change) {
        if (!Number(&change->month) || change->month < 1 || change->month > 12 || !Take('.')) return false;
        if (!Number(&change->week) || change->week < 1 || change->week > 5 || !Take('.')) return false;
        return Number(&change->weekday) && change->weekday <= 6;
    }

    bool Change(RecurringRules::Change* change) {
        using Kind = RecurringRules::Change::Kind;
        if (!Take(',')) return false;
        if (Take('M')) {
            change->kind = Kind::weekday_of_month;
            if (!WeekdayOfMonth(change)) return false;
        } else {
            change->kind = Take('J') ? Kind::day_without_leap : Kind::day;
            if (!Number(&change->day) || change->day > 365) return false;
        }
        return !Take('/') || Time(&change->second);
    }

    std::string_view rest_;
};

std::optional<RecurringRules> RecurringRules::Parse(std::string_view text) {
    RecurringRules rules;
    if (!RecurringRulesReader(text).Read(&rules)) return std::nullopt;
    return rules;
}

std::int64_t RecurringRules::Change::WallTime(int year) const {
    std::int64_t days = DaysSinceEpoch(year, 1, 1);
    if (kind == Kind::day) {
        days += day;
    } else if (kind == Kind::day_without_leap) {
        days += day - 1 + (day > 59 && DaysInMonth(year, 2) == 29);
    } else {
        const DayNumber first = ToDayNumber(year, month, 1);
        int day_of_month = 1 + (weekday - DayOfWeek(first) + 7) % 7 + (week - 1) * 7;
        if (day_of_month > DaysInMonth(year, month)) day_of_month -= 7;
        days = first - kEpochDay + day_of_month - 1;
    }
    return days * kDay + second;
}

ZoneState RecurringRules::At(std::int64_t moment) const {
    const ZoneState standard{standard_offset_, standard_name_}, summer{summer_offset_, summer_name_};
    if (!has_summer_) return standard;
    const int year = YearOf(moment + standard_offset_);
    const std::int64_t begin = to_summer_.WallTime(year) - standard_offset_;
    const std::int64_t end = to_standard_.WallTime(year) - summer_offset_;
    if (begin <= end) return moment >= begin && moment < end ? summer : standard;
    return moment >= end && moment < begin ? standard : summer;    // south of the equator
}

// Reads a zone file's bytes from the left; what is beyond the end makes it fail.
class ZoneFileReader {
public:
    explicit ZoneFileReader(std::string_view bytes) : rest_(bytes) {}

    bool Read(ZoneRules* rules) {
        Counts counts{};
        if (!ReadHeader(&counts)) return false;
        if (counts.version >= '2') {
            // The first block has 32-bit times; the second repeats it with 64-bit ones.
            if (!Skip(counts.SizeOfBlock(4)) || !ReadHeader(&counts)) return false;
            return ReadBlock(counts, 8, rules) && ReadFooter(rules);
        }
        return ReadBlock(counts, 4, rules);
    }

private:
    struct Counts {
        char version;
        std::size_t ut, standard, leap, time, type, letter;

        [[nodiscard]] std::size_t SizeOfBlock(std::size_t time_size) const {
            return time * (time_size + 1) + type * 6 + letter + leap * (time_size + 4) + standard + ut;
        }
    };

    bool Skip(std::size_t size) {
        if (size > rest_.size()) return false;
        rest_.remove_prefix(size);
        return true;
    }

    // A number of `size` bytes, most significant first; there must be so many.
    std::int64_t TakeSigned(std::size_t size) {
        std::uint64_t value = static_cast<unsigned char>(rest_[0]) & 0x80 ? ~std::uint64_t{0} : 0;
        for (std::size_t i = 0; i < size; ++i) value = value << 8 | static_cast<unsigned char>(rest_[i]);
        rest_.remove_prefix(size);
        return static_cast<std::int64_t>(value);
    }

    bool ReadHeader(Counts* counts) {
        constexpr std::size_t kLimit = 1 << 20;    // of each count; real files stay below some thousand
        if (rest_.size() < 44 || !rest_.starts_with("TZif")) return false;
        counts->version = rest_[4];
        rest_.remove_prefix(20);
        for (std::size_t* count : {&counts->ut, &counts->standard, &counts->leap, &counts->time, &counts->type,
                                   &counts->letter}) {
            const std::int64_t value = TakeSigned(4);
            if (value < 0 || value > static_cast<std::int64_t>(kLimit)) return false;
            *count = static_cast<std::size_t>(value);
        }
        return counts->type > 0;
    }

    bool ReadBlock(const Counts& counts, std::size_t time_size, ZoneRules* rules) {
        if (rest_.size() < counts.SizeOfBlock(time_size)) return false;
        for (std::size_t i = 0; i < counts.time; ++i) rules->moments_.push_back(TakeSigned(time_size));
        for (std::size_t i = 0; i < counts.time; ++i) {
            rules->types_.push_back(static_cast<std::uint8_t>(rest_[i]));
            if (rules->types_.back() >= counts.type) return false;
        }
        rest_.remove_prefix(counts.time);
        for (std::size_t i = 0; i < counts.type; ++i) {
            const auto offset = static_cast<std::int32_t>(TakeSigned(4));
            const auto abbreviation = static_cast<std::uint8_t>(rest_[1]);
            if (abbreviation >= counts.letter || offset < -100'000 || offset > 100'000) return false;
            rules->all_types_.push_back({offset, abbreviation});
            rest_.remove_prefix(2);
        }
        rules->abbreviations_ = rest_.substr(0, counts.letter);
        rest_.remove_prefix(counts.letter + counts.leap * (time_size + 4) + counts.standard + counts.ut);
        return std::is_sorted(rules->moments_.begin(), rules->moments_.end());
    }

    // "\n<rule text>\n"; the text may be empty.
    bool ReadFooter(ZoneRules* rules) {
        if (rest_.size() < 2 || rest_.front() != '\n' || rest_.back() != '\n') return false;
        rules->after_ = RecurringRules::Parse(rest_.substr(1, rest_.size() - 2));
        return true;
    }

    std::string_view rest_;
};

std::optional<ZoneRules> ZoneRules::FromFile(std::string_view bytes) {
    ZoneRules rules;
    if (!ZoneFileReader(bytes).Read(&rules)) return std::nullopt;
    return rules;
}

std::optional<ZoneRules> ZoneRules::FromText(std::string_view text) {
    ZoneRules rules;
    rules.after_ = RecurringRules::Parse(text);
    if (!rules.after_) return std::nullopt;
    return rules;
}

ZoneState ZoneRules::StateOf(const Type& type) const {
    const std::string_view all = abbreviations_;
    const std::string_view from = all.substr(type.abbreviation);
    return {type.offset, from.substr(0, from.find('\0'))};
}

ZoneState ZoneRules::At(std::int64_t moment) const {
    const auto next = std::upper_bound(moments_.begin(), moments_.end(), moment);
    if (next == moments_.end() && after_) return after_->At(moment);
    if (next == moments_.begin()) return all_types_.empty() ? ZoneState{} : StateOf(all_types_.front());
    return StateOf(all_types_[types_[static_cast<std::size_t>(next - moments_.begin()) - 1]]);
}

ZoneState ZoneRules::AtWallTime(std::int64_t wall) const {
    const ZoneState before = At(wall - kDay), after = At(wall + kDay);
    for (const ZoneState& state : {before, after}) {
        const ZoneState there = At(wall - state.offset);
        if (there.offset == state.offset) return there;
    }
    return before;
}

}  // namespace date
