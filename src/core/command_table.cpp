// The lookup of commands by what a typed word begins, and the table of handlers. Set up at start-up, then only read.
#include "core/command_table.h"

#include <array>
#include <cctype>
#include <cstdlib>
#include <cstring>

#include "core/messages.h"

constexpr Command kCommandTable[] = {
#define COMMAND(word, code) {#word, Code::word},
#define ALIAS(word, other) {#word, Code::other},
#include "core/commands.def"
    {nullptr, Code{}},
};

namespace {

// Codes are places in tables: none stands for two commands, none is beyond what tables are made for.
constexpr bool CodesAreSound() {
    bool taken[kCodeLimit] = {};
    for (const Code code : kCommandCodes) {
        const int place = static_cast<int>(code);
        if (place <= 0 || place >= kCodeLimit || taken[place]) return false;
        taken[place] = true;
    }
    return true;
}
static_assert(CodesAreSound(), "a code in commands.def is used twice or out of bounds");

// Which codes are a command's.
constexpr auto kIsCommand = [] {
    std::array<bool, kHighestCommandCode + 1> is_command{};
    for (const Code code : kCommandCodes) is_command[static_cast<size_t>(code)] = true;
    return is_command;
}();

bool IsCommand(Code code) {
    const int place = static_cast<int>(code);
    return place >= 0 && place <= kHighestCommandCode && kIsCommand[static_cast<size_t>(place)];
}

// The first four characters rule most rows out; every word of the table has as many, a closing zero counted.
bool Begins(const char* folded, size_t length, const char* word) {
    constexpr size_t kHead = 4;
    if (length >= kHead && std::memcmp(folded, word, kHead) != 0) return false;
    return std::strncmp(folded, word, length) == 0;
}

[[noreturn]] void RefuseRow(const CommandRow& row, const char* reason) {
    Message(kOutput, "Command code %d %s: %s\n", static_cast<int>(row.code), reason, row.usage);
    std::abort();
}

}  // namespace

const Command* FindCommand(const char* word) {
    char folded[32];
    const size_t length = std::strlen(word);
    if (length == 0 || length > sizeof folded) return nullptr;  // no command is that long
    for (size_t index = 0; index < length; ++index)
        folded[index] = static_cast<char>(std::tolower(static_cast<unsigned char>(word[index])));
    for (const Command* row = kCommandTable; row->word != nullptr; ++row)
        if (Begins(folded, length, row->word)) return row;
    return nullptr;
}

void HandlerTable::Set(const CommandRow& row, void (*run)(const CommandRow&, int, char**)) {
    if (!IsCommand(row.code)) RefuseRow(row, "is no command's");
    Handler& handler = handlers_[static_cast<int>(row.code)];
    if (handler.row != nullptr) RefuseRow(row, "has two handlers");
    handler = {&row, run};
}

const HandlerTable::Handler* HandlerTable::Find(Code code) const {
    const Handler& handler = handlers_[static_cast<int>(code)];
    return handler.row == nullptr ? nullptr : &handler;
}
