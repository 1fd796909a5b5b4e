// The calls of the XA switch that are about branches. Flags and identifiers are judged first (XAER_INVAL), then whether
// the manager is open (XAER_PROTO), then the branch.
#pragma once

#include "xa/answer.h"

namespace xa {

Answer Start(const XID* xid, int rmid, xa_long flags);
Answer End(const XID* xid, int rmid, xa_long flags);
Answer Rollback(const XID* xid, int rmid, xa_long flags);
Answer Prepare(const XID* xid, int rmid, xa_long flags);
Answer Commit(const XID* xid, int rmid, xa_long flags);
Answer Forget(const XID* xid, int rmid, xa_long flags);
// XA_OK with `*count` of the identifiers written, which it tells on entry how many fit.
Answer Recover(XID* xids, xa_long& count, int rmid, xa_long flags);

}  // namespace xa
