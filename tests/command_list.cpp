// Prints the commands that have a handler, a line each: word, usage text, and the word counts it takes ("3 5 6"; "4+"
// for any count from there on, "any" for a command that judges its counts itself). What tests need to know of the
// command table.
#include <cstdio>
#include <string>

#include "loop/dispatch.h"

namespace {

std::string CountsOf(const WordCounts& words) {
    std::string counts;
    for (int count = 1; count < 64; ++count)
        if ((words.bits >> count & 1) != 0) counts += (counts.empty() ? "" : " ") + std::to_string(count);
    if (words.from_there_on) return counts.empty() ? "any" : counts + "+";
    return counts;
}

// A usage text may end in a line feed of its own.
std::string OneLine(std::string usage) {
    while (!usage.empty() && usage.back() == '\n') usage.pop_back();
    return usage;
}

}  // namespace

int main() {
    for (const Command* command = kCommandTable; command->word != nullptr; ++command) {
        const HandlerTable::Handler* handler = Handlers().Find(command->code);
        if (handler == nullptr) continue;
        const CommandRow& row = *handler->row;
        std::printf("%s\t%s\t%s\n", command->word, OneLine(row.usage).c_str(), CountsOf(row.words).c_str());
    }
}
