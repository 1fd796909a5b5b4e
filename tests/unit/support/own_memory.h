// The memory functions of an application: they count what is out, overwrite what they give and take back, and can be
// looked into.
#pragma once

#include <atomic>
#include <cstdlib>
#include <cstring>
#include <functional>

#include "oci.h"

struct OwnMemory {
    std::atomic<int> out = 0;
    std::function<void()> before_allocating;
    std::function<void(const char* block, size_t size)> before_freeing;

    sword Open(OCIEnv** env, ub4 mode = OCI_DEFAULT) {
        return OCIEnvCreate(env, mode, this, Allocate, Reallocate, Free, 0, nullptr);
    }

    static dvoid* Allocate(dvoid* context, size_t size) {
        auto& memory = *static_cast<OwnMemory*>(context);
        if (memory.before_allocating) memory.before_allocating();
        ++memory.out;
        auto* block = static_cast<char*>(std::malloc(size + kAhead));
        std::memset(block, 0x5A, size + kAhead);
        std::memcpy(block, &size, sizeof size);
        return block + kAhead;
    }
    static dvoid* Reallocate(dvoid*, dvoid*, size_t) { return nullptr; }
    static void Free(dvoid* context, dvoid* given) {
        auto& memory = *static_cast<OwnMemory*>(context);
        char* block = static_cast<char*>(given) - kAhead;
        size_t size = 0;
        std::memcpy(&size, block, sizeof size);
        if (memory.before_freeing) memory.before_freeing(static_cast<char*>(given), size);
        --memory.out;
        std::memset(block, 0xDD, size + kAhead);
        std::free(block);
    }

private:
    static constexpr size_t kAhead = sizeof(size_t) + 1;    // so that blocks are aligned to nothing
};
