// to_char, to_date, to_number and their like, on the library's format models. A null argument makes a null.
#include <algorithm>
#include <string>

#include "date/format.h"
#include "engine/sqlite/function_values.h"
#include "handles/errors.h"
#include "number/format.h"
#include "platform/hexadecimal.h"

namespace engine::sqlite {
namespace {

constexpr std::size_t kLongestModelText = 512;    // models of numbers have 64 elements, those of dates 22 names

void ReturnText(sqlite3_context* context, std::string_view text) {
    sqlite3_result_text64(context, text.data(), text.size(), SQLITE_TRANSIENT, SQLITE_UTF8);
}

// Digits that do not fit the model are written as '#', also those that rounding carries beyond it.
int NumberText(const OCINumber& number, std::string_view model, std::span<char> text, std::size_t* length) {
    const number::Nls nls;
    const int failure = number::ToText(number, model, nls, text.data(), text.size(), length);
    OCINumber larger;
    if (failure != errors::kRoundingOverflow || number::Shift(number, 1, &larger) != 0) return failure;
    return number::ToText(larger, model, nls, text.data(), text.size(), length);
}

std::string_view UsualModel(const date::DateTime& value) {
    if (value.has_zone) return date::kTimestampZoneModel;
    return value.nanosecond != 0 ? date::kTimestampModel : date::kDateModel;
}

// to_char(date), to_char(date, model), to_char(number), to_char(number, model)
void ToChar(sqlite3_context* context, int count, Arguments arguments) {
    if (AnyNull(count, arguments)) return sqlite3_result_null(context);
    const std::string_view model = count > 1 ? TextOf(arguments[1]) : "";
    std::array<char, kLongestModelText> text;
    std::size_t length = 0;
    date::DateTime date;
    int failure = 0;
    if (IsDate(arguments[0], date)) {
        failure = date::ToText(date, count > 1 ? model : UsualModel(date), date::kEnglish, date::Scope::timestamp,
                               text.data(), text.size(), &length);
    } else if (count == 1) {
        const TextArgument plain(arguments[0]);
        return plain.Failure() != 0 ? Refuse(context, plain.Failure()) : ReturnText(context, plain.Text());
    } else {
        OCINumber number;
        failure = ReadNumber(arguments[0], number);
        if (failure == 0) failure = NumberText(number, model, text, &length);
    }
    if (failure != 0) return Refuse(context, failure);
    ReturnText(context, {text.data(), length});
}

// to_date(text), to_date(text, model); to_timestamp
template <date::Scope scope>
void ToMoment(sqlite3_context* context, int count, Arguments arguments) {
    if (AnyNull(count, arguments)) return sqlite3_result_null(context);
    const TextArgument text(arguments[0]);
    date::DateTime date;
    int failure = text.Failure();
    if (failure == 0) {
        failure = count == 1 ? ReadDate(arguments[0], date)
                             : date::FromText(text.Text(), TextOf(arguments[1]), date::kEnglish, scope, &date);
    }
    if (failure != 0) return Refuse(context, failure);
    if (scope == date::Scope::date) {
        date.nanosecond = 0;
        date.has_zone = false;
    }
    ReturnDate(context, date);
}

// to_number(text), to_number(text, model)
void TextToNumber(sqlite3_context* context, int count, Arguments arguments) {
    if (AnyNull(count, arguments)) return sqlite3_result_null(context);
    OCINumber number;
    int failure = 0;
    if (count == 1 || IsNumber(arguments[0])) {
        failure = ReadNumber(arguments[0], number);
    } else {
        failure = number::FromText(TextOf(arguments[0]), TextOf(arguments[1]), number::Nls(), &number);
    }
    if (failure != 0) return Refuse(context, failure);
    ReturnNumber(context, number);
}

// hextoraw(digits); before an odd number of them stands a 0.
void HexToRaw(sqlite3_context* context, int, Arguments arguments) {
    const TextArgument digits(arguments[0]);
    if (digits.Failure() != 0) return Refuse(context, digits.Failure());
    ResultText bytes(digits.Text().size() / 2 + 1);
    if (!bytes) return sqlite3_result_error_nomem(context);
    bool second = digits.Text().size() % 2 != 0;
    int high = 0;
    for (const char c : digits.Text()) {
        const int value = HexDigit(c);
        if (value < 0) return Refuse(context, errors::kBadHexadecimal);
        if (second) bytes.Append(static_cast<char>(high * 16 + value));
        high = value;
        second = !second;
    }
    bytes.ReturnBytes(context);
}

// rawtohex(bytes or text)
void RawToHex(sqlite3_context* context, int count, Arguments arguments) {
    if (AnyNull(count, arguments)) return sqlite3_result_null(context);
    if (IsNumber(arguments[0])) return Refuse(context, errors::kInconsistentTypes);
    const std::string_view bytes = Bytes(arguments[0]);
    ResultText digits(bytes.size() * 2);
    if (!digits) return sqlite3_result_error_nomem(context);
    constexpr std::string_view kDigits = "0123456789ABCDEF";
    for (const char c : bytes) {
        digits.Append(kDigits[static_cast<unsigned char>(c) >> 4]);
        digits.Append(kDigits[static_cast<unsigned char>(c) & 15]);
    }
    digits.Return(context);
}

// to_date and to_timestamp fill up from the current date.
constexpr FunctionRow kRows[] = {
    {"to_char", 1, 2, SQLITE_DETERMINISTIC, ToChar, "varchar2"},
    {"to_date", 1, 2, 0, ToMoment<date::Scope::date>, "date"},
    {"to_timestamp", 1, 2, 0, ToMoment<date::Scope::timestamp>, "timestamp"},
    {"to_number", 1, 2, SQLITE_DETERMINISTIC, TextToNumber, "number"},
    {"hextoraw", 1, 1, SQLITE_DETERMINISTIC, HexToRaw, "raw"},
    {"rawtohex", 1, 1, SQLITE_DETERMINISTIC, RawToHex, "varchar2"},
};

}  // namespace

std::span<const FunctionRow> ConversionFunctions() { return kRows; }

}  // namespace engine::sqlite
