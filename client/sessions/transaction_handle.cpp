// Transaction handles: their attributes.
#include "sessions/transaction_handle.h"

#include "handles/attributes.h"
#include "handles/errors.h"
#include "oci.h"

namespace {

constexpr std::size_t kLongestName = 64;

Status SetName(TransactionHandle& handle, const AttributeValue& value) {
    if (value.text.empty() || value.text.size() > kLongestName) return Error(errors::kBadValue);
    handle.name = value.text;
    return {};
}

Status GetLock(TransactionHandle&, AttributeValue&) { return {}; }    // no locks are counted

using T = TransactionHandle;
constexpr AttributeRow kRows[] = {
    {OCI_ATTR_XID, Shape::bytes, GetText<&T::xid>, SetText<&T::xid>, T::kXidSize},
    {OCI_ATTR_TRANS_NAME, Shape::text, GetText<&T::name>, Set<T, SetName>},
    {OCI_ATTR_TRANS_TIMEOUT, Shape::ub4, GetField<&T::timeout>, SetField<&T::timeout>},
    {OCI_ATTR_TRANS_LOCK, Shape::ub4, Get<T, GetLock>, nullptr},
};

}  // namespace

std::span<const AttributeRow> TransactionHandle::Attributes() const { return kRows; }
