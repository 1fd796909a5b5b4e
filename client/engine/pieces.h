// Pieces of SQL text: words, numbers, quoted texts, placeholders, operators, single characters. As SQLite reads it, and
// as PostgreSQL does where no backslash or dollar sign makes quotes of another kind.
// Comments and blanks are no pieces. All views are of the text. Pure functions; any thread.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace engine {

class Pieces {
public:
    explicit Pieces(std::string_view sql) : sql_(sql) {}
    std::string_view Next();    // empty at the end
    [[nodiscard]] std::size_t At() const { return at_; }    // where the last piece ended

private:
    void SkipBlanks();
    [[nodiscard]] std::size_t QuotedEnd(std::size_t quote) const;
    [[nodiscard]] std::size_t NumberEnd(std::size_t begin) const;
    [[nodiscard]] std::size_t WordEnd(std::size_t begin) const;
    [[nodiscard]] char Character(std::size_t index) const { return index < sql_.size() ? sql_[index] : '\0'; }

    std::string_view sql_;
    std::size_t at_ = 0;
};

// Pieces [first, last) of a text.
struct Span {
    std::size_t first = 0;
    std::size_t last = 0;
    [[nodiscard]] std::size_t Size() const { return last - first; }
};

using PieceList = std::vector<std::string_view>;
PieceList Split(std::string_view sql);

std::string Lower(std::string_view text);    // of ASCII letters

bool IsWordCharacter(char c);    // which another one beside it would make longer

// Without regard to letter case; `lower` is in lower case.
bool IsWord(std::string_view piece, std::string_view lower);

// The index, from 0, of a placeholder like ?7; kNoParameter for anything else.
constexpr std::size_t kNoParameter = static_cast<std::size_t>(-1);
std::size_t ParameterOf(std::string_view piece);

bool IsName(std::string_view piece);       // a word or quoted name
bool IsLiteral(std::string_view piece);    // 'text'
bool IsNumber(std::string_view piece);     // 12, .5, 1e-3; no sign

// A name, perhaps with its schema's before it: "s.t". False for anything else.
struct ObjectName {
    std::string_view schema, name;    // as they are written
};
bool ReadObjectName(std::string_view text, ObjectName& read);

// A name without its quotes; the text of a literal.
std::string PlainName(std::string_view piece);
std::string PlainText(std::string_view literal);

}  // namespace engine
