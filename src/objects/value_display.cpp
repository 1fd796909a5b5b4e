// One table from type to the function that shows an element of that type.
#include "objects/value_display.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <string>
#include <string_view>

#include "core/state.h"
#include "objects/decimal_float.h"
#include "objects/element_access.h"
#include "objects/library_failure.h"
#include "objects/registry.h"
#include "objects/text_conversion.h"
#include "platform/client_library.h"
#include "platform/packed_decimal.h"

namespace {

// Ends the line of a value whose library call failed.
void Fail(Line& line, sword rc) {
    line.Print();
    report_library_failure(DefaultErrorHandle, rc);
}

void EndLine(Line& line) {
    line.Character('\n').Print();
}

// --- Texts and bytes -----------------------------------------------------------------------------------------------

void ShowText(Line& line, std::string_view text, bool utf16) {
    if (AddText(line, text.data(), text.size(), utf16, Quotes::always)) EndLine(line);
}

void ShowBytes(Line& line, std::string_view bytes) {
    line.Character('"').Hex(bytes.data(), bytes.size()).Character('"');
    EndLine(line);
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

void ShowCharacters(Line& line, const ElementView& element) {
    ShowText(line, Counted(element), element.utf16);
}

void ShowTerminated(Line& line, const ElementView& element) {
    const auto* text = reinterpret_cast<const char*>(element.data);
    const size_t length = element.utf16 ? Utf16Length(text, element.size) : strnlen(text, element.size);
    ShowText(line, {text, length}, element.utf16);
}

template <class Prefix> void ShowPrefixedText(Line& line, const ElementView& element) {
    ShowText(line, Prefixed<Prefix>(element), element.utf16);
}

void ShowLibraryString(Line& line, const ElementView& element) {
    const auto* string = ReadElement<OCIString*>(element.data, element.size);
    const OraText* text = Call(&ClientLibrary::OCIStringPtr, DefaultEnvironment, string);
    const ub4 length = text == nullptr ? 0 : Call(&ClientLibrary::OCIStringSize, DefaultEnvironment, string);
    ShowText(line, {reinterpret_cast<const char*>(text), length}, element.utf16);
}

void ShowCountedBytes(Line& line, const ElementView& element) {
    ShowBytes(line, Counted(element));
}

void ShowPrefixedBytes(Line& line, const ElementView& element) {
    ShowBytes(line, Prefixed<uint16_t>(element));
}

void ShowLibraryRaw(Line& line, const ElementView& element) {
    const auto* raw = ReadElement<OCIRaw*>(element.data, element.size);
    const ub1* bytes = Call(&ClientLibrary::OCIRawPtr, DefaultEnvironment, raw);
    const ub4 length = bytes == nullptr ? 0 : Call(&ClientLibrary::OCIRawSize, DefaultEnvironment, raw);
    ShowBytes(line, {reinterpret_cast<const char*>(bytes), length});
}

// --- Numbers -------------------------------------------------------------------------------------------------------

void ShowNumber(Line& line, const ElementView& element) {
    const auto number = ReadElement<OCINumber>(element.data, element.size);
    double value = 0;
    const sword rc = Call(&ClientLibrary::OCINumberToReal, DefaultErrorHandle, &number, uword{sizeof value}, &value);
    if (rc != OCI_SUCCESS) return Fail(line, rc);
    line.Format("%f\n", value).Print();
}

void ShowSigned(Line& line, const ElementView& element) {
    line.Format("%lld\n", static_cast<long long>(ReadSigned(element.data, element.size))).Print();
}

void ShowUnsigned(Line& line, const ElementView& element) {
    line.Format("%llu\n", static_cast<unsigned long long>(ReadUnsigned(element.data, element.size))).Print();
}

void ShowReal(Line& line, const ElementView& element) {
    double value = 0;
    if (element.size == 4) value = ReadElement<float>(element.data, element.size);
    if (element.size == 8 || element.size == 16) value = ReadElement<double>(element.data, element.size);
    line.Format("%f\n", value).Print();
}

void ShowPackedDecimal(Line& line, const ElementView& element) {
    constexpr size_t kSignPointAndEnd = 4;
    const int digits = std::max<int>(element.precision, std::abs(element.scale));
    std::string text(kSignPointAndEnd + static_cast<size_t>(digits), '\0');
    // The type may have been changed, and the precision speak of more bytes than there are.
    const bool whole = PackedDecimalSize(element.precision) <= element.size;
    const int rc = !whole ? kDecimalBadSign
                          : DecimalToText(element.data, element.precision, element.scale, text.data(), text.size());
    if (rc != kDecimalDone) {
        line.Print();
        Message(kError, "DecimalToText failed with rc - %ld\n", static_cast<long>(rc));
    }
    line.Text(text.c_str());
    EndLine(line);
}

void ShowDecimalFloat(Line& line, const ElementView& element) {
    line.Print();  // the statement that converts may run callbacks which print
    std::string text;
    const sword rc = DecimalFloatText(element.type, element.data, element.size, text);
    if (rc != OCI_SUCCESS) return Fail(line, rc);
    line.Text(text);
    EndLine(line);
}

// --- Dates ---------------------------------------------------------------------------------------------------------

void ShowSevenByteDate(Line& line, const ElementView& element) {
    SevenByteDate date;
    if (!date.Read(element.data, element.size)) return static_cast<void>(line.Text("Invalid date found\n").Print());
    line.Format("\"%04d-%02d-%02d-%02d:%02d:%02d\"\n", date.year, date.month, date.day, date.hour, date.minute,
                date.second);
    line.Print();
}

void AddDate(Line& line, const OCIDate& date) {
    const OCITime& time = date.OCIDateTime;
    line.Format("%04d-%02d-%02d-%02d:%02d:%02d\n", date.OCIDateYYYY, date.OCIDateMM, date.OCIDateDD, time.OCITimeHH,
                time.OCITimeMI, time.OCITimeSS);
    line.Print();
    constexpr int kLastSecond = 60;  // a leap second is accepted
    if (time.OCITimeSS > kLastSecond)
        Message(kOutput, "Invalid OCITimeSS - %ld\n", static_cast<long>(time.OCITimeSS));
}

void ShowDate(Line& line, const ElementView& element) {
    AddDate(line, ReadElement<OCIDate>(element.data, element.size));
}

// Adds the datetime as the library reads it, with `quote` around, and ends the line; a failing read is reported
// instead.
void AddDateTime(Line& line, OCIDateTime* datetime, const char* quote) {
    sb2 year = 0;
    ub1 month = 0, day = 0, hour = 0, minute = 0, second = 0;
    ub4 fraction = 0;
    sword rc = Call(&ClientLibrary::OCIDateTimeGetDateNS, DefaultEnvironment, DefaultErrorHandle, datetime, &year,
                    &month, &day);
    if (rc == OCI_SUCCESS)
        rc = Call(&ClientLibrary::OCIDateTimeGetTimeNS, DefaultEnvironment, DefaultErrorHandle, datetime, &hour,
                  &minute, &second, &fraction);
    if (rc != OCI_SUCCESS) return Fail(line, rc);
    line.Format("%s%04d-%02d-%02d %02d:%02d:%02d.%06d%s\n", quote, year, month, day, hour, minute, second,
                static_cast<int>(fraction), quote);
    line.Print();
}

void ShowDateTime(Line& line, const ElementView& element) {
    AddDateTime(line, ReadElement<OCIDateTime*>(element.data, element.size), "\"");
}

// --- Handles -------------------------------------------------------------------------------------------------------

void ShowHandle(Line& line, const ElementView& element) {
    const bool null = ReadElement<void*>(element.data, element.size) == nullptr;
    line.Text(null ? "Null value\n" : "Non null value\n").Print();
}

void ShowRowid(Line& line, const ElementView&) {
    line.Text("RID\n").Print();
}

// Locators are shown by the LOB commands only.
void ShowLocator(Line& line, const ElementView&) {
    EndLine(line);
}

struct TypeDisplay {
    int type;
    void (*show)(Line& line, const ElementView& element);
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
    void (*show[SQLT_TIMESTAMP_LTZ + 1])(Line&, const ElementView&) = {};
    constexpr DisplayIndex() {
        for (const TypeDisplay& row : kTypeDisplays) show[row.type] = row.show;
    }
};
constexpr DisplayIndex kDisplayIndex;

uint32_t ElementLength(const MemBuffer& buffer, uint32_t index) {
    if (buffer.dynamic_lengths == 0) return buffer.lengths[index];
    const uint32_t previous = buffer.previous_lengths == nullptr ? 0 : buffer.previous_lengths[index];
    return previous + (buffer.piece_lengths == nullptr ? 0 : buffer.piece_lengths[index]);
}

}  // namespace

void DisplayElement(Line& line, const ElementView& element) {
    constexpr int kNullIndicator = -1;
    if (element.indicator == kNullIndicator || (element.return_code != 0 && element.return_code != 1)) {
        EndLine(line);
        return;
    }
    if (element.type <= 0 || element.type > SQLT_TIMESTAMP_LTZ || kDisplayIndex.show[element.type] == nullptr) {
        line.Print();  // the line of a type that has no display is not ended either
        return;
    }
    kDisplayIndex.show[element.type](line, element);
}

void DisplayBuffer(Line& line, const MemBuffer& buffer) {
    const bool utf16 = StatementIsUtf16(buffer.statement);
    for (uint32_t index = 0; buffer.Complete() && index < buffer.array_size; ++index) {
        const ElementView element = {.type = buffer.type,
                                     .data = buffer.Element(index),
                                     .size = buffer.element_size,
                                     .indicator = buffer.indicators[index],
                                     .return_code = buffer.return_codes[index],
                                     .length = ElementLength(buffer, index),
                                     .precision = buffer.precision,
                                     .scale = buffer.scale,
                                     .utf16 = utf16};
        line.Format("Row=%u,Ind=%d,rcode=%d,len=%u,data=", index + 1, element.indicator, element.return_code,
                    element.length);
        DisplayElement(line, element);
    }
    if (!line.Empty()) line.Print();
}

bool StatementIsUtf16(const void* statement) {
    if (statement == nullptr) return false;
    const NamedObject* slot = FindByPointer(Kind::stmt, statement);
    return slot != nullptr && slot->utf16_mode != 0;
}

void PrintDate(const OCIDate& date) {
    Line line;
    AddDate(line, date);
}

void PrintDateTime(OCIDateTime* datetime) {
    Line line;
    AddDateTime(line, datetime, "");
}
