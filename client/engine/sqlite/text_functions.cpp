// Functions of text, and the choices among values: decode, greatest, least. Positions count characters from 1, an empty
// result is a null. Case is that of ASCII letters, as in SQLite's upper and lower.
#include <algorithm>
#include <string>

#include "engine/sqlite/characters.h"
#include "engine/sqlite/function_values.h"
#include "handles/errors.h"

namespace engine::sqlite {
namespace {

std::string_view Characters(std::string_view text, std::int64_t first, std::int64_t count) {
    text.remove_prefix(ByteOf(text, first));
    return text.substr(0, ByteOf(text, count));
}

// initcap(text)
void InitCap(sqlite3_context* context, int count, Arguments arguments) {
    if (AnyNull(count, arguments)) return sqlite3_result_null(context);
    const TextArgument text(arguments[0]);
    if (text.Failure() != 0) return Refuse(context, text.Failure());
    ResultText result(text.Text().size());
    if (!result) return sqlite3_result_error_nomem(context);
    bool in_word = false;
    for (const char c : text.Text()) {
        const bool small = c >= 'a' && c <= 'z';
        const bool capital = c >= 'A' && c <= 'Z';
        if (in_word ? capital : small) result.Append(static_cast<char>(c ^ 0x20));
        else result.Append(c);
        in_word = small || capital || (c >= '0' && c <= '9') || static_cast<unsigned char>(c) >= 0x80;
    }
    result.Return(context);
}

enum class Side : std::uint8_t { left, right };

// lpad(text, length), lpad(text, length, padding); rpad
template <Side side>
void Pad(sqlite3_context* context, int count, Arguments arguments) {
    if (AnyNull(count, arguments)) return sqlite3_result_null(context);
    const TextArgument text(arguments[0]);
    const TextArgument filler(count > 2 ? arguments[2] : nullptr, " ");
    const std::string_view padding = filler.Text();
    std::int64_t wanted = 0;
    int failure = text.Failure() != 0 ? text.Failure() : filler.Failure();
    if (failure == 0) failure = ReadWhole(arguments[1], wanted);
    if (failure != 0) return Refuse(context, failure);
    constexpr std::int64_t kLongest = 32767;
    wanted = std::clamp<std::int64_t>(wanted, 0, kLongest);
    const std::string_view kept = Characters(text.Text(), 0, wanted);
    const std::int64_t missing = wanted - CharacterCount(kept);
    if (missing > 0 && padding.empty()) return sqlite3_result_null(context);
    const std::int64_t repeated = missing > 0 ? missing / CharacterCount(padding) : 0;
    const std::string_view rest = missing > 0 ? Characters(padding, 0, missing % CharacterCount(padding)) : "";
    ResultText result(kept.size() + static_cast<std::size_t>(repeated) * padding.size() + rest.size());
    if (!result) return sqlite3_result_error_nomem(context);
    if (side == Side::right) result.Append(kept);
    for (std::int64_t index = 0; index < repeated; ++index) result.Append(padding);
    result.Append(rest);
    if (side == Side::left) result.Append(kept);
    result.Return(context);
}

// The byte of the occurrence that is wanted; npos for none. Backwards they are counted from `from` down.
std::size_t FindOccurrence(std::string_view text, std::string_view part, std::size_t from, bool backwards,
                           std::int64_t occurrence) {
    for (;;) {
        const std::size_t found = backwards ? text.rfind(part, from) : text.find(part, from);
        if (found == std::string_view::npos || --occurrence == 0) return found;
        if (backwards && found == 0) return std::string_view::npos;
        from = backwards ? found - 1 : found + 1;
    }
}

// instr(text, part), instr(text, part, position), instr(text, part, position, occurrence); a position below 0 counts
// from the end and searches backwards.
void InStr(sqlite3_context* context, int count, Arguments arguments) {
    if (AnyNull(count, arguments)) return sqlite3_result_null(context);
    const TextArgument text(arguments[0]);
    const TextArgument part(arguments[1]);
    std::int64_t position = 1;
    std::int64_t occurrence = 1;
    int failure = text.Failure() != 0 ? text.Failure() : part.Failure();
    if (failure == 0 && count > 2) failure = ReadWhole(arguments[2], position);
    if (failure == 0 && count > 3) failure = ReadWhole(arguments[3], occurrence);
    if (failure == 0 && occurrence < 1) failure = errors::kOutOfRange;
    if (failure != 0) return Refuse(context, failure);
    if (part.Text().empty()) return sqlite3_result_null(context);
    const std::int64_t length = CharacterCount(text.Text());
    if (position == 0 || position > length || position < -length) return sqlite3_result_int(context, 0);
    const std::size_t from = ByteOf(text.Text(), position > 0 ? position - 1 : length + position);
    const std::size_t found = FindOccurrence(text.Text(), part.Text(), from, position < 0, occurrence);
    if (found == std::string_view::npos) return sqlite3_result_int(context, 0);
    sqlite3_result_int64(context, CharacterCount(text.Text().substr(0, found)) + 1);
}

// substr(text, position), substr(text, position, length). Position 0 is the first; one below 0 counts from the end.
void SubStr(sqlite3_context* context, int count, Arguments arguments) {
    if (AnyNull(count, arguments)) return sqlite3_result_null(context);
    const bool is_bytes = sqlite3_value_type(arguments[0]) == SQLITE_BLOB && !IsNumber(arguments[0]);
    const TextArgument text(arguments[0]);
    std::int64_t position = 0;
    int failure = text.Failure() != 0 ? text.Failure() : ReadWhole(arguments[1], position);
    const std::int64_t whole =
        is_bytes ? static_cast<std::int64_t>(Bytes(arguments[0]).size()) : CharacterCount(text.Text());
    std::int64_t length = whole;
    if (failure == 0 && count > 2) failure = ReadWhole(arguments[2], length);
    if (failure != 0) return Refuse(context, failure);
    const std::int64_t first = position > 0 ? position - 1 : position < 0 ? whole + position : 0;
    if (first < 0 || first >= whole || length < 1) return sqlite3_result_null(context);
    length = std::min(length, whole - first);
    if (is_bytes) {
        return sqlite3_result_blob64(context, Bytes(arguments[0]).data() + first,
                                     static_cast<sqlite3_uint64>(length), SQLITE_TRANSIENT);
    }
    const std::string_view part = Characters(text.Text(), first, length);
    sqlite3_result_text64(context, part.data(), part.size(), SQLITE_TRANSIENT, SQLITE_UTF8);
}

// replace(text, part), replace(text, part, other): without one the parts go. Nothing is found of a null.
void Replace(sqlite3_context* context, int count, Arguments arguments) {
    if (AnyNull(1, arguments)) return sqlite3_result_null(context);
    const TextArgument text(arguments[0]);
    const TextArgument part(arguments[1]);
    const TextArgument other(count > 2 ? arguments[2] : nullptr);
    int failure = text.Failure() != 0 ? text.Failure() : part.Failure();
    if (failure == 0) failure = other.Failure();
    if (failure != 0) return Refuse(context, failure);
    std::string_view rest = text.Text();
    std::string replaced;
    while (!part.Text().empty()) {
        const std::size_t found = rest.find(part.Text());
        if (found == std::string_view::npos) break;
        replaced.append(rest.substr(0, found)).append(other.Text());
        rest.remove_prefix(found + part.Text().size());
    }
    replaced.append(rest);
    if (replaced.empty()) return sqlite3_result_null(context);
    sqlite3_result_text64(context, replaced.data(), replaced.size(), SQLITE_TRANSIENT, SQLITE_UTF8);
}

// -1, 0, 1 in `order`: as numbers when one of them is one, else by bytes. Neither is null. 0 or an error number.
int CompareValues(sqlite3_value* left, sqlite3_value* right, int& order) {
    if (!IsNumber(left) && !IsNumber(right)) {
        const int by_bytes = Bytes(left).compare(Bytes(right));
        order = (by_bytes > 0) - (by_bytes < 0);
        return 0;
    }
    OCINumber numbers[2];
    int failure = ReadNumber(left, numbers[0]);
    if (failure == 0) failure = ReadNumber(right, numbers[1]);
    if (failure == 0) failure = number::Compare(numbers[0], numbers[1], &order);
    return failure;
}

// greatest(x, ...), least(x, ...)
template <int wanted>
void Extreme(sqlite3_context* context, int count, Arguments arguments) {
    if (count < 1) return Refuse(context, errors::kTooFewArguments);
    if (AnyNull(count, arguments)) return sqlite3_result_null(context);
    sqlite3_value* best = arguments[0];
    for (int index = 1; index < count; ++index) {
        int order = 0;
        const int failure = CompareValues(arguments[index], best, order);
        if (failure != 0) return Refuse(context, failure);
        if (order == wanted) best = arguments[index];
    }
    sqlite3_result_value(context, best);
}

// decode(x, value, result, value, result, ..., otherwise): the result of the value that x is; a null is a null.
void Decode(sqlite3_context* context, int count, Arguments arguments) {
    if (count < 3) return Refuse(context, errors::kTooFewArguments);
    const bool null = sqlite3_value_type(arguments[0]) == SQLITE_NULL;
    int index = 1;
    for (; index + 1 < count; index += 2) {
        const bool null_value = sqlite3_value_type(arguments[index]) == SQLITE_NULL;
        int order = null == null_value ? 0 : 1;
        const int failure = null || null_value ? 0 : CompareValues(arguments[0], arguments[index], order);
        if (failure != 0) return Refuse(context, failure);
        if (order == 0) return sqlite3_result_value(context, arguments[index + 1]);
    }
    if (index < count) sqlite3_result_value(context, arguments[index]);
}

constexpr FunctionRow kRows[] = {
    {"initcap", 1, 1, SQLITE_DETERMINISTIC, InitCap, "varchar2"},
    {"lpad", 2, 3, SQLITE_DETERMINISTIC, Pad<Side::left>, "varchar2"},
    {"rpad", 2, 3, SQLITE_DETERMINISTIC, Pad<Side::right>, "varchar2"},
    {"instr", 2, 4, SQLITE_DETERMINISTIC, InStr, "number"},
    {"substr", 2, 3, SQLITE_DETERMINISTIC, SubStr},
    {"replace", 2, 3, SQLITE_DETERMINISTIC, Replace, "varchar2"},
    {"greatest", 1, kAnyCount, SQLITE_DETERMINISTIC, Extreme<1>, "", 1},
    {"least", 1, kAnyCount, SQLITE_DETERMINISTIC, Extreme<-1>, "", 1},
    {"decode", 3, kAnyCount, SQLITE_DETERMINISTIC, Decode, "", 3},
};

}  // namespace

std::span<const FunctionRow> TextFunctions() { return kRows; }

}  // namespace engine::sqlite
