// The allocators that the whole process uses while these tests run.
#include "faults/allocations.h"

#include <sqlite3.h>

#include <atomic>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <new>
#include <utility>

// Sanitizers bring a malloc of their own.
#if defined(__GLIBC__) && !defined(FAULTS_BESIDE_SANITIZER)
#define FAULTS_IN_MALLOC
extern "C" {
void* __libc_malloc(std::size_t size);
void* __libc_calloc(std::size_t count, std::size_t size);
void* __libc_realloc(void* block, std::size_t size);
}
#endif

namespace faults {
namespace {

constinit Plan plan{Whose::library, How::alone, 0};
constinit std::atomic<long> counted{0};
constinit std::atomic<long> failed{0};
constinit const char* first_allocator = nullptr;
constinit std::size_t first_size = 0;
constinit thread_local bool armed = false;
constinit std::atomic<long> application_blocks{0};

bool Planned(long number) {
    return plan.at != 0 && (plan.how == How::alone ? number == plan.at : number >= plan.at);
}

// A place for a breakpoint.
[[gnu::noinline]] void Fail(const char* allocator, std::size_t size) {
    if (failed.fetch_add(1) > 0) return;
    first_allocator = allocator;
    first_size = size;
}

bool Refused(Whose whose, const char* allocator, std::size_t size) {
    if (!armed || whose != plan.whose) return false;
    if (!Planned(counted.fetch_add(1) + 1)) return false;
    Fail(allocator, size);
    return true;
}

#ifdef FAULTS_IN_MALLOC
bool RefusedInC(const char* allocator, std::size_t size) {
    return plan.in_c && Refused(Whose::library, allocator, size);
}
#endif

void* Uncounted(std::size_t size) {
#ifdef FAULTS_IN_MALLOC
    return __libc_malloc(size);
#else
    return std::malloc(size);
#endif
}

// What the language's allocation functions stand on. Blocks of any alignment go back through free().
void* New(std::size_t size, std::size_t alignment = 0) {
    if (Refused(Whose::library, "operator new", size)) return nullptr;
    if (alignment == 0) return Uncounted(size ? size : 1);
    void* block = nullptr;
    return posix_memalign(&block, alignment, size) == 0 ? block : nullptr;
}

void* NewOrThrow(std::size_t size, std::size_t alignment = 0) {
    void* block = New(size, alignment);
    if (!block) throw std::bad_alloc();
    return block;
}

sqlite3_mem_methods sqlite_own;

void* SqliteMalloc(int size) {
    if (Refused(Whose::library, "SQLite", static_cast<std::size_t>(size))) return nullptr;
    const bool before = std::exchange(armed, false);
    void* block = sqlite_own.xMalloc(size);
    armed = before;
    return block;
}

void* SqliteRealloc(void* block, int size) {
    if (Refused(Whose::library, "SQLite", static_cast<std::size_t>(size))) return nullptr;
    const bool before = std::exchange(armed, false);
    void* grown = sqlite_own.xRealloc(block, size);
    armed = before;
    return grown;
}

// Before anything uses SQLite.
[[maybe_unused]] const bool in_place = [] {
    sqlite3_config(SQLITE_CONFIG_GETMALLOC, &sqlite_own);
    sqlite3_mem_methods methods = sqlite_own;
    methods.xMalloc = SqliteMalloc;
    methods.xRealloc = SqliteRealloc;
    return sqlite3_config(SQLITE_CONFIG_MALLOC, &methods) == SQLITE_OK || (std::abort(), false);
}();

}  // namespace

void Set(const Plan& next) {
    plan = next;
    counted = 0;
    failed = 0;
    first_allocator = nullptr;
}

Outcome Seen() {
    if (!first_allocator) return {counted, failed, "nothing"};
    return {counted, failed, std::string(first_allocator) + ", " + std::to_string(first_size) + " bytes"};
}

Armed::Armed() : before_(std::exchange(armed, true)) {}
Armed::~Armed() { armed = before_; }

void* ApplicationMemory::Allocate(void*, std::size_t size) {
    if (Refused(Whose::application, "application", size)) return nullptr;
    auto* block = static_cast<char*>(Uncounted(size + 1));
    if (!block) return nullptr;
    ++application_blocks;
    std::memset(block, 0x5A, size + 1);
    return block + 1;
}

void ApplicationMemory::Release(void*, void* block) {
    --application_blocks;
    std::free(static_cast<char*>(block) - 1);
}

long ApplicationMemory::Blocks() { return application_blocks; }

long long SqliteBytes() { return sqlite3_memory_used(); }

}  // namespace faults

#ifdef FAULTS_IN_MALLOC
extern "C" {

void* malloc(std::size_t size) {
    if (!faults::RefusedInC("malloc", size)) return __libc_malloc(size);
    errno = ENOMEM;
    return nullptr;
}

void* calloc(std::size_t count, std::size_t size) {
    if (!faults::RefusedInC("calloc", count * size)) return __libc_calloc(count, size);
    errno = ENOMEM;
    return nullptr;
}

void* realloc(void* block, std::size_t size) {
    if (!faults::RefusedInC("realloc", size)) return __libc_realloc(block, size);
    errno = ENOMEM;
    return nullptr;
}

}  // extern "C"
#endif

// A hash that takes no time, in place of the system's, which takes some 20 ms by design.
extern "C" {

char* crypt_gensalt_rn(const char*, unsigned long, const char*, int, char* out, int size) {
    std::snprintf(out, static_cast<std::size_t>(size), "$test$");
    return out;
}

char* crypt_rn(const char* password, const char*, void* data, int size) {
    std::snprintf(static_cast<char*>(data), static_cast<std::size_t>(size), "$test$%s", password);
    return static_cast<char*>(data);
}

}  // extern "C"

// Those of the language's that are in use; the others go through these.
void* operator new(std::size_t size) { return faults::NewOrThrow(size); }
void* operator new[](std::size_t size) { return faults::NewOrThrow(size); }
void* operator new(std::size_t size, const std::nothrow_t&) noexcept { return faults::New(size); }
void* operator new(std::size_t size, std::align_val_t alignment) {
    return faults::NewOrThrow(size, static_cast<std::size_t>(alignment));
}
void* operator new(std::size_t size, std::align_val_t alignment, const std::nothrow_t&) noexcept {
    return faults::New(size, static_cast<std::size_t>(alignment));
}
void operator delete(void* block) noexcept { std::free(block); }
void operator delete[](void* block) noexcept { std::free(block); }
void operator delete(void* block, std::size_t) noexcept { std::free(block); }
void operator delete[](void* block, std::size_t) noexcept { std::free(block); }
void operator delete(void* block, std::align_val_t) noexcept { std::free(block); }
void operator delete(void* block, std::size_t, std::align_val_t) noexcept { std::free(block); }
