// Reading and writing settings.
#include "platform/ini.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <string>
#include <string_view>

#include "platform/ini_text.h"
#include "platform/whole_file.h"

namespace {

std::string PathOf(std::string_view file) {
    const char* const home = std::getenv("KELPCI_HOME");
    if (!home || !*home || file.find('/') != file.npos) return std::string(file);
    return std::string(home) + '/' + std::string(file);
}

std::size_t CopyText(std::string_view text, char* buffer, std::size_t capacity) {
    if (capacity == 0) return 0;
    const std::size_t length = std::min(text.size(), capacity - 1);
    std::memcpy(buffer, text.data(), length);
    buffer[length] = '\0';
    return length;
}

std::size_t CopyKeys(const IniText& ini, const char* section, char* buffer, std::size_t capacity) {
    if (capacity == 0) return 0;
    std::size_t length = 0;
    for (const std::string& key : ini.Keys(section)) {
        if (length + key.size() + 2 > capacity) break;
        std::memcpy(buffer + length, key.c_str(), key.size() + 1);
        length += key.size() + 1;
    }
    buffer[length] = '\0';
    return length;
}

bool IsOneLine(std::string_view text) {
    return text.find_first_of("\r\n") == text.npos;
}

bool IsTrimmed(std::string_view text) {
    constexpr std::string_view kBlanks = " \t";
    return text.empty() || (kBlanks.find(text.front()) == kBlanks.npos && kBlanks.find(text.back()) == kBlanks.npos);
}

// Whether what is written could be read back.
bool CanHold(std::string_view section, std::string_view key, std::string_view value) {
    const bool key_is_clean =
        !key.empty() && IsTrimmed(key) && key.find('=') == key.npos && key.find_first_of("[;#") != 0;
    const bool section_is_clean = IsTrimmed(section) && section.find(']') == section.npos;
    return key_is_clean && section_is_clean && IsOneLine(section) && IsOneLine(key) && IsOneLine(value);
}

}  // namespace

std::size_t IniReadString(const char* file, const char* section, const char* key, const char* otherwise, char* buffer,
                          std::size_t capacity) {
    std::string content;
    if (!ReadWholeFile(PathOf(file), content)) content.clear();
    const IniText ini(content);
    if (!key) return CopyKeys(ini, section, buffer, capacity);
    const std::string* const value = ini.Find(section, key);
    return CopyText(value ? *value : otherwise ? otherwise : "", buffer, capacity);
}

bool IniWriteString(const char* file, const char* section, const char* key, const char* value) {
    if (!key || !CanHold(section, key, value ? value : "")) return false;
    const std::string path = PathOf(file);
    const DirectoryLock lock(path);
    std::string content;
    if (!lock.IsHeld() || !ReadWholeFile(path, content)) return false;
    IniText ini(content);
    if (!value && !ini.Remove(section, key)) return true;
    if (value) ini.Set(section, key, value);
    return lock.Replace(ini.Text());
}
