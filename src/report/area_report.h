// The report of a call on data areas, which have no handle to ask: the result itself, its text, and the function code
// of the area where a script has asked for it. Command thread only.
#pragma once

#include "core/command_table.h"
#include "oci.h"

struct CalledAreas {
    Lda_Def* login = nullptr;        // is asked for the text of a result; without one the text is that of any login
    const Cda_Def* shown = nullptr;  // its fields may be read; null where a script has given no area of its own
    bool has_text = true;            // false where the call was itself the one that asks for a text
};

// The trace line and then the report, which says nothing for 0, or while `setcallerroroci 0` holds. `name` is the word
// of the area as typed.
void TraceAndReportAreas(Code code, const char* name, const CalledAreas& areas, sword rc);
