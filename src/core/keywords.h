// Symbolic words and their values, and the reading of plain numbers. Command thread only.
#pragma once

#include <string_view>

#include "core/keyword_tables.h"

// The value of the first row whose keyword the word begins (case ignored), or kNotFound. A null or empty word prints
// "DecodeKeyword(): Null length token.\n" and finds nothing.
int DecodeKeyword(const char* word, const KeywordTable* table);

// The OR of the values of the words joined by "|"; blanks are ignored. A word that matches nothing prints a warning
// and adds nothing.
int DecodeBitmask(const char* word, const KeywordTable* table);
// The same, but a word must be the keyword as a whole.
int DecodeWholeWords(const char* word, const KeywordTable* table);

// As above; a word of which nothing matched is read as a decimal number (a bitmask has warned by then).
int DecodeKeywordOrNumber(const char* word, const KeywordTable* table);
int DecodeBitmaskOrNumber(const char* word, const KeywordTable* table);

// Decimal numbers by the rules of atoi and atol: optional leading blanks and sign, digits up to the first other
// character, 0 when there are none. A value too large for an int keeps its low 32 bits.
int DecodeNumber(const char* word);
long DecodeLong(const char* word);

// The reserved words, compared over the whole word without regard to case.
bool SameIgnoringCase(std::string_view left, std::string_view right);
inline bool IsNull(std::string_view word) {
    return SameIgnoringCase(word, "null");
}
inline bool IsInvalid(std::string_view word) {
    return SameIgnoringCase(word, "invalid");
}
