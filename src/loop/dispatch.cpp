// Finds the command that a line names, checks its word count and runs its handler.
#include "loop/dispatch.h"

#include <string_view>

#include "commands/families.h"
#include "core/messages.h"
#include "loop/script.h"

namespace {

constexpr PlainCommand kLoopCommands[] = {
    {{Code::read, kAnyWords, "read FileName"}, ReadScript},
};

HandlerTable AllHandlers() {
    HandlerTable handlers;
    handlers.Add(kLoopCommands);
    for (const auto add : kCommandFamilies) add(handlers);
    return handlers;
}

// A usage text that says so itself is not said to be invalid syntax.
void ComplainOfWordCount(const std::string_view usage) {
    if (usage.starts_with("Usage: ")) Message(kError, "%s\n", usage.data());
    else InvalidSyntax(usage.data());
}

void RunHandler(Code code, int count, char** words) {
    const HandlerTable::Handler* handler = Handlers().Find(code);
    if (handler == nullptr) return Message(kError, "ReadAndEvaluateScript(): Case error !\n");
    if (!handler->row->words.Has(count)) return ComplainOfWordCount(handler->row->usage);
    handler->run(*handler->row, count, words);
}

}  // namespace

const HandlerTable& Handlers() {
    static const HandlerTable kHandlers = AllHandlers();
    return kHandlers;
}

int Dispatch(int count, char** words) {
    if (words[0][0] == '\0') Message(kError, "DecodeKeyword(): Null length token.\n");
    const Command* command = FindCommand(words[0]);
    if (command == nullptr) {
        Message(kError, "Syntax Error: First token is not a valid command !\n");
        return 0;
    }
    if (command->code == Code::exit) return kStopLoop;
    RunHandler(command->code, count, words);
    return 0;
}
