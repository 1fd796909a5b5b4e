// Statements: running them. Row numbers are those of the bound arrays. Transactions begin and end in the engine: a
// statement only says what it does.
#include <algorithm>
#include <utility>

#include "handles/errors.h"
#include "sessions/link.h"
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

engine::Effect EffectOf(const sql::Step& step) {
    switch (step.run) {
        case sql::Run::query:
        case sql::Run::open_cursor:
        case sql::Run::assign: return step.locks_rows ? engine::Effect::locks : engine::Effect::reads;
        case sql::Run::change: return engine::Effect::changes;
        case sql::Run::definition: return engine::Effect::defines;
        default: return engine::Effect::controls;
    }
}

// Whether the engine compiles the step; the others are calls on the connection.
bool IsForEngine(const sql::Step& step) {
    return step.run != sql::Run::commit && step.run != sql::Run::rollback && step.run != sql::Run::begin &&
           step.run != sql::Run::nothing;
}

bool EndsTransaction(const sql::Step& step) {
    return step.run == sql::Run::commit || step.run == sql::Run::rollback || step.run == sql::Run::definition;
}

}  // namespace

Status Statement::Execute(const ExecuteTarget& target, ErrorHandle& error, const ExecuteArguments& arguments) {
    Status status = ExecuteNow(target, error, arguments);
    AddNotices(error, status);
    return status;
}

Status Statement::ExecuteNow(const ExecuteTarget& target, ErrorHandle& error, const ExecuteArguments& arguments) {
    if (Status status = Admit(); !status.Ok()) return status;
    const PieceStream::Use wants = pieces_.Wants();
    if (wants == PieceStream::Use::execute) return ContinueExecute(error);
    if (wants == PieceStream::Use::fetch_by_execute) {
        const ExecuteArguments started = pieces_.Arguments();
        return Complete(EndExactFetch(ContinueFetch(), started), started);
    }
    if (Status status = Ready(target, arguments); !status.Ok()) return status;
    error.row_failures.clear();
    error.row_offset = 0;
    if (arguments.mode & OCI_PARSE_ONLY) return ParseOnly();
    if (arguments.mode & OCI_DESCRIBE_ONLY) return DescribeOnly();
    StartAnew();
    run_.fetch_error = errors::kNoDefines;    // unless it succeeds
    return text_.AnyInPieces() ? StartExecuteInPieces(error, arguments) : Run(error, arguments);
}

// Checks the arguments, joins the link and answers what the text itself tells to be wrong.
Status Statement::Ready(const ExecuteTarget& target, const ExecuteArguments& arguments) {
    pieces_.End();
    if (!text_.IsSet()) return Error(errors::kNotPrepared);
    if (Status status = CheckMode(arguments.mode); !status.Ok()) return status;
    if (!target.link) return target.status;
    const bool ends = arguments.mode & OCI_COMMIT_ON_SUCCESS || std::ranges::any_of(Scanned().steps, EndsTransaction);
    if (Status status = target.link->CheckBranch(ends); !status.Ok()) return status;
    if (target.link != UsedLink()) {
        Drop();
        Use(target.link);
        defines_.Renew();
    }
    text_.lobs = target.link->lobs;
    if (run_.fetch_error == errors::kNotConnected) run_.fetch_error = errors::kNotExecuted;
    parse_error_offset_ = Scanned().error_offset;
    if (Scanned().error == 0) return {};
    StartAnew();
    run_.fetch_error = errors::kNoDefines;
    return Error(Scanned().error);
}

// An engine that needs the kinds of its parameters compiles anew when they are others.
Status Statement::Compile(std::size_t index, Compiled*& compiled) {
    compiled_.resize(Scanned().steps.size());
    compiled = &compiled_[index];
    engine::Database& database = UsedLink()->Database();
    const bool typed = database.GetCapabilities().typed_parameters;
    if (compiled->query && !typed) return {};
    if (!compiled->rewritten) {
        compiled->text = sql::Rewrite(text_.Text(), Scanned(), Scanned().steps[index], database.GetDialect());
        compiled->rewritten = true;
    }
    std::vector<engine::Kind> kinds = KindsOf(text_, compiled->text);
    if (compiled->query && kinds == compiled->kinds) return {};
    compiled->query.reset();
    compiled->kinds = std::move(kinds);
    std::uint32_t offset = 0;
    Status status = Engine().Compile({compiled->text.sql, EffectOf(Scanned().steps[index]), compiled->kinds,
                                      PlaceholdersOf(text_, compiled->text)}, compiled->query, offset);
    if (!status.Ok()) parse_error_offset_ = compiled->text.SourceOffset(offset);
    return status;
}

// The only step of a plain statement, with its binds.
Status Statement::CompileForValues(Compiled*& compiled) {
    if (Status status = Compile(0, compiled); !status.Ok()) return status;
    if (Status status = compiled->rows.Collect(text_, compiled->text); !status.Ok()) return status;
    return compiled->rows.HasTables() ? Error(errors::kTablesInBlocksOnly) : Status();
}

Status Statement::ParseOnly() {
    if (run_.state != Execution::State::initialized || described_) return Error(errors::kAlreadyExecuted);
    for (std::size_t index = 0; index < Scanned().steps.size(); ++index) {
        Compiled* compiled = nullptr;
        if (!IsForEngine(Scanned().steps[index])) continue;
        if (Status status = Compile(index, compiled); !status.Ok()) return status;
    }
    return {};
}

// Rows that are open stay so, and what they are is what is described; else anew, for tables may have changed.
Status Statement::DescribeOnly() {
    if (Scanned().type != sql::StatementType::select || run_.cursor.IsOpen()) return {};
    if (!compiled_.empty()) compiled_[0].query.reset();
    Compiled* compiled = nullptr;
    Status status = Compile(0, compiled);
    described_ = status.Ok();
    return status;
}

Status Statement::Run(ErrorHandle& error, const ExecuteArguments& arguments) {
    const auto run = [&] {
        if (Scanned().is_block) return RunBlock(arguments);
        switch (Scanned().steps[0].run) {
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
    run_.fetch_error = 0;
    if (run_.state == Execution::State::initialized) run_.state = Execution::State::executed;
    if (!(arguments.mode & OCI_COMMIT_ON_SUCCESS) || pieces_.Wants() != PieceStream::Use::none) return status;
    Status committed = UsedLink()->Commit();
    return committed.Ok() ? status : committed;
}

// What the engine had to say besides makes success one with information. After a failure its error says enough; an
// operation that goes on keeps it for its end.
void Statement::AddNotices(ErrorHandle& error, Status& status) {
    Link* const link = UsedLink().get();
    if (!link || link->Closed()) return;
    if (status.Failed()) link->Answered(status);
    if (!link->Engine().HasNotices() || status.Code() == OCI_NEED_DATA) return;
    std::vector<Status> notices = link->Engine().TakeNotices();
    if (status.Code() != OCI_SUCCESS && status.Code() != OCI_SUCCESS_WITH_INFO) return;
    if (!status.Ok()) error.list.Add(status);
    for (std::size_t index = 0; index + 1 < notices.size(); ++index) error.list.Add(notices[index]);
    status = std::move(notices.back());
}

// ---- Queries

Status Statement::RunQuery(const ExecuteArguments& arguments) {
    Compiled* compiled = nullptr;
    if (Status status = CompileForValues(compiled); !status.Ok()) return status;
    const bool was_described = std::exchange(described_, true);
    if (arguments.iterations > 0) {
        if (Status status = CheckRange(arguments); !status.Ok()) return status;
        if (Status status = defines_.Activate(compiled->query->Columns(), text_.lobs); !status.Ok()) return status;
    }
    const bool scrollable = arguments.mode & OCI_STMT_SCROLLABLE_READONLY;
    if (Status status = compiled->query->Open(compiled->rows, {0, scrollable}); !status.Ok()) {
        described_ = was_described;
        return status;
    }
    run_.cursor.Open(*compiled->query, scrollable);
    ++UsedLink()->open_statements;
    defines_.Renew();    // the first row may have told more of the columns
    run_.state = Execution::State::executed;
    return arguments.iterations > 0 ? FetchAtExecute(arguments) : Status();
}

// The rows that the execute itself delivers; elements count from the row offset. An exact fetch looks one row further.
Status Statement::FetchAtExecute(const ExecuteArguments& arguments) {
    const ub4 rows = arguments.iterations - arguments.first;
    if (Status status = defines_.Activate(run_.cursor.Columns(), UsedLink()->lobs); !status.Ok()) return status;
    Status status = defines_.InPieces() ? StartFetchInPieces(rows, arguments.first, nullptr, &arguments)
                                        : FetchRows(rows, arguments.first, nullptr);
    return EndExactFetch(std::move(status), arguments);
}

// Once the rows are delivered, pieces and all.
Status Statement::EndExactFetch(Status status, const ExecuteArguments& arguments) {
    if (!(arguments.mode & OCI_EXACT_FETCH) || status.Code() == OCI_NEED_DATA) return status;
    if (pieces_.Wants() != PieceStream::Use::none) return status;    // it may be asked again with a better buffer
    bool more = false;
    if (!status.Failed() && status.Code() != OCI_NO_DATA) {
        if (Status next = run_.cursor.AnyMore(more); !next.Ok()) status = std::move(next);
    }
    CloseCursor();
    run_.state = Execution::State::end_of_fetch;
    return more ? Error(errors::kTooManyRows) : status;
}

// ---- Changes

Status Statement::RunChange(ErrorHandle& error, const ExecuteArguments& arguments) {
    if (Status status = CheckRange(arguments); !status.Ok()) return status;
    ForgetOutcome();
    Status status = RunRows(arguments);
    return status.Failed() ? status : Finish(error, arguments);
}

// The room for failures stays for the next execute.
void Statement::ForgetOutcome() noexcept {
    outcome_.affected = 0;
    outcome_.executed = 0;
    outcome_.failures.clear();
    outcome_.last_row.reset();
}

// Runs the rows [first, iterations) and adds what they did.
Status Statement::RunRows(const ExecuteArguments& arguments) {
    const sql::Step& step = Scanned().steps[0];
    Compiled* compiled = nullptr;
    if (Status status = CompileForValues(compiled); !status.Ok()) return status;
    engine::ArrayRun run{arguments.first, arguments.iterations, (arguments.mode & OCI_BATCH_ERRORS) != 0, nullptr};
    if (compiled->query->Columns().empty()) return compiled->query->ExecuteArray(compiled->rows, run, outcome_);
    SetReturned(step, 0);
    Targets targets(text_, step, *compiled->query, Targets::Layout::each_execution);
    run.returned = &targets;
    const std::uint32_t done_before = outcome_.executed;
    Status status = compiled->query->ExecuteArray(compiled->rows, run, outcome_);
    if (status.Ok() && outcome_.executed > done_before) {
        // The last execution that succeeded: failures behind it are those of the rows at the end.
        ub4 last = run.all_rows || outcome_.failures.empty() ? arguments.iterations : outcome_.failures.back().row;
        for (auto failure = outcome_.failures.rbegin(); failure != outcome_.failures.rend(); ++failure)
            if (failure->row + 1 == last) last = failure->row;
        SetReturned(step, targets.RowsOf(last - 1));
    }
    return status;
}

// Of the statement's binds that take what it gives back, how many rows they got.
void Statement::SetReturned(const sql::Step& step, std::uint32_t rows) {
    for (const std::uint32_t target : step.targets)
        if (text_.IsBound(target)) text_.At(target)->rows_returned = rows;
}

// What an array execute did shows whatever goes wrong in telling it.
Status Statement::Finish(ErrorHandle& error, const ExecuteArguments& arguments) {
    run_.row_count = outcome_.affected;
    run_.last_row = outcome_.last_row;
    run_.failed_rows = static_cast<std::uint32_t>(outcome_.failures.size());
    if (outcome_.failures.empty()) return {};
    for (const auto& failure : outcome_.failures) UsedLink()->Answered(failure.status);
    if (!(arguments.mode & OCI_BATCH_ERRORS)) {
        error.row_offset = outcome_.failures.front().row;
        return std::move(outcome_.failures.front().status);
    }
    const bool cut_short = outcome_.executed + outcome_.failures.size() < arguments.iterations - arguments.first;
    Status last = cut_short ? outcome_.failures.back().status : Status();
    for (auto& failure : outcome_.failures) error.row_failures.push_back({failure.row, std::move(failure.status)});
    return cut_short ? last : Warning(errors::kRowsFailed);
}

// ---- Everything else

// Definitions, savepoints and what only the engine knows; the last may turn out to return rows.
Status Statement::RunOnce(const ExecuteArguments& arguments) {
    const sql::Run run = Scanned().steps[0].run;
    const bool is_definition = run == sql::Run::definition;
    if (is_definition && !Scanned().placeholders.empty()) return Error(errors::kBindsInDefinition);
    Compiled* compiled = nullptr;
    if (Status status = Compile(0, compiled); !status.Ok()) return status;
    if (!compiled->query->Columns().empty() && !is_definition) return RunQuery(arguments);
    if (Status status = CheckOnce(arguments); !status.Ok()) return status;
    if (Status status = CompileForValues(compiled); !status.Ok()) return status;
    engine::ArrayOutcome outcome;
    Status status = compiled->query->ExecuteArray(compiled->rows, {}, outcome);
    if (status.Ok() && !outcome.failures.empty()) return std::move(outcome.failures.front().status);
    return status;
}

Status Statement::RunControl(const ExecuteArguments& arguments) {
    if (Status status = CheckOnce(arguments); !status.Ok()) return status;
    switch (Scanned().steps[0].run) {
        case sql::Run::begin: return Engine().Begin(engine::TransactionMode::read_write);
        case sql::Run::commit: return UsedLink()->Commit();
        default: return UsedLink()->Rollback();
    }
}
