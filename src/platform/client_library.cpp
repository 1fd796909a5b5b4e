// Loading the client library.
//
// HARNIX_CLIENT_LIBRARY names it, by path or by soname. Unset, it is the bundled one, beside the executable's directory
// or in it. HARNIX_TRACE_LOAD names a file that then lists every candidate tried and what the dynamic loader said.
//
// Other libraries can be driven although they lack what only ours has: a function whose name ends in NS falls back to
// the name without it, OCI_memGetMemCount and XaGetInfo may be absent, and HARNIX_XA_SWITCH names another XA switch.
#include "platform/client_library.h"

#include <dlfcn.h>

#include <cstdio>
#include <cstdlib>
#include <string>
#include <string_view>
#include <vector>

#include "platform/executable.h"

#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
#define SANITIZED 1
#elif defined(__has_feature)
#if __has_feature(address_sanitizer) || __has_feature(thread_sanitizer)
#define SANITIZED 1
#endif
#endif

ClientLibrary client_library;

namespace {

constexpr char kBundledName[] = "libkelpci.so";

// The library prefers its own symbols to those of the program, but for the sanitizers, which must replace its malloc.
#if defined(RTLD_DEEPBIND) && !defined(SANITIZED)
constexpr int kOwnSymbols = RTLD_LOCAL | RTLD_DEEPBIND;
#else
constexpr int kOwnSymbols = RTLD_LOCAL;
#endif

// How a candidate is tried: with everything resolved at once, then leaving to the calls what cannot be resolved.
constexpr struct {
    int flags;
    const char* name;
} kModes[] = {{RTLD_NOW | kOwnSymbols, "now"}, {RTLD_LAZY | RTLD_LOCAL, "lazy"}};

struct {
    bool tried = false;
    void* handle = nullptr;
    xa_switch_t* xa_switch = nullptr;
    LoaderComplaint complain = nullptr;
} loader;

void Complain(const std::string& text) {
    if (loader.complain) loader.complain(text.c_str());
}

const char* Setting(const char* variable, const char* otherwise) {
    const char* value = std::getenv(variable);
    return value && *value ? value : otherwise;
}

std::vector<std::string> Candidates() {
    if (const char* named = Setting("HARNIX_CLIENT_LIBRARY", nullptr)) return {named};
    const std::string directory = ExecutableDirectory();
    return {directory + "/../lib/" + kBundledName, directory + "/" + kBundledName};
}

// Opens the first candidate that can be. `reason` is what the loader said of the first one that could not.
void* Open(const std::vector<std::string>& candidates, std::string& reason) {
    const char* trace_name = Setting("HARNIX_TRACE_LOAD", nullptr);
    std::FILE* trace = trace_name ? std::fopen(trace_name, "w") : nullptr;
    void* handle = nullptr;
    for (const std::string& candidate : candidates) {
        for (const auto& mode : kModes) {
            handle = dlopen(candidate.c_str(), mode.flags);
            const std::string said = handle ? "loaded" : dlerror();
            if (trace) std::fprintf(trace, "%s (%s): %s\n", candidate.c_str(), mode.name, said.c_str());
            if (handle) break;
            if (reason.empty()) reason = said;
        }
        if (handle) break;
    }
    if (trace) std::fclose(trace);
    return handle;
}

void* Find(std::string_view name) {
    if (void* symbol = dlsym(loader.handle, name.data())) return symbol;
    if (!name.ends_with("NS")) return nullptr;
    return dlsym(loader.handle, std::string(name.substr(0, name.size() - 2)).c_str());
}

template <class Signature>
void Resolve(LibraryFunction<Signature>& function) {
    function.pointer = reinterpret_cast<Signature*>(Find(function.name));
}

const char* XaSwitchName() {
    return Setting("HARNIX_XA_SWITCH", "rmXaSwitch");
}

}  // namespace

void SetLoaderComplaint(LoaderComplaint complain) {
    loader.complain = complain;
}

void LoadClientLibrary() {
    if (loader.tried) return;
    loader.tried = true;
    std::string reason;
    loader.handle = Open(Candidates(), reason);
    if (!loader.handle) {
        const char* name = Setting("HARNIX_CLIENT_LIBRARY", kBundledName);
        return Complain(std::string("Could not load client library ") + name + ": " + reason + "\n");
    }
#define FUNCTION(symbol) Resolve(client_library.symbol);
#include "platform/client_functions.def"
#undef FUNCTION
    loader.xa_switch = static_cast<xa_switch_t*>(dlsym(loader.handle, XaSwitchName()));
}

xa_switch_t* XaSwitch() {
    LoadClientLibrary();
    if (!loader.xa_switch) CallMissing(XaSwitchName(), Missing::complains_and_answers_error);
    return loader.xa_switch;
}

void ForgetClientLibrary() {
    const LoaderComplaint complain = loader.complain;
    loader = {};
    loader.complain = complain;
    client_library = {};
}

int CallMissing(const char* name, Missing missing) {
    const bool complains =
        missing == Missing::complains_and_answers_error || missing == Missing::complains_and_answers_zero;
    if (loader.handle && complains) Complain(std::string("Function ") + name + " not found in client library\n");
    return missing == Missing::complains_and_answers_zero || missing == Missing::answers_zero ? 0 : OCI_ERROR;
}
