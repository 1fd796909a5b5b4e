// Every command family: the function that adds its rows, declared and listed here. A command whose family is not listed
// is known by name but has no handler.
#pragma once

#include "core/command_table.h"

void AddBufferCommands(HandlerTable& handlers);
void AddErrorCommands(HandlerTable& handlers);

inline constexpr void (*kCommandFamilies[])(HandlerTable&) = {
    AddBufferCommands,
    AddErrorCommands,
};
