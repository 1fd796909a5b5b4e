// Zones of values: parsing what names one, the regions read so far, and comparing across zones.
#include "date/zone.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <cstdlib>
#include <ctime>
#include <map>
#include <memory>
#include <mutex>
#include <new>
#include <shared_mutex>
#include <string>
#include <vector>

#include "platform/letters.h"
#include "date/zone_rules.h"
#include "handles/errors.h"

namespace date {
namespace {

constexpr const char* kZoneDirectory = "/usr/share/zoneinfo/";
constexpr const char* kLocalZone = "/etc/localtime";
constexpr std::size_t kMaxFile = 1 << 20;

class Descriptor {
public:
    explicit Descriptor(const char* path) : number_(open(path, O_RDONLY | O_CLOEXEC | O_NONBLOCK)) {}
    ~Descriptor() {
        if (number_ >= 0) close(number_);
    }
    Descriptor(const Descriptor&) = delete;
    Descriptor& operator=(const Descriptor&) = delete;
    operator int() const { return number_; }

private:
    int number_;
};

// False when there is no such file, or none that may be read; what is short for the moment is thrown as bad_alloc, lest
// a zone seem unknown.
bool ReadRegularFile(const std::string& path, std::string* bytes) {
    const Descriptor file(path.c_str());
    if (file < 0) {
        if (errno == ENOMEM || errno == EMFILE || errno == ENFILE) throw std::bad_alloc();
        return false;
    }
    struct stat status {};
    if (fstat(file, &status) != 0 || !S_ISREG(status.st_mode)) return false;
    if (status.st_size < 0 || static_cast<std::size_t>(status.st_size) > kMaxFile) return false;
    bytes->resize(static_cast<std::size_t>(status.st_size));
    std::size_t length = 0;
    while (length < bytes->size()) {
        const ssize_t count = read(file, bytes->data() + length, bytes->size() - length);
        if (count < 0 && errno == EINTR) continue;
        if (count <= 0) return false;
        length += static_cast<std::size_t>(count);
    }
    return true;
}

std::optional<ZoneRules> LoadFile(const std::string& path) {
    std::string bytes;
    if (!ReadRegularFile(path, &bytes)) return std::nullopt;
    return ZoneRules::FromFile(bytes);
}

// A name of letters, digits, + - _ in parts that do not begin with anything else, so that no path leads elsewhere.
bool IsRegionName(std::string_view name) {
    if (name.size() > 64) return false;
    bool part_start = true;
    for (const char c : name) {
        if (c == '/' ? part_start : !letters::IsLetter(c) && !letters::IsDigit(c) && c != '+' && c != '-' && c != '_') return false;
        part_start = c == '/';
    }
    return !name.empty() && !part_start;
}

struct Region {
    std::string name;
    ZoneRules rules;
};

// Regions are added and never go, so that a value's number stays good and views of names stay valid.
class Regions {
public:
    // 0: unknown.
    std::uint16_t Find(std::string_view name) {
        if (!IsRegionName(name)) return 0;
        {
            const std::shared_lock lock(mutex_);
            if (const auto found = numbers_.find(name); found != numbers_.end()) return found->second;
        }
        std::optional<ZoneRules> rules = LoadFile(kZoneDirectory + std::string(name));
        if (!rules) return 0;
        const std::unique_lock lock(mutex_);
        if (const auto found = numbers_.find(name); found != numbers_.end()) return found->second;
        if (all_.size() >= UINT16_MAX) return 0;
        // Both lists or none, should memory run out.
        auto region = std::make_unique<Region>(Region{std::string(name), std::move(*rules)});
        const auto number = static_cast<std::uint16_t>(all_.size() + 1);
        all_.reserve(number);
        numbers_.emplace(name, number);
        all_.push_back(std::move(region));
        return number;
    }

    const Region* Get(std::uint16_t number) {
        const std::shared_lock lock(mutex_);
        return number == 0 ? nullptr : all_[number - 1U].get();
    }

private:
    std::shared_mutex mutex_;
    std::map<std::string, std::uint16_t, std::less<>> numbers_;
    std::vector<std::unique_ptr<Region>> all_;
};

// Never destroyed, as threads may still ask while the process ends; so made in place.
template <class T> T& Immortal() {
    alignas(T) static unsigned char place[sizeof(T)];
    static T* const object = new (place) T;
    return *object;
}

Regions& TheRegions() { return Immortal<Regions>(); }

// What TZ names, else the system's zone, else Greenwich.
ZoneRules LoadProcessZone() {
    const char* variable = std::getenv("TZ");
    std::optional<ZoneRules> rules;
    if (!variable) {
        rules = LoadFile(kLocalZone);
    } else {
        std::string_view name = variable;
        if (name.starts_with(':')) name.remove_prefix(1);
        if (name.starts_with('/')) rules = LoadFile(std::string(name));
        else if (IsRegionName(name)) rules = LoadFile(kZoneDirectory + std::string(name));
        if (!rules) rules = ZoneRules::FromText(name);
    }
    return rules ? std::move(*rules) : ZoneRules();
}

// The zone of the process, read at the first question that finds the memory for it.
class LocalZone {
public:
    const ZoneRules& Rules() {
        if (!known_.load(std::memory_order_acquire)) Read();
        return rules_;
    }

private:
    void Read() {
        const std::lock_guard lock(mutex_);
        if (known_.load(std::memory_order_relaxed)) return;
        rules_ = LoadProcessZone();
        known_.store(true, std::memory_order_release);
    }

    std::mutex mutex_;
    std::atomic<bool> known_ = false;
    ZoneRules rules_;
};

const ZoneRules& ProcessZone() { return Immortal<LocalZone>().Rules(); }

// What may read the zone of the process ends here where memory is short.
template <class Body> Errno Guarded(Body body) noexcept {
    try {
        return body();
    } catch (const std::bad_alloc&) {
        return errors::kOutOfMemory;
    }
}

int SecondOfDay(const DateTime& value) { return (value.hour * 60 + value.minute) * 60 + value.second; }

std::int64_t WallSeconds(const DateTime& value) {
    return (ToDayNumber(value) - kEpochDay) * std::int64_t{86400} + SecondOfDay(value);
}

// Offsets are kept in minutes; before 1900 zones had seconds, which are rounded.
int OffsetMinutes(const ZoneState& state) { return (state.offset + (state.offset < 0 ? -30 : 30)) / 60; }

void SetOffset(int minutes, std::uint16_t region, DateTime* value) {
    value->has_zone = true;
    value->zone_minutes = static_cast<std::int16_t>(minutes);
    value->region = region;
}

// The offset in force in a zone at a value's local time; that of today for a time without a date.
int OffsetAt(const ZoneRules& rules, const DateTime& value) {
    return OffsetMinutes(value.month == 0 ? rules.At(std::time(nullptr)) : rules.AtWallTime(WallSeconds(value)));
}

std::int64_t MomentSeconds(const DateTime& value) {
    const int minutes = value.has_zone ? value.zone_minutes : OffsetAt(ProcessZone(), value);
    return WallSeconds(value) - minutes * std::int64_t{60};
}

Errno MoveSeconds(std::int64_t seconds, DateTime* value) {
    seconds += SecondOfDay(*value);
    const std::int64_t second_of_day = (seconds % 86400 + 86400) % 86400;
    if (const Errno number = AddDays(*value, (seconds - second_of_day) / 86400, value)) return number;
    value->hour = static_cast<std::uint8_t>(second_of_day / 3600);
    value->minute = static_cast<std::uint8_t>(second_of_day / 60 % 60);
    value->second = static_cast<std::uint8_t>(second_of_day % 60);
    return 0;
}

Errno SetWrittenOffset(std::string_view text, DateTime* value) {
    const bool west = text.front() == '-';
    text.remove_prefix(1);
    int hours = 0, minutes = 0;
    if (letters::TakeDigits(text, 2, &hours) == 0) return errors::kNoZone;
    if (text.starts_with(':')) {
        text.remove_prefix(1);
        if (letters::TakeDigits(text, 2, &minutes) == 0) return errors::kNoZone;
    }
    return text.empty() ? SetOffset(west, hours, minutes, value) : errors::kNoZone;
}

Errno SetRegion(std::string_view name, DateTime* value) {
    const std::uint16_t number = TheRegions().Find(name);
    if (number == 0) return errors::kNoSuchZone;
    SetOffset(OffsetAt(TheRegions().Get(number)->rules, *value), number, value);
    return 0;
}

}  // namespace

Errno SetOffset(bool west, int hours, int minutes, DateTime* value) noexcept {
    const int furthest = west ? 12 : 14;
    if (hours > furthest) return errors::kBadZoneHour;
    if (minutes > 59) return errors::kBadZoneMinute;
    if (hours == furthest && minutes > 0) return errors::kBadZoneHour;
    SetOffset((west ? -1 : 1) * (hours * 60 + minutes), 0, value);
    return 0;
}

Errno SetZone(std::string_view zone, DateTime* value) noexcept {
    return Guarded([&]() -> Errno {
        if (zone.empty()) {
            SetOffset(OffsetAt(ProcessZone(), *value), 0, value);
            return 0;
        }
        return zone.front() == '+' || zone.front() == '-' ? SetWrittenOffset(zone, value) : SetRegion(zone, value);
    });
}

std::string_view RegionName(const DateTime& value) noexcept {
    const Region* region = TheRegions().Get(value.region);
    return region ? std::string_view(region->name) : std::string_view();
}

std::string_view ZoneAbbreviation(const DateTime& value) noexcept {
    const Region* region = TheRegions().Get(value.region);
    if (!region) return {};
    return region->rules.At(value.month == 0 ? std::time(nullptr) : MomentSeconds(value)).abbreviation;
}

Errno CompareMoments(const DateTime& left, const DateTime& right, int* order) noexcept {
    return Guarded([&]() -> Errno {
        if (!left.has_zone && !right.has_zone) {
            *order = Compare(left, right);
            return 0;
        }
        const std::pair one(MomentSeconds(left), left.nanosecond), other(MomentSeconds(right), right.nanosecond);
        *order = (one > other) - (one < other);
        return 0;
    });
}

Errno ToOffset(const DateTime& value, int zone_minutes, DateTime* result) noexcept {
    return Guarded([&]() -> Errno {
        DateTime moved = value;
        const std::int64_t wall = MomentSeconds(value) + zone_minutes * std::int64_t{60};
        if (const Errno number = MoveSeconds(wall - WallSeconds(value), &moved)) return number;
        SetOffset(zone_minutes, 0, &moved);
        *result = moved;
        return 0;
    });
}

Errno ToLocal(const DateTime& value, DateTime* result) noexcept {
    return Guarded(
        [&] { return ToOffset(value, OffsetMinutes(ProcessZone().At(MomentSeconds(value))), result); });
}

Errno MoveMoment(const DateTime& value, std::int64_t seconds, DateTime* result) noexcept {
    if (value.month == 0) return errors::kNoSuchField;
    DateTime moved = value;
    if (const Errno number = MoveSeconds(seconds, &moved)) return number;
    if (const Region* region = TheRegions().Get(value.region)) {
        const int minutes = OffsetMinutes(region->rules.At(MomentSeconds(value) + seconds));
        if (const Errno number = MoveSeconds((minutes - value.zone_minutes) * 60, &moved)) return number;
        moved.zone_minutes = static_cast<std::int16_t>(minutes);
    }
    *result = moved;
    return 0;
}

Errno SecondsBetween(const DateTime& left, const DateTime& right, std::int64_t* seconds) noexcept {
    if (left.month == 0 || right.month == 0) return errors::kNoSuchField;
    return Guarded([&]() -> Errno {
        const bool plain = !left.has_zone && !right.has_zone;
        *seconds = plain ? WallSeconds(left) - WallSeconds(right) : MomentSeconds(left) - MomentSeconds(right);
        return 0;
    });
}

Errno Now(DateTime* result) noexcept {
    timespec now{};
    clock_gettime(CLOCK_REALTIME, &now);
    DateTime value{.year = 1970, .month = 1, .day = 1, .nanosecond = static_cast<std::uint32_t>(now.tv_nsec)};
    const Errno number =
        Guarded([&] { return MoveSeconds(now.tv_sec + ProcessZone().At(now.tv_sec).offset, &value); });
    if (!number) *result = value;
    return number;
}

}  // namespace date
