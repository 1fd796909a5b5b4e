// Parameter descriptors: the description of one column of a select list, a copy that outlives the statement's text.
#pragma once

#include "engine/engine.h"
#include "handles/object.h"
#include "statements/statement.h"

class Parameter : public Object {
public:
    static constexpr Kind kKind = Kind::parameter;
    explicit Parameter(const Origin& origin) : Object(origin) {}
    ~Parameter() override;
    [[nodiscard]] std::span<const AttributeRow> Attributes() const override;
    [[nodiscard]] std::shared_ptr<std::recursive_mutex> Serial() override;

    engine::Column column;
    std::uint32_t position = 0;        // from 1
    Statement* statement = nullptr;    // that hands this descriptor out again for the same position
};
