// Statements: blocks. Each step runs once for each iteration. A step that takes index-table arguments runs once for
// each of their elements; one that gives values into such arguments fills their elements from the first on. Targets
// that are cursors get the rows of a query to fetch.
#include <algorithm>
#include <cstring>

#include "handles/environment.h"
#include "handles/errors.h"
#include "statements/result_set.h"
#include "statements/rows.h"
#include "statements/statement.h"

// A block that fails undoes what it did, unless it has ended a transaction on its way.
Status Statement::RunBlock(const ExecuteArguments& arguments) {
    if (arguments.iterations <= arguments.first) return Error(errors::kNoIterations);
    const auto has = [this](auto... runs) {
        return std::any_of(scanned_.steps.begin(), scanned_.steps.end(),
                           [=](const sql::Step& step) { return ((step.run == runs) || ...); });
    };
    if (!has(sql::Run::change) || has(sql::Run::commit, sql::Run::rollback)) return RunSteps(arguments);
    if (Status status = Engine().Begin(); !status.Ok()) return status;
    if (Status status = RunText("savepoint kelp_block"); !status.Ok()) return status;
    Status status = RunSteps(arguments);
    if (!status.Ok() && !Engine().InTransaction()) return status;    // the engine has undone more than the block
    Status undone = status.Ok() ? Status() : RunText("rollback to savepoint kelp_block");
    Status released = RunText("release savepoint kelp_block");
    if (!undone.Ok()) return undone;
    return status.Ok() ? released : status;
}

// A statement of the library's own.
Status Statement::RunText(std::string_view sql) {
    std::unique_ptr<engine::Query> query;
    std::uint32_t offset = 0;
    Rows none;
    engine::ArrayOutcome outcome;
    if (Status status = Engine().Prepare(sql, query, offset); !status.Ok()) return status;
    if (Status status = query->ExecuteArray(none, 0, 1, false, outcome); !status.Ok()) return status;
    return outcome.failures.empty() ? Status() : std::move(outcome.failures.front().status);
}

Status Statement::RunSteps(const ExecuteArguments& arguments) {
    for (ub4 row = arguments.first; row < arguments.iterations; ++row) {
        for (std::size_t index = 0; index < scanned_.steps.size(); ++index) {
            if (Status status = RunStep(index, row); !status.Ok()) return status;
        }
        ++row_count_;
    }
    return {};
}

Status Statement::RunStep(std::size_t index, ub4 row) {
    const sql::Step& step = scanned_.steps[index];
    switch (step.run) {
        case sql::Run::nothing: return {};
        case sql::Run::begin: return Engine().Begin();
        case sql::Run::commit: return Engine().Commit();
        case sql::Run::rollback: return Engine().Rollback();
        default: break;
    }
    for (const std::uint32_t target : step.targets)
        if (!bound_[target]) return Error(errors::kNotAllBound);
    Compiled* compiled = nullptr;
    Rows rows;
    if (Status status = Compile(index, compiled); !status.Ok()) return status;
    if (Status status = rows.Collect(*this, *compiled); !status.Ok()) return status;
    if (step.run == sql::Run::open_cursor) return OpenCursor(*compiled, rows, step, row);
    if (!rows.HasTables()) {
        return IntoTables(step) ? SelectIntoTables(*compiled, rows, step) : RunElement(*compiled, rows, step, row, row);
    }
    std::uint32_t elements = 0;
    if (Status status = rows.TableElements(elements); !status.Ok()) return status;
    for (const std::uint32_t target : step.targets)
        if (bound_[target]->IsTable() && bound_[target]->most_elements < elements)
            return Error(errors::kBadTableLength);
    for (std::uint32_t element = 0; element < elements; ++element) {
        rows.table_element = element;
        if (Status status = RunElement(*compiled, rows, step, row, element); !status.Ok()) return status;
    }
    for (const std::uint32_t target : step.targets)
        if (bound_[target]->IsTable()) *bound_[target]->current_elements = elements;
    return {};
}

bool Statement::IntoTables(const sql::Step& step) const {
    for (const std::uint32_t target : step.targets)
        if (bound_[target]->IsTable()) return true;
    return false;
}

// A step once: a query or expression into element `element` of its targets, or a change.
Status Statement::RunElement(Compiled& compiled, Rows& rows, const sql::Step& step, ub4 row, std::size_t element) {
    const bool gives_value = step.run == sql::Run::query || step.run == sql::Run::assign;
    if (gives_value) return SelectInto(compiled, rows, step, element, row);
    if (Status status = Engine().Begin(); !status.Ok()) return status;
    if (!compiled.query->Columns().empty()) {
        std::uint64_t count = 0;
        return ReturnRow(compiled, rows, step, row, count);
    }
    engine::ArrayOutcome outcome;
    if (Status status = compiled.query->ExecuteArray(rows, row, row + 1, false, outcome); !status.Ok()) return status;
    return outcome.failures.empty() ? Status() : std::move(outcome.failures.front().status);
}

// Exactly one row.
Status Statement::SelectInto(Compiled& compiled, Rows& rows, const sql::Step& step, std::size_t element, ub4 row) {
    engine::Query& query = *compiled.query;
    if (Status status = query.Open(rows, row); !status.Ok()) return status;
    std::vector<engine::Datum> values(query.Columns().size());
    bool found = false;
    Status status = query.Fetch(values, found);
    if (status.Ok() && !found) status = Error(errors::kNoRows);
    if (status.Ok()) status = StoreTargets(step, query, values, element);
    if (status.Ok()) status = query.Fetch(values, found);
    query.Close();
    if (!status.Ok()) return status;
    return found ? Error(errors::kTooManyRows) : Status();
}

// All rows, one an element; 1414 when there are more than the tables can take.
Status Statement::SelectIntoTables(Compiled& compiled, Rows& rows, const sql::Step& step) {
    engine::Query& query = *compiled.query;
    if (Status status = query.Open(rows, 0); !status.Ok()) return status;
    std::vector<engine::Datum> values(query.Columns().size());
    ub4 most = ~ub4{0};
    for (const std::uint32_t target : step.targets) {
        const Bind& bind = *bound_[target];
        most = std::min(most, bind.IsTable() ? bind.most_elements : 1);
    }
    ub4 count = 0;
    Status status;
    for (bool found = true; status.Ok();) {
        status = query.Fetch(values, found);
        if (!status.Ok() || !found) break;
        status = count < most ? StoreTargets(step, query, values, count++) : Error(errors::kBadTableLength);
    }
    query.Close();
    for (const std::uint32_t target : step.targets)
        if (bound_[target]->IsTable()) *bound_[target]->current_elements = count;
    return status;
}

// The element points to a statement handle or a result-set descriptor, or is null and gets a new statement.
Status Statement::OpenCursor(Compiled& compiled, Rows& rows, const sql::Step& step, ub4 row) {
    Bind& bind = *bound_[step.targets[0]];
    if (bind.Type()->family != values::Family::cursor) return Error(errors::kBlockError);
    char* place = bind.elements.Value(row);
    if (!place) return Error(errors::kBadResultSet);
    if (Status status = compiled.query->Open(rows, row); !status.Ok()) return status;
    std::unique_ptr<engine::Query> query = std::move(compiled.query);

    void* pointer;
    std::memcpy(&pointer, place, sizeof pointer);
    Statement* target = Live<Statement>(pointer);
    if (!target) target = Live<ResultSet>(pointer);
    if (!target && pointer) return Error(errors::kBadResultSet);
    if (target == this) return Error(errors::kBadResultSet);
    if (!target) target = Create<Statement>(Env(), OCI_HTYPE_STMT, 0);
    target->TakeResult(std::move(query), UsedLink());
    pointer = target;
    std::memcpy(place, &pointer, sizeof pointer);
    bind.elements.SetIndicator(row, 0);
    bind.elements.SetLength(row, sizeof pointer);
    bind.elements.SetCode(row, 0);
    return {};
}

void Statement::TakeResult(std::unique_ptr<engine::Query> query, const std::shared_ptr<Link>& link) {
    Drop();
    Use(link);
    cursor_.Open(std::move(query));
    ++link->open_statements;
    state_ = State::executed;
    described_ = true;
    failed_ = cancelled_ = link_lost_ = false;
    defines_changed_ = true;
    row_count_ = 0;
    rows_fetched_ = 0;
}

void ResultSet::BecomeStatement() {
    live::Retype(this, Kind::statement);
    SetType(OCI_HTYPE_STMT);
}
