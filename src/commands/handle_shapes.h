// What the commands on handles share: the words for a new object and for extra memory, the shape of a call on one
// handle, and modes.
#pragma once

#include <cstddef>
#include <cstring>

#include "core/command_table.h"
#include "core/keywords.h"
#include "core/state.h"
#include "objects/registry.h"
#include "oci.h"
#include "platform/client_library.h"
#include "report/return_code.h"
#include "report/trace.h"

// A mode: words joined by "|", or a number.
inline ub4 DecodeMode(const char* word, const KeywordTable* modes = EnvModeKeywords) {
    return static_cast<ub4>(DecodeBitmaskOrNumber(word, modes));
}

// The environment that a named object was made from; null when there is no such object.
inline void* ParentOf(Kind kind, const char* name) {
    const NamedObject* slot = FindByName(kind, name);
    return slot == nullptr ? nullptr : slot->parent;
}

// An object of the first kind, else whatever the word stands for in the second.
inline void* ResolveEither(Kind first, Kind second, const char* name) {
    void* object = nullptr;
    return FindObject(first, name, object) ? object : ResolveObject(second, name);
}

// The object that a command makes: the name it shall have, and the place where the library puts it. "null" and "-1"
// give the library no place.
template <class T> class NewObject {
public:
    explicit NewObject(const char* name) : name_(name) {}

    T** Place() { return OutputName(name_) == nullptr ? nullptr : &object_; }
    T* Get() const { return object_; }
    // What the place holds before the call, where a command hands over an object that exists.
    void Hand(T* object) { object_ = object; }

    // After a call that succeeded. Null when there is no entry: "-1" passes in silence, else the reason has been said.
    NamedObject* Enter(Kind kind, void* parent) const {
        return std::strcmp(name_, "-1") == 0 ? nullptr : Register(kind, name_, object_, parent);
    }

private:
    const char* name_;
    T* object_ = nullptr;
};

// The optional words "[extramem [null]]": memory of the script's own that comes with an object, and whether the library
// is given a place for its address.
class ExtraMemory {
public:
    ExtraMemory() = default;
    ExtraMemory(int count, char** words)
        : size_(count > 0 ? static_cast<size_t>(DecodeLong(words[0])) : 0), placed_(count < 2 || !IsNull(words[1])) {}
    static ExtraMemory None() {
        ExtraMemory none;
        none.placed_ = false;
        return none;
    }

    size_t Size() const { return size_; }
    void** Place() { return placed_ ? &memory_ : nullptr; }
    void* Get() const { return memory_; }
    void DropSize() { size_ = 0; }

private:
    size_t size_ = 0;
    bool placed_ = true;
    void* memory_ = nullptr;
};

// The error handle for commands that are given none: the first one made since the last one here was freed.
inline void AdoptErrorHandle(OCIError* error) {
    if (DefaultErrorHandle == nullptr) DefaultErrorHandle = error;
}
inline void ForgetErrorHandle(const void* error) {
    if (DefaultErrorHandle == error) DefaultErrorHandle = nullptr;
}

// A call on one handle and its error handle: words[1] and words[2]. What further words mean is the call's own.
struct HandleCall : CommandRow {
    Kind kind;
    Kind other_kind;  // looked through after `kind`; the same one where there is no choice
    sword (*call)(void* handle, OCIError* error, char** words);
};
inline void RunHandleCall(const HandleCall& row, int, char** words) {
    void* const handle = ResolveEither(row.kind, row.other_kind, words[1]);
    auto* const error = ResolveError<OCIError>(words[2]);
    const sword rc = row.call(handle, error, words);
    TraceAndReport(row.code, words[1], error, rc);
}
