// Objects: everything the library hands out by pointer (handles, descriptors, strings, raws, files, thread objects).
//
// An object belongs to an environment and hangs below a parent (the environment, a statement, a describe handle, ...):
// destroying the parent destroys it. Its memory comes from the environment. What the application passes in is checked
// by Live, which asks the set of living objects and never reads the memory behind an unknown pointer. Objects are
// looked up and used inside a call in flight (in_flight.h says for how long); what they hold is guarded by their serial
// mutex.
#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <forward_list>
#include <memory>
#include <mutex>
#include <new>
#include <span>
#include <string>
#include <utility>
#include <vector>

#include "handles/live.h"

class Environment;
struct AttributeRow;

using TypeCode = std::uint32_t;    // OCI_HTYPE_* or OCI_DTYPE_*; 0 for objects that have neither

class Object;

// Where an object comes from: the first argument of every object's constructor, handed on to Object.
struct Origin {
    Environment& environment;
    Object* parent;    // null for an environment alone
    TypeCode type;
};

class Object {
public:
    explicit Object(const Origin& origin)
        : environment_(&origin.environment), parent_(origin.parent), type_(origin.type) {}
    virtual ~Object() = default;
    Object(const Object&) = delete;
    Object& operator=(const Object&) = delete;

    [[nodiscard]] TypeCode Type() const { return type_; }
    [[nodiscard]] Environment& Env() const { return *environment_; }
    [[nodiscard]] Object* Parent() const { return parent_; }
    [[nodiscard]] void* UserMemory() const { return user_memory_; }

    // What OCIAttrGet and OCIAttrSet know of this object, beside the attributes that every object has.
    [[nodiscard]] virtual std::span<const AttributeRow> Attributes() const { return {}; }

    // What calls on this object hold while they run: one mutex a connection in a threaded environment, else null.
    [[nodiscard]] virtual std::shared_ptr<std::recursive_mutex> Serial() { return nullptr; }

    // Keeps a converted attribute text for as long as the object lives or until the same attribute is kept anew.
    std::string& KeptText(std::uint32_t attribute);

    // Whether OCIHandleFree must refuse (24386).
    [[nodiscard]] virtual bool InUse() const { return false; }

    // No call finds the object any more; it is destroyed when the last one that may know it has ended. For waking those
    // who wait in it. Under the lock of the environment's tree: nothing may be made or destroyed.
    virtual void Withdrawn() noexcept {}

protected:
    // For objects that become something else in place; live::Retype goes with it.
    void SetType(TypeCode type) { type_ = type; }

private:
    friend class ObjectTree;
    friend class RetiredObjects;
    Environment* environment_;
    Object* parent_;
    Object* first_child_ = nullptr;
    Object* previous_ = nullptr;
    Object* next_ = nullptr;
    in_flight::Epoch born_ = 0;       // its epochs (in_flight.h)
    in_flight::Epoch retired_ = 0;    // once it is
    void* user_memory_ = nullptr;
    std::forward_list<std::pair<std::uint32_t, std::string>> kept_texts_;    // a text stays where it is
    TypeCode type_;
};

// Held while a call on an object runs, which may destroy the object; nothing in environments without threads. Who waits
// for it keeps nothing that others free meanwhile.
class SerialLock {
public:
    using Mutex = std::shared_ptr<std::recursive_mutex>;

    explicit SerialLock(Object& object);
    explicit SerialLock(Mutex mutex) { Lock(std::move(mutex)); }
    SerialLock(Object& object, std::try_to_lock_t);    // waits for nothing, as the next
    SerialLock(Mutex mutex, std::try_to_lock_t) : mutex_(std::move(mutex)), owns_(!mutex_ || mutex_->try_lock()) {}
    ~SerialLock() { if (mutex_) Unlock(); }
    SerialLock(const SerialLock&) = delete;
    SerialLock& operator=(const SerialLock&) = delete;

    [[nodiscard]] bool Owns() const { return owns_; }

private:
    void LockThreaded(Object& object);
    bool Lock(Mutex mutex);    // true when it had to wait
    void Unlock() noexcept;

    Mutex mutex_;
    bool owns_ = true;    // there is no mutex, or it is locked
};

// Makes and destroys objects; the links between them are the tree's alone. Safe from several threads.
class ObjectTree {
public:
    // Memory of an object of `size` bytes and its user memory; throws std::bad_alloc.
    static void* Reserve(Environment& environment, std::size_t size);
    static void Unreserve(Environment& environment, void* memory) noexcept;
    // Hangs the object below its parent and makes it live. Throws std::bad_alloc and changes nothing then.
    static void Adopt(Object& object, Kind kind, std::size_t extra);
    // Destroys the object and all below it, or has it destroyed when the last call that may know it has ended. False
    // when it is destroyed or waits for that already, or goes with what it hangs below.
    static bool Destroy(Object* object) noexcept;

private:
    friend class RetiredObjects;
    // The next three hold, or are called under, the lock of the environment's tree.
    static void Link(Object& object, Kind kind);
    static void Unlink(Object& object) noexcept;
    static bool Withdraw(Object& object) noexcept;
    static void DestroyTree(Object* object) noexcept;
};

// The living T behind a pointer, or null. T::kKind says its kind; Live<Object> takes any. In line: nearly every call
// asks twice, and mostly for what it asked for last.
template <class T>
[[gnu::always_inline]] inline T* Live(const void* pointer) noexcept {
    if constexpr (requires { T::kKind; }) {
        if (!live::Is<T::kKind>(pointer)) return nullptr;
    } else {
        if (live::KindOf(pointer) == Kind::none) return nullptr;
    }
    if (!pointer) __builtin_unreachable();    // no object lives there: callers' checks of the answer cost nothing
    return static_cast<T*>(static_cast<Object*>(const_cast<void*>(pointer)));
}

// The living object of one of two kinds, looked up once.
inline Object* LiveOneOf(const void* pointer, Kind one, Kind other) noexcept {
    const Kind kind = live::KindOf(pointer);
    return kind == one || kind == other ? static_cast<Object*>(const_cast<void*>(pointer)) : nullptr;
}

// Makes a T below `parent` with `extra` bytes of user memory (zeroed). Throws std::bad_alloc.
template <class T, class... Arguments>
T* Create(Object& parent, TypeCode type, std::size_t extra, Arguments&&... arguments) {
    Environment& environment = parent.Env();
    void* memory = ObjectTree::Reserve(environment, sizeof(T));
    T* object = nullptr;
    try {
        object = new (memory) T(Origin{environment, &parent, type}, std::forward<Arguments>(arguments)...);
        ObjectTree::Adopt(*object, T::kKind, extra);
    } catch (...) {
        if (object) object->~T();
        ObjectTree::Unreserve(environment, memory);
        throw;
    }
    return object;
}

inline bool Destroy(Object* object) noexcept { return ObjectTree::Destroy(object); }

// Owns an object that nobody has been given yet, or that is to go whatever happens.
struct Destroyer {
    void operator()(Object* object) const noexcept { Destroy(object); }
};
template <class T>
using Made = std::unique_ptr<T, Destroyer>;

// The pointer that the application gets: AsHandle<OCIStmt>(statement).
template <class Handle>
Handle* AsHandle(Object* object) {
    return static_cast<Handle*>(static_cast<void*>(object));
}
