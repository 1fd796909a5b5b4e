// Row id descriptors: empty until a fetch or an attribute puts a row id into them.
#pragma once

#include <optional>

#include "handles/object.h"
#include "values/rowid.h"

class RowIdDescriptor : public Object {
public:
    static constexpr Kind kKind = Kind::row_id;
    explicit RowIdDescriptor(const Origin& origin) : Object(origin) {}

    std::optional<rowid::RowId> value;
};
