// Packed decimal, decimal floats, numbers from text, tagged memory, message texts.
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

#include "platform/decimal_float.h"
#include "platform/memory.h"
#include "platform/message_catalogue.h"
#include "platform/message_texts.h"
#include "platform/numbers.h"
#include "platform/packed_decimal.h"

namespace {

using namespace std::string_literals;

TEST(PackedDecimal, ToText) {
    const struct { std::string packed; unsigned precision; int scale; const char* text; int result; } cases[] = {
        {"\x12\x34\x5D", 5, 2, "-123.45", 0}, {"\x12\x34\x0D", 5, 2, "-123.40", 0}, {"\x12\x34\x5C", 5, 0, "12345", 0},
        {"\x00\x00\x0D"s, 5, 2, "0.00", 0},
        {"\x00\x00\x5B"s, 5, 2, "-0.05", 0}, {"\x01\x2F", 2, 2, "0.12", 0}, {"\x01\x2A", 2, 4, "0.0012", 0},
        {"\x12\x3E", 3, 3, "0.123", 0}, {"\x12\x3C", 3, -2, "12300", 0}, {"\x00\x0C"s, 3, -2, "0", 0},
        {"\x7C", 1, 0, "7", 0}, {"\xC", 0, 0, "0", 0}, {"\x12\x34\x59", 5, 2, "", kDecimalBadSign},
        {"\x1A\x34\x5C", 5, 2, "1", kDecimalBadDigit}, {"\x12\x34\xBC", 5, 2, "123.4", kDecimalBadDigit}};
    for (const auto& c : cases) {
        char text[64] = "?";
        const auto* packed = reinterpret_cast<const unsigned char*>(c.packed.data());
        EXPECT_EQ(DecimalToText(packed, c.precision, c.scale, text, sizeof text), c.result) << c.text;
        EXPECT_STREQ(text, c.text);
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

TEST(PackedDecimal, FromText) {
    const struct { const char* text; unsigned precision; int scale; std::string packed; } cases[] = {
        {"-123.45", 5, 2, "\x12\x34\x5D"}, {"\t+1.5 ", 5, 2, "\x00\x15\x0C"s}, {"1.5", 1, 0, "\x2C"}, {"0.0", 5, 2, "\x00\x00\x0C"s},
        {"-0", 5, 2, "\x00\x00\x0C"s}, {"1.005", 3, 2, "\x10\x1C"}, {"-1.0049", 3, 2, "\x10\x0D"},
        {"9.995", 4, 2, "\x01\x00\x0C"s}, {".5", 1, 0, "\x1C"}, {"0.04", 1, 1, "\x0C"}, {"-0.04", 1, 1, "\x0C"},
        {"0.004", 1, 1, "\x0C"}, {"12e2", 4, 0, "\x01\x20\x0C"s}, {"1234e-2", 4, 2, "\x01\x23\x4C"},
        {"1e-999999999999", 3, 2, "\x00\x0C"s}, {"12345", 3, -2, "\x12\x3C"}, {"000000123", 3, 0, "\x12\x3C"},
        {"0e999999", 3, 0, "\x00\x0C"s}};
    for (const auto& c : cases) {
        std::string packed(PackedDecimalSize(c.precision), '?');
        auto* area = reinterpret_cast<unsigned char*>(packed.data());
        EXPECT_EQ(TextToDecimal(c.text, area, c.precision, c.scale), kDecimalDone) << c.text;
        EXPECT_EQ(packed, c.packed) << c.text;
    }
    const struct { const char* text; unsigned precision; int scale; int result; } refused[] = {
        {"1000", 5, 2, kDecimalOverflow}, {"999.995", 5, 2, kDecimalOverflow}, {"1e9999999999", 5, 2, kDecimalOverflow},
        {"", 5, 2, kDecimalBadText}, {".", 5, 2, kDecimalBadText}, {"1.2.3", 5, 2, kDecimalBadText},
        {"12x", 5, 2, kDecimalBadText}, {"1e", 5, 2, kDecimalBadText}, {"--1", 5, 2, kDecimalBadText},
        {nullptr, 5, 2, kDecimalBadText}};
    for (const auto& c : refused) {
        unsigned char packed[3] = {1, 2, 3};
        EXPECT_EQ(TextToDecimal(c.text, packed, c.precision, c.scale), c.result) << (c.text ? c.text : "null");
        EXPECT_EQ(packed[0], 1);
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

TEST(DecimalFloat, FromText) {
    const struct {
        const char* text;
        std::size_t size;
        const char* hex;  // least significant byte first
    } cases[] = {
        {"0", 8, "000000000000C031"}, {"0E500", 8, "000000000000C031"}, {"-0.00", 8, "000000000000C0B1"},
        {"1", 8, "010000000000C031"}, {"-1", 8, "010000000000C0B1"}, {"12.5", 8, "7D0000000000A031"},
        {"9999999999999999", 8, "FFFFC06FF286736C"}, {"99999999999999995", 8, "0080C6A47E8D0332"},
        {"1E384", 8, "0080C6A47E8DE35F"}, {"1E-398", 8, "0100000000000000"}, {"4E-399", 8, "0000000000000000"},
        {"5E-399", 8, "0100000000000000"}, {"9999999999999999E-414", 8, "0100000000000000"},
        {"9999999999999999E-415", 8, "0000000000000000"}, {"1E-500", 8, "0000000000000000"}, {"1", 16, "01000000000000000000000000004030"},
        {"-0.1", 16, "01000000000000000000000000003EB0"}};
    for (const auto& c : cases) {
        unsigned char bytes[16];
        ASSERT_TRUE(decimal_float::FromText(c.text, c.size, bytes)) << c.text;
        EXPECT_EQ(Hex(bytes, c.size), c.hex) << c.text << " in " << c.size;
    }
    for (const char* text : {"", "-", ".", "1.2.3", "1E", "1E5x", "1E385", "1E2000000", "one"}) {
        unsigned char bytes[] = "untouched";
        EXPECT_FALSE(decimal_float::FromText(text, 8, bytes)) << text;
        EXPECT_STREQ(reinterpret_cast<char*>(bytes), "untouched") << text;
    }
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
