// Environments and the process: OCIEnvCreate, OCIEnvInit, OCIInitialize, OCITerminate, version, block count. There is
// no handle yet to leave a record with. From any thread at any time.
#include <cstdint>
#include <limits>

#include "handles/gate.h"
#include "kelpci.h"
#include "oci.h"

namespace {

constexpr sword kClientVersion[] = {1, 0, 0, 0, 0};

sword OpenEnvironment(OCIEnv** env_out, ub4 mode, const Environment::CharacterSets& sets, const MemoryFunctions& memory,
                      size_t extra, dvoid** extra_out) {
    if (!env_out) return OCI_ERROR;
    const CallInFlight call;
    Environment* environment = Environment::Open(mode, sets, memory, extra);
    if (!environment) return OCI_ERROR;
    *env_out = AsHandle<OCIEnv>(environment);
    if (extra_out) *extra_out = environment->UserMemory();
    return OCI_SUCCESS;
}

MemoryFunctions Functions(const dvoid* context, OCIAllocFunction allocate, OCIFreeFunction release) {
    return {const_cast<dvoid*>(context), allocate, release};
}

}  // namespace

// The reallocation function is never needed: what grows is allocated anew.
sword OCIEnvCreate(OCIEnv** envOut, ub4 mode, const dvoid* memctx, OCIAllocFunction allocate, OCIReallocFunction,
                   OCIFreeFunction release, size_t extra, dvoid** extraOut) {
    return OpenEnvironment(envOut, mode, Environment::SetsOf(mode), Functions(memctx, allocate, release), extra,
                           extraOut);
}

// A set of 0 is what the mode says or else the locale's; the national one's 0 is the other's.
sword OCIEnvNlsCreate(OCIEnv** envOut, ub4 mode, const dvoid* memctx, OCIAllocFunction allocate, OCIReallocFunction,
                      OCIFreeFunction release, size_t extra, dvoid** extraOut, ub2 charset, ub2 ncharset) try {
    const ub2 usual = mode & OCI_UTF16 ? OCI_UTF16ID : charset::IdOfLocale();
    const CharacterSet* text = charset::Find(charset ? charset : usual);
    const CharacterSet* national = ncharset ? charset::Find(ncharset) : text;
    if (!text || !national) return OCI_ERROR;
    return OpenEnvironment(envOut, mode, {text, national}, Functions(memctx, allocate, release), extra, extraOut);
} catch (const std::bad_alloc&) {
    return OCI_ERROR;
}

sword OCIEnvInit(OCIEnv** envOut, ub4 mode, size_t extra, dvoid** extraOut) {
    const ProcessDefaults defaults = GetProcessDefaults();
    const ub4 own_mode = mode & ~static_cast<ub4>(OCI_ENV_NO_UCB | OCI_ENV_NO_MUTEX);
    const ub4 whole_mode = defaults.mode | own_mode;
    return OpenEnvironment(envOut, whole_mode, Environment::SetsOf(whole_mode), defaults.memory, extra, extraOut);
}

sword OCIInitialize(ub4 mode, const dvoid* memctx, OCIAllocFunction allocate, OCIReallocFunction,
                    OCIFreeFunction release) {
    SetProcessDefaults({mode, Functions(memctx, allocate, release)});
    return OCI_SUCCESS;
}

// Environments that are still open stay usable: they may be another part's of the program.
sword OCITerminate(ub4) {
    SetProcessDefaults({});
    return OCI_SUCCESS;
}

void OCIClientVersion(sword* major, sword* minor, sword* update, sword* patch, sword* port) {
    sword* const places[] = {major, minor, update, patch, port};
    for (size_t index = 0; index < std::size(places); ++index) {
        if (places[index]) *places[index] = kClientVersion[index];
    }
}

sb4 OCI_memGetMemCount(void) {
    constexpr std::int64_t kMost = std::numeric_limits<sb4>::max();
    const std::int64_t blocks = HeldBlocks();
    return static_cast<sb4>(blocks < kMost ? blocks : kMost);
}
