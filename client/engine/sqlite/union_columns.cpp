// Each query is compiled and described by itself, with the WITH that stands before them all. What EXCEPT and INTERSECT leave
// are values of the queries before them.
#include "engine/sqlite/union_columns.h"

#include <algorithm>
#include <string>
#include <utility>

#include "engine/sqlite/column_types.h"
#include "engine/sqlite/connection.h"
#include "engine/sqlite/describe.h"
#include "engine/sqlite/names.h"
#include "oci.h"

namespace engine::sqlite {
namespace {

// Columns of one query; null literals are of any type.
struct Part {
    std::vector<Column> columns;
    std::vector<bool> untyped;
    std::vector<bool> nulls;
};

std::size_t PlaceOf(const StatementReading& reading, std::size_t piece) {
    return piece < reading.pieces.size() ? static_cast<std::size_t>(reading.pieces[piece].data() - reading.sql.data()) : reading.sql.size();
}

// From one of them to what stands before the next, or what orders them all.
std::string TextOf(const StatementReading& reading, const std::vector<std::size_t>& begins, std::size_t index) {
    const std::string_view sql = reading.sql;
    std::size_t end = begins[index];
    const auto ends = [&](std::string_view piece) {
        return piece.empty() || piece == ";" || IsOneOf(piece, {"union", "except", "intersect", "order", "limit"});
    };
    while (!ends(reading.operands.At(end))) end = (reading.operands.At(end) == "(" ? reading.operands.Partner(end) : end) + 1;
    const std::size_t begin = PlaceOf(reading, begins[index]);
    return std::string(sql.substr(0, PlaceOf(reading, begins[0]))).append(sql.substr(begin, PlaceOf(reading, end) - begin));
}

bool Describe(sqlite3* database, StatementReading& reading, const std::vector<std::size_t>& begins, std::size_t index, Part& part) {
    const std::string text = TextOf(reading, begins, index);
    sqlite3_stmt* compiled = nullptr;
    sqlite3_prepare_v2(database, text.data(), static_cast<int>(text.size()), &compiled, nullptr);
    const StatementHandle statement(compiled);
    if (!statement) return false;
    DescribeColumns(database, statement.get(), text, part.columns, part.untyped);
    part.nulls.assign(part.columns.size(), false);
    if (!IsWord(reading.operands.At(begins[index]), "select")) return true;
    const std::vector<Names::Item> items = reading.names.Items(begins[index]);
    for (std::size_t at = 0; at < items.size() && items.size() == part.nulls.size(); ++at) {
        const Span item = items[at].expression;
        part.nulls[at] = item.Size() == 1 && IsWord(reading.operands.At(item.first), "null");
        const TableColumn* const type = part.untyped[at] ? reading.names.TypeOf(item) : nullptr;
        if (!type) continue;
        part.columns[at] = type->column;
        part.columns[at].nullable = true;
        part.untyped[at] = false;
    }
    return true;
}

// Of dates and times: what the one above holds is not lost in the one below.
constexpr std::uint16_t kDatesByWidth[] = {SQLT_DAT, SQLT_TIMESTAMP, SQLT_TIMESTAMP_LTZ, SQLT_TIMESTAMP_TZ};

const Column& WiderDate(const Column& left, const Column& right) {
    const auto width = [](const Column& column) { return std::find(std::begin(kDatesByWidth), std::end(kDatesByWidth), column.type); };
    return width(left) < width(right) ? right : left;
}

bool IsPlainText(std::uint16_t type) { return type == SQLT_CHR || type == SQLT_AFC; }

// A size of 0 has no limit; bytes and characters are not compared.
void WidenSize(Column& wide, const Column& other) {
    const bool has_limit = wide.size != 0 && other.size != 0;
    const bool counts_alike = (wide.characters != 0) == (other.characters != 0);
    wide.size = has_limit ? std::max(wide.size, other.size) : 0;
    wide.characters = has_limit && counts_alike ? std::max(wide.characters, other.characters) : 0;
    wide.national = wide.national && other.national;
}

// False where no type holds the values of both. A large object stays what its query has made it.
bool Widen(Column& wide, const Column& other) {
    if (ObjectKindOf(wide) || ObjectKindOf(other)) return true;
    if (IsDateType(wide.type) && IsDateType(other.type)) {
        const Column& wider = WiderDate(wide, other);
        wide.scale = std::max(wide.scale, other.scale);
        wide.type = wider.type;
        wide.size = wider.size;
        return true;
    }
    if (IsNumeric(wide.type) && IsNumeric(other.type)) {
        const bool alike = wide.type == other.type && wide.precision == other.precision && wide.scale == other.scale;
        return alike || ReadDeclaredType("number", wide);
    }
    const bool are_texts = IsPlainText(wide.type) && IsPlainText(other.type);
    if (wide.type != other.type && !are_texts) return false;
    if (wide.type != other.type) wide.type = SQLT_CHR;
    WidenSize(wide, other);
    wide.precision = std::max(wide.precision, other.precision);
    wide.scale = std::max(wide.scale, other.scale);
    return true;
}

}  // namespace

bool DescribeUnion(sqlite3* database, std::string_view sql, std::vector<Column>& columns, std::vector<bool>& untyped) {
    if (Lower(sql).find("union") == std::string::npos) return false;
    const std::vector<std::string_view> pieces = Split(sql);
    if (!IsOneOf(pieces[0], {"select", "with", "values"})) return false;
    StatementReading reading(database, sql, pieces);
    std::vector<std::size_t> begins = reading.names.Parts(0);
    std::erase_if(begins, [&](std::size_t begin) { return IsOneOf(reading.operands.At(begin - 1), {"except", "intersect"}); });
    if (begins.size() < 2) return false;
    std::vector<Part> parts(begins.size());
    for (std::size_t index = 0; index < parts.size(); ++index) {
        if (!Describe(database, reading, begins, index, parts[index]) || parts[index].columns.size() != columns.size()) return false;
    }
    for (std::size_t index = 0; index < columns.size(); ++index) {
        Column* wide = nullptr;
        bool told = true;
        for (Part& part : parts) {
            if (part.nulls[index]) continue;
            told = told && !part.untyped[index] && (!wide || Widen(*wide, part.columns[index]));
            if (!wide) wide = &part.columns[index];
        }
        Column made = wide && told ? std::move(*wide) : Column();
        made.name = std::move(columns[index].name);
        made.nullable = std::any_of(parts.begin(), parts.end(), [&](const Part& part) { return part.columns[index].nullable; });
        columns[index] = std::move(made);
        untyped[index] = !wide || !told;
    }
    return true;
}

}  // namespace engine::sqlite
