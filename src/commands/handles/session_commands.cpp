// Logging on and off, servers and sessions, versions, breaking a call. Lengths are passed as typed.
// Command thread only.
#include <algorithm>
#include <cstring>
#include <vector>

#include "commands/families.h"
#include "commands/shared/handle_call.h"
#include "commands/shared/pool_name.h"
#include "core/messages.h"
#include "core/state.h"
#include "objects/text_conversion.h"
#include "platform/utf.h"

namespace {

// --- Calls on one handle ---------------------------------------------------------------------------------------------

// Where the library's own modes differ from those of environments, scripts give numbers.
constexpr HandleCall kHandleCalls[] = {
    {{Code::ocilogoff, Words(3), "OCILogoff hSvc hError"}, Kind::svc, Kind::svc,
     [](void* svc, OCIError* error, char**) {
         return Call(&ClientLibrary::OCILogoff, static_cast<OCISvcCtx*>(svc), error);
     }},
    {{Code::ociserverdetach, Words(4), "OCIServerDetach hServer hError mode"}, Kind::server, Kind::server,
     [](void* server, OCIError* error, char** words) {
         return Call(&ClientLibrary::OCIServerDetach, static_cast<OCIServer*>(server), error, DecodeMode(words[3]));
     }},
    {{Code::ocisessionbegin, Words(6), "OCISessionBegin hSvc hError hSession credit mode"}, Kind::svc, Kind::svc,
     [](void* svc, OCIError* error, char** words) {
         auto* const session = Resolve<OCISession>(Kind::session, words[3]);
         const ub4 credentials = DecodeMode(words[4], CredentialKeywords);
         const ub4 mode = DecodeMode(words[5], SessionBeginKeywords);
         return Call(&ClientLibrary::OCISessionBegin, static_cast<OCISvcCtx*>(svc), error, session, credentials, mode);
     }},
    {{Code::ocisessionend, Words(5), "OCISessionEnd hSvc hError hSession mode"}, Kind::svc, Kind::svc,
     [](void* svc, OCIError* error, char** words) {
         auto* const session = Resolve<OCISession>(Kind::session, words[3]);
         return Call(&ClientLibrary::OCISessionEnd, static_cast<OCISvcCtx*>(svc), error, session, DecodeMode(words[4]));
     }},
    {{Code::ociping, Words(4), "OCIPing hSvc hError mode"}, Kind::svc, Kind::svc,
     [](void* svc, OCIError* error, char** words) {
         return Call(&ClientLibrary::OCIPing, static_cast<OCISvcCtx*>(svc), error, DecodeMode(words[3]));
     }},
    {{Code::ocibreak, Words(3), "OCIBreak {hSvc | hServer} hError"}, Kind::svc, Kind::server,
     [](void* handle, OCIError* error, char**) { return Call(&ClientLibrary::OCIBreak, handle, error); }},
    {{Code::ocireset, Words(3), "OCIReset {hSvc | hServer} hError"}, Kind::svc, Kind::server,
     [](void* handle, OCIError* error, char**) { return Call(&ClientLibrary::OCIReset, handle, error); }},
};

// --- Logging on ------------------------------------------------------------------------------------------------------

struct LogonTexts {
    TextArgument user, password, server;

    bool Set(char** words) {
        return user.SetWords(words) && SetPassword(password, words[2], DecodeLong(words[3])) &&
               server.SetWords(words + 4);
    }
};

struct Logon : CommandRow {
    sword (*call)(OCIEnv* environment, OCIError* error, OCISvcCtx** place, LogonTexts& texts, char** words);
};

// A name in use hands over its service context and stays as it is.
void RunLogon(const Logon& row, int, char** words) {
    auto* const environment = Resolve<OCIEnv>(Kind::environment, words[1]);
    auto* const error = ResolveError<OCIError>(words[2]);
    NewObject<OCISvcCtx> svc(words[3]);
    const NamedObject* const held = FindByName(Kind::svc, words[3]);
    if (held != nullptr) svc.Hand(static_cast<OCISvcCtx*>(held->object));
    LogonTexts texts;
    if (!texts.Set(words + 4)) return;
    const sword rc = row.call(environment, error, svc.Place(), texts, words);
    TraceAndReport(row.code, words[3], error, rc);
    if (rc == OCI_SUCCESS && held == nullptr) svc.Enter(Kind::svc, environment);
}

constexpr Logon kLogons[] = {
    {{Code::ocilogon, Words(10),
      "OCILogon hEnv hError hSvc username username_len password password_len server server_len"},
     [](OCIEnv* environment, OCIError* error, OCISvcCtx** place, LogonTexts& texts, char**) {
         return Call(&ClientLibrary::OCILogon, environment, error, place, texts.user.Text(), texts.user.Length(),
                     texts.password.Text(), texts.password.Length(), texts.server.Text(), texts.server.Length());
     }},
    {{Code::ocilogon2, Words(11),
      "OCILogon2 hEnv hError hSvc username username_len password password_len server server_len mode"},
     [](OCIEnv* environment, OCIError* error, OCISvcCtx** place, LogonTexts& texts, char** words) {
         const ub4 mode = DecodeMode(words[10], Logon2ModeKeywords);
         UsePoolName(texts.server, words[8], mode, kLogonPoolModes);
         return Call(&ClientLibrary::OCILogon2, environment, error, place, texts.user.Text(), texts.user.Length(),
                     texts.password.Text(), texts.password.Length(), texts.server.Text(), texts.server.Length(), mode);
     }},
};

// --- Calls with texts ------------------------------------------------------------------------------------------------

void AttachServer(const CommandRow& row, int, char** words) {
    auto* const server = Resolve<OCIServer>(Kind::server, words[1]);
    auto* const error = ResolveError<OCIError>(words[2]);
    TextArgument name;
    if (!name.SetWords(words + 3)) return;
    const ub4 mode = DecodeMode(words[5], ServerAttachKeywords);
    UsePoolName(name, words[3], mode, kAttachPoolModes);
    const sword rc = Call(&ClientLibrary::OCIServerAttach, server, error, name.Text(), static_cast<sb4>(name.Length()),
                          mode);
    TraceAndReport(row.code, words[1], error, rc);
}

void ChangePassword(const CommandRow& row, int, char** words) {
    auto* const svc = Resolve<OCISvcCtx>(Kind::svc, words[1]);
    auto* const error = ResolveError<OCIError>(words[2]);
    TextArgument user, old_password, new_password;
    if (!user.SetWords(words + 3) || !old_password.SetWords(words + 5) || !new_password.SetWords(words + 7)) return;
    const sword rc = Call(&ClientLibrary::OCIPasswordChange, svc, error, user.Text(), user.Length(),
                          old_password.Text(), old_password.Length(), new_password.Text(),
                          static_cast<sb4>(new_password.Length()), DecodeMode(words[9]));
    TraceAndReport(row.code, words[1], error, rc);
}

// --- Versions --------------------------------------------------------------------------------------------------------

void* ResolveVersionHandle(int type, const char* type_word, const char* name) {
    switch (type) {
        case OCI_HTYPE_SVCCTX: return Resolve<void>(Kind::svc, name);
        case OCI_HTYPE_SERVER: return Resolve<void>(Kind::server, name);
        default: Message(kError, "Invalid handle type - %s\n", type_word); return nullptr;
    }
}

// Room for what the library may write when told the typed length, within reason: a version is a few lines.
size_t RoomFor(int typed_length) {
    constexpr int kLeast = 1024;
    constexpr int kMost = 1 << 20;
    return static_cast<size_t>(typed_length < 0 ? kMost : std::clamp(typed_length, kLeast, kMost));
}

void ShowServerVersion(const CommandRow& row, int count, char** words) {
    constexpr int kOwnLength = 40;
    const int type = DecodeKeyword(words[3], HandleTypeKeywords);
    void* const handle = ResolveVersionHandle(type, words[3], words[1]);
    auto* const error = ResolveError<OCIError>(words[2]);
    const int length = count == 6 ? DecodeNumber(words[5]) : kOwnLength;
    std::vector<OraText> room(RoomFor(length));
    OraText* const text = count == 6 && IsNull(words[4]) ? nullptr : room.data();
    const sword rc = Call(&ClientLibrary::OCIServerVersion, handle, error, text, static_cast<ub4>(length),
                          static_cast<ub1>(type));
    TraceAndReport(row.code, words[1], error, rc);
    if (text == nullptr || (rc != OCI_SUCCESS && rc != OCI_SUCCESS_WITH_INFO)) return;
    const size_t shown = Utf16Mode ? utf::Utf16Length(text, room.size())
                                   : strnlen(reinterpret_cast<const char*>(text), room.size());
    Line line;
    if (AddText(line, text, shown, Utf16Mode)) line.Character('\n').Print();
}

// A number that is given no place prints as "null".
void ShowClientVersion(const CommandRow& row, int count, char** words) {
    sword numbers[5] = {};
    sword* places[5];
    for (int index = 0; index < 5; ++index)
        places[index] = count > 1 && IsNull(words[1 + index]) ? nullptr : &numbers[index];
    Call(&ClientLibrary::OCIClientVersion, places[0], places[1], places[2], places[3], places[4]);
    outputOCI(row.code, OCI_SUCCESS, "");
    Line line;
    for (const sword* place : places) {
        if (!line.Empty()) line.Character('.');
        if (place == nullptr) line.Text("null");
        else line.Format("%d", *place);
    }
    line.Character('\n').Print();
}

constexpr PlainCommand kPlainCommands[] = {
    {{Code::ociserverattach, Words(6), "OCIServerAttach hServer hError server server_len mode"}, AttachServer},
    // The bracket that its words open is not closed: logs have it so.
    {{Code::ociclientversion, Words(1, 6),
      "OCIClientVersion [major_version minor_version update_num patch_num port_update_num"},
     ShowClientVersion},
    {{Code::ociserverversion, Words(4, 6), "OCIServerVersion handle hError handletype [buf buf_len]"},
     ShowServerVersion},
    {{Code::ocipasswordchange, Words(10),
      "OCIPasswordChange hSvc hError username username_len opassword opassword_len npassword npassword_len mode"},
     ChangePassword},
};

}  // namespace

void AddSessionCommands(HandlerTable& handlers) {
    handlers.Add<RunHandleCall>(kHandleCalls);
    handlers.Add<RunLogon>(kLogons);
    handlers.Add(kPlainCommands);
}
