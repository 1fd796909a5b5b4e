// Finding comparisons and what they compare, in one pass over the pieces; a table is asked for its columns when a name is
// to be told. Linear but for the depth of what lies in parentheses.
#include "engine/sqlite/comparisons.h"

#include <algorithm>
#include <array>
#include <set>
#include <string>
#include <utility>

#include "engine/pieces.h"
#include "engine/sqlite/column_types.h"
#include "engine/sqlite/names.h"
#include "engine/sqlite/operands.h"
#include "engine/sqlite/table_columns.h"
#include "handles/errors.h"

namespace engine::sqlite {
namespace {

// What begins another condition, so that the comparison before it is over.
bool EndsCondition(std::string_view piece) { return piece == "," || piece == ";" || IsKeyword(piece); }

class Finder {
public:
    Finder(StatementReading& reading, ValueTargets& targets)
        : sql_(reading.sql), pieces_(reading.pieces), operands_(reading.operands), names_(reading.names), targets_(targets) {}

    Status Find() {
        // By depth of parentheses: whether the names of a SET come, whether there has been a comparison.
        struct Level {
            bool sets = false;
            bool compares = false;
        };
        std::vector<Level> levels(1);
        for (std::size_t at = operands_.FirstExpression(); at < pieces_.size() && status_.Ok() && names_.Failure().Ok(); ++at) {
            const std::string_view piece = pieces_[at];
            Level& level = levels.back();
            if (piece == "(") {
                levels.emplace_back();
            } else if (piece == ")") {
                levels.pop_back();
            } else if (IsComparison(piece)) {
                if (level.sets && IsAssignment(at)) continue;
                if (level.compares) return Error(errors::kNotProperlyEnded, "a comparison of a comparison");
                level.compares = true;
                Compare(operands_.Before(at), operands_.From(at + 1));
            } else if (IsWord(piece, "nullif") && At(at + 1) == "(") {
                if (const std::vector<Span> values = operands_.Arguments(at); values.size() == 2) Compare(values[0], values[1]);
            } else if (EndsCondition(piece)) {
                level.compares = false;
                if (IsWord(piece, "set")) level.sets = true;
                else if (IsOneOf(piece, {"where", "returning", "order", "limit", "on"}) || BeginsFrom(pieces_, at)) level.sets = false;
                else if (IsWord(piece, "between")) Between(at);
                else if (IsWord(piece, "in") && At(at + 1) == "(") In(at);
                else if (IsWord(piece, "case")) Case(at);
                else if (IsWord(piece, "is")) Is(at);
            }
        }
        return status_.Ok() ? names_.Failure() : status_;
    }

private:
    std::string_view At(std::size_t index) const { return operands_.At(index); }

    // name = ... or (names) = ... behind SET or a comma
    bool IsAssignment(std::size_t equals) const {
        std::size_t first = equals - 1;
        if (At(first) == ")") first = operands_.Partner(first);
        return IsWord(At(first - 1), "set") || At(first - 1) == ",";
    }

    void Compare(Span left, Span right) {
        if (operands_.IsColumn(left) && operands_.IsColumn(right)) return;
        const std::vector<Span> lefts = operands_.List(left);
        const std::vector<Span> rights = operands_.List(right);
        if (lefts.size() > 1 && lefts.size() == rights.size()) {
            for (std::size_t index = 0; index < lefts.size(); ++index) Compare(lefts[index], rights[index]);
            return;
        }
        const TableColumn* const column = ConcerningType(left);
        if (column) Use(right, *column);
        else if (const TableColumn* other = ConcerningType(right)) Use(left, *other);
        UseChoices(left);
        UseChoices(right);
    }

    // What stands beside a date in nvl or CASE is read as one, too.
    void UseChoices(Span span) {
        const TableColumn* const column = ConcerningType(span);
        if (!column || !IsDateType(column->column.type)) return;
        for (const Span choice : operands_.Choices(operands_.Bare(span))) {
            Use(choice, *column);
            UseChoices(choice);
        }
    }

    Span Subject(std::size_t at) const { return operands_.Before(IsWord(At(at - 1), "not") ? at - 1 : at); }

    void Between(std::size_t at) {
        const Span subject = Subject(at);
        const Span first = operands_.From(at + 1);
        const std::size_t middle = operands_.BehindCollations(first.last);
        if (IsWord(At(middle), "and")) CompareEach(subject, {first, operands_.From(middle + 1)});
    }

    void In(std::size_t at) { CompareEach(Subject(at), operands_.List({at + 1, operands_.Partner(at + 1) + 1})); }

    // d is '01-JAN-24', d is not distinct from '01-JAN-24'
    void Is(std::size_t at) {
        std::size_t other = at + 1;
        while (IsOneOf(At(other), {"not", "distinct", "from"})) ++other;
        if (!IsWord(At(other), "null")) Compare(operands_.Before(at), operands_.From(other));
    }

    void CompareEach(Span subject, const std::vector<Span>& others) {
        for (const Span other : others) Compare(subject, other);
        const Span bare = operands_.Bare(subject);
        if (!operands_.IsValue(bare)) return;
        CheckTypes(others, PlainText(At(bare.first)).ends_with(' '));
        UseBeside(others);
    }

    // A value that is read as a column's meets other values: they are read alike.
    void UseBeside(const std::vector<Span>& others) {
        const TableColumn* column = nullptr;
        for (const Span other : others)
            if (!column) column = ConcerningType(other);
        if (!column) return;
        for (const Span other : others) Use(other, *column);
    }

    // A value is read in one way only: it cannot be compared with a date or a raw, or with blanks at its end with fixed
    // text, and with something else, too.
    void CheckTypes(const std::vector<Span>& others, bool ends_in_blank) {
        const auto type = [&](const TableColumn& found) -> int {
            if (IsDateType(found.column.type)) return SQLT_DAT;
            return found.column.type == SQLT_BIN || (ends_in_blank && found.column.type == SQLT_AFC) ? found.column.type : 0;
        };
        const TableColumn* first = nullptr;
        for (const Span other : others) {
            const TableColumn* const found = names_.TypeOf(other);
            if (!found) continue;
            if (first && type(*first) != type(*found)) status_ = Error(errors::kInconsistentTypes, "column " + found->column.name);
            first = found;
        }
    }

    // case d when '01-JAN-24' then ... end
    void Case(std::size_t at) {
        const Span subject = operands_.From(at + 1);
        std::vector<Span> others;
        int depth = 1;
        for (at = subject.last; at < pieces_.size() && subject.Size() > 0 && depth > 0; ++at) {
            if (IsWord(At(at), "case")) ++depth;
            else if (IsWord(At(at), "end")) --depth;
            else if (IsWord(At(at), "when") && depth == 1) others.push_back(operands_.From(at + 1));
        }
        if (depth == 0) CompareEach(subject, others);
    }

    // The column that an expression is, or one of the type of the date that it answers; null for anything else, and
    // where the column's type does not matter to what it is compared with.
    const TableColumn* ConcerningType(Span span) {
        const TableColumn* column = names_.TypeOf(span);
        return column && column->concerned && Coercion::ConcernsComparison(column->column) ? column : nullptr;
    }

    // What is compared with a column. A date takes anything but other columns and queries; columns of other types take
    // placeholders and literals.
    void Use(Span span, const TableColumn& column) {
        const Span bare = operands_.Bare(span);
        if (bare.Size() == 0) {
            if (IsDateType(column.column.type)) status_ = Error(errors::kInconsistentTypes, "column " + column.column.name);
        } else if (operands_.IsValue(bare)) {
            const std::size_t parameter = ParameterOf(At(bare.first));
            if (parameter == kNoParameter) return UseLiteral(bare, column);
            targets_.parameters.push_back({parameter, column.column, Coercion::Purpose::compare});
        } else if (IsDateType(column.column.type) && !operands_.IsColumn(bare) && !operands_.IsQuery(bare) &&
                   !IsWord(At(bare.first), "null") && !names_.TypeOf(bare)) {
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

    std::string_view sql_;
    const std::vector<std::string_view>& pieces_;
    const Operands& operands_;
    Names& names_;
    ValueTargets& targets_;
    std::set<std::pair<std::size_t, std::size_t>> added_;    // pieces that have their edit
    Status status_;
};

}  // namespace

Status FindComparisons(StatementReading& reading, ValueTargets& targets) {
    return Finder(reading, targets).Find();
}

}  // namespace engine::sqlite
