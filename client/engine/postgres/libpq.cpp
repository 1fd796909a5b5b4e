#include "engine/postgres/libpq.h"

#include <dlfcn.h>

#include <mutex>

#include "engine/postgres/errors.h"

namespace engine::postgres {
namespace {

constexpr const char* kName = "libpq.so.5";
constexpr int kNoAdapter = 12560;

// What the loader said last.
Status NotLoaded() {
    const char* const words = dlerror();
    return Refused(kNoAdapter, words ? words : kName);
}

template <class Function>
bool Find(void* library, const char* name, Function& function) {
    function = reinterpret_cast<Function>(dlsym(library, name));
    return function != nullptr;
}

// Stays loaded: sessions may live until the process ends.
Status Load() {
    void* const library = dlopen(kName, RTLD_LAZY | RTLD_LOCAL);
    if (!library) return NotLoaded();
#define FUNCTION(symbol) if (!Find(library, #symbol, symbol)) return NotLoaded();
#include "engine/postgres/libpq_functions.def"
#undef FUNCTION
    return {};
}

}  // namespace

#define FUNCTION(symbol) constinit decltype(&::symbol) symbol = nullptr;
#include "engine/postgres/libpq_functions.def"
#undef FUNCTION

// What has failed is tried again: memory may have been short.
Status LoadLibpq() {
    static constinit std::mutex mutex;
    static constinit bool loaded = false;
    const std::lock_guard lock(mutex);
    if (loaded) return {};
    Status status = Load();
    loaded = status.Ok();
    return status;
}

}  // namespace engine::postgres
