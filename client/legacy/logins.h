// The calls on login areas: logging on and off, transactions, break, the non-blocking mode; error texts.
#pragma once

#include "legacy/call.h"

namespace legacy {

// A text with a length as these calls take it; -1 measures it.
struct TextArgument {
    const text* begin;
    sword length;
};

sword LogOn(Lda_Def* area, bool has_host_area, TextArgument user, TextArgument password, TextArgument database,
            ub4 mode);
// A session of another's: the area is a login on it until it is logged off, which leaves the session alone. Without a
// service context `rc` is 1012 and the area is not known.
void Borrow(Lda_Def* area, OCISvcCtx* service);
sword DescribeProcedure(Lda_Def* area, const text* name, ub4* count);
sword LogOff(Lda_Def* area);
sword Commit(Lda_Def* area);
sword Rollback(Lda_Def* area);
sword CommitEach(Lda_Def* area, bool commits);
sword Break(Lda_Def* area);
sword SetNonBlocking(Lda_Def* area, bool on);
sword TestNonBlocking(Lda_Def* area);
sword SetThreads(ub4 mode);
// `login` may be any area, or null: then the text says nothing of an engine.
sword Message(const Lda_Def* login, int code, text* buffer, sword size);

}  // namespace legacy
