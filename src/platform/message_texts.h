// Texts for the diagnostics of an XA call, broken into lines. Any thread.
#pragma once

#include <cstddef>

#include "kelpci.h"

// The error as the library worded it, or its number alone where it gave no words; nothing for a success without words.
// Answers the bytes written, the closing NUL not counted. Lines are broken at blanks, or within a word
// that is longer than a line, and the whole is cut to the capacity.
std::size_t SqlcaMessageText(char* buffer, std::size_t capacity, std::size_t line_width, const SQLCA& diagnostics);

// The meaning of a five-character SQLSTATE, which needs no terminator, or else of its class; nothing where neither is
// known. The same results.
std::size_t SqlstateMessageText(char* buffer, std::size_t capacity, std::size_t line_width, const char* sqlstate);
