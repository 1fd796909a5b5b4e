// Parameter descriptors: the description of one column of a select list, a copy that outlives the statement's text. The
// names that it shows are the statement's: they stay where they are as long as the statement lives.
//
// Threads: calls hold the statement's serial lock.
#pragma once

#include <memory>
#include <utility>

#include "engine/engine.h"
#include "handles/object.h"
#include "statements/share.h"

class Parameter : public Object {
public:
    static constexpr Kind kKind = Kind::parameter;
    explicit Parameter(const Origin& origin, std::shared_ptr<StatementShare> of_statement = nullptr,
                       std::uint32_t of_position = 0)
        : Object(origin), position(of_position), statement(std::move(of_statement)) {}
    [[nodiscard]] std::span<const AttributeRow> Attributes() const override;
    [[nodiscard]] std::shared_ptr<std::recursive_mutex> Serial() override;

    engine::Column column;
    const std::uint32_t position;                       // from 1
    const std::shared_ptr<StatementShare> statement;    // null for one that the application allocated
};
