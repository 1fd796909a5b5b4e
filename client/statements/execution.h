// One execution of a statement: what it did, and the result that it opened. Made anew for each, so that nothing of the
// former one shows.
//
// Threads: under the statement's serial lock.
#pragma once

#include <cstdint>
#include <memory>
#include <optional>

#include "engine/engine.h"
#include "handles/errors.h"
#include "statements/cursor.h"

class Link;

struct Execution {
    enum class State : std::uint8_t { initialized = 1, executed = 2, end_of_fetch = 3 };    // as OCI_ATTR_STMT_STATE

    State state = State::initialized;
    // Why a fetch is refused, whatever the cursor says; 0: it is not. It is not executed yet, has failed, the result was
    // given up, or the session is gone.
    int fetch_error = errors::kNotExecuted;
    std::uint64_t row_count = 0;
    std::uint32_t rows_fetched = 0;    // by the last fetch
    std::uint32_t failed_rows = 0;
    std::optional<engine::RowId> last_row;    // that a change touched
    Cursor cursor;
};

// The session's link that an execute runs on, or why there is none.
struct ExecuteTarget {
    Status status;
    std::shared_ptr<Link> link;
};

// What an execute was asked for: rows [first, iterations) of the bound arrays, or of the defines.
struct ExecuteArguments {
    ub4 iterations;
    ub4 first;
    ub4 mode;
};
