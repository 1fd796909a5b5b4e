// Transactions of a service context, local ones and branches of global ones: the calls of the OCITrans family.
//
// A context's transaction handle with an identifier (or a name) makes a transaction a branch. A call is about the branch
// that the session works in; where it works in none, commit, rollback and forget are about the one that the handle
// names.
//
// Threads: the caller holds the turn on the session.
#pragma once

#include <cstdint>

#include "sessions/service_context.h"

namespace transactions {

// `timeout` in seconds: how long a new branch may rest (0: for ever), how long to wait for one that is resumed.
Status Start(ServiceContext& service, Link& link, std::uint32_t timeout, std::uint32_t flags);
Status Detach(ServiceContext& service, Link& link, std::uint32_t flags);
Status Prepare(ServiceContext& service, Link& link, std::uint32_t flags);
// One branch of several that are prepared together, all of the global transaction that `first` names.
Status PrepareOneOf(Link& link, const TransactionHandle& first, const TransactionHandle& handle);
Status Commit(ServiceContext& service, Link& link, std::uint32_t flags);
Status Rollback(ServiceContext& service, Link& link, std::uint32_t flags);
Status Forget(ServiceContext& service, Link& link, std::uint32_t flags);

}  // namespace transactions
