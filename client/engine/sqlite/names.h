// The names in a statement's expressions: which table's column one is, through subqueries and WITH, and of which type an
// expression is as far as its pieces tell. A view of the pieces of one statement, on the thread that compiles it.
#pragma once

#include <sqlite3.h>

#include <cstddef>
#include <cstdint>
#include <deque>
#include <map>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "engine/pieces.h"
#include "engine/sqlite/operands.h"
#include "engine/sqlite/table_columns.h"
#include "handles/status.h"

namespace engine::sqlite {

class Names {
public:
    Names(sqlite3* database, const std::vector<std::string_view>& pieces, const Operands& operands)
        : database_(database), pieces_(pieces), operands_(operands) {}

    // The column that a name is; null for a calculated one, and for none. Columns live as long as this object.
    const TableColumn* Resolve(Span name);
    // The column that an expression is, or one of the type of the date or interval that it answers; else null.
    const TableColumn* TypeOf(Span span);
    // The column that an expression is, or one of the type that its text tells; else null.
    const TableColumn* AnswerOf(Span span);
    // Whether it is a binary_double: of such a real every digit counts.
    bool HasAllDigits(Span span);
    // Of the columns meant of a query, or of several with UNION and its like between them, those whose values are all
    // numbers or null.
    std::vector<bool> Numbers(std::size_t query, std::vector<bool> meant);
    // Where those begin; of one of them with so many columns, their types as far as tables tell them, else 0.
    [[nodiscard]] std::vector<std::size_t> Parts(std::size_t query) const;
    std::vector<std::uint16_t> Types(std::size_t part, std::size_t count);
    // 932 when a name was of a date or an interval in one table and of another type in another.
    [[nodiscard]] const Status& Failure() const { return status_; }

    // An expression of a select list, and what it is called.
    struct Item {
        Span expression;
        std::string_view name;
        bool is_all = false;      // * or t.*
        std::string qualifier;
    };
    [[nodiscard]] std::vector<Item> Items(std::size_t select) const;
    // Of an item "*" or "t.*" of a query: whether columns of such a type are among what it stands for.
    using TypeTest = bool (*)(std::uint16_t type);
    bool HasColumnOf(std::size_t select, const std::string& qualifier, TypeTest is_meant);

private:
    static constexpr int kDeepest = 200;     // subqueries within each other
    static constexpr int kMostLooks = 1000;  // subqueries that join each other twice and twice again

    // A table or subquery of the statement, where it is named.
    struct Table {
        std::size_t at = 0;
        std::size_t scope = 0;
        bool is_target = false;    // of an insert
        std::string name;          // its alias, if it has one
        TableName table;
        std::size_t query = 0;                  // where a subquery begins; 0: a table
        std::vector<std::string_view> names;    // of a subquery's columns, where WITH tells them
        bool is_natural = false;                // joined so, or USING these columns: "*" stands for one of each pair
        std::vector<std::string_view> merged;
    };
    struct With {
        std::string name;
        Span seen;                // between the parentheses around it; up to 0: everywhere
        std::size_t query = 0;
        std::vector<std::string_view> names;
    };

    // What a name is found to be. A column of a subquery that is calculated is found, and is no table's column.
    struct Found {
        bool any = false;
        const TableColumn* column = nullptr;
    };

    // A column of a query; not a table's where it is calculated.
    struct Listed {
        std::string name;
        const TableColumn* column = nullptr;
    };

    [[nodiscard]] std::string_view At(std::size_t index) const { return operands_.At(index); }
    Found FindName(std::string_view column, const std::string& qualifier, std::size_t scope);
    Found FindInScope(std::string_view column, const std::string& qualifier, std::size_t scope);
    template <class Meant>
    Found Agreed(std::string_view name, Meant is_meant);
    Found ColumnOf(const Table& table, std::string_view name);
    Found ColumnOfQuery(const Table& table, const std::string& name);
    bool IsTooDeep(std::string_view name);    // to look into one more subquery; the statement is refused then
    bool Expand(const Table& table, std::vector<Listed>& columns);
    bool ExpandQuery(std::size_t query, std::vector<Listed>& columns);
    static bool IsMerged(const Table& table, const std::string& name, const std::vector<Listed>& before);
    bool IsNumber(Span span);
    [[nodiscard]] Item ReadItem(Span span) const;
    [[nodiscard]] bool TableHasColumnOf(const TableName& table, TypeTest is_meant) const;
    bool QueryHasColumnOf(std::size_t query, TypeTest is_meant);
    void ReadTables();
    [[nodiscard]] std::size_t MainQuery(std::size_t at) const;
    void NoteExcluded();
    void NoteWith(std::size_t open);
    void ReadTable(std::size_t at, std::size_t scope, bool is_target);
    [[nodiscard]] bool IsNaturalJoin(std::size_t at) const;
    void UseWith(Table& table) const;

    sqlite3* database_;
    const std::vector<std::string_view>& pieces_;
    const Operands& operands_;
    Status status_;
    std::vector<std::size_t> scopes_;     // by piece
    std::vector<std::size_t> parents_;    // by scope; the outermost is its own
    std::deque<Table> tables_;
    std::vector<With> withs_;
    int depth_ = 0;                       // of subqueries looked into, and how many for one name
    int looks_ = 0;
    std::map<std::pair<std::size_t, std::string>, Found> of_queries_;    // by where the query begins and the name in lower case
    std::deque<TableColumn> columns_;     // that were told of, and what calls answer
};

// A statement's text with what is read of it once, for all that look for places in it.
struct StatementReading {
    StatementReading(sqlite3* database, std::string_view text, const std::vector<std::string_view>& split)
        : sql(text), pieces(split), operands(split), names(database, split, operands) {}

    std::string_view sql;
    const std::vector<std::string_view>& pieces;
    Operands operands;
    Names names;
};

}  // namespace engine::sqlite
