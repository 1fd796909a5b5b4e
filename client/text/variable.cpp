// Strings and raws: their memory.
#include "text/variable.h"

#include <algorithm>
#include <cstring>

#include "handles/environment.h"
#include "handles/errors.h"

namespace {

constexpr std::uint32_t kLargest = 256U << 20;    // a length beyond that is a mistake, and nothing to be read
constexpr std::size_t kTerminator = 2;

}  // namespace

Variable::~Variable() { Env().Release(data_); }

void Variable::Replace(std::uint32_t room, std::string_view content) {
    auto* block = static_cast<char*>(Env().Allocate(room + kTerminator));
    if (!content.empty()) std::memcpy(block, content.data(), content.size());
    std::memset(block + content.size(), 0, kTerminator);
    Env().Release(data_);
    data_ = block;
    size_ = static_cast<std::uint32_t>(content.size());
    room_ = room;
}

Status Variable::Assign(std::string_view content) {
    if (content.size() > kLargest) return Error(errors::kSizeTooLarge);
    if (!data_ || content.size() > room_) {
        Replace(static_cast<std::uint32_t>(content.size()), content);
        return {};
    }
    if (!content.empty()) std::memmove(data_, content.data(), content.size());
    size_ = static_cast<std::uint32_t>(content.size());
    std::memset(data_ + size_, 0, kTerminator);
    return {};
}

Status Variable::Resize(std::uint32_t size) {
    if (size > kLargest) return Error(errors::kSizeTooLarge);
    Replace(size, View().substr(0, std::min<std::size_t>(size, size_)));
    return {};
}
