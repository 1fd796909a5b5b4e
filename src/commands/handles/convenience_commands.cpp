// Connecting in one line, and ending what that made in another. The calls inside leave no trace lines.
// Command thread only.
#include <cstring>
#include <string_view>

#include "commands/families.h"
#include "commands/shared/word_arguments.h"
#include "core/messages.h"
#include "core/state.h"
#include "platform/client_library.h"
#include "report/return_code.h"

namespace {

// --- QuickConnectOCI -------------------------------------------------------------------------------------------------

OCIEnv* ConnectEnvironment(const char* name) {
    OCIEnv* environment = nullptr;
    const sword rc = Call(&ClientLibrary::OCIEnvCreate, &environment, ub4{OCI_OBJECT}, nullptr, nullptr, nullptr,
                          nullptr, size_t{0}, nullptr);
    if (rc != OCI_SUCCESS) {
        Message(kError, "OCIEnvCreate failed\n");
        return nullptr;
    }
    Register(Kind::environment, name, environment, nullptr);
    if (DefaultEnvironment == nullptr) DefaultEnvironment = environment;
    return environment;
}

bool AllocateHandle(OCIEnv* environment, ub4 type, void*& handle) {
    handle = nullptr;
    const sword rc = Call(&ClientLibrary::OCIHandleAlloc, environment, &handle, type, size_t{0}, nullptr);
    if (rc == OCI_SUCCESS) return true;
    Message(kError, "OCIHandleAlloc failed\n");
    return false;
}

struct LogonText {
    std::string_view text;  // without a place: a null pointer
    const OraText* Text() const { return reinterpret_cast<const OraText*>(text.data()); }
    ub4 Length() const { return static_cast<ub4>(text.size()); }
};

// The service context's entry keeps the handle it was made with, whatever the logon writes back.
void LogOn(OCIEnv* environment, OCIError* error, OCISvcCtx* svc, int count, char** words) {
    const LogonText server = {words[4]};
    LogonText user, password;
    if (count == 7) {
        user.text = words[5];
        password.text = replace_password ? std::string_view(start_up_password) : words[6];
    }
    const sword rc = Call(&ClientLibrary::OCILogon, environment, error, &svc, user.Text(), user.Length(),
                          password.Text(), password.Length(), server.Text(), server.Length());
    ReturnCodeReport(error, rc);
}

void QuickConnect(const CommandRow&, int count, char** words) {
    if (CheckInUse(Kind::environment, words[1]) || CheckInUse(Kind::error, words[2]) || CheckInUse(Kind::svc, words[3]))
        return;
    OCIEnv* const environment = ConnectEnvironment(words[1]);
    if (environment == nullptr) return;
    void* error = nullptr;
    if (!AllocateHandle(environment, OCI_HTYPE_ERROR, error)) return;
    AdoptErrorHandle(static_cast<OCIError*>(error));
    Register(Kind::error, words[2], error, environment);
    void* svc = nullptr;
    if (!AllocateHandle(environment, OCI_HTYPE_SVCCTX, svc)) return;
    Register(Kind::svc, words[3], svc, environment);
    LogOn(environment, static_cast<OCIError*>(error), static_cast<OCISvcCtx*>(svc), count, words);
}

// --- KillEnvOCI ------------------------------------------------------------------------------------------------------

// Frees a handle and its name. False when the library refuses, which is reported against the environment.
bool FreeHandle(OCIEnv* environment, void* handle, ub4 type, Kind kind, const char* name) {
    const sword rc = Call(&ClientLibrary::OCIHandleFree, handle, type);
    EnvironmentReport(environment, rc);
    if (rc != OCI_SUCCESS) return false;
    Release(kind, name);
    return true;
}

void KillEnvironment(const CommandRow&, int, char** words) {
    void* found = InvalidObject();
    if (!IsInvalid(words[1]) && !FindObject(Kind::environment, words[1], found)) return;
    auto* const environment = static_cast<OCIEnv*>(found);
    auto* const error = ResolveError<OCIError>(words[2]);
    auto* const svc = Resolve<OCISvcCtx>(Kind::svc, words[3]);

    const sword rc = Call(&ClientLibrary::OCILogoff, svc, error);
    ReturnCodeReport(error, rc);
    if (rc != OCI_SUCCESS) return;
    if (!FreeHandle(environment, svc, OCI_HTYPE_SVCCTX, Kind::svc, words[3])) return;
    if (!FreeHandle(environment, error, OCI_HTYPE_ERROR, Kind::error, words[2])) return;
    ForgetErrorHandle(error);
    if (!FreeHandle(environment, environment, OCI_HTYPE_ENV, Kind::environment, words[1])) return;
    Call(&ClientLibrary::OCITerminate, ub4{OCI_DEFAULT});
}

constexpr PlainCommand kConvenienceCommands[] = {
    {{Code::quickconnectoci, Words(5, 7), "QuickConnectOCI hEnv hError hSvc dbname [userid password]"}, QuickConnect},
    {{Code::killenvoci, Words(4), "KillEnvOCI hEnv hError hSvc"}, KillEnvironment},
};

}  // namespace

void AddConvenienceCommands(HandlerTable& handlers) {
    handlers.Add(kConvenienceCommands);
}
