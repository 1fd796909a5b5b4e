// Every command family: the function that adds its rows, declared and listed here. A command whose family is not listed
// is known by name but has no handler. Added at start-up by the command thread.
#pragma once

#include "core/command_table.h"

void AddAttributeCommands(HandlerTable& handlers);
void AddBindCommands(HandlerTable& handlers);
void AddBufferCommands(HandlerTable& handlers);
void AddConvenienceCommands(HandlerTable& handlers);
void AddDateCommands(HandlerTable& handlers);
void AddDateTimeCommands(HandlerTable& handlers);
void AddDescribeCommands(HandlerTable& handlers);
void AddDynamicCommands(HandlerTable& handlers);
void AddEnvironmentCommands(HandlerTable& handlers);
void AddErrorCommands(HandlerTable& handlers);
void AddFetchAllCommand(HandlerTable& handlers);
void AddFileCommands(HandlerTable& handlers);
void AddHandleCommands(HandlerTable& handlers);
void AddLegacyAreaCommands(HandlerTable& handlers);
void AddLegacyDescribeCommands(HandlerTable& handlers);
void AddLegacyLoginCommands(HandlerTable& handlers);
void AddLegacyLongCommands(HandlerTable& handlers);
void AddLegacyValueCommands(HandlerTable& handlers);
void AddLobCommands(HandlerTable& handlers);
void AddLobTransferCommands(HandlerTable& handlers);
void AddNumberCommands(HandlerTable& handlers);
void AddPoolCommands(HandlerTable& handlers);
void AddRowidCommands(HandlerTable& handlers);
void AddSessionCommands(HandlerTable& handlers);
void AddStatementCommands(HandlerTable& handlers);
void AddStringCommands(HandlerTable& handlers);
void AddStructCommands(HandlerTable& handlers);
void AddThreadCommands(HandlerTable& handlers);
void AddTransactionCommands(HandlerTable& handlers);
void AddUtilityCommands(HandlerTable& handlers);
void AddXaCommands(HandlerTable& handlers);
void AddXaHandleCommands(HandlerTable& handlers);
void AddXidCommands(HandlerTable& handlers);

inline constexpr void (*kCommandFamilies[])(HandlerTable&) = {
    AddAttributeCommands,
    AddBindCommands,
    AddBufferCommands,
    AddConvenienceCommands,
    AddDateCommands,
    AddDateTimeCommands,
    AddDescribeCommands,
    AddDynamicCommands,
    AddEnvironmentCommands,
    AddErrorCommands,
    AddFetchAllCommand,
    AddFileCommands,
    AddHandleCommands,
    AddLegacyAreaCommands,
    AddLegacyDescribeCommands,
    AddLegacyLoginCommands,
    AddLegacyLongCommands,
    AddLegacyValueCommands,
    AddLobCommands,
    AddLobTransferCommands,
    AddNumberCommands,
    AddPoolCommands,
    AddRowidCommands,
    AddSessionCommands,
    AddStatementCommands,
    AddStringCommands,
    AddStructCommands,
    AddThreadCommands,
    AddTransactionCommands,
    AddUtilityCommands,
    AddXaCommands,
    AddXaHandleCommands,
    AddXidCommands,
};
