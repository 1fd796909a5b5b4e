// Allocating and freeing handles, descriptors and arrays of descriptors. Which table an object is entered in follows
// from its numeric type; a type that has no table is passed to the library all the same, and nothing is entered. Return
// codes are reported against the environment: the one named or, when freeing, the one the object was made from.
// Command thread only.
#include <cstdint>
#include <cstring>
#include <optional>

#include "commands/families.h"
#include "commands/shared/word_arguments.h"
#include "core/messages.h"
#include "core/state.h"
#include "objects/memory.h"
#include "platform/client_library.h"
#include "report/return_code.h"
#include "report/trace.h"

namespace {

// A numeric type as a word gives it, and its table.
struct ObjectType {
    int number;
    std::optional<Kind> kind;
};

// How a command reads its type word. `complaint` holds one %s, for the word of a type without a table; null: silence.
struct TypeWord {
    const KeywordTable* keywords;
    std::optional<Kind> (*kind_of)(int number);
    const char* complaint;

    ObjectType Decode(const char* word) const {
        const int number = DecodeKeyword(word, keywords);
        return {number, kind_of(number)};
    }
    void Complain(const char* word) const {
        if (complaint != nullptr) Message(kError, complaint, word);
    }
};

constexpr TypeWord kHandleType = {HandleTypeKeywords, KindOfHandleType, "Invalid handle type %s\n"};
constexpr TypeWord kNewDescriptorType = {HandleTypeKeywords, KindOfDescriptorType, nullptr};
constexpr TypeWord kNewArrayType = {DescriptorTypeKeywords, KindOfDescriptorType, nullptr};
constexpr TypeWord kDescriptorType = {DescriptorTypeKeywords, KindOfDescriptorType, "Invalid descriptor type - %s\n"};

// --- One object ------------------------------------------------------------------------------------------------------

struct Allocation : CommandRow {
    LibraryFunction<sword(const void*, void**, ub4, size_t, void**)> ClientLibrary::*function;
    TypeWord type_word;
};

void Allocate(const Allocation& row, int count, char** words) {
    auto* const environment = Resolve<OCIEnv>(Kind::environment, words[1]);
    const char* const name = words[2];
    NewObject<void> object(name);
    const ObjectType type = row.type_word.Decode(words[3]);
    if (type.kind && CheckInUse(*type.kind, name)) return;
    if (!type.kind && object.Place() != nullptr) row.type_word.Complain(words[3]);

    ExtraMemory extra(count - 4, words + 4);
    const sword rc = Call(row.function, environment, object.Place(), static_cast<ub4>(type.number), extra.Size(),
                          extra.Place());
    outputOCI(row.code, rc, name);
    EnvironmentReport(environment, rc);
    if (rc != OCI_SUCCESS || !type.kind) return;
    if (type.kind == Kind::error) AdoptErrorHandle(static_cast<OCIError*>(object.Get()));
    object.Enter(*type.kind, environment);
}

constexpr Allocation kAllocations[] = {
    {{Code::ocihandlealloc, Words(4, 5), "OCIHandleAlloc hEnv hHandle handletype [extramem]"},
     &ClientLibrary::OCIHandleAlloc, kHandleType},
    {{Code::ocidescriptoralloc, Words(4, 5, 6), "OCIDescriptorAlloc hEnv hHandle descriptortype [extramem [null]]"},
     &ClientLibrary::OCIDescriptorAlloc, kNewDescriptorType},
};

// --- Arrays of descriptors -------------------------------------------------------------------------------------------

// Where the library puts the descriptors: a block of the driver's own, which a slot owns once the array has a name.
class DescriptorArray {
public:
    // False after a failed allocation, which has been complained about.
    bool Allocate(ub4 count) {
        constexpr ub4 kMost = 1u << 24;  // no script means more; what asks for more finds no memory
        if (count == 0) return true;
        array_.reset(static_cast<void**>(GetMem(count <= kMost ? count * sizeof(void*) : SIZE_MAX)));
        if (array_ == nullptr) Message(kOutput, "Could not allocate memory\n");
        return array_ != nullptr;
    }
    void** Get() const { return array_.get(); }
    void HandTo(NamedDescriptor& slot, ub4 count) {
        slot.array_count = count;
        slot.object = array_.release();
    }

private:
    Memory<void*> array_;
};

// Writes the whole of the extra memory, to show that it can be written.
void FillExtraMemory(const ExtraMemory& extra) {
    if (extra.Size() == 0 || extra.Get() == nullptr) return;
    std::memset(extra.Get(), 0, extra.Size());
    Message(kOutput, "Wrote %ld bytes to extra buffer successfully\n", static_cast<long>(extra.Size()));
}

void AllocateArray(const CommandRow& row, int count, char** words) {
    auto* const environment = Resolve<OCIEnv>(Kind::environment, words[1]);
    const char* const name = words[2];
    const ObjectType type = kNewArrayType.Decode(words[3]);
    if (type.kind && CheckInUse(*type.kind, name)) return;
    const auto elements = static_cast<ub4>(DecodeNumber(words[4]));
    ExtraMemory extra(count - 5, words + 5);
    DescriptorArray array;
    if (!array.Allocate(elements)) return;

    NewObject<void> object(name);
    void** const place = object.Place() == nullptr ? nullptr : array.Get();
    const sword rc = Call(&ClientLibrary::OCIArrayDescriptorAlloc, environment, place, static_cast<ub4>(type.number),
                          elements, extra.Size(), extra.Place());
    outputOCI(row.code, rc, name);
    EnvironmentReport(environment, rc);
    if (rc != OCI_SUCCESS) return;
    if (type.kind)
        if (auto* slot = AsDescriptor(*type.kind, object.Enter(*type.kind, environment))) array.HandTo(*slot, elements);
    FillExtraMemory(extra);
}

constexpr PlainCommand kArrayCommands[] = {
    {{Code::ociarraydescriptoralloc, Words(5, 6, 7),
      "OCIArrayDescriptorAlloc hEnv hHandle descriptortype array_size [extramem [null]]"},
     AllocateArray},
};

// --- Freeing ---------------------------------------------------------------------------------------------------------

template <class Object> struct Freeing : CommandRow {
    LibraryFunction<sword(Object*, ub4)> ClientLibrary::*function;
    TypeWord type_word;
};

// Frees the slot of that name and what it owned.
void ReleaseObject(Kind kind, const char* name, NamedObject* slot) {
    if (kind == Kind::error && slot != nullptr) ForgetErrorHandle(slot->object);
    const NamedDescriptor* const descriptor = AsDescriptor(kind, slot);
    const bool whole_array = descriptor != nullptr && descriptor->array_count != 0 && slot == FindByName(kind, name);
    Release(kind, name);
    if (whole_array) FreeMem(slot->object);
}

void* PassedAs(const DescriptorReference& found, void*) {
    return found.object;
}
// An array is read by the library: of a single descriptor, or of an element, it is the place that holds the pointer.
void** PassedAs(const DescriptorReference& found, void**) {
    if (found.slot == nullptr || found.is_array) return static_cast<void**>(found.object);
    const bool is_element = found.object != found.slot->object;
    return is_element ? static_cast<void**>(found.slot->object) + found.index : &found.slot->object;
}

template <class Object> void Free(const Freeing<Object>& row, int, char** words) {
    const char* const name = words[1];
    const ObjectType type = row.type_word.Decode(words[2]);
    DescriptorReference found;
    if (type.kind) found = ResolveDescriptor(*type.kind, name);
    else row.type_word.Complain(words[2]);
    void* const environment = type.kind == Kind::environment ? found.object
                              : found.slot != nullptr        ? found.slot->parent
                                                             : nullptr;
    const sword rc = Call(row.function, PassedAs(found, static_cast<Object*>(nullptr)), static_cast<ub4>(type.number));
    outputOCI(row.code, rc, name);
    EnvironmentReport(environment, rc);
    if (rc == OCI_SUCCESS && type.kind) ReleaseObject(*type.kind, name, found.slot);
}

constexpr Freeing<void> kObjectFreeings[] = {
    {{Code::ocihandlefree, Words(3), "OCIHandleFree hHandle handletype"}, &ClientLibrary::OCIHandleFree, kHandleType},
    {{Code::ocidescriptorfree, Words(3), "OCIDescriptorFree hHandle descriptortype"},
     &ClientLibrary::OCIDescriptorFree, kDescriptorType},
};
constexpr Freeing<void*> kArrayFreeings[] = {
    {{Code::ociarraydescriptorfree, Words(3), "OCIArrayDescriptorFree descp type"},
     &ClientLibrary::OCIArrayDescriptorFree, kDescriptorType},
};

}  // namespace

void AddHandleCommands(HandlerTable& handlers) {
    handlers.Add<Allocate>(kAllocations);
    handlers.Add(kArrayCommands);
    handlers.Add<Free<void>>(kObjectFreeings);
    handlers.Add<Free<void*>>(kArrayFreeings);
}
