// Texts of results, as the library gives them: never converted, since these calls know no environment.
#include "report/area_report.h"

#include <cstring>

#include "core/messages.h"
#include "core/state.h"
#include "platform/client_library.h"
#include "report/diagnostics.h"
#include "report/trace.h"

namespace {

void PrintText(Lda_Def* login, sword result) {
    const auto code = static_cast<sb2>(result);
    char room[kDiagnosticSize] = {};
    auto* const text = reinterpret_cast<OraText*>(room);
    const sword rc = login == nullptr ? Call(&ClientLibrary::oermsg, code, text)
                                      : Call(&ClientLibrary::oerhms, login, code, text, sword{kDiagnosticSize});
    if (rc != OCI_SUCCESS) return;
    Message(kOutput, "%s\n", NormaliseDiagnostic({room, strnlen(room, sizeof room)}).c_str());
}

}  // namespace

void TraceAndReportAreas(Code code, const char* name, const CalledAreas& areas, sword rc) {
    outputOCI(code, rc, name);
    if (rc == OCI_SUCCESS || report_switch == 0) return;
    Message(kOutput, "Error - rc = %ld:\n", static_cast<long>(rc));
    if (rc > 0 && areas.has_text) PrintText(areas.login, rc);
    if (print_sql_function_code && areas.shown != nullptr)
        Message(kOutput, "SQL function code - %ld\n", static_cast<long>(areas.shown->ft));
}
