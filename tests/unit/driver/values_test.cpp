// Elements as they are stored from a script's texts and as they are shown, for the types that need no library.
#include <cstring>
#include <sstream>

#include "core/keywords.h"
#include "core/state.h"
#include "objects/buffers.h"
#include "objects/memory.h"
#include "objects/value_assignment.h"
#include "objects/value_display.h"
#include "oci.h"
#include "platform/memory.h"
#include "support/printed.h"

namespace {

// One element with a guard behind it.
struct Element {
    int type;
    uint32_t size;
    unsigned char data[64];
    int16_t indicator = 7;
    uint16_t length = 7, return_code = 0;
    uint16_t precision = 0;
    int16_t scale = 0;
    bool assigned = false;

    Element(int type, uint32_t size) : type(type), size(size) { std::memset(data, 0xEE, sizeof data); }

    // What is printed; the guard must not have been touched.
    std::string Assign(const char* word, long given) {
        const ElementTarget target = {type, data, size, &indicator, &length, &return_code, precision, scale};
        const std::string printed = Printed([&] { assigned = AssignText(target, word, given); });
        for (size_t index = size; index < sizeof data; ++index) EXPECT_EQ(data[index], 0xEE) << word << " at " << index;
        return printed;
    }
    std::string Show() const {
        Line line;
        const ElementView view = {type, data, size, indicator, return_code, length, precision, scale, false};
        return Printed([&] { DisplayElement(line, view); });
    }
    std::string Bytes(size_t count) const { return {reinterpret_cast<const char*>(data), count}; }
};

TEST(Values, TextsStoredAndShown) {
    const struct { int type; uint32_t size; const char* word; long given; int length; const char* shown; } cases[] = {
        {SQLT_CHR, 5, "abcde", 3, 3, "\"abc\"\n"}, {SQLT_CHR, 5, "abcdefgh", 8, 5, "\"abcde\"\n"},
        {SQLT_CHR, 5, "abc", -1, 0, "\"\"\n"}, {SQLT_LNG, 5, "abc", 3, 3, "\"abc\"\n"},
        {SQLT_STR, 5, "abcdefgh", 8, 4, "\"abcd\"\n"}, {SQLT_STR, 5, "ab", 100000, 4, "\"ab\"\n"},
        {SQLT_STR, 0, "ab", 2, 0, "\"\"\n"}, {SQLT_AFC, 5, "ab", 2, 5, "\"ab   \"\n"},
        {SQLT_VCS, 6, "abcdef", 3, 5, "\"abc\"\n"}, {SQLT_AVC, 6, "abcdef", 6, 6, "\"abcd\"\n"},
        {SQLT_LVC, 8, "abcdef", 6, 8, "\"abcd\"\n"}, {SQLT_BIN, 5, "abc", 2, 2, "\"6162\"\n"},
        {SQLT_BIN, 5, "X'01abFF'", 9, 3, "\"01ABFF\"\n"}, {SQLT_LBI, 5, "X'01abFF'", 2, 2, "\"01AB\"\n"},
        {SQLT_VBI, 6, "X'01abFF'", 9, 5, "\"01ABFF\"\n"}, {SQLT_RID, 10, "X'01'", 5, 5, "\"5827303127\"\n"},
        {SQLT_INT, 1, "-128", 4, 1, "-128\n"}, {SQLT_INT, 2, "32767", 1, 2, "32767\n"},
        {SQLT_INT, 4, "-2147483648", 4, 4, "-2147483648\n"},
        {SQLT_INT, 8, "+9223372036854775807", 8, 8, "9223372036854775807\n"},
        {SQLT_UIN, 8, "18446744073709551615", 8, 8, "18446744073709551615\n"}, {SQLT_UIN, 3, "65535", 3, 3, "65535\n"},
        {SQLT_FLT, 4, "1.5", 4, 4, "1.500000\n"}, {SQLT_FLT, 8, "-1e3", 8, 8, "-1000.000000\n"},
        {SQLT_FLT, 16, "0.25", 16, 16, "0.250000\n"},
        {SQLT_DAT, 7, "2024-02-29-13:05:00", 7, 7, "\"2024-02-29-13:05:00\"\n"},
        {SQLT_DAT, 7, "2023-02-29-13:05:00", 7, 7, "Invalid date found\n"},
        {SQLT_DAT, 7, "2000-12-31", 7, 7, "\"2000-12-31-00:00:00\"\n"}, {SQLT_BIN, 5, "X'", 2, 2, "\"5827\"\n"},
        {SQLT_BIN, 5, "X''", 3, 0, "\"\"\n"},
        {SQLT_DAT, 3, "2024-12-31", 7, 7, "Invalid date found\n"},
        {SQLT_ODT, 8, "1999-01-02-03:04:60", 8, 8, "1999-01-02-03:04:60\n"},
        {SQLT_ODT, 8, "1999-01-02-03:04:61", 8, 8, "1999-01-02-03:04:61\nInvalid OCITimeSS - 61\n"}};
    for (const auto& c : cases) {
        Element element(c.type, c.size);
        EXPECT_EQ(element.Assign(c.word, c.given), "") << c.type << " " << c.word;
        EXPECT_EQ(element.length, c.length) << c.type << " " << c.word;
        EXPECT_TRUE(element.assigned && element.indicator == 0) << c.type << " " << c.word;
        EXPECT_EQ(element.Show(), c.shown) << c.type << " " << c.word;
    }
}

TEST(Values, AWordThatIsNoValueChangesNothing) {
    const struct { int type; uint32_t size; const char* word; } cases[] = {
        {SQLT_INT, 1, "128"}, {SQLT_INT, 4, "12x"}, {SQLT_INT, 4, ""}, {SQLT_UIN, 4, "-1"}, {SQLT_FLT, 8, "one"},
        {SQLT_FLT, 2, "1"}, {SQLT_BIN, 5, "X'0'"}, {SQLT_VBI, 8, "X'0G'"}, {SQLT_DAT, 7, "yesterday"},
        {SQLT_ODT, 8, "-1-1-1"}, {SQLT_CLOB, 8, "no_such_lob"}, {SQLT_RSET, 8, "no_such_result"},
        {SQLT_BFLOAT, 8, "1.2.3"}, {SQLT_BFLOAT, 8, "1E400"}, {SQLT_TIME, 8, "12:00:00"}};
    for (const auto& c : cases) {
        Element element(c.type, c.size);
        const std::string before = element.Bytes(sizeof element.data);
        EXPECT_EQ(element.Assign(c.word, 30), std::string("Invalid value - ") + c.word + "\n") << c.type;
        EXPECT_EQ(element.Bytes(sizeof element.data), before) << c.type << " " << c.word;
        EXPECT_TRUE(!element.assigned && element.indicator == 7 && element.length == 7) << c.type << " " << c.word;
    }
}

TEST(Values, NullSetsTheIndicatorOnly) {
    Element element(SQLT_INT, 4);
    EXPECT_EQ(element.Assign("Null", 4), "");
    EXPECT_EQ(element.indicator, -1);
    EXPECT_EQ(element.length, 0);
    EXPECT_EQ(element.Bytes(4), "\xEE\xEE\xEE\xEE");
    EXPECT_EQ(element.Show(), "\n");
    element.return_code = 1405;
    EXPECT_EQ(element.Assign("7", 1), "");
    EXPECT_EQ(element.return_code, 0) << "of a value that was fetched before";
}

TEST(Values, ATextOfOneByteIsItsEnd) {
    Element element(SQLT_STR, 1);
    EXPECT_EQ(element.Assign("ab", 2), "");
    EXPECT_EQ(element.Bytes(1), std::string(1, '\0'));
}

TEST(Values, BlanksInUtf16) {
    Element element(SQLT_AFC, 8);
    application_code_page = second_code_page = 1208;
    Utf16Mode = true;
    EXPECT_EQ(element.Assign("ab", 2), "convertToUTF16 succeeded - In length - 2, Out length - 4\n");
    EXPECT_EQ(Element(SQLT_CHR, 8).Assign("", 0), "");
    application_code_page = 77777;
    EXPECT_EQ(element.Assign("cd", 2), "CodePageConvert failed with rc - 1\n");
    EXPECT_FALSE(element.assigned);
    Utf16Mode = false;
    EXPECT_EQ(element.Bytes(8), std::string("a\0b\0 \0 \0", 8));
}

// Of fewer characters than a line sets aside, of as many, and of more.
TEST(Values, LargeRealsAreShownWhole) {
    for (const double value : {1e247, 1e248, -1e308}) {
        Element element(SQLT_FLT, sizeof value);
        std::memcpy(element.data, &value, sizeof value);
        element.indicator = 0;
        EXPECT_EQ(element.Show(), std::to_string(value) + "\n");
    }
}

// Lengths that the library returned, or prefixes in the data, may say more than there is.
TEST(Values, LengthsAreNotFollowedPastTheElement) {
    const struct { int type; uint32_t size; const char* shown; } cases[] = {
        {SQLT_CHR, 2, "\"\xFF\xFF\"\n"}, {SQLT_STR, 2, "\"\xFF\xFF\"\n"}, {SQLT_BIN, 2, "\"FFFF\"\n"},
        {SQLT_VCS, 4, "\"\xFF\xFF\"\n"}, {SQLT_VCS, 1, "\"\"\n"}, {SQLT_VBI, 3, "\"FF\"\n"}, {SQLT_LVC, 6, "\"\"\n"},
        {SQLT_FLT, 2, "0.000000\n"}, {SQLT_DAT, 7, "Invalid date found\n"}, {SQLT_DAT, 3, "Invalid date found\n"},
        {SQLT_CUR, 8, "Non null value\n"}, {SQLT_RSET, 0, "Null value\n"}, {SQLT_RDD, 8, "RID\n"}};
    for (const auto& c : cases) {
        Element element(c.type, c.size);
        std::memset(element.data, 0xFF, c.size);
        element.indicator = 0;
        element.length = 65535;
        EXPECT_EQ(element.Show(), c.shown) << c.type << " of " << c.size;
    }
}

TEST(Values, PackedDecimalsShown) {
    const struct { std::string bytes; uint16_t precision; int16_t scale; const char* shown; } cases[] = {
        {"\x12\x34\x5D", 5, 2, "-123.45\n"}, {"\x12\x34\x5D", 5, 5, "-0.12345\n"},
        {"\x12\x34\x5D", 5, 7, "-0.0012345\n"}, {"\x12\x34\x5D", 5, -3, "-12345000\n"}, {"\x9D", 1, 1, "-0.9\n"},
        {"\x9D", 1, 0, "-9\n"}, {std::string("\0\0\x0D", 3), 5, 5, "0.00000\n"},
        {"\x12\x34\x51", 5, 2, "DecimalToText failed with rc - 2\n\n"},
        {"\x12\xA4\x5C", 5, 2, "DecimalToText failed with rc - 1\n12\n"},
        // The precision speaks of more bytes than the element has.
        {"\x12\x3D", 5, 0, "DecimalToText failed with rc - 2\n\n"},
        {"\x12\x3D", 65535, 0, "DecimalToText failed with rc - 2\n\n"},
    };
    for (const auto& c : cases) {
        Element element(SQLT_PDN, static_cast<uint32_t>(c.bytes.size()));
        std::memset(element.data, 0x1C, sizeof element.data);
        std::memcpy(element.data, c.bytes.data(), c.bytes.size());
        element.indicator = 0;
        element.precision = c.precision;
        element.scale = c.scale;
        EXPECT_EQ(element.Show(), c.shown) << c.precision << "," << c.scale;
    }
}

// The first and the last of each field, and the next beyond.
TEST(Values, SevenByteDatesThatArePossible) {
    const struct { unsigned char bytes[7]; const char* shown; } cases[] = {
        {{100, 101, 1, 1, 1, 1, 1}, "\"0001-01-01-00:00:00\"\n"}, {{100, 100, 1, 1, 1, 1, 1}, "Invalid date found\n"},
        {{100, 99, 12, 31, 24, 60, 60}, "\"-001-12-31-23:59:59\"\n"},
        {{199, 199, 12, 31, 24, 60, 60}, "\"9999-12-31-23:59:59\"\n"},
        {{200, 100, 1, 1, 1, 1, 1}, "Invalid date found\n"}, {{53, 88, 1, 1, 1, 1, 1}, "\"-4712-01-01-00:00:00\"\n"},
        {{53, 87, 1, 1, 1, 1, 1}, "Invalid date found\n"}, {{120, 124, 0, 1, 1, 1, 1}, "Invalid date found\n"},
        {{120, 124, 13, 1, 1, 1, 1}, "Invalid date found\n"}, {{120, 124, 1, 0, 1, 1, 1}, "Invalid date found\n"},
        {{120, 124, 4, 31, 1, 1, 1}, "Invalid date found\n"}, {{120, 124, 1, 1, 0, 1, 1}, "Invalid date found\n"},
        {{120, 124, 1, 1, 25, 1, 1}, "Invalid date found\n"}, {{120, 124, 1, 1, 1, 61, 1}, "Invalid date found\n"},
        {{120, 124, 1, 1, 1, 1, 61}, "Invalid date found\n"}, {{119, 100, 2, 29, 1, 1, 1}, "Invalid date found\n"},
        {{120, 100, 2, 29, 1, 1, 1}, "\"2000-02-29-00:00:00\"\n"}, {{120, 100, 2, 30, 1, 1, 1}, "Invalid date found\n"},
        {{100, 99, 2, 29, 1, 1, 1}, "\"-001-02-29-00:00:00\"\n"}, {{100, 96, 2, 29, 1, 1, 1}, "Invalid date found\n"}};
    for (const auto& c : cases) {
        Element element(SQLT_DAT, 7);
        std::memcpy(element.data, c.bytes, sizeof c.bytes);
        element.indicator = 0;
        EXPECT_EQ(element.Show(), c.shown) << testing::PrintToString(c.bytes);
    }
}

TEST(Values, FreeingABufferGivesBackEveryBlock) {
    const size_t before = PlatformOutstanding("harnix");
    MemBuffer buffer{};
    ASSERT_EQ(AllocateBuffer(buffer, nullptr, {.type = SQLT_STR, .size = 10}, 3), 0);
    // What dynamic binds and defines attach.
    buffer.dynamic.previous_lengths = static_cast<uint32_t*>(GetMem(3 * sizeof(uint32_t)));
    buffer.dynamic.piece_lengths = static_cast<uint32_t*>(GetMem(3 * sizeof(uint32_t)));
    buffer.dynamic.list = static_cast<MemBuffer**>(GetMem(sizeof(MemBuffer*)));
    EXPECT_EQ(PlatformOutstanding("harnix"), before + 7);
    FreeBufferBlocks(buffer);
    EXPECT_EQ(PlatformOutstanding("harnix"), before);
    FreeBufferBlocks(buffer);
    EXPECT_EQ(PlatformOutstanding("harnix"), before) << "a second time there is nothing to free";
    buffer.dynamic.lengths_count = 1;    // as a dynamic define leaves it
    ASSERT_EQ(AllocateBuffer(buffer, nullptr, {.type = SQLT_STR, .size = 10}, 3), 0);
    *buffer.Length(0) = 5;
    EXPECT_EQ(LengthOf(buffer, 0), 5u) << "a buffer in its slot has none of it";
    FreeBufferBlocks(buffer);
}

TEST(Values, ElementSizesByType) {
    const struct { const char* types; uint32_t given, size; } cases[] = {
        {"sqlt_num sqlt_vnu", 100, 22}, {"sqlt_int", 8, 8}, {"sqlt_int", 3, 4}, {"sqlt_flt", 4, 4},
        {"sqlt_flt", 16, 16}, {"sqlt_flt", 2, 8}, {"sqlt_vcs sqlt_vbi sqlt_avc", 10, 12}, {"sqlt_lvc", 10, 14},
        {"sqlt_rid", 99, 10}, {"sqlt_dat", 99, 7}, {"sqlt_bfloat", 99, 8}, {"sqlt_bdouble", 99, 16},
        {"sqlt_lvb sqlt_cur sqlt_rdd sqlt_clob sqlt_blob sqlt_rset sqlt_vst sqlt_odt sqlt_date", 99, 8},
        {"sqlt_timestamp sqlt_timestamp_tz sqlt_timestamp_ltz", 99, 8},
        {"sqlt_chr sqlt_str sqlt_lng sqlt_bin sqlt_lbi sqlt_uin sqlt_afc sqlt_time sqlt_time_tz", 3, 3}};
    for (const auto& c : cases) {
        std::istringstream types(c.types);
        for (std::string type; types >> type;)
            EXPECT_EQ(ElementSize(DecodeKeyword(type.c_str(), SqltKeywords), c.given, 0), c.size) << type;
    }
    EXPECT_EQ(ElementSize(SQLT_PDN, 10, 10), 6u);
    EXPECT_EQ(ElementSize(SQLT_PDN, 31, 31), 16u);
}

}  // namespace
