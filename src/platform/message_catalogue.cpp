// Reading catalogues. What a damaged one says of lengths and places is believed as far as its bytes go.
#include "platform/message_catalogue.h"

#include <cstdlib>
#include <cstring>

#include "platform/executable.h"
#include "platform/whole_file.h"

namespace {

constexpr std::uint32_t kMagic = 0x950412de;
constexpr std::size_t kCountPlace = 8, kKeysPlace = 12, kTextsPlace = 16, kHeader = 28, kEntry = 8;

std::string Load(const std::string& path) {
    std::string bytes;
    return ReadWholeFile(path, bytes) ? bytes : std::string();
}

std::string LoadNamed(std::string_view name) {
    if (name.find('/') != name.npos) return Load(std::string(name));
    std::string bytes;
    if (const char* home = std::getenv("KELPCI_HOME"); home && *home) bytes = Load(home + ("/" + std::string(name)));
    return bytes.empty() ? Load(ExecutableDirectory() + "/../share/" + std::string(name)) : bytes;
}

}  // namespace

MessageCatalogue::MessageCatalogue(std::string_view name) : bytes_(LoadNamed(name)) {
    if (bytes_.size() < kHeader || Number(0) != kMagic) bytes_.clear();
}

std::uint32_t MessageCatalogue::Number(std::size_t place) const {
    std::uint32_t number = 0;
    if (place <= bytes_.size() && bytes_.size() - place >= sizeof number)
        std::memcpy(&number, bytes_.data() + place, sizeof number);
    return number;
}

// The text that an entry tells the length and the place of.
std::string_view MessageCatalogue::Text(std::size_t entry) const {
    const std::size_t length = Number(entry), place = Number(entry + 4);
    if (place > bytes_.size() || bytes_.size() - place < length) return {};
    return {bytes_.data() + place, length};
}

std::string_view MessageCatalogue::Find(std::string_view key) const {
    if (bytes_.empty()) return {};
    const std::size_t keys = Number(kKeysPlace), texts = Number(kTextsPlace);
    for (std::size_t index = 0; index < Number(kCountPlace); ++index) {
        const std::size_t entry = keys + index * kEntry;
        if (entry >= bytes_.size()) return {};
        if (Text(entry) == key) return Text(texts + index * kEntry);
    }
    return {};
}
