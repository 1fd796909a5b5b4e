// Commands that turn numbers into integers, reals and texts and back; each has steps of its own. Command thread only.
#pragma once

#include "core/command_table.h"
#include "oci.h"

void AddNumberConversions(HandlerTable& handlers);

// Prints the number as an 8-byte real, "%f\n". False when it could not be read as one, which has been reported.
bool PrintAsReal(const OCINumber& value, OCIError* error);
