// From the words of a line to the command they name. Command thread only.
#pragma once

#include "core/command_table.h"

inline constexpr int kStopLoop = 13;

// Runs the command that the first word names. Returns kStopLoop for `exit` and `quit`, 0 otherwise.
int Dispatch(int count, char** words);

// The handlers of all families.
const HandlerTable& Handlers();
