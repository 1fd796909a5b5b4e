// Bind handles: what the application supplies for a placeholder, or receives through one.
#pragma once

#include <string>

#include "statements/data_area.h"

class Bind : public DataArea {
public:
    static constexpr Kind kKind = Kind::bind;
    explicit Bind(const Origin& origin) : DataArea(origin) {}
    ~Bind() override;
    [[nodiscard]] std::span<const AttributeRow> Attributes() const override;

    // The element count of an index-table argument; null for a plain or array bind.
    [[nodiscard]] bool IsTable() const { return most_elements > 0 && current_elements; }

    ub4 most_elements = 0;
    ub4* current_elements = nullptr;
    std::uint32_t rows_returned = 0;

    // A value that came in pieces, of the iteration that is being collected.
    std::string collected;
    bool collected_null = false;
};
