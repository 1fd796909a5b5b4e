// Error records: keeping them, and putting their texts together.
#include "handles/error_handle.h"

#include <cstdio>
#include <utility>

#include "handles/attributes.h"
#include "handles/function_codes.h"
#include "handles/gate.h"

namespace {

Status FirstCode(ErrorHandle& error, AttributeValue& value) {
    const auto first = error.list.At(1);
    value.integer = first ? static_cast<std::uint64_t>(first->number) : 0;
    return {};
}

constexpr AttributeRow kRows[] = {
    {OCI_ATTR_SQLCODE, Shape::ub4, Get<ErrorHandle, FirstCode>, nullptr},
    {OCI_ATTR_FNCODE, Shape::ub4, Get<ErrorHandle, GetLastCall<ErrorHandle>>, nullptr},
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

void ErrorList::List(const Status& status) noexcept try {
    Record record{status.Number(), status.Engine(), status.Detail()};
    const std::lock_guard lock(mutex_);
    records_.reserve(records_.size() + 2);    // nothing fails below
    const int alone = state_.exchange(kListed, std::memory_order_relaxed);
    if (alone != kListed) records_.clear();    // what a thread listed while another emptied the list
    if (alone > 0) records_.push_back({alone, Status::kClient, {}});
    if (alone == kSpare) records_.push_back({spare_.Number(), spare_.Engine(), {}});
    records_.push_back(std::move(record));
} catch (const std::bad_alloc&) {
    const std::lock_guard lock(mutex_);
    int none = kNone;
    if (state_.compare_exchange_strong(none, kSpare, std::memory_order_relaxed)) spare_ = status;
}

void ErrorList::TakeFrom(ErrorList& other) noexcept {
    const int state = other.state_.exchange(kNone, std::memory_order_relaxed);
    Clear();
    if (state != kListed && state != kSpare) return state_.store(state, std::memory_order_relaxed);
    const std::scoped_lock lock(mutex_, other.mutex_);
    records_ = std::exchange(other.records_, {});
    spare_ = other.spare_;
    state_.store(state, std::memory_order_relaxed);
}

std::optional<ErrorList::Record> ErrorList::At(std::size_t position) const {
    const int state = state_.load(std::memory_order_relaxed);
    if (state > 0 && position == 1) return Record{state, Status::kClient, {}};
    if (state != kListed && state != kSpare) return std::nullopt;
    const std::lock_guard lock(mutex_);
    if (state == kSpare && position == 1) return Record{spare_.Number(), spare_.Engine(), spare_.Detail()};
    if (position == 0 || position > records_.size()) return std::nullopt;
    return records_[position - 1];
}

void ErrorList::Empty() noexcept {
    const std::lock_guard lock(mutex_);
    records_.clear();
    state_.store(kNone, std::memory_order_relaxed);
}

std::span<const AttributeRow> ErrorHandle::Attributes() const { return kRows; }
