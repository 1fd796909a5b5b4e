// Where an expression beside an operator begins and ends, and what it is. A view of the pieces of one statement.
#pragma once

#include <initializer_list>
#include <string_view>
#include <vector>

#include "engine/sqlite/value_targets.h"

namespace engine::sqlite {

class Operands {
public:
    explicit Operands(const std::vector<std::string_view>& pieces);

    // Empty behind the end, and before the start.
    [[nodiscard]] std::string_view At(std::size_t index) const {
        return index < pieces_.size() ? pieces_[index] : std::string_view();
    }
    // The parenthesis that belongs to the one at `index`; the end of the text for anything else.
    [[nodiscard]] std::size_t Partner(std::size_t index) const {
        return index < pieces_.size() ? partners_[index] : pieces_.size();
    }

    // The parenthesis that opens around a piece; the end of the text where there is none.
    [[nodiscard]] std::size_t Around(std::size_t index) const;

    // The expression that begins at `first`, or ends before `last`, as far as arithmetic and || go; empty when none is
    // understood.
    [[nodiscard]] Span From(std::size_t first) const;
    [[nodiscard]] Span Before(std::size_t last) const;    // without its collations
    [[nodiscard]] std::size_t BehindCollations(std::size_t at) const;
    // Behind the FILTER and OVER of a call that ends before `at`.
    [[nodiscard]] std::size_t BehindWindow(std::size_t at) const;
    // One operand alone, with its signs.
    [[nodiscard]] Span OneFrom(std::size_t first) const { return {first, OperandEnd(first)}; }
    [[nodiscard]] Span OneBefore(std::size_t last) const;

    // Without the parentheses around the whole of it.
    [[nodiscard]] Span Bare(Span span) const;
    // A placeholder or a text literal; a name, or several with points between them.
    [[nodiscard]] bool IsValue(Span span) const;
    [[nodiscard]] bool IsColumn(Span span) const;
    [[nodiscard]] bool IsQuery(Span span) const;
    // The parts of (a, b, c); none for anything else.
    [[nodiscard]] std::vector<Span> List(Span span) const;
    // The values that a CASE, or a call like nvl, gives one of; none for anything else.
    [[nodiscard]] std::vector<Span> Choices(Span span) const;
    // Of the call whose name stands at `function`, without DISTINCT; none where no call stands.
    [[nodiscard]] std::vector<Span> Arguments(std::size_t function) const;
    // Those of its arguments, or of the values of a CASE, one of which an expression is; none for anything else.
    [[nodiscard]] std::vector<Span> Answers(Span span) const;

    // Queries and changes are looked through from their start, what they define or explain is not; of create table and
    // create view their query is.
    [[nodiscard]] std::size_t FirstExpression() const;

private:
    [[nodiscard]] bool IsOperand(std::size_t index) const;
    [[nodiscard]] bool NamesWindow(std::size_t index) const;
    [[nodiscard]] std::size_t CaseEnd(std::size_t first) const;
    [[nodiscard]] std::size_t CaseBegin(std::size_t last) const;
    [[nodiscard]] std::size_t OperandEnd(std::size_t first) const;
    [[nodiscard]] std::size_t OperandBegin(std::size_t last) const;

    const std::vector<std::string_view>& pieces_;
    std::vector<std::size_t> partners_;
};

// Words of clauses and conditions; in an expression some of them may be names all the same.
bool IsKeyword(std::string_view piece);
bool MayBeName(std::string_view piece);

bool IsOneOf(std::string_view piece, std::initializer_list<std::string_view> words);    // in lower case

bool IsComparison(std::string_view piece);

}  // namespace engine::sqlite
