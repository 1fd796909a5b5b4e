// Finding comparisons: a name, an operator, a placeholder or a literal. SQLite compares dates as the texts that they
// are kept as, and blanks at the end of a text count; the types of the columns know better.
#include "engine/sqlite/comparisons.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <string>
#include <vector>

#include "engine/sqlite/pieces.h"
#include "engine/sqlite/table_columns.h"

namespace engine::sqlite {
namespace {

bool IsOneOf(std::string_view piece, std::initializer_list<std::string_view> words) {
    return std::any_of(words.begin(), words.end(), [&](std::string_view word) { return IsWord(piece, word); });
}

class Finder {
public:
    Finder(sqlite3* database, std::string_view sql, ValueTargets& targets)
        : database_(database), sql_(sql), pieces_(Split(sql)), targets_(targets) {}

    void Find() {
        for (std::size_t at = FirstCondition(); at < pieces_.size(); ++at) {
            if (IsComparison(at)) Compare(at);
            else if (IsOneOf(pieces_[at], {"between"})) Between(at);
            else if (IsOneOf(pieces_[at], {"in"}) && At(at + 1) == "(") In(at);
        }
    }

private:
    std::string_view At(std::size_t index) const {
        return index < pieces_.size() ? pieces_[index] : std::string_view();
    }

    // What an update sets is stored, what a query lists names its columns: conditions come behind them.
    std::size_t FirstCondition() const {
        const bool is_update = IsWord(At(0), "update");
        if (!is_update && !IsOneOf(At(0), {"select", "delete"})) return pieces_.size();
        int depth = 0;
        for (std::size_t at = 0; at < pieces_.size(); ++at) {
            if (pieces_[at] == "(") ++depth;
            if (pieces_[at] == ")") --depth;
            if (depth == 0 && IsWord(pieces_[at], is_update ? "where" : "from")) return at;
        }
        return pieces_.size();
    }

    // The first character of an operator.
    bool IsComparison(std::size_t at) const {
        const std::string_view piece = pieces_[at];
        if (piece == "!") return At(at + 1) == "=";
        return (piece == "=" || piece == "<" || piece == ">") && !IsOperatorPart(at - 1);
    }
    bool IsOperatorPart(std::size_t at) const {
        const std::string_view piece = At(at);
        return piece == "=" || piece == "<" || piece == ">" || piece == "!";
    }

    void Compare(std::size_t at) {
        std::size_t right = at + 1;
        while (IsOperatorPart(right)) ++right;
        if (const std::string_view name = NameBefore(at); !name.empty()) {
            Use(right, name);
        } else if (const std::size_t value = ValueBefore(at); value < at) {
            Use(value, NameAt(right));
        }
    }

    void Between(std::size_t at) {
        const std::string_view name = NameBefore(IsWord(At(at - 1), "not") ? at - 1 : at);
        const std::size_t second = at + 1 + ValueSize(at + 1);
        if (name.empty() || !IsWord(At(second), "and")) return;
        Use(at + 1, name);
        Use(second + 1, name);
    }

    void In(std::size_t at) {
        const std::string_view name = NameBefore(IsWord(At(at - 1), "not") ? at - 1 : at);
        if (name.empty()) return;
        for (std::size_t value = at + 2; ValueSize(value) > 0; ++value) {
            Use(value, name);
            value += ValueSize(value);
            if (At(value) != ",") return;
        }
    }

    bool IsName(std::size_t at) const {
        const std::string_view piece = At(at);
        if (piece.empty()) return false;
        const auto first = static_cast<unsigned char>(piece[0]);
        return piece[0] == '"' || piece[0] == '_' || std::isalpha(first) || first >= 0x80;
    }

    // Whether something at `at` goes on as a larger expression.
    bool Joins(std::size_t at) const {
        const std::string_view piece = At(at);
        return !piece.empty() && (std::string_view("+-*/%|&.(").find(piece[0]) != std::string_view::npos ||
                                  IsOneOf(piece, {"collate"}));
    }

    // "name" or "table.name" that ends before `at` and is a whole operand: its last part; empty for anything else.
    std::string_view NameBefore(std::size_t at) const {
        if (at == 0 || !IsName(at - 1)) return {};
        const std::size_t first = at >= 3 && At(at - 2) == "." && IsName(at - 3) ? at - 3 : at - 1;
        const bool opens = first > 0 && At(first - 1) == "(";
        return first > 0 && Joins(first - 1) && !opens ? std::string_view() : pieces_[at - 1];
    }

    std::string_view NameAt(std::size_t at) const {
        if (!IsName(at)) return {};
        const std::size_t last = At(at + 1) == "." && IsName(at + 2) ? at + 2 : at;
        return Joins(last + 1) ? std::string_view() : pieces_[last];
    }

    // How many pieces the placeholder or the text literal at `at` has; 0: neither stands there.
    std::size_t ValueSize(std::size_t at) const {
        if (ParameterAt(pieces_, at) != kNoParameter) return 2;
        return !At(at).empty() && At(at)[0] == '\'' ? 1 : 0;
    }

    // Where a value that ends before `at` begins; `at` when there is none.
    std::size_t ValueBefore(std::size_t at) const {
        for (const std::size_t size : {std::size_t{2}, std::size_t{1}}) {
            if (at < size || ValueSize(at - size) != size) continue;
            const std::size_t before = at - size - 1;    // beyond the end when the value stands first
            return Joins(before) && At(before) != "(" ? at : at - size;
        }
        return at;
    }

    void Use(std::size_t value, std::string_view name) {
        const std::size_t size = ValueSize(value);
        if (size == 0 || name.empty() || Joins(value + size)) return;
        const TableColumn* column = Resolve(name);
        if (!column) return;
        if (const std::size_t parameter = ParameterAt(pieces_, value); parameter != kNoParameter) {
            targets_.parameters.push_back({parameter, column->column, Coercion::Purpose::compare});
            return;
        }
        // A literal with a quote inside is several pieces.
        if (!At(value + 1).empty() && At(value + 1)[0] == '\'') return;
        const auto begin = static_cast<std::size_t>(pieces_[value].data() - sql_.data());
        targets_.wraps.push_back({begin, "kelp_compare("});
        targets_.wraps.push_back({begin + pieces_[value].size(),
                                  ", " + Literal(column->declared) + ", " + Literal(column->column.name) + ")"});
    }

    // The column of that name in the statement's tables, when its values are of a type that all of them agree on.
    const TableColumn* Resolve(std::string_view name) {
        if (!tables_read_) ReadTables();
        const TableColumn* found = nullptr;
        for (const auto& columns : tables_) {
            const TableColumn* column = FindColumn(columns, name);
            if (!column) continue;
            if (found && found->column.type != column->column.type) return nullptr;
            found = column;
        }
        return found && found->concerned && Coercion::ConcernsComparison(found->column) ? found : nullptr;
    }

    // Every name behind from, join, update and a comma in a from list that is a table's.
    void ReadTables() {
        tables_read_ = true;
        for (std::size_t at = 0; at < pieces_.size();) {
            if (!IsOneOf(pieces_[at++], {"from", "join", "update"})) continue;
            for (;;) {
                if (!IsName(at)) break;
                at = ReadTable(database_, pieces_, at, tables_.emplace_back());
                if (IsWord(At(at), "as")) ++at;
                if (IsName(at) && At(at + 1) == ",") ++at;
                if (At(at) != ",") break;
                ++at;
            }
        }
    }

    sqlite3* database_;
    std::string_view sql_;
    std::vector<std::string_view> pieces_;
    ValueTargets& targets_;
    bool tables_read_ = false;
    std::vector<std::vector<TableColumn>> tables_;
};

}  // namespace

void FindComparisons(sqlite3* database, std::string_view sql, ValueTargets& targets) {
    Finder(database, sql, targets).Find();
}

}  // namespace engine::sqlite
