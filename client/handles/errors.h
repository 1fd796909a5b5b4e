// The names of the published error numbers that the library's own code speaks of, made from the table of their texts.
#pragma once

namespace errors {

#define NAMED(number, name, text) constexpr int name = number;
#define WORDING(number, text)
#include "handles/error_texts.def"
#undef WORDING
#undef NAMED

}  // namespace errors
