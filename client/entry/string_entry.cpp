// Strings, raws and the text of row ids. Strings and raws differ in their names alone. A value is not locked: threads
// that change one at a time are the application's to keep apart.
#include <cstring>

#include "handles/errors.h"
#include "handles/gate.h"
#include "text/variable.h"
#include "values/rowid_descriptor.h"

namespace {

template <class Handle> struct ClassOf;
template <> struct ClassOf<OCIString> { using Type = String; };
template <> struct ClassOf<OCIRaw> { using Type = Raw; };

// Works on the object behind `*place`, or on a new one that is put there when all went well: change(object). A pointer
// that is no living object is refused like any bad handle.
template <class Handle, class Change>
sword ChangeAt(OCIEnv* env, OCIError* err, Handle** place, Change change) {
    using T = typename ClassOf<Handle>::Type;
    return Enter<Environment>(env, err, [&](Environment& environment) -> Status {
        if (!place) return Error(errors::kNullArgument);
        if (*place) {
            T* object = Live<T>(*place);
            return object ? change(*object) : InvalidHandle();
        }
        Status changed;
        Made<T> made(Create<T>(environment, 0, 0, change, changed));
        if (changed.Ok()) *place = AsHandle<Handle>(made.release());
        return changed;
    });
}

// A null source stands for nothing.
template <class Handle>
sword AssignBytes(OCIEnv* env, OCIError* err, const void* source, ub4 length, Handle** place) {
    const std::string_view content(static_cast<const char*>(source), source ? length : 0);
    return ChangeAt(env, err, place, [content](Variable& target) { return target.Assign(content); });
}

template <class Handle>
sword AssignObject(OCIEnv* env, OCIError* err, const Handle* source, Handle** place) {
    return ChangeAt(env, err, place, [source](Variable& target) {
        if (!source) return target.Assign("");
        const Variable* from = Live<typename ClassOf<Handle>::Type>(source);
        return from ? target.Assign(*from) : InvalidHandle();
    });
}

// A size of 0 frees the object.
template <class Handle>
sword Resize(OCIEnv* env, OCIError* err, ub4 size, Handle** place) {
    using T = typename ClassOf<Handle>::Type;
    if (size > 0) return ChangeAt(env, err, place, [size](Variable& target) { return target.Resize(size); });
    return Enter<Environment>(env, err, [&](Environment&) -> Status {
        if (!place) return Error(errors::kNullArgument);
        if (!*place) return {};
        T* object = Live<T>(*place);
        if (!object) return InvalidHandle();
        if (!Destroy(object)) return InvalidHandle();
        *place = nullptr;
        return {};
    });
}

template <class Handle>
sword GetRoom(OCIEnv* env, OCIError* err, const Handle* pointer, ub4* size) {
    return Enter<Environment>(env, err, [&](Environment&) -> Status {
        if (!pointer || !size) return Error(errors::kNullArgument);
        const auto* object = Live<typename ClassOf<Handle>::Type>(pointer);
        if (!object) return InvalidHandle();
        *size = object->Room();
        return {};
    });
}

// These calls have no way to tell of a mistake: null or 0 it is.
template <class Handle>
const Variable* Find(const OCIEnv* env, const Handle* pointer) {
    return Live<Environment>(env) ? Live<typename ClassOf<Handle>::Type>(pointer) : nullptr;
}

template <class Handle>
void* Contents(const OCIEnv* env, const Handle* pointer) {
    const CallInFlight call;
    const Variable* object = Find(env, pointer);
    return object ? object->Data() : nullptr;
}

template <class Handle>
ub4 Size(const OCIEnv* env, const Handle* pointer) {
    const CallInFlight call;
    const Variable* object = Find(env, pointer);
    return object ? object->Size() : 0;
}

// The zero that closes the text is written when there is room for it.
Status RowIdText(const RowIdDescriptor& descriptor, OraText* buf, ub2* len) {
    if (!buf || !len) return Error(errors::kNullArgument);
    if (!descriptor.value) return Error(errors::kInvalidRowId);
    char text[rowid::kTextLength];
    rowid::ToText(*descriptor.value, text);
    std::string converted;
    const std::string_view shown = TextOut(descriptor.Env(), {text, sizeof text}, converted);
    const std::size_t room = *len;
    *len = static_cast<ub2>(shown.size());
    if (room < shown.size()) return Error(errors::kBufferTooSmall, std::to_string(shown.size()) + " bytes are needed");
    shown.copy(reinterpret_cast<char*>(buf), shown.size());
    const std::size_t terminator = descriptor.Env().Utf16() ? 2 : 1;
    if (room - shown.size() >= terminator) std::memset(buf + shown.size(), 0, terminator);
    return {};
}

}  // namespace

sword OCIStringAssign(OCIEnv* env, OCIError* err, const OCIString* rhs, OCIString** lhs) {
    return AssignObject(env, err, rhs, lhs);
}

sword OCIStringAssignText(OCIEnv* env, OCIError* err, const OraText* rhs, ub4 rhsLen, OCIString** lhs) {
    return AssignBytes(env, err, rhs, rhsLen, lhs);
}

sword OCIStringResize(OCIEnv* env, OCIError* err, ub4 newSize, OCIString** string) {
    return Resize(env, err, newSize, string);
}

sword OCIStringAllocSize(OCIEnv* env, OCIError* err, const OCIString* string, ub4* size) {
    return GetRoom(env, err, string, size);
}

OraText* OCIStringPtr(OCIEnv* env, const OCIString* string) { return static_cast<OraText*>(Contents(env, string)); }

ub4 OCIStringSize(OCIEnv* env, const OCIString* string) { return Size(env, string); }

sword OCIRawAssignRaw(OCIEnv* env, OCIError* err, const OCIRaw* rhs, OCIRaw** lhs) {
    return AssignObject(env, err, rhs, lhs);
}

sword OCIRawAssignBytes(OCIEnv* env, OCIError* err, const ub1* rhs, ub4 rhsLen, OCIRaw** lhs) {
    return AssignBytes(env, err, rhs, rhsLen, lhs);
}

sword OCIRawResize(OCIEnv* env, OCIError* err, ub4 newSize, OCIRaw** raw) { return Resize(env, err, newSize, raw); }

sword OCIRawAllocSize(OCIEnv* env, OCIError* err, const OCIRaw* raw, ub4* size) { return GetRoom(env, err, raw, size); }

ub1* OCIRawPtr(OCIEnv* env, const OCIRaw* raw) { return static_cast<ub1*>(Contents(env, raw)); }

ub4 OCIRawSize(OCIEnv* env, const OCIRaw* raw) { return Size(env, raw); }

sword OCIRowidToChar(OCIRowid* rid, OraText* buf, ub2* len, OCIError* err) {
    return Enter<RowIdDescriptor>(rid, err, [&](const RowIdDescriptor& row) { return RowIdText(row, buf, len); });
}
