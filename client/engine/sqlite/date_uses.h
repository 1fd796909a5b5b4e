// Where a statement calculates with dates, which are kept as texts: SQLite would take such a text for its year.
#pragma once

#include "handles/status.h"

namespace engine::sqlite {

struct StatementReading;

// 932 for a date that is an operand of arithmetic or an argument of a function of numbers: a column, a call or a choice
// that answers one, a scalar subquery, a literal in the form in which dates are kept. In queries, changes, create table
// as and views.
Status FindDateUses(StatementReading& reading);

}  // namespace engine::sqlite
