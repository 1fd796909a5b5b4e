// The ways between service contexts and logins: a context lends its session to a login, and a login becomes a context.
#pragma once

#include "handles/gate.h"
#include "legacy/logins.h"
#include "sessions/service_context.h"

namespace legacy {

Status LendTo(Lda_Def* area, ServiceContext& service);
Status BringBack(Lda_Def* area, OCISvcCtx** out, ErrorHandle& error);

}  // namespace legacy
