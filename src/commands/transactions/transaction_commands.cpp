// Transactions of a service context: starting, leaving, preparing, ending. Command thread only.
#include <algorithm>

#include "commands/families.h"
#include "commands/shared/handle_call.h"
#include "core/messages.h"
#include "objects/memory.h"
#include "report/return_code.h"

namespace {

constexpr KeywordTable kNoTransFlags[] = {{"oci_default", 0}, kEndOfKeywords};

// A call on a service context and its error handle whose one argument more is flags.
using FlagsCall = LibraryFunction<sword(OCISvcCtx*, OCIError*, ub4)> ClientLibrary::*;

template <FlagsCall kFunction, int kFlagsWord, const KeywordTable* kFlags>
sword CallWithFlags(void* svc, OCIError* error, char** words) {
    return Call(kFunction, static_cast<OCISvcCtx*>(svc), error, DecodeMode(words[kFlagsWord], kFlags));
}

constexpr HandleCall kHandleCalls[] = {
    {{Code::ocitransstart, Words(5), "OCITransStart hSvc hError timeout flags"}, Kind::svc, Kind::svc,
     [](void* svc, OCIError* error, char** words) {
         const auto timeout = static_cast<uword>(DecodeNumber(words[3]));
         return Call(&ClientLibrary::OCITransStart, static_cast<OCISvcCtx*>(svc), error, timeout,
                     DecodeMode(words[4], TransStartKeywords));
     }},
    {{Code::ocitransdetach, Words(4), "OCITransDetach hSvc hError flags"}, Kind::svc, Kind::svc,
     CallWithFlags<&ClientLibrary::OCITransDetach, 3, kNoTransFlags>},
    {{Code::ocitransprepare, Words(4), "OCITransPrepare hSvc hError flags"}, Kind::svc, Kind::svc,
     CallWithFlags<&ClientLibrary::OCITransPrepare, 3, kNoTransFlags>},
    {{Code::ocitransforget, Words(4), "OCITransForget hSvc hError flags"}, Kind::svc, Kind::svc,
     CallWithFlags<&ClientLibrary::OCITransForget, 3, kNoTransFlags>},
    {{Code::ocitransrollback, Words(3), "OCITransRollback hSvc hError"}, Kind::svc, Kind::svc,
     [](void* svc, OCIError* error, char**) {
         return Call(&ClientLibrary::OCITransRollback, static_cast<OCISvcCtx*>(svc), error, ub4{OCI_DEFAULT});
     }},
};

void Commit(const CommandRow& row, int count, char** words) {
    auto* const svc = Resolve<OCISvcCtx>(Kind::svc, words[1]);
    auto* const error = ResolveError<OCIError>(words[2]);
    const ub4 flags = count > 3 ? DecodeMode(words[3], TransCommitKeywords) : OCI_DEFAULT;
    TraceAndReport(row.code, words[1], error, Call(&ClientLibrary::OCITransCommit, svc, error, flags));
}

// The one return code is reported against the error handle of every branch.
void PrepareBranches(const CommandRow& row, int count, char** words) {
    const int branches = DecodeNumber(words[2]);
    if ((count - 3) % 2 != 0 || (count - 3) / 2 != branches) return InvalidSyntax(row.usage);
    auto* const svc = Resolve<OCISvcCtx>(Kind::svc, words[1]);
    const auto room = static_cast<size_t>(std::max(branches, 1)) * sizeof(void*);
    const Memory<OCITrans*> transactions(static_cast<OCITrans**>(GetMem(room)));
    const Memory<OCIError*> errors(static_cast<OCIError**>(GetMem(room)));
    if (!transactions || !errors) return;
    char** const transaction_words = words + 3;
    char** const error_words = transaction_words + branches;
    for (int index = 0; index < branches; ++index)
        transactions.get()[index] = Resolve<OCITrans>(Kind::trans, transaction_words[index]);
    for (int index = 0; index < branches; ++index)
        errors.get()[index] = ResolveError<OCIError>(error_words[index]);
    const sword rc = Call(&ClientLibrary::OCITransMultiPrepare, svc, static_cast<ub4>(branches), transactions.get(),
                          errors.get());
    outputOCI(row.code, rc, words[1]);
    for (int index = 0; index < branches; ++index) ReturnCodeReport(errors.get()[index], rc);
}

constexpr PlainCommand kPlainCommands[] = {
    {{Code::ocitranscommit, Words(3, 4), "OCITransCommit hSvc hError [flags]"}, Commit},
    {{Code::ocitransmultiprepare, WordsFrom(3),
      "OCITransMultiPrepare hSvc numBranches txn1 txn2 ... txnN errhp1 errhp2 ... errhpN"},
     PrepareBranches},
};

}  // namespace

void AddTransactionCommands(HandlerTable& handlers) {
    handlers.Add<RunHandleCall>(kHandleCalls);
    handlers.Add(kPlainCommands);
}
