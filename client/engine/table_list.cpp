#include "engine/table_list.h"

#include <algorithm>
#include <utility>

namespace engine {

std::size_t ReadTableName(const PieceList& pieces, std::size_t at, TableName& table) {
    table = {};
    if (at >= pieces.size()) return at;
    table.name = PlainName(pieces[at++]);
    if (at + 1 < pieces.size() && pieces[at] == ".") {
        table.schema = std::exchange(table.name, PlainName(pieces[at + 1]));
        at += 2;
    }
    return at;
}

bool IsAnyOf(std::string_view piece, std::initializer_list<std::string_view> words) {
    return std::any_of(words.begin(), words.end(), [&](std::string_view word) { return IsWord(piece, word); });
}

bool BeginsWindows(const PieceList& pieces, std::size_t at) {
    return at + 2 < pieces.size() && IsWord(pieces[at], "window") && IsName(pieces[at + 1]) && IsWord(pieces[at + 2], "as");
}

bool BeginsConflict(const PieceList& pieces, std::size_t at) {
    return at + 2 < pieces.size() && IsWord(pieces[at], "on") && IsWord(pieces[at + 1], "conflict") &&
           (pieces[at + 2] == "(" || IsWord(pieces[at + 2], "do"));
}

bool BeginsFrom(const PieceList& pieces, std::size_t at) {
    return at < pieces.size() && IsWord(pieces[at], "from") && !(at > 0 && IsWord(pieces[at - 1], "distinct"));
}

std::size_t FindPiece(const PieceList& pieces, std::size_t from, std::initializer_list<std::string_view> words) {
    int depth = 0;
    for (std::size_t index = from; index < pieces.size(); ++index) {
        if (depth == 0 && IsAnyOf(pieces[index], words) && (!IsWord(pieces[index], "from") || BeginsFrom(pieces, index))) return index;
        if (pieces[index] == "(") ++depth;
        if (pieces[index] == ")") --depth;
    }
    return pieces.size();
}

std::optional<ListOfTable> ReadSelect(const PieceList& pieces) {
    if (pieces.size() < 4 || !IsWord(pieces[0], "select") || IsWord(pieces[1], "distinct")) return {};
    const std::size_t first = IsWord(pieces[1], "all") ? 2 : 1;
    const std::size_t from = FindPiece(pieces, first, {"from"});
    if (from + 1 >= pieces.size() || !IsName(pieces[from + 1])) return {};
    ListOfTable read;
    read.list = {first, from};
    std::size_t at = ReadTableName(pieces, from + 1, read.table);
    const auto goes_on = [&] { return at < pieces.size() && pieces[at] != ";"; };
    const auto is_clause = [&] { return IsAnyOf(pieces[at], {"where", "order", "limit", "offset", "fetch", "for"}); };
    if (goes_on() && IsWord(pieces[at], "as")) ++at;
    if (goes_on() && !is_clause() && IsName(pieces[at])) read.alias = pieces[at++];
    if (goes_on() && !is_clause()) return {};
    if (FindPiece(pieces, at, {"union", "except", "intersect", "group", "having"}) < pieces.size()) return {};
    for (at = FindPiece(pieces, at, {"window"}); at < pieces.size(); at = FindPiece(pieces, at + 1, {"window"}))
        if (BeginsWindows(pieces, at)) return {};
    return read;
}

std::optional<ListOfTable> ReadReturning(const PieceList& pieces) {
    if (pieces.size() < 4 || !IsAnyOf(pieces[0], {"insert", "update", "delete", "replace"})) return {};
    const std::size_t returning = FindPiece(pieces, 0, {"returning"});
    if (returning == pieces.size()) return {};
    std::size_t at = 1;
    if (IsWord(pieces[at], "or")) at += 2;
    if (IsAnyOf(pieces[at], {"into", "from"})) ++at;
    ListOfTable read;
    ReadTableName(pieces, at, read.table);
    const std::size_t end = pieces.back() == ";" ? pieces.size() - 1 : pieces.size();
    read.list = {returning + 1, end};
    return read;
}

}  // namespace engine
