// Every command family: the function that adds its rows, declared and listed here. A command whose family is not listed
// is known by name but has no handler.
#pragma once

#include "core/command_table.h"

void AddBufferCommands(HandlerTable& handlers);
void AddDateCommands(HandlerTable& handlers);
void AddDateTimeCommands(HandlerTable& handlers);
void AddErrorCommands(HandlerTable& handlers);
void AddFileCommands(HandlerTable& handlers);
void AddNumberCommands(HandlerTable& handlers);
void AddRowidCommands(HandlerTable& handlers);
void AddStringCommands(HandlerTable& handlers);
void AddThreadCommands(HandlerTable& handlers);

inline constexpr void (*kCommandFamilies[])(HandlerTable&) = {
    AddBufferCommands,
    AddDateCommands,
    AddDateTimeCommands,
    AddErrorCommands,
    AddFileCommands,
    AddNumberCommands,
    AddRowidCommands,
    AddStringCommands,
    AddThreadCommands,
};
