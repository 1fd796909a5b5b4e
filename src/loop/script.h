// The loop: prompts, reads, echoes and runs command lines of an open stream. Command thread only.
#pragma once

#include <cstdio>

#include "core/command_table.h"

// Until the end of the stream, a read error, or a command that asks to stop. Levels nest through the `read` command.
void ReadAndEvaluateScript(std::FILE* stream);

// The `read` command: runs the script that words[1] names.
void ReadScript(const CommandRow& row, int count, char** words);
