// Large objects of PostgreSQL tables, and temporary ones. What is short comes with its row; what is longer is read in
// pieces, by the table and place of the row's version and the transaction that made it: a version never changes, and one
// that can no longer be seen is refused. A value that the transaction has locked is what its row holds now: the versions
// that the row gets are followed. What is written is collected in a draft, outside of the server, which becomes the
// column's value (one update) before anything could see it: before the next statement of the connection, a mark, or the
// commit. Columns that hold the numbers of large objects of the server have no drafts: object_lob.h.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "engine/chunked_bytes.h"
#include "engine/lobs.h"
#include "engine/postgres/lob_columns.h"

namespace engine::postgres {

// One version of a row of a table.
struct RowVersion {
    Oid table = 0;
    std::uint32_t transaction = 0;    // that made it
    std::uint64_t place = 0;          // block and offset in it, as in a row id
    bool operator==(const RowVersion&) const = default;
};
struct RowVersionHash {
    std::size_t operator()(const RowVersion& version) const noexcept {
        return std::hash<std::uint64_t>()(version.place * 31 + version.transaction) * 31 + version.table;
    }
};

// What is known of one row.
struct LobRow {
    std::vector<RowVersion> versions;    // that it had; the last one known comes last
    // The version that the transaction has locked or made first, and when that was known. As long as this is not undone,
    // nobody else changes the row, and the version stays where it lies.
    RowVersion anchor;
    std::uint64_t held_at = 0;           // 0: there is none
};

// The value of a Datum of Kind::lob; the bytes follow where they came with the row.
struct LobView {
    const std::shared_ptr<const LobColumn>* column = nullptr;
    RowVersion version;          // of table 0: of no row that is known
    bool is_locked = false;      // by the statement that brings it
    bool is_whole = false;       // its bytes follow
    Oid object = 0;              // the number of one that the server keeps for itself, which has no length here
    std::uint64_t length = 0;
    std::uint64_t seen_at = 0;   // when the row was read
};

class PgLobStore final : public LobStore {
public:
    explicit PgLobStore(PgConnection& connection);
    ~PgLobStore() override;
    PgLobStore(const PgLobStore&) = delete;
    PgLobStore& operator=(const PgLobStore&) = delete;

    Status CreateTemporary(LobKind kind, std::shared_ptr<Lob>& lob) override;
    Status Take(const Datum& value, bool brief, std::shared_ptr<Lob>& lob) override;

    // ---- For the connection

    [[nodiscard]] std::uint64_t Now() const { return now_; }    // another number behind each statement
    std::uint64_t StatementRuns() noexcept { return ++now_; }
    // Drafts become values. The values of drafts that fail stay as they were; where memory failed, the drafts wait.
    Status Settle();
    void Forget() noexcept;                 // the drafts: what they are of is undone, or part of it
    void Undone(std::uint64_t since) noexcept;    // what the transaction did behind that moment, not its drafts
    void TransactionBegins() noexcept { ++transaction_; }

private:
    friend class RowLob;
    friend class ColumnLob;
    friend class ObjectLob;
    struct Draft {
        std::shared_ptr<LobRow> row;
        std::shared_ptr<const LobColumn> column;
        std::shared_ptr<Lob> value;
    };
    struct Shared {
        PgLobStore* store;
    };

    using Rows = std::unordered_map<RowVersion, std::weak_ptr<LobRow>, RowVersionHash>;

    std::shared_ptr<LobRow> RowOf(const RowVersion& version);
    // With room that was made for it before, a version that is nobody's yet needs no memory.
    Rows::node_type MakeRoom(LobRow& row);
    void Follow(std::shared_ptr<LobRow>& row, const RowVersion& version, Rows::node_type room);
    void Sweep();
    // The transaction was seen to have the row of that version then.
    void Hold(LobRow& row, const RowVersion& version, std::uint64_t at) noexcept;
    [[nodiscard]] bool Stands(std::uint64_t at) const noexcept;    // what it did then is not undone
    Lob* FindDraft(const LobRow& row, const LobColumn& column);
    Status Flush(Draft& draft);
    Status Upload(Lob& value, std::uint64_t length, Oid& object);
    Status Update(Draft& draft, const std::string& expression, std::string_view value);

    // Questions to the server, about versions of a row.
    Status ReadVersion(const LobColumn& column, const RowVersion& version, std::uint64_t offset, std::size_t most,
                       Result& found);
    // `follows`: a version that is not known is one if it has come of the anchor.
    Status FindLatest(const LobColumn& column, const LobRow& row, bool follows, RowVersion& latest,
                      std::uint64_t& measure);
    Status HasWritten(const RowVersion& version, bool& written);
    Status WhyMissing(const RowVersion& version);
    [[nodiscard]] bool InTransaction(std::uint64_t number) const;
    [[nodiscard]] std::uint64_t OpenTransaction() const;    // its number; 0: there is none

    PgConnection& connection_;
    const std::shared_ptr<ChunkFile> file_ = std::make_shared<ChunkFile>();
    const std::shared_ptr<Shared> shared_;
    Rows rows_;
    std::size_t sweep_at_ = 64;
    std::vector<Draft> drafts_;
    std::uint64_t transaction_ = 0;       // the number of the one that runs, or ran last
    std::uint64_t now_ = 1;
    std::uint64_t writes_ = 0;            // into drafts
    std::uint64_t object_changes_ = 0;    // of objects that the server keeps for itself: writes, and what undid them
    struct Stretch {
        std::uint64_t since, until;       // neither belongs to it
    };
    std::vector<Stretch> undone_;         // in their order, apart from each other
    std::uint64_t all_undone_at_ = 0;
    std::uint64_t last_held_at_ = 0;
};

}  // namespace engine::postgres
