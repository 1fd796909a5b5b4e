#include "objects/memory.h"

#include <algorithm>

#include "core/messages.h"
#include "platform/memory.h"

namespace {
constexpr char kTag[] = "harnix";
}

void* GetMem(size_t size, int line) {
    void* block = PlatformAlloc(std::max<size_t>(size, 1), kTag, line);
    if (block == nullptr) Message(kError, "GetMem: failed to allocate memory.\n");
    return block;
}

void FreeMem(void* block) {
    if (block != nullptr) PlatformFree(block, kTag);
}
