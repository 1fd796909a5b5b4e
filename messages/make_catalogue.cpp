// Makes the message catalogue kelpsql.mo, in the binary form of gettext's catalogues: the wording of each error number
// under "ORA-nnnnn", the meaning of each SQLSTATE, or of its class, under "SQLSTATE " and its characters. Translators
// take it apart and together with gettext's own tools.
//
//   make_catalogue FILE
#include <cstdint>
#include <cstdio>
#include <fstream>
#include <map>
#include <string>

namespace {

std::string NumberKey(int number) {
    char key[16];
    std::snprintf(key, sizeof key, "ORA-%05d", number);
    return key;
}

// In the order of their keys, as the form wants them.
std::map<std::string, std::string> Texts() {
    std::map<std::string, std::string> texts = {{"", "Content-Type: text/plain; charset=UTF-8\n"}};
#define NAMED(number, name, text) texts[NumberKey(number)] = text;
#define WORDING(number, text) texts[NumberKey(number)] = text;
#include "handles/error_texts.def"
#undef WORDING
#undef NAMED
#define STATE(code, text) texts["SQLSTATE " code] = text;
#include "sqlstates.def"
#undef STATE
    return texts;
}

void Append(std::string& bytes, std::size_t number) {
    const auto word = static_cast<std::uint32_t>(number);
    bytes.append(reinterpret_cast<const char*>(&word), sizeof word);
}

// The header, the table of keys, that of texts, then all of them, each with a closing zero.
std::string Catalogue(const std::map<std::string, std::string>& texts) {
    constexpr std::size_t kHeader = 28, kEntry = 8;
    const std::size_t count = texts.size();
    std::string table[2], bytes;
    std::string strings;
    const std::size_t first_string = kHeader + 2 * kEntry * count;
    const auto add = [&](std::string& entries, const std::string& text) {
        Append(entries, text.size());
        Append(entries, first_string + strings.size());
        strings += text + '\0';
    };
    for (const auto& [key, text] : texts) add(table[0], key);
    for (const auto& [key, text] : texts) add(table[1], text);
    Append(bytes, 0x950412de);
    Append(bytes, 0);
    Append(bytes, count);
    Append(bytes, kHeader);
    Append(bytes, kHeader + kEntry * count);
    Append(bytes, 0);    // no hash table
    Append(bytes, first_string);
    return bytes + table[0] + table[1] + strings;
}

}  // namespace

int main(int count, char** words) {
    if (count != 2) return 2;
    std::ofstream file(words[1], std::ios::binary);
    file << Catalogue(Texts());
    return file.flush() ? 0 : 1;
}
