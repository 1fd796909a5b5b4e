// The row that a statement has fetched last, as far as it can be read in parts later on: its texts and bytes.
//
// Threads: under the statement's serial lock.
#pragma once

#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "engine/engine.h"

class KeptRow {
public:
    // Throws std::bad_alloc; there is no row then.
    void Keep(std::span<const engine::Datum> values, const std::vector<engine::Column>& columns) {
        has_row_ = false;
        bytes_.clear();
        values_.resize(values.size());
        for (std::size_t index = 0; index < values.size(); ++index) {
            const engine::Datum& value = values[index];
            const bool is_kept = value.kind == engine::Kind::text || value.kind == engine::Kind::bytes;
            values_[index] = {columns[index].type, value.kind, bytes_.size(), is_kept ? value.length : 0};
            if (is_kept) bytes_.append(value.Text());
        }
        has_row_ = true;
    }
    void Forget() noexcept { has_row_ = false; }

    [[nodiscard]] bool HasRow() const { return has_row_; }
    [[nodiscard]] std::size_t Columns() const { return values_.size(); }
    [[nodiscard]] std::uint16_t Type(std::size_t column) const { return values_[column].type; }    // internal
    [[nodiscard]] engine::Kind KindOf(std::size_t column) const { return values_[column].kind; }
    [[nodiscard]] std::string_view Bytes(std::size_t column) const {
        return std::string_view(bytes_).substr(values_[column].begin, values_[column].length);
    }

private:
    struct Value {
        std::uint16_t type;
        engine::Kind kind;
        std::size_t begin;
        std::uint32_t length;
    };
    bool has_row_ = false;
    std::string bytes_;
    std::vector<Value> values_;
};
