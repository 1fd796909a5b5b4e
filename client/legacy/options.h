// What oopt chooses for the executes of a cursor: whether one that fails undoes all that it did, or the failing row alone,
// and whether locks of other sessions are waited for.
#pragma once

#include "legacy/call.h"

namespace legacy {

sword SetOptions(Cda_Def* area, sword rollback, sword wait);
// As OCIStmtExecute; 3129 when a piece is wanted, in whatever direction.
int RunStatement(Cursor& cursor, ub4 iterations, ub4 first, ub4 mode);
// An execute that waited for pieces is given up: it has failed.
void GiveUpExecute(Cursor& cursor) noexcept;

}  // namespace legacy
