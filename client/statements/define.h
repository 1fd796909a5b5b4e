// Define handles: where the application wants a column of the fetched rows.
#pragma once

#include "statements/data_area.h"

class Define final : public AreaHandle<DataArea> {
public:
    static constexpr Kind kKind = Kind::define;
    using AreaHandle::AreaHandle;
    [[nodiscard]] std::span<const AttributeRow> Attributes() const override;
};
