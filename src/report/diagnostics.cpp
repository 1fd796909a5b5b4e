// Normalising of diagnostic texts.
#include "report/diagnostics.h"

#include <cstring>

#include "core/state.h"
#include "objects/text_conversion.h"
#include "platform/utf.h"

namespace {

constexpr size_t kLongestText = kDiagnosticSize - 1;
constexpr char kServerTag[] = "[KELP/OKRA64";

size_t FindTag(const std::string& text) {
    for (const char* tag : {"[KELP", "[AS", "[PLOVR/VM"}) {
        const size_t found = text.find(tag);
        if (found != std::string::npos) return found;
    }
    return std::string::npos;
}

void ReplaceTag(std::string& text) {
    const size_t tag = FindTag(text);
    if (tag == std::string::npos) return;
    const size_t bracket = text.find(']', tag);
    if (bracket == std::string::npos) return;
    text.replace(tag, bracket - tag, kServerTag);
    if (text.size() > kLongestText) text.resize(kLongestText);
}

// Two places are written and no more: that a line feed at the very end closes the text is what makes it one line end.
void RewriteLineEnd(std::string& text) {
    const size_t found = text.find("\r\n");
    if (found == std::string::npos) return;
    text[found] = '\n';
    if (found + 2 == text.size()) text.pop_back();
    else text[found + 1] = text[found + 2];
}

}  // namespace

std::string NormaliseDiagnostic(std::string text) {
    ReplaceTag(text);
    RewriteLineEnd(text);
    return text;
}

bool ReadDiagnostic(const char* room, size_t room_size, std::string& text) {
    if (!Utf16Mode) {
        text.assign(room, strnlen(room, room_size));
    } else {
        if (!convertFromUTF16(room, utf::Utf16Length(room, room_size), text, kLongestText)) return false;
    }
    text = NormaliseDiagnostic(std::move(text));
    return true;
}
