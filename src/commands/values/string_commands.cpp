// The commands on library strings and raws, which come in pairs: a handler serves both. Command thread only.
#include "commands/families.h"
#include "commands/shared/word_arguments.h"
#include "core/messages.h"
#include "core/state.h"
#include "objects/registry.h"
#include "platform/client_library.h"
#include "report/trace.h"

namespace {

// What strings and raws differ in.
template <class Object> struct Traits;
template <> struct Traits<OCIString> {
    static constexpr Kind kKind = Kind::string;
    static constexpr auto kAssignText = &ClientLibrary::OCIStringAssignText;
    static constexpr auto kAssign = &ClientLibrary::OCIStringAssign;
    static constexpr auto kResize = &ClientLibrary::OCIStringResize;
    static constexpr auto kPtr = &ClientLibrary::OCIStringPtr;
    static constexpr auto kSize = &ClientLibrary::OCIStringSize;
    static constexpr auto kAllocSize = &ClientLibrary::OCIStringAllocSize;
    static constexpr const char* kNullMessage = "String is NULL\n";

    static bool SetText(TextArgument& text, char** words) { return SetTextWords(text, words); }
    static bool AddContents(Line& line, const void* text, size_t size) { return AddText(line, text, size, Utf16Mode); }
};
template <> struct Traits<OCIRaw> {
    static constexpr Kind kKind = Kind::raw;
    static constexpr auto kAssignText = &ClientLibrary::OCIRawAssignBytes;
    static constexpr auto kAssign = &ClientLibrary::OCIRawAssignRaw;
    static constexpr auto kResize = &ClientLibrary::OCIRawResize;
    static constexpr auto kPtr = &ClientLibrary::OCIRawPtr;
    static constexpr auto kSize = &ClientLibrary::OCIRawSize;
    static constexpr auto kAllocSize = &ClientLibrary::OCIRawAllocSize;
    static constexpr const char* kNullMessage = "Raw is NULL\n";

    // Bytes are what was typed, in every mode.
    static bool SetText(TextArgument& text, char** words) { return SetByteWords(text, words); }
    static bool AddContents(Line& line, const void* bytes, size_t size) {
        line.Hex(bytes, size);
        return true;
    }
};

template <class Object> Object* Find(const char* word) {
    return Resolve<Object>(Traits<Object>::kKind, word);
}

// The object that an assignment or a resize works on. A name that is not known yet gets the object that the library
// makes of a null pointer.
template <class Object> class ObjectToChange {
public:
    explicit ObjectToChange(const char* word)
        : word_(word), slot_(FindByName(Traits<Object>::kKind, word)), made_(word, NullName::is_refused) {
        if (slot_ != nullptr) known_ = static_cast<Object*>(slot_->object);
    }

    Object** Place() { return slot_ == nullptr ? made_.Place() : &known_; }

    // All that follows the call. The library may have moved the object.
    void Conclude(const CommandRow& row, const EnvironmentAndError& handles, sword rc) {
        TraceAndReport(row.code, word_, handles.error, rc);
        if (slot_ != nullptr) slot_->object = known_;
        else if (rc == OCI_SUCCESS) made_.Enter(Traits<Object>::kKind, handles.environment);
    }

private:
    const char* word_;
    NamedObject* slot_;  // null: the name is not known yet
    Object* known_ = nullptr;
    NewObject<Object> made_;
};

template <class Object> void RunAssignText(const CommandRow& row, int, char** words) {
    const EnvironmentAndError handles(words);
    TextArgument text;
    if (!Traits<Object>::SetText(text, words + 3)) return;
    ObjectToChange<Object> target(words[5]);
    const sword rc = Call(Traits<Object>::kAssignText, handles.environment, handles.error, text.Text(), text.Length(),
                          target.Place());
    target.Conclude(row, handles, rc);
}

template <class Object> void RunAssign(const CommandRow& row, int, char** words) {
    const EnvironmentAndError handles(words);
    const Object* const source = Find<Object>(words[3]);
    ObjectToChange<Object> target(words[4]);
    const sword rc = Call(Traits<Object>::kAssign, handles.environment, handles.error, source, target.Place());
    target.Conclude(row, handles, rc);
}

template <class Object> void RunResize(const CommandRow& row, int, char** words) {
    const EnvironmentAndError handles(words);
    const ub4 length = static_cast<ub4>(DecodeNumber(words[3]));
    ObjectToChange<Object> target(words[4]);
    const sword rc = Call(Traits<Object>::kResize, handles.environment, handles.error, length, target.Place());
    target.Conclude(row, handles, rc);
}

template <class Object> void ShowContents(const CommandRow& row, int, char** words) {
    OCIEnv* const environment = Resolve<OCIEnv>(Kind::environment, words[1]);
    const Object* const object = Find<Object>(words[2]);
    const ub1* const contents = Call(Traits<Object>::kPtr, environment, object);
    outputOCI(row.code, OCI_SUCCESS, words[2]);
    if (contents == nullptr) return MessageText(kOutput, Traits<Object>::kNullMessage);
    const ub4 size = Call(Traits<Object>::kSize, environment, object);
    Line line;
    if (Traits<Object>::AddContents(line, contents, size)) line.Character('\n').Print();
}

template <class Object> void ShowSize(const CommandRow& row, int, char** words) {
    OCIEnv* const environment = Resolve<OCIEnv>(Kind::environment, words[1]);
    const Object* const object = Find<Object>(words[2]);
    const ub4 size = Call(Traits<Object>::kSize, environment, object);
    outputOCI(row.code, OCI_SUCCESS, words[2]);
    Message(kOutput, "%u\n", size);
}

template <class Object> void ShowAllocatedSize(const CommandRow& row, int count, char** words) {
    const EnvironmentAndError handles(words);
    const Object* const object = Find<Object>(words[3]);
    ub4 size = 0;
    ub4* const place = Place(size, count, words, 4);
    const sword rc = Call(Traits<Object>::kAllocSize, handles.environment, handles.error, object, place);
    TraceAndReport(row.code, words[3], handles.error, rc);
    if (rc == OCI_SUCCESS && place != nullptr) Message(kOutput, "%u\n", size);
}

constexpr PlainCommand kStringCommands[] = {
    {{Code::ocistringallocsize, WordsBetween(4, 5), "OCIStringAllocSize hEnv hError string [pcbString]"},
     ShowAllocatedSize<OCIString>},
    {{Code::ocistringassign, Words(5), "OCIStringAssign hEnv hError stringrhs stringlhs"}, RunAssign<OCIString>},
    {{Code::ocistringassigntext, Words(6), "OCIStringAssignText hEnv hError string string_len stringlhs"},
     RunAssignText<OCIString>},
    {{Code::ocistringptr, Words(3), "OCIStringPtr hEnv string"}, ShowContents<OCIString>},
    {{Code::ocistringresize, Words(5), "OCIStringResize hEnv hError newlen string"}, RunResize<OCIString>},
    {{Code::ocistringsize, Words(3), "OCIStringSize hEnv string"}, ShowSize<OCIString>},
    {{Code::ocirawresize, Words(5), "OCIRawResize hEnv hError newlen raw"}, RunResize<OCIRaw>},
    {{Code::ocirawallocsize, WordsBetween(4, 5), "OCIRawAllocSize hEnv hError raw [pcbRaw]"},
     ShowAllocatedSize<OCIRaw>},
    {{Code::ocirawassignbytes, Words(6), "OCIRawAssignBytes hEnv hError string string_len raw"}, RunAssignText<OCIRaw>},
    {{Code::ocirawassignraw, Words(5), "OCIRawAssignRaw hEnv hError rawrhs rawlhs"}, RunAssign<OCIRaw>},
    {{Code::ocirawptr, Words(3), "OCIRawPtr hEnv raw"}, ShowContents<OCIRaw>},
    {{Code::ocirawsize, Words(3), "OCIRawSize hEnv raw"}, ShowSize<OCIRaw>},
};

}  // namespace

void AddStringCommands(HandlerTable& handlers) {
    handlers.Add(kStringCommands);
}
