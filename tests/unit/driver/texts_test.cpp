// Texts between the application code page and UTF-16: what is converted, and what is said.
#include <cstring>

#include "core/state.h"
#include "objects/text_conversion.h"
#include "support/printed.h"

namespace {

using namespace std::string_literals;

std::string Wide(std::string_view text) {
    std::string wide;
    for (const char character : text) wide += {character, '\0'};
    return wide;
}

// A word as commands get it: in a token buffer.
const char* Token(const std::string& text) {
    static char buffer[TextArgument::kTokenBufferSize];
    std::memset(buffer, 0, sizeof buffer);
    std::memcpy(buffer, text.data(), text.size());
    return buffer;
}

class Texts : public testing::Test {
protected:
    void SetUp() override {
        application_code_page = 1208;
        second_code_page = 819;
    }
    void TearDown() override { Utf16Mode = false; }
};

// The words of scripts are converted in transcripts: here with their lengths and areas chosen.
TEST_F(Texts, ConvertToUtf16) {
    const struct { std::string input; uint32_t length, capacity; int result; std::string output; } cases[] = {
        {"abc", 2, 12, 0, Wide("ab")},
        {"\xE4", 1, 4, 0, Wide("\xE4")},  // the second code page stands in for UTF-8
        {"abc", 3, 4, static_cast<int>(0x870F00C0), Wide("ab")},
        {"W'abc'", 5, 24, 0, Wide("W'abc")},  // the length decides where the word ends
        {"W'abc'", 6, 2, 0, "ab"}, {"W'", 2, 8, 0, Wide("W'")}, {"abc", 3, 0, -1, ""}};
    for (const auto& c : cases) {
        std::string area(c.capacity, 'x');
        uint32_t length = 0;
        int result = 77;
        Printed([&] { result = convertToUTF16(Token(c.input), c.length, area.data(), c.capacity, &length); });
        EXPECT_EQ(result, c.result) << c.input;
        EXPECT_EQ(area.substr(0, length), c.output) << c.input;
    }
    char area[4] = "xxx";
    uint32_t length = 0;
    convertToUTF16("", 0, area, sizeof area, &length);
    EXPECT_EQ(std::string(area, 4), std::string(4, '\0')) << "an empty word clears the area";
    EXPECT_EQ(Printed([&] { convertToUTF16("a", 1, nullptr, 0, &length); }), "pOut is NULL\n");
    EXPECT_EQ(Printed([&] { convertToUTF16(nullptr, 1, area, 0, &length); }), "pIn is NULL\n");
    second_code_page = 77777;
    EXPECT_EQ(Printed([&] { convertToUTF16("a", 1, area, 4, &length); }), "CodePageConvert failed with rc - 1\n");
}

TEST_F(Texts, ConvertFromUtf16) {
    std::string output = "before";
    EXPECT_TRUE(convertFromUTF16(Wide("ab\xE4").data(), 6, output));
    EXPECT_EQ(output, "ab\xE4");
    EXPECT_TRUE(convertFromUTF16(nullptr, 6, output));
    EXPECT_EQ(output, "");
    application_code_page = 13488;  // which has a stand-in, too
    second_code_page = 54936;
    EXPECT_TRUE(convertFromUTF16(Wide("\xE4\xE4").data(), 4, output));
    EXPECT_EQ(output, "\x81\x30\x8A\x31\x81\x30\x8A\x31") << "nothing is cut in a multi-byte code page";
    second_code_page = 77777;
    EXPECT_EQ(Printed([&] { EXPECT_FALSE(convertFromUTF16("a", 2, output)); }), "convertFromUTF16 failed: rc = 1\n");
    Line line;
    line.Text("before ");
    EXPECT_EQ(Printed([&] { EXPECT_FALSE(AddText(line, "a", 2, true, Quotes::always)); }),
              "before convertFromUTF16 failed: rc = 1\n");
}

}  // namespace
