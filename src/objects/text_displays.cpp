// Texts between quotes and bytes as pairs of digits, however an element tells how long they are. Command thread only.
#include <algorithm>
#include <cstring>
#include <string_view>

#include "core/state.h"
#include "objects/displays.h"
#include "objects/element_access.h"
#include "objects/text_conversion.h"
#include "platform/client_library.h"
#include "platform/utf.h"

namespace {

sword ShowText(Line& line, std::string_view text, bool utf16) {
    return AddText(line, text.data(), text.size(), utf16, Quotes::always) ? EndLine(line) : OCI_SUCCESS;
}

sword ShowBytes(Line& line, std::string_view bytes) {
    line.Character('"').Hex(bytes.data(), bytes.size()).Character('"');
    return EndLine(line);
}

// What the element's length says it holds.
std::string_view Counted(const ElementView& element) {
    return {reinterpret_cast<const char*>(element.data), std::min(element.length, element.size)};
}

// What the prefix at the element's start says it holds.
template <class Prefix> std::string_view Prefixed(const ElementView& element) {
    if (element.size <= sizeof(Prefix)) return {};
    const auto room = static_cast<int64_t>(element.size - sizeof(Prefix));
    const int64_t length = std::clamp(int64_t{ReadElement<Prefix>(element.data, element.size)}, int64_t{0}, room);
    return {reinterpret_cast<const char*>(element.data) + sizeof(Prefix), static_cast<size_t>(length)};
}

}  // namespace

sword ShowCharacters(Line& line, const ElementView& element) {
    return ShowText(line, Counted(element), element.utf16);
}

sword ShowTerminated(Line& line, const ElementView& element) {
    const auto* text = reinterpret_cast<const char*>(element.data);
    const size_t length = element.utf16 ? utf::Utf16Length(text, element.size) : strnlen(text, element.size);
    return ShowText(line, {text, length}, element.utf16);
}

template <class Prefix> sword ShowPrefixedText(Line& line, const ElementView& element) {
    return ShowText(line, Prefixed<Prefix>(element), element.utf16);
}

template sword ShowPrefixedText<uint16_t>(Line& line, const ElementView& element);
template sword ShowPrefixedText<int32_t>(Line& line, const ElementView& element);

sword ShowLibraryString(Line& line, const ElementView& element) {
    const auto* string = ReadElement<OCIString*>(element.data, element.size);
    const OraText* text = Call(&ClientLibrary::OCIStringPtr, DefaultEnvironment, string);
    const ub4 length = text == nullptr ? 0 : Call(&ClientLibrary::OCIStringSize, DefaultEnvironment, string);
    return ShowText(line, {reinterpret_cast<const char*>(text), length}, element.utf16);
}

sword ShowCountedBytes(Line& line, const ElementView& element) {
    return ShowBytes(line, Counted(element));
}

sword ShowPrefixedBytes(Line& line, const ElementView& element) {
    return ShowBytes(line, Prefixed<uint16_t>(element));
}

sword ShowLibraryRaw(Line& line, const ElementView& element) {
    const auto* raw = ReadElement<OCIRaw*>(element.data, element.size);
    const ub1* bytes = Call(&ClientLibrary::OCIRawPtr, DefaultEnvironment, raw);
    const ub4 length = bytes == nullptr ? 0 : Call(&ClientLibrary::OCIRawSize, DefaultEnvironment, raw);
    return ShowBytes(line, {reinterpret_cast<const char*>(bytes), length});
}
