// Describing schema objects, and taking parameters out of statements, descriptions and other parameters. Command thread
// only.
#include "commands/families.h"
#include "commands/shared/word_arguments.h"
#include "core/messages.h"
#include "platform/client_library.h"
#include "report/trace.h"

namespace {

constexpr KeywordTable kPointerTypes[] = {{"oci_otype_name", 1}, kEndOfKeywords};
constexpr KeywordTable kInfoLevels[] = {{"oci_default", 0}, kEndOfKeywords};

ub1 DecodeByte(const char* word, const KeywordTable* keywords) {
    return static_cast<ub1>(DecodeKeywordOrNumber(word, keywords));
}

void DescribeAny(const CommandRow& row, int, char** words) {
    auto* const svc = Resolve<OCISvcCtx>(Kind::svc, words[1]);
    auto* const error = ResolveError<OCIError>(words[2]);
    TextArgument name;
    if (!name.SetWords(words + 3)) return;
    const ub1 pointer_type = DecodeByte(words[5], kPointerTypes);
    const ub1 level = DecodeByte(words[6], kInfoLevels);
    const ub1 object_type = DecodeByte(words[7], DescribeTypeKeywords);
    auto* const describe = Resolve<OCIDescribe>(Kind::describe, words[8]);
    const sword rc = Call(&ClientLibrary::OCIDescribeAny, svc, error, name.Text(), name.Length(), pointer_type, level,
                          object_type, describe);
    TraceAndReport(row.code, words[1], error, rc);
}

// What parameters are taken from. No error handle has any; of other types the first object of the name is meant.
void* ResolveDescribed(int type, const char* name) {
    switch (type) {
        case OCI_HTYPE_STMT: return Resolve<void>(Kind::stmt, name);
        case OCI_DTYPE_PARAM: return Resolve<void>(Kind::param, name);
        case OCI_HTYPE_ERROR: Message(kOutput, "Invalid handle type\n"); return nullptr;
        default: return ResolveErrorObject(name);
    }
}

// The environment of whatever the parameter was taken from.
void* ParentOfDescribed(const char* name) {
    for (const Kind kind : {Kind::stmt, Kind::param, Kind::describe})
        if (void* const parent = ParentOf(kind, name)) return parent;
    return nullptr;
}

// A name in use stands for the new parameter from now on.
void GetParameter(const CommandRow& row, int, char** words) {
    const int type = DecodeKeyword(words[2], HandleTypeKeywords);
    const void* const described = ResolveDescribed(type, words[1]);
    auto* const error = ResolveError<OCIError>(words[3]);
    NewObject<void> parameter(words[4]);
    const sword rc = Call(&ClientLibrary::OCIParamGet, described, static_cast<ub4>(type), error, parameter.Place(),
                          DecodeCount(words[5]));
    TraceAndReport(row.code, words[1], error, rc);
    if (rc == OCI_SUCCESS) parameter.EnterAnew(Kind::param, ParentOfDescribed(words[1]));
}

constexpr PlainCommand kDescribeCommands[] = {
    {{Code::ocidescribeany, Words(9),
      "OCIDescribeAny hSvc hError objectname objectname_len typename objectlevel objecttype hDescribe"},
     DescribeAny},
    {{Code::ociparamget, Words(6), "OCIParamGet hHandleIn handletype hError hHandleOut index"}, GetParameter},
};

}  // namespace

void AddDescribeCommands(HandlerTable& handlers) {
    handlers.Add(kDescribeCommands);
}
