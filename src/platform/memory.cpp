// Tagged memory: a map of the blocks that are out, so that a pointer is judged without reading what it points to.
#include "platform/memory.h"

#include <cstdlib>
#include <mutex>
#include <new>
#include <string_view>
#include <unordered_map>

namespace {

// More than any machine has. Larger requests are refused here, since some allocators end the process over them.
constexpr std::size_t kLargestBlock = std::size_t{1} << 38;

struct Origin {
    std::size_t size;
    const char* tag;
    int line;
};

struct Blocks {
    std::mutex mutex;
    std::unordered_map<const void*, Origin> out;
};

// Never destroyed: blocks are given back while the program ends, too.
Blocks& TheBlocks() {
    static Blocks* const blocks = new Blocks;
    return *blocks;
}

bool Same(const char* tag, const char* other) {
    return tag == other || std::string_view(tag) == other;
}

}  // namespace

void* PlatformAlloc(std::size_t size, const char* tag, int line) {
    if (size > kLargestBlock) return nullptr;
    void* const pointer = std::calloc(size == 0 ? 1 : size, 1);
    if (!pointer) return nullptr;
    try {
        Blocks& blocks = TheBlocks();
        const std::lock_guard lock(blocks.mutex);
        blocks.out.emplace(pointer, Origin{size, tag, line});
        return pointer;
    } catch (const std::bad_alloc&) {
        std::free(pointer);
        return nullptr;
    }
}

bool PlatformFree(void* pointer, const char* tag) {
    {
        Blocks& blocks = TheBlocks();
        const std::lock_guard lock(blocks.mutex);
        const auto found = blocks.out.find(pointer);
        if (found == blocks.out.end() || !Same(found->second.tag, tag)) return false;
        blocks.out.erase(found);
    }
    std::free(pointer);
    return true;
}

std::size_t PlatformOutstanding(const char* tag) {
    std::size_t count = 0;
    PlatformVisit(tag, [](const PlatformBlock&, void* context) { ++*static_cast<std::size_t*>(context); }, &count);
    return count;
}

void PlatformVisit(const char* tag, void (*visit)(const PlatformBlock& block, void* context), void* context) {
    Blocks& blocks = TheBlocks();
    const std::lock_guard lock(blocks.mutex);
    for (const auto& [pointer, origin] : blocks.out)
        if (Same(origin.tag, tag)) visit({pointer, origin.size, origin.line}, context);
}
