// Pieces of SQL text as SQLite reads it: words, quoted texts, single characters. Comments and blanks are no pieces. All
// views are of the text.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace engine::sqlite {

class Pieces {
public:
    explicit Pieces(std::string_view sql) : sql_(sql) {}
    std::string_view Next();    // empty at the end
    [[nodiscard]] std::size_t At() const { return at_; }    // where the last piece ended

private:
    void SkipBlanks();

    std::string_view sql_;
    std::size_t at_ = 0;
};

std::vector<std::string_view> Split(std::string_view sql);

// Without regard to letter case; `lower` is in lower case.
bool IsWord(std::string_view piece, std::string_view lower);

// The index, from 0, of the placeholder ?7 that stands at pieces[at]; kNoParameter for anything else.
constexpr std::size_t kNoParameter = static_cast<std::size_t>(-1);
std::size_t ParameterAt(const std::vector<std::string_view>& pieces, std::size_t at);

// A name without its quotes.
std::string PlainName(std::string_view piece);

// The first word behind blanks, comments and parentheses.
std::string_view FirstWord(std::string_view sql);

}  // namespace engine::sqlite
