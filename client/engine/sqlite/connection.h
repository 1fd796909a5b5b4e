// One user's session on a SQLite database: transactions, marks, stopping, the queries that are open on it, and what
// its statements may not touch.
#pragma once

#include <sqlite3.h>

#include <array>
#include <chrono>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>

#include "engine/engine.h"
#include "engine/sqlite/errors.h"
#include "engine/sqlite/home.h"
#include "engine/sqlite/lob_columns.h"
#include "engine/sqlite/lob_store.h"
#include "engine/sqlite/object_values.h"
#include "engine/sqlite/value_targets.h"

namespace engine::sqlite {

class SqliteQuery;

// What a statement was compiled for: the tables as they were then.
struct Schema {
    int version = 0;                   // the file's word
    std::uint64_t definitions = 0;     // run by this connection
    bool operator==(const Schema&) const = default;
};

// One compiled statement, with what its values are for.
struct Compilation {
    StatementHandle statement;
    ValueTargets targets;
    std::string table;    // that it changes; those of triggers and cascades are others
    std::vector<ObjectTarget> objects;  // placeholders whose long values may be filled in when the row stands
    std::vector<LobItem> lobs;          // of its list
    StatementHandle as_written;         // of one with lobs: what its columns are called and declared as
    Schema schema;
};

class SqliteConnection final : public Connection {
public:
    // A connection on a handle of its own, with nobody logged on yet.
    static Status Make(std::shared_ptr<Home> home, std::shared_ptr<const StopRequest> stop,
                       std::unique_ptr<SqliteConnection>& connection);
    ~SqliteConnection() override;
    SqliteConnection(const SqliteConnection&) = delete;
    SqliteConnection& operator=(const SqliteConnection&) = delete;

    Status ChangePassword(const std::string& user, const std::string& old_password,
                          const std::string& new_password) override;
    Status Compile(const StatementSource& source, std::unique_ptr<Query>& query, std::uint32_t& error_offset) override;
    Status Begin(TransactionMode mode) override;
    Status Commit() override;
    Status Rollback() override;
    [[nodiscard]] bool InTransaction() const override { return sqlite3_get_autocommit(Database()) == 0; }
    Status SetMark() override;
    Status UndoToMark() override;
    Status DropMark() override;
    Status Prepare(const Xid& xid, bool& read_only) override;
    Status CommitPrepared(const Xid& xid) override;
    Status RollbackPrepared(const Xid& xid) override;
    Status Recover(std::vector<Xid>& prepared) override;
    Status MakeReady(bool& changed) override;
    Status Another(std::shared_ptr<const StopRequest> stop, std::unique_ptr<Connection>& connection) override;
    void Obey(std::shared_ptr<const StopRequest> stop) noexcept override { stop_ = std::move(stop); }
    Status Describe(std::string_view name, ObjectKind kind, ObjectDescription& object) override;
    Status UseSchema(std::string& schema) override;
    engine::LobStore* Lobs() override { return &lobs_; }
    void WaitForLocks(bool waits) noexcept override { waits_ = waits; }
    Status Ping() override;
    [[nodiscard]] bool Broken() const override { return broken_; }
    void Interrupt() noexcept override {}    // a call looks at the request by itself, again and again

    // ---- For queries, descriptions and accounts

    [[nodiscard]] sqlite3* Database() const { return handle_.database.get(); }
    [[nodiscard]] bool Utf8() const { return utf8_; }                      // how the file keeps texts
    [[nodiscard]] bool Private() const { return home_->Private(); }        // nobody else can open the database
    [[nodiscard]] const std::string& File() const { return home_->File(); }

    // Whether the call that runs is to stop; and the answer of one that does.
    [[nodiscard]] bool Stopping() const { return heeds_ && stop_ && stop_->Asked(); }
    [[nodiscard]] static Status Stopped();
    // The status of a call on the database that has just failed.
    Status Failed(int code, Verb verb, bool was_in_transaction) noexcept;

    // Compiles a text, `error_offset` as in Compile.
    Status Make(std::string_view sql, Compilation& made, std::uint32_t& error_offset);
    // The tables as they are for a statement that runs now: inside a transaction as this one sees them, else as they
    // were when the connection last looked at the file, or later.
    Status SeeSchema(Schema& schema);
    void Defined() noexcept;    // a definition has run

    // What a statement needs to run.
    struct Entry {
        Effect effect = Effect::reads;
        bool read_only = false;    // by SQLite's word
        bool begins = false;       // a savepoint: it stands in a transaction
        bool goes_back = false;    // to a savepoint: rows are again what they were
    };
    // Makes way for a statement: ends or begins a transaction, and has the open queries but `query` read ahead.
    Status Enter(const Entry& entry, bool& began);
    // Ends a transaction that Enter began for a statement that then did nothing.
    void Abandon() noexcept;
    void Join(SqliteQuery& query) noexcept;     // the query has rows to come
    void Leave(SqliteQuery& query) noexcept;
    // Lets the open queries but `except` read the rest of their rows, so that none holds an old state of the database.
    // The first failure, of which the fetch that gets there is told: of interest if it has lost the transaction. A stop is
    // for the call that runs, and does not disturb the queries.
    Status ReadAhead() noexcept;
    [[nodiscard]] bool HasOpenQueries() const { return first_open_ != nullptr; }
    [[nodiscard]] LobStore& LobsOfTables() { return lobs_; }
    // How many changes of rows the connection was told of.
    [[nodiscard]] std::uint64_t ToldChanges() const { return told_changes_; }
    // The last row that was changed in a table, for whoever said which one and emptied it before.
    std::optional<std::int64_t> changed_row;
    const std::string* changed_table = nullptr;
    std::vector<std::int64_t>* changed_rows = nullptr;    // all of them, as far as there is room

    // While one lives, statements may read and change the accounts.
    class Trusted {
    public:
        explicit Trusted(SqliteConnection& connection) : connection_(connection), before_(connection.trusted_) {
            connection_.trusted_ = true;
        }
        ~Trusted() { connection_.trusted_ = before_; }
        Trusted(const Trusted&) = delete;
        Trusted& operator=(const Trusted&) = delete;

    private:
        SqliteConnection& connection_;
        const bool before_;
    };

private:
    // The connection's own statements, compiled when they are first needed and kept: those that end or undo need no
    // memory then.
    enum class Own : std::uint8_t { begin, begin_reading, look, version, commit, rollback, mark, undo, drop };
    static constexpr std::size_t kOwns = static_cast<std::size_t>(Own::drop) + 1;
    class Unheeding;

    SqliteConnection(std::shared_ptr<Home> home, std::shared_ptr<const StopRequest> stop);
    static int OnProgress(void* self);
    static int OnBusy(void* self, int attempts);
    static void OnChange(void* self, int operation, const char* schema, const char* table, sqlite3_int64 row);
    void NoteTable(int action, const char* table) noexcept;
    static int OnAccess(void* self, int action, const char* first, const char* second, const char* schema,
                        const char* trigger);
    bool HasIntervals();
    StatementHandle CompileText(std::string_view sql, int& code, std::size_t* end) noexcept;
    Status CompileOwn(Own own) noexcept;
    Status Run(Own own) noexcept;
    Status LookOrEnd();
    Status Settle();
    std::string Encoding();

    std::shared_ptr<Home> home_;
    OpenHandle handle_;
    std::shared_ptr<const StopRequest> stop_;
    std::array<StatementHandle, kOwns> owns_;
    bool heeds_ = true;                // the call that runs looks at stop_
    bool waits_ = true;                // for locks
    bool trusted_ = false;
    bool read_only_ = false;           // the transaction, if there is one
    sqlite3_int64 changes_before_ = 0; // it began
    bool broken_ = false;
    bool utf8_ = true;
    std::string* table_ = nullptr;     // takes the table that the statement which is compiled changes
    Schema schema_;                    // as it was at data_version_
    std::optional<Schema> looked_for_intervals_;
    bool has_intervals_ = false;
    std::optional<unsigned> data_version_;
    std::chrono::steady_clock::time_point busy_since_;
    SqliteQuery* first_open_ = nullptr;
    std::uint64_t told_changes_ = 0;
    LobStore lobs_{*this};
};

}  // namespace engine::sqlite
