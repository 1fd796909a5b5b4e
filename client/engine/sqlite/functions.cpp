#include "engine/sqlite/functions.h"

#include <array>
#include <string>

#include "date/date.h"
#include "engine/sqlite/errors.h"
#include "engine/sqlite/stored_number.h"
#include "number/number.h"
#include "oci.h"

namespace engine::sqlite {
namespace {

using Arguments = sqlite3_value**;

// A result that is an error: errors.cpp finds the number at the end of the words.
void Refuse(sqlite3_context* context, int number) {
    const std::string words = "value cannot be converted, error " + std::to_string(number);
    sqlite3_result_error(context, words.c_str(), static_cast<int>(words.size()));
}

std::string_view Bytes(sqlite3_value* value) {
    const auto* bytes = static_cast<const char*>(sqlite3_value_blob(value));
    return {bytes ? bytes : "", static_cast<std::size_t>(sqlite3_value_bytes(value))};
}

std::string_view TextOf(sqlite3_value* value) {
    const auto* text = reinterpret_cast<const char*>(sqlite3_value_text(value));
    return {text ? text : "", static_cast<std::size_t>(sqlite3_value_bytes(value))};
}

// Any value as a number: 0 or an error number.
int ReadNumber(sqlite3_value* value, OCINumber& number) {
    switch (sqlite3_value_type(value)) {
        case SQLITE_INTEGER: number::FromInt64(sqlite3_value_int64(value), &number); return 0;
        case SQLITE_FLOAT: return number::FromDouble(sqlite3_value_double(value), &number);
        case SQLITE_BLOB: return ReadNumberBlob(Bytes(value), number) ? 0 : number::kInvalidNumber;
        default: return number::FromPlainText(TextOf(value), '.', &number);
    }
}

void ReturnNumber(sqlite3_context* context, const OCINumber& number) {
    const StoredNumber stored = StoredNumber::From(number);
    switch (stored.form) {
        case StoredNumber::Form::integer: return sqlite3_result_int64(context, stored.integer);
        case StoredNumber::Form::real: return sqlite3_result_double(context, stored.real);
        case StoredNumber::Form::blob: return sqlite3_result_blob(context, stored.blob, stored.length, SQLITE_TRANSIENT);
        case StoredNumber::Form::null: return sqlite3_result_null(context);
    }
}

// Whether the value needs more digits before the point than `precision` and `scale` leave.
bool Exceeds(const OCINumber& number, int precision, int scale) {
    OCINumber one;
    OCINumber limit;
    OCINumber size;
    int compared = 0;
    number::FromInt64(1, &one);
    if (number::Shift(one, precision - scale, &limit) != 0 || number::Abs(number, &size) != 0) return false;
    return number::Compare(size, limit, &compared) == 0 && compared >= 0;
}

// number(x), number(x, precision), number(x, precision, scale)
void ToNumber(sqlite3_context* context, int count, Arguments arguments) {
    if (sqlite3_value_type(arguments[0]) == SQLITE_NULL) return sqlite3_result_null(context);
    OCINumber number;
    int failure = ReadNumber(arguments[0], number);
    if (failure == 0 && count > 1) {
        const int precision = sqlite3_value_int(arguments[1]);
        const int scale = count > 2 ? sqlite3_value_int(arguments[2]) : 0;
        failure = number::Round(number, scale, &number);
        if (failure == 0 && Exceeds(number, precision, scale)) failure = 1438;
    }
    if (failure != 0) return Refuse(context, failure);
    ReturnNumber(context, number);
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
