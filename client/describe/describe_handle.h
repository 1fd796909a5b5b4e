// Describe handles: the description of one object at a time. Its parameters hang below the description, which goes with
// the handle, or when the handle is used to describe again.
//
// Threads: calls on the handle and on its parameters take turns by the handle's own serial lock; no other is taken
// while it is held.
#pragma once

#include <cstdint>
#include <memory>
#include <mutex>

#include "describe/node.h"
#include "describe/parameter.h"
#include "handles/object.h"
#include "handles/status.h"

class DescribeHandle : public Object {
public:
    static constexpr Kind kKind = Kind::describe;
    explicit DescribeHandle(const Origin& origin);
    [[nodiscard]] std::span<const AttributeRow> Attributes() const override;
    [[nodiscard]] std::shared_ptr<std::recursive_mutex> Serial() override { return source_->Serial(); }

    // Shows what was described from now on; null: nothing. The parameters that were handed out before go.
    void Show(std::shared_ptr<const describe::Node> root);
    [[nodiscard]] bool Shows() const { return description_ != nullptr; }
    // The root parameter, at position 1: 24334 for any other, and where nothing is shown.
    Status GetParameter(std::uint32_t position, void** out);

    // Kept for the application, without effect here: no engine has public synonyms.
    std::int32_t looks_for_public = 0;
    std::uint8_t wants_synonym_base = 0;

private:
    class Description;
    const std::shared_ptr<ParameterSource> source_;
    Description* description_ = nullptr;    // a child that nobody is given; null: nothing was described
};
