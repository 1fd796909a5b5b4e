// Texts between the application's form and UTF-8.
#include <cstring>

#include "handles/environment.h"

namespace {

void AppendUtf8(std::uint32_t point, std::string& out) {
    const auto put = [&out](std::uint32_t byte) { out.push_back(static_cast<char>(byte)); };
    if (point < 0x80) return put(point);
    if (point < 0x800) {
        put(0xC0 | point >> 6);
        return put(0x80 | (point & 0x3F));
    }
    if (point < 0x10000) {
        put(0xE0 | point >> 12);
    } else {
        put(0xF0 | point >> 18);
        put(0x80 | (point >> 12 & 0x3F));
    }
    put(0x80 | (point >> 6 & 0x3F));
    put(0x80 | (point & 0x3F));
}

void AppendUnit(std::uint32_t unit, std::string& out) {
    const auto value = static_cast<char16_t>(unit);
    out.append(reinterpret_cast<const char*>(&value), sizeof value);
}

void AppendUtf16(std::uint32_t point, std::string& out) {
    if (point < 0x10000) return AppendUnit(point, out);
    AppendUnit(0xD800 + ((point - 0x10000) >> 10), out);
    AppendUnit(0xDC00 + ((point - 0x10000) & 0x3FF), out);
}

// The code point at the start of `text`, and how many bytes it takes; 0 bytes when malformed.
std::size_t DecodeUtf8(std::string_view text, std::uint32_t& point) {
    const auto byte = [text](std::size_t index) { return static_cast<unsigned char>(text[index]); };
    const unsigned lead = byte(0);
    const std::size_t size = lead < 0x80 ? 1 : lead < 0xC2 ? 0 : lead < 0xE0 ? 2 : lead < 0xF0 ? 3 : 4;
    if (size == 0 || lead >= 0xF5 || text.size() < size) return 0;
    if (size == 1) {
        point = lead;
        return 1;
    }
    point = lead & (0x7Fu >> size);
    for (std::size_t index = 1; index < size; ++index) {
        if ((byte(index) & 0xC0) != 0x80) return 0;
        point = point << 6 | (byte(index) & 0x3F);
    }
    constexpr std::uint32_t kSmallest[] = {0, 0, 0x80, 0x800, 0x10000};
    if (point < kSmallest[size] || point > 0x10FFFF || (point >= 0xD800 && point < 0xE000)) return 0;
    return size;
}

// The length of the longest part of UTF-8 `text` that fits into `room` bytes and ends between characters.
std::size_t WholeCharacters(std::string_view text, std::size_t room) {
    if (text.size() <= room) return text.size();
    std::size_t end = room;
    while (end > 0 && (static_cast<unsigned char>(text[end]) & 0xC0) == 0x80) --end;
    return end;
}

// The same for UTF-16: whole units, and no pair torn apart.
std::size_t WholeUnits(std::string_view text, std::size_t room) {
    if (text.size() <= room) return text.size();
    std::size_t end = room / 2 * 2;
    char16_t last = 0;
    if (end > 0) std::memcpy(&last, text.data() + end - 2, sizeof last);
    return last >= 0xD800 && last < 0xDC00 ? end - 2 : end;
}

}  // namespace

namespace utf {

bool ToUtf8(const void* utf16, std::size_t bytes, std::string& out) {
    const auto* units = static_cast<const char*>(utf16);
    const auto unit = [units](std::size_t at) {
        char16_t value;
        std::memcpy(&value, units + at, sizeof value);
        return static_cast<std::uint32_t>(value);
    };
    out.reserve(out.size() + bytes / 2);
    for (std::size_t at = 0; at + 1 < bytes; at += 2) {
        const std::uint32_t first = unit(at);
        if (first < 0xD800 || first >= 0xE000) {
            AppendUtf8(first, out);
            continue;
        }
        if (first >= 0xDC00 || at + 3 >= bytes) return false;
        const std::uint32_t second = unit(at + 2);
        if (second < 0xDC00 || second >= 0xE000) return false;
        AppendUtf8(0x10000 + ((first & 0x3FF) << 10) + (second & 0x3FF), out);
        at += 2;
    }
    return bytes % 2 == 0;
}

bool ToUtf16(std::string_view utf8, std::string& out) {
    out.reserve(out.size() + utf8.size() * 2);
    while (!utf8.empty()) {
        std::uint32_t point = 0;
        const std::size_t size = DecodeUtf8(utf8, point);
        if (size == 0) return false;
        AppendUtf16(point, out);
        utf8.remove_prefix(size);
    }
    return true;
}

}  // namespace utf

TextIn::TextIn(const Environment& environment, const void* text, std::size_t length) {
    if (!text || length == 0) return;
    if (!environment.Utf16()) {
        view_ = {static_cast<const char*>(text), length};
        return;
    }
    valid_ = utf::ToUtf8(text, length, converted_);
    view_ = converted_;
}

std::string_view TextOut(const Environment& environment, std::string_view utf8, std::string& converted) {
    if (!environment.Utf16()) return utf8;
    converted.clear();
    while (!utf8.empty()) {
        std::uint32_t point = 0;
        const std::size_t size = DecodeUtf8(utf8, point);
        AppendUtf16(size > 0 ? point : 0xFFFD, converted);    // what is no UTF-8 shows as replacement characters
        utf8.remove_prefix(size > 0 ? size : 1);
    }
    return converted;
}

bool TextToBuffer(const Environment& environment, std::string_view utf8, void* buffer, std::size_t size) {
    const std::size_t zero = environment.Utf16() ? 2 : 1;
    if (!buffer || size < zero) return false;
    std::string converted;
    const std::string_view text = TextOut(environment, utf8, converted);
    const std::size_t room = size - zero;
    const std::size_t length = environment.Utf16() ? WholeUnits(text, room) : WholeCharacters(text, room);
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
