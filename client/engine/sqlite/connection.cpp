// Compiling statements, transactions, waiting for locks, stopping, and guarding the accounts.
#include "engine/sqlite/connection.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <new>
#include <thread>

#include "engine/sqlite/accounts.h"
#include "engine/sqlite/query.h"
#include "engine/sqlite/returned_values.h"
#include "handles/errors.h"

namespace engine::sqlite {
namespace {

using namespace std::chrono_literals;

constexpr auto kLockWait = 2000ms;    // how long a call waits for another session's transaction
constexpr int kStepsBetweenChecks = 2000;
constexpr std::size_t kLongestStatement = 1000000000;

// By Own. Marks nest under one name: SQLite takes the last of that name.
constexpr const char* kOwnTexts[] = {"begin immediate",
                                     "begin",
                                     "select 1 from sqlite_schema limit 1",
                                     "pragma schema_version",
                                     "commit",
                                     "rollback",
                                     "savepoint kelp_mark",
                                     "rollback to kelp_mark",
                                     "release kelp_mark"};

// What may not be done to the accounts, and where the authorizer tells the table.
struct GuardedRow {
    int action;
    bool table_is_second;
};
constexpr GuardedRow kGuarded[] = {
    {SQLITE_INSERT, false},           {SQLITE_UPDATE, false},           {SQLITE_DELETE, false},
    {SQLITE_CREATE_TABLE, false},     {SQLITE_CREATE_TEMP_TABLE, false}, {SQLITE_CREATE_VTABLE, false},
    {SQLITE_CREATE_VIEW, false},      {SQLITE_CREATE_TEMP_VIEW, false}, {SQLITE_DROP_TABLE, false},
    {SQLITE_DROP_VTABLE, false},      {SQLITE_CREATE_INDEX, true},      {SQLITE_CREATE_TEMP_INDEX, true},
    {SQLITE_DROP_INDEX, true},        {SQLITE_CREATE_TRIGGER, true},    {SQLITE_CREATE_TEMP_TRIGGER, true},
    {SQLITE_DROP_TRIGGER, true},      {SQLITE_ALTER_TABLE, true},
};

Status Unsupported(const char* what) { return Error(errors::kUnsupported, what).From("SQLITE"); }

// Resets a statement when it has run, however that ended.
class Resetting {
public:
    explicit Resetting(sqlite3_stmt* statement) : statement_(statement) {}
    ~Resetting() { sqlite3_reset(statement_); }
    Resetting(const Resetting&) = delete;
    Resetting& operator=(const Resetting&) = delete;

private:
    sqlite3_stmt* const statement_;
};

// A parameter in a spelling of SQLite alone (@a, $a), to which nobody could give a value; null for none.
const char* OwnParameter(sqlite3_stmt* statement) {
    for (int index = sqlite3_bind_parameter_count(statement); index > 0; --index) {
        const char* name = sqlite3_bind_parameter_name(statement, index);
        if (name && *name != '?') return name;
    }
    return nullptr;
}

}  // namespace

// While one lives, nothing stops the call that runs: it ends or undoes.
class SqliteConnection::Unheeding {
public:
    explicit Unheeding(SqliteConnection& connection) : connection_(connection), before_(connection.heeds_) {
        connection_.heeds_ = false;
    }
    ~Unheeding() { connection_.heeds_ = before_; }
    Unheeding(const Unheeding&) = delete;
    Unheeding& operator=(const Unheeding&) = delete;

private:
    SqliteConnection& connection_;
    const bool before_;
};

// ---- Beginning and end

SqliteConnection::SqliteConnection(std::shared_ptr<Home> home, std::shared_ptr<const StopRequest> stop)
    : home_(std::move(home)), stop_(std::move(stop)) {}

Status SqliteConnection::Make(std::shared_ptr<Home> home, std::shared_ptr<const StopRequest> stop,
                              std::unique_ptr<SqliteConnection>& connection) {
    std::unique_ptr<SqliteConnection> made(new SqliteConnection(std::move(home), std::move(stop)));
    Status status = made->home_->Take(made->handle_);
    if (status.Failed()) return status;
    sqlite3* database = made->Database();
    sqlite3_busy_handler(database, OnBusy, made.get());
    sqlite3_progress_handler(database, kStepsBetweenChecks, OnProgress, made.get());
    sqlite3_update_hook(database, OnChange, made.get());
    sqlite3_set_authorizer(database, OnAccess, made.get());
    made->utf8_ = made->Encoding() == "UTF-8";
    connection = std::move(made);
    return status;
}

// Closing rolls back, as does giving the handle back.
SqliteConnection::~SqliteConnection() {
    if (!handle_.database) return;
    lobs_.Close();
    for (StatementHandle& own : owns_) own.reset();
    sqlite3_busy_handler(Database(), nullptr, nullptr);
    sqlite3_progress_handler(Database(), 0, nullptr, nullptr);
    sqlite3_update_hook(Database(), nullptr, nullptr);
    sqlite3_set_authorizer(Database(), nullptr, nullptr);
    home_->GiveBack(std::move(handle_));
}

Status SqliteConnection::Another(std::shared_ptr<const StopRequest> stop, std::unique_ptr<Connection>& connection) {
    if (Private()) return Unsupported("a database in memory has one connection");
    std::unique_ptr<SqliteConnection> made;
    Status status = Make(home_, std::move(stop), made);
    if (status.Ok()) connection = std::move(made);
    return status;
}

Status SqliteConnection::ChangePassword(const std::string& user, const std::string& old_password,
                                        const std::string& new_password) {
    return engine::sqlite::ChangePassword(*this, user, old_password, new_password);
}

Status SqliteConnection::Ping() { return Run(Own::look); }

std::string SqliteConnection::Encoding() {
    int code = SQLITE_OK;
    const StatementHandle statement = CompileText("pragma encoding", code, nullptr);
    if (!statement || sqlite3_step(statement.get()) != SQLITE_ROW) throw std::bad_alloc();    // nothing else can fail
    return reinterpret_cast<const char*>(sqlite3_column_text(statement.get(), 0));
}

// ---- Statements

// Compiling reads of tables, too, and what is read may fail and take the transaction with it.
Status SqliteConnection::Compile(const StatementSource& source, std::unique_ptr<Query>& query,
                                 std::uint32_t& error_offset) {
    const bool in_transaction = InTransaction();
    Status status;
    try {
        Compilation made;
        status = Make(source.sql, made, error_offset);
        if (status.Ok()) query = std::make_unique<SqliteQuery>(*this, std::move(made), source);
    } catch (const std::bad_alloc&) {
        status = Error(errors::kOutOfMemory).From("SQLITE");
    }
    return in_transaction && !InTransaction() ? RolledBack(status) : status;
}

// The tables are looked at first: what changes meanwhile is seen when the statement runs.
Status SqliteConnection::Make(std::string_view sql, Compilation& made, std::uint32_t& error_offset) {
    if (Status status = SeeSchema(made.schema); status.Failed()) return status;
    if (sql.size() > kLongestStatement) return Error(errors::kStatementTooLong).From("SQLITE");
    sqlite3* database = Database();
    int code = SQLITE_OK;
    std::size_t end = 0;
    made.table.reserve(sql.size());    // a name is no longer than its statement
    table_ = &made.table;
    made.statement = CompileText(sql, code, &end);
    table_ = nullptr;
    if (code != SQLITE_OK) {
        const int offset = sqlite3_error_offset(database);
        if (offset >= 0) error_offset = static_cast<std::uint32_t>(offset);
        return Failure(database, code);
    }
    if (!made.statement) return Error(errors::kInvalidStatement).From("SQLITE");
    if (CompileText(sql.substr(end), code, nullptr) || (code & 0xFF) == SQLITE_ERROR) {
        error_offset = static_cast<std::uint32_t>(end);
        return Error(errors::kNotProperlyEnded).From("SQLITE");
    }
    if (code != SQLITE_OK) return Failure(database, code);
    if (const char* name = OwnParameter(made.statement.get())) return Error(errors::kInvalidCharacter, name).From("SQLITE");

    if (Status status = FindValueTargets(database, sql, HasIntervals(), made.targets); status.Failed()) return status;
    if (utf8_) made.objects = FindObjectTargets(database, made.targets, lobs_);
    if (utf8_) made.lobs = FindLobItems(database, made.statement.get(), sql, lobs_, made.targets);
    const bool keeps = KeepReturned(database, made.statement.get(), sql, made.targets);
    const std::string rewritten = made.targets.Rewritten(sql);
    if (rewritten.empty()) return {};
    StatementHandle checked = CompileText(rewritten, code, nullptr);
    if (code != SQLITE_OK) return Failure(database, code);
    std::swap(made.statement, checked);
    if (!made.lobs.empty() || keeps) made.as_written = std::move(checked);
    return {};
}

// Asked for once after each change of the database. The version comes before the look, which has SQLite read the
// schema anew when it is an older one: what is compiled then is for tables of this version, or of a later one.
Status SqliteConnection::SeeSchema(Schema& schema) {
    unsigned data_version = 0;
    const auto see = [&] { sqlite3_file_control(Database(), "main", SQLITE_FCNTL_DATA_VERSION, &data_version); };
    if (!Private()) see();
    if (!data_version_ || *data_version_ != data_version) {
        if (Status status = CompileOwn(Own::version); status.Failed()) return status;
        sqlite3_stmt* const statement = owns_[static_cast<std::size_t>(Own::version)].get();
        const Resetting resetting(statement);
        const int code = sqlite3_step(statement);
        if (code != SQLITE_ROW) return Failure(Database(), code);
        schema_.version = sqlite3_column_int(statement, 0);
        if (!Private()) see();
        if (Status status = Run(Own::look); status.Failed()) return status;
        data_version_ = data_version;
    }
    schema = schema_;
    return {};
}

// Whether a table may have a column of intervals: looked at once for each state of the tables. Temporary tables, where
// there are any, and those of attached files may. One that has been is not forgotten: its drop may be undone.
bool SqliteConnection::HasIntervals() {
    if (has_intervals_ || looked_for_intervals_ == schema_) return has_intervals_;
    constexpr const char* kLook =
        "select exists(select 1 from main.sqlite_schema where sql like '%span\\_%' escape '\\') or "
        "exists(select 1 from pragma_database_list where seq > 0)";
    int code = SQLITE_OK;
    const StatementHandle look = CompileText(kLook, code, nullptr);
    if (!look || sqlite3_step(look.get()) != SQLITE_ROW) return true;
    has_intervals_ = sqlite3_column_int(look.get(), 0) != 0;
    looked_for_intervals_ = schema_;
    return has_intervals_;
}

// `end` tells where the statement ends in the text. None for a text without a statement.
StatementHandle SqliteConnection::CompileText(std::string_view sql, int& code, std::size_t* end) noexcept {
    sqlite3_stmt* compiled = nullptr;
    const char* rest = nullptr;
    code = sqlite3_prepare_v3(Database(), sql.data(), static_cast<int>(sql.size()), SQLITE_PREPARE_PERSISTENT,
                              &compiled, &rest);
    if (end && rest) *end = static_cast<std::size_t>(rest - sql.data());
    return StatementHandle(compiled);
}

Status SqliteConnection::CompileOwn(Own own) noexcept {
    const auto index = static_cast<std::size_t>(own);
    if (owns_[index]) return {};
    int code = SQLITE_OK;
    owns_[index] = CompileText(kOwnTexts[index], code, nullptr);
    return code == SQLITE_OK ? Status() : Failure(Database(), code);
}

Status SqliteConnection::Run(Own own) noexcept {
    Status status = CompileOwn(own);
    if (status.Failed()) return status;
    sqlite3_stmt* statement = owns_[static_cast<std::size_t>(own)].get();
    const Resetting resetting(statement);
    const bool in_transaction = InTransaction();
    errno = 0;
    const int code = sqlite3_step(statement);
    return code == SQLITE_DONE || code == SQLITE_ROW ? Status() : Failed(code, Verb::other, in_transaction);
}

// ---- Transactions

// What will end the transaction is made ready before it begins.
Status SqliteConnection::Begin(TransactionMode mode) {
    if (InTransaction()) return {};
    for (const Own own : {Own::commit, Own::rollback}) {
        if (Status status = CompileOwn(own); status.Failed()) return status;
    }
    (void)ReadAhead();
    read_only_ = mode == TransactionMode::read_only;
    changes_before_ = sqlite3_total_changes64(Database());
    lobs_.TransactionBegins();
    if (mode == TransactionMode::read_write) return Run(Own::begin);
    Status status = Run(Own::begin_reading);
    return status.Ok() ? LookOrEnd() : status;
}

// SQLite begins to read when something is read: now. The lock for writing comes with the first change, and is refused
// (8177) if somebody has changed the database since.
Status SqliteConnection::LookOrEnd() {
    Status status = Run(Own::look);
    if (status.Failed()) (void)Rollback();    // the first failure counts
    return status;
}

// A deferred constraint that fails at the end undoes the transaction, as does a file that cannot take it.
Status SqliteConnection::Commit() {
    if (!InTransaction()) return {};
    const Unheeding undisturbed(*this);
    if (Status settled = lobs_.Settle(); settled.Failed()) {
        if (settled.Number() == errors::kOutOfMemory && InTransaction()) return settled;    // nothing is lost
        const Status undone = Rollback();
        return undone.Failed() ? undone : RolledBack(settled);
    }
    Status status = Run(Own::commit);
    if (status.Number() != errors::kParentMissing) return status;
    Status undone = Rollback();
    return undone.Failed() ? undone : Error(errors::kRolledBack, status.Detail()).From("SQLITE");
}

Status SqliteConnection::Rollback() {
    if (!InTransaction()) return {};
    const Unheeding undisturbed(*this);
    (void)ReadAhead();
    lobs_.Forget();
    return InTransaction() ? Run(Own::rollback) : Status();
}

Status SqliteConnection::SetMark() {
    for (const Own own : {Own::undo, Own::drop}) {
        if (Status status = CompileOwn(own); status.Failed()) return status;
    }
    if (Status status = Settle(); status.Failed()) return status;
    Status status = Begin(TransactionMode::read_write);
    return status.Ok() ? Run(Own::mark) : status;
}

Status SqliteConnection::UndoToMark() {
    const Unheeding undisturbed(*this);
    const bool in_transaction = InTransaction();
    const Status read = ReadAhead();
    if (in_transaction && !InTransaction()) return RolledBack(read);
    lobs_.Forget();
    Status status = Run(Own::undo);
    if (status.Ok() || status.Number() == errors::kNoSuchSavepoint) return status;
    Status undone = Rollback();
    return undone.Failed() ? undone : RolledBack(status);
}

Status SqliteConnection::DropMark() {
    const Unheeding undisturbed(*this);
    return Run(Own::drop);
}

Status SqliteConnection::Prepare(const Xid&, bool&) { return Unsupported("two-phase commit"); }
Status SqliteConnection::CommitPrepared(const Xid&) { return Unsupported("two-phase commit"); }
Status SqliteConnection::RollbackPrepared(const Xid&) { return Unsupported("two-phase commit"); }
Status SqliteConnection::Recover(std::vector<Xid>&) { return Unsupported("two-phase commit"); }

// Only a foreign key is checked at the end.
Status SqliteConnection::MakeReady(bool& changed) {
    changed = sqlite3_total_changes64(Database()) != changes_before_;
    int unresolved = 0, highest = 0;
    sqlite3_db_status(Database(), SQLITE_DBSTATUS_DEFERRED_FKS, &unresolved, &highest, 0);
    if (unresolved == 0) return {};
    Status undone = Rollback();
    return undone.Failed() ? undone : Error(errors::kRolledBack, "FOREIGN KEY constraint failed").From("SQLITE");
}

// Outside a transaction an older query's rows would keep a new one from seeing what others have committed since.
Status SqliteConnection::Enter(const Entry& entry, bool& began) {
    began = false;
    broken_ = broken_ || !home_->Unchanged(handle_);
    if (broken_) return Error(errors::kEndOfChannel, "the read-only file has changed").From("SQLITE");
    if (Status status = Settle(); status.Failed()) return status;
    if (entry.goes_back) lobs_.Forget();
    if (entry.effect == Effect::defines) {
        if (Status status = Commit(); status.Failed()) return status;
    }
    const bool writes = entry.effect == Effect::changes || entry.effect == Effect::locks;
    if (InTransaction()) {
        if (read_only_ && writes) return Error(errors::kReadOnlyTransaction).From("SQLITE");
    } else if (writes || entry.begins) {
        Status status = Begin(TransactionMode::read_write);
        began = status.Ok();
        return status;
    }
    const bool in_transaction = InTransaction();
    const bool goes_stale = !in_transaction && !Private();
    Status read;
    if (!entry.read_only || entry.effect == Effect::controls || goes_stale) read = ReadAhead();
    return in_transaction && !InTransaction() ? RolledBack(read) : Status();
}

// What large objects were given becomes their values: nothing stops that half-way.
Status SqliteConnection::Settle() {
    const Unheeding undisturbed(*this);
    return lobs_.Settle();
}

void SqliteConnection::Defined() noexcept {
    ++schema_.definitions;
    lobs_.Defined();
}

void SqliteConnection::Abandon() noexcept { (void)Rollback(); }    // nothing is lost: there was nothing yet

// ---- Open queries

void SqliteConnection::Join(SqliteQuery& query) noexcept {
    query.next_open_ = first_open_;
    if (first_open_) first_open_->previous_ = &query;
    first_open_ = &query;
}

void SqliteConnection::Leave(SqliteQuery& query) noexcept {
    if (query.previous_) query.previous_->next_open_ = query.next_open_;
    else first_open_ = query.next_open_;
    if (query.next_open_) query.next_open_->previous_ = query.previous_;
    query.previous_ = query.next_open_ = nullptr;
    lobs_.LetGo();
}

Status SqliteConnection::ReadAhead() noexcept {
    const Unheeding undisturbed(*this);
    Status first;
    for (SqliteQuery* query = first_open_; query;) {
        SqliteQuery* next = query->next_open_;    // reading ahead takes the query off the list
        const Status status = query->ReadAhead();
        if (first.Ok()) first = status;
        query = next;
    }
    return first;
}

// ---- What SQLite asks

int SqliteConnection::OnProgress(void* self) { return static_cast<SqliteConnection*>(self)->Stopping(); }

int SqliteConnection::OnBusy(void* self, int attempts) {
    auto& connection = *static_cast<SqliteConnection*>(self);
    const auto now = std::chrono::steady_clock::now();
    if (attempts == 0) connection.busy_since_ = now;
    if (!connection.waits_ || connection.Stopping() || now - connection.busy_since_ > kLockWait) return 0;
    std::this_thread::sleep_for(std::min(1ms * (attempts + 1), 20ms));
    return 1;
}

void SqliteConnection::OnChange(void* self, int operation, const char*, const char* table, sqlite3_int64 row) {
    auto& connection = *static_cast<SqliteConnection*>(self);
    ++connection.told_changes_;
    connection.lobs_.RowChanged(operation, table, row);
    if (connection.changed_table && std::strcmp(connection.changed_table->c_str(), table) == 0)
        connection.changed_row = row;
    std::vector<std::int64_t>* const rows = connection.changed_rows;
    if (rows && connection.changed_row == row && rows->size() < rows->capacity()) rows->push_back(row);
}

// SQLite tells the table of the statement before those of its triggers and cascades.
void SqliteConnection::NoteTable(int action, const char* table) noexcept {
    const bool changes = action == SQLITE_INSERT || action == SQLITE_UPDATE || action == SQLITE_DELETE;
    if (changes && table_ && table_->empty() && std::strlen(table) <= table_->capacity()) table_->assign(table);
}

// Names of users may be read; hashes are nobody's business.
int SqliteConnection::OnAccess(void* self, int action, const char* first, const char* second, const char*,
                               const char*) {
    static_cast<SqliteConnection*>(self)->NoteTable(action, first);
    if (static_cast<SqliteConnection*>(self)->trusted_) return SQLITE_OK;
    const auto is = [](const char* name, const char* wanted) { return sqlite3_stricmp(name, wanted) == 0; };
    if (action == SQLITE_READ) return is(first, kAccounts) && is(second, kPasswords) ? SQLITE_DENY : SQLITE_OK;
    for (const GuardedRow& row : kGuarded) {
        if (row.action == action) return is(row.table_is_second ? second : first, kAccounts) ? SQLITE_DENY : SQLITE_OK;
    }
    return SQLITE_OK;
}

Status SqliteConnection::Stopped() { return Error(errors::kCancelled).From("SQLITE"); }

// A wait for a lock that was given up because of the request is a call that was stopped, too.
Status SqliteConnection::Failed(int code, Verb verb, bool was_in_transaction) noexcept {
    const bool may_be_stopped = (code & 0xFF) == SQLITE_INTERRUPT || (code & 0xFF) == SQLITE_BUSY;
    Status status = may_be_stopped && Stopping() ? Stopped() : Failure(Database(), code, verb);
    return was_in_transaction && !InTransaction() ? RolledBack(status) : status;
}

}  // namespace engine::sqlite
