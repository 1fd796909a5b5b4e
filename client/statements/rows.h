// The rows of values that a step is run with: for each of the engine's placeholders the bind behind it.
#pragma once

#include <cstdint>
#include <span>
#include <vector>

#include "engine/engine.h"
#include "statements/statement.h"

class Statement::Rows : public engine::RowSource {
public:
    // Error 1008 when a placeholder has nothing bound to it.
    Status Collect(const Statement& statement, const Compiled& compiled);

    Status Row(std::uint32_t row, std::span<engine::Datum> values) override;

    // Index-table arguments give their element `table_element` in every row.
    [[nodiscard]] bool HasTables() const;
    // How many elements they have; 6502 when they differ.
    Status TableElements(std::uint32_t& count) const;
    std::uint32_t table_element = 0;

private:
    struct Slot {
        Bind* bind;
        std::size_t same_as;    // an earlier slot with the same bind, or its own index
        bool is_row_id;
    };
    int Load(const Slot& slot, std::uint32_t row, engine::Datum& value) const;

    std::vector<Slot> slots_;
};
