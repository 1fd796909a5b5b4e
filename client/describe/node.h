// What a parameter shows: a column, a list, or an object of the database. Made by the call that describes, and never
// changed afterwards: any thread may read it.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "engine/engine.h"
#include "oci.h"

namespace describe {

// Which attributes there are follows from what is shown, and from the way that led there.
enum class Shown : std::uint16_t {
    selected = 1,    // a column of a select list
    column = 2,      // a column of a described object
    table = 4, view = 8, sequence = 16, synonym = 32, schema = 64, database = 128,
    list = 256,
    member = 512     // an object in a list: of what kind it is and what it is called
};

// What is told of a database besides what is in it.
struct DatabaseFacts {
    std::string version;
    bool knows_nowait = false;    // "for update nowait" is more than words
};

struct Node {
    Shown shown = Shown::selected;
    std::uint8_t type = OCI_PTYPE_COL;    // OCI_PTYPE_*
    engine::Column column;                // of columns
    std::uint32_t position = 0;           // of columns, from 1
    engine::ObjectDescription object;     // of objects, without its columns and members
    DatabaseFacts database;               // of the database
    std::shared_ptr<const Node> list;     // of objects: their columns, objects or schemas; null: none are known
    std::uint16_t list_type = OCI_LTYPE_UNK;             // of lists, as what follows
    std::uint32_t first = 1;                             // the position of the first member
    std::vector<std::shared_ptr<const Node>> members;
};

std::shared_ptr<const Node> SelectedColumn(const engine::Column& column, std::uint32_t position);
// An object with the lists below it.
std::shared_ptr<const Node> DescribedObject(engine::ObjectDescription object, DatabaseFacts facts);

}  // namespace describe
