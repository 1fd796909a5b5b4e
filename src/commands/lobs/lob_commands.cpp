// LOB locators: making and freeing temporary ones, opening, lengths, copying, buffering, and assigning a text. Trace
// lines name the locator that stands first in the line. Command thread only.
#include <cstring>

#include "commands/families.h"
#include "commands/shared/word_arguments.h"
#include "core/messages.h"
#include "core/state.h"
#include "objects/lobs.h"
#include "objects/one_row_query.h"
#include "platform/client_library.h"
#include "report/return_code.h"
#include "report/trace.h"

namespace {

OCILobLocator* Locator(const char* name) {
    return Resolve<OCILobLocator>(Kind::lob, name);
}

// --- Calls on one locator --------------------------------------------------------------------------------------------

// "hSvc hError hLob", words[1] to words[3]; what further words mean is the call's own.
struct LobCall : CommandRow {
    sword (*call)(OCISvcCtx* svc, OCIError* error, OCILobLocator* lob, char** words);
};

void RunLobCall(const LobCall& row, int, char** words) {
    auto* const svc = Resolve<OCISvcCtx>(Kind::svc, words[1]);
    auto* const error = ResolveError<OCIError>(words[2]);
    OCILobLocator* const lob = Locator(words[3]);
    const sword rc = row.call(svc, error, lob, words);
    TraceAndReport(row.code, words[3], error, rc);
}

template <auto kFunction> sword CallPlain(OCISvcCtx* svc, OCIError* error, OCILobLocator* lob, char**) {
    return Call(kFunction, svc, error, lob);
}

constexpr KeywordTable kFlushFlags[] = {
    {"oci_lob_buffer_free", 1}, {"oci_lob_buffer_nofree", 2}, kEndOfKeywords};

constexpr LobCall kLobCalls[] = {
    {{Code::ocilobfreetemporary, Words(4), "OCILobFreeTemporary hSvc hError hLob"},
     CallPlain<&ClientLibrary::OCILobFreeTemporary>},
    {{Code::ocilobclose, Words(4), "OCILobClose hSvc hError hLob"}, CallPlain<&ClientLibrary::OCILobClose>},
    {{Code::ocilobenablebuffering, Words(4), "OCILobEnableBuffering hSvc hError hLob"},
     CallPlain<&ClientLibrary::OCILobEnableBuffering>},
    {{Code::ocilobdisablebuffering, Words(4), "OCILobDisableBuffering hSvc hError hLob"},
     CallPlain<&ClientLibrary::OCILobDisableBuffering>},
    {{Code::ocilobopen, Words(5), "OCILobOpen hSvc hError hLob mode"},
     [](OCISvcCtx* svc, OCIError* error, OCILobLocator* lob, char** words) {
         return Call(&ClientLibrary::OCILobOpen, svc, error, lob,
                     static_cast<ub1>(DecodeKeywordOrNumber(words[4], LobOpenModeKeywords)));
     }},
    {{Code::ocilobtrim, Words(5), "OCILobTrim hSvc hError hLob newlen"},
     [](OCISvcCtx* svc, OCIError* error, OCILobLocator* lob, char** words) {
         return Call(&ClientLibrary::OCILobTrim, svc, error, lob, DecodeCount(words[4]));
     }},
    {{Code::ocilobflushbuffer, Words(5), "OCILobFlushBuffer hSvc hError hLob flag"},
     [](OCISvcCtx* svc, OCIError* error, OCILobLocator* lob, char** words) {
         return Call(&ClientLibrary::OCILobFlushBuffer, svc, error, lob,
                     static_cast<ub4>(DecodeKeywordOrNumber(words[4], kFlushFlags)));
     }},
    {{Code::ocilobcopy, Words(8), "OCILobCopy hSvc hError hLobDst hLobSrc amount dstoffset srcoffset"},
     [](OCISvcCtx* svc, OCIError* error, OCILobLocator* target, char** words) {
         OCILobLocator* const source = Locator(words[4]);
         return Call(&ClientLibrary::OCILobCopy, svc, error, target, source, DecodeCount(words[5]),
                     DecodeCount(words[6]), DecodeCount(words[7]));
     }},
    {{Code::ocilobappend, Words(5), "OCILobAppend hSvc hError hLobDst hLobSrc"},
     [](OCISvcCtx* svc, OCIError* error, OCILobLocator* target, char** words) {
         return Call(&ClientLibrary::OCILobAppend, svc, error, target, Locator(words[4]));
     }},
};

// --- Questions -------------------------------------------------------------------------------------------------------

// "owner hError hLob [output]": the answer is printed unless its word is "null".
template <class Owner, class Lob, class Answer> struct LobQuestion : CommandRow {
    Kind owner;
    LibraryFunction<sword(Owner*, OCIError*, Lob*, Answer*)> ClientLibrary::*function;
};

template <class Owner, class Lob, class Answer>
void RunLobQuestion(const LobQuestion<Owner, Lob, Answer>& row, int count, char** words) {
    auto* const owner = Resolve<Owner>(row.owner, words[1]);
    auto* const error = ResolveError<OCIError>(words[2]);
    OCILobLocator* const lob = Locator(words[3]);
    Answer answer{};
    Answer* const place = Place(answer, count, words, 4);
    const sword rc = Call(row.function, owner, error, lob, place);
    TraceAndReport(row.code, words[3], error, rc);
    if (rc == OCI_SUCCESS && place != nullptr) Message(kOutput, "%ld\n", static_cast<long>(answer));
}

constexpr LobQuestion<OCISvcCtx, OCILobLocator, ub4> kLengthQuestions[] = {
    {{Code::ocilobgetlength, Words(4, 5), "OCILobGetLength hSvc hError hLob [len]"}, Kind::svc,
     &ClientLibrary::OCILobGetLength},
};
constexpr LobQuestion<OCISvcCtx, OCILobLocator, boolean> kSessionQuestions[] = {
    {{Code::ocilobisopen, Words(4, 5), "OCILobIsOpen hSvc hError hLob [isopen]"}, Kind::svc,
     &ClientLibrary::OCILobIsOpen},
};
constexpr LobQuestion<OCIEnv, OCILobLocator, boolean> kTemporaryQuestions[] = {
    {{Code::ocilobistemporary, Words(4, 5), "OCILobIsTemporary hEnv hError hLob [is_temporary]"}, Kind::environment,
     &ClientLibrary::OCILobIsTemporary},
};
constexpr LobQuestion<OCIEnv, const OCILobLocator, boolean> kLocatorQuestions[] = {
    {{Code::ociloblocatorisinit, Words(4, 5), "OCILobLocatorIsInit hEnv hError hLob [isinit]"}, Kind::environment,
     &ClientLibrary::OCILobLocatorIsInit},
};

// No error handle: what went wrong is told by the environment.
void CompareLobs(const CommandRow& row, int count, char** words) {
    auto* const environment = Resolve<OCIEnv>(Kind::environment, words[1]);
    const OCILobLocator* const left = Locator(words[2]);
    const OCILobLocator* const right = Locator(words[3]);
    boolean equal = FALSE;
    boolean* const place = Place(equal, count, words, 4);
    const sword rc = Call(&ClientLibrary::OCILobIsEqual, environment, left, right, place);
    outputOCI(row.code, rc, words[2]);
    EnvironmentReport(environment, rc);
    if (rc == OCI_SUCCESS && place != nullptr) Message(kOutput, "%ld\n", static_cast<long>(equal));
}

void EraseLob(const CommandRow& row, int, char** words) {
    auto* const svc = Resolve<OCISvcCtx>(Kind::svc, words[1]);
    auto* const error = ResolveError<OCIError>(words[2]);
    OCILobLocator* const lob = Locator(words[3]);
    ub4 amount = DecodeCount(words[4]);
    const sword rc = Call(&ClientLibrary::OCILobErase, svc, error, lob, &amount, DecodeCount(words[5]));
    TraceAndReport(row.code, words[3], error, rc);
    if (rc == OCI_SUCCESS) Message(kOutput, "Amount erased - %ld\n", static_cast<long>(amount));
}

// --- Assigning locators ----------------------------------------------------------------------------------------------

// The library may put another locator in the place of the target, which the name then stands for.
void AssignInEnvironment(const CommandRow& row, int, char** words) {
    auto* const environment = Resolve<OCIEnv>(Kind::environment, words[1]);
    Resolve<OCISvcCtx>(Kind::svc, words[2]);  // a word of the line that the call has no use for
    auto* const error = ResolveError<OCIError>(words[3]);
    const OCILobLocator* const source = Locator(words[4]);
    OCILobLocator** const target = ResolveLob(words[5]).place;
    const sword rc = Call(&ClientLibrary::OCILobAssign, environment, error, source, target);
    TraceAndReport(row.code, words[4], error, rc);
}

void AssignInSession(const CommandRow& row, int, char** words) {
    auto* const svc = Resolve<OCISvcCtx>(Kind::svc, words[1]);
    auto* const error = ResolveError<OCIError>(words[2]);
    const OCILobLocator* const source = Locator(words[3]);
    OCILobLocator** const target = ResolveLob(words[4]).place;
    const sword rc = Call(&ClientLibrary::OCILobLocatorAssign, svc, error, source, target);
    TraceAndReport(row.code, words[3], error, rc);
}

// --- Types and temporary LOBs ----------------------------------------------------------------------------------------

constexpr KeywordTable kLocatorTypes[] = {
    {"sqlt_clob", SQLT_CLOB}, {"sqlt_blob", SQLT_BLOB}, {"sqlt_dbclob", SQLT_DBCLOB}, kEndOfKeywords};

uint16_t TypeOfTemporary(ub1 kind) {
    switch (kind) {
        case OCI_TEMP_BLOB: return SQLT_BLOB;
        case OCI_TEMP_NCLOB: return SQLT_DBCLOB;
        default: return SQLT_CLOB;
    }
}

void CreateTemporary(const CommandRow& row, int, char** words) {
    constexpr KeywordTable kDurations[] = {
        {"oci_duration_session", 0xa}, {"oci_duration_call", 0xc}, kEndOfKeywords};
    auto* const svc = Resolve<OCISvcCtx>(Kind::svc, words[1]);
    auto* const error = ResolveError<OCIError>(words[2]);
    const LobReference lob = ResolveLob(words[3]);
    const auto character_set = static_cast<ub2>(DecodeKeywordOrNumber(words[4], CharsetIdKeywords));
    const auto form = static_cast<ub1>(DecodeKeywordOrNumber(words[5], CharsetFormKeywords));
    const auto kind = static_cast<ub1>(DecodeKeywordOrNumber(words[6], TempLobKeywords));
    const boolean cache = DecodeKeywordOrNumber(words[7], BooleanKeywords);
    const auto duration = static_cast<OCIDuration>(DecodeKeywordOrNumber(words[8], kDurations));
    const sword rc = Call(&ClientLibrary::OCILobCreateTemporary, svc, error, lob.locator, character_set, form, kind,
                          cache, duration);
    TraceAndReport(row.code, words[3], error, rc);
    if (rc == OCI_SUCCESS && lob.slot != nullptr) lob.slot->type = TypeOfTemporary(kind);
}

void UpdateType(const CommandRow&, int, char** words) {
    const LobReference lob = ResolveLob(words[1]);
    if (lob.slot == nullptr) return;
    lob.slot->type = static_cast<uint16_t>(DecodeKeywordOrNumber(words[2], kLocatorTypes));
    Message(kOutput, "Lob handle C type updated for %s\n", words[1]);
}

// --- Assigning a text ------------------------------------------------------------------------------------------------

// Whether the recorded type is a locator's: a script may have recorded any number.
bool IsLocatorType(uint16_t type) {
    return type == SQLT_CLOB || type == SQLT_BLOB || type == SQLT_DBCLOB;
}

// A query turns the text into a LOB and fetches it into the locator. What it fetches under another type stays out of the
// table.
void AssignTextToLob(const CommandRow&, int, char** words) {
    const LobReference lob = ResolveLob(words[1]);
    TextArgument text;
    if (!text.SetWords(words + 2)) return;
    const auto length = static_cast<sb4>(text.Length());
    // The library reads all of it, and takes what is negative for no length.
    if (length > sb4{TextArgument::kReadableText}) return Message(kError, "Could not allocate memory\n");
    const uint16_t type = lob.Type();
    OCILobLocator* locator = lob.locator;
    OneRowQuery query;
    query.Prepare(type == SQLT_BLOB ? "values(cast(:1 as blob))" : "values(cast(:1 as clob))");
    query.Define(&locator, sizeof locator, type);
    query.Bind(text.Text(), length, SQLT_CHR);
    const sword rc = query.Execute();
    if (rc == OCI_SUCCESS && lob.place != nullptr && IsLocatorType(type)) *lob.place = locator;
    ReturnCodeReport(DefaultErrorHandle, rc);
    if (rc == OCI_SUCCESS) Message(kOutput, "AssignTextToLob: lob %s updated.\n", words[1]);
}

constexpr PlainCommand kPlainCommands[] = {
    {{Code::ocilobisequal, Words(4, 5), "OCILobIsEqual hEnv hLobSrc hLobDst [isequal]"}, CompareLobs},
    {{Code::ociloberase, Words(6), "OCILobErase hSvc hError hLob amount offset"}, EraseLob},
    {{Code::ocilobassign, Words(6), "OCILobAssign hEnv hSvc hError hLobSrc hLobDst"}, AssignInEnvironment},
    {{Code::ociloblocatorassign, Words(5), "OCILobLocatorAssign hSvc hError hLobSrc hLobDst"}, AssignInSession},
    {{Code::ocilobcreatetemporary, Words(9),
      "OCILobCreateTemporary hSvc hError hLob csid csfrm lobtype cache duration"},
     CreateTemporary},
    {{Code::updatelobdescriptorctype, Words(3),
      "UpdateLobDescriptorCType hLob {SQLT_CLOB | SQLT_BLOB | SQLT_DBCLOB}"},
     UpdateType},
    {{Code::assigntexttolob, Words(4), "AssignTextToLob clob value len"}, AssignTextToLob},
};

}  // namespace

void AddLobCommands(HandlerTable& handlers) {
    handlers.Add<RunLobCall>(kLobCalls);
    handlers.Add<RunLobQuestion<OCISvcCtx, OCILobLocator, ub4>>(kLengthQuestions);
    handlers.Add<RunLobQuestion<OCISvcCtx, OCILobLocator, boolean>>(kSessionQuestions);
    handlers.Add<RunLobQuestion<OCIEnv, OCILobLocator, boolean>>(kTemporaryQuestions);
    handlers.Add<RunLobQuestion<OCIEnv, const OCILobLocator, boolean>>(kLocatorQuestions);
    handlers.Add(kPlainCommands);
}
