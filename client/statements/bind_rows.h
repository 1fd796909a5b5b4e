// The rows of values that a step is run with: for each of the engine's placeholders the bind behind it.
//
// Threads: under the statement's serial lock.
#pragma once

#include <cstdint>
#include <span>
#include <string_view>
#include <vector>

#include "engine/engine.h"
#include "sql/engine_text.h"
#include "statements/bound_text.h"

// The kind of each of the engine's placeholders, null where nothing is bound yet.
std::vector<engine::Kind> KindsOf(const BoundText& text, const sql::EngineText& sql);
// Each of them as the application wrote it.
std::vector<std::string_view> PlaceholdersOf(const BoundText& text, const sql::EngineText& sql);

class BindRows final : public engine::RowSource {
public:
    // Finds the binds, unless nothing has changed since it did. Error 1008 when a placeholder has nothing bound to it.
    Status Collect(const BoundText& text, const sql::EngineText& sql);

    Status Row(std::uint32_t row, std::span<engine::Datum> values) override;

    // Index-table arguments give their element `table_element` in every row.
    [[nodiscard]] bool HasTables() const { return has_tables_; }
    // How many elements they have; 6502 when they differ, 1414 when there are more than the arrays hold.
    Status TableElements(std::uint32_t& count) const;
    std::uint32_t table_element = 0;

private:
    struct Slot {
        BindArea* bind;
        std::size_t same_as;    // an earlier slot with the same bind, or its own index
        bool is_row_id;
    };
    int Load(const Slot& slot, std::uint32_t row, engine::Datum& value) const;

    std::vector<Slot> slots_;
    std::uint32_t collected_ = 0;    // the text's changes when it was; 0: not yet
    std::uint64_t seen_ = 0;         // erased objects when all binds were found living
    bool has_tables_ = false;
};
