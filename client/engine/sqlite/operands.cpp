// Reading expressions by their pieces, forwards and backwards.
#include "engine/sqlite/operands.h"

#include <algorithm>
#include <array>
#include <cctype>

#include "engine/pieces.h"


namespace engine::sqlite {
namespace {

// In order.
constexpr std::string_view kKeywords[] = {
    "all", "and", "as", "asc", "between", "by", "case", "check", "collate", "cross", "default", "delete", "desc",
    "distinct", "do", "else", "end", "escape", "except", "exists", "filter", "from", "full", "glob", "group",
    "having", "in", "inner", "insert", "intersect", "into", "is", "isnull", "join", "left", "like", "limit", "match",
    "natural", "not", "notnull", "null", "nulls", "offset", "on", "or", "order", "outer", "over", "partition",
    "regexp", "returning", "right", "select", "set", "then", "union", "update", "using", "values", "when", "where",
    "window", "with"};
constexpr std::size_t kLongestKeyword = 9;

constexpr std::string_view kArithmetic[] = {"+", "-", "*", "/", "%", "&", "|", "||", "<<", ">>", "->", "->>"};

template <class List>
bool Contains(const List& list, std::string_view piece) {
    return std::find(std::begin(list), std::end(list), piece) != std::end(list);
}

}  // namespace

bool IsKeyword(std::string_view piece) {
    std::array<char, kLongestKeyword> lower;
    if (piece.empty() || piece.size() > lower.size() || !std::isalpha(static_cast<unsigned char>(piece[0]))) return false;
    std::transform(piece.begin(), piece.end(), lower.begin(),
                   [](unsigned char c) { return static_cast<char>(std::tolower(c)); });
    return std::binary_search(std::begin(kKeywords), std::end(kKeywords), std::string_view(lower.data(), piece.size()));
}

bool MayBeName(std::string_view piece) {
    return IsName(piece) &&
           (!IsKeyword(piece) || IsOneOf(piece, {"asc", "cross", "desc", "do", "end", "full", "inner", "left", "match", "nulls", "offset",
                                                 "outer", "over", "partition", "right", "window", "with"}));
}

bool IsComparison(std::string_view piece) {
    constexpr std::string_view kComparisons[] = {"=", "==", "<>", "!=", "<", ">", "<=", ">="};
    return Contains(kComparisons, piece);
}

bool IsOneOf(std::string_view piece, std::initializer_list<std::string_view> words) {
    return std::any_of(words.begin(), words.end(), [&](std::string_view word) { return IsWord(piece, word); });
}

Operands::Operands(const std::vector<std::string_view>& pieces) : pieces_(pieces), partners_(pieces.size() + 1) {
    std::vector<std::size_t> open;
    std::fill(partners_.begin(), partners_.end(), pieces.size());
    for (std::size_t index = 0; index < pieces.size(); ++index) {
        if (pieces[index] == "(") open.push_back(index);
        if (pieces[index] != ")" || open.empty()) continue;
        partners_[index] = open.back();
        partners_[open.back()] = index;
        open.pop_back();
    }
}

std::size_t Operands::Around(std::size_t index) const {
    while (index-- > 0) {
        if (At(index) == ")") index = Partner(index);
        else if (At(index) == "(") return index;
    }
    return pieces_.size();
}

// A word, literal, number or placeholder that is an operand, or begins one, by itself.
bool Operands::IsOperand(std::size_t index) const {
    const std::string_view piece = At(index);
    if (piece.empty() || IsWord(piece, "null")) return !piece.empty();
    if (IsName(piece)) return MayBeName(piece);
    return piece.back() == '\'' || IsNumber(piece) || ParameterOf(piece) != kNoParameter;
}

// Behind the operand at `first`: its signs, its points, the arguments of a call and what follows them. `first` itself
// when there is none.
std::size_t Operands::OperandEnd(std::size_t first) const {
    std::size_t at = first;
    while (At(at) == "+" || At(at) == "-" || At(at) == "~") ++at;
    if (At(at) == "(") return Partner(at) + 1;
    if (IsWord(At(at), "case")) return CaseEnd(at);
    if (!IsOperand(at)) return first;
    ++at;
    while (At(at) == ".") at += 2;
    if (At(at) != "(") return at;
    return BehindWindow(Partner(at) + 1);
}

// over NAME, behind a call: "over" is a name elsewhere.
bool Operands::NamesWindow(std::size_t index) const {
    return IsName(At(index)) && !IsKeyword(At(index)) && IsWord(At(index - 1), "over") && At(index - 2) == ")";
}

std::size_t Operands::BehindWindow(std::size_t at) const {
    while (IsOneOf(At(at), {"over", "filter"}) && At(at + 1) == "(") at = Partner(at + 1) + 1;
    return NamesWindow(at + 1) ? at + 2 : at;
}

// Behind the END of the CASE at `first`; `first` itself when it has none.
std::size_t Operands::CaseEnd(std::size_t first) const {
    int depth = 0;
    for (std::size_t at = first; at < pieces_.size(); ++at) {
        if (IsWord(At(at), "case")) ++depth;
        if (IsWord(At(at), "end") && --depth == 0) return at + 1;
    }
    return first;
}

// Where the CASE begins whose END stands before `last`.
std::size_t Operands::CaseBegin(std::size_t last) const {
    int depth = 0;
    for (std::size_t at = last; at-- > 0;) {
        if (IsWord(At(at), "end")) ++depth;
        if (IsWord(At(at), "case") && --depth == 0) return at;
    }
    return last;
}

Span Operands::From(std::size_t first) const {
    std::size_t end = OperandEnd(first);
    while (end > first && Contains(kArithmetic, At(end))) {
        const std::size_t next = OperandEnd(end + 1);
        if (next == end + 1) return {first, first};
        end = next;
    }
    return {first, end};
}

// Where the operand before `last` begins, without its signs; `last` itself when there is none, as behind IN and EXISTS, whose
// conditions are numbers.
std::size_t Operands::OperandBegin(std::size_t last) const {
    std::size_t at = last - 1;
    if (IsWord(At(at), "end") && CaseBegin(last) < last) return CaseBegin(last);
    if (NamesWindow(at)) return OperandBegin(at - 1);
    bool is_named = true;
    if (At(at) == ")") {
        at = Partner(at);
        if (IsOneOf(At(at - 1), {"over", "filter"})) return OperandBegin(at - 1);
        is_named = IsName(At(at - 1)) && !IsKeyword(At(at - 1));
        if (is_named) --at;
    } else if (!IsOperand(at)) {
        return last;
    }
    while (is_named && At(at - 1) == ".") at -= 2;
    return IsOneOf(At(at - 1), {"in", "exists"}) ? last : at;
}

std::size_t Operands::BehindCollations(std::size_t at) const {
    while (IsWord(At(at), "collate")) at += 2;
    return at;
}

Span Operands::Before(std::size_t last) const {
    while (IsWord(At(last - 2), "collate")) last -= 2;
    std::size_t begin = OperandBegin(last);
    while (Contains(kArithmetic, At(begin - 1))) begin = OperandBegin(begin - 1);    // or a sign
    return {begin, last};
}

Span Operands::OneBefore(std::size_t last) const {
    std::size_t begin = OperandBegin(last);
    const auto is_sign = [&](std::size_t at) {
        const bool signs = At(at) == "+" || At(at) == "-" || At(at) == "~";
        return signs && OperandBegin(at) == at;
    };
    while (begin < last && is_sign(begin - 1)) --begin;
    return {begin, last};
}

Span Operands::Bare(Span span) const {
    while (span.Size() > 2 && At(span.first) == "(" && Partner(span.first) == span.last - 1) {
        ++span.first;
        --span.last;
    }
    return span;
}

bool Operands::IsValue(Span span) const {
    return span.Size() == 1 && (IsLiteral(At(span.first)) || ParameterOf(At(span.first)) != kNoParameter);
}

bool Operands::IsColumn(Span span) const {
    if (span.Size() % 2 == 0 || IsWord(At(span.first), "null")) return false;
    for (std::size_t at = span.first; at < span.last; ++at) {
        const bool is_point = (at - span.first) % 2 == 1;
        if (is_point ? At(at) != "." : !IsName(At(at))) return false;
    }
    return true;
}

bool Operands::IsQuery(Span span) const {
    if (IsOneOf(At(span.first), {"select", "values"})) return true;
    if (!IsWord(At(span.first), "with")) return false;
    std::size_t at = span.first + (IsWord(At(span.first + 1), "recursive") ? 3 : 2);    // behind the first name, but for a column "with"
    if (At(at) == "(") at = Partner(at) + 1;
    return IsWord(At(at), "as");
}

std::vector<Span> Operands::List(Span span) const {
    std::vector<Span> parts;
    if (span.Size() < 2 || At(span.first) != "(" || Partner(span.first) != span.last - 1) return parts;
    if (IsQuery({span.first + 1, span.last})) return parts;
    std::size_t begin = span.first + 1;
    for (std::size_t at = begin; at < span.last; ++at) {
        if (At(at) == "(") at = Partner(at);
        if (At(at) != "," && at + 1 != span.last) continue;
        parts.push_back({begin, at});
        begin = at + 1;
    }
    return parts;
}

std::vector<Span> Operands::Choices(Span span) const {
    if (IsOneOf(At(span.first), {"nvl", "coalesce", "ifnull"})) return List({span.first + 1, span.last});
    std::vector<Span> values;
    if (!IsWord(At(span.first), "case") || CaseEnd(span.first) != span.last) return values;
    int depth = 0;
    for (std::size_t at = span.first; at < span.last; ++at) {
        if (IsWord(At(at), "case")) ++depth;
        if (IsWord(At(at), "end")) --depth;
        if (depth == 1 && IsOneOf(At(at), {"then", "else"})) values.push_back(From(at + 1));
    }
    return values;
}

std::vector<Span> Operands::Arguments(std::size_t function) const {
    if (!IsName(At(function))) return {};
    std::vector<Span> arguments = List({function + 1, Partner(function + 1) + 1});
    if (!arguments.empty() && IsOneOf(At(arguments[0].first), {"distinct", "all"})) ++arguments[0].first;
    return arguments;
}

std::vector<Span> Operands::Answers(Span span) const {
    std::vector<Span> values = Choices(span);
    if (!values.empty() || At(span.first + 1) != "(" || OneFrom(span.first).last != span.last) return values;
    const std::string_view function = At(span.first);
    values = Arguments(span.first);
    if (IsOneOf(function, {"min", "max", "greatest", "least"})) return values;
    std::size_t first = 0, step = values.size();
    if (IsOneOf(function, {"nvl2", "iif", "if"})) first = step = 1;
    else if (IsWord(function, "decode")) first = step = 2;
    else if (IsOneOf(function, {"lag", "lead"})) step = 2;    // and the default
    else if (!IsOneOf(function, {"trunc", "nullif", "first_value", "last_value", "nth_value"})) return {};
    std::vector<Span> chosen;
    for (std::size_t index = first; index < values.size(); index += step) chosen.push_back(values[index]);
    if (first == 2 && values.size() % 2 == 0) chosen.push_back(values.back());    // decode's default
    return chosen;
}

std::size_t Operands::FirstExpression() const {
    if (IsOneOf(At(0), {"select", "with", "values", "insert", "replace", "update", "delete"})) return 0;
    if (!IsWord(At(0), "create")) return pieces_.size();
    std::size_t at = 1;
    while (IsOneOf(At(at), {"temp", "temporary"})) ++at;
    if (!IsOneOf(At(at), {"table", "view"})) return pieces_.size();
    while (at < pieces_.size() && !(IsWord(At(at), "as") && IsQuery({at + 1, pieces_.size()}))) ++at;
    return at;
}

}  // namespace engine::sqlite
