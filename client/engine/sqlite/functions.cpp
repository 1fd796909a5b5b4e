// The SQL functions. Arguments that are null make a null, but for nvl and nvl2.
#include "engine/sqlite/functions.h"

#include <algorithm>
#include <array>
#include <memory>
#include <string>

#include "date/date.h"
#include "engine/sqlite/coercion.h"
#include "engine/sqlite/column_types.h"
#include "engine/sqlite/errors.h"
#include "engine/sqlite/stored_number.h"
#include "number/number.h"
#include "oci.h"

namespace engine::sqlite {
namespace {

using Arguments = sqlite3_value**;

// A result that is an error: Failure reads number and detail back.
void Refuse(sqlite3_context* context, const Status& status) {
    const std::string words = std::string(kErrorMark) + std::to_string(status.Number()) + ' ' + status.Detail();
    sqlite3_result_error(context, words.c_str(), static_cast<int>(words.size()));
}
void Refuse(sqlite3_context* context, int number) { Refuse(context, Error(number)); }

std::string_view Bytes(sqlite3_value* value) {
    const auto* bytes = static_cast<const char*>(sqlite3_value_blob(value));
    return {bytes ? bytes : "", static_cast<std::size_t>(sqlite3_value_bytes(value))};
}

std::string_view TextOf(sqlite3_value* value) {
    const auto* text = reinterpret_cast<const char*>(sqlite3_value_text(value));
    return {text ? text : "", static_cast<std::size_t>(sqlite3_value_bytes(value))};
}

void SetBytes(Datum& datum, Kind kind, std::string_view bytes) {
    datum.kind = kind;
    datum.data = bytes.data();
    datum.length = static_cast<std::uint32_t>(bytes.size());
}

// Any value as a number: 0 or an error number.
int ReadNumber(sqlite3_value* value, OCINumber& number) {
    switch (sqlite3_value_type(value)) {
        case SQLITE_INTEGER: number::FromInt64(sqlite3_value_int64(value), &number); return 0;
        case SQLITE_FLOAT: return number::FromReal15(sqlite3_value_double(value), &number);
        case SQLITE_BLOB: return ReadNumberBlob(Bytes(value), number) ? 0 : number::kInvalidNumber;
        default: return number::FromPlainText(TextOf(value), '.', &number);
    }
}

void ReturnNumber(sqlite3_context* context, const OCINumber& number) {
    const StoredNumber stored = StoredNumber::From(number);
    switch (stored.form) {
        case StoredNumber::Form::integer: return sqlite3_result_int64(context, stored.integer);
        case StoredNumber::Form::real: return sqlite3_result_double(context, stored.real);
        case StoredNumber::Form::blob:
            return sqlite3_result_blob(context, stored.blob, stored.length, SQLITE_TRANSIENT);
        case StoredNumber::Form::null: return sqlite3_result_null(context);
    }
}

Datum ReadDatum(sqlite3_value* value, OCINumber& number) {
    Datum datum;
    const std::string_view bytes = sqlite3_value_type(value) == SQLITE_TEXT ? TextOf(value) : Bytes(value);
    switch (sqlite3_value_type(value)) {
        case SQLITE_INTEGER:
            datum.kind = Kind::integer;
            datum.integer = sqlite3_value_int64(value);
            break;
        case SQLITE_FLOAT:
            datum.kind = Kind::real;
            datum.real = sqlite3_value_double(value);
            break;
        case SQLITE_TEXT: SetBytes(datum, Kind::text, bytes); break;
        case SQLITE_BLOB:
            SetBytes(datum, Kind::bytes, bytes);
            if (!ReadNumberBlob(bytes, number)) break;
            SetBytes(datum, Kind::decimal, {reinterpret_cast<char*>(&number), sizeof number});
            break;
        default: break;
    }
    return datum;
}

void ReturnDatum(sqlite3_context* context, const Datum& datum) {
    switch (datum.kind) {
        case Kind::integer: return sqlite3_result_int64(context, datum.integer);
        case Kind::real: return sqlite3_result_double(context, datum.real);
        case Kind::decimal: return ReturnNumber(context, *static_cast<const OCINumber*>(datum.data));
        case Kind::text:
        case Kind::timestamp:
            return sqlite3_result_text64(context, datum.length ? datum.Text().data() : "", datum.length,
                                         SQLITE_TRANSIENT, SQLITE_UTF8);
        case Kind::bytes:
            return sqlite3_result_blob64(context, datum.length ? datum.data : "", datum.length, SQLITE_TRANSIENT);
        default: return sqlite3_result_null(context);
    }
}

// number(x), number(x, precision), number(x, precision, scale)
void ToNumber(sqlite3_context* context, int count, Arguments arguments) {
    OCINumber number;
    Datum value = ReadDatum(arguments[0], number);
    Column column;
    ReadDeclaredType("number", column);
    if (count > 1) column.precision = static_cast<std::uint8_t>(std::clamp(sqlite3_value_int(arguments[1]), 1, 38));
    if (count > 1) column.scale = 0;
    if (count > 2) column.scale = static_cast<std::int8_t>(std::clamp(sqlite3_value_int(arguments[2]), -84, 126));
    Coercion coercion(std::move(column));
    const Status status = coercion.Apply(value);
    if (status.Failed()) Refuse(context, status);
    else ReturnDatum(context, value);
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

// A value as text; false when the engine must refuse it.
bool MakeText(sqlite3_value* value, std::string& text) {
    OCINumber number;
    const int type = sqlite3_value_type(value);
    if (type == SQLITE_TEXT || (type == SQLITE_BLOB && !ReadNumberBlob(Bytes(value), number))) {
        text = TextOf(value);
        return true;
    }
    std::array<char, number::kMaxPlainText> digits;
    std::size_t length = 0;
    if (ReadNumber(value, number) != 0 || number::ToPlainText(number, '.', digits.data(), &length) != 0) return false;
    text.assign(digits.data(), length);
    return true;
}

// The first `count` characters of UTF-8 text; how many there are.
std::size_t CutCharacters(std::string& text, std::size_t count) {
    std::size_t characters = 0;
    for (std::size_t at = 0; at < text.size(); ++at) {
        if ((static_cast<unsigned char>(text[at]) & 0xC0) == 0x80) continue;
        if (characters == count) {
            text.resize(at);
            break;
        }
        ++characters;
    }
    return characters;
}

// varchar(x), varchar(x, characters); char(x), char(x, characters), which pads with blanks
template <bool padded>
void ToText(sqlite3_context* context, int count, Arguments arguments) {
    if (sqlite3_value_type(arguments[0]) == SQLITE_NULL) return sqlite3_result_null(context);
    std::string text;
    if (!MakeText(arguments[0], text)) return Refuse(context, number::kInvalidNumber);
    const int limit = count > 1 ? sqlite3_value_int(arguments[1]) : padded ? 1 : 0;
    if (limit > 0) {
        const auto wanted = static_cast<std::size_t>(limit);
        const std::size_t characters = CutCharacters(text, wanted);
        constexpr std::size_t kLongestPadding = 32767;
        if (padded && characters < wanted && wanted <= kLongestPadding) text.append(wanted - characters, ' ');
    }
    sqlite3_result_text(context, text.data(), static_cast<int>(text.size()), SQLITE_TRANSIENT);
}

void ReturnDate(sqlite3_context* context, const date::DateTime& value) {
    std::array<char, date::kMaxEngineText> text;
    const std::size_t length = date::ToEngineText(value, text.data());
    sqlite3_result_text(context, text.data(), static_cast<int>(length), SQLITE_TRANSIENT);
}

// date(x), which has no fraction and no zone; timestamp(x)
template <bool whole_seconds>
void ToDate(sqlite3_context* context, int, Arguments arguments) {
    if (sqlite3_value_type(arguments[0]) == SQLITE_NULL) return sqlite3_result_null(context);
    date::DateTime value;
    const int failure = date::FromEngineText(TextOf(arguments[0]), &value);
    if (failure != 0) return Refuse(context, failure);
    if (whole_seconds) {
        value.nanosecond = 0;
        value.has_zone = false;
    }
    ReturnDate(context, value);
}

// The present moment in local time: as a date, or with fraction and zone.
template <bool whole_seconds>
void Now(sqlite3_context* context, int, Arguments) {
    date::DateTime now = date::Now();
    if (whole_seconds) {
        now.nanosecond = 0;
        now.has_zone = false;
    }
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

// store(x, 'declared type', 'column'): what a column of that type takes, or refuses; compare(x, ...): what x is when it
// is compared with one. The type is read once a statement.
template <Coercion::Purpose purpose>
void Coerce(sqlite3_context* context, int, Arguments arguments) {
    auto* coercion = static_cast<Coercion*>(sqlite3_get_auxdata(context, 1));
    std::unique_ptr<Coercion> made;
    if (!coercion) {
        Column column;
        if (!ReadDeclaredType(TextOf(arguments[1]), column)) return sqlite3_result_value(context, arguments[0]);
        column.name = TextOf(arguments[2]);
        made = std::make_unique<Coercion>(std::move(column), purpose);
        coercion = made.get();
    }
    OCINumber number;
    Datum value = ReadDatum(arguments[0], number);
    const Status status = coercion->Apply(value);
    if (status.Failed()) Refuse(context, status);
    else ReturnDatum(context, value);
    if (made) {
        sqlite3_set_auxdata(context, 1, made.release(), [](void* kept) { delete static_cast<Coercion*>(kept); });
    }
}

struct FunctionRow {
    const char* name;
    int least;    // arguments
    int most;
    int flags;
    void (*call)(sqlite3_context*, int, Arguments);
};

constexpr FunctionRow kFunctionRows[] = {
    {"kelp_number", 1, 3, SQLITE_DETERMINISTIC, ToNumber},
    {"kelp_decfloat", 1, 2, SQLITE_DETERMINISTIC, ToDecimalFloat},
    {"kelp_varchar", 1, 2, SQLITE_DETERMINISTIC, ToText<false>},
    {"kelp_char", 1, 2, SQLITE_DETERMINISTIC, ToText<true>},
    {"kelp_date", 1, 1, SQLITE_DETERMINISTIC, ToDate<true>},
    {"kelp_timestamp", 1, 2, SQLITE_DETERMINISTIC, ToDate<false>},
    {"kelp_store", 3, 3, SQLITE_DETERMINISTIC, Coerce<Coercion::Purpose::store>},
    {"kelp_compare", 3, 3, SQLITE_DETERMINISTIC, Coerce<Coercion::Purpose::compare>},
    {"nvl", 2, 2, SQLITE_DETERMINISTIC, Nvl},
    {"nvl2", 3, 3, SQLITE_DETERMINISTIC, Nvl2},
    {"kelp_sysdate", 0, 0, 0, Now<true>},
    {"kelp_systimestamp", 0, 0, 0, Now<false>},
};

}  // namespace

Status AddFunctions(sqlite3* database) {
    for (const FunctionRow& row : kFunctionRows) {
        for (int arguments = row.least; arguments <= row.most; ++arguments) {
            const int code = sqlite3_create_function_v2(database, row.name, arguments, SQLITE_UTF8 | row.flags, nullptr,
                                                        row.call, nullptr, nullptr, nullptr);
            if (code != SQLITE_OK) return Failure(database, code);
        }
    }
    return {};
}

}  // namespace engine::sqlite
