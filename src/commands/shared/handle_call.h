// Shapes of calls that families share: on one handle, and on a package that an environment holds. Command thread only.
#pragma once

#include "commands/shared/word_arguments.h"
#include "core/command_table.h"
#include "platform/client_library.h"
#include "report/trace.h"

// A call on one handle and its error handle: words[1] and words[2]. What further words mean is the call's own.
struct HandleCall : CommandRow {
    Kind kind;
    Kind other_kind;  // looked through after `kind`; the same one where there is no choice
    sword (*call)(void* handle, OCIError* error, char** words);
};
inline void RunHandleCall(const HandleCall& row, int, char** words) {
    void* const handle = ResolveEither(row.kind, row.other_kind, words[1]);
    auto* const error = ResolveError<OCIError>(words[2]);
    const sword rc = row.call(handle, error, words);
    TraceAndReport(row.code, words[1], error, rc);
}

// A call that starts or ends a package: an environment and an error handle, nothing else. Trace lines without a label
// leave the name out.
struct PackageCall : CommandRow {
    LibraryFunction<sword(void*, OCIError*)> ClientLibrary::*function;
};
inline void RunPackageCall(const PackageCall& row, int, char** words) {
    const EnvironmentAndError handles(words);
    TraceAndReport(row.code, words[1], handles.error, Call(row.function, handles.environment, handles.error));
}
