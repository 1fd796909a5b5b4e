// Words as the commands on values, files and threads take them.
#pragma once

#include <cstring>

#include "core/keywords.h"
#include "objects/registry.h"
#include "objects/text_conversion.h"
#include "oci.h"

// The environment and the error handle that many commands begin with.
struct Handles {
    explicit Handles(char** words)
        : environment(Resolve<OCIEnv>(Kind::environment, words[1])), error(ResolveError<OCIError>(words[2])) {}
    OCIEnv* environment;
    OCIError* error;
};

// The place of an output that the word at `index`, where there is one, may refuse by "null".
template <class T> T* Place(T& output, int count, char** words, int index) {
    return count > index && IsNull(words[index]) ? nullptr : &output;
}

// The place of a new object's pointer: null when its name is "-1".
template <class T> T** NewPlace(T*& object, const char* name) {
    return std::strcmp(name, "-1") == 0 ? nullptr : &object;
}

// Whether a text word stands for a null pointer.
inline bool IsNoText(const char* word) {
    return IsNull(word) || std::strcmp(word, "-1") == 0;
}
// A text: "null" and "-1" stand for a null pointer. False when the command ends here, which has been said.
inline bool SetTextWord(TextArgument& text, const char* word, long length) {
    return text.Set(IsNoText(word) ? nullptr : word, length, TextArea::four_times);
}
// The text at words[0], its length at words[1].
inline bool SetTextWords(TextArgument& text, char** words) {
    return SetTextWord(text, words[0], DecodeLong(words[1]));
}
// A text that the library takes up to its closing zero.
inline bool SetClosedText(TextArgument& text, const char* word) {
    return SetTextWord(text, word, static_cast<long>(std::strlen(word)));
}
// The bytes at words[0] as they were typed, in every mode; their count at words[1].
inline bool SetByteWords(TextArgument& bytes, char** words) {
    return bytes.SetBytes(IsNoText(words[0]) ? nullptr : words[0], DecodeLong(words[1]));
}
