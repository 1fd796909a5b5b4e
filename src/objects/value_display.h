// Values as the log shows them, by external data type. A value is one line: a prefix with indicator, return code and
// length, then the value. Lengths that the library returned are never followed past the end of the element.
// Command thread only.
#pragma once

#include <cstdint>

#include "core/messages.h"
#include "objects/buffers.h"
#include "oci.h"

// One element, wherever it lies.
struct ElementView {
    int type;
    const unsigned char* data;
    uint32_t size;             // of the element
    int indicator;
    int return_code;
    uint32_t length;
    uint16_t precision;        // packed decimal only
    int16_t scale;
    bool utf16;                // its statement's character data is UTF-16
};

// Ends the line, which holds the element's prefix, with the value if one follows, and prints it. Answers the return
// code of the library call that failed, for the caller to report; the line ends where it was, then. The line of a type
// that has no display is not ended either.
sword DisplayElement(Line& line, const ElementView& element);

// An element of a complete buffer. `utf16`: see StatementIsUtf16.
ElementView ElementOf(const MemBuffer& buffer, uint32_t index, bool utf16);

// Whether the statement's character data is UTF-16, by its registry slot.
bool StatementIsUtf16(const void* statement);

// A date as "%04ld-%02ld-%02ld-%02ld:%02ld:%02ld\n"; a second above 60 adds "Invalid OCITimeSS - %ld\n".
void PrintDate(const OCIDate& date);
// A datetime as "%04ld-%02ld-%02ld %02ld:%02ld:%02ld.%06ld\n", read with the default environment and error handle. When
// that fails nothing is printed, and the return code is for the caller to report.
sword PrintDateTime(OCIDateTime* datetime);
