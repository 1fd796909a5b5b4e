// Diagnostic texts as the log shows them: converted from UTF-16 where that mode is on, the server tag made the same for
// every server, the first line end rewritten. Any thread.
#pragma once

#include <cstddef>
#include <string>

// The room a record's text is given, its closing zero included.
inline constexpr unsigned kDiagnosticSize = 1025;

// The text that the library has put into `room`. False after a failed conversion, which has been printed.
bool ReadDiagnostic(const char* room, size_t room_size, std::string& text);

// Every server's tag prints as "[KELP/OKRA64" and its own closing bracket; without a bracket the text stays as it is.
// The first carriage return and line feed become the line feed and the character after it, which stays in its place
// too.
std::string NormaliseDiagnostic(std::string text);
