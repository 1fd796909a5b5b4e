// Putting together what was described: an object, its list, and the members of the list.
#include "describe/node.h"

#include <utility>

namespace describe {
namespace {

struct KindRow {
    engine::ObjectKind kind;
    Shown shown;
    std::uint8_t type;
};
constexpr KindRow kKinds[] = {
    {engine::ObjectKind::any, Shown::member, OCI_PTYPE_UNK},
    {engine::ObjectKind::table, Shown::table, OCI_PTYPE_TABLE},
    {engine::ObjectKind::view, Shown::view, OCI_PTYPE_VIEW},
    {engine::ObjectKind::sequence, Shown::sequence, OCI_PTYPE_SEQ},
    {engine::ObjectKind::synonym, Shown::synonym, OCI_PTYPE_SYN},
    {engine::ObjectKind::schema, Shown::schema, OCI_PTYPE_SCHEMA},
    {engine::ObjectKind::database, Shown::database, OCI_PTYPE_DATABASE},
};

const KindRow& RowOf(engine::ObjectKind kind) {
    for (const KindRow& row : kKinds) {
        if (row.kind == kind) return row;
    }
    return kKinds[0];
}

std::shared_ptr<Node> List(std::uint16_t type, std::uint32_t first) {
    auto list = std::make_shared<Node>();
    list->shown = Shown::list;
    list->type = OCI_PTYPE_LIST;
    list->list_type = type;
    list->first = first;
    return list;
}

std::shared_ptr<const Node> Columns(std::vector<engine::Column> columns) {
    auto list = List(OCI_LTYPE_COLUMN, 1);
    for (engine::Column& column : columns) {
        auto node = std::make_shared<Node>();
        node->shown = Shown::column;
        node->column = std::move(column);
        node->position = static_cast<std::uint32_t>(list->members.size() + 1);
        list->members.push_back(std::move(node));
    }
    return list;
}

// Of a schema's objects the engine tells the kinds; the database's members are schemas.
std::shared_ptr<const Node> Members(engine::ObjectDescription& object) {
    const bool of_schema = object.kind == engine::ObjectKind::schema;
    auto list = List(of_schema ? OCI_LTYPE_SCH_OBJ : OCI_LTYPE_DB_SCH, 0);
    for (std::size_t index = 0; index < object.members.size(); ++index) {
        auto node = std::make_shared<Node>();
        node->shown = Shown::member;
        node->object.kind = of_schema ? object.member_kinds[index] : engine::ObjectKind::schema;
        if (of_schema) node->object.schema = object.name;
        node->object.name = std::move(object.members[index]);
        node->type = RowOf(node->object.kind).type;
        list->members.push_back(std::move(node));
    }
    return list;
}

}  // namespace

std::shared_ptr<const Node> SelectedColumn(const engine::Column& column, std::uint32_t position) {
    auto node = std::make_shared<Node>();
    node->column = column;
    node->position = position;
    return node;
}

std::shared_ptr<const Node> DescribedObject(engine::ObjectDescription object, DatabaseFacts facts) {
    auto node = std::make_shared<Node>();
    const KindRow& row = RowOf(object.kind);
    node->shown = row.shown;
    node->type = row.type;
    node->database = std::move(facts);
    switch (object.kind) {
        case engine::ObjectKind::table:
        case engine::ObjectKind::view: node->list = Columns(std::move(object.columns)); break;
        case engine::ObjectKind::schema:
        case engine::ObjectKind::database: node->list = Members(object); break;
        default: break;
    }
    node->object = std::move(object);
    return node;
}

}  // namespace describe
