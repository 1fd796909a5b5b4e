// Describe handles: their description and their attributes.
#include "describe/describe_handle.h"

#include <utility>

#include "handles/attributes.h"
#include "handles/environment.h"
#include "handles/errors.h"

namespace {

class Source : public ParameterSource {
public:
    explicit Source(bool threaded) : serial_(threaded ? std::make_shared<std::recursive_mutex>() : nullptr) {}
    [[nodiscard]] std::shared_ptr<std::recursive_mutex> Serial() const override { return serial_; }

private:
    const std::shared_ptr<std::recursive_mutex> serial_;
};

Status GetRoot(DescribeHandle& handle, AttributeValue& value) { return handle.GetParameter(1, &value.pointer); }

Status CountRoots(DescribeHandle& handle, AttributeValue& value) {
    value.integer = handle.Shows() ? 1 : 0;
    return {};
}

using D = DescribeHandle;
constexpr AttributeRow kRows[] = {
    {OCI_ATTR_PARAM, Shape::handle, Get<D, GetRoot>, nullptr},
    {OCI_ATTR_PARAM_COUNT, Shape::ub4, Get<D, CountRoots>, nullptr},
    {OCI_ATTR_DESC_PUBLIC, Shape::ub4, nullptr, SetField<&D::looks_for_public>},
    {OCI_ATTR_DESC_SYNBASE, Shape::ub1, nullptr, SetField<&D::wants_synonym_base>},
};

}  // namespace

// What parameters hang below.
class DescribeHandle::Description : public Object {
public:
    static constexpr Kind kKind = Kind::description;
    Description(const Origin& origin, std::shared_ptr<const describe::Node> of_root)
        : Object(origin), root(std::move(of_root)) {}

    const std::shared_ptr<const describe::Node> root;
    Parameters parameters;
};

DescribeHandle::DescribeHandle(const Origin& origin)
    : Object(origin), source_(std::make_shared<Source>(Env().Threaded())) {}

std::span<const AttributeRow> DescribeHandle::Attributes() const { return kRows; }

// A memory function that is called meanwhile may describe, too: the last one stays.
void DescribeHandle::Show(std::shared_ptr<const describe::Node> root) {
    if (Description* before = std::exchange(description_, nullptr)) Destroy(before);
    if (!root) return;
    auto* shown = Create<Description>(*this, 0, 0, std::move(root));
    if (Description* meanwhile = std::exchange(description_, shown)) Destroy(meanwhile);
}

Status DescribeHandle::GetParameter(std::uint32_t position, void** out) {
    Description* const shown = description_;
    if (!shown || position != 1) return Error(errors::kNoParameter);
    if (!out) return Error(errors::kNullArgument);
    *out = &shown->parameters.At(0, *shown, source_, shown->root);
    return {};
}
