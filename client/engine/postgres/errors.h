// PostgreSQL's SQLSTATEs as published error numbers, with the server's own words.
#pragma once

#include <cstdint>
#include <string_view>

#include "engine/postgres/libpq.h"
#include "handles/status.h"

namespace engine::postgres {

// How the errors of this engine's own SQL functions begin; the number and the detail follow.
inline constexpr std::string_view kErrorMark = "kelp error ";

enum class Verb : std::uint8_t { other, insert, update, remove };    // what a statement does to rows

// Of an error's result. Without words where there is no memory for them.
Status Failure(const PGresult* result, Verb verb = Verb::other) noexcept;

// Of a connection that could not be made: told by the SQLSTATE or the system's words in libpq's message.
Status ConnectFailure(std::string_view message) noexcept;

// An error of this engine's own.
Status Refused(int number, std::string_view words = {}) noexcept;

// Whether it tells of the moment, and nothing of what was asked: the same might be answered a little later.
bool IsPassing(const Status& failure) noexcept;

// A failure that has taken the transaction with it: the record says so, too.
Status RolledBack(const Status& failure) noexcept;

}  // namespace engine::postgres
