// LOB locators, looked up by name and by pointer. Command thread only.
#include "objects/lobs.h"

namespace {

// What stands for "invalid" as a locator that a call may change.
OCILobLocator** InvalidPlace() {
    static OCILobLocator* invalid = nullptr;
    invalid = static_cast<OCILobLocator*>(InvalidObject());
    return &invalid;
}

// The place of the slot, or of the array element, that holds what the name stands for.
OCILobLocator** PlaceOf(NamedLob& slot, const DescriptorReference& found) {
    if (slot.array_count == 0) return reinterpret_cast<OCILobLocator**>(&slot.object);
    if (found.is_array) return nullptr;
    return static_cast<OCILobLocator**>(slot.object) + found.index;
}

bool Holds(const NamedLob& slot, const OCILobLocator* locator) {
    if (slot.array_count == 0) return slot.object == locator;
    const auto* const array = static_cast<OCILobLocator* const*>(slot.object);
    for (uint32_t index = 0; index < slot.array_count; ++index)
        if (array[index] == locator) return true;
    return false;
}

}  // namespace

uint16_t LobReference::Type() const {
    return slot == nullptr || slot->type == 0 ? uint16_t{SQLT_CLOB} : slot->type;
}

LobReference ResolveLob(const char* name) {
    const DescriptorReference found = ResolveDescriptor(Kind::lob, name);
    LobReference lob;
    lob.locator = static_cast<OCILobLocator*>(found.object);
    lob.slot = AsRecord<Kind::lob>(found.slot);
    if (lob.slot != nullptr) lob.place = PlaceOf(*lob.slot, found);
    else if (lob.locator != nullptr) lob.place = InvalidPlace();
    return lob;
}

uint16_t RecordedLobType(const OCILobLocator* locator) {
    for (NamedObject& slot : SlotsOf(Kind::lob)) {
        const NamedLob& lob = *AsRecord<Kind::lob>(&slot);
        if (lob.in_use && Holds(lob, locator)) return lob.type;
    }
    return 0;
}
