// Preparing and describing, and executions: one by one or in batches.
#include "engine/postgres/query.h"

#include <algorithm>
#include <array>
#include <cstdlib>
#include <new>
#include <utility>

#include "engine/pieces.h"
#include "handles/errors.h"

namespace engine::postgres {
namespace {

constexpr std::uint32_t kLargestBatch = 1000;            // rows
constexpr std::size_t kBatchBytes = std::size_t{1} << 20;
constexpr std::uint32_t kRowsBetweenPushes = 64;
constexpr std::size_t kFieldsOfPlace = 3;
constexpr std::string_view kReturningRow = " returning ctid";

Verb VerbOf(std::string_view sql) {
    constexpr struct {
        std::string_view word;
        Verb verb;
    } kVerbs[] = {{"insert", Verb::insert}, {"update", Verb::update}, {"delete", Verb::remove}};
    for (const auto& [word, verb] : kVerbs) {
        if (IsWord(sql.substr(0, word.size()), word)) return verb;
    }
    return Verb::other;
}

// Bytes from the start of a text to a character of it, from 1.
std::uint32_t OffsetOf(std::string_view text, const char* position) {
    auto characters = position ? std::strtoul(position, nullptr, 10) : 1;
    std::size_t at = 0;
    for (; characters > 1 && at < text.size(); --characters) {
        do ++at;
        while (at < text.size() && (text[at] & 0xC0) == 0x80);
    }
    return static_cast<std::uint32_t>(at);
}

// What a placeholder of dates is where no column tells; 0: it is of none.
Oid TimeOf(Kind kind) {
    return kind == Kind::timestamp ? oid::kTimestamp : kind == Kind::moment ? oid::kMoment : 0;
}

Status NoMemory() { return Refused(errors::kOutOfMemory); }

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

PgQuery::PgQuery(PgConnection& connection, const StatementSource& source)
    : connection_(connection),
      sql_(source.sql),
      effect_(source.effect),
      verb_(VerbOf(sql_)),
      kinds_(source.parameters.begin(), source.parameters.end()),
      text_(sql_) {
    if (effect_ == Effect::controls) savepoint_ = PgConnection::ReadSavepoint(sql_);
}

PgQuery::~PgQuery() {
    Close();
    connection_.Forget(name_);
    connection_.Forget(whole_name_);
}

// ---- Preparing

// What a date is compared with tells whether it goes with a zone; where that is no date at all, it is one all the same.
bool PgQuery::RetypesTimes(std::vector<Oid>& types) const {
    bool any = false;
    types = bound_.Types();
    for (std::size_t index = 0; index < kinds_.size(); ++index) {
        const Oid time = TimeOf(kinds_[index]);
        const bool misread = time != 0 && types[index] != oid::kTimestamp && types[index] != oid::kMoment;
        types[index] = misread ? time : TypeOf(kinds_[index]);
        any = any || misread;
    }
    return any;
}

// insert ... values, of one row or a few: whose row ids are few, too.
bool PgQuery::InsertsRows() const {
    if (verb_ != Verb::insert) return false;
    const std::string lower = Lower(sql_);
    const auto has = [&](const char* words) { return lower.find(words) != std::string::npos; };
    return has("values") && !has("select") && !has("returning");
}

// Some of what is asked on the way may fail, but not if it takes the transaction with it.
Status PgQuery::Prepare(std::uint32_t& error_offset) {
    if (savepoint_.verb != PgConnection::SavepointCommand::Verb::none) return {};
    const bool within = connection_.InTransaction();
    Status status = PrepareText(error_offset);
    const bool lost = within && !connection_.InTransaction() && !connection_.Server().Broken();
    return lost && !connection_.Loss().Ok() ? connection_.Loss() : status;
}

// A row's place is told by the insert itself, where the table has such a thing.
Status PgQuery::PrepareText(std::uint32_t& error_offset) {
    tail_ = InsertsRows() ? kReturningRow : std::string_view();
    Status status = PrepareTyped(error_offset);
    if (!tail_.empty() && !status.Ok() && !connection_.Server().Broken()) {
        tail_ = {};
        status = PrepareTyped(error_offset);
    }
    return status.Ok() && !lobs_.empty() ? PrepareLobs() : status;
}

// A list with large objects is asked for with the places of its rows, where the server can tell them. Without them only
// those come that the server keeps for themselves. What a delete returns has no place any more: the values come whole.
Status PgQuery::PrepareLobs() {
    std::string text;
    if (verb_ != Verb::remove) text = WithPlaces(text_, columns_.size(), lobs_, connection_.Server().ServerHasUtf8());
    Result description;
    std::uint32_t offset = 0;
    std::string name = connection_.NewName();
    const auto fields = static_cast<int>(columns_.size() + lobs_.size() + kFieldsOfPlace);
    Status status = text.empty() ? Refused(errors::kUnsupported) : SendPrepared(name, text, bound_.Types(), description, offset);
    if (connection_.Server().Broken() || IsPassing(status)) return status;
    has_places_ = status.Ok() && PQnfields(description.get()) == fields;
    if (has_places_) connection_.Forget(std::exchange(name_, std::move(name)));
    else if (status.Ok()) connection_.Forget(name);
    if (!has_places_) std::erase_if(lobs_, [](const LobItem& item) { return !item.column->is_object; });
    at_hand_.lobs.resize(lobs_.size());
    return {};
}

std::vector<Oid> PgQuery::DeclaredTypes() const {
    std::vector<Oid> types;
    for (const Kind kind : kinds_) types.push_back(TypeOf(kind));
    return types;
}

Status PgQuery::PrepareTyped(std::uint32_t& error_offset) {
    std::vector<Oid> types = DeclaredTypes();
    text_ = sql_;
    makes_object_.clear();
    Status status = PrepareForObjects(PrepareAs(types, error_offset), error_offset);
    if (connection_.Server().Broken()) return status;
    if (status.Number() == errors::kInconsistentTypes) {    // a type that nothing tells
        std::vector<Oid> told = types;
        for (std::size_t index = 0; index < told.size(); ++index) {
            if (const Oid time = TimeOf(kinds_[index]); told[index] == 0) told[index] = time != 0 ? time : oid::kText;
        }
        if (told == types) return status;
        Status again = PrepareAs(told, error_offset);
        return again.Ok() ? again : connection_.Server().OrLoss(std::move(status));
    }
    if (!status.Ok()) return status;
    const bool retypes = RetypesTimes(types);
    if (retypes) status = PrepareAs(types, error_offset);
    return status.Ok() ? PrepareForTexts(std::move(types), error_offset) : status;
}

Status PgQuery::PrepareAs(const std::vector<Oid>& types, std::uint32_t& error_offset) {
    connection_.Forget(name_);
    connection_.Forget(std::exchange(whole_name_, {}));
    whole_ = Whole::unknown;
    name_.clear();
    std::string name = connection_.NewName();
    Result description;
    Status status = SendPrepared(name, text_ + std::string(tail_), types, description, error_offset);
    if (!status.Ok()) return status;
    name_ = std::move(name);
    return Describe(description.get());
}

Status PgQuery::SendPrepared(const std::string& name, const std::string& text, const std::vector<Oid>& types,
                             Result& description, std::uint32_t& error_offset) {
    Wire& server = connection_.Server();
    const PgConnection::Guard guard = connection_.SendGuard(false);
    server.SendPrepare(name.c_str(), text.c_str(), types);
    server.SendDescribe(name.c_str());
    connection_.SendRelease(guard);
    Status status = connection_.PassGuard(guard);
    for (int command = 0; status.Ok() && command < 2;) {
        Result result = server.Next();
        if (!result) ++command;
        else if (IsFailure(result.get())) {
            status = server.Answer(result.get());
            error_offset = OffsetOf(sql_, PQresultErrorField(result.get(), PG_DIAG_STATEMENT_POSITION));
        } else description = std::move(result);
    }
    Status rest = server.Drain();
    return connection_.Settle(guard, status.Ok() ? std::move(rest) : std::move(status));
}

// Throws before anything is changed, or the query is none.
Status PgQuery::Describe(const PGresult* result) {
    std::vector<Oid> types;
    for (int index = 0; index < PQnparams(result); ++index) {
        const Oid type = PQparamtype(result, index);
        Oid base = type;
        if (Status status = connection_.BaseType(base); !status.Ok()) return status;
        types.push_back(base == oid::kBytes || IsTextType(base) ? base : type);
    }
    parameters_.resize(types.size());
    bound_.SetTypes(std::move(types));
    return DescribeColumns(result);
}

Status PgQuery::DescribeColumns(const PGresult* result) {
    const int count = tail_.empty() ? PQnfields(result) : 0;
    lobs_.clear();
    has_places_ = false;
    columns_.assign(static_cast<std::size_t>(count), {});
    at_hand_.rooms.resize(columns_.size());
    at_hand_.values.resize(columns_.size());
    readers_.resize(columns_.size());
    binary_ = true;
    for (int index = 0; index < count; ++index) binary_ = binary_ && BinaryReader(PQftype(result, index));
    for (int index = 0; index < count; ++index) {
        const auto place = static_cast<std::size_t>(index);
        const Oid type = PQftype(result, index);
        DescribeType(type, PQfmod(result, index), columns_[place]);
        const std::string_view name = PQfname(result, index);
        columns_[place].name = name == "ctid" ? "ROWID" : ShownName(name);
        readers_[place] = binary_ ? BinaryReader(type) : TextReader(type);
        if (const Reader reader = IntervalReader(columns_[place], binary_)) readers_[place] = reader;
        const Oid table = PQftable(result, index);
        const auto number = static_cast<std::size_t>(std::max(PQftablecol(result, index), 0));
        if (table == 0 || number == 0) continue;
        std::shared_ptr<const Table> known;
        if (Status status = connection_.TableOf(table, known); !status.Ok()) return status;
        if (number >= known->columns.size()) continue;
        const TableColumn& column = known->columns[number];
        DescribeColumn(type, PQfmod(result, index), column.domain, columns_[place]);
        columns_[place].nullable = column.described.nullable;
        if (const Reader reader = IntervalReader(columns_[place], binary_)) readers_[place] = reader;
        if (IsLob(columns_[place])) readers_[place] = binary_ ? WholeBinaryReader(type) : WholeTextReader(type);
        if (auto lob = LobColumnOf(*known, number, columns_[place])) lobs_.push_back({place, std::move(lob)});
    }
    return {};
}

// The tables are others than they were, or somebody has thrown the server's statements away. With places behind it a list
// of all columns that has got longer or shorter is none at all.
bool PgQuery::IsStale(const Status& status) const {
    const int number = status.Number();
    return number == errors::kSchemaChanged || number == 1003 ||
           (has_places_ && (number == errors::kInvalidStatement || number == errors::kInconsistentTypes));
}

Status PgQuery::PrepareAnew() {
    std::uint32_t offset = 0;
    return Prepare(offset);
}

// Whether what failed is prepared anew; if that fails, this is the answer.
bool PgQuery::Renews(Status& failure) {
    if (!IsStale(failure)) return false;
    Status anew = PrepareAnew();
    const bool is_new = anew.Ok();
    if (!is_new) failure = std::move(anew);
    return is_new;
}

// ---- Executions

Status PgQuery::Load(RowSource& source, std::uint32_t row) noexcept try {
    Status status = parameters_.empty() ? Status() : source.Row(row, parameters_);
    return status.Ok() ? bound_.Set(parameters_) : status;
} catch (const std::bad_alloc&) {
    return NoMemory();
}

// Whether the row joins the batch. Behind others nothing can be asked of the server: a row that fails there begins the next
// batch instead.
bool PgQuery::LoadForBatch(RowSource& source, std::uint32_t row, bool heeds, Batch& batch) noexcept {
    Status status = Load(source, row);
    const bool stops = status.Ok() && heeds && connection_.Server().Asked();
    if (stops) {
        status = PgConnection::Stopped();
        batch.stop = row;
    }
    if (status.Ok()) return true;
    batch.refused = stops || batch.sent == 0;
    if (batch.refused) batch.refusal = std::move(status);
    return false;
}

// Before the statement is sent: what was known of rows before may be so no more.
PgConnection::Guard PgQuery::Begin(bool needs) noexcept {
    since_ = connection_.Large().Now();
    ran_at_ = connection_.Large().StatementRuns();
    return connection_.SendGuard(needs);
}

Status PgQuery::ExecuteArray(RowSource& source, const ArrayRun& run, ArrayOutcome& outcome) {
    Close();
    if (connection_.Server().Asked()) return PgConnection::Stopped();
    outcome.failures.reserve(outcome.failures.size() + 2);
    const bool undoes = savepoint_.verb == PgConnection::SavepointCommand::Verb::undo;
    if (undoes && connection_.CheckSavepoint(savepoint_).Ok()) connection_.Large().Forget();    // what it would undo
    if (Status status = connection_.Enter(effect_); !status.Ok()) return status;
    if (savepoint_.verb != PgConnection::SavepointCommand::Verb::none) return ExecuteSavepoint(outcome);
    if (effect_ == Effect::changes) return ExecuteRows(source, run, outcome);
    for (std::uint32_t row = run.first; row < run.last; ++row) {
        Status status = ExecuteOnce(source, row, outcome);
        if (status.Ok()) continue;
        outcome.failures.push_back({row, std::move(status)});
        break;
    }
    return {};
}

// Within the transaction, if there is one.
Status PgQuery::ExecuteOnce(RowSource& source, std::uint32_t row, ArrayOutcome& outcome) {
    Status status = Load(source, row);
    if (!status.Ok()) return status;
    Wire& server = connection_.Server();
    for (int runs = 0; runs == 0 || (runs == 1 && Renews(status)); ++runs) {
        const PgConnection::Guard guard = Begin(false);
        server.SendExecute(name_.c_str(), bound_.Values(), binary_);
        connection_.SendRelease(guard);
        const Wire::Heeding heeding(server);
        status = connection_.PassGuard(guard);
        Status rest = server.Drain();
        status = connection_.Settle(guard, status.Ok() ? std::move(rest) : std::move(status), since_);
    }
    if (status.Ok()) ++outcome.executed;
    return status;
}

Status PgQuery::ExecuteSavepoint(ArrayOutcome& outcome) {
    Status status = connection_.CheckSavepoint(savepoint_);
    Wire& server = connection_.Server();
    if (status.Ok()) {
        const bool begins = !connection_.InTransaction();
        const PgConnection::Guard guard = begins ? PgConnection::Guard::began : PgConnection::Guard::none;
        if (begins) server.Send("begin");
        server.Send(sql_.c_str());
        server.Sync();
        status = connection_.Settle(guard, server.Drain());
        if (status.Ok()) connection_.NoteSavepoint(savepoint_);
    }
    if (status.Ok()) ++outcome.executed;
    else outcome.failures.push_back({0, std::move(status)});
    return {};
}

// ---- Arrays

// A batch is all done or not done at all: of one with a failure the rows before it are run again. Rows that fail one
// after the other make batches small. A stop holds for the row that it was met at; those before it are done.
Status PgQuery::ExecuteRows(RowSource& source, const ArrayRun& run, ArrayOutcome& outcome) {
    const bool delivers = run.returned && !columns_.empty();
    Wire& server = connection_.Server();
    std::uint32_t size = kLargestBatch;
    std::uint32_t stop = run.last;
    std::uint32_t singly = run.first;    // rows below go one by one
    bool renewed = false;
    for (std::uint32_t row = run.first; row < run.last;) {
        const bool was_in_transaction = connection_.InTransaction();
        const std::size_t told = server.Told();
        const std::uint32_t last = std::min(stop, row + std::min(run.last - row, size));
        Batch batch;
        const bool whole = row >= singly && !delivers && stop == run.last && PrepareWhole(run.last - row);
        if (was_in_transaction && !connection_.InTransaction()) return connection_.Loss();
        if (server.Broken()) return server.Loss();
        if (whole) {
            batch = TryWhole(source, row, run.last);
            singly = row + std::max(batch.sent, 1U);
            if (batch.refusal.Number() == errors::kCancelled) stop = singly;
            if (!batch.failure.Ok() && connection_.InTransaction() == was_in_transaction && !server.Broken()) {
                server.Untell(told, server.Told());
                continue;
            }
        } else if (row == stop) batch.refusal = PgConnection::Stopped();
        else if (delivers) batch = RunReturning(source, row, last, stop == run.last, *run.returned);
        else batch = RunBatch(source, row, last, stop == run.last);
        if (batch.refusal.Number() == errors::kCancelled) stop = row + batch.sent;
        stop = batch.stop.value_or(stop);
        Status failure = batch.failure;
        while (!failure.Ok() && batch.done > 0 && connection_.InTransaction() == was_in_transaction && !server.Broken()) {
            const std::uint32_t before = batch.done;
            server.Untell(told, batch.told);
            const std::size_t own = server.Told() - std::min(told, server.Told());    // of the row that fails
            batch = RunBatch(source, row, row + before, false);
            if (batch.failure.Ok() && batch.sent == before) {    // it is the row behind them that fails
                server.TellLast(told, told + own);
                break;
            }
            server.Untell(told, told + own);
            batch.told -= std::min(own, batch.told);
            failure = batch.failure;
        }
        if (batch.failure.Ok()) {
            outcome.executed += batch.sent;
            outcome.affected += batch.affected;
            if (batch.affected > 0) {
                connection_.NoteChange();
                outcome.last_row = batch.last_row;    // none of rows that went whole
            }
            row += batch.sent;
        }
        size = failure.Ok() ? std::min(2 * size, kLargestBatch) : std::max(size / 8, 1U);
        if (failure.Ok()) failure = std::move(batch.refusal);
        if (failure.Ok()) continue;
        const auto is_lost = [&] { return server.Broken() || (was_in_transaction && !connection_.InTransaction()); };
        if (!is_lost() && !std::exchange(renewed, renewed || IsStale(failure)) && Renews(failure)) continue;
        if (is_lost()) return failure;
        const bool stops = !run.all_rows || failure.Number() == errors::kCancelled;
        outcome.failures.push_back({row, std::move(failure)});
        if (stops) break;
        ++row;
        if (HasRoom(outcome.failures)) continue;
        if (row < run.last) outcome.failures.push_back({row, NoMemory()});
        break;
    }
    return {};
}

// Sends what can be sent of the rows [first, last), and reads the answers.
PgQuery::Batch PgQuery::RunBatch(RowSource& source, std::uint32_t first, std::uint32_t last, bool heeds) {
    Wire& server = connection_.Server();
    Batch batch;
    std::size_t bytes = 0;
    PgConnection::Guard guard = PgConnection::Guard::none;
    for (std::uint32_t row = first; row < last && bytes < kBatchBytes; ++row) {
        if (!LoadForBatch(source, row, heeds, batch)) break;
        if (batch.sent == 0) guard = Begin(true);
        server.SendExecute(name_.c_str(), bound_.Values(), binary_);
        bytes += bound_.Bytes();
        if (++batch.sent % kRowsBetweenPushes == 0) server.Push();
    }
    if (batch.sent == 0) return batch;
    connection_.SendRelease(guard);
    const Wire::Heeding heeding(server, heeds && !batch.refused);
    batch.failure = connection_.PassGuard(guard);
    if (batch.failure.Ok()) ReadBatch(batch);
    const bool all_done = batch.failure.Ok();
    Status rest = server.Drain();
    if (all_done) batch.failure = std::move(rest);
    batch.failure = connection_.Settle(guard, std::move(batch.failure), since_);
    if (all_done && !batch.failure.Ok()) batch.done = 0;    // the end of the batch has failed: none of its rows is to blame
    return batch;
}

void PgQuery::ReadBatch(Batch& batch) noexcept {
    Wire& server = connection_.Server();
    batch.told = server.Told();
    while (batch.done < batch.sent && batch.failure.Ok()) {
        const Result result = server.Next();
        if (server.Broken() && !result) return;
        if (!result) {
            ++batch.done;
            batch.told = server.Told();
        } else if (IsFailure(result.get())) batch.failure = server.Answer(result.get(), verb_);
        else {
            batch.affected += AffectedBy(result.get());
            const int rows = tail_.empty() ? 0 : PQntuples(result.get());
            if (rows > 0) batch.last_row = RowIdOf(PQgetvalue(result.get(), rows - 1, 0));
        }
    }
}

}  // namespace engine::postgres
