// The defines of a statement, and rows into them. A define whose handle is freed counts as not made.
//
// Threads: under the statement's serial lock.
#pragma once

#include <cstdint>
#include <memory>
#include <span>
#include <vector>

#include "engine/engine.h"
#include "oci.h"
#include "statements/data_area.h"

class Defines {
public:
    // A define and the column that it takes.
    struct Active {
        std::shared_ptr<DataArea> area;
        std::uint32_t column;
        values::ByKind<values::OutConverter> converters;
        values::ByKind<values::Renderer> renderers;    // of defines in pieces
    };

    // The area of a position, from 1; null when none is made.
    [[nodiscard]] std::shared_ptr<DataArea> At(ub4 position) const;
    // Room for a position, so that Put does not fail.
    void Reserve(ub4 position) { if (made_.size() < position) made_.resize(position); }
    // What was made for the position before goes.
    void Put(ub4 position, const std::shared_ptr<DataArea>& area, const Object& statement) noexcept;
    // The text changes: handles outlive theirs by one, since applications hand them in again for the next.
    void Retire(const Object& statement) noexcept;

    // The columns may be others, or other ones of their kind.
    void Renew() noexcept { changed_ = true; }
    // Finds the column of each define and what converts its values. 1007 for a column that is not there, 24374 when
    // nothing is defined.
    Status Activate(const std::vector<engine::Column>& columns, const std::shared_ptr<values::LobSession>& lobs);
    [[nodiscard]] const std::vector<Active>& All() const { return active_; }    // as Activate left them
    [[nodiscard]] bool InPieces() const { return in_pieces_; }                  // some are
    // The number of erased objects when all of them were found living.
    [[nodiscard]] std::uint64_t Seen() const { return seen_; }

    // A row into element `index` of the defines that do not take pieces; answers the gravest thing that happened: an
    // error before 24345 before 0.
    int StoreRow(std::size_t index, std::span<const engine::Datum> row) const;

private:
    [[nodiscard]] bool AllLive() const;

    std::vector<std::shared_ptr<DataArea>> made_;       // by position - 1
    std::vector<std::shared_ptr<DataArea>> retired_;    // of the text before
    std::vector<Active> active_;
    bool changed_ = true;    // since active_ was made
    std::uint64_t seen_ = 0;
    bool in_pieces_ = false;    // some of active_ are
    bool at_once_ = false;      // some are not
};
