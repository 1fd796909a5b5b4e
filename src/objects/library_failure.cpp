// Holds the report that start-up hands down.
#include "objects/library_failure.h"

void (*report_library_failure)(void* error_handle, int rc) = [](void*, int) {};
