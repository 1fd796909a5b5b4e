// Cutting SQL text into pieces.
#include "engine/pieces.h"

#include <algorithm>
#include <cctype>
#include <cstdlib>
#include <iterator>

namespace engine {

bool IsWordCharacter(char c) {
    return std::isalnum(static_cast<unsigned char>(c)) || c == '_' || c == '$' || (c & 0x80) != 0;
}

namespace {

bool IsDigit(char c) { return c >= '0' && c <= '9'; }

// The longer of two that begin alike stands first.
constexpr std::string_view kOperators[] = {"->>", "->", "<=", ">=", "<>", "!=", "==", "||", "<<", ">>"};

// What stands between quotes, of which a doubled one is one. There are none within brackets.
std::string Unquoted(std::string_view piece) {
    const char quote = piece.back();
    const std::string_view inside = piece.substr(1, piece.size() - 2);
    std::string plain;
    for (std::size_t at = 0; at < inside.size(); ++at) {
        plain.push_back(inside[at]);
        if (inside[at] == quote) ++at;
    }
    return plain;
}

}  // namespace

std::string_view Pieces::Next() {
    SkipBlanks();
    const std::size_t begin = at_;
    if (at_ == sql_.size()) return {};
    const char c = sql_[at_];
    const bool is_blob = (c == 'x' || c == 'X') && Character(at_ + 1) == '\'';
    const auto* found = std::find_if(std::begin(kOperators), std::end(kOperators),
                                     [&](std::string_view text) { return sql_.substr(at_).starts_with(text); });
    if (is_blob) at_ = QuotedEnd(at_ + 1);
    else if (c == '\'' || c == '"' || c == '`' || c == '[') at_ = QuotedEnd(at_);
    else if (IsDigit(c) || (c == '.' && IsDigit(Character(at_ + 1)))) at_ = NumberEnd(at_);
    else if (c == '?') at_ = WordEnd(at_ + 1);
    else if (IsWordCharacter(c)) at_ = WordEnd(at_);
    else at_ += found != std::end(kOperators) ? found->size() : 1;
    return sql_.substr(begin, at_ - begin);
}

// Behind the quoted part that opens at `quote`.
std::size_t Pieces::QuotedEnd(std::size_t quote) const {
    const char closing = sql_[quote] == '[' ? ']' : sql_[quote];
    std::size_t end = quote;
    do {
        end = sql_.find(closing, end + 1);
        if (end == std::string_view::npos) return sql_.size();
        ++end;
    } while (closing != ']' && Character(end) == closing);
    return end;
}

std::size_t Pieces::NumberEnd(std::size_t begin) const {
    std::size_t end = begin;
    while (IsWordCharacter(Character(end)) || Character(end) == '.') {
        const bool exponent = (Character(end) | 0x20) == 'e';
        ++end;
        const bool sign = Character(end) == '+' || Character(end) == '-';
        if (exponent && sign && IsDigit(Character(end + 1))) ++end;
    }
    return end;
}

std::size_t Pieces::WordEnd(std::size_t begin) const {
    while (begin < sql_.size() && IsWordCharacter(sql_[begin])) ++begin;
    return begin;
}

void Pieces::SkipBlanks() {
    for (;;) {
        while (at_ < sql_.size() && std::isspace(static_cast<unsigned char>(sql_[at_]))) ++at_;
        if (sql_.substr(at_, 2) == "--") at_ = std::min(sql_.find('\n', at_), sql_.size());
        else if (sql_.substr(at_, 2) == "/*") at_ = std::min(sql_.find("*/", at_ + 2), sql_.size() - 2) + 2;
        else return;
    }
}

std::vector<std::string_view> Split(std::string_view sql) {
    std::vector<std::string_view> pieces;
    Pieces source(sql);
    for (std::string_view piece = source.Next(); !piece.empty(); piece = source.Next()) pieces.push_back(piece);
    return pieces;
}

std::string Lower(std::string_view text) {
    std::string lower(text);
    for (char& c : lower) c = static_cast<char>(c >= 'A' && c <= 'Z' ? c - 'A' + 'a' : c);
    return lower;
}

bool IsWord(std::string_view piece, std::string_view lower) {
    return std::equal(piece.begin(), piece.end(), lower.begin(), lower.end(),
                      [](char a, char b) { return std::tolower(static_cast<unsigned char>(a)) == b; });
}

std::size_t ParameterOf(std::string_view piece) {
    if (piece.size() < 2 || piece[0] != '?') return kNoParameter;
    return static_cast<std::size_t>(std::atoi(std::string(piece.substr(1)).c_str())) - 1;
}

bool IsName(std::string_view piece) {
    if (piece.empty() || piece.back() == '\'') return false;
    const auto first = static_cast<unsigned char>(piece[0]);
    return first == '"' || first == '`' || first == '[' || first == '_' || std::isalpha(first) || first >= 0x80;
}

bool IsLiteral(std::string_view piece) { return !piece.empty() && piece[0] == '\''; }

bool IsNumber(std::string_view piece) {
    return !piece.empty() && (IsDigit(piece[0]) || (piece[0] == '.' && piece.size() > 1));
}

bool ReadObjectName(std::string_view text, ObjectName& read) {
    const PieceList pieces = Split(text);
    const bool qualified = pieces.size() == 3 && pieces[1] == ".";
    if (pieces.size() != 1 && !qualified) return false;
    read = {qualified ? pieces.front() : std::string_view(), pieces.back()};
    const auto is_closed = [](std::string_view piece) {
        return IsName(piece) && (piece.front() != '"' || (piece.size() > 2 && piece.back() == '"'));
    };
    return is_closed(pieces.front()) && is_closed(pieces.back());
}

std::string PlainName(std::string_view piece) {
    const bool quoted = piece.size() >= 2 && (piece[0] == '"' || piece[0] == '`' || piece[0] == '[' || piece[0] == '\'');
    return quoted ? Unquoted(piece) : std::string(piece);
}

std::string PlainText(std::string_view literal) { return Unquoted(literal); }

}  // namespace engine
