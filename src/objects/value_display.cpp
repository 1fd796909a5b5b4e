// One table from type to the function that shows an element of that type. Command thread only.
#include "objects/value_display.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <string>
#include <string_view>

#include "core/state.h"
#include "objects/decimal_float_query.h"
#include "objects/element_access.h"
#include "objects/registry.h"
#include "objects/text_conversion.h"
#include "platform/client_library.h"
#include "platform/packed_decimal.h"
#include "platform/utf.h"

namespace {

// Each of the functions below adds the value to the line, the line's end included, and answers OCI_SUCCESS or the
// return code of the library call that failed, after which the line ends where it was.

sword End(Line& line) {
    line.Character('\n');
    return OCI_SUCCESS;
}

// --- Texts and bytes -----------------------------------------------------------------------------------------------

sword ShowText(Line& line, std::string_view text, bool utf16) {
    return AddText(line, text.data(), text.size(), utf16, Quotes::always) ? End(line) : OCI_SUCCESS;
}

sword ShowBytes(Line& line, std::string_view bytes) {
    line.Character('"').Hex(bytes.data(), bytes.size()).Character('"');
    return End(line);
}

// What the element's length says it holds.
std::string_view Counted(const ElementView& element) {
    return {reinterpret_cast<const char*>(element.data), std::min(element.length, element.size)};
}

// What the prefix at the element's start says it holds.
template <class Prefix> std::string_view Prefixed(const ElementView& element) {
    if (element.size <= sizeof(Prefix)) return {};
    const auto room = static_cast<int64_t>(element.size - sizeof(Prefix));
    const int64_t length = std::clamp(int64_t{ReadElement<Prefix>(element.data, element.size)}, int64_t{0}, room);
    return {reinterpret_cast<const char*>(element.data) + sizeof(Prefix), static_cast<size_t>(length)};
}

sword ShowCharacters(Line& line, const ElementView& element) {
    return ShowText(line, Counted(element), element.utf16);
}

sword ShowTerminated(Line& line, const ElementView& element) {
    const auto* text = reinterpret_cast<const char*>(element.data);
    const size_t length = element.utf16 ? utf::Utf16Length(text, element.size) : strnlen(text, element.size);
    return ShowText(line, {text, length}, element.utf16);
}

template <class Prefix> sword ShowPrefixedText(Line& line, const ElementView& element) {
    return ShowText(line, Prefixed<Prefix>(element), element.utf16);
}

sword ShowLibraryString(Line& line, const ElementView& element) {
    const auto* string = ReadElement<OCIString*>(element.data, element.size);
    const OraText* text = Call(&ClientLibrary::OCIStringPtr, DefaultEnvironment, string);
    const ub4 length = text == nullptr ? 0 : Call(&ClientLibrary::OCIStringSize, DefaultEnvironment, string);
    return ShowText(line, {reinterpret_cast<const char*>(text), length}, element.utf16);
}

sword ShowCountedBytes(Line& line, const ElementView& element) {
    return ShowBytes(line, Counted(element));
}

sword ShowPrefixedBytes(Line& line, const ElementView& element) {
    return ShowBytes(line, Prefixed<uint16_t>(element));
}

sword ShowLibraryRaw(Line& line, const ElementView& element) {
    const auto* raw = ReadElement<OCIRaw*>(element.data, element.size);
    const ub1* bytes = Call(&ClientLibrary::OCIRawPtr, DefaultEnvironment, raw);
    const ub4 length = bytes == nullptr ? 0 : Call(&ClientLibrary::OCIRawSize, DefaultEnvironment, raw);
    return ShowBytes(line, {reinterpret_cast<const char*>(bytes), length});
}

// --- Numbers -------------------------------------------------------------------------------------------------------

sword ShowNumber(Line& line, const ElementView& element) {
    const auto number = ReadElement<OCINumber>(element.data, element.size);
    double value = 0;
    const sword rc = Call(&ClientLibrary::OCINumberToReal, DefaultErrorHandle, &number, uword{sizeof value}, &value);
    if (rc != OCI_SUCCESS) return rc;
    line.Format("%f", value);
    return End(line);
}

sword ShowSigned(Line& line, const ElementView& element) {
    line.Format("%lld", static_cast<long long>(ReadSigned(element.data, element.size)));
    return End(line);
}

sword ShowUnsigned(Line& line, const ElementView& element) {
    line.Format("%llu", static_cast<unsigned long long>(ReadUnsigned(element.data, element.size)));
    return End(line);
}

sword ShowReal(Line& line, const ElementView& element) {
    double value = 0;
    if (element.size == 4) value = ReadElement<float>(element.data, element.size);
    if (element.size == 8 || element.size == 16) value = ReadElement<double>(element.data, element.size);
    line.Format("%f", value);
    return End(line);
}

// Room for the digits, the zeros that the scale adds before or behind them, sign, leading zero, point and closing zero.
size_t RoomForDecimal(uint32_t precision, int scale) {
    constexpr int kRest = 4;
    const int digits = 2 * static_cast<int>(PackedDecimalSize(precision)) - 1;
    return static_cast<size_t>(kRest + (scale < 0 ? digits - scale : std::max(digits, scale)));
}

sword ShowPackedDecimal(Line& line, const ElementView& element) {
    std::string text(RoomForDecimal(element.precision, element.scale), '\0');
    // The type may have been changed, and the precision speak of more bytes than there are.
    const bool whole = PackedDecimalSize(element.precision) <= element.size;
    const int rc = !whole ? kDecimalBadSign
                          : DecimalToText(element.data, element.precision, element.scale, text.data(), text.size());
    if (rc != kDecimalDone) {
        line.Print();
        Message(kError, "DecimalToText failed with rc - %ld\n", static_cast<long>(rc));
    }
    line.Text(text.c_str());
    return End(line);
}

sword ShowDecimalFloat(Line& line, const ElementView& element) {
    line.Print();  // the statement that converts may run callbacks which print
    std::string text;
    const sword rc = DecimalFloatText(element.type, element.data, element.size, text);
    if (rc != OCI_SUCCESS) return rc;
    line.Text(text);
    return End(line);
}

// --- Dates ---------------------------------------------------------------------------------------------------------

sword ShowSevenByteDate(Line& line, const ElementView& element) {
    SevenByteDate date;
    if (!date.Read(element.data, element.size)) return End(line.Text("Invalid date found"));
    line.Format("\"%04d-%02d-%02d-%02d:%02d:%02d\"", date.year, date.month, date.day, date.hour, date.minute,
                date.second);
    return End(line);
}

sword AddDate(Line& line, const OCIDate& date) {
    const OCITime& time = date.OCIDateTime;
    line.Format("%04d-%02d-%02d-%02d:%02d:%02d\n", date.OCIDateYYYY, date.OCIDateMM, date.OCIDateDD, time.OCITimeHH,
                time.OCITimeMI, time.OCITimeSS);
    constexpr int kLastSecond = 60;  // a leap second is accepted
    if (time.OCITimeSS > kLastSecond) line.Format("Invalid OCITimeSS - %d\n", time.OCITimeSS);
    return OCI_SUCCESS;
}

sword ShowDate(Line& line, const ElementView& element) {
    return AddDate(line, ReadElement<OCIDate>(element.data, element.size));
}

// The datetime as the library reads it, with `quote` around.
sword AddDateTime(Line& line, OCIDateTime* datetime, const char* quote) {
    sb2 year = 0;
    ub1 month = 0, day = 0, hour = 0, minute = 0, second = 0;
    ub4 fraction = 0;
    sword rc = Call(&ClientLibrary::OCIDateTimeGetDateNS, DefaultEnvironment, DefaultErrorHandle, datetime, &year,
                    &month, &day);
    if (rc == OCI_SUCCESS)
        rc = Call(&ClientLibrary::OCIDateTimeGetTimeNS, DefaultEnvironment, DefaultErrorHandle, datetime, &hour,
                  &minute, &second, &fraction);
    if (rc != OCI_SUCCESS) return rc;
    line.Format("%s%04d-%02d-%02d %02d:%02d:%02d.%06d%s", quote, year, month, day, hour, minute, second,
                static_cast<int>(fraction), quote);
    return End(line);
}

sword ShowDateTime(Line& line, const ElementView& element) {
    return AddDateTime(line, ReadElement<OCIDateTime*>(element.data, element.size), "\"");
}

// --- Handles -------------------------------------------------------------------------------------------------------

sword ShowHandle(Line& line, const ElementView& element) {
    const bool null = ReadElement<void*>(element.data, element.size) == nullptr;
    return End(line.Text(null ? "Null value" : "Non null value"));
}

sword ShowRowid(Line& line, const ElementView&) {
    return End(line.Text("RID"));
}

// Locators are shown by the LOB commands only.
sword ShowLocator(Line& line, const ElementView&) {
    return End(line);
}

using Show = sword (*)(Line& line, const ElementView& element);

struct TypeDisplay {
    int type;
    Show show;
};

constexpr TypeDisplay kTypeDisplays[] = {
    {SQLT_CHR, ShowCharacters},
    {SQLT_NUM, ShowNumber},
    {SQLT_INT, ShowSigned},
    {SQLT_FLT, ShowReal},
    {SQLT_STR, ShowTerminated},
    {SQLT_VNU, ShowNumber},
    {SQLT_PDN, ShowPackedDecimal},
    {SQLT_LNG, ShowCharacters},
    {SQLT_VCS, ShowPrefixedText<uint16_t>},
    {SQLT_RID, ShowCountedBytes},
    {SQLT_DAT, ShowSevenByteDate},
    {SQLT_VBI, ShowPrefixedBytes},
    {SQLT_BFLOAT, ShowDecimalFloat},
    {SQLT_BDOUBLE, ShowDecimalFloat},
    {SQLT_BIN, ShowCountedBytes},
    {SQLT_LBI, ShowCountedBytes},
    {SQLT_UIN, ShowUnsigned},
    {SQLT_LVC, ShowPrefixedText<int32_t>},
    {SQLT_LVB, ShowLibraryRaw},
    {SQLT_AFC, ShowTerminated},
    {SQLT_AVC, ShowPrefixedText<uint16_t>},
    {SQLT_CUR, ShowHandle},
    {SQLT_RDD, ShowRowid},
    {SQLT_CLOB, ShowLocator},
    {SQLT_BLOB, ShowLocator},
    {SQLT_RSET, ShowHandle},
    {SQLT_VST, ShowLibraryString},
    {SQLT_ODT, ShowDate},
    {SQLT_DATE, ShowDateTime},
    {SQLT_TIMESTAMP, ShowDateTime},
    {SQLT_TIMESTAMP_TZ, ShowDateTime},
    {SQLT_TIMESTAMP_LTZ, ShowDateTime},
};

// One step from a type to its display.
struct DisplayIndex {
    Show shows[SQLT_TIMESTAMP_LTZ + 1] = {};
    constexpr DisplayIndex() {
        for (const TypeDisplay& row : kTypeDisplays) shows[row.type] = row.show;
    }
    // Null where a type has no display.
    Show Find(int type) const { return type < 0 || type > SQLT_TIMESTAMP_LTZ ? nullptr : shows[type]; }
};
constexpr DisplayIndex kDisplayIndex;

bool HasValue(const ElementView& element) {
    constexpr int kNullIndicator = -1;
    return element.indicator != kNullIndicator && (element.return_code == 0 || element.return_code == 1);
}

// Prints what the line has left.
sword Printed(Line& line, sword rc) {
    if (!line.Empty()) line.Print();
    return rc;
}

}  // namespace

sword DisplayElement(Line& line, const ElementView& element) {
    if (!HasValue(element)) return Printed(line, End(line));
    const Show show = kDisplayIndex.Find(element.type);
    return Printed(line, show == nullptr ? OCI_SUCCESS : show(line, element));
}

ElementView ElementOf(const MemBuffer& buffer, uint32_t index, bool utf16) {
    return {.type = buffer.type,
            .data = buffer.Element(index),
            .size = buffer.element_size,
            .indicator = *buffer.Indicator(index),
            .return_code = *buffer.ReturnCode(index),
            .length = LengthOf(buffer, index),
            .precision = buffer.precision,
            .scale = buffer.scale,
            .utf16 = utf16};
}

bool StatementIsUtf16(const void* statement) {
    if (statement == nullptr) return false;
    NamedObject* const slot = FindByPointer(Kind::stmt, statement);
    return slot != nullptr && AsRecord<Kind::stmt>(slot)->utf16_mode != 0;
}

void PrintDate(const OCIDate& date) {
    Line line;
    AddDate(line, date);
    line.Print();
}

sword PrintDateTime(OCIDateTime* datetime) {
    Line line;
    return Printed(line, AddDateTime(line, datetime, ""));
}
