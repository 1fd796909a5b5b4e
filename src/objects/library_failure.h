// How a library call that failed below the reports is reported: the report is a room above this one and is handed
// down at start-up. Until then such failures are dropped.
#pragma once

extern void (*report_library_failure)(void* error_handle, int rc);
