// Reading and setting attributes. What a value looks like, in the words of a script and to the library, follows from
// the shape of the attribute: a row a shape. Areas start as zeros and are larger than any value. Command thread only.
#include <algorithm>
#include <cstring>
#include <optional>
#include <string>
#include <vector>

#include "commands/families.h"
#include "commands/handles/attribute_catalogue.h"
#include "commands/shared/word_arguments.h"
#include "core/messages.h"
#include "core/state.h"
#include "objects/element_access.h"
#include "objects/memory.h"
#include "objects/value_assignment.h"
#include "objects/value_display.h"
#include "objects/xids.h"
#include "platform/client_library.h"
#include "report/return_code.h"
#include "report/trace.h"

namespace {

constexpr size_t kAreaSize = 256;

// --- What the words have in common -----------------------------------------------------------------------------------

// "hHandle handletype", words[1] and words[2]. Descriptor types select their tables, too.
struct AttributeHandle {
    explicit AttributeHandle(char** words);
    void* Parent() const;

    int type;
    void* object = nullptr;
    const NamedObject* slot = nullptr;
};

std::optional<Kind> KindOfType(int type) {
    if (type == OCI_DTYPE_PARAM) return Kind::param;
    const std::optional<Kind> kind = KindOfHandleType(type);
    return kind ? kind : KindOfDescriptorType(type);
}

AttributeHandle::AttributeHandle(char** words) : type(DecodeKeyword(words[2], HandleTypeKeywords)) {
    const std::optional<Kind> kind = KindOfType(type);
    if (!kind) {
        Message(kError, "Invalid handle type %s\n", words[2]);
        return;
    }
    const DescriptorReference found = ResolveDescriptor(*kind, words[1]);
    object = found.object;
    slot = found.slot;
}

// The environment that what the handle gives out belongs to.
void* AttributeHandle::Parent() const {
    if (type == OCI_HTYPE_ENV) return object;
    return slot == nullptr ? nullptr : slot->parent;
}

// --- Shapes ----------------------------------------------------------------------------------------------------------

// What the library has put into the area; of texts the length, which is 0 where it was given no place for it.
struct Reading {
    alignas(XID) unsigned char area[kAreaSize] = {};
    ub4 size = 0;
    OCIError* error = nullptr;

    template <class T> T As() const { return ReadElement<T>(area, sizeof area); }
};

// What is passed to the library, and what it points to.
struct Setting {
    alignas(XID) unsigned char area[kAreaSize] = {};
    void* value = nullptr;
    ub4 size = 0;
    bool is_password = false;
    TextArgument text;
    Memory<char> wide;
    std::string names;
    std::vector<const char*> array;
};

void PrintNothing(const Reading&) {}

template <class Integer> void PrintInteger(const Reading& reading) {
    const auto value = reading.As<Integer>();
    if constexpr (sizeof(Integer) == sizeof(ub8))
        Message(kOutput, "%llu\n", static_cast<unsigned long long>(value));
    else
        Message(kOutput, "%ld\n", static_cast<long>(value));
}

template <class Integer> bool TakeInteger(Setting& setting, const char* word) {
    WriteElement(setting.area, sizeof setting.area, static_cast<Integer>(DecodeLong(word)));
    setting.value = setting.area;
    return true;
}

// Without a place for its length, a text shows as an empty one: where it ends, nobody knows.
void PrintText(const Reading& reading) {
    const auto* const text = reading.As<const OraText*>();
    Line line;
    if (AddText(line, text, text == nullptr ? 0 : reading.size, Utf16Mode)) line.Character('\n').Print();
}

bool TakeText(Setting& setting, const char* word) {
    const auto length = static_cast<long>(setting.size);
    const bool taken = setting.is_password ? SetPassword(setting.text, word, length)
                                           : setting.text.Set(word, length, TextArea::four_times);
    setting.value = setting.text.Text();
    setting.size = setting.text.Length();
    return taken;
}

// Names joined by commas. Null pointers stand behind the last one, for a library that is told of more.
bool TakeTexts(Setting& setting, const char* word) {
    constexpr size_t kSpare = 64, kMostSpare = 1u << 20;
    setting.names = word;
    setting.array.push_back(setting.names.data());
    for (char& character : setting.names) {
        if (character != ',') continue;
        character = '\0';
        setting.array.push_back(&character + 1);
    }
    setting.array.resize(setting.array.size() + std::clamp<size_t>(setting.size, kSpare, kMostSpare));
    setting.value = setting.array.data();
    return true;
}

template <Kind kKind> bool TakeObject(Setting& setting, const char* word) {
    setting.value = ResolveObject(kKind, word);
    return true;
}

void PrintXid(const Reading& reading) {
    const NamedXid* const slot = FindXid(reading.As<XID>());
    if (slot != nullptr) Message(kOutput, "XID - %s\n", slot->name);
}

bool TakeXid(Setting& setting, const char* word) {
    setting.value = ResolveXid(word);
    return true;
}

void PrintSevenByteDate(const Reading& reading) {
    const auto* const bytes = reading.As<const unsigned char*>();
    SevenByteDate date;
    if (bytes == nullptr || !date.Read(bytes, 7)) return Message(kOutput, "Invalid date found\n");
    PrintDate({static_cast<sb2>(date.year), static_cast<ub1>(date.month), static_cast<ub1>(date.day),
               {static_cast<ub1>(date.hour), static_cast<ub1>(date.minute), static_cast<ub1>(date.second)}});
}

// The bytes come with the count in front, 22 in all, or without it. The count itself tells where the size does not.
OCINumber NumberOf(const ub1* bytes, const Reading& reading) {
    OCINumber number{};
    const bool counted = reading.size == 0 || reading.size >= sizeof number;
    const size_t digits = std::min(counted ? bytes[0] : reading.size, ub4{sizeof number - 1});
    number.OCINumberPart[0] = static_cast<ub1>(digits);
    std::memcpy(number.OCINumberPart + 1, counted ? bytes + 1 : bytes, digits);
    return number;
}

void PrintNumberBytes(const Reading& reading) {
    const auto* const bytes = reading.As<const ub1*>();
    if (bytes == nullptr) return;
    const OCINumber number = NumberOf(bytes, reading);
    Line line;
    const ElementView view = {.type = SQLT_VNU, .data = number.OCINumberPart, .size = sizeof number, .indicator = 0,
                              .return_code = 0, .length = sizeof number, .precision = 0, .scale = 0, .utf16 = false};
    ReturnCodeReport(reading.error, DisplayElement(line, view));
}

// What buffers of the type hold. It is of a fixed size: the whole word is read, whatever its length.
template <int kType> bool TakeAsElement(Setting& setting, const char* word) {
    int16_t indicator = 0;
    uint16_t length = 0, return_code = 0;
    setting.value = setting.area;
    return AssignText({kType, setting.area, sizeof setting.area, &indicator, &length, &return_code, 0, 0}, word, 0);
}

// "invalid" is all that scripts can say.
bool TakePointer(Setting& setting, const char* word) {
    if (IsInvalid(word)) setting.value = InvalidObject();
    else Message(kError, "Handle %s not found\n", word);
    return true;
}

struct ShapeRow {
    AttributeShape shape;
    void (*print)(const Reading& reading);
    bool (*take)(Setting& setting, const char* word);  // false when the command ends here, which has been said
    std::optional<Kind> kind = {};                     // of what is entered when it has been read
};

using Shape = AttributeShape;
constexpr ShapeRow kShapes[] = {
    {Shape::ub1, PrintInteger<ub1>, TakeInteger<ub1>},
    {Shape::ub2, PrintInteger<ub2>, TakeInteger<ub2>},
    {Shape::ub4, PrintInteger<ub4>, TakeInteger<ub4>},
    {Shape::ub8, PrintInteger<ub8>, TakeInteger<ub8>},
    {Shape::sb1, PrintInteger<sb1>, TakeInteger<sb1>},
    {Shape::sb2, PrintInteger<sb2>, TakeInteger<sb2>},
    {Shape::sb4, PrintInteger<sb4>, TakeInteger<sb4>},
    {Shape::text, PrintText, TakeText},
    {Shape::texts, PrintNothing, TakeTexts},
    {Shape::server, PrintNothing, TakeObject<Kind::server>, Kind::server},
    {Shape::session, PrintNothing, TakeObject<Kind::session>, Kind::session},
    {Shape::trans, PrintNothing, TakeObject<Kind::trans>, Kind::trans},
    {Shape::environment, PrintNothing, TakeObject<Kind::environment>, Kind::environment},
    {Shape::param, PrintNothing, TakeObject<Kind::param>, Kind::param},
    {Shape::rowid, PrintNothing, TakeObject<Kind::rowid>},
    {Shape::xid, PrintXid, TakeXid},
    {Shape::date, PrintSevenByteDate, TakeAsElement<SQLT_DAT>},
    {Shape::number, PrintNumberBytes, TakeAsElement<SQLT_VNU>},
    {Shape::pointer, PrintNothing, TakePointer},
};

constexpr bool ShapesAreInOrder() {
    for (size_t place = 0; place < std::size(kShapes); ++place)
        if (kShapes[place].shape != static_cast<Shape>(place)) return false;
    return std::size(kShapes) == static_cast<size_t>(Shape::pointer) + 1;
}
static_assert(ShapesAreInOrder());

const ShapeRow& RowOf(Shape shape) {
    return kShapes[static_cast<size_t>(shape)];
}

// --- Reading ---------------------------------------------------------------------------------------------------------

// The words "value size" tell what the library gets: a place for an object to be entered under the value word, the row
// id that it names, or an area.
void GetAttribute(const CommandRow& row, int, char** words) {
    const AttributeHandle handle(words);
    const Attribute attribute = DecodeAttribute(words[5], handle.type);
    const ShapeRow& shape = RowOf(attribute.shape);
    if (shape.kind && InfoOf(*shape.kind).in_use != nullptr && CheckInUse(*shape.kind, words[3])) return;
    NewObject<void> object(words[3]);
    Reading reading;
    void* value = IsNull(words[3]) ? nullptr : reading.area;
    if (shape.kind) value = object.Place();
    else if (attribute.shape == Shape::rowid) value = ResolveObject(Kind::rowid, words[3]);
    reading.error = ResolveError<OCIError>(words[6]);
    const sword rc = Call(&ClientLibrary::OCIAttrGet, handle.object, static_cast<ub4>(handle.type), value,
                          IsNull(words[4]) ? nullptr : &reading.size, attribute.number, reading.error);
    TraceAndReport(row.code, words[1], reading.error, rc);
    if (rc != OCI_SUCCESS || value == nullptr) return;
    if (shape.kind) object.EnterAnew(*shape.kind, handle.Parent());
    else shape.print(reading);
}

// --- Setting ---------------------------------------------------------------------------------------------------------

// A library that takes the value for a text reads as far as the size says: zeros stand there. False without memory, which
// has been said.
bool WidenArea(Setting& setting) {
    const bool beyond = setting.size > TextArgument::kReadableText;  // only the library can say no
    if (setting.value != setting.area || setting.size <= sizeof setting.area || beyond) return true;
    setting.wide.reset(static_cast<char*>(GetMem(setting.size)));
    if (setting.wide == nullptr) {
        Message(kError, "Could not allocate memory\n");
        return false;
    }
    std::memcpy(setting.wide.get(), setting.area, sizeof setting.area);
    setting.value = setting.wide.get();
    return true;
}

void SetAttribute(const CommandRow& row, int, char** words) {
    const AttributeHandle handle(words);
    const Attribute attribute = DecodeAttribute(words[5], handle.type);
    Setting setting;
    setting.size = DecodeCount(words[4]);
    setting.is_password = attribute.shape == Shape::text && attribute.number == OCI_ATTR_PASSWORD;
    if (!IsNull(words[3]) && !(RowOf(attribute.shape).take(setting, words[3]) && WidenArea(setting))) return;
    auto* const error = ResolveError<OCIError>(words[6]);
    const sword rc = Call(&ClientLibrary::OCIAttrSet, handle.object, static_cast<ub4>(handle.type), setting.value,
                          setting.size, attribute.number, error);
    TraceAndReport(row.code, words[1], error, rc);
}

constexpr PlainCommand kAttributeCommands[] = {
    {{Code::ociattrget, Words(7), "OCIAttrGet hHandle handletype value size attribute hError"}, GetAttribute},
    {{Code::ociattrset, Words(7), "OCIAttrSet hHandle handletype value size attribute hError"}, SetAttribute},
};

}  // namespace

void AddAttributeCommands(HandlerTable& handlers) {
    handlers.Add(kAttributeCommands);
}
