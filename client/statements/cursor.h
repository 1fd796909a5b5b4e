// A cursor: where the application stands in the rows of an open query. The query counts, keeps and scrolls; what is
// here are the positions that the application sees: from 1, 0 before the first row, one behind the last at the end.
//
// Threads: under the statement's serial lock. What reads the query is a long call.
#pragma once

#include <cstdint>
#include <memory>
#include <vector>

#include "engine/engine.h"

// A sink that counts what it gets, a row that it refuses with the others.
class CountedSink : public engine::RowSink {
public:
    std::uint32_t rows = 0;
};

class Cursor {
public:
    // Takes an open query: borrowed, or owned (result sets).
    void Open(engine::Query& query, bool scrollable) noexcept;
    void Open(std::unique_ptr<engine::Query> query) noexcept;
    // Ends the query.
    void Close() noexcept;

    [[nodiscard]] bool IsOpen() const { return query_ != nullptr; }
    [[nodiscard]] bool Scrollable() const { return scrollable_; }
    [[nodiscard]] const std::vector<engine::Column>& Columns() const { return query_->Columns(); }
    [[nodiscard]] std::uint64_t Position() const { return position_; }
    // The highest row reached: the rows fetched so far.
    [[nodiscard]] std::uint64_t Reached() const { return reached_; }

    // Up to `most` rows behind the position into the sink. `delivered` counts them, with one that the sink refused; it
    // is below `most` at the end of the rows, or after a failure.
    Status Read(CountedSink& sink, std::uint32_t most, std::uint32_t& delivered);
    // The row at a position of a scrollable cursor, which `found` says to be there, and on up to `most` rows.
    Status ReadFrom(std::uint64_t position, CountedSink& sink, std::uint32_t most, std::uint32_t& delivered);
    // From behind the last row back to it.
    void StayOnLastRow() noexcept { if (position_ > reached_) position_ = reached_; }
    // Whether there is a row behind the position, which goes with the answer.
    Status AnyMore(bool& more);
    // How many rows a scrollable cursor has.
    Status Count(std::uint64_t& rows);

private:
    std::unique_ptr<engine::Query> owned_;
    engine::Query* query_ = nullptr;
    bool scrollable_ = false;
    bool at_end_ = false;    // the query has no more rows
    std::uint64_t position_ = 0;
    std::uint64_t reached_ = 0;
};
