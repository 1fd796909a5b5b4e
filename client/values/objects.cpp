// Row ids, and elements that point to objects of the library: strings, raws, datetime and row-id descriptors. A null
// element of a string or raw gets an object of its own on the way out; descriptors are the application's to make.
#include "date/descriptor.h"
#include "handles/environment.h"
#include "handles/errors.h"
#include "text/variable.h"
#include "values/in_rows.h"
#include "values/out_rows.h"
#include "values/rowid.h"
#include "values/rowid_descriptor.h"

namespace values {
namespace {

using engine::Datum;
using engine::Kind;
using View = std::string_view;

void* PointerAt(const char* at) {
    void* pointer;
    std::memcpy(&pointer, at, sizeof pointer);
    return pointer;
}

template <class T>
int PutVariable(View content, Workspace& workspace, Target& target) {
    void* pointer = PointerAt(target.at);
    T* value = pointer ? Live<T>(pointer) : Create<T>(*workspace.environment, 0, 0);
    if (!value) return errors::kBadObject;
    const bool fits = value->Assign(content).Ok();
    if (live::KindOf(workspace.holder) == ::Kind::none) return kPlaceGone;
    if (!fits) return errors::kLengthPastArea;
    pointer = value;
    std::memcpy(target.at, &pointer, sizeof pointer);
    target.stored = sizeof pointer;
    return 0;
}

template <class T>
int FromVariable(const Source& source, Workspace& workspace, Datum& datum,
                 int (*convert)(View, Workspace&, Datum&)) {
    const void* pointer = PointerAt(source.at);
    if (!pointer) return 0;
    const T* value = Live<T>(pointer);
    return value ? convert(value->View(), workspace, datum) : errors::kBadObject;
}

int RowIdOfDatum(const Datum& datum, Workspace&, rowid::RowId& value) {
    value = rowid::FromBytes(datum.Row().bytes.data());
    return 0;
}
int RowIdOfText(const Datum& datum, Workspace&, rowid::RowId& value) {
    return rowid::FromText(datum.Text(), &value) ? 0 : errors::kInvalidRowId;
}
int PutRid(const rowid::RowId& value, Workspace&, Target& target) {
    target.stored = rowid::kByteLength;
    return rowid::ToBytes(value, reinterpret_cast<std::uint8_t*>(target.at)) ? 0 : errors::kInvalidRowId;
}

int PutRdd(const rowid::RowId& value, Workspace&, Target& target) {
    auto* descriptor = Live<RowIdDescriptor>(PointerAt(target.at));
    if (!descriptor) return errors::kBadObject;
    descriptor->value = value;
    target.stored = sizeof(void*);
    return 0;
}

// 1410 for a row id that no row of an engine can have.
int SetRowId(const rowid::RowId& value, Workspace& workspace, Datum& datum) {
    engine::RowId row;
    if (!rowid::ToBytes(value, row.bytes.data())) return errors::kInvalidRowId;
    std::memcpy(workspace.small.data(), &row, sizeof row);
    datum.kind = Kind::row_id;
    datum.length = sizeof row;
    datum.data = workspace.small.data();
    return 0;
}

template <auto put>
constexpr ByOrigin<OutConverter> kRowIdRow = {
    NoConversion, NoConversion, NoConversion, NoConversion, Through<rowid::RowId, RowIdOfText, put>, NoConversion,
    NoConversion, NoConversion, Through<rowid::RowId, RowIdOfDatum, put>, NoConversion, NoConversion,
    NoConversion, NoConversion, NoConversion};

}  // namespace

const ByOrigin<OutConverter> kToRid = kRowIdRow<PutRid>;
const ByOrigin<OutConverter> kToRdd = kRowIdRow<PutRdd>;
int PutString(View utf8, Workspace& workspace, Target& target) {
    View text;
    if (const int error = ToApplication(utf8, workspace, text)) return error;
    return PutVariable<String>(text, workspace, target);
}
int PutRaw(View bytes, Workspace& workspace, Target& target) { return PutVariable<Raw>(bytes, workspace, target); }

int FromString(const Source& source, Workspace& workspace, Datum& datum) {
    return FromVariable<String>(source, workspace, datum, FromWholeText);
}
int FromRaw(const Source& source, Workspace& workspace, Datum& datum) {
    return FromVariable<Raw>(source, workspace, datum, FromWholeBytes);
}

int PutDatetime(const date::DateTime& value, Workspace&, Target& target) {
    auto* descriptor = Live<DateTimeDescriptor>(PointerAt(target.at));
    if (!descriptor) return errors::kBadObject;
    target.stored = sizeof(void*);
    return descriptor->Store(value).Number();
}

// A descriptor without a date holds the time alone.
int FromDatetime(const Source& source, Workspace& workspace, Datum& datum) {
    const auto* descriptor = Live<DateTimeDescriptor>(PointerAt(source.at));
    if (!descriptor) return errors::kBadObject;
    if (!descriptor->IsSet()) return errors::kInvalidDateTime;
    SetTimestamp(descriptor->Value(), workspace, datum);
    return 0;
}

int FromRid(const Source& source, Workspace& workspace, Datum& datum) {
    return SetRowId(rowid::FromBytes(reinterpret_cast<const std::uint8_t*>(source.at)), workspace, datum);
}

int FromRdd(const Source& source, Workspace& workspace, Datum& datum) {
    const auto* descriptor = Live<RowIdDescriptor>(PointerAt(source.at));
    if (!descriptor) return errors::kBadObject;
    if (!descriptor->value) return errors::kInvalidRowId;
    return SetRowId(*descriptor->value, workspace, datum);
}

int RowIdFromText(Workspace& workspace, Datum& datum) {
    rowid::RowId value;
    if (!rowid::FromText(datum.Text(), &value)) return errors::kInvalidRowId;
    return SetRowId(value, workspace, datum);
}

}  // namespace values
