// SQLite's result codes as published error numbers, with its own words.
#pragma once

#include <sqlite3.h>

#include <cstdint>
#include <string_view>

#include "handles/status.h"

namespace engine::sqlite {

// How the errors of this engine's own SQL functions begin; the number and the detail follow.
inline constexpr std::string_view kErrorMark = "kelp error ";

enum class Verb : std::uint8_t { other, insert, update, remove };    // what a statement does to rows

// The status of a call that has just failed on the database; without words where there is no memory for them: the call
// has failed all the same.
Status Failure(sqlite3* database, int code, Verb verb = Verb::other) noexcept;

// A failure that has taken the transaction with it: the record says so, too, even where memory is short (1019 then).
Status RolledBack(const Status& failure) noexcept;

// What the calls for numbers answer, as SQL tells it; other numbers are as they are.
int SqlNumber(int failure) noexcept;

// The status of a result code that has no database behind it.
Status Failure(int code, std::string_view words) noexcept;

}  // namespace engine::sqlite
