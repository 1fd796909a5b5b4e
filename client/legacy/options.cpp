#include "legacy/options.h"

#include <memory>
#include <optional>
#include <utility>

#include "handles/gate.h"
#include "sessions/service_context.h"

namespace legacy {
namespace {

// The values of oopt.
enum : sword { kUndoAll = 0, kUndoRow = 2, kWait = 0, kDoNotWait = 4 };

int Execute(Cursor& cursor, ub4 iterations, ub4 first, ub4 mode) {
    return Outcome(OCIStmtExecute(cursor.login->service, cursor.statement, cursor.error, iterations, first, nullptr,
                                  nullptr, mode),
                   cursor);
}

// While one lives, statements on the link do not wait for locks, if that is wished for.
class LockWish {
public:
    LockWish(std::shared_ptr<Link> link, bool waits) : link_(waits ? nullptr : std::move(link)) {
        if (link_) link_->Engine().WaitForLocks(false);
    }
    ~LockWish() {
        if (link_ && !link_->Closed()) link_->Engine().WaitForLocks(true);
    }
    LockWish(const LockWish&) = delete;
    LockWish& operator=(const LockWish&) = delete;

private:
    const std::shared_ptr<Link> link_;
};

// A failing statement of one row undoes itself.
int ExecuteAll(Cursor& cursor, const std::shared_ptr<Link>& link, ub4 iterations, ub4 first, ub4 mode) {
    if (!cursor.mark) {
        auto mark = std::make_unique<LinkMark>(link);
        if (const Status status = mark->Set(); !status.Ok()) return status.Number();
        cursor.mark = std::move(mark);
    }
    const int result = Execute(cursor, iterations, first, mode);
    cursor.login->undoing = result == errors::kWantsPiece ? &cursor : nullptr;
    if (result == errors::kWantsPiece) return result;
    const std::unique_ptr<LinkMark> mark = std::move(cursor.mark);
    bool is_undone = false;
    const Status ended = result == 0 ? mark->Keep() : mark->Undo(is_undone);
    return ended.Ok() ? result : ended.Number();
}

}  // namespace

int RunStatement(Cursor& cursor, ub4 iterations, ub4 first, ub4 mode) {
    const bool undoes_all = cursor.mark || (cursor.undoes_all && !cursor.is_query && iterations > first + 1);
    if (!undoes_all && cursor.waits_for_locks) return Execute(cursor, iterations, first, mode);
    const CallInFlight call;
    auto* const service = Live<ServiceContext>(cursor.login->service);
    if (!service) return errors::kNotLoggedOn;
    const LongCall may_take_long;
    const SessionTurn turn(*service);
    if (!turn.link) return turn.status.Number();
    const LockWish wish(turn.link, cursor.waits_for_locks);
    return undoes_all ? ExecuteAll(cursor, turn.link, iterations, first, mode) : Execute(cursor, iterations, first, mode);
}

void GiveUpExecute(Cursor& cursor) noexcept {
    if (!cursor.mark) return;
    cursor.login->undoing = nullptr;
    const CallInFlight call;
    auto* const service = Live<ServiceContext>(cursor.login->service);
    std::optional<SessionTurn> turn;
    if (service) turn.emplace(*service);
    cursor.mark = nullptr;
}

sword SetOptions(Cda_Def* area, sword rollback, sword wait) {
    return OnCursor(area, Function::oopt, [&](Cursor& cursor) -> int {
        const bool known = (rollback == kUndoAll || rollback == kUndoRow) && (wait == kWait || wait == kDoNotWait);
        if (!known) return errors::kParameterOutOfRange;
        cursor.undoes_all = rollback == kUndoAll;
        cursor.waits_for_locks = wait == kWait;
        return 0;
    });
}

}  // namespace legacy
