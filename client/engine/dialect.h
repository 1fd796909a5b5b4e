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
        std::string_view sizes = {};     // of an interval: what stands for the sizes that are not told, "2" or "2,6"
    };
    std::string (*placeholder)(std::size_t number);    // from 1: ?1, $1
    std::span<const Spelling> types;         // replaced as whole words in definition statements and casts
    std::span<const Spelling> functions;     // replaced as whole words in expressions
    std::span<const Spelling> calls = {};    // of functions: replaced where a parenthesis follows
    std::span<const Spelling> casts;         // type, function: "cast(e as T(a, b))" becomes "F(e, a, b)"
    std::string_view counts_characters;      // behind the name of a text type, or its cast, whose size is in characters:
                                             // varchar2(9 char); empty: every size is
    std::string_view dual;                   // in a from clause, for "dual"; an alias is added where there is none
    std::string_view minus;                  // between two queries, for "minus"
    std::string_view truncate_table;         // for "truncate table"
    bool cuts_for_update = false;            // "for update ..." is left out
    std::string (*date_literal)(const date::DateTime& value, bool is_date);    // date '...', timestamp '...'
    std::string (*row_id_literal)(const RowId& row);    // for a row id's text
    std::string_view row_id = {};            // for "rowid", a row's own column
    std::string_view subquery_alias = {};    // behind a subquery of a from clause that has none; a number is added
    std::string (*quoted_name)(std::string_view quoted) = nullptr;         // for a name in quotes, which stay
    std::string (*bytes_literal)(std::string_view digits) = nullptr;       // for x'0AFF'
    std::string_view empty_text = {};        // for '', which is a null
    // decode(value, search, result, ..., otherwise): what stands before the value, behind it, between a search and its
    // result, before a further search, before the otherwise, and at the end.
    struct DecodeText {
        std::string_view begin, first, then, next, otherwise, end;
    };
    const DecodeText* decode = nullptr;
};

}  // namespace engine
