// The text and the bytes of row ids.
#include <gtest/gtest.h>

#include "values/rowid.h"

namespace {

TEST(RowIdText, GoesBothWays) {
    const struct { rowid::RowId value; const char* text; } cases[] = {
        {{0, 0}, "AAAAAAAAAAAAAAAAAA"}, {{0, 1}, "AAAAAAAAAAAAAAAAAB"}, {{1, 64}, "AAAAABAAAAAAAAAABA"},
        {{0xFFFFFFFF, -1}, "D/////AP//////////"}, {{7, INT64_MAX}, "AAAAAHAH//////////"},
        {{7, INT64_MIN}, "AAAAAHAIAAAAAAAAAA"}};
    for (const auto& c : cases) {
        char text[rowid::kTextLength];
        EXPECT_EQ(std::string(text, rowid::ToText(c.value, text)), c.text);
        rowid::RowId back{};
        EXPECT_TRUE(rowid::FromText(std::string(" ") + c.text + "  ", &back)) << c.text;
        EXPECT_EQ(back, c.value) << c.text;
        std::uint8_t bytes[rowid::kByteLength + 1] = {};
        const bool fits = rowid::ToBytes(c.value, bytes);
        EXPECT_EQ(fits, c.value.table <= 0xFFFF);
        EXPECT_EQ(bytes[rowid::kByteLength], 0) << "not written";
        EXPECT_TRUE(!fits || rowid::FromBytes(bytes) == c.value) << c.text;
    }
    for (const char* text : {"", "AAAAAAAAAAAAAAAAA", "AAAAAAAAAAAAAAAAAAA", "AAAAAAAAAAAAAAAAA!", "EAAAAAAAAAAAAAAAAA",
                             "AAAAAABAAAAAAAAAAA", "AAAAAAAQAAAAAAAAAA",
                             "AAAAAAAA AAAAAAAAA"}) {
        rowid::RowId value{};
        EXPECT_FALSE(rowid::FromText(text, &value)) << text;
    }
}

}  // namespace
