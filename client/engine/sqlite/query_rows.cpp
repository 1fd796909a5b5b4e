// The rows of a query: stepping, reading values, scrolling, reading ahead. Nothing is allocated for a row that is
// delivered.
#include <algorithm>
#include <limits>
#include <new>

#include "engine/sqlite/characters.h"
#include "engine/sqlite/interval_text.h"
#include "engine/sqlite/query.h"
#include "engine/sqlite/query_parts.h"
#include "engine/sqlite/row_number.h"
#include "engine/sqlite/stored_number.h"

namespace engine::sqlite {

// Binds and makes the first step, which a later row's views must not depend on: values are copied. The step is the first
// to see what other sessions have done to the tables: where SQLite had to compile anew, all of it may have to be. So may
// a statement whose values were refused before it.
Status SqliteQuery::Start(RowSource& source, std::uint32_t row, bool& has_row) {
    Status status;
    for (bool again = true; again;) {
        const sqlite3_stmt* const statement = statement_.get();
        const int recompilations = Recompilations();
        status = BindRow(source, row, true);
        const bool is_bound = status.Ok();
        if (is_bound) status = Step(has_row);
        else (void)connection_.Ping();
        again = false;
        if (is_bound && Recompilations() == recompilations) break;
        Status followed = FollowSchema();
        again = statement_.get() != statement;
        if (again || status.Ok()) status = std::move(followed);
    }
    if (status.Ok() && has_row) DescribeFromRow();
    return status;
}

Status SqliteQuery::Open(RowSource& source, const QueryRun& run) {
    Close();
    if (connection_.Stopping()) return SqliteConnection::Stopped();
    Running running(connection_, statement_);
    Status status = connection_.Enter(entry_, running.began);
    if (status.Ok()) status = FollowSchema();
    bool has_row = false;
    if (status.Ok()) status = Start(source, run.row, has_row);
    if (!status.Ok()) return status;
    scrollable_ = run.scrollable;
    running.began = false;
    if (!has_row) {
        state_ = State::drained;
        return status;
    }
    running.GoesOn();
    state_ = State::on_row;
    connection_.Join(*this);
    return status;
}

Status SqliteQuery::CheckOpen() {
    if (state_ == State::closed) return Error(errors::kFetchOutOfSequence);
    return connection_.Stopping() ? Ended(SqliteConnection::Stopped()) : Status();
}

Status SqliteQuery::Ended(Status status) noexcept {
    Close();
    return status;
}

// Flat: what it takes to step and to read is in line, for it runs for every row.
[[gnu::flatten]] Status SqliteQuery::Fetch(RowSink& sink, std::uint32_t most, bool& more) {
    more = false;
    Status status = CheckOpen();
    for (std::uint32_t row = 0; row < most && status.Ok(); ++row) {
        bool found = false;
        status = Next(found);
        if (!status.Ok()) return Ended(std::move(status));
        if (!found) {
            if (!scrollable_) Close();
            return status;
        }
        const bool came = state_ == State::stepping && !scrollable_;
        try {
            status = sink.Row(0, values_);
        } catch (const std::bad_alloc&) {    // it comes again
            if (came) state_ = State::on_row;
            else --next_;
            throw;
        }
    }
    more = IsOpen();
    return status;
}

// The next row as views, wherever it comes from.
Status SqliteQuery::Next(bool& found) {
    if (scrollable_ && next_ == store_.Size()) {
        if (Status status = Keep(next_ + 1); !status.Ok()) return status;
    }
    if (scrollable_ || state_ == State::drained) {
        found = next_ < store_.Size();
        Status status = found ? store_.Read(next_, values_) : end_;
        if (found && status.Ok()) ++next_;
        return status;
    }
    if (state_ == State::stepping) {
        bool has_row = false;
        Status status = Step(has_row);
        if (!has_row) return status;
        state_ = State::on_row;
    }
    Fill();
    state_ = State::stepping;
    found = true;
    return {};
}

// Steps to the next row and copies it into the store; drained behind the last one.
Status SqliteQuery::KeepRow() {
    if (state_ == State::stepping) {
        bool has_row = false;
        Status status = Step(has_row);
        if (!has_row) {
            if (status.Ok()) Drain({});
            return status;
        }
        state_ = State::on_row;
    }
    Fill();
    const std::size_t kept = kept_lobs_.size();
    Status status = lobs_.empty() ? Status() : KeepLobs();
    if (status.Ok()) status = store_.Add(values_);
    if (status.Ok()) state_ = State::stepping;
    else kept_lobs_.resize(kept);
    return status;
}

// Reads on until the store has that many rows, or all.
Status SqliteQuery::Keep(std::uint64_t rows) {
    Status status;
    while (status.Ok() && store_.Size() < rows && state_ != State::drained) status = KeepRow();
    return status.Ok() && store_.Size() < rows ? end_ : status;
}

void SqliteQuery::Drain(Status end) noexcept {
    sqlite3_reset(statement_.get());
    connection_.Leave(*this);
    end_ = std::move(end);
    state_ = State::drained;
}

Status SqliteQuery::ReadAhead() noexcept {
    Status status;
    try {
        while (status.Ok() && state_ != State::drained) status = KeepRow();
    } catch (const std::bad_alloc&) {
        status = NoMemory();
    }
    if (state_ != State::drained) Drain(std::move(status));
    return end_;
}

Status SqliteQuery::Scroll(std::uint64_t position, RowSink& sink, bool& found) {
    found = false;
    Status status = CheckOpen();
    if (!status.Ok()) return status;
    status = Keep(position);
    if (!status.Ok()) return Ended(std::move(status));
    next_ = std::min(position, store_.Size());
    if (position == 0 || position > store_.Size()) return status;
    status = store_.Read(position - 1, values_);
    if (!status.Ok()) return Ended(std::move(status));
    found = true;
    return sink.Row(0, values_);
}

Status SqliteQuery::Count(std::uint64_t& rows) {
    Status status = CheckOpen();
    if (!status.Ok()) return status;
    status = Keep(std::numeric_limits<std::uint64_t>::max());
    if (!status.Ok()) return Ended(std::move(status));
    rows = store_.Size();
    return status;
}

void SqliteQuery::Close() noexcept {
    if (state_ == State::closed) return;
    if (state_ != State::drained) Drain({});
    sqlite3_clear_bindings(statement_.get());
    store_.Clear();
    kept_lobs_.clear();
    state_ = State::closed;
    end_ = {};
    next_ = 0;
}

// ---- Reading

// The row that SQLite stands on, as views. Throws where SQLite found no memory for a value.
void SqliteQuery::Fill() {
    sqlite3_stmt* const statement = statement_.get();
    const bool utf8 = connection_.Utf8();
    const Reading* reading = readings_.data();
    const int count = static_cast<int>(values_.size());
    Datum* value = values_.data();
    for (int index = 0; index < count; ++index, ++value, ++reading) {
        sqlite3_value* const stored = sqlite3_column_value(statement, index);
        switch (sqlite3_value_type(stored)) {
            case SQLITE_INTEGER:
                value->kind = Kind::integer;
                value->integer = sqlite3_value_int64(stored);
                if (*reading == Reading::row_id) FillRowId(index, *value);
                if (*reading == Reading::lob) FillLob(index, *value);
                if (*reading == Reading::interval) FillInterval(index, *value);
                break;
            case SQLITE_FLOAT:
                value->kind = Kind::real;
                value->real = sqlite3_value_double(stored);
                if (*reading == Reading::binary_digits) FillWhole(*value);
                break;
            case SQLITE_TEXT:
                value->kind = Kind::text;
                // The bytes as they lie in the file: asking for a text would copy them to add a zero.
                value->data = utf8 ? sqlite3_value_blob(stored) : sqlite3_value_text(stored);
                value->length = static_cast<std::uint32_t>(sqlite3_value_bytes(stored));
                if (!value->data && (value->length > 0 || !utf8)) throw std::bad_alloc();
                if (*reading == Reading::date) FillDate(index, *value);
                if (*reading == Reading::padded) Pad(index, *value);
                break;
            case SQLITE_BLOB:
                value->kind = Kind::bytes;
                value->data = sqlite3_value_blob(stored);
                value->length = static_cast<std::uint32_t>(sqlite3_value_bytes(stored));
                if (!value->data && value->length > 0) throw std::bad_alloc();
                if (*reading == Reading::characters) value->kind = Kind::text;
                else if (*reading != Reading::bytes) FillNumber(index, *value);
                break;
            default: *value = {}; break;
        }
    }
}

// A whole number has all the digits of its real, not those alone that a number has which was computed.
void SqliteQuery::FillWhole(Datum& value) {
    if (!IsWholeReal(value.real)) return;
    value.kind = Kind::integer;
    value.integer = static_cast<std::int64_t>(value.real);
}

void SqliteQuery::FillRowId(int column, Datum& value) {
    RowId& row = rooms_[static_cast<std::size_t>(column)].row;
    row = RowIdOf(value.integer);
    SetView(value, Kind::row_id, &row, sizeof row);
}

// A text that is no date stays one, and so does a time alone.
void SqliteQuery::FillDate(int column, Datum& value) {
    date::DateTime& date = rooms_[static_cast<std::size_t>(column)].date;
    if (date::FromEngineText(value.Text(), &date) != 0 || date.month == 0) return;
    SetView(value, Kind::timestamp, &date, sizeof date);
}

// As the text that it is shown as. What the file of somebody else holds beyond that stays a number.
void SqliteQuery::FillInterval(int index, Datum& value) {
    const auto column = static_cast<std::size_t>(index);
    IntervalText shown;
    std::string& text = rooms_[column].padded;
    text = WriteInterval(value.integer, columns_[column], shown);
    if (!text.empty()) SetView(value, Kind::text, text.data(), text.size());
}

void SqliteQuery::FillNumber(int column, Datum& value) {
    OCINumber& number = rooms_[static_cast<std::size_t>(column)].number;
    if (ReadNumberBlob(value.Text(), number)) SetView(value, Kind::decimal, &number, sizeof number);
}

void SqliteQuery::FillLob(int index, Datum& value) {
    const auto column = static_cast<std::size_t>(index);
    const auto item = std::find_if(lobs_.begin(), lobs_.end(), [&](const LobItem& lob) { return lob.index == column; });
    LobView& view = rooms_[column].lob;
    view = {&item->column, value.integer, entry_.effect != Effect::reads, nullptr};
    SetView(value, Kind::lob, &view, sizeof view);
}

// The large objects of a row that is read ahead are copied as they are now.
Status SqliteQuery::KeepLobs() {
    for (const LobItem& lob : lobs_) {
        if (values_[lob.index].kind != Kind::lob) continue;
        std::shared_ptr<Lob>& kept = kept_lobs_.emplace_back();
        Status status = connection_.LobsOfTables().Take(values_[lob.index], true, kept);
        if (status.Ok()) status = connection_.LobsOfTables().Keep(kept);
        if (status.Failed()) return status;
        rooms_[lob.index].lob.kept = &kept;
    }
    return {};
}

// A fixed column's texts have its length, in characters or bytes.
void SqliteQuery::Pad(int index, Datum& value) {
    const auto column = static_cast<std::size_t>(index);
    const std::size_t characters = columns_[column].characters;
    const std::size_t more = characters > 0 ? value.length - static_cast<std::size_t>(CharacterCount(value.Text())) : 0;
    const std::size_t size = (characters > 0 ? characters : columns_[column].size) + more;
    if (value.length >= size) return;
    std::string& padded = rooms_[column].padded;
    padded.assign(value.Text());
    padded.resize(size, ' ');
    SetView(value, Kind::text, padded.data(), size);
}

}  // namespace engine::sqlite
