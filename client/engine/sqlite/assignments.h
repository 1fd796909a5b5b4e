// What the values of a statement are for: the columns that it stores them into or compares them with. Placeholders keep
// their place, and their values are made to fit; other expressions are wrapped into calls of kelp_store(expression,
// 'declared type', 'column') or kelp_compare(...), which do the same.
#pragma once

#include <sqlite3.h>

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

#include "engine/engine.h"
#include "engine/sqlite/coercion.h"

namespace engine::sqlite {

struct ValueTargets {
    struct Parameter {
        std::size_t index;    // from 0
        Column column;
        Coercion::Purpose purpose;
    };
    struct Wrap {
        std::size_t at;       // offset in the text
        std::string text;     // what comes in there
    };
    std::vector<Parameter> parameters;
    std::vector<Wrap> wraps;              // in the order of the text
    std::string sql;                      // the statement written anew; empty: only the wraps

    // The statement with its expressions wrapped; empty when it stays as it is.
    [[nodiscard]] std::string Rewritten(std::string_view text) const;
};

// Of insert ... values, insert ... select, update ... set. Nothing for other statements and for forms not understood.
ValueTargets FindAssignments(sqlite3* database, std::string_view sql);

}  // namespace engine::sqlite
