// Statements: blocks. Each step runs once for each iteration. A step that takes index-table arguments runs once for
// each of their elements; one that gives values into such arguments fills their elements from the first on. Targets
// that are cursors get the rows of a query to fetch.
//
// A block that fails undoes what it did since it last ended a transaction on its way.
#include <algorithm>
#include <cstring>
#include <new>

#include "handles/environment.h"
#include "handles/errors.h"
#include "sql/token.h"
#include "statements/result_set.h"
#include "statements/statement.h"

namespace {

// What a savepoint step does.
struct SavepointStep {
    enum class Verb : std::uint8_t { sets, goes_back, releases };
    Verb verb = Verb::goes_back;
    std::string name;
};
// To some engines a name in quotes is the one without, in either letter case; to others it is another one.
SavepointStep ReadSavepoint(std::string_view step, bool quotes_matter) {
    SavepointStep read;
    sql::Tokenizer tokens(step);
    sql::Token token = tokens.Next();
    if (token.Is("savepoint")) read.verb = SavepointStep::Verb::sets;
    if (token.Is("release")) read.verb = SavepointStep::Verb::releases;
    for (; token.kind == sql::TokenKind::word || token.kind == sql::TokenKind::quoted_word; token = tokens.Next()) {
        read.name = sql::PlaceholderName(token.text);
        if (!quotes_matter) read.name = sql::UpperCase(read.name);
    }
    return read;
}

}  // namespace

// What a block does between ends of transactions. Undone unless it is kept, by an exception, too.
class Statement::Stretch {
public:
    explicit Stretch(engine::Connection& engine) : engine_(engine) {}
    ~Stretch() { if (begun_) (void)Undo(); }
    Stretch(const Stretch&) = delete;
    Stretch& operator=(const Stretch&) = delete;

    // To be called before a step that leaves something to undo.
    Status Begin() {
        if (begun_) return {};
        began_transaction_ = !engine_.InTransaction();
        Status status = engine_.SetMark();
        begun_ = status.Ok();
        return status;
    }
    // To be called after each step, which may have ended the transaction.
    void Look() noexcept {
        begun_ = begun_ && engine_.InTransaction();
        if (!begun_) savepoints_.clear();
    }
    // Makes room for noting a savepoint step, so that this does not fail.
    void Reserve() { savepoints_.reserve(savepoints_.size() + 1); }
    // To be called after a savepoint step. One that was not set in here lies before the mark, which is gone with it:
    // what follows gets another.
    void Note(SavepointStep&& step) noexcept {
        const auto found = std::find(savepoints_.rbegin(), savepoints_.rend(), step.name);
        const bool releases = step.verb == SavepointStep::Verb::releases;
        if (step.verb == SavepointStep::Verb::sets) savepoints_.push_back(std::move(step.name));
        else if (found != savepoints_.rend()) savepoints_.erase(found.base() - releases, savepoints_.end());
        else begun_ = false;
        if (!begun_) savepoints_.clear();
    }
    // Keeps what is done. Dropping the mark would drop the savepoints behind it, which the application may go back to.
    Status Keep() { return std::exchange(begun_, false) && savepoints_.empty() ? engine_.DropMark() : Status(); }
    // Ok when nothing is left of it. A mark that could not be gone back to stays.
    Status Undo() {
        Look();
        if (!std::exchange(begun_, false)) return {};
        if (began_transaction_) return engine_.Rollback();
        Status status = engine_.UndoToMark();
        return status.Ok() ? engine_.DropMark() : status;
    }

private:
    engine::Connection& engine_;
    bool begun_ = false;
    bool began_transaction_ = false;
    std::vector<std::string> savepoints_;    // that steps have set, the first one first
};

Status Statement::RunBlock(const ExecuteArguments& arguments) {
    if (arguments.iterations <= arguments.first) return Error(errors::kNoIterations);
    Stretch stretch(Engine());
    Status status;
    try {
        status = RunSteps(arguments, stretch);
    } catch (const std::bad_alloc&) {
        status = Error(errors::kOutOfMemory);
    }
    if (!status.Failed()) {
        Status kept = stretch.Keep();
        return kept.Ok() ? status : kept;
    }
    UsedLink()->Answered(status);
    Status undone = stretch.Undo();
    return undone.Ok() ? status : undone;
}

// A step's warning, such as a commit's, stops nothing and is told at the end.
Status Statement::RunSteps(const ExecuteArguments& arguments, Stretch& stretch) {
    Status told;
    for (ub4 row = arguments.first; row < arguments.iterations; ++row) {
        for (std::size_t index = 0; index < Scanned().steps.size(); ++index) {
            Status status = RunStep(index, row, stretch);
            stretch.Look();
            if (status.Failed()) return status;
            if (!status.Ok()) told = std::move(status);
        }
        ++run_.row_count;
    }
    return told;
}

Status Statement::RunStep(std::size_t index, ub4 row, Stretch& stretch) {
    const sql::Step& step = Scanned().steps[index];
    switch (step.run) {
        case sql::Run::nothing: return {};
        case sql::Run::commit: return UsedLink()->Commit();
        case sql::Run::rollback: return UsedLink()->Rollback();
        default: break;
    }
    for (const std::uint32_t target : step.targets)
        if (!text_.IsBound(target)) return Error(errors::kNotAllBound);
    Compiled* compiled = nullptr;
    if (Status status = Compile(index, compiled); !status.Ok()) return status;
    BindRows& rows = compiled->rows;
    if (Status status = rows.Collect(text_, compiled->text); !status.Ok()) return status;
    if (step.run == sql::Run::open_cursor) return OpenResult(*compiled, step, row);
    if (step.run == sql::Run::change || step.run == sql::Run::savepoint) {
        if (Status status = stretch.Begin(); !status.Ok()) return status;
    }
    if (step.run == sql::Run::savepoint) return Savepoint(*compiled, step, row, stretch);
    if (!rows.HasTables())
        return IntoTables(step) ? SelectIntoTables(*compiled, step, row) : RunElement(*compiled, step, row, 0);
    std::uint32_t elements = 0;
    if (Status status = rows.TableElements(elements); !status.Ok()) return status;
    for (const std::uint32_t target : step.targets)
        if (text_.At(target)->IsTable() && text_.At(target)->most_elements < elements)
            return Error(errors::kBadTableLength);
    for (std::uint32_t element = 0; element < elements; ++element) {
        rows.table_element = element;
        if (Status status = RunElement(*compiled, step, row, element); !status.Ok()) return status;
    }
    for (const std::uint32_t target : step.targets)
        if (text_.IsBound(target) && text_.At(target)->IsTable()) *text_.At(target)->current_elements = elements;
    return {};
}

Status Statement::Savepoint(Compiled& compiled, const sql::Step& step, ub4 row, Stretch& stretch) {
    const bool quotes_matter = UsedLink()->Database().GetDialect().quoted_name != nullptr;
    SavepointStep read = ReadSavepoint(std::string_view(text_.Text()).substr(step.begin), quotes_matter);
    stretch.Reserve();
    Status status = Change(compiled, step, row, 0);
    if (status.Ok()) stretch.Note(std::move(read));
    return status;
}

bool Statement::IntoTables(const sql::Step& step) const {
    return std::any_of(step.targets.begin(), step.targets.end(),
                       [this](std::uint32_t target) { return text_.At(target)->IsTable(); });
}

// A step once: a query or expression into the row of its targets, or element `element` of those that are tables, or a
// change.
Status Statement::RunElement(Compiled& compiled, const sql::Step& step, ub4 row, ub4 element) {
    const bool gives_value = step.run == sql::Run::query || step.run == sql::Run::assign;
    if (!gives_value) return Change(compiled, step, row, element);
    Targets targets(text_, step, *compiled.query, Targets::Layout::one_row);
    targets.SetElements(row, element);
    return SelectInto(compiled, targets, row);
}

Status Statement::Change(Compiled& compiled, const sql::Step& step, ub4 row, ub4 element) {
    Targets targets(text_, step, *compiled.query, Targets::Layout::each_execution);
    targets.SetElements(row, element);
    const bool returns = !compiled.query->Columns().empty();
    engine::ArrayOutcome outcome;
    const engine::ArrayRun run{row, row + 1, false, returns ? &targets : nullptr};
    if (Status status = compiled.query->ExecuteArray(compiled.rows, run, outcome); !status.Ok()) return status;
    if (!outcome.failures.empty()) return std::move(outcome.failures.front().status);
    targets.Settle();
    if (returns) SetReturned(step, targets.Rows());
    return {};
}

// Exactly one row.
Status Statement::SelectInto(Compiled& compiled, Targets& targets, ub4 row) {
    engine::Query& query = *compiled.query;
    if (Status status = query.Open(compiled.rows, {row, false}); !status.Ok()) return status;
    bool more = true;
    Status status = query.Fetch(targets, 2, more);
    query.Close();
    if (status.Ok() && targets.Rows() == 0) status = Error(errors::kNoRows);
    if (status.Ok()) targets.Settle();
    return status;
}

// All rows, one an element; 1414 when there are more than the tables can take.
Status Statement::SelectIntoTables(Compiled& compiled, const sql::Step& step, ub4 row) {
    engine::Query& query = *compiled.query;
    Targets targets(text_, step, query, Targets::Layout::tables);
    targets.SetElements(row, 0);
    if (Status status = query.Open(compiled.rows, {row, false}); !status.Ok()) return status;
    constexpr std::uint32_t kBatch = 1000;
    Status status;
    for (bool more = true; more && status.Ok();) status = query.Fetch(targets, kBatch, more);
    query.Close();
    targets.Settle();
    for (const std::uint32_t target : step.targets)
        if (text_.IsBound(target) && text_.At(target)->IsTable()) *text_.At(target)->current_elements = targets.Rows();
    return status;
}

// ---- Results

namespace {

// The statement that an element points to: a statement handle or a result-set descriptor. Null for any other pointer.
Statement* ResultTarget(const char* place) {
    void* pointer;
    std::memcpy(&pointer, place, sizeof pointer);
    Statement* statement = Live<Statement>(pointer);
    return statement ? statement : Live<ResultSet>(pointer);
}

}  // namespace

void Statement::CollectResultTargets(const ExecuteArguments& arguments, std::vector<Statement*>& targets) const {
    if (!Scanned().is_block) return;
    for (const sql::Step& step : Scanned().steps) {
        if (step.run != sql::Run::open_cursor || !text_.IsBound(step.targets[0])) continue;
        const BindArea& bind = *text_.At(step.targets[0]);
        if (bind.Type()->family != values::Family::cursor || !bind.elements.values) continue;
        for (ub4 row = arguments.first; row < arguments.iterations; ++row)
            if (Statement* target = ResultTarget(bind.elements.Value(row))) targets.push_back(target);
    }
}

// The element points to a statement, or is null and gets a new one.
Status Statement::OpenResult(Compiled& compiled, const sql::Step& step, ub4 row) {
    const std::shared_ptr<BindArea> bind = text_.At(step.targets[0]);
    if (bind->Type()->family != values::Family::cursor) return Error(errors::kBlockError);
    char* place = bind->elements.Value(row);
    if (!place) return Error(errors::kBadResultSet);
    Statement* target = ResultTarget(place);
    void* pointer;
    std::memcpy(&pointer, place, sizeof pointer);
    if ((!target && pointer) || target == this || (target && target->pieces_.Asks())) return Error(errors::kBadResultSet);
    if (Status status = compiled.query->Open(compiled.rows, {row, false}); !status.Ok()) return status;
    std::unique_ptr<engine::Query> query = std::move(compiled.query);
    if (!target) target = Create<Statement>(Env(), OCI_HTYPE_STMT, 0);
    if (!bind->HasHandle()) return Error(errors::kNotAllBound);    // freed by a memory function
    target->TakeResult(std::move(query), UsedLink());
    pointer = target;
    std::memcpy(place, &pointer, sizeof pointer);
    bind->elements.SetIndicator(row, 0);
    bind->elements.SetLength(row, sizeof pointer);
    bind->elements.SetCode(row, 0);
    return {};
}

void Statement::TakeResult(std::unique_ptr<engine::Query> query, const std::shared_ptr<Link>& link) {
    Drop();
    StartAnew();
    Use(link);
    run_.cursor.Open(std::move(query));
    ++link->open_statements;
    run_.state = Execution::State::executed;
    run_.fetch_error = 0;
}

void ResultSet::BecomeStatement() {
    live::Retype(this, Kind::statement);
    SetType(OCI_HTYPE_STMT);
}
