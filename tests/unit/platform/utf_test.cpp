// UTF-8 and UTF-16: between each other, what is malformed, and cutting between characters.
#include <gtest/gtest.h>

#include <string>

#include "platform/utf.h"

namespace {

using namespace std::string_literals;

std::string Units(std::u16string_view text) {
    return {reinterpret_cast<const char*>(text.data()), text.size() * 2};
}

// Texts are taken in blocks of eight characters: what is none of ASCII may stand at every place of a block.
TEST(Utf, OneCharacterAtEachPlaceOfAText) {
    const struct { std::string utf8; std::u16string utf16; } cases[] = {
        {"\xC2\x80", u"\u0080"}, {"\xE2\x82\xAC", u"\u20AC"}, {"\xEF\xBF\xBF", u"\uFFFF"},
        {"\xF0\x9F\x98\x80", u"\U0001F600"}, {"\0"s, u"\0"s}, {"\x7F", u"\x7F"}, {"", u""}};
    for (const auto& c : cases) {
        for (size_t length = 0; length <= 20; ++length) {
            for (size_t place = 0; place <= length; ++place) {
                std::string utf8(length, 'x'), out = "<", back = "<";
                std::u16string utf16(length, u'x');
                ASSERT_TRUE(utf::ToUtf16(utf8.insert(place, c.utf8), out));
                ASSERT_EQ(out, "<" + Units(utf16.insert(place, c.utf16))) << c.utf8 << place << " of " << length;
                ASSERT_TRUE(utf::ToUtf8(out.data() + 1, out.size() - 1, back));
                ASSERT_EQ(back, "<" + utf8) << place << " of " << length;
            }
        }
    }
}

TEST(Utf, MalformedTextsEndWhereTheyAreMalformed) {
    for (const char* bad : {"\x80", "\xC3", "\xC0\x80", "\xE0\x80\x80", "\xED\xA0\x80", "\xF4\x90\x80\x80",
                            "\xF8\x88\x80\x80\x80", "\xE2\x82", "\xF5\x80\x80\x80", "\xFF"}) {
        std::string out;
        EXPECT_FALSE(utf::ToUtf16("nine or so"s + bad, out)) << bad;
        EXPECT_EQ(out, Units(u"nine or so")) << bad;
    }
    for (const std::u16string& bad : {u"\xD800"s, u"\xDC00"s, u"\xD800z"s, u"\xD800\xD800"s}) {
        std::string out;
        const std::string units = Units(u"nine or so" + bad);
        EXPECT_FALSE(utf::ToUtf8(units.data(), units.size(), out));
        EXPECT_EQ(out, "nine or so");
    }
    std::string out;
    EXPECT_FALSE(utf::ToUtf8("a\0b", 3, out)) << "half a unit";
}

TEST(Utf, WhatIsShownReplacesEachMalformedByte) {
    std::string out;
    utf::ToUtf16Replacing("a\xFF\xE2\x82z", out);
    EXPECT_EQ(out, Units(u"a\uFFFD\uFFFD\uFFFDz"));
}

}  // namespace
