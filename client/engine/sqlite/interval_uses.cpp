// Judging uses by what stands beside them: what is not known to be right is refused.
#include "engine/sqlite/interval_uses.h"

#include <algorithm>
#include <string>

#include "engine/sqlite/column_types.h"
#include "engine/sqlite/names.h"
#include "engine/sqlite/operands.h"
#include "handles/errors.h"

namespace engine::sqlite {
namespace {

constexpr std::size_t kNone = static_cast<std::size_t>(-1);

bool IsPlainName(std::string_view piece) { return IsName(piece) && !IsKeyword(piece); }

// What may stand before an expression that is all of a condition's side, an item or an argument; and behind one.
bool Begins(std::string_view piece) { return piece == "(" || piece == "," || IsKeyword(piece); }
bool Ends(std::string_view piece) {
    if (piece.empty() || piece == ")" || piece == ",") return true;
    return IsName(piece) && !IsOneOf(piece, {"collate", "like", "glob", "match", "regexp", "escape", "over", "filter", "range"});
}

// What makes a condition of the expression before it.
bool IsCondition(std::string_view piece) {
    return IsComparison(piece) || IsOneOf(piece, {"is", "isnull", "notnull", "not", "in", "between"});
}

// Functions whose first argument may be an interval's text.
bool TakesText(std::string_view function) {
    constexpr std::string_view kPrefixes[] = {"kelp_varchar", "kelp_nvarchar", "kelp_char", "kelp_nchar", kSpanPrefix};
    return IsWord(function, "to_char") || std::any_of(std::begin(kPrefixes), std::end(kPrefixes), [&](std::string_view prefix) {
               return IsWord(function.substr(0, prefix.size()), prefix);
           });
}

class Finder {
public:
    Finder(StatementReading& reading, ValueTargets& targets)
        : sql_(reading.sql), pieces_(reading.pieces), operands_(reading.operands), names_(reading.names), targets_(targets) {}

    Status Find() {
        for (std::size_t at = operands_.FirstExpression(); at < pieces_.size() && status_.Ok(); ++at) {
            if (IsWord(At(at), "select")) CheckStars(at);
            const Span span = ExpressionAt(at);
            if (span.Size() == 0) continue;
            const TableColumn* const type = names_.TypeOf(span);
            if (type && IsIntervalType(type->column.type)) {
                type_ = type;
                if (!IsRight(span)) Refuse();
            }
            if (At(span.last) != "(" && operands_.IsColumn(span)) at = span.last - 1;
        }
        return status_.Ok() ? names_.Failure() : status_;
    }

private:
    [[nodiscard]] std::string_view At(std::size_t index) const { return operands_.At(index); }
    [[nodiscard]] std::string_view Before(std::size_t index) const { return At(index - 1); }
    void Refuse() {
        const bool is_named = type_ && !type_->column.name.empty();    // no cast
        status_ = Error(errors::kInconsistentTypes, is_named ? "column " + type_->column.name : "an interval");
    }

    // The name or the cast to an interval that begins at a piece; none for aliases and names of tables.
    [[nodiscard]] Span ExpressionAt(std::size_t at) const {
        if (!IsPlainName(At(at)) || Before(at) == ".") return {};
        const std::string_view before = Before(at);
        if (IsOneOf(before, {"as", "from", "join", "into", "update", "table", "view", "end"})) return {};
        if (before == ")" || IsPlainName(before) || IsNumber(before) || before.ends_with('\'')) return {};
        if (before == "," && IsWord(At(Clause(at)), "from")) return {};
        std::size_t last = at + 1;
        if (At(last) == "(") {
            const bool casts = At(at).size() > kSpanPrefix.size() && IsWord(At(at).substr(0, kSpanPrefix.size()), kSpanPrefix);
            return casts ? Span{at, operands_.Partner(last) + 1} : Span{};
        }
        while (At(last) == "." && IsName(At(last + 1))) last += 2;
        return At(last) == "." ? Span{} : Span{at, last};    // of a table whose columns are all named
    }

    // The word that begins the list which `at` stands in, or its parenthesis; kNone when there is neither.
    [[nodiscard]] std::size_t Clause(std::size_t at) const {
        while (at-- > 0) {
            if (At(at) == ")") at = operands_.Partner(at);
            else if (At(at) == "(" || IsOneOf(At(at), {"select", "by", "set", "returning", "values", "from", "limit"})) return at;
        }
        return kNone;
    }

    // The parenthesis around the query whose clause begins at `at`; kNone for the statement's own.
    [[nodiscard]] std::size_t Around(std::size_t at) const {
        while (at != kNone && At(at) != "(") at = Clause(at);
        return at;
    }

    bool IsRight(Span span) {
        bool is_plain = true;
        for (;;) {
            const std::string_view before = Before(span.first), after = At(span.last);
            if (before == "(" && after == ")") {
                const std::size_t open = span.first - 1;
                const std::string_view function = Before(open);
                if (!IsPlainName(function)) {
                    const bool is_row = function == "," && IsWord(At(Clause(open)), "values");
                    if (is_row || IsOneOf(function, {"in", "values", "using", "over"})) return InList(span, open);
                    span = {open, span.last + 1};
                } else if (IsOneOf(function, {"min", "max"})) {
                    span = {open - 1, operands_.BehindWindow(span.last + 1)};
                } else {
                    return IsWord(function, "count") || InList(span, open);
                }
                is_plain = false;
            } else if (after != "||" && !IsCondition(after) &&
                       (IsOneOf(before, {"select", "all", "distinct", "returning"}) ||
                        (before == "," && IsOneOf(At(Clause(span.first)), {"select", "returning"})))) {
                if (!Ends(after)) return false;
                const std::size_t clause = Clause(span.first);
                if (At(clause) == "(") return IsWord(Before(clause), "count");
                const std::size_t open = Around(clause);
                if (open == kNone || !IsScalar(open)) return InSelectList(span, clause, open, is_plain);
                if (IsCompound(clause) || names_.Items(clause).size() != 1) return false;
                span = {open, operands_.Partner(open) + 1};
                is_plain = false;
            } else {
                return StandsRight(span);
            }
        }
    }

    // ---- Conditions, assignments and lists

    bool StandsRight(Span span) {
        const std::string_view before = Before(span.first), after = At(span.last);
        if (before == "||" || after == "||")
            return (before == "||" || Begins(before)) && (after == "||" || Ends(after)) && AsText(span);
        if (IsComparison(before)) return Ends(after) && BehindComparison(span);
        const std::size_t low = IsWord(before, "and") ? operands_.Before(span.first - 1).first : span.first;
        if (IsWord(Before(low), "between")) return Ends(after) && Fits(Subject(low - 1), span) && BoundsFit(low, span);
        if (!Begins(before) || IsOneOf(before, {"is", "like", "glob", "escape"})) return false;
        if (IsWord(before, "in")) return Ends(after) && Fits(Subject(span.first - 1), span);
        if (IsComparison(after)) return IsTarget(span) || Fits(operands_.From(span.last + 1), span);
        if (IsOneOf(after, {"isnull", "notnull"})) return true;
        if (IsOneOf(after, {"is", "not", "in", "between"})) return BeforeCondition(span);
        if (!Ends(after)) return false;
        if (IsWord(before, "by")) return true;
        const std::size_t clause = before == "(" ? span.first - 1 : before == "," ? Clause(span.first) : kNone;
        return IsWord(At(clause), "by") || (At(clause) == "(" && InList(span, clause));
    }

    [[nodiscard]] Span Subject(std::size_t at) const { return operands_.Before(IsWord(Before(at), "not") ? at - 1 : at); }

    // set span = ..., behind SET or a comma
    [[nodiscard]] bool IsTarget(Span span) const {
        return At(span.last) == "=" &&
               (IsWord(Before(span.first), "set") ||
                (Before(span.first) == "," && IsWord(At(Clause(span.first)), "set")));
    }

    bool BehindComparison(Span span) {
        const Span other = operands_.Before(span.first - 1);
        return IsTarget(other) ? AsText(span) : Fits(other, span);
    }

    // is null, not null, [not] in (...), [not] between ... and ...
    bool BeforeCondition(Span span) {
        std::size_t at = span.last;
        const bool is = IsWord(At(at), "is");
        if (is) ++at;
        if (IsWord(At(at), "not")) ++at;
        if (IsWord(At(at), "null")) return true;
        if (is) return false;
        if (IsWord(At(at), "between")) return BoundsFit(at + 1, span);
        if (!IsWord(At(at), "in") || At(at + 1) != "(") return false;
        const Span list{at + 1, operands_.Partner(at + 1) + 1};
        if (operands_.IsQuery({at + 2, list.last})) return Fits(list, span);
        return ListFits(list, span);
    }

    // Both bounds behind BETWEEN, all elements behind IN: a value that is read as an interval is compared with each.
    bool BoundsFit(std::size_t low, Span span) {
        const Span first = operands_.From(low);
        return Fits(first, span) && IsWord(At(first.last), "and") && Fits(operands_.From(first.last + 1), span);
    }
    bool ListFits(Span list, Span span) {
        const std::vector<Span> parts = operands_.List(list);
        return std::all_of(parts.begin(), parts.end(), [&](Span part) { return Fits(part, span); });
    }

    // Whether an expression may be compared with an interval: a null, a value that is read as one, another of its type.
    bool Fits(Span other, Span span) {
        if (other.Size() == 0) return false;
        const Span bare = operands_.Bare(other);
        if (bare.Size() == 1 && IsWord(At(bare.first), "null")) return true;
        if (operands_.IsValue(bare)) return IsOfType(span);
        if (!operands_.IsQuery(bare)) return IsOfType(other);
        if (!IsWord(At(bare.first), "select") || IsCompound(bare.first)) return false;
        return IsOfType(names_.Items(bare.first)[0].expression);
    }

    bool IsOfType(Span span) {
        const TableColumn* const found = names_.TypeOf(span);
        return found && found->column.type == type_->column.type;
    }

    // An element of what stands in parentheses: the arguments of a call, values, names of columns.
    bool InList(Span span, std::size_t open) {
        const std::string_view word = Before(open);
        const bool is_first = span.first == open + 1;
        if (IsOneOf(word, {"using", "conflict", "set"})) return true;
        if (IsWord(word, "in"))
            return Fits(Subject(open - 1), span) && ListFits({open, operands_.Partner(open) + 1}, span);
        if (IsWord(word, "values") || (word == "," && IsWord(At(Clause(open)), "values"))) return AsText(span);
        if (!IsPlainName(word)) return false;
        if (is_first && TakesText(word)) return AsText(span);
        std::size_t name = open - 1;
        while (Before(name) == ".") name -= 2;
        const std::size_t as = operands_.Partner(open) + 1;
        std::size_t query = as + 1;
        while (IsOneOf(At(query), {"not", "materialized"})) ++query;
        const bool names_with = IsWord(At(as), "as") && At(query) == "(";
        return IsWord(Before(name), "into") || names_with;
    }

    // ---- Select lists

    // Whether the query in the parentheses is a value, not one whose columns have names.
    [[nodiscard]] bool IsScalar(std::size_t open) const {
        const std::string_view before = Before(open);
        if (IsOneOf(before, {"from", "join", "as", "materialized", "exists"})) return false;
        if (before == "," && IsWord(At(Clause(open)), "from")) return false;
        return !(before == "=" && names_.Items(open + 1).size() > 1);    // set (a, b) = (select ...)
    }

    // The first and the last piece around the parts of a union.
    [[nodiscard]] Span Level(std::size_t clause) const {
        const std::size_t open = Around(clause);
        return open == kNone ? Span{0, pieces_.size()} : Span{open + 1, operands_.Partner(open)};
    }

    // The SELECTs of a query's parts.
    [[nodiscard]] std::vector<std::size_t> Parts(std::size_t clause) const {
        std::vector<std::size_t> parts;
        const Span level = Level(clause);
        for (std::size_t at = level.first; at < level.last; ++at) {
            if (At(at) == "(") at = operands_.Partner(at);
            else if (IsOneOf(At(at), {"select", "values"})) parts.push_back(at);
        }
        return parts;
    }
    [[nodiscard]] bool IsCompound(std::size_t clause) const { return Parts(clause).size() > 1; }

    bool InSelectList(Span span, std::size_t clause, std::size_t open, bool is_plain) {
        if (Before(open) == "=") return AsText(span);
        const std::vector<Names::Item> items = names_.Items(clause);
        const auto item = std::find_if(items.begin(), items.end(), [&](const Names::Item& candidate) {
            return candidate.expression.last == span.last;
        });
        if (item == items.end()) return false;
        const bool shows = open == kNone;
        if (shows && Changes(clause)) return AsText(span);
        if (MakesTable()) return false;
        if (!is_plain && (shows ? IsWord(At(0), "create") : !IsWord(Before(open), "exists"))) return false;
        const auto index = static_cast<std::size_t>(item - items.begin());
        if (IsWord(At(clause), "select") && IsCompound(clause) && !Agree(Parts(clause), index)) return false;
        const bool is_told = std::none_of(items.begin(), item, [](const Names::Item& other) { return other.is_all; });
        if (shows && is_told) NoteShown(index);
        return is_told || is_plain;
    }

    // With the digits of each part of a union.
    void NoteShown(std::size_t item) {
        for (ValueTargets::Interval& noted : targets_.intervals) {
            if (noted.item != item) continue;
            noted.column.precision = std::max(noted.column.precision, type_->column.precision);
            noted.column.scale = std::max(noted.column.scale, type_->column.scale);
            return;
        }
        targets_.intervals.push_back({item, type_->column});
    }

    // Whether the query whose SELECT is told gives an insert its rows.
    [[nodiscard]] bool Changes(std::size_t clause) const {
        if (!IsWord(At(clause), "select")) return false;
        for (std::size_t at = 0; at < clause; ++at) {
            if (At(at) == "(") at = operands_.Partner(at);
            else if (IsOneOf(At(at), {"insert", "replace"})) return true;
        }
        return false;
    }

    // create table as: SQLite forgets the types
    [[nodiscard]] bool MakesTable() const {
        return IsWord(At(0), "create") && !IsWord(At(1), "view") && !IsWord(At(2), "view");
    }

    bool Agree(const std::vector<std::size_t>& parts, std::size_t index) {
        return std::all_of(parts.begin(), parts.end(), [&](std::size_t part) {
            if (!IsWord(At(part), "select")) return false;
            const std::vector<Names::Item> items = names_.Items(part);
            const bool is_all = std::any_of(items.begin(), items.end(), [](const Names::Item& item) { return item.is_all; });
            return !is_all && index < items.size() && IsOfType(items[index].expression);
        });
    }

    // "*" hides what goes into a table, or meets columns of another query.
    void CheckStars(std::size_t select) {
        const bool goes = Around(select) == kNone && (MakesTable() || Changes(select));
        if (!goes && !IsCompound(select)) return;
        type_ = nullptr;
        for (const Names::Item& item : names_.Items(select)) {
            if (item.is_all && names_.HasColumnOf(select, item.qualifier, IsIntervalType)) Refuse();
        }
    }

    // The interval's text takes its place.
    bool AsText(Span span) {
        const auto begin = static_cast<std::size_t>(At(span.first).data() - sql_.data());
        const std::string_view last = At(span.last - 1);
        const auto end = static_cast<std::size_t>(last.data() - sql_.data()) + last.size();
        targets_.edits.push_back({begin, end, "kelp_interval_text(", ", " + Literal(type_->declared) + ")", false});
        return true;
    }

    std::string_view sql_;
    const std::vector<std::string_view>& pieces_;
    const Operands& operands_;
    Names& names_;
    ValueTargets& targets_;
    const TableColumn* type_ = nullptr;    // of the use that is looked at
    Status status_;
};

}  // namespace

Status FindIntervalUses(StatementReading& reading, ValueTargets& targets) {
    return Finder(reading, targets).Find();
}

}  // namespace engine::sqlite
