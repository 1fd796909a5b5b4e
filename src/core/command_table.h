// The commands: their words and codes, and how a code reaches its handler. What a command looks like (code, word
// counts, usage text, and whatever tells it from its siblings) is a row; rows of one shape share one handler. All of it
// is set up at start-up and only read afterwards, in any thread.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <span>

// What a command is called in rows and in trace lines: Code::ocinumberadd.
enum class Code : int {
#define COMMAND(word, code) word = (code),
#include "core/commands.def"
};

struct Command {
    const char* word;  // lower case; null in the closing row
    Code code;
};

// In lookup order, closed by a row without a word: the first row that a typed word begins is the command.
extern const Command kCommandTable[];

// The first row that the word, in any case, begins; null when there is none. The word must not be empty.
const Command* FindCommand(const char* word);

// Each code once, as the list has them.
inline constexpr Code kCommandCodes[] = {
#define COMMAND(word, code) Code::word,
#include "core/commands.def"
};
inline constexpr int kHighestCommandCode = static_cast<int>(std::ranges::max(kCommandCodes));
inline constexpr int kCodeLimit = 1000;  // codes stay below it: they are places in tables

// The word counts a command takes, the command word included.
struct WordCounts {
    uint64_t bits;  // bit n stands for n words
    bool from_there_on = false;  // any count above the highest bit is taken as well

    constexpr bool Has(int count) const {
        if (count < 64 && (bits >> count & 1) != 0) return true;
        return from_there_on && (count >= 64 || (bits >> count) == 0);
    }
};
template <class... Counts> constexpr WordCounts Words(Counts... counts) {
    return {((uint64_t{1} << counts) | ...)};
}
constexpr WordCounts WordsBetween(int first, int last) {
    uint64_t bits = 0;
    for (int count = first; count <= last; ++count) bits |= uint64_t{1} << count;
    return {bits};
}
constexpr WordCounts WordsFrom(int first) {
    return {uint64_t{1} << first, true};
}
// For a command that checks its word count itself.
inline constexpr WordCounts kAnyWords{1, true};

// What every row of every shape begins with. A count that `words` does not hold prints the usage text as invalid syntax,
// or as it is where it begins with "Usage: ", and nothing else happens: the dispatcher sees to that, no handler does.
struct CommandRow {
    Code code;
    WordCounts words;
    const char* usage;
};

// A command whose handler is a column of its own row.
struct PlainCommand : CommandRow {
    void (*run)(const CommandRow& row, int count, char** words);
};

// Code to handler. A family of commands adds its rows once, at start-up; the rows must live as long as the process. A
// code that is no command's, or has a handler already, is a fault of the program and ends it with a message.
class HandlerTable {
public:
    struct Handler {
        const CommandRow* row = nullptr;
        void (*run)(const CommandRow& row, int count, char** words) = nullptr;
    };

    // Every row reaches Run(row, count, words).
    template <auto Run, class Row> void Add(std::span<const Row> rows) {
        for (const Row& row : rows)
            Set(row, [](const CommandRow& base, int count, char** words) {
                Run(static_cast<const Row&>(base), count, words);
            });
    }
    template <auto Run, class Row, size_t kCount> void Add(const Row (&rows)[kCount]) {
        Add<Run>(std::span<const Row>(rows));
    }
    template <size_t kCount> void Add(const PlainCommand (&rows)[kCount]) {
        for (const PlainCommand& row : rows) Set(row, row.run);
    }
    // Null when no family has added the code.
    const Handler* Find(Code code) const;

private:
    void Set(const CommandRow& row, void (*run)(const CommandRow&, int, char**));
    Handler handlers_[kHighestCommandCode + 1];
};
