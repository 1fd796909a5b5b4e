// Finding where a statement stores values, by its pieces. Forms that are not understood are left as they are.
#include "engine/sqlite/assignments.h"

#include <algorithm>
#include <cctype>
#include <initializer_list>
#include <utility>

#include "engine/sqlite/pieces.h"
#include "engine/sqlite/table_columns.h"

namespace engine::sqlite {
namespace {

constexpr std::ptrdiff_t kExactDigits = 15;

class Finder {
public:
    Finder(sqlite3* database, std::string_view sql) : database_(database), sql_(sql), pieces_(Split(sql)) {}

    ValueTargets Find() {
        if (Is(0, "insert") || Is(0, "replace")) Insert();
        else if (Is(0, "update")) Update();
        return std::move(result_);
    }

private:
    // An expression: pieces [first, last).
    struct Span {
        std::size_t first, last;
    };

    bool Is(std::size_t index, std::string_view word) const {
        return index < pieces_.size() && IsWord(pieces_[index], word);
    }
    std::size_t Begin(std::size_t index) const { return static_cast<std::size_t>(pieces_[index].data() - sql_.data()); }
    std::size_t End(std::size_t index) const { return Begin(index) + pieces_[index].size(); }

    // The first of the words at the depth of `from`, outside parentheses; the end of the text when there is none.
    std::size_t FindWord(std::size_t from, std::initializer_list<std::string_view> words) const {
        int depth = 0;
        for (std::size_t index = from; index < pieces_.size(); ++index) {
            if (pieces_[index] == "(") ++depth;
            if (pieces_[index] == ")" && --depth < 0) return index;
            if (depth != 0) continue;
            const bool found = std::any_of(words.begin(), words.end(), [&](auto word) { return Is(index, word); });
            if (found) return index;
        }
        return pieces_.size();
    }

    void Insert() {
        std::size_t at = 1;
        while (at < pieces_.size() && at < 4 && !Is(at, "into")) ++at;
        if (!Is(at, "into")) return;
        at = ReadTable(database_, pieces_, at + 1, columns_);
        if (Is(at, "as")) at += 2;
        std::vector<const TableColumn*> targets;
        if (Is(at, "(")) {
            for (++at; at < pieces_.size() && !Is(at, ")"); ++at) {
                if (!Is(at, ",")) targets.push_back(FindColumn(columns_, pieces_[at]));
            }
            ++at;
        } else {
            for (const TableColumn& column : columns_) targets.push_back(&column);
        }
        if (Is(at, "values")) InsertValues(at + 1, targets);
        else if (Is(at, "select") || Is(at, "with")) InsertQuery(at, targets);
    }

    void InsertValues(std::size_t at, const std::vector<const TableColumn*>& targets) {
        while (Is(at, "(")) {
            std::size_t column = 0;
            for (;;) {
                const std::size_t end = FindWord(at + 1, {","});
                if (end >= pieces_.size()) return;
                if (column < targets.size()) Assign({at + 1, end}, targets[column]);
                ++column;
                at = end;
                if (Is(end, ")")) break;
            }
            if (!Is(++at, ",")) return;
            ++at;
        }
    }

    // insert into t <query> becomes
    // with kelp_source(c1, ...) as (<query>) insert into t select kelp_store(c1, ...), ... from kelp_source
    void InsertQuery(std::size_t at, const std::vector<const TableColumn*>& targets) {
        const bool concerned = std::any_of(targets.begin(), targets.end(),
                                           [](const TableColumn* target) { return target && target->concerned; });
        if (!concerned || FindWord(at, {"returning", "conflict", ";"}) != pieces_.size()) return;
        std::string names;
        std::string values;
        for (std::size_t index = 0; index < targets.size(); ++index) {
            const std::string name = "c" + std::to_string(index + 1);
            const std::string_view separator = index > 0 ? ", " : "";
            names.append(separator).append(name);
            values.append(separator).append(Stored(name, targets[index]));
        }
        const std::size_t query = Begin(at);
        result_.sql = "with kelp_source(" + names + ") as (" + std::string(sql_.substr(query)) + "\n) " +
                      std::string(sql_.substr(0, query)) + " select " + values + " from kelp_source";
    }

    static std::string Stored(const std::string& expression, const TableColumn* target) {
        if (!target || !target->concerned) return expression;
        const std::string& name = target->column.name;
        return "kelp_store(" + expression + ", " + Literal(target->declared) + ", " + Literal(name) + ")";
    }

    void Update() {
        std::size_t at = Is(1, "or") ? 3 : 1;
        at = ReadTable(database_, pieces_, at, columns_);
        at = FindWord(at, {"set"});
        while (at < pieces_.size() && !EndsAssignments(at)) {
            const std::size_t end = FindWord(at + 1, {",", "from", "where", "returning", "order", "limit", ";"});
            if (Is(at + 2, "=") && at + 3 < end) Assign({at + 3, end}, FindColumn(columns_, pieces_[at + 1]));
            at = end;
        }
    }

    bool EndsAssignments(std::size_t at) const { return !Is(at, "set") && !Is(at, ","); }

    void Assign(Span span, const TableColumn* target) {
        if (!target || !target->concerned || span.first >= span.last) return;
        const std::size_t index = span.last - span.first == 2 ? ParameterAt(pieces_, span.first) : kNoParameter;
        if (index != kNoParameter) {
            result_.parameters.push_back({index, target->column, Coercion::Purpose::store});
        } else if (!IsHarmless(span, *target)) {
            const std::string wrapped = Stored(IsLongNumber(span) ? "''" : "", target);    // kelp_store('', 'type', ...
            const std::size_t middle = wrapped.find(',') - (IsLongNumber(span) ? 1 : 0);
            result_.wraps.push_back({Begin(span.first), wrapped.substr(0, middle)});
            result_.wraps.push_back({End(span.last - 1), wrapped.substr(middle)});
        }
    }

    // A literal of a number with more digits than a real keeps: it is read as text.
    bool IsLongNumber(Span span) const {
        const std::string_view text = sql_.substr(Begin(span.first), End(span.last - 1) - Begin(span.first));
        const auto digits = std::count_if(text.begin(), text.end(), [](unsigned char c) { return std::isdigit(c); });
        return digits > kExactDigits &&
               text.find_first_not_of("0123456789.", text[0] == '-' ? 1 : 0) == std::string_view::npos;
    }

    // A null, and a plain number for a column of numbers without limits.
    bool IsHarmless(Span span, const TableColumn& target) const {
        if (span.last - span.first != 1) return false;
        const std::string_view piece = pieces_[span.first];
        if (Is(span.first, "null")) return true;
        return std::all_of(piece.begin(), piece.end(), [](unsigned char c) { return std::isdigit(c); }) &&
               std::ssize(piece) <= kExactDigits && target.column.type == SQLT_NUM &&
               (target.column.precision == 0 || target.column.precision == 38);
    }

    sqlite3* database_;
    std::string_view sql_;
    std::vector<std::string_view> pieces_;
    std::vector<TableColumn> columns_;
    ValueTargets result_;
};

}  // namespace

std::string ValueTargets::Rewritten(std::string_view text) const {
    std::string rewritten = sql;
    if (!sql.empty() || wraps.empty()) return rewritten;
    std::size_t copied = 0;
    for (const Wrap& wrap : wraps) {
        rewritten.append(text.substr(copied, wrap.at - copied)).append(wrap.text);
        copied = wrap.at;
    }
    return rewritten.append(text.substr(copied));
}

ValueTargets FindAssignments(sqlite3* database, std::string_view sql) {
    const std::string_view word = FirstWord(sql);
    const bool stores = IsWord(word, "insert") || IsWord(word, "replace") || IsWord(word, "update");
    return stores ? Finder(database, sql).Find() : ValueTargets();
}

}  // namespace engine::sqlite
