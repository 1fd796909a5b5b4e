// Trace lines, diagnostic texts, the command table and lookup, against texts written down by hand.
#include <gtest/gtest.h>
#include <unistd.h>

#include <cctype>
#include <sstream>
#include <string>

#include "core/command_table.h"
#include "support/printed.h"
#include "report/diagnostics.h"
#include "report/trace.h"

namespace {

std::string Trace(int code, long rc, const char* name) {
    return Printed([&] { outputOCI(static_cast<Code>(code), rc, name); });
}

// The word of a function's command: its name in lower case.
Code CodeOf(std::string function) {
    for (char& character : function) character = static_cast<char>(std::tolower(character));
    const Command* const command = FindCommand(function.c_str());
    return command == nullptr ? Code{} : command->code;
}

// Every line, by what follows the function's name when it is called for "x" and answers -7.
TEST(Trace, TheLineOfEveryFunction) {
    const struct { const char* ending; const char* functions; } groups[] = {
        {"             OCI henv = x\n", "OCIEnvCreate OCIEnvInit xaoEnv"},
        {"             OCI hSvc = x\n",
         "OCILogoff OCILogon OCILogon2 OCISessionBegin OCISessionEnd OCITransCommit OCITransRollback OCIPing "
         "OCIPasswordChange OCIDescribeAny OCITransStart OCITransDetach OCITransPrepare OCITransMultiPrepare "
         "OCITransForget"},
        {"             OCI handle = x\n",
         "OCIHandleAlloc OCIHandleFree OCIDescriptorAlloc OCIDescriptorFree OCIServerVersion OCIAttrGet "
         "OCIAttrSet OCIParamGet OCIErrorGet OCIArrayDescriptorAlloc OCIArrayDescriptorFree"},
        {"             OCI hServer = x\n", "OCIServerAttach OCIServerDetach"},
        {"             OCI hString = x\n",
         "OCIStringAllocSize OCIStringAssign OCIStringAssignText OCIStringPtr OCIStringResize OCIStringSize"},
        {"             OCI hRaw = x\n",
         "OCIRawAllocSize OCIRawAssignBytes OCIRawAssignRaw OCIRawPtr OCIRawResize OCIRawSize"},
        {"             OCI hFile = x\n", "OCIFileClose OCIFileFlush OCIFileOpen OCIFileRead OCIFileSeek OCIFileWrite"},
        {"             OCI hLob = x\n",
         "OCILobIsOpen OCILobAppend OCILobTrim OCILobCopy OCILobAssign OCILobIsEqual OCILobLocatorIsInit "
         "OCILobLocatorAssign OCILobEnableBuffering OCILobDisableBuffering OCILobFlushBuffer OCILobErase "
         "OCILobGetLength OCILobClose OCILobOpen OCILobRead OCILobWrite OCILobIsTemporary OCILobFreeTemporary "
         "OCILobCreateTemporary"},
        {"             OCI hStmt = x\n",
         "OCIStmtExecute OCIStmtFetch OCIStmtFetch2 OCIStmtPrepare OCIStmtPrepare2 OCIStmtRelease "
         "OCIDefineByPos OCIBindByName OCIBindByPos OCIStmtGetBindInfo OCIStmtGetPieceInfo"},
        {"             OCI hDefine = x\n", "OCIDefineDynamic OCIDefineArrayOfStruct"},
        {"             OCI hBind = x\n", "OCIBindDynamic OCIBindArrayOfStruct"},
        {"             memhandle = x\n", "SetBindDynamicBuffers"},
        {"             OCI hResult = x\n", "OCIResultSetToStmt"},
        {"             OCI hndlp = x\n", "OCIBreak OCIStmtSetPieceInfo OCIReset"},
        {"             OCI svchp = x\n", "xaoSvcCtx xaosterr OCISessionGet OCISessionRelease"},
        {"             OCI hRowid= x\n", "OCIRowidToChar"},
        {"             mutex = x\n",
         "OCIThreadMutexInit OCIThreadMutexDestroy OCIThreadMutexAcquire OCIThreadMutexRelease"},
        {"             key = x\n", "OCIThreadKeyInit OCIThreadKeyDestroy OCIThreadKeySet OCIThreadKeyGet"},
        {"             tid = x\n",
         "OCIThreadIdInit OCIThreadIdDestroy OCIThreadIdNull OCIThreadIdGet OCIThreadIdSetNull OCIThreadIdSet"},
        {"             thnd = x\n",
         "OCIThreadHndInit OCIThreadHndDestroy OCIThreadHandleGet OCIThreadCreate OCIThreadClose OCIThreadJoin"},
        {"             envhp = x\n", "OCIThreadInit OCIThreadTerm OCIThreadIdSame"},
        {"             spoolhd = x\n", "OCISessionPoolCreate OCISessionPoolDestroy"},
        {"             poolhd = x\n", "OCIConnectionPoolCreate OCIConnectionPoolDestroy"},
        {"             lda = x\n", "OCILdaToSvcCtx"}, {"             svchp = x\n", "OCISvcCtxToLda"},
        {"             lda = x, rc = -7\n",
         "olog ologof orol ocom ocon ocof obreak onbclr onbset onbtst sqllda odessp sqlld2"},
        {"             cda = x, rc = -7\n",
         "oopen oparse odescr oclose ogetpi osetpi odefinps odefin ocan oexec oexfet oexn ofen ofetch obindps "
         "obndra obndrv obndrn oopt"},
        {"             cda = x\n", "getcda"}, {"             cursor = x, rc = -7\n", "oflng"},
        {"             rc = -7\n", "opinit oermsg"},
        {"\n",
         "OCIInitialize OCITerminate OCIClientVersion OCIFileExists OCIFileGetLength OCIFileInit OCIFileTerm "
         "OCINumberAbs OCINumberAdd OCINumberArcCos OCINumberArcSin OCINumberArcTan OCINumberArcTan2 "
         "OCINumberAssign OCINumberCeil OCINumberCmp OCINumberCos OCINumberDec OCINumberDiv OCINumberExp "
         "OCINumberFloor OCINumberFromInt OCINumberFromReal OCINumberFromText OCINumberHypCos OCINumberHypSin "
         "OCINumberHypTan OCINumberInc OCINumberIntPower OCINumberIsInt OCINumberIsZero OCINumberLn "
         "OCINumberLog OCINumberMod OCINumberMul OCINumberNeg OCINumberPower OCINumberPrec OCINumberRound "
         "OCINumberSetPi OCINumberSetZero OCINumberShift OCINumberSign OCINumberSin OCINumberSqrt OCINumberSub "
         "OCINumberTan OCINumberToInt OCINumberToReal OCINumberToRealArray OCINumberToText OCINumberTrunc "
         "OCIDateAddDays OCIDateAddMonths OCIDateAssign OCIDateCheck OCIDateCompare OCIDateDaysBetween "
         "OCIDateFromText OCIDateLastDay OCIDateNextDay OCIDateSysDate OCIDateToText OCIDateTimeAssign "
         "OCIDateTimeCheck OCIDateTimeCompare OCIDateTimeConstruct OCIDateTimeGetDate OCIDateTimeGetTime "
         "OCIDateTimeSetDate OCIDateTimeSetTime"},
        {"", "OCIThreadProcessInit"},
    };
    int lines = 0;
    for (const auto& group : groups) {
        std::istringstream functions(group.functions);
        for (std::string function; functions >> function; ++lines) {
            const std::string line = Printed([&] { outputOCI(CodeOf(function), -7, "x"); });
            EXPECT_EQ(line, function + group.ending);
        }
    }
    EXPECT_EQ(Trace(382, -7, "x"), "OCIThreadThreadIsMulti");
    EXPECT_EQ(Trace(200, 0, nullptr), "OCIEnvCreate             OCI henv = \n");
    EXPECT_EQ(lines, 231);
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
        {"e", 76}, {"EXIT", 76}, {"ex", 76}, {"q", 76}, {"o", 50}, {"r", 77}, {"ocil", 203}, {"ocilogon", 206},
        {"ocilogon2", 207}, {"OCIStmtFetch", 312}, {"ocistmtfetch2", 313}, {"sqll", 445}, {"sqlld2", 452}, {"xa", 368},
        {"xar", 192}, {"ocithreadi", 389}, {"ocithreadisMULTI", 382}, {"olo", 414}, {"ologof", 415}, {"get", 448},
        {"getm", 319}, {"exitx", 0}, {"", 0}, {"ocistmtexecutes", 0}, {"#", 0},
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
    const struct { std::string text, shown; } cases[] = {
        {"[KELP/SQLITE] ORA-00942: no such table", "[KELP/OKRA64] ORA-00942: no such table"},
        {"a [AS/400] b", "a [KELP/OKRA64] b"}, {"[PLOVR/VM]", "[KELP/OKRA64]"}, {"[AS][KELP/X]!", "[AS][KELP/OKRA64]!"},
        {"]] [KELP", "]] [KELP"}, {"[KELP and no bracket", "[KELP and no bracket"}, {"[kelp] plain", "[kelp] plain"},
        {"", ""}, {"one\r\n", "one\n"}, {"one\r\ntwo\r\n", "one\nttwo\r\n"}, {"one\rtwo\n", "one\rtwo\n"},
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
