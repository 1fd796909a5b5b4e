// Statements: executes and fetches whose values go in pieces. They end with OCI_NEED_DATA where the driver waits for the
// application, and go on with the next call of the same function.
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
            0,
            static_cast<ub1>(wanted.continued ? OCI_NEXT_PIECE : OCI_ONE_PIECE)};
    return {};
}

Status Statement::SetPieceInfo(DataArea& area, const PieceBuffer& piece) {
    if (pieces_.Wants() == PieceStream::Use::none) return Error(errors::kIllegalOperation);
    const WantedPiece& wanted = pieces_.Wanted();
    if (wanted.area != &area || piece.piece > OCI_LAST_PIECE) return Error(errors::kIllegalOperation);
    const bool null_in = !wanted.out && SaysNull(piece);
    if (!null_in && !piece.length) return Error(errors::kBadLength);
    if (!null_in && !piece.buffer) return Error(errors::kBadBuffer);
    area.piece = piece;
    area.piece.is_set = true;
    return {};
}

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
    FetchSink sink(*this, row, true);
    std::uint32_t delivered = 0;
    Status status = position ? run_.cursor.ReadFrom(*position, sink, 1, delivered) : run_.cursor.Read(sink, 1, delivered);
    if (status.Ok() && delivered == 0) status = EndOfFetch();
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
    return status;
}

// ---- Executing

Status Statement::StartExecuteInPieces(ErrorHandle& error, const ExecuteArguments& arguments) {
    pieces_.StartExecute(text_, arguments);
    ForgetOutcome();
    return ContinueExecute(error);
}

// Changes run row by row as their values come; anything else needs the values of one row.
Status Statement::ContinueExecute(ErrorHandle& error) {
    for (bool more = true;;) {
        if (Status status = pieces_.Collect(driver_); !status.Ok()) return status;
        Status status = RunCollected(error, more);
        if (!more) return status;
        pieces_.NextIteration();
    }
}

// All values of an iteration are there: runs it; `more` when there is another.
Status Statement::RunCollected(ErrorHandle& error, bool& more) {
    const ExecuteArguments arguments = pieces_.Arguments();
    const bool by_row = !Scanned().is_block && Scanned().steps[0].run == sql::Run::change;
    more = false;
    if (!by_row || arguments.iterations <= arguments.first) {
        pieces_.End();
        return Run(error, arguments);
    }
    const ub4 row = pieces_.Wanted().iteration;
    Status status = RunRows({row + 1, row, arguments.mode});
    run_.row_count = outcome_.affected;
    const bool stop = status.Failed() || (!outcome_.failures.empty() && !(arguments.mode & OCI_BATCH_ERRORS));
    more = !stop && row + 1 < arguments.iterations;
    if (more) return {};
    pieces_.End();
    if (status.Failed()) return status;
    return Complete(Finish(error, arguments), arguments);
}
