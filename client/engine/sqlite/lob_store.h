// Large objects of SQLite tables, and temporary ones. A column's value is read where it lies, by the row's number, and
// written there as far as it does not grow. What grows or shrinks is collected in a draft, a file outside of the
// database, which becomes the column's value before anything could see it: before the next statement of the connection,
// a mark, or the commit. So it belongs to the transaction like any change. A value is never held in memory but for texts
// of up to kHeldWhole bytes; longer ones are kept as a blob, which SQLite can write in pieces.
//
// A row's number alone does not tell the row: it may be deleted, and the number given to another. The store notes what
// the connection does to rows of such tables, and what others may have done by the file's data version.
#pragma once

#include <sqlite3.h>

#include <array>
#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "engine/chunked_bytes.h"
#include "engine/lobs.h"
#include "engine/sqlite/home.h"

namespace engine::sqlite {

class SqliteConnection;

// A column whose values are large objects. One of each name on a connection; compared by pointer.
struct LobColumn {
    std::string schema, table, name;
    LobKind kind;
};

// The value of a Datum of Kind::lob.
struct LobView {
    std::shared_ptr<const LobColumn> const* column;
    std::int64_t row;
    bool is_locked;                        // by the statement that brings it
    const std::shared_ptr<Lob>* kept;      // of a row that was read ahead; else null
};

// An open value, moved from row to row.
class OpenValue {
public:
    ~OpenValue() { Close(); }
    // 22922 where there is no such value.
    Status Open(SqliteConnection& connection, const std::shared_ptr<const LobColumn>& column, std::int64_t row,
                bool writes);
    void Close() noexcept;
    [[nodiscard]] std::uint64_t Length() const { return static_cast<std::uint64_t>(sqlite3_blob_bytes(blob_)); }
    // Within the length.
    [[nodiscard]] int Read(std::uint64_t offset, std::span<std::byte> out);
    [[nodiscard]] int Write(std::uint64_t offset, std::span<const std::byte> in);

private:
    int Closed(int code) noexcept;

    sqlite3_blob* blob_ = nullptr;
    std::shared_ptr<const LobColumn> column_;
    std::int64_t row_ = 0;
    bool writes_ = false;
};

class LobStore final : public engine::LobStore {
public:
    explicit LobStore(SqliteConnection& connection);
    ~LobStore() override;
    LobStore(const LobStore&) = delete;
    LobStore& operator=(const LobStore&) = delete;

    Status CreateTemporary(LobKind kind, std::shared_ptr<Lob>& lob) override;
    Status Take(const Datum& value, bool brief, std::shared_ptr<Lob>& lob) override;
    [[nodiscard]] bool TakesObjects() const override { return true; }

    // The one column of that name.
    std::shared_ptr<const LobColumn> Column(std::string_view schema, std::string_view table, std::string_view name,
                                            LobKind kind);

    // Makes an object that Take answered a copy of what its column holds.
    Status Keep(const std::shared_ptr<Lob>& lob);

    // ---- For the connection

    void LetGo() noexcept;               // of the database, unless somebody else holds it

    // Drafts become values: before a statement, a mark, a commit. The values of drafts that fail stay as they were;
    // where memory failed, the drafts wait for the next time.
    Status Settle();
    void Close() noexcept { Forget(), data_version_.reset(); }
    void Forget() noexcept;              // the drafts: what they are of is undone
    void TransactionBegins() noexcept;
    void Defined() noexcept;             // tables may be others
    void RowChanged(int operation, const char* table, std::int64_t row) noexcept;
    void RowsGone(std::string_view table) noexcept;    // all of a table's rows, and nobody has told of each

private:
    friend class ColumnLob;
    struct Draft {
        Draft(std::shared_ptr<const LobColumn> of, std::int64_t number, std::shared_ptr<ChunkFile> file)
            : column(std::move(of)), row(number), bytes(std::move(file), FillerOf(column->kind)) {}
        std::shared_ptr<const LobColumn> column;
        std::int64_t row;
        ChunkedBytes bytes;
    };
    struct Change {
        std::uint64_t at = 0;             // the last one of its values
        std::uint64_t replaced_at = 0;    // the last one that made it another row, or none
        std::uint64_t gone_at = 0;        // it was deleted, unless that is undone
        std::uint64_t transaction = 0;    // of the last one
    };
    // A table with such columns.
    struct Table {
        std::string schema, name;
        std::uint64_t known_since;        // the transaction
        bool changed_before;              // that one, and nobody noted what
        std::uint64_t emptied_at = 0;     // all rows were deleted, unless that is undone
        std::unordered_map<std::int64_t, Change> changes;
    };
    struct Shared {
        LobStore* store;
    };

    Table* FindTable(const LobColumn& column);    // null before there is any such column
    Change ChangeOf(const LobColumn& column, std::int64_t row);    // nothing's where none is known
    void NoteWrite(const LobColumn& column, std::int64_t row) noexcept;
    void Note(Table& table, std::int64_t row, int operation) noexcept;
    Draft* FindDraft(const LobColumn& column, std::int64_t row);
    Status MakeDraft(const std::shared_ptr<const LobColumn>& column, std::int64_t row, Draft*& draft);
    Status Flush(Draft& draft);
    Status FlushWhole(Draft& draft, sqlite3_stmt* statement);
    Status FlushInPieces(Draft& draft, sqlite3_stmt* statement);
    Status RunUpdate(sqlite3_stmt* statement);
    [[nodiscard]] bool InTransaction(std::uint64_t number) const;
    Status DataVersion(std::int64_t& version);
    [[nodiscard]] bool IsWrittenRow(const LobColumn& column, std::int64_t row);

    SqliteConnection& connection_;
    const std::shared_ptr<ChunkFile> file_ = std::make_shared<ChunkFile>();
    const std::shared_ptr<Shared> shared_;
    std::vector<std::shared_ptr<const LobColumn>> columns_;
    std::vector<Table> tables_;
    std::vector<std::unique_ptr<Draft>> drafts_;
    OpenValue open_;
    StatementHandle data_version_;
    std::uint64_t transaction_ = 1;       // the number of the one that runs, or of the one to come
    int changes_at_begin_ = 0;
    std::uint64_t now_ = 1;               // grows with each change of a row or value
    std::uint64_t floor_ = 0;             // what is older cannot be told to be what it was
    std::uint64_t undone_at_ = 0;         // the last time that a transaction's changes were
    bool flushes_ = false;
};

}  // namespace engine::sqlite
