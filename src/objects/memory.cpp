// Tagged blocks of the platform, with the complaint when there is none to be had.
#include "objects/memory.h"

#include "core/messages.h"
#include "platform/memory.h"

namespace {

constexpr char kTag[] = "harnix";
// Sizes come from scripts as they are typed. Where memory is overcommitted a senseless one would be granted, and the
// process would end when it is used.
constexpr size_t kLargestBlock = size_t{1} << 30;

}  // namespace

void* GetMem(size_t size, int line) {
    void* block = size > kLargestBlock ? nullptr : PlatformAlloc(size, kTag, line);
    if (block == nullptr) Message(kError, "GetMem: failed to allocate memory.\n");
    return block;
}

void FreeMem(void* block) {
    if (block != nullptr) PlatformFree(block, kTag);
}
