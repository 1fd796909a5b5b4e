// The handles of an XA connection on the side of the call interface, and what an error number is there.
// Command thread only.
#include <cstring>

#include "commands/families.h"
#include "commands/shared/word_arguments.h"
#include "core/messages.h"
#include "platform/client_library.h"
#include "report/trace.h"

namespace {

struct HandleOf : CommandRow {
    Kind kind;
    const char* none;    // printed, with the database's name, where there is no handle
    void* (*call)(OraText* database);
};

void TakeHandle(const HandleOf& row, int, char** words) {
    if (CheckInUse(row.kind, words[2])) return;
    TextArgument database;
    if (!database.Set(words[1], static_cast<long>(std::strlen(words[1])), TextArea::four_times)) return;
    void* const handle = row.call(database.Text());
    if (handle == nullptr) return Message(kOutput, row.none, words[1]);
    outputOCI(row.code, OCI_SUCCESS, words[2]);
    Register(row.kind, words[2], handle, nullptr);
    if (row.kind == Kind::environment && DefaultEnvironment == nullptr)
        DefaultEnvironment = static_cast<OCIEnv*>(handle);
}

constexpr HandleOf kHandles[] = {
    {{Code::xaoenv, Words(3), "xaoEnv dbname envhp"}, Kind::environment, "henv NULL for %s\n",
     [](OraText* database) -> void* { return Call(&ClientLibrary::xaoEnv, database); }},
    {{Code::xaosvcctx, Words(3), "xaoSvcCtx dbname svchp"}, Kind::svc, "svchp is NULL for %s\n",
     [](OraText* database) -> void* { return Call(&ClientLibrary::xaoSvcCtx, database); }},
};

void TranslateError(const CommandRow& row, int, char** words) {
    auto* const svc = Resolve<OCISvcCtx>(Kind::svc, words[1]);
    const int result = Call(&ClientLibrary::xaosterr, svc, sb4{DecodeNumber(words[2])});
    outputOCI(row.code, result, words[1]);
    Message(kOutput, "xaosterr - %ld\n", static_cast<long>(result));
}

constexpr PlainCommand kPlainCommands[] = {
    {{Code::xaosterr, Words(3), "xaosterr svchp error"}, TranslateError},
};

}  // namespace

void AddXaHandleCommands(HandlerTable& handlers) {
    handlers.Add<TakeHandle>(kHandles);
    handlers.Add(kPlainCommands);
}
