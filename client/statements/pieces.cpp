// Statements: executes whose values go in pieces. They end with OCI_NEED_DATA where they wait for the application, and
// go on with the next call of the same function.
#include <exception>
#include <memory>
#include <utility>

#include "handles/errors.h"
#include "sessions/link_mark.h"
#include "statements/statement.h"

namespace {

// Ends a stream when what was under way is left by an exception.
class EndedByException {
public:
    explicit EndedByException(PieceStream& pieces) : pieces_(pieces) {}
    ~EndedByException() { if (std::uncaught_exceptions() > before_) pieces_.End(); }
    EndedByException(const EndedByException&) = delete;
    EndedByException& operator=(const EndedByException&) = delete;

private:
    PieceStream& pieces_;
    const int before_ = std::uncaught_exceptions();
};

}  // namespace

Status Statement::StartExecuteInPieces(ErrorHandle& error, const ExecuteArguments& arguments) {
    if (Status status = pieces_.StartExecute(text_, arguments); !status.Ok()) return status;
    ForgetOutcome();
    told_ = {};
    return ContinueExecute(error);
}

// Changes and blocks run iteration by iteration as their values come; anything else needs the values of one.
bool Statement::RunsByIteration() const {
    const ExecuteArguments& arguments = pieces_.Arguments();
    return (Scanned().is_block || Scanned().steps[0].run == sql::Run::change) && arguments.first < arguments.iterations;
}

Status Statement::ContinueExecute(ErrorHandle& error) {
    const EndedByException guard(pieces_);
    const ExecuteArguments arguments = pieces_.Arguments();
    if (!RunsByIteration()) {
        if (Status status = pieces_.Collect(driver_); !status.Ok()) return status;
        pieces_.End();
        return Run(error, arguments);
    }
    ub4 row = 0;
    Status status = RunIterations(row);
    if (status.Failed() && !Scanned().is_block) error.row_offset = row;
    if (!status.Ok()) return status;
    if (!Scanned().is_block) status = Finish(error, arguments);
    if (status.Ok()) status = std::exchange(told_, {});
    if (status.Ok() && pieces_.Warned()) status = Warning(errors::kTruncationWarning);
    return Complete(std::move(status), arguments);
}

// One after the other, until one waits or fails: `row` is the last one that was begun.
Status Statement::RunIterations(ub4& row) {
    Status status;
    for (bool stopped = false;;) {
        row = pieces_.Wanted().iteration;
        if (!pieces_.Delivers()) {
            if (status = pieces_.Collect(driver_); !status.Ok()) return status;
            if (pieces_.ReturnsToCallbacks()) {
                if (status = RunAndDeliver(stopped); !status.Ok() && !stopped) return status;
            } else {
                status = RunCollected(stopped);
            }
            if (stopped) break;
        }
        if (status = pieces_.Deliver(driver_); !status.Ok()) return status;
        if (row + 1 >= pieces_.Arguments().iterations) break;
        pieces_.NextIteration();
    }
    pieces_.End();
    return status;
}

// All values of an iteration are there: runs it. `stopped` when no other follows.
Status Statement::RunCollected(bool& stopped) {
    const ub4 row = pieces_.Wanted().iteration;
    const ub4 mode = pieces_.Arguments().mode;
    const std::uint32_t done_before = outcome_.executed;
    const bool is_block = Scanned().is_block;
    Status status = is_block ? RunBlock({row + 1, row, mode}) : RunRows({row + 1, row, mode});
    if (!is_block) run_.row_count = outcome_.affected;
    if (!is_block && outcome_.executed == done_before) pieces_.ForgetReturned();
    if (is_block && !status.Ok() && !status.Failed()) told_ = std::exchange(status, {});
    stopped = status.Failed() || (!outcome_.failures.empty() && !(mode & OCI_BATCH_ERRORS));
    if (!stopped) pieces_.StartDelivery(is_block);
    return status;
}

// The same where callbacks take all that comes back: an iteration whose values they do not take is undone.
Status Statement::RunAndDeliver(bool& stopped) {
    const std::uint64_t affected = outcome_.affected, count = run_.row_count;
    const std::uint32_t executed = outcome_.executed;
    LinkMark mark(UsedLink());
    Status status = mark.Set();
    stopped = !status.Ok();
    if (stopped) return status;
    if (status = RunCollected(stopped); !stopped) status = pieces_.Deliver(driver_);
    if (stopped || status.Ok()) {
        Status kept = mark.Keep();
        return kept.Ok() ? status : kept;
    }
    bool is_undone = false;
    Status undone = mark.Undo(is_undone);
    if (!is_undone) return status;
    outcome_.affected = affected;
    outcome_.executed = executed;
    run_.row_count = count;
    return undone.Ok() ? status : undone;
}
