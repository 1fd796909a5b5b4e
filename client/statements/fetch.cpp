// Statements: fetching rows into the defines, and values in pieces: such a fetch ends with OCI_NEED_DATA where it waits
// for the application, and goes on with the next call.
#include <algorithm>

#include "handles/errors.h"
#include "sessions/link.h"
#include "statements/fetch_sink.h"
#include "values/lobs.h"

const std::vector<engine::Column>* Statement::Columns() {
    if (run_.cursor.IsOpen()) return &run_.cursor.Columns();
    if (!described_ || compiled_.empty() || !compiled_[0].query) return nullptr;
    return &compiled_[0].query->Columns();
}

Status Statement::CheckFetch() {
    if (pieces_.Wants() == PieceStream::Use::execute) return Error(errors::kOperationActive);
    if (run_.fetch_error != 0) return Error(run_.fetch_error);
    return run_.cursor.IsOpen() ? Status() : Error(errors::kFetchOutOfSequence);
}

// What the engine had to say waits for the end of a fetch that goes on. Flat: what it calls here is in line, for it runs
// for every value that goes in pieces.
[[gnu::flatten]] Status Statement::Fetch(ErrorHandle& error, ub4 rows, ub2 orientation, sb4 offset) {
    const PieceStream::Use wants = pieces_.Wants();
    const bool goes_on = wants == PieceStream::Use::fetch || wants == PieceStream::Use::fetch_by_execute;
    Status status = goes_on ? ContinueFetch() : FetchNow(rows, orientation, offset);
    if (status.Code() != OCI_NEED_DATA) AddNotices(error, status);
    return status;
}

Status Statement::FetchNow(ub4 rows, ub2 orientation, sb4 offset) {
    run_.rows_fetched = 0;
    if (Status status = CheckFetch(); !status.Ok()) return status;
    if (rows == 0) {
        CloseCursor();
        run_.fetch_error = errors::kFetchOutOfSequence;
        return {};
    }
    if (Status status = defines_.Activate(run_.cursor.Columns(), UsedLink()->lobs); !status.Ok()) return status;
    std::uint64_t first = 0;
    const std::uint64_t* position = nullptr;
    if (run_.cursor.Scrollable()) {
        if (Status status = FindFirst(orientation, offset, first); !status.Ok()) return status;
        position = &first;
    } else if (orientation != OCI_DEFAULT && orientation != OCI_FETCH_NEXT) {
        return Error(errors::kBadFetch);
    }
    return defines_.InPieces() ? StartFetchInPieces(rows, 0, position, nullptr) : FetchRows(rows, 0, position);
}

// The position of the first row that is wanted of a scrollable cursor; 0 is before them.
Status Statement::FindFirst(ub2 orientation, sb4 offset, std::uint64_t& position) {
    const auto here = static_cast<std::int64_t>(run_.cursor.Position());
    std::int64_t target = 0;
    switch (orientation) {
        case OCI_DEFAULT:
        case OCI_FETCH_NEXT: target = here + 1; break;
        case OCI_FETCH_CURRENT: target = here; break;
        case OCI_FETCH_PRIOR: target = here - 1; break;
        case OCI_FETCH_FIRST: target = 1; break;
        case OCI_FETCH_RELATIVE: target = here + offset; break;
        case OCI_FETCH_ABSOLUTE:
            if (offset < 0) return Error(errors::kBadScroll);
            target = offset;
            break;
        case OCI_FETCH_LAST: return run_.cursor.Count(position);
        default: return Error(errors::kBadFetch);
    }
    position = target > 0 ? static_cast<std::uint64_t>(target) : 0;
    return {};
}

// A row that is refused was not fetched.
Status Statement::FetchSink::Row(std::uint32_t, std::span<const engine::Datum> values) {
    KeptRow* const kept = statement_.kept_row.get();
    if (kept) kept->Keep(values, statement_.run_.cursor.Columns());
    ++rows;
    const int error = statement_.defines_.StoreRow(index_, values);
    if (error != 0 && error != errors::kTruncationWarning) {
        if (kept) kept->Forget();
        return Error(error);
    }
    if (error != 0) warning_ = Warning(error);
    if (in_pieces_) {
        const bool has_lobs =
            std::any_of(values.begin(), values.end(), [](const auto& value) { return value.kind == engine::Kind::lob; });
        if (has_lobs)
            if (Status status = ReadLobs(values); !status.Ok()) return status;
        if (has_lobs) statement_.pieces_.Begin(index_, row_->values, &row_->objects);
        else statement_.pieces_.Begin(index_, values, nullptr);
    } else {
        ++statement_.run_.rows_fetched;
    }
    ++index_;
    return {};
}

// A row that waits outlasts the views of its large objects: those that go in pieces are read, or taken as they are.
Status Statement::FetchSink::ReadLobs(std::span<const engine::Datum> values) {
    RowOfLobs& row = row_.emplace();
    row.values.assign(values.begin(), values.end());
    row.contents.resize(values.size());
    row.objects.assign(values.size(), nullptr);
    for (const Defines::Active& active : statement_.defines_.All()) {
        engine::Datum& value = row.values[active.column];
        if (!active.area->InPieces() || value.kind != engine::Kind::lob) continue;
        values::LobSession* const session = statement_.UsedLink()->lobs.get();
        std::shared_ptr<engine::Lob>& object = row.objects[active.column];
        std::uint64_t length = 0;
        int error = values::TakeLong(value, session, object);
        if (object && !OutgoingValue::Streams(*active.area, object->Kind())) object = nullptr;
        if (error == 0 && !object)
            error = values::ReadLob(values[active.column], session, values::kWholeLob, row.contents[active.column], value, length);
        if (error != 0) return Error(error);
    }
    return {};
}

// Up to `rows` rows into the elements from `first` on; of a scrollable cursor those from a position on.
Status Statement::FetchRows(ub4 rows, ub4 first, const std::uint64_t* position) {
    FetchSink sink(*this, first, false);
    std::uint32_t delivered = 0;
    Status status = position ? run_.cursor.ReadFrom(*position, sink, rows, delivered)
                             : run_.cursor.Read(sink, rows, delivered);
    run_.row_count = run_.cursor.Reached();
    if (!status.Ok()) return status;
    return delivered < rows ? EndOfFetch() : sink.Warned();
}

// A scrollable cursor that delivered something stays on the last row of it.
Status Statement::EndOfFetch() {
    if (run_.rows_fetched > 0) run_.cursor.StayOnLastRow();
    run_.row_count = run_.cursor.Reached();
    run_.state = Execution::State::end_of_fetch;
    return NoData();
}

// ---- In pieces

// `rows` rows into the elements from `first` on. `execute`: what the execute that delivers them was asked for, or null.
Status Statement::StartFetchInPieces(ub4 rows, ub4 first, const std::uint64_t* position,
                                     const ExecuteArguments* execute) {
    pieces_.StartFetch(first + rows, execute != nullptr, execute ? execute->mode : ub4{OCI_DEFAULT});
    Status status = NextRowInPieces(first, position);
    return status.Ok() ? ContinueFetch() : status;
}

// Ok when the row is there. The defines are active.
Status Statement::NextRowInPieces(ub4 row, const std::uint64_t* position) {
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
        status = defines_.Activate(run_.cursor.Columns(), UsedLink()->lobs);
        if (!status.Ok()) pieces_.End();
        if (status.Ok()) status = NextRowInPieces(next, nullptr);
        if (status.Ok()) status = pieces_.HandOut(defines_, driver_);
    }
    if (status.Ok() && pieces_.Warned()) return Warning(errors::kTruncationWarning);
    return status;
}
