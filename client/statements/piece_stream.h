// Values in pieces. A stream knows which piece is wanted next and what of the values is there; a driver
// (piece_drivers.h) gets the place of each piece from the application, by polling or by callback.
//
// Going in, the application decides with ONE or LAST that a value is complete; coming out, a value goes on until it is
// taken whole or the application says LAST. The row whose values go out is the stream's own copy, as are the values
// that an iteration returns: whatever becomes of the query meanwhile, their bytes stay. Large objects of more than
// engine::kHeldWhole bytes are read as their pieces go, as long as they can be.
//
// While a callback runs, the statement takes no other call (Asks). What the callback takes away besides ends the
// operation: the statement's handle, its session, a bind. A define or bind that is freed before its value comes out, or
// while it does, is passed over.
//
// The defines stay as they were activated while a stream is under way: whoever changes them ends it first.
//
// Threads: under the statement's serial lock.
#pragma once

#include <cstdint>
#include <memory>
#include <span>
#include <string_view>
#include <vector>

#include "statements/bound_text.h"
#include "statements/defines.h"
#include "statements/execution.h"
#include "statements/piece_drivers.h"
#include "statements/whole_value.h"

// A row that is kept.
class OwnRow {
public:
    void Keep(std::span<const engine::Datum> values);
    [[nodiscard]] const engine::Datum& operator[](std::size_t column) const { return values_[column]; }

private:
    std::vector<engine::Datum> values_;
    std::vector<std::uint64_t> bytes_;    // aligned for what values point to
};

class PieceStream {
public:
    explicit PieceStream(const void* statement) : statement_(statement) {}

    enum class Use : std::uint8_t { none, execute, fetch, fetch_by_execute };

    // What the stream waits for. None when the handle of the wanted piece, or a bind that takes part, is freed: the
    // operation ends then.
    [[nodiscard]] Use Wants() noexcept {
        if (use_ != Use::none && live::erased_objects.load(std::memory_order_acquire) != seen_) EndUnlessLiving();
        return wanted_.area ? use_ : Use::none;
    }
    [[nodiscard]] const WantedPiece& Wanted() const { return wanted_; }
    void End() noexcept;

    // Whether a callback is under way.
    [[nodiscard]] bool Asks() const { return asks_; }
    // The area must be that of the handle that is wanted.
    Status SetPlace(DataArea& area, const PieceBuffer& place);

    // Values of binds, one iteration after another: Collect, run it, StartDelivery, Deliver. 24369 when a callback is
    // missing beside one that is there.
    Status StartExecute(const BoundText& text, const ExecuteArguments& arguments);
    // Ok when all values of the iteration are there.
    Status Collect(CallbackDriver& driver);
    // What the iteration gave the targets, or, of a block, what its variables hold.
    void StartDelivery(bool is_block);
    void ForgetReturned() noexcept;    // the iteration failed
    [[nodiscard]] bool ReturnsToCallbacks() const noexcept;    // all that comes back
    [[nodiscard]] bool Delivers() const { return wanted_.out; }
    Status Deliver(CallbackDriver& driver);
    void NextIteration() noexcept;
    [[nodiscard]] const ExecuteArguments& Arguments() const { return arguments_; }

    // Coming out: rows up to element `end`, each Begun before it is handed out.
    void StartFetch(ub4 end, bool by_execute, ub4 mode) noexcept;
    // Large objects that are not read yet stand beside the values, one a column or null; they are taken.
    using Objects = std::vector<std::shared_ptr<engine::Lob>>;
    void Begin(ub4 row, std::span<const engine::Datum> values, Objects* objects);
    // Ok when the row is taken; its defines are those of `defines`.
    Status HandOut(const Defines& defines, CallbackDriver& driver);
    [[nodiscard]] ub4 Row() const { return wanted_.iteration; }
    [[nodiscard]] ub4 EndRow() const { return arguments_.iterations; }

    // Whether a value was cut because its area, or a callback, had no more room for it, since StartFetch or StartExecute.
    [[nodiscard]] bool Warned() const { return warned_; }
    void Warn() noexcept { warned_ = true; }

private:
    void EndUnlessLiving() noexcept;
    [[nodiscard]] bool AllLiving() const noexcept;
    Status Fail(int error) noexcept;
    Status Place(CallbackDriver& driver, bool by_callback);
    Status Ask(CallbackDriver& driver);
    void ForgetValues() noexcept;
    Status CollectPiece(BindArea& bind, CallbackDriver& driver);
    bool NextReturned();
    Status HandPieces(CallbackDriver& driver);
    // These answer an error's number or 0.
    int AppendPiece(BindArea& bind, const PieceBuffer& place, bool by_callback);
    int NextValue(const Defines& defines);
    int TakePiece(bool& value_ends);
    int Move(const PieceBuffer& place);
    int MoveParts(char* buffer, std::size_t room, std::size_t& moved);
    int EndCut(const PieceBuffer& place);

    const void* const statement_;
    Use use_ = Use::none;
    bool asks_ = false;
    bool warned_ = false;
    WantedPiece wanted_;
    std::uint64_t seen_ = 0;    // erased objects when the handles that Wants looks at were found living
    ExecuteArguments arguments_{};
    // binds, in order of the placeholders
    std::vector<std::shared_ptr<BindArea>> ins_;
    std::vector<std::shared_ptr<BindArea>> outs_;
    std::size_t bind_ = 0;        // the next one to look at
    std::size_t returned_ = 0;    // elements of the iteration that come out
    ub1 begun_with_ = 0;          // the piece that the value began with, while it is the only one
    PieceCollector collector_;
    // rows
    OwnRow row_;
    Objects objects_;             // of the row
    std::size_t define_ = 0;      // the next one to look at
    bool is_null_ = false;
    OutgoingValue value_;         // what is still to be taken
};
