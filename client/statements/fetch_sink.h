// Where fetched rows go: into the defines, and what is taken in pieces to the piece stream.
#pragma once

#include "statements/cursor.h"
#include "statements/statement.h"

class Statement::FetchSink final : public CountedSink {
public:
    // `first` is the element of the first row.
    FetchSink(Statement& statement, ub4 first, bool in_pieces)
        : statement_(statement), index_(first), in_pieces_(in_pieces) {}
    Status Row(std::uint32_t execution, std::span<const engine::Datum> values) override;
    [[nodiscard]] Status Warned() const { return warning_; }    // 24345 when a value was cut

private:
    Status ReadLobs(std::span<const engine::Datum> values);

    Statement& statement_;
    ub4 index_;
    const bool in_pieces_;
    Status warning_;
    std::vector<engine::Datum> row_;        // one that goes in pieces: with its large objects read
    std::vector<std::string> contents_;     // of those, by column
    PieceStream::Objects objects_;          // the long ones
};
