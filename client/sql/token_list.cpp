// Questions about tokens that stand beside each other. Any thread.
#include "sql/token_list.h"

#include <algorithm>

namespace sql {
namespace {

bool IsComparison(const Token& token) {
    constexpr std::string_view kSymbols[] = {"=", "<>", "!=", "<", ">", "<=", ">="};
    const bool listed = std::find(std::begin(kSymbols), std::end(kSymbols), token.text) != std::end(kSymbols);
    return token.kind == TokenKind::symbol && listed;
}

bool IsOperand(const Token& token) { return token.kind == TokenKind::placeholder || token.kind == TokenKind::literal; }

// The operands of the comparisons that the word ROWID at `index` takes part in.
void MarkOperands(const std::vector<Token>& tokens, std::size_t index, std::vector<bool>& marks) {
    const auto mark = [&](std::size_t at) {
        if (IsOperand(At(tokens, at))) marks[at] = true;
    };
    if (IsComparison(At(tokens, index + 1))) mark(index + 2);
    const std::size_t first = index >= 2 && tokens[index - 1].Is(".") ? index - 2 : index;    // of table.rowid
    if (IsComparison(At(tokens, first - 1))) mark(first - 2);
    if (!At(tokens, index + 1).Is("in") || !At(tokens, index + 2).Is("(")) return;
    for (std::size_t at = index + 3; IsOperand(At(tokens, at)) || At(tokens, at).Is(","); ++at) mark(at);
}

}  // namespace

std::vector<Token> Tokenize(std::string_view text, std::size_t begin, std::size_t end) {
    std::vector<Token> tokens;
    Tokenizer tokenizer(text.substr(0, end), begin);
    do tokens.push_back(tokenizer.Next());
    while (tokens.back().kind != TokenKind::end);
    return tokens;
}

const Token& At(const std::vector<Token>& tokens, std::size_t index) {
    return index < tokens.size() ? tokens[index] : tokens.back();
}

std::vector<bool> RowIdOperands(const std::vector<Token>& tokens) {
    std::vector<bool> marks(tokens.size());
    for (std::size_t index = 0; index < tokens.size(); ++index)
        if (tokens[index].Is("rowid")) MarkOperands(tokens, index, marks);
    return marks;
}

bool IsIndicator(const std::vector<Token>& tokens, std::size_t index) {
    return index > 0 && tokens[index].kind == TokenKind::placeholder && tokens[index].text[0] == ':' &&
           tokens[index - 1].kind == TokenKind::placeholder && tokens[index - 1].text[0] == ':' &&
           tokens[index - 1].End() == tokens[index].begin;
}

bool DefinesCode(const std::vector<Token>& tokens) {
    if (!tokens[0].Is("create")) return false;
    std::size_t index = 1;
    for (const std::string_view skipped : {"or", "replace", "editionable", "temp", "temporary"})
        if (At(tokens, index).Is(skipped)) ++index;
    constexpr std::string_view kObjects[] = {"trigger", "procedure", "function", "package", "type"};
    return std::any_of(std::begin(kObjects), std::end(kObjects), [&](auto word) { return At(tokens, index).Is(word); });
}

}  // namespace sql
