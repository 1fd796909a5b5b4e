// Login and cursor data areas under the names of a script. The library knows an area by its address and writes into it
// even when a call fails: an area is a block of its own that is there before the call and never moves. Command thread
// only.
#pragma once

#include <span>

#include "objects/memory.h"
#include "objects/registry.h"
#include "oci.h"

struct NamedArea {
    bool in_use = false;
    Lda_Def* parent = nullptr;  // of a cursor: the login it was opened on, null when that is gone
    Cda_Def* area = nullptr;    // owned
    ub1* host_area = nullptr;   // owned; what olog was given besides, else null
    char name[32] = {};
};
// The table of a kind: `ldainfo` or `cursor`.
std::span<NamedArea> Areas(Kind kind);

// A static area of 512 zeros that begins with "Invalid buffer", set anew by each call: libraries write into what they
// are given.
Cda_Def* InvalidArea();

// The area an argument stands for: "invalid" the bad one, "null" a null pointer; an unknown name prints
// "Handle %s not found\n" and gives a null pointer. `slot` is null unless the name was found.
struct AreaArgument {
    Cda_Def* area = nullptr;
    NamedArea* slot = nullptr;
};
AreaArgument ResolveArea(Kind kind, const char* word);

// Ends the name and gives its blocks back. Cursors opened on it have no login from now on, and stay.
void ReleaseArea(NamedArea& slot);

// The area that a command makes. What has not been entered is given back with this object.
class NewArea {
public:
    // `name` as the library gets it: "null" and "-1" are no area at all.
    NewArea(Kind kind, const char* name) : kind_(kind), name_(name) {}

    // Before the call. False when the command ends here, which has been said: no memory, or a login's name in use. The
    // name of a cursor in use hands over that cursor's area.
    bool Make();
    // Makes a host area besides; null without memory, which has been said.
    ub1* MakeHost();
    Cda_Def* Area() const { return held_ != nullptr ? held_->area : area_.get(); }

    // After a call that succeeded. A name that cannot be entered, which is said, leaves the area to the library.
    void Enter(Lda_Def* parent);

private:
    static constexpr size_t kHostSize = HDA_SIZE;
    Kind kind_;
    const char* name_;
    NamedArea* held_ = nullptr;
    Memory<Cda_Def> area_;
    Memory<ub1> host_area_;
};
