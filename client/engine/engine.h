// What a database does for the library. Texts are UTF-8. A connection and what it made serve one thread at a time,
// Cancel aside. A statement that fails undoes itself and not the transaction. Every call answers a Status: error
// numbers are the published ones, with the engine's own words after them where it had some. Nothing here throws but
// bad_alloc.
#pragma once

#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "engine/datum.h"
#include "engine/dialect.h"
#include "handles/status.h"

namespace engine {

// A column of a select list.
struct Column {
    std::string name;             // as the application sees it; unquoted names in upper case
    std::uint16_t type = 1;       // internal type code: SQLT_CHR, SQLT_NUM, SQLT_DAT, SQLT_AFC, SQLT_BIN, ...
    std::uint32_t size = 0;       // bytes; 0 when the engine sets no limit
    std::uint32_t characters = 0; // the limit of a column that counts characters; 0: it counts bytes
    std::uint8_t precision = 0;   // decimal digits; 0 when not constrained
    std::int8_t scale = 0;        // -127: floating
    bool nullable = true;
};

// Gives the bound values of one execution after another. The views of a row stay valid until the next call.
class RowSource {
public:
    virtual ~RowSource() = default;
    // Fills one Datum a placeholder, in the order of the engine's placeholders.
    virtual Status Row(std::uint32_t row, std::span<Datum> values) = 0;
};

// What an array execution did.
struct ArrayOutcome {
    struct Failure {
        std::uint32_t row;
        Status status;
    };
    std::uint64_t affected = 0;       // rows inserted, updated or deleted in all
    std::uint32_t executed = 0;       // executions that succeeded
    std::vector<Failure> failures;    // in row order; at most one unless all rows are tried
};

// One compiled statement. Destroying it closes what it has open. Must not outlive its connection.
class Query {
public:
    virtual ~Query() = default;

    // The select list; empty for a statement that returns no rows. Known without executing.
    virtual const std::vector<Column>& Columns() = 0;
    virtual std::uint32_t PlaceholderCount() const = 0;

    // Runs a statement that returns no rows once for each row first..last-1 of the source. Stops at the first failure
    // (rows before it stay done) unless `all_rows`; failures are in `outcome`. A Status that is an error means that
    // nothing is done: nothing could be run, or the transaction is gone.
    virtual Status ExecuteArray(RowSource& source, std::uint32_t first, std::uint32_t last, bool all_rows,
                                ArrayOutcome& outcome) = 0;

    // Starts a query with row `row` of the source bound. Values are taken over; the source may go afterwards.
    virtual Status Open(RowSource& source, std::uint32_t row) = 0;
    // Steps to the next row and fills one view a column, valid until the next call on this query. `more` is false at
    // the end; the query is closed then.
    virtual Status Fetch(std::span<Datum> values, bool& more) = 0;
    // Ends an open query early; harmless when none is open.
    virtual void Close() noexcept = 0;
};

struct Credentials {
    std::string user;         // empty with external: the operating-system user
    std::string password;
    bool external = false;    // a logon with null user and password
};

class Connection {
public:
    virtual ~Connection() = default;    // rolls back what is open

    // Checks a user's right to a session on this database: error 1017 when refused.
    virtual Status Authenticate(const Credentials& credentials) = 0;
    virtual Status ChangePassword(const std::string& user, const std::string& old_password,
                                  const std::string& new_password) = 0;

    // Compiles one statement (placeholders and spellings already the engine's). `query` is set on success only.
    // `error_offset` is set on a syntax error: bytes from the start of `sql`.
    virtual Status Prepare(std::string_view sql, std::unique_ptr<Query>& query, std::uint32_t& error_offset) = 0;

    virtual Status Begin() = 0;       // does nothing within a transaction
    virtual Status Commit() = 0;      // does nothing outside one
    virtual Status Rollback() = 0;
    virtual bool InTransaction() const = 0;

    virtual Status Ping() = 0;
    virtual std::string ServerVersion() = 0;    // the text that OCIServerVersion answers

    // Stops the call that runs, or the next one that executes or fetches: it answers error 1013. From any thread.
    virtual void Cancel() noexcept = 0;
    // Forgets a cancellation that has met no call yet. From any thread.
    virtual void ForgetCancel() noexcept = 0;

    // Row number of the last row that an insert, update or delete touched; 0 when none did.
    virtual std::int64_t LastRowNumber() const = 0;

    virtual const Dialect& GetDialect() const = 0;
    virtual std::string_view EngineName() const = 0;    // for error texts: "SQLITE", "POSTGRES"
};

// Opens the database that the server word of a logon names.
Status Connect(std::string_view database, std::unique_ptr<Connection>& connection);

}  // namespace engine
