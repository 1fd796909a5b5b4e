// Preparing, executing and releasing statements, fetching, bind information. Lengths are passed as typed.
// Command thread only.
#include <algorithm>

#include "commands/families.h"
#include "commands/shared/handle_call.h"
#include "core/messages.h"
#include "core/state.h"
#include "objects/text_conversion.h"

namespace {

// The display of values asks for the mode under which the statement's data came.
void RecordUtf16Mode(NamedObject* slot) {
    if (slot != nullptr) AsRecord<Kind::stmt>(slot)->utf16_mode = Utf16Mode ? OCI_UTF16 : 0;
}

// --- Preparing and executing -----------------------------------------------------------------------------------------

void Prepare(const CommandRow& row, int, char** words) {
    auto* const statement = Resolve<OCIStmt>(Kind::stmt, words[1]);
    auto* const error = ResolveError<OCIError>(words[2]);
    TextArgument text;
    if (!text.SetWords(words + 3, TextArea::four_times_and_one)) return;
    const ub4 syntax = DecodeStatementMode(words[5], SyntaxKeywords);
    const ub4 mode = DecodeStatementMode(words[6], Prepare2ModeKeywords);
    const sword rc = Call(&ClientLibrary::OCIStmtPrepare, statement, error, text.Text(), text.Length(), syntax, mode);
    TraceAndReport(row.code, words[1], error, rc);
    RecordUtf16Mode(FindByName(Kind::stmt, words[1]));
}

void PrepareNew(const CommandRow& row, int, char** words) {
    auto* const svc = Resolve<OCISvcCtx>(Kind::svc, words[1]);
    auto* const error = ResolveError<OCIError>(words[3]);
    const char* const name = words[2];
    if (CheckInUse(Kind::stmt, name)) return;
    NewObject<OCIStmt> statement(name);
    TextArgument text, key;
    if (!text.SetWords(words + 4, TextArea::four_times_and_one)) return;
    if (!key.SetWords(words + 6, TextArea::four_times_and_one)) return;
    const ub4 syntax = DecodeStatementMode(words[8], SyntaxKeywords);
    const ub4 mode = DecodeStatementMode(words[9], Prepare2ModeKeywords);
    const sword rc = Call(&ClientLibrary::OCIStmtPrepare2, svc, statement.Place(), error, text.Text(), text.Length(),
                          key.Text(), key.Length(), syntax, mode);
    TraceAndReport(row.code, name, error, rc);
    if (rc == OCI_SUCCESS) RecordUtf16Mode(statement.Enter(Kind::stmt, ParentOf(Kind::svc, words[1])));
}

void ReleaseStatement(const CommandRow& row, int, char** words) {
    auto* const statement = Resolve<OCIStmt>(Kind::stmt, words[1]);
    auto* const error = ResolveError<OCIError>(words[2]);
    TextArgument key;
    if (!key.SetWords(words + 3, TextArea::four_times_and_one)) return;
    const ub4 mode = DecodeStatementMode(words[5], ReleaseModeKeywords);
    const sword rc = Call(&ClientLibrary::OCIStmtRelease, statement, error, key.Text(), key.Length(), mode);
    TraceAndReport(row.code, words[1], error, rc);
    if (rc == OCI_SUCCESS) Release(Kind::stmt, words[1]);
}

void Execute(const CommandRow& row, int, char** words) {
    auto* const svc = Resolve<OCISvcCtx>(Kind::svc, words[1]);
    auto* const statement = Resolve<OCIStmt>(Kind::stmt, words[2]);
    auto* const error = ResolveError<OCIError>(words[3]);
    const ub4 mode = DecodeStatementMode(words[6], ExecuteModeKeywords);
    const sword rc = Call(&ClientLibrary::OCIStmtExecute, svc, statement, error, DecodeCount(words[4]),
                          DecodeCount(words[5]), nullptr, nullptr, mode);
    TraceAndReport(row.code, words[2], error, rc);
    RecordUtf16Mode(FindByName(Kind::stmt, words[2]));
}

constexpr PlainCommand kPlainCommands[] = {
    {{Code::ocistmtprepare, Words(7), "OCIStmtPrepare hStmt hError stmttext stmttext_len syntax mode"}, Prepare},
    {{Code::ocistmtprepare2, Words(10),
      "OCIStmtPrepare2 hSvc hStmt hError stmttext stmttext_len key key_len syntax mode"},
     PrepareNew},
    {{Code::ocistmtrelease, Words(6), "OCIStmtRelease hStmt hError key keylen mode"}, ReleaseStatement},
    {{Code::ocistmtexecute, Words(7), "OCIStmtExecute hSvc hStmt hError rows rowoffset mode"}, Execute},
};

constexpr HandleCall kHandleCalls[] = {
    {{Code::ociresultsettostmt, Words(3), "OCIResultSetToStmt hResult hError"}, Kind::result, Kind::stmt,
     [](void* result, OCIError* error, char**) {
         return Call(&ClientLibrary::OCIResultSetToStmt, static_cast<OCIResult*>(result), error);
     }},
};

// --- Fetching --------------------------------------------------------------------------------------------------------

struct Fetch : CommandRow {
    sword (*fetch)(OCIStmt* statement, OCIError* error, ub4 rows, ub2 orientation, char** words);
};

bool MayHaveRows(sword rc) {
    return rc != OCI_ERROR && rc != OCI_INVALID_HANDLE && rc != OCI_NEED_DATA;
}

void PrintRowsFetched(OCIStmt* statement, OCIError* error) {
    ub4 rows = 0;
    const sword rc = Call(&ClientLibrary::OCIAttrGet, statement, ub4{OCI_HTYPE_STMT}, &rows, nullptr,
                          ub4{OCI_ATTR_ROWS_FETCHED}, error);
    if (rc == OCI_SUCCESS) Message(kOutput, "Rows fetched - %ld\n", static_cast<long>(rows));
}

void RunFetch(const Fetch& row, int, char** words) {
    auto* const statement = Resolve<OCIStmt>(Kind::stmt, words[1]);
    auto* const error = ResolveError<OCIError>(words[2]);
    const auto orientation = static_cast<ub2>(DecodeStatementMode(words[4], FetchOrientationKeywords));
    const sword rc = row.fetch(statement, error, DecodeCount(words[3]), orientation, words);
    TraceAndReport(row.code, words[1], error, rc);
    if (MayHaveRows(rc)) PrintRowsFetched(statement, error);
}

constexpr Fetch kFetches[] = {
    {{Code::ocistmtfetch, Words(6), "OCIStmtFetch hStmt hError rows orientation mode"},
     [](OCIStmt* statement, OCIError* error, ub4 rows, ub2 orientation, char** words) {
         return Call(&ClientLibrary::OCIStmtFetch, statement, error, rows, orientation,
                     DecodeStatementMode(words[5], FetchModeKeywords));
     }},
    {{Code::ocistmtfetch2, Words(7), "OCIStmtFetch2 hStmt hError rows orientation offset mode"},
     [](OCIStmt* statement, OCIError* error, ub4 rows, ub2 orientation, char** words) {
         return Call(&ClientLibrary::OCIStmtFetch2, statement, error, rows, orientation,
                     static_cast<sb4>(DecodeNumber(words[5])), DecodeStatementMode(words[6], FetchModeKeywords));
     }},
};

// --- Bind information ------------------------------------------------------------------------------------------------

constexpr ub4 kMostBinds = 100;

// What the library tells about placeholders. Whatever it answers, no more is read than the arrays hold.
struct BindInfo {
    sb4 found = 0;
    OraText* names[kMostBinds] = {};
    ub1 name_lengths[kMostBinds] = {};
    OraText* indicators[kMostBinds] = {};
    ub1 indicator_lengths[kMostBinds] = {};
    ub1 duplicates[kMostBinds] = {};
    OCIBind* binds[kMostBinds] = {};

    // How many entries to show: a negative count says that there are more than were asked for.
    ub4 Entries(ub4 asked_for) const {
        const ub4 count = found < 0 ? 0 - static_cast<ub4>(found) : static_cast<ub4>(found);
        return std::min({count, asked_for, kMostBinds});
    }
    bool Print(ub4 index) const;
};

// A name that the library gave no text for is empty, whatever its length says.
bool AddName(Line& line, const OraText* name, ub1 length) {
    return AddText(line, name, name == nullptr ? 0 : length, Utf16Mode);
}

// False after a failed conversion, which has been said.
bool BindInfo::Print(ub4 index) const {
    Line line;
    line.Format("%u varlen=%d ", index, name_lengths[index]);
    if (!AddName(line, names[index], name_lengths[index])) return false;
    line.Format(" indlen=%d ", indicator_lengths[index]);
    if (!AddName(line, indicators[index], indicator_lengths[index])) return false;
    line.Format("dupl=%d\n", duplicates[index]).Print();
    return true;
}

// The seven output words that a longer line gives: each may refuse its array.
enum OutputWord { kFound = 5, kNames, kNameLengths, kIndicators, kIndicatorLengths, kDuplicates, kBinds };

void GetBindInfo(const CommandRow& row, int count, char** words) {
    auto* const statement = Resolve<OCIStmt>(Kind::stmt, words[1]);
    auto* const error = ResolveError<OCIError>(words[2]);
    const ub4 size = DecodeCount(words[3]);
    if (size > kMostBinds) return Message(kError, "Can't do more than 100 in tool\n");
    BindInfo info;
    const auto place = [&](auto* output, OutputWord word) {
        return count > word && IsNull(words[word]) ? nullptr : output;
    };
    const sword rc = Call(&ClientLibrary::OCIStmtGetBindInfo, statement, error, size, DecodeCount(words[4]),
                          place(&info.found, kFound), place(info.names, kNames), place(info.name_lengths, kNameLengths),
                          place(info.indicators, kIndicators), place(info.indicator_lengths, kIndicatorLengths),
                          place(info.duplicates, kDuplicates), place(info.binds, kBinds));
    TraceAndReport(row.code, words[1], error, rc);
    if (rc != OCI_SUCCESS && rc != OCI_SUCCESS_WITH_INFO) return;
    Message(kOutput, "found - %ld\n", static_cast<long>(info.found));
    for (ub4 index = 0; index < info.Entries(size); ++index)
        if (!info.Print(index)) return;
}

constexpr PlainCommand kBindInfoCommands[] = {
    {{Code::ocistmtgetbindinfo, Words(5, 12),
      "OCIStmtGetBindInfo hStmt hError size startloc [pfound pbvnp pbvnl pinvp pinpl pdupl phndl]"},
     GetBindInfo},
};

}  // namespace

void AddStatementCommands(HandlerTable& handlers) {
    handlers.Add(kPlainCommands);
    handlers.Add<RunHandleCall>(kHandleCalls);
    handlers.Add<RunFetch>(kFetches);
    handlers.Add(kBindInfoCommands);
}
