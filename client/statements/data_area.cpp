// Bind and define handles: taking over the application's areas, and the attributes of both.
#include "statements/data_area.h"

#include "handles/attributes.h"
#include "handles/environment.h"
#include "handles/errors.h"
#include "statements/bind.h"
#include "statements/define.h"
#include "statements/statement.h"

namespace {

constexpr std::uint16_t kUtf16CharacterSet = OCI_UTF16ID;

Status SetCharacterSet(DataArea& area, const AttributeValue& value) {
    area.UseCharacterSet(static_cast<std::uint16_t>(value.integer));
    return {};
}

Status GetScale(DataArea& area, AttributeValue& value) {
    value.integer = static_cast<std::uint64_t>(area.workspace.scale);
    return {};
}
Status SetScale(DataArea& area, const AttributeValue& value) {
    area.workspace.scale = static_cast<std::int8_t>(value.integer);
    return {};
}
Status GetPrecision(DataArea& area, AttributeValue& value) {
    value.integer = area.workspace.precision;
    return {};
}
Status SetPrecision(DataArea& area, const AttributeValue& value) {
    area.workspace.precision = static_cast<std::uint8_t>(value.integer);
    return {};
}

constexpr AttributeRow kCharCount{OCI_ATTR_CHAR_COUNT, Shape::ub4, GetField<&DataArea::character_count>,
                                  SetField<&DataArea::character_count>};
constexpr AttributeRow kScale{OCI_ATTR_PDSCL, Shape::ub2, Get<DataArea, GetScale>, Set<DataArea, SetScale>};
constexpr AttributeRow kPrecision{OCI_ATTR_PDPRC, Shape::ub2, Get<DataArea, GetPrecision>, Set<DataArea, SetPrecision>};
constexpr AttributeRow kCharSet{OCI_ATTR_CHARSET_ID, Shape::ub2, GetField<&DataArea::character_set>,
                                Set<DataArea, SetCharacterSet>};
constexpr AttributeRow kCharForm{OCI_ATTR_CHARSET_FORM, Shape::ub1, GetField<&DataArea::character_form>,
                                 SetField<&DataArea::character_form>};
constexpr AttributeRow kMostBytes{OCI_ATTR_MAXDATA_SIZE, Shape::ub4, GetField<&DataArea::most_bytes>,
                                  SetField<&DataArea::most_bytes>};
constexpr AttributeRow kMostCharacters{OCI_ATTR_MAXCHAR_SIZE, Shape::ub4, GetField<&DataArea::most_characters>,
                                       SetField<&DataArea::most_characters>};
constexpr AttributeRow kPosition{OCI_ATTR_HANDLE_POSITION, Shape::ub4, GetField<&DataArea::position>, nullptr};

constexpr AttributeRow kDefineRows[] = {kCharCount, kScale, kPrecision, kCharSet, kCharForm, kMostCharacters,
                                        kPosition};
constexpr AttributeRow kBindRows[] = {
    kCharCount, kScale, kPrecision, kCharSet, kCharForm, kMostBytes, kMostCharacters, kPosition,
    {OCI_ATTR_ROWS_RETURNED, Shape::ub4, GetField<&Bind::rows_returned>, nullptr}};

}  // namespace

DataArea::DataArea(const Origin& origin) : Object(origin) {
    workspace.environment = &Env();
    workspace.utf16 = Env().Utf16();
}

Status DataArea::Assign(const AreaArguments& arguments, bool in_pieces) {
    const values::ExternalType* type = values::FindType(arguments.type);
    if (!type) return Error(errors::kUnknownType);
    if (in_pieces && !type->in_pieces) return Error(errors::kIllegalForPieces);
    std::uint32_t size = 0;
    if (const int error = values::CheckSize(*type, arguments.size, size)) return Error(error);
    type_ = type;
    in_pieces_ = in_pieces;
    piece = {};
    elements = {};
    elements.values = static_cast<char*>(arguments.value);
    elements.size = size;
    elements.value_step = size;
    elements.indicators = static_cast<char*>(arguments.indicators);
    elements.lengths = reinterpret_cast<char*>(arguments.lengths);
    elements.codes = reinterpret_cast<char*>(arguments.codes);
    return {};
}

void DataArea::SetSteps(ub4 value, ub4 indicator, ub4 length, ub4 code) {
    elements.value_step = value;
    elements.indicator_step = indicator;
    elements.length_step = length;
    elements.code_step = code;
}

void DataArea::UseCharacterSet(std::uint16_t id) {
    character_set = id;
    workspace.utf16 = id == 0 ? Env().Utf16() : id == kUtf16CharacterSet;
}

std::shared_ptr<std::recursive_mutex> DataArea::Serial() { return statement ? statement->Serial() : nullptr; }

Bind::~Bind() { if (statement) statement->Forget(*this); }

std::span<const AttributeRow> Bind::Attributes() const { return kBindRows; }

Define::~Define() { if (statement) statement->Forget(*this); }

std::span<const AttributeRow> Define::Attributes() const { return kDefineRows; }
