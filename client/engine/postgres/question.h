// Texts, and bytes, as the values of a question of the engine's own to the server.
#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "engine/postgres/wire.h"

namespace engine::postgres {

// The strings stay where they are.
struct Question {
    std::vector<std::string> texts;
    Wire::Values values;
    explicit Question(std::vector<std::string> words) : texts(std::move(words)) {
        for (const std::string& text : texts) Add(text, false);
    }
    Question(const Question&) = delete;
    Question& operator=(const Question&) = delete;
    void Add(std::string_view value, bool binary) {
        values.data.push_back(value.data() ? value.data() : "");
        values.lengths.push_back(static_cast<int>(value.size()));
        values.formats.push_back(binary);
    }
};

inline std::string_view Field(const Result& result, int row, int column) {
    return {PQgetvalue(result.get(), row, column), static_cast<std::size_t>(PQgetlength(result.get(), row, column))};
}

}  // namespace engine::postgres
