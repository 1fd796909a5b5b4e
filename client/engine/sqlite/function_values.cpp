// Reading arguments and giving results back.
#include "engine/sqlite/function_values.h"

#include <array>
#include <new>
#include <string>

#include "date/format.h"
#include "engine/sqlite/errors.h"
#include "engine/sqlite/stored_number.h"
#include "handles/errors.h"

namespace engine::sqlite {
namespace {

void SetBytes(Datum& datum, Kind kind, std::string_view bytes) {
    datum.kind = kind;
    datum.data = bytes.data();
    datum.length = static_cast<std::uint32_t>(bytes.size());
}

}  // namespace

void Refuse(sqlite3_context* context, const Status& status) {
    const std::string words = std::string(kErrorMark) + std::to_string(status.Number()) + ' ' + status.Detail();
    sqlite3_result_error(context, words.c_str(), static_cast<int>(words.size()));
}
void Refuse(sqlite3_context* context, int number) { Refuse(context, Error(SqlNumber(number))); }

std::string_view Bytes(sqlite3_value* value) {
    const auto* bytes = static_cast<const char*>(sqlite3_value_blob(value));
    const auto size = static_cast<std::size_t>(sqlite3_value_bytes(value));
    if (!bytes && size > 0) throw std::bad_alloc();
    return {bytes ? bytes : "", size};
}

std::string_view TextOf(sqlite3_value* value) {
    const auto* text = reinterpret_cast<const char*>(sqlite3_value_text(value));
    if (!text && sqlite3_value_type(value) != SQLITE_NULL) throw std::bad_alloc();
    return {text ? text : "", static_cast<std::size_t>(sqlite3_value_bytes(value))};
}

int ReadNumber(sqlite3_value* value, OCINumber& number) {
    switch (sqlite3_value_type(value)) {
        case SQLITE_INTEGER: number::FromInt64(sqlite3_value_int64(value), &number); return 0;
        case SQLITE_FLOAT: return number::FromReal15(sqlite3_value_double(value), &number);
        case SQLITE_BLOB: return ReadNumberBlob(Bytes(value), number) ? 0 : errors::kInvalidNumber;
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
            return sqlite3_result_text64(context, datum.length ? datum.Text().data() : "", datum.length,
                                         SQLITE_TRANSIENT, SQLITE_UTF8);
        case Kind::bytes:
            return sqlite3_result_blob64(context, datum.length ? datum.data : "", datum.length, SQLITE_TRANSIENT);
        default: return sqlite3_result_null(context);
    }
}

void ReturnDate(sqlite3_context* context, const date::DateTime& value) {
    std::array<char, date::kMaxEngineText> text;
    const std::size_t length = date::ToEngineText(value, text.data());
    sqlite3_result_text(context, text.data(), static_cast<int>(length), SQLITE_TRANSIENT);
}

int ReadDate(sqlite3_value* value, date::DateTime& result) {
    if (sqlite3_value_type(value) != SQLITE_TEXT) return errors::kInconsistentTypes;
    const int failure = date::FromEngineText(TextOf(value), &result);
    if (failure == 0) return result.month != 0 ? 0 : errors::kInconsistentTypes;
    const int by_model = date::FromText(TextOf(value), date::kDateModel, date::kEnglish, date::Scope::date, &result);
    return by_model != 0 && failure != errors::kTextMismatch ? failure : by_model;
}

bool IsDate(sqlite3_value* value, date::DateTime& result) {
    return sqlite3_value_type(value) == SQLITE_TEXT && date::FromEngineText(TextOf(value), &result) == 0 &&
           result.month != 0;    // no time alone
}

bool IsNumber(sqlite3_value* value) {
    OCINumber number;
    const int type = sqlite3_value_type(value);
    return type == SQLITE_INTEGER || type == SQLITE_FLOAT ||
           (type == SQLITE_BLOB && ReadNumberBlob(Bytes(value), number));
}

bool AnyNull(int count, Arguments arguments) {
    for (int index = 0; index < count; ++index)
        if (sqlite3_value_type(arguments[index]) == SQLITE_NULL) return true;
    return false;
}

TextArgument::TextArgument(sqlite3_value* value, std::string_view usual) : text_(usual) {
    if (!value) return;
    if (!IsNumber(value)) {
        text_ = TextOf(value);
        return;
    }
    OCINumber number;
    std::size_t length = 0;
    failure_ = ReadNumber(value, number);
    if (failure_ == 0) (void)number::ToPlainText(number, '.', digits_.data(), &length);
    text_ = {digits_.data(), length};
}

int ReadWhole(sqlite3_value* value, std::int64_t& whole) {
    OCINumber number;
    const int failure = ReadNumber(value, number);
    if (failure != 0) return failure;
    return number::ToInt64(number, &whole) == 0 ? 0 : errors::kNumericOverflow;
}

ResultText::ResultText(std::size_t capacity) : bytes_(static_cast<char*>(sqlite3_malloc64(capacity + 1))) {}

void ResultText::Return(sqlite3_context* context) {
    if (size_ == 0) return sqlite3_result_null(context);
    sqlite3_result_text64(context, bytes_.release(), size_, sqlite3_free, SQLITE_UTF8);
}

void ResultText::ReturnBytes(sqlite3_context* context) {
    if (size_ == 0) return sqlite3_result_null(context);
    sqlite3_result_blob64(context, bytes_.release(), size_, sqlite3_free);
}

}  // namespace engine::sqlite
