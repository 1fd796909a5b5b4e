// Binding, stepping and reading. Nothing is allocated for a row.
#include "engine/sqlite/query.h"

#include <algorithm>
#include <cctype>
#include <limits>

#include "engine/sqlite/characters.h"
#include "engine/sqlite/column_types.h"
#include "engine/sqlite/describe.h"
#include "engine/sqlite/stored_number.h"
#include "handles/errors.h"

namespace engine::sqlite {
namespace {

int Length(const Datum& value) { return static_cast<int>(value.length); }

}  // namespace

SqliteQuery::SqliteQuery(SqliteConnection& connection, StatementHandle statement, std::string_view sql)
    : connection_(connection),
      statement_(std::move(statement)),
      sql_(sql),
      verb_(VerbOf(sql_)),
      changes_rows_(verb_ != Verb::other),
      read_only_(sqlite3_stmt_readonly(statement_.get()) != 0),
      parameters_(static_cast<std::size_t>(sqlite3_bind_parameter_count(statement_.get()))),
      coercions_(parameters_.size()) {}

SqliteQuery::~SqliteQuery() { Close(); }

void SqliteQuery::UseFor(std::size_t parameter, const Column& column, Coercion::Purpose purpose) {
    if (parameter < coercions_.size()) coercions_[parameter] = std::make_unique<Coercion>(column, purpose);
}

const std::vector<Column>& SqliteQuery::Columns() {
    const auto count = static_cast<std::size_t>(sqlite3_column_count(statement_.get()));
    if (columns_.size() != count) {    // not described yet, or its tables have changed
        columns_.clear();
        untyped_.clear();
        DescribeColumns(connection_.Database(), statement_.get(), sql_, columns_, untyped_);
        PlanReading();
    }
    return columns_;
}

SqliteQuery::Reading SqliteQuery::ReadingOf(const Column& column) {
    if (IsNumberType(column.type)) return Reading::number;
    if (IsDateType(column.type)) return Reading::date;
    switch (column.type) {
        case SQLT_RDD: return Reading::row_id;
        case SQLT_AFC: return column.size > 0 ? Reading::padded : Reading::as_stored;
        case SQLT_BIN:
        case SQLT_LBI:
        case SQLT_BLOB: return Reading::bytes;
        default: return Reading::as_stored;
    }
}

void SqliteQuery::PlanReading() {
    readings_.clear();
    for (const Column& column : columns_) readings_.push_back(ReadingOf(column));
    numbers_.resize(columns_.size());
    padded_.resize(columns_.size());
}

// What no declaration tells, the first row does.
void SqliteQuery::DescribeFromRow() {
    Columns();
    for (std::size_t index = 0; index < columns_.size(); ++index) {
        if (!untyped_[index]) continue;
        DescribeValue(sqlite3_column_value(statement_.get(), static_cast<int>(index)), columns_[index]);
    }
    PlanReading();
}

Status SqliteQuery::Bind(int index, const Datum& value, bool copy) {
    sqlite3_stmt* statement = statement_.get();
    const sqlite3_destructor_type keep = copy ? SQLITE_TRANSIENT : SQLITE_STATIC;
    int code = SQLITE_OK;
    switch (value.kind) {
        case Kind::null: code = sqlite3_bind_null(statement, index); break;
        case Kind::integer:
        case Kind::row_id:
        case Kind::lob: code = sqlite3_bind_int64(statement, index, value.integer); break;
        case Kind::real: code = sqlite3_bind_double(statement, index, value.real); break;
        case Kind::text:
        case Kind::timestamp:
            code = sqlite3_bind_text(statement, index, value.length ? static_cast<const char*>(value.data) : "",
                                     Length(value), keep);
            break;
        case Kind::bytes:
            code = sqlite3_bind_blob(statement, index, value.length ? value.data : "", Length(value), keep);
            break;
        case Kind::decimal: {
            const StoredNumber number = StoredNumber::From(*static_cast<const OCINumber*>(value.data));
            if (number.form == StoredNumber::Form::null) return Error(errors::kInvalidNumber);
            if (number.form == StoredNumber::Form::integer) code = sqlite3_bind_int64(statement, index, number.integer);
            else if (number.form == StoredNumber::Form::real) code = sqlite3_bind_double(statement, index, number.real);
            else code = sqlite3_bind_blob(statement, index, number.blob, number.length, SQLITE_TRANSIENT);
            break;
        }
        case Kind::cursor: return Error(errors::kInconsistentTypes);
    }
    return code == SQLITE_OK ? Status() : Failure(connection_.Database(), code);
}

Status SqliteQuery::BindRow(RowSource& source, std::uint32_t row, bool copy) {
    if (parameters_.empty()) return {};
    Status status = source.Row(row, parameters_);
    for (std::size_t index = 0; index < parameters_.size() && status.Ok(); ++index) {
        if (coercions_[index]) status = coercions_[index]->Apply(parameters_[index]);
        if (status.Ok()) status = Bind(static_cast<int>(index) + 1, parameters_[index], copy);
    }
    return status;
}

// A call that was stopped says so, whatever it was in the middle of.
Status SqliteQuery::Stopped(int code) {
    if (!connection_.Cancelled()) return Failure(connection_.Database(), code, verb_);
    connection_.ForgetCancel();
    return Error(errors::kCancelled).From("SQLITE");
}

Status SqliteQuery::Step(bool& has_row) {
    const bool in_transaction = connection_.InTransaction();
    const int code = connection_.Cancelled() ? SQLITE_INTERRUPT : sqlite3_step(statement_.get());
    has_row = code == SQLITE_ROW;
    if (has_row || code == SQLITE_DONE) return {};
    Status status = Stopped(code & 0xFF);
    return in_transaction && !connection_.InTransaction() ? RolledBack(status) : status;
}

Status SqliteQuery::ExecuteRow(RowSource& source, std::uint32_t row, std::uint64_t& affected) {
    Status status = BindRow(source, row, false);
    bool has_row = status.Ok();
    while (has_row && status.Ok()) status = Step(has_row);
    if (status.Ok() && changes_rows_) affected += static_cast<std::uint64_t>(sqlite3_changes64(connection_.Database()));
    sqlite3_reset(statement_.get());
    return status;
}

Status SqliteQuery::ExecuteArray(RowSource& source, std::uint32_t first, std::uint32_t last, bool all_rows,
                                 ArrayOutcome& outcome) {
    Close();
    if (!read_only_) connection_.ReadAhead(this);
    connection_.ForgetLastRow();
    const bool in_transaction = connection_.InTransaction();
    for (std::uint32_t row = first; row < last; ++row) {
        Status status = ExecuteRow(source, row, outcome.affected);
        if (status.Ok()) {
            ++outcome.executed;
            continue;
        }
        if (in_transaction && !connection_.InTransaction()) return status;
        const bool stop = !all_rows || status.Number() == errors::kCancelled;
        outcome.failures.push_back({row, std::move(status)});
        if (stop) break;
    }
    return {};
}

Status SqliteQuery::Open(RowSource& source, std::uint32_t row) {
    Close();
    // Outside a transaction an older query's rows would keep this one from seeing what others have committed since.
    if (!read_only_ || (!connection_.InTransaction() && !connection_.Private())) connection_.ReadAhead(this);
    Status status = BindRow(source, row, true);
    bool has_row = false;
    if (status.Ok()) status = Step(has_row);
    if (!status.Ok() || !has_row) {
        sqlite3_reset(statement_.get());
        return status;
    }
    state_ = State::on_row;
    connection_.Join(*this);
    DescribeFromRow();
    return status;
}

Status SqliteQuery::Fetch(std::span<Datum> values, bool& more) {
    more = false;
    if (state_ == State::stepping) {
        const Status status = Step(more);
        if (more) Fill(values);
        else Close();
        return status;
    }
    if (state_ == State::on_row) {
        state_ = State::stepping;
        more = true;
        Fill(values);
        return {};
    }
    if (state_ == State::closed) return {};
    Status status;
    more = store_.Next(values, status);
    if (more) return status;
    if (status.Ok()) status = stored_end_;
    Close();
    return status;
}

void SqliteQuery::Close() noexcept {
    if (state_ == State::closed) return;
    connection_.Leave(*this);
    if (state_ == State::stored) store_.Clear();
    else sqlite3_reset(statement_.get());
    state_ = State::closed;
    stored_end_ = {};
}

void SqliteQuery::ReadAhead() {
    if (state_ == State::closed || state_ == State::stored) return;
    std::vector<Datum> values(columns_.size());
    Status status;
    bool has_row = state_ == State::on_row;
    if (!has_row) status = Step(has_row);
    while (has_row && status.Ok()) {
        Fill(values);
        status = store_.Add(values);
        if (status.Ok()) status = Step(has_row);
    }
    stored_end_ = std::move(status);
    sqlite3_reset(statement_.get());
    connection_.Leave(*this);
    state_ = State::stored;
}

void SqliteQuery::Fill(std::span<Datum> values) {
    sqlite3_stmt* statement = statement_.get();
    for (std::size_t index = 0; index < values.size(); ++index) {
        Datum& value = values[index];
        sqlite3_value* stored = sqlite3_column_value(statement, static_cast<int>(index));
        switch (sqlite3_value_type(stored)) {
            case SQLITE_INTEGER:
                value.kind = readings_[index] == Reading::row_id ? Kind::row_id : Kind::integer;
                value.length = 0;
                value.integer = sqlite3_value_int64(stored);
                break;
            case SQLITE_FLOAT:
                value.kind = Kind::real;
                value.length = 0;
                value.real = sqlite3_value_double(stored);
                break;
            case SQLITE_TEXT:
                value.kind = readings_[index] == Reading::date ? Kind::timestamp : Kind::text;
                // The bytes as they lie in the file: asking for a text would copy them to add a zero.
                value.data = connection_.Utf8() ? sqlite3_value_blob(stored) : sqlite3_value_text(stored);
                value.length = static_cast<std::uint32_t>(sqlite3_value_bytes(stored));
                if (readings_[index] == Reading::padded) Pad(index, value);
                break;
            case SQLITE_BLOB:
                value.kind = Kind::bytes;
                value.data = sqlite3_value_blob(stored);
                value.length = static_cast<std::uint32_t>(sqlite3_value_bytes(stored));
                if (readings_[index] != Reading::bytes && ReadNumberBlob(value.Text(), numbers_[index])) {
                    value.kind = Kind::decimal;
                    value.data = &numbers_[index];
                    value.length = sizeof numbers_[index];
                }
                break;
            default:
                value.kind = Kind::null;
                value.length = 0;
                value.integer = 0;
                break;
        }
    }
}

// A fixed column's texts have its length, in characters or bytes.
void SqliteQuery::Pad(std::size_t column, Datum& value) {
    const std::size_t characters = columns_[column].characters;
    const std::size_t more = characters > 0 ? value.length - static_cast<std::size_t>(CharacterCount(value.Text())) : 0;
    const std::size_t size = (characters > 0 ? characters : columns_[column].size) + more;
    if (value.length >= size) return;
    padded_[column].assign(value.Text());
    padded_[column].resize(size, ' ');
    value.data = padded_[column].data();
    value.length = static_cast<std::uint32_t>(size);
}

}  // namespace engine::sqlite
