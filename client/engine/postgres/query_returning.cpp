// Changes that return rows: executions go in batches, each behind a savepoint of its own, so that one that fails, or whose
// rows are refused, is undone with those behind it. Rows are handed on when all of a batch have come.
#include <algorithm>
#include <cstdio>
#include <new>

#include "engine/postgres/query.h"
#include "handles/errors.h"

namespace engine::postgres {
namespace {

constexpr std::uint32_t kMostRows = 64;    // subtransactions that a server follows with ease
constexpr std::size_t kMostBytes = std::size_t{1} << 20;

// Of the row of that index in its batch, from 1: the first row has the statement's guard.
struct RowCommand {
    char text[56];
    RowCommand(const char* command, std::uint32_t row) { std::snprintf(text, sizeof text, "%s kelp_row_%u", command, row); }
};

}  // namespace

PgConnection::Guard PgQuery::SendReturning(RowSource& source, std::uint32_t first, std::uint32_t last, bool heeds,
                                           Batch& batch) {
    Wire& server = connection_.Server();
    PgConnection::Guard guard = PgConnection::Guard::none;
    std::size_t bytes = 0;
    for (std::uint32_t row = first; row < last && bytes < kMostBytes; ++row) {
        if (!LoadForBatch(source, row, heeds, batch)) break;
        if (batch.sent == 0) guard = Begin(true);
        else server.Send(RowCommand("savepoint", batch.sent).text);
        server.SendExecute(name_.c_str(), bound_.Values(), binary_);
        bytes += bound_.Bytes();
        ++batch.sent;
    }
    if (batch.sent > 0) server.Sync();
    return guard;
}

// The failure is of the row behind those that are done.
Status PgQuery::ReadReturning(PgConnection::Guard guard, bool heeds, Batch& batch, std::vector<Returned>& results) noexcept {
    Wire& server = connection_.Server();
    const Wire::Heeding heeding(server, heeds && !batch.refused);
    Status failure = connection_.PassGuard(guard);
    while (failure.Ok() && batch.done < batch.sent) {
        if (batch.done > 0) failure = server.Pass(1);
        if (!failure.Ok()) --batch.done;    // without a savepoint to go back to, the row before it goes, too
        if (!failure.Ok()) break;
        for (Result result = server.Next(); result; result = server.Next()) {
            if (IsFailure(result.get())) failure = server.Answer(result.get(), verb_);
            else results[batch.done].rows = std::move(result);
        }
        if (server.Broken() && failure.Ok()) failure = server.Lost();
        if (failure.Ok()) results[batch.done++].told = server.Told();
    }
    Status rest = server.Drain();
    if (!failure.Ok() || rest.Ok()) return failure;
    batch.done = 0;
    return rest;
}

// The rows from that one on. Of the first one it is the statement that is undone.
Status PgQuery::UndoRows(std::uint32_t row, const Batch& batch, std::uint64_t since) noexcept {
    if (row == 0 || row == batch.sent) return {};
    const Wire::Heeding undisturbed(connection_.Server(), false);
    connection_.SomethingUndone(since);
    return connection_.Server().Run(RowCommand("rollback to savepoint", row).text);
}

Status PgQuery::ReleaseRows(PgConnection::Guard guard, const Batch& batch) noexcept {
    if (guard == PgConnection::Guard::savepoint) return connection_.DropGuard();
    return batch.sent > 1 ? connection_.Server().Run(RowCommand("release savepoint", 1).text) : Status();
}

// What fails is answered as the refusal of the row behind those that are done.
PgQuery::Batch PgQuery::RunReturning(RowSource& source, std::uint32_t first, std::uint32_t last, bool heeds, RowSink& sink) {
    Batch batch;
    std::vector<Returned> results(std::min(last - first, kMostRows));
    const PgConnection::Guard guard =
        SendReturning(source, first, first + static_cast<std::uint32_t>(results.size()), heeds, batch);
    if (batch.sent == 0) return batch;
    Status failure = ReadReturning(guard, heeds, batch, results);
    batch.told = connection_.Server().Told();
    connection_.Note();    // that a transaction has begun
    std::uint32_t kept = connection_.Server().Broken() ? 0 : batch.done;
    Status ended = UndoRows(kept, batch, since_);
    for (std::uint32_t row = 0; row < kept && ended.Ok(); ++row) {
        const std::uint64_t before = connection_.Large().Now();
        ran_at_ = connection_.Large().StatementRuns();    // which may have changed the rows of those before
        Status status = Deliver(results[row].rows.get(), first + row, sink);
        if (status.Ok()) {
            batch.affected += AffectedBy(results[row].rows.get());
            continue;
        }
        failure = std::move(status);
        kept = row;
        connection_.Server().Untell(results[row].told, batch.told);
        ended = UndoRows(kept, batch, before);
    }
    if (ended.Ok()) ended = kept == 0 ? failure : ReleaseRows(guard, batch);
    ended = connection_.Settle(guard, std::move(ended), since_);
    if (!ended.Ok()) {    // nothing of it is left
        kept = 0;
        batch.affected = 0;
        failure = std::move(ended);
    }
    batch.sent = kept;
    if (!failure.Ok()) batch.refusal = std::move(failure);
    return batch;
}

Status PgQuery::Deliver(const PGresult* result, std::uint32_t row, RowSink& sink) try {
    Status status;
    for (int index = 0; index < PQntuples(result) && status.Ok(); ++index) {
        status = Fill(result, index);
        if (status.Ok()) status = sink.Row(row, at_hand_.values);
    }
    return status;
} catch (const std::bad_alloc&) {
    return Refused(errors::kOutOfMemory);
}

}  // namespace engine::postgres
