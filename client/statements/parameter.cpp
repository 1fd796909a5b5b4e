// Parameters: the columns of a statement's select list and their attributes.
#include "statements/parameter.h"

#include <algorithm>

#include "handles/attributes.h"
#include "handles/environment.h"
#include "handles/errors.h"
#include "handles/gate.h"
#include "statements/statement.h"

namespace {

constexpr std::uint32_t kDefaultSize = 4000;    // reported where the engine sets no limit
constexpr std::uint64_t kLongestName = 0xFFFF;

bool IsCharacters(const Parameter& parameter) {
    const std::uint16_t type = parameter.column.type;
    return type == SQLT_CHR || type == SQLT_AFC || type == SQLT_LNG;
}

// What OCI_ATTR_DATA_TYPE and its kin say in two bytes.
std::uint64_t Size(const Parameter& parameter) {
    const std::uint32_t size = parameter.column.size;
    const bool unlimited = size == 0 && (IsCharacters(parameter) || parameter.column.type == SQLT_BIN);
    return std::min<std::uint64_t>(unlimited ? kDefaultSize : size, kLongestName);
}

Status Name(Parameter& parameter, AttributeValue& value) {
    if (!parameter.statement) return {};
    const Environment& environment = parameter.Env();
    std::string converted;
    value.text = parameter.statement->KeepName(TextOut(environment, parameter.column.name, converted));
    value.converted = environment.Utf16();
    return {};
}
Status NoText(Parameter&, AttributeValue&) { return {}; }
Status DataType(Parameter& parameter, AttributeValue& value) {
    value.integer = parameter.column.type;
    return {};
}
Status DataSize(Parameter& parameter, AttributeValue& value) {
    value.integer = Size(parameter);
    return {};
}
Status Characters(Parameter& parameter, AttributeValue& value) {
    const std::uint32_t characters = std::min<std::uint32_t>(parameter.column.characters, kLongestName);
    value.integer = characters > 0 ? characters : IsCharacters(parameter) ? Size(parameter) : 0;
    return {};
}
Status CountsCharacters(Parameter& parameter, AttributeValue& value) {
    value.integer = parameter.column.characters > 0;
    return {};
}
Status Precision(Parameter& parameter, AttributeValue& value) {
    value.integer = parameter.column.precision;
    return {};
}
Status Scale(Parameter& parameter, AttributeValue& value) {
    value.integer = static_cast<std::uint64_t>(parameter.column.scale);
    return {};
}
Status IsNullable(Parameter& parameter, AttributeValue& value) {
    value.integer = parameter.column.nullable;
    return {};
}
// Characters that a value needs when it is shown.
Status DisplaySize(Parameter& parameter, AttributeValue& value) {
    constexpr std::uint64_t kNumber = 40, kDate = 9, kTimestamp = 31, kRowId = 18;
    switch (parameter.column.type) {
        case SQLT_NUM:
        case SQLT_IBFLOAT:
        case SQLT_IBDOUBLE: value.integer = kNumber; break;
        case SQLT_DAT: value.integer = kDate; break;
        case SQLT_TIMESTAMP:
        case SQLT_TIMESTAMP_TZ:
        case SQLT_TIMESTAMP_LTZ: value.integer = kTimestamp; break;
        case SQLT_RDD: value.integer = kRowId; break;
        case SQLT_BIN:
        case SQLT_LBI: value.integer = Size(parameter) * 2; break;
        default: value.integer = Size(parameter); break;
    }
    return {};
}
Status ParameterType(Parameter&, AttributeValue& value) {
    value.integer = OCI_PTYPE_COL;
    return {};
}
Status NoFlag(Parameter&, AttributeValue& value) {
    value.integer = 0;
    return {};
}
Status CharacterForm(Parameter& parameter, AttributeValue& value) {
    value.integer = IsCharacters(parameter) || parameter.column.type == SQLT_CLOB ? SQLCS_IMPLICIT : 0;
    return {};
}

Status Position(Parameter& parameter, AttributeValue& value) {
    value.integer = parameter.position;
    return {};
}

template <Status (*function)(Parameter&, AttributeValue&)>
constexpr auto kGet = Get<Parameter, function>;

constexpr AttributeRow kRows[] = {
    {OCI_ATTR_NAME, Shape::text, kGet<Name>, nullptr},
    {OCI_ATTR_DATA_TYPE, Shape::ub2, kGet<DataType>, nullptr},
    {OCI_ATTR_DATA_SIZE, Shape::ub2, kGet<DataSize>, nullptr},
    {OCI_ATTR_DISP_SIZE, Shape::ub4, kGet<DisplaySize>, nullptr},
    {OCI_ATTR_PRECISION, Shape::ub2, kGet<Precision>, nullptr},
    {OCI_ATTR_SCALE, Shape::ub1, kGet<Scale>, nullptr},
    {OCI_ATTR_IS_NULL, Shape::ub1, kGet<IsNullable>, nullptr},
    {OCI_ATTR_TYPE_NAME, Shape::text, kGet<NoText>, nullptr},
    {OCI_ATTR_SCHEMA_NAME, Shape::text, kGet<NoText>, nullptr},
    {OCI_ATTR_POSITION, Shape::ub2, kGet<Position>, nullptr},
    {OCI_ATTR_PTYPE, Shape::ub1, kGet<ParameterType>, nullptr},
    {OCI_ATTR_CHAR_USED, Shape::ub1, kGet<CountsCharacters>, nullptr},
    {OCI_ATTR_CHAR_SIZE, Shape::ub2, kGet<Characters>, nullptr},
    {OCI_ATTR_CHARSET_ID, Shape::ub2, kGet<NoFlag>, nullptr},
    {OCI_ATTR_CHARSET_FORM, Shape::ub1, kGet<CharacterForm>, nullptr},
};

}  // namespace

std::span<const AttributeRow> Parameter::Attributes() const { return kRows; }

std::shared_ptr<std::recursive_mutex> Parameter::Serial() {
    return statement ? statement->Serial() : nullptr;
}

// One descriptor a position: handed out again and brought up to date, so that asking often leaves nothing behind.
Status Statement::GetParameter(ub4 position, dvoid** out) {
    const std::vector<engine::Column>* columns = Columns();
    if (!columns || position == 0 || position > columns->size()) return Error(errors::kNoParameter);
    if (!out) return Error(errors::kNullArgument);
    if (parameters_.size() < position) parameters_.resize(position);
    Parameter* parameter = Live<Parameter>(parameters_[position - 1]);
    const bool is_ours = parameter && parameter->Parent() == this && parameter->position == position;
    if (!is_ours) {    // none yet, or freed since
        parameter = Create<Parameter>(*this, OCI_DTYPE_PARAM, 0, Share(), position);
        parameters_[position - 1] = parameter;
        columns = Columns();    // a memory function may have prepared anew
        if (!columns || position > columns->size()) return Error(errors::kNoParameter);
    }
    parameter->column = (*columns)[position - 1];
    *out = parameter;
    return {};
}
