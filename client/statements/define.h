// Define handles: where the application wants a column of the fetched rows.
#pragma once

#include "statements/data_area.h"

class Define : public DataArea {
public:
    static constexpr Kind kKind = Kind::define;
    explicit Define(const Origin& origin) : DataArea(origin) {}
    ~Define() override;
    [[nodiscard]] std::span<const AttributeRow> Attributes() const override;
};
