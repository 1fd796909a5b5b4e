// Texts between the application's form and UTF-8.
#include <cstring>

#include "handles/environment.h"

namespace {

// The bytes of a text that ends at a zero, or where `length` says: a length beyond a terminated text does no harm.
std::size_t BoundedLength(const Environment& environment, const char* text, std::size_t length) {
    if (!environment.Utf16()) {
        const void* zero = std::memchr(text, 0, length);
        return zero ? static_cast<std::size_t>(static_cast<const char*>(zero) - text) : length;
    }
    for (std::size_t end = 0; end + 1 < length; end += 2)
        if (text[end] == 0 && text[end + 1] == 0) return end;
    return length;
}

}  // namespace

TextIn::TextIn(const Environment& environment, const void* text, std::size_t length) {
    if (!text || length == 0) return;
    const auto* bytes = static_cast<const char*>(text);
    const std::string_view given(bytes, BoundedLength(environment, bytes, length));
    if (!environment.Converts()) {
        view_ = given;
        return;
    }
    valid_ = charset::ToUtf8(*environment.Sets().text, given, converted_);
    view_ = converted_;
}

std::string_view TextOut(const Environment& environment, std::string_view utf8, std::string& converted) {
    if (!environment.Converts()) return utf8;
    converted.clear();
    charset::FromUtf8(*environment.Sets().text, utf8, converted);
    return converted;
}

bool TextToBuffer(const Environment& environment, std::string_view utf8, void* buffer, std::size_t size) {
    const std::size_t zero = environment.Utf16() ? 2 : 1;
    if (size < zero) return false;
    std::string converted;
    const std::string_view text = TextOut(environment, utf8, converted);
    const std::size_t room = size - zero;
    const std::size_t length = charset::Whole(*environment.Sets().text, text, room);
    std::memcpy(buffer, text.data(), length);
    std::memset(static_cast<char*>(buffer) + length, 0, zero);
    return length == text.size();
}

std::size_t TextLength(const Environment& environment, const void* text) {
    const auto* bytes = static_cast<const char*>(text);
    if (!environment.Utf16()) return std::strlen(bytes);
    std::size_t length = 0;
    while (bytes[length] != 0 || bytes[length + 1] != 0) length += 2;
    return length;
}
