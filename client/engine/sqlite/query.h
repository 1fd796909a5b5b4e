// One compiled SQLite statement: array executions with borrowed values, and a query's rows as views.
#pragma once

#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "engine/engine.h"
#include "engine/sqlite/coercion.h"
#include "engine/sqlite/connection.h"
#include "engine/sqlite/errors.h"
#include "engine/sqlite/row_store.h"
#include "oci.h"

namespace engine::sqlite {

class SqliteQuery final : public Query {
public:
    SqliteQuery(SqliteConnection& connection, StatementHandle statement, std::string_view sql);
    // The placeholder's values are stored into the column, or compared with it.
    void UseFor(std::size_t parameter, const Column& column, Coercion::Purpose purpose);
    ~SqliteQuery() override;
    SqliteQuery(const SqliteQuery&) = delete;
    SqliteQuery& operator=(const SqliteQuery&) = delete;

    const std::vector<Column>& Columns() override;
    std::uint32_t PlaceholderCount() const override { return static_cast<std::uint32_t>(parameters_.size()); }
    Status ExecuteArray(RowSource& source, std::uint32_t first, std::uint32_t last, bool all_rows,
                        ArrayOutcome& outcome) override;
    Status Open(RowSource& source, std::uint32_t row) override;
    Status Fetch(std::span<Datum> values, bool& more) override;
    void Close() noexcept override;

    // Reads the rest of an open query's rows into memory and lets go of the database.
    void ReadAhead();

private:
    friend class SqliteConnection;

    enum class State : std::uint8_t {
        closed,
        on_row,      // stepped to a row that nobody has seen yet
        stepping,    // the next row is a step away
        stored       // the rows to come are in store_
    };
    // How a value of a column is handed out.
    enum class Reading : std::uint8_t { as_stored, number, padded, date, row_id, bytes };

    Status Bind(int index, const Datum& value, bool copy);
    Status BindRow(RowSource& source, std::uint32_t row, bool copy);
    Status ExecuteRow(RowSource& source, std::uint32_t row, std::uint64_t& affected);
    Status Step(bool& has_row);
    Status Stopped(int code);
    void Fill(std::span<Datum> values);
    void Pad(std::size_t column, Datum& value);
    static Reading ReadingOf(const Column& column);
    void PlanReading();
    void DescribeFromRow();

    SqliteConnection& connection_;
    StatementHandle statement_;
    std::string sql_;
    Verb verb_;
    bool changes_rows_;
    bool read_only_;
    State state_ = State::closed;
    std::vector<Datum> parameters_;
    std::vector<std::unique_ptr<Coercion>> coercions_;    // by parameter; null where nothing is to be done
    std::vector<Column> columns_;
    std::vector<bool> untyped_;          // columns whose type only a value tells
    std::vector<Reading> readings_;      // one a column, once described
    std::vector<OCINumber> numbers_;     // room for numbers read from blobs
    std::vector<std::string> padded_;    // room for padded texts
    RowStore store_;
    Status stored_end_;                  // what comes after the stored rows
    SqliteQuery* previous_ = nullptr;    // on the connection's list of open queries
    SqliteQuery* next_ = nullptr;
};

}  // namespace engine::sqlite
