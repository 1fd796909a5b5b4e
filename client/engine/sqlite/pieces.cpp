// Cutting SQL text into pieces.
#include "engine/sqlite/pieces.h"

#include <algorithm>
#include <cctype>
#include <cstdlib>

namespace engine::sqlite {
namespace {

bool IsWordCharacter(char c) {
    return std::isalnum(static_cast<unsigned char>(c)) || c == '_' || c == '$' || (c & 0x80) != 0;
}

}  // namespace

std::string_view Pieces::Next() {
    SkipBlanks();
    const std::size_t begin = at_;
    if (at_ == sql_.size()) return {};
    const char c = sql_[at_];
    if (c == '\'' || c == '"' || c == '`' || c == '[') {
        const std::size_t end = sql_.find(c == '[' ? ']' : c, at_ + 1);
        at_ = end == std::string_view::npos ? sql_.size() : end + 1;
    } else if (IsWordCharacter(c)) {
        while (at_ < sql_.size() && IsWordCharacter(sql_[at_])) ++at_;
    } else {
        ++at_;
    }
    return sql_.substr(begin, at_ - begin);
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

bool IsWord(std::string_view piece, std::string_view lower) {
    return std::equal(piece.begin(), piece.end(), lower.begin(), lower.end(),
                      [](char a, char b) { return std::tolower(static_cast<unsigned char>(a)) == b; });
}

std::size_t ParameterAt(const std::vector<std::string_view>& pieces, std::size_t at) {
    if (at + 1 >= pieces.size() || pieces[at] != "?") return kNoParameter;
    const int number = std::atoi(std::string(pieces[at + 1]).c_str());
    return number > 0 ? static_cast<std::size_t>(number) - 1 : kNoParameter;
}

std::string PlainName(std::string_view piece) {
    const bool quoted = piece.size() >= 2 && (piece[0] == '"' || piece[0] == '`' || piece[0] == '[');
    return std::string(quoted ? piece.substr(1, piece.size() - 2) : piece);
}

std::string_view FirstWord(std::string_view sql) {
    Pieces pieces(sql);
    std::string_view piece = pieces.Next();
    while (piece == "(") piece = pieces.Next();
    return piece;
}

}  // namespace engine::sqlite
