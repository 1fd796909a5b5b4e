// The gate that every exported function passes: marks the call as in flight, checks the error handle and the object
// (null, foreign and freed pointers get OCI_INVALID_HANDLE and no record), empties the records, runs the body, turns
// what it answers or throws into a record and the return code. Bodies answer a Status and may throw. Every pointer is
// looked up once, and inside the call in flight: what it gives lives until the call's end, whoever frees it. What a
// body looks up beside the gate's object is not locked by the gate. The handle that records keeps the name of the
// calling function, for OCI_ATTR_FNCODE.
//
//   sword OCIPing(OCISvcCtx* svchp, OCIError* errhp, ub4) {
//       return Enter<ServiceContext>(svchp, errhp, [](ServiceContext& service) { return service.Ping(); });
//   }
#pragma once

#include <exception>
#include <new>
#include <utility>

#include "handles/environment.h"
#include "handles/error_handle.h"
#include "handles/errors.h"
#include "handles/in_flight.h"
#include "oci.h"

// Adds the record of a status and answers its return code.
inline sword Record(ErrorList& list, const Status& status) noexcept {
    list.Add(status);
    return status.Code();
}

// What is being thrown, as an error; without its words where they find no memory.
inline Status Caught() noexcept try {
    throw;
} catch (const std::bad_alloc&) {
    return Error(errors::kOutOfMemory);
} catch (const std::exception& failure) {
    try {
        return Error(errors::kInternalError, failure.what());
    } catch (...) {
        return Error(errors::kInternalError);
    }
} catch (...) {
    return Error(errors::kInternalError);
}

// Runs a body and records into `list`.
template <class Body>
sword Guard(ErrorList& list, Body&& body) noexcept {
    try {
        const Status status = body();
        return status.Ok() ? OCI_SUCCESS : Record(list, status);
    } catch (...) {
        return Record(list, Caught());
    }
}

// Calls that have an object and an error handle, and need both: body(T&, ErrorHandle&).
template <class T, class Body>
sword EnterWithError(const void* object, OCIError* errhp, Body&& body,
                     const char* name = __builtin_FUNCTION()) noexcept {
    const CallInFlight call;
    ErrorHandle* error = Live<ErrorHandle>(errhp);
    if (!error) return OCI_INVALID_HANDLE;
    error->Begin(name);
    T* target = Live<T>(object);
    if (!target) return OCI_INVALID_HANDLE;
    const SerialLock lock(*target);
    return Guard(error->list, [&] {
        if constexpr (requires { target->Admit(); }) {
            if (Status status = target->Admit(); !status.Ok()) return status;
        }
        return body(*target, *error);
    });
}

// The same for bodies that answer with a status alone: body(T&).
template <class T, class Body>
sword Enter(const void* object, OCIError* errhp, Body&& body, const char* name = __builtin_FUNCTION()) noexcept {
    return EnterWithError<T>(object, errhp, [&](T& target, ErrorHandle&) { return body(target); }, name);
}

// The same without the object's lock, for bodies that lock what they need themselves, in an order of their own.
template <class T, class Body>
sword EnterUnlocked(const void* object, OCIError* errhp, Body&& body,
                    const char* name = __builtin_FUNCTION()) noexcept {
    const CallInFlight call;
    ErrorHandle* error = Live<ErrorHandle>(errhp);
    if (!error) return OCI_INVALID_HANDLE;
    error->Begin(name);
    T* target = Live<T>(object);
    return target ? Guard(error->list, [&] { return body(*target); }) : OCI_INVALID_HANDLE;
}

// Calls that have nothing but an error handle: body(ErrorHandle&).
template <class Body>
sword EnterError(OCIError* errhp, Body&& body, const char* name = __builtin_FUNCTION()) noexcept {
    const CallInFlight call;
    ErrorHandle* error = Live<ErrorHandle>(errhp);
    if (!error) return OCI_INVALID_HANDLE;
    error->Begin(name);
    return Guard(error->list, [&] { return body(*error); });
}

// Calls whose first argument is an environment or a session handle: body(Environment&).
template <class Body>
sword EnterHandle(const void* handle, OCIError* errhp, Body&& body, const char* name = __builtin_FUNCTION()) noexcept {
    const CallInFlight call;
    ErrorHandle* error = Live<ErrorHandle>(errhp);
    if (!error) return OCI_INVALID_HANDLE;
    error->Begin(name);
    const Object* target = LiveOneOf(handle, Kind::environment, Kind::session);
    if (!target) return OCI_INVALID_HANDLE;
    return Guard(error->list, [&] { return body(target->Env()); });
}

// Calls that have nothing but a parent environment; what goes wrong is recorded there: body(Environment&).
template <class Body>
sword EnterEnvironment(const void* parent, Body&& body, const char* name = __builtin_FUNCTION()) noexcept {
    const CallInFlight call;
    Environment* environment = Live<Environment>(parent);
    if (!environment) return OCI_INVALID_HANDLE;
    environment->last_call = name;
    ErrorList records;
    const sword code = Guard(records, [&] { return body(*environment); });
    environment->errors.TakeFrom(records);
    return code;
}
