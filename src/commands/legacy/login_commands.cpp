// Logins and cursors as they are made, the way between logins and service contexts, and the calls that need no area.
// Command thread only.
#include <optional>

#include "commands/families.h"
#include "commands/legacy/area_words.h"
#include "core/messages.h"
#include "platform/client_library.h"
#include "report/diagnostics.h"
#include "report/return_code.h"
#include "report/trace.h"

namespace {

// --- Logins that a command makes -------------------------------------------------------------------------------------

struct LoginMaker : CommandRow {
    // Nothing when the command ends here, which has been said.
    std::optional<sword> (*call)(NewArea& login, char** words);
};

void RunLoginMaker(const LoginMaker& row, int, char** words) {
    NewArea login(Kind::ldainfo, words[1]);
    if (!login.Make()) return;
    const std::optional<sword> rc = row.call(login, words);
    if (!rc) return;
    TraceAndReportAreas(row.code, words[1], {.login = login.Area(), .shown = login.Area()}, *rc);
    if (*rc == OCI_SUCCESS) login.Enter(nullptr);
}

// False when there is no memory for it.
bool HostArea(NewArea& login, const char* word, ub1*& host_area) {
    host_area = IsInvalid(word) ? reinterpret_cast<ub1*>(InvalidArea()) : nullptr;
    if (host_area != nullptr || IsNull(word)) return true;
    host_area = login.MakeHost();
    return host_area != nullptr;
}

std::optional<sword> LogOn(NewArea& login, char** words) {
    ub1* host_area = nullptr;
    TextArgument user, password, database;
    const PasswordWord given(words[5], DecodeNumber(words[6]));
    if (!HostArea(login, words[2], host_area) || !SetAreaText(user, words + 3) ||
        !password.SetBytes(IsNull(words[5]) ? nullptr : given.text, given.length) || !SetAreaText(database, words + 7))
        return std::nullopt;
    return Call(&ClientLibrary::olog, login.Area(), host_area, user.Text(), LengthOfText(user), password.Text(),
                LengthOfText(password), database.Text(), LengthOfText(database), DecodeCount(words[9]));
}

// The result of a call that has none: what it has left in the area.
template <class Signature> sword ResultIn(LibraryFunction<Signature> ClientLibrary::*function, const Lda_Def* area) {
    if (!Exports(function)) return OCI_ERROR;
    return area == nullptr ? OCI_SUCCESS : sword{area->rc};
}

std::optional<sword> AdoptConnection(NewArea& login, char**) {
    Call(&ClientLibrary::sqllda, login.Area());
    return ResultIn(&ClientLibrary::sqllda, login.Area());
}

std::optional<sword> AdoptNamedConnection(NewArea& login, char** words) {
    TextArgument name;
    if (!SetAreaText(name, words + 2)) return std::nullopt;
    sb4 length = LengthOfText(name);
    Call(&ClientLibrary::sqlld2, login.Area(), name.Text(), IsNull(words[3]) ? nullptr : &length);
    return ResultIn(&ClientLibrary::sqlld2, login.Area());
}

constexpr LoginMaker kLoginMakers[] = {
    {{Code::olog, Words(10),
      "olog lda hda username username_len password password_len database database_len mode"},
     LogOn},
    {{Code::sqllda, Words(2), "sqllda lda"}, AdoptConnection},
    {{Code::sqlld2, Words(4), "sqlld2 lda dbname dbname_len"}, AdoptNamedConnection},
};

// --- A service context that becomes a login, and the way back --------------------------------------------------------

void LendServiceContext(const CommandRow& row, int, char** words) {
    NewArea login(Kind::ldainfo, words[3]);
    if (!login.Make()) return;
    auto* const svc = Resolve<OCISvcCtx>(Kind::svc, words[1]);
    auto* const error = ResolveError<OCIError>(words[2]);
    const sword rc = Call(&ClientLibrary::OCISvcCtxToLda, svc, error, login.Area());
    TraceAndReport(row.code, words[1], error, rc);
    if (rc == OCI_SUCCESS) login.Enter(nullptr);
}

// A name in use hands over its service context and stays as it is.
void TakeBackServiceContext(const CommandRow& row, int, char** words) {
    NewObject<OCISvcCtx> svc(words[1]);
    const NamedObject* const held = FindByName(Kind::svc, words[1]);
    if (held != nullptr) svc.Hand(static_cast<OCISvcCtx*>(held->object));
    auto* const error = ResolveError<OCIError>(words[2]);
    const AreaArgument login = ResolveArea(Kind::ldainfo, words[3]);
    const sword rc = Call(&ClientLibrary::OCILdaToSvcCtx, svc.Place(), error, login.area);
    TraceAndReport(row.code, words[3], error, rc);
    if (rc != OCI_SUCCESS) return;
    if (held == nullptr && svc.Place() != nullptr) svc.Enter(Kind::svc, ParentOf(Kind::error, words[2]));
    if (login.slot != nullptr) ReleaseArea(*login.slot);
}

// --- Cursors ---------------------------------------------------------------------------------------------------------

void OpenCursor(const CommandRow& row, int count, char** words) {
    const bool is_long = count == 8;
    NewArea cursor(Kind::cursor, words[1]);
    if (!cursor.Make()) return;
    const AreaArgument login = ResolveArea(Kind::ldainfo, words[2]);
    OptionalText database, user;
    if (is_long && !(database.Set(words + 3) && user.Set(words + 6))) return;
    const sword area_size = is_long ? DecodeNumber(words[5]) : -1;
    const sword rc = Call(&ClientLibrary::oopen, cursor.Area(), login.area, database.Text(), database.Length(),
                          area_size, user.Text(), user.Length());
    TraceAndReportAreas(row.code, words[1], {.login = login.area, .shown = cursor.Area()}, rc);
    if (rc == OCI_SUCCESS) cursor.Enter(login.area);
}

// --- Calls without an area -------------------------------------------------------------------------------------------

void ShowText(const CommandRow& row, int count, char** words) {
    char room[kDiagnosticSize] = {};
    auto* const text = Place(*reinterpret_cast<OraText*>(room), count, words, 2);
    const sword rc = Call(&ClientLibrary::oermsg, static_cast<sb2>(DecodeNumber(words[1])), text);
    TraceAndReportAreas(row.code, "", {.has_text = false}, rc);
    if (rc == OCI_SUCCESS && text != nullptr)
        Message(kOutput, "%s\n", NormaliseDiagnostic({room, strnlen(room, sizeof room)}).c_str());
}

void Initialise(const CommandRow& row, int, char** words) {
    TraceAndReportAreas(row.code, "", {}, Call(&ClientLibrary::opinit, DecodeCount(words[1])));
}

constexpr PlainCommand kPlainCommands[] = {
    {{Code::ocisvcctxtolda, Words(4), "OCISvcCtxToLda hSvc hError lda"}, LendServiceContext},
    {{Code::ocildatosvcctx, Words(4), "OCILdaToSvcCtx hSvc hError lda"}, TakeBackServiceContext},
    {{Code::oopen, Words(3, 8), "oopen cda lda [database database_len areasize username username_len]"}, OpenCursor},
    {{Code::oermsg, Words(2, 3), "oermsg code [buf]"}, ShowText},
    {{Code::opinit, Words(2), "opinit mode"}, Initialise},
};

}  // namespace

void AddLegacyLoginCommands(HandlerTable& handlers) {
    handlers.Add<RunLoginMaker>(kLoginMakers);
    handlers.Add(kPlainCommands);
}
