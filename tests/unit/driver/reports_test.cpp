// Trace lines, diagnostic texts, the command table and lookup, against texts written down by hand.
#include <gtest/gtest.h>
#include <unistd.h>

#include <map>
#include <string>

#include "core/command_table.h"
#include "support/printed.h"
#include "report/diagnostics.h"
#include "report/trace.h"

namespace {

std::string Trace(int code, long rc, const char* name) {
    return Printed([&] { outputOCI(static_cast<Code>(code), rc, name); });
}

TEST(Trace, OneFunctionOfEachLabel) {
    const std::map<int, std::string> lines = {
        {201, "OCIEnvInit             OCI henv = x\n"},
        {207, "OCILogon2             OCI hSvc = x\n"},
        {216, "OCITransRollback             OCI hSvc = x\n"},
        {329, "OCIErrorGet             OCI handle = x\n"},
        {208, "OCIServerAttach             OCI hServer = x\n"},
        {267, "OCIStringAssignText             OCI hString = x\n"},
        {356, "OCIRawAssignBytes             OCI hRaw = x\n"},
        {276, "OCIFileOpen             OCI hFile = x\n"},
        {366, "OCILobCreateTemporary             OCI hLob = x\n"},
        {321, "OCIDefineByPos             OCI hStmt = x\n"},
        {340, "OCIDefineArrayOfStruct             OCI hDefine = x\n"},
        {345, "OCIBindArrayOfStruct             OCI hBind = x\n"},
        {339, "SetBindDynamicBuffers             memhandle = x\n"},
        {346, "OCIResultSetToStmt             OCI hResult = x\n"},
        {349, "OCIStmtSetPieceInfo             OCI hndlp = x\n"},
        {376, "xaosterr             OCI svchp = x\n"},
        {411, "OCIRowidToChar             OCI hRowid= x\n"},
        {380, "OCIThreadMutexAcquire             mutex = x\n"},
        {388, "OCIThreadKeyGet             key = x\n"},
        {394, "OCIThreadIdSetNull             tid = x\n"},
        {393, "OCIThreadIdSame             envhp = x\n"},
        {398, "OCIThreadHandleGet             thnd = x\n"},
        {403, "OCISessionPoolCreate             spoolhd = x\n"},
        {405, "OCIConnectionPoolDestroy             poolhd = x\n"},
        {433, "OCILdaToSvcCtx             lda = x\n"},
        {434, "OCISvcCtxToLda             svchp = x\n"},
        {415, "ologof             lda = x, rc = -7\n"},
        {431, "oexfet             cda = x, rc = -7\n"},
        {448, "getcda             cda = x\n"},
        {447, "oflng             cursor = x, rc = -7\n"},
        {449, "oermsg             rc = -7\n"},
        {212, "OCITerminate\n"},
        {225, "OCINumberArcTan2\n"},
        {293, "OCIDateTimeAssign\n"},
        {279, "OCIFileTerm\n"},
        {377, "OCIThreadProcessInit"},
        {382, "OCIThreadThreadIsMulti"},
    };
    for (const auto& [code, line] : lines) EXPECT_EQ(Trace(code, -7, "x"), line) << code;
    EXPECT_EQ(Trace(200, 0, nullptr), "OCIEnvCreate             OCI henv = \n");
}

TEST(Trace, CodesWithoutALine) {
    for (const int code : {-1,  0,   199, 319, 320, 325, 326, 328, 330, 335, 341, 342, 343,
                           344, 350, 351, 352, 360, 361, 367, 373, 406, 413, 446, 453})
        EXPECT_EQ(Trace(code, 0, "x"), "outputOCI (): unrecognized command!\n") << code;
}

TEST(Commands, TheFirstRowThatTheWordBegins) {
    const struct {
        const char* word;
        int code;  // 0: none
    } cases[] = {
        {"e", 76},           {"EXIT", 76},       {"ex", 76},         {"q", 76},          {"o", 50},
        {"r", 77},           {"ocil", 203},      {"ocilogon", 206},  {"ocilogon2", 207}, {"OCIStmtFetch", 312},
        {"ocistmtfetch2", 313}, {"sqll", 445},   {"sqlld2", 452},    {"xa", 368},        {"xar", 192},
        {"ocithreadi", 389}, {"ocithreadisMULTI", 382}, {"olo", 414}, {"ologof", 415},   {"get", 448},
        {"getm", 319},       {"exitx", 0},       {"", 0},            {"ocistmtexecutes", 0}, {"#", 0},
    };
    for (const auto& c : cases) {
        const Command* command = FindCommand(c.word);
        EXPECT_EQ(command == nullptr ? 0 : static_cast<int>(command->code), c.code) << c.word;
    }
}

TEST(Commands, NoWordHidesAnother) {
    int rows = 0;
    for (const Command* row = kCommandTable; row->word != nullptr; ++row, ++rows)
        EXPECT_EQ(FindCommand(row->word), row) << row->word;
    EXPECT_EQ(rows, 268);
}

// A command with two handlers, or a handler of no command, would leave one of them without notice.
TEST(CommandsDeathTest, AHandlerTableHasOnePlaceForEachCommand) {
    static constexpr PlainCommand kTwice[] = {
        {{Code::ociping, Words(4), "first"}, [](const CommandRow&, int, char**) {}},
        {{Code::ociping, Words(4), "second"}, [](const CommandRow&, int, char**) {}},
    };
    static constexpr PlainCommand kNoCommand[] = {
        {{static_cast<Code>(453), Words(4), "beyond"}, [](const CommandRow&, int, char**) {}},
    };
    // The log goes to standard output, which a death test does not see: the reason is looked for there.
    const auto add = [](const auto& rows) {
        dup2(STDERR_FILENO, STDOUT_FILENO);
        HandlerTable().Add(rows);
    };
    EXPECT_DEATH(add(kTwice), "Command code 219 has two handlers: second");
    EXPECT_DEATH(add(kNoCommand), "Command code 453 is no command's: beyond");
}

TEST(Diagnostics, TheServerTagIsTheSameForEveryServer) {
    const std::string longest(1100, 'x');
    const struct {
        std::string text, shown;
    } cases[] = {
        {"[KELP/SQLITE] ORA-00942: no such table", "[KELP/OKRA64] ORA-00942: no such table"},
        {"a [AS/400] b", "a [KELP/OKRA64] b"},
        {"[PLOVR/VM]", "[KELP/OKRA64]"},
        {"[AS][KELP/X]!", "[AS][KELP/OKRA64]!"},
        {"]] [KELP", "]] [KELP"},
        {"[KELP and no bracket", "[KELP and no bracket"},
        {"[kelp] plain", "[kelp] plain"},
        {"", ""},
        {"one\r\n", "one\n"},
        {"one\r\ntwo\r\n", "one\nttwo\r\n"},
        {"one\rtwo\n", "one\rtwo\n"},
        {"[AS]" + longest, "[KELP/OKRA64]" + longest.substr(0, 1011)},
    };
    for (const auto& c : cases) EXPECT_EQ(NormaliseDiagnostic(c.text), c.shown) << c.text;
}

TEST(WordCounts, WhatEachFormHolds) {
    EXPECT_TRUE(Words(3, 5).Has(3));
    EXPECT_FALSE(Words(3, 5).Has(4));
    EXPECT_TRUE(WordsBetween(2, 4).Has(4));
    EXPECT_FALSE(WordsBetween(2, 4).Has(5));
    EXPECT_TRUE(WordsFrom(4).Has(4));
    EXPECT_TRUE(WordsFrom(4).Has(1024));
    EXPECT_FALSE(WordsFrom(4).Has(3));
    EXPECT_TRUE(kAnyWords.Has(1));
    EXPECT_TRUE(kAnyWords.Has(64));
}

}  // namespace
