// Finding comparisons and what they compare, in one pass over the pieces; a table is asked for its columns when a name is
// to be told. Linear but for the depth of what lies in parentheses.
#include "engine/sqlite/comparisons.h"

#include <algorithm>
#include <array>
#include <deque>
#include <set>
#include <string>
#include <utility>

#include "engine/pieces.h"
#include "engine/sqlite/column_types.h"
#include "engine/sqlite/function_values.h"
#include "engine/sqlite/operands.h"
#include "engine/sqlite/select_list.h"
#include "engine/sqlite/table_columns.h"
#include "handles/errors.h"

namespace engine::sqlite {
namespace {

bool IsOneOf(std::string_view piece, std::initializer_list<std::string_view> words) {
    return std::any_of(words.begin(), words.end(), [&](std::string_view word) { return IsWord(piece, word); });
}

// What begins another condition, so that the comparison before it is over.
bool EndsCondition(std::string_view piece) { return piece == "," || piece == ";" || IsKeyword(piece); }

class Finder {
public:
    Finder(sqlite3* database, std::string_view sql, const std::vector<std::string_view>& pieces, ValueTargets& targets)
        : database_(database), sql_(sql), pieces_(pieces), operands_(pieces), targets_(targets) {}

    Status Find() {
        // By depth of parentheses: whether the names of a SET come, whether there has been a comparison.
        struct Level {
            bool sets = false;
            bool compares = false;
        };
        std::vector<Level> levels(1);
        for (std::size_t at = FirstExpression(); at < pieces_.size() && status_.Ok(); ++at) {
            const std::string_view piece = pieces_[at];
            Level& level = levels.back();
            if (piece == "(") {
                levels.emplace_back();
            } else if (piece == ")") {
                if (levels.size() > 1) levels.pop_back();
            } else if (IsComparison(piece)) {
                if (level.sets && IsAssignment(at)) continue;
                if (level.compares) return Error(errors::kNotProperlyEnded, "a comparison of a comparison");
                level.compares = true;
                Compare(operands_.Before(at), operands_.From(at + 1));
            } else if (EndsCondition(piece)) {
                level.compares = false;
                if (IsWord(piece, "set")) level.sets = true;
                else if (IsOneOf(piece, {"where", "from", "returning", "order", "limit", "on"})) level.sets = false;
                else if (IsWord(piece, "between")) Between(at);
                else if (IsWord(piece, "in") && At(at + 1) == "(") In(at);
                else if (IsWord(piece, "case")) Case(at);
            }
        }
        return status_;
    }

private:
    // A table or subquery of the statement, where it is named.
    struct Table {
        std::size_t scope = 0;
        bool is_target = false;    // of an insert
        std::string name;          // its alias, if it has one
        TableName table;
        std::size_t query = 0;                  // where a subquery begins; 0: a table
        std::vector<std::string_view> names;    // of a subquery's columns, where WITH tells them
    };
    struct With {
        std::string name;
        std::size_t query = 0;
        std::vector<std::string_view> names;
    };

    std::string_view At(std::size_t index) const { return operands_.At(index); }

    // Queries and changes are looked through from their start, what they define or explain is not; of create table and
    // create view their query is.
    std::size_t FirstExpression() const {
        if (IsOneOf(At(0), {"select", "with", "values", "insert", "replace", "update", "delete"})) return 0;
        if (!IsWord(At(0), "create")) return pieces_.size();
        std::size_t at = 1;
        while (IsOneOf(At(at), {"temp", "temporary"})) ++at;
        if (!IsOneOf(At(at), {"table", "view"})) return pieces_.size();
        while (at < pieces_.size() && !(IsWord(At(at), "as") && operands_.IsQuery({at + 1, pieces_.size()}))) ++at;
        return at;
    }

    // name = ... or (names) = ... behind SET or a comma
    bool IsAssignment(std::size_t equals) const {
        std::size_t first = equals - 1;
        if (At(first) == ")") first = operands_.Partner(first);
        return first > 0 && (IsWord(At(first - 1), "set") || At(first - 1) == ",");
    }

    void Compare(Span left, Span right) {
        if (operands_.IsColumn(left) && operands_.IsColumn(right)) return;
        const std::vector<Span> lefts = operands_.List(left);
        const std::vector<Span> rights = operands_.List(right);
        if (lefts.size() > 1 && lefts.size() == rights.size()) {
            for (std::size_t index = 0; index < lefts.size(); ++index) Compare(lefts[index], rights[index]);
            return;
        }
        if (const TableColumn* column = ConcerningType(left)) Use(right, *column);
        else if (const TableColumn* other = ConcerningType(right)) Use(left, *other);
    }

    Span Subject(std::size_t at) const { return operands_.Before(IsWord(At(at - 1), "not") ? at - 1 : at); }

    void Between(std::size_t at) {
        const Span subject = Subject(at);
        const Span first = operands_.From(at + 1);
        if (first.Size() == 0 || !IsWord(At(first.last), "and")) return;
        Compare(subject, first);
        Compare(subject, operands_.From(first.last + 1));
    }

    void In(std::size_t at) {
        for (const Span& element : operands_.List({at + 1, operands_.Partner(at + 1) + 1}))
            Compare(Subject(at), element);
    }

    // case d when '01-JAN-24' then ... end
    void Case(std::size_t at) {
        const Span subject = operands_.From(at + 1);
        int depth = 1;
        for (at = subject.last; at < pieces_.size() && subject.Size() > 0; ++at) {
            if (At(at) == "(") at = operands_.Partner(at);
            else if (IsWord(At(at), "case")) ++depth;
            else if (IsWord(At(at), "end") && --depth == 0) return;
            else if (IsWord(At(at), "when") && depth == 1) Compare(subject, operands_.From(at + 1));
        }
    }

    // The column that an expression is, or one of the type of the date that it answers; null for anything else, and
    // where the column's type does not matter to what it is compared with.
    const TableColumn* ConcerningType(Span span) {
        const TableColumn* column = TypeOf(span);
        return column && column->concerned && Coercion::ConcernsComparison(column->column) ? column : nullptr;
    }

    const TableColumn* TypeOf(Span span) {
        span = operands_.Bare(span);
        if (span.Size() == 0 || operands_.IsValue(span)) return nullptr;
        if (operands_.IsColumn(span)) return Resolve(span);
        if (!IsName(At(span.first))) return nullptr;
        const ExpressionType type = ReadType({pieces_.begin() + static_cast<std::ptrdiff_t>(span.first),
                                              pieces_.begin() + static_cast<std::ptrdiff_t>(span.last)});
        const TableColumn* column = nullptr;
        if (!type.argument.empty()) {
            const auto first = static_cast<std::size_t>(
                std::find_if(pieces_.begin(), pieces_.end(),
                             [&](auto piece) { return piece.data() == type.argument.front().data(); }) -
                pieces_.begin());
            column = Resolve({first, first + type.argument.size()});
        } else if (!type.declared.empty()) {
            TableColumn answered;
            answered.declared = type.declared;
            answered.concerned = ReadDeclaredType(type.declared, answered.column);
            column = &columns_.emplace_back(std::move(answered));
        }
        return column && IsDateType(column->column.type) ? column : nullptr;
    }

    // What is compared with a column. A date takes anything but other columns and queries; columns of other types take
    // placeholders and literals.
    void Use(Span span, const TableColumn& column) {
        const Span bare = operands_.Bare(span);
        if (bare.Size() == 0) return;
        if (operands_.IsValue(bare)) {
            const std::size_t parameter = ParameterOf(At(bare.first));
            if (parameter == kNoParameter) return UseLiteral(bare, column);
            targets_.parameters.push_back({parameter, column.column, Coercion::Purpose::compare});
        } else if (IsDateType(column.column.type) && !operands_.IsColumn(bare) && !operands_.IsQuery(bare) &&
                   !IsWord(At(bare.first), "null") && !TypeOf(bare)) {
            Wrap(span, column);
        }
    }

    // A literal that is no value of the type is refused when the statement runs; in a view, when that is made.
    void UseLiteral(Span span, const TableColumn& column) {
        std::string literal;
        const Status status = Convert(PlainText(At(span.first)), column.column, Coercion::Purpose::compare, literal);
        if (status.Ok()) Add(span, std::move(literal), "", true);
        else if (IsWord(At(0), "create")) status_ = status;
        else Wrap(span, column);
    }

    void Wrap(Span span, const TableColumn& column) {
        Add(span, "kelp_compare(", ", " + Literal(column.declared) + ", " + Literal(column.column.name) + ")", false);
    }

    // A value may be compared with two columns; the first one counts.
    void Add(Span span, std::string before, std::string after, bool replaces) {
        if (!added_.insert({span.first, span.last}).second) return;
        const auto begin = static_cast<std::size_t>(At(span.first).data() - sql_.data());
        const std::string_view last = At(span.last - 1);
        const auto end = static_cast<std::size_t>(last.data() - sql_.data()) + last.size();
        targets_.edits.push_back({begin, end, std::move(before), std::move(after), replaces});
    }

    // ---- Names

    // What a name is found to be. A column of a subquery that is calculated is found, and is no table's column.
    struct Found {
        bool any = false;
        const TableColumn* column = nullptr;
    };

    const TableColumn* Resolve(Span name) {
        if (scopes_.empty()) ReadTables();
        const std::string qualifier = name.Size() > 1 ? PlainName(At(name.last - 3)) : std::string();
        if (depth_ == 0) looks_ = 0;
        return FindName(At(name.last - 1), qualifier, scopes_[name.first]).column;
    }

    // A column of the table that the qualifier says, or of those of the innermost query that has one so called; else of
    // any table, as behind what is not understood.
    Found FindName(std::string_view column, const std::string& qualifier, std::size_t scope) {
        const auto is_meant = [&](const Table& table) {
            return qualifier.empty() || sqlite3_stricmp(table.name.c_str(), qualifier.c_str()) == 0;
        };
        for (;; scope = parents_[scope]) {
            const auto in_scope = [&](const Table& table) { return table.scope == scope && is_meant(table); };
            const Found found = Agreed(column, in_scope);
            if (found.any || !status_.Ok()) return found;
            if (parents_[scope] == scope) break;
        }
        return Agreed(column, [](const Table& table) { return !table.is_target && table.query == 0; });
    }

    // The column of that name in the tables meant, if they agree on its type. Dates are too easily compared wrongly.
    template <class Meant>
    Found Agreed(std::string_view name, Meant is_meant) {
        Found agreed;
        for (std::size_t index = 0; index < tables_.size() && status_.Ok(); ++index) {
            if (!is_meant(tables_[index])) continue;
            const Found found = ColumnOf(tables_[index], name);
            if (!found.any) continue;
            const bool differs = agreed.column && found.column && agreed.column->column.type != found.column->column.type;
            const bool dates = differs && (IsDateType(agreed.column->column.type) || IsDateType(found.column->column.type));
            if (dates) status_ = Error(errors::kInconsistentTypes, "column " + PlainName(name));
            if (differs) return {true, nullptr};
            agreed = found;
        }
        return agreed;
    }

    Found ColumnOf(const Table& table, std::string_view name) {
        if (table.query == 0) {
            TableColumn column;
            if (!ReadColumn(database_, table.table, name, column)) return {};
            return {true, &columns_.emplace_back(std::move(column))};
        }
        constexpr int kDeepest = 30;       // a recursive query looks into itself
        constexpr int kMostLooks = 1000;   // subqueries that join each other twice and twice again
        if (depth_ >= kDeepest || ++looks_ > kMostLooks || !IsWord(At(table.query), "select")) return {};
        ++depth_;
        const Found found = ColumnOfQuery(table, PlainName(name));
        --depth_;
        return found;
    }

    // By the select list of a subquery, and the names that WITH gives to its columns.
    Found ColumnOfQuery(const Table& table, const std::string& name) {
        const std::vector<Item> items = Items(table.query);
        for (std::size_t index = 0; index < items.size(); ++index) {
            const Item& item = items[index];
            if (item.is_all && table.names.empty()) {
                const Found found = FindName(name, item.qualifier, scopes_[table.query]);
                if (found.any) return found;
                continue;
            }
            const std::string_view called = index < table.names.size() ? table.names[index] : item.name;
            if (sqlite3_stricmp(PlainName(called).c_str(), name.c_str()) == 0) return {true, TypeOf(item.expression)};
        }
        return {};
    }

    // An expression of a select list, and what it is called.
    struct Item {
        Span expression;
        std::string_view name;
        bool is_all = false;      // * or t.*
        std::string qualifier;
    };

    std::vector<Item> Items(std::size_t select) const {
        std::vector<Item> items;
        std::size_t begin = select + 1;
        if (IsOneOf(At(begin), {"distinct", "all"})) ++begin;
        for (std::size_t at = begin; at <= pieces_.size(); ++at) {
            if (At(at) == "(") at = operands_.Partner(at) + 1;
            const bool ends = At(at).empty() || At(at) == ")" || At(at) == ";" ||
                              IsOneOf(At(at), {"from", "where", "group", "having", "window", "union", "except",
                                               "intersect", "order", "limit"});
            if (!ends && At(at) != ",") continue;
            items.push_back(ReadItem({begin, at}));
            if (ends) break;
            begin = at + 1;
        }
        return items;
    }

    Item ReadItem(Span span) const {
        Item item{span, {}, false, {}};
        if (span.Size() == 0) return item;
        const std::string_view last = At(span.last - 1);
        if (last == "*") {
            item.is_all = true;
            if (span.Size() > 2) item.qualifier = PlainName(At(span.last - 3));
        } else if (span.Size() > 2 && IsWord(At(span.last - 2), "as")) {
            item.name = last;
            item.expression.last -= 2;
        } else if (operands_.From(span.first).last + 1 == span.last && IsName(last)) {
            item.name = last;
            --item.expression.last;
        } else if (operands_.IsColumn(span)) {
            item.name = last;
        }
        return item;
    }

    // The scope of each piece: a query, each part of a union for itself; what stands around the query of an insert is
    // none of its own. And the tables that are named behind from, join, into and update.
    void ReadTables() {
        scopes_.assign(pieces_.size(), 0);
        parents_.assign(1, 0);
        std::vector<std::size_t> open(1, 0);    // the scope at each depth of parentheses
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
                open.push_back(is_query ? enter(open.back()) : open.back());
            } else if (At(at) == ")" && !outside) {
                open.pop_back();
            } else if (IsOneOf(At(at), {"union", "except", "intersect"})) {
                const std::size_t parent = parents_[open.back()];
                open.back() = enter(parent == open.back() ? parents_.size() : parent);
            } else if (IsWord(At(at), "select") && inserts && outside && open.back() == 0) {
                open.back() = enter(parents_.size());
            } else if (IsOneOf(At(at), {"conflict", "returning"}) && outside) {
                open.back() = 0;
            }
            scopes_[at] = open.back();
            if (IsWord(At(at), "into")) inserts = true;
            if (IsOneOf(At(at), {"from", "join", "into", "update"}))
                ReadList(IsWord(At(at + 1), "or") ? at + 3 : at + 1, open.back(), IsWord(At(at), "into"));
        }
    }

    // with NAME as (query), with NAME(a, b) as (query): the query opens at `open`.
    void NoteWith(std::size_t open) {
        std::size_t at = open;
        while (at > 0 && IsOneOf(At(at - 1), {"materialized", "not"})) --at;
        if (at < 2 || !IsWord(At(at - 1), "as")) return;
        With with;
        with.query = open + 1;
        at -= 2;
        if (At(at) == ")") {
            const std::size_t names = operands_.Partner(at);
            for (std::size_t name = names + 1; name < at; name += 2) with.names.push_back(At(name));
            at = names - 1;
        }
        with.name = PlainName(At(at));
        withs_.push_back(std::move(with));
    }

    void ReadList(std::size_t at, std::size_t scope, bool is_target) {
        while (At(at) == "(" && !operands_.IsQuery({at + 1, pieces_.size()})) ++at;
        for (;;) {
            const bool is_query = At(at) == "(";
            if (!is_query && (!IsName(At(at)) || IsKeyword(At(at)))) return;
            Table& table = tables_.emplace_back();
            table.scope = scope;
            table.is_target = is_target;
            if (is_query) {
                table.query = at + 1;
                at = operands_.Partner(at) + 1;
            } else {
                at = ReadTableName(pieces_, at, table.table);
                table.name = table.table.name;
                UseWith(table);
            }
            if (IsWord(At(at), "as")) ++at;
            if (IsName(At(at)) && !IsKeyword(At(at))) table.name = PlainName(At(at++));
            if (At(at) != ",") return;
            ++at;
        }
    }

    // A name that WITH has given hides a table's.
    void UseWith(Table& table) const {
        for (const With& with : withs_) {
            if (sqlite3_stricmp(with.name.c_str(), table.name.c_str()) != 0) continue;
            table.query = with.query;
            table.names = with.names;
        }
    }

    sqlite3* database_;
    std::string_view sql_;
    const std::vector<std::string_view>& pieces_;
    Operands operands_;
    ValueTargets& targets_;
    std::set<std::pair<std::size_t, std::size_t>> added_;    // pieces that have their edit
    Status status_;
    std::vector<std::size_t> scopes_;     // by piece
    std::vector<std::size_t> parents_;    // by scope; the outermost is its own
    std::deque<Table> tables_;
    std::vector<With> withs_;
    int depth_ = 0;                       // of subqueries looked into, and how many for one name
    int looks_ = 0;
    std::deque<TableColumn> columns_;     // that were told of, and what calls answer
};

}  // namespace

Status FindComparisons(sqlite3* database, std::string_view sql, const std::vector<std::string_view>& pieces,
                       ValueTargets& targets) {
    return Finder(database, sql, pieces, targets).Find();
}

}  // namespace engine::sqlite
