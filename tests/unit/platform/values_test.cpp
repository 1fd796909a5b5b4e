// Packed decimal, tagged memory, message texts.
#include <gtest/gtest.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <limits>
#include <string>
#include <vector>

#include "platform/memory.h"
#include "platform/message_catalogue.h"
#include "platform/message_texts.h"
#include "platform/packed_decimal.h"

namespace {

TEST(PackedDecimal, ToTextOfEveryCapacity) {
    const std::string whole = "-123.45";
    for (std::size_t capacity = 0; capacity < 10; ++capacity) {
        std::vector<char> area(capacity, '?');
        const unsigned char packed[] = {0x12, 0x34, 0x5D};
        const int result = DecimalToText(packed, 5, 2, area.data(), capacity);
        EXPECT_EQ(result, capacity > whole.size() ? kDecimalDone : kDecimalTooShort) << capacity;
        const std::string text = capacity == 0 ? "" : area.data();
        EXPECT_EQ(text, whole.substr(0, capacity == 0 ? 0 : capacity - 1));
    }
}

TEST(Memory, BlocksAreCountedByTagAndFilledWithZeros) {
    auto* block = static_cast<char*>(PlatformAlloc(100, "one", 11));
    void* other = PlatformAlloc(0, "two", 12);
    EXPECT_EQ(std::string(block, 100), std::string(100, '\0'));
    EXPECT_NE(other, nullptr);
    EXPECT_EQ(PlatformOutstanding("one"), 1u);
    EXPECT_EQ(PlatformOutstanding("two"), 1u);
    PlatformVisit("one", [](const PlatformBlock& seen, void* expected) {
        EXPECT_EQ(seen.pointer, expected);
        EXPECT_EQ(seen.size, 100u);
        EXPECT_EQ(seen.line, 11);
    }, block);
    EXPECT_TRUE(PlatformFree(block, std::string("one").c_str()));
    EXPECT_TRUE(PlatformFree(other, "two"));
    EXPECT_EQ(PlatformOutstanding("one") + PlatformOutstanding("two"), 0u);
}

TEST(Memory, RefusesWhatItDidNotGiveOut) {
    char local = 0;
    char* block = static_cast<char*>(PlatformAlloc(8, "tag", 1));
    EXPECT_FALSE(PlatformFree(nullptr, "tag"));
    EXPECT_FALSE(PlatformFree(&local, "tag"));
    EXPECT_FALSE(PlatformFree(block + 1, "tag"));
    EXPECT_FALSE(PlatformFree(reinterpret_cast<void*>(16), "tag"));
    EXPECT_FALSE(PlatformFree(block, "gat"));
    EXPECT_TRUE(PlatformFree(block, "tag"));
    EXPECT_FALSE(PlatformFree(block, "tag"));
    EXPECT_EQ(PlatformAlloc(std::numeric_limits<std::size_t>::max(), "tag", 1), nullptr);
    EXPECT_EQ(PlatformOutstanding("tag"), 0u);
}

TEST(MessageTexts, OfDiagnosticsInLines) {
    SQLCA diagnostics{};
    diagnostics.sqlcode = -1017;
    const char* catalogue = "kelpsql.mo";
    const auto text = [&](std::size_t width, std::size_t capacity = 100) {
        std::vector<char> area(capacity);
        return std::string(area.data(), SqlcaMessageText(area.data(), capacity, width, catalogue, diagnostics));
    };
    EXPECT_EQ(text(80), "ORA-01017: invalid user name or password; logon denied");
    const std::string words = "by the server ";
    words.copy(diagnostics.sqlerrmc, words.size());
    diagnostics.sqlerrml = static_cast<sb2>(words.size());
    EXPECT_EQ(text(80), "ORA-01017: invalid user name or password; logon denied: by the server");
    diagnostics.sqlerrml = 32767;
    EXPECT_EQ(text(12), "ORA-01017:\ninvalid user\nname or\npassword;\nlogon\ndenied: by\nthe server");
    EXPECT_EQ(text(4, 30), "ORA-\n0101\n7:\ninva\nlid\nuser\nna");
    EXPECT_EQ(text(0, 4), "O\nR");
    EXPECT_EQ(text(80, 0), "");
    catalogue = "./no such catalogue";
    EXPECT_EQ(text(80), "ORA-01017: by the server");
    diagnostics.sqlerrml = -1;
    EXPECT_EQ(text(80), "ORA-01017");
    diagnostics.sqlcode = 0;
    EXPECT_EQ(text(80), "");
}

TEST(MessageTexts, OfSqlstates) {
    const struct { const char* code; const char* text; } cases[] = {
        {"40001", "40001: transaction rollback: serialization failure"}, {"40003", "40003: transaction rollback"},
        {"28000xyz", "28000: invalid authorization"}, {"HY000", "HY000: general error"}, {"00000", ""}, {"28", ""},
        {"ZZ000", ""}, {"", ""}};
    for (const auto& c : cases) {
        char area[100];
        const std::size_t length = SqlstateMessageText(area, sizeof area, 80, "kelpsql.mo", c.code);
        EXPECT_EQ(std::string(area, length), c.text) << c.code;
    }
}

// Whatever is damaged: nothing beyond the bytes is read, and what is whole is found.
TEST(MessageTexts, OfADamagedCatalogue) {
    const std::filesystem::path path = std::filesystem::temp_directory_path() / ("kelpsql." + std::to_string(getpid()));
    std::ifstream source(std::filesystem::read_symlink("/proc/self/exe").parent_path() / "../share/kelpsql.mo");
    const std::string whole((std::istreambuf_iterator<char>(source)), {});
    ASSERT_GT(whole.size(), 1000u);
    const auto found = [&](const std::string& bytes) {
        std::ofstream(path, std::ios::binary) << bytes;
        return std::string(MessageCatalogue(path.string()).Find("ORA-00001"));
    };
    EXPECT_EQ(found(whole), "unique constraint violated");
    for (const std::size_t length : {0u, 3u, 27u, 28u, 40u, 1000u}) EXPECT_EQ(found(whole.substr(0, length)), "") << length;
    for (std::size_t place = 0; place < 52; place += 4) {
        std::string damaged = whole;
        damaged.replace(place, 4, "\xFF\xFF\xFF\xFF");
        const std::string text = found(damaged);
        EXPECT_TRUE(text.empty() || whole.find(text) != whole.npos) << place;
    }
    std::filesystem::remove(path);
}

}  // namespace
