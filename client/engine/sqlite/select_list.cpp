#include "engine/sqlite/select_list.h"

#include <algorithm>
#include <array>
#include <cctype>

#include "engine/sqlite/functions.h"

namespace engine::sqlite {
namespace {

bool IsWordCharacter(char c) {
    return std::isalnum(static_cast<unsigned char>(c)) || c == '_' || c == '$' || (c & 0x80) != 0;
}

// Pieces of SQL: words, quoted texts, single characters. Comments and blanks are no pieces.
class Pieces {
public:
    explicit Pieces(std::string_view sql) : sql_(sql) {}

    // The next piece; empty at the end.
    std::string_view Next() {
        SkipBlanks();
        const std::size_t begin = at_;
        if (at_ == sql_.size()) return {};
        const char c = sql_[at_];
        if (c == '\'' || c == '"' || c == '`') SkipQuoted(c);
        else if (IsWordCharacter(c)) while (at_ < sql_.size() && IsWordCharacter(sql_[at_])) ++at_;
        else ++at_;
        return sql_.substr(begin, at_ - begin);
    }
    [[nodiscard]] std::size_t At() const { return at_; }

private:
    void SkipBlanks() {
        for (;;) {
            while (at_ < sql_.size() && std::isspace(static_cast<unsigned char>(sql_[at_]))) ++at_;
            if (sql_.substr(at_, 2) == "--") at_ = std::min(sql_.find('\n', at_), sql_.size());
            else if (sql_.substr(at_, 2) == "/*") at_ = std::min(sql_.find("*/", at_ + 2), sql_.size() - 2) + 2;
            else return;
        }
    }
    void SkipQuoted(char quote) {
        const std::size_t end = sql_.find(quote, at_ + 1);
        at_ = end == std::string_view::npos ? sql_.size() : end + 1;
    }

    std::string_view sql_;
    std::size_t at_ = 0;
};

bool Is(std::string_view word, std::string_view lower) {
    return std::equal(word.begin(), word.end(), lower.begin(), lower.end(),
                      [](char a, char b) { return std::tolower(static_cast<unsigned char>(a)) == b; });
}

std::vector<std::string_view> Split(std::string_view text) {
    std::vector<std::string_view> pieces;
    Pieces source(text);
    for (std::string_view piece = source.Next(); !piece.empty(); piece = source.Next()) pieces.push_back(piece);
    return pieces;
}

// Whether the parenthesis at pieces[open] closes at the last piece.
bool ClosesLast(const std::vector<std::string_view>& pieces, std::size_t open) {
    int depth = 0;
    for (std::size_t index = open; index < pieces.size(); ++index) {
        if (pieces[index] == "(") ++depth;
        if (pieces[index] == ")" && --depth == 0) return index + 1 == pieces.size();
    }
    return false;
}

// cast(e as T(a, b)), or F(e, a, b) of a function that casts.
std::string CastType(const std::vector<std::string_view>& pieces) {
    if (pieces.size() < 4 || pieces[1] != "(" || !ClosesLast(pieces, 1)) return {};
    const auto* cast = std::find_if(std::begin(kCasts), std::end(kCasts),
                                    [&](const Dialect::Spelling& spelling) { return Is(pieces[0], spelling.engine); });
    const bool by_function = cast != std::end(kCasts);
    if (!by_function && !Is(pieces[0], "cast")) return {};
    int depth = 0;
    for (std::size_t index = 1; index + 1 < pieces.size(); ++index) {
        if (pieces[index] == "(") ++depth;
        if (pieces[index] == ")") --depth;
        if (depth != 1 || !(by_function ? pieces[index] == "," : Is(pieces[index], "as"))) continue;
        const char* begin = pieces[index + 1].data();
        const std::string rest(begin, pieces.back().data());
        return by_function ? std::string(cast->written) + '(' + rest + ')' : rest;
    }
    return by_function ? std::string(cast->written) : std::string();
}

SelectItem ReadItem(std::string_view text) {
    std::vector<std::string_view> pieces = Split(text);
    for (std::size_t index = 1; index + 1 < pieces.size(); ++index) {
        if (index + 2 == pieces.size() && Is(pieces[index], "as")) pieces.resize(index);
    }
    SelectItem item;
    item.is_row_id = !pieces.empty() && Is(pieces.back(), "rowid") &&
                     (pieces.size() == 1 || (pieces.size() == 3 && pieces[1] == "."));
    item.cast_type = CastType(pieces);
    return item;
}

bool EndsList(std::string_view piece) {
    constexpr std::array<std::string_view, 9> kClauses = {"from", "where", "union", "order", "limit", "group",
                                                          "except", "intersect", "window"};
    return piece.empty() || piece == ";" || piece == ")" ||
           std::any_of(kClauses.begin(), kClauses.end(), [&](std::string_view clause) { return Is(piece, clause); });
}

}  // namespace

std::string_view FirstWord(std::string_view sql) {
    Pieces pieces(sql);
    std::string_view piece = pieces.Next();
    while (piece == "(") piece = pieces.Next();
    return piece;
}

std::vector<SelectItem> ReadSelectList(std::string_view sql) {
    Pieces pieces(sql);
    const std::string_view verb = pieces.Next();
    const bool is_values = Is(verb, "values");
    if (!is_values && !Is(verb, "select")) return {};
    if (is_values) pieces.Next();    // the parenthesis
    std::vector<SelectItem> items;
    std::size_t begin = pieces.At();
    int depth = 0;
    for (;;) {
        const std::size_t end = pieces.At();
        const std::string_view piece = pieces.Next();
        if (depth == 0 && begin == end && (Is(piece, "distinct") || Is(piece, "all"))) {
            begin = pieces.At();
        } else if (depth == 0 && (piece == "," || EndsList(piece))) {
            items.push_back(ReadItem(sql.substr(begin, end - begin)));
            if (piece != ",") return items;
            begin = pieces.At();
        } else if (piece.empty()) {
            return {};
        } else if (piece == "*" && depth == 0 && sql.substr(begin, end - begin).find_first_not_of(" \t\r\n") == std::string_view::npos) {
            return {};
        } else if (piece == "(") {
            ++depth;
        } else if (piece == ")") {
            --depth;
        }
    }
}

}  // namespace engine::sqlite
