// The trace line of a library call: the function's name and, for most, the object it was called for.
#pragma once

// `code` is the command's code, `name` the word of its primary object as typed (null prints as empty). A code without a
// line prints "outputOCI (): unrecognized command!\n" on the error stream.
void outputOCI(int code, long rc, const char* name);

// The trace line and then the report of the return code against the error handle: what follows most calls.
void TraceAndReport(int code, const char* name, void* error_handle, int rc);
