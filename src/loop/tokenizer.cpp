// The scanner of a command line, and the token buffers its words are copied to.
#include "loop/tokenizer.h"

#include <cctype>
#include <cstring>

#include "core/messages.h"
#include "objects/memory.h"
#include "objects/text_conversion.h"

namespace {

constexpr char kQuote = '"';
constexpr char kComment = '#';

static_assert(TextArgument::kTokenBufferSize == kLineSize, "as much as commands pass on of a word");

// What a slot without a buffer holds.
char empty_word[kLineSize];

bool IsSpace(char character) {
    return std::isspace(static_cast<unsigned char>(character)) != 0;
}

char* SkipBlanks(char* position) {
    while (*position == ' ' || *position == '\t') ++position;
    return position;
}

// Where the scanning of a line stands. The last byte of the buffer is always zero.
struct Scanner {
    char* const last;  // of the buffer
    char* position;
    bool line_done = false;

    char* Quoted();
    char* Plain();
    void CloseWord(bool terminate);
};

// Goes to the end of the word and past the character that ends it; a comment ends the line as well.
void Scanner::CloseWord(bool terminate) {
    while (*position != '\0' && *position != kComment && !IsSpace(*position)) ++position;
    line_done = *position == kComment || *position == '\0';
    if (terminate) *position = '\0';
    if (!line_done) ++position;
}

char* Scanner::Plain() {
    char* word = position;
    CloseWord(true);
    return word;
}

char* Scanner::Quoted() {
    char* word = position + 1;
    auto* close = static_cast<char*>(std::memchr(word, kQuote, static_cast<size_t>(last - word)));
    if (close == nullptr) {
        Message(kOutput, "Parser warning: Missing end delimiter \"%c\"\n", kQuote);
        position = last;
        line_done = true;
        return word;
    }
    *close = '\0';
    position = close + 1;
    CloseWord(false);  // what is glued to the closing quote is dropped
    return word;
}

}  // namespace

TokenVector::TokenVector() {
    for (char*& slot : slots_) slot = empty_word;
}

TokenVector::~TokenVector() {
    for (char* slot : slots_)
        if (slot != empty_word) FreeMem(slot);
}

void TokenVector::StrAllocAndCopy(int slot, const char* text) {
    const size_t size = std::strlen(text) + 1;
    if (size > kLineSize) {
        Message(kError, "StrAllocAndCopy(): inString len > MAX_BUFFER_SIZE !\n");
        return;
    }
    if (slots_[slot] == empty_word) {
        auto* room = static_cast<char*>(GetMem(kLineSize));
        if (room == nullptr) {
            Message(kError, "StrAllocAndCopy(): GetMem() failed !\n");
            return;
        }
        slots_[slot] = room;
    }
    std::memcpy(slots_[slot], text, size);
}

int Tokenize(char* line, char* start, TokenVector& tokens) {
    Scanner scanner{line + kLineSize - 1, SkipBlanks(start)};
    int count = 0;
    bool too_many = false;
    do {
        const char* word = *scanner.position == kQuote ? scanner.Quoted() : scanner.Plain();
        if (count < kTokenSlots) tokens.StrAllocAndCopy(count++, word);
        else too_many = true;
        if (scanner.line_done) break;
        scanner.position = SkipBlanks(scanner.position);
    } while (*scanner.position != '\0' && *scanner.position != '\n' && *scanner.position != kComment);
    if (too_many) Message(kOutput, "Parser warning: Too many tokens\n");
    return count;
}
