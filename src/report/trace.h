// The trace line of a library call: the function's name and, for most, the object it was called for. Any thread.
#pragma once

#include "core/command_table.h"

// `name` is the word of the primary object as typed (null prints as empty). A code without a line
// prints "outputOCI (): unrecognized command!\n" on the error stream.
void outputOCI(Code code, long rc, const char* name);

// The trace line and then the report of the return code against the error handle: what follows most calls.
void TraceAndReport(Code code, const char* name, void* error_handle, int rc);
