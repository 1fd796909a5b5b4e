// Reading and writing identifiers.
#include "transactions/xid.h"

#include <cstring>

namespace transactions {
namespace {

constexpr std::int32_t kFormatOfNames = 0x4B454C50;

}  // namespace

bool ReadXid(const XID& from, engine::Xid& to) {
    const bool global_fits = from.gtrid_length >= 1 && from.gtrid_length <= MAXGTRIDSIZE;
    const bool branch_fits = from.bqual_length >= 0 && from.bqual_length <= MAXBQUALSIZE;
    if (from.formatID == engine::Xid::kNone || !global_fits || !branch_fits) return false;
    to.format = from.formatID;
    to.global_length = static_cast<std::uint8_t>(from.gtrid_length);
    to.branch_length = static_cast<std::uint8_t>(from.bqual_length);
    to.data = {};
    std::memcpy(to.data.data(), from.data, to.Length());
    return true;
}

XID WriteXid(const engine::Xid& from) {
    XID to{from.format, from.global_length, from.branch_length, {}};
    std::memcpy(to.data, from.data.data(), from.Length());
    return to;
}

engine::Xid XidOfName(std::string_view name) {
    engine::Xid xid;
    xid.format = kFormatOfNames;
    xid.global_length = static_cast<std::uint8_t>(name.size());
    name.copy(xid.data.data(), xid.global_length);
    return xid;
}

}  // namespace transactions
