// Packed decimal, numbers from text, tagged memory, message texts.
#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <limits>
#include <string>
#include <vector>

#include "platform/memory.h"
#include "platform/message_catalogue.h"
#include "platform/message_texts.h"
#include "platform/numbers.h"
#include "platform/packed_decimal.h"

namespace {

using namespace std::string_literals;

TEST(PackedDecimal, FromTextTellsWhatIsWrong) {
    const struct { const char* text; int result; } cases[] = {{"1000", kDecimalOverflow}, {"999.995", kDecimalOverflow},
        {"", kDecimalBadText}, {"12x", kDecimalBadText}, {nullptr, kDecimalBadText}};
    for (const auto& c : cases) {
        unsigned char packed[3] = {1, 2, 3};
        EXPECT_EQ(TextToDecimal(c.text, packed, 5, 2), c.result) << (c.text ? c.text : "null");
        EXPECT_EQ(packed[0], 1);
    }
}

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

TEST(Numbers, RulesOfAtoiAndBeyondTheRange) {
    const struct { const char* text; std::int64_t i; std::uint64_t u; } cases[] = {
        {"42", 42, 42}, {" \t-7x", -7, 0xFFFFFFFFFFFFFFF9}, {"+3", 3, 3}, {"x", 0, 0}, {"", 0, 0}, {nullptr, 0, 0},
        {"0x10", 0, 0}, {"010", 10, 10}, {"2147483648", 2147483648, 2147483648},
        {"-2147483649", -2147483649, 0xFFFFFFFF7FFFFFFF}, {"18446744073709551615", INT64_MAX, UINT64_MAX},
        {"99999999999999999999", INT64_MAX, UINT64_MAX}, {"-99999999999999999999", INT64_MIN, UINT64_MAX}};
    for (const auto& c : cases) {
        EXPECT_EQ(StrToInt64(c.text), c.i) << (c.text ? c.text : "null");
        EXPECT_EQ(StrToUint64(c.text), c.u) << (c.text ? c.text : "null");
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
        {"28000xyz", "28000: invalid authorization"}, {"00000", ""}, {"28", ""}, {"ZZ000", ""}, {"", ""}};
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

std::string Hex(const void* bytes, std::size_t size) {
    std::string hex;
    for (std::size_t index = 0; index < size; ++index) {
        char pair[3];
        std::snprintf(pair, sizeof pair, "%02X", static_cast<const unsigned char*>(bytes)[index]);
        hex += pair;
    }
    return hex;
}

TEST(PackedDecimal, DigitsOfTheBytes) {
    const struct { std::string packed; std::size_t room; int result; bool negative; const char* digits; } cases[] = {
        {"\x12\x34\x5D", 5, kDecimalDone, true, "12345"}, {"\x12\x34\x5B", 5, kDecimalDone, true, "12345"},
        {"\x12\x34\x5C", 5, kDecimalDone, false, "12345"}, {"\x12\x34\x5A", 5, kDecimalDone, false, "12345"},
        {"\x12\x34\x5E", 5, kDecimalDone, false, "12345"}, {"\x12\x34\x5F", 5, kDecimalDone, false, "12345"},
        {"\x00\x00\x7C"s, 1, kDecimalDone, false, "7"}, {"\x00\x0D"s, 1, kDecimalDone, true, ""},
        {"\x12\x34\x5C", 4, kDecimalTooShort, false, "1234"}, {"\x12\x34\x59", 5, kDecimalBadSign, false, ""},
        {"\x1A\x34\x5C", 5, kDecimalBadDigit, false, "1"}};
    for (const auto& c : cases) {
        char digits[16] = {};
        bool negative = false;
        std::size_t count = 99;
        EXPECT_EQ(ReadPackedDecimal(c.packed.data(), c.packed.size(), &negative, digits, c.room, &count), c.result)
            << Hex(c.packed.data(), c.packed.size());
        EXPECT_EQ(std::string(digits, count), c.digits) << Hex(c.packed.data(), c.packed.size());
        EXPECT_EQ(negative, c.negative) << Hex(c.packed.data(), c.packed.size());
    }
}

}  // namespace
