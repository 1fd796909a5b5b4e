// Declared types: one table row a type.
#include "engine/sqlite/column_types.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <cstdlib>
#include <string>

#include "engine/sqlite/functions.h"
#include "oci.h"

namespace engine::sqlite {
namespace {

// How the numbers in parentheses are meant.
enum class Measure : std::uint8_t { none, size, characters, digits, binary_digits, fraction };

struct TypeRow {
    std::string_view words;      // lower case; the declaration begins with them
    std::uint16_t type;
    Measure measure;
    std::uint32_t size;          // when nothing is in parentheses
    std::uint8_t precision;
    std::int8_t scale;
    bool national = false;       // in the national character set
};

constexpr std::int8_t kFloating = -127;
constexpr long kLargestSize = 1L << 29;    // of which four bytes each can be told
constexpr std::uint32_t kDateSize = 7;
constexpr std::uint32_t kTimestampSize = 11;
constexpr std::uint32_t kZonedTimestampSize = 13;
constexpr std::uint32_t kLocatorSize = 4000;
constexpr std::uint32_t kRowIdSize = 18;

// The longer of two beginnings stands first.
constexpr TypeRow kTypes[] = {
    {"number", SQLT_NUM, Measure::digits, 22, 0, kFloating},
    {"numeric", SQLT_NUM, Measure::digits, 22, 38, 0},
    {"decimal", SQLT_NUM, Measure::digits, 22, 38, 0},
    {"decfloat(16", SQLT_BFLOAT, Measure::none, 8, 16, kFloating},
    {"decfloat", SQLT_BDOUBLE, Measure::none, 16, 34, kFloating},
    {"kelp_decfp(16", SQLT_BFLOAT, Measure::none, 8, 16, kFloating},
    {"kelp_decfp", SQLT_BDOUBLE, Measure::none, 16, 34, kFloating},
    {"kelp_decfloat(16", SQLT_BFLOAT, Measure::none, 8, 16, kFloating},    // in files of before
    {"kelp_decfloat", SQLT_BDOUBLE, Measure::none, 16, 34, kFloating},
    {"dec", SQLT_NUM, Measure::digits, 22, 38, 0},
    {"integer", SQLT_NUM, Measure::none, 22, 38, 0},
    {"int", SQLT_NUM, Measure::none, 22, 38, 0},
    {"smallint", SQLT_NUM, Measure::none, 22, 38, 0},
    {"bigint", SQLT_NUM, Measure::none, 22, 38, 0},
    {"tinyint", SQLT_NUM, Measure::none, 22, 38, 0},
    {"mediumint", SQLT_NUM, Measure::none, 22, 38, 0},
    {"boolean", SQLT_NUM, Measure::none, 22, 1, 0},
    {"float", SQLT_NUM, Measure::binary_digits, 22, 126, kFloating},
    {"real", SQLT_NUM, Measure::none, 22, 63, kFloating},
    {"double precision", SQLT_NUM, Measure::none, 22, 126, kFloating},
    {"double", SQLT_NUM, Measure::none, 22, 126, kFloating},
    {"binary_float", SQLT_IBFLOAT, Measure::none, 4, 0, 0},
    {"binary_double", SQLT_IBDOUBLE, Measure::none, 8, 0, 0},
    {"varchar2", SQLT_CHR, Measure::size, 0, 0, 0},
    {"varchar", SQLT_CHR, Measure::size, 0, 0, 0},
    {"nvarchar2", SQLT_CHR, Measure::characters, 0, 0, 0, true},
    {"nvarchar", SQLT_CHR, Measure::characters, 0, 0, 0, true},
    {"char varying", SQLT_CHR, Measure::size, 0, 0, 0},
    {"character varying", SQLT_CHR, Measure::size, 0, 0, 0},
    {"varying character", SQLT_CHR, Measure::size, 0, 0, 0},
    {"text", SQLT_CHR, Measure::size, 0, 0, 0},
    {"string", SQLT_CHR, Measure::size, 0, 0, 0},
    {"nchar", SQLT_AFC, Measure::characters, 1, 0, 0, true},
    {"native character", SQLT_AFC, Measure::characters, 1, 0, 0, true},
    {"character", SQLT_AFC, Measure::size, 1, 0, 0},
    {"char", SQLT_AFC, Measure::size, 1, 0, 0},
    {"raw", SQLT_BIN, Measure::size, 0, 0, 0},
    {"varbinary", SQLT_BIN, Measure::size, 0, 0, 0},
    {"binary", SQLT_BIN, Measure::size, 0, 0, 0},
    {"long raw", SQLT_LBI, Measure::none, 0, 0, 0},
    {"long", SQLT_LNG, Measure::none, 0, 0, 0},
    {"datetime", SQLT_DAT, Measure::none, kDateSize, 0, 0},
    {"date", SQLT_DAT, Measure::none, kDateSize, 0, 0},
    {"timestamp_tz", SQLT_TIMESTAMP_TZ, Measure::fraction, kZonedTimestampSize, 0, 6},
    {"timestamp_ltz", SQLT_TIMESTAMP_LTZ, Measure::fraction, kTimestampSize, 0, 6},
    {"timestamp with time zone", SQLT_TIMESTAMP_TZ, Measure::fraction, kZonedTimestampSize, 0, 6},
    {"timestamp with local time zone", SQLT_TIMESTAMP_LTZ, Measure::fraction, kTimestampSize, 0, 6},
    {"timestamp", SQLT_TIMESTAMP, Measure::fraction, kTimestampSize, 0, 6},
    {"time", SQLT_TIMESTAMP, Measure::fraction, kTimestampSize, 0, 6},
    {"span_ym", SQLT_INTERVAL_YM, Measure::digits, 5, 2, 0},
    {"span_ds", SQLT_INTERVAL_DS, Measure::digits, 11, 2, 6},
    {"interval year to month", SQLT_INTERVAL_YM, Measure::digits, 5, 2, 0},    // of a cast
    {"interval day to second", SQLT_INTERVAL_DS, Measure::digits, 11, 2, 6},
    {"clob", SQLT_CLOB, Measure::none, kLocatorSize, 0, 0},
    {"nclob", SQLT_CLOB, Measure::none, kLocatorSize, 0, 0, true},
    {"dbclob", SQLT_DBCLOB, Measure::none, kLocatorSize, 0, 0},
    {"blob", SQLT_BLOB, Measure::none, kLocatorSize, 0, 0},
    {"bfile", SQLT_FILE, Measure::none, kLocatorSize, 0, 0},
    {"rowid", SQLT_RDD, Measure::none, kRowIdSize, 0, 0},
    {"urowid", SQLT_RDD, Measure::none, kRowIdSize, 0, 0},
};

// Lower case, one blank between words, none around parentheses.
std::string Normal(std::string_view words) {
    std::string normal;
    for (const char c : words) {
        const auto byte = static_cast<unsigned char>(c);
        const bool glue = normal.empty() || normal.back() == ' ' || normal.back() == '(';
        if (std::isspace(byte)) {
            if (!glue) normal.push_back(' ');
            continue;
        }
        if ((c == '(' || c == ')' || c == ',') && normal.ends_with(' ')) normal.pop_back();
        normal.push_back(static_cast<char>(std::tolower(byte)));
    }
    return normal;
}

bool BeginsWithWords(const std::string& normal, std::string_view words) {
    if (!normal.starts_with(words)) return false;
    const char next = normal.size() > words.size() ? normal[words.size()] : '\0';
    return !std::isalnum(static_cast<unsigned char>(next)) && next != '_';
}

// The numbers of the first parentheses; how many there are.
std::size_t Numbers(const std::string& normal, std::array<int, 2>& numbers) {
    const std::size_t open = normal.find('(');
    if (open == std::string::npos) return 0;
    const char* at = normal.c_str() + open + 1;
    std::size_t count = 0;
    for (; count < numbers.size(); ++count) {
        char* end = nullptr;
        const long number = std::strtol(at, &end, 10);
        if (end == at) break;
        numbers[count] = static_cast<int>(std::clamp(number, -kLargestSize, kLargestSize));
        at = *end == ',' ? end + 1 : end;
    }
    return count;
}

// A size of one is meant where none is told of what counts characters.
void CountCharacters(std::uint32_t characters, Column& column) {
    constexpr std::uint32_t kMostBytes = 4;    // of a character in UTF-8
    column.characters = characters;
    column.size = characters * kMostBytes;
}

void Apply(Measure measure, const std::string& normal, Column& column) {
    std::array<int, 2> numbers{};
    const std::size_t count = Numbers(normal, numbers);
    if (count == 0 && measure == Measure::characters) return CountCharacters(column.size, column);
    if (count == 0) return;
    switch (measure) {
        case Measure::none: break;
        case Measure::size: column.size = static_cast<std::uint32_t>(std::max(numbers[0], 0)); break;
        case Measure::characters: CountCharacters(static_cast<std::uint32_t>(std::max(numbers[0], 0)), column); break;
        case Measure::digits:
            column.precision = static_cast<std::uint8_t>(std::clamp(numbers[0], 0, 38));
            column.scale = static_cast<std::int8_t>(count > 1 ? std::clamp(numbers[1], -84, 127) : 0);
            break;
        case Measure::binary_digits:
            column.precision = static_cast<std::uint8_t>(std::clamp(numbers[0], 0, 126));
            break;
        case Measure::fraction: column.scale = static_cast<std::int8_t>(std::clamp(numbers[0], 0, 9)); break;
    }
}

}  // namespace

bool ReadDeclaredType(std::string_view declared, Column& column) {
    std::string normal = Normal(declared);
    const std::size_t suffix = normal.find(kCountsCharacters);
    const bool counts_characters = suffix != std::string::npos;
    if (counts_characters) normal.erase(suffix, kCountsCharacters.size());
    const auto* row = std::find_if(std::begin(kTypes), std::end(kTypes),
                                   [&](const TypeRow& candidate) { return BeginsWithWords(normal, candidate.words); });
    if (row == std::end(kTypes)) return false;
    column.type = row->type;
    column.size = row->size;
    column.precision = row->precision;
    column.scale = row->scale;
    column.national = row->national;
    Apply(row->measure == Measure::size && counts_characters ? Measure::characters : row->measure, normal, column);
    return true;
}

std::optional<LobKind> ObjectKindOf(const Column& column) {
    switch (column.type) {
        case SQLT_CLOB:
        case SQLT_DBCLOB:
        case SQLT_LNG: return LobKind::characters;
        case SQLT_BLOB:
        case SQLT_LBI: return LobKind::bytes;
        default: return std::nullopt;
    }
}

bool IsNumberType(std::uint16_t type) {
    return type == SQLT_NUM || type == SQLT_BFLOAT || type == SQLT_BDOUBLE;
}

bool IsNumeric(std::uint16_t type) { return IsNumberType(type) || type == SQLT_IBFLOAT || type == SQLT_IBDOUBLE; }

bool IsTextType(std::uint16_t type) {
    return type == SQLT_CHR || type == SQLT_AFC || type == SQLT_LNG || type == SQLT_CLOB || type == SQLT_DBCLOB;
}

bool HasBinaryDigits(const Column& column) {
    return column.type == SQLT_NUM && column.scale == kFloating && column.precision != 0;
}

bool IsDateType(std::uint16_t type) {
    return type == SQLT_DAT || type == SQLT_TIMESTAMP || type == SQLT_TIMESTAMP_TZ || type == SQLT_TIMESTAMP_LTZ;
}

bool IsIntervalType(std::uint16_t type) { return type == SQLT_INTERVAL_YM || type == SQLT_INTERVAL_DS; }

}  // namespace engine::sqlite
