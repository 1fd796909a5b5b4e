// Statements: fetching rows into the defines.
#include "handles/errors.h"
#include "sessions/link.h"
#include "statements/statement.h"

const std::vector<engine::Column>* Statement::Columns() {
    if (cursor_.IsOpen()) return &cursor_.Columns();
    if (!described_ || compiled_.empty() || !compiled_[0].query) return nullptr;
    return &compiled_[0].query->Columns();
}

Status Statement::CheckFetch() const {
    if (pieces_.kind == Pieces::Kind::execute) return Error(errors::kOperationActive);
    if (link_lost_) return Error(errors::kNotConnected);
    if (cancelled_) return Error(errors::kFetchOutOfSequence);
    if (failed_) return Error(errors::kNoDefines);
    if (state_ == State::initialized) return Error(errors::kNotExecuted);
    return cursor_.IsOpen() ? Status() : Error(errors::kFetchOutOfSequence);
}

Status Statement::Fetch(ub4 rows, ub2 orientation, sb4 offset) {
    if (pieces_.kind == Pieces::Kind::fetch) return ContinueFetch();
    rows_fetched_ = 0;
    if (Status status = CheckFetch(); !status.Ok()) return status;
    if (rows == 0) {
        CloseCursor();
        cancelled_ = true;
        return {};
    }
    if (Status status = ActivateDefines(); !status.Ok()) return status;
    bool at_first = false;
    if (cursor_.Scrollable()) {
        if (Status status = GoToFirst(orientation, offset, at_first); !status.Ok()) return status;
        if (!at_first) return EndOfFetch();
    } else if (orientation != OCI_DEFAULT && orientation != OCI_FETCH_NEXT) {
        return Error(errors::kBadFetch);
    }
    return fetches_in_pieces_ ? StartFetchInPieces(rows, at_first, false) : FetchRows(rows, 0, at_first);
}

// Moves a scrollable cursor to the first row that is wanted.
Status Statement::GoToFirst(ub2 orientation, sb4 offset, bool& found) {
    const auto position = static_cast<std::int64_t>(cursor_.Position());
    std::int64_t target = 0;
    switch (orientation) {
        case OCI_DEFAULT:
        case OCI_FETCH_NEXT: target = position + 1; break;
        case OCI_FETCH_CURRENT: target = position; break;
        case OCI_FETCH_PRIOR: target = position - 1; break;
        case OCI_FETCH_FIRST: target = 1; break;
        case OCI_FETCH_RELATIVE: target = position + offset; break;
        case OCI_FETCH_ABSOLUTE:
            if (offset < 0) return Error(errors::kBadScroll);
            target = offset;
            break;
        case OCI_FETCH_LAST: {
            std::uint64_t count = 0;
            if (Status status = cursor_.Count(count); !status.Ok()) return status;
            target = static_cast<std::int64_t>(count);
            break;
        }
        default: return Error(errors::kBadFetch);
    }
    return cursor_.GoTo(target > 0 ? static_cast<std::uint64_t>(target) : 0, found);
}

// Finds the column of each define and what converts its values.
Status Statement::ActivateDefines() {
    if (!defines_changed_) return {};
    active_.clear();
    fetches_in_pieces_ = false;
    const std::vector<engine::Column>& columns = *Columns();
    for (std::uint32_t index = 0; index < defined_.size(); ++index) {
        Define* define = defined_[index];
        if (!define) continue;
        if (index >= columns.size()) return Error(errors::kNoSuchColumn);
        define->workspace.column = values::ClassOf(columns[index].type);
        const values::ExternalType& type = *define->Type();
        ActiveDefine& active = active_.emplace_back(ActiveDefine{define, index, {}, {}});
        active.converters = values::ForColumn(*type.out, define->workspace.column);
        if (define->InPieces()) active.renderers = values::ForColumn(*type.pieces, define->workspace.column);
        fetches_in_pieces_ |= define->InPieces();
    }
    if (active_.empty()) return Error(errors::kNoDefines);
    defines_changed_ = false;
    return {};
}

// Up to `rows` rows into the elements from `first` on. `at_first`: the cursor stands on the first of them already.
Status Statement::FetchRows(ub4 rows, ub4 first, bool at_first) {
    Status outcome;
    for (ub4 row = 0; row < rows; ++row) {
        bool found = at_first && row == 0;
        if (!found) {
            if (Status status = cursor_.Next(found); !status.Ok()) return status;
            if (!found) return EndOfFetch();
        }
        if (const int error = StoreRow(first + row)) {
            if (error != errors::kTruncationWarning) return Error(error);
            outcome = Warning(error);
        }
        ++rows_fetched_;
    }
    row_count_ = cursor_.Reached();
    return outcome;
}

// All columns of the row at hand; answers the gravest thing that happened: an error before a warning.
int Statement::StoreRow(ub4 index) {
    const std::span<const engine::Datum> row = cursor_.Row();
    int worst = 0;
    for (const ActiveDefine& active : active_) {
        if (active.define->InPieces()) continue;
        const int error = values::Store(active.define->elements, index, active.converters, active.define->workspace,
                                        row[active.column]);
        if (error != 0 && (worst == 0 || worst == errors::kTruncationWarning)) worst = error;
    }
    return worst;
}

// A scrollable cursor that delivered something stays on the last row of it.
Status Statement::EndOfFetch() {
    bool found = false;
    if (cursor_.Scrollable() && rows_fetched_ > 0) {
        if (Status status = cursor_.GoTo(cursor_.Position() - 1, found); !status.Ok()) return status;
    }
    row_count_ = cursor_.Reached();
    state_ = State::end_of_fetch;
    return NoData();
}
