// One table from type to the function that shows an element of that type. Command thread only.
#include "objects/value_display.h"

#include "objects/displays.h"
#include "objects/element_access.h"
#include "objects/registry.h"

namespace {

// --- Handles -------------------------------------------------------------------------------------------------------

sword ShowHandle(Line& line, const ElementView& element) {
    const bool null = ReadElement<void*>(element.data, element.size) == nullptr;
    return EndLine(line.Text(null ? "Null value" : "Non null value"));
}

sword ShowRowid(Line& line, const ElementView&) {
    return EndLine(line.Text("RID"));
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
    {SQLT_CLOB, ShowLob},
    {SQLT_BLOB, ShowLob},
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
    Show Find(int type) const { return type > SQLT_TIMESTAMP_LTZ ? nullptr : shows[type]; }
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
    if (!HasValue(element)) return Printed(line, EndLine(line));
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
