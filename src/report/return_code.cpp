// Names of return codes, and the loop over the records of a handle.
#include "report/return_code.h"

#include <cstring>

#include "core/messages.h"
#include "core/state.h"
#include "objects/text_conversion.h"
#include "oci.h"
#include "platform/client_library.h"
#include "report/diagnostics.h"

namespace {

// Every record of the handle, from the first on.
void PrintRecords(void* handle, ub4 type) {
    for (ub4 number = 1;; ++number) {
        char text[kDiagnosticSize] = {};  // a text of another width than expected ends where it ends, all the same
        sb4 code = 0;
        const sword rc = Call(&ClientLibrary::OCIErrorGet, handle, number, nullptr, &code,
                              reinterpret_cast<OraText*>(text), ub4{kDiagnosticSize}, type);
        if (rc != OCI_SUCCESS) return;
        std::string shown;
        if (!ReadDiagnostic(text, sizeof text, shown)) return;
        Message(kOutput, Utf16Mode ? "W\"%s\"\n" : "%s\n", shown.c_str());
    }
}

}  // namespace

void TypedReport(void* handle, unsigned type, int rc) {
    if (rc == OCI_SUCCESS || report_switch == 0) return;
    switch (rc) {
        case OCI_SUCCESS_WITH_INFO:
            Message(kOutput, "OCI_SUCCESS_WITH_INFO:\n");
            return PrintRecords(handle, type);
        case OCI_ERROR:
            Message(kOutput, "Error - OCI_ERROR:\n");
            return PrintRecords(handle, type);
        case OCI_NEED_DATA: return Message(kOutput, "Error - OCI_NEED_DATA\n");
        case OCI_NO_DATA: return Message(kOutput, "Error - OCI_NO_DATA\n");
        case OCI_INVALID_HANDLE: return Message(kOutput, "Error - OCI_INVALID_HANDLE\n");
        case OCI_STILL_EXECUTING: return Message(kOutput, "Error - OCI_STILL_EXECUTING\n");
        case OCI_CONTINUE: return Message(kOutput, "Error - OCI_CONTINUE\n");
        default: return Message(kOutput, "Unknown rc - %ld\n", static_cast<long>(rc));
    }
}

void ReturnCodeReport(void* error_handle, int rc) {
    TypedReport(error_handle, OCI_HTYPE_ERROR, rc);
}

void EnvironmentReport(void* environment, int rc) {
    TypedReport(environment, OCI_HTYPE_ENV, rc);
}
