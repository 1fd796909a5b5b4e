// Intervals in elements: descriptors, and the text that stands for an interval at the door, "+02-03" or
// "+01 02:03:04.500000", as exact as the interval is.
#include "date/interval_descriptor.h"
#include "handles/errors.h"
#include "values/in_rows.h"
#include "values/out_rows.h"

namespace values {
namespace {

using engine::Datum;

IntervalPlace* PlaceAt(const char* at) {
    void* pointer;
    std::memcpy(&pointer, at, sizeof pointer);
    return FindInterval(pointer);
}

template <date::Span span>
int PutInterval(const Datum& datum, Workspace&, Target& target) {
    IntervalPlace* const place = PlaceAt(target.at);
    if (!place) return errors::kBadObject;
    if (place->span != span) return errors::kInconsistentTypes;
    date::Interval value;
    if (const int error = date::FromText(datum.Text(), span, &value)) return error;
    place->value = value;
    target.stored = sizeof(void*);
    return 0;
}

template <date::Span span>
int FromInterval(const Source& source, Workspace& workspace, Datum& datum) {
    static_assert(date::kMaxIntervalText <= std::tuple_size_v<decltype(Workspace::small)>);
    const IntervalPlace* const place = PlaceAt(source.at);
    if (!place) return errors::kBadObject;
    if (place->span != span) return errors::kInconsistentTypes;
    if (!place->value) return errors::kBadInterval;
    const unsigned fraction = place->value->nanosecond % 1000 == 0 ? 6 : 9;
    std::size_t length = 0;
    const int error = date::ToText(*place->value, date::LeadingDigits(*place->value), fraction, workspace.small.data(), &length);
    datum.kind = engine::Kind::text;
    datum.length = static_cast<std::uint32_t>(length);
    datum.data = workspace.small.data();
    return error;
}

template <auto put>
constexpr ByOrigin<OutConverter> kIntervalRow = {
    NoConversion, NoConversion, NoConversion, NoConversion, put, NoConversion, NoConversion, NoConversion, NoConversion,
    NoConversion, NoConversion, NoConversion, NoConversion, NoConversion};

}  // namespace

const ByOrigin<OutConverter> kToYearMonth = kIntervalRow<PutInterval<date::Span::year_month>>;
const ByOrigin<OutConverter> kToDaySecond = kIntervalRow<PutInterval<date::Span::day_second>>;

int FromYearMonth(const Source& source, Workspace& workspace, Datum& datum) {
    return FromInterval<date::Span::year_month>(source, workspace, datum);
}
int FromDaySecond(const Source& source, Workspace& workspace, Datum& datum) {
    return FromInterval<date::Span::day_second>(source, workspace, datum);
}

}  // namespace values
