// Memory blocks with a tag and a line that tell where they were asked for. What was never given out, was given back
// already or bears another tag is refused, without being read. Any thread.
#pragma once

#include <cstddef>

// A block filled with zeros, aligned for any type; null when memory does not suffice. A size of 0 gives a block too.
// The tag is kept by pointer: a literal.
void* PlatformAlloc(std::size_t size, const char* tag, int line);

// False when the pointer is refused; null is.
bool PlatformFree(void* pointer, const char* tag);

// Blocks given out under the tag and not given back.
std::size_t PlatformOutstanding(const char* tag);

// Calls `visit` for each outstanding block of the tag, in no order. It must not allocate or free here.
struct PlatformBlock {
    const void* pointer;
    std::size_t size;
    int line;
};
void PlatformVisit(const char* tag, void (*visit)(const PlatformBlock& block, void* context), void* context);
