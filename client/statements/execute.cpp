// Statements: running them. Row numbers are those of the bound arrays.
#include <algorithm>
#include <utility>

#include "handles/errors.h"
#include "sessions/service_context.h"
#include "statements/rows.h"
#include "statements/statement.h"

namespace {

constexpr ub4 kExecuteModes = OCI_BATCH_MODE | OCI_EXACT_FETCH | OCI_STMT_SCROLLABLE_READONLY | OCI_DESCRIBE_ONLY |
                              OCI_COMMIT_ON_SUCCESS | OCI_NON_BLOCKING | OCI_BATCH_ERRORS | OCI_PARSE_ONLY |
                              OCI_SHOW_DML_WARNINGS;

Status CheckMode(ub4 mode) {
    if (mode & ~kExecuteModes) return Error(errors::kBadMode);
    constexpr ub4 kNoRun = OCI_DESCRIBE_ONLY | OCI_PARSE_ONLY;
    return (mode & kNoRun) == kNoRun ? Error(errors::kModesExclude) : Status();
}

Status CheckRange(const ExecuteArguments& arguments) {
    return arguments.iterations <= arguments.first ? Error(errors::kNoIterations) : Status();
}

// Statements that take no rows run once.
Status CheckOnce(const ExecuteArguments& arguments) {
    if (arguments.iterations > 1) return Error(errors::kOnceOnly);
    return CheckRange(arguments);
}

}  // namespace

Status Statement::Execute(ServiceContext& service, ErrorHandle& error, const ExecuteArguments& arguments) {
    if (pieces_.kind == Pieces::Kind::execute) return ContinueExecute(error);
    if (pieces_.kind == Pieces::Kind::fetch && pieces_.by_execute) return ContinueFetch();
    if (Status status = Ready(service, arguments); !status.Ok()) return status;
    error.row_failures.clear();
    error.row_offset = 0;
    if (arguments.mode & OCI_PARSE_ONLY) return ParseOnly();
    if (arguments.mode & OCI_DESCRIBE_ONLY) return DescribeOnly();

    CloseCursor();
    state_ = State::initialized;
    row_count_ = 0;
    rows_fetched_ = failed_rows_ = 0;
    last_row_ = 0;
    cancelled_ = false;
    failed_ = true;
    const bool in_pieces = std::any_of(bound_.begin(), bound_.end(),
                                       [](const Bind* bind) { return bind && bind->InPieces(); });
    if (in_pieces) return StartExecuteInPieces(arguments);
    return Run(error, arguments);
}

// Checks the arguments, joins the link and answers what the text itself tells to be wrong.
Status Statement::Ready(ServiceContext& service, const ExecuteArguments& arguments) {
    pieces_ = {};
    if (!prepared_) return Error(errors::kNotPrepared);
    if (Status status = CheckMode(arguments.mode); !status.Ok()) return status;
    std::shared_ptr<Link> link;
    if (Status status = service.Require(link); !status.Ok()) return status;
    if (link != UsedLink()) {
        Drop();
        Use(std::move(link));
    }
    link_lost_ = false;
    defines_changed_ = true;
    parse_error_offset_ = scanned_.error_offset;
    if (scanned_.error == 0) return {};
    failed_ = true;
    return Error(scanned_.error);
}

Status Statement::Compile(std::size_t index, Compiled*& compiled) {
    compiled_.resize(scanned_.steps.size());
    compiled = &compiled_[index];
    if (compiled->query) return {};
    compiled->text = sql::Rewrite(text_, scanned_, scanned_.steps[index], Engine().GetDialect());
    std::uint32_t offset = 0;
    Status status = Engine().Prepare(compiled->text.sql, compiled->query, offset);
    if (!status.Ok()) parse_error_offset_ = compiled->text.SourceOffset(offset);
    return status;
}

Status Statement::ParseOnly() {
    if (state_ != State::initialized || described_) return Error(errors::kAlreadyExecuted);
    for (std::size_t index = 0; index < scanned_.steps.size(); ++index) {
        const sql::Run run = scanned_.steps[index].run;
        const bool for_engine = run != sql::Run::commit && run != sql::Run::rollback && run != sql::Run::begin &&
                                run != sql::Run::nothing;
        Compiled* compiled = nullptr;
        if (!for_engine) continue;
        if (Status status = Compile(index, compiled); !status.Ok()) return status;
    }
    return {};
}

Status Statement::DescribeOnly() {
    if (scanned_.type != sql::StatementType::select) return {};
    Compiled* compiled = nullptr;
    Status status = Compile(0, compiled);
    described_ = status.Ok();
    return status;
}

Status Statement::Run(ErrorHandle& error, const ExecuteArguments& arguments) {
    const auto run = [&] {
        if (scanned_.is_block) return RunBlock(arguments);
        switch (scanned_.steps[0].run) {
            case sql::Run::query: return RunQuery(arguments);
            case sql::Run::change: return RunChange(error, arguments);
            case sql::Run::begin:
            case sql::Run::commit:
            case sql::Run::rollback: return RunControl(arguments);
            default: return RunOnce(arguments);
        }
    };
    return Complete(run(), arguments);
}

// Notes how an execute went, and commits if it is asked to.
Status Statement::Complete(Status status, const ExecuteArguments& arguments) {
    if (status.Failed()) return status;
    failed_ = false;
    if (state_ == State::initialized) state_ = State::executed;
    if (!(arguments.mode & OCI_COMMIT_ON_SUCCESS) || pieces_.kind != Pieces::Kind::none) return status;
    Status committed = Engine().Commit();
    return committed.Ok() ? status : committed;
}

// ---- Queries

Status Statement::RunQuery(const ExecuteArguments& arguments) {
    Compiled* compiled = nullptr;
    Rows rows;
    if (Status status = Compile(0, compiled); !status.Ok()) return status;
    if (Status status = rows.Collect(*this, *compiled); !status.Ok()) return status;
    if (rows.HasTables()) return Error(errors::kTablesInBlocksOnly);
    const bool was_described = std::exchange(described_, true);
    if (arguments.iterations > 0) {
        if (Status status = CheckRange(arguments); !status.Ok()) return status;
        if (Status status = ActivateDefines(); !status.Ok()) return status;
    }
    if (scanned_.steps[0].locks_rows || scanned_.steps[0].run == sql::Run::change) {
        if (Status status = Engine().Begin(); !status.Ok()) return status;
    }
    if (Status status = compiled->query->Open(rows, 0); !status.Ok()) {
        described_ = was_described;
        return status;
    }
    cursor_.Open(*compiled->query, arguments.mode & OCI_STMT_SCROLLABLE_READONLY);
    ++UsedLink()->open_statements;
    defines_changed_ = true;    // the first row may have told more of the columns
    state_ = State::executed;
    return arguments.iterations > 0 ? FetchAtExecute(arguments) : Status();
}

// The rows that the execute itself delivers; elements count from the row offset. An exact fetch looks one row further.
Status Statement::FetchAtExecute(const ExecuteArguments& arguments) {
    const ub4 rows = arguments.iterations - arguments.first;
    if (Status status = ActivateDefines(); !status.Ok()) return status;
    if (fetches_in_pieces_) return StartFetchInPieces(rows, false, true);
    Status status = FetchRows(rows, arguments.first, false);
    if (!(arguments.mode & OCI_EXACT_FETCH)) return status;
    bool more = false;
    if (!status.Failed() && status.Code() != OCI_NO_DATA) {
        if (Status next = cursor_.Next(more); !next.Ok()) status = std::move(next);
    }
    CloseCursor();
    state_ = State::end_of_fetch;
    return more ? Error(errors::kTooManyRows) : status;
}

// ---- Changes

Status Statement::RunChange(ErrorHandle& error, const ExecuteArguments& arguments) {
    if (Status status = CheckRange(arguments); !status.Ok()) return status;
    engine::ArrayOutcome outcome;
    Status status = RunRows(arguments, outcome);
    return status.Failed() ? status : Finish(error, arguments, outcome);
}

// Runs the rows [first, iterations) and adds what they did.
Status Statement::RunRows(const ExecuteArguments& arguments, engine::ArrayOutcome& outcome) {
    const sql::Step& step = scanned_.steps[0];
    Compiled* compiled = nullptr;
    Rows rows;
    if (Status status = Compile(0, compiled); !status.Ok()) return status;
    if (Status status = rows.Collect(*this, *compiled); !status.Ok()) return status;
    if (rows.HasTables()) return Error(errors::kTablesInBlocksOnly);
    if (Status status = Engine().Begin(); !status.Ok()) return status;
    const bool all_rows = arguments.mode & OCI_BATCH_ERRORS;
    if (compiled->query->Columns().empty())
        return compiled->query->ExecuteArray(rows, arguments.first, arguments.iterations, all_rows, outcome);
    for (ub4 row = arguments.first; row < arguments.iterations; ++row) {
        Status status = ReturnRow(*compiled, rows, step, row, outcome.affected);
        if (!status.Ok() && !Engine().InTransaction()) return status;
        if (status.Ok()) ++outcome.executed;
        else outcome.failures.push_back({row, std::move(status)});
        if (!outcome.failures.empty() && !all_rows) break;
    }
    return {};
}

// One execution of a change that gives rows back; the last one stays in the targets' element.
Status Statement::ReturnRow(Compiled& compiled, Rows& rows, const sql::Step& step, ub4 row, std::uint64_t& count) {
    if (Status status = compiled.query->Open(rows, row); !status.Ok()) return status;
    std::vector<engine::Datum> values(compiled.query->Columns().size());
    std::uint32_t returned = 0;
    for (bool more = true;;) {
        Status status = compiled.query->Fetch(values, more);
        if (status.Ok() && !more) break;
        if (status.Ok()) status = StoreTargets(step, *compiled.query, values, row);
        if (!status.Ok()) {
            compiled.query->Close();
            return status;
        }
        ++returned;
    }
    for (const std::uint32_t target : step.targets)
        if (Bind* bind = bound_[target]) bind->rows_returned = returned;
    count += returned;
    return {};
}

// Puts a row into the binds of a step's targets.
Status Statement::StoreTargets(const sql::Step& step, engine::Query& query, std::span<const engine::Datum> row,
                               std::size_t index) {
    const std::size_t count = std::min(step.targets.size(), row.size());
    for (std::size_t target = 0; target < count; ++target) {
        Bind* bind = bound_[step.targets[target]];
        if (!bind) return Error(errors::kNotAllBound);
        bind->workspace.column = values::ClassOf(query.Columns()[target].type);
        const auto converters = values::ForColumn(*bind->Type()->out, bind->workspace.column);
        const int error = values::Store(bind->elements, index, converters, bind->workspace, row[target]);
        if (error != 0 && error != errors::kTruncationWarning) return Error(error);
    }
    return {};
}

Status Statement::Finish(ErrorHandle& error, const ExecuteArguments& arguments, engine::ArrayOutcome& outcome) {
    row_count_ = outcome.affected;
    last_row_ = Engine().LastRowNumber();
    failed_rows_ = static_cast<std::uint32_t>(outcome.failures.size());
    if (outcome.failures.empty()) return {};
    if (!(arguments.mode & OCI_BATCH_ERRORS)) {
        error.row_offset = outcome.failures.front().row;
        return std::move(outcome.failures.front().status);
    }
    for (auto& failure : outcome.failures) error.row_failures.push_back({failure.row, std::move(failure.status)});
    return Warning(errors::kRowsFailed);
}

// ---- Everything else

// Definitions, savepoints and what only the engine knows; the last may turn out to return rows.
Status Statement::RunOnce(const ExecuteArguments& arguments) {
    const sql::Run run = scanned_.steps[0].run;
    const bool is_definition = run == sql::Run::definition;
    if (is_definition && !scanned_.placeholders.empty()) return Error(errors::kBindsInDefinition);
    Compiled* compiled = nullptr;
    Rows rows;
    if (Status status = Compile(0, compiled); !status.Ok()) return status;
    if (!compiled->query->Columns().empty() && !is_definition) return RunQuery(arguments);
    if (Status status = CheckOnce(arguments); !status.Ok()) return status;
    if (Status status = rows.Collect(*this, *compiled); !status.Ok()) return status;
    if (run == sql::Run::savepoint || is_definition) {
        if (Status status = is_definition ? Engine().Commit() : Engine().Begin(); !status.Ok()) return status;
    }
    engine::ArrayOutcome outcome;
    if (Status status = compiled->query->ExecuteArray(rows, 0, 1, false, outcome); status.Failed()) return status;
    if (!outcome.failures.empty()) return std::move(outcome.failures.front().status);
    return is_definition ? Engine().Commit() : Status();
}

Status Statement::RunControl(const ExecuteArguments& arguments) {
    if (Status status = CheckOnce(arguments); !status.Ok()) return status;
    switch (scanned_.steps[0].run) {
        case sql::Run::begin: return Engine().Begin();
        case sql::Run::commit: return Engine().Commit();
        default: return Engine().Rollback();
    }
}
