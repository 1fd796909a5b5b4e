// The types and lengths that the version-7 calls take for values.
#pragma once

#include "oci.h"

namespace legacy {

// 1024 for a code that is none, or whose element holds a pointer; a length of -1 becomes the one that the type has, else
// 1025. `value` is read for a text alone.
int CheckType(const dvoid* value, sword type, sb4& length);

}  // namespace legacy
