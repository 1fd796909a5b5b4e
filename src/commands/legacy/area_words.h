// Words of a line as arguments of the calls on data areas. Their texts are passed as typed in every mode, and "null" alone
// is no text. Command thread only.
#pragma once

#include "commands/shared/word_arguments.h"
#include "objects/areas.h"
#include "report/area_report.h"

// The text at words[0], its length at words[1]. False without memory, which has been said.
inline bool SetAreaText(TextArgument& text, char** words) {
    return text.SetBytes(IsNull(words[0]) ? nullptr : words[0], DecodeNumber(words[1]));
}
inline sword LengthOfText(const TextArgument& text) {
    return static_cast<sword>(text.Length());
}

// A text that a form of a line may leave out: then it is not given, and its length is -1.
struct OptionalText {
    text* Text() const { return given.Text(); }
    sword Length() const { return is_given ? LengthOfText(given) : -1; }
    bool Set(char** words) {
        is_given = true;
        return SetAreaText(given, words);
    }
    TextArgument given;
    bool is_given = false;
};

// What a report looks at after a call on a login, on a cursor.
inline CalledAreas CalledLogin(const AreaArgument& login) {
    return {.login = login.area, .shown = login.slot == nullptr ? nullptr : login.slot->area};
}
inline CalledAreas CalledCursor(const AreaArgument& cursor) {
    if (cursor.slot == nullptr) return {};
    return {.login = cursor.slot->parent, .shown = cursor.slot->area};
}
