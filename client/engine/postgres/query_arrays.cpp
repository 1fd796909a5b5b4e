// Arrays handed over whole: an insert of nothing but placeholders becomes one statement over arrays of their values, which
// the server takes twice as fast as single ones. What fails there is done again row by row: it knows which one fails.
#include <algorithm>
#include <new>

#include "engine/pieces.h"
#include "engine/postgres/query.h"
#include "engine/postgres/query_objects.h"
#include "handles/errors.h"

namespace engine::postgres {
namespace {

constexpr std::uint32_t kFewestRows = 8;
constexpr std::uint32_t kMostRows = 10000;
constexpr std::size_t kMostBytes = std::size_t{4} << 20;
constexpr std::size_t kHeader = 20;    // dimensions, nulls, type of the elements, their number, the first one's index

struct ElementRow {
    Oid oid;
    const char* array;
};
constexpr ElementRow kElements[] = {
    {oid::kInt8, "int8[]"},           {oid::kFloat8, "float8[]"},        {oid::kNumeric, "numeric[]"},
    {oid::kBytes, "bytea[]"},         {oid::kTimestamp, "timestamp[]"}, {oid::kMoment, "timestamptz[]"},
    {oid::kText, "text[]"},
};

// The row of what a placeholder's values are written as; null: not in a binary form.
const ElementRow* ElementOf(Oid type, Kind kind) {
    if (kind == Kind::null) return nullptr;
    if (IsTextType(type)) type = oid::kText;
    else if (kind == Kind::text) return nullptr;
    const auto* found = std::find_if(std::begin(kElements), std::end(kElements),
                                     [type](const ElementRow& row) { return row.oid == type; });
    return found == std::end(kElements) ? nullptr : found;
}

// Whether "($1, $2, ...)" with so many placeholders is all there is.
bool IsPlaceholdersAlone(std::string_view text, std::size_t count) {
    std::string pieces, expected;
    for (const std::string_view piece : Split(text)) pieces += piece;
    for (std::size_t number = 1; number <= count; ++number) expected += (number == 1 ? "($" : ",$") + std::to_string(number);
    return pieces == expected + ')';
}

}  // namespace

bool PgQuery::PrepareWhole(std::uint32_t rows) {
    if (rows < kFewestRows || whole_ == Whole::impossible) return false;
    if (whole_ == Whole::ready) return true;
    whole_ = Whole::impossible;
    try {
        return MakeWhole();
    } catch (const std::bad_alloc&) {
        return false;
    }
}

// Has the server prepare the statement over arrays, once.
bool PgQuery::MakeWhole() {
    const std::vector<Oid>& types = bound_.Types();
    const std::size_t values = Lower(sql_).find("values");
    if (!InsertsRows() || types.empty()) return false;
    if (!IsPlaceholdersAlone(std::string_view(sql_).substr(values + 6), types.size())) return false;
    std::string given, columns, arrays;
    for (std::size_t index = 0; index < types.size(); ++index) {
        const ElementRow* element = ElementOf(types[index], kinds_[index]);
        if (!element) return false;
        const std::string_view comma = index > 0 ? ", " : "";
        const std::string name = "kelp_" + std::to_string(index + 1);
        const bool makes_object = index < makes_object_.size() && makes_object_[index];
        given.append(comma).append(makes_object ? NewObject(name) : name);
        columns.append(comma).append(name);
        arrays.append(comma).append("$" + std::to_string(index + 1) + "::" + element->array);
    }
    const std::string text =
        sql_.substr(0, values) + "select " + given + " from unnest(" + arrays + ") as kelp_a(" + columns + ")";
    std::string name = connection_.NewName();
    Wire& server = connection_.Server();
    const PgConnection::Guard guard = connection_.SendGuard(false);
    server.SendPrepare(name.c_str(), text.c_str(), {});
    connection_.SendRelease(guard);
    Status status = connection_.PassGuard(guard);
    Status rest = server.Drain();
    if (!connection_.Settle(guard, status.Ok() ? std::move(rest) : std::move(status)).Ok()) return false;
    whole_name_ = std::move(name);
    whole_ = Whole::ready;
    return true;
}

void PgQuery::AppendRow() {
    const Wire::Values& values = bound_.Values();
    for (std::size_t index = 0; index < arrays_.size(); ++index) {
        std::string& array = arrays_[index];
        const std::int32_t length = values.data[index] ? values.lengths[index] : -1;
        char prefix[sizeof length];
        Put(length, prefix);
        array.append(prefix, sizeof prefix);
        if (length > 0) array.append(values.data[index], static_cast<std::size_t>(length));
    }
}

Wire::Values PgQuery::FinishArrays(std::uint32_t rows) {
    Wire::Values whole;
    for (std::size_t index = 0; index < arrays_.size(); ++index) {
        std::string& array = arrays_[index];
        const std::uint32_t header[] = {1, 1, ElementOf(bound_.Types()[index], kinds_[index])->oid, rows, 1};
        for (std::size_t place = 0; place < std::size(header); ++place) Put(header[place], array.data() + 4 * place);
        whole.data.push_back(array.data());
        whole.lengths.push_back(static_cast<int>(array.size()));
        whole.formats.push_back(1);
    }
    return whole;
}

// As RunBatch; of a failure nobody knows the row.
PgQuery::Batch PgQuery::RunWhole(RowSource& source, std::uint32_t first, std::uint32_t last) {
    Wire& server = connection_.Server();
    Batch batch;
    std::size_t bytes = 0;
    arrays_.resize(bound_.Types().size());
    for (std::string& array : arrays_) array.assign(kHeader, '\0');
    last = first + std::min(last - first, kMostRows);
    for (std::uint32_t row = first; row < last && bytes < kMostBytes; ++row) {
        batch.refusal = Load(source, row);
        if (batch.refusal.Ok() && server.Asked()) batch.refusal = PgConnection::Stopped();
        batch.refused = !batch.refusal.Ok();
        if (batch.refused) break;
        AppendRow();
        bytes += bound_.Bytes();
        ++batch.sent;
    }
    if (batch.sent == 0) return batch;
    const Wire::Values whole = FinishArrays(batch.sent);
    const PgConnection::Guard guard = Begin(true);
    server.SendExecute(whole_name_.c_str(), whole, true);
    connection_.SendRelease(guard);
    const Wire::Heeding heeding(server, !batch.refused);
    batch.failure = connection_.PassGuard(guard);
    while (batch.failure.Ok()) {
        const Result result = server.Next();
        if (!result) break;
        if (IsFailure(result.get())) batch.failure = server.Answer(result.get(), verb_);
        else batch.affected = AffectedBy(result.get());
    }
    Status rest = server.Drain();
    if (batch.failure.Ok()) batch.failure = std::move(rest);
    batch.failure = connection_.Settle(guard, std::move(batch.failure), since_);
    return batch;
}

// Short of memory before anything was sent: single rows need less.
PgQuery::Batch PgQuery::TryWhole(RowSource& source, std::uint32_t first, std::uint32_t last) noexcept {
    try {
        return RunWhole(source, first, last);
    } catch (const std::bad_alloc&) {
        Batch none;
        none.failure = Refused(errors::kOutOfMemory);
        return none;
    }
}

}  // namespace engine::postgres
