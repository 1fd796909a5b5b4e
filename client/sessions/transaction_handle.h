// Transaction handles: what names a global branch.
#pragma once

#include <cstdint>
#include <string>

#include "handles/kept.h"
#include "handles/status.h"

class TransactionHandle : public Object {
public:
    static constexpr Kind kKind = Kind::transaction;
    static constexpr std::uint32_t kXidSize = 140;
    explicit TransactionHandle(const Origin& origin) : Object(origin) {}
    [[nodiscard]] std::span<const AttributeRow> Attributes() const override;

    std::string xid = std::string(kXidSize, '\0');
    std::string name;
    std::uint32_t timeout = 0;
    const Birth birth;
};
