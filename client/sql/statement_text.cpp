// Scanning a statement: its kind by its first word, its placeholders, the steps of a block. A statement is one that
// applications write: what begins with another word goes to no engine, whatever that would make of it.
#include "sql/statement_text.h"

#include <algorithm>
#include <unordered_map>

#include "handles/errors.h"
#include "sql/token_list.h"

namespace sql {
namespace {

constexpr std::uint16_t kBlockCode = 34;

// What the first word of a statement tells.
struct Leading {
    std::string_view word;
    StatementType type;
    std::uint16_t function_code;
    Run run;
};
constexpr Leading kLeading[] = {
    {"select", StatementType::select, 4, Run::query},
    {"values", StatementType::select, 4, Run::query},
    {"insert", StatementType::insert, 3, Run::change},
    {"replace", StatementType::insert, 3, Run::change},
    {"update", StatementType::update, 5, Run::change},
    {"delete", StatementType::remove, 9, Run::change},
    {"merge", StatementType::merge, 189, Run::change},
    {"lock", StatementType::unknown, 35, Run::change},
    {"create", StatementType::create, 0, Run::definition},
    {"drop", StatementType::drop, 0, Run::definition},
    {"alter", StatementType::alter, 0, Run::definition},
    {"truncate", StatementType::unknown, 85, Run::definition},
    {"grant", StatementType::unknown, 28, Run::definition},
    {"revoke", StatementType::unknown, 29, Run::definition},
    {"rename", StatementType::unknown, 37, Run::definition},
    {"comment", StatementType::unknown, 38, Run::definition},
    {"analyze", StatementType::unknown, 62, Run::definition},
    {"call", StatementType::call, kBlockCode, Run::change},
    {"begin", StatementType::begin, kBlockCode, Run::begin},
    {"declare", StatementType::declare, kBlockCode, Run::other},
    {"commit", StatementType::unknown, 54, Run::commit},
    {"rollback", StatementType::unknown, 55, Run::rollback},
    {"savepoint", StatementType::unknown, 56, Run::savepoint},
    {"release", StatementType::unknown, 56, Run::savepoint},
    {"set", StatementType::unknown, 33, Run::other},
    {"explain", StatementType::unknown, 27, Run::other},
};

// Function codes of definitions, by the object that is defined.
struct Defined {
    std::string_view object;
    std::uint16_t create, drop, alter;
};
constexpr Defined kDefined[] = {
    {"table", 1, 8, 26},   {"view", 10, 7, 0},       {"index", 20, 21, 0},    {"sequence", 13, 16, 14},
    {"user", 19, 11, 53},  {"role", 12, 0, 0},       {"schema", 17, 0, 0},    {"procedure", 24, 68, 25},
    {"synonym", 30, 31, 0}, {"trigger", 59, 0, 0},   {"session", 0, 0, 52},
};

const Leading* FindLeading(const Token& token) {
    for (const Leading& row : kLeading)
        if (token.Is(row.word)) return &row;
    return nullptr;
}

std::uint16_t DefinitionCode(const std::vector<Token>& tokens, StatementType type) {
    for (std::size_t index = 1; index < 6 && At(tokens, index).kind == TokenKind::word; ++index) {
        for (const Defined& row : kDefined) {
            if (!tokens[index].Is(row.object)) continue;
            return type == StatementType::create ? row.create : type == StatementType::drop ? row.drop : row.alter;
        }
    }
    return 0;
}

std::uint32_t Offset(std::size_t offset) { return static_cast<std::uint32_t>(offset); }

class Scanner {
public:
    explicit Scanner(std::string_view text) : tokens_(Tokenize(text, 0, text.size())) {}

    StatementText Result() {
        CheckQuotes();
        FindType();
        if (!DefinesCode(tokens_)) FindPlaceholders();
        if (result_.error != 0) return std::move(result_);
        if (IsBlock()) ParseBlock();
        else PlainStatement();
        FindPositions();
        return std::move(result_);
    }

private:
    void Fail(int number, const Token& token) {
        if (result_.error != 0) return;
        result_.error = number;
        result_.error_offset = Offset(token.begin);
    }

    void CheckQuotes() {
        for (const Token& token : tokens_) {
            if (token.kind == TokenKind::unclosed) Fail(errors::kUnclosedText, token);
            if (token.kind == TokenKind::invalid) Fail(errors::kInvalidCharacter, token);
        }
    }

    // The word that decides: the first one; behind WITH the first verb outside parentheses.
    const Leading* Decisive(std::size_t index) const {
        while (tokens_[index].Is("(")) ++index;
        if (!At(tokens_, index).Is("with")) return FindLeading(At(tokens_, index));
        int depth = 0;
        for (; index < tokens_.size(); ++index) {
            if (tokens_[index].Is("(")) ++depth;
            if (tokens_[index].Is(")")) --depth;
            const Leading* row = depth == 0 ? FindLeading(tokens_[index]) : nullptr;
            if (row && (row->run == Run::query || row->run == Run::change)) return row;
        }
        return nullptr;
    }

    void FindType() {
        const Leading* row = Decisive(0);
        if (!row || !ExplainsStatement(row)) return Fail(errors::kInvalidStatement, tokens_[0]);
        result_.type = row->type;
        run_ = row->run;
        result_.function_code = row->run == Run::definition && row->function_code == 0
                                    ? DefinitionCode(tokens_, row->type) : row->function_code;
    }

    // What is explained is a statement of its own kind.
    bool ExplainsStatement(const Leading* row) const {
        if (row->word != "explain") return true;
        std::size_t index = 1;
        while (At(tokens_, index).Is("query") || At(tokens_, index).Is("plan") || At(tokens_, index).Is("for")) ++index;
        const Leading* explained = FindLeading(At(tokens_, index));
        return At(tokens_, index).Is("with") ||
               (explained && (explained->run == Run::query || explained->run == Run::change));
    }

    void FindPlaceholders() {
        const std::vector<bool> row_ids = RowIdOperands(tokens_);
        std::unordered_map<std::string, std::uint32_t> names;
        for (std::size_t index = 0; index < tokens_.size(); ++index) {
            const Token& token = tokens_[index];
            const Token& next = At(tokens_, index + 1);
            if (token.Is("$") && next.kind == TokenKind::number && next.begin == token.End())
                return Fail(errors::kInvalidCharacter, token);    // an engine would take it for a placeholder
            if (token.kind != TokenKind::placeholder) continue;
            if (IsIndicator(tokens_, index)) {
                if (IsIndicator(tokens_, index - 1)) return Fail(errors::kInvalidCharacter, token);    // a third name
                result_.placeholders.back().indicator = PlaceholderName(token.text);
                continue;
            }
            const std::uint32_t place = Offset(result_.placeholders.size());
            Placeholder placeholder;
            placeholder.name = token.text == "?" ? std::to_string(place + 1) : PlaceholderName(token.text);
            placeholder.first = names.try_emplace(placeholder.name, place).first->second;
            placeholder.begin = Offset(token.begin);
            placeholder.end = Offset(token.End());
            placeholder.is_row_id = row_ids[index];
            result_.placeholders.push_back(std::move(placeholder));
        }
    }

    void FindPositions() {
        for (std::uint32_t index = 0; index < result_.placeholders.size(); ++index)
            if (!result_.is_block || result_.placeholders[index].first == index) result_.positions.push_back(index);
    }

    // The placeholder that a token is.
    std::uint32_t PlaceholderAt(const Token& token) const {
        const auto found = std::lower_bound(result_.placeholders.begin(), result_.placeholders.end(), token.begin,
                                            [](const Placeholder& p, std::size_t begin) { return p.begin < begin; });
        return Offset(static_cast<std::size_t>(found - result_.placeholders.begin()));
    }

    // A block, unless it is the BEGIN that starts a transaction.
    bool IsBlock() const {
        if (result_.type == StatementType::declare) return true;
        if (result_.type != StatementType::begin) return false;
        constexpr std::string_view kTransaction[] = {";", "transaction", "work", "deferred", "immediate", "exclusive",
                                                     "isolation", "read"};
        const Token& next = At(tokens_, 1);
        return next.kind != TokenKind::end && std::none_of(std::begin(kTransaction), std::end(kTransaction),
                                                           [&](auto word) { return next.Is(word); });
    }

    void PlainStatement() {
        std::size_t last = tokens_.size() - 1;
        while (tokens_[last - 1].Is(";")) --last;    // the first is a word
        if (!DefinesCode(tokens_)) {
            for (std::size_t index = 0; index < last; ++index)
                if (tokens_[index].Is(";")) return Fail(errors::kNotProperlyEnded, tokens_[index + 1]);
        }
        AddStep(run_, 0, last);
    }

    // Tokens [first, last) as a step; finds what it gives back and whether it locks rows.
    void AddStep(Run run, std::size_t first, std::size_t last) {
        Step step;
        step.run = run == Run::rollback && NamesSavepoint(first, last) ? Run::savepoint : run;
        if (step.run == Run::commit || step.run == Run::rollback) CheckEnd(first + 1, last);
        step.begin = first < last ? Offset(tokens_[first].begin) : 0;
        step.end = first < last ? Offset(tokens_[last - 1].End()) : 0;
        if (run == Run::change || (run == Run::query && result_.is_block)) FindInto(step, first, last);
        if (run == Run::query || run == Run::open_cursor || run == Run::assign) step.locks_rows = LocksRows(first, last);
        result_.steps.push_back(std::move(step));
    }

    // The engine never sees a commit or rollback: one of something else, or with more to do, is none.
    void CheckEnd(std::size_t next, std::size_t last) {
        if (next < last && (tokens_[next].Is("work") || tokens_[next].Is("transaction"))) ++next;
        if (next < last) Fail(errors::kNotProperlyEnded, tokens_[next]);
    }

    bool NamesSavepoint(std::size_t first, std::size_t last) const {
        return std::any_of(tokens_.begin() + static_cast<std::ptrdiff_t>(first),
                           tokens_.begin() + static_cast<std::ptrdiff_t>(last),
                           [](const Token& token) { return token.Is("to"); });
    }

    // `into :a, :b` outside parentheses: anywhere in a query, behind RETURNING in a change.
    void FindInto(Step& step, std::size_t first, std::size_t last) {
        bool allowed = step.run == Run::query;
        int depth = 0;
        for (std::size_t index = first; index < last; ++index) {
            if (tokens_[index].Is("(")) ++depth;
            if (tokens_[index].Is(")")) --depth;
            if (depth != 0) continue;
            if (tokens_[index].Is("returning")) allowed = true;
            const bool before_target = At(tokens_, index + 1).kind == TokenKind::placeholder;
            if (!allowed || !before_target || !tokens_[index].Is("into")) continue;
            step.cut_begin = Offset(tokens_[index].begin);
            for (++index; index < last; ++index) {
                const bool is_target = tokens_[index].kind == TokenKind::placeholder;
                if (!is_target && !tokens_[index].Is(",")) break;
                step.cut_end = Offset(tokens_[index].End());
                if (is_target && !IsIndicator(tokens_, index)) step.targets.push_back(PlaceholderAt(tokens_[index]));
            }
            return;
        }
    }

    // By `for update`, in a subquery too, or by a change in the place of one.
    bool LocksRows(std::size_t first, std::size_t last) const {
        for (std::size_t index = first; index + 1 < last; ++index) {
            const Token& next = tokens_[index + 1];
            if (tokens_[index].Is("for") && next.Is("update")) return true;
            const Token& behind = At(tokens_, index + 2);    // what no column or function of that name has there
            const bool begins = behind.Is("into") || behind.Is("from") || next.Is("update");
            const Leading* row = begins && tokens_[index].Is("(") ? FindLeading(next) : nullptr;
            if (row && row->run == Run::change) return true;
        }
        return false;
    }

    void ParseBlock() {
        result_.is_block = true;
        if (result_.type == StatementType::declare) return Fail(errors::kBlockError, tokens_[0]);
        std::size_t index = 1;
        while (!At(tokens_, index).Is("end")) {
            const std::size_t last = StatementEnd(index);
            if (!At(tokens_, last).Is(";")) return Fail(errors::kBlockError, At(tokens_, last));
            if (!BlockStatement(index, last)) return Fail(errors::kBlockError, tokens_[index]);
            index = last + 1;
        }
        ++index;
        if (At(tokens_, index).kind == TokenKind::word) ++index;    // the block's name
        while (At(tokens_, index).Is(";")) ++index;
        if (At(tokens_, index).kind != TokenKind::end) Fail(errors::kBlockError, tokens_[index]);
        if (result_.steps.empty()) Fail(errors::kBlockError, tokens_[0]);
    }

    // The index of the semicolon, or of the end of the text.
    std::size_t StatementEnd(std::size_t index) const {
        while (index + 1 < tokens_.size() && !tokens_[index].Is(";")) ++index;
        return index;
    }

    // One statement of a block; false when the library does not know such a one.
    bool BlockStatement(std::size_t first, std::size_t last) {
        const Token& verb = tokens_[first];
        if (verb.Is("null") && first + 1 == last) return AddStep(Run::nothing, last, last), true;
        if (verb.Is("open") && At(tokens_, first + 1).kind == TokenKind::placeholder &&
            At(tokens_, first + 2).Is("for")) {
            const Leading* row = Decisive(first + 3);
            return row && row->run == Run::query && AddTargeted(Run::open_cursor, first + 1, first + 3, last);
        }
        if (verb.kind == TokenKind::placeholder && At(tokens_, first + 1).Is(":="))
            return AddTargeted(Run::assign, first, first + 2, last);
        const Leading* row = FindLeading(verb);
        if (!row || row->run == Run::definition || row->run == Run::other || row->run == Run::begin) return false;
        AddStep(row->run, first, last);
        return row->run != Run::query || !result_.steps.back().targets.empty();
    }

    // A step over tokens [first, last) whose result goes to the placeholder at `target`.
    bool AddTargeted(Run run, std::size_t target, std::size_t first, std::size_t last) {
        if (first >= last) return false;
        AddStep(run, first, last);
        result_.steps.back().targets = {PlaceholderAt(tokens_[target])};
        return true;
    }

    std::vector<Token> tokens_;
    StatementText result_;
    Run run_ = Run::other;
};

}  // namespace

bool StatementText::Returning() const {
    return !is_block && std::any_of(steps.begin(), steps.end(), [](const Step& step) { return !step.targets.empty(); });
}

StatementText Scan(std::string_view text) { return Scanner(text).Result(); }

std::string PlaceholderName(std::string_view written) {
    if (!written.empty() && written.front() == ':') written.remove_prefix(1);
    if (written.size() >= 2 && written.front() == '"' && written.back() == '"')
        return std::string(written.substr(1, written.size() - 2));
    return UpperCase(written);
}

}  // namespace sql
