// Reading the items of a select list: an alias is cut off, what is left is told by its first pieces.
#include "engine/sqlite/select_list.h"

#include <algorithm>
#include <array>
#include <utility>

#include "engine/pieces.h"
#include "engine/sqlite/functions.h"
#include "engine/sqlite/operands.h"

namespace engine::sqlite {
namespace {

// Whether the parenthesis at pieces[open] closes at the last piece.
bool ClosesLast(const std::vector<std::string_view>& pieces, std::size_t open) {
    int depth = 0;
    for (std::size_t index = open; index < pieces.size(); ++index) {
        if (pieces[index] == "(") ++depth;
        if (pieces[index] == ")" && --depth == 0) return index + 1 == pieces.size();
    }
    return false;
}

// The argument, from 1, of the call whose parenthesis stands at pieces[1].
std::vector<std::string_view> Argument(const std::vector<std::string_view>& pieces, int position) {
    std::vector<std::string_view> argument;
    int depth = 0;
    for (std::size_t index = 1; index + 1 < pieces.size(); ++index) {
        if (pieces[index] == "(") ++depth;
        if (pieces[index] == ")") --depth;
        if (depth == 1 && pieces[index] == ",") --position;
        else if (position == 1 && index > 1) argument.push_back(pieces[index]);
    }
    return argument;
}

// cast(e as T(a, b)), or F(e, a, b) of a function that casts.
std::string CastType(const std::vector<std::string_view>& pieces) {
    if (pieces.size() < 4 || pieces[1] != "(" || !ClosesLast(pieces, 1)) return {};
    std::string_view name = pieces[0];
    const bool counts_characters = name.ends_with(kCountsCharacters);
    if (counts_characters) name.remove_suffix(kCountsCharacters.size());
    const auto* cast = std::find_if(std::begin(kCasts), std::end(kCasts), [&](const Dialect::Spelling& spelling) {
        return IsWord(name, spelling.engine);
    });
    const bool by_function = cast != std::end(kCasts);
    if (!by_function && !IsWord(pieces[0], "cast")) return {};
    int depth = 0;
    for (std::size_t index = 1; index + 1 < pieces.size(); ++index) {
        if (pieces[index] == "(") ++depth;
        if (pieces[index] == ")") --depth;
        if (depth != 1 || !(by_function ? pieces[index] == "," : IsWord(pieces[index], "as"))) continue;
        const char* begin = pieces[index + 1].data();
        const std::string rest(begin, pieces.back().data());
        if (!by_function) return rest;
        return std::string(cast->written).append(counts_characters ? kCountsCharacters : "") + '(' + rest + ')';
    }
    return by_function ? std::string(cast->written) : std::string();
}

// Whether the pieces are numbers, calls, names and the like with nothing but arithmetic between them. Comparisons and
// || are none, nor is what may be a name behind an operand; a plus before one does nothing to it.
bool IsArithmetic(const std::vector<std::string_view>& pieces) {
    const std::size_t first = pieces[0] == "-" || pieces[0] == "+" ? 1 : 0;
    int depth = 0;
    bool calculates = pieces[0] == "-";
    for (std::size_t index = first; index < pieces.size(); ++index) {
        const std::string_view piece = pieces[index];
        if (piece == "(") ++depth;
        if (piece == ")") --depth;
        if (depth > 0 || piece == ")" || piece == ".") continue;
        const bool is_operator = piece.size() == 1 && std::string_view("+-*/%").find(piece[0]) != std::string_view::npos;
        if (is_operator && index + 1 == pieces.size()) return false;    // t.*
        calculates |= is_operator;
        if (!is_operator && !IsNumber(piece) && ParameterOf(piece) == kNoParameter && !IsLiteral(piece) &&
            !MayBeName(piece))
            return false;
    }
    return calculates;
}

// Takes "over NAME", "over (...)" and "filter (...)" off the end.
void CutWindow(std::vector<std::string_view>& pieces) {
    const std::size_t size = pieces.size();
    if (size > 3 && IsName(pieces[size - 1]) && IsWord(pieces[size - 2], "over") && pieces[size - 3] == ")") pieces.resize(size - 2);
    int depth = 0;
    for (std::size_t index = pieces.size(); index-- > 1;) {
        if (pieces[index] == ")") ++depth;
        if (pieces[index] == "(") --depth;
        if (depth != 0) continue;
        const bool is_window = IsWord(pieces[index - 1], "over") || IsWord(pieces[index - 1], "filter");
        if (pieces[index] != "(" || !is_window) return;
        pieces.resize(--index);
    }
}

// Pieces that are an operand by themselves, so that a name behind them is an alias.
bool EndsOperand(std::string_view piece) {
    return piece == ")" || IsNumber(piece) || IsLiteral(piece) || ParameterOf(piece) != kNoParameter ||
           IsWord(piece, "end") || (IsName(piece) && !IsKeyword(piece));
}

// "expression as name" or "expression name".
bool CutAlias(std::vector<std::string_view>& pieces) {
    if (pieces.size() < 2 || !IsName(pieces.back()) || IsKeyword(pieces.back())) return false;
    const std::string_view before = pieces[pieces.size() - 2];
    const bool by_word = pieces.size() > 2 && IsWord(before, "as");
    if (!by_word && !EndsOperand(before)) return false;
    pieces.resize(pieces.size() - (by_word ? 2 : 1));
    return true;
}

SelectItem ReadItem(std::string_view text) {
    std::vector<std::string_view> pieces = Split(text);
    SelectItem item;
    if (pieces.empty()) return item;
    item.has_alias = CutAlias(pieces);
    const std::size_t size = pieces.size();
    const bool is_name = size == 1 || (size <= 5 && pieces[1] == "." && pieces[size - 2] == ".");    // main.t.rowid
    item.is_row_id = is_name && IsWord(pieces.back(), "rowid");
    item.type = ReadType(std::move(pieces)).declared;
    return item;
}

// Goes on to what a change returns; false when it returns nothing.
bool PassReturning(Pieces& pieces) {
    int depth = 0;
    for (std::string_view piece = pieces.Next(); !piece.empty(); piece = pieces.Next()) {
        if (piece == "(") ++depth;
        if (piece == ")") --depth;
        if (depth == 0 && IsWord(piece, "returning")) return true;
    }
    return false;
}

// The piece between `before` and `rest`; "window" does before NAME AS, "from" but behind DISTINCT.
bool EndsList(std::string_view piece, std::string_view before, Pieces rest) {
    constexpr std::array<std::string_view, 7> kClauses = {"where", "union", "order", "limit", "group", "except", "intersect"};
    if (IsWord(piece, "window")) return IsName(rest.Next()) && IsWord(rest.Next(), "as");
    if (IsWord(piece, "from")) return !IsWord(before, "distinct");
    return piece.empty() || piece == ";" || piece == ")" ||
           std::any_of(kClauses.begin(), kClauses.end(),
                       [&](std::string_view clause) { return IsWord(piece, clause); });
}

}  // namespace

ExpressionType ReadType(std::vector<std::string_view> pieces) {
    for (;;) {
        while (pieces.size() > 2 && pieces[0] == "(" && ClosesLast(pieces, 0))
            pieces = {pieces.begin() + 1, pieces.end() - 1};
        CutWindow(pieces);
        if (pieces.empty()) return {};
        if (pieces.size() == 1 && IsNumber(pieces[0])) return {"number", {}};
        if (IsArithmetic(pieces)) return {"number", {}};
        if (pieces[0] == "+") {
            pieces.erase(pieces.begin());
            continue;
        }
        if (std::string type = CastType(pieces); !type.empty()) return {std::move(type), {}};
        if (IsName(pieces[0]) && pieces.size() % 2 == 1 && (pieces.size() == 1 || pieces[1] == ".")) {
            return {{}, std::move(pieces)};
        }
        if (pieces.size() < 3 || pieces[1] != "(") return {};
        const ResultType result = FunctionResult(pieces[0]);
        if (!ClosesLast(pieces, 1)) return {};
        if (result.like == 0) return {std::string(result.declared), {}};
        pieces = Argument(pieces, result.like);
    }
}

std::vector<SelectItem> ReadSelectList(std::string_view sql) {
    Pieces pieces(sql);
    const std::string_view verb = pieces.Next();
    const bool is_values = IsWord(verb, "values");
    if (IsOneOf(verb, {"with", "insert", "replace", "update", "delete"})) {
        if (!PassReturning(pieces)) return {};
    } else if (!is_values && !IsWord(verb, "select")) {
        return {};
    }
    if (is_values) pieces.Next();    // the parenthesis
    std::vector<SelectItem> items;
    std::size_t begin = pieces.At();
    int depth = 0;
    std::string_view before, piece;
    for (;;) {
        const std::size_t end = pieces.At();
        before = std::exchange(piece, pieces.Next());
        if (depth == 0 && begin == end && (IsWord(piece, "distinct") || IsWord(piece, "all"))) {
            begin = pieces.At();
        } else if (depth == 0 && (piece == "," || EndsList(piece, before, pieces))) {
            items.push_back(ReadItem(sql.substr(begin, end - begin)));
            if (piece != ",") return items;
            begin = pieces.At();
        } else if (piece.empty()) {
            return {};
        } else if (piece == "*" && depth == 0 &&
                   sql.substr(begin, end - begin).find_first_not_of(" \t\r\n") == std::string_view::npos) {
            return {};
        } else if (piece == "(") {
            ++depth;
        } else if (piece == ")") {
            --depth;
        }
    }
}

}  // namespace engine::sqlite
