// Making values what a column takes: the cheap tests first, so that a value that fits costs little.
#include "engine/sqlite/coercion.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <cmath>
#include <cstring>

#include "date/format.h"
#include "engine/sqlite/characters.h"
#include "engine/sqlite/column_types.h"
#include "engine/sqlite/errors.h"
#include "engine/sqlite/interval_text.h"
#include "engine/sqlite/stored_number.h"
#include "handles/errors.h"
#include "number/number.h"
#include "platform/hexadecimal.h"

namespace engine::sqlite {
namespace {

constexpr std::int8_t kFloating = -127;

constexpr std::int64_t kPowersOfTen[] = {1,
                                         10,
                                         100,
                                         1000,
                                         10000,
                                         100000,
                                         1000000,
                                         10000000,
                                         100000000,
                                         1000000000,
                                         10000000000,
                                         100000000000,
                                         1000000000000,
                                         10000000000000,
                                         100000000000000,
                                         1000000000000000,
                                         10000000000000000,
                                         100000000000000000,
                                         1000000000000000000};
constexpr int kMostPower = static_cast<int>(std::size(kPowersOfTen)) - 1;
constexpr int kExactPower = 15;                        // powers of ten and products below are exact in a real
constexpr double kLargestExact = 9007199254740992.0;   // 2^53
constexpr double kLargestNumber = 1e126;               // what a number cannot hold any more
constexpr double kSmallNumber = 1e-129;                // below which it may not hold it

void Set(Datum& value, Kind kind, const void* data, std::size_t length) {
    value.kind = kind;
    value.data = data;
    value.length = static_cast<std::uint32_t>(length);
}

// Whether |value| has at most `digits` digits before the point.
bool Fits(std::int64_t value, int digits) {
    if (digits > kMostPower) return true;
    if (digits < 0) return value == 0;
    return value < kPowersOfTen[digits] && value > -kPowersOfTen[digits];
}

// A real that has no more than `scale` digits after the point, and fits, needs nothing done.
bool IsPlainReal(double value, int precision, int scale) {
    if (scale < 0 || scale > kExactPower || precision - scale < 0) return false;
    const auto power = static_cast<double>(kPowersOfTen[scale]);
    const double scaled = std::nearbyint(value * power);
    if (!(std::fabs(scaled) < kLargestExact) || scaled / power != value) return false;
    const int digits = precision - scale;
    return digits > kMostPower || std::fabs(value) < static_cast<double>(kPowersOfTen[digits]);
}

// The number is valid, and the digits are those of a declaration: none of this can fail.
bool ExceedsPrecision(const OCINumber& number, int digits) {
    OCINumber limit;
    OCINumber size;
    int compared = 0;
    number::FromInt64(1, &limit);
    (void)number::Shift(limit, digits, &limit);
    (void)number::Abs(number, &size);
    (void)number::Compare(size, limit, &compared);
    return compared >= 0;
}

// The default model of the type, else the form in which dates are kept.
int ReadDate(std::string_view text, std::uint16_t type, date::DateTime& value) {
    if (date::FromEngineText(text, &value) == 0 && value.month != 0) return 0;
    const bool is_date = type == SQLT_DAT;
    const std::string_view model = is_date                       ? date::kDateModel
                                   : type == SQLT_TIMESTAMP_TZ ? date::kTimestampZoneModel
                                                                 : date::kTimestampModel;
    return date::FromText(text, model, date::kEnglish, is_date ? date::Scope::date : date::Scope::timestamp, &value);
}

}  // namespace

// Without limits nothing is refused for its size.
Coercion::Coercion(Column column, Purpose purpose, Origin origin)
    : column_(std::move(column)), purpose_(purpose), origin_(origin), among_reals_(HasBinaryDigits(column_)) {
    if (column_.type == SQLT_IBFLOAT || column_.type == SQLT_IBDOUBLE) column_.scale = kFloating;
    const bool is_large = column_.type == SQLT_CLOB || column_.type == SQLT_DBCLOB || column_.type == SQLT_BLOB;
    if (is_large) column_.size = column_.characters = 0;    // which are a locator's
    if (purpose == Purpose::store) return;
    if (column_.type == SQLT_BFLOAT || column_.type == SQLT_BDOUBLE) column_.type = SQLT_NUM;
    column_.size = column_.characters = 0;
    column_.scale = kFloating;
}

bool Coercion::ConcernsComparison(const Column& column) {
    return IsDateType(column.type) || IsIntervalType(column.type) || IsNumeric(column.type) || column.type == SQLT_AFC || column.type == SQLT_BIN;
}

bool Coercion::Concerns(const Column& column) {
    switch (column.type) {
        case SQLT_CHR:
        case SQLT_BIN: return column.size > 0;
        case SQLT_CLOB:
        case SQLT_DBCLOB:
        case SQLT_BLOB:
        case SQLT_FILE:
        case SQLT_RDD: return false;
        default: return true;
    }
}

Status Coercion::Apply(Datum& value) {
    if (value.kind == Kind::null) return {};
    if (purpose_ == Purpose::pass) return value.kind == Kind::row_id ? Refuse(errors::kInconsistentTypes) : Status();
    if (column_.type == SQLT_IBFLOAT || column_.type == SQLT_IBDOUBLE) return ApplyBinary(value);
    if (IsNumberType(column_.type)) {
        Status status = ApplyNumber(value);
        if (status.Ok() && among_reals_) KeepAmongReals(value);
        return status;
    }
    if (IsDateType(column_.type)) return ApplyDate(value);
    if (IsIntervalType(column_.type)) return ApplyInterval(value);
    if (column_.type == SQLT_BIN || column_.type == SQLT_LBI || column_.type == SQLT_BLOB) return ApplyBytes(value);
    return ApplyText(value);
}

Status Coercion::Refuse(int number) const {
    return Error(SqlNumber(number), column_.name.empty() ? std::string() : "column " + column_.name);
}

Status Coercion::ApplyNumber(Datum& value) {
    switch (value.kind) {
        case Kind::integer:
        case Kind::real:
        case Kind::decimal: return ApplyDigits(value);
        case Kind::text: {
            if (value.Text().empty()) {
                value = {};
                return {};
            }
            const int failure = number::FromPlainText(value.Text(), '.', &number_);
            return failure == 0 ? ApplyDecimal(number_, value) : Refuse(failure);
        }
        default: return Refuse(errors::kInconsistentTypes);
    }
}

Status Coercion::ApplyDigits(Datum& value) {
    const int precision = column_.precision;
    const int scale = column_.scale;
    const bool limited = scale != kFloating;
    if (value.kind == Kind::decimal) return ApplyDecimal(*static_cast<const OCINumber*>(value.data), value);
    if (value.kind == Kind::integer) {
        const bool rounds = column_.type == SQLT_BFLOAT && !Fits(value.integer, precision);
        if (!rounds && (!limited || (scale >= 0 && Fits(value.integer, precision - scale)))) return {};
        number::FromInt64(value.integer, &number_);
        return ApplyDecimal(number_, value);
    }
    const bool of_number = column_.type == SQLT_NUM;
    if (of_number && !(std::fabs(value.real) < kLargestNumber)) return Refuse(errors::kNumericOverflow);
    const bool may_vanish = of_number && purpose_ == Purpose::store && std::fabs(value.real) < kSmallNumber && value.real != 0;
    if (!may_vanish && (!limited || IsPlainReal(value.real, precision, scale))) return {};
    const int failure = number::FromReal15(value.real, &number_);
    return failure == 0 ? ApplyDecimal(number_, value) : Refuse(failure);
}

// SQLite makes reals of the integers in a column of binary digits: those that none holds are kept as blobs. A real that
// was computed has the digits that count.
void Coercion::KeepAmongReals(Datum& value) {
    if (value.kind == Kind::real && IsWholeReal(value.real)) {
        (void)number::FromReal15(value.real, &number_);
        (void)number::ToDouble(number_, &value.real);
        return;
    }
    if (value.kind == Kind::decimal) {
        const StoredNumber stored = StoredNumber::From(value.Number());
        if (stored.form != StoredNumber::Form::integer) return;
        value.kind = Kind::integer;
        value.integer = stored.integer;
    }
    if (value.kind != Kind::integer) return;
    const auto real = static_cast<double>(value.integer);
    if (IsWholeReal(real) && static_cast<std::int64_t>(real) == value.integer) return;
    number::FromInt64(value.integer, &number_);
    const StoredNumber stored = StoredNumber::Blob(number_);
    text_.assign(reinterpret_cast<const char*>(stored.blob), stored.length);
    Set(value, Kind::bytes, text_.data(), text_.size());
}

// A real of the column's width, whatever came as a number. An integer is compared with reals as it is.
Status Coercion::ApplyBinary(Datum& value) {
    if (Status status = ApplyNumber(value); status.Failed() || value.kind == Kind::null) return status;
    if (value.kind == Kind::integer) {
        if (purpose_ == Purpose::compare) return {};
        value.real = static_cast<double>(value.integer);
    } else if (value.kind == Kind::decimal) {
        (void)number::ToDouble(*static_cast<const OCINumber*>(value.data), &value.real);    // which holds more
    }
    value.kind = Kind::real;
    if (column_.type == SQLT_IBDOUBLE || purpose_ == Purpose::compare) return {};
    const auto narrow = static_cast<float>(value.real);
    if (std::isinf(narrow) && !std::isinf(value.real)) return Refuse(errors::kNumericOverflow);
    value.real = number::WidenByDigits(narrow);
    return {};
}

Status Coercion::ApplyDecimal(const OCINumber& number, Datum& value) {
    number_ = number;
    int failure = 0;
    if (column_.type == SQLT_BFLOAT || column_.type == SQLT_BDOUBLE) {
        failure = number::Prec(number_, column_.precision, &number_);
    } else if (column_.scale != kFloating) {
        failure = number::Round(number_, column_.scale, &number_);
        if (failure == 0 && ExceedsPrecision(number_, column_.precision - column_.scale))
            failure = errors::kAbovePrecision;
    }
    if (failure != 0) return Refuse(failure);
    Set(value, Kind::decimal, &number_, sizeof number_);
    return {};
}

// False when a number holds no such real.
bool Coercion::ReadReal(double real) {
    if (std::fabs(real) < kSmallNumber && real != 0) return false;
    return (origin_ == Origin::bound ? number::FromDouble : number::FromReal15)(real, &number_) == 0;
}

// As it comes out; what no number holds, as it reads back.
void Coercion::WriteNumber(Datum& value) {
    std::size_t length = 0;
    text_.resize(number::kMaxPlainText);
    const auto write = [&](auto digits) {
        length = static_cast<std::size_t>(std::to_chars(text_.data(), text_.data() + text_.size(), digits).ptr - text_.data());
    };
    if (value.kind == Kind::integer) write(value.integer);
    else if (value.kind == Kind::decimal) (void)number::ToPlainText(value.Number(), '.', text_.data(), &length);
    else if (ReadReal(value.real)) (void)number::ToPlainText(number_, '.', text_.data(), &length);
    else write(value.real);
    Set(value, Kind::text, text_.data(), length);
}

void Coercion::WriteBytes(Datum& value) {
    text_.clear();
    AppendHex(value.Text(), text_);
    Set(value, Kind::text, text_.data(), text_.size());
}

Status Coercion::ApplyText(Datum& value) {
    switch (value.kind) {
        case Kind::integer:
        case Kind::real:
        case Kind::decimal: WriteNumber(value); break;
        case Kind::bytes: WriteBytes(value); break;
        case Kind::timestamp: SetDate(value.Timestamp(), value); break;
        case Kind::row_id: return Refuse(errors::kInconsistentTypes);
        default: break;
    }
    // Blanks at the end of a fixed column's text come back when it is read.
    if (column_.type == SQLT_AFC && value.kind == Kind::text) {
        while (value.length > 1 && value.Text().back() == ' ') --value.length;
    }
    return ApplySize(value);
}

Status Coercion::ApplyBytes(Datum& value) {
    if (value.kind == Kind::lob) return {};
    if (value.kind == Kind::text) {
        const std::string_view digits = value.Text();
        if (digits.size() % 2 != 0) return Refuse(errors::kBadHexadecimal);
        text_.clear();
        for (std::size_t at = 0; at < digits.size(); at += 2) {
            const int high = HexDigit(digits[at]);
            const int low = HexDigit(digits[at + 1]);
            if (high < 0 || low < 0) return Refuse(errors::kBadHexadecimal);
            text_.push_back(static_cast<char>(high * 16 + low));
        }
        Set(value, Kind::bytes, text_.data(), text_.size());
    }
    return value.kind == Kind::bytes ? ApplySize(value) : Refuse(errors::kInconsistentTypes);
}

Status Coercion::ApplySize(const Datum& value) {
    const bool has_length = value.kind == Kind::text || value.kind == Kind::bytes;
    const std::uint32_t most = column_.characters > 0 ? column_.characters : column_.size;
    if (!has_length || most == 0 || value.length <= most) return {};
    const std::int64_t actual = column_.characters > 0 ? CharacterCount(value.Text()) : value.length;
    if (actual <= most) return {};
    const std::string place = column_.name.empty() ? "" : "column " + column_.name + ", ";
    return Error(errors::kTooLarge, place + "actual " + std::to_string(actual) + ", maximum " + std::to_string(most));
}

Status Coercion::ApplyDate(Datum& value) {
    if (value.kind != Kind::text && value.kind != Kind::timestamp) return Refuse(errors::kInconsistentTypes);
    if (value.kind == Kind::text && value.length == 0) {
        value = {};
        return {};
    }
    const bool is_date = value.kind == Kind::timestamp && value.Timestamp().month != 0;
    const bool stores = purpose_ == Purpose::store;
    if (value.kind == Kind::timestamp && !is_date) SetDate(value.Timestamp(), value);    // a time alone is read as a text
    date::DateTime read = is_date ? value.Timestamp() : date::DateTime();
    int failure = is_date ? 0 : ReadDate(value.Text(), column_.type, read);
    if (column_.type == SQLT_DAT && (stores || !is_date)) read.nanosecond = 0;
    else if (failure == 0 && stores) failure = date::RoundFraction(read, column_.scale, &read);
    if (failure != 0) return Refuse(failure);
    if ((column_.type == SQLT_DAT || column_.type == SQLT_TIMESTAMP) && (stores || !is_date)) read.has_zone = false;
    SetDate(read, value);
    return {};
}

// Only what is stored is rounded to the column's digits, and must not have more of them before.
Status Coercion::ApplyInterval(Datum& value) {
    if (value.kind != Kind::text) return Refuse(errors::kInconsistentTypes);
    if (value.length == 0) {
        value = {};
        return {};
    }
    date::Interval read;
    const bool of_months = column_.type == SQLT_INTERVAL_YM;
    int failure = date::FromText(value.Text(), of_months ? date::Span::year_month : date::Span::day_second, &read);
    if (failure == 0 && purpose_ == Purpose::store) {
        std::array<char, date::kMaxIntervalText> text;
        std::size_t length = 0;
        const int digits = of_months ? 0 : column_.scale;
        failure = date::RoundFraction(read, digits, &read);
        if (failure == 0)
            failure = date::ToText(read, column_.precision, static_cast<unsigned>(digits), text.data(), &length);
    }
    if (failure != 0) return Refuse(failure);
    std::int64_t kept = 0;
    if (!KeepInterval(read, kept)) return Refuse(errors::kLeadingPrecision);
    value.kind = Kind::integer;
    value.length = 0;
    value.integer = kept;
    return {};
}

void Coercion::SetDate(const date::DateTime& date, Datum& value) {
    const std::string_view text = WriteDate(date, date_);
    Set(value, Kind::text, text.data(), text.size());
}

}  // namespace engine::sqlite
