// Bind handles: what the application supplies for a placeholder, or receives through one.
#pragma once

#include <vector>

#include "statements/data_area.h"
#include "statements/whole_value.h"

struct BindArea : DataArea {
    using DataArea::DataArea;

    // An index-table argument: elements in a block, with a count of them. Else a plain or array bind.
    [[nodiscard]] bool IsTable() const { return most_elements > 0 && current_elements; }

    ub4 most_elements = 0;
    ub4* current_elements = nullptr;    // of a table
    std::uint32_t rows_returned = 0;    // by the last execution of a statement that returns values

    // Values in pieces, of the iteration that is under way. In: one, or those of a table; of a block's variable what it
    // holds. Out: what the iteration gives back, one a row; in a block what a step gives.
    std::vector<WholeValue> in;
    std::vector<WholeValue> out;
};

class Bind final : public AreaHandle<BindArea> {
public:
    static constexpr Kind kKind = Kind::bind;
    using AreaHandle::AreaHandle;
    [[nodiscard]] std::span<const AttributeRow> Attributes() const override;
};
