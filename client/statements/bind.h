// Bind handles: what the application supplies for a placeholder, or receives through one.
#pragma once

#include <string>

#include "statements/data_area.h"

struct BindArea : DataArea {
    using DataArea::DataArea;

    // An index-table argument: elements in a block, with a count of them. Else a plain or array bind.
    [[nodiscard]] bool IsTable() const { return most_elements > 0 && current_elements; }

    ub4 most_elements = 0;
    ub4* current_elements = nullptr;    // of a table
    std::uint32_t rows_returned = 0;    // by the last execution of a statement that returns values

    // A value that came in pieces, of the iteration that is being collected.
    std::string collected;
    bool collected_null = false;
};

class Bind final : public AreaHandle<BindArea> {
public:
    static constexpr Kind kKind = Kind::bind;
    using AreaHandle::AreaHandle;
    [[nodiscard]] std::span<const AttributeRow> Attributes() const override;
};
