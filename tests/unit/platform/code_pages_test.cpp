// Code pages: known bytes of each page both ways, areas of every length, what cannot be converted, the process's pages.
#include <gtest/gtest.h>

#include <cstdlib>
#include <random>
#include <string>

#include "platform/code_page.h"
#include "platform/code_page_table.h"

namespace {

using namespace std::string_literals;

struct Converted { int result; std::string output; std::size_t unused_input; };

// Converts into an area of just this capacity: the sanitizers see a byte too far.
Converted Convert(unsigned source, unsigned target, const std::string& input, std::size_t capacity = 256) {
    Converted converted;
    std::size_t unused = 0;
    char* const area = new char[capacity];
    converted.result = CodePageConvert(source, target, input.data(), input.size(), &converted.unused_input, area,
                                       capacity, &unused);
    converted.output.assign(area, capacity - unused);
    delete[] area;
    return converted;
}

TEST(CodePages, KnownBytesBothWays) {
    const struct { unsigned page; std::string bytes; std::string utf8; } cases[] = {
        {37, "\xC1\xF1\x51\xBA", "A1é["}, {437, "\x82\xE1", "éß"}, {500, "\xC1\xF1\x51\x4A", "A1é["},
        {819, "\xE9\xFF", "éÿ"}, {850, "\x82\xD5", "éı"}, {858, "\x82\xD5", "é€"}, {912, "\xB3", "ł"},
        {923, "\xA4\xBD", "€œ"}, {932, "\x82\xA0", "あ"}, {943, "\x82\xA0\xB1", "あｱ"}, {950, "\xA4\xA4", "中"},
        {1200, "\x00\xE9\x4E\x2D"s, "é中"}, {1202, "\xE9\x00\x2D\x4E"s, "é中"}, {1208, "é中", "é中"}, {1250, "\xB3", "ł"},
        {1251, "\xC6", "Ж"}, {1252, "\x80\xE9", "€é"}, {1253, "\xE1", "α"}, {1254, "\xF0", "ğ"}, {1255, "\xE0", "א"},
        {1256, "\xC7", "ا"}, {1257, "\xE0", "ą"}, {1258, "e\xD2" "e", "ẻe"}, {1381, "\xD6\xD0", "中"},
        {1383, "\xD6\xD0", "中"}, {5348, "\x80", "€"}, {13488, "\x00\xE9\x4E\x2D"s, "é中"},
        {273, "\x4A", "Ä"}, {277, "\x7B\xC0", "Ææ"}, {278, "\x7B\xC0", "Ää"}, {280, "\xC0\xD0", "àè"}, {284, "\x7B\x6A", "Ññ"},
        {285, "\x5B\x4A", "£$"}, {297, "\x7B\xC0", "£é"}, {367, "~", "~"}, {813, "\xA2\xE1", "’α"}, {852, "\x88", "ł"},
        {855, "\xEA", "Ж"}, {857, "\xA7", "ğ"}, {860, "\x84", "ã"}, {861, "\x8B", "Ð"}, {862, "\x80", "א"},
        {863, "\x84", "Â"}, {864, "\x9E", "ﻼ"}, {865, "\x9B\xAF", "ø¤"}, {866, "\x86", "Ж"}, {869, "\xD6", "α"},
        {870, "\x9A", "ł"}, {871, "\x5A\xD0", "Ææ"}, {874, "\xA1", "ก"}, {878, "\xF6", "Ж"}, {913, "\xA1", "Ħ"},
        {914, "\xF3", "ķ"}, {915, "\xB6", "Ж"}, {916, "\xE0", "א"}, {920, "\xF0", "ğ"}, {921, "\xE0", "ą"},
        {949, "\x81\x41", "갂"}, {954, "\xA4\xA2", "あ"}, {964, "\xC4\xE3", "中"}, {970, "\xB0\xA1", "가"},
        {1026, "\x5A", "Ğ"}, {1047, "\xAD\xBD", "[]"}, {1089, "\xD9", "ع"}, {1140, "\xBA\x9F", "[€"},
        {1141, "\x4A\x9F", "Ä€"}, {1148, "\x4A\x9F", "[€"}, {1386, "\x81\x40", "丂"}, {5488, "\x94\x32\xBE\x34", "𝄞"},
        {54936, "\xD6\xD0\x94\x32\xBE\x34", "中𝄞"}, {1202, "\x34\xD8\x1E\xDD", "𝄞"}, {1200, "\xD8\x34\xDD\x1E", "𝄞"},
        {1202, "\0\x08\0\xE0\0\xD8\0\xDC"s, "\u0800\uE000\U00010000"}};  // where longer forms begin
    for (const auto& c : cases) {
        const Converted there = Convert(c.page, 1208, c.bytes);
        const Converted back = Convert(1208, c.page, c.utf8);
        EXPECT_EQ(there.result, kCodePageDone) << c.page;
        EXPECT_EQ(there.output, c.utf8) << c.page;
        EXPECT_EQ(back.result, kCodePageDone) << c.page;
        EXPECT_EQ(back.output, c.bytes) << c.page;
    }
}

// However short the area: no half character, and what was read is just what was written.
TEST(CodePages, AreasOfEveryLength) {
    const struct { unsigned source; unsigned target; std::string input; } cases[] = {
        {1208, 1202, "aé中𝄞b"}, {1202, 1208, Convert(1208, 1202, "aé中𝄞b").output}, {1208, 1208, "aé中𝄞b"},
        {1208, 54936, "aé中𝄞b"}, {54936, 1200, Convert(1208, 54936, "aé中𝄞b").output}, {943, 1208, "a\x82\xA0\xB1z"},
        {1202, 943, Convert(943, 1202, "a\x82\xA0\xB1z").output},
        {1258, 1208, "xe\xEC" "e\xEC" "ae"},  // each e but the last is joined by its accent
        {1258, 1202, "xe\xEC" "ae\xEC"}, {1208, 37, "abcé"}, {1208, 819, "a中"},
        {1208, 943, "é中é"}, {1208, 54936, "a\xFFz"},  // substitutes that just fit
        {1208, 1202, "a\xFFz\xE4\xB8"}, {1202, 850, Convert(1208, 1202, "aй中z").output},
        {1202, 1208, Convert(1208, 1202, "twenty-four letters here").output}, {1208, 1202, "as many of them"}, {1255, 1208, "\xE0\xF9\xCC"},
    };
    for (const auto& c : cases) {
        const Converted whole = Convert(c.source, c.target, c.input);
        ASSERT_EQ(whole.unused_input, 0u);
        for (std::size_t capacity = 0; capacity <= whole.output.size(); ++capacity) {
            SCOPED_TRACE(testing::Message() << c.source << " to " << c.target << ", capacity " << capacity);
            const Converted cut = Convert(c.source, c.target, c.input, capacity);
            const bool is_whole = capacity == whole.output.size();
            EXPECT_EQ(cut.result, is_whole ? whole.result : kCodePageTruncated);
            EXPECT_EQ(cut.output, whole.output.substr(0, cut.output.size()));
            const std::string read = c.input.substr(0, c.input.size() - cut.unused_input);
            EXPECT_EQ(Convert(c.source, c.target, read).output, cut.output);
            EXPECT_EQ(cut.unused_input > 0, !is_whole);
        }
    }
    EXPECT_EQ(Convert(1258, 1208, "xye\xEC", 3).output, "xy") << "all that fits before the letter with its accent";
}

TEST(CodePages, WhatCannotBeConverted) {
    const struct { unsigned source; unsigned target; std::string input; std::string output; } cases[] = {
        {1208, 819, "a中b", "a?b"}, {1208, 367, "é", "?"}, {1208, 37, "中", "\x6F"}, {1208, 943, "é", "?"},
        {1202, 850, "\x34\xD8\x1E\xDD" "a\0"s, "?a"}, {1208, 1202, "a\xFF", "a\0\xFD\xFF"s},
        {1208, 1202, "\xC0\x80", "\xFD\xFF\xFD\xFF"}, {1208, 1202, "\xED\xA0\x80", "\xFD\xFF\xFD\xFF\xFD\xFF"},
        {1208, 1202, "\xF4\x90\x80\x80", "\xFD\xFF\xFD\xFF\xFD\xFF\xFD\xFF"},
        {1208, 1202, "é\xE4\xB8", "\xE9\0\xFD\xFF\xFD\xFF"s}, {1202, 1208, "\x34\xD8" "a\0"s, "\uFFFD" "a"},
        {1202, 1208, "\x1E\xDD", "\uFFFD"}, {1202, 1208, "a\0b"s, "a\uFFFD"}, {1202, 819, "a\0b"s, "a?"},
        {1200, 1208, "\xD8\x34", "\uFFFD"}, {1208, 13488, "𝄞", "\xFF\xFD"}, {943, 1208, "a\x82", "a\uFFFD"},
        {1255, 819, "\xE0\xE1" "a", "??a"}};
    for (const auto& c : cases) {
        const Converted converted = Convert(c.source, c.target, c.input);
        EXPECT_EQ(converted.result, kCodePageSubstituted) << c.source << " to " << c.target;
        EXPECT_EQ(converted.output, c.output) << c.source << " to " << c.target << testing::PrintToString(c.input);
        EXPECT_EQ(converted.unused_input, 0u);
    }
}

// The two ways to convert Unicode, by hand and through iconv, agree on any bytes.
TEST(CodePages, TheShortWayAgreesWithTheLongOne) {
    std::mt19937 random(7);
    const char bytes[] = "ab\0\x7F\x80\xBF\xC2\xC3\xA9\xD8\xDC\xE0\xE4\xB8\xAD\xED\xA0\xEF\xF0\x9D\x84\x9E\xF4\x90\xFF";
    for (int round = 0; round < 3000; ++round) {
        std::string input(random() % 40, 'x');  // half of them mostly ASCII, which is taken in blocks
        for (char& byte : input)
            if (round % 2 == 0 || random() % 16 == 0) byte = bytes[random() % (sizeof bytes - 1)];
        const Converted short_way = Convert(1208, 1202, input);
        const Converted long_way = Convert(1208, 1200, input);
        EXPECT_EQ(short_way.output, Convert(1200, 1202, long_way.output).output) << testing::PrintToString(input);
        EXPECT_EQ(short_way.result, long_way.result) << testing::PrintToString(input);

        std::string swapped = input.substr(0, input.size() / 2 * 2);
        for (std::size_t index = 0; index < swapped.size(); index += 2) std::swap(swapped[index], swapped[index + 1]);
        const std::string even = input.substr(0, swapped.size());
        EXPECT_EQ(Convert(1202, 1208, even).output, Convert(1200, 1208, swapped).output)
            << testing::PrintToString(even);
    }
}

TEST(CodePages, UnknownPagesAndNullAreasAreRefused) {
    char area[4];
    std::size_t unused_input = 0, unused_output = 0;
    EXPECT_EQ(CodePageConvert(1208, 4711, "ab", 2, &unused_input, area, 4, &unused_output), kCodePageUnknown);
    EXPECT_EQ(unused_input, 2u);
    EXPECT_EQ(unused_output, 4u);
    EXPECT_EQ(CodePageConvert(0, 1202, "ab", 2, nullptr, area, 4, nullptr), kCodePageUnknown);
    EXPECT_EQ(CodePageConvert(1208, 1202, nullptr, 3, &unused_input, area, 4, nullptr), kCodePageBadArgument);
    EXPECT_EQ(unused_input, 3u);
    EXPECT_EQ(CodePageConvert(1208, 1202, "ab", 2, nullptr, nullptr, 4, nullptr), kCodePageBadArgument);
    EXPECT_EQ(CodePageConvert(1208, 850, nullptr, 0, nullptr, nullptr, 0, nullptr), kCodePageDone);
}

TEST(CodePages, OfCharacterSets) {
    const struct { const char* name; unsigned page; } cases[] = {
        {"ANSI_X3.4-1968", 367}, {"ansix34-1968", 0}, {"ISO_8859-15", 923}, {"iso8859_1", 819}, {"utf8", 1208}, {"UTF-8Z", 0},
        {"UTF", 0}, {"koi8r-", 878}, {"EUC-CN", 1381}, {"", 0}};
    for (const auto& c : cases) {
        const CodePage* const page = FindCharacterSet(c.name);
        EXPECT_EQ(page ? page->number : 0, c.page) << c.name;
    }
}

TEST(CodePages, OfTheProcess) {
    const struct { const char* locale; const char* setting; int result; unsigned first; unsigned second; } cases[] = {
        {"C", nullptr, 0, 1208, 1208}, {"C.UTF-8", nullptr, 0, 1208, 1208}, {"not-a-locale", "", 0, 1208, 1208},
        {"C", "850", 0, 850, 850}, {"C", "1208,1252", 0, 1208, 1252}, {"C", "13488,1208", 0, 13488, 1208},
        {"C", "0", kCodePageUnknown, 1208, 1208}, {"C", "1208,1", kCodePageUnknown, 1208, 1208},
        {"C", "1208,", kCodePageBadArgument, 1208, 1208}, {"C", "latin", kCodePageBadArgument, 1208, 1208},
        {"C", "850 ", kCodePageBadArgument, 1208, 1208}, {"C", "99999999999", kCodePageBadArgument, 1208, 1208}};
    for (const auto& c : cases) {
        setenv("LC_ALL", c.locale, 1);
        if (c.setting) setenv("KELPCI_CODEPAGE", c.setting, 1);
        std::uint32_t first = 0, second = 0;
        const char* const shown = c.setting ? c.setting : c.locale;
        EXPECT_EQ(GetProcessCodePage(&first, &second), c.result) << shown;
        EXPECT_EQ(first, c.first) << shown;
        EXPECT_EQ(second, c.second) << shown;
        unsetenv("KELPCI_CODEPAGE");
    }
    unsetenv("LC_ALL");
}

}  // namespace
