// What stands behind the areas of the version-7 calls. A login or cursor area is known by its address, from the call
// that made it until the one that ends it; nothing is read from it. A login owns an environment of the library's own
// and the service context with its session; a cursor owns a statement of that environment.
//
// Threads: the register has a lock of its own. Calls on one login, its cursors included, take turns by the login's lock;
// who waited for it looks whether the area is still what it was (`ended`). A call that was left unfinished goes on in a
// thread of its own, without that lock: as long as it does, all that touches handles or cursors of the login is refused.
#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "handles/errors.h"
#include "oci.h"
#include "oci_legacy.h"
#include "sessions/link_mark.h"

namespace legacy {

class Cursor;
class UnfinishedCall;

class Login {
public:
    Login();
    ~Login();
    Login(const Login&) = delete;
    Login& operator=(const Login&) = delete;

    // Environment, error handle; false without memory.
    [[nodiscard]] bool Open();
    // The context that lent the session is gone, or was taken back, and the login with it.
    [[nodiscard]] bool Over() const noexcept;
    // Whether a call of another cursor's has not ended; null: of any.
    [[nodiscard]] bool IsBusy(const Cursor* but = nullptr) const { return unfinished || (undoing && undoing != but); }
    // What runs in a thread of its own is stopped and waited for.
    void StopUnfinished() noexcept;

    std::recursive_mutex turn;
    bool ended = false;    // under the lock, as what follows
    OCIEnv* environment = nullptr;
    OCIError* error = nullptr;
    OCISvcCtx* service = nullptr;
    bool borrowed = false;    // the service context is a connection's of the XA switch
    OCISvcCtx* lender = nullptr;        // whose session `service` uses
    std::weak_ptr<const void> loan;
    std::unique_ptr<UnfinishedCall> unfinished;
    const Cursor* undoing = nullptr;    // whose execute waits for pieces, and undoes all it did if it fails
    bool commits = false;    // each execute that succeeds
    int last_error = 0;      // with the engine's words, for oerhms
    std::string last_message;
};

// A bind or define that takes pieces: what ogetpi tells and osetpi passes on.
struct PieceArea {
    dvoid* context;
    sb2* indicator;
    ub2* code;
    sb4 indicator_skip = sizeof(sb2);
    sb4 code_skip = sizeof(ub2);
};

class Cursor {
public:
    explicit Cursor(std::shared_ptr<Login> of) : login(std::move(of)) {}
    ~Cursor();
    Cursor(const Cursor&) = delete;
    Cursor& operator=(const Cursor&) = delete;

    [[nodiscard]] bool Open();

    const std::shared_ptr<Login> login;
    bool ended = false;
    OCIStmt* statement = nullptr;
    OCIError* error = nullptr;
    OCIRowid* row_id = nullptr;

    // Of the statement that was parsed last.
    bool parsed = false;
    bool is_query = false;
    bool compiled = false;
    bool described = false;    // its columns are at hand without a result
    bool definition_ran = false;    // by oparse, so that the first execute has nothing to do
    bool has_result = false;
    bool truncated = false;         // by the call that runs
    sword highest_define = 0;
    ub4 rows = 0;                   // delivered since the execute, those of this call included
    ub4 rows_before = 0;            // the same, without the fetch that runs
    enum class Waits : std::uint8_t { no, execute, fetch };
    Waits waits = Waits::no;
    std::unique_ptr<LinkMark> mark;    // what the execute that waits is undone to
    // Set by oopt.
    bool undoes_all = false;           // an execute that fails
    bool waits_for_locks = true;
    std::map<const dvoid*, PieceArea> pieces;    // by bind or define handle
};

std::shared_ptr<Login> FindLogin(const void* area);
std::shared_ptr<Cursor> FindCursor(const void* area);
// Throw std::bad_alloc and change nothing then.
void Enter(const void* area, std::shared_ptr<Login> login);
void Enter(const void* area, std::shared_ptr<Cursor> cursor);
std::size_t CountCursors(const Login& login);
// For who holds the cursor. It may be forgotten with its login already.
void ForgetCursor(const void* area);
// The login, and the cursors on it as `cursors`; null when none was known.
std::shared_ptr<Login> ForgetLogin(const void* area, std::vector<std::shared_ptr<Cursor>>& cursors);
// Once it is forgotten: whoever waits for its turn finds it ended.
void EndLogin(Login& login, const std::vector<std::shared_ptr<Cursor>>& cursors) noexcept;

}  // namespace legacy
