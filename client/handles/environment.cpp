// Environments: opening, closing, memory.
#include "handles/environment.h"

#include <cstdlib>

#include "oci.h"

namespace {

std::atomic<std::int64_t> held_blocks{0};

constexpr std::size_t kAlignment = 16;

// The application's functions may align to less than objects need: their block's own address stands before ours.
void* AllocateFrom(const MemoryFunctions& memory, std::size_t size) noexcept {
    if (size > SIZE_MAX - 2 * kAlignment) return nullptr;
    if (!memory.allocate) return std::malloc(size ? size : 1);
    void* block = memory.allocate(memory.context, size + 2 * kAlignment);
    if (!block) return nullptr;
    const auto address = (reinterpret_cast<std::uintptr_t>(block) + 2 * kAlignment - 1) / kAlignment * kAlignment;
    auto** aligned = reinterpret_cast<void**>(address);
    aligned[-1] = block;
    return aligned;
}

void ReleaseTo(const MemoryFunctions& memory, void* aligned) noexcept {
    if (!memory.allocate) return std::free(aligned);
    memory.release(memory.context, static_cast<void**>(aligned)[-1]);
}

std::mutex defaults_mutex;
ProcessDefaults process_defaults;

}  // namespace

std::int64_t HeldBlocks() noexcept { return held_blocks.load(std::memory_order_relaxed); }

void SetProcessDefaults(const ProcessDefaults& defaults) {
    const std::lock_guard lock(defaults_mutex);
    process_defaults = defaults;
}

ProcessDefaults GetProcessDefaults() {
    const std::lock_guard lock(defaults_mutex);
    return process_defaults;
}

Environment::Environment(const Origin& origin, std::uint32_t mode, const MemoryFunctions& memory)
    : Object(origin), mode_(mode), utf16_(mode & OCI_UTF16), threaded_(mode & OCI_THREADED), memory_(memory) {}

Environment* Environment::Open(std::uint32_t mode, const MemoryFunctions& given, std::size_t extra) noexcept {
    const MemoryFunctions memory = given.allocate && given.release ? given : MemoryFunctions{};
    void* block = AllocateFrom(memory, sizeof(Environment));
    if (!block) return nullptr;
    held_blocks.fetch_add(1, std::memory_order_relaxed);
    auto* environment = static_cast<Environment*>(block);
    new (block) Environment(Origin{*environment, nullptr, OCI_HTYPE_ENV}, mode, memory);
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
    return memory;
}

void Environment::Release(void* memory) noexcept {
    if (!memory) return;
    held_blocks.fetch_sub(1, std::memory_order_relaxed);
    ReleaseTo(memory_, memory);
}
