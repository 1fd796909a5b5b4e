// Mode words of statements, binds and defines.
#pragma once

#include <cstring>

#include "core/keywords.h"
#include "oci.h"

// One keyword, or several joined by "|"; a word that matches none is a decimal number.
inline ub4 DecodeStatementMode(const char* word, const KeywordTable* modes) {
    const bool joined = std::strchr(word, '|') != nullptr;
    return static_cast<ub4>(joined ? DecodeBitmaskOrNumber(word, modes) : DecodeKeywordOrNumber(word, modes));
}
