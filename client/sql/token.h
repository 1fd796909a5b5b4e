// Cuts SQL text into tokens. Knows quotes, comments and placeholders, and no grammar; takes time in proportion to the
// text, whatever it holds. Tokens are views of the text.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

namespace sql {

enum class TokenKind : std::uint8_t {
    end,
    word,           // keyword or name without quotes
    quoted_word,    // "Name", quotes included
    number,
    literal,        // 'text', quotes included
    q_literal,      // q'[text]', n'text', all included
    placeholder,    // :name, :1, :"Name" or ?, the mark included
    symbol,         // an operator or a single character
    unclosed,       // a quote that never closes, to the end of the text
    invalid         // a zero byte
};

struct Token {
    TokenKind kind = TokenKind::end;
    std::string_view text;
    std::size_t begin = 0;    // offset in the whole text

    [[nodiscard]] std::size_t End() const { return begin + text.size(); }
    // A word without regard to letter case, or a symbol; `expected` in lower case.
    [[nodiscard]] bool Is(std::string_view expected) const;
};

class Tokenizer {
public:
    // From `begin` on; offsets count from the start of `text`.
    explicit Tokenizer(std::string_view text, std::size_t begin = 0) : text_(text), at_(begin) {}
    Token Next();

private:
    void SkipBlanks();
    [[nodiscard]] char Peek(std::size_t ahead) const { return at_ + ahead < text_.size() ? text_[at_ + ahead] : '\0'; }
    Token Take(TokenKind kind, std::size_t end);
    Token Quoted(TokenKind kind, std::size_t quote);
    Token QLiteral(std::size_t quote);
    Token Number();
    Token Colon();
    [[nodiscard]] std::size_t WordEnd(std::size_t from) const;

    std::string_view text_;
    std::size_t at_;
};

// ASCII without regard to letter case; `lower` is in lower case.
bool EqualsLower(std::string_view text, std::string_view lower);
std::string UpperCase(std::string_view text);

}  // namespace sql
