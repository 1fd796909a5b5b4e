// Words of a line as arguments of a call, for the families that share them: modes and counts, the handles that many
// commands begin with, outputs that a word may refuse, objects that a command makes, texts. Command thread only; what
// is made here lives for one command.
#pragma once

#include <cstddef>
#include <cstring>

#include "core/keywords.h"
#include "core/state.h"
#include "objects/registry.h"
#include "objects/text_conversion.h"
#include "oci.h"

// --- Modes and counts ------------------------------------------------------------------------------------------------

// A mode: words joined by "|", or a number.
inline ub4 DecodeMode(const char* word, const KeywordTable* modes = EnvModeKeywords) {
    return static_cast<ub4>(DecodeBitmaskOrNumber(word, modes));
}
// The same for statements, binds and defines: one keyword stands alone, and warns of nothing.
inline ub4 DecodeStatementMode(const char* word, const KeywordTable* modes) {
    const bool joined = std::strchr(word, '|') != nullptr;
    return static_cast<ub4>(joined ? DecodeBitmaskOrNumber(word, modes) : DecodeKeywordOrNumber(word, modes));
}
inline ub4 DecodeCount(const char* word) {
    return static_cast<ub4>(DecodeNumber(word));
}

// --- Objects that are there ------------------------------------------------------------------------------------------

// The environment and the error handle that many commands begin with.
struct EnvironmentAndError {
    explicit EnvironmentAndError(char** words)
        : environment(Resolve<OCIEnv>(Kind::environment, words[1])), error(ResolveError<OCIError>(words[2])) {}
    OCIEnv* environment;
    OCIError* error;
};

// The environment that a named object was made from; null when there is no such object.
inline void* ParentOf(Kind kind, const char* name) {
    const NamedObject* slot = FindByName(kind, name);
    return slot == nullptr ? nullptr : slot->parent;
}

// The statement that a buffer or struct belongs to; "null" is none. False when the command ends here: an unknown name,
// which has been complained about.
inline bool ResolveOwner(const char* word, void*& statement) {
    statement = IsInvalid(word) ? InvalidObject() : nullptr;
    if (statement != nullptr || FindObject(Kind::stmt, word, statement) || IsNull(word)) return true;
    Message(kError, "Handle %s not found\n", word);
    return false;
}

// An object of the first kind, else whatever the word stands for in the second.
inline void* ResolveEither(Kind first, Kind second, const char* name) {
    void* object = nullptr;
    return FindObject(first, name, object) ? object : ResolveObject(second, name);
}

// What callbacks get as their context: a text of the driver's, the bad object or null.
inline char callback_context[] = "My  Context";
inline void* ContextOf(const char* word) {
    if (IsInvalid(word)) return InvalidObject();
    return IsNull(word) ? nullptr : callback_context;
}

// --- Places for what a call gives back -------------------------------------------------------------------------------

// The place of an output that the word at `index`, where there is one, may refuse by "null".
template <class T> T* Place(T& output, int count, char** words, int index) {
    return count > index && IsNull(words[index]) ? nullptr : &output;
}

// What "null" says as the name of a new object. "-1" always gives the library no place.
enum class NullName {
    gives_no_place,
    is_refused  // the library gets a place, and the name is complained about afterwards
};

// The object that a command makes: the name it shall have, and the place where the library puts it.
template <class T> class NewObject {
public:
    explicit NewObject(const char* name, NullName null = NullName::gives_no_place) : name_(name), null_(null) {}

    T** Place() {
        if (std::strcmp(name_, "-1") == 0 || (null_ == NullName::gives_no_place && IsNull(name_))) return nullptr;
        return &object_;
    }
    T* Get() const { return object_; }
    // What the place holds before the call, where a command hands over an object that exists.
    void Hand(T* object) { object_ = object; }

    // After a call that succeeded. Null when there is no entry: "-1" passes in silence, else the reason has been said.
    NamedObject* Enter(Kind kind, void* parent) const {
        return std::strcmp(name_, "-1") == 0 ? nullptr : Register(kind, name_, object_, parent);
    }
    // The same under a name that may be taken: the new object stands for it from now on.
    NamedObject* EnterAnew(Kind kind, void* parent) const {
        NamedObject* const old = FindByName(kind, name_);
        if (old != nullptr) old->in_use = false;
        return Enter(kind, parent);
    }

private:
    const char* name_;
    NullName null_;
    T* object_ = nullptr;
};

// The optional words "[extramem [null]]": memory of the script's own that comes with an object, and whether the library
// is given a place for its address.
class ExtraMemory {
public:
    ExtraMemory() = default;
    ExtraMemory(int count, char** words)
        : size_(count > 0 ? static_cast<size_t>(DecodeLong(words[0])) : 0), placed_(count < 2 || !IsNull(words[1])) {}
    static ExtraMemory None() {
        ExtraMemory none;
        none.placed_ = false;
        return none;
    }

    size_t Size() const { return size_; }
    void** Place() { return placed_ ? &memory_ : nullptr; }
    void* Get() const { return memory_; }
    void DropSize() { size_ = 0; }

private:
    size_t size_ = 0;
    bool placed_ = true;
    void* memory_ = nullptr;
};

// --- Texts -----------------------------------------------------------------------------------------------------------
// Where values, files and threads are concerned, "-1" stands for a null pointer, as "null" does everywhere. All answer
// false when the command ends here, which has been said.

inline bool IsNoText(const char* word) {
    return IsNull(word) || std::strcmp(word, "-1") == 0;
}
inline bool SetTextWord(TextArgument& text, const char* word, long length) {
    return text.Set(IsNoText(word) ? nullptr : word, length, TextArea::four_times);
}
// The text at words[0], its length at words[1].
inline bool SetTextWords(TextArgument& text, char** words) {
    return SetTextWord(text, words[0], DecodeLong(words[1]));
}
// A password: the start-up password stands in for any but "null", where that was asked for; a length of 0 stays 0.
struct PasswordWord {
    PasswordWord(const char* word, long typed_length) : text(word), length(typed_length) {
        if (!replace_password || IsNull(word)) return;
        text = start_up_password.c_str();
        if (length != 0) length = static_cast<long>(start_up_password.size());
    }
    const char* text;
    long length;
};
inline bool SetPassword(TextArgument& password, const char* word, long length) {
    const PasswordWord given(word, length);
    return password.Set(given.text, given.length, TextArea::four_times);
}
// A text that the library takes up to its closing zero.
inline bool SetClosedText(TextArgument& text, const char* word) {
    return SetTextWord(text, word, static_cast<long>(std::strlen(word)));
}
// The bytes at words[0] as they were typed, in every mode; their count at words[1].
inline bool SetByteWords(TextArgument& bytes, char** words) {
    return bytes.SetBytes(IsNoText(words[0]) ? nullptr : words[0], DecodeLong(words[1]));
}
