// The SQL functions that this engine adds: casts that SQLite would do another way, the time with its zone, and those of
// the dialect. SQLite calls them on the thread that steps a statement; they keep nothing between calls but what belongs
// to the connection, and throw nothing into it.
#pragma once

#include <sqlite3.h>

#include "engine/engine.h"

namespace engine::sqlite {

// Casts by functions that keep every digit of a number and the text form of dates. Of two types that begin with the
// same word the longer stands first.
inline constexpr Dialect::Spelling kCasts[] = {
    {"decfloat", "kelp_decfloat"},
    {"number", "kelp_number"},
    {"numeric", "kelp_number"},
    {"decimal", "kelp_number"},
    {"dec", "kelp_number"},
    {"binary_float", "kelp_binary_float"},
    {"binary_double", "kelp_binary_double"},
    {"varchar2", "kelp_varchar"},
    {"varchar", "kelp_varchar"},
    {"nvarchar2", "kelp_nvarchar"},
    {"character varying", "kelp_varchar"},
    {"char varying", "kelp_varchar"},
    {"character", "kelp_char"},
    {"nchar", "kelp_nchar"},
    {"char", "kelp_char"},
    {"raw", "kelp_raw"},
    {"date", "kelp_date"},
    {"timestamp", "kelp_timestamp"},
    {"interval year to month", "kelp_span_ym", false, "2"},
    {"interval day to second", "kelp_span_ds", false, "2,6"},
};

// Behind the name of a text type, or of its cast, that counts characters: varchar2_chars(9).
inline constexpr std::string_view kCountsCharacters = "_chars";

// The words for the present moment; in parentheses, as a column's default needs its expression.
inline constexpr Dialect::Spelling kMoments[] = {
    {"sysdate", "(kelp_sysdate())"},
    {"current_date", "(kelp_sysdate())"},
    {"systimestamp", "(kelp_systimestamp())"},
    {"current_timestamp", "(kelp_systimestamp())"},
    {"localtimestamp", "(kelp_localtimestamp())"},
};

// The table of one row, in a from clause.
inline constexpr std::string_view kDual = "(select 'X' as dummy)";

Status AddFunctions(sqlite3* database);

// What a call of a function answers, SQLite's own among them: the declared type, or the argument, from 1, whose type it
// has. Empty: only its values tell.
struct ResultType {
    std::string_view declared;
    int like = 0;
};
ResultType FunctionResult(std::string_view name);
// One of the engine's that takes texts, and numbers as they are shown.
bool TakesTexts(std::string_view function);
// One of SQLite's own that calculates with numbers, and answers one.
bool TakesNumbers(std::string_view function);

}  // namespace engine::sqlite
