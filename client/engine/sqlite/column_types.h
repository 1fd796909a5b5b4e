// Declared types: what a column's declaration says about its values. SQLite keeps the words and little more.
// Pure functions; any thread.
#pragma once

#include <optional>
#include <string_view>

#include "engine/engine.h"

namespace engine::sqlite {

// Fills type, size, precision and scale from the words of a declaration, like "number(12,2)". False: the words say
// nothing known; the column is then one of text without a limit.
bool ReadDeclaredType(std::string_view declared, Column& column);

// Whether values of the type are numbers; texts, of large objects, too; dates and times, kept as text.
bool IsNumberType(std::uint16_t type);
bool IsNumeric(std::uint16_t type);    // or of the machine's floats
bool IsTextType(std::uint16_t type);
bool IsDateType(std::uint16_t type);
// Of binary digits: float, real, double precision.
bool HasBinaryDigits(const Column& column);
// Intervals are kept as integers: months, or nanoseconds.
bool IsIntervalType(std::uint16_t type);

// What a column of large objects or long values holds; none of other columns.
std::optional<LobKind> ObjectKindOf(const Column& column);

}  // namespace engine::sqlite
