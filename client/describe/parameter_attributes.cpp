// Attributes of parameters: one table for all that parameters show. What an object has by its kind, but its engine does
// not know of it (a time of creation, a number), is 24315 as well.
#include <algorithm>
#include <array>
#include <optional>

#include "describe/parameter.h"
#include "handles/attributes.h"
#include "handles/environment.h"
#include "handles/errors.h"
#include "number/number.h"

namespace {

using describe::Shown;

constexpr std::uint32_t kDefaultSize = 4000;    // reported where the engine sets no limit
constexpr std::uint64_t kLongestName = 0xFFFF;
constexpr std::uint16_t kCharacterSetUtf8 = 873;    // what engines keep texts in

const engine::Column& Column(const Parameter& parameter) { return parameter.Node().column; }
const engine::ObjectDescription& Object(const Parameter& parameter) { return parameter.Node().object; }

Status Unknown() { return Error(errors::kUnknownAttribute); }

Status Keep(const Parameter& parameter, std::string_view text, AttributeValue& value) {
    value.text = parameter.Kept(text);
    value.converted = true;
    return {};
}

// ---- Columns

bool IsCharacters(const engine::Column& column) {
    return column.type == SQLT_CHR || column.type == SQLT_AFC || column.type == SQLT_LNG;
}
bool HasCharacterSet(const engine::Column& column) {
    return IsCharacters(column) || column.type == SQLT_CLOB || column.type == SQLT_DBCLOB;
}
bool IsTimestamp(const engine::Column& column) {
    return column.type == SQLT_TIMESTAMP || column.type == SQLT_TIMESTAMP_TZ || column.type == SQLT_TIMESTAMP_LTZ;
}

// What OCI_ATTR_DATA_SIZE and its kin say in two bytes.
std::uint64_t Size(const engine::Column& column) {
    const bool unlimited = column.size == 0 && (IsCharacters(column) || column.type == SQLT_BIN);
    return std::min<std::uint64_t>(unlimited ? kDefaultSize : column.size, kLongestName);
}

Status Name(Parameter& parameter, AttributeValue& value) {
    const bool is_column = parameter.Node().type == OCI_PTYPE_COL;
    const bool is_synonym = parameter.Node().shown == Shown::synonym;    // what it stands for
    const std::string& object = is_synonym ? Object(parameter).target : Object(parameter).name;
    return Keep(parameter, is_column ? Column(parameter).name : object, value);
}
Status SchemaName(Parameter& parameter, AttributeValue& value) {
    return Keep(parameter, Object(parameter).target_schema, value);    // columns have none
}
Status NoText(Parameter&, AttributeValue&) { return {}; }
Status NoPointer(Parameter&, AttributeValue&) { return {}; }
Status Zero(Parameter&, AttributeValue&) { return {}; }

Status DataType(Parameter& parameter, AttributeValue& value) {
    value.integer = Column(parameter).type;
    return {};
}
Status DataSize(Parameter& parameter, AttributeValue& value) {
    value.integer = Size(Column(parameter));
    return {};
}
Status Characters(Parameter& parameter, AttributeValue& value) {
    const engine::Column& column = Column(parameter);
    const std::uint32_t characters = std::min<std::uint32_t>(column.characters, kLongestName);
    value.integer = characters > 0 ? characters : IsCharacters(column) ? Size(column) : 0;
    return {};
}
Status CountsCharacters(Parameter& parameter, AttributeValue& value) {
    value.integer = Column(parameter).characters > 0;
    return {};
}
Status Precision(Parameter& parameter, AttributeValue& value) {
    value.integer = Column(parameter).precision;
    return {};
}
Status Scale(Parameter& parameter, AttributeValue& value) {
    value.integer = static_cast<std::uint64_t>(Column(parameter).scale);
    return {};
}
Status FractionDigits(Parameter& parameter, AttributeValue& value) {
    if (!IsTimestamp(Column(parameter)) && Column(parameter).type != SQLT_INTERVAL_DS) return Unknown();
    return Scale(parameter, value);
}
Status LeadingDigits(Parameter& parameter, AttributeValue& value) {
    const std::uint16_t type = Column(parameter).type;
    return type == SQLT_INTERVAL_DS || type == SQLT_INTERVAL_YM ? Precision(parameter, value) : Unknown();
}
Status IsNullable(Parameter& parameter, AttributeValue& value) {
    value.integer = Column(parameter).nullable;
    return {};
}
// Characters that a value needs when it is shown.
Status DisplaySize(Parameter& parameter, AttributeValue& value) {
    constexpr std::uint64_t kNumber = 40, kDate = 9, kTimestamp = 31, kRowId = 18;
    const engine::Column& column = Column(parameter);
    switch (column.type) {
        case SQLT_NUM:
        case SQLT_BFLOAT:
        case SQLT_BDOUBLE:
        case SQLT_IBFLOAT:
        case SQLT_IBDOUBLE: value.integer = kNumber; break;
        case SQLT_DAT: value.integer = kDate; break;
        case SQLT_TIMESTAMP:
        case SQLT_TIMESTAMP_TZ:
        case SQLT_TIMESTAMP_LTZ: value.integer = kTimestamp; break;
        case SQLT_INTERVAL_YM: value.integer = column.precision + std::uint64_t{4}; break;
        case SQLT_INTERVAL_DS:
            value.integer = column.precision + std::uint64_t{10};
            if (column.scale > 0) value.integer += static_cast<std::uint64_t>(column.scale) + 1;
            break;
        case SQLT_RDD: value.integer = kRowId; break;
        case SQLT_BIN:
        case SQLT_LBI: value.integer = Size(column) * 2; break;
        default: value.integer = Size(column); break;
    }
    return {};
}
Status CharacterForm(Parameter& parameter, AttributeValue& value) {
    const engine::Column& column = Column(parameter);
    const bool national = column.national || column.type == SQLT_DBCLOB;
    if (HasCharacterSet(column)) value.integer = national ? SQLCS_NCHAR : SQLCS_IMPLICIT;
    return {};
}
Status CharacterSet(Parameter& parameter, AttributeValue& value) {
    const bool of_database = parameter.Node().shown == Shown::database;
    if (of_database || HasCharacterSet(Column(parameter))) value.integer = kCharacterSetUtf8;
    return {};
}
Status Position(Parameter& parameter, AttributeValue& value) {
    value.integer = parameter.Node().position;
    return {};
}

// ---- Objects and lists

Status Type(Parameter& parameter, AttributeValue& value) {
    value.integer = parameter.Node().type;
    return {};
}
Status ObjectName(Parameter& parameter, AttributeValue& value) {
    return Keep(parameter, Object(parameter).name, value);
}
Status ObjectSchema(Parameter& parameter, AttributeValue& value) {
    const std::string& schema = Object(parameter).schema;
    return schema.empty() ? Unknown() : Keep(parameter, schema, value);
}
Status ObjectNumber(Parameter& parameter, AttributeValue& value) {
    value.integer = Object(parameter).number;
    return value.integer == 0 ? Unknown() : Status();
}
Status FirstPage(Parameter& parameter, AttributeValue& value) {
    value.integer = Object(parameter).first_page;
    return value.integer == 0 ? Unknown() : Status();
}
Status IsIndexOnly(Parameter& parameter, AttributeValue& value) {
    value.integer = Object(parameter).index_only;
    return {};
}
Status IsTemporary(Parameter& parameter, AttributeValue& value) {
    value.integer = Object(parameter).temporary;
    return {};
}
Status Duration(Parameter& parameter, AttributeValue& value) {
    value.integer = Object(parameter).temporary ? OCI_DURATION_SESSION : OCI_DURATION_NULL;
    return {};
}
Status ColumnCount(Parameter& parameter, AttributeValue& value) {
    value.integer = parameter.Node().list->members.size();
    return {};
}
Status List(Parameter& parameter, AttributeValue& value) {
    value.pointer = parameter.GetList();
    return {};
}
Status MemberCount(Parameter& parameter, AttributeValue& value) {
    value.integer = parameter.Node().members.size();
    return {};
}
Status ListType(Parameter& parameter, AttributeValue& value) {
    value.integer = parameter.Node().list_type;
    return {};
}

// The 22 bytes of a number: the application gets a pointer to them.
Status Number(const Parameter& parameter, std::optional<std::int64_t> integer, AttributeValue& value) {
    if (!integer) return Unknown();
    OCINumber number{};
    number::FromInt64(*integer, &number);
    value.text = parameter.KeptBytes({reinterpret_cast<const char*>(&number), sizeof number});
    value.converted = true;
    return {};
}
template <auto member>
Status Number(Parameter& parameter, AttributeValue& value) {
    return Number(parameter, Object(parameter).*member, value);
}

Status Version(Parameter& parameter, AttributeValue& value) {
    return Keep(parameter, parameter.Node().database.version, value);
}
Status Nowait(Parameter& parameter, AttributeValue& value) {
    value.integer = parameter.Node().database.knows_nowait ? OCI_NW_SUPPORTED : OCI_NW_UNSUPPORTED;
    return {};
}
template <std::uint8_t answer>
Status Answer(Parameter&, AttributeValue& value) {
    value.integer = answer;
    return {};
}

// ---- The table

constexpr std::uint32_t operator|(Shown one, Shown other) {
    return static_cast<std::uint32_t>(one) | static_cast<std::uint32_t>(other);
}
constexpr std::uint32_t operator|(std::uint32_t some, Shown other) { return some | static_cast<std::uint32_t>(other); }

constexpr std::uint32_t kColumns = Shown::selected | Shown::column;
constexpr std::uint32_t kSchemaObjects = Shown::table | Shown::view | Shown::sequence | Shown::synonym;
constexpr std::uint32_t kObjects = kSchemaObjects | Shown::schema | Shown::database | Shown::member;
constexpr std::uint32_t kRelations = Shown::table | Shown::view;

struct ShownRow {
    AttributeRow row;
    std::uint32_t shown;    // that have it
};

template <Status (*function)(Parameter&, AttributeValue&)>
constexpr AttributeRow Row(std::uint32_t attribute, Shape shape) {
    return {attribute, shape, Get<Parameter, function>, nullptr};
}
constexpr std::uint32_t Only(Shown shown) { return static_cast<std::uint32_t>(shown); }

using engine::ObjectDescription;
constexpr ShownRow kAll[] = {
    {Row<Type>(OCI_ATTR_PTYPE, Shape::ub1), kColumns | kObjects | Shown::list},
    {Row<Name>(OCI_ATTR_NAME, Shape::text), kColumns | kObjects},
    {Row<DataType>(OCI_ATTR_DATA_TYPE, Shape::ub2), kColumns},
    {Row<DataSize>(OCI_ATTR_DATA_SIZE, Shape::ub2), kColumns},
    {Row<DisplaySize>(OCI_ATTR_DISP_SIZE, Shape::ub4), kColumns},
    {Row<Precision>(OCI_ATTR_PRECISION, Shape::ub2), Only(Shown::selected)},
    {Row<Precision>(OCI_ATTR_PRECISION, Shape::ub1), Only(Shown::column)},
    {Row<Scale>(OCI_ATTR_SCALE, Shape::ub1), kColumns},
    {Row<FractionDigits>(OCI_ATTR_FSPRECISION, Shape::ub1), kColumns},
    {Row<LeadingDigits>(OCI_ATTR_LFPRECISION, Shape::ub1), kColumns},
    {Row<IsNullable>(OCI_ATTR_IS_NULL, Shape::ub1), kColumns},
    {Row<NoText>(OCI_ATTR_TYPE_NAME, Shape::text), kColumns},
    {Row<SchemaName>(OCI_ATTR_SCHEMA_NAME, Shape::text), kColumns | Shown::synonym},
    {Row<Position>(OCI_ATTR_POSITION, Shape::ub2), kColumns},
    {Row<CountsCharacters>(OCI_ATTR_CHAR_USED, Shape::ub1), kColumns},
    {Row<Characters>(OCI_ATTR_CHAR_SIZE, Shape::ub2), kColumns},
    {Row<CharacterSet>(OCI_ATTR_CHARSET_ID, Shape::ub2), kColumns | Shown::database},
    {Row<CharacterForm>(OCI_ATTR_CHARSET_FORM, Shape::ub1), kColumns},
    {Row<NoPointer>(OCI_ATTR_REF_TDO, Shape::handle), kColumns},    // no column's type is an object's

    {Row<ObjectName>(OCI_ATTR_OBJ_NAME, Shape::text), kObjects},
    {Row<ObjectSchema>(OCI_ATTR_OBJ_SCHEMA, Shape::text), kSchemaObjects | Shown::member},
    {Row<ObjectNumber>(OCI_ATTR_OBJ_ID, Shape::ub4), kSchemaObjects},
    {Row<ObjectNumber>(OCI_ATTR_OBJID, Shape::ub4), kRelations | Shown::sequence},
    {Row<ColumnCount>(OCI_ATTR_NUM_COLS, Shape::ub2), kRelations},
    {Row<List>(OCI_ATTR_LIST_COLUMNS, Shape::handle), kRelations},
    {Row<FirstPage>(OCI_ATTR_RDBA, Shape::ub4), Only(Shown::table)},
    {Row<Zero>(OCI_ATTR_TABLESPACE, Shape::ub4), Only(Shown::table)},    // there is one, the database
    {Row<Zero>(OCI_ATTR_CLUSTERED, Shape::ub1), Only(Shown::table)},
    {Row<Zero>(OCI_ATTR_PARTITIONED, Shape::ub1), Only(Shown::table)},
    {Row<IsIndexOnly>(OCI_ATTR_INDEX_ONLY, Shape::ub1), Only(Shown::table)},
    {Row<IsTemporary>(OCI_ATTR_IS_TEMPORARY, Shape::ub1), Only(Shown::table)},
    {Row<Zero>(OCI_ATTR_IS_TYPED, Shape::ub1), Only(Shown::table)},
    {Row<Duration>(OCI_ATTR_DURATION, Shape::ub2), Only(Shown::table)},

    {Row<Number<&ObjectDescription::sequence_least>>(OCI_ATTR_MIN, Shape::text), Only(Shown::sequence)},
    {Row<Number<&ObjectDescription::sequence_most>>(OCI_ATTR_MAX, Shape::text), Only(Shown::sequence)},
    {Row<Number<&ObjectDescription::sequence_step>>(OCI_ATTR_INCR, Shape::text), Only(Shown::sequence)},
    {Row<Number<&ObjectDescription::sequence_cache>>(OCI_ATTR_CACHE, Shape::text), Only(Shown::sequence)},
    {Row<Number<&ObjectDescription::sequence_mark>>(OCI_ATTR_HW_MARK, Shape::text), Only(Shown::sequence)},
    {Row<Zero>(OCI_ATTR_ORDER, Shape::ub1), Only(Shown::sequence)},    // none is promised
    {Row<NoText>(OCI_ATTR_SUB_NAME, Shape::text), Only(Shown::synonym)},
    {Row<NoText>(OCI_ATTR_LINK, Shape::text), Only(Shown::synonym)},

    {Row<MemberCount>(OCI_ATTR_NUM_PARAMS, Shape::ub2), Only(Shown::list)},
    {Row<ListType>(OCI_ATTR_LTYPE, Shape::ub2), Only(Shown::list)},
    {Row<List>(OCI_ATTR_LIST_OBJECTS, Shape::handle), Only(Shown::schema)},

    {Row<List>(OCI_ATTR_LIST_SCHEMAS, Shape::handle), Only(Shown::database)},
    {Row<Version>(OCI_ATTR_VERSION, Shape::text), Only(Shown::database)},
    {Row<CharacterSet>(OCI_ATTR_NCHARSET_ID, Shape::ub2), Only(Shown::database)},
    {Row<Zero>(OCI_ATTR_MAX_PROC_LEN, Shape::ub4), Only(Shown::database)},      // there are none
    {Row<Zero>(OCI_ATTR_MAX_COLUMN_LEN, Shape::ub4), Only(Shown::database)},    // no limit
    {Row<Answer<OCI_CURSOR_OPEN>>(OCI_ATTR_CURSOR_COMMIT_BEHAVIOR, Shape::ub1), Only(Shown::database)},
    {Row<Zero>(OCI_ATTR_MAX_CATALOG_NAMELEN, Shape::ub1), Only(Shown::database)},    // there are none
    {Row<Answer<OCI_CL_START>>(OCI_ATTR_CATALOG_LOCATION, Shape::ub1), Only(Shown::database)},
    {Row<Answer<OCI_SP_SUPPORTED>>(OCI_ATTR_SAVEPOINT_SUPPORT, Shape::ub1), Only(Shown::database)},
    {Row<Nowait>(OCI_ATTR_NOWAIT_SUPPORT, Shape::ub1), Only(Shown::database)},
    {Row<Answer<OCI_AC_DDL>>(OCI_ATTR_AUTOCOMMIT_DDL, Shape::ub1), Only(Shown::database)},
    {Row<Answer<OCI_LOCK_IMMEDIATE>>(OCI_ATTR_LOCKING_MODE, Shape::ub1), Only(Shown::database)},
};

// The rows of one kind, side by side.
constexpr std::size_t CountOf(Shown shown) {
    return static_cast<std::size_t>(
        std::ranges::count_if(kAll, [shown](const ShownRow& row) { return (row.shown & Only(shown)) != 0; }));
}
template <Shown shown>
constexpr auto kRowsOf = [] {
    std::array<AttributeRow, CountOf(shown)> rows{};
    std::size_t count = 0;
    for (const ShownRow& row : kAll) {
        if (row.shown & Only(shown)) rows[count++] = row.row;
    }
    return rows;
}();

}  // namespace

std::span<const AttributeRow> Parameter::Attributes() const {
    if (!node_) return {};
    switch (node_->shown) {
        case Shown::selected: return kRowsOf<Shown::selected>;
        case Shown::column: return kRowsOf<Shown::column>;
        case Shown::table: return kRowsOf<Shown::table>;
        case Shown::view: return kRowsOf<Shown::view>;
        case Shown::sequence: return kRowsOf<Shown::sequence>;
        case Shown::synonym: return kRowsOf<Shown::synonym>;
        case Shown::schema: return kRowsOf<Shown::schema>;
        case Shown::database: return kRowsOf<Shown::database>;
        case Shown::list: return kRowsOf<Shown::list>;
        case Shown::member: return kRowsOf<Shown::member>;
    }
    return {};
}
