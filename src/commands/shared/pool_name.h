// The name that the library gave a pool: a script refers to it by the pool handle's own name.
#pragma once

#include "objects/registry.h"
#include "objects/text_conversion.h"
#include "oci.h"

// The pool mode bits of calls that connect, and the table that each speaks of.
struct PoolMode {
    ub4 bit;
    Kind kind;
};
inline constexpr PoolMode kLogonPoolModes[] = {{OCI_LOGON2_CPOOL, Kind::cpool}, {OCI_LOGON2_SPOOL, Kind::spool}};
inline constexpr PoolMode kAttachPoolModes[] = {{OCI_CPOOL, Kind::cpool}};
inline constexpr PoolMode kSessionPoolModes[] = {{OCI_SESSGET_CPOOL, Kind::cpool}, {OCI_SESSGET_SPOOL, Kind::spool}};

// Where the mode asks for a pool and the word names one that has been created, the pool's own name becomes the text.
template <size_t kCount>
void UsePoolName(TextArgument& text, const char* word, ub4 mode, const PoolMode (&modes)[kCount]) {
    for (const PoolMode& pool_mode : modes) {
        if ((mode & pool_mode.bit) == 0) continue;
        const auto* const pool = static_cast<const NamedPool*>(FindByName(pool_mode.kind, word));
        if (pool == nullptr || pool->pool_name.empty()) continue;
        text.SetBytes(pool->pool_name.data(), static_cast<long>(pool->pool_name.size()));
        return;
    }
}
