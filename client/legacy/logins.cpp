// The calls on login areas, on the service context that the login owns.
#include "legacy/logins.h"

#include <algorithm>
#include <atomic>
#include <cstdlib>
#include <cstring>
#include <string_view>

#include "handles/error_handle.h"

namespace legacy {
namespace {

std::atomic<bool> threads{false};

// False for a length that is none.
bool Read(TextArgument argument, std::string_view& out) {
    if (argument.length < -1) return false;
    if (!argument.begin) return true;
    const auto* const begin = reinterpret_cast<const char*>(argument.begin);
    out = argument.length < 0 ? std::string_view(begin) : std::string_view(begin, static_cast<std::size_t>(argument.length));
    return true;
}

struct Names {
    std::string_view user, password, database;
};

// "name/password[@database]" where there is no password; a database of its own goes before the one in the name.
void Split(Names& names) {
    const std::size_t slash = names.user.find('/');
    if (slash == std::string_view::npos) return;
    names.password = names.user.substr(slash + 1);
    names.user = names.user.substr(0, slash);
    const std::size_t at = names.password.rfind('@');
    if (at == std::string_view::npos) return;
    if (names.database.empty()) names.database = names.password.substr(at + 1);
    names.password = names.password.substr(0, at);
}

const OraText* Begin(std::string_view text) { return text.empty() ? nullptr : reinterpret_cast<const OraText*>(text.data()); }
ub4 Length(std::string_view text) { return static_cast<ub4>(text.size()); }

int Mode(Login& login, ub1& mode) {
    return Outcome(OCIAttrGet(login.service, OCI_HTYPE_SVCCTX, &mode, nullptr, OCI_ATTR_NONBLOCKING_MODE, login.error),
                   login.error, login);
}

// The attribute is a toggle.
int SetMode(Login& login, bool on) {
    ub1 mode = 0;
    if (const int failed = Mode(login, mode)) return failed;
    if ((mode != 0) == on) return 0;
    return Outcome(OCIAttrSet(login.service, OCI_HTYPE_SVCCTX, nullptr, 0, OCI_ATTR_NONBLOCKING_MODE, login.error),
                   login.error, login);
}

int LogOnAs(Login& login, const Names& names, ub4 mode) {
    const int result = Outcome(
        OCILogon(login.environment, login.error, &login.service, Begin(names.user), Length(names.user),
                 Begin(names.password), Length(names.password), Begin(names.database), Length(names.database)),
        login.error, login);
    return result == 0 && mode == OCI_LM_NBL ? SetMode(login, true) : result;
}

int MakeLogin(Lda_Def* area, bool has_host_area, TextArgument user, TextArgument password, TextArgument database,
              ub4 mode) {
    if (mode != OCI_LM_DEF && mode != OCI_LM_NBL) return errors::kBadMode;
    if (threads && !has_host_area) return errors::kNoHostArea;
    Names names;
    if (!Read(user, names.user) || !Read(password, names.password) || !Read(database, names.database)) {
        return errors::kParameterOutOfRange;
    }
    if (!password.begin) Split(names);
    const auto login = std::make_shared<Login>();
    if (!login->Open()) return errors::kOutOfMemory;
    const int result = LogOnAs(*login, names, mode);
    if (result == 0) Enter(area, login);
    return result;
}

// Without memory for the engine's words there are none.
void NoteMessage(Login& login, int number, const char* message) noexcept {
    login.last_error = 0;
    try {
        login.last_message = message;
        login.last_error = number;
    } catch (const std::bad_alloc&) {
    }
}

void Put(std::string_view message, text* buffer, std::size_t size) {
    const std::size_t length = std::min(message.size(), size - 1);
    std::memcpy(buffer, message.data(), length);
    buffer[length] = 0;
}

}  // namespace

int Outcome(sword code, OCIError* error, Login& login) noexcept {
    if (code == OCI_SUCCESS) return 0;
    if (code == OCI_NO_DATA) return errors::kNoRows;
    if (code == OCI_NEED_DATA) return errors::kWantsPiece;
    if (code == OCI_INVALID_HANDLE) return errors::kNotLoggedOn;    // freed behind the login
    sb4 number = 0;
    OraText message[1024];
    const sword found = OCIErrorGet(error, 1, nullptr, &number, nullptr, 0, OCI_HTYPE_ERROR);
    if (found != OCI_SUCCESS) return errors::kOutOfMemory;    // for the record
    if (code == OCI_SUCCESS_WITH_INFO) return number == errors::kTruncationWarning ? errors::kTruncationWarning : 0;
    const sword told = OCIErrorGet(error, 1, nullptr, nullptr, message, sizeof message, OCI_HTYPE_ERROR);
    NoteMessage(login, number, told == OCI_SUCCESS ? reinterpret_cast<const char*>(message) : "");
    return number;
}

int Outcome(sword code, Cursor& cursor) noexcept {
    const int result = Outcome(code, cursor.error, *cursor.login);
    if (result != errors::kTruncationWarning) return result;
    cursor.truncated = true;
    return 0;
}

sword LogOn(Lda_Def* area, bool has_host_area, TextArgument user, TextArgument password, TextArgument database,
            ub4 mode) {
    if (!area || FindCursor(area)) return errors::kInvalidCursor;
    if (FindLogin(area)) {
        return OnLogin(area, [](Login&) { return errors::kAlreadyLoggedOn; });
    }
    std::memset(area, 0, sizeof *area);
    return SetResult(*area, Function::none, Guarded([&] {
        return MakeLogin(area, has_host_area, user, password, database, mode);
    }));
}

void Borrow(Lda_Def* area, OCISvcCtx* service) {
    if (!area || FindCursor(area)) return;
    if (const std::shared_ptr<Login> login = FindLogin(area)) {
        if (!login->borrowed) return (void)OnLogin(area, [](Login&) { return errors::kAlreadyLoggedOn; });
        (void)LogOff(area);
    }
    std::memset(area, 0, sizeof *area);
    (void)SetResult(*area, Function::none, Guarded([&]() -> int {
        if (!service) return errors::kNotLoggedOn;
        const auto login = std::make_shared<Login>();
        if (!login->Open()) return errors::kOutOfMemory;
        login->service = service;
        login->borrowed = true;
        Enter(area, login);
        return 0;
    }));
}

// No engine has stored procedures.
sword DescribeProcedure(Lda_Def* area, const text* name, ub4* count) {
    return OnLogin(area, [&](Login&) -> int {
        if (!name) return errors::kParameterMissing;
        if (count) *count = 0;
        return errors::kNoSuchObject;
    });
}

// A session that is gone has nothing to commit: the area is forgotten all the same.
sword LogOff(Lda_Def* area) {
    return OnLogin(area, [area](Login& login) -> int {
        if (login.lender) return errors::kInvalidCall;
        std::vector<std::shared_ptr<Cursor>> cursors;
        cursors.reserve(CountCursors(login));    // nothing fails once the session has ended
        const int result =
            login.borrowed ? 0 : Outcome(OCILogoff(login.service, login.error), login.error, login);
        if (result != 0 && result != errors::kNotConnected) return result;
        (void)ForgetLogin(area, cursors);
        for (const auto& cursor : cursors) cursor->ended = true;
        login.ended = true;
        return result;
    });
}

sword Commit(Lda_Def* area) {
    return OnLogin(area, [](Login& login) {
        return Outcome(OCITransCommit(login.service, login.error, OCI_DEFAULT), login.error, login);
    });
}

sword Rollback(Lda_Def* area) {
    return OnLogin(area, [](Login& login) {
        return Outcome(OCITransRollback(login.service, login.error, OCI_DEFAULT), login.error, login);
    });
}

sword CommitEach(Lda_Def* area, bool commits) {
    return OnLogin(area, [commits](Login& login) {
        login.commits = commits;
        return 0;
    });
}

// From any thread, while a call of the login's runs: it waits for no turn and shares nothing with that call. The error
// handle is one of its own.
sword Break(Lda_Def* area) {
    const std::shared_ptr<Login> login = FindLogin(area);
    if (!login) return errors::kInvalidCursor;
    return SetResult(*area, Function::none, Guarded([&]() -> int {
        dvoid* handle = nullptr;
        if (OCIHandleAlloc(login->environment, &handle, OCI_HTYPE_ERROR, 0, nullptr) != OCI_SUCCESS) {
            return errors::kOutOfMemory;
        }
        const sword code = OCIBreak(login->service, static_cast<OCIError*>(handle));
        (void)OCIHandleFree(handle, OCI_HTYPE_ERROR);
        return code == OCI_SUCCESS ? 0 : errors::kNotConnected;
    }));
}

sword SetNonBlocking(Lda_Def* area, bool on) {
    return OnLogin(area, [on](Login& login) { return SetMode(login, on); });
}

sword TestNonBlocking(Lda_Def* area) {
    return OnLogin(area, [](Login& login) -> int {
        ub1 mode = 0;
        const int failed = Mode(login, mode);
        if (failed != 0) return failed;
        return mode != 0 ? 0 : errors::kBlockingMode;
    });
}

sword SetThreads(ub4 mode) {
    if (mode != OCI_EV_DEF && mode != OCI_EV_TSF) return errors::kBadMode;
    threads = mode == OCI_EV_TSF;
    return 0;
}

sword Message(const Lda_Def* area, int code, text* buffer, sword size) {
    if (!buffer || size < 1) return errors::kParameterMissing;
    constexpr std::size_t kMost = 512;
    return Guarded([&] {
        code = std::abs(code);
        std::string message;
        if (const std::shared_ptr<Login> login = FindLogin(area)) {
            const std::lock_guard turn(login->turn);
            if (!login->unfinished && login->last_error == code) message = login->last_message;
        }
        if (message.empty()) message = ErrorMessage(code, Status::kClient, {});
        const std::size_t room = std::min(kMost, static_cast<std::size_t>(size));
        Put(message, buffer, room);
        return 0;
    });
}

}  // namespace legacy
