// The list of SQL functions; those that casts become, the present moment, nvl and what columns take and compare with.
#include "engine/sqlite/functions.h"

#include <algorithm>
#include <array>
#include <map>
#include <new>
#include <string>
#include <utility>

#include "date/date.h"
#include "date/zone.h"
#include "engine/pieces.h"
#include "engine/sqlite/characters.h"
#include "engine/sqlite/coercion.h"
#include "engine/sqlite/column_types.h"
#include "engine/sqlite/errors.h"
#include "engine/sqlite/function_values.h"
#include "engine/sqlite/interval_text.h"
#include "engine/sqlite/operands.h"
#include "engine/sqlite/stored_number.h"
#include "handles/errors.h"
#include "number/number.h"
#include "oci.h"
#include "platform/utf.h"

namespace engine::sqlite {
namespace {

void ReturnStored(sqlite3_context* context, Column column, sqlite3_value* argument) {
    OCINumber number;
    Datum value = ReadDatum(argument, number);
    Coercion coercion(std::move(column));
    const Status status = coercion.Apply(value);
    if (status.Failed()) Refuse(context, status);
    else ReturnDatum(context, value);
}

// binary_float(x), binary_double(x)
template <std::uint16_t type>
void ToBinary(sqlite3_context* context, int, Arguments arguments) {
    Column column;
    column.type = type;
    ReturnStored(context, std::move(column), arguments[0]);
}

// number(x), number(x, precision), number(x, precision, scale)
void ToNumber(sqlite3_context* context, int count, Arguments arguments) {
    Column column;
    ReadDeclaredType("number", column);
    if (count > 1) column.precision = static_cast<std::uint8_t>(std::clamp(sqlite3_value_int(arguments[1]), 1, 38));
    if (count > 1) column.scale = 0;
    if (count > 2) column.scale = static_cast<std::int8_t>(std::clamp(sqlite3_value_int(arguments[2]), -84, 126));
    ReturnStored(context, std::move(column), arguments[0]);
}

// whole(x): what a cast to an integer, of 64 bits, then takes as it is; real(x): what one to another type of numbers does
template <bool whole>
void ToPlain(sqlite3_context* context, int, Arguments arguments) {
    if (sqlite3_value_type(arguments[0]) == SQLITE_INTEGER) return sqlite3_result_value(context, arguments[0]);
    Column column;
    ReadDeclaredType(whole ? "integer" : "number", column);
    OCINumber number;
    Datum value = ReadDatum(arguments[0], number);
    Coercion coercion(std::move(column));
    const Status status = coercion.Apply(value);
    if (status.Failed()) return Refuse(context, status);
    const bool fits = value.kind != Kind::decimal || StoredNumber::From(value.Number()).form == StoredNumber::Form::integer;
    if (fits) return ReturnDatum(context, value);
    if (whole) return Refuse(context, errors::kNumericOverflow);
    double real = 0;
    (void)number::ToDouble(value.Number(), &real);    // which holds more
    sqlite3_result_double(context, real);
}

// text(x): a number as it is shown, anything else as it is
void ToShownText(sqlite3_context* context, int, Arguments arguments) {
    const bool is_integer = sqlite3_value_type(arguments[0]) == SQLITE_INTEGER;
    if (is_integer || !IsNumber(arguments[0])) return sqlite3_result_value(context, arguments[0]);
    const TextArgument shown(arguments[0]);
    if (shown.Failure() != 0) return Refuse(context, shown.Failure());
    sqlite3_result_text64(context, shown.Text().data(), shown.Text().size(), SQLITE_TRANSIENT, SQLITE_UTF8);
}

// exact_text(x): what a column of texts takes of a value whose digits all count
void ToExactText(sqlite3_context* context, int, Arguments arguments) {
    Column column;
    ReadDeclaredType("varchar2", column);
    ReturnStored(context, std::move(column), arguments[0]);
}

// decfloat(x), decfloat(x, digits): rounded to 34 or 16 digits
void ToDecimalFloat(sqlite3_context* context, int count, Arguments arguments) {
    if (sqlite3_value_type(arguments[0]) == SQLITE_NULL) return sqlite3_result_null(context);
    OCINumber number;
    int failure = ReadNumber(arguments[0], number);
    const int digits = count > 1 && sqlite3_value_int(arguments[1]) == 16 ? 16 : 34;
    if (failure == 0) failure = number::Prec(number, digits, &number);
    if (failure != 0) return Refuse(context, failure);
    ReturnNumber(context, number);
}

enum class Unit : std::uint8_t { bytes, characters };

// The first `count` units of a text, without part of a character; how many there are.
std::size_t Cut(std::string& text, std::size_t count, Unit unit) {
    text.resize(unit == Unit::bytes ? utf::WholeUtf8(text, count) : ByteOf(text, static_cast<std::int64_t>(count)));
    return unit == Unit::bytes ? text.size() : static_cast<std::size_t>(CharacterCount(text));
}

// varchar(x), varchar(x, size); char(x), char(x, size), which pads with blanks
template <bool padded, Unit unit>
void ToText(sqlite3_context* context, int count, Arguments arguments) {
    if (sqlite3_value_type(arguments[0]) == SQLITE_NULL) return sqlite3_result_null(context);
    const TextArgument value(arguments[0]);
    if (value.Failure() != 0) return Refuse(context, value.Failure());
    std::string text(value.Text());
    const int limit = count > 1 ? sqlite3_value_int(arguments[1]) : padded ? 1 : 0;
    if (limit > 0) {
        const auto wanted = static_cast<std::size_t>(limit);
        const std::size_t kept = Cut(text, wanted, unit);
        constexpr std::size_t kLongestPadding = 32767;
        if (padded && kept < wanted && wanted <= kLongestPadding) text.append(wanted - kept, ' ');
    }
    sqlite3_result_text(context, text.data(), static_cast<int>(text.size()), SQLITE_TRANSIENT);
}

// raw(x), raw(x, size)
void ToRaw(sqlite3_context* context, int count, Arguments arguments) {
    Column column;
    ReadDeclaredType("raw", column);
    if (count > 1) column.size = static_cast<std::uint32_t>(std::max(sqlite3_value_int(arguments[1]), 0));
    ReturnStored(context, std::move(column), arguments[0]);
}

// date(x), which has no fraction and no zone; timestamp(x), timestamp(x, digits), which rounds the fraction
template <bool whole_seconds>
void ToDate(sqlite3_context* context, int count, Arguments arguments) {
    if (sqlite3_value_type(arguments[0]) == SQLITE_NULL) return sqlite3_result_null(context);
    date::DateTime value;
    int failure = ReadDate(arguments[0], value);
    if (whole_seconds) {
        value.nanosecond = 0;
        value.has_zone = false;
    } else if (failure == 0) {
        constexpr int kUsualDigits = 6;
        const int digits = count > 1 ? std::clamp(sqlite3_value_int(arguments[1]), 0, 9) : kUsualDigits;
        failure = date::RoundFraction(value, digits, &value);
    }
    if (failure != 0) return Refuse(context, failure);
    ReturnDate(context, value);
}

// span_ym(x, digits), span_ds(x, digits, digits of the fraction)
template <std::uint16_t type>
void ToInterval(sqlite3_context* context, int count, Arguments arguments) {
    constexpr int kMostDigits = 9;
    Column column;
    column.type = type;
    column.precision = static_cast<std::uint8_t>(std::clamp(sqlite3_value_int(arguments[1]), 0, kMostDigits));
    if (count > 2) column.scale = static_cast<std::int8_t>(std::clamp(sqlite3_value_int(arguments[2]), 0, kMostDigits));
    ReturnStored(context, std::move(column), arguments[0]);
}

// interval_text(x, 'declared type'): an interval as it is kept, as it is shown
void ToIntervalText(sqlite3_context* context, int, Arguments arguments) {
    Column column;
    if (sqlite3_value_type(arguments[0]) != SQLITE_INTEGER || !ReadDeclaredType(TextOf(arguments[1]), column))
        return sqlite3_result_value(context, arguments[0]);
    IntervalText text;
    const std::string_view written = WriteInterval(sqlite3_value_int64(arguments[0]), column, text);
    if (written.empty()) return Refuse(context, errors::kInconsistentTypes);
    sqlite3_result_text(context, written.data(), static_cast<int>(written.size()), SQLITE_TRANSIENT);
}

enum class Moment : std::uint8_t { date, local, zoned };

// The present moment in local time: as a date, with a fraction, or with the zone, too.
template <Moment moment>
void Now(sqlite3_context* context, int, Arguments) {
    date::DateTime now;
    int failure = date::Now(&now);
    if (failure == 0 && moment == Moment::zoned) failure = date::SetZone({}, &now);
    if (failure != 0) return Refuse(context, failure);
    if (moment == Moment::date) now.nanosecond = 0;
    ReturnDate(context, now);
}

// nvl(x, instead)
void Nvl(sqlite3_context* context, int, Arguments arguments) {
    const bool null = sqlite3_value_type(arguments[0]) == SQLITE_NULL;
    sqlite3_result_value(context, arguments[null ? 1 : 0]);
}

// nvl2(x, when it is there, when it is null)
void Nvl2(sqlite3_context* context, int, Arguments arguments) {
    const bool null = sqlite3_value_type(arguments[0]) == SQLITE_NULL;
    sqlite3_result_value(context, arguments[null ? 2 : 1]);
}

// A row with what a connection's calls have read of declared types, by the type's and the column's words. SQLite would
// look through what it keeps for all the calls of a statement.
struct CoercingRow : FunctionRow {
    struct Before {
        using is_transparent = void;
        using Words = std::pair<std::string_view, std::string_view>;
        bool operator()(const Words& left, const Words& right) const { return left < right; }
    };
    std::map<std::pair<std::string, std::string>, Coercion, Before> known;
};

// store(x, 'declared type', 'column'): what a column of that type takes, or refuses; compare(x, ...): what x is when it
// is compared with one.
template <Coercion::Purpose purpose>
void Coerce(sqlite3_context* context, int, Arguments arguments) {
    constexpr std::size_t kMostKnown = 1000;
    auto& known = static_cast<CoercingRow*>(static_cast<FunctionRow*>(sqlite3_user_data(context)))->known;
    const std::string_view declared = TextOf(arguments[1]);
    const std::string_view name = TextOf(arguments[2]);
    auto found = known.find(std::pair(declared, name));
    if (found == known.end()) {
        Column column;
        if (!ReadDeclaredType(declared, column)) return sqlite3_result_value(context, arguments[0]);
        column.name = name;
        if (known.size() >= kMostKnown) known.clear();
        Coercion coercion(std::move(column), purpose, Coercion::Origin::computed);
        found = known.emplace(std::pair(std::string(declared), std::string(name)), std::move(coercion)).first;
    }
    OCINumber number;
    Datum value = ReadDatum(arguments[0], number);
    const Status status = found->second.Apply(value);
    if (status.Failed()) Refuse(context, status);
    else ReturnDatum(context, value);
}

// Large objects without anything in them are no nulls.
void EmptyClob(sqlite3_context* context, int, Arguments) { sqlite3_result_text(context, "", 0, SQLITE_STATIC); }
void EmptyBlob(sqlite3_context* context, int, Arguments) { sqlite3_result_zeroblob(context, 0); }

constexpr FunctionRow kFunctionRows[] = {
    {"empty_clob", 0, 0, SQLITE_DETERMINISTIC, EmptyClob, "clob"},
    {"empty_blob", 0, 0, SQLITE_DETERMINISTIC, EmptyBlob, "blob"},
    {"kelp_number", 1, 3, SQLITE_DETERMINISTIC, ToNumber},
    {"kelp_whole", 1, 1, SQLITE_DETERMINISTIC, ToPlain<true>},
    {"kelp_real", 1, 1, SQLITE_DETERMINISTIC, ToPlain<false>},
    {"kelp_text", 1, 1, SQLITE_DETERMINISTIC, ToShownText},
    {"kelp_exact_text", 1, 1, SQLITE_DETERMINISTIC, ToExactText},
    {"kelp_decfloat", 1, 2, SQLITE_DETERMINISTIC, ToDecimalFloat},
    {"kelp_binary_float", 1, 1, SQLITE_DETERMINISTIC, ToBinary<SQLT_IBFLOAT>},
    {"kelp_binary_double", 1, 1, SQLITE_DETERMINISTIC, ToBinary<SQLT_IBDOUBLE>},
    {"kelp_varchar", 1, 2, SQLITE_DETERMINISTIC, ToText<false, Unit::bytes>},
    {"kelp_varchar_chars", 1, 2, SQLITE_DETERMINISTIC, ToText<false, Unit::characters>},
    {"kelp_nvarchar", 1, 2, SQLITE_DETERMINISTIC, ToText<false, Unit::characters>},
    {"kelp_char", 1, 2, SQLITE_DETERMINISTIC, ToText<true, Unit::bytes>},
    {"kelp_char_chars", 1, 2, SQLITE_DETERMINISTIC, ToText<true, Unit::characters>},
    {"kelp_nchar", 1, 2, SQLITE_DETERMINISTIC, ToText<true, Unit::characters>},
    {"kelp_raw", 1, 2, SQLITE_DETERMINISTIC, ToRaw},
    {"kelp_date", 1, 1, SQLITE_DETERMINISTIC, ToDate<true>},
    {"kelp_timestamp", 1, 2, SQLITE_DETERMINISTIC, ToDate<false>},
    {"kelp_span_ym", 2, 2, SQLITE_DETERMINISTIC, ToInterval<SQLT_INTERVAL_YM>},
    {"kelp_span_ds", 3, 3, SQLITE_DETERMINISTIC, ToInterval<SQLT_INTERVAL_DS>},
    {"kelp_interval_text", 2, 2, SQLITE_DETERMINISTIC, ToIntervalText},
    {"nvl", 2, 2, SQLITE_DETERMINISTIC, Nvl, "", 1},
    {"nvl2", 3, 3, SQLITE_DETERMINISTIC, Nvl2, "", 2},
    {"kelp_sysdate", 0, 0, 0, Now<Moment::date>, "date"},
    {"kelp_localtimestamp", 0, 0, 0, Now<Moment::local>, "timestamp"},
    {"kelp_systimestamp", 0, 0, 0, Now<Moment::zoned>, "timestamp_tz"},
};

// Each connection has its own.
constexpr FunctionRow kCoercingRows[] = {
    {"kelp_store", 3, 3, SQLITE_DETERMINISTIC, Coerce<Coercion::Purpose::store>},
    {"kelp_compare", 3, 3, SQLITE_DETERMINISTIC, Coerce<Coercion::Purpose::compare>},
};

// What SQLite's own functions answer.
constexpr struct {
    std::string_view name;
    ResultType result;
} kEngineFunctions[] = {
    {"count", {"number"}}, {"length", {"number"}}, {"row_number", {"number"}}, {"rank", {"number"}}, {"dense_rank", {"number"}},
    {"percent_rank", {"number"}}, {"cume_dist", {"number"}}, {"ntile", {"number"}}, {"max", {"", 1}}, {"min", {"", 1}},
};

std::array<std::span<const FunctionRow>, 4> Tables() {
    return {kFunctionRows, ConversionFunctions(), DateFunctions(), TextFunctions()};
}

// SQLite is C: what a function throws must not reach it.
void Call(sqlite3_context* context, int count, Arguments arguments) noexcept {
    const auto* row = static_cast<const FunctionRow*>(sqlite3_user_data(context));
    try {
        row->call(context, count, arguments);
    } catch (const std::bad_alloc&) {
        sqlite3_result_error_nomem(context);
    }
}

// The row must last, as those of the tables do.
Status AddFunction(sqlite3* database, const FunctionRow& row) {
    auto* kept = const_cast<FunctionRow*>(&row);
    const int first = row.most == kAnyCount ? kAnyCount : row.least;
    for (int arguments = first; arguments <= row.most; ++arguments) {
        const int code = sqlite3_create_function_v2(database, row.name, arguments, SQLITE_UTF8 | row.flags, kept, Call,
                                                    nullptr, nullptr, nullptr);
        if (code != SQLITE_OK) return Failure(database, code);
    }
    return {};
}

Status AddCoercing(sqlite3* database, const FunctionRow& row) {
    FunctionRow* const kept = new CoercingRow{row, {}};
    const auto end = [](void* ended) { delete static_cast<CoercingRow*>(static_cast<FunctionRow*>(ended)); };
    const int code = sqlite3_create_function_v2(database, row.name, row.least, SQLITE_UTF8 | row.flags, kept, Call, nullptr, nullptr, end);
    return code == SQLITE_OK ? Status() : Failure(database, code);    // where it has ended, too
}

}  // namespace

Status AddFunctions(sqlite3* database) {
    for (const FunctionRow& row : kCoercingRows)
        if (Status status = AddCoercing(database, row); status.Failed()) return status;
    for (const auto& table : Tables()) {
        for (const FunctionRow& row : table) {
            if (Status status = AddFunction(database, row); status.Failed()) return status;
        }
    }
    return {};
}

ResultType FunctionResult(std::string_view name) {
    for (const auto& table : Tables()) {
        for (const FunctionRow& row : table) {
            if (IsWord(name, row.name)) return {row.type, row.like};
        }
    }
    for (const auto& row : kEngineFunctions) {
        if (IsWord(name, row.name)) return row.result;
    }
    return {TakesNumbers(name) ? "number" : ""};
}

bool TakesTexts(std::string_view function) {
    return IsOneOf(function, {"to_char", "substr", "replace", "lpad", "rpad", "instr", "initcap", "kelp_varchar", "kelp_varchar_chars",
                              "kelp_nvarchar", "kelp_char", "kelp_char_chars", "kelp_nchar"});
}

bool TakesNumbers(std::string_view function) {
    return IsOneOf(function, {"sum", "avg", "total", "abs", "mod", "sign", "ceil", "ceiling", "floor", "exp", "ln", "log",
                              "log2", "log10", "pow", "power", "sqrt", "sin", "cos", "tan", "asin", "acos", "atan", "atan2",
                              "sinh", "cosh", "tanh", "asinh", "acosh", "atanh", "degrees", "radians"});
}

}  // namespace engine::sqlite
