// One table row a type. What has no row is a text.
#include "engine/postgres/types.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <cstdlib>
#include <optional>
#include <utility>

#include "date/format.h"
#include "engine/pieces.h"
#include "handles/errors.h"
#include "oci.h"
#include "platform/hexadecimal.h"

namespace engine::postgres {
namespace {

constexpr std::int8_t kFloating = -127;
constexpr std::uint32_t kBytesOfCharacter = 4;    // at most, in UTF-8
constexpr int kModifierHeader = 4;                // what the modifiers of texts and numbers are raised by

void SetView(Datum& value, Kind kind, const void* data, std::size_t length) {
    value.kind = kind;
    value.length = static_cast<std::uint32_t>(length);
    value.data = data;
}

// ---- Reading

int ReadText(std::string_view bytes, ValueRoom&, Datum& value) {
    if (bytes.empty()) value = {};    // an empty text is null
    else SetView(value, Kind::text, bytes.data(), bytes.size());
    return 0;
}

int ReadBytes(std::string_view bytes, ValueRoom&, Datum& value) {
    if (bytes.empty()) value = {};
    else SetView(value, Kind::bytes, bytes.data(), bytes.size());
    return 0;
}

template <Kind kind>
int ReadWhole(std::string_view bytes, ValueRoom&, Datum& value) {
    SetView(value, kind, bytes.data(), bytes.size());
    return 0;
}

int GiveInteger(std::int64_t integer, Datum& value) {
    value.kind = Kind::integer;
    value.length = 0;
    value.integer = integer;
    return 0;
}

int GiveReal(double real, Datum& value) {
    value.kind = Kind::real;
    value.length = 0;
    value.real = real;
    return 0;
}

template <class T>
int ReadInteger(std::string_view bytes, ValueRoom&, Datum& value) {
    return GiveInteger(static_cast<std::int64_t>(Get<T>(bytes.data())), value);
}

int ReadBool(std::string_view bytes, ValueRoom&, Datum& value) { return GiveInteger(bytes[0] != 0, value); }

int ReadDouble(std::string_view bytes, ValueRoom&, Datum& value) {
    const auto bits = Get<std::uint64_t>(bytes.data());
    double real;
    std::memcpy(&real, &bits, sizeof real);
    return GiveReal(real, value);
}

int ReadFloat(std::string_view bytes, ValueRoom&, Datum& value) {
    const auto bits = Get<std::uint32_t>(bytes.data());
    float real;
    std::memcpy(&real, &bits, sizeof real);
    return GiveReal(static_cast<double>(real), value);
}

int ReadNumeric(std::string_view bytes, ValueRoom& room, Datum& value) {
    NumericValue numeric;
    if (const int error = NumericTo(bytes, numeric)) return error;
    if (numeric.is_integer) return GiveInteger(numeric.integer, value);
    room.number = numeric.number;
    SetView(value, Kind::decimal, &room.number, sizeof room.number);
    return 0;
}

int GiveDate(int error, ValueRoom& room, Datum& value) {
    SetView(value, Kind::timestamp, &room.date, sizeof room.date);
    return error;
}

int ReadTimestamp(std::string_view bytes, ValueRoom& room, Datum& value) {
    return GiveDate(MicrosecondsTo(Get<std::int64_t>(bytes.data()), room.date), room, value);
}

int ReadMoment(std::string_view bytes, ValueRoom& room, Datum& value) {
    return GiveDate(MomentTo(Get<std::int64_t>(bytes.data()), room.date), room, value);
}

int ReadDay(std::string_view bytes, ValueRoom& room, Datum& value) {
    room.date = {};
    return GiveDate(DaysTo(Get<std::int32_t>(bytes.data()), room.date), room, value);
}

// Years and months, or days and what is shorter: both at once are no interval here, nor the other span in a column of
// one. `digits` of the fraction, of days; kOfMonths of months; kEither where the value itself tells.
constexpr int kOfMonths = -1, kMostFraction = 6, kEither = 7;

int GiveInterval(std::int64_t months, std::int64_t days, std::int64_t microseconds, int digits, ValueRoom& room,
                 Datum& value) {
    constexpr std::int64_t kSecond = 1'000'000;
    const bool has_days = days != 0 || microseconds != 0;
    const bool of_months = digits == kOfMonths || (digits == kEither && months != 0);
    if (of_months ? has_days : months != 0) return errors::kBadInterval;
    date::Interval interval{date::Span::year_month, months, 0};
    std::int64_t all = 0;
    if (!of_months) {
        if (__builtin_mul_overflow(days, 86400 * kSecond, &all) || __builtin_add_overflow(all, microseconds, &all))
            return errors::kLeadingPrecision;
        interval = {date::Span::day_second, all / kSecond, static_cast<std::int32_t>(all % kSecond * 1000)};
    }
    std::size_t length = 0;
    const auto fraction = static_cast<unsigned>(std::clamp(digits, 0, kMostFraction));
    const int error = date::ToText(interval, date::LeadingDigits(interval), fraction, room.interval, &length);
    SetView(value, Kind::text, room.interval, length);
    return error;
}

template <int digits>
int ReadInterval(std::string_view bytes, ValueRoom& room, Datum& value) {
    const char* const at = bytes.data();
    return GiveInterval(Get<std::int32_t>(at + 12), Get<std::int32_t>(at + 8), Get<std::int64_t>(at), digits, room, value);
}

int ReadTupleId(std::string_view bytes, ValueRoom& room, Datum& value) {
    room.row = RowIdOf(bytes.data());
    SetView(value, Kind::row_id, &room.row, sizeof room.row);
    return 0;
}

int ReadCursor(std::string_view bytes, ValueRoom&, Datum& value) {
    SetView(value, Kind::cursor, bytes.data(), bytes.size());
    return 0;
}

// ---- Reading texts: of a result with a column whose binary form is not known here

int TextToBool(std::string_view text, ValueRoom&, Datum& value) { return GiveInteger(text == "t", value); }

int TextToNumber(std::string_view text, ValueRoom& room, Datum& value) {
    if (text.ends_with("Infinity")) return errors::kNumericOverflow;
    std::int64_t integer = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), integer);
    if (error == std::errc() && end == text.data() + text.size()) return GiveInteger(integer, value);
    SetView(value, Kind::decimal, &room.number, sizeof room.number);
    return number::FromPlainText(text, '.', &room.number);
}

int TextToReal(std::string_view text, ValueRoom&, Datum& value) {
    return GiveReal(std::strtod(text.data(), nullptr), value);    // libpq closes texts with a zero
}

int TextToDate(std::string_view text, ValueRoom& room, Datum& value) {
    if (text.ends_with("infinity")) return errors::kBadYear;
    return GiveDate(date::FromEngineText(text, &room.date), room, value);
}

// \x and pairs of digits, read where they lie: the result is the engine's own.
int TextToBytes(std::string_view text, ValueRoom& room, Datum& value) {
    constexpr std::string_view kDigits = "0123456789abcdef";
    if (text.size() <= 2) return ReadBytes({}, room, value);
    char* const bytes = const_cast<char*>(text.data());
    std::size_t count = 0;
    for (std::size_t at = 2; at + 1 < text.size(); at += 2) {
        bytes[count++] = static_cast<char>(kDigits.find(text[at]) << 4 | kDigits.find(text[at + 1]));
    }
    return ReadBytes({bytes, count}, room, value);
}

int TextToWholeBytes(std::string_view text, ValueRoom& room, Datum& value) {
    TextToBytes(text, room, value);
    return value.kind == Kind::null ? ReadWhole<Kind::bytes>({text.data(), 0}, room, value) : 0;
}

// "-1-2", "1 2:03:04.5", "-2:03:04.5", "0": what has parts of two signs, or of both spans, is written otherwise.
template <int digits>
int TextToInterval(std::string_view text, ValueRoom& room, Datum& value) {
    if (text == "0") return GiveInterval(0, 0, 0, digits, room, value);
    const bool is_negative = text.starts_with('-');
    const std::string_view plain = text.substr(is_negative);
    char with_days[date::kMaxIntervalText + 2] = "0 ";
    const bool has_days = plain.find_first_of(" -") != plain.npos;
    const std::string_view whole =
        has_days ? plain : std::string_view(with_days, 2 + plain.copy(with_days + 2, date::kMaxIntervalText));
    const date::Span span = plain.find('-') != plain.npos ? date::Span::year_month : date::Span::day_second;
    date::Interval read;
    if (const int error = date::FromText(whole, span, &read)) return error;
    if (is_negative) read = date::Negative(read);
    if (span == date::Span::year_month) return GiveInterval(read.whole, 0, 0, digits, room, value);
    return GiveInterval(0, read.whole / 86400, read.whole % 86400 * 1'000'000 + read.nanosecond / 1000, digits, room, value);
}

int TextToTupleId(std::string_view text, ValueRoom& room, Datum& value) {
    char bytes[kTupleIdSize];
    char* end = nullptr;
    Put(static_cast<std::uint32_t>(std::strtoul(text.data() + 1, &end, 10)), bytes);
    Put(static_cast<std::uint16_t>(std::strtoul(end + 1, nullptr, 10)), bytes + 4);
    return ReadTupleId({bytes, sizeof bytes}, room, value);
}

// ---- Types

struct TypeRow {
    Oid oid;
    Reader binary, text;
    std::uint16_t type;
    std::uint32_t size;
    std::uint8_t precision;
    std::int8_t scale;
};

constexpr std::uint32_t kNumberSize = 22, kDateSize = 7, kTimestampSize = 11, kZonedSize = 13, kRowIdSize = 18;
constexpr Oid kChar = 18, kName = 19, kJson = 114, kXml = 142, kFixed = 1042, kVarying = 1043;

constexpr TypeRow kTypes[] = {
    {oid::kBool, ReadBool, TextToBool, SQLT_NUM, kNumberSize, 1, 0},
    {oid::kBytes, ReadBytes, TextToBytes, SQLT_BIN, 0, 0, 0},
    {kChar, ReadText, ReadText, SQLT_CHR, 1, 0, 0},
    {kName, ReadText, ReadText, SQLT_CHR, 64, 0, 0},
    {oid::kInt8, ReadInteger<std::int64_t>, TextToNumber, SQLT_NUM, kNumberSize, 19, 0},
    {oid::kInt2, ReadInteger<std::int16_t>, TextToNumber, SQLT_NUM, kNumberSize, 5, 0},
    {oid::kInt4, ReadInteger<std::int32_t>, TextToNumber, SQLT_NUM, kNumberSize, 10, 0},
    {oid::kText, ReadText, ReadText, SQLT_CHR, 0, 0, 0},
    {oid::kOid, ReadInteger<std::uint32_t>, TextToNumber, SQLT_NUM, kNumberSize, 10, 0},
    {oid::kTupleId, ReadTupleId, TextToTupleId, SQLT_RDD, kRowIdSize, 0, 0},
    {kJson, ReadText, ReadText, SQLT_CHR, 0, 0, 0},
    {kXml, ReadText, ReadText, SQLT_CHR, 0, 0, 0},
    {oid::kFloat4, ReadFloat, TextToReal, SQLT_IBFLOAT, 4, 0, 0},
    {oid::kFloat8, ReadDouble, TextToReal, SQLT_IBDOUBLE, 8, 0, 0},
    {kFixed, ReadText, ReadText, SQLT_AFC, 0, 0, 0},
    {kVarying, ReadText, ReadText, SQLT_CHR, 0, 0, 0},
    {oid::kDate, ReadDay, TextToDate, SQLT_DAT, kDateSize, 0, 0},
    {oid::kTimestamp, ReadTimestamp, TextToDate, SQLT_TIMESTAMP, kTimestampSize, 0, 6},
    {oid::kMoment, ReadMoment, TextToDate, SQLT_TIMESTAMP_TZ, kZonedSize, 0, 6},
    {oid::kInterval, ReadInterval<kEither>, TextToInterval<kEither>, SQLT_CHR, 0, 0, 0},
    {oid::kNumeric, ReadNumeric, TextToNumber, SQLT_NUM, kNumberSize, 0, kFloating},
    {oid::kCursor, ReadCursor, ReadCursor, SQLT_RSET, 8, 0, 0},
};

const TypeRow* Find(Oid type) {
    const auto* row = std::lower_bound(std::begin(kTypes), std::end(kTypes), type,
                                       [](const TypeRow& candidate, Oid wanted) { return candidate.oid < wanted; });
    return row != std::end(kTypes) && row->oid == type ? row : nullptr;
}

// The modifier of a number: its precision above, its scale, of eleven bits with a sign, below.
void DescribeNumber(int modifier, Column& column) {
    const int packed = modifier - kModifierHeader;
    const int scale = ((packed & 0x7FF) ^ 1024) - 1024;
    column.precision = static_cast<std::uint8_t>(std::min(packed >> 16 & 0xFFFF, 255));
    column.scale = static_cast<std::int8_t>(std::clamp(scale, -84, 127));
}

// Of all digits that the leading part may have: the server knows no limit of its own.
void DescribeSpan(std::uint16_t span, int fraction, Column& column) {
    constexpr std::uint8_t kMostDigits = 9;
    column.type = span;
    column.size = span == SQLT_INTERVAL_YM ? 5 : 11;
    column.precision = kMostDigits;
    column.scale = static_cast<std::int8_t>(std::min(fraction, kMostFraction));
}

// The modifier of an interval: the fields that it has, as bits, above the digits of the fraction. A column with fields
// of both spans stays what it is.
void DescribeInterval(int modifier, Column& column) {
    constexpr int kMonths = 1 << 1 | 1 << 2;                         // month, year
    constexpr int kDays = 1 << 3 | 1 << 10 | 1 << 11 | 1 << 12;      // day, hour, minute, second
    const int fields = modifier >> 16 & 0x7FFF;
    if ((fields & ~kMonths) == 0) DescribeSpan(SQLT_INTERVAL_YM, 0, column);
    else if ((fields & ~kDays) == 0) DescribeSpan(SQLT_INTERVAL_DS, modifier & 0xFFFF, column);
}

template <int... digits>
Reader ReaderOfDigits(int wanted, bool binary, std::integer_sequence<int, digits...>) {
    constexpr Reader kBinary[] = {ReadInterval<digits>...}, kText[] = {TextToInterval<digits>...};
    return (binary ? kBinary : kText)[wanted];
}

}  // namespace

void DescribeType(Oid type, int modifier, Column& column) {
    const TypeRow* row = Find(type);
    column.type = row ? row->type : SQLT_CHR;
    column.size = row ? row->size : 0;
    column.precision = row ? row->precision : 0;
    column.scale = row ? row->scale : 0;
    column.characters = 0;
    if (modifier < 0) return;
    if (type == kFixed || type == kVarying) {
        column.characters = static_cast<std::uint32_t>(modifier - kModifierHeader);
        column.size = column.characters * kBytesOfCharacter;
    } else if (type == oid::kNumeric) {
        DescribeNumber(modifier, column);
    } else if (type == oid::kInterval) {
        DescribeInterval(modifier, column);
    } else if (type == oid::kTimestamp && modifier == 0) {    // how a date with its time is declared
        column.type = SQLT_DAT;
        column.size = kDateSize;
        column.scale = 0;
    } else if (type == oid::kTimestamp || type == oid::kMoment) {
        column.scale = static_cast<std::int8_t>(modifier);
    }
}

void DescribeColumn(Oid type, int modifier, std::string_view domain, Column& column) {
    constexpr std::uint32_t kLocatorSize = 4000;
    constexpr struct {
        Oid type;
        std::string_view domain;
        std::uint16_t described;
        std::uint32_t size;
        bool national;
    } kColumns[] = {
        {oid::kText, "long", SQLT_LNG, 0, false},
        {oid::kText, "nclob", SQLT_CLOB, kLocatorSize, true},
        {oid::kText, "dbclob", SQLT_DBCLOB, kLocatorSize, false},
        {oid::kText, "", SQLT_CLOB, kLocatorSize, false},
        {oid::kBytes, "raw", SQLT_BIN, 0, false},
        {oid::kBytes, "long_raw", SQLT_LBI, 0, false},
        {oid::kBytes, "", SQLT_BLOB, kLocatorSize, false},
        {oid::kOid, kObjectDomain, SQLT_BLOB, kLocatorSize, false},
    };
    DescribeType(type, modifier, column);
    if (type == oid::kTimestamp && modifier == 0 && domain != "date") {    // declared by itself
        column.type = SQLT_TIMESTAMP;
        column.size = kTimestampSize;
    }
    if (type == oid::kInterval && domain == "year_month") return DescribeSpan(SQLT_INTERVAL_YM, 0, column);
    for (const auto& row : kColumns) {
        if (row.type != type || row.domain != domain) continue;
        column.type = row.described;
        column.size = row.size;
        column.national = row.national;
    }
}

bool IsLob(const Column& column) {
    return column.type == SQLT_CLOB || column.type == SQLT_DBCLOB || column.type == SQLT_BLOB;
}

std::string ShownName(std::string_view name) {
    std::string other(name);
    bool upper = false, lower = false;
    for (char& c : other) {
        const bool is_upper = c >= 'A' && c <= 'Z', is_lower = c >= 'a' && c <= 'z';
        upper = upper || is_upper;
        lower = lower || is_lower;
        if (is_upper || is_lower) c = static_cast<char>(c ^ 0x20);
    }
    return upper && lower ? std::string(name) : other;
}

std::string StoredName(std::string_view part) {
    if (part.starts_with('"')) return ShownName(PlainName(part));
    return Lower(part);
}

Reader BinaryReader(Oid type) {
    const TypeRow* row = Find(type);
    return row ? row->binary : nullptr;
}

Reader TextReader(Oid type) {
    const TypeRow* row = Find(type);
    return row ? row->text : ReadText;
}

Reader IntervalReader(const Column& column, bool binary) {
    if (column.type == SQLT_INTERVAL_YM) return binary ? ReadInterval<kOfMonths> : TextToInterval<kOfMonths>;
    if (column.type != SQLT_INTERVAL_DS) return nullptr;
    return ReaderOfDigits(column.scale, binary, std::make_integer_sequence<int, kMostFraction + 1>());
}

Reader WholeBinaryReader(Oid type) {
    if (type == oid::kOid) return BinaryReader(type);
    return type == oid::kBytes ? ReadWhole<Kind::bytes> : ReadWhole<Kind::text>;
}
Reader WholeTextReader(Oid type) {
    if (type == oid::kOid) return TextReader(type);
    return type == oid::kBytes ? TextToWholeBytes : ReadWhole<Kind::text>;
}

bool IsTextType(Oid type) {
    return type == oid::kText || type == kVarying || type == kFixed || type == kName;
}

// ---- Writing

Oid TypeOf(Kind kind) {
    switch (kind) {
        case Kind::integer: return oid::kInt8;
        case Kind::real: return oid::kFloat8;
        case Kind::decimal: return oid::kNumeric;
        case Kind::bytes: return oid::kBytes;
        case Kind::row_id: return oid::kTupleId;
        case Kind::cursor: return oid::kCursor;
        default: return 0;    // texts are read as what they are compared with; so are dates, with or without a zone
    }
}

void BoundValues::SetTypes(std::vector<Oid> types) {
    const std::size_t count = types.size();
    rooms_.resize(count);
    values_.data.resize(count);
    values_.lengths.resize(count);
    values_.formats.resize(count);
    types_ = std::move(types);
}

void BoundValues::Point(std::size_t index, const void* data, std::size_t length, bool binary) {
    values_.data[index] = data ? static_cast<const char*>(data) : "";
    values_.lengths[index] = static_cast<int>(length);
    values_.formats[index] = binary;
    bytes_ += length;
}

Status BoundValues::Set(std::span<const Datum> values) {
    bytes_ = 0;
    for (std::size_t index = 0; index < types_.size(); ++index) {
        if (values[index].kind == Kind::null) values_.data[index] = nullptr;
        else if (const int error = Write(index, values[index])) return Refused(error);
    }
    return {};
}

// The customary models, or the engines' own form.
static int ReadDate(std::string_view text, Oid type, date::DateTime& value) {
    if (date::FromEngineText(text, &value) == 0 && value.month != 0) return 0;
    const int error = date::FromText(text, date::kDateModel, date::kEnglish, date::Scope::date, &value);
    if (error == 0) return 0;
    const auto read = [&](std::string_view model) {
        return date::FromText(text, model, date::kEnglish, date::Scope::timestamp, &value);
    };
    if (read(date::kTimestampModel) == 0) return 0;
    return type == oid::kMoment ? read(date::kTimestampZoneModel) : error;
}

// "2-3", "4 05:06:07.8" with a sign or without; what the server's own words say is left to it. A number alone may be years
// or days.
static int ReadInterval(std::string_view text, std::optional<date::Interval>& value) {
    const std::size_t digits = std::min(text.find_first_of("0123456789"), text.size());
    const std::size_t behind = std::min(text.find_first_not_of("0123456789", digits), text.size());
    if (digits == text.size() || text.find_first_not_of(" 0123456789+-:.", digits) != text.npos) return 0;
    if (behind == text.size()) return errors::kBadInterval;
    const date::Span span = text[behind] == '-' ? date::Span::year_month : date::Span::day_second;
    return date::FromText(text, span, &value.emplace());
}

// A text for a text goes as it lies there; for any other type it is the server that reads it, up to a zero.
int BoundValues::WriteText(std::size_t index, std::string_view text) {
    if (IsTextType(types_[index])) {
        Point(index, text.data(), text.size(), true);
        return 0;
    }
    date::DateTime date;
    if (types_[index] == oid::kTimestamp || types_[index] == oid::kMoment) {
        const int error = ReadDate(text, types_[index], date);
        return error != 0 ? error : WriteTime(index, date);
    }
    if (types_[index] == oid::kInterval) {
        std::optional<date::Interval> interval;
        if (const int error = ReadInterval(text, interval)) return error;
        if (interval) return WriteInterval(index, *interval);
    }
    std::string& room = rooms_[index];
    room.assign(types_[index] == oid::kBytes ? "\\x" : "");
    room.append(text);
    if (room.find('\0') != std::string::npos) return errors::kInvalidCharacter;
    Point(index, room.c_str(), room.size(), false);
    return 0;
}

// A text made here.
int BoundValues::WriteOwn(std::size_t index, std::string_view text) {
    rooms_[index].assign(text);
    Point(index, rooms_[index].c_str(), text.size(), false);
    return 0;
}

int BoundValues::WriteTime(std::size_t index, const date::DateTime& value) {
    std::int64_t microseconds = 0;
    const int error = types_[index] == oid::kMoment ? MomentFrom(value, microseconds) : MicrosecondsFrom(value, microseconds);
    if (error != 0) return error;
    std::string& room = rooms_[index];
    room.resize(sizeof microseconds);
    Put(microseconds, room.data());
    Point(index, room.data(), room.size(), true);
    return 0;
}

// Cut to the microseconds that the server has; it then rounds to the digits of the column.
int BoundValues::WriteInterval(std::size_t index, const date::Interval& value) {
    constexpr std::int64_t kDay = 86400;
    const bool of_months = value.span == date::Span::year_month;
    const std::int64_t months = of_months ? value.whole : 0, all = of_months ? 0 : value.whole;
    if (months != static_cast<std::int32_t>(months)) return errors::kLeadingPrecision;
    std::string& room = rooms_[index];
    room.resize(16);
    Put(all % kDay * 1'000'000 + value.nanosecond / 1000, room.data());
    Put(static_cast<std::int32_t>(all / kDay), room.data() + 8);
    Put(static_cast<std::int32_t>(months), room.data() + 12);
    Point(index, room.data(), room.size(), true);
    return 0;
}

int BoundValues::Write(std::size_t index, const Datum& value) {
    std::string& room = rooms_[index];
    switch (value.kind) {
        case Kind::integer:
            if (types_[index] != oid::kInt8) return WriteOwn(index, std::to_string(value.integer));
            room.resize(sizeof value.integer);
            Put(value.integer, room.data());
            break;
        case Kind::real: {
            std::uint64_t bits;
            std::memcpy(&bits, &value.real, sizeof bits);
            room.resize(sizeof bits);
            Put(bits, room.data());
            break;
        }
        case Kind::decimal:
            room.resize(kMaxNumeric);
            room.resize(NumericFrom(value.Number(), room.data()));
            if (room.empty()) return errors::kInvalidNumber;
            break;
        case Kind::text: return WriteText(index, value.Text());
        case Kind::bytes:
            if (!IsTextType(types_[index])) {
                Point(index, value.data, value.length, true);
                return 0;
            }
            room.clear();
            AppendHex(value.Text(), room);
            break;
        case Kind::timestamp: return WriteTime(index, value.Timestamp());
        case Kind::row_id:
            room.resize(kTupleIdSize);
            TupleIdOf(value.Row(), room.data());
            break;
        default: return errors::kInconsistentTypes;
    }
    Point(index, room.data(), room.size(), true);
    return 0;
}

}  // namespace engine::postgres
