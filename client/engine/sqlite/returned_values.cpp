// One pass over the list behind RETURNING; large objects in it have been rewritten before.
#include "engine/sqlite/returned_values.h"

#include <algorithm>
#include <optional>
#include <string>
#include <vector>

#include "engine/pieces.h"
#include "engine/sqlite/table_columns.h"
#include "engine/table_list.h"

namespace engine::sqlite {
namespace {

// Whether the words of a declared type may mean so to SQLite.
bool MayBeReal(const std::string& declared) {
    const std::string words = UpperCase(declared);
    const auto has = [&](const char* part) { return words.find(part) != std::string::npos; };
    return has("REAL") || has("FLOA") || has("DOUB");
}

}  // namespace

bool KeepReturned(sqlite3* database, sqlite3_stmt* compiled, std::string_view sql, ValueTargets& targets) {
    if (sqlite3_stmt_readonly(compiled) != 0 || sqlite3_column_count(compiled) == 0) return false;
    PieceList pieces = Split(sql);
    const bool with = IsWord(pieces[0], "with");
    const std::size_t verb = with ? FindPiece(pieces, 0, {"insert", "update", "delete", "replace"}) : 0;
    pieces.erase(pieces.begin(), pieces.begin() + static_cast<std::ptrdiff_t>(verb));
    const std::optional<ListOfTable> read = ReadReturning(pieces);
    const std::vector<TableColumn> columns = read ? AllColumns(database, read->table) : std::vector<TableColumn>();
    if (columns.empty() || !MayBeReal(columns.front().declared)) return false;
    std::string all;
    for (const TableColumn& column : columns) all += (all.empty() ? "+" : ", +") + QuotedName(column.name);
    for (std::size_t at = read->list.first; at < read->list.last; at = FindPiece(pieces, at, {","}) + 1) {
        const auto begin = static_cast<std::size_t>(pieces[at].data() - sql.data());
        const bool is_all = pieces[at] == "*";
        const bool is_lob = std::any_of(targets.edits.begin(), targets.edits.end(),
                                        [&](const ValueTargets::Edit& edit) { return edit.replaces && edit.begin == begin; });
        if (!is_lob) targets.edits.push_back({begin, begin + pieces[at].size(), is_all ? all : "+", {}, is_all});
    }
    return true;
}

}  // namespace engine::sqlite
