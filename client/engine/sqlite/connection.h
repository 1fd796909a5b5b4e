// A connection to a SQLite database: transactions, cancelling, and the queries that are open on it.
#pragma once

#include <sqlite3.h>

#include <atomic>
#include <chrono>
#include <memory>
#include <string>

#include "engine/engine.h"

namespace engine::sqlite {

class SqliteQuery;

struct DatabaseCloser {
    void operator()(sqlite3* database) const { sqlite3_close_v2(database); }
};
struct StatementCloser {
    void operator()(sqlite3_stmt* statement) const { sqlite3_finalize(statement); }
};
using DatabaseHandle = std::unique_ptr<sqlite3, DatabaseCloser>;
using StatementHandle = std::unique_ptr<sqlite3_stmt, StatementCloser>;

class SqliteConnection final : public Connection {
public:
    explicit SqliteConnection(DatabaseHandle database);
    ~SqliteConnection() override;
    SqliteConnection(const SqliteConnection&) = delete;
    SqliteConnection& operator=(const SqliteConnection&) = delete;

    // What follows opening: settings, functions, a first look at the file. The last step of Connect.
    Status Prime();

    Status Authenticate(const Credentials& credentials) override;
    Status ChangePassword(const std::string& user, const std::string& old_password,
                          const std::string& new_password) override;
    Status Prepare(std::string_view sql, std::unique_ptr<Query>& query, std::uint32_t& error_offset) override;
    Status Begin() override;
    Status Commit() override;
    Status Rollback() override;
    bool InTransaction() const override { return sqlite3_get_autocommit(database_.get()) == 0; }
    Status Ping() override;
    std::string ServerVersion() override;
    void Cancel() noexcept override { cancelled_.store(true, std::memory_order_relaxed); }
    void ForgetCancel() noexcept override { cancelled_.store(false, std::memory_order_relaxed); }
    std::int64_t LastRowNumber() const override { return last_row_; }
    const Dialect& GetDialect() const override;
    std::string_view EngineName() const override { return "SQLITE"; }

    // For queries.
    [[nodiscard]] sqlite3* Database() const { return database_.get(); }
    [[nodiscard]] bool Utf8() const { return utf8_; }         // how the file keeps texts
    [[nodiscard]] bool Private() const { return private_; }   // nobody else can open the database
    [[nodiscard]] bool Cancelled() const { return cancelled_.load(std::memory_order_relaxed); }
    void ForgetLastRow() { last_row_ = 0; }
    void Join(SqliteQuery& query) noexcept;     // the query has rows to come
    void Leave(SqliteQuery& query) noexcept;
    // Lets the open queries but `except` read the rest of their rows, so that none holds an old state of the database.
    void ReadAhead(const SqliteQuery* except);

private:
    static int OnProgress(void* self);
    static int OnBusy(void* self, int attempts);
    static void OnChange(void* self, int operation, const char* schema, const char* table, sqlite3_int64 row);
    StatementHandle Compile(std::string_view sql, int& code, std::size_t* end);
    Status Run(const char* sql);
    std::string Text(const char* sql);    // the first column of the first row

    DatabaseHandle database_;
    std::atomic<bool> cancelled_{false};
    std::chrono::steady_clock::time_point busy_since_;
    std::int64_t last_row_ = 0;
    bool utf8_ = true;
    bool private_ = false;
    SqliteQuery* first_open_ = nullptr;
};

}  // namespace engine::sqlite
