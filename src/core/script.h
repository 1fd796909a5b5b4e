// The loop: prompts, reads, echoes and runs command lines of an open stream.
#pragma once

#include <cstdio>

// Until the end of the stream, a read error, or a command that asks to stop. Levels nest through the `read` command.
void ReadAndEvaluateScript(std::FILE* stream);

// The `read` command: runs the script that words[1] names.
void ReadScript(int count, char** words);
