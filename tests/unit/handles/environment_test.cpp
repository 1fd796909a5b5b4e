// Texts of error records, and texts between UTF-8 and UTF-16.
#include <gtest/gtest.h>

#include "handles/environment.h"
#include "handles/error_handle.h"
#include "oci.h"

namespace {

TEST(ErrorTexts, NumberStateAndWords) {
    const struct { int number; const char* state; const char* text;
    } cases[] = {{0, "00000", "normal, successful completion"},
                 {1, "23000", "unique constraint violated"},
                 {942, "42000", "table or view does not exist"},
                 {1001, "24000", "invalid cursor"},
                 {1017, "28000", "invalid user name or password; logon denied"},
                 {1095, "02000", "DML processed no rows"},
                 {1403, "02000", "no data found"},
                 {1405, "22002", "fetched value is null"},
                 {1422, "21000", nullptr},
                 {1438, "22003", nullptr},
                 {1476, "22012", "division by zero"},
                 {1480, "22024", nullptr},
                 {1722, "42000", "invalid number"},
                 {1843, "22008", "not a valid month"},
                 {2091, "40000", nullptr},
                 {2292, "23000", nullptr},
                 {3114, "66000", "not connected"},
                 {6511, "24000", nullptr},
                 {6512, "65000", nullptr},
                 {8177, "40001", nullptr},
                 {12154, "66000", nullptr},
                 {12899, "22001", nullptr},
                 {20500, "HY000", "application error"},
                 {24374, "HY000", "define missing before fetch"},
                 {99999, "HY000", "message not found"}};
    for (const auto& c : cases) {
        EXPECT_EQ(SqlState(c.number), c.state) << c.number;
        if (c.text) {
            EXPECT_EQ(ErrorText(c.number), c.text) << c.number;
        }
        EXPECT_NE(ErrorText(c.number), "") << c.number;
    }
    EXPECT_EQ(ErrorMessage(942, "SQLITE", "no such table: t\n"),
              "[KELP/SQLITE] ORA-00942: table or view does not exist: no such table: t\n");
    EXPECT_EQ(ErrorMessage(24374, "CLIENT", ""), "[KELP/CLIENT] ORA-24374: define missing before fetch\n");
}

std::string Units(std::u16string_view text) { return {reinterpret_cast<const char*>(text.data()), text.size() * 2}; }

TEST(Utf, BothWaysAndWhatIsMalformed) {
    const struct { std::string utf8; std::u16string utf16;
    } good[] = {{"", u""},
                {"a", u"a"},
                {"\xC3\xA4", u"\u00E4"},
                {"\xE2\x82\xAC", u"\u20AC"},
                {"\xF0\x9F\x98\x80", u"\U0001F600"},
                {"\xEF\xBF\xBF", u"\uFFFF"},
                {std::string("a\0b", 3), std::u16string(u"a\0b", 3)}};
    for (const auto& c : good) {
        std::string out;
        EXPECT_TRUE(utf::ToUtf16(c.utf8, out));
        EXPECT_EQ(out, Units(c.utf16)) << c.utf8;
        std::string back;
        EXPECT_TRUE(utf::ToUtf8(out.data(), out.size(), back));
        EXPECT_EQ(back, c.utf8);
    }
    for (const char* bad : {"\x80", "\xC3", "\xC0\x80", "\xE0\x80\x80", "\xED\xA0\x80", "\xF4\x90\x80\x80",
                            "\xF8\x88\x80\x80\x80", "a\xE2\x82", "\xF5\x80\x80\x80"}) {
        std::string out;
        EXPECT_FALSE(utf::ToUtf16(bad, out)) << bad;
    }
    for (const std::u16string& bad :
         {std::u16string(u"\xD800"), std::u16string(u"\xDC00"), std::u16string(u"a\xD800z")}) {
        std::string out;
        EXPECT_FALSE(utf::ToUtf8(bad.data(), bad.size() * 2, out));
    }
    std::string out;
    EXPECT_FALSE(utf::ToUtf8("abc", 3, out)) << "half a unit";
}

TEST(TextToBuffer, CutsBetweenCharacters) {
    for (const bool utf16 : {false, true}) {
        Environment* environment = Environment::Open(utf16 ? OCI_UTF16 : OCI_DEFAULT, {}, 0);
        const std::string text = "\xC3\xA4\xF0\x9F\x98\x80z";    // 2, 4 and 1 bytes; 1, 2 and 1 units
        std::string whole;
        const std::string_view out = TextOut(*environment, text, whole);
        const std::size_t zero = utf16 ? 2 : 1;
        std::size_t last = 0;
        for (std::size_t size = 0; size <= out.size() + zero; ++size) {
            std::string buffer(32, 'x');
            EXPECT_EQ(TextToBuffer(*environment, text, buffer.data(), size), size == out.size() + zero) << size;
            EXPECT_EQ(buffer[size], 'x') << size;
            if (size < zero) continue;
            const std::size_t length = TextLength(*environment, buffer.data());
            EXPECT_EQ(buffer.substr(0, length), out.substr(0, length));
            EXPECT_GE(length, last);
            std::string check;
            EXPECT_TRUE(utf16 ? utf::ToUtf8(buffer.data(), length, check)
                              : utf::ToUtf16(buffer.substr(0, length), check))
                << size;
            last = length;
        }
        Destroy(environment);
    }
}

}  // namespace
