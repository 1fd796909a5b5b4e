// The rows of a query: waiting for them, scrolling, reading ahead.
#include <algorithm>
#include <limits>
#include <new>

#include "engine/postgres/query.h"
#include "handles/errors.h"

namespace engine::postgres {
namespace {

constexpr int kRowsBeforeCancel = 1000;    // that a query closed early may still send before it is cancelled

}  // namespace

// Waits for the first row, so that what fails at once is answered here.
Status PgQuery::Open(RowSource& source, const QueryRun& run) {
    Close();
    if (connection_.Server().Asked()) return PgConnection::Stopped();
    if (Status status = connection_.Enter(effect_); !status.Ok()) return status;
    Status status;
    for (int runs = 0; runs == 0 || (runs == 1 && Renews(status)); ++runs) {
        status = Load(source, run.row);
        if (status.Ok()) status = Start(run);
    }
    return status;
}

// Rows are locked as they are sent.
Status PgQuery::Start(const QueryRun& run) {
    Wire& server = connection_.Server();
    guard_ = Begin(effect_ == Effect::locks);
    server.SendExecute(name_.c_str(), bound_.Values(), binary_);
    connection_.SendRelease(guard_);
    const Wire::Heeding heeding(server);
    Status status = connection_.PassGuard(guard_);
    if (!status.Ok()) return Finish(std::move(status));
    server.OneByOne();
    connection_.Stream(this);
    state_ = State::coming;
    scrollable_ = run.scrollable;
    status = Step();
    if (!status.Ok()) {
        Close();
        return status;
    }
    if (effect_ == Effect::locks) {
        ReadAhead();
        if (!end_.Ok()) return Ended(end_);
    }
    return status;
}

// Waits for the next row: on_row with it, drained behind the last one.
Status PgQuery::Step() {
    Wire& server = connection_.Server();
    row_.reset();
    for (;;) {
        Result result = server.Next();
        if (!result) return Finish(server.Broken() ? server.Lost() : Status());
        const ExecStatusType status = PQresultStatus(result.get());
        if (status == PGRES_FATAL_ERROR) return Finish(server.Answer(result.get()));
        if (status == PGRES_SINGLE_TUPLE) {
            row_ = std::move(result);
            state_ = State::on_row;
            return {};
        }
    }
}

// Reads what is left of the batch, and lets go of the connection.
Status PgQuery::Finish(Status status) noexcept {
    Status rest = connection_.Server().Drain();
    connection_.Stream(nullptr);
    state_ = State::drained;
    return connection_.Settle(guard_, status.Ok() ? std::move(rest) : std::move(status), since_);
}

Status PgQuery::CheckOpen() {
    if (state_ == State::closed && connection_.Server().Broken()) return connection_.Server().Lost();
    if (state_ == State::closed) return Refused(errors::kFetchOutOfSequence);
    return connection_.Server().Asked() ? Ended(PgConnection::Stopped()) : Status();
}

Status PgQuery::Ended(Status status) noexcept {
    Close();
    return status;
}

Status PgQuery::Fetch(RowSink& sink, std::uint32_t most, bool& more) {
    more = false;
    const Wire::Heeding heeding(connection_.Server());
    Status status = CheckOpen();
    for (std::uint32_t row = 0; row < most && status.Ok(); ++row) {
        bool found = false;
        status = Next(found);
        if (!status.Ok()) return Ended(std::move(status));
        if (!found) {
            if (!scrollable_) Close();
            return status;
        }
        status = GiveTo(sink);
    }
    more = IsOpen();
    return status;
}

// The next row as views, wherever it comes from.
Status PgQuery::Next(bool& found) {
    if (scrollable_ && next_ == store_.Size()) {
        if (Status status = Keep(next_ + 1); !status.Ok()) return status;
    }
    if (state_ == State::coming && !scrollable_) {
        if (connection_.Server().Asked()) return PgConnection::Stopped();
        if (Status status = Step(); !status.Ok()) return status;
    }
    if (scrollable_ || state_ == State::drained) {
        found = next_ < store_.Size();
        Status status = found ? store_.Read(next_, at_hand_.values) : end_;
        if (found && status.Ok()) ++next_;
        return status;
    }
    found = true;
    Status status = Fill(row_.get(), 0);
    state_ = State::coming;
    return status;
}

// What the sink reads of large objects may have the rest of the rows read ahead. A row that it found no memory for comes
// again.
Status PgQuery::GiveTo(RowSink& sink) {
    const bool came = state_ == State::coming && !scrollable_;
    struct Delivery {
        PgQuery& query;
        ~Delivery() {
            query.delivers_ = false;
            query.held_ = {};
        }
    } const delivery{*this};
    delivers_ = true;
    try {
        if (scrollable_ && state_ == State::coming && !lobs_.empty()) CopyRow();
        return sink.Row(0, at_hand_.values);
    } catch (const std::bad_alloc&) {
        if (came && state_ == State::coming) state_ = State::on_row;
        else --next_;
        throw;
    }
}

// The store may move what it has when more comes.
void PgQuery::CopyRow() {
    at_hand_.copies.resize(at_hand_.values.size());
    for (std::size_t index = 0; index < at_hand_.copies.size(); ++index) {
        Datum& value = at_hand_.values[index];
        if (value.length == 0) continue;
        at_hand_.copies[index] = value.Text();
        value.data = at_hand_.copies[index].data();
    }
}

// The row that the sink has stays where it is; the next ones get another place.
void PgQuery::Hold() {
    if (!scrollable_) {
        if (Status status = store_.Add(at_hand_.values); status.Failed()) throw std::bad_alloc();
        next_ = 1;
    }
    RowAtHand other;
    other.values.resize(at_hand_.values.size());
    other.rooms.resize(at_hand_.rooms.size());
    other.lobs.resize(at_hand_.lobs.size());
    held_ = std::exchange(at_hand_, std::move(other));
    held_.result = std::move(row_);
    delivers_ = false;
}

// Copies the next row into the store.
Status PgQuery::KeepRow() {
    if (state_ == State::coming) {
        if (Status status = Step(); !status.Ok() || state_ == State::drained) return status;
    }
    Status status = Fill(row_.get(), 0);
    if (status.Ok()) status = store_.Add(at_hand_.values);
    if (status.Ok()) state_ = State::coming;
    return status;
}

// Reads on until the store has that many rows, or all.
Status PgQuery::Keep(std::uint64_t rows) {
    Status status;
    while (status.Ok() && store_.Size() < rows && state_ != State::drained) status = KeepRow();
    return status.Ok() && store_.Size() < rows ? end_ : status;
}

void PgQuery::ReadAhead() noexcept {
    const Wire::Heeding undisturbed(connection_.Server(), false);
    Status status;
    try {
        if (delivers_) Hold();
        while (status.Ok() && state_ != State::drained) status = KeepRow();
    } catch (const std::bad_alloc&) {
        status = Refused(errors::kOutOfMemory);
    }
    if (!status.Ok()) end_ = std::move(status);
    if (connection_.Streams(this)) Leave();
}

// The rest is of no use. Not much of it is passed over; a query that goes on sending is stopped.
void PgQuery::Leave() noexcept {
    Wire& server = connection_.Server();
    const Wire::Heeding undisturbed(server, false);
    if (!delivers_) row_.reset();
    bool more = true;
    for (int row = 0; more && row < kRowsBeforeCancel; ++row) more = server.Next() != nullptr;
    if (more) server.Cancel();
    Status rest = server.Drain();
    connection_.Stream(nullptr);
    state_ = State::drained;
    (void)connection_.Settle(guard_, std::move(rest), since_);
}

Status PgQuery::Scroll(std::uint64_t position, RowSink& sink, bool& found) {
    found = false;
    const Wire::Heeding heeding(connection_.Server());
    Status status = CheckOpen();
    if (!status.Ok()) return status;
    status = Keep(position);
    if (!status.Ok()) return Ended(std::move(status));
    next_ = std::min(position, store_.Size());
    if (position == 0 || position > store_.Size()) return status;
    status = store_.Read(position - 1, at_hand_.values);
    if (!status.Ok()) return Ended(std::move(status));
    found = true;
    return GiveTo(sink);
}

Status PgQuery::Count(std::uint64_t& rows) {
    const Wire::Heeding heeding(connection_.Server());
    Status status = CheckOpen();
    if (!status.Ok()) return status;
    status = Keep(std::numeric_limits<std::uint64_t>::max());
    if (!status.Ok()) return Ended(std::move(status));
    rows = store_.Size();
    return status;
}

void PgQuery::Close() noexcept {
    if (state_ == State::closed) return;
    if (connection_.Streams(this)) Leave();
    store_.Clear();
    state_ = State::closed;
    end_ = {};
    next_ = 0;
}

// A row as views of the result, or of the rooms.
Status PgQuery::Fill(const PGresult* result, int row) {
    const int count = static_cast<int>(at_hand_.values.size());
    const auto places = static_cast<int>(has_places_ ? lobs_.size() + 3 : 0);
    if (PQnfields(result) != count + places) return Refused(errors::kSchemaChanged);
    for (int index = 0; index < count; ++index) {
        const auto place = static_cast<std::size_t>(index);
        Datum& value = at_hand_.values[place];
        if (PQgetisnull(result, row, index)) {
            value = {};
            continue;
        }
        const std::string_view bytes(PQgetvalue(result, row, index),
                                     static_cast<std::size_t>(PQgetlength(result, row, index)));
        if (const int error = readers_[place](bytes, at_hand_.rooms[place], value)) return Refused(error);
    }
    return lobs_.empty() ? Status() : FillLobs(result, row);
}

// Of the row at hand: behind the columns and the lengths of large objects stand its table, place and transaction.
Status PgQuery::FindPlace(const PGresult* result, int row, RowVersion& version) {
    const auto first = static_cast<int>(at_hand_.values.size() + lobs_.size());
    ValueRoom room;
    Datum table, place, transaction;
    if (PQgetisnull(result, row, first + 1) || !ReadField(result, row, first, oid::kInt8, room, table) ||
        !ReadField(result, row, first + 2, oid::kInt8, room, transaction) ||
        !ReadField(result, row, first + 1, oid::kTupleId, room, place))
        return Refused(errors::kInternalError, "a row without a place");
    char tuple[kTupleIdSize];
    TupleIdOf(place.Row(), tuple);
    version = {static_cast<Oid>(table.integer), static_cast<std::uint32_t>(transaction.integer),
               std::uint64_t{Get<std::uint32_t>(tuple)} << 16 | Get<std::uint16_t>(tuple + 4)};
    return {};
}

bool PgQuery::ReadField(const PGresult* result, int row, int field, Oid type, ValueRoom& room, Datum& value) const {
    const std::string_view bytes(PQgetvalue(result, row, field), static_cast<std::size_t>(PQgetlength(result, row, field)));
    return (binary_ ? BinaryReader(type) : TextReader(type))(bytes, room, value) == 0;
}

// Values of large objects become views of them. Without places only those come that the server keeps for themselves.
Status PgQuery::FillLobs(const PGresult* result, int row) {
    LobView view;
    if (has_places_) {
        if (Status status = FindPlace(result, row, view.version); !status.Ok()) return status;
    }
    view.is_locked = effect_ == Effect::locks || effect_ == Effect::changes;
    view.seen_at = ran_at_;
    for (std::size_t index = 0; index < lobs_.size(); ++index) {
        Datum& value = at_hand_.values[lobs_[index].index];
        const int field = static_cast<int>(at_hand_.values.size() + index);
        const bool is_object = lobs_[index].column->is_object;
        if (is_object ? value.kind == Kind::null : PQgetisnull(result, row, field)) {
            value = {};
            continue;
        }
        ValueRoom room;
        Datum length;
        view.object = is_object ? static_cast<Oid>(value.integer) : 0;
        if (!is_object && !ReadField(result, row, field, oid::kInt8, room, length)) return Refused(errors::kInternalError);
        view.column = &lobs_[index].column;
        view.length = static_cast<std::uint64_t>(length.integer);
        view.is_whole = !is_object && value.kind != Kind::null;
        std::string& bytes = at_hand_.lobs[index];
        bytes.assign(reinterpret_cast<const char*>(&view), sizeof view);
        if (view.is_whole) bytes.append(value.Text());
        value.kind = Kind::lob;
        value.length = static_cast<std::uint32_t>(bytes.size());
        value.data = bytes.data();
    }
    return {};
}

}  // namespace engine::postgres
