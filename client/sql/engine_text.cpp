// Writing a step for an engine: one pass over its tokens, each of which is copied or replaced by what the dialect says.
// No engine is known here. Linear in the text; one Rewriter serves one step, on the thread that compiles it.
#include "sql/engine_text.h"

#include <algorithm>
#include <array>
#include <span>

#include "date/date.h"
#include "engine/pieces.h"
#include "sql/token_list.h"
#include "values/rowid.h"

namespace sql {
namespace {

using Spellings = std::span<const engine::Dialect::Spelling>;

// The application's q'[text]' or n'text' as a plain literal.
std::string PlainLiteral(std::string_view q_literal) {
    const std::size_t quote = q_literal.find('\'');
    if (q_literal[quote - 1] == 'n' || q_literal[quote - 1] == 'N') return std::string(q_literal.substr(quote));
    std::string literal = "'";
    for (const char c : q_literal.substr(quote + 2, q_literal.size() - quote - 4)) literal.append(c == '\'' ? 2 : 1, c);
    return literal += '\'';
}

class Rewriter {
public:
    Rewriter(std::string_view text, const StatementText& statement, const Step& step, const engine::Dialect& dialect)
        : text_(text), statement_(statement), step_(step), dialect_(dialect),
          tokens_(Tokenize(text, step.begin, step.end)), row_ids_(RowIdOperands(tokens_)),
          names_columns_(statement.type == StatementType::create || statement.type == StatementType::alter),
          defines_code_(DefinesCode(tokens_)) {
        if (!dialect.casts.empty()) FindCasts();
        if (dialect.decode) CountArguments();
        result_.source_begin = copied_ = step.begin;
        if (step.run != Run::assign) return;
        result_.sql = "select ";    // an expression by itself
        result_.edits.push_back({step.begin, step.begin, 0, result_.sql.size()});
    }

    EngineText Result() {
        for (std::size_t index = 0;; index = Visit(index)) {
            if (index == default_end_) Insert(tokens_[index - 1].End(), ")");
            if (tokens_[index].kind == TokenKind::end) break;
        }
        Copy(step_.end);
        return std::move(result_);
    }

private:
    // A parenthesis that is open.
    struct Open {
        bool is_cast;        // cast(... as TYPE)
        std::size_t as;      // of a cast that becomes a function: where the AS stands
        bool is_columns;     // the columns of a table's definition
        bool is_type_size;   // the size behind a type's name
        std::size_t decoded = 0;      // of a decode: its argument that is visited, from 1
        std::size_t arguments = 0;    // of a decode: all of them
        bool is_from_subquery = false;    // a subquery of a from clause
        bool in_from = false;         // what is visited stands in the from clause of its own
    };

    // Deals with the token, answers the index of the next one.
    std::size_t Visit(std::size_t index) {
        const Token& token = tokens_[index];
        if (token.begin >= step_.cut_begin && token.begin < step_.cut_end) return Drop(index, step_.cut_end);
        switch (token.kind) {
            case TokenKind::placeholder: return VisitPlaceholder(index);
            case TokenKind::literal: VisitLiteral(index); break;
            case TokenKind::quoted_word:
                if (dialect_.quoted_name && !defines_code_) Replace(token, token.End(), dialect_.quoted_name(token.text));
                break;
            case TokenKind::q_literal: Replace(token, token.End(), PlainLiteral(token.text)); break;
            case TokenKind::symbol: VisitSymbol(index); break;
            case TokenKind::word: return VisitWord(index);
            default: break;
        }
        return index + 1;
    }

    std::size_t VisitPlaceholder(std::size_t index) {
        const Token& token = tokens_[index];
        if (defines_code_) return index + 1;
        const auto& all = statement_.placeholders;
        const auto found = std::lower_bound(all.begin(), all.end(), token.begin,
                                            [](const Placeholder& p, std::size_t begin) { return p.begin < begin; });
        result_.placeholders.push_back(static_cast<std::uint32_t>(found - all.begin()));
        const bool has_indicator = IsIndicator(tokens_, index + 1);
        const std::size_t end = tokens_[index + has_indicator].End();
        Replace(token, end, dialect_.placeholder(result_.placeholders.size()));
        return index + 1 + has_indicator;
    }

    // A row id's text that is compared with one becomes the engine's number of the row.
    void VisitLiteral(std::size_t index) {
        const Token& token = tokens_[index];
        if (token.text == "''" && !dialect_.empty_text.empty()) return Replace(token, token.End(), dialect_.empty_text);
        rowid::RowId value;
        if (!row_ids_[index] || !rowid::FromText(token.text.substr(1, token.text.size() - 2), &value)) return;
        engine::RowId row;
        if (rowid::ToBytes(value, row.bytes.data())) Replace(token, token.End(), dialect_.row_id_literal(row));
    }

    void VisitSymbol(std::size_t index) {
        const Token& token = tokens_[index];
        if (token.Is(",") && !open_.empty() && open_.back().decoded > 0) {
            Replace(token, token.End(), DecodeComma(open_.back()));
        } else if (token.Is("(")) {
            const bool columns = names_columns_ && open_.empty();
            const std::size_t as = index > 0 && !cast_as_.empty() ? cast_as_[index - 1] : 0;
            open_.push_back({Previous(index).Is("cast"), as, columns, type_end_ == index, decode_begin_ == index, Arguments(index),
                             IsFromSubquery(index)});
        } else if (token.Is(")")) {
            if (!open_.empty() && open_.back().decoded > 0) Replace(token, token.End(), dialect_.decode->end);
            if (!open_.empty() && open_.back().is_from_subquery && !FollowedByAlias(index)) {
                Insert(token.End(), std::string(dialect_.subquery_alias) + std::to_string(++subqueries_));
            }
            if (!open_.empty()) open_.pop_back();
        } else if (token.Is("*") && !open_.empty() && open_.back().is_type_size) {
            Replace(token, token.End(), "38");
        }
    }

    // Whether the parenthesis at `index` opens a subquery of a from clause.
    bool IsFromSubquery(std::size_t index) const {
        const Token& next = At(tokens_, index + 1);
        const Token& before = Previous(index);
        const bool is_query = next.Is("select") || next.Is("with") || next.Is("values");
        const bool is_place = IsFrom(index - 1) || before.Is("join") || before.Is(",");
        return !dialect_.subquery_alias.empty() && is_query && is_place && (open_.empty() ? in_from_ : open_.back().in_from);
    }

    // No comparison, as IS DISTINCT FROM is.
    bool IsFrom(std::size_t index) const { return At(tokens_, index).Is("from") && !Previous(index).Is("distinct"); }

    // From clauses begin and end with words.
    void NoteClause(std::size_t index) {
        const Token& token = tokens_[index];
        constexpr std::string_view kOthers[] = {"select", "where", "group", "order", "having", "union", "intersect",
                                                "minus", "except", "limit", "set", "values"};
        bool& in_from = open_.empty() ? in_from_ : open_.back().in_from;
        if (IsFrom(index)) in_from = true;
        else if (in_from && std::any_of(std::begin(kOthers), std::end(kOthers), [&](auto word) { return token.Is(word); }))
            in_from = false;
    }

    std::size_t VisitWord(std::size_t index) {
        const Token& token = tokens_[index];
        NoteClause(index);
        const Token& literal = At(tokens_, index + 1);
        if (token.Is("x") && dialect_.bytes_literal && literal.kind == TokenKind::literal && literal.begin == token.End()) {
            Replace(token, literal.End(), dialect_.bytes_literal(literal.text.substr(1, literal.text.size() - 2)));
            return index + 2;
        }
        if (!open_.empty() && open_.back().as == index) return VisitCastType(index);
        if (IsTypePlace(index)) return VisitType(index);
        const bool in_type_size = !open_.empty() && open_.back().is_type_size;
        if (in_type_size && (token.Is("char") || token.Is("byte"))) return Drop(index, token.End());
        if (token.Is("default") && names_columns_ && !defines_code_) VisitDefault(index);
        if (token.Is("rowid") && !dialect_.row_id.empty() && !Previous(index).Is("as")) {
            Replace(token, token.End(), dialect_.row_id);
        } else if (token.Is("dual") && Previous(index).Is("from")) {
            std::string table(dialect_.dual);
            Replace(token, token.End(), FollowedByAlias(index) ? table : table + " as dual");
        } else if (token.Is("minus") && At(tokens_, index + 1).Is("select")) {
            Replace(token, token.End(), dialect_.minus);
        } else if (token.Is("truncate") && index == 0 && At(tokens_, 1).Is("table") &&
                   !dialect_.truncate_table.empty()) {
            Replace(token, tokens_[1].End(), dialect_.truncate_table);
        } else if (token.Is("for") && step_.locks_rows && dialect_.cuts_for_update && open_.empty() &&
                   At(tokens_, index + 1).Is("update")) {
            return Drop(index, step_.end);
        } else if (!cast_as_.empty() && cast_as_[index] > 0) {
            const std::size_t type = cast_as_[index] + 1;
            std::string function(FindCast(type)->engine);
            if (CountsCharacters(type)) function += dialect_.counts_characters;
            Replace(token, token.End(), function);
        } else if (IsDateLiteral(index)) {
            return VisitDateLiteral(index);
        } else if (const std::size_t end = VisitIntervalLiteral(index)) {
            return end;
        } else if (IsDecode(index)) {
            decode_begin_ = index + 1;
            Replace(token, tokens_[index + 1].End(), dialect_.decode->begin);
        } else if (const auto* spelling = FindFunction(index)) {
            Replace(token, token.End(), spelling->engine);
        }
        return index + 1;
    }

    bool IsDecode(std::size_t index) const {
        return dialect_.decode && tokens_[index].Is("decode") && At(tokens_, index + 1).Is("(") &&
               !Previous(index).Is(".") && !defines_code_ && Arguments(index + 1) > 2;
    }

    // How many arguments the parentheses at `index` hold, if they are a decode's.
    std::size_t Arguments(std::size_t index) const { return arguments_.empty() ? 0 : arguments_[index]; }

    // Counts the arguments of all decodes in one pass.
    void CountArguments() {
        arguments_.resize(tokens_.size());
        std::vector<std::size_t> open;
        for (std::size_t index = 0; tokens_[index].kind != TokenKind::end; ++index) {
            const Token& token = tokens_[index];
            if (token.Is("(")) {
                arguments_[index] = Previous(index).Is("decode") ? 1 : 0;
                open.push_back(index);
            } else if (token.Is(")")) {
                if (!open.empty()) open.pop_back();
            } else if (token.Is(",") && !open.empty() && arguments_[open.back()] > 0) {
                ++arguments_[open.back()];
            }
        }
    }

    // What stands between the arguments of a decode.
    std::string_view DecodeComma(Open& decode) const {
        const std::size_t before = decode.decoded++;    // the argument that ends
        if (before == 1) return dialect_.decode->first;
        if (before % 2 == 0) return dialect_.decode->then;
        return before + 1 == decode.arguments ? dialect_.decode->otherwise : dialect_.decode->next;
    }

    // Notes each CAST whose type has a function to do it: the place of its AS, by the place of the word CAST.
    void FindCasts() {
        cast_as_.assign(tokens_.size(), 0);
        std::vector<std::size_t> open;    // the word before each open parenthesis
        for (std::size_t index = 1; index < tokens_.size(); ++index) {
            if (tokens_[index].Is("(")) open.push_back(index - 1);
            if (open.empty()) continue;
            const bool in_cast = tokens_[open.back()].Is("cast");
            if (tokens_[index].Is(")")) open.pop_back();
            else if (in_cast && tokens_[index].Is("as") && FindCast(index + 1)) cast_as_[open.back()] = index;
        }
    }

    const engine::Dialect::Spelling* FindCast(std::size_t type) const {
        const auto found = std::find_if(dialect_.casts.begin(), dialect_.casts.end(),
                                        [&](const auto& spelling) { return MatchWords(type, spelling.written) > 0; });
        return found == dialect_.casts.end() ? nullptr : &*found;
    }

    // The sign of a scale, as in number(5, -2).
    bool IsSign(std::size_t index) const {
        return (tokens_[index].Is("-") || tokens_[index].Is("+")) && Previous(index).Is(",");
    }

    // What no type has among its sizes.
    static bool IsStray(const Token& token) {
        return token.kind != TokenKind::word && token.kind != TokenKind::number && !token.Is("(") && !token.Is(")") &&
               !token.Is(",") && !token.Is("*");
    }

    // "as T(a, b)" of a cast that became a function: its further arguments. Answers the closing parenthesis.
    std::size_t VisitCastType(std::size_t as) {
        std::string arguments;
        int depth = 0;
        std::size_t index = as + 1;
        if (const auto& type = *FindCast(index); !type.sizes.empty()) {
            const std::size_t first = index;
            index += MatchWords(index, type.written);
            arguments = ", " + IntervalSizes(first, type.sizes, index);
        }
        for (; tokens_[index].kind != TokenKind::end; ++index) {
            const Token& token = tokens_[index];
            if (token.Is(")") && --depth < 0) break;
            if (token.kind == TokenKind::number) arguments.append(IsSign(index - 1) ? "" : ", ").append(token.text);
            if (token.Is("*")) arguments.append(", 38");
            if (IsSign(index)) arguments.append(", ").append(token.text);
            else if (IsStray(token)) arguments.append(token.text);    // the engine refuses it there
            if (token.Is("(")) ++depth;
        }
        Replace(tokens_[as], tokens_[index].begin, arguments);
        return index;
    }

    // Whether the word stands where a type is named: cast(x as HERE, or behind a column's name in a definition.
    bool IsTypePlace(std::size_t index) const {
        if (defines_code_) return false;
        if (!open_.empty() && open_.back().is_cast) return Previous(index).Is("as");
        if (!names_columns_ || index < 2) return false;
        const Token& name = tokens_[index - 1];
        const Token& before = tokens_[index - 2];
        if (statement_.type == StatementType::alter && open_.empty() && name.Is("type")) return true;
        if (name.kind != TokenKind::word && name.kind != TokenKind::quoted_word) return false;
        if (!open_.empty()) return open_.back().is_columns && (before.Is("(") || before.Is(","));
        const bool adds = before.Is("add") || before.Is("column") || before.Is("modify");
        return statement_.type == StatementType::alter && adds;
    }

    // The default of a column is an expression by itself, which some engines want in parentheses unless it is a literal.
    void VisitDefault(std::size_t index) {
        const std::size_t first = index + 1;
        const std::size_t last = DefaultEnd(first);
        const bool has_sign = tokens_[first].Is("-") || tokens_[first].Is("+");
        const bool is_name = tokens_[first].kind == TokenKind::word && !tokens_[first].Is("null") && !FindFunction(first);
        if (IsDateLiteral(first) || (!is_name && last <= first + 1 + has_sign)) return;
        Insert(tokens_[first].begin, "(");
        default_end_ = last;
    }

    // Behind the expression: where its column's constraints, the next column or the end of the definition come.
    std::size_t DefaultEnd(std::size_t first) const {
        constexpr std::string_view kConstraints[] = {
            "not", "null", "constraint", "primary", "unique", "check", "references", "collate", "generated", "enable",
            "disable"};
        std::size_t index = first;
        for (int depth = 0; tokens_[index].kind != TokenKind::end; ++index) {
            const Token& token = tokens_[index];
            if (token.Is("(")) ++depth;
            if (depth == 0 && (token.Is(")") || token.Is(","))) break;
            if (token.Is(")")) --depth;
            const bool ends = index > first && depth == 0 &&
                              std::any_of(std::begin(kConstraints), std::end(kConstraints),
                                          [&](auto word) { return token.Is(word); });
            if (ends) break;
        }
        return index;
    }

    // Whether the size of the type at `index` is told in characters: varchar2(9 char).
    bool CountsCharacters(std::size_t index) const {
        while (At(tokens_, index).kind == TokenKind::word) ++index;
        return At(tokens_, index).Is("(") && At(tokens_, index + 2).Is("char");
    }

    std::size_t VisitType(std::size_t index) {
        std::size_t end = index + 1;
        for (const auto& spelling : dialect_.types) {
            const std::size_t matched = MatchWords(index, spelling.written);
            if (matched == 0) continue;
            end = index + matched;
            std::string replacement(spelling.engine);
            if (!spelling.sizes.empty()) {
                replacement.append("(").append(IntervalSizes(index, spelling.sizes, end)).append(")");
            } else if (matched > 1 && IsSize(index + 1)) replacement.append("(").append(tokens_[index + 2].text).append(")");
            if (spelling.drops_size) end = BehindSize(end);
            Replace(tokens_[index], tokens_[end - 1].End(), replacement);
            break;
        }
        while (At(tokens_, end).kind == TokenKind::word && CountsCharacters(end)) ++end;
        if (CountsCharacters(end)) Insert(tokens_[end - 1].End(), dialect_.counts_characters);
        type_end_ = end;    // where the size in parentheses may follow
        return end;
    }

    // The sizes of an interval's type, which stand behind its second word and its last; `end` goes behind the latter.
    std::string IntervalSizes(std::size_t index, std::string_view defaults, std::size_t& end) const {
        const std::size_t comma = std::min(defaults.find(','), defaults.size());
        std::string leading(defaults.substr(0, comma)), fraction(defaults.substr(comma));
        if (IsSize(index + 2)) leading = tokens_[index + 3].text;
        if (!fraction.empty() && IsSize(end)) {
            fraction = "," + std::string(tokens_[end + 1].text);
            end += 3;
        }
        return leading + fraction;
    }

    // Behind what stands in parentheses at `index`, if anything does.
    std::size_t BehindSize(std::size_t index) const {
        if (!At(tokens_, index).Is("(")) return index;
        while (tokens_[index].kind != TokenKind::end && !tokens_[index].Is(")")) ++index;
        return index + (tokens_[index].kind != TokenKind::end);
    }

    // Whether a size in parentheses stands at `index`: "(3)".
    bool IsSize(std::size_t index) const {
        const bool holds_number = At(tokens_, index + 1).kind == TokenKind::number;
        return holds_number && At(tokens_, index).Is("(") && At(tokens_, index + 2).Is(")");
    }

    // How many tokens the words of `written` are at `index`; 0 when they are not there. A size may stand behind any
    // but the last word: timestamp(3) with time zone.
    std::size_t MatchWords(std::size_t index, std::string_view written) const {
        std::size_t count = 0;
        while (!written.empty()) {
            const std::size_t length = std::min(written.find(' '), written.size());
            if (count > 0 && IsSize(index + count)) count += 3;
            if (!At(tokens_, index + count).Is(written.substr(0, length))) return 0;
            written.remove_prefix(std::min(length + 1, written.size()));
            ++count;
        }
        return count;
    }

    bool FollowedByAlias(std::size_t index) const {
        constexpr std::string_view kClauses[] = {
            "where", "group", "order", "having", "union", "intersect", "minus", "except", "connect", "start", "limit",
            "offset", "fetch", "for", "join", "inner", "left", "right", "full", "cross", "natural", "on",
            "window", "returning"};
        const Token& next = At(tokens_, index + 1);
        return next.kind == TokenKind::quoted_word ||
               (next.kind == TokenKind::word &&
                std::none_of(std::begin(kClauses), std::end(kClauses), [&](auto word) { return next.Is(word); }));
    }

    bool IsDateLiteral(std::size_t index) const {
        return (tokens_[index].Is("date") || tokens_[index].Is("timestamp")) &&
               tokens_[index + 1].kind == TokenKind::literal;
    }

    // date '2024-2-9' becomes what the engine writes for it; what is no date stays as it is.
    std::size_t VisitDateLiteral(std::size_t index) {
        const Token& literal = tokens_[index + 1];
        date::DateTime value;
        if (date::FromEngineText(literal.text.substr(1, literal.text.size() - 2), &value) != 0) return index + 2;
        Replace(tokens_[index], literal.End(), dialect_.date_literal(value, tokens_[index].Is("date")));
        return index + 2;
    }

    // interval '1-2' year to month becomes the call that casts its text; answers 0 for what is none.
    std::size_t VisitIntervalLiteral(std::size_t index) {
        if (!tokens_[index].Is("interval") || At(tokens_, index + 1).kind != TokenKind::literal) return 0;
        for (const auto& cast : dialect_.casts) {
            if (cast.sizes.empty()) continue;
            const std::string_view fields = cast.written.substr(cast.written.find(' ') + 1);
            const std::size_t matched = MatchWords(index + 2, fields);
            if (matched == 0) continue;
            std::size_t end = index + 2 + matched;
            const std::string sizes = IntervalSizes(index + 1, cast.sizes, end);
            const std::string text = std::string(cast.engine) + "(" + std::string(tokens_[index + 1].text) + ", " + sizes + ")";
            Replace(tokens_[index], tokens_[end - 1].End(), text);
            return end;
        }
        return 0;
    }

    // A word of the dialect's lists: one that stands alone, or a call; no name's part, no alias.
    const engine::Dialect::Spelling* FindFunction(std::size_t index) const {
        const Token& next = tokens_[index + 1];
        const auto& list = next.Is("(") ? dialect_.calls : dialect_.functions;
        const auto found = std::find_if(list.begin(), list.end(),
                                        [&](const auto& spelling) { return tokens_[index].Is(spelling.written); });
        if (found == list.end() || defines_code_) return nullptr;
        if (Previous(index).Is(".") || Previous(index).Is("as") || next.Is(".")) return nullptr;
        return &*found;
    }

    const Token& Previous(std::size_t index) const { return index > 0 ? tokens_[index - 1] : tokens_.back(); }

    void Copy(std::size_t end) {
        const std::string_view part = text_.substr(copied_, end - copied_);
        const bool behind_edit = !result_.edits.empty() && result_.edits.back().end == result_.sql.size();
        if (behind_edit && KeepApart(part)) ++result_.edits.back().end;
        result_.sql.append(part);
        copied_ = end;
    }

    // What the engine would read as one word with the text before it, as in :"a"from; answers whether a blank was put between.
    bool KeepApart(std::string_view part) {
        const bool joins = !result_.sql.empty() && !part.empty() && engine::IsWordCharacter(result_.sql.back()) &&
                           engine::IsWordCharacter(part.front());
        if (joins) result_.sql += ' ';
        return joins;
    }

    void Replace(const Token& first, std::size_t source_end, std::string_view replacement) {
        Copy(first.begin);
        const std::size_t begin = result_.sql.size();
        KeepApart(replacement);
        result_.sql.append(replacement);
        result_.edits.push_back({first.begin, source_end, begin, result_.sql.size()});
        copied_ = source_end;
    }

    // At the end of a word it makes that longer.
    void Insert(std::size_t place, std::string_view inserted) {
        if (inserted.empty()) return;
        Copy(place);
        const std::size_t begin = result_.sql.size();
        result_.sql.append(inserted);
        result_.edits.push_back({place, place, begin, result_.sql.size()});
    }

    // Leaves out the text up to `source_end`; answers the first token behind it.
    std::size_t Drop(std::size_t index, std::size_t source_end) {
        Replace(tokens_[index], source_end, "");
        while (tokens_[index].kind != TokenKind::end && tokens_[index].begin < source_end) ++index;
        return index;
    }

    std::string_view text_;
    const StatementText& statement_;
    const Step& step_;
    const engine::Dialect& dialect_;
    std::vector<Token> tokens_;
    std::vector<bool> row_ids_;    // by token: what is compared with row ids
    const bool names_columns_;
    const bool defines_code_;
    std::vector<Open> open_;
    std::vector<std::size_t> arguments_;    // by token: of the decode that opens there
    std::vector<std::size_t> cast_as_;    // by token; 0: no cast that becomes a function
    std::size_t type_end_ = std::string_view::npos;
    bool in_from_ = false;
    unsigned subqueries_ = 0;
    std::size_t decode_begin_ = std::string_view::npos;    // the parenthesis of the decode at hand
    std::size_t default_end_ = std::string_view::npos;    // where a default's closing parenthesis comes
    std::size_t copied_ = 0;
    EngineText result_;
};

}  // namespace

std::uint32_t EngineText::SourceOffset(std::size_t offset) const {
    const auto after = std::upper_bound(edits.begin(), edits.end(), offset,
                                        [](std::size_t at, const Edit& edit) { return at < edit.begin; });
    if (after == edits.begin()) return static_cast<std::uint32_t>(source_begin + offset);
    const Edit& edit = *(after - 1);
    return static_cast<std::uint32_t>(offset < edit.end ? edit.source_begin : edit.source_end + (offset - edit.end));
}

EngineText Rewrite(std::string_view text, const StatementText& statement, const Step& step,
                   const engine::Dialect& dialect) {
    return Rewriter(text, statement, step, dialect).Result();
}

}  // namespace sql
