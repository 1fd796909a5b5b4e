// One compiled SQLite statement: array executions with borrowed values, and a query's rows as views.
#pragma once

#include <deque>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "engine/engine.h"
#include "engine/row_store.h"
#include "engine/sqlite/coercion.h"
#include "engine/sqlite/connection.h"
#include "engine/sqlite/date_text.h"
#include "engine/sqlite/errors.h"
#include "oci.h"

namespace engine::sqlite {

class SqliteQuery final : public Query {
public:
    SqliteQuery(SqliteConnection& connection, Compilation compilation, const StatementSource& source);
    ~SqliteQuery() override;
    SqliteQuery(const SqliteQuery&) = delete;
    SqliteQuery& operator=(const SqliteQuery&) = delete;

    const std::vector<Column>& Columns() override;
    Status ExecuteArray(RowSource& source, const ArrayRun& run, ArrayOutcome& outcome) override;
    Status Open(RowSource& source, const QueryRun& run) override;
    [[nodiscard]] bool IsOpen() const override { return state_ != State::closed; }
    Status Fetch(RowSink& sink, std::uint32_t most, bool& more) override;
    Status Scroll(std::uint64_t position, RowSink& sink, bool& found) override;
    Status Count(std::uint64_t& rows) override;
    void Close() noexcept override;

    // Reads the rest of an open query's rows into the store and lets go of the database. What fails is kept for the
    // fetch that gets there, and answered.
    Status ReadAhead() noexcept;

private:
    friend class SqliteConnection;

    enum class State : std::uint8_t {
        closed,
        on_row,      // stepped to a row that nobody has seen yet
        stepping,    // the next row is a step away
        drained      // the rows to come are in store_, with end_ behind them
    };
    // How a value of a column is handed out.
    enum class Reading : std::uint8_t { as_stored, number, binary_digits, padded, date, row_id, bytes, characters, lob, interval };
    // Room for a column's value that SQLite keeps in another form.
    struct Room {
        OCINumber number;
        date::DateTime date;
        RowId row;
        std::string padded;
        LobView lob;
    };

    using Coercions = std::vector<std::unique_ptr<Coercion>>;
    static Coercions CoercionsOf(const ValueTargets& targets, std::size_t parameters);
    Status FollowSchema();
    Status Bind(int index, const Datum& value, bool copy);
    Status BindDate(int index, const date::DateTime& value, bool copy);
    Status BindRow(RowSource& source, std::uint32_t row, bool copy);
    Status StepThrough();
    Status FillObjects();
    Status RunWithObjects();
    Status ExecuteRow(RowSource& source, std::uint32_t row, RowSink* returned, std::uint64_t& affected);
    Status TryRow(RowSource& source, std::uint32_t row, RowSink* returned, std::uint64_t& affected) noexcept;
    Status RunReturning(std::uint32_t row, RowSink& sink);
    Status DeliverRows(std::uint32_t row, RowSink& sink);
    Status Step(bool& has_row);
    Status Start(RowSource& source, std::uint32_t row, bool& has_row);

    Status CheckOpen();
    Status Ended(Status status) noexcept;
    Status Next(bool& found);
    Status Keep(std::uint64_t rows);
    Status KeepRow();
    void Drain(Status end) noexcept;

    void Fill();
    static void FillWhole(Datum& value);
    void FillRowId(int column, Datum& value);
    void FillDate(int column, Datum& value);
    void FillNumber(int column, Datum& value);
    void FillLob(int column, Datum& value);
    Status KeepLobs();
    void Pad(int index, Datum& value);

    static Reading ReadingOf(const Column& column);
    void Describe();
    void DescribeIntervals();
    void PlanReading();
    void FillInterval(int index, Datum& value);
    void DescribeFromRow();
    [[nodiscard]] int Recompilations() const;

    SqliteConnection& connection_;
    StatementHandle statement_;
    std::string table_;    // that it changes
    Schema schema_;        // that it is compiled for
    std::vector<LobItem> lobs_;    // columns that come as numbers of rows
    ObjectValues objects_;
    StatementHandle as_written_;
    std::string sql_;
    std::vector<std::string> written_;    // its placeholders
    Verb verb_;
    SqliteConnection::Entry entry_;
    State state_ = State::closed;
    std::vector<Datum> parameters_;
    Coercions coercions_;                 // by parameter; null where its values are taken as they are
    std::vector<ValueTargets::Interval> intervals_;
    std::vector<DateText> dates_;                         // by parameter; empty until a date is bound

    bool described_ = false;
    int described_at_ = 0;               // which compilation
    std::vector<Column> columns_;
    std::vector<bool> untyped_;          // columns whose type only a value tells
    bool any_untyped_ = false;
    std::vector<Reading> readings_;      // one a column, as rooms_ and values_ have
    std::vector<Room> rooms_;
    std::vector<Datum> values_;          // the row at hand

    bool scrollable_ = false;
    std::deque<std::shared_ptr<Lob>> kept_lobs_;    // of rows in the store
    RowStore store_;                     // rows read ahead; of a scrollable query every row that was reached
    std::uint64_t next_ = 0;             // the row of the store that comes next
    Status end_;                         // what comes behind the last row
    SqliteQuery* previous_ = nullptr;    // on the connection's list of open queries
    SqliteQuery* next_open_ = nullptr;
};

}  // namespace engine::sqlite
