// Time zones: offsets, regions, comparing.
#include <gtest/gtest.h>
#include <sys/resource.h>

#include <cstdlib>
#include <ctime>
#include <fstream>
#include <random>
#include <sstream>

#include "date/zone.h"
#include "date/zone_rules.h"

namespace {

using namespace date;

DateTime Read(std::string_view text) {
    DateTime value;
    EXPECT_EQ(FromEngineText(text, &value), 0) << text;
    return value;
}

TEST(Zone, RegionsNameTheirSeasons) {
    const struct { const char* value; const char* region; const char* name; } cases[] = {
        {"2024-01-15 12:00:00", "Europe/Paris", "CET"}, {"2024-07-15 12:00:00", "Europe/Paris", "CEST"},
        {"2024-10-27 02:30:00", "Europe/Paris", "CEST"}, {"2099-07-15 12:00:00", "America/New_York", "EDT"},
        {"1890-01-15 12:00:00", "Europe/Berlin", "LMT"}, {"2024-01-15 12:00:00", "Etc/GMT+5", "-05"}};
    for (const auto& c : cases) {
        DateTime value = Read(c.value);
        ASSERT_EQ(SetZone(c.region, &value), 0) << c.region;
        EXPECT_EQ(RegionName(value), c.region);
        EXPECT_EQ(ZoneAbbreviation(value), c.name) << c.value << ' ' << c.region;
    }
    DateTime value = Read("2024-01-01");
    EXPECT_EQ(SetZone(std::string(100000, 'x'), &value), 1882);
    rlimit files{};
    getrlimit(RLIMIT_NOFILE, &files);
    const rlimit none{0, files.rlim_max};
    setrlimit(RLIMIT_NOFILE, &none);
    EXPECT_EQ(SetZone("Asia/Tokyo", &value), 1019) << "no file can be opened for the moment";
    setrlimit(RLIMIT_NOFILE, &files);
    EXPECT_EQ(SetZone("Asia/Tokyo", &value), 0);
}

TEST(Zone, TheClockIsThatOfTheProcess) {
    const std::time_t before = std::time(nullptr);
    DateTime now;
    ASSERT_EQ(Now(&now), 0);
    EXPECT_EQ(Validate(now), 0);
    std::tm shown{};
    shown.tm_year = now.year - 1900, shown.tm_mon = now.month - 1, shown.tm_mday = now.day;
    shown.tm_hour = now.hour, shown.tm_min = now.minute, shown.tm_sec = now.second, shown.tm_isdst = -1;
    EXPECT_GE(std::mktime(&shown), before);
    EXPECT_LE(std::mktime(&shown), std::time(nullptr) + 1) << "that clock ticks slowly";
}

std::string FileBytes(const std::string& path) {
    std::ifstream file(path, std::ios::binary);
    std::ostringstream bytes;
    bytes << file.rdbuf();
    return bytes.str();
}

// The C library reads the same files.
TEST(ZoneRules, AgreeWithTheCLibrary) {
    std::mt19937_64 random(1582);
    for (const char* name : {"Europe/Paris", "America/St_Johns", "Australia/Lord_Howe", "Africa/Casablanca",
                             "Asia/Kathmandu", "America/Asuncion", "Pacific/Apia", "Europe/Dublin", "EST5EDT"}) {
        const auto rules = ZoneRules::FromFile(FileBytes(std::string("/usr/share/zoneinfo/") + name));
        ASSERT_TRUE(rules) << name;
        setenv("TZ", (std::string(":") + name).c_str(), 1);
        tzset();
        for (int i = 0; i < 2000; ++i) {
            const auto moment = static_cast<std::time_t>(random() % 10'000'000'000) - 3'000'000'000;    // 1874 to 2191
            std::tm local{};
            localtime_r(&moment, &local);
            const ZoneState state = rules->At(moment);
            ASSERT_EQ(state.offset, local.tm_gmtoff) << name << ' ' << moment;
            ASSERT_EQ(state.abbreviation, local.tm_zone) << name << ' ' << moment;
        }
    }
    unsetenv("TZ");
    tzset();
}

TEST(ZoneRules, TextsOfRules) {
    const struct { const char* text; std::int64_t moment; int offset; const char* name; } cases[] = {
        {"UTC0", 0, 0, "UTC"}, {"LMT-0:20:59", 0, 1259, "LMT"}, {"XXX+3:59", 0, -14340, "XXX"}, {"<+0330>-3:30", 0, 12600, "+0330"},
        {"CET-1CEST,M3.5.0,M10.5.0/3", 1711846799, 3600, "CET"},
        {"CET-1CEST,M3.5.0,M10.5.0/3", 1711846800, 7200, "CEST"}, {"EST5EDT", 1710054000, -14400, "EDT"},
        {"AEST-10AEDT,M10.1.0,M4.1.0/3", 1704067200, 39600, "AEDT"},
        {"XXX3YYY2,J59/0,300/0", 1709089199, -10800, "XXX"},  // J59 is 28 February, in leap years too
        {"XXX3YYY2,J59/0,300/0", 1709089200, -7200, "YYY"}, {"XXX-10YYY,J1/0:15,J100", 1704033000, 39600, "YYY"},
        {"XXX3YYY2,59/0,300/0", 1709175599, -10800, "XXX"},   // 59 is 29 February in leap years
        {"XXX3YYY2,59/0,300/0", 1709175600, -7200, "YYY"}, {"XXX3YYY2,M2.5.6/0,M10.5.6/0", 1708743600, -7200, "YYY"},
        {"XXX3YYY2,J60/0,300/0", 1709218800, -10800, "XXX"},  // J60 is 1 March in leap years, too
        {"XXX3YYY2,J60/0,300/0", 1709262000, -7200, "YYY"}, {"XXX0YYY-1,J365/18,100", 1735650000, 0, "XXX"}, {"XXX167", 0, -601200, "XXX"},
        {"AEST-10AEDT,M10.1.0,M4.1.0/3", 1728144000, 39600, "AEDT"}, {"XXX3YYY2,M1.1.0/0,M12.1.0/0", 1704596400, -7200, "YYY"},
        {"XXX3YYY2,1/1,1/2", 90000, -10800, "XXX"},           // ends as it begins
    };
    for (const auto& c : cases) {
        const auto rules = ZoneRules::FromText(c.text);
        ASSERT_TRUE(rules) << c.text;
        EXPECT_EQ(rules->At(c.moment).offset, c.offset) << c.text;
        EXPECT_EQ(rules->At(c.moment).abbreviation, c.name) << c.text;
    }
    for (const char* text : {"", "UTC", "5", "CET-1CEST,", "CET-1CEST,M3.5.0", "CET-1CEST,M3.5.0,M10.5.0x", "CET-1CEST,M13.5.0,M10.5.0",
                             "CET-1CEST,M3.6.0,M10.5.0", "CET-1CEST,M3.6,M10.5.0", "CET-1CEST,M3.0.0,M10.5.0",
                             "CET-1CEST,M3..0,M10.5.0", "CET-1CEST,M3.5,M10.5.0", "XXX168", "LMT0:", "CET-1CEST,M0.5.0,M10.5.0", "CET-1CEST,M3.5.7,M10.5.0", "CET-1CEST,366,M10.5.0",
                             "CET-1CEST,J366,M10.5.0", "<CET-1", "CET-999", "UTC0x", "LMT0:60", "LMT0:0:60", "LMT0:0:"}) {
        EXPECT_FALSE(ZoneRules::FromText(text)) << text;
    }
}

// Files of two types and one change, each wrong by as little as can be.
TEST(ZoneRules, SmallFiles) {
    const struct { std::uint8_t index, letter; std::int32_t offset; bool read; } cases[] = {
        {1, 0, 3600, true}, {2, 0, 3600, false}, {1, 3, 3600, true}, {1, 4, 3600, false}, {1, 0, 100000, true},
        {1, 0, 100001, false}, {1, 0, -100000, true}, {1, 0, -100001, false}, {1, 0, 0xFFFFFF, false}};
    for (const auto& c : cases) {
        std::string bytes = "TZif" + std::string(16, '\0');
        const auto put = [&](std::int32_t number) {
            for (int shift = 24; shift >= 0; shift -= 8) bytes += static_cast<char>(number >> shift);
        };
        for (const int count : {0, 0, 0, 1, 2, 4}) put(count);
        put(-1000);
        bytes += static_cast<char>(c.index);
        put(60);
        bytes += {'\0', '\0'};
        put(c.offset);
        bytes += {'\0', static_cast<char>(c.letter), 'A', 'B', 'C', '\0'};
        const auto rules = ZoneRules::FromFile(bytes);
        ASSERT_EQ(rules.has_value(), c.read) << c.offset << ' ' << int{c.letter};
        if (!rules) continue;
        EXPECT_EQ(rules->At(-1000).offset, c.offset);
        EXPECT_EQ(rules->At(-1000).abbreviation, c.letter ? "" : "ABC");
        EXPECT_EQ(rules->At(-1001).offset, 60);
        EXPECT_FALSE(ZoneRules::FromFile(bytes.substr(0, bytes.size() - 1)));
    }
    EXPECT_FALSE(ZoneRules::FromFile("TZif" + std::string(40, '\0'))) << "without types";
}

// A process reads its zone once, so that each has a process of its own.
TEST(ZoneDeath, TheProcessHasTheZoneThatTzNames) {
    GTEST_FLAG_SET(death_test_style, "threadsafe");
    const struct { const char* variable; int minutes; } cases[] = {
        {"Asia/Kolkata", 330}, {":Asia/Kolkata", 330}, {"/usr/share/zoneinfo/Asia/Tokyo", 540}, {"XXX-3", 180},
        {":XXX3:30", -210}, {"Atlantis/Nowhere", 0}, {"../zoneinfo/Asia/Tokyo", 0}, {"", 0}};
    for (const auto& c : cases) {
        EXPECT_EXIT({
            setenv("TZ", c.variable, 1);
            DateTime value = Read("2024-01-01");
            std::int64_t seconds = 0;    // from what has no zone to midnight at Greenwich
            const Errno number = SecondsBetween(Read("2024-01-01 00:00:00 +00:00"), value, &seconds);
            std::exit(number == 0 && seconds == c.minutes * 60 && SetZone({}, &value) == 0 && value.zone_minutes == c.minutes ? 0 : 1);
        }, testing::ExitedWithCode(0), "") << c.variable;
    }
}

// Bytes flipped and files cut short: refused or read, without harm.
TEST(ZoneRules, DamagedFiles) {
    const std::string good = FileBytes("/usr/share/zoneinfo/Europe/Paris");
    EXPECT_FALSE(ZoneRules::FromFile(std::string(good).replace(good.rfind('\n', good.size() - 2), 1, " ")));
    for (std::size_t length = 0; length < good.size(); ++length)
        EXPECT_FALSE(ZoneRules::FromFile(good.substr(0, length))) << length;
    std::mt19937 random(1);
    for (int i = 0; i < 3000; ++i) {
        std::string bad = good;
        for (int n = 0; n < 3; ++n) bad[random() % (i % 2 ? 100 : bad.size())] = static_cast<char>(random());
        if (const auto rules = ZoneRules::FromFile(bad)) (void)rules->AtWallTime(1'700'000'000);
    }
}

}  // namespace
