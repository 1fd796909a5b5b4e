// What a database does for the library: the one door to every engine. Nothing above it knows an engine by name or by
// its spelling of SQL; what an engine cannot do is a capability that it lacks.
//
// Texts are UTF-8. Every call answers a Status: error numbers are the published ones, with the engine's own words after
// them where it had some. Nothing here throws but bad_alloc, and what is told below holds after it, too: the call has
// done nothing, or has done all of it.
//
// Threads: a Database serves any number of threads. A connection and what it made serve one thread at a time, not
// always the same one; Interrupt alone comes from any thread at any time.
//
// Transactions: a statement says what it does (Effect), the engine sees to the rest: it begins a transaction before the
// first statement that changes or locks something, and commits before and after one that defines. A statement that
// fails undoes itself and not the transaction; where the engine lost the transaction with it, InTransaction tells.
// Between statements an idle connection holds no transaction open but one that the session has work in: one that a
// statement began and did nothing in, because it failed, is ended.
#pragma once

#include <atomic>
#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "engine/datum.h"
#include "engine/dialect.h"
#include "engine/lobs.h"
#include "engine/row_id.h"
#include "engine/transactions.h"
#include "handles/status.h"

namespace engine {

// ---- Statements

// A column of a select list, a table or a view.
struct Column {
    std::string name;             // as the application sees it; unquoted names in upper case
    std::uint16_t type = 1;       // internal type code: SQLT_CHR, SQLT_NUM, SQLT_DAT, SQLT_AFC, SQLT_BIN, ...
    std::uint32_t size = 0;       // bytes; 0 when the engine sets no limit
    std::uint32_t characters = 0; // the limit of a column that counts characters; 0: it counts bytes
    std::uint8_t precision = 0;   // decimal digits; 0 when not constrained. Of timestamps: digits of the fraction
    std::int8_t scale = 0;        // -127: floating
    bool nullable = true;
    bool national = false;        // text in the national character set
};

// What a statement does to the database.
enum class Effect : std::uint8_t {
    reads,      // rows come back
    locks,      // rows come back and are locked: select ... for update
    changes,    // insert, update, delete, merge, lock; rows may come back (returning)
    defines,    // create, alter, drop, ...
    controls    // savepoints, settings and whatever else the engine knows: within the transaction if there is one
};

// One statement to compile: placeholders and spellings already the engine's.
struct StatementSource {
    std::string_view sql;
    Effect effect = Effect::reads;
    // The kind of each placeholder's values; null: nothing is bound to it.
    std::span<const Kind> parameters;
    // The placeholders as the application wrote them, which are parts of columns' names.
    std::span<const std::string_view> written = {};
};

// Gives the values of one execution after another.
class RowSource {
public:
    virtual ~RowSource() = default;
    // Fills one Datum a placeholder, in the order of the engine's placeholders: of the announced kind, or null. The
    // views hold until the next call. Rows may be asked for ahead of the first failure, and twice. A Status that is not
    // Ok is the failure of that row's execution.
    virtual Status Row(std::uint32_t row, std::span<Datum> values) = 0;
};

// Takes rows that come back.
class RowSink {
public:
    virtual ~RowSink() = default;
    // One row, with one Datum a column; `execution` is the source's row whose execution returned it, 0 for a query. The
    // views hold until the call returns. A Status that is not Ok ends the call that delivers the row and is what it
    // answers; of a change it is the failure of that execution, which is undone.
    virtual Status Row(std::uint32_t execution, std::span<const Datum> values) = 0;
};

// What an array execution did.
struct ArrayOutcome {
    struct Failure {
        std::uint32_t row;
        Status status;
    };
    std::uint64_t affected = 0;        // rows inserted, updated or deleted in all, by executions that succeeded
    std::uint32_t executed = 0;        // executions that succeeded
    std::vector<Failure> failures;     // in row order; at most one unless all rows are tried
    std::optional<RowId> last_row;     // that an insert, update or delete touched, where the engine can tell
};

struct ArrayRun {
    std::uint32_t first = 0;      // rows [first, last) of the source
    std::uint32_t last = 1;
    bool all_rows = false;        // goes on behind a row that failed; a stop that was asked for ends it all the same
    RowSink* returned = nullptr;  // takes the rows of a statement with columns; those of a row that fails later on in
                                  // its own execution may have been delivered
};

// How a query is opened.
struct QueryRun {
    std::uint32_t row = 0;           // of the source
    bool scrollable = false;         // Scroll will be called
};

// One compiled statement. Destroying it closes what it has open. It must not outlive its connection, and is used no
// more once the connection is broken, but for closing and destroying it.
class Query {
public:
    virtual ~Query() = default;

    // The select list; empty for a statement that returns no rows. Known without executing, but for what only a value
    // tells: Open may make it more exact. Valid until the next Open, or until the query goes.
    virtual const std::vector<Column>& Columns() = 0;

    // Runs a statement that changes something once for each row of the run. Stops at the first failure (rows before it
    // stay done), unless all rows are tried. What it did is added to `outcome`, failures with it: memory that is short
    // is the failure of a row (1019). A Status that is an error means that nothing is done: nothing could be run, or
    // the transaction is gone.
    virtual Status ExecuteArray(RowSource& source, const ArrayRun& run, ArrayOutcome& outcome) = 0;

    // Starts a query; one that is open is closed first. The values are taken over, the source may go afterwards.
    //
    // The open query goes on delivering the rows that there were when it was opened, whatever happens besides: changes
    // by this connection or others, commit, rollback, and the end of the tables. An engine that cannot have it so reads
    // the rest of the rows first; what fails then is answered by the fetch that gets there.
    virtual Status Open(RowSource& source, const QueryRun& run) = 0;
    [[nodiscard]] virtual bool IsOpen() const = 0;
    // Delivers up to `most` rows. `more` is false once the end is reached; a query that cannot be scrolled is closed
    // then. After a failure of the sink the next call goes on behind the row that it refused, and after bad_alloc with
    // the first one that the sink did not get; any other failure closes the query. 1002 when none is open, here and in
    // Scroll and Count.
    virtual Status Fetch(RowSink& sink, std::uint32_t most, bool& more) = 0;
    // Delivers the row at `position` of a scrollable query, from 1, and stands there: the next Fetch goes on behind it.
    // `found` is false for 0 and beyond the last row; the query stands before the first or behind the last one then.
    virtual Status Scroll(std::uint64_t position, RowSink& sink, bool& found) = 0;
    // How many rows a scrollable query has; where it stands does not change.
    virtual Status Count(std::uint64_t& rows) = 0;
    // Ends an open query early; harmless when none is open.
    virtual void Close() noexcept = 0;
};

// ---- Objects

enum class ObjectKind : std::uint8_t { any, table, view, sequence, synonym, schema, database };

struct ObjectDescription {
    ObjectKind kind = ObjectKind::any;
    std::string schema;
    std::string name;
    std::vector<Column> columns;          // of tables and views
    std::string target_schema, target;    // of synonyms
    std::int64_t sequence_step = 1, sequence_least = 1, sequence_most = 0;
    std::optional<std::int64_t> sequence_cache;    // how many are taken at a time, where the engine tells
    std::optional<std::int64_t> sequence_mark;     // the last number that was taken, or the first of all
    std::vector<std::string> members;     // of schemas: the names of their objects; of the database: its schemas
    std::vector<ObjectKind> member_kinds; // of schemas: the kinds in the same order
    std::uint32_t number = 0;             // that the engine knows the object by; 0: none
    std::uint32_t first_page = 0;         // where a table begins in the database's file; 0: the engine does not tell
    bool temporary = false;               // of tables: gone with the session
    bool index_only = false;              // of tables: their rows lie in an index
};

// ---- Connections

// The wish to stop what runs. It is kept above the engines, since it holds for the next call when none runs: one that
// stands when ExecuteArray, Open, Fetch, Scroll or Count begins stops that call. Whoever is told 1013 takes it back.
class StopRequest {
public:
    void Ask() noexcept { asked_.store(true, std::memory_order_relaxed); }
    [[nodiscard]] bool Asked() const noexcept { return asked_.load(std::memory_order_relaxed); }
    // Whether it was asked for, which is forgotten.
    bool Take() noexcept { return Asked() && asked_.exchange(false, std::memory_order_relaxed); }

private:
    std::atomic<bool> asked_{false};
};

struct Credentials {
    std::string user;         // empty with external: the operating-system user
    std::string password;
    bool external = false;    // a logon with null user and password
    bool operator==(const Credentials&) const = default;
};

// One user's session on a database.
class Connection {
public:
    virtual ~Connection() = default;    // rolls back what is open

    // Takes effect at once and for good. An engine that could do so only within the open transaction refuses (24754).
    // 28008 when the old password is wrong, 1017 when there is no such user or the new password cannot be one.
    virtual Status ChangePassword(const std::string& user, const std::string& old_password,
                                  const std::string& new_password) = 0;

    // Compiles one statement. `query` is set on success only. `error_offset` is set on a syntax error: bytes from the
    // start of the text.
    virtual Status Compile(const StatementSource& source, std::unique_ptr<Query>& query,
                           std::uint32_t& error_offset) = 0;

    // Does nothing within a transaction. A read-only or serializable one sees what was there when it began; a change
    // within a read-only one is refused (1456).
    virtual Status Begin(TransactionMode mode) = 0;
    // Does nothing outside a transaction. A commit that fails has rolled back (2091, or the engine's own number) unless
    // InTransaction still holds.
    virtual Status Commit() = 0;
    virtual Status Rollback() = 0;    // does nothing outside a transaction
    [[nodiscard]] virtual bool InTransaction() const = 0;

    // Marks in the transaction, which nest: UndoToMark undoes what was done since the last one, which stays; DropMark
    // forgets the last one and keeps the work. SetMark begins a transaction when there is none. The end of the
    // transaction forgets them all. 1086 without a mark. Any other failure of UndoToMark has rolled all of the
    // transaction back.
    virtual Status SetMark() = 0;
    virtual Status UndoToMark() = 0;
    virtual Status DropMark() = 0;

    // Two-phase commit, of engines that can. Prepare ends the connection's part in the transaction: afterwards it is
    // outside of one, and any connection of the database finishes the branch by its name, which lasts as long as
    // Capabilities tells. A branch that changed nothing is committed instead, and `read_only` says so. 1022 of engines
    // that cannot.
    virtual Status Prepare(const Xid& xid, bool& read_only) = 0;
    virtual Status CommitPrepared(const Xid& xid) = 0;      // 24756 when there is none of that name
    virtual Status RollbackPrepared(const Xid& xid) = 0;
    virtual Status Recover(std::vector<Xid>& prepared) = 0;
    // Whether the server keeps a prepared branch of the name, whoever prepared it: no other can be prepared beside it.
    virtual Status KeepsPrepared(const Xid&, bool& kept) {
        kept = false;
        return {};
    }

    // Of engines that cannot: makes sure of what a commit would check at its end, so that it then succeeds, and sets
    // `changed` when there is anything to commit. A failure has rolled the transaction back, unless InTransaction holds.
    virtual Status MakeReady(bool& changed) {
        changed = InTransaction();
        return {};
    }

    // A further connection of the same user, who need not prove himself again. A branch that is set aside keeps its own
    // connection, with the transaction open, for whoever takes the branch up; its session goes on with another. 1022
    // where the database has room for one connection.
    virtual Status Another(std::shared_ptr<const StopRequest> stop, std::unique_ptr<Connection>& connection) = 0;
    // From now on this is the wish that the connection's calls look at: that of the session that it serves.
    virtual void Obey(std::shared_ptr<const StopRequest> stop) noexcept = 0;

    // A name is a word or a quoted one, perhaps with its schema's and a point before it. 4043 when there is none of
    // that name and kind, 942 where a table or view is wanted.
    virtual Status Describe(std::string_view name, ObjectKind kind, ObjectDescription& object) = 0;
    // From now on objects without a schema's name are looked for in this one first. Answers the one in use, which stays
    // when the name is empty. 1435 when there is none of that name, or the engine cannot prefer it.
    virtual Status UseSchema(std::string& schema) = 0;
    // From its next call on objects are looked for first where another connection looks; null: where nobody has asked for
    // any.
    virtual void PreferSchemaOf(const Connection*) noexcept {}
    virtual LobStore* Lobs() = 0;    // null where Capabilities has no lobs
    // Whether statements from now on wait for what other sessions have locked, as they do at first, before they answer
    // 54; else they answer it at once.
    virtual void WaitForLocks(bool waits) noexcept = 0;

    virtual Status Ping() = 0;
    // The connection is lost (3113 or 3114 was the answer): nothing but destroying it is of use.
    [[nodiscard]] virtual bool Broken() const = 0;
    // What the engine had to say beside the answers since it was last asked: a warning each, mostly none.
    std::vector<Status> TakeNotices() noexcept { return std::exchange(notices_, {}); }
    [[nodiscard]] bool HasNotices() const noexcept { return !notices_.empty(); }

    // Has the call that runs look at the StopRequest: it then answers 1013 as soon as it can, and leaves the request as
    // it is. Calls that only end or undo (Commit, Rollback, UndoToMark, DropMark, Prepare and its kin, Close) do not
    // look at it. From any thread; does nothing when no call runs.
    virtual void Interrupt() noexcept = 0;

protected:
    std::vector<Status> notices_;
};

// ---- Databases

struct Capabilities {
    bool two_phase = false;             // Prepare and its kin
    bool lobs = false;                  // Lobs()
    bool sequences = false;
    bool typed_parameters = false;      // a statement must be compiled anew when the kinds of its parameters change
    bool statement_waits = false;       // execute and fetch can be left unfinished (non-blocking mode)
};

// A database that a server handle is attached to. Connections may outlive it.
class Database {
public:
    virtual ~Database() = default;
    [[nodiscard]] virtual const Dialect& GetDialect() const = 0;
    [[nodiscard]] virtual const Capabilities& GetCapabilities() const = 0;
    virtual std::string Version() = 0;    // the text that OCIServerVersion answers; a release number first
    // The same text for all that are the same database, so that branches of a global transaction are found by whoever
    // is attached to it; empty for one that nobody else can be attached to.
    [[nodiscard]] virtual std::string Identity() const { return {}; }
    // Begins a session: 1017 when the user is refused. `stop` is what the connection's calls look at while they run.
    virtual Status Connect(const Credentials& credentials, std::shared_ptr<const StopRequest> stop,
                           std::unique_ptr<Connection>& connection) = 0;
};

// Attaches the database that the server word of a logon names. `database` is set on success only.
Status Open(std::string_view name, std::unique_ptr<Database>& database);

}  // namespace engine
