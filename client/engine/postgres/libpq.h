// The functions of libpq, under their own names within this namespace. libpq is loaded when the first server is
// attached: it brings some twenty libraries, which nobody else shall have to load, nor to have.
//
// Threads: whoever has had LoadLibpq succeed may call them.
#pragma once

#include <libpq-fe.h>

#include "handles/status.h"

namespace engine::postgres {

#define FUNCTION(symbol) extern decltype(&::symbol) symbol;
#include "engine/postgres/libpq_functions.def"
#undef FUNCTION

// Does nothing once it has succeeded. 12560 with the loader's words where libpq, or a function of it, is not there.
Status LoadLibpq();

}  // namespace engine::postgres
