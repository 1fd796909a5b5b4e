// The rows of the conversion matrix from the engine to the application: by external type, a converter for each origin.
#pragma once

#include "date/date.h"
#include "values/conversion.h"

namespace values {

extern const ByOrigin<OutConverter> kToChr, kToStr, kToAfc, kToPrefix2, kToPrefix4, kToString;    // text
extern const ByOrigin<OutConverter> kToBin, kToVbi, kToRaw;                                       // bytes
extern const ByOrigin<OutConverter> kToNum, kToPdn, kToDecimal64, kToDecimal128;                  // numbers
extern const ByOrigin<OutConverter> kToInt, kToUin, kToFlt;
extern const ByOrigin<OutConverter> kToDat, kToOdt, kToDatetime;                                  // dates
extern const ByOrigin<OutConverter> kToYearMonth, kToDaySecond;                                   // intervals
extern const ByOrigin<OutConverter> kToRid, kToRdd;                                               // row ids
extern const ByOrigin<OutConverter> kToClob, kToDbclob, kToBlob;                                  // locators
extern const ByOrigin<OutConverter> kToNothing;                                                   // no conversion: 932

extern const ByOrigin<Renderer> kWholeText, kWholeBytes;

// Into the objects that elements point to.
int PutString(std::string_view utf8, Workspace&, Target&);
int PutRaw(std::string_view bytes, Workspace&, Target&);
int PutDatetime(const date::DateTime& value, Workspace&, Target&);

int NoConversion(const engine::Datum&, Workspace&, Target&);

// A row made of one way to put a value of the intermediate form into an element, after each way to get that form.
template <class Form, auto render, auto put>
int Through(const engine::Datum& datum, Workspace& workspace, Target& target) {
    Form form{};
    if (const int error = render(datum, workspace, form)) return error;
    return put(form, workspace, target);
}

}  // namespace values
