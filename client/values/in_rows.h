// The converters from the application's elements to engine values, by external type.
#pragma once

#include "date/date.h"
#include "values/conversion.h"

namespace values {

int FromChr(const Source&, Workspace&, engine::Datum&);
int FromStr(const Source&, Workspace&, engine::Datum&);
int FromPrefix2(const Source&, Workspace&, engine::Datum&);
int FromPrefix4(const Source&, Workspace&, engine::Datum&);
int FromBin(const Source&, Workspace&, engine::Datum&);
int FromVbi(const Source&, Workspace&, engine::Datum&);
int FromInt(const Source&, Workspace&, engine::Datum&);
int FromUin(const Source&, Workspace&, engine::Datum&);
int FromFlt(const Source&, Workspace&, engine::Datum&);
int FromNum(const Source&, Workspace&, engine::Datum&);
int FromPdn(const Source&, Workspace&, engine::Datum&);
int FromDecimal64(const Source&, Workspace&, engine::Datum&);
int FromDecimal128(const Source&, Workspace&, engine::Datum&);
int FromDat(const Source&, Workspace&, engine::Datum&);
int FromOdt(const Source&, Workspace&, engine::Datum&);
int FromRid(const Source&, Workspace&, engine::Datum&);
int FromString(const Source&, Workspace&, engine::Datum&);      // OCIString*
int FromRaw(const Source&, Workspace&, engine::Datum&);         // OCIRaw*
int FromDatetime(const Source&, Workspace&, engine::Datum&);    // OCIDateTime*
int FromYearMonth(const Source&, Workspace&, engine::Datum&);   // OCIInterval*
int FromDaySecond(const Source&, Workspace&, engine::Datum&);
int FromRdd(const Source&, Workspace&, engine::Datum&);         // OCIRowid*
int FromClob(const Source&, Workspace&, engine::Datum&);        // OCILobLocator*
int FromBlob(const Source&, Workspace&, engine::Datum&);
int FromNull(const Source&, Workspace&, engine::Datum&);        // null, whatever stands there
int FromNothing(const Source&, Workspace&, engine::Datum&);     // no conversion: 932

// A text that is compared with row ids becomes one, in the workspace.
int RowIdFromText(Workspace&, engine::Datum&);

// A date in the workspace.
void SetTimestamp(const date::DateTime& value, Workspace&, engine::Datum&);

// A whole value that came in pieces; data must live until the Datum is used.
// Where the zero of a text of a terminated type stands, else its end.
std::size_t EndOfText(std::string_view bytes, bool utf16);
int FromWholeText(std::string_view data, Workspace&, engine::Datum&);
int FromWholeBytes(std::string_view data, Workspace&, engine::Datum&);

}  // namespace values
