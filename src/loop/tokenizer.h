// Splits a command line into words. Command thread only.
#pragma once

#include <cstddef>

inline constexpr size_t kLineSize = 10000;  // of the line buffer and of every token buffer
inline constexpr int kTokenSlots = 1024;

// The words of one reading level. A slot gets its buffer of kLineSize bytes when it is first used and keeps it, and
// what it held, for later lines. A slot that could not get one holds an empty word.
class TokenVector {
public:
    TokenVector();
    ~TokenVector();
    TokenVector(const TokenVector&) = delete;
    TokenVector& operator=(const TokenVector&) = delete;

    // Copies the text into the slot, or complains and leaves the slot as it was.
    void StrAllocAndCopy(int slot, const char* text);
    char** Words() { return slots_; }

private:
    char* slots_[kTokenSlots];
};

// `line` is a buffer of kLineSize bytes, `start` where the first word begins. Returns the number of words. The line is
// written to: a word is closed with a zero where it ends. A quote without its partner runs on to the end of the buffer,
// over the line's own end and into what an earlier line has left there.
int Tokenize(char* line, char* start, TokenVector& tokens);
