// Lists of columns of one table's rows: of a select list or what a change returns. What makes rows of others is none.
#pragma once

#include <initializer_list>
#include <optional>
#include <string>
#include <string_view>

#include "engine/pieces.h"

namespace engine {

struct TableName {
    std::string schema;    // empty: any
    std::string name;
};

// Reads the name of a table, "name" or "schema.name", at pieces[at]. Answers where the text goes on.
std::size_t ReadTableName(const PieceList& pieces, std::size_t at, TableName& table);

// The list, the table, and what the list calls the table by.
struct ListOfTable {
    Span list;
    TableName table;
    std::string_view alias{};    // a piece; empty: the table's name
};

// "select list from table [[as] alias] [where ...] [order by ...] [limit ...]", and nothing that makes rows of others.
std::optional<ListOfTable> ReadSelect(const PieceList& pieces);
// "insert into table ... returning list" and its kin.
std::optional<ListOfTable> ReadReturning(const PieceList& pieces);

bool IsAnyOf(std::string_view piece, std::initializer_list<std::string_view> words);
// Whether the windows of a query are defined there: window NAME as (...). It is a name anywhere else.
bool BeginsWindows(const PieceList& pieces, std::size_t at);
// Whether an insert's ON CONFLICT stands there: before DO or the columns. CONFLICT is a name anywhere else.
bool BeginsConflict(const PieceList& pieces, std::size_t at);
// Whether FROM stands there, and no IS DISTINCT FROM.
bool BeginsFrom(const PieceList& pieces, std::size_t at);
// The first of some words outside of parentheses; the end of the text when there is none.
std::size_t FindPiece(const PieceList& pieces, std::size_t from, std::initializer_list<std::string_view> words);

}  // namespace engine
