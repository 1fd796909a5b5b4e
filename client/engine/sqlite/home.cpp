// Opening handles, and taking back the one that a database in memory lives in.
#include "engine/sqlite/home.h"

#include <cctype>
#include <new>
#include <string_view>
#include <utility>
#include <vector>

#include "engine/sqlite/errors.h"
#include "engine/sqlite/functions.h"
#include "engine/sqlite/table_columns.h"
#include "handles/errors.h"

namespace engine::sqlite {
namespace {

constexpr int kOpeningWait = 2000;    // milliseconds that opening waits for somebody who mends the file

int Run(sqlite3* database, const std::string& sql) {
    return sqlite3_exec(database, sql.c_str(), nullptr, nullptr, nullptr);
}

Status OpenFile(const std::string& name, int flags, DatabaseHandle& handle) {
    sqlite3* opened = nullptr;
    const int code = sqlite3_open_v2(name.c_str(), &opened, flags | SQLITE_OPEN_NOMUTEX | SQLITE_OPEN_EXRESCODE, nullptr);
    handle.reset(opened);
    if (code != SQLITE_OK) return opened ? Failure(opened, code) : Failure(code, sqlite3_errstr(code));
    sqlite3_busy_timeout(opened, kOpeningWait);
    sqlite3_db_config(opened, SQLITE_DBCONFIG_DEFENSIVE, 1, nullptr);    // nobody writes the schema as a table
    sqlite3_db_config(opened, SQLITE_DBCONFIG_DQS_DML, 0, nullptr);      // an unknown name in double quotes is no text
    sqlite3_db_config(opened, SQLITE_DBCONFIG_DQS_DDL, 0, nullptr);
    return {};
}

// What follows opening: functions, a first look at the file (not a database; cannot be read), settings.
Status Prime(sqlite3* database, bool in_memory) {
    Status status = AddFunctions(database);
    if (status.Failed()) return status;
    int code = Run(database, "select count(*) from sqlite_schema");
    // A file that cannot be written, or that somebody is using in another way, keeps the journal it has.
    if (code == SQLITE_OK && !in_memory) (void)Run(database, "pragma journal_mode=wal");
    if (code == SQLITE_OK) code = Run(database, "pragma foreign_keys=on");
    return code == SQLITE_OK ? Status() : Failure(database, code);
}

std::string Uri(const std::string& file) {
    constexpr const char* kDigits = "0123456789ABCDEF";
    std::string uri = "file:";
    for (const char c : file) {
        const auto byte = static_cast<unsigned char>(c);
        if (std::isalnum(byte) || std::string_view("/._-~").find(c) != std::string_view::npos) uri += c;
        else (uri += '%').append({kDigits[byte >> 4], kDigits[byte & 15]});
    }
    return uri;
}

// The statements that `sql` makes of what it finds: a verb and a name.
std::vector<std::string> Made(sqlite3* database, const char* sql) {
    std::vector<std::string> statements;
    sqlite3_stmt* compiled = nullptr;
    sqlite3_prepare_v2(database, sql, -1, &compiled, nullptr);
    const StatementHandle statement(compiled);
    const auto column = [&](int index) { return reinterpret_cast<const char*>(sqlite3_column_text(compiled, index)); };
    while (compiled && sqlite3_step(compiled) == SQLITE_ROW) {
        if (column(0) && column(1)) statements.push_back(column(0) + QuotedName(column(1)));
    }
    return statements;
}

// Leaves what other sessions shall see.
void Clean(sqlite3* database) {
    if (!sqlite3_get_autocommit(database)) Run(database, "rollback");
    for (const char* setting : {"foreign_keys=on", "query_only=off", "ignore_check_constraints=off",
                                "case_sensitive_like=off", "recursive_triggers=off", "reverse_unordered_selects=off"}) {
        Run(database, std::string("pragma ") + setting);
    }
    for (const char* sql : {"select 'drop trigger temp.', name from sqlite_temp_schema where type = 'trigger'",
                            "select 'drop view temp.', name from sqlite_temp_schema where type = 'view'",
                            "select 'drop table temp.', name from sqlite_temp_schema where type = 'table'",
                            "select 'detach ', name from pragma_database_list where name not in ('main', 'temp')"}) {
        for (const std::string& statement : Made(database, sql)) Run(database, statement);
    }
}

bool IsSame(const struct stat& left, const struct stat& right) {
    return left.st_dev == right.st_dev && left.st_ino == right.st_ino && left.st_size == right.st_size &&
           left.st_mtim.tv_sec == right.st_mtim.tv_sec && left.st_mtim.tv_nsec == right.st_mtim.tv_nsec;
}

}  // namespace

bool Home::HasLog() const {
    struct stat log{};
    return stat((file_ + "-wal").c_str(), &log) == 0 && log.st_size > 0;
}

// A file that keeps its changes in a log cannot be opened where neither may be written. Without a log its pages are all
// there is, and they are read as they lie.
Status Home::OpenNew(OpenHandle& handle) const {
    handle = {};
    Status status = OpenFile(file_, SQLITE_OPEN_READWRITE | SQLITE_OPEN_CREATE, handle.database);
    if (status.Ok()) status = Prime(handle.database.get(), private_);
    if (status.Number() != errors::kNoDatabase && status.Number() != errors::kReadOnlyDatabase) return status;
    if (HasLog() || stat(file_.c_str(), &handle.seen) != 0) return status;
    OpenHandle unchanging;
    unchanging.immutable = true;
    unchanging.seen = handle.seen;
    Status read = OpenFile(Uri(file_) + "?immutable=1", SQLITE_OPEN_READONLY | SQLITE_OPEN_URI, unchanging.database);
    if (read.Ok()) read = Prime(unchanging.database.get(), private_);
    if (read.Ok()) handle = std::move(unchanging);
    return read.Ok() ? read : status;
}

bool Home::Unchanged(const OpenHandle& handle) const {
    struct stat now{};
    return !handle.immutable || (stat(file_.c_str(), &now) == 0 && IsSame(now, handle.seen) && !HasLog());
}

Status Home::Open() {
    OpenHandle handle;
    Status status = OpenNew(handle);
    if (status.Failed()) return status;
    if (!private_) file_ = sqlite3_db_filename(handle.database.get(), "main");
    const std::lock_guard lock(mutex_);
    spare_ = std::move(handle);
    open_ = true;
    return status;
}

void Home::Close() noexcept {
    OpenHandle closed;    // when the lock is given up
    const std::lock_guard lock(mutex_);
    open_ = false;
    closed = std::move(spare_);
}

Status Home::Take(OpenHandle& handle) {
    {
        const std::lock_guard lock(mutex_);
        handle = std::exchange(spare_, {});
    }
    return handle.database ? Status() : OpenNew(handle);
}

void Home::GiveBack(OpenHandle handle) noexcept {
    if (!private_) return;
    try {
        Clean(handle.database.get());
    } catch (const std::bad_alloc&) {    // the tables count for more than what is left over
    }
    const std::lock_guard lock(mutex_);
    if (open_ && !spare_.database) spare_ = std::move(handle);
}

}  // namespace engine::sqlite
