// Statements: executes and fetches whose values go in pieces. They end with OCI_NEED_DATA where the driver waits for the
// application, and go on with the next call of the same function.
#include <exception>

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
    if (Status status = defines_.Activate(run_.cursor.Columns()); !status.Ok()) {
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
            if (status = RunCollected(stopped); stopped) break;
            pieces_.StartDelivery(Scanned().is_block);
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
    return status;
}
