// The set of living objects, asked directly: what it answers while others write, and how many tables it keeps.
#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <thread>

#include "handles/live.h"

namespace {

const void* Address(std::uintptr_t index) { return reinterpret_cast<const void*>(0x7F00'0000'0000 + index * 16); }

TEST(Live, KnowsWholeAddressesOnly) {
    const CallInFlight call;
    const void* object = Address(1);
    live::Insert(object, Kind::statement);
    EXPECT_EQ(live::KindOf(object), Kind::statement);
    const auto bits = reinterpret_cast<std::uintptr_t>(object);
    for (const std::uintptr_t change : {1ULL, 8ULL, 16ULL, 1ULL << 47, 1ULL << 59, 1ULL << 60, 1ULL << 63})
        EXPECT_EQ(live::KindOf(reinterpret_cast<const void*>(bits ^ change)), Kind::none) << std::hex << change;
    for (const std::uintptr_t odd : {0ULL, 1ULL, ~0ULL, ~0ULL << 4, ~0ULL >> 4, ~0ULL >> 4 << 4})
        EXPECT_EQ(live::KindOf(reinterpret_cast<const void*>(odd)), Kind::none) << std::hex << odd;
    EXPECT_TRUE(live::Is<Kind::statement>(object));
    live::Retype(object, Kind::none);
    EXPECT_FALSE(live::Is<Kind::statement>(object)) << "what was found last is not remembered any more";
    EXPECT_EQ(live::KindOf(object), Kind::none);
    EXPECT_TRUE(live::Contains(object));
    live::Retype(object, Kind::statement);
    EXPECT_TRUE(live::Is<Kind::statement>(object));
    EXPECT_FALSE(live::Is<Kind::statement>(nullptr));
    EXPECT_TRUE(live::Erase(object));
    EXPECT_FALSE(live::Is<Kind::statement>(object));
    EXPECT_FALSE(live::Contains(object));
    EXPECT_FALSE(live::Erase(object));
    live::Retype(object, Kind::statement);
    EXPECT_EQ(live::KindOf(object), Kind::none) << "an object that is gone is nothing new";
}

// Two objects of different kinds that take turns in one slot.
TEST(Live, ASlotThatChangesHandsNeverAnswersTheOthersKind) {
    const void* first = Address(2);
    live::Insert(first, Kind::error);
    const live::Table& table = *live::current.load();
    std::uintptr_t other = 3;
    while (table.Home(live::AddressOf(Address(other))) != table.Home(live::AddressOf(first))) ++other;
    const void* second = Address(other);
    live::Erase(first);
    std::atomic<bool> stop{false};
    std::thread writing([&] {
        while (!stop) {
            live::Insert(first, Kind::error);
            live::Erase(first);
            live::Insert(second, Kind::statement);
            live::Erase(second);
        }
    });
    const auto end = std::chrono::steady_clock::now() + std::chrono::milliseconds(500);
    long wrong = 0;
    while (std::chrono::steady_clock::now() < end) {
        for (int round = 0; round < 1000; ++round) {
            const CallInFlight call;
            const Kind kind = live::KindOf(first);
            wrong += kind != Kind::none && kind != Kind::error;
            wrong += live::Is<Kind::error>(first) && live::Is<Kind::error>(second);
        }
    }
    stop = true;
    writing.join();
    EXPECT_EQ(wrong, 0);
}

// A table that grew leaves the old one behind until no call can be reading it.
TEST(Live, ReplacedTablesAreFreed) {
    constexpr std::uintptr_t kFirst = 1000, kCount = 50'000;
    const live::Table* table = live::current.load();
    std::atomic<bool> stop{false};
    int replaced = 0;
    for (const bool beside : {false, true}) {
        std::thread looking([&] {
            while (beside && !stop) {
                const CallInFlight call;
                for (std::uintptr_t index = kFirst; index < kFirst + 10; ++index) live::KindOf(Address(index));
            }
        });
        std::size_t most = 0;
        for (std::uintptr_t index = 0; index < kCount; ++index) {
            const CallInFlight call;
            live::Insert(Address(kFirst + index + beside * kCount), Kind::raw);
            replaced += live::current.load() != table;
            table = live::current.load();
            if (!beside) most = std::max(most, live::TableCount());
        }
        EXPECT_LE(most, 2u);
        stop = true;
        looking.join();
    }
    EXPECT_GE(replaced, 7);
    for (std::uintptr_t index = 0; index < 2 * kCount; ++index) {
        const CallInFlight call;
        ASSERT_EQ(live::KindOf(Address(kFirst + index)), Kind::raw) << index;
        ASSERT_TRUE(live::Erase(Address(kFirst + index)));
    }
}

}  // namespace
