// The application's elements as engine values. Lengths are checked against the area before anything is read. Character
// data and bytes without any are null.
#include <algorithm>
#include <limits>

#include "date/date.h"
#include "handles/environment.h"
#include "handles/errors.h"
#include "number/decimal_float.h"
#include "number/number.h"
#include "oci.h"
#include "platform/utf.h"
#include "values/in_rows.h"
#include "values/packed_decimal.h"
#include "values/rowid.h"

namespace values {
namespace {

using engine::Datum;
using engine::Kind;
using View = std::string_view;

void SetView(Kind kind, View view, Datum& datum) {
    datum.kind = view.empty() ? Kind::null : kind;
    datum.length = static_cast<std::uint32_t>(view.size());
    datum.data = view.data();
}

int SetText(View text, Workspace& workspace, Datum& datum) {
    if (workspace.set) {
        workspace.text.clear();
        if (!charset::ToUtf8(*workspace.set, text, workspace.text)) return errors::kBadCharacters;
        text = workspace.text;
    }
    SetView(Kind::text, text, datum);
    return 0;
}

// The bytes of an element whose length stands beside it, or is that of the area.
int GivenBytes(const Source& source, View& bytes) {
    if (source.has_length && source.length > source.size) return errors::kLengthPastArea;
    bytes = {source.at, source.has_length ? source.length : source.size};
    return 0;
}

// Bytes behind a prefix that counts them.
template <class Prefix>
int PrefixedBytes(const Source& source, View& bytes) {
    Prefix length;
    std::memcpy(&length, source.at, sizeof length);
    if (length > source.size - sizeof length) return errors::kBadVaryingLength;
    bytes = {source.at + sizeof length, length};
    return 0;
}

// Up to the zero, which stands within the length given or within the area.
int TerminatedBytes(const Source& source, bool utf16, View& bytes) {
    if (const int error = GivenBytes(source, bytes)) return error;
    const std::size_t end = EndOfText(bytes, utf16);
    const std::size_t zero = utf16 ? 2 : 1;
    const bool found = end + zero <= bytes.size();
    if (!found && !source.has_length && !bytes.empty()) return errors::kNoTerminator;
    bytes = bytes.substr(0, end);
    return 0;
}

void SetDecimal(const OCINumber& number, Workspace& workspace, Datum& datum) {
    std::memcpy(workspace.small.data(), &number, sizeof number);
    datum.kind = Kind::decimal;
    datum.length = sizeof number;
    datum.data = workspace.small.data();
}

// Whole numbers of up to 64 bits go as such, the others as decimals in the workspace.
int SetNumber(const OCINumber& number, Workspace& workspace, Datum& datum) {
    int is_integer = 0;
    if (number::IsInt(number, &is_integer) != 0) return errors::kInvalidNumber;
    if (is_integer && number::ToInt64(number, &datum.integer) == 0) {
        datum.kind = Kind::integer;
        return 0;
    }
    SetDecimal(number, workspace, datum);
    return 0;
}

template <class Narrow>
std::int64_t ReadAs(const char* at) {
    Narrow value;
    std::memcpy(&value, at, sizeof value);
    return static_cast<std::int64_t>(value);
}

template <std::size_t size>
int FromDecimal(const Source& source, Workspace& workspace, Datum& datum) {
    OCINumber number;
    const int error = AsConversionError(number::FromDecimalFloat(source.at, size, &number));
    if (error != 0) return error;
    return SetNumber(number, workspace, datum);
}

int SetDate(const date::DateTime& value, Workspace& workspace, Datum& datum) {
    SetTimestamp(value, workspace, datum);
    return 0;
}

}  // namespace

std::size_t EndOfText(View bytes, bool utf16) {
    if (!utf16) return std::min(bytes.find('\0'), bytes.size());
    for (std::size_t at = 0; at + 2 <= bytes.size(); at += 2)
        if (bytes[at] == 0 && bytes[at + 1] == 0) return at;
    return bytes.size();
}

int FromWholeText(View data, Workspace& workspace, Datum& datum) { return SetText(data, workspace, datum); }
int FromWholeBytes(View data, Workspace&, Datum& datum) { return SetView(Kind::bytes, data, datum), 0; }

int FromChr(const Source& source, Workspace& workspace, Datum& datum) {
    View bytes;
    if (const int error = GivenBytes(source, bytes)) return error;
    return SetText(bytes, workspace, datum);
}
int FromStr(const Source& source, Workspace& workspace, Datum& datum) {
    View bytes;
    if (const int error = TerminatedBytes(source, workspace.utf16, bytes)) return error;
    return SetText(bytes, workspace, datum);
}
int FromPrefix2(const Source& source, Workspace& workspace, Datum& datum) {
    View bytes;
    if (const int error = PrefixedBytes<std::uint16_t>(source, bytes)) return error;
    return SetText(bytes, workspace, datum);
}
int FromPrefix4(const Source& source, Workspace& workspace, Datum& datum) {
    View bytes;
    if (const int error = PrefixedBytes<std::uint32_t>(source, bytes)) return error;
    return SetText(bytes, workspace, datum);
}
int FromBin(const Source& source, Workspace&, Datum& datum) {
    View bytes;
    if (const int error = GivenBytes(source, bytes)) return error;
    SetView(Kind::bytes, bytes, datum);
    return 0;
}
int FromVbi(const Source& source, Workspace&, Datum& datum) {
    View bytes;
    if (const int error = PrefixedBytes<std::uint16_t>(source, bytes)) return error;
    SetView(Kind::bytes, bytes, datum);
    return 0;
}

int FromInt(const Source& source, Workspace&, Datum& datum) {
    datum.kind = Kind::integer;
    switch (source.size) {
        case 1: datum.integer = ReadAs<std::int8_t>(source.at); break;
        case 2: datum.integer = ReadAs<std::int16_t>(source.at); break;
        case 4: datum.integer = ReadAs<std::int32_t>(source.at); break;
        default: datum.integer = ReadAs<std::int64_t>(source.at); break;
    }
    return 0;
}
int FromUin(const Source& source, Workspace& workspace, Datum& datum) {
    datum.kind = Kind::integer;
    switch (source.size) {
        case 1: datum.integer = ReadAs<std::uint8_t>(source.at); break;
        case 2: datum.integer = ReadAs<std::uint16_t>(source.at); break;
        case 4: datum.integer = ReadAs<std::uint32_t>(source.at); break;
        default: datum.integer = ReadAs<std::uint64_t>(source.at); break;
    }
    if (datum.integer >= 0) return 0;
    OCINumber number;    // above what a signed integer holds
    number::FromUint64(static_cast<std::uint64_t>(datum.integer), &number);
    return SetNumber(number, workspace, datum);
}
int FromFlt(const Source& source, Workspace&, Datum& datum) {
    datum.kind = Kind::real;
    if (source.size >= sizeof(double)) {
        std::memcpy(&datum.real, source.at, sizeof(double));
        return 0;
    }
    float narrow;
    std::memcpy(&narrow, source.at, sizeof narrow);
    datum.real = number::WidenByDigits(narrow);
    return 0;
}
int FromNum(const Source& source, Workspace& workspace, Datum& datum) {
    OCINumber number;
    std::memcpy(&number, source.at, sizeof number);
    return SetNumber(number, workspace, datum);
}
int FromPdn(const Source& source, Workspace& workspace, Datum& datum) {
    OCINumber number;
    if (const int error = FromPackedDecimal(source.at, source.size, workspace.scale, &number)) return error;
    return SetNumber(number, workspace, datum);
}
int FromDecimal64(const Source& source, Workspace& workspace, Datum& datum) {
    return FromDecimal<number::kDecimal64Size>(source, workspace, datum);
}
int FromDecimal128(const Source& source, Workspace& workspace, Datum& datum) {
    return FromDecimal<number::kDecimal128Size>(source, workspace, datum);
}

int FromDat(const Source& source, Workspace& workspace, Datum& datum) {
    date::DateTime value;
    if (const int error = date::FromBytes(reinterpret_cast<const std::uint8_t*>(source.at), &value)) return error;
    return SetDate(value, workspace, datum);
}
int FromOdt(const Source& source, Workspace& workspace, Datum& datum) {
    OCIDate date;
    std::memcpy(&date, source.at, sizeof date);
    const date::DateTime value = date::FromOciDate(date);
    if (const int error = date::Validate(value)) return error;
    return SetDate(value, workspace, datum);
}

void SetTimestamp(const date::DateTime& value, Workspace& workspace, Datum& datum) {
    static_assert(alignof(date::DateTime) <= 8);    // that of the workspace
    std::memcpy(workspace.small.data(), &value, sizeof value);
    datum.kind = Kind::timestamp;
    datum.length = sizeof value;
    datum.data = workspace.small.data();
}

int FromNull(const Source&, Workspace&, Datum&) { return 0; }    // the datum is null as it comes
int FromNothing(const Source&, Workspace&, Datum&) { return errors::kInconsistentTypes; }

}  // namespace values
