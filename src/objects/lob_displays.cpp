// The data behind locators, read by a query that casts them. Command thread only.
#include <algorithm>
#include <cstring>

#include "core/state.h"
#include "objects/displays.h"
#include "objects/element_access.h"
#include "objects/lobs.h"
#include "objects/one_row_query.h"
#include "objects/text_conversion.h"
#include "platform/utf.h"

namespace {

const char* QueryFor(uint16_t type) {
    switch (type) {
        case SQLT_BLOB: return "values(cast(:1 as blob))";
        case SQLT_DBCLOB: return "values(cast(:1 as dbclob))";
        default: return "values(cast(:1 as clob))";
    }
}

struct LobData {
    char bytes[1000 + 2] = {};  // room for a closing zero that the library has none for
    sb2 indicator = 0;
    ub2 length = 0;
    ub2 code = 0;  // with a place for it, data that are cut are no error
};

bool Succeeded(sword rc) {
    return rc == OCI_SUCCESS || rc == OCI_SUCCESS_WITH_INFO;  // what is cut is shown as far as it goes
}

sword ReadData(OCILobLocator* locator, uint16_t type, LobData& data) {
    constexpr sb4 kShown = 1000;
    OneRowQuery query;
    query.Prepare(QueryFor(type));
    query.Define(data.bytes, kShown, type == SQLT_BLOB ? SQLT_BIN : SQLT_STR, &data.indicator, &data.length,
                 &data.code);
    query.Bind(&locator, sizeof locator, type);
    return query.Execute();
}

void AddData(Line& line, uint16_t type, const LobData& data) {
    line.Text("Data - ");
    if (type == SQLT_BLOB) {
        const size_t length = std::min<size_t>(data.length, sizeof data.bytes);
        line.Character('"').Hex(data.bytes, data.indicator == OCI_IND_NULL ? 0 : length).Character('"');
        return;
    }
    const size_t length = Utf16Mode ? utf::Utf16Length(data.bytes, sizeof data.bytes)
                                    : strnlen(data.bytes, sizeof data.bytes);
    AddText(line, data.bytes, length, Utf16Mode);
}

}  // namespace

sword ShowLob(Line& line, const ElementView& element) {
    auto* const locator = ReadElement<OCILobLocator*>(element.data, element.size);
    if (locator == nullptr) return EndLine(line);
    const uint16_t recorded = RecordedLobType(locator);
    const uint16_t type = recorded == 0 ? static_cast<uint16_t>(element.type) : recorded;
    line.Print();  // the query may run callbacks which print
    LobData data;
    const sword rc = ReadData(locator, type, data);
    if (!Succeeded(rc)) return rc;
    AddData(line, type, data);
    return EndLine(line);
}
