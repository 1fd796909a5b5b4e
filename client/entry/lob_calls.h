// What the entry points of large objects share: the locator of a call, looked up in the session of its context.
#pragma once

#include "handles/errors.h"
#include "handles/gate.h"
#include "lobs/operations.h"
#include "sessions/service_context.h"
#include "values/lob_descriptor.h"

// A locator that is no living one is refused like any bad handle; null is a missing argument.
inline Status FindLocator(const OCILobLocator* pointer, LobDescriptor*& descriptor) {
    if (!pointer) return Error(errors::kNullArgument);
    descriptor = Live<LobDescriptor>(pointer);
    return descriptor ? Status() : InvalidHandle();
}

// Calls on a locator in a session: body(link, descriptor).
template <class Body>
sword EnterLocator(OCISvcCtx* svc, OCIError* err, const OCILobLocator* pointer, Body body,
                   const char* name = __builtin_FUNCTION()) {
    return EnterUnlocked<ServiceContext>(svc, err, [&](ServiceContext& service) -> Status {
        LobDescriptor* descriptor = nullptr;
        if (Status status = FindLocator(pointer, descriptor); !status.Ok()) return status;
        const LongCall may_take_long;
        const SessionTurn turn(service);
        if (!turn.link) return turn.status;
        if (!turn.link->lobs->store) return Error(errors::kUnsupported, "large objects");
        return body(*turn.link, *descriptor);
    }, name);
}

// Calls on its object, which are refused while a stream goes on or buffering is on: body(link, object).
template <class Body>
sword EnterLob(OCISvcCtx* svc, OCIError* err, const OCILobLocator* pointer, Body body,
                   const char* name = __builtin_FUNCTION()) {
    return EnterLocator(svc, err, pointer, [&](Link& link, LobDescriptor& descriptor) -> Status {
        lobs::LargeObject object;
        Status status = lobs::FindUnbuffered(descriptor, link, object);
        return status.Ok() ? body(link, object) : status;
    }, name);
}

// The same on two.
template <class Body>
sword EnterLobs(OCISvcCtx* svc, OCIError* err, const OCILobLocator* to, const OCILobLocator* from, Body body,
                const char* name = __builtin_FUNCTION()) {
    return EnterLob(svc, err, to, [&](Link& link, lobs::LargeObject& target) -> Status {
        LobDescriptor* descriptor = nullptr;
        lobs::LargeObject source;
        Status status = FindLocator(from, descriptor);
        if (status.Ok()) status = lobs::FindUnbuffered(*descriptor, link, source);
        return status.Ok() ? body(link, target, source) : status;
    }, name);
}
