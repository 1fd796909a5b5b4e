#include "statements/piece_stream.h"

#include <algorithm>
#include <cstring>
#include <utility>

#include "handles/errors.h"
#include "platform/utf.h"
#include "values/lob_descriptor.h"

namespace {

// The piece's own places for what is told of the value, or those of the define. False where there is none.
bool TellIndicator(const DataArea& area, ub4 row, const PieceBuffer& piece, std::int16_t indicator) {
    if (piece.indicator) std::memcpy(piece.indicator, &indicator, sizeof indicator);
    else area.elements.SetIndicator(row, indicator);
    return piece.indicator || area.elements.indicators;
}
void TellCode(const DataArea& area, ub4 row, const PieceBuffer& piece, int number) {
    const auto code = static_cast<ub2>(number);
    if (piece.code) std::memcpy(piece.code, &code, sizeof code);
    else area.elements.SetCode(row, number);
}

// How many bytes of `rest` a buffer takes without tearing a character apart.
std::size_t PieceLength(const DataArea& area, std::string_view rest, std::size_t room) {
    if (area.Type()->family != values::Family::text) return std::min(rest.size(), room);
    return values::WholeCharacters(area.workspace, rest, room);
}

}  // namespace

void OwnRow::Keep(std::span<const engine::Datum> values) {
    constexpr std::size_t kWord = sizeof(std::uint64_t);
    const auto words = [](const engine::Datum& value) {
        return value.kind > engine::Kind::real ? (value.length + kWord - 1) / kWord : 0;
    };
    std::size_t total = 1;    // no view is null
    for (const engine::Datum& value : values) total += words(value);
    values_.assign(values.begin(), values.end());
    if (bytes_.size() < total) bytes_.resize(total);
    std::uint64_t* at = bytes_.data();
    for (engine::Datum& value : values_) {
        if (value.kind <= engine::Kind::real) continue;
        if (value.length > 0) std::memcpy(at, value.data, value.length);
        value.data = at;
        at += words(value);
    }
}

bool PieceStream::AllLiving() const noexcept {
    return std::all_of(ins_.begin(), ins_.end(), [](const auto& bind) { return bind->HasHandle(); });
}

void PieceStream::EndUnlessLiving() noexcept {
    const std::uint64_t erased = live::erased_objects.load(std::memory_order_acquire);
    if ((!wanted_.area || wanted_.area->HasHandle()) && AllLiving()) seen_ = erased;
    else End();
}

void PieceStream::End() noexcept {
    use_ = Use::none;
    wanted_ = {};
    ins_.clear();
    outs_.clear();
    bind_ = 0;
}

Status PieceStream::Fail(int error) noexcept {
    End();
    return Error(error);
}

Status PieceStream::SetPlace(DataArea& area, const PieceBuffer& place) {
    const bool waits = Wants() != Use::none && !asks_ && wanted_.area == &area && !wanted_.ByCallback();
    if (!waits || place.piece > OCI_LAST_PIECE) return Error(errors::kIllegalOperation);
    if (!wanted_.out) {
        const bool goes_on = place.piece == OCI_NEXT_PIECE || place.piece == OCI_LAST_PIECE;
        if (goes_on != wanted_.continued) return Error(errors::kIllegalOperation);
    }
    if (wanted_.out || !SaysNull(place)) {
        if (!place.length) return Error(errors::kBadLength);
        if (!place.buffer) return Error(errors::kBadBuffer);
    }
    area.piece = place;
    area.piece.is_set = true;
    return {};
}

// Ok when the place of the piece is in its area. A polled piece stays wanted whatever is answered.
inline Status PieceStream::Place(CallbackDriver& driver, bool by_callback) {
    if (by_callback) return Ask(driver);
    return wanted_.TakePlace() ? Status() : Poll(wanted_);
}

// Has a callback put it there; its failure ends the operation. No area is wanted any more when its handle was freed
// while its value came out.
Status PieceStream::Ask(CallbackDriver& driver) {
    Status status;
    {
        struct Asking {
            explicit Asking(bool& asks) : asks_(asks) { asks_ = true; }
            ~Asking() { asks_ = false; }
            bool& asks_;
        } const asking(asks_);
        status = driver.Supply(wanted_);
    }
    if (use_ == Use::none) return Error(errors::kNotConnected);    // the session went
    if (!status.Ok()) {
        End();
        return status;
    }
    const std::uint64_t erased = live::erased_objects.load(std::memory_order_acquire);
    if (erased == seen_) return {};
    if (live::KindOf(statement_) == Kind::none) return Fail(errors::kIllegalOperation);
    if (!wanted_.out && !AllLiving()) return Fail(errors::kNotAllBound);
    if (wanted_.area->HasHandle()) seen_ = erased;
    else wanted_.area = nullptr;
    return {};
}

// ---- Binds

namespace {

using Binds = std::vector<std::shared_ptr<BindArea>>;

void AddOnce(Binds& binds, const std::shared_ptr<BindArea>& bind) {
    if (std::find(binds.begin(), binds.end(), bind) == binds.end()) binds.push_back(bind);
}

bool IsTarget(const sql::StatementText& text, std::size_t placeholder) {
    return std::any_of(text.steps.begin(), text.steps.end(), [placeholder](const sql::Step& step) {
        return std::find(step.targets.begin(), step.targets.end(), placeholder) != step.targets.end();
    });
}

// A callback serves one direction, and there is one for the other.
bool LacksCallback(const Binds& binds, bool comes_out) {
    return std::any_of(binds.begin(), binds.end(), [comes_out](const auto& bind) {
        return bind->AsksBy().Any() && !bind->AsksBy().Serve(comes_out);
    });
}

ub4 ElementsOf(const BindArea& bind) {
    return bind.IsTable() ? std::min(*bind.current_elements, bind.most_elements) : 1;
}

}  // namespace

// What is only given back is not asked for, unless there is a callback to ask; what that gives is not looked at.
Status PieceStream::StartExecute(const BoundText& text, const ExecuteArguments& arguments) {
    End();
    seen_ = live::erased_objects.load(std::memory_order_acquire);
    collector_.Use(text.lobs ? text.lobs->store : nullptr);
    for (std::size_t placeholder = 0; placeholder < text.Count(); ++placeholder) {
        const std::shared_ptr<BindArea>& bind = text.At(placeholder);
        if (!bind || !bind->InPieces() || !bind->HasHandle()) continue;
        const bool is_target = IsTarget(text.Scanned(), placeholder);
        if (is_target) AddOnce(outs_, bind);
        if (!is_target || bind->AsksBy().in) AddOnce(ins_, bind);
    }
    if (LacksCallback(ins_, false) || LacksCallback(outs_, true)) return Fail(errors::kNoCallback);
    use_ = Use::execute;
    warned_ = false;
    arguments_ = arguments;
    wanted_.iteration = arguments.first;
    for (const auto& bind : ins_) bind->piece = {};
    ForgetValues();
    return {};
}

void PieceStream::ForgetValues() noexcept {
    for (const Binds* binds : {&ins_, &outs_})
        for (const auto& bind : *binds)
            for (WholeValue& whole : bind->in) whole.Forget();
    ForgetReturned();
}

void PieceStream::ForgetReturned() noexcept {
    for (const auto& bind : outs_) bind->out.clear();
}

Status PieceStream::Collect(CallbackDriver& driver) {
    for (; bind_ < ins_.size(); ++bind_) {
        BindArea& bind = *ins_[bind_];
        const ub4 elements = ElementsOf(bind);
        if (bind.IsTable() && *bind.current_elements > elements) return Fail(errors::kBadTableLength);
        if (bind.in.size() < elements) bind.in.resize(elements);
        while (wanted_.index < elements)
            if (Status status = CollectPiece(bind, driver); !status.Ok()) return status;
        wanted_.index = 0;
    }
    wanted_.area = nullptr;
    return {};
}

Status PieceStream::CollectPiece(BindArea& bind, CallbackDriver& driver) {
    wanted_.area = &bind;
    const bool by_callback = wanted_.ByCallback();
    if (Status status = Place(driver, by_callback); !status.Ok()) return status;
    if (const int error = AppendPiece(bind, bind.piece, by_callback)) return Fail(error);
    wanted_.asked = false;
    if (!wanted_.continued) ++wanted_.index;
    return {};
}

// A callback that goes by the iteration alone gives the same piece again when it is asked for the next one: that was all.
int PieceStream::AppendPiece(BindArea& bind, const PieceBuffer& place, bool by_callback) {
    WholeValue& whole = bind.in[wanted_.index];
    const bool begins = !wanted_.continued;
    const bool is_null = SaysNull(place) || (by_callback && !place.buffer && *place.length == 0);
    if (place.code) std::memset(place.code, 0, sizeof *place.code);
    whole.is_null = is_null;
    wanted_.continued = false;
    if (is_null) return 0;
    if (!place.buffer) return errors::kBadBuffer;
    if (place.piece > OCI_LAST_PIECE) return errors::kIllegalOperation;
    const std::string_view piece(static_cast<const char*>(place.buffer), *place.length);
    if (!begins && by_callback && std::exchange(begun_with_, ub1{OCI_LAST_PIECE}) == place.piece &&
        place.piece != OCI_LAST_PIECE && piece == whole.bytes)
        return 0;
    const bool begins_again = place.piece == OCI_ONE_PIECE || place.piece == OCI_FIRST_PIECE;
    if (!begins && begins_again) return errors::kIllegalOperation;
    const bool last = place.piece == OCI_ONE_PIECE || place.piece == OCI_LAST_PIECE;
    if (const int error = collector_.Append(bind, whole, piece, begins, last)) return error;
    if (begins) begun_with_ = place.piece;
    wanted_.continued = !last;
    return 0;
}

void PieceStream::NextIteration() noexcept {
    ++wanted_.iteration;
    wanted_.out = false;
    wanted_.index = 0;
    bind_ = 0;
    ForgetValues();
}

void PieceStream::StartDelivery(bool is_block) {
    wanted_.out = true;
    wanted_.index = 0;
    bind_ = 0;
    returned_ = 0;
    for (const auto& bind : outs_) {
        if (is_block) {
            bind->in.resize(ElementsOf(*bind));
            bind->out.swap(bind->in);
        }
        returned_ = std::max(returned_, bind->out.size());
    }
}

// Row by row, and in each by order of the placeholders. False when there are no more.
bool PieceStream::NextReturned() {
    for (; wanted_.index < returned_; ++wanted_.index, bind_ = 0) {
        while (bind_ < outs_.size()) {
            BindArea& bind = *outs_[bind_++];
            if (wanted_.index >= bind.out.size() || !bind.HasHandle()) continue;
            const WholeValue& whole = bind.out[wanted_.index];
            is_null_ = whole.is_null;
            if (whole.object) value_.Start(whole.object);
            else value_.Start(whole.bytes);
            bind.piece = {};
            wanted_.area = &bind;
            wanted_.continued = wanted_.asked = false;
            return true;
        }
    }
    return false;
}

bool PieceStream::ReturnsToCallbacks() const noexcept {
    return !outs_.empty() &&
           std::all_of(outs_.begin(), outs_.end(), [](const auto& bind) { return bind->AsksBy().out != nullptr; });
}

Status PieceStream::Deliver(CallbackDriver& driver) {
    while (wanted_.area || NextReturned())
        if (Status status = HandPieces(driver); !status.Ok()) return status;
    return {};
}

// ---- Rows

void PieceStream::StartFetch(ub4 end, bool by_execute, ub4 mode) noexcept {
    End();
    warned_ = false;
    use_ = by_execute ? Use::fetch_by_execute : Use::fetch;
    arguments_ = {end, 0, mode};
    wanted_.out = true;
}

void PieceStream::Begin(ub4 row, std::span<const engine::Datum> values, Objects* objects) {
    row_.Keep(values);
    if (objects) objects_.swap(*objects);
    else if (!objects_.empty()) objects_.clear();
    wanted_.iteration = row;
    define_ = 0;
}

// The next define that takes its value in pieces, and that value; none is wanted at the end of the row.
int PieceStream::NextValue(const Defines& defines) {
    const std::vector<Defines::Active>& all = defines.All();
    const std::uint64_t erased = live::erased_objects.load(std::memory_order_acquire);
    const bool all_live = erased == defines.Seen();
    const auto takes_part = [&](const DataArea& area) { return area.InPieces() && (all_live || area.HasHandle()); };
    auto active = all.begin() + static_cast<std::ptrdiff_t>(define_);
    for (; active != all.end() && !takes_part(*active->area); ++active) ++define_;
    if (active == all.end()) return 0;
    DataArea& area = *active->area;
    const engine::Datum& value = row_[active->column];
    is_null_ = value.kind == engine::Kind::null;
    std::string_view whole;
    if (!objects_.empty() && objects_[active->column]) {
        value_.Start(objects_[active->column]);
    } else {
        int error = 0;
        if (!is_null_) error = active->renderers[static_cast<std::size_t>(value.kind)](value, area.workspace, whole);
        if (error == 0 && area.workspace.set && area.Type()->family == values::Family::text)
            error = values::ToApplication(whole, area.workspace, whole);
        if (error != 0) return error;
        value_.Start(whole);
    }
    ++define_;    // memory that is short leaves the value to the next call
    area.piece.is_set = false;
    wanted_.area = &area;
    wanted_.continued = wanted_.asked = false;
    seen_ = erased;
    return 0;
}

// Fills the buffer from what is left of the value, as it is read.
int PieceStream::MoveParts(char* buffer, std::size_t room, std::size_t& moved) {
    DataArea& area = *wanted_.area;
    for (;;) {
        if (const int error = value_.Refill(area)) return error;
        const std::size_t part = PieceLength(area, value_.rest, room - moved);
        if (part > 0) std::memcpy(buffer + moved, value_.rest.data(), part);
        value_.rest.remove_prefix(part);
        moved += part;
        if (part == 0 || moved == room || value_.Ends()) break;
    }
    return moved == 0 && !value_.Ends() ? errors::kBadLength : 0;
}

// Mostly the buffer takes all that is left. Terminated types get a zero that is not counted.
int PieceStream::Move(const PieceBuffer& piece) {
    const DataArea& area = *wanted_.area;
    const std::size_t zero = area.Type()->code != SQLT_STR ? 0 : area.workspace.utf16 ? 2 : 1;
    if (!piece.length) return errors::kBadLength;
    if (!piece.buffer) return errors::kBadBuffer;
    if (*piece.length < zero) return errors::kBadLength;
    const std::size_t room = *piece.length - zero;
    auto* const buffer = static_cast<char*>(piece.buffer);
    std::size_t moved = 0;
    if (value_.IsAtHand() && value_.rest.size() <= room) [[likely]] {
        moved = value_.rest.copy(buffer, room);
        value_.rest = {};
    } else if (const int error = MoveParts(buffer, room, moved)) {
        return error;
    }
    if (zero > 0) buffer[moved] = 0;
    if (zero > 1) buffer[moved + 1] = 0;
    *piece.length = static_cast<ub4>(moved);
    return 0;
}

int PieceStream::TakePiece(bool& value_ends) {
    const DataArea& area = *wanted_.area;
    const PieceBuffer& place = area.piece;
    const ub4 row = wanted_.iteration;
    value_ends = true;
    if (is_null_) {
        if (place.length) *place.length = 0;
        TellCode(area, row, place, errors::kNullFetched);
        return TellIndicator(area, row, place, values::kNullIndicator) ? 0 : errors::kNullFetched;
    }
    if (const int error = Move(place)) {
        if (error == errors::kBadLength && place.length && wanted_.continued && wanted_.ByCallback()) return EndCut(place);
        value_ends = error != errors::kBadLength && error != errors::kBadBuffer;    // else another buffer may do
        return error;
    }
    const bool goes_on = !value_.Ends();
    const bool cut = goes_on && place.piece == OCI_LAST_PIECE;
    TellCode(area, row, place, cut ? errors::kTruncated : 0);
    TellIndicator(area, row, place, cut ? value_.CutIndicator() : 0);
    value_ends = !goes_on || cut;
    return 0;
}

// A callback has no room for the rest of the value: as if its area were too small.
int PieceStream::EndCut(const PieceBuffer& place) {
    const DataArea& area = *wanted_.area;
    *place.length = 0;
    TellCode(area, wanted_.iteration, place, errors::kTruncated);
    TellIndicator(area, wanted_.iteration, place, value_.CutIndicator());
    warned_ = true;
    return place.code || area.elements.codes ? 0 : errors::kTruncated;
}

// The value at hand, until it is taken.
Status PieceStream::HandPieces(CallbackDriver& driver) {
    while (wanted_.area) {
        const bool by_callback = wanted_.ByCallback();
        if (Status status = Place(driver, by_callback); !status.Ok()) return status;
        if (!wanted_.area) break;
        bool value_ends = false;
        if (const int error = TakePiece(value_ends)) {
            if (value_ends || by_callback) End();    // else another buffer may do
            return Error(error);
        }
        if (value_ends) wanted_.area = nullptr;
        wanted_.continued = !value_ends;
        wanted_.asked = false;
    }
    return {};
}

// Flat: what it calls here is in line, for it runs for every value.
[[gnu::flatten]] Status PieceStream::HandOut(const Defines& defines, CallbackDriver& driver) {
    for (;;) {
        if (!wanted_.area) {
            if (const int error = NextValue(defines)) return Fail(error);
            if (!wanted_.area) return {};
        }
        if (Status status = HandPieces(driver); !status.Ok()) return status;
    }
}
