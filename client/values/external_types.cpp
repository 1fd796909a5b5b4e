// The external types, one row a code, and the laying of a value into an element with its indicator, length and return
// code.
#include <algorithm>
#include <iterator>
#include <limits>

#include "handles/errors.h"
#include "oci.h"
#include "values/in_rows.h"
#include "values/out_rows.h"

namespace values {
namespace {

constexpr std::uint8_t kPointer = sizeof(void*);

// Codes 97, 21 and 22 are forms of this system's own: characters behind a 2-byte count, and decimal floating point. In
// an area of just their size, 21 and 22 are the machine's float and double.
const ExternalType kTypes[] = {
    {SQLT_CHR, Family::text, 0, true, false, FromChr, &kToChr, &kWholeText},
    {SQLT_NUM, Family::number, OCI_NUMBER_SIZE, false, false, FromNum, &kToNum, nullptr},
    {SQLT_INT, Family::integer, 1, false, false, FromInt, &kToInt, nullptr},
    {SQLT_FLT, Family::real, 4, false, false, FromFlt, &kToFlt, nullptr},
    {SQLT_STR, Family::text, 0, true, false, FromStr, &kToStr, &kWholeText},
    {SQLT_VNU, Family::number, OCI_NUMBER_SIZE, false, false, FromNum, &kToNum, nullptr},
    {SQLT_PDN, Family::number, 1, false, false, FromPdn, &kToPdn, nullptr},
    {SQLT_LNG, Family::text, 0, true, false, FromChr, &kToChr, &kWholeText},
    {SQLT_VCS, Family::text, 2, false, false, FromPrefix2, &kToPrefix2, nullptr},
    {SQLT_RID, Family::row_id, 10, false, false, FromRid, &kToRid, nullptr},
    {SQLT_DAT, Family::date, 7, false, false, FromDat, &kToDat, nullptr},
    {SQLT_VBI, Family::bytes, 2, false, false, FromVbi, &kToVbi, nullptr},
    {SQLT_BFLOAT, Family::number, 8, false, false, FromDecimal64, &kToDecimal64, nullptr},
    {SQLT_BDOUBLE, Family::number, 16, false, false, FromDecimal128, &kToDecimal128, nullptr},
    {SQLT_BIN, Family::bytes, 0, true, false, FromBin, &kToBin, &kWholeBytes},
    {SQLT_LBI, Family::bytes, 0, true, false, FromBin, &kToBin, &kWholeBytes},
    {SQLT_UIN, Family::integer, 1, false, false, FromUin, &kToUin, nullptr},
    {SQLT_LVC, Family::text, 4, false, false, FromPrefix4, &kToPrefix4, nullptr},
    {SQLT_LVB, Family::bytes, kPointer, false, true, FromRaw, &kToRaw, nullptr},
    {SQLT_AFC, Family::text, 0, true, false, FromChr, &kToAfc, &kWholeText},
    {SQLT_AVC, Family::text, 2, false, false, FromPrefix2, &kToPrefix2, nullptr},
    {SQLT_IBFLOAT, Family::real, 4, false, false, FromFlt, &kToFlt, nullptr},
    {SQLT_IBDOUBLE, Family::real, 8, false, false, FromFlt, &kToFlt, nullptr},
    {SQLT_CUR, Family::cursor, kPointer, false, true, FromNothing, &kToNothing, nullptr},
    {SQLT_RDD, Family::row_id, kPointer, false, true, FromRdd, &kToRdd, nullptr},
    {SQLT_CLOB, Family::lob, kPointer, false, true, FromClob, &kToClob, nullptr},
    {SQLT_BLOB, Family::lob, kPointer, false, true, FromBlob, &kToBlob, nullptr},
    {SQLT_DBCLOB, Family::lob, kPointer, false, true, FromClob, &kToDbclob, nullptr},
    {SQLT_RSET, Family::cursor, kPointer, false, true, FromNothing, &kToNothing, nullptr},
    {SQLT_VST, Family::text, kPointer, false, true, FromString, &kToString, nullptr},
    {SQLT_ODT, Family::date, sizeof(OCIDate), false, false, FromOdt, &kToOdt, nullptr},
    {SQLT_DATE, Family::date, kPointer, false, true, FromDatetime, &kToDatetime, nullptr},
    {SQLT_TIME, Family::date, kPointer, false, true, FromDatetime, &kToDatetime, nullptr},
    {SQLT_TIME_TZ, Family::date, kPointer, false, true, FromDatetime, &kToDatetime, nullptr},
    {SQLT_TIMESTAMP, Family::date, kPointer, false, true, FromDatetime, &kToDatetime, nullptr},
    {SQLT_TIMESTAMP_TZ, Family::date, kPointer, false, true, FromDatetime, &kToDatetime, nullptr},
    {SQLT_TIMESTAMP_LTZ, Family::date, kPointer, false, true, FromDatetime, &kToDatetime, nullptr},
    {SQLT_INTERVAL_YM, Family::interval, kPointer, false, true, FromYearMonth, &kToYearMonth, nullptr},
    {SQLT_INTERVAL_DS, Family::interval, kPointer, false, true, FromDaySecond, &kToDaySecond, nullptr},
};

constexpr ExternalType kMachineFloat{SQLT_BFLOAT, Family::real, 4, false, false, FromFlt, &kToFlt, nullptr};
constexpr ExternalType kMachineDouble{SQLT_BDOUBLE, Family::real, 8, false, false, FromFlt, &kToFlt, nullptr};

// What an area of no size stands for: null going in, no place for a value coming out.
constexpr ExternalType kWithoutSize[] = {
    {SQLT_INT, Family::integer, 0, false, false, FromNull, &kToNothing, nullptr},
    {SQLT_UIN, Family::integer, 0, false, false, FromNull, &kToNothing, nullptr},
    {SQLT_FLT, Family::real, 0, false, false, FromNull, &kToNothing, nullptr},
    {SQLT_VNU, Family::number, 0, false, false, FromNull, &kToNothing, nullptr},
    {SQLT_DAT, Family::date, 0, false, false, FromNull, &kToNothing, nullptr},
    {SQLT_ODT, Family::date, 0, false, false, FromNull, &kToNothing, nullptr},
};

template <std::size_t count>
const ExternalType* FindCode(const ExternalType (&types)[count], std::uint16_t code) {
    const auto* found = std::find_if(std::begin(types), std::end(types),
                                     [code](const ExternalType& type) { return type.code == code; });
    return found == std::end(types) ? nullptr : found;
}

// Numbers and dates of fixed form may lie in a larger area; integers and reals fill theirs; pointers need no size.
int CheckSize(const ExternalType& type, std::int64_t size, std::uint32_t& area) {
    if (type.is_pointer && size <= 0) size = kPointer;
    const bool variable = !type.is_pointer && (type.family == Family::text || type.family == Family::bytes);
    if (size < type.least_size) return variable ? errors::kBadAreaLength : errors::kBadFixedLength;
    const bool power_of_two = (size & (size - 1)) == 0;
    if (type.family == Family::integer && (size > 8 || !power_of_two)) return errors::kBadFixedLength;
    if (type.family == Family::real && (size > 16 || !power_of_two)) return errors::kBadFixedLength;
    if (size > std::numeric_limits<std::uint32_t>::max()) return errors::kBadAreaLength;
    area = static_cast<std::uint32_t>(size);
    return 0;
}

int StoreNull(const Elements& elements, std::size_t index) {
    elements.SetIndicator(index, kNullIndicator);
    elements.SetLength(index, 0);
    elements.SetCode(index, errors::kNullFetched);
    return elements.indicators ? 0 : errors::kNullFetched;
}

// The indicator tells the whole length, if it can.
int StoreTruncated(const Elements& elements, std::size_t index, const Target& target) {
    constexpr std::size_t kLongest = std::numeric_limits<std::int16_t>::max();
    elements.SetIndicator(index, target.whole <= kLongest ? static_cast<std::int16_t>(target.whole) : kLongIndicator);
    elements.SetLength(index, target.stored);
    elements.SetCode(index, errors::kTruncated);
    return elements.codes ? errors::kTruncationWarning : errors::kTruncated;
}

}  // namespace

ColumnClass ClassOf(std::uint16_t internal_type) {
    switch (internal_type) {
        case SQLT_NUM:
        case SQLT_BFLOAT:
        case SQLT_BDOUBLE: return ColumnClass::number;
        case SQLT_IBFLOAT: return ColumnClass::binary_float;
        case SQLT_IBDOUBLE: return ColumnClass::binary_double;
        case SQLT_DAT: return ColumnClass::date;
        case SQLT_TIMESTAMP:
        case SQLT_TIMESTAMP_LTZ: return ColumnClass::timestamp;
        case SQLT_TIMESTAMP_TZ: return ColumnClass::timestamp_zone;
        default: return ColumnClass::plain;
    }
}

int FindType(std::uint16_t code, std::int64_t size, bool may_be_null, const ExternalType*& type, std::uint32_t& area) {
    const ExternalType* found = FindCode(kTypes, code);
    if (!found) return errors::kUnknownType;
    if (code == SQLT_BFLOAT && size == kMachineFloat.least_size) found = &kMachineFloat;
    if (code == SQLT_BDOUBLE && size == kMachineDouble.least_size) found = &kMachineDouble;
    if (size == 0 && may_be_null) {
        if (const ExternalType* null = FindCode(kWithoutSize, code)) found = null;
    }
    type = found;
    return CheckSize(*found, size, area);
}

engine::Kind KindOf(const ExternalType& type, std::uint32_t size) {
    switch (type.family) {
        case Family::text:
        case Family::interval: return engine::Kind::text;
        case Family::bytes: return engine::Kind::bytes;
        case Family::number: return engine::Kind::decimal;
        case Family::integer:
            return type.code == SQLT_UIN && size == sizeof(std::uint64_t) ? engine::Kind::decimal : engine::Kind::integer;
        case Family::real: return engine::Kind::real;
        case Family::date:
            return type.code == SQLT_TIMESTAMP_TZ || type.code == SQLT_TIMESTAMP_LTZ ? engine::Kind::moment : engine::Kind::timestamp;
        case Family::row_id: return engine::Kind::row_id;
        case Family::lob: return type.code == SQLT_BLOB ? engine::Kind::bytes : engine::Kind::text;
        case Family::cursor: return engine::Kind::cursor;
    }
    return engine::Kind::null;
}

int Store(const Elements& elements, std::size_t index, const ByKind<OutConverter>& converters, Workspace& workspace,
          const engine::Datum& datum) {
    if (datum.kind == engine::Kind::null) return StoreNull(elements, index);
    char* at = elements.Value(index);
    if (!at) return 0;
    Target target{at, elements.size};
    const int error = converters[static_cast<std::size_t>(datum.kind)](datum, workspace, target);
    if (error == errors::kTruncated) return StoreTruncated(elements, index, target);
    if (error == kPlaceGone) return errors::kNoDefines;
    elements.SetCode(index, error);
    if (error != 0) return error;
    elements.SetIndicator(index, 0);
    elements.SetLength(index, target.stored);
    return 0;
}

int NoConversion(const engine::Datum&, Workspace&, Target&) { return errors::kInconsistentTypes; }

const ByOrigin<OutConverter> kToNothing = [] {
    ByOrigin<OutConverter> row;
    row.fill(NoConversion);
    return row;
}();

}  // namespace values
