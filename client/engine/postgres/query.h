// One statement that the server has prepared: array executions in pipelined batches, and a query's rows as they come.
//
// Rows come one by one while nothing else is asked of the connection. Before something else is, the rest is read into
// the store. Rows of a scrollable query are kept there as they are reached.
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "engine/engine.h"
#include "engine/postgres/lob_store.h"
#include "engine/postgres/types.h"
#include "engine/row_store.h"

namespace engine::postgres {

class PgQuery final : public Query {
public:
    PgQuery(PgConnection& connection, const StatementSource& source);
    ~PgQuery() override;
    PgQuery(const PgQuery&) = delete;
    PgQuery& operator=(const PgQuery&) = delete;

    // Has the server prepare the statement.
    Status Prepare(std::uint32_t& error_offset);

    const std::vector<Column>& Columns() override { return columns_; }
    Status ExecuteArray(RowSource& source, const ArrayRun& run, ArrayOutcome& outcome) override;
    Status Open(RowSource& source, const QueryRun& run) override;
    [[nodiscard]] bool IsOpen() const override { return state_ != State::closed; }
    Status Fetch(RowSink& sink, std::uint32_t most, bool& more) override;
    Status Scroll(std::uint64_t position, RowSink& sink, bool& found) override;
    Status Count(std::uint64_t& rows) override;
    void Close() noexcept override;

    // Reads the rest of the rows that still come into the store. What fails is kept for the fetch that gets there.
    void ReadAhead() noexcept;

private:
    enum class State : std::uint8_t {
        closed,
        on_row,     // a row has come that nobody has seen yet
        coming,     // the next row is still to come
        drained     // the rows to come are in store_, with end_ behind them
    };
    // How a batch of executions went.
    struct Batch {
        std::uint32_t sent = 0;        // rows
        std::uint32_t done = 0;        // of them, before the one that failed
        std::uint64_t affected = 0;
        std::size_t told = 0;          // notices, up to those of the rows that are done
        Status failure;                // of the row behind them, or of the batch
        std::optional<RowId> last_row;
        bool refused = false;          // the row behind those that were sent: by its source, or by a stop
        Status refusal;
        std::optional<std::uint32_t> stop;    // the row that a stop was met at, in the whole array
    };

    struct Returned {
        Result rows;
        std::size_t told = 0;          // notices up to there
    };

    Status PrepareTyped(std::uint32_t& error_offset);
    Status PrepareForObjects(Status status, std::uint32_t& error_offset);
    [[nodiscard]] bool GivesTextsToObjects() const;
    Status FindObjects(bool& found);
    Status PrepareForTexts(std::vector<Oid> types, std::uint32_t& error_offset);
    [[nodiscard]] std::vector<Oid> DeclaredTypes() const;
    Status PrepareAs(const std::vector<Oid>& types, std::uint32_t& error_offset);
    Status SendPrepared(const std::string& name, const std::string& text, const std::vector<Oid>& types,
                        Result& description, std::uint32_t& error_offset);
    Status Describe(const PGresult* result);
    Status DescribeColumns(const PGresult* result);
    Status PrepareLobs();
    [[nodiscard]] bool InsertsRows() const;
    bool RetypesTimes(std::vector<Oid>& types) const;
    Status PrepareText(std::uint32_t& error_offset);
    Status PrepareAnew();
    [[nodiscard]] bool IsStale(const Status& status) const;
    bool Renews(Status& failure);
    Status Load(RowSource& source, std::uint32_t row) noexcept;
    bool LoadForBatch(RowSource& source, std::uint32_t row, bool heeds, Batch& batch) noexcept;
    PgConnection::Guard Begin(bool needs) noexcept;

    Status ExecuteOnce(RowSource& source, std::uint32_t row, ArrayOutcome& outcome);
    Status ExecuteSavepoint(ArrayOutcome& outcome);
    Status ExecuteRows(RowSource& source, const ArrayRun& run, ArrayOutcome& outcome);
    Batch RunBatch(RowSource& source, std::uint32_t first, std::uint32_t last, bool heeds);
    bool PrepareWhole(std::uint32_t rows);
    void AppendRow();
    Wire::Values FinishArrays(std::uint32_t rows);
    Batch RunWhole(RowSource& source, std::uint32_t first, std::uint32_t last);
    Batch TryWhole(RowSource& source, std::uint32_t first, std::uint32_t last) noexcept;
    bool MakeWhole();
    void ReadBatch(Batch& batch) noexcept;
    Batch RunReturning(RowSource& source, std::uint32_t first, std::uint32_t last, bool heeds, RowSink& sink);
    PgConnection::Guard SendReturning(RowSource& source, std::uint32_t first, std::uint32_t last, bool heeds, Batch& batch);
    Status ReadReturning(PgConnection::Guard guard, bool heeds, Batch& batch, std::vector<Returned>& results) noexcept;
    Status UndoRows(std::uint32_t row, const Batch& batch, std::uint64_t since) noexcept;
    Status ReleaseRows(PgConnection::Guard guard, const Batch& batch) noexcept;
    Status Deliver(const PGresult* result, std::uint32_t row, RowSink& sink);

    Status Start(const QueryRun& run);
    void Leave() noexcept;
    Status CheckOpen();
    Status Ended(Status status) noexcept;
    Status Next(bool& found);
    Status Step();
    Status Finish(Status status) noexcept;
    Status Keep(std::uint64_t rows);
    Status KeepRow();
    Status GiveTo(RowSink& sink);
    void CopyRow();
    void Hold();
    Status Fill(const PGresult* result, int row);
    Status FillLobs(const PGresult* result, int row);
    Status FindPlace(const PGresult* result, int row, RowVersion& version);
    bool ReadField(const PGresult* result, int row, int field, Oid type, ValueRoom& room, Datum& value) const;

    PgConnection& connection_;
    const std::string sql_;
    const Effect effect_;
    const Verb verb_;
    const std::vector<Kind> kinds_;
    PgConnection::SavepointCommand savepoint_;
    std::string text_;                     // the statement, with values that become large objects of the server
    std::vector<bool> makes_object_;       // by placeholder; shorter or empty: the others do not
    std::string_view tail_;                // what the server is told behind the statement
    std::string name_;                     // empty: the server has it not
    std::uint64_t since_ = 0;              // when it was executed, as large objects count; what it did is behind that
    std::uint64_t ran_at_ = 0;             // when what it returns was as it is
    BoundValues bound_;
    std::vector<Datum> parameters_;
    enum class Whole : std::uint8_t { unknown, impossible, ready } whole_ = Whole::unknown;
    std::string whole_name_;               // of the statement over arrays
    std::vector<std::string> arrays_;
    std::vector<Column> columns_;
    std::vector<Reader> readers_;
    std::vector<LobItem> lobs_;            // columns of large objects
    bool has_places_ = false;              // the places of their rows come behind the others
    // The row at hand: its values, and what they show beside the result.
    struct RowAtHand {
        std::vector<Datum> values;
        std::vector<ValueRoom> rooms;
        std::vector<std::string> lobs;
        std::vector<std::string> copies;    // of rows of the store
        Result result;                      // of a row that is held
    } at_hand_;
    bool delivers_ = false;                // the sink has the row at hand
    RowAtHand held_;                       // or this one, where the sink itself has the rest read ahead
    bool binary_ = true;

    State state_ = State::closed;
    PgConnection::Guard guard_ = PgConnection::Guard::none;
    Result row_;                           // what the views of the row at hand show
    bool scrollable_ = false;
    RowStore store_;
    std::uint64_t next_ = 0;               // the row of the store that comes next
    Status end_;                           // what comes behind the last row
};

}  // namespace engine::postgres
