// What a statement's text says before any engine has seen it: its kind, its placeholders, and the steps it runs in. A
// plain statement is one step; a block `begin ... end;` is one for each statement in it. Offsets are bytes in the text.
// It owns what it says; scanning is a pure function, for any thread.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace sql {

// What OCI_ATTR_STMT_TYPE answers.
enum class StatementType : std::uint16_t {
    unknown = 0, select = 1, update = 2, remove = 3, insert = 4, create = 5, drop = 6, alter = 7, begin = 8,
    declare = 9, call = 10, merge = 16
};

// How a step is run.
enum class Run : std::uint8_t {
    query,         // returns rows
    change,        // needs a transaction: insert, update, delete, merge, lock
    definition,    // commits before and after
    other,         // as the engine sees fit: explain, pragma, set, ...
    begin, commit, rollback,
    savepoint,     // set, roll back to or release one: within the transaction
    open_cursor,   // open :target for <query>
    assign,        // :target := <expression>
    nothing        // null;
};

struct Placeholder {
    std::string name;              // without the colon, in upper case unless quoted; a ? has its position
    std::string indicator;         // of the form :name:indicator
    std::uint32_t first = 0;       // index of the first placeholder of this name: itself unless repeated
    std::uint32_t begin = 0;
    std::uint32_t end = 0;
    bool is_row_id = false;        // compared with a row id
};

// A part of the text to run. [begin, end) without [cut_begin, cut_end), which is the `into :a, :b` of a statement that
// gives values back; `targets` are the placeholders that stand there, or the cursor or variable of the step.
struct Step {
    Run run = Run::other;
    std::uint32_t begin = 0;
    std::uint32_t end = 0;
    std::uint32_t cut_begin = 0;
    std::uint32_t cut_end = 0;
    bool locks_rows = false;       // select ... for update, or one with changes in it
    std::vector<std::uint32_t> targets;
};

struct StatementText {
    StatementType type = StatementType::unknown;
    std::uint16_t function_code = 0;          // what OCI_ATTR_SQLFNCODE answers
    bool is_block = false;
    std::vector<Placeholder> placeholders;    // in the order of the text
    std::vector<std::uint32_t> positions;     // placeholder of each bind position: every one; in blocks, each name once
    std::vector<Step> steps;                  // at least one unless `error`
    int error = 0;                            // published number of what the text itself tells to be wrong
    std::uint32_t error_offset = 0;

    [[nodiscard]] bool Returning() const;     // an insert, update or delete ... returning ... into
};

// Never fails: what is wrong with the text is in `error` and answered when the statement is executed.
StatementText Scan(std::string_view text);

// The name to search for, of a placeholder as a bind call names it: with or without the colon, quoted or not.
std::string PlaceholderName(std::string_view written);

}  // namespace sql
