// How an engine's SQL differs from what applications write; read by the SQL text's rewriter, which knows no engine. A
// text that is empty, or a function that is null, means that the engine takes what applications write as it stands.
#pragma once

#include <span>
#include <string>
#include <string_view>

#include "date/date.h"
#include "engine/row_id.h"

namespace engine {

struct Dialect {
    struct Spelling {
        std::string_view written;    // a word of the application's, lower case; several words with one blank between
        std::string_view engine;     // what the engine knows for it
        bool drops_size = false;     // of a type: what stands in parentheses behind it is left out
    };
    std::string (*placeholder)(std::size_t number);    // from 1: ?1, $1
    std::span<const Spelling> types;         // replaced as whole words in definition statements and casts
    std::span<const Spelling> functions;     // replaced as whole words in expressions
    std::span<const Spelling> casts;         // type, function: "cast(e as T(a, b))" becomes "F(e, a, b)"
    std::string_view counts_characters;      // behind the name of a text type, or its cast, whose size is in characters:
                                             // varchar2(9 char); empty: every size is
    std::string_view dual;                   // in a from clause, for "dual"; an alias is added where there is none
    std::string_view minus;                  // between two queries, for "minus"
    std::string_view truncate_table;         // for "truncate table"
    bool cuts_for_update = false;            // "for update ..." is left out
    std::string (*date_literal)(const date::DateTime& value) = nullptr;    // for date '...' and timestamp '...'
    std::string (*row_id_literal)(const RowId& row) = nullptr;             // for a row id's text
    std::string_view row_id = {};            // for "rowid", a row's own column
};

}  // namespace engine
