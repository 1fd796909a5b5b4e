// What the two halves of a query share: its changes (query.cpp) and its rows (query_rows.cpp).
#pragma once

#include <sqlite3.h>

#include <cstddef>
#include <cstdint>

#include "engine/datum.h"
#include "engine/sqlite/connection.h"
#include "handles/errors.h"

namespace engine::sqlite {

inline Status NoMemory() { return Error(errors::kOutOfMemory).From("SQLITE"); }

inline void SetView(Datum& value, Kind kind, const void* data, std::size_t length) {
    value.kind = kind;
    value.data = data;
    value.length = static_cast<std::uint32_t>(length);
}

// What Enter began is ended if nothing is done in it, and the statement reset, whatever is thrown.
class Running {
public:
    Running(SqliteConnection& connection, const StatementHandle& statement)
        : connection_(connection), statement_(&statement) {}
    ~Running() {
        if (statement_) sqlite3_reset(statement_->get());
        if (began) connection_.Abandon();
    }
    Running(const Running&) = delete;
    Running& operator=(const Running&) = delete;
    void GoesOn() {
        statement_ = nullptr;
        began = false;
    }

    bool began = false;

private:
    SqliteConnection& connection_;
    const StatementHandle* statement_;
};

}  // namespace engine::sqlite
