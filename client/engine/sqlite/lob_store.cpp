// Columns of tables as large objects: taking, reading and writing them, drafts, and what is known of their rows.
#include "engine/sqlite/lob_store.h"

#include <algorithm>
#include <cstring>
#include <limits>
#include <new>

#include "engine/sqlite/connection.h"
#include "engine/sqlite/errors.h"
#include "engine/sqlite/table_columns.h"
#include "engine/temporary_lob.h"
#include "handles/errors.h"

namespace engine::sqlite {
namespace {

constexpr std::size_t kBlock = std::size_t{1} << 17;
constexpr std::size_t kMostChanges = std::size_t{1} << 16;        // of a table
constexpr std::uint64_t kOtherColumns = 4096;                     // of the row, beside the value

bool IsSameName(std::string_view left, std::string_view right) {
    return left.size() == right.size() &&
           sqlite3_strnicmp(left.data(), right.data(), static_cast<int>(left.size())) == 0;
}

Status NoValue() { return Error(errors::kNoLobValue).From("SQLITE"); }

// All of an open value.
Status CopyValue(SqliteConnection& connection, OpenValue& value, ChunkedBytes& bytes) {
    const bool in_transaction = connection.InTransaction();
    return bytes.Fill(value.Length(), [&](std::uint64_t offset, std::span<std::byte> out) {
        const int code = value.Read(offset, out);
        return code == SQLITE_OK ? Status() : connection.Failed(code, Verb::other, in_transaction);
    });
}

}  // namespace

// ---- Open values

Status OpenValue::Open(SqliteConnection& connection, const std::shared_ptr<const LobColumn>& column, std::int64_t row,
                       bool writes) {
    const bool in_transaction = connection.InTransaction();
    int code = SQLITE_ABORT;
    if (blob_ && column_ == column && (writes_ || !writes)) {
        if (row_ == row && sqlite3_blob_read(blob_, nullptr, 0, 0) == SQLITE_OK) return {};
        code = sqlite3_blob_reopen(blob_, row);
    }
    if (code != SQLITE_OK) {
        Close();
        if (in_transaction && !connection.InTransaction()) return connection.Failed(code, Verb::other, true);
        code = sqlite3_blob_open(connection.Database(), column->schema.c_str(), column->table.c_str(),
                                 column->name.c_str(), row, writes, &blob_);
        column_ = column;
        writes_ = writes;
    }
    row_ = row;
    if (code == SQLITE_OK) return {};
    Status status = (code & 0xFF) == SQLITE_ERROR ? NoValue() : connection.Failed(code, Verb::other, in_transaction);
    Close();
    return status;
}

void OpenValue::Close() noexcept {
    sqlite3_blob_close(blob_);
    blob_ = nullptr;
}

// One that failed may take the transaction with it when it is closed: that is done at once, where it is noticed.
int OpenValue::Closed(int code) noexcept {
    if (code != SQLITE_OK) Close();
    return code;
}

int OpenValue::Read(std::uint64_t offset, std::span<std::byte> out) {
    return Closed(sqlite3_blob_read(blob_, out.data(), static_cast<int>(out.size()), static_cast<int>(offset)));
}

int OpenValue::Write(std::uint64_t offset, std::span<const std::byte> in) {
    return Closed(sqlite3_blob_write(blob_, in.data(), static_cast<int>(in.size()), static_cast<int>(offset)));
}

// ---- The object of a column

class ColumnLob final : public Lob {
public:
    ColumnLob(LobStore& store, const LobView& view)
        : shared_(store.shared_), column_(*view.column), row_(view.row), seen_at_(store.now_) {}

    [[nodiscard]] LobKind Kind() const override { return column_->kind; }
    [[nodiscard]] bool IsTemporary() const override { return false; }
    [[nodiscard]] bool IsSame(const Lob& other) const override {
        const auto* column = dynamic_cast<const ColumnLob*>(&other);
        return column && column->column_ == column_ && column->row_ == row_;
    }
    [[nodiscard]] std::uint64_t Version() const override;
    Status Length(std::uint64_t& bytes) override;
    Status Read(std::uint64_t offset, std::span<std::byte> out, std::size_t& read) override;
    Status CheckWrite() override;
    Status Write(std::uint64_t offset, std::span<const std::byte> in) override;
    Status Trim(std::uint64_t bytes) override;

private:
    friend class LobStore;
    Status Check();
    Status CheckOthers();
    Status Open(bool writes) { return Store().open_.Open(Store().connection_, column_, row_, writes); }
    Status Draft(LobStore::Draft*& draft);
    void NoteWrite();
    [[nodiscard]] LobStore& Store() const { return *shared_->store; }

    const std::shared_ptr<LobStore::Shared> shared_;
    const std::shared_ptr<const LobColumn> column_;
    const std::int64_t row_;
    const std::uint64_t seen_at_;
    std::uint64_t transaction_ = 0;     // it was fetched in; 0: none
    std::int64_t data_version_ = 0;     // of that transaction
    bool is_current_ = false;           // what it holds now counts, not what it held then
    bool is_brief_ = false;             // the query that brings it is open, and sees nobody else's changes
    std::unique_ptr<ChunkedBytes> copy_;
};

// The last time that the value may have changed.
std::uint64_t ColumnLob::Version() const {
    if (copy_ || !shared_->store) return 0;
    const LobStore::Change change = Store().ChangeOf(*column_, row_);
    return std::max({change.at, change.gone_at, Store().floor_, Store().undone_at_});
}

// Whether the row is there and, unless the present value counts, what it was.
Status ColumnLob::Check() {
    if (!shared_->store) return Error(errors::kInvalidLocator);
    if (seen_at_ < Store().floor_) return Error(errors::kSnapshotTooOld).From("SQLITE");
    const LobStore::Change change = Store().ChangeOf(*column_, row_);
    if (change.replaced_at > seen_at_) return NoValue();
    if (change.gone_at > seen_at_) {    // unless that is undone
        Status there = Open(false);
        Store().LetGo();
        if (there.Failed()) return there;
    }
    if (change.at > seen_at_ && !is_current_) return Error(errors::kSnapshotTooOld).From("SQLITE");
    if (is_brief_ || Store().InTransaction(transaction_) || Store().connection_.Private()) return {};
    return CheckOthers();
}

// Nothing can be told of a row once others have written.
Status ColumnLob::CheckOthers() {
    std::int64_t version = 0;
    Status status = Store().DataVersion(version);
    if (status.Ok() && version != data_version_) return Error(errors::kSnapshotTooOld).From("SQLITE");
    return status;
}

Status ColumnLob::Length(std::uint64_t& bytes) {
    if (copy_) return bytes = copy_->Size(), Status();
    if (Status status = Check(); status.Failed()) return status;
    if (const LobStore::Draft* draft = Store().FindDraft(*column_, row_)) return bytes = draft->bytes.Size(), Status();
    Status status = Open(false);
    if (status.Ok()) bytes = Store().open_.Length();
    Store().LetGo();
    return status;
}

Status ColumnLob::Read(std::uint64_t offset, std::span<std::byte> out, std::size_t& read) {
    read = 0;
    if (copy_) return copy_->Read(offset, out, read);
    if (Status status = Check(); status.Failed()) return status;
    if (const LobStore::Draft* draft = Store().FindDraft(*column_, row_)) return draft->bytes.Read(offset, out, read);
    Status status = Open(false);
    if (status.Ok() && offset < Store().open_.Length()) {
        const std::uint64_t rest = Store().open_.Length() - offset;
        const std::span<std::byte> part = out.first(static_cast<std::size_t>(std::min<std::uint64_t>(out.size(), rest)));
        SqliteConnection& connection = Store().connection_;
        const bool in_transaction = connection.InTransaction();
        const int code = Store().open_.Read(offset, part);
        if (code != SQLITE_OK) status = connection.Failed(code, Verb::other, in_transaction);
        else read = part.size();
    }
    Store().LetGo();
    return status;
}

Status ColumnLob::CheckWrite() {
    if (!shared_->store) return Error(errors::kInvalidLocator);
    if (!is_current_) return Error(errors::kRowNotLocked).From("SQLITE");
    if (!Store().InTransaction(transaction_)) return Error(errors::kLocatorOfOldTransaction).From("SQLITE");
    return Check();
}

// The draft of the value, which is made when there is none; rows to come of open queries are read before.
Status ColumnLob::Draft(LobStore::Draft*& draft) {
    draft = Store().FindDraft(*column_, row_);
    return draft ? Status() : Store().MakeDraft(column_, row_, draft);
}

void ColumnLob::NoteWrite() { Store().NoteWrite(*column_, row_); }

Status ColumnLob::Write(std::uint64_t offset, std::span<const std::byte> in) {
    if (Status status = CheckWrite(); status.Failed()) return status;
    const auto limit = static_cast<std::uint64_t>(sqlite3_limit(Store().connection_.Database(), SQLITE_LIMIT_LENGTH, -1));
    if (offset + in.size() + kOtherColumns > limit) return Error(errors::kLobTooLarge).From("SQLITE");
    NoteWrite();
    LobStore::Draft* draft = Store().FindDraft(*column_, row_);
    if (!draft) {
        SqliteConnection& connection = Store().connection_;
        if (Status status = connection.ReadAhead(); !connection.InTransaction()) return status;
        const Status opened = Open(true);    // not where the column is part of an index
        if (opened.Ok() && offset + in.size() <= Store().open_.Length()) {
            const bool in_transaction = connection.InTransaction();
            const int code = Store().open_.Write(offset, in);
            return code == SQLITE_OK ? Status() : connection.Failed(code, Verb::update, in_transaction);
        }
        if (opened.Failed() && opened.Number() != errors::kNoLobValue) return opened;
        if (Status status = Draft(draft); status.Failed()) return status;
    }
    return draft->bytes.Write(offset, in);
}

Status ColumnLob::Trim(std::uint64_t bytes) {
    if (Status status = CheckWrite(); status.Failed()) return status;
    std::uint64_t length = 0;
    if (Status status = Length(length); status.Failed() || length == bytes) return status;
    NoteWrite();
    LobStore::Draft* draft = nullptr;
    if (Status status = Draft(draft); status.Failed()) return status;
    draft->bytes.Trim(bytes);
    return {};
}

// ---- The store

LobStore::LobStore(SqliteConnection& connection)
    : connection_(connection), shared_(std::make_shared<Shared>(Shared{this})) {}

LobStore::~LobStore() { shared_->store = nullptr; }

Status LobStore::CreateTemporary(LobKind kind, std::shared_ptr<Lob>& lob) {
    lob = std::make_shared<TemporaryLob>(kind, file_);
    return {};
}

// A value that another session may change before it is read is copied; so is one whose row is kept for later.
Status LobStore::Take(const Datum& value, bool brief, std::shared_ptr<Lob>& lob) {
    LobView view;
    std::memcpy(&view, value.data, sizeof view);
    if (view.kept && (brief || !view.is_locked)) return lob = *view.kept, Status();
    auto made = std::make_shared<ColumnLob>(*this, view);
    made->is_brief_ = brief;
    const bool in_transaction = connection_.InTransaction();
    if (in_transaction) made->transaction_ = transaction_;
    made->is_current_ = in_transaction && (view.is_locked || IsWrittenRow(**view.column, view.row));
    if (in_transaction && !brief && !connection_.Private()) {
        if (Status status = DataVersion(made->data_version_); status.Failed()) return status;
    }
    lob = made;
    return !brief && !in_transaction && !connection_.Private() ? Keep(lob) : Status();
}

// Makes it a copy of what the column holds: rows are kept before there is any draft.
Status LobStore::Keep(const std::shared_ptr<Lob>& lob) {
    auto& column = static_cast<ColumnLob&>(*lob);
    auto copy = std::make_unique<ChunkedBytes>(file_, std::byte{});
    Status status = open_.Open(connection_, column.column_, column.row_, false);
    if (status.Ok()) status = CopyValue(connection_, open_, *copy);
    LetGo();
    if (status.Ok()) column.copy_ = std::move(copy);
    return status;
}

std::shared_ptr<const LobColumn> LobStore::Column(std::string_view schema, std::string_view table,
                                                  std::string_view name, LobKind kind) {
    for (const auto& column : columns_) {
        if (column->kind == kind && IsSameName(column->schema, schema) && IsSameName(column->table, table) &&
            IsSameName(column->name, name))
            return column;
    }
    auto made = std::make_shared<LobColumn>(LobColumn{std::string(schema), std::string(table), std::string(name), kind});
    columns_.reserve(columns_.size() + 1);
    if (!FindTable(*made)) {
        const bool changed = connection_.InTransaction() && sqlite3_total_changes(connection_.Database()) != changes_at_begin_;
        tables_.push_back({made->schema, made->table, transaction_, changed, 0, {}});
    }
    columns_.push_back(made);
    return made;
}

LobStore::Table* LobStore::FindTable(const LobColumn& column) {
    for (Table& table : tables_)
        if (IsSameName(table.name, column.table) && IsSameName(table.schema, column.schema)) return &table;
    return nullptr;
}

bool LobStore::InTransaction(std::uint64_t number) const {
    return number == transaction_ && connection_.InTransaction();
}

LobStore::Change LobStore::ChangeOf(const LobColumn& column, std::int64_t row) {
    const Table& table = *FindTable(column);
    const auto found = table.changes.find(row);
    Change change = found == table.changes.end() ? Change() : found->second;
    change.gone_at = std::max(change.gone_at, table.emptied_at);
    return change;
}

// A row that the transaction has written is locked. Who came too late to see it written takes it for one that is.
bool LobStore::IsWrittenRow(const LobColumn& column, std::int64_t row) {
    const Table& table = *FindTable(column);
    return (table.known_since == transaction_ && table.changed_before) || ChangeOf(column, row).transaction == transaction_;
}

// Asking begins to read; of a transaction it is the same all through.
Status LobStore::DataVersion(std::int64_t& version) {
    sqlite3* const database = connection_.Database();
    if (!data_version_) {
        sqlite3_stmt* compiled = nullptr;
        const int code = sqlite3_prepare_v3(database, "pragma data_version", -1, SQLITE_PREPARE_PERSISTENT, &compiled,
                                            nullptr);
        data_version_.reset(compiled);
        if (code != SQLITE_OK) return Failure(database, code);
    }
    const int code = sqlite3_step(data_version_.get());
    Status status = code == SQLITE_ROW ? Status() : Failure(database, code);
    if (status.Ok()) version = sqlite3_column_int64(data_version_.get(), 0);
    sqlite3_reset(data_version_.get());
    return status;
}

void LobStore::LetGo() noexcept {
    if (!connection_.InTransaction() && !connection_.HasOpenQueries()) open_.Close();
}

// ---- What happens to rows

// Of a row that is there, by its locator.
void LobStore::NoteWrite(const LobColumn& column, std::int64_t row) noexcept {
    ++now_;
    Note(*FindTable(column), row, 0);
}

// Numbers that grow are those of new rows: one that is inserted may take the place of another, and so may one that is
// updated and had another number, where a row was deleted.
void LobStore::Note(Table& table, std::int64_t row, int operation) noexcept {
    try {
        if (table.changes.size() >= kMostChanges) throw std::bad_alloc();    // too many
        Change& change = table.changes[row];
        if (operation == SQLITE_DELETE) {
            change.gone_at = now_;
            return;
        }
        if (operation == SQLITE_INSERT) change.replaced_at = now_;
        if (operation == SQLITE_UPDATE)
            change.replaced_at = std::max({change.replaced_at, change.gone_at, table.emptied_at});
        change.at = now_;
        change.transaction = transaction_;
    } catch (const std::bad_alloc&) {
        table.changes.clear();
        floor_ = now_;
        table.known_since = transaction_;
        table.changed_before = true;
    }
}

void LobStore::RowChanged(int operation, const char* table, std::int64_t row) noexcept {
    if (flushes_ || tables_.empty()) return;
    ++now_;
    for (Table& known : tables_)
        if (IsSameName(known.name, table)) Note(known, row, operation);
}

void LobStore::RowsGone(std::string_view table) noexcept {
    ++now_;
    for (Table& known : tables_)
        if (IsSameName(known.name, table)) known.emptied_at = now_;
}

void LobStore::Defined() noexcept { floor_ = ++now_; }

void LobStore::TransactionBegins() noexcept {
    ++transaction_;
    changes_at_begin_ = sqlite3_total_changes(connection_.Database());
}

// ---- Drafts

LobStore::Draft* LobStore::FindDraft(const LobColumn& column, std::int64_t row) {
    if (drafts_.empty()) return nullptr;
    const auto found = std::find_if(drafts_.begin(), drafts_.end(), [&](const auto& draft) {
        return draft->column.get() == &column && draft->row == row;
    });
    return found == drafts_.end() ? nullptr : found->get();
}

Status LobStore::MakeDraft(const std::shared_ptr<const LobColumn>& column, std::int64_t row, Draft*& draft) {
    auto made = std::make_unique<Draft>(column, row, file_);
    drafts_.reserve(drafts_.size() + 1);
    if (Status status = connection_.ReadAhead(); !connection_.InTransaction()) return status;
    Status status = open_.Open(connection_, column, row, false);
    if (status.Ok()) status = CopyValue(connection_, open_, made->bytes);
    if (status.Failed()) return status;
    open_.Close();
    draft = made.get();
    drafts_.push_back(std::move(made));
    return status;
}

void LobStore::Forget() noexcept {
    open_.Close();
    drafts_.clear();
    undone_at_ = ++now_;
}

// What was open when a draft was made has been read ahead, and what opens settles first.
Status LobStore::Settle() {
    open_.Close();
    if (drafts_.empty()) return {};
    auto drafts = std::exchange(drafts_, {});
    if (!connection_.InTransaction()) return {};    // lost with it
    Status first;
    flushes_ = true;
    for (auto& draft : drafts) {
        if (!connection_.InTransaction()) break;    // lost with one before
        Status status;
        try {
            status = Flush(*draft);
        } catch (const std::bad_alloc&) {
            status = Error(errors::kOutOfMemory).From("SQLITE");
        }
        if (status.Number() != errors::kOutOfMemory) draft = nullptr;
        if (first.Ok()) first = std::move(status);
    }
    open_.Close();
    flushes_ = false;
    std::erase(drafts, nullptr);
    if (connection_.InTransaction()) drafts_ = std::move(drafts);
    return first;
}

// Triggers are for what SQL changes: the statement is compiled without.
Status LobStore::Flush(Draft& draft) {
    sqlite3* const database = connection_.Database();
    const LobColumn& column = *draft.column;
    const std::string sql = "update " + QuotedName(column.schema) + '.' + QuotedName(column.table) + " set " +
                            QuotedName(column.name) + " = ?1 where rowid = ?2";
    const SqliteConnection::Trusted trusted(connection_);
    sqlite3_db_config(database, SQLITE_DBCONFIG_ENABLE_TRIGGER, 0, nullptr);
    sqlite3_stmt* compiled = nullptr;
    const int code = sqlite3_prepare_v2(database, sql.data(), static_cast<int>(sql.size()), &compiled, nullptr);
    const StatementHandle statement(compiled);
    Status status = code == SQLITE_OK ? Status() : Failure(database, code);
    if (status.Ok()) {
        sqlite3_bind_int64(compiled, 2, draft.row);
        status = draft.bytes.Size() <= kHeldWhole ? FlushWhole(draft, compiled) : FlushInPieces(draft, compiled);
    }
    sqlite3_db_config(database, SQLITE_DBCONFIG_ENABLE_TRIGGER, 1, nullptr);
    return status;
}

Status LobStore::RunUpdate(sqlite3_stmt* statement) {
    const bool in_transaction = connection_.InTransaction();
    const int code = sqlite3_step(statement);
    if ((code & 0xFF) == SQLITE_TOOBIG) return Error(errors::kLobTooLarge).From("SQLITE");
    if (code != SQLITE_DONE) return connection_.Failed(code, Verb::update, in_transaction);
    return sqlite3_changes(connection_.Database()) == 1 ? Status() : NoValue();
}

Status LobStore::FlushWhole(Draft& draft, sqlite3_stmt* statement) {
    std::vector<std::byte> bytes(static_cast<std::size_t>(draft.bytes.Size()));
    std::size_t read = 0;
    if (Status status = draft.bytes.Read(0, bytes, read); status.Failed()) return status;
    const int length = static_cast<int>(bytes.size());
    const char* const data = bytes.empty() ? "" : reinterpret_cast<const char*>(bytes.data());
    if (draft.column->kind == LobKind::characters) sqlite3_bind_text(statement, 1, data, length, SQLITE_STATIC);
    else sqlite3_bind_blob(statement, 1, data, length, SQLITE_STATIC);
    return RunUpdate(statement);
}

// A value half written must not stay: the transaction goes with it. What is part of an index is not written in pieces.
Status LobStore::FlushInPieces(Draft& draft, sqlite3_stmt* statement) {
    Status status = open_.Open(connection_, draft.column, draft.row, true);
    if (status.Number() == errors::kNoLobValue) return FlushWhole(draft, statement);
    sqlite3_bind_zeroblob64(statement, 1, draft.bytes.Size());
    if (status.Ok()) status = RunUpdate(statement);
    if (status.Failed()) return status;
    status = open_.Open(connection_, draft.column, draft.row, true);
    std::vector<std::byte> block(kBlock);
    std::size_t read = 0;
    for (std::uint64_t done = 0; status.Ok() && done < draft.bytes.Size(); done += read) {
        status = draft.bytes.Read(done, block, read);
        if (status.Failed()) break;
        const bool in_transaction = connection_.InTransaction();
        const int code = open_.Write(done, std::span(block).first(read));
        if (code != SQLITE_OK) status = connection_.Failed(code, Verb::update, in_transaction);
    }
    open_.Close();
    if (status.Ok() || !connection_.InTransaction()) return status;
    const Status undone = connection_.Rollback();
    return undone.Failed() ? undone : RolledBack(status);
}

}  // namespace engine::sqlite
