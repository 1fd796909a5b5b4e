// The thread package: its calls find their objects inside the gate's call, and wait, where they wait, without keeping
// what others free. The objects guard themselves.
#include "handles/errors.h"
#include "handles/package.h"
#include "threads/thread.h"

namespace {

template <class Handle> struct ClassOf;
template <> struct ClassOf<OCIThreadMutex> { using Type = ThreadMutex; };
template <> struct ClassOf<OCIThreadKey> { using Type = ThreadKey; };
template <> struct ClassOf<OCIThreadId> { using Type = ThreadId; };
template <> struct ClassOf<OCIThreadHandle> { using Type = ThreadHandle; };
template <class Handle> using Class = typename ClassOf<Handle>::Type;

constinit Package the_package{errors::kNullArgument, "the thread package is not initialised"};

// An object that must be given. What is no living one is refused like any bad handle.
template <class Handle>
Status Find(Handle* pointer, Class<Handle>*& object) {
    if (!pointer) return Error(errors::kNullArgument);
    object = Live<Class<Handle>>(pointer);
    return object ? Status() : InvalidHandle();
}

// Calls on one object: body(object).
template <class Handle, class Body>
sword EnterObject(void* handle, OCIError* err, Handle* pointer, Body body) {
    return the_package.Enter(handle, err, [&](Environment&) -> Status {
        Class<Handle>* object = nullptr;
        Status found = Find(pointer, object);
        return found.Ok() ? body(*object) : found;
    });
}

// Calls on two of a kind: body(first, second).
template <class Handle, class Body>
sword EnterObjects(void* handle, OCIError* err, Handle* first, Handle* second, Body body) {
    return EnterObject(handle, err, first, [&](Class<Handle>& one) -> Status {
        Class<Handle>* other = nullptr;
        Status found = Find(second, other);
        return found.Ok() ? body(one, *other) : found;
    });
}

// A pointer to an object that lives already must not be made anew.
template <class Handle, class... Arguments>
sword Make(void* handle, OCIError* err, Handle** place, Arguments... arguments) {
    return the_package.Enter(handle, err, [&](Environment& environment) -> Status {
        if (!place || Live<Class<Handle>>(*place)) return Error(errors::kNullArgument);
        *place = AsHandle<Handle>(Create<Class<Handle>>(environment, 0, 0, arguments...));
        return {};
    });
}

// Destroys the object when check(object) does not object, and empties the pointer.
template <class Handle, class Check>
sword Unmake(void* handle, OCIError* err, Handle** place, Check check) {
    return the_package.Enter(handle, err, [&](Environment&) -> Status {
        if (!place) return Error(errors::kNullArgument);
        Class<Handle>* object = nullptr;
        Status status = Find(*place, object);
        if (status.Ok()) status = check(*object);
        if (!status.Ok()) return status;
        if (!Destroy(object)) return InvalidHandle();    // another thread has
        *place = nullptr;
        return {};
    });
}

template <class Handle>
sword Unmake(void* handle, OCIError* err, Handle** place) {
    return Unmake(handle, err, place, [](const Object&) { return Status(); });
}

// An object that may be missing, but not be a dead one.
template <class Handle>
Status FindOptional(Handle* pointer, Class<Handle>*& object) {
    return pointer ? Find(pointer, object) : Status();
}

Status Start(void (*start)(dvoid*), dvoid* argument, OCIThreadId* tid, OCIThreadHandle* th) {
    if (!start) return Error(errors::kNullArgument);
    ThreadId* id = nullptr;
    ThreadHandle* handle = nullptr;
    Status found = FindOptional(tid, id);
    if (found.Ok()) found = FindOptional(th, handle);
    return found.Ok() ? StartThread(start, argument, id, handle) : found;
}

}  // namespace

// Nothing has to be prepared: the library is always ready for threads.
void OCIThreadProcessInit(void) {}

boolean OCIThreadIsMulti(void) { return TRUE; }

sword OCIThreadInit(dvoid* hndl, OCIError* err) {
    return EnterHandle(hndl, err, [](Environment&) { return the_package.Init(), Status(); });
}

sword OCIThreadTerm(dvoid* hndl, OCIError* err) {
    return EnterHandle(hndl, err, [](Environment&) { return the_package.Term(); });
}

sword OCIThreadMutexInit(dvoid* hndl, OCIError* err, OCIThreadMutex** mutex) { return Make(hndl, err, mutex); }

sword OCIThreadMutexDestroy(dvoid* hndl, OCIError* err, OCIThreadMutex** mutex) {
    return Unmake(hndl, err, mutex, [](ThreadMutex& object) { return object.CheckFree(); });
}

sword OCIThreadMutexAcquire(dvoid* hndl, OCIError* err, OCIThreadMutex* mutex) {
    return EnterObject(hndl, err, mutex, [](ThreadMutex& object) { return object.Acquire(); });
}

sword OCIThreadMutexRelease(dvoid* hndl, OCIError* err, OCIThreadMutex* mutex) {
    return EnterObject(hndl, err, mutex, [](ThreadMutex& object) { return object.Release(); });
}

sword OCIThreadKeyInit(dvoid* hndl, OCIError* err, OCIThreadKey** key, OCIThreadKeyDestFunc destroy) {
    return Make(hndl, err, key, destroy);
}

sword OCIThreadKeyDestroy(dvoid* hndl, OCIError* err, OCIThreadKey** key) { return Unmake(hndl, err, key); }

sword OCIThreadKeySet(dvoid* hndl, OCIError* err, OCIThreadKey* key, dvoid* value) {
    return EnterObject(hndl, err, key, [value](ThreadKey& object) { return object.Set(value), Status(); });
}

sword OCIThreadKeyGet(dvoid* hndl, OCIError* err, OCIThreadKey* key, dvoid** value) {
    return EnterObject(hndl, err, key, [value](const ThreadKey& object) -> Status {
        if (!value) return Error(errors::kNullArgument);
        *value = object.Get();
        return {};
    });
}

sword OCIThreadIdInit(dvoid* hndl, OCIError* err, OCIThreadId** tid) { return Make(hndl, err, tid); }

sword OCIThreadIdDestroy(dvoid* hndl, OCIError* err, OCIThreadId** tid) { return Unmake(hndl, err, tid); }

sword OCIThreadIdSet(dvoid* hndl, OCIError* err, OCIThreadId* dst, OCIThreadId* src) {
    return EnterObjects(hndl, err, dst, src, [](ThreadId& target, const ThreadId& source) {
        return target.number = source.number.load(), Status();
    });
}

sword OCIThreadIdSetNull(dvoid* hndl, OCIError* err, OCIThreadId* tid) {
    return EnterObject(hndl, err, tid, [](ThreadId& id) { return id.number = 0, Status(); });
}

sword OCIThreadIdGet(dvoid* hndl, OCIError* err, OCIThreadId* tid) {
    return EnterObject(hndl, err, tid, [](ThreadId& id) { return id.number = CurrentThread()->number, Status(); });
}

sword OCIThreadIdSame(dvoid* hndl, OCIError* err, OCIThreadId* tid1, OCIThreadId* tid2, boolean* same) {
    return EnterObjects(hndl, err, tid1, tid2, [same](const ThreadId& left, const ThreadId& right) -> Status {
        if (!same) return Error(errors::kNullArgument);
        *same = left.number == right.number;
        return {};
    });
}

sword OCIThreadIdNull(dvoid* hndl, OCIError* err, OCIThreadId* tid, boolean* isNull) {
    return EnterObject(hndl, err, tid, [isNull](const ThreadId& id) -> Status {
        if (!isNull) return Error(errors::kNullArgument);
        *isNull = id.number == 0;
        return {};
    });
}

sword OCIThreadHndInit(dvoid* hndl, OCIError* err, OCIThreadHandle** th) { return Make(hndl, err, th); }

sword OCIThreadHndDestroy(dvoid* hndl, OCIError* err, OCIThreadHandle** th) { return Unmake(hndl, err, th); }

sword OCIThreadCreate(dvoid* hndl, OCIError* err, OCIThreadStartFunction start, dvoid* arg, OCIThreadId* tid,
                      OCIThreadHandle* th) {
    return the_package.Enter(hndl, err, [&](Environment&) { return Start(start, arg, tid, th); });
}

sword OCIThreadJoin(dvoid* hndl, OCIError* err, OCIThreadHandle* th) {
    return EnterObject(hndl, err, th, [](ThreadHandle& handle) { return handle.Join(); });
}

sword OCIThreadClose(dvoid* hndl, OCIError* err, OCIThreadHandle* th) {
    return EnterObject(hndl, err, th, [](ThreadHandle& handle) { return handle.Close(); });
}

sword OCIThreadHandleGet(dvoid* hndl, OCIError* err, OCIThreadHandle* th) {
    return EnterObject(hndl, err, th, [](ThreadHandle& handle) { return handle.Set(CurrentThread()), Status(); });
}
