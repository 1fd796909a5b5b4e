// How values are shown, by family: the functions that the table of value_display.cpp is made of. Each adds the value to
// the line, the line's end included, and answers OCI_SUCCESS or the return code of the library call that failed, after
// which the line ends where it was. A new family is a file of its own. Command thread only.
#pragma once

#include <cstdint>

#include "objects/value_display.h"

inline sword EndLine(Line& line) {
    line.Character('\n');
    return OCI_SUCCESS;
}

// --- text_displays.cpp -----------------------------------------------------------------------------------------------

sword ShowCharacters(Line& line, const ElementView& element);  // as many as the length says
sword ShowTerminated(Line& line, const ElementView& element);
template <class Prefix> sword ShowPrefixedText(Line& line, const ElementView& element);  // uint16_t, int32_t
sword ShowLibraryString(Line& line, const ElementView& element);
sword ShowCountedBytes(Line& line, const ElementView& element);
sword ShowPrefixedBytes(Line& line, const ElementView& element);
sword ShowLibraryRaw(Line& line, const ElementView& element);

// --- number_displays.cpp ---------------------------------------------------------------------------------------------

sword ShowNumber(Line& line, const ElementView& element);
sword ShowSigned(Line& line, const ElementView& element);
sword ShowUnsigned(Line& line, const ElementView& element);
sword ShowReal(Line& line, const ElementView& element);
sword ShowPackedDecimal(Line& line, const ElementView& element);
sword ShowDecimalFloat(Line& line, const ElementView& element);

// --- date_displays.cpp -----------------------------------------------------------------------------------------------

sword ShowSevenByteDate(Line& line, const ElementView& element);
sword ShowDate(Line& line, const ElementView& element);
sword ShowDateTime(Line& line, const ElementView& element);

// --- lob_displays.cpp ------------------------------------------------------------------------------------------------

sword ShowLob(Line& line, const ElementView& element);  // the beginning of the data behind the locator
