// Texts for the diagnostics of an XA call, out of a message catalogue (message_catalogue.h says where it lies) and
// broken into lines. Any thread.
//
// Both answer the bytes written, the closing NUL not counted. Lines are broken at blanks, or within a word that is
// longer than a line, and the whole is cut to the capacity.
#pragma once

#include <cstddef>

#include "kelpci.h"

// "ORA-nnnnn", the catalogue's wording of the number and the words that came with it, as far as there are any; of a
// success the words alone.
std::size_t SqlcaMessageText(char* buffer, std::size_t capacity, std::size_t line_width, const char* catalogue,
                             const SQLCA& diagnostics);

// A five-character SQLSTATE, which needs no terminator, and what the catalogue says of it, or else of its class;
// nothing where it knows neither.
std::size_t SqlstateMessageText(char* buffer, std::size_t capacity, std::size_t line_width, const char* catalogue,
                                const char* sqlstate);
