// One pass over the pieces: only what stands beside an operator, or in a function of numbers, is looked at.
#include "engine/sqlite/date_uses.h"

#include <algorithm>
#include <string>

#include "date/date.h"
#include "engine/sqlite/column_types.h"
#include "engine/sqlite/functions.h"
#include "engine/sqlite/names.h"
#include "engine/sqlite/operands.h"
#include "handles/errors.h"

namespace engine::sqlite {
namespace {

// Of numbers, and bits.
bool IsOperator(std::string_view piece) {
    if (piece.size() == 1) return std::string_view("+-*/%&|~").find(piece[0]) != std::string_view::npos;
    return piece == "<<" || piece == ">>";
}

class Finder {
public:
    explicit Finder(StatementReading& reading) : pieces_(reading.pieces), operands_(reading.operands), names_(reading.names) {}

    Status Find() {
        for (std::size_t at = operands_.FirstExpression(); at < pieces_.size(); ++at) {
            const bool calculates = IsOperator(At(at)) ? IsDate(Left(at)) || IsDate(operands_.OneFrom(at + 1))
                                                       : At(at + 1) == "(" && TakesNumbers(At(at)) && AnyDate(operands_.Arguments(at));
            if (!names_.Failure().Ok()) return names_.Failure();
            if (calculates) return Error(errors::kInconsistentTypes, detail_);
        }
        return {};
    }

private:
    [[nodiscard]] std::string_view At(std::size_t index) const { return operands_.At(index); }
    [[nodiscard]] std::string_view Before(std::size_t index) const { return At(index - 1); }

    // What stands before an operator.
    [[nodiscard]] Span Left(std::size_t at) const {
        Span span = operands_.OneBefore(at);
        if (span.Size() > 0 && IsWord(Before(span.first), "collate")) span = operands_.OneBefore(span.first - 1);
        return span;
    }

    bool AnyDate(const std::vector<Span>& spans) {
        return std::any_of(spans.begin(), spans.end(), [&](Span span) { return IsDate(span); });
    }

    bool IsDate(Span span) {
        span = operands_.Bare(span);
        if (span.Size() == 0) return false;
        if (operands_.IsQuery(span)) return AnswersDate(span);
        if (const std::vector<Span> answers = operands_.Answers(span); !answers.empty()) return AnyDate(answers);
        detail_ = "a date";
        if (span.Size() == 1 && (IsLiteral(At(span.first)) || IsWord(At(span.first), "current_time")))
            return IsWord(At(span.first), "current_time") || IsDateText(PlainText(At(span.first)));
        const TableColumn* const type = names_.TypeOf(span);
        if (!type || !IsDateType(type->column.type)) return false;
        if (!type->column.name.empty()) detail_ = "column " + type->column.name;    // no call
        return true;
    }

    static bool IsDateText(const std::string& text) {
        date::DateTime value;
        return date::FromEngineText(text, &value) == 0 && value.month != 0;    // no time alone
    }

    // Whether one of the SELECTs of a scalar subquery answers a date.
    bool AnswersDate(Span query) {
        for (std::size_t at = query.first; at < query.last; ++at) {
            if (At(at) == "(") at = operands_.Partner(at);
            if (!IsWord(At(at), "select")) continue;
            detail_ = "a date";
            for (const Names::Item& item : names_.Items(at))
                if (item.is_all ? names_.HasColumnOf(at, item.qualifier, IsDateType) : IsDate(item.expression)) return true;
        }
        return false;
    }

    const std::vector<std::string_view>& pieces_;
    const Operands& operands_;
    Names& names_;
    std::string detail_;    // what was found to be a date
};

}  // namespace

Status FindDateUses(StatementReading& reading) { return Finder(reading).Find(); }

}  // namespace engine::sqlite
