// The kinds and their tables, and the one search, registration and release for all of them. Command thread only.
#include "objects/registry.h"

#include <array>
#include <iterator>
#include <string_view>
#include <utility>

#include "core/keywords.h"
#include "core/messages.h"
#include "oci.h"

namespace {

constexpr int kWide = 36;
constexpr int kNarrow = 32;

// In the order of Kind. Some texts are shared by kinds that are not alike: logs have them so.
constexpr KindInfo kKinds[] = {
    {30, kNarrow, "Reached max environment handle count - %ld\n", "*** Environment handle already in use\n"},
    {30, kNarrow, "Reached max error handle count - %ld\n", "*** Error handle already in use\n"},
    {800, kNarrow, "Reached max svc handle count - %ld\n", "*** Svc handle already in use\n"},
    {800, kNarrow, "Reached max server handle count - %ld\n", "*** Server handle already in use\n"},
    {800, kNarrow, "Reached max session handle count - %ld\n", "*** Session handle already in use\n"},
    {800, kNarrow, "Reached max trans handle count - %ld\n", "*** Trans handle already in use\n"},
    {800, kWide, "Reached max spool handle count - %ld\n", "*** SPool handle already in use\n"},
    {800, kWide, "Reached max cpool handle count - %ld\n", "*** SPool handle already in use\n"},
    {650, kNarrow, "Reached max stmt handle count - %ld\n", "*** Stmt handle already in use\n"},
    {650, kNarrow, "Reached max describe handle count - %ld\n", "*** Describe handle already in use\n"},
    {256, kNarrow, "Reached max bind handle count - %ld\n", "*** Bind handle already in use\n"},
    {256, kNarrow, "Reached max define handle count - %ld\n", "*** Define handle already in use\n"},
    {100, kNarrow, "Reached max param handle count - %ld\n", nullptr},
    {650, kNarrow, "Reached max lob handle count - %ld\n", "*** Lob handle already in use\n"},
    {650, kNarrow, "Reached max lob handle count - %ld\n", "*** Result handle already in use\n"},
    {650, kNarrow, "Reached max rowid handle count - %ld\n", "*** Rowid handle already in use\n"},
    {650, kNarrow, "Reached max file handle count - %ld\n", "*** File handle already in use\n"},
    {650, kNarrow, "Reached max datetime handle count - %ld\n", "*** Datetime handle already in use\n"},
    {650, kNarrow, "Reached max string handle count - %ld\n", nullptr},
    {650, kNarrow, "Reached max raw handle count - %ld\n", nullptr},
    {650, kNarrow, "Reached max mutex handle count - %ld\n", "*** Mutex handle already in use\n"},
    {650, kNarrow, "Reached max key handle count - %ld\n", "*** Key handle already in use\n"},
    {650, kNarrow, "Reached max tid handle count - %ld\n", "*** tid handle already in use\n"},
    {650, kNarrow, "Reached max thnd handle count - %ld\n", "*** thnd handle already in use\n"},
    {256, kWide, "Reached max buffer handle count - %ld\n", nullptr},
    {256, kWide, "Reached max struct handle count - %ld\n", "Name already in use %s\n"},
    {30, kNarrow, "Reached max cursor count - %ld\n", nullptr},
    {30, kNarrow, "Reached max ldainfo count - %ld\n", "lda already in use\n"},
};
static_assert(std::size(kKinds) == static_cast<size_t>(Kind::ldainfo) + 1);

constexpr size_t kHandleKinds = static_cast<size_t>(Kind::thnd) + 1;  // those whose tables are here

template <Kind kKind> RecordOf<kKind> slots[kKinds[static_cast<size_t>(kKind)].capacity];

// Makes a slot as new as one that never held anything.
template <Kind kKind> void Clear(NamedObject& slot) {
    static_cast<RecordOf<kKind>&>(slot) = {};
}
template <> void Clear<Kind::key>(NamedObject& slot) {
    slot = {};
}

struct SlotTable {
    Slots slots;
    void (*clear)(NamedObject& slot);
};
constinit const auto kTables = []<size_t... kKind>(std::index_sequence<kKind...>) {
    return std::array{SlotTable{Slots(slots<static_cast<Kind>(kKind)>), Clear<static_cast<Kind>(kKind)>}...};
}(std::make_index_sequence<kHandleKinds>());

bool IsDescriptor(Kind kind) {
    return kind >= Kind::lob && kind <= Kind::datetime;
}

NamedObject* FindByName(Kind kind, std::string_view name) {
    name = name.substr(0, static_cast<size_t>(InfoOf(kind).name_width) - 1);
    for (NamedObject& slot : SlotsOf(kind))
        if (slot.in_use && name == slot.name) return &slot;
    return nullptr;
}

void ComplainNotFound(std::string_view name) {
    Message(kError, "Handle %.*s not found\n", static_cast<int>(name.size()), name.data());
}

// The part of a word that names an object: for descriptors, what stands before an index.
std::string_view NameIn(Kind kind, std::string_view word) {
    return IsDescriptor(kind) ? word.substr(0, word.find('[')) : word;
}

// What the word finds in the table, its index obeyed. An index beyond the array, or none, gives the array itself.
DescriptorReference LookUp(Kind kind, const char* word) {
    DescriptorReference found;
    const std::string_view name = NameIn(kind, word);
    const bool indexed = word[name.size()] != '\0';
    if (indexed) found.index = DecodeLong(word + name.size() + 1);
    found.slot = FindByName(kind, name);
    if (found.slot == nullptr) return found;
    found.object = found.slot->object;
    const NamedDescriptor* const descriptor = AsDescriptor(kind, found.slot);
    found.is_array = descriptor != nullptr && descriptor->array_count != 0;
    if (found.is_array && indexed && found.index >= 0 && found.index < long{descriptor->array_count}) {
        found.object = static_cast<void**>(found.object)[found.index];
        found.is_array = false;
    }
    return found;
}

}  // namespace

const KindInfo& InfoOf(Kind kind) {
    return kKinds[static_cast<size_t>(kind)];
}

NamedDescriptor* AsDescriptor(Kind kind, NamedObject* slot) {
    return IsDescriptor(kind) ? static_cast<NamedDescriptor*>(slot) : nullptr;
}

Slots SlotsOf(Kind kind) {
    return kTables[static_cast<size_t>(kind)].slots;
}

void* InvalidObject() {
    static char area[15] = "Invalid buffer";
    return area;
}

NamedObject* FindByName(Kind kind, const char* name) {
    return FindByName(kind, std::string_view(name));
}

NamedObject* FindByPointer(Kind kind, const void* object) {
    for (NamedObject& slot : SlotsOf(kind))
        if (slot.in_use && slot.object == object) return &slot;
    return nullptr;
}

NamedObject* FindNewestByPointer(Kind kind, const void* object) {
    NamedObject* newest = nullptr;
    for (NamedObject& slot : SlotsOf(kind))
        if (slot.in_use && slot.object == object && (newest == nullptr || slot.turn > newest->turn)) newest = &slot;
    return newest;
}

DescriptorReference ResolveDescriptor(Kind kind, const char* word) {
    if (IsInvalid(word)) return {.object = InvalidObject()};
    const DescriptorReference found = LookUp(kind, word);
    const std::string_view name = NameIn(kind, word);
    if (found.slot == nullptr && !IsNull(name)) ComplainNotFound(name);
    return found;
}

void* ResolveObject(Kind kind, const char* name) {
    return ResolveDescriptor(kind, name).object;
}

bool FindObject(Kind kind, const char* name, void*& object) {
    const DescriptorReference found = LookUp(kind, name);
    object = found.object;
    return found.slot != nullptr;
}

void* ResolveErrorObject(const char* name) {
    if (IsInvalid(name)) return InvalidObject();
    void* object = nullptr;
    if (FindObject(Kind::error, name, object)) return object;
    for (size_t kind = 0; kind < kHandleKinds; ++kind)
        if (FindObject(static_cast<Kind>(kind), name, object)) return object;
    if (!IsNull(name)) ComplainNotFound(name);
    return nullptr;
}

const char* OutputName(const char* word) {
    return std::strcmp(word, "-1") == 0 || IsNull(word) ? nullptr : word;
}

bool CheckInUse(Kind kind, const char* name) {
    if (FindByName(kind, name) == nullptr) return false;
    if (InfoOf(kind).in_use != nullptr) MessageText(kError, InfoOf(kind).in_use);
    return true;
}

void ReportOverflow(Kind kind) {
    // Every overflow text holds one %ld and nothing else to fill.
    Message(kError, InfoOf(kind).overflow, static_cast<long>(InfoOf(kind).capacity));
}

bool MayBeName(const char* name) {
    if (!IsNull(name) && !IsInvalid(name)) return true;
    Message(kError, "Variable name NULL not allowed\n");
    return false;
}

NamedObject* Register(Kind kind, const char* name, void* object, void* parent) {
    static uint32_t turn = 0;
    if (!MayBeName(name)) return nullptr;
    for (NamedObject& slot : SlotsOf(kind)) {
        if (slot.in_use) continue;
        kTables[static_cast<size_t>(kind)].clear(slot);
        slot.in_use = true;
        slot.turn = ++turn;
        slot.object = object;
        slot.parent = parent;
        std::strncpy(slot.name, name, static_cast<size_t>(InfoOf(kind).name_width) - 1);
        return &slot;
    }
    ReportOverflow(kind);
    return nullptr;
}

void Release(Kind kind, const char* name) {
    NamedObject* slot = FindByName(kind, name);
    if (slot == nullptr) return ComplainNotFound(name);
    slot->in_use = false;
}

std::optional<Kind> KindOfHandleType(int type) {
    switch (type) {
        case OCI_HTYPE_ENV: return Kind::environment;
        case OCI_HTYPE_ERROR: return Kind::error;
        case OCI_HTYPE_SVCCTX: return Kind::svc;
        case OCI_HTYPE_STMT: return Kind::stmt;
        case OCI_HTYPE_BIND: return Kind::bind;
        case OCI_HTYPE_DEFINE: return Kind::define;
        case OCI_HTYPE_DESCRIBE: return Kind::describe;
        case OCI_HTYPE_SERVER: return Kind::server;
        case OCI_HTYPE_SESSION: return Kind::session;
        case OCI_HTYPE_TRANS: return Kind::trans;
        case OCI_HTYPE_CPOOL: return Kind::cpool;
        case OCI_HTYPE_SPOOL: return Kind::spool;
        default: return std::nullopt;
    }
}

std::optional<Kind> KindOfDescriptorType(int type) {
    switch (type) {
        case OCI_DTYPE_LOB: return Kind::lob;
        case OCI_DTYPE_RSET: return Kind::result;
        case OCI_DTYPE_ROWID: return Kind::rowid;
        case OCI_DTYPE_FILE: return Kind::file;
        case 62: return Kind::datetime;  // what the keyword oci_dtype_datetime stands for
        default: return std::nullopt;
    }
}
