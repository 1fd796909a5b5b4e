// Prints the commands that have a handler, a line each: word and usage text. What tests need to know of the command
// table.
#include <cstdio>
#include <string>

#include "loop/dispatch.h"

namespace {

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
        std::printf("%s\t%s\n", command->word, OneLine(handler->row->usage).c_str());
    }
}
