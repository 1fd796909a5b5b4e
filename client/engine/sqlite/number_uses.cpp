// One pass over the pieces. A cast stays one, for its result is compared as a number then.
#include "engine/sqlite/number_uses.h"

#include <algorithm>
#include <initializer_list>
#include <string_view>

#include "engine/sqlite/column_types.h"
#include "engine/sqlite/functions.h"
#include "engine/sqlite/names.h"
#include "engine/sqlite/operands.h"
#include "oci.h"

namespace engine::sqlite {
namespace {

class Finder {
public:
    Finder(StatementReading& reading, ValueTargets& targets)
        : sql_(reading.sql), pieces_(reading.pieces), operands_(reading.operands), names_(reading.names), targets_(targets) {}

    void Find() {
        for (const Span text : targets_.texts) StoredText(text);
        for (std::size_t at = operands_.FirstExpression(); at < pieces_.size(); ++at) {
            if (pieces_[at] == "||") Concatenation(at);
            else if (IsWord(pieces_[at], "like")) Like(at);
            else if (operands_.At(at + 1) != "(") continue;
            else if (IsWord(pieces_[at], "cast")) Cast(at + 1);
            else if (IsOneOf(pieces_[at], {"length", "lower", "upper", "trim", "ltrim", "rtrim"})) Call(at + 1);
            else if (TakesTexts(pieces_[at])) ShowingCall(at + 1);
        }
    }

private:
    // Each operand of a chain once.
    void Concatenation(std::size_t at) {
        const Span left = operands_.OneBefore(at);
        const std::string_view before = operands_.At(left.first - 1);
        if (before != "||" && !IsWord(before, "collate")) AsText(left);
        AsText(operands_.OneFrom(at + 1));
    }

    void AsText(Span span) {
        if (span.Size() > 0 && !IsNoNumber(operands_.Bare(span))) WrapText(span);
    }

    void Like(std::size_t at) {
        const bool is_not = IsWord(operands_.At(at - 1), "not");
        NumberAsText(operands_.Before(is_not ? at - 1 : at));
        NumberAsText(operands_.From(at + 1));
    }

    // A call of the engine's own that takes texts, whose parenthesis opens at `open`.
    void Call(std::size_t open) {
        for (const Span argument : operands_.List({open, operands_.Partner(open) + 1})) NumberAsText(argument);
    }

    void NumberAsText(Span span) {
        if (MayBeNumber(operands_.Bare(span))) WrapText(span);
    }

    void WrapText(Span span) { Wrap(span, names_.HasAllDigits(span) ? "kelp_exact_text(" : "kelp_text("); }

    // A call that takes numbers as they are shown, by itself.
    void ShowingCall(std::size_t open) {
        for (const Span argument : operands_.List({open, operands_.Partner(open) + 1}))
            if (argument.Size() > 0 && names_.HasAllDigits(argument)) WrapText(argument);
    }

    // What is stored, as far as it is no comparison.
    void StoredText(Span stored) {
        if (operands_.From(stored.first).last == stored.last) AsText(stored);
    }

    bool MayBeNumber(Span span) {
        if (span.Size() == 1 && ParameterOf(operands_.At(span.first)) != kNoParameter) return true;
        if (const TableColumn* const column = names_.AnswerOf(span)) return IsNumeric(column->column.type);
        const std::vector<Span> choices = operands_.Choices(span);
        return std::any_of(choices.begin(), choices.end(), [&](Span choice) { return MayBeNumber(operands_.Bare(choice)); });
    }

    bool IsNoNumber(Span span) {
        const std::string_view piece = operands_.At(span.first);
        if (span.Size() == 1 && piece.back() == '\'') return true;
        const TableColumn* const column = operands_.IsColumn(span) ? names_.Resolve(span) : nullptr;
        if (!column) return false;
        const std::uint16_t type = column->column.type;
        return IsTextType(type) || IsDateType(type) || IsIntervalType(type);
    }

    // cast(e as T), whose parenthesis opens at `open`, or a table called so. Of what is no number, and of a number kept as a
    // blob, SQLite makes 0, for any type that is neither text nor blob; as one of those it takes the number's own bytes.
    void Cast(std::size_t open) {
        const std::size_t close = operands_.Partner(open);
        std::size_t as = open + 1;
        while (as < close && !IsWord(operands_.At(as), "as")) as = (operands_.At(as) == "(" ? operands_.Partner(as) : as) + 1;
        if (as == close) return;
        const std::string_view type = sql_.substr(Begin(as + 1), Begin(close) - Begin(as + 1));
        Column column;
        (void)ReadDeclaredType(type, column);
        const Span operand{open + 1, as};
        if (Holds(type, {"int"})) Wrap(operand, "kelp_whole(");
        else if (HasBinaryDigits(column)) Wrap(operand, "kelp_binary_double(");
        else if (Holds(type, {"char", "clob", "text", "blob"})) AsText(operand);
        else Wrap(operand, "kelp_real(");
    }

    // By SQLite's own rule, in this order.
    static bool Holds(std::string_view type, std::initializer_list<std::string_view> words) {
        const auto same = [](char written, char letter) { return (written | ' ') == letter; };
        return std::any_of(words.begin(), words.end(), [&](std::string_view word) {
            return std::search(type.begin(), type.end(), word.begin(), word.end(), same) != type.end();
        });
    }

    void Wrap(Span span, const char* call) {
        const std::string_view last = pieces_[span.last - 1];
        targets_.edits.push_back({Begin(span.first), Begin(span.last - 1) + last.size(), call, ")", false});
    }

    [[nodiscard]] std::size_t Begin(std::size_t index) const { return static_cast<std::size_t>(pieces_[index].data() - sql_.data()); }

    std::string_view sql_;
    const std::vector<std::string_view>& pieces_;
    const Operands& operands_;
    Names& names_;
    ValueTargets& targets_;
};

}  // namespace

void FindNumberUses(StatementReading& reading, ValueTargets& targets) { Finder(reading, targets).Find(); }

}  // namespace engine::sqlite
