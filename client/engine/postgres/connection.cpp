// Compiling, transactions, marks and savepoints.
#include "engine/postgres/connection.h"

#include <algorithm>
#include <cstdio>
#include <new>
#include <utility>

#include "engine/postgres/lob_store.h"
#include "engine/pieces.h"
#include "engine/postgres/query.h"
#include "engine/postgres/question.h"
#include "engine/postgres/types.h"
#include "handles/errors.h"

namespace engine::postgres {
namespace {

constexpr const char* kSetGuard = "savepoint kelp_guard";
constexpr const char* kUndoGuard = "rollback to savepoint kelp_guard";
constexpr const char* kDropGuard = "release savepoint kelp_guard";
constexpr std::size_t kForgottenAtOnce = 20;
constexpr const char* kNoLockWait = "1ms";    // the least; 0 is for ever

constexpr const char* kBegins[] = {"begin", "begin isolation level repeatable read, read only",
                                   "begin isolation level serializable"};

// A command with a mark's name in it; without memory.
struct MarkText {
    char text[48];
    MarkText(const char* command, unsigned mark) { std::snprintf(text, sizeof text, "%s kelp_mark_%u", command, mark); }
};

}  // namespace

PgConnection::PgConnection(std::shared_ptr<Home> home, Credentials credentials, std::unique_ptr<class Wire> wire)
    : home_(std::move(home)), credentials_(std::move(credentials)), wire_(std::move(wire)), lobs_(std::make_unique<PgLobStore>(*this)) {
    wire_->notices = &notices_;
}

PgConnection::~PgConnection() = default;    // the server rolls back what is open

Status PgConnection::Stopped() { return Refused(errors::kCancelled); }

// ---- Making way

Status PgConnection::Enter() {
    if (wire_->Broken()) return wire_->Lost();
    if (streaming_) streaming_->ReadAhead();
    if (wire_->Broken()) return wire_->Loss();
    if (!wire_->Idle()) return Refused(errors::kInternalError, "a batch is under way");
    if (!path_stands_) {
        if (Status status = SetPath(); !status.Ok()) return status;
    }
    const bool forgets = forgotten_.size() >= kForgottenAtOnce && !in_transaction_;    // a failure would end it
    if (!forgets) return wire_->Loss();
    for (const std::string& command : forgotten_) wire_->Send(command.c_str());
    wire_->Sync();
    forgotten_.clear();
    (void)wire_->Drain();
    return wire_->Loss();
}

Status PgConnection::Enter(Effect effect) {
    if (Status status = Enter(); !status.Ok()) return status;
    if (effect == Effect::defines) {
        tables_.clear();
        if (Status status = Commit(); status.Failed()) return status;
    }
    if (Status status = TellLockWait(); !status.Ok()) return status;
    if (Status status = lobs_->Settle(); status.Failed()) return status;
    return {};
}

// What was set in the transaction may have been taken back.
void PgConnection::ForgetLockWait() noexcept {
    if (!lock_timeout_.empty()) local_waits_.reset();
}

// Before a statement. Most sessions never wish for anything else than what they have.
Status PgConnection::TellLockWait() {
    if (local_waits_ == waits_) return {};
    Result result;
    if (lock_timeout_.empty()) {
        Status status = Ask("select pg_catalog.current_setting('lock_timeout')", {}, result);
        if (!status.Ok()) return status;
        lock_timeout_ = PQgetvalue(result.get(), 0, 0);
    }
    const bool within = in_transaction_;
    Status status = Ask("select pg_catalog.set_config('lock_timeout', $1, $2::bool)",
                        {waits_ ? lock_timeout_ : kNoLockWait, within ? "true" : "false"}, result);
    if (!status.Ok()) return status;
    if (!within) session_waits_ = waits_;
    local_waits_ = waits_;
    return status;
}

LobStore* PgConnection::Lobs() { return lobs_.get(); }

void PgConnection::Note() noexcept {
    const PGTransactionStatusType state = wire_->Transaction();
    const bool before = std::exchange(in_transaction_, !wire_->Broken() && (state == PQTRANS_INTRANS || state == PQTRANS_INERROR));
    if (!before && in_transaction_) {
        lobs_->TransactionBegins();
        loss_ = {};
    }
    if (before && !in_transaction_) {
        lobs_->Forget();
        SomethingUndone(0);
        path_may_go_ = changed_ = false;
    }
    if (in_transaction_) return;
    savepoints_.clear();
    local_waits_ = session_waits_;
}

PgConnection::Guard PgConnection::SendGuard(bool needs) noexcept {
    if (in_transaction_) {
        wire_->Send(kSetGuard);
        wire_->Flush();
        return Guard::savepoint;
    }
    if (!needs) return Guard::none;
    wire_->Send(kBegins[0]);
    return Guard::began;
}

// A stop that met the savepoint would leave nothing to go back to: only what follows is stopped.
Status PgConnection::PassGuard(Guard guard) noexcept {
    if (guard == Guard::began) return wire_->Pass(1);
    const Wire::Heeding undisturbed(*wire_, false);
    return guard == Guard::none ? Status() : wire_->Pass(1);
}

void PgConnection::SendRelease(Guard guard) noexcept {
    if (guard == Guard::savepoint) wire_->Send(kDropGuard);
    wire_->Sync();
}

Status PgConnection::Settle(Guard guard, Status status, std::uint64_t since) noexcept {
    const Wire::Heeding undisturbed(*wire_, false);
    Note();
    if (!status.Ok()) status = wire_->OrLoss(std::move(status));
    if (status.Ok() || !in_transaction_) return guard == Guard::savepoint && status.Failed() ? Undone(status) : status;
    if (guard == Guard::savepoint) {
        wire_->Send(kUndoGuard);
        wire_->Send(kDropGuard);
        wire_->Sync();
        const Status undone = wire_->Drain();
        if (since != kNothing) SomethingUndone(since);
        Note();
        return undone.Ok() ? status : Lose(status);
    }
    if (guard == Guard::none && wire_->Transaction() == PQTRANS_INTRANS) return status;
    (void)wire_->Run("rollback");
    Note();
    return guard == Guard::none ? Undone(status) : wire_->OrLoss(std::move(status));
}

// The server has given the transaction up with a failure.
Status PgConnection::Lose(const Status& failure) noexcept {
    (void)wire_->Run("rollback");
    Note();
    return Undone(failure);
}

Status PgConnection::Undone(const Status& failure) noexcept { return loss_ = RolledBack(wire_->OrLoss(failure)); }

Status PgConnection::DropGuard() noexcept { return wire_->Run(kDropGuard); }

// ---- Statements

Status PgConnection::Compile(const StatementSource& source, std::unique_ptr<Query>& query,
                             std::uint32_t& error_offset) {
    try {
        if (Status status = Enter(); !status.Ok()) return status;
        if (Status status = TellLockWait(); !status.Ok()) return status;
        auto made = std::make_unique<PgQuery>(*this, source);
        if (Status status = made->Prepare(error_offset); !status.Ok()) return status;
        query = std::move(made);
        return {};
    } catch (const std::bad_alloc&) {    // between questions: what has been sent is answered
        return Refused(errors::kOutOfMemory);
    }
}

std::string PgConnection::NewName() { return "kelp_" + std::to_string(++names_); }

// There is nothing to be done about a name that no memory is left for: it stays with the server until the session ends.
void PgConnection::Forget(const std::string& name) noexcept try {
    if (!name.empty() && !wire_->Broken()) forgotten_.push_back("deallocate " + name);
} catch (const std::bad_alloc&) {
}

Status PgConnection::Ask(const char* sql, const std::vector<std::string>& values, Result& result) {
    const Question question(values);
    return AskGuarded(sql, question.values, result, false);
}

Status PgConnection::AskGuarded(const std::string& sql, const Wire::Values& values, Result& result, bool binary_results) {
    if (Status status = Enter(); !status.Ok()) return status;
    const Guard guard = SendGuard(false);
    wire_->SendQuery(sql.c_str(), values, binary_results);
    SendRelease(guard);
    Status status = PassGuard(guard);
    while (status.Ok()) {
        Result next = wire_->Next();
        if (!next) break;
        if (PQresultStatus(next.get()) == PGRES_FATAL_ERROR) status = wire_->Answer(next.get());
        else result = std::move(next);
    }
    Status rest = wire_->Drain();
    status = Settle(guard, status.Ok() ? std::move(rest) : std::move(status));
    const bool has_rows = result && PQresultStatus(result.get()) == PGRES_TUPLES_OK;
    return status.Ok() && !has_rows ? Refused(errors::kInternalError, "an answer without rows") : status;
}

Status PgConnection::ReadTable(Oid table, Table& read) {
    const std::string number = std::to_string(table);
    Result result;
    Status status = AskGuarded(
        "select a.attnum::text, pg_catalog.format('%I', a.attname), a.attname, a.attnotnull::text,"
        " case when t.typtype = 'd' then t.typtypmod else a.atttypmod end::text,"
        " case when t.typtype = 'd' then t.typbasetype else t.oid end::text,"
        " case when t.typnamespace = pg_catalog.to_regnamespace('kelp') or (t.typname = 'lo' and t.typbasetype = 26)"
        " then t.typname else '' end,"
        " pg_catalog.format('%I.%I', n.nspname, c.relname), c.relkind::text from pg_catalog.pg_class c"
        " join pg_catalog.pg_namespace n on n.oid = c.relnamespace join pg_catalog.pg_attribute a on a.attrelid = c.oid"
        " join pg_catalog.pg_type t on t.oid = a.atttypid"
        " where c.oid = $1::oid and a.attnum > 0 and not a.attisdropped order by a.attnum",
        {{number.c_str()}, {0}, {0}}, result);
    for (int row = 0; status.Ok() && row < PQntuples(result.get()); ++row) {
        const auto text = [&](int column) { return PQgetvalue(result.get(), row, column); };
        const auto place = static_cast<std::size_t>(std::atoi(text(0)));
        read.columns.resize(place + 1);
        TableColumn& column = read.columns[place];
        column.name = text(1);
        column.domain = text(6);
        DescribeColumn(static_cast<Oid>(std::strtoul(text(5), nullptr, 10)), std::atoi(text(4)), column.domain, column.described);
        column.described.name = ShownName(text(2));
        column.described.nullable = *text(3) == 'f';
        read.name = text(7);
        read.has_rows = *text(8) == 'r';
    }
    return status;
}

Status PgConnection::TableOf(Oid table, std::shared_ptr<const Table>& known) {
    if (const auto found = tables_.find(table); found != tables_.end()) {
        known = found->second;
        return {};
    }
    auto made = std::make_shared<Table>();
    if (Status status = ReadTable(table, *made); !status.Ok()) return status;
    known = tables_[table] = std::move(made);
    return {};
}

Status PgConnection::BaseType(Oid& type) {
    constexpr Oid kFirstMade = 16384;    // by users
    if (type < kFirstMade) return {};
    if (const auto known = base_types_.find(type); known != base_types_.end()) {
        type = known->second.type;
        return {};
    }
    const std::string number = std::to_string(type);
    Result result;
    Status status = AskGuarded("select typbasetype, typname from pg_catalog.pg_type where oid = $1::oid and typtype = 'd'",
                               {{number.c_str()}, {0}, {0}}, result);
    if (!status.Ok()) return status;
    BaseOfType base{type, false};
    if (PQntuples(result.get()) == 1) {
        base.type = Get<std::uint32_t>(PQgetvalue(result.get(), 0, 0));
        base.is_object = base.type == oid::kOid && PQgetvalue(result.get(), 0, 1) == kObjectDomain;
    }
    base_types_[type] = base;
    type = base.type;
    return {};
}

bool PgConnection::IsObjectType(Oid type) const {
    const auto known = base_types_.find(type);
    return known != base_types_.end() && known->second.is_object;
}

// ---- Transactions

// The server takes the picture of what a transaction sees with its first question: that is asked at once.
Status PgConnection::Begin(TransactionMode mode) {
    if (Status status = Enter(); !status.Ok() || in_transaction_) return status;
    const char* const begin = kBegins[static_cast<std::size_t>(mode)];
    if (mode == TransactionMode::read_write) return Settle(Guard::began, wire_->Run(begin));
    wire_->Send(begin);
    wire_->Send("select 1");
    wire_->Sync();
    return Settle(Guard::began, wire_->Drain());
}

// A constraint that was deferred and fails at the end undoes the transaction.
Status PgConnection::Commit() {
    if (wire_->Broken()) return wire_->Lost();
    if (!in_transaction_) return {};
    if (Status status = Enter(); !status.Ok()) return status;
    if (Status settled = lobs_->Settle(); settled.Failed()) {
        if (settled.Number() == errors::kOutOfMemory && in_transaction_) return settled;    // nothing is lost
        return Lose(settled);
    }
    Status status = wire_->Run("commit");
    Note();
    if (in_transaction_) return Lose(status);
    const bool violated = status.Number() == 1 || status.Number() == errors::kParentMissing ||
                          status.Number() == errors::kChildFound || status.Number() == errors::kCheckViolated;
    return violated ? Refused(errors::kRolledBack, status.Detail()) : status;
}

Status PgConnection::Rollback() {
    if (wire_->Broken()) return wire_->Lost();
    if (!in_transaction_) return {};
    if (Status status = Enter(); !status.Ok()) return status;
    lobs_->Forget();
    Status status = wire_->Run("rollback");
    Note();
    return !status.Ok() && in_transaction_ ? Lose(status) : status;
}

Status PgConnection::Ping() {
    if (Status status = Enter(); !status.Ok()) return status;
    wire_->Sync();
    return wire_->Drain();
}

// ---- Marks

std::size_t PgConnection::LastMark() const noexcept {
    const auto found = std::find_if(savepoints_.rbegin(), savepoints_.rend(),
                                    [](const Savepoint& savepoint) { return savepoint.mark != 0; });
    return found == savepoints_.rend() ? savepoints_.size()
                                       : static_cast<std::size_t>(savepoints_.rend() - found) - 1;
}

Status PgConnection::SetMark() {
    if (Status status = Enter(); !status.Ok()) return status;
    if (Status status = lobs_->Settle(); status.Failed()) return status;
    savepoints_.reserve(savepoints_.size() + 1);
    const Guard guard = in_transaction_ ? Guard::none : Guard::began;
    if (guard == Guard::began) wire_->Send(kBegins[0]);
    const MarkText command("savepoint", ++marks_);
    wire_->Send(command.text);
    wire_->Sync();
    Status status = Settle(guard, wire_->Drain());
    if (status.Ok()) savepoints_.push_back({{}, marks_, lobs_->Now()});
    return status;
}

Status PgConnection::UndoToMark() {
    const std::size_t mark = LastMark();
    if (mark == savepoints_.size()) return Refused(errors::kNoSuchSavepoint);
    if (Status status = Enter(); !status.Ok()) return status;
    lobs_->Forget();
    SomethingUndone(savepoints_[mark].at);
    Status status = wire_->Run(MarkText("rollback to savepoint", savepoints_[mark].mark).text);
    Note();
    if (!status.Ok()) return Lose(status);
    ForgetLockWait();
    savepoints_.erase(savepoints_.begin() + static_cast<std::ptrdiff_t>(mark) + 1, savepoints_.end());
    return status;
}

// With savepoints behind it the server's stays, for its end would be theirs.
Status PgConnection::DropMark() {
    const std::size_t mark = LastMark();
    if (mark == savepoints_.size()) return Refused(errors::kNoSuchSavepoint);
    if (Status status = Enter(); !status.Ok()) return status;
    Status status;
    if (mark + 1 == savepoints_.size()) status = wire_->Run(MarkText("release savepoint", savepoints_[mark].mark).text);
    Note();
    if (!status.Ok()) return Lose(status);
    savepoints_.erase(savepoints_.begin() + static_cast<std::ptrdiff_t>(mark));
    return status;
}

// ---- Savepoints of applications

// What has more behind its name is left to the server, as a statement like any other.
PgConnection::SavepointCommand PgConnection::ReadSavepoint(std::string_view sql) {
    const PieceList pieces = Split(sql);
    std::size_t at = 0;
    const auto takes = [&](std::string_view word) {
        const bool is_there = at < pieces.size() && IsWord(pieces[at], word);
        at += is_there;
        return is_there;
    };
    SavepointCommand command;
    if (takes("savepoint")) {
        command.verb = SavepointCommand::Verb::set;
    } else if (takes("release")) {
        command.verb = SavepointCommand::Verb::drop;
        (void)takes("savepoint");
    } else if (takes("rollback")) {
        command.verb = SavepointCommand::Verb::undo;
        (void)(takes("work") || takes("transaction"));
        if (!takes("to")) return {};
        (void)takes("savepoint");
    }
    if (at == 0 || at == pieces.size() || !IsName(pieces[at])) return {};
    const std::string_view name = pieces[at++];
    if (at < pieces.size()) return {};
    command.name = PlainName(name);
    if (command.name.empty()) return {};
    if (!name.starts_with('"')) command.name = Lower(command.name);
    return command;
}

Status PgConnection::CheckSavepoint(const SavepointCommand& command) {
    if (command.verb == SavepointCommand::Verb::set) {
        savepoints_.reserve(savepoints_.size() + 1);
        return {};
    }
    const bool known = std::any_of(savepoints_.begin(), savepoints_.end(),
                                   [&](const Savepoint& savepoint) { return savepoint.name == command.name; });
    return known ? Status() : Refused(errors::kNoSuchSavepoint);
}

// The server has done it: what stands behind a savepoint is gone with it.
void PgConnection::NoteSavepoint(const SavepointCommand& command) {
    if (command.verb == SavepointCommand::Verb::set) {
        savepoints_.push_back({command.name, 0, lobs_->Now()});
        return;
    }
    const auto found = std::find_if(savepoints_.rbegin(), savepoints_.rend(),
                                    [&](const Savepoint& savepoint) { return savepoint.name == command.name; });
    if (command.verb == SavepointCommand::Verb::undo) SomethingUndone(found->at);
    ForgetLockWait();
    const auto kept = found.base() - (command.verb == SavepointCommand::Verb::drop ? 1 : 0);
    savepoints_.erase(kept, savepoints_.end());
}

}  // namespace engine::postgres
