// Bind and define handles: taking over the application's areas, and the attributes of both.
#include "statements/data_area.h"

#include <algorithm>
#include <utility>

#include "handles/environment.h"
#include "handles/errors.h"
#include "statements/bind.h"
#include "statements/define.h"

namespace {

// Of packed decimals; of fractions of seconds and the leading field of an interval.
constexpr std::int16_t kLeastScale = -84;
constexpr std::int16_t kMostScale = 127;
constexpr std::uint64_t kMostDigits = 40;
constexpr std::uint64_t kMostDateDigits = 9;

template <class Handle>
DataArea& AreaOf(Object& object) { return *static_cast<Handle&>(object).area; }

// A member of the area as an attribute.
template <class Handle, auto member>
Status GetArea(Object& object, AttributeValue& value) {
    value.integer = static_cast<std::uint64_t>(AreaOf<Handle>(object).*member);
    return {};
}
template <class Handle, auto member>
Status SetArea(Object& object, const AttributeValue& value) {
    auto& field = AreaOf<Handle>(object).*member;
    field = static_cast<std::remove_reference_t<decltype(field)>>(value.integer);
    return {};
}
template <class Handle, auto member>
constexpr AttributeRow Kept(std::uint32_t attribute, Shape shape) {
    return {attribute, shape, GetArea<Handle, member>, SetArea<Handle, member>};
}

template <class Handle>
Status SetCharacterSet(Object& object, const AttributeValue& value) {
    DataArea& area = AreaOf<Handle>(object);
    return area.UseCharacterSet(static_cast<std::uint16_t>(value.integer), area.character_form);
}
template <class Handle>
Status SetCharacterForm(Object& object, const AttributeValue& value) {
    if (value.integer != SQLCS_IMPLICIT && value.integer != SQLCS_NCHAR) return Error(errors::kBadValue);
    DataArea& area = AreaOf<Handle>(object);
    return area.UseCharacterSet(area.character_set, static_cast<std::uint8_t>(value.integer));
}
template <class Handle>
Status GetScale(Object& object, AttributeValue& value) {
    value.integer = static_cast<std::uint64_t>(AreaOf<Handle>(object).workspace.scale);
    return {};
}
template <class Handle>
Status SetScale(Object& object, const AttributeValue& value) {
    const auto scale = static_cast<std::int16_t>(value.integer);
    if (scale < kLeastScale || scale > kMostScale) return Error(errors::kBadValue);
    AreaOf<Handle>(object).workspace.scale = static_cast<std::int8_t>(scale);
    return {};
}
template <class Handle>
Status GetPrecision(Object& object, AttributeValue& value) {
    value.integer = AreaOf<Handle>(object).workspace.precision;
    return {};
}
template <class Handle>
Status SetPrecision(Object& object, const AttributeValue& value) {
    if (value.integer > kMostDigits) return Error(errors::kBadValue);
    AreaOf<Handle>(object).workspace.precision = static_cast<std::uint8_t>(value.integer);
    return {};
}

template <class Handle, auto member>
Status SetDigits(Object& object, const AttributeValue& value) {
    return value.integer <= kMostDateDigits ? SetArea<Handle, member>(object, value) : Error(errors::kBadValue);
}

Status GetRowsReturned(Object& object, AttributeValue& value) {
    value.integer = static_cast<Bind&>(object).area->rows_returned;
    return {};
}

template <class H>
constexpr AttributeRow kCharCount = Kept<H, &DataArea::character_count>(OCI_ATTR_CHAR_COUNT, Shape::ub4);
template <class H>
constexpr AttributeRow kScale{OCI_ATTR_PDSCL, Shape::ub2, GetScale<H>, SetScale<H>};
template <class H>
constexpr AttributeRow kPrecision{OCI_ATTR_PDPRC, Shape::ub2, GetPrecision<H>, SetPrecision<H>};
template <class H>
constexpr AttributeRow kCharSet{OCI_ATTR_CHARSET_ID, Shape::ub2, GetArea<H, &DataArea::character_set>,
                                SetCharacterSet<H>};
template <class H>
constexpr AttributeRow kCharForm{OCI_ATTR_CHARSET_FORM, Shape::ub1, GetArea<H, &DataArea::character_form>,
                                 SetCharacterForm<H>};
template <class H>
constexpr AttributeRow kMostBytes = Kept<H, &DataArea::most_bytes>(OCI_ATTR_MAXDATA_SIZE, Shape::ub4);
template <class H>
constexpr AttributeRow kMostCharacters = Kept<H, &DataArea::most_characters>(OCI_ATTR_MAXCHAR_SIZE, Shape::ub4);
template <class H>
constexpr AttributeRow kPosition{OCI_ATTR_HANDLE_POSITION, Shape::ub4, GetArea<H, &DataArea::position>, nullptr};

template <class H>
constexpr AttributeRow kFraction{OCI_ATTR_FSPRECISION, Shape::ub1, GetArea<H, &DataArea::fraction_digits>,
                                 SetDigits<H, &DataArea::fraction_digits>};
template <class H>
constexpr AttributeRow kLeading{OCI_ATTR_LFPRECISION, Shape::ub1, GetArea<H, &DataArea::leading_digits>,
                                SetDigits<H, &DataArea::leading_digits>};

// Two numbers mean something else for dates, times and intervals, in another width.
template <bool datetime>
constexpr AttributeRow kDefineRows[] = {
    datetime ? kFraction<Define> : kScale<Define>, datetime ? kLeading<Define> : kPrecision<Define>,
    kCharCount<Define>, kCharSet<Define>, kCharForm<Define>, kMostCharacters<Define>, kPosition<Define>};
template <bool datetime>
constexpr AttributeRow kBindRows[] = {
    datetime ? kFraction<Bind> : kScale<Bind>, datetime ? kLeading<Bind> : kPrecision<Bind>,
    kCharCount<Bind>, kCharSet<Bind>, kCharForm<Bind>, kMostBytes<Bind>, kMostCharacters<Bind>, kPosition<Bind>,
    {OCI_ATTR_ROWS_RETURNED, Shape::ub4, GetRowsReturned, nullptr}};

}  // namespace

DataArea::DataArea(Object& handle, TypeCode handle_type) : handle_type_(handle_type) {
    workspace.environment = &handle.Env();
    workspace.Use(*handle.Env().Sets().text);
    workspace.holder = &handle;
}

Status DataArea::Assign(const AreaArguments& arguments, bool in_pieces) {
    const values::ExternalType* type = nullptr;
    std::uint32_t size = 0;
    const bool may_be_null = handle_type_ == OCI_HTYPE_BIND;
    constexpr sb8 kMost = 0xFFFFFFFF;    // of a value in pieces any limit will do
    const sb8 area = in_pieces ? std::min(arguments.size, kMost) : arguments.size;
    const int error = values::FindType(arguments.type, area, may_be_null, type, size);
    if (type && in_pieces && !type->in_pieces) return Error(errors::kIllegalForPieces);
    if (error != 0) return Error(error);
    type_ = type;
    in_pieces_ = in_pieces;
    callbacks_ = {};
    piece = {};
    elements = {};
    elements.values = static_cast<char*>(arguments.value);
    elements.size = size;
    elements.value_step = size;
    elements.indicators = static_cast<char*>(arguments.indicators);
    elements.lengths = arguments.lengths.array;
    elements.wide_lengths = arguments.lengths.wide;
    if (arguments.lengths.wide) elements.length_step = sizeof(ub4);
    elements.codes = reinterpret_cast<char*>(arguments.codes);
    return {};
}

Status DataArea::SetCallbacks(const Callbacks& callbacks) {
    if (!in_pieces_) return Error(errors::kBadContext);
    callbacks_ = callbacks;
    return {};
}

void DataArea::SetSteps(ub4 value, ub4 indicator, ub4 length, ub4 code) {
    elements.value_step = value;
    elements.indicator_step = indicator;
    elements.length_step = length;
    elements.code_step = code;
}

// A set that the library does not know would come out as something else than it says.
Status DataArea::UseCharacterSet(std::uint16_t id, std::uint8_t form) {
    const Environment::CharacterSets& sets = workspace.environment->Sets();
    const CharacterSet* set = id != 0 ? charset::Find(id) : form == SQLCS_NCHAR ? sets.national : sets.text;
    if (!set) return Error(errors::kBadCharacterSet);
    character_set = id;
    character_form = form;
    workspace.Use(*set);
    return {};
}

std::shared_ptr<StatementShare> DataArea::Owner() const {
    const std::lock_guard lock(owner_mutex_);
    return owner_;
}

void DataArea::SetOwner(std::shared_ptr<StatementShare> owner) noexcept {
    const std::lock_guard lock(owner_mutex_);
    owner_.swap(owner);
}

void ReleaseArea(DataArea& area, const Object& statement) noexcept {
    area.SetOwner(nullptr);
    Object* const handle = area.Handle();
    if (handle && handle->Parent() == &statement) Destroy(handle);
}

std::span<const AttributeRow> Bind::Attributes() const {
    if (area->IsDatetime()) return kBindRows<true>;
    return kBindRows<false>;
}

std::span<const AttributeRow> Define::Attributes() const {
    if (area->IsDatetime()) return kDefineRows<true>;
    return kDefineRows<false>;
}
