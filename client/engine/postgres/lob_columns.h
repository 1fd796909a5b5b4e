// Columns of a select or returning list that hold large objects of a table's rows. Such a statement is asked within a
// query of the engine's own, which brings what is short as it is, of what is longer the size alone, and where each row
// lies, so that it is read there. Lists of several tables, of groups and the like bring values. Columns of large objects
// that the server keeps for themselves bring their numbers, by which they are read, in any list.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "engine/lobs.h"
#include "engine/postgres/connection.h"

namespace engine::postgres {

constexpr std::uint64_t kLongestInline = std::uint64_t{1} << 16;    // bytes of a value that comes with its row

struct LobColumn {
    LobKind kind;
    std::string name;          // as it stands in SQL
    bool is_object = false;    // the value is the number of a large object of the server
};

struct LobItem {
    std::size_t index;    // of the column in the list
    std::shared_ptr<const LobColumn> column;
};

// Of a column as it was described; null where it holds other values, or values that are not a table's.
std::shared_ptr<const LobColumn> LobColumnOf(const Table& table, std::size_t number, const Column& column);

// Bytes of UTF-8 of a column's value.
std::string BytesOf(const LobColumn& column, std::string_view value);
// Their number; of an object of the server its own.
std::string MeasureOf(const LobColumn& column, std::string_view value, bool server_has_utf8);

// Whether a text may have quotes of the server's own, which are left alone: E'...' with backslashes, $$.
bool QuotesOtherwise(std::string_view sql);

// The statement whose result has the list's columns, then the measure of each item, then the row's table, place and
// transaction. Empty where it cannot be told how.
std::string WithPlaces(std::string_view sql, std::size_t columns, const std::vector<LobItem>& items,
                       bool server_has_utf8);

}  // namespace engine::postgres
