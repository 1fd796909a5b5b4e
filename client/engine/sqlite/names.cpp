// Looking names up: the tables of each query are read once a statement, a table is asked for its columns each time.
#include "engine/sqlite/names.h"

#include <algorithm>
#include <utility>

#include "engine/sqlite/column_types.h"
#include "engine/sqlite/select_list.h"
#include "handles/errors.h"
#include "oci.h"

namespace engine::sqlite {
namespace {

// What is kept as something that it does not look like.
bool IsMoment(const TableColumn* column) {
    return column && (IsDateType(column->column.type) || IsIntervalType(column->column.type));
}

bool IsSame(const std::string& left, const std::string& right) { return sqlite3_stricmp(left.c_str(), right.c_str()) == 0; }

}  // namespace

const TableColumn* Names::TypeOf(Span span) {
    span = operands_.Bare(span);
    if (operands_.IsValue(span)) return nullptr;
    if (operands_.IsColumn(span)) return Resolve(span);
    for (const Span choice : operands_.Choices(span)) {
        if (const TableColumn* const column = TypeOf(choice); IsMoment(column)) return column;
    }
    const TableColumn* const column = IsName(At(span.first)) ? AnswerOf(span) : nullptr;
    return IsMoment(column) ? column : nullptr;
}

const TableColumn* Names::AnswerOf(Span span) {
    const ExpressionType type = ReadType({pieces_.begin() + static_cast<std::ptrdiff_t>(span.first),
                                          pieces_.begin() + static_cast<std::ptrdiff_t>(span.last)});
    if (!type.argument.empty()) {
        const auto first = static_cast<std::size_t>(
            std::find_if(pieces_.begin(), pieces_.end(),
                         [&](auto piece) { return piece.data() == type.argument.front().data(); }) -
            pieces_.begin());
        return Resolve({first, first + type.argument.size()});
    }
    if (type.declared.empty()) return nullptr;
    TableColumn answered;
    answered.declared = type.declared;
    answered.concerned = ReadDeclaredType(type.declared, answered.column);
    return &columns_.emplace_back(std::move(answered));
}

bool Names::HasAllDigits(Span span) {
    span = operands_.Bare(span);
    if (span.Size() == 0 || operands_.IsValue(span)) return false;
    if (operands_.IsQuery(span)) {
        const std::vector<std::size_t> parts = Parts(span.first);
        return parts.size() == 1 && IsWord(At(parts[0]), "select") && HasAllDigits(Items(parts[0])[0].expression);
    }
    const TableColumn* const column = AnswerOf(span);
    return column && column->column.type == SQLT_IBDOUBLE;
}

std::vector<std::size_t> Names::Parts(std::size_t query) const {
    std::vector<std::size_t> parts;
    for (std::size_t at = query; !At(at).empty() && At(at) != ")"; ++at) {
        if (At(at) == "(") at = operands_.Partner(at);
        if (IsOneOf(At(at), {"select", "values"})) parts.push_back(at);
    }
    return parts;
}

// What cannot be told of a column refuses nothing.
std::vector<std::uint16_t> Names::Types(std::size_t part, std::size_t count) {
    std::vector<std::uint16_t> types(count);
    std::vector<Listed> columns;
    if (scopes_.empty()) ReadTables();
    looks_ = 0;
    Status status = std::exchange(status_, {});
    const bool told = ExpandQuery(part, columns) && columns.size() == count;
    status_ = std::move(status);
    for (std::size_t index = 0; index < count && told; ++index)
        if (columns[index].column) types[index] = columns[index].column->column.type;
    return types;
}

std::vector<bool> Names::Numbers(std::size_t query, std::vector<bool> meant) {
    for (const std::size_t at : Parts(query)) {
        const std::vector<Item> items = IsWord(At(at), "select") ? Items(at) : std::vector<Item>();
        for (std::size_t index = 0; index < meant.size(); ++index)
            meant[index] = meant[index] && items.size() == meant.size() && IsNumber(items[index].expression);
    }
    return meant;
}

bool Names::IsNumber(Span span) {
    if (span.Size() == 0) return false;
    span = operands_.Bare(span);
    if (operands_.IsQuery(span)) return Numbers(span.first, {true})[0];
    const std::vector<Span> answers = operands_.Answers(span);
    if (answers.empty()) {
        const TableColumn* const type = AnswerOf(span);
        return type && IsNumeric(type->column.type);
    }
    const auto is_null = [&](Span answer) { return answer.Size() == 1 && IsWord(At(answer.first), "null"); };
    return std::all_of(answers.begin(), answers.end(), [&](Span answer) { return is_null(answer) || IsNumber(answer); }) &&
           !std::all_of(answers.begin(), answers.end(), is_null);
}

// ---- Names

const TableColumn* Names::Resolve(Span name) {
    if (scopes_.empty()) ReadTables();
    const std::string qualifier = name.Size() > 1 ? PlainName(At(name.last - 3)) : std::string();
    if (depth_ == 0) looks_ = 0;
    return FindName(At(name.last - 1), qualifier, scopes_[name.first]).column;
}

// A column of the table that the qualifier says, or of those of the innermost query that has one so called; of any table
// where the qualifier is of something else, as of a join in parentheses.
Names::Found Names::FindName(std::string_view column, const std::string& qualifier, std::size_t scope) {
    for (;; scope = parents_[scope]) {
        const Found found = FindInScope(column, qualifier, scope);
        if (found.any || !status_.Ok()) return found;
        if (parents_[scope] == scope) break;
    }
    return qualifier.empty() ? Found() : Agreed(column, [](const Table&) { return true; });
}

Names::Found Names::FindInScope(std::string_view column, const std::string& qualifier, std::size_t scope) {
    return Agreed(column, [&](const Table& table) {
        return table.scope == scope && (qualifier.empty() || IsSame(table.name, qualifier));
    });
}

// The column of that name in the tables meant, if they agree on its type. Dates and intervals are too easily taken
// for something else.
template <class Meant>
Names::Found Names::Agreed(std::string_view name, Meant is_meant) {
    Found agreed;
    for (std::size_t index = 0; index < tables_.size() && status_.Ok(); ++index) {
        if (!is_meant(tables_[index])) continue;
        const Found found = ColumnOf(tables_[index], name);
        if (!found.any) continue;
        const auto type = [](const Found& of) -> int { return of.column ? of.column->column.type : 0; };
        const bool differs = agreed.any && type(agreed) != type(found);
        if (differs && (IsMoment(agreed.column) || IsMoment(found.column)))
            status_ = Error(errors::kInconsistentTypes, "column " + PlainName(name));
        if (differs) return {true, nullptr};
        agreed = found;
    }
    return agreed;
}

Names::Found Names::ColumnOf(const Table& table, std::string_view name) {
    if (table.query == 0) {
        TableColumn column;
        if (!ReadColumn(database_, table.table, name, column)) return {};
        return {true, &columns_.emplace_back(std::move(column))};
    }
    const std::pair key(table.query, Lower(PlainName(name)));
    if (const auto known = of_queries_.find(key); known != of_queries_.end()) return known->second;
    if (IsTooDeep(name)) return {};
    ++depth_;
    const Found found = ColumnOfQuery(table, key.second);
    --depth_;
    if (status_.Ok()) of_queries_.emplace(key, found);
    return found;
}

bool Names::IsTooDeep(std::string_view name) {
    if (depth_ < kDeepest && ++looks_ <= kMostLooks) return false;
    status_ = Error(errors::kInconsistentTypes, "column " + PlainName(name));
    return true;
}

// By the select list of a subquery, or the names that WITH gives to its columns.
Names::Found Names::ColumnOfQuery(const Table& table, const std::string& name) {
    const auto is_called = [&](std::string_view called) { return IsSame(PlainName(called), name); };
    if (!table.names.empty()) {
        const auto named = std::find_if(table.names.begin(), table.names.end(), is_called);
        std::vector<Listed> columns;
        const auto at = static_cast<std::size_t>(named - table.names.begin());
        if (!ExpandQuery(table.query, columns) || at >= columns.size()) return {};
        return {true, columns[at].column};
    }
    for (const Item& item : Items(table.query)) {
        if (item.is_all) {
            const Found found = FindInScope(name, item.qualifier, scopes_[table.query]);
            if (found.any) return found;
        } else if (is_called(item.name)) {
            return {true, TypeOf(item.expression)};
        }
    }
    return {};
}

// The columns of a table or subquery in their order. False where that is not known.
bool Names::Expand(const Table& table, std::vector<Listed>& columns) {
    if (table.query == 0) {
        for (TableColumn& column : AllColumns(database_, table.table)) {
            const TableColumn& kept = columns_.emplace_back(std::move(column));
            columns.push_back({kept.name, &kept});
        }
        return true;
    }
    if (!ExpandQuery(table.query, columns)) return false;
    for (std::size_t at = 0; at < std::min(table.names.size(), columns.size()); ++at)
        columns[at].name = PlainName(table.names[at]);
    return true;
}

bool Names::ExpandQuery(std::size_t query, std::vector<Listed>& columns) {
    if (!IsWord(At(query), "select") || IsTooDeep("*")) return false;
    bool told = true;
    ++depth_;
    for (const Item& item : Items(query)) {
        if (!item.is_all) {
            columns.push_back({PlainName(item.name), TypeOf(item.expression)});
            continue;
        }
        const std::size_t first = columns.size();
        for (const Table& table : tables_) {
            const bool is_all = item.qualifier.empty();
            if (table.scope != scopes_[query] || !(is_all || IsSame(table.name, item.qualifier))) continue;
            std::vector<Listed> of_table;
            told = Expand(table, of_table) && told;
            const std::vector<Listed> before(columns.begin() + static_cast<std::ptrdiff_t>(first), columns.end());
            for (Listed& column : of_table)
                if (!is_all || !IsMerged(table, column.name, before)) columns.push_back(std::move(column));
        }
    }
    --depth_;
    return told;
}

// Whether "*" shows the column where a table stands that was joined before.
bool Names::IsMerged(const Table& table, const std::string& name, const std::vector<Listed>& before) {
    const auto is_called = [&](const Listed& column) { return IsSame(column.name, name); };
    if (table.is_natural) return std::any_of(before.begin(), before.end(), is_called);
    return std::any_of(table.merged.begin(), table.merged.end(), [&](auto merged) { return IsSame(PlainName(merged), name); });
}

std::vector<Names::Item> Names::Items(std::size_t select) const {
    std::vector<Item> items;
    std::size_t begin = select + 1;
    if (IsOneOf(At(begin), {"distinct", "all"})) ++begin;
    for (std::size_t at = begin; ; ++at) {
        if (At(at) == "(") at = operands_.Partner(at) + 1;
        const bool ends = At(at).empty() || At(at) == ")" || At(at) == ";" || BeginsFrom(pieces_, at) || BeginsWindows(pieces_, at) ||
                          IsOneOf(At(at), {"where", "group", "having", "union", "except", "intersect", "order", "limit"});
        if (!ends && At(at) != ",") continue;
        items.push_back(ReadItem({begin, at}));
        if (ends) break;
        begin = at + 1;
    }
    return items;
}

Names::Item Names::ReadItem(Span span) const {
    Item item{span, {}, false, {}};
    const std::string_view last = At(span.last - 1);
    if (last == "*") {
        item.is_all = true;
        if (span.Size() > 2) item.qualifier = PlainName(At(span.last - 3));
    } else if (span.Size() > 2 && IsWord(At(span.last - 2), "as")) {
        item.name = last;
        item.expression.last -= 2;
    } else if (operands_.From(span.first).last + 1 == span.last && !IsOneOf(last, {"isnull", "notnull"})) {
        item.name = last;
        --item.expression.last;
    } else if (operands_.IsColumn(span)) {
        item.name = last;
    }
    return item;
}

// The scope of each piece: a query, each part of a union for itself; what stands around the query of an insert is
// none of its own. And the tables that are named behind from, join, into and update, and commas behind from.
void Names::ReadTables() {
    scopes_.assign(pieces_.size(), 0);
    parents_.assign(1, 0);
    struct Level {
        std::size_t scope = 0;
        bool lists = false;    // tables
    };
    std::vector<Level> open(1);    // at each depth of parentheses
    const auto enter = [&](std::size_t parent) {
        parents_.push_back(parent);
        return parents_.size() - 1;
    };
    bool inserts = false;
    for (std::size_t at = 0; at < pieces_.size(); ++at) {
        const bool outside = open.size() == 1;
        if (At(at) == "(") {
            const bool is_query = operands_.IsQuery({at + 1, pieces_.size()});
            if (is_query) NoteWith(at);
            const bool lists = IsOneOf(At(at - 1), {"from", "join"}) || (open.back().lists && IsOneOf(At(at - 1), {",", "("}));
            open.push_back(is_query ? Level{enter(open.back().scope)} : Level{open.back().scope, lists});
        } else if (At(at) == ")") {
            open.pop_back();
        } else if (IsOneOf(At(at), {"union", "except", "intersect"})) {
            const std::size_t scope = open.back().scope, parent = parents_[scope];
            open.back() = {enter(parent == scope ? parents_.size() : parent)};
        } else if (IsWord(At(at), "select") && inserts && outside && open.back().scope == 0) {
            open.back().scope = enter(parents_.size());
        } else if (inserts && outside && (IsWord(At(at), "returning") || BeginsConflict(pieces_, at))) {
            open.back().scope = 0;
            if (IsWord(At(at), "on")) NoteExcluded();
        }
        Level& level = open.back();
        scopes_[at] = level.scope;
        if (IsWord(At(at), "into")) inserts = true;
        const bool from = BeginsFrom(pieces_, at);
        if (from) level.lists = true;
        if (IsOneOf(At(at), {"where", "group", "having", "order", "limit", "returning"}) || BeginsWindows(pieces_, at))
            level.lists = false;
        if (from || IsOneOf(At(at), {"join", "into", "update"}) || (At(at) == "," && level.lists))
            ReadTable(IsWord(At(at + 1), "or") ? at + 3 : at + 1, level.scope, IsWord(At(at), "into"));
    }
    for (Table& table : tables_)
        if (table.query == 0) UseWith(table);    // which comes later
}

// Behind ON CONFLICT the row that was to be inserted goes by a name of its own.
void Names::NoteExcluded() {
    const auto target = std::find_if(tables_.begin(), tables_.end(), [](const Table& table) { return table.is_target; });
    if (target == tables_.end()) return;
    Table excluded = *target;
    excluded.name = "excluded";
    tables_.push_back(std::move(excluded));
}

// Behind the WITH that a query may begin with.
std::size_t Names::MainQuery(std::size_t at) const {
    while (at < pieces_.size() && !IsOneOf(At(at), {"select", "values"})) at = (At(at) == "(" ? operands_.Partner(at) : at) + 1;
    return at;
}

// with NAME as (query), with NAME(a, b) as (query): the query opens at `open`.
void Names::NoteWith(std::size_t open) {
    std::size_t at = open;
    while (IsOneOf(At(at - 1), {"materialized", "not"})) --at;
    if (!IsWord(At(at - 1), "as")) return;
    With with;
    with.query = MainQuery(open + 1);
    at -= 2;
    if (At(at) == ")") {
        const std::size_t names = operands_.Partner(at);
        for (std::size_t name = names + 1; name < at; name += 2) with.names.push_back(At(name));
        at = names - 1;
    }
    with.name = PlainName(At(at));
    const std::size_t around = operands_.Around(at);
    with.seen = {around, around < pieces_.size() ? operands_.Partner(around) : 0};
    withs_.push_back(std::move(with));
}

void Names::ReadTable(std::size_t at, std::size_t scope, bool is_target) {
    while (At(at) == "(" && !operands_.IsQuery({at + 1, pieces_.size()})) ++at;
    const bool is_query = At(at) == "(";
    if (!is_query && (!IsName(At(at)) || IsWord(At(at), "set"))) return;    // do update set
    Table& table = tables_.emplace_back();
    table.scope = scope;
    table.is_natural = IsNaturalJoin(at);
    table.is_target = is_target;
    table.at = at;
    if (is_query) {
        table.query = MainQuery(at + 1);
        at = operands_.Partner(at) + 1;
    } else {
        at = ReadTableName(pieces_, at, table.table);
        table.name = table.table.name;
        UseWith(table);
    }
    const bool is_told = IsWord(At(at), "as");
    if (is_told) ++at;
    if (IsName(At(at)) && (is_told || !IsKeyword(At(at)))) table.name = PlainName(At(at++));
    if (IsWord(At(at), "using"))
        for (std::size_t name = at + 2; name < operands_.Partner(at + 1); name += 2) table.merged.push_back(At(name));
}

// natural [left|right|full] [outer|inner] join HERE
bool Names::IsNaturalJoin(std::size_t at) const {
    if (!IsWord(At(at - 1), "join")) return false;
    for (--at; IsOneOf(At(at - 1), {"left", "right", "full", "outer", "inner", "cross"}); --at) {}
    return IsWord(At(at - 1), "natural");
}

// A name that WITH has given hides a table's, within the parentheses around it.
void Names::UseWith(Table& table) const {
    for (const With& with : withs_) {
        const bool is_seen = with.seen.last == 0 || (table.at > with.seen.first && table.at < with.seen.last);
        if (!is_seen || !table.table.schema.empty() || !IsSame(with.name, table.table.name)) continue;
        table.query = with.query;
        table.names = with.names;
    }
}

bool Names::HasColumnOf(std::size_t select, const std::string& qualifier, TypeTest is_meant) {
    if (scopes_.empty()) ReadTables();
    for (const Table& table : tables_) {
        const bool is_named = qualifier.empty() || IsSame(table.name, qualifier);
        if (table.scope != scopes_[select] || !is_named) continue;
        if (table.query == 0 ? TableHasColumnOf(table.table, is_meant) : QueryHasColumnOf(table.query, is_meant)) return true;
    }
    return false;
}

bool Names::TableHasColumnOf(const TableName& table, TypeTest is_meant) const {
    const std::vector<TableColumn> columns = InsertableColumns(database_, table);
    return std::any_of(columns.begin(), columns.end(), [&](const TableColumn& c) { return is_meant(c.column.type); });
}

bool Names::QueryHasColumnOf(std::size_t query, TypeTest is_meant) {
    if (depth_ >= kDeepest) return true;
    ++depth_;
    const std::vector<Item> items = Items(query);
    const bool found = std::any_of(items.begin(), items.end(), [&](const Item& item) {
        if (item.is_all) return HasColumnOf(query, item.qualifier, is_meant);
        const TableColumn* const column = TypeOf(item.expression);
        return column && is_meant(column->column.type);
    });
    --depth_;
    return found;
}

}  // namespace engine::sqlite
