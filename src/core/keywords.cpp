// Decoding of symbolic words, alone and joined, and of plain numbers.
#include "core/keywords.h"

#include <strings.h>

#include <cctype>
#include <cstdlib>
#include <cstring>
#include <string_view>

#include "core/messages.h"

namespace {

constexpr size_t kLongestWord = 128;  // of a bitmask; what is beyond is not looked at

void ComplainOfEmptyWord() {
    Message(kError, "DecodeKeyword(): Null length token.\n");
}

enum class Match { beginning, whole };

// The first row whose keyword the word begins, or is; null without one.
const KeywordTable* FindRow(std::string_view word, const KeywordTable* table, Match match = Match::beginning) {
    char folded[kLongestWord];
    if (word.empty() || word.size() > sizeof folded) return nullptr;  // no keyword is that long
    for (size_t index = 0; index < word.size(); ++index)
        folded[index] = static_cast<char>(std::tolower(static_cast<unsigned char>(word[index])));
    for (const KeywordTable* row = table; row->keyword != nullptr; ++row) {
        if (std::strncmp(folded, row->keyword, word.size()) != 0) continue;
        if (match == Match::beginning || row->keyword[word.size()] == '\0') return row;
    }
    return nullptr;
}

// One word of a bitmask: ORs its value into `mask`, or complains. Returns whether it matched.
bool AddWord(std::string_view text, const KeywordTable* table, Match match, int& mask) {
    char word[kLongestWord];
    size_t length = 0;
    for (const char character : text) {
        if (character == ' ' || character == '\t') continue;
        if (length == sizeof word) break;
        word[length++] = character;
    }
    if (length == 0) {
        ComplainOfEmptyWord();
        return false;
    }
    const KeywordTable* row = FindRow({word, length}, table, match);
    if (row == nullptr) {
        Message(kOutput, "Warning : Unrecognized Token in bitmask : %.*s\n", static_cast<int>(length), word);
        return false;
    }
    mask |= row->value;
    return true;
}

// Returns whether any word matched.
bool Decode(std::string_view rest, const KeywordTable* table, int& mask, Match match = Match::beginning) {
    bool matched = false;
    for (;;) {
        const size_t bar = rest.find('|');
        matched |= AddWord(rest.substr(0, bar), table, match, mask);
        if (bar == std::string_view::npos) return matched;
        rest.remove_prefix(bar + 1);
    }
}

std::string_view TextOf(const char* word) {
    return word == nullptr ? std::string_view() : std::string_view(word);
}

}  // namespace

int DecodeKeyword(const char* word, const KeywordTable* table) {
    const std::string_view text = TextOf(word);
    if (text.empty()) ComplainOfEmptyWord();
    const KeywordTable* row = FindRow(text, table);
    return row == nullptr ? kNotFound : row->value;
}

int DecodeBitmask(const char* word, const KeywordTable* table) {
    int mask = 0;
    Decode(TextOf(word), table, mask);
    return mask;
}

int DecodeWholeWords(const char* word, const KeywordTable* table) {
    int mask = 0;
    Decode(TextOf(word), table, mask, Match::whole);
    return mask;
}

int DecodeKeywordOrNumber(const char* word, const KeywordTable* table) {
    const std::string_view text = TextOf(word);
    if (text.empty()) ComplainOfEmptyWord();
    const KeywordTable* row = FindRow(text, table);
    return row == nullptr ? DecodeNumber(word) : row->value;
}

int DecodeBitmaskOrNumber(const char* word, const KeywordTable* table) {
    int mask = 0;
    return Decode(TextOf(word), table, mask) ? mask : DecodeNumber(word);
}

int DecodeNumber(const char* word) {
    return static_cast<int>(DecodeLong(word));
}

long DecodeLong(const char* word) {
    return word == nullptr ? 0 : std::strtol(word, nullptr, 10);
}

bool SameIgnoringCase(std::string_view left, std::string_view right) {
    return left.size() == right.size() && strncasecmp(left.data(), right.data(), left.size()) == 0;
}
