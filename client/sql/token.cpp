// Cutting SQL text into tokens: one look at each character, but for what closes a quote. Any thread.
#include "sql/token.h"

#include <algorithm>

namespace sql {
namespace {

bool IsDigit(char c) { return c >= '0' && c <= '9'; }
bool IsWordStart(char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || c == '_' || static_cast<unsigned char>(c) >= 0x80;
}
bool IsWordPart(char c) { return IsWordStart(c) || IsDigit(c) || c == '$' || c == '#'; }
bool IsBlank(char c) { return c == ' ' || (c >= '\t' && c <= '\r'); }
char Lower(char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c + ('a' - 'A')) : c; }

constexpr std::string_view kLongSymbols[] = {":=", "::", "<=", ">=", "<>", "!=", "||", "=>"};

// What closes a q'...' literal that opens so.
char ClosingOf(char open) {
    switch (open) {
        case '[': return ']';
        case '(': return ')';
        case '{': return '}';
        case '<': return '>';
        default: return open;
    }
}

}  // namespace

bool EqualsLower(std::string_view text, std::string_view lower) {
    return std::equal(text.begin(), text.end(), lower.begin(), lower.end(),
                      [](char a, char b) { return Lower(a) == b; });
}

std::string UpperCase(std::string_view text) {
    std::string upper(text);
    for (char& c : upper)
        if (c >= 'a' && c <= 'z') c = static_cast<char>(c - ('a' - 'A'));
    return upper;
}

bool Token::Is(std::string_view expected) const {
    return (kind == TokenKind::word || kind == TokenKind::symbol) && EqualsLower(text, expected);
}

Token Tokenizer::Next() {
    SkipBlanks();
    if (at_ >= text_.size()) return Take(TokenKind::end, text_.size());
    const char c = text_[at_];
    if (IsWordStart(c)) {
        const std::size_t end = WordEnd(at_);
        const std::string_view word = text_.substr(at_, end - at_);
        const bool is_q = EqualsLower(word, "q") || EqualsLower(word, "nq");
        if (is_q && Peek(word.size()) == '\'') return QLiteral(end);
        if (EqualsLower(word, "n") && Peek(1) == '\'') return Quoted(TokenKind::q_literal, end);
        return Take(TokenKind::word, end);
    }
    if (IsDigit(c) || (c == '.' && IsDigit(Peek(1)))) return Number();
    switch (c) {
        case '\'': return Quoted(TokenKind::literal, at_);
        case '"': return Quoted(TokenKind::quoted_word, at_);
        case ':': return Colon();
        case '?': return Take(TokenKind::placeholder, at_ + 1);
        case '\0': return Take(TokenKind::invalid, at_ + 1);
        default: break;
    }
    for (const std::string_view symbol : kLongSymbols)
        if (text_.substr(at_, symbol.size()) == symbol) return Take(TokenKind::symbol, at_ + symbol.size());
    return Take(TokenKind::symbol, at_ + 1);
}

void Tokenizer::SkipBlanks() {
    while (at_ < text_.size()) {
        if (IsBlank(text_[at_])) {
            ++at_;
        } else if (Peek(0) == '-' && Peek(1) == '-') {
            at_ = std::min(text_.find('\n', at_), text_.size());
        } else if (Peek(0) == '/' && Peek(1) == '*') {
            const std::size_t close = text_.find("*/", at_ + 2);
            at_ = close == std::string_view::npos ? text_.size() : close + 2;
        } else {
            return;
        }
    }
}

Token Tokenizer::Take(TokenKind kind, std::size_t end) {
    const Token token{kind, text_.substr(at_, end - at_), at_};
    at_ = end;
    return token;
}

// From the current place through the quoted part that opens at `quote`. A doubled quote stands for itself.
Token Tokenizer::Quoted(TokenKind kind, std::size_t quote) {
    const char mark = text_[quote];
    std::size_t end = quote;
    do {
        end = text_.find(mark, end + 1);
        if (end == std::string_view::npos) return Take(TokenKind::unclosed, text_.size());
        ++end;
    } while (end < text_.size() && text_[end] == mark);
    return Take(kind, end);
}

Token Tokenizer::QLiteral(std::size_t quote) {
    if (quote + 1 >= text_.size()) return Take(TokenKind::unclosed, text_.size());
    const char closing[2] = {ClosingOf(text_[quote + 1]), '\''};
    const std::size_t close = text_.find(std::string_view(closing, 2), quote + 2);
    if (close == std::string_view::npos) return Take(TokenKind::unclosed, text_.size());
    return Take(TokenKind::q_literal, close + 2);
}

Token Tokenizer::Number() {
    std::size_t end = at_;
    while (end < text_.size() && (IsWordPart(text_[end]) || text_[end] == '.')) {
        const bool exponent = Lower(text_[end++]) == 'e';
        const char sign = Peek(end - at_);
        if (exponent && (sign == '+' || sign == '-') && IsDigit(Peek(end - at_ + 1))) ++end;
    }
    return Take(TokenKind::number, end);
}

// A placeholder, or one of the symbols that begin with a colon.
Token Tokenizer::Colon() {
    const char next = Peek(1);
    if (next == '"') return Quoted(TokenKind::placeholder, at_ + 1);
    if (IsWordStart(next) || IsDigit(next)) return Take(TokenKind::placeholder, WordEnd(at_ + 1));
    if (next == ':' || next == '=') return Take(TokenKind::symbol, at_ + 2);
    return Take(TokenKind::symbol, at_ + 1);
}

std::size_t Tokenizer::WordEnd(std::size_t from) const {
    while (from < text_.size() && IsWordPart(text_[from])) ++from;
    return from;
}

}  // namespace sql
