// A cursor: the rows of an open query, forward only or scrollable. Rows of a scrollable one are kept as they are
// reached. Positions count from 1; 0 is before the first row.
#pragma once

#include <cstdint>
#include <memory>
#include <span>
#include <vector>

#include "engine/engine.h"
#include "statements/row_buffer.h"

class Cursor {
public:
    // Takes an open query: borrowed, or owned (result sets).
    void Open(engine::Query& query, bool scrollable);
    void Open(std::unique_ptr<engine::Query> query);
    // Ends the query and forgets the rows.
    void Close() noexcept;

    [[nodiscard]] bool IsOpen() const { return query_ != nullptr; }
    [[nodiscard]] bool Scrollable() const { return scrollable_; }
    [[nodiscard]] const std::vector<engine::Column>& Columns() const { return query_->Columns(); }
    [[nodiscard]] std::uint64_t Position() const { return position_; }
    // The highest row reached: the rows fetched so far.
    [[nodiscard]] std::uint64_t Reached() const { return reached_; }

    // Steps to the next row. `found` is false at the end.
    Status Next(bool& found);
    // Goes to a row of a scrollable cursor, which `found` says to be there; past the end the position is behind the
    // last.
    Status GoTo(std::uint64_t position, bool& found);
    // Reads a scrollable cursor to its end.
    Status Count(std::uint64_t& rows);

    // The row at the position; valid until the next call.
    [[nodiscard]] std::span<const engine::Datum> Row() const { return row_; }

private:
    Status Read(bool& found);

    std::unique_ptr<engine::Query> owned_;
    engine::Query* query_ = nullptr;
    bool scrollable_ = false;
    bool at_end_ = false;    // the query has no more rows
    std::uint64_t position_ = 0;
    std::uint64_t reached_ = 0;
    std::vector<engine::Datum> current_;
    std::span<const engine::Datum> row_;
    RowBuffer kept_;
};
