// The select list of a statement's text, as far as SQLite does not tell what an expression is: row ids, casts, calls of
// functions, arithmetic. Pure functions of the text.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace engine::sqlite {

struct SelectItem {
    bool is_row_id = false;
    bool has_alias = false;
    std::string type;    // as a declaration, of an expression whose text tells it; or empty
};

// One item a column, of what a change returns, too; none when the text has no list that can be told, as with "*".
std::vector<SelectItem> ReadSelectList(std::string_view sql);

// What an expression answers: the type as a declaration, or the argument whose type it has, as trunc(hired) has that of
// hired; neither when its pieces do not tell.
struct ExpressionType {
    std::string declared;
    std::vector<std::string_view> argument;    // a name, or several with points between them
};
ExpressionType ReadType(std::vector<std::string_view> pieces);

}  // namespace engine::sqlite
