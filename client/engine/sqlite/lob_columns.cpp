#include "engine/sqlite/lob_columns.h"

#include <algorithm>
#include <array>
#include <new>
#include <optional>
#include <string>

#include "engine/pieces.h"
#include "engine/sqlite/column_types.h"
#include "engine/sqlite/describe.h"
#include "engine/sqlite/table_columns.h"

namespace engine::sqlite {
namespace {

// "order by 2" means the item.
bool OrdersByNumber(const PieceList& pieces, const ListOfTable& read) {
    const std::size_t order = FindPiece(pieces, read.list.last, {"order"});
    return std::any_of(pieces.begin() + static_cast<std::ptrdiff_t>(order), pieces.end(), IsNumber);
}

}  // namespace

bool FindNumberedTable(sqlite3* database, TableName& table) {
    const auto has_numbers = [&](const char* schema) {
        const char* declared = nullptr;
        int key = 0;
        const int code = sqlite3_table_column_metadata(database, schema, table.name.c_str(), "rowid", &declared, nullptr,
                                                       nullptr, &key, nullptr);
        if ((code & 0xFF) == SQLITE_NOMEM) throw std::bad_alloc();
        return code == SQLITE_OK && key != 0 && declared && sqlite3_stricmp(declared, "integer") == 0;
    };
    if (!table.schema.empty()) return has_numbers(table.schema.c_str());
    for (const char* schema : {"temp", "main"}) {
        if (!has_numbers(schema)) continue;
        table.schema = schema;
        return true;
    }
    return false;
}

namespace {

class Rewriter {
public:
    Rewriter(sqlite3* database, std::string_view sql, const PieceList& pieces, ListOfTable read, bool is_query, LobStore& store)
        : database_(database), sql_(sql), pieces_(pieces), read_(std::move(read)), is_query_(is_query),
          is_delete_(IsWord(pieces[0], "delete")), store_(store) {}

    // False where the items cannot be told.
    bool Rewrite(std::size_t columns) {
        if (!FindNumberedTable(database_, read_.table)) return false;
        std::size_t begin = read_.list.first;
        while (begin < read_.list.last) {
            const std::size_t end = std::min(FindPiece(pieces_, begin, {","}), read_.list.last);
            RewriteItem({begin, end});
            begin = end + 1;
        }
        return index_ == columns && !uses_alias_;
    }
    std::vector<LobItem> items;
    std::vector<ValueTargets::Edit> edits;

private:
    std::string Name() const { return read_.alias.empty() ? QuotedName(read_.table.name) : std::string(read_.alias); }

    // Whether an item's name is meant behind the list, where it would be the row number.
    [[nodiscard]] bool IsUsed(std::string_view name) const {
        const std::string alias = PlainName(name);
        return std::any_of(pieces_.begin() + static_cast<std::ptrdiff_t>(read_.list.last), pieces_.end(), [&](std::string_view piece) {
            return IsName(piece) && sqlite3_stricmp(PlainName(piece).c_str(), alias.c_str()) == 0;
        });
    }

    void RewriteItem(Span item) {
        const bool qualified = item.Size() >= 3 && pieces_[item.first + 1] == ".";
        const std::size_t name = item.first + (qualified ? 2 : 0);
        if (name + 1 == item.last && pieces_[name] == "*") return RewriteAll(item);
        const std::size_t index = index_++;
        const bool behind = name + 1 < item.last;    // an alias, or more of an expression
        const bool alias = behind && (name + 2 == item.last ? IsName(pieces_[name + 1]) && !IsAnyOf(pieces_[name + 1], {"is", "isnull", "notnull"})
                                                            : IsWord(pieces_[name + 1], "as"));
        if ((behind && !alias) || !IsName(pieces_[name])) return;
        TableColumn column;
        if (!ReadColumn(database_, read_.table, pieces_[name], column) || !ObjectKindOf(column.column)) return;
        uses_alias_ = uses_alias_ || (alias && IsUsed(pieces_[item.last - 1]));
        Note(index, column);
        edits.push_back({Begin(item.first), End(name), Number(column), {}, true});
    }
    void RewriteAll(Span item) {
        std::string list;
        for (const TableColumn& column : InsertableColumns(database_, read_.table)) {
            if (!list.empty()) list += ", ";
            const bool is_object = ObjectKindOf(column.column).has_value();
            list += is_object ? Number(column) : (is_query_ ? "" : "+") + Name() + '.' + QuotedName(column.name);
            if (is_object) Note(index_, column);
            ++index_;
        }
        edits.push_back({Begin(item.first), End(item.last - 1), list, {}, true});
    }
    void Note(std::size_t index, const TableColumn& column) {
        items.push_back({index, store_.Column(read_.table.schema, read_.table.name, column.name, *ObjectKindOf(column.column))});
    }
    // What is neither text nor bytes is not read where it lies. Nor are long values that are not very long, and those of
    // rows that are gone.
    [[nodiscard]] std::string Number(const TableColumn& column) const {
        const std::string value = Name() + '.' + QuotedName(column.name);
        if (is_delete_)
            return "case when typeof(" + value + ") in ('integer', 'real') then cast(" + value + " as text) else " + value +
                   " end";
        if (column.column.type == SQLT_LNG || column.column.type == SQLT_LBI)
            return "case when typeof(" + value + ") in ('integer', 'real') then cast(" + value + " as text) when typeof(" +
                   value + ") = 'blob' and length(" + value + ") > " + std::to_string(kHeldWhole) + " then " + Name() +
                   ".rowid else " + value + " end";
        return "case typeof(" + value + ") when 'null' then null when 'text' then " + Name() +
               ".rowid when 'blob' then " + Name() + ".rowid else cast(" + value + " as text) end";
    }
    [[nodiscard]] std::size_t Begin(std::size_t piece) const {
        return static_cast<std::size_t>(pieces_[piece].data() - sql_.data());
    }
    [[nodiscard]] std::size_t End(std::size_t piece) const { return Begin(piece) + pieces_[piece].size(); }

    sqlite3* const database_;
    const std::string_view sql_;
    const PieceList& pieces_;
    ListOfTable read_;
    const bool is_query_;    // else KeepReturned says why there is a plus
    const bool is_delete_;
    LobStore& store_;
    std::size_t index_ = 0;
    bool uses_alias_ = false;
};

// SQLite tells the declared types of a select list, not of what a change returns.
bool MayHaveLobs(sqlite3_stmt* compiled, bool is_query) {
    const int count = sqlite3_column_count(compiled);
    if (!is_query) return count > 0;
    for (int index = 0; index < count; ++index) {
        Column column;
        const char* declared = sqlite3_column_decltype(compiled, index);
        if (declared && ReadDeclaredType(declared, column) && ObjectKindOf(column)) return true;
    }
    return false;
}

}  // namespace

std::vector<LobItem> FindLobItems(sqlite3* database, sqlite3_stmt* compiled, std::string_view sql, LobStore& store,
                                  ValueTargets& targets) {
    const bool is_query = sqlite3_stmt_readonly(compiled) != 0;
    if (!MayHaveLobs(compiled, is_query)) return {};
    const PieceList pieces = Split(sql);
    const std::optional<ListOfTable> read = is_query ? ReadSelect(pieces) : ReadReturning(pieces);
    if (!read || (is_query && OrdersByNumber(pieces, *read))) return {};
    Rewriter rewriter(database, sql, pieces, *read, is_query, store);
    if (!rewriter.Rewrite(static_cast<std::size_t>(sqlite3_column_count(compiled))) || rewriter.items.empty()) return {};
    targets.edits.insert(targets.edits.end(), rewriter.edits.begin(), rewriter.edits.end());
    return std::move(rewriter.items);
}

}  // namespace engine::sqlite
