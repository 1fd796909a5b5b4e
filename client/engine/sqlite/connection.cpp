// Opening a database, compiling statements, transactions, waiting for locks, cancelling.
#include "engine/sqlite/connection.h"

#include <cctype>
#include <thread>

#include "engine/sqlite/accounts.h"
#include "engine/sqlite/errors.h"
#include "engine/sqlite/functions.h"
#include "engine/sqlite/query.h"
#include "engine/sqlite/sqlite.h"
#include "engine/sqlite/value_targets.h"
#include "handles/errors.h"

namespace engine::sqlite {
namespace {

using namespace std::chrono_literals;

constexpr auto kLockWait = 2000ms;    // how long a call waits for another session's transaction
constexpr int kStepsBetweenChecks = 2000;
constexpr std::size_t kLongestStatement = 1000000000;

// Words that SQLite has others for. What it keeps as it is written stays: it remembers the declared words of a column.
constexpr Dialect::Spelling kTypes[] = {
    {"decfloat", "kelp_decfloat"},    // without "floa", which would make every value a real
    {"long raw", "long raw"},
    {"long", "long varchar"},
    {"timestamp with local time zone", "timestamp_ltz"},
    {"timestamp with time zone", "timestamp_tz"},
};

std::string Placeholder(std::size_t number) { return '?' + std::to_string(number); }

// The text in which dates are kept.
std::string DateLiteral(const date::DateTime& value) {
    char text[date::kMaxEngineText];
    return "'" + std::string(text, date::ToEngineText(value, text)) + "'";
}

// The number of the row, most significant byte first, behind two bytes for the table.
std::string RowIdLiteral(const RowId& row) {
    std::uint64_t number = 0;
    for (std::size_t index = 2; index < row.bytes.size(); ++index) number = number << 8 | row.bytes[index];
    return std::to_string(static_cast<std::int64_t>(number));
}

}  // namespace

Status Connect(const std::string& file, std::unique_ptr<Connection>& connection) {
    sqlite3* opened = nullptr;
    const int flags = SQLITE_OPEN_READWRITE | SQLITE_OPEN_CREATE | SQLITE_OPEN_NOMUTEX | SQLITE_OPEN_EXRESCODE;
    const int code = sqlite3_open_v2(file.c_str(), &opened, flags, nullptr);
    DatabaseHandle database(opened);
    if (code != SQLITE_OK) return opened ? Failure(opened, code) : Failure(code, sqlite3_errstr(code));
    auto made = std::make_unique<SqliteConnection>(std::move(database));
    Status status = made->Prime();
    if (status.Ok()) connection = std::move(made);
    return status;
}

SqliteConnection::SqliteConnection(DatabaseHandle database) : database_(std::move(database)) {
    sqlite3_busy_handler(database_.get(), OnBusy, this);
    sqlite3_progress_handler(database_.get(), kStepsBetweenChecks, OnProgress, this);
    sqlite3_update_hook(database_.get(), OnChange, this);
}

SqliteConnection::~SqliteConnection() = default;    // closing rolls back

Status SqliteConnection::Prime() {
    private_ = *sqlite3_db_filename(database_.get(), "main") == '\0';
    Status status = AddFunctions(database_.get());
    if (status.Ok()) status = Run("select count(*) from sqlite_schema");    // not a database; cannot be read
    // A file that cannot be written, or that somebody is using in another way, keeps the journal it has.
    if (status.Ok() && !private_) (void)Run("pragma journal_mode=wal");
    if (status.Ok()) status = Run("pragma foreign_keys=on");
    if (status.Ok()) utf8_ = Text("pragma encoding") == "UTF-8";
    return status;
}

Status SqliteConnection::Authenticate(const Credentials& credentials) {
    return engine::sqlite::Authenticate(*this, credentials);
}

Status SqliteConnection::ChangePassword(const std::string& user, const std::string& old_password,
                                        const std::string& new_password) {
    return engine::sqlite::ChangePassword(*this, user, old_password, new_password);
}

Status SqliteConnection::Prepare(std::string_view sql, std::unique_ptr<Query>& query, std::uint32_t& error_offset) {
    if (sql.size() > kLongestStatement) return Error(errors::kStatementTooLong).From("SQLITE");
    sqlite3* database = database_.get();
    int code = SQLITE_OK;
    std::size_t end = 0;
    StatementHandle statement = Compile(sql, code, &end);
    if (code != SQLITE_OK) {
        const int offset = sqlite3_error_offset(database);
        if (offset >= 0) error_offset = static_cast<std::uint32_t>(offset);
        return Failure(database, code);
    }
    if (!statement) return Error(errors::kInvalidStatement).From("SQLITE");
    if (Compile(sql.substr(end), code, nullptr) || code != SQLITE_OK) {
        error_offset = static_cast<std::uint32_t>(end);
        return Error(errors::kNotProperlyEnded).From("SQLITE");
    }

    ValueTargets targets;
    if (Status status = FindValueTargets(database, sql, targets); status.Failed()) return status;
    const std::string rewritten = targets.Rewritten(sql);
    if (!rewritten.empty()) {
        StatementHandle checked = Compile(rewritten, code, nullptr);
        if (code != SQLITE_OK) return Failure(database, code);
        statement = std::move(checked);
    }
    auto made = std::make_unique<SqliteQuery>(*this, std::move(statement), sql);
    for (const auto& parameter : targets.parameters) made->UseFor(parameter.index, parameter.column, parameter.purpose);
    query = std::move(made);
    return {};
}

// `end` tells where the statement ends in the text. None for a text without a statement.
StatementHandle SqliteConnection::Compile(std::string_view sql, int& code, std::size_t* end) {
    sqlite3_stmt* compiled = nullptr;
    const char* rest = nullptr;
    code = sqlite3_prepare_v3(database_.get(), sql.data(), static_cast<int>(sql.size()), SQLITE_PREPARE_PERSISTENT,
                              &compiled, &rest);
    if (end && rest) *end = static_cast<std::size_t>(rest - sql.data());
    return StatementHandle(compiled);
}

Status SqliteConnection::Begin() {
    if (InTransaction()) return {};
    ReadAhead(nullptr);
    return Run("begin immediate");
}

// A deferred constraint that fails at the end undoes the transaction, as does a file that cannot take it.
Status SqliteConnection::Commit() {
    if (!InTransaction()) return {};
    Status status = Run("commit");
    if (!status.Ok() && !InTransaction()) return RolledBack(status);
    if (status.Number() != errors::kParentMissing && status.Number() != errors::kChildFound) return status;
    Status undone = Rollback();
    return undone.Failed() ? undone : Error(errors::kRolledBack, status.Detail()).From("SQLITE");
}

Status SqliteConnection::Rollback() {
    if (!InTransaction()) return {};
    ReadAhead(nullptr);
    return Run("rollback");
}

Status SqliteConnection::Ping() { return Run("select count(*) from sqlite_schema"); }

std::string SqliteConnection::ServerVersion() {
    std::string text = std::string("KELP embedded engine, SQLite ") + sqlite3_libversion() + "\nDatabase ";
    return text += private_ ? "in memory" : sqlite3_db_filename(database_.get(), "main");
}

const Dialect& SqliteConnection::GetDialect() const {
    static constexpr Dialect kDialect{
        .placeholder = Placeholder,
        .types = kTypes,
        .functions = kMoments,
        .casts = kCasts,
        .counts_characters = kCountsCharacters,
        .dual = "(select 'X' as dummy)",
        .minus = "except",
        .truncate_table = "delete from",
        .cuts_for_update = true,
        .date_literal = DateLiteral,
        .row_id_literal = RowIdLiteral,
    };
    return kDialect;
}

void SqliteConnection::Join(SqliteQuery& query) noexcept {
    query.next_ = first_open_;
    if (first_open_) first_open_->previous_ = &query;
    first_open_ = &query;
}

void SqliteConnection::Leave(SqliteQuery& query) noexcept {
    if (query.previous_) query.previous_->next_ = query.next_;
    else if (first_open_ == &query) first_open_ = query.next_;
    if (query.next_) query.next_->previous_ = query.previous_;
    query.previous_ = query.next_ = nullptr;
}

void SqliteConnection::ReadAhead(const SqliteQuery* except) {
    for (SqliteQuery* query = first_open_; query;) {
        SqliteQuery* next = query->next_;    // reading ahead takes the query off the list
        if (query != except) query->ReadAhead();
        query = next;
    }
}

int SqliteConnection::OnProgress(void* self) { return static_cast<SqliteConnection*>(self)->Cancelled(); }

int SqliteConnection::OnBusy(void* self, int attempts) {
    auto& connection = *static_cast<SqliteConnection*>(self);
    const auto now = std::chrono::steady_clock::now();
    if (attempts == 0) connection.busy_since_ = now;
    if (connection.Cancelled() || now - connection.busy_since_ > kLockWait) return 0;
    std::this_thread::sleep_for(std::min(1ms * (attempts + 1), 20ms));
    return 1;
}

void SqliteConnection::OnChange(void* self, int, const char*, const char*, sqlite3_int64 row) {
    static_cast<SqliteConnection*>(self)->last_row_ = row;
}

Status SqliteConnection::Run(const char* sql) {
    const int code = sqlite3_exec(database_.get(), sql, nullptr, nullptr, nullptr);
    if (code == SQLITE_OK) return {};
    if (!Cancelled()) return Failure(database_.get(), code);
    ForgetCancel();    // it ended the wait for a lock
    return Error(errors::kCancelled).From("SQLITE");
}

std::string SqliteConnection::Text(const char* sql) {
    sqlite3_stmt* compiled = nullptr;
    sqlite3_prepare_v2(database_.get(), sql, -1, &compiled, nullptr);
    const StatementHandle statement(compiled);
    if (!compiled || sqlite3_step(compiled) != SQLITE_ROW) return {};
    const auto* text = reinterpret_cast<const char*>(sqlite3_column_text(compiled, 0));
    return text ? text : "";
}

}  // namespace engine::sqlite
