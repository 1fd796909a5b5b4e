// What a query is described as, binding, and array executions.
#include "engine/sqlite/query.h"

#include <algorithm>
#include <cerrno>
#include <new>
#include <optional>

#include "engine/pieces.h"
#include "engine/sqlite/column_types.h"
#include "engine/sqlite/describe.h"
#include "engine/sqlite/query_parts.h"
#include "engine/sqlite/row_number.h"
#include "engine/sqlite/stored_number.h"
#include "handles/errors.h"

namespace engine::sqlite {
namespace {

int Length(const Datum& value) { return static_cast<int>(value.length); }

bool BeginsWith(std::string_view sql, std::string_view word) {
    Pieces pieces(sql);
    return IsWord(pieces.Next(), word);
}

// Whether two more failures can be noted: one, and that there is no room for others.
bool HasRoom(std::vector<ArrayOutcome::Failure>& failures) noexcept {
    try {
        if (failures.capacity() - failures.size() < 2) failures.reserve(2 * failures.size() + 2);
        return true;
    } catch (const std::bad_alloc&) {
        return false;
    }
}

}  // namespace

SqliteQuery::SqliteQuery(SqliteConnection& connection, Compilation compilation, const StatementSource& source)
    : connection_(connection),
      statement_(std::move(compilation.statement)),
      table_(std::move(compilation.table)),
      schema_(compilation.schema),
      lobs_(std::move(compilation.lobs)),
      objects_(connection, std::move(compilation.objects)),
      as_written_(std::move(compilation.as_written)),
      sql_(source.sql),
      written_(source.written.begin(), source.written.end()),
      verb_(VerbOf(sql_)),
      entry_{source.effect, sqlite3_stmt_readonly(statement_.get()) != 0, source.effect == Effect::controls && BeginsWith(sql_, "savepoint"),
             source.effect == Effect::controls && BeginsWith(sql_, "rollback")},
      parameters_(static_cast<std::size_t>(sqlite3_bind_parameter_count(statement_.get()))),
      coercions_(CoercionsOf(compilation.targets, parameters_.size())),
      intervals_(std::move(compilation.targets.intervals)) {}

SqliteQuery::~SqliteQuery() { Close(); }

// By parameter: those whose values are stored into a column, or compared with it.
SqliteQuery::Coercions SqliteQuery::CoercionsOf(const ValueTargets& targets, std::size_t parameters) {
    Coercions coercions(parameters);
    for (const auto& [index, column, purpose] : targets.parameters) {
        coercions[index] = std::make_unique<Coercion>(column, purpose);
    }
    return coercions;
}

// SQLite sees to tables that have changed since, but what the values are for was found here: compiles it all anew.
Status SqliteQuery::FollowSchema() {
    Schema schema;
    if (Status status = connection_.SeeSchema(schema); status.Failed() || schema == schema_) return status;
    Compilation made;
    std::uint32_t offset = 0;
    if (Status status = connection_.Make(sql_, made, offset); status.Failed()) return status;
    coercions_ = CoercionsOf(made.targets, parameters_.size());
    intervals_ = std::move(made.targets.intervals);
    statement_ = std::move(made.statement);
    table_ = std::move(made.table);
    lobs_ = std::move(made.lobs);
    objects_.Use(std::move(made.objects));
    as_written_ = std::move(made.as_written);
    schema_ = made.schema;
    described_ = false;
    return {};
}

// ---- The select list

// SQLite compiles a statement anew when its tables have changed.
int SqliteQuery::Recompilations() const {
    return sqlite3_stmt_status(statement_.get(), SQLITE_STMTSTATUS_REPREPARE, 0);
}

const std::vector<Column>& SqliteQuery::Columns() {
    if (!described_ || described_at_ != Recompilations()) Describe();
    return columns_;
}

void SqliteQuery::Describe() {
    described_ = false;
    described_at_ = Recompilations();
    columns_.clear();
    untyped_.clear();
    if (sqlite3_column_count(statement_.get()) > 0) {
        sqlite3_stmt* const described = as_written_ ? as_written_.get() : statement_.get();
        DescribeColumns(connection_.Database(), described, sql_, columns_, untyped_, written_);
        DescribeIntervals();
    }
    any_untyped_ = std::find(untyped_.begin(), untyped_.end(), true) != untyped_.end();
    PlanReading();
    described_ = true;
}

void SqliteQuery::DescribeIntervals() {
    for (const auto& [item, type] : intervals_) {
        if (item >= columns_.size()) continue;
        Column& column = columns_[item];
        column.type = type.type;
        column.size = type.size;
        column.precision = type.precision;
        column.scale = type.scale;
        untyped_[item] = false;
    }
}

SqliteQuery::Reading SqliteQuery::ReadingOf(const Column& column) {
    if (HasBinaryDigits(column)) return Reading::binary_digits;
    if (IsNumberType(column.type)) return Reading::number;
    if (IsDateType(column.type)) return Reading::date;
    if (IsIntervalType(column.type)) return Reading::interval;
    switch (column.type) {
        case SQLT_RDD: return Reading::row_id;
        case SQLT_AFC: return Reading::padded;
        case SQLT_BIN:
        case SQLT_LBI:
        case SQLT_BLOB: return Reading::bytes;
        case SQLT_CLOB:
        case SQLT_DBCLOB:
        case SQLT_LNG: return Reading::characters;    // long ones are kept as blobs
        default: return Reading::as_stored;
    }
}

void SqliteQuery::PlanReading() {
    readings_.clear();
    for (const Column& column : columns_) readings_.push_back(ReadingOf(column));
    for (const LobItem& lob : lobs_) {
        const Reading whole = lob.column->kind == LobKind::characters ? Reading::characters : Reading::bytes;
        readings_[lob.index] = verb_ == Verb::remove ? whole : Reading::lob;
    }
    rooms_.resize(columns_.size());
    values_.resize(columns_.size());
}

// What no declaration tells, the first row does.
void SqliteQuery::DescribeFromRow() {
    Columns();
    if (!any_untyped_) return;
    for (std::size_t index = 0; index < columns_.size(); ++index) {
        if (!untyped_[index]) continue;
        DescribeValue(sqlite3_column_value(statement_.get(), static_cast<int>(index)), columns_[index]);
    }
    PlanReading();
}

// ---- Binding

Status SqliteQuery::BindDate(int index, const date::DateTime& value, bool copy) {
    dates_.resize(parameters_.size());
    DateText& text = dates_[static_cast<std::size_t>(index) - 1];
    const std::string_view view = WriteDate(value, text);
    Datum written;
    SetView(written, Kind::text, view.data(), view.size());
    return Bind(index, written, copy);
}

Status SqliteQuery::Bind(int index, const Datum& value, bool copy) {
    sqlite3_stmt* statement = statement_.get();
    const sqlite3_destructor_type keep = copy ? SQLITE_TRANSIENT : SQLITE_STATIC;
    int code = SQLITE_OK;
    switch (value.kind) {
        case Kind::null: code = sqlite3_bind_null(statement, index); break;
        case Kind::integer: code = sqlite3_bind_int64(statement, index, value.integer); break;
        case Kind::row_id: code = sqlite3_bind_int64(statement, index, RowNumber(value.Row())); break;
        case Kind::real: code = sqlite3_bind_double(statement, index, value.real); break;
        case Kind::timestamp: return BindDate(index, value.Timestamp(), copy);
        case Kind::text:
            code = sqlite3_bind_text(statement, index, value.length ? static_cast<const char*>(value.data) : "",
                                     Length(value), keep);
            break;
        case Kind::bytes:
            code = sqlite3_bind_blob(statement, index, value.length ? value.data : "", Length(value), keep);
            break;
        case Kind::decimal: {
            const StoredNumber number = StoredNumber::From(value.Number());
            if (number.form == StoredNumber::Form::null) return Error(errors::kInvalidNumber);
            if (number.form == StoredNumber::Form::integer) code = sqlite3_bind_int64(statement, index, number.integer);
            else if (number.form == StoredNumber::Form::real) code = sqlite3_bind_double(statement, index, number.real);
            else code = sqlite3_bind_blob(statement, index, number.blob, number.length, SQLITE_TRANSIENT);
            break;
        }
        case Kind::lob: code = sqlite3_bind_zeroblob64(statement, index, objects_.LengthOf(value)); break;
        case Kind::cursor:
        case Kind::moment: return Error(errors::kInconsistentTypes);
    }
    return code == SQLITE_OK ? Status() : Failure(connection_.Database(), code);
}

Status SqliteQuery::BindRow(RowSource& source, std::uint32_t row, bool copy) {
    if (parameters_.empty()) return {};
    Status status = source.Row(row, parameters_);
    if (status.Ok()) status = objects_.Take(parameters_);
    for (std::size_t index = 0; index < parameters_.size() && status.Ok(); ++index) {
        if (coercions_[index]) status = coercions_[index]->Apply(parameters_[index]);
        if (status.Ok()) status = Bind(static_cast<int>(index) + 1, parameters_[index], copy);
    }
    return status;
}

Status SqliteQuery::Step(bool& has_row) {
    has_row = false;
    if (connection_.Stopping()) return SqliteConnection::Stopped();
    const bool in_transaction = connection_.InTransaction();
    errno = 0;    // a write that fails tells why
    const int code = sqlite3_step(statement_.get());
    has_row = code == SQLITE_ROW;
    return has_row || code == SQLITE_DONE ? Status() : connection_.Failed(code, verb_, in_transaction);
}

// ---- Changes

// Steps through an execution whose rows go to the sink.
Status SqliteQuery::DeliverRows(std::uint32_t row, RowSink& sink) {
    bool has_row = false;
    Status status = Step(has_row);
    if (has_row) Columns();
    while (has_row && status.Ok()) {
        Fill();
        status = sink.Row(row, values_);
        if (status.Ok()) status = Step(has_row);
    }
    return status;
}

// What a sink refuses must be undone, which SQLite does for its own failures alone: the execution gets a mark.
Status SqliteQuery::RunReturning(std::uint32_t row, RowSink& sink) {
    Status status = connection_.SetMark();
    if (!status.Ok()) return status;
    try {
        status = DeliverRows(row, sink);
    } catch (const std::bad_alloc&) {
        status = NoMemory();
    }
    sqlite3_reset(statement_.get());    // a statement that runs holds its marks
    if (status.Ok()) status = connection_.DropMark();
    if (status.Ok() || !connection_.InTransaction()) return status;
    Status undone = connection_.UndoToMark();
    if (undone.Ok()) undone = connection_.DropMark();
    return undone.Ok() ? status : undone;
}

// Through an execution whose rows nobody wants.
Status SqliteQuery::StepThrough() {
    Status status;
    for (bool has_row = true; has_row;) status = Step(has_row);
    sqlite3_reset(statement_.get());
    return status;
}

// The rows are written with room for their long values, which are filled in then.
Status SqliteQuery::FillObjects() {
    std::vector<std::int64_t> rows;
    rows.reserve(ObjectValues::kMostRows);
    connection_.changed_rows = &rows;
    Status status = StepThrough();
    connection_.changed_rows = nullptr;
    if (status.Failed()) return status;
    const auto changes = static_cast<std::uint64_t>(sqlite3_changes64(connection_.Database()));
    return objects_.Fill(rows, changes);
}

// What cannot be filled in later is undone, and written whole.
Status SqliteQuery::RunWithObjects() {
    Status status = objects_.Detach();
    if (status.Ok()) status = connection_.SetMark();
    if (status.Failed()) return status;
    try {
        status = FillObjects();
    } catch (const std::bad_alloc&) {
        connection_.changed_rows = nullptr;
        status = NoMemory();
    }
    if (!connection_.InTransaction()) return status;
    if (status.Ok() && !objects_.Refused()) return connection_.DropMark();
    Status undone = connection_.UndoToMark();
    if (undone.Ok()) undone = connection_.DropMark();
    if (undone.Failed() || status.Failed()) return undone.Failed() ? undone : status;
    status = objects_.HoldWhole(parameters_);
    for (std::size_t index = 0; index < parameters_.size() && status.Ok(); ++index)
        status = Bind(static_cast<int>(index) + 1, parameters_[index], false);
    return status.Ok() ? StepThrough() : status;
}

Status SqliteQuery::ExecuteRow(RowSource& source, std::uint32_t row, RowSink* returned, std::uint64_t& affected) {
    Status status = BindRow(source, row, false);
    if (!status.Ok()) return status;
    const std::uint64_t told = connection_.ToldChanges();
    if (returned) status = RunReturning(row, *returned);
    else status = objects_.Any() ? RunWithObjects() : StepThrough();
    if (status.Failed() || verb_ == Verb::other) return status;
    const auto changes = static_cast<std::uint64_t>(sqlite3_changes64(connection_.Database()));
    affected += changes;
    // "delete from t" deletes all rows at once and tells of none.
    if (verb_ == Verb::remove && changes > 0 && connection_.ToldChanges() == told)
        connection_.LobsOfTables().RowsGone(table_);
    return status;
}

Status SqliteQuery::TryRow(RowSource& source, std::uint32_t row, RowSink* returned, std::uint64_t& affected) noexcept {
    try {
        return ExecuteRow(source, row, returned, affected);
    } catch (const std::bad_alloc&) {
        return NoMemory();
    }
}

Status SqliteQuery::ExecuteArray(RowSource& source, const ArrayRun& run, ArrayOutcome& outcome) {
    Close();
    if (connection_.Stopping()) return SqliteConnection::Stopped();
    std::vector<ArrayOutcome::Failure>& failures = outcome.failures;
    failures.reserve(failures.size() + 2);
    Running running(connection_, statement_);
    Status status = connection_.Enter(entry_, running.began);
    if (status.Ok()) status = FollowSchema();
    if (status.Failed()) return status;
    const bool in_transaction = connection_.InTransaction();
    std::optional<std::int64_t> last_row;
    connection_.changed_table = &table_;
    for (std::uint32_t row = run.first; row < run.last; ++row) {
        connection_.changed_row.reset();
        Status done = TryRow(source, row, run.returned, outcome.affected);
        if (done.Ok()) {
            ++outcome.executed;
            running.began = false;
            if (connection_.changed_row) last_row = connection_.changed_row;
            continue;
        }
        if (in_transaction && !connection_.InTransaction()) {
            status = std::move(done);
            break;
        }
        const bool stops = !run.all_rows || done.Number() == errors::kCancelled;
        failures.push_back({row, std::move(done)});
        if (stops) break;
        if (HasRoom(failures)) continue;
        if (row + 1 < run.last) failures.push_back({row + 1, NoMemory()});
        break;
    }
    connection_.changed_table = nullptr;
    if (entry_.effect == Effect::defines) connection_.Defined();
    if (last_row) outcome.last_row = RowIdOf(*last_row);
    sqlite3_clear_bindings(statement_.get());    // they point to the source's values
    return status;
}

}  // namespace engine::sqlite
