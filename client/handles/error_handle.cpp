// Error records: keeping them, and putting their texts together.
#include "handles/error_handle.h"

#include <cstdio>

#include "handles/attributes.h"
#include "handles/gate.h"

namespace {

Status FirstCode(ErrorHandle& error, AttributeValue& value) {
    const auto first = error.list.At(1);
    value.integer = first ? static_cast<std::uint64_t>(first->number) : 0;
    return {};
}

constexpr AttributeRow kRows[] = {
    {OCI_ATTR_SQLCODE, Shape::ub4, Get<ErrorHandle, FirstCode>, nullptr},
    {OCI_ATTR_DML_ROW_OFFSET, Shape::ub4, GetField<&ErrorHandle::row_offset>, nullptr},
};

}  // namespace

std::string ErrorMessage(int number, std::string_view engine, std::string_view detail) {
    char code[24];
    std::snprintf(code, sizeof code, "] ORA-%05d: ", number);
    std::string message = "[KELP/";
    message.append(engine).append(code).append(ErrorText(number));
    while (!detail.empty() && detail.back() == '\n') detail.remove_suffix(1);
    if (!detail.empty()) message.append(": ").append(detail);
    return message += '\n';
}

void ErrorList::Add(const Status& status) {
    if (status.Number() == 0) return;
    const std::lock_guard lock(mutex_);
    records_.push_back({status.Number(), status.Engine(), status.Detail()});
    any_.store(true, std::memory_order_relaxed);
}

void ErrorList::TakeFrom(ErrorList& other) noexcept {
    const std::scoped_lock lock(mutex_, other.mutex_);
    records_ = std::move(other.records_);
    other.records_.clear();
    other.any_.store(false, std::memory_order_relaxed);
    any_.store(!records_.empty(), std::memory_order_relaxed);
}

std::optional<ErrorList::Record> ErrorList::At(std::size_t position) const {
    const std::lock_guard lock(mutex_);
    if (position == 0 || position > records_.size()) return std::nullopt;
    return records_[position - 1];
}

void ErrorList::Empty() noexcept {
    const std::lock_guard lock(mutex_);
    records_.clear();
    any_.store(false, std::memory_order_relaxed);
}

std::span<const AttributeRow> ErrorHandle::Attributes() const { return kRows; }

sword Record(ErrorList& list, const Status& status) noexcept {
    try {
        list.Add(status);
    } catch (const std::bad_alloc&) {
        // The return code still tells of the failure.
    }
    return status.Code();
}
