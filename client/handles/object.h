// Objects: everything the library hands out by pointer (handles, descriptors, strings, raws, files, thread objects).
//
// An object belongs to an environment and hangs below a parent (the environment, a statement, a describe handle, ...):
// destroying the parent destroys it. Its memory comes from the environment. What the application passes in is checked
// by Live, which asks the set of living objects and never reads the memory behind an unknown pointer.
#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <mutex>
#include <new>
#include <span>
#include <string>
#include <utility>
#include <vector>

class Environment;
struct AttributeRow;

using TypeCode = std::uint32_t;    // OCI_HTYPE_* or OCI_DTYPE_*; 0 for objects that have neither

// One value for each class that Live can ask for. A class may serve several type codes.
enum class Kind : std::uint8_t {
    none,
    environment, error, service_context, statement, bind, define, describe, server, session, transaction,
    connection_pool, session_pool, plain_handle, descriptor_array,
    lob, snapshot, result_set, parameter, row_id, datetime, interval, plain_descriptor,
    string, raw, file, thread_mutex, thread_key, thread_id, thread_handle
};

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
    std::uint64_t retired_ = 0;    // the epoch, once it is
    void* user_memory_ = nullptr;
    std::vector<std::pair<std::uint32_t, std::string>> kept_texts_;
    TypeCode type_;
};

// Held while a call on an object runs, which may destroy the object; nothing in environments without threads.
class SerialLock {
public:
    explicit SerialLock(Object& object);
    explicit SerialLock(std::shared_ptr<std::recursive_mutex> mutex) { Lock(std::move(mutex)); }
    ~SerialLock() { if (mutex_) mutex_->unlock(); }
    SerialLock(const SerialLock&) = delete;
    SerialLock& operator=(const SerialLock&) = delete;

private:
    void Lock(std::shared_ptr<std::recursive_mutex> mutex);

    std::shared_ptr<std::recursive_mutex> mutex_;
};

// Makes and destroys objects; the links between them are the tree's alone. Safe from several threads.
class ObjectTree {
public:
    // Memory of an object of `size` bytes and its user memory; throws std::bad_alloc.
    static void* Reserve(Environment& environment, std::size_t size);
    static void Unreserve(Environment& environment, void* memory) noexcept;
    // Hangs the object below its parent and makes it live. Throws std::bad_alloc and changes nothing then.
    static void Adopt(Object& object, Kind kind, std::size_t extra);
    // Destroys the object and all below it; later, when another thread is inside a call. False when another thread has
    // done so meanwhile: it or what it hangs below.
    static bool Destroy(Object* object) noexcept;

private:
    friend class RetiredObjects;
    // The next three hold, or are called under, the lock of the environment's tree.
    static void Link(Object& object, Kind kind);
    static void Unlink(Object& object) noexcept;
    static bool Withdraw(Object& object) noexcept;
    static void DestroyTree(Object* object) noexcept;
};

// The set of living objects: a hash table from pointer to kind. KindOf takes no lock and reads nothing but the table;
// it is inline, since every call of the library asks at least once.
namespace live {

using Key = std::uintptr_t;
constexpr Key kEmpty = 0;
constexpr Key kErased = 1;    // no object lies there

struct Slot {
    std::atomic<Key> key{kEmpty};
    std::atomic<Kind> kind{Kind::none};
};

struct Table {
    unsigned shift;
    std::size_t mask;
    Slot* slots;

    [[nodiscard]] std::size_t Home(Key key) const {
        return static_cast<std::size_t>((key * std::uint64_t{0x9E3779B97F4A7C15}) >> shift);
    }
    [[nodiscard]] std::size_t Next(std::size_t index) const { return (index + 1) & mask; }
    [[nodiscard]] std::size_t Previous(std::size_t index) const { return (index - 1) & mask; }
};

extern constinit std::atomic<const Table*> current;    // never null

// Kind::none when it is no living object.
inline Kind KindOf(const void* pointer) noexcept {
    const Key key = reinterpret_cast<Key>(pointer);
    if (key <= kErased) return Kind::none;
    const Table& table = *current.load(std::memory_order_acquire);
    for (std::size_t index = table.Home(key);; index = table.Next(index)) {
        const Key found = table.slots[index].key.load(std::memory_order_acquire);
        if (found == key) return table.slots[index].kind.load(std::memory_order_relaxed);
        if (found == kEmpty) return Kind::none;
    }
}

void Insert(const void* pointer, Kind kind);    // throws std::bad_alloc and changes nothing then
bool Erase(const void* pointer) noexcept;       // false when it is not in the set
// Nothing for an object that another thread has erased. As Kind::none an object stays in the set, but is not found.
void Retype(const void* pointer, Kind kind) noexcept;
bool Contains(const void* pointer) noexcept;    // of any kind, Kind::none too
}  // namespace live

// The living T behind a pointer, or null. T::kKind says its kind; Live<Object> takes any.
template <class T>
T* Live(const void* pointer) noexcept {
    const Kind kind = live::KindOf(pointer);
    if constexpr (requires { T::kKind; }) {
        if (kind != T::kKind) return nullptr;
    } else {
        if (kind == Kind::none) return nullptr;
    }
    return static_cast<T*>(static_cast<Object*>(const_cast<void*>(pointer)));
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

// The pointer that the application gets: AsHandle<OCIStmt>(statement).
template <class Handle>
Handle* AsHandle(Object* object) {
    return static_cast<Handle*>(static_cast<void*>(object));
}
