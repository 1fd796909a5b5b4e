// Reading and writing settings. Any thread.
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

// The settings whose keys, each with its closing zero, fit into the capacity together with an empty one.
std::vector<IniSetting> SettingsWithin(std::size_t capacity, std::vector<IniSetting> settings) {
    std::size_t length = 0;
    const auto beyond = std::ranges::find_if(settings, [&](const IniSetting& setting) {
        length += setting.key.size() + 1;
        return length + 1 > capacity;
    });
    settings.erase(beyond, settings.end());
    return settings;
}

std::size_t CopyKeys(const std::vector<IniSetting>& settings, char* buffer, std::size_t capacity) {
    if (capacity == 0) return 0;
    std::size_t length = 0;
    for (const IniSetting& setting : settings) {
        std::memcpy(buffer + length, setting.key.c_str(), setting.key.size() + 1);
        length += setting.key.size() + 1;
    }
    buffer[length] = '\0';
    return length;
}

IniText LoadIni(const char* file) {
    std::string content;
    if (!ReadWholeFile(PathOf(file), content)) content.clear();
    return IniText(content);
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
    if (!key) return CopyKeys(IniReadSection(file, section, capacity), buffer, capacity);
    const IniText ini = LoadIni(file);
    const std::string* const value = ini.Find(section, key);
    return CopyText(value ? *value : otherwise, buffer, capacity);
}

std::vector<IniSetting> IniReadSection(const char* file, const char* section, std::size_t most_key_bytes) {
    return SettingsWithin(most_key_bytes, LoadIni(file).Settings(section));
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
