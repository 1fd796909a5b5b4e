// Finding where a statement stores values, by its pieces: from the verb on, clause by clause.
#include "engine/sqlite/assignments.h"

#include <algorithm>
#include <cctype>
#include <deque>
#include <initializer_list>
#include <string>
#include <utility>

#include "engine/pieces.h"
#include "engine/sqlite/column_types.h"
#include "engine/sqlite/operands.h"
#include "engine/sqlite/table_columns.h"
#include "handles/errors.h"
#include "number/number.h"
#include "oci.h"

namespace engine::sqlite {
namespace {

constexpr std::ptrdiff_t kExactDigits = 15;

class Finder {
public:
    Finder(sqlite3* database, StatementReading& reading, ValueTargets& targets)
        : database_(database), sql_(reading.sql), pieces_(reading.pieces), names_(reading.names), targets_(targets) {}

    Status Find() {
        if (Is(0, "create") || Is(0, "alter")) return Definition();
        const bool with = Is(0, "with");
        const std::size_t verb = with ? FindWord(1, {"insert", "replace", "update", "select", "delete"}) : 0;
        if (Is(verb, "insert") || Is(verb, "replace")) Insert(verb);
        else if (Is(verb, "update")) Update(verb);
        if (with || !writes_alike_) targets_.objects.clear();
        return {};
    }

private:
    using Columns = std::vector<const TableColumn*>;

    bool Is(std::size_t index, std::string_view word) const {
        return index < pieces_.size() && IsWord(pieces_[index], word);
    }
    // The offset of a piece; the end of the text behind the last one.
    std::size_t Begin(std::size_t index) const {
        return index < pieces_.size() ? static_cast<std::size_t>(pieces_[index].data() - sql_.data()) : sql_.size();
    }
    std::size_t End(std::size_t index) const { return Begin(index) + pieces_[index].size(); }

    // The first of the words at the depth of `from`, outside parentheses, or the parenthesis that closes around it; the
    // end of the text when there is none.
    std::size_t FindWord(std::size_t from, std::initializer_list<std::string_view> words) const {
        int depth = 0;
        for (std::size_t index = from; index < pieces_.size(); ++index) {
            if (pieces_[index] == "(") ++depth;
            if (pieces_[index] == ")" && --depth < 0) return index;
            if (depth != 0) continue;
            const bool found = std::any_of(words.begin(), words.end(), [&](auto word) { return Is(index, word); });
            if (found && (!Is(index, "from") || BeginsFrom(pieces_, index))) return index;
        }
        return pieces_.size();
    }

    // The columns that a table is made with, or one that is added.
    Status Definition() {
        const std::size_t table = FindWord(1, {"table", "as"});
        if (!Is(table, "table")) return {};
        if (Is(0, "alter")) {
            std::size_t column = FindWord(table, {"add"}) + 1;
            if (Is(column, "column")) ++column;
            return ColumnDefault({column, pieces_.size()});
        }
        std::size_t at = table + 1;
        while (at < pieces_.size() && !Is(at, "(") && !Is(at, "as")) ++at;
        while (Is(at, "(") || Is(at, ",")) {
            const std::size_t end = FindWord(at + 1, {","});
            if (Status status = ColumnDefault({at + 1, end}); !status.Ok()) return status;
            at = end;
        }
        return {};
    }

    // name type ... default 'literal' ...
    Status ColumnDefault(Span definition) {
        const std::size_t type = definition.first + 1;
        const std::size_t at = FindWord(type, {"default"});
        std::size_t literal = at + 1;
        if (at >= definition.last) return {};
        const bool has_sign = IsSign(literal);
        if (has_sign) ++literal;
        const bool is_number = IsNumber(pieces_[literal]);
        if (!is_number && !(IsLiteral(pieces_[literal]) && !has_sign)) return {};
        std::size_t type_end = type;
        while (type_end < at && (!IsKeyword(pieces_[type_end]) && !Is(type_end, "constraint"))) ++type_end;
        if (type_end == type) return {};
        Column column;
        if (!ReadDeclaredType(sql_.substr(Begin(type), End(type_end - 1) - Begin(type)), column)) return {};
        const bool as_text = is_number && IsTextType(column.type);
        if (!as_text && !Coercion::Concerns(column)) return {};
        column.name = UpperCase(PlainName(pieces_[definition.first]));
        if (is_number && IsDateType(column.type)) return Error(errors::kInconsistentTypes, "column " + column.name);
        std::string written = is_number ? std::string(sql_.substr(Begin(at + 1), End(literal) - Begin(at + 1)))
                                        : PlainText(pieces_[literal]);
        Status status = as_text ? ShowNumber(written) : Status();
        std::string kept;
        if (status.Ok()) status = Convert(written, column, Coercion::Purpose::store, kept);
        if (!status.Ok()) return status;
        targets_.edits.push_back({Begin(at + 1), End(literal), std::move(kept), "", true});
        return {};
    }

    // The literal of a number as the number comes out.
    static Status ShowNumber(std::string& text) {
        OCINumber number;
        std::size_t length = 0;
        const auto digits = std::remove_if(text.begin(), text.end(), [](unsigned char c) { return std::isspace(c); });
        int failure = number::FromPlainText({text.begin(), digits}, '.', &number);
        text.resize(number::kMaxPlainText);
        if (failure == 0) failure = number::ToPlainText(number, '.', text.data(), &length);
        text.resize(length);
        return failure == 0 ? Status() : Error(failure);
    }

    void Insert(std::size_t verb) {
        std::size_t at = ReadTableName(pieces_, FindWord(verb, {"into"}) + 1, table_);
        if (Is(at, "as")) at += 2;
        Columns targets;
        if (Is(at, "(")) {
            at = ReadNames(at, targets);
        } else {
            for (TableColumn& column : InsertableColumns(database_, table_)) targets.push_back(&Keep(std::move(column)));
        }
        if (Is(at, "values")) InsertValues(at + 1, targets);
        else if (Is(at, "select") || Is(at, "with")) InsertQuery(at, targets);
        for (at = FindWord(at, {"do"}); at < pieces_.size(); at = FindWord(at + 1, {"do"})) {
            if (Is(at + 1, "update")) Set(FindWord(at, {"set"}));
        }
    }

    // The columns named in the list that opens at `open`; answers where the text goes on behind it.
    std::size_t ReadNames(std::size_t open, Columns& columns) {
        const std::size_t close = FindWord(open + 1, {});
        for (std::size_t at = open + 1; at < close; at += 2) columns.push_back(FindColumn(pieces_[at]));
        return close + 1;
    }

    TableColumn& Keep(TableColumn column) { return columns_.emplace_back(std::move(column)); }

    // Null when the table has no such column.
    const TableColumn* FindColumn(std::string_view name) {
        TableColumn column;
        return ReadColumn(database_, table_, name, column) ? &Keep(std::move(column)) : nullptr;
    }

    void InsertValues(std::size_t at, const Columns& targets) {
        std::size_t lists = 0;
        for (bool more = Is(at, "("); more; ++lists) {
            at = AssignList(at, targets);
            more = Is(at, ",");
            if (more) ++at;
        }
        writes_alike_ = lists == 1 && at == pieces_.size();
    }

    // The expressions of the list that opens at `open`, one a column; answers where the text goes on behind it.
    std::size_t AssignList(std::size_t open, const Columns& targets) {
        std::size_t column = 0;
        for (std::size_t at = open;; ++column) {
            const std::size_t end = FindWord(at + 1, {","});
            if (column < targets.size()) Assign({at + 1, end}, targets[column]);
            at = end;
            if (!Is(end, ",")) return end + 1;
        }
    }

    void InsertQuery(std::size_t at, const Columns& targets) {
        std::size_t end = FindWord(at, {"returning", "on"});
        while (Is(end, "on") && !BeginsConflict(pieces_, end)) end = FindWord(end + 1, {"returning", "on"});    // a join's
        WrapQuery({at, end}, targets, Is(end, "on"));
    }

    // How the values of a query's column become texts; of several queries the greatest counts.
    enum class Shown : std::uint8_t { as_they_are, with_all_digits, as_computed };

    // A query becomes "with kelp_source(c1, ...) as (<query>) select kelp_store(c1, ...), ... from kelp_source". What
    // ON CONFLICT follows needs a condition before it.
    void WrapQuery(Span query, const Columns& targets, bool with_condition) {
        const std::vector<Shown> shown = AssignQuery(query, targets);
        bool concerned = false;
        std::string names;
        std::string values;
        for (std::size_t index = 0; index < targets.size(); ++index) {
            const std::string name = "c" + std::to_string(index + 1);
            const std::string_view separator = index > 0 ? ", " : "";
            const std::string stored = Stored(name, targets[index], shown[index]);
            concerned |= stored != name;
            names.append(separator).append(name);
            values.append(separator).append(stored);
        }
        if (!concerned) return;
        targets_.edits.push_back({Begin(query.first), Begin(query.last), "with kelp_source(" + names + ") as (",
                                  "\n) select " + values + " from kelp_source" + (with_condition ? " where 1 " : " ")});
    }

    // What a query, or several with UNION and its like between them, gives to columns of texts. Beside what is computed
    // placeholders become texts at once, where that changes neither the order nor which rows are alike.
    std::vector<Shown> AssignQuery(Span query, const Columns& targets) {
        std::vector<Shown> shown(targets.size(), Shown::as_they_are);
        if (std::none_of(targets.begin(), targets.end(), TakesText)) return shown;
        const std::vector<std::size_t> parts = names_.Parts(query.first);
        const bool looks = parts.size() > 1 || std::any_of(targets.begin(), targets.end(), MakesText);
        for (const std::size_t part : parts) {
            const std::vector<Shown> of_part = ShownBy(part, targets, looks);
            std::transform(shown.begin(), shown.end(), of_part.begin(), shown.begin(), [](Shown a, Shown b) { return std::max(a, b); });
        }
        const bool takes_all = std::all_of(parts.begin(), parts.end(), [&](std::size_t part) { return part == parts[0] || Is(part - 1, "all"); });
        const bool at_once = takes_all && FindWord(query.first, {"order", "limit"}) >= query.last;
        for (const std::size_t part : parts) AssignItems(part, targets, shown, at_once);
        return shown;
    }

    // The items of a query's list, when there is one a column.
    std::vector<Names::Item> ItemsFor(std::size_t part, const Columns& targets) const {
        std::vector<Names::Item> items = Is(part, "select") ? names_.Items(part) : std::vector<Names::Item>();
        const bool alike = items.size() == targets.size() && std::none_of(items.begin(), items.end(), [](const auto& item) { return item.is_all; });
        return alike ? items : std::vector<Names::Item>();
    }

    std::vector<Shown> ShownBy(std::size_t part, const Columns& targets, bool looks) {
        const std::vector<Names::Item> items = ItemsFor(part, targets);
        std::vector<std::uint16_t> types(targets.size());
        if (looks || items.empty()) types = names_.Types(part, targets.size());
        std::vector<Shown> shown(targets.size(), Shown::as_computed);
        for (std::size_t index = 0; index < targets.size(); ++index) {
            const std::uint16_t type = types[index];
            if (IsTextType(type) || IsDateType(type) || IsIntervalType(type)) shown[index] = Shown::as_they_are;
            else if (type == SQLT_IBDOUBLE) shown[index] = Shown::with_all_digits;
            else if (!items.empty() && TakesText(targets[index])) shown[index] = ShownItem(items[index].expression);
        }
        return shown;
    }

    Shown ShownItem(Span item) {
        const Span value = Bare(item);
        const std::string_view piece = pieces_[value.first];
        if (value.Size() == 1 && (IsLiteral(piece) || IsWord(piece, "null"))) return Shown::as_they_are;
        const bool is_short = value.Size() == 1 && IsNumber(piece) && std::ssize(piece) <= kExactDigits;
        const bool is_placeholder = value.Size() == 1 && ParameterOf(piece) != kNoParameter;
        return is_short || is_placeholder || names_.HasAllDigits(value) ? Shown::with_all_digits : Shown::as_computed;
    }

    void AssignItems(std::size_t part, const Columns& targets, const std::vector<Shown>& shown, bool at_once) {
        const std::vector<Names::Item> items = ItemsFor(part, targets);
        for (std::size_t column = 0; column < items.size(); ++column) {
            const Span value = Bare(items[column].expression);
            const std::size_t index = value.Size() == 1 ? ParameterOf(pieces_[value.first]) : kNoParameter;
            if (index == kNoParameter || !TakesText(targets[column])) continue;
            Column text = targets[column]->column;
            text.size = text.characters = 0;
            const bool becomes_text = at_once && shown[column] == Shown::as_computed;
            targets_.parameters.push_back({index, std::move(text), becomes_text ? Coercion::Purpose::store : Coercion::Purpose::pass});
        }
    }

    static std::string Stored(std::string expression, const TableColumn* target, Shown shown) {
        const bool with_all_digits = TakesText(target) && shown == Shown::with_all_digits;
        if (with_all_digits) expression = "kelp_exact_text(" + expression + ")";
        if (target && target->concerned) return "kelp_store(" + expression + Described(*target);
        return MakesText(target) && shown == Shown::as_computed ? "kelp_text(" + expression + ")" : expression;
    }
    static std::string Described(const TableColumn& target) {
        return ", " + Literal(target.declared) + ", " + Literal(target.column.name) + ")";
    }

    void Update(std::size_t verb) {
        const std::size_t at = ReadTableName(pieces_, Is(verb + 1, "or") ? verb + 3 : verb + 1, table_);
        Set(FindWord(at, {"set"}));
        writes_alike_ = FindWord(at, {"from", "returning"}) == pieces_.size();
    }

    // From SET, or a comma between assignments, on.
    void Set(std::size_t at) {
        while (Is(at, "set") || Is(at, ",")) {
            const std::size_t end =
                FindWord(at + 1, {",", "from", "where", "returning", "order", "limit", "on"});
            if (Is(at + 1, "(")) SetRow({at + 1, end});
            else Assign({at + 3, end}, FindColumn(pieces_[at + 1]));
            at = end;
        }
    }

    // (a, b) = (1, 2) or (a, b) = (select ...); (a) = 1
    void SetRow(Span row) {
        Columns targets;
        const std::size_t equals = ReadNames(row.first, targets);
        if (targets.size() == 1) return Assign({equals + 1, row.last}, targets[0]);
        const std::size_t first = equals + 2;
        if (Is(first, "select") || Is(first, "with")) WrapQuery({first, FindWord(first, {})}, targets, false);
        else AssignList(equals + 1, targets);
    }

    bool IsSign(std::size_t index) const { return Is(index, "-") || Is(index, "+"); }

    // Without the parentheses around a single piece, or one with a sign.
    Span Bare(Span span) const {
        Span bare = span;
        while (bare.Size() > 2 && Is(bare.first, "(") && Is(bare.last - 1, ")")) bare = {bare.first + 1, bare.last - 1};
        return bare.Size() == (IsSign(bare.first) ? 2 : 1) ? bare : span;
    }

    void Assign(Span span, const TableColumn* target) {
        span = Bare(span);
        NoteObject(span, target);
        const std::size_t index = span.Size() == 1 ? ParameterOf(pieces_[span.first]) : kNoParameter;
        if (target && index != kNoParameter && (target->concerned || ObjectKindOf(target->column) || IsText(*target))) {
            targets_.parameters.push_back({index, target->column, Coercion::Purpose::store});
            return;
        }
        if (!target) return;
        NoteText(span, *target);
        if (!target->concerned || IsHarmless(span, *target)) return;
        const std::string number = LongNumber(span, *target);
        targets_.edits.push_back({Begin(span.first), End(span.last - 1), "kelp_store(" + number, Described(*target), !number.empty()});
    }

    // By its words; one of which they say nothing is what SQLite makes of it.
    static bool IsText(const TableColumn& target) {
        Column column;
        return ReadDeclaredType(target.declared, column) && IsTextType(column.type);
    }

    static bool TakesText(const TableColumn* target) { return target && IsText(*target); }
    static bool MakesText(const TableColumn* target) { return TakesText(target) && !target->concerned; }

    void NoteText(Span span, const TableColumn& target) {
        if (!MakesText(&target)) {
            if (IsText(target) && names_.HasAllDigits(span)) targets_.texts.push_back(span);
            return;
        }
        const std::string number = LongNumber(span, target);
        if (number.empty()) targets_.texts.push_back(span);
        else targets_.edits.push_back({Begin(span.first), End(span.last - 1), "kelp_text(" + number, ")", true});
    }

    void NoteObject(Span span, const TableColumn* target) {
        const std::size_t index = target && span.Size() == 1 ? ParameterOf(pieces_[span.first]) : kNoParameter;
        if (index == kNoParameter) return;
        if (const auto kind = ObjectKindOf(target->column))
            targets_.objects.push_back({index, table_, target->name, *kind});
    }

    // A literal of a number with more digits than a real keeps, as an expression that keeps them; none for anything else.
    std::string LongNumber(Span span, const TableColumn& target) const {
        const bool has_sign = span.Size() == 2 && IsSign(span.first);
        const std::string_view number = pieces_[span.last - 1];
        if (span.Size() > (has_sign ? 2 : 1) || number.find_first_not_of("0123456789.eE+-") != number.npos) return {};
        const std::string_view digits = number.substr(0, number.find_first_of("eE"));
        if (std::count_if(digits.begin(), digits.end(), [](unsigned char c) { return std::isdigit(c); }) <= kExactDigits) return {};
        const std::string literal = Literal(std::string(has_sign ? pieces_[span.first] : "").append(number));
        return IsText(target) ? "kelp_number(" + literal + ")" : literal;
    }

    // A null, and a plain number for a column of numbers without limits.
    bool IsHarmless(Span span, const TableColumn& target) const {
        if (span.Size() != 1) return false;
        const std::string_view piece = pieces_[span.first];
        if (Is(span.first, "null")) return true;
        return std::all_of(piece.begin(), piece.end(), [](unsigned char c) { return std::isdigit(c); }) &&
               std::ssize(piece) <= kExactDigits && target.column.type == SQLT_NUM &&
               (target.column.precision == 0 || (target.column.precision == 38 && target.column.scale == 0));
    }

    sqlite3* database_;
    std::string_view sql_;
    const std::vector<std::string_view>& pieces_;
    Names& names_;
    ValueTargets& targets_;
    TableName table_;                   // that is changed
    bool writes_alike_ = false;         // the same values into each row, and shows none
    std::deque<TableColumn> columns_;    // of it, as far as they are named
};

}  // namespace

Status FindAssignments(sqlite3* database, StatementReading& reading, ValueTargets& targets) {
    return Finder(database, reading, targets).Find();
}

}  // namespace engine::sqlite
