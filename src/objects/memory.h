// Memory of the driver's own: blocks tagged "harnix" with the line that asked for them. Any thread.
#pragma once

#include <cstddef>
#include <memory>

// A zero-filled block of at least one byte and at most 1 GB. Failure prints "GetMem: failed to allocate memory.\n" and
// gives null.
void* GetMem(size_t size, int line = __builtin_LINE());
void FreeMem(void* block);

struct FreeMemory {
    void operator()(void* block) const { FreeMem(block); }
};
template <class T> using Memory = std::unique_ptr<T, FreeMemory>;
