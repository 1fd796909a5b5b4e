#include "statements/piece_stream.h"

#include <algorithm>
#include <cstring>
#include <utility>

#include "handles/errors.h"
#include "platform/utf.h"

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
    return area.workspace.utf16 ? utf::WholeUtf16(rest, room) : utf::WholeUtf8(rest, room);
}

// Moves the next part of `rest` into the buffer; terminated types get a zero that is not counted.
int Move(const DataArea& area, const PieceBuffer& piece, std::string_view& rest) {
    const std::size_t zero = area.Type()->code != SQLT_STR ? 0 : area.workspace.utf16 ? 2 : 1;
    const std::size_t room = *piece.length;
    if (room < zero) return errors::kBadLength;
    const std::size_t taken = PieceLength(area, rest, room - zero);
    if (taken == 0 && !rest.empty()) return errors::kBadLength;
    auto* buffer = static_cast<char*>(piece.buffer);
    if (taken > 0) std::memcpy(buffer, rest.data(), taken);
    std::memset(buffer + taken, 0, zero);
    rest.remove_prefix(taken);
    *piece.length = static_cast<ub4>(taken);
    return 0;
}

std::int16_t CutIndicator(std::size_t whole) {
    constexpr std::size_t kLongest = 32767;
    return whole <= kLongest ? static_cast<std::int16_t>(whole) : values::kLongIndicator;
}

}  // namespace

bool SaysNull(const PieceBuffer& piece) {
    std::int16_t indicator = 0;
    if (piece.indicator) std::memcpy(&indicator, piece.indicator, sizeof indicator);
    return indicator == values::kNullIndicator;
}

Status PollingDriver::Supply(WantedPiece& wanted) {
    if (std::exchange(wanted.area->piece.is_set, false)) return {};
    if (wanted.asked) return Error(errors::kNoBuffer);
    wanted.asked = true;
    return NeedData(wanted.out ? errors::kWantsBuffer : errors::kWantsPiece);
}

void OwnRow::Keep(std::span<const engine::Datum> values) {
    constexpr std::size_t kWord = sizeof(std::uint64_t);
    const auto words = [](const engine::Datum& value) {
        return value.kind > engine::Kind::real ? (value.length + kWord - 1) / kWord : 0;
    };
    std::size_t total = 0;
    for (const engine::Datum& value : values) total += words(value);
    values_.assign(values.begin(), values.end());
    bytes_.resize(std::max<std::size_t>(total, 1));
    std::uint64_t* at = bytes_.data();
    for (engine::Datum& value : values_) {
        if (value.kind <= engine::Kind::real) continue;
        if (value.length > 0) std::memcpy(at, value.data, value.length);
        value.data = at;
        at += words(value);
    }
}

void PieceStream::EndUnlessLiving() noexcept {
    const std::uint64_t erased = live::erased_objects.load(std::memory_order_acquire);
    const bool living = (!wanted_.area || wanted_.area->HasHandle()) &&
                        std::all_of(binds_.begin(), binds_.end(), [](const auto& bind) { return bind->HasHandle(); });
    if (living) seen_ = erased;
    else End();
}

void PieceStream::End() noexcept {
    use_ = Use::none;
    wanted_ = {};
    binds_.clear();
    bind_ = 0;
}

// ---- Going in

void PieceStream::StartExecute(const BoundText& text, const ExecuteArguments& arguments) {
    End();
    seen_ = live::erased_objects.load(std::memory_order_acquire);
    for (std::size_t placeholder = 0; placeholder < text.Count(); ++placeholder) {
        const std::shared_ptr<BindArea>& bind = text.At(placeholder);
        if (!bind || !bind->InPieces() || !bind->HasHandle()) continue;
        if (std::find(binds_.begin(), binds_.end(), bind) == binds_.end()) binds_.push_back(bind);
    }
    use_ = Use::execute;
    arguments_ = arguments;
    wanted_.iteration = arguments.first;
    for (const auto& bind : binds_) bind->collected_null = false, bind->collected.clear();
    wanted_.area = binds_[0].get();
    wanted_.area->piece = {};
}

Status PieceStream::Collect(PieceDriver& driver) {
    while (bind_ < binds_.size()) {
        BindArea& bind = *binds_[bind_];
        wanted_.area = &bind;
        wanted_.out = false;
        if (Status status = driver.Supply(wanted_); !status.Ok()) return status;
        const PieceBuffer& place = bind.piece;
        const bool is_null = SaysNull(place);
        if (!is_null) bind.collected.append(static_cast<const char*>(place.buffer), *place.length);
        bind.collected_null = is_null;
        if (place.code) *place.code = 0;
        wanted_.asked = false;
        wanted_.continued = !is_null && place.piece != OCI_ONE_PIECE && place.piece != OCI_LAST_PIECE;
        if (!wanted_.continued) ++bind_;
    }
    return {};
}

void PieceStream::NextIteration() noexcept {
    ++wanted_.iteration;
    bind_ = 0;
    wanted_.area = binds_[0].get();
    for (const auto& bind : binds_) bind->collected_null = false, bind->collected.clear();
}

// ---- Coming out

void PieceStream::StartFetch(ub4 end, bool by_execute, ub4 mode) noexcept {
    End();
    use_ = by_execute ? Use::fetch_by_execute : Use::fetch;
    arguments_ = {end, 0, mode};
    wanted_.out = true;
}

void PieceStream::Begin(ub4 row, std::span<const engine::Datum> values) {
    row_.Keep(values);
    wanted_.iteration = row;
    define_ = 0;
}

// The next define that takes its value in pieces, and that value; none is wanted at the end of the row.
int PieceStream::NextValue(const Defines& defines) {
    const std::vector<Defines::Active>& all = defines.All();
    const std::uint64_t erased = live::erased_objects.load(std::memory_order_acquire);
    const bool all_live = erased == defines.Seen();
    const auto takes_part = [&](const DataArea& area) { return area.InPieces() && (all_live || area.HasHandle()); };
    while (define_ < all.size() && !takes_part(*all[define_].area)) ++define_;
    if (define_ == all.size()) return 0;
    const Defines::Active& active = all[define_++];
    DataArea& area = *active.area;
    const engine::Datum& value = row_[active.column];
    is_null_ = value.kind == engine::Kind::null;
    rest_ = {};
    int error = 0;
    if (!is_null_) error = active.renderers[static_cast<std::size_t>(value.kind)](value, area.workspace, rest_);
    if (error == 0 && area.Type()->family == values::Family::text)
        error = values::ToApplication(rest_, area.workspace, rest_);
    if (error != 0) return error;
    whole_ = rest_.size();
    area.piece.is_set = false;
    wanted_.area = &area;
    wanted_.continued = wanted_.asked = false;
    seen_ = erased;
    return 0;
}

int PieceStream::TakePiece(bool& value_ends) {
    const DataArea& area = *wanted_.area;
    const PieceBuffer& place = area.piece;
    const ub4 row = wanted_.iteration;
    value_ends = true;
    if (is_null_) {
        *place.length = 0;
        TellCode(area, row, place, errors::kNullFetched);
        return TellIndicator(area, row, place, values::kNullIndicator) ? 0 : errors::kNullFetched;
    }
    if (const int error = Move(area, place, rest_)) {
        value_ends = false;
        return error;
    }
    const bool cut = !rest_.empty() && place.piece == OCI_LAST_PIECE;
    TellCode(area, row, place, cut ? errors::kTruncated : 0);
    TellIndicator(area, row, place, cut ? CutIndicator(whole_) : 0);
    value_ends = rest_.empty() || cut;
    return 0;
}

Status PieceStream::HandOut(const Defines& defines, PieceDriver& driver) {
    for (;;) {
        if (!wanted_.area) {
            if (const int error = NextValue(defines)) {
                End();
                return Error(error);
            }
            if (!wanted_.area) return {};
        }
        if (Status status = driver.Supply(wanted_); !status.Ok()) return status;
        bool value_ends = false;
        if (const int error = TakePiece(value_ends)) {
            if (value_ends) End();    // else another buffer may do
            return Error(error);
        }
        if (value_ends) wanted_.area = nullptr;
        wanted_.continued = !value_ends;
        wanted_.asked = false;
    }
}
