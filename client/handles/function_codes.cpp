#include "handles/function_codes.h"

#include <string_view>

namespace {

struct Code {
    std::string_view function;
    std::uint32_t code;
};

// What can be told of: calls that record somewhere. The wide form of a call has the number of the plain one.
constexpr Code kCodes[] = {
    {"OCIHandleAlloc", 2}, {"OCIDescriptorAlloc", 4}, {"OCIServerAttach", 7}, {"OCIServerDetach", 8},
    {"OCISessionBegin", 10}, {"OCISessionEnd", 11}, {"OCIPasswordChange", 12}, {"OCIStmtPrepare", 13},
    {"OCIBindDynamic", 17}, {"OCIBindArrayOfStruct", 20}, {"OCIStmtExecute", 21}, {"OCIDefineDynamic", 26},
    {"OCIDefineArrayOfStruct", 27}, {"OCIStmtFetch", 28}, {"OCIStmtGetBindInfo", 29}, {"OCIDescribeAny", 32},
    {"OCITransStart", 33}, {"OCITransDetach", 34}, {"OCITransCommit", 35}, {"OCILobCopy", 42}, {"OCILobAppend", 43},
    {"OCILobErase", 44}, {"OCILobGetLength", 45}, {"OCILobTrim", 46}, {"OCILobRead", 47}, {"OCILobWrite", 48},
    {"OCIBreak", 50}, {"OCIServerVersion", 51}, {"OCIAttrGet", 54}, {"OCIAttrSet", 55}, {"OCIParamGet", 57},
    {"OCIStmtGetPieceInfo", 58}, {"OCILdaToSvcCtx", 59}, {"OCIStmtSetPieceInfo", 61}, {"OCITransForget", 62},
    {"OCITransPrepare", 63}, {"OCITransRollback", 64}, {"OCIDefineByPos", 65}, {"OCIBindByPos", 66},
    {"OCIBindByName", 67}, {"OCILobAssign", 68}, {"OCILobIsEqual", 69}, {"OCILobLocatorIsInit", 70},
    {"OCILobEnableBuffering", 71}, {"OCILogon", 76}, {"OCILogoff", 77}, {"OCILobDisableBuffering", 78},
    {"OCILobFlushBuffer", 79}, {"OCILobOpen", 81}, {"OCILobClose", 82}, {"OCILobIsOpen", 83},
    {"OCILobCreateTemporary", 87}, {"OCILobFreeTemporary", 88}, {"OCILobIsTemporary", 89}, {"OCIReset", 92},
    {"OCISvcCtxToLda", 93}, {"OCILobLocatorAssign", 94}, {"OCITransMultiPrepare", 99},
    {"OCIConnectionPoolCreate", 100}, {"OCIConnectionPoolDestroy", 101}, {"OCILogon2", 102}, {"OCIRowidToChar", 103},
    {"OCISessionPoolCreate", 104}, {"OCISessionPoolDestroy", 105}, {"OCISessionGet", 106}, {"OCISessionRelease", 107},
    {"OCIStmtPrepare2", 108}, {"OCIStmtRelease", 109}, {"OCIArrayDescriptorAlloc", 127},
    {"OCILobCopy2", 42}, {"OCILobErase2", 44}, {"OCILobGetLength2", 45}, {"OCILobTrim2", 46}, {"OCILobRead2", 47},
    {"OCILobWrite2", 48},
    {"OCIStmtFetch2", 28}, {"OCIDefineByPos2", 65}, {"OCIBindByPos2", 66}, {"OCIBindByName2", 67},
};

}  // namespace

std::uint32_t FunctionCode(const char* name) noexcept {
    const std::string_view wanted = name ? name : "";
    for (const Code& row : kCodes) {
        if (row.function == wanted) return row.code;
    }
    return 0;
}
