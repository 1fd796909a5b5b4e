// Statements: values in pieces. An execute or fetch that wants a piece answers OCI_NEED_DATA, the application says
// where the piece is and calls the same function again. Going in, the application decides with ONE or LAST that a value
// is complete; coming out, a value goes on until it is taken whole or the application says LAST.
#include <algorithm>
#include <cstring>
#include <utility>

#include "handles/errors.h"
#include "platform/utf.h"
#include "sessions/link.h"
#include "statements/statement.h"

namespace {

void SetIndicator(const PieceBuffer& piece, std::int16_t indicator) {
    if (piece.indicator) std::memcpy(piece.indicator, &indicator, sizeof indicator);
}
void SetCode(const PieceBuffer& piece, int number) {
    const auto code = static_cast<ub2>(number);
    if (piece.code) std::memcpy(piece.code, &code, sizeof code);
}
bool IsNull(const PieceBuffer& piece) {
    std::int16_t indicator = 0;
    if (piece.indicator) std::memcpy(&indicator, piece.indicator, sizeof indicator);
    return indicator == values::kNullIndicator;
}

// How many bytes of `rest` a buffer takes without tearing a character apart.
std::size_t PieceLength(const Define& define, std::string_view rest, std::size_t room) {
    if (define.Type()->family != values::Family::text) return std::min(rest.size(), room);
    return define.workspace.utf16 ? utf::WholeUtf16(rest, room) : utf::WholeUtf8(rest, room);
}

// A null, into the application's places for it.
int TakeNull(const PieceBuffer& piece) {
    *piece.length = 0;
    SetCode(piece, errors::kNullFetched);
    SetIndicator(piece, values::kNullIndicator);
    return piece.indicator ? 0 : errors::kNullFetched;
}

// Moves the next part of `rest` into the buffer; terminated types get a zero that is not counted.
int TakePiece(const Define& define, const PieceBuffer& piece, std::string_view& rest) {
    const std::size_t zero = define.Type()->code != SQLT_STR ? 0 : define.workspace.utf16 ? 2 : 1;
    const std::size_t room = *piece.length;
    if (room < zero) return errors::kBadLength;
    const std::size_t taken = PieceLength(define, rest, room - zero);
    if (taken == 0 && !rest.empty()) return errors::kBadLength;
    auto* buffer = static_cast<char*>(piece.buffer);
    if (taken > 0) std::memcpy(buffer, rest.data(), taken);
    std::memset(buffer + taken, 0, zero);
    rest.remove_prefix(taken);
    *piece.length = static_cast<ub4>(taken);
    SetCode(piece, 0);
    SetIndicator(piece, 0);
    return 0;
}

void MarkCut(const PieceBuffer& piece, std::size_t whole) {
    constexpr std::size_t kLongest = 32767;
    SetCode(piece, errors::kTruncated);
    SetIndicator(piece, whole <= kLongest ? static_cast<std::int16_t>(whole) : values::kLongIndicator);
}

}  // namespace

// ---- What is wanted

Status Statement::GetPieceInfo(PieceInfo& info) const {
    if (pieces_.kind == Pieces::Kind::none) return Error(errors::kIllegalOperation);
    const ub1 piece = pieces_.continued ? OCI_NEXT_PIECE : OCI_ONE_PIECE;
    if (pieces_.kind == Pieces::Kind::execute) {
        info = {pieces_.binds[pieces_.bind], OCI_HTYPE_BIND, OCI_PARAM_IN, pieces_.iteration, 0, piece};
    } else {
        info = {active_[pieces_.active].define, OCI_HTYPE_DEFINE, OCI_PARAM_OUT, pieces_.row, 0, piece};
    }
    return {};
}

Status Statement::SetPieceInfo(DataArea& area, const PieceBuffer& piece) {
    PieceInfo wanted;
    if (Status status = GetPieceInfo(wanted); !status.Ok()) return status;
    if (wanted.handle != &area || piece.piece > OCI_LAST_PIECE) return Error(errors::kIllegalOperation);
    const bool null_in = wanted.direction == OCI_PARAM_IN && IsNull(piece);
    if (!null_in && !piece.length) return Error(errors::kBadLength);
    if (!null_in && !piece.buffer) return Error(errors::kBadBuffer);
    area.piece = piece;
    area.piece.is_set = true;
    return {};
}

// ---- Fetching

Status Statement::StartFetchInPieces(ub4 rows, bool at_first, bool by_execute) {
    pieces_.kind = Pieces::Kind::fetch;
    pieces_.by_execute = by_execute;
    pieces_.rows = rows;
    pieces_.row = 0;
    return NextRowInPieces(at_first);
}

Status Statement::NextRowInPieces(bool at_row) {
    bool found = at_row;
    Status status = found ? Status() : cursor_.Next(found);
    if (status.Ok() && !found) status = EndOfFetch();
    if (status.Ok()) {
        const int error = StoreRow(pieces_.row);
        if (error != 0 && error != errors::kTruncationWarning) status = Error(error);
    }
    int error = 0;
    if (status.Ok() && NextDefineInPieces(0, error)) return NeedData(errors::kWantsBuffer);
    pieces_.kind = Pieces::Kind::none;
    return error != 0 ? Error(error) : status;
}

// The first define from index `from` on that takes its value in pieces, and that value. False at the end of the row, or
// with an error set.
bool Statement::NextDefineInPieces(std::size_t from, int& error) {
    while (from < active_.size() && !active_[from].define->InPieces()) ++from;
    if (from == active_.size()) return false;
    const ActiveDefine& active = active_[from];
    Define& define = *active.define;
    const engine::Datum& value = cursor_.Row()[active.column];
    pieces_.active = from;
    pieces_.continued = false;
    pieces_.is_null = value.kind == engine::Kind::null;
    pieces_.whole = {};
    const values::Renderer render = active.renderers[static_cast<std::size_t>(value.kind)];
    if (!pieces_.is_null) error = render(value, define.workspace, pieces_.whole);
    if (error == 0 && define.Type()->family == values::Family::text)
        error = values::ToApplication(pieces_.whole, define.workspace, pieces_.whole);
    pieces_.rest = pieces_.whole;
    return error == 0;
}

Status Statement::ContinueFetch() {
    Define& define = *active_[pieces_.active].define;
    const PieceBuffer piece = std::exchange(define.piece, {});
    if (!piece.is_set) return Error(errors::kNoBuffer);
    int error = pieces_.is_null ? TakeNull(piece) : TakePiece(define, piece, pieces_.rest);
    if (error == errors::kBadLength) return Error(error);
    if (error == 0 && !pieces_.rest.empty()) {
        if (piece.piece != OCI_LAST_PIECE) {
            pieces_.continued = true;
            return NeedData(errors::kWantsBuffer);
        }
        MarkCut(piece, pieces_.whole.size());
    }
    if (error == 0 && NextDefineInPieces(pieces_.active + 1, error)) return NeedData(errors::kWantsBuffer);
    if (error != 0) {
        pieces_.kind = Pieces::Kind::none;
        return Error(error);
    }
    ++rows_fetched_;
    row_count_ = cursor_.Reached();
    if (++pieces_.row < pieces_.rows) return NextRowInPieces(false);
    pieces_.kind = Pieces::Kind::none;
    return {};
}

// ---- Executing

Status Statement::StartExecuteInPieces(const ExecuteArguments& arguments) {
    pieces_ = {};
    for (Bind* bind : bound_) {
        if (!bind || !bind->InPieces()) continue;
        if (std::find(pieces_.binds.begin(), pieces_.binds.end(), bind) != pieces_.binds.end()) continue;
        bind->collected.clear();
        bind->collected_null = false;
        pieces_.binds.push_back(bind);
    }
    pieces_.kind = Pieces::Kind::execute;
    pieces_.arguments = arguments;
    pieces_.iteration = arguments.first;
    return NeedData(errors::kWantsPiece);
}

Status Statement::ContinueExecute(ErrorHandle& error) {
    Bind& bind = *pieces_.binds[pieces_.bind];
    const PieceBuffer piece = std::exchange(bind.piece, {});
    if (!piece.is_set) return Error(errors::kNoBuffer);
    const bool is_null = IsNull(piece);
    if (!is_null) bind.collected.append(static_cast<const char*>(piece.buffer), *piece.length);
    bind.collected_null = is_null;
    SetCode(piece, 0);
    pieces_.continued = !is_null && piece.piece != OCI_ONE_PIECE && piece.piece != OCI_LAST_PIECE;
    if (pieces_.continued) return NeedData(errors::kWantsPiece);
    if (++pieces_.bind < pieces_.binds.size()) return NeedData(errors::kWantsPiece);
    return RunCollected(error);
}

// All values of an iteration are there: runs it, and asks for the next one's.
Status Statement::RunCollected(ErrorHandle& error) {
    const ExecuteArguments arguments = pieces_.arguments;
    const bool by_row = !scanned_.is_block && scanned_.steps[0].run == sql::Run::change;
    if (!by_row || arguments.iterations <= arguments.first) {
        pieces_ = {};
        return Run(error, arguments);
    }
    const ExecuteArguments one{pieces_.iteration + 1, pieces_.iteration, arguments.mode};
    Status status = RunRows(one, pieces_.outcome);
    const bool stop = status.Failed() || (!pieces_.outcome.failures.empty() && !(arguments.mode & OCI_BATCH_ERRORS));
    if (!stop && ++pieces_.iteration < arguments.iterations) {
        pieces_.bind = 0;
        for (Bind* bind : pieces_.binds) bind->collected.clear();
        return NeedData(errors::kWantsPiece);
    }
    engine::ArrayOutcome outcome = std::move(pieces_.outcome);
    pieces_ = {};
    if (status.Failed()) return status;
    status = Finish(error, arguments, outcome);
    return Complete(std::move(status), arguments);
}
