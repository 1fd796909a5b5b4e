// Describing columns: declarations first, then the text of the select list, then the first value.
#include "engine/sqlite/describe.h"

#include <algorithm>
#include <new>
#include <utility>

#include "engine/pieces.h"
#include "engine/sqlite/column_types.h"
#include "engine/sqlite/connection.h"
#include "engine/sqlite/functions.h"
#include "engine/sqlite/names.h"
#include "engine/sqlite/select_list.h"
#include "engine/sqlite/stored_number.h"
#include "engine/sqlite/table_columns.h"
#include "engine/sqlite/union_columns.h"
#include "oci.h"

namespace engine::sqlite {
namespace {

constexpr std::int8_t kFloating = -127;
constexpr std::uint32_t kNumberSize = 22;
constexpr std::uint32_t kRowIdSize = 18;

void MakeNumber(Column& column) {
    column.type = SQLT_NUM;
    column.size = kNumberSize;
    column.scale = kFloating;
}

std::string_view Trimmed(std::string_view text) {
    while (!text.empty() && text.front() == ' ') text.remove_prefix(1);
    while (!text.empty() && text.back() == ' ') text.remove_suffix(1);
    return text;
}

// The cast that a function does; null for other words.
const Dialect::Spelling* FindCast(std::string_view word, bool& counts_characters) {
    counts_characters = word.ends_with(kCountsCharacters);
    if (counts_characters) word.remove_suffix(kCountsCharacters.size());
    const auto* found =
        std::find_if(std::begin(kCasts), std::end(kCasts), [&](const auto& row) { return IsWord(word, row.engine); });
    return found == std::end(kCasts) ? nullptr : found;
}

// A cast's type as it was written, by the arguments of its function. An interval's sizes stand behind its second word and
// its last; those that are understood were not written.
std::string TypeAsWritten(const Dialect::Spelling& cast, std::string_view sizes, bool counts_characters) {
    std::string written(cast.written);
    if (sizes.empty()) return written;
    if (cast.sizes.empty()) return written.append("(").append(sizes).append(counts_characters ? " char)" : ")");
    const auto parts = [](std::string_view all) {
        const std::size_t comma = std::min(all.find(','), all.size());
        return std::pair(Trimmed(all.substr(0, comma)), Trimmed(all.substr(std::min(comma + 1, all.size()))));
    };
    const auto [leading, fraction] = parts(sizes);
    const auto [usual_leading, usual_fraction] = parts(cast.sizes);
    if (fraction != usual_fraction) written.append("(").append(fraction).append(")");
    if (leading != usual_leading) written.insert(written.find(" to "), "(" + std::string(leading) + ")");
    return written;
}

// An expression as the application wrote it: kelp_number(a , 5, 2) was cast(a as number(5, 2)).
std::string AsWritten(std::string_view text) {
    Pieces pieces(text);
    const Dialect::Spelling* cast = nullptr;
    bool counts_characters = false;
    std::size_t begin = 0;
    std::size_t open = 0;
    std::size_t comma = 0;
    int depth = 0;
    for (std::string_view piece = pieces.Next(); !piece.empty(); piece = pieces.Next()) {
        if (!cast) {
            cast = FindCast(piece, counts_characters);
            if (!cast) continue;
            begin = pieces.At() - piece.size();
        } else if (piece == "(") {
            if (++depth == 1) open = pieces.At();
        } else if (piece == "," && depth == 1 && comma == 0) {
            comma = pieces.At() - 1;
        } else if (piece == ")" && --depth == 0) {
            const std::size_t close = pieces.At() - 1;
            std::string written(text.substr(0, begin));
            written += "cast(" + AsWritten(Trimmed(text.substr(open, (comma ? comma : close) - open))) + " as ";
            const std::string_view sizes = comma ? Trimmed(text.substr(comma + 1, close - comma - 1)) : std::string_view();
            written += TypeAsWritten(*cast, sizes, counts_characters);
            return written + ")" + AsWritten(text.substr(close + 1));
        }
    }
    return std::string(text);
}

// sysdate and its like as the application wrote them.
std::string WithMoments(std::string name) {
    for (const Dialect::Spelling& moment : kMoments) {
        for (std::size_t at; (at = name.find(moment.engine)) != std::string::npos;)
            name.replace(at, moment.engine.size(), moment.written);
    }
    return name;
}

std::string WithDual(std::string name) {
    constexpr std::string_view kName = "dual", kAlias = " as dual";
    for (std::size_t at; (at = name.find(kDual)) != std::string::npos;) {
        const bool has_alias = std::string_view(name).substr(at + kDual.size()).starts_with(kAlias);
        name.replace(at, kDual.size() + (has_alias ? kAlias.size() : 0), kName);
    }
    return name;
}

// Without the calls that were put around operands of || and around what is cast.
std::string WithoutCalls(std::string_view name) {
    std::string shown;
    std::size_t copied = 0;
    std::vector<bool> calls;    // by open parenthesis: whether it is such a call's
    bool is_call = false;
    Pieces pieces(name);
    for (std::string_view piece = pieces.Next(); !piece.empty(); piece = pieces.Next()) {
        bool drops = IsOneOf(piece, {"kelp_text", "kelp_exact_text", "kelp_whole", "kelp_real"});
        const bool opens = std::exchange(is_call, drops);
        if (piece == "(") {
            calls.push_back(opens);
            drops = opens;
        } else if (piece == ")" && !calls.empty()) {
            drops = calls.back();
            calls.pop_back();
        }
        if (!drops) continue;
        shown.append(name.substr(copied, pieces.At() - piece.size() - copied));
        copied = pieces.At();
    }
    return shown.append(name.substr(copied));
}

std::string WithPlaceholders(std::string_view name, std::span<const std::string> written) {
    std::string shown;
    std::size_t copied = 0;
    Pieces pieces(name);
    for (std::string_view piece = pieces.Next(); !piece.empty(); piece = pieces.Next()) {
        const std::size_t index = ParameterOf(piece);
        if (index >= written.size()) continue;
        shown.append(name.substr(copied, pieces.At() - piece.size() - copied)).append(written[index]);
        copied = pieces.At();
    }
    return shown.append(name.substr(copied));
}

// Names that were not quoted are shown in upper case. A name that stands quoted in the statement was.
std::string ShownName(std::string_view name, std::string_view sql, std::span<const std::string> written) {
    if (sql.find(QuotedName(name)) != std::string_view::npos) return std::string(name);
    std::string shown = WithDual(std::string(name));
    if (shown.find("kelp_") != shown.npos) shown = WithMoments(AsWritten(WithoutCalls(shown)));
    if (shown.find('?') != shown.npos) shown = WithPlaceholders(shown, written);
    char quote = '\0';
    for (char& c : shown) {
        if (quote != '\0') {
            if (c == quote) quote = '\0';
        } else if (c == '\'' || c == '"') {
            quote = c;
        } else {
            c = static_cast<char>(c >= 'a' && c <= 'z' ? c - 'a' + 'A' : c);
        }
    }
    return shown;
}

bool IsNullable(sqlite3* database, sqlite3_stmt* statement, int index) {
    const char* table = sqlite3_column_table_name(statement, index);
    const char* origin = sqlite3_column_origin_name(statement, index);
    if (!table) return true;
    int not_null = 0;
    int primary_key = 0;
    sqlite3_table_column_metadata(database, sqlite3_column_database_name(statement, index), table, origin, nullptr,
                                  nullptr, &not_null, &primary_key, nullptr);
    return not_null == 0 && primary_key == 0;
}

// The names that a statement's columns have as it was written. One with values in it that have been written anew has
// another text.
class WrittenNames {
public:
    WrittenNames(sqlite3* database, sqlite3_stmt* statement, std::string_view sql) : statement_(statement) {
        if (sqlite3_sql(statement) == sql || !HasChanged(sql)) return;
        sqlite3_stmt* compiled = nullptr;
        sqlite3_prepare_v2(database, sql.data(), static_cast<int>(sql.size()), &compiled, nullptr);
        written_.reset(compiled);
    }
    const char* Name(int index) const {
        sqlite3_stmt* named = index < sqlite3_column_count(written_.get()) ? written_.get() : statement_;
        const char* name = sqlite3_column_name(named, index);
        return name ? name : throw std::bad_alloc();
    }

private:
    // Whether a name is an expression that does not stand in the text.
    bool HasChanged(std::string_view sql) const {
        for (int index = 0; index < sqlite3_column_count(statement_); ++index) {
            const std::string_view name = Name(index);
            if (name.find_first_of(" ('=<>") != name.npos && sql.find(name) == sql.npos) return true;
        }
        return false;
    }

    sqlite3_stmt* statement_;
    StatementHandle written_;
};

void DescribeItem(const SelectItem& item, Column& column, bool& typed) {
    if (item.is_row_id) {
        if (!item.has_alias) column.name = "ROWID";    // SQLite names the key column that stands for it
        column.type = SQLT_RDD;
        column.size = kRowIdSize;
        column.precision = 0;
        column.scale = 0;
        column.nullable = false;
        typed = true;
    } else if (!item.type.empty()) {
        typed = ReadDeclaredType(item.type, column);
    }
}

// What neither a declaration nor its own text tells is a number when all that it may answer is, by the columns' names.
void DescribeNumbers(sqlite3* database, std::string_view sql, std::vector<Column>& columns, std::vector<bool>& untyped) {
    const std::vector<std::string_view> pieces = Split(sql);
    if (!IsOneOf(pieces[0], {"select", "with"})) return;
    StatementReading reading(database, sql, pieces);
    const std::vector<bool> numbers = reading.names.Numbers(0, untyped);
    for (std::size_t index = 0; index < columns.size(); ++index) {
        if (!numbers[index]) continue;
        MakeNumber(columns[index]);
        untyped[index] = false;
    }
}

}  // namespace

Verb VerbOf(std::string_view sql) {
    Pieces pieces(sql);
    int depth = 0;
    bool with = false;    // with ... (...) insert: the verb comes later
    for (std::string_view piece = pieces.Next(); !piece.empty(); piece = pieces.Next()) {
        if (piece == "(") ++depth;
        if (piece == ")") --depth;
        if (depth > 0 || piece == ")") continue;
        if (IsWord(piece, "insert") || IsWord(piece, "replace")) return Verb::insert;
        if (IsWord(piece, "update")) return Verb::update;
        if (IsWord(piece, "delete")) return Verb::remove;
        if (IsWord(piece, "select") || (!with && !IsWord(piece, "with"))) break;
        with = true;
    }
    return Verb::other;
}

void DescribeColumns(sqlite3* database, sqlite3_stmt* statement, std::string_view sql, std::vector<Column>& columns,
                     std::vector<bool>& untyped, std::span<const std::string> written) {
    const int count = sqlite3_column_count(statement);
    const std::vector<SelectItem> items = ReadSelectList(sql);
    const bool listed = items.size() == static_cast<std::size_t>(count);
    const WrittenNames names(database, statement, sql);
    for (int index = 0; index < count; ++index) {
        Column column;
        column.name = ShownName(names.Name(index), sql, written);
        const char* declared = sqlite3_column_decltype(statement, index);
        bool typed = declared && ReadDeclaredType(declared, column);
        column.nullable = IsNullable(database, statement, index);
        if (listed) DescribeItem(items[static_cast<std::size_t>(index)], column, typed);
        columns.push_back(std::move(column));
        untyped.push_back(!typed);
    }
    if (DescribeUnion(database, sql, columns, untyped)) return;
    const bool any_untyped = std::find(untyped.begin(), untyped.end(), true) != untyped.end();
    if (any_untyped && sqlite3_stmt_readonly(statement)) DescribeNumbers(database, sql, columns, untyped);
}

void DescribeValue(sqlite3_value* value, Column& column) {
    switch (sqlite3_value_type(value)) {
        case SQLITE_INTEGER:
        case SQLITE_FLOAT: return MakeNumber(column);
        case SQLITE_BLOB: {
            OCINumber number;
            const std::string_view bytes(static_cast<const char*>(sqlite3_value_blob(value)),
                                         static_cast<std::size_t>(sqlite3_value_bytes(value)));
            if (ReadNumberBlob(bytes, number)) return MakeNumber(column);
            column.type = SQLT_BIN;
            return;
        }
        default: column.type = SQLT_CHR;
    }
}

}  // namespace engine::sqlite
