// Dates and datetimes, as elements and by themselves. Command thread only.
#include "core/state.h"
#include "objects/displays.h"
#include "objects/element_access.h"
#include "platform/client_library.h"

namespace {

sword AddDate(Line& line, const OCIDate& date) {
    const OCITime& time = date.OCIDateTime;
    line.Format("%04d-%02d-%02d-%02d:%02d:%02d\n", date.OCIDateYYYY, date.OCIDateMM, date.OCIDateDD, time.OCITimeHH,
                time.OCITimeMI, time.OCITimeSS);
    constexpr int kLastSecond = 60;  // a leap second is accepted
    if (time.OCITimeSS > kLastSecond) line.Format("Invalid OCITimeSS - %d\n", time.OCITimeSS);
    return OCI_SUCCESS;
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
    return EndLine(line);
}

}  // namespace

sword ShowSevenByteDate(Line& line, const ElementView& element) {
    SevenByteDate date;
    if (!date.Read(element.data, element.size)) return EndLine(line.Text("Invalid date found"));
    line.Format("\"%04d-%02d-%02d-%02d:%02d:%02d\"", date.year, date.month, date.day, date.hour, date.minute,
                date.second);
    return EndLine(line);
}

sword ShowDate(Line& line, const ElementView& element) {
    return AddDate(line, ReadElement<OCIDate>(element.data, element.size));
}

sword ShowDateTime(Line& line, const ElementView& element) {
    return AddDateTime(line, ReadElement<OCIDateTime*>(element.data, element.size), "\"");
}

void PrintDate(const OCIDate& date) {
    Line line;
    AddDate(line, date);
    line.Print();
}

sword PrintDateTime(OCIDateTime* datetime) {
    Line line;
    const sword rc = AddDateTime(line, datetime, "");
    if (!line.Empty()) line.Print();
    return rc;
}
