// Trace lines, the command table and lookup, against texts written down by hand.
#include <unistd.h>

#include "core/command_table.h"
#include "support/printed.h"
#include "report/trace.h"

namespace {

std::string Trace(int code, long rc, const char* name) {
    return Printed([&] { outputOCI(static_cast<Code>(code), rc, name); });
}

// The lines of the functions are compared by the transcripts, which call each.
TEST(Trace, CodesWithoutALine) {
    EXPECT_EQ(Trace(200, 0, nullptr), "OCIEnvCreate             OCI henv = \n");
    for (const int code : {-1,  0,   199, 319, 320, 325, 326, 328, 330, 335, 341, 342, 343,
                           344, 350, 351, 352, 360, 361, 367, 373, 406, 413, 446, 453})
        EXPECT_EQ(Trace(code, 0, "x"), "outputOCI (): unrecognized command!\n") << code;
}

// A command with two handlers, or a handler of no command, would leave one of them without notice.
TEST(CommandsDeathTest, AHandlerTableHasOnePlaceForEachCommand) {
    static constexpr PlainCommand kTwice[] = {
        {{Code::ociping, Words(4), "first"}, [](const CommandRow&, int, char**) {}},
        {{Code::ociping, Words(4), "second"}, [](const CommandRow&, int, char**) {}}};
    static constexpr PlainCommand kNoCommand[] = {
        {{static_cast<Code>(453), Words(4), "beyond"}, [](const CommandRow&, int, char**) {}}};
    // The log goes to standard output, which a death test does not see: the reason is looked for there.
    const auto add = [](const auto& rows) {
        dup2(STDERR_FILENO, STDOUT_FILENO);
        HandlerTable().Add(rows);
    };
    EXPECT_DEATH(add(kTwice), "Command code 219 has two handlers: second");
    EXPECT_DEATH(add(kNoCommand), "Command code 453 is no command's: beyond");
}

}  // namespace
