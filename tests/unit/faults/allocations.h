// Allocations that fail on purpose. Allocations are counted while an Armed lives, on its thread alone, and the one that
// the plan names fails: an application's block (the functions of ApplicationMemory), or one that the library asks for
// itself, through operator new, SQLite's allocator or, but not beside a sanitizer, malloc. Set and read a plan only
// while no thread is armed.
#pragma once

#include <cstddef>
#include <string>

namespace faults {

enum class Whose { application, library };
enum class How { alone, from_then_on };

struct Plan {
    Whose whose;
    How how;
    long at;    // the number of the allocation, from 1; 0: none fails
    bool in_c = true;    // malloc and its kin fail, too
};

// What became of the plan since it was set.
struct Outcome {
    long counted = 0, failed = 0;
    std::string first;    // what failed first, as "operator new, 64 bytes"
};

void Set(const Plan& plan);
Outcome Seen();

class Armed {
public:
    Armed();
    ~Armed();
    Armed(const Armed&) = delete;
    Armed& operator=(const Armed&) = delete;

private:
    bool before_;
};

// The memory functions given to environments, and how many of their blocks are out. Blocks are aligned to nothing and
// hold what was there before.
struct ApplicationMemory {
    static void* Allocate(void*, std::size_t size);
    static void Release(void*, void* block);
    static long Blocks();
};

// Bytes that SQLite holds.
long long SqliteBytes();

}  // namespace faults
