// The place that a word of a line is kept in.
#include <string>

#include "loop/tokenizer.h"
#include "support/printed.h"

namespace {

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
