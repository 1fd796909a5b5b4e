// The text of one step as an engine reads it: its placeholders numbered, the spellings that it does not know replaced
// by those of its dialect. Nothing here knows an engine.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "engine/engine.h"
#include "sql/statement_text.h"

namespace sql {

struct EngineText {
    // A part of the application's text, and what stands for it.
    struct Edit {
        std::size_t source_begin, source_end;
        std::size_t begin, end;
    };

    std::string sql;
    std::vector<std::uint32_t> placeholders;    // the statement's placeholder behind each of the engine's, in order
    std::size_t source_begin = 0;               // where the step begins
    std::vector<Edit> edits;

    // Where in the application's text an offset of the engine's points.
    [[nodiscard]] std::uint32_t SourceOffset(std::size_t offset) const;
};

EngineText Rewrite(std::string_view text, const StatementText& statement, const Step& step,
                   const engine::Dialect& dialect);

}  // namespace sql
