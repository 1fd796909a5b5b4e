// Which columns a statement stores into: the declared types of the targets of its placeholders, and of its other
// expressions, whose text is then wrapped into calls of kelp_store(expression, 'declared type', 'column').
#pragma once

#include <sqlite3.h>

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

#include "engine/engine.h"

namespace engine::sqlite {

struct Assignments {
    struct Parameter {
        std::size_t index;    // from 0
        Column column;
    };
    std::vector<Parameter> parameters;    // that are stored as they are
    std::string sql;                      // the statement with its other expressions wrapped; empty: nothing to wrap
};

// Of insert ... values, insert ... select, update ... set. Nothing for other statements and for forms not understood.
Assignments FindAssignments(sqlite3* database, std::string_view sql);

}  // namespace engine::sqlite
