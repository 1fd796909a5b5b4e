// Named identifiers of global transactions. A slot once used stays used: nothing gives an identifier back.
// Command thread only.
#pragma once

#include "xa.h"

struct NamedXid {
    bool in_use = false;
    XID xid = {};
    char name[32] = {};
};
inline constexpr int kMostXids = 800;

// Null when there is none. Prints nothing and knows no reserved words.
NamedXid* FindXid(const char* name);
// The first whose 140 bytes are those of `xid`.
NamedXid* FindXid(const XID& xid);

// The next slot, under the name; null when all are taken.
NamedXid* TakeXidSlot(const char* name);

// The identifier that a word other than "null" stands for: "invalid" an area that holds "Invalid buffer"; an unknown name
// prints "Handle %s not found\n" and gives a null pointer.
XID* ResolveXid(const char* name);
