// Elements as they are stored from a script's texts and as they are shown, for the types that need no library.
#include <cstring>

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

}  // namespace
