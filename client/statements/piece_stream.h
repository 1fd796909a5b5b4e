// Values in pieces. A stream knows which piece is wanted next and what of the values is there; a driver gets the place
// of each piece from the application, in its own way. The one there is waits for the application: the call answers
// OCI_NEED_DATA, the application says where the piece is and makes the same call again. One that asks the application by
// a callback only has to supply the place at once.
//
// Going in, the application decides with ONE or LAST that a value is complete; coming out, a value goes on until it is
// taken whole or the application says LAST. The row whose values go out is the stream's own copy: whatever becomes of
// the query meanwhile, its bytes stay.
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

// The piece that is wanted next.
struct WantedPiece {
    DataArea* area = nullptr; // one of the stream's binds or of the active defines; null while no value is at hand
    bool out = false;         // to the application
    ub4 iteration = 0;        // or row, from 0
    bool continued = false;   // the value has begun
    bool asked = false;       // the application knows
};

// Where pieces lie.
class PieceDriver {
public:
    virtual ~PieceDriver() = default;
    // Puts the place of the piece into its area. What is not Ok ends the call that is under way: OCI_NEED_DATA until it
    // is made again, anything else as its error; the piece stays wanted.
    virtual Status Supply(WantedPiece& wanted) = 0;
};

// Takes the places that OCIStmtSetPieceInfo gave.
class PollingDriver final : public PieceDriver {
public:
    Status Supply(WantedPiece& wanted) override;
};

// Whether the application says that the value is null.
bool SaysNull(const PieceBuffer& piece);

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
    enum class Use : std::uint8_t { none, execute, fetch, fetch_by_execute };

    // What the stream waits for. None when the handle of the wanted piece, or a bind that takes part, is freed: the
    // operation ends then.
    [[nodiscard]] Use Wants() noexcept {
        if (use_ != Use::none && live::erased_objects.load(std::memory_order_acquire) != seen_) EndUnlessLiving();
        return wanted_.area ? use_ : Use::none;
    }
    [[nodiscard]] const WantedPiece& Wanted() const { return wanted_; }
    void End() noexcept;

    // Going in: the values of one iteration after another.
    void StartExecute(const BoundText& text, const ExecuteArguments& arguments);
    // Ok when all values of the iteration are there.
    Status Collect(PieceDriver& driver);
    void NextIteration() noexcept;
    [[nodiscard]] const ExecuteArguments& Arguments() const { return arguments_; }

    // Coming out: rows up to element `end`, each Begun before it is handed out.
    void StartFetch(ub4 end, bool by_execute, ub4 mode) noexcept;
    void Begin(ub4 row, std::span<const engine::Datum> values);
    // Ok when the row is taken; its defines are those of `defines`.
    Status HandOut(const Defines& defines, PieceDriver& driver);
    [[nodiscard]] ub4 Row() const { return wanted_.iteration; }
    [[nodiscard]] ub4 EndRow() const { return arguments_.iterations; }

private:
    void EndUnlessLiving() noexcept;
    // Both answer an error's number or 0.
    int NextValue(const Defines& defines);
    int TakePiece(bool& value_ends);

    Use use_ = Use::none;
    WantedPiece wanted_;
    std::uint64_t seen_ = 0;    // erased objects when the handles that Wants looks at were found living
    ExecuteArguments arguments_{};
    // going in
    std::vector<std::shared_ptr<BindArea>> binds_;    // that take pieces, in order of the placeholders
    std::size_t bind_ = 0;
    // coming out
    OwnRow row_;
    std::size_t define_ = 0;           // the next one to look at
    bool is_null_ = false;
    std::size_t whole_ = 0;       // length of the value
    std::string_view rest_;       // what of it is still to be taken
};
