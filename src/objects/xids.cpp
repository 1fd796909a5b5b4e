// The table of transaction identifiers. Command thread only.
#include "objects/xids.h"

#include <cstring>
#include <span>

#include "core/keywords.h"
#include "core/messages.h"
#include "objects/registry.h"

namespace {

NamedXid xids[kMostXids];

// As large as an identifier, for a library that reads one.
XID* InvalidXid() {
    static union {
        char text[sizeof(XID)];
        XID xid;
    } area = {"Invalid buffer"};
    return &area.xid;
}

}  // namespace

NamedXid* FindXid(const char* name) {
    return FindSlot(std::span<NamedXid>(xids), name);
}

NamedXid* FindXid(const XID& xid) {
    for (NamedXid& slot : xids)
        if (slot.in_use && std::memcmp(&slot.xid, &xid, sizeof xid) == 0) return &slot;
    return nullptr;
}

NamedXid* TakeXidSlot(const char* name) {
    for (NamedXid& slot : xids) {
        if (slot.in_use) continue;
        slot.in_use = true;
        std::strncpy(slot.name, name, sizeof slot.name - 1);
        return &slot;
    }
    return nullptr;
}

XID* ResolveXid(const char* name) {
    if (IsInvalid(name)) return InvalidXid();
    if (NamedXid* const slot = FindXid(name)) return &slot->xid;
    Message(kError, "Handle %s not found\n", name);
    return nullptr;
}
