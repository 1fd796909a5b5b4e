// One table from command code to function name and label.
#include "report/trace.h"

#include "core/messages.h"
#include "report/return_code.h"

namespace {

// How a line goes on after the function's name. The texts are what scripts' logs have always held: the rowid label
// lacks a blank, one function's name is doubled, two lines are not ended.
enum class Ending { name, name_and_rc, rc, plain, unended };

struct Label {
    const char* text;  // what stands between the name and the object
    Ending ending;
};

constexpr Label kHenv = {"OCI henv = ", Ending::name};
constexpr Label kHsvc = {"OCI hSvc = ", Ending::name};
constexpr Label kHandle = {"OCI handle = ", Ending::name};
constexpr Label kHserver = {"OCI hServer = ", Ending::name};
constexpr Label kHstring = {"OCI hString = ", Ending::name};
constexpr Label kHraw = {"OCI hRaw = ", Ending::name};
constexpr Label kHfile = {"OCI hFile = ", Ending::name};
constexpr Label kHlob = {"OCI hLob = ", Ending::name};
constexpr Label kHstmt = {"OCI hStmt = ", Ending::name};
constexpr Label kHdefine = {"OCI hDefine = ", Ending::name};
constexpr Label kHbind = {"OCI hBind = ", Ending::name};
constexpr Label kMemhandle = {"memhandle = ", Ending::name};
constexpr Label kHresult = {"OCI hResult = ", Ending::name};
constexpr Label kHndlp = {"OCI hndlp = ", Ending::name};
constexpr Label kOciSvchp = {"OCI svchp = ", Ending::name};
constexpr Label kHrowid = {"OCI hRowid= ", Ending::name};
constexpr Label kMutex = {"mutex = ", Ending::name};
constexpr Label kKey = {"key = ", Ending::name};
constexpr Label kTid = {"tid = ", Ending::name};
constexpr Label kThnd = {"thnd = ", Ending::name};
constexpr Label kEnvhp = {"envhp = ", Ending::name};
constexpr Label kSpoolhd = {"spoolhd = ", Ending::name};
constexpr Label kPoolhd = {"poolhd = ", Ending::name};
constexpr Label kLda = {"lda = ", Ending::name};
constexpr Label kSvchp = {"svchp = ", Ending::name};
constexpr Label kCda = {"cda = ", Ending::name};
constexpr Label kLdaRc = {"lda = ", Ending::name_and_rc};
constexpr Label kCdaRc = {"cda = ", Ending::name_and_rc};
constexpr Label kCursorRc = {"cursor = ", Ending::name_and_rc};
constexpr Label kRc = {"rc = ", Ending::rc};
constexpr Label kPlain = {"", Ending::plain};
constexpr Label kUnended = {"", Ending::unended};

constexpr int kFirstCode = 200;
constexpr int kLastCode = 452;

struct TraceRow {
    int code;
    const char* function;
    const Label& label;
};

constexpr TraceRow kTraceRows[] = {
    {200, "OCIEnvCreate", kHenv},
    {201, "OCIEnvInit", kHenv},
    {202, "OCIInitialize", kPlain},
    {203, "OCILogoff", kHsvc},
    {204, "OCIHandleAlloc", kHandle},
    {205, "OCIHandleFree", kHandle},
    {206, "OCILogon", kHsvc},
    {207, "OCILogon2", kHsvc},
    {208, "OCIServerAttach", kHserver},
    {209, "OCIServerDetach", kHserver},
    {210, "OCISessionBegin", kHsvc},
    {211, "OCISessionEnd", kHsvc},
    {212, "OCITerminate", kPlain},
    {213, "OCIDescriptorAlloc", kHandle},
    {214, "OCIDescriptorFree", kHandle},
    {215, "OCITransCommit", kHsvc},
    {216, "OCITransRollback", kHsvc},
    {217, "OCIClientVersion", kPlain},
    {218, "OCIServerVersion", kHandle},
    {219, "OCIPing", kHsvc},
    {220, "OCINumberAbs", kPlain},
    {221, "OCINumberAdd", kPlain},
    {222, "OCINumberArcCos", kPlain},
    {223, "OCINumberArcSin", kPlain},
    {224, "OCINumberArcTan", kPlain},
    {225, "OCINumberArcTan2", kPlain},
    {226, "OCINumberAssign", kPlain},
    {227, "OCINumberCeil", kPlain},
    {228, "OCINumberCmp", kPlain},
    {229, "OCINumberCos", kPlain},
    {230, "OCINumberDec", kPlain},
    {231, "OCINumberDiv", kPlain},
    {232, "OCINumberExp", kPlain},
    {233, "OCINumberFloor", kPlain},
    {234, "OCINumberFromInt", kPlain},
    {235, "OCINumberFromReal", kPlain},
    {236, "OCINumberFromText", kPlain},
    {237, "OCINumberHypCos", kPlain},
    {238, "OCINumberHypSin", kPlain},
    {239, "OCINumberHypTan", kPlain},
    {240, "OCINumberInc", kPlain},
    {241, "OCINumberIntPower", kPlain},
    {242, "OCINumberIsInt", kPlain},
    {243, "OCINumberIsZero", kPlain},
    {244, "OCINumberLn", kPlain},
    {245, "OCINumberLog", kPlain},
    {246, "OCINumberMod", kPlain},
    {247, "OCINumberMul", kPlain},
    {248, "OCINumberNeg", kPlain},
    {249, "OCINumberPower", kPlain},
    {250, "OCINumberPrec", kPlain},
    {251, "OCINumberRound", kPlain},
    {252, "OCINumberSetPi", kPlain},
    {253, "OCINumberSetZero", kPlain},
    {254, "OCINumberShift", kPlain},
    {255, "OCINumberSign", kPlain},
    {256, "OCINumberSin", kPlain},
    {257, "OCINumberSqrt", kPlain},
    {258, "OCINumberSub", kPlain},
    {259, "OCINumberTan", kPlain},
    {260, "OCINumberToInt", kPlain},
    {261, "OCINumberToReal", kPlain},
    {262, "OCINumberToRealArray", kPlain},
    {263, "OCINumberToText", kPlain},
    {264, "OCINumberTrunc", kPlain},
    {265, "OCIStringAllocSize", kHstring},
    {266, "OCIStringAssign", kHstring},
    {267, "OCIStringAssignText", kHstring},
    {268, "OCIStringPtr", kHstring},
    {269, "OCIStringResize", kHstring},
    {270, "OCIStringSize", kHstring},
    {271, "OCIFileClose", kHfile},
    {272, "OCIFileExists", kPlain},
    {273, "OCIFileFlush", kHfile},
    {274, "OCIFileGetLength", kPlain},
    {275, "OCIFileInit", kPlain},
    {276, "OCIFileOpen", kHfile},
    {277, "OCIFileRead", kHfile},
    {278, "OCIFileSeek", kHfile},
    {279, "OCIFileTerm", kPlain},
    {280, "OCIFileWrite", kHfile},
    {281, "OCIPasswordChange", kHsvc},
    {282, "OCIDateAddDays", kPlain},
    {283, "OCIDateAddMonths", kPlain},
    {284, "OCIDateAssign", kPlain},
    {285, "OCIDateCheck", kPlain},
    {286, "OCIDateCompare", kPlain},
    {287, "OCIDateDaysBetween", kPlain},
    {288, "OCIDateFromText", kPlain},
    {289, "OCIDateLastDay", kPlain},
    {290, "OCIDateNextDay", kPlain},
    {291, "OCIDateSysDate", kPlain},
    {292, "OCIDateToText", kPlain},
    {293, "OCIDateTimeAssign", kPlain},
    {294, "OCIDateTimeCheck", kPlain},
    {295, "OCIDateTimeCompare", kPlain},
    {296, "OCIDateTimeConstruct", kPlain},
    {297, "OCILobIsOpen", kHlob},
    {298, "OCILobAppend", kHlob},
    {299, "OCILobTrim", kHlob},
    {300, "OCILobCopy", kHlob},
    {301, "OCILobAssign", kHlob},
    {302, "OCILobIsEqual", kHlob},
    {303, "OCILobLocatorIsInit", kHlob},
    {304, "OCILobLocatorAssign", kHlob},
    {305, "OCILobEnableBuffering", kHlob},
    {306, "OCILobDisableBuffering", kHlob},
    {307, "OCILobFlushBuffer", kHlob},
    {308, "OCILobErase", kHlob},
    {309, "OCILobGetLength", kHlob},
    {310, "OCILobClose", kHlob},
    {311, "OCIStmtExecute", kHstmt},
    {312, "OCIStmtFetch", kHstmt},
    {313, "OCIStmtFetch2", kHstmt},
    {314, "OCIStmtPrepare", kHstmt},
    {315, "OCIStmtPrepare2", kHstmt},
    {316, "OCIStmtRelease", kHstmt},
    {317, "OCIAttrGet", kHandle},
    {318, "OCIAttrSet", kHandle},
    {321, "OCIDefineByPos", kHstmt},
    {322, "OCIDescribeAny", kHsvc},
    {323, "OCIBindByName", kHstmt},
    {324, "OCIBindByPos", kHstmt},
    {327, "OCIParamGet", kHandle},
    {329, "OCIErrorGet", kHandle},
    {331, "OCIDateTimeGetDate", kPlain},
    {332, "OCIDateTimeGetTime", kPlain},
    {333, "OCIDateTimeSetDate", kPlain},
    {334, "OCIDateTimeSetTime", kPlain},
    {336, "OCIStmtGetBindInfo", kHstmt},
    {337, "OCIDefineDynamic", kHdefine},
    {338, "OCIBindDynamic", kHbind},
    {339, "SetBindDynamicBuffers", kMemhandle},
    {340, "OCIDefineArrayOfStruct", kHdefine},
    {345, "OCIBindArrayOfStruct", kHbind},
    {346, "OCIResultSetToStmt", kHresult},
    {347, "OCIBreak", kHndlp},
    {348, "OCIStmtGetPieceInfo", kHstmt},
    {349, "OCIStmtSetPieceInfo", kHndlp},
    {353, "OCIReset", kHndlp},
    {354, "OCIRawResize", kHraw},
    {355, "OCIRawAllocSize", kHraw},
    {356, "OCIRawAssignBytes", kHraw},
    {357, "OCIRawAssignRaw", kHraw},
    {358, "OCIRawPtr", kHraw},
    {359, "OCIRawSize", kHraw},
    {362, "OCILobRead", kHlob},
    {363, "OCILobWrite", kHlob},
    {364, "OCILobIsTemporary", kHlob},
    {365, "OCILobFreeTemporary", kHlob},
    {366, "OCILobCreateTemporary", kHlob},
    {368, "xaoEnv", kHenv},
    {369, "xaoSvcCtx", kOciSvchp},
    {370, "OCITransStart", kHsvc},
    {371, "OCITransDetach", kHsvc},
    {372, "OCITransPrepare", kHsvc},
    {374, "OCITransMultiPrepare", kHsvc},
    {375, "OCITransForget", kHsvc},
    {376, "xaosterr", kOciSvchp},
    {377, "OCIThreadProcessInit", kUnended},
    {378, "OCIThreadMutexInit", kMutex},
    {379, "OCIThreadMutexDestroy", kMutex},
    {380, "OCIThreadMutexAcquire", kMutex},
    {381, "OCIThreadMutexRelease", kMutex},
    {382, "OCIThreadThreadIsMulti", kUnended},
    {383, "OCIThreadInit", kEnvhp},
    {384, "OCIThreadTerm", kEnvhp},
    {385, "OCIThreadKeyInit", kKey},
    {386, "OCIThreadKeyDestroy", kKey},
    {387, "OCIThreadKeySet", kKey},
    {388, "OCIThreadKeyGet", kKey},
    {389, "OCIThreadIdInit", kTid},
    {390, "OCIThreadIdDestroy", kTid},
    {391, "OCIThreadIdNull", kTid},
    {392, "OCIThreadIdGet", kTid},
    {393, "OCIThreadIdSame", kEnvhp},
    {394, "OCIThreadIdSetNull", kTid},
    {395, "OCIThreadIdSet", kTid},
    {396, "OCIThreadHndInit", kThnd},
    {397, "OCIThreadHndDestroy", kThnd},
    {398, "OCIThreadHandleGet", kThnd},
    {399, "OCIThreadCreate", kThnd},
    {400, "OCIThreadClose", kThnd},
    {401, "OCIThreadJoin", kThnd},
    {402, "OCISessionPoolDestroy", kSpoolhd},
    {403, "OCISessionPoolCreate", kSpoolhd},
    {404, "OCIConnectionPoolCreate", kPoolhd},
    {405, "OCIConnectionPoolDestroy", kPoolhd},
    {407, "OCISessionGet", kOciSvchp},
    {408, "OCISessionRelease", kOciSvchp},
    {409, "OCIArrayDescriptorAlloc", kHandle},
    {410, "OCIArrayDescriptorFree", kHandle},
    {411, "OCIRowidToChar", kHrowid},
    {412, "OCILobOpen", kHlob},
    {414, "olog", kLdaRc},
    {415, "ologof", kLdaRc},
    {416, "oopen", kCdaRc},
    {417, "oparse", kCdaRc},
    {418, "orol", kLdaRc},
    {419, "ocom", kLdaRc},
    {420, "odescr", kCdaRc},
    {421, "oclose", kCdaRc},
    {422, "ocon", kLdaRc},
    {423, "ocof", kLdaRc},
    {424, "ogetpi", kCdaRc},
    {425, "osetpi", kCdaRc},
    {426, "odefinps", kCdaRc},
    {427, "odefin", kCdaRc},
    {428, "obreak", kLdaRc},
    {429, "ocan", kCdaRc},
    {430, "oexec", kCdaRc},
    {431, "oexfet", kCdaRc},
    {432, "oexn", kCdaRc},
    {433, "OCILdaToSvcCtx", kLda},
    {434, "OCISvcCtxToLda", kSvchp},
    {435, "ofen", kCdaRc},
    {436, "ofetch", kCdaRc},
    {437, "onbclr", kLdaRc},
    {438, "onbset", kLdaRc},
    {439, "onbtst", kLdaRc},
    {440, "opinit", kRc},
    {441, "obindps", kCdaRc},
    {442, "obndra", kCdaRc},
    {443, "obndrv", kCdaRc},
    {444, "obndrn", kCdaRc},
    {445, "sqllda", kLdaRc},
    {447, "oflng", kCursorRc},
    {448, "getcda", kCda},
    {449, "oermsg", kRc},
    {450, "odessp", kLdaRc},
    {451, "oopt", kCdaRc},
    {452, "sqlld2", kLdaRc},
};

// Row of each code, for one step from a code to its line; null where a code has none.
struct TraceIndex {
    const TraceRow* rows[kLastCode - kFirstCode + 1] = {};
    constexpr TraceIndex() {
        for (const TraceRow& row : kTraceRows) rows[row.code - kFirstCode] = &row;
    }
};
constexpr TraceIndex kTraceIndex;

const TraceRow* FindTraceRow(int code) {
    return code < kFirstCode || code > kLastCode ? nullptr : kTraceIndex.rows[code - kFirstCode];
}

}  // namespace

void outputOCI(int code, long rc, const char* name) {
    constexpr char kGap[] = "             ";  // 13 blanks
    const TraceRow* row = FindTraceRow(code);
    if (row == nullptr) return Message(kError, "outputOCI (): unrecognized command!\n");
    if (name == nullptr) name = "";
    const char* label = row->label.text;
    switch (row->label.ending) {
        case Ending::name: return Message(kOutput, "%s%s%s%s\n", row->function, kGap, label, name);
        case Ending::name_and_rc:
            return Message(kOutput, "%s%s%s%s, rc = %ld\n", row->function, kGap, label, name, rc);
        case Ending::rc: return Message(kOutput, "%s%s%s%ld\n", row->function, kGap, label, rc);
        case Ending::plain: return Message(kOutput, "%s\n", row->function);
        case Ending::unended: return Message(kOutput, "%s", row->function);
    }
}

void TraceAndReport(int code, const char* name, void* error_handle, int rc) {
    outputOCI(code, rc, name);
    ReturnCodeReport(error_handle, rc);
}
