// PostgreSQL's types: what a column of one is described as, how its values are read, and how values for one are written.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "date/interval.h"
#include "engine/engine.h"
#include "engine/postgres/binary.h"
#include "engine/postgres/libpq.h"
#include "engine/postgres/wire.h"

namespace engine::postgres {

namespace oid {
constexpr Oid kBool = 16, kBytes = 17, kInt8 = 20, kInt2 = 21, kInt4 = 23, kText = 25, kOid = 26, kTupleId = 27;
constexpr Oid kFloat4 = 700, kFloat8 = 701, kDate = 1082, kTimestamp = 1114, kMoment = 1184;
constexpr Oid kInterval = 1186, kNumeric = 1700, kCursor = 1790;
}  // namespace oid

// A column's type, size and numbers by type and modifier; name and nullability are left alone.
void DescribeType(Oid type, int modifier, Column& column);
// A domain of that name over oid, in any schema, is of the server's large objects.
constexpr std::string_view kObjectDomain = "lo";
// The same of a column of a table or view: `domain` is the name of its type where that is one of the schema kelp, or the
// domain of large objects.
void DescribeColumn(Oid type, int modifier, std::string_view domain, Column& column);
bool IsLob(const Column& column);
// A name as the application sees it, and the other way round: all of it in the other letter case, unless it has both. What
// is written without quotes is in upper case there and in lower case here.
std::string ShownName(std::string_view name);
std::string StoredName(std::string_view part);    // of a word or a quoted one

// Room for a value that the server has in another form.
union ValueRoom {
    OCINumber number;
    date::DateTime date;
    RowId row;
    char interval[date::kMaxIntervalText];
    ValueRoom() : number() {}
};

// Reads a value that is not null as a view of the result or of the room; answers 0 or a published number.
using Reader = int (*)(std::string_view bytes, ValueRoom& room, Datum& value);
Reader BinaryReader(Oid type);    // null: the type is read as text
Reader TextReader(Oid type);
// The same of large objects' columns: an empty text is no null; of one of the server's the number.
Reader WholeBinaryReader(Oid type);
Reader WholeTextReader(Oid type);
// The same of a column of intervals, which says of which span they are; null for any other column.
Reader IntervalReader(const Column& column, bool binary);
bool IsTextType(Oid type);

// The type that a placeholder is declared as by the kind of its values; 0: the server finds one.
Oid TypeOf(Kind kind);

// The values of one execution as libpq takes them. What is not in the source's own form lies in memory that is kept from
// one execution to the next.
class BoundValues {
public:
    // The types that the server has found for the placeholders.
    void SetTypes(std::vector<Oid> types);    // empty: no placeholders
    [[nodiscard]] const std::vector<Oid>& Types() const { return types_; }
    Status Set(std::span<const Datum> values);
    [[nodiscard]] const Wire::Values& Values() const { return values_; }
    [[nodiscard]] std::size_t Bytes() const { return bytes_; }    // of all of them

private:
    int Write(std::size_t index, const Datum& value);
    int WriteText(std::size_t index, std::string_view text);
    int WriteOwn(std::size_t index, std::string_view text);
    int WriteTime(std::size_t index, const date::DateTime& value);
    int WriteInterval(std::size_t index, const date::Interval& value);
    void Point(std::size_t index, const void* data, std::size_t length, bool binary);

    std::vector<Oid> types_;
    Wire::Values values_;
    std::vector<std::string> rooms_;
    std::size_t bytes_ = 0;
};

}  // namespace engine::postgres
