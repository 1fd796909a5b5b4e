// The attributes of objects that only keep what they are given.
#include "handles/plain_objects.h"

#include "handles/attributes.h"
#include "oci.h"

namespace {

template <auto member>
Status GetPointer(Object& object, AttributeValue& value) {
    value.pointer = static_cast<typename MemberOf<member>::Class&>(object).*member;
    return {};
}

template <auto member>
Status SetPointer(Object& object, const AttributeValue& value) {
    static_cast<typename MemberOf<member>::Class&>(object).*member = value.pointer;
    return {};
}

using P = PlainHandle;
constexpr AttributeRow kSubscriptionRows[] = {
    {OCI_ATTR_SUBSCR_NAME, Shape::text, GetText<&P::name>, SetText<&P::name>},
    {OCI_ATTR_SUBSCR_CALLBACK, Shape::handle, GetPointer<&P::callback>, SetPointer<&P::callback>},
    {OCI_ATTR_SUBSCR_CTX, Shape::handle, GetPointer<&P::context>, SetPointer<&P::context>},
    {OCI_ATTR_SUBSCR_NAMESPACE, Shape::ub4, GetField<&P::name_space>, SetField<&P::name_space>},
};

constexpr AttributeRow kSnapshotRows[] = {
    {OCI_ATTR_SCN_BASE, Shape::ub4, GetField<&Snapshot::base>, SetField<&Snapshot::base>},
    {OCI_ATTR_SCN_WRAP, Shape::ub4, GetField<&Snapshot::wrap>, SetField<&Snapshot::wrap>},
};

}  // namespace

std::span<const AttributeRow> PlainHandle::Attributes() const {
    if (Type() == OCI_HTYPE_SUBSCRIPTION) return kSubscriptionRows;
    return {};
}

std::span<const AttributeRow> Snapshot::Attributes() const { return kSnapshotRows; }
