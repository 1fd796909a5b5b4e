// Environments: opening, closing, memory.
#include "handles/environment.h"

#include <malloc.h>

#include <cstdlib>
#include <cstring>

#include "handles/attributes.h"
#include "handles/function_codes.h"
#include "oci.h"

namespace {

std::atomic<std::int64_t> held_blocks{0};

constexpr std::size_t kAlignment = 16;

constexpr std::size_t kLargestBlock = std::size_t{1} << 36;    // what is larger is a mistake of the caller's

// The application's functions may align to less than objects need: their block's own address stands before ours.
void* AllocateFrom(const MemoryFunctions& memory, std::size_t size) noexcept {
    if (size > kLargestBlock) return nullptr;
    if (!memory.allocate) return std::calloc(1, size);
    void* block = memory.allocate(memory.context, size + 2 * kAlignment);
    if (!block) return nullptr;
    const auto address = (reinterpret_cast<std::uintptr_t>(block) + 2 * kAlignment - 1) / kAlignment * kAlignment;
    auto** aligned = reinterpret_cast<void**>(address);
    aligned[-1] = block;
    aligned[-2] = reinterpret_cast<void*>(size);
    std::memset(aligned, 0, size);
    return aligned;
}

// The block's bytes, as far as they are the caller's.
std::size_t SizeOf(const MemoryFunctions& memory, void* aligned) noexcept {
    if (!memory.allocate) return malloc_usable_size(aligned);
    return reinterpret_cast<std::size_t>(static_cast<void**>(aligned)[-2]);
}

void ReleaseTo(const MemoryFunctions& memory, void* aligned) noexcept {
    if (!memory.allocate) return std::free(aligned);
    memory.release(memory.context, static_cast<void**>(aligned)[-1]);
}

std::mutex defaults_mutex;
ProcessDefaults process_defaults;

Status InObjectMode(Environment& environment, AttributeValue& value) {
    value.integer = environment.Mode() & OCI_OBJECT ? 1 : 0;
    return {};
}

Status TextSet(Environment& environment, AttributeValue& value) {
    value.integer = charset::Id(*environment.Sets().text);
    return {};
}

Status NationalSet(Environment& environment, AttributeValue& value) {
    value.integer = charset::Id(*environment.Sets().national);
    return {};
}

Status InUtf16(Environment& environment, AttributeValue& value) {
    value.integer = environment.Utf16() ? 1 : 0;
    return {};
}

Status HeapBytes(Environment& environment, AttributeValue& value) {
    value.integer = environment.HeapBytes();
    return {};
}
Status NoSharedHeap(Environment&, AttributeValue&) { return {}; }    // memory is each environment's own

using E = Environment;
constexpr AttributeRow kRows[] = {
    {OCI_ATTR_FNCODE, Shape::ub4, Get<E, GetLastCall<E>>, nullptr},
    {OCI_ATTR_OBJECT, Shape::ub4, Get<E, InObjectMode>, nullptr},
    {OCI_ATTR_HEAPALLOC, Shape::ub4, Get<E, HeapBytes>, nullptr},
    {OCI_ATTR_SHARED_HEAPALLOC, Shape::ub4, Get<E, NoSharedHeap>, nullptr},
    {OCI_ATTR_CHARSET_ID, Shape::ub2, Get<E, TextSet>, nullptr},
    {OCI_ATTR_NCHARSET_ID, Shape::ub2, Get<E, NationalSet>, nullptr},
    {OCI_ATTR_ENV_UTF16, Shape::ub1, Get<E, InUtf16>, nullptr},
    {OCI_ATTR_CACHE_OPT_SIZE, Shape::ub4, GetField<&E::cache_optimal_size>, SetField<&E::cache_optimal_size>},
    {OCI_ATTR_CACHE_MAX_SIZE, Shape::ub4, GetField<&E::cache_maximal_excess>, SetField<&E::cache_maximal_excess>},
    {OCI_ATTR_PINOPTION, Shape::ub2, GetField<&E::pin_option>, SetField<&E::pin_option>},
    {OCI_ATTR_ALLOC_DURATION, Shape::ub2, GetField<&E::allocation_duration>, SetField<&E::allocation_duration>},
    {OCI_ATTR_PIN_DURATION, Shape::ub2, GetField<&E::pin_duration>, SetField<&E::pin_duration>},
};

}  // namespace

std::span<const AttributeRow> Environment::Attributes() const { return kRows; }

std::int64_t HeldBlocks() noexcept { return held_blocks.load(std::memory_order_relaxed); }

void SetProcessDefaults(const ProcessDefaults& defaults) {
    const std::lock_guard lock(defaults_mutex);
    process_defaults = defaults;
}

ProcessDefaults GetProcessDefaults() {
    const std::lock_guard lock(defaults_mutex);
    return process_defaults;
}

Environment::Environment(const Origin& origin, std::uint32_t mode, const CharacterSets& sets,
                         const MemoryFunctions& memory)
    : Object(origin), mode_(mode), sets_(sets), converts_(!charset::IsUtf8(*sets.text)),
      utf16_(charset::IsUtf16(*sets.text)), threaded_(mode & OCI_THREADED), memory_(memory) {}

Environment::CharacterSets Environment::SetsOf(std::uint32_t mode) {
    const CharacterSet* set = charset::Find(mode & OCI_UTF16 ? OCI_UTF16ID : charset::kUtf8);
    return {set, set};
}

Environment* Environment::Open(std::uint32_t mode, const CharacterSets& sets, const MemoryFunctions& given,
                               std::size_t extra) noexcept {
    const MemoryFunctions memory = given.allocate && given.release ? given : MemoryFunctions{};
    void* block = AllocateFrom(memory, sizeof(Environment));
    if (!block) return nullptr;
    held_blocks.fetch_add(1, std::memory_order_relaxed);
    auto* environment = static_cast<Environment*>(block);
    new (block) Environment(Origin{*environment, nullptr, OCI_HTYPE_ENV}, mode, sets, memory);
    try {
        ObjectTree::Adopt(*environment, kKind, extra);
        return environment;
    } catch (const std::bad_alloc&) {
        environment->Close();
        return nullptr;
    }
}

void Environment::Close() noexcept {
    const MemoryFunctions memory = memory_;
    this->~Environment();
    held_blocks.fetch_sub(1, std::memory_order_relaxed);
    ReleaseTo(memory, this);
}

void* Environment::Allocate(std::size_t size) {
    void* memory = AllocateFrom(memory_, size);
    if (!memory) throw std::bad_alloc();
    held_blocks.fetch_add(1, std::memory_order_relaxed);
    heap_bytes_.fetch_add(SizeOf(memory_, memory), std::memory_order_relaxed);
    return memory;
}

void Environment::Release(void* memory) noexcept {
    if (!memory) return;
    held_blocks.fetch_sub(1, std::memory_order_relaxed);
    heap_bytes_.fetch_sub(SizeOf(memory_, memory), std::memory_order_relaxed);
    ReleaseTo(memory_, memory);
}
