// Strings and raws: their memory.
#include "text/variable.h"

#include <cstring>
#include <utility>

#include "handles/environment.h"
#include "handles/errors.h"

namespace {

constexpr std::uint32_t kLargest = 256U << 20;    // a length beyond that is a mistake, and nothing to be read
constexpr std::size_t kTerminator = 2;

}  // namespace

Variable::~Variable() { Env().Release(data_); }

// The content is looked at when the memory functions have been called, and the old block given back when it is no
// longer this value's.
template <class Content>
void Variable::Replace(std::uint32_t room, Content content) {
    auto* block = static_cast<char*>(Env().Allocate(room + kTerminator));
    const std::string_view kept = std::string_view(content()).substr(0, room);
    if (!kept.empty()) std::memcpy(block, kept.data(), kept.size());
    std::memset(block + kept.size(), 0, kTerminator);
    size_ = static_cast<std::uint32_t>(kept.size());
    room_ = room;
    Env().Release(std::exchange(data_, block));
}

Status Variable::Assign(std::string_view content) {
    if (content.size() > kLargest) return Error(errors::kSizeTooLarge);
    if (!data_ || content.size() > room_) {
        Replace(static_cast<std::uint32_t>(content.size()), [content] { return content; });
        return {};
    }
    if (!content.empty()) std::memmove(data_, content.data(), content.size());
    size_ = static_cast<std::uint32_t>(content.size());
    std::memset(data_ + size_, 0, kTerminator);
    return {};
}

Status Variable::Assign(const Variable& other) {
    if (data_ && other.size_ <= room_) return Assign(other.View());
    Replace(other.size_, [&other] { return other.View(); });
    return {};
}

Status Variable::Resize(std::uint32_t size) {
    if (size > kLargest) return Error(errors::kSizeTooLarge);
    Replace(size, [this] { return View(); });
    return {};
}
