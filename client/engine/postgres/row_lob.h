// What locators of rows' columns have in common: the version of the row that they came with, whether what the row holds
// now counts, and whether they may write.
#pragma once

#include <cstdint>
#include <memory>

#include "engine/postgres/lob_store.h"

namespace engine::postgres {

class RowLob : public Lob {
public:
    [[nodiscard]] LobKind Kind() const final { return column_->kind; }
    [[nodiscard]] bool IsTemporary() const final { return false; }
    Status CheckWrite() final;

    // It is held longer than the row's views: of the row itself from now on.
    void Keep(const LobView& view);

protected:
    RowLob(PgLobStore& store, const LobView& view);

    virtual Status CheckRead() = 0;
    // The row's last version; `measure` is that of the column in it. Once the transaction is over that is refused where
    // somebody else has changed the row.
    Status FindLatest(bool follows, RowVersion& latest, std::uint64_t& measure);
    [[nodiscard]] PgLobStore& Store() const { return *shared_->store; }
    [[nodiscard]] bool InItsTransaction() const;

    const std::shared_ptr<PgLobStore::Shared> shared_;    // its store is null once the connection is gone
    const std::shared_ptr<const LobColumn> column_;
    std::shared_ptr<LobRow> row_;          // null of one that is brief, or of no row
    RowVersion version_;                   // that it reads
    std::uint64_t seen_at_;                // when it was the row's
    std::uint64_t transaction_ = 0;        // it was fetched in; 0: none
    bool is_current_ = false;              // what the row holds now counts, not that version
};

}  // namespace engine::postgres
