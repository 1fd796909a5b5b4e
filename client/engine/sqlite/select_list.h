// The select list of a statement's text, as far as SQLite does not tell what an expression is: row ids, casts and
// functions.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace engine::sqlite {

struct SelectItem {
    bool is_row_id = false;
    bool has_alias = false;
    std::string type;    // as a declaration, of an expression that is wholly a cast or a call of a function; or empty
};

// One item a column; none when the text is no query whose list can be told, as with "*".
std::vector<SelectItem> ReadSelectList(std::string_view sql);

}  // namespace engine::sqlite
