// The words that a line gives.
#include <cstring>
#include <vector>

#include "loop/tokenizer.h"
#include "support/printed.h"

namespace {

using Words = std::vector<std::string>;

struct Tokenized { Words words; std::string printed; };

Tokenized Split(const std::string& line) {
    static char buffer[kLineSize];
    std::memset(buffer, 0, sizeof buffer);
    std::memcpy(buffer, line.c_str(), line.size() + 1);
    TokenVector tokens;
    int count = 0;
    Tokenized result{{}, Printed([&] { count = Tokenize(buffer, buffer, tokens); })};
    for (int index = 0; index < count; ++index) result.words.push_back(tokens.Words()[index]);
    return result;
}

TEST(Tokenizer, ALineThatFillsTheBuffer) {
    const std::string word(kLineSize - 1, 'x');
    EXPECT_EQ(Split(word).words, Words{word});
    std::string quoted = word;
    quoted[0] = '"';
    EXPECT_EQ(Split(quoted).words, Words{word.substr(1)});
    quoted.back() = '"';
    EXPECT_EQ(Split(quoted).words, Words{word.substr(2)});
}

TEST(Tokenizer, ASlotKeepsItsBufferForLaterLines) {
    TokenVector tokens;
    tokens.StrAllocAndCopy(3, "first");
    const char* room = tokens.Words()[3];
    tokens.StrAllocAndCopy(3, "2nd");
    EXPECT_EQ(tokens.Words()[3], room);
    EXPECT_STREQ(room, "2nd");
    EXPECT_STREQ(room + 4, "t") << "the old contents stay behind the closing zero";

    EXPECT_EQ(Printed([&] { tokens.StrAllocAndCopy(3, std::string(kLineSize, 'x').c_str()); }),
              "StrAllocAndCopy(): inString len > MAX_BUFFER_SIZE !\n");
    EXPECT_STREQ(room, "2nd");
}

}  // namespace
