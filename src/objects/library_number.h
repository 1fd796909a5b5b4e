// The library's numbers from plain texts of the driver. Command thread only.
#pragma once

#include <string_view>

#include "oci.h"

// Converts with a format of nines as long as the text, in the texts' form that the environment takes. Returns the
// library's return code; nothing is printed.
sword NumberFromText(std::string_view text, OCINumber& number);
