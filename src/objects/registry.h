// Named objects: for each kind a fixed table from the name a script gives to the pointer the library returned.
// Tables are searched from slot 0, so the lowest free slot is filled first. Names are cut to the slot's width before
// they are stored or compared, and are unique within a kind only. Used by the command thread only; nothing here
// locks. A slot is a record: that of its kind where the kind has fields of its own, else a NamedObject.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <optional>
#include <span>
#include <string>

enum class Kind : uint8_t {
    environment, error, svc, server, session, trans, spool, cpool, stmt, describe, bind, define, param,
    lob, result, rowid, file, datetime,  // descriptors: may be arrays, names may carry an index
    string, raw, mutex, key, tid, thnd,
    buffer, memory_struct, cursor, ldainfo  // in tables elsewhere
};

struct KindInfo {
    int capacity;
    int name_width;        // of the slot's name field, the closing zero included
    const char* overflow;  // printed with the capacity when the table is full
    const char* in_use;    // printed when a new name is taken; null where taking is never checked
};
const KindInfo& InfoOf(Kind kind);

// --- Records -------------------------------------------------------------------------------------------------------

struct NamedObject {
    bool in_use = false;     // release clears this and nothing else
    uint32_t turn = 0;       // later ones were registered later
    void* parent = nullptr;  // the environment it was made from
    void* object = nullptr;  // the library's pointer; of an array of descriptors, the array
    char name[36] = {};
};
struct NamedPool : NamedObject {
    std::string pool_name;  // what the library calls the pool, in its own characters; empty until it is created
};
struct NamedStatement : NamedObject {
    uint32_t utf16_mode = 0;  // 0x4000 when the statement's character data is UTF-16
};
struct NamedDescriptor : NamedObject {
    uint32_t array_count = 0;  // elements of the array, 0 for a single descriptor
};
struct NamedLob : NamedDescriptor {
    uint16_t type = 0;  // external, such as 112
    uint32_t flag = 0;
};
struct NamedKey : NamedObject {
    char text[80] = {};  // of its value. Taking the slot anew leaves it: the library may still hold its address
};

// The record of a kind. The kinds from `buffer` on have records and tables elsewhere.
template <Kind kKind> struct RecordOfKind { using Type = NamedObject; };
template <> struct RecordOfKind<Kind::spool> { using Type = NamedPool; };
template <> struct RecordOfKind<Kind::cpool> { using Type = NamedPool; };
template <> struct RecordOfKind<Kind::stmt> { using Type = NamedStatement; };
template <> struct RecordOfKind<Kind::lob> { using Type = NamedLob; };
template <> struct RecordOfKind<Kind::result> { using Type = NamedDescriptor; };
template <> struct RecordOfKind<Kind::rowid> { using Type = NamedDescriptor; };
template <> struct RecordOfKind<Kind::file> { using Type = NamedDescriptor; };
template <> struct RecordOfKind<Kind::datetime> { using Type = NamedDescriptor; };
template <> struct RecordOfKind<Kind::key> { using Type = NamedKey; };
template <Kind kKind> using RecordOf = typename RecordOfKind<kKind>::Type;

// A slot of the kind as the kind's record; null stays null.
template <Kind kKind> RecordOf<kKind>* AsRecord(NamedObject* slot) {
    return static_cast<RecordOf<kKind>*>(slot);
}
// A slot of any kind as a descriptor; null where the kind is none.
NamedDescriptor* AsDescriptor(Kind kind, NamedObject* slot);

// All slots of a kind, free ones included, in their order.
class Slots {
public:
    class Iterator {
    public:
        Iterator(NamedObject* slot, size_t stride) : slot_(slot), stride_(stride) {}
        NamedObject& operator*() const { return *slot_; }
        Iterator& operator++() {
            slot_ = reinterpret_cast<NamedObject*>(reinterpret_cast<char*>(slot_) + stride_);
            return *this;
        }
        bool operator!=(const Iterator& other) const { return slot_ != other.slot_; }

    private:
        NamedObject* slot_;
        size_t stride_;
    };

    template <class Record, size_t kCount>
    explicit constexpr Slots(Record (&slots)[kCount]) : first_(slots), count_(kCount), stride_(sizeof(Record)) {}
    Iterator begin() const { return {first_, stride_}; }
    Iterator end() const {
        return {reinterpret_cast<NamedObject*>(reinterpret_cast<char*>(first_) + count_ * stride_), stride_};
    }

private:
    NamedObject* first_;
    size_t count_;
    size_t stride_;
};
// Not of kinds whose tables are elsewhere.
Slots SlotsOf(Kind kind);

// A deliberately bad object: a static, writable 15-byte text "Invalid buffer".
void* InvalidObject();

// --- Looking up ----------------------------------------------------------------------------------------------------

// The pointer an argument stands for: "invalid" the bad object, "null" a null pointer; an unknown name prints
// "Handle %s not found\n" and gives a null pointer, with which the call is made all the same. Names of descriptors may
// carry an index.
void* ResolveObject(Kind kind, const char* name);
template <class T> T* Resolve(Kind kind, const char* name) {
    return static_cast<T*>(ResolveObject(kind, name));
}

// The same for an error handle argument, which any kind may supply: the error table is searched first.
void* ResolveErrorObject(const char* name);
template <class T> T* ResolveError(const char* name) {
    return static_cast<T*>(ResolveErrorObject(name));
}

// A descriptor argument with all that its name says. `slot` is null unless the name was found.
struct DescriptorReference {
    void* object = nullptr;
    NamedObject* slot = nullptr;
    bool is_array = false;  // `object` is the whole array
    long index = 0;         // as given in the name
};
DescriptorReference ResolveDescriptor(Kind kind, const char* name);

// The same without messages and reserved words; false when there is no such object.
bool FindObject(Kind kind, const char* name, void*& object);

// The first occupied slot of that name, or null. Prints nothing and knows no reserved words.
NamedObject* FindByName(Kind kind, const char* name);
// The first occupied slot of that pointer, or null.
NamedObject* FindByPointer(Kind kind, const void* object);
// The last one registered: libraries give the memory of a handle that went with its statement to the next one.
NamedObject* FindNewestByPointer(Kind kind, const void* object);

// --- Making and freeing --------------------------------------------------------------------------------------------

// Null for "-1" and "null": the library gets a null output location and nothing is registered. Else the word itself.
const char* OutputName(const char* word);

// Whether the name is taken; prints the kind's message if so.
bool CheckInUse(Kind kind, const char* name);

// Fills the first free slot after a successful call. A name that may not be, which is said, and a full table, which
// prints its overflow message, give null.
NamedObject* Register(Kind kind, const char* name, void* object, void* parent);

// Whether an object may be called so: "null" and "invalid" print "Variable name NULL not allowed\n" and may not.
bool MayBeName(const char* name);

// Frees the first slot of that name after a successful call; "Handle %s not found\n" when there is none.
void Release(Kind kind, const char* name);

// The table that a numeric handle or descriptor type stands for.
std::optional<Kind> KindOfHandleType(int type);
std::optional<Kind> KindOfDescriptorType(int type);

// --- For tables elsewhere ------------------------------------------------------------------------------------------
// A record has at least `in_use` and a character array `name`.

// Whether the slot's name is the word, cut to the slot's width.
template <class Slot> bool HasName(const Slot& slot, const char* name) {
    constexpr size_t kWidth = sizeof slot.name;
    return std::strncmp(slot.name, name, kWidth - 1) == 0;
}
template <class Slot> Slot* FindSlot(std::span<Slot> slots, const char* name) {
    for (Slot& slot : slots)
        if (slot.in_use && HasName(slot, name)) return &slot;
    return nullptr;
}
// Occupies the first free slot under the name; prints the kind's overflow message when there is none. The slot's other
// fields are left as they were.
void ReportOverflow(Kind kind);
template <class Slot> Slot* OccupySlot(Kind kind, std::span<Slot> slots, const char* name) {
    for (Slot& slot : slots) {
        if (slot.in_use) continue;
        slot.in_use = true;
        std::memset(slot.name, 0, sizeof slot.name);
        std::strncpy(slot.name, name, sizeof slot.name - 1);
        return &slot;
    }
    ReportOverflow(kind);
    return nullptr;
}
