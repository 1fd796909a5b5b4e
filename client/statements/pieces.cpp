// Statements: executes and fetches whose values go in pieces. They end with OCI_NEED_DATA where the driver waits for the
// application, and go on with the next call of the same function.
#include <exception>
#include <memory>
#include <utility>

#include "handles/errors.h"
#include "statements/fetch_sink.h"

// ---- What is wanted

Status Statement::GetPieceInfo(PieceInfo& info) {
    if (pieces_.Wants() == PieceStream::Use::none) return Error(errors::kIllegalOperation);
    const WantedPiece& wanted = pieces_.Wanted();
    info = {wanted.area->Pointer(),
            wanted.area->HandleType(),
            static_cast<ub1>(wanted.out ? OCI_PARAM_OUT : OCI_PARAM_IN),
            wanted.iteration,
            wanted.index,
            static_cast<ub1>(wanted.continued ? OCI_NEXT_PIECE : OCI_ONE_PIECE)};
    return {};
}

Status Statement::SetPieceInfo(DataArea& area, const PieceBuffer& piece) { return pieces_.SetPlace(area, piece); }

// ---- Fetching

// `rows` rows into the elements from `first` on. `execute`: what the execute that delivers them was asked for, or null.
Status Statement::StartFetchInPieces(ub4 rows, ub4 first, const std::uint64_t* position,
                                     const ExecuteArguments* execute) {
    pieces_.StartFetch(first + rows, execute != nullptr, execute ? execute->mode : ub4{OCI_DEFAULT});
    Status status = NextRowInPieces(first, position);
    return status.Ok() ? ContinueFetch() : status;
}

// Ok when the row is there.
Status Statement::NextRowInPieces(ub4 row, const std::uint64_t* position) {
    if (Status status = defines_.Activate(run_.cursor.Columns(), UsedLink()->lobs); !status.Ok()) {
        pieces_.End();
        return status;
    }
    FetchSink sink(*this, row, true);
    std::uint32_t delivered = 0;
    Status status = position ? run_.cursor.ReadFrom(*position, sink, 1, delivered) : run_.cursor.Read(sink, 1, delivered);
    if (status.Ok() && delivered == 0) status = EndOfFetch();
    if (!sink.Warned().Ok()) pieces_.Warn();
    if (!status.Ok()) pieces_.End();
    return status;
}

// A row counts when all its pieces are taken.
Status Statement::ContinueFetch() {
    Status status = pieces_.HandOut(defines_, driver_);
    while (status.Ok()) {
        ++run_.rows_fetched;
        run_.row_count = run_.cursor.Reached();
        const ub4 next = pieces_.Row() + 1;
        if (next == pieces_.EndRow()) {
            pieces_.End();
            break;
        }
        status = NextRowInPieces(next, nullptr);
        if (status.Ok()) status = pieces_.HandOut(defines_, driver_);
    }
    if (status.Ok() && pieces_.Warned()) return Warning(errors::kTruncationWarning);
    return status;
}

// ---- Executing

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

// What one iteration can be undone to. The session may go while callbacks run, and the transaction end: the mark goes
// with them, and what follows is none of its business.
class IterationMark {
public:
    explicit IterationMark(std::shared_ptr<Link> link) : link_(std::move(link)) {}
    ~IterationMark() {
        bool is_undone = false;
        if (is_set_) (void)Undo(is_undone);
    }
    IterationMark(const IterationMark&) = delete;
    IterationMark& operator=(const IterationMark&) = delete;

    Status Set() {
        began_ = !link_->Engine().InTransaction();
        Status status = link_->Engine().SetMark();
        is_set_ = status.Ok();
        return status;
    }
    Status Keep() {
        Status status = TakeStanding() ? link_->Engine().DropMark() : Status();
        return status.Number() == errors::kNoSuchSavepoint ? Status() : status;
    }
    Status Undo(bool& is_undone) {
        if (!TakeStanding()) return {};
        Status status = link_->Engine().UndoToMark();
        is_undone = status.Number() != errors::kNoSuchSavepoint;
        if (!status.Ok()) return status;
        return began_ ? link_->Engine().Rollback() : link_->Engine().DropMark();
    }

private:
    bool TakeStanding() { return std::exchange(is_set_, false) && !link_->Closed() && link_->Engine().InTransaction(); }

    const std::shared_ptr<Link> link_;
    bool began_ = false;
    bool is_set_ = false;
};

}  // namespace

Status Statement::StartExecuteInPieces(ErrorHandle& error, const ExecuteArguments& arguments) {
    if (Status status = pieces_.StartExecute(text_, arguments); !status.Ok()) return status;
    ForgetOutcome();
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
    Status status;
    for (bool stopped = false;;) {
        if (!pieces_.Delivers()) {
            if (status = pieces_.Collect(driver_); !status.Ok()) return status;
            if (!RunsByIteration()) {
                pieces_.End();
                return Run(error, arguments);
            }
            if (pieces_.ReturnsToCallbacks()) {
                if (status = RunAndDeliver(stopped); !status.Ok() && !stopped) return status;
            } else {
                status = RunCollected(stopped);
            }
            if (stopped) break;
        }
        if (status = pieces_.Deliver(driver_); !status.Ok()) return status;
        if (pieces_.Wanted().iteration + 1 >= arguments.iterations) break;
        pieces_.NextIteration();
    }
    pieces_.End();
    if (status.Failed()) return status;
    if (!Scanned().is_block) status = Finish(error, arguments);
    if (status.Ok() && pieces_.Warned()) status = Warning(errors::kTruncationWarning);
    return Complete(std::move(status), arguments);
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
    stopped = status.Failed() || (!outcome_.failures.empty() && !(mode & OCI_BATCH_ERRORS));
    if (!stopped) pieces_.StartDelivery(is_block);
    return status;
}

// The same where callbacks take all that comes back: an iteration whose values they do not take is undone.
Status Statement::RunAndDeliver(bool& stopped) {
    const std::uint64_t affected = outcome_.affected, count = run_.row_count;
    const std::uint32_t executed = outcome_.executed;
    IterationMark mark(UsedLink());
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
