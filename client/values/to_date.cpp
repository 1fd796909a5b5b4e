// Engine values as dates: the seven bytes, the OCIDate structure, datetime descriptors.
#include "date/date.h"
#include "date/format.h"
#include "oci.h"
#include "values/out_rows.h"

namespace values {
namespace {

using engine::Datum;

int OwnDate(const Datum& datum, Workspace&, date::DateTime& value) {
    value = datum.Timestamp();
    return 0;
}

// The engines' form; character data may also be in the default model of dates.
int DateOfText(const Datum& datum, Workspace&, date::DateTime& value) {
    if (date::FromEngineText(datum.Text(), &value) == 0) return 0;
    return date::FromText(datum.Text(), date::kDateModel, date::kEnglish, date::Scope::date, &value);
}

int PutDat(const date::DateTime& value, Workspace&, Target& target) {
    date::ToBytes(value, reinterpret_cast<std::uint8_t*>(target.at));
    target.stored = date::kDateBytes;
    return 0;
}

int PutOdt(const date::DateTime& value, Workspace&, Target& target) {
    OCIDate date{};
    date::ToOciDate(value, &date);
    std::memcpy(target.at, &date, sizeof date);
    target.stored = sizeof date;
    return 0;
}

template <auto put>
constexpr ByOrigin<OutConverter> kDateRow = {
    NoConversion, NoConversion, NoConversion, NoConversion, Through<date::DateTime, DateOfText, put>, NoConversion,
    Through<date::DateTime, OwnDate, put>, NoConversion, NoConversion, NoConversion, NoConversion, NoConversion,
    NoConversion, Through<date::DateTime, DateOfText, put>};

}  // namespace

const ByOrigin<OutConverter> kToDat = kDateRow<PutDat>;
const ByOrigin<OutConverter> kToOdt = kDateRow<PutOdt>;
const ByOrigin<OutConverter> kToDatetime = kDateRow<PutDatetime>;

}  // namespace values
