// What Scan and Rewrite both ask of a statement's tokens. Tokens are views of the text, which must outlive them.
#pragma once

#include <string_view>
#include <vector>

#include "sql/token.h"

namespace sql {

// The tokens of text[begin, end), the closing TokenKind::end included.
std::vector<Token> Tokenize(std::string_view text, std::size_t begin, std::size_t end);

// The token at an index that may lie outside the list; an end token then.
const Token& At(const std::vector<Token>& tokens, std::size_t index);

// By token: whether it is a placeholder or a literal that is compared with the row id of a table.
std::vector<bool> RowIdOperands(const std::vector<Token>& tokens);

// Whether `index` is the second half of :name:indicator.
bool IsIndicator(const std::vector<Token>& tokens, std::size_t index);

// create trigger, procedure, function, ...: the text holds statements of its own, in which nothing is a placeholder.
bool DefinesCode(const std::vector<Token>& tokens);

}  // namespace sql
