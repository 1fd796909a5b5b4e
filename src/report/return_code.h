// The report of a return code: its name and, where the library left some, its diagnostic records. Any thread.
#pragma once

// The three differ only in the handle type under which the records are asked for. Nothing is printed for rc 0, or while
// `setcallerroroci 0` holds.
void ReturnCodeReport(void* error_handle, int rc);
void EnvironmentReport(void* environment, int rc);
void TypedReport(void* handle, unsigned type, int rc);
