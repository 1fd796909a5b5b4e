// Where fetched rows go: into the defines, and what is taken in pieces to the piece stream.
#pragma once

#include <optional>

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
    // A row that goes in pieces, with its large objects.
    struct RowOfLobs {
        std::vector<engine::Datum> values;
        std::vector<std::string> contents;    // of those that are read, by column
        PieceStream::Objects objects;         // the long ones
    };
    std::optional<RowOfLobs> row_;
};
