// Rows that a statement gives back, into the binds of a step's targets: `returning ... into`, `select ... into`,
// assignments. A value that does not fit its place is the failure of the execution that gave it. What goes out in pieces
// is kept with its bind, a value for each row.
//
// Threads: under the statement's serial lock.
#pragma once

#include <cstdint>
#include <span>
#include <vector>

#include "engine/engine.h"
#include "statements/bound_text.h"

class Targets final : public engine::RowSink {
public:
    // What becomes of rows: each goes into the element of its execution, so that the last of them stays; or there is
    // one; or they fill the tables from the first element on.
    enum class Layout : std::uint8_t { each_execution, one_row, tables };

    Targets(const BoundText& text, const sql::Step& step, engine::Query& query, Layout layout)
        : text_(text), step_(step), query_(query), layout_(layout) {}

    // The element of plain binds (but with each_execution) and that of tables.
    void SetElements(std::uint32_t plain, std::uint32_t table) { plain_ = plain, table_ = table; }

    // 1422 for a row more than one, 1414 for one more than the tables have room for.
    Status Row(std::uint32_t execution, std::span<const engine::Datum> values) override;

    // To be called in a block when the step is done: what it gave to variables in pieces is what they hold now.
    void Settle();

    // How many rows came in all, and from an execution if it was the last that gave any.
    [[nodiscard]] std::uint32_t Rows() const { return rows_; }
    [[nodiscard]] std::uint32_t RowsOf(std::uint32_t execution) const { return execution == execution_ ? of_execution_ : 0; }

private:
    struct Place {
        BindArea* bind;
        values::ByKind<values::OutConverter> converters;
        values::ByKind<values::Renderer> renderers;    // of binds in pieces
    };
    Status FindPlaces(std::size_t columns);
    int Keep(const Place& place, std::uint32_t element, const engine::Datum& value);
    [[nodiscard]] std::uint32_t Most() const;

    const BoundText& text_;
    const sql::Step& step_;
    engine::Query& query_;
    const Layout layout_;
    std::vector<Place> places_;    // once the first row is there
    std::uint32_t plain_ = 0;
    std::uint32_t table_ = 0;
    std::uint32_t rows_ = 0;
    std::uint32_t execution_ = 0;
    std::uint32_t of_execution_ = 0;
};
