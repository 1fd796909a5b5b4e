// OCIAttrGet and OCIAttrSet: the object must be of the type that is named. Its serial lock is held meanwhile; objects
// without one are the application's to keep apart.
#include "handles/attributes.h"
#include "handles/gate.h"
#include "oci.h"

namespace {

// A call that asks an error handle about itself leaves its records alone.
template <class Body>
sword EnterAttribute(const void* object, ub4 type, OCIError* errhp, Body&& body,
                     const char* name = __builtin_FUNCTION()) noexcept {
    const CallInFlight call;
    ErrorHandle* error = Live<ErrorHandle>(errhp);
    if (!error) return OCI_INVALID_HANDLE;
    Object* target = Live<Object>(object);
    if (static_cast<const Object*>(error) != target) error->Begin(name);
    if (!target || target->Type() != type) return OCI_INVALID_HANDLE;
    const SerialLock lock(*target);
    return Guard(error->list, [&] { return body(*target); });
}

}  // namespace

sword OCIAttrGet(const dvoid* hndl, ub4 type, dvoid* value, ub4* size, ub4 attr, OCIError* err) {
    return EnterAttribute(hndl, type, err, [&](Object& object) { return GetAttribute(object, value, size, attr); });
}

sword OCIAttrSet(dvoid* hndl, ub4 type, dvoid* value, ub4 size, ub4 attr, OCIError* err) {
    return EnterAttribute(hndl, type, err, [&](Object& object) { return SetAttribute(object, value, size, attr); });
}
