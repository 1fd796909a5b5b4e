// What the values of a statement are for: the columns that it stores them into or compares them with. Placeholders keep
// their place, and their values are made to fit. Literals that are compared are written as the column keeps its values;
// other expressions are wrapped into calls of kelp_store(expression, 'declared type', 'column') or kelp_compare(...),
// which do the same for each row. Used by the thread that compiles the statement.
#pragma once

#include <sqlite3.h>

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

#include "engine/engine.h"
#include "engine/pieces.h"
#include "engine/sqlite/coercion.h"
#include "engine/sqlite/table_columns.h"
#include "handles/status.h"

namespace engine::sqlite {

struct ValueTargets {
    struct Parameter {
        std::size_t index;    // from 0
        Column column;
        Coercion::Purpose purpose;
    };
    // The text's bytes [begin, end) get `before` and `after` around them, or give way to both. Edits may lie within
    // each other, and may begin or end together; they do not overlap otherwise.
    struct Edit {
        std::size_t begin, end;
        std::string before;
        std::string after;
        bool replaces = false;
    };
    // A placeholder that is, as it is, the value of a column of large objects or long values, in each row that the
    // statement writes. None of statements that show what they write, or write rows of different values.
    struct Object {
        std::size_t index;
        TableName table;
        std::string column;
        LobKind kind;
    };
    // An item of the select list that is shown, from 0, which answers an interval.
    struct Interval {
        std::size_t item;
        Column column;
    };
    std::vector<Parameter> parameters;
    std::vector<Span> texts;    // expressions, by pieces, of which SQLite itself makes texts: what large objects take, and texts of any size
    std::vector<Interval> intervals;
    std::vector<Object> objects;
    std::vector<Edit> edits;    // in any order

    // The statement with its edits; empty when there are none.
    [[nodiscard]] std::string Rewritten(std::string_view text) const;
};

// Reads a text as a value of the column and writes it as an SQL literal, as SQLite keeps the value.
Status Convert(std::string_view text, const Column& column, Coercion::Purpose purpose, std::string& literal);

// Looks through a statement that SQLite has found to be well-formed. Refuses what compares values in a way whose
// meaning cannot be told, or uses dates or intervals as numbers: 932, 933. Tables have none unless `has_intervals`.
Status FindValueTargets(sqlite3* database, std::string_view sql, bool has_intervals, ValueTargets& targets);

}  // namespace engine::sqlite
