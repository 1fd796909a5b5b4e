// LOB locators by name, and the external type recorded with each, which says how its data are shown. Command thread only.
#pragma once

#include <cstdint>

#include "objects/registry.h"
#include "oci.h"

// A locator argument with the place that holds it, for calls that may put another locator there. The place is null for
// "null", an unknown name and a whole array; `slot` is null unless the name was found.
struct LobReference {
    OCILobLocator* locator = nullptr;
    OCILobLocator** place = nullptr;
    NamedLob* slot = nullptr;

    // SQLT_CLOB, unless another one was recorded.
    uint16_t Type() const;
};
LobReference ResolveLob(const char* name);

// The type recorded with the locator; 0 when there is none.
uint16_t RecordedLobType(const OCILobLocator* locator);
