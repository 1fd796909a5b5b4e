// Identifiers of branches between the application's form and the engines'.
#pragma once

#include <string_view>

#include "engine/transactions.h"
#include "xa.h"

namespace transactions {

// False for the null identifier and for one whose lengths are out of bounds: 1 to 64 for the global part, 0 to 64 for
// the branch's.
bool ReadXid(const XID& from, engine::Xid& to);

// The bytes behind the two parts are zero.
XID WriteXid(const engine::Xid& from);

// The identifier that a name of at most 64 bytes stands for.
engine::Xid XidOfName(std::string_view name);

inline bool SameTransaction(const engine::Xid& left, const engine::Xid& right) {
    return left.format == right.format && left.global_length == right.global_length &&
           std::memcmp(left.data.data(), right.data.data(), left.global_length) == 0;
}

}  // namespace transactions
