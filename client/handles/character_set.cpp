#include "handles/character_set.h"

#include <iconv.h>
#include <langinfo.h>
#include <locale.h>
#include <strings.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <memory>
#include <mutex>
#include <new>
#include <utility>
#include <vector>

#include "platform/utf.h"

namespace {

enum class Form : std::uint8_t { utf8, utf16, utf16_high_first, bytes };

constexpr char16_t kNone = 0xFFFF;    // a byte that stands for nothing

// A set of single bytes, both ways.
struct ByteTable {
    std::array<char16_t, 256> characters{};
    std::vector<std::pair<char16_t, char>> bytes;    // by character
};

}  // namespace

struct CharacterSet {
    std::uint16_t id;
    const char* name;
    const char* code_set;    // as iconv and the locales call it
    Form form;
};

namespace {

// The first of a code set is what a locale that names it means.
constexpr CharacterSet kSets[] = {
    {1, "US7ASCII", "ASCII", Form::bytes},
    {31, "WE8ISO8859P1", "ISO-8859-1", Form::bytes},
    {32, "EE8ISO8859P2", "ISO-8859-2", Form::bytes},
    {46, "WE8ISO8859P15", "ISO-8859-15", Form::bytes},
    {170, "EE8MSWIN1250", "CP1250", Form::bytes},
    {171, "CL8MSWIN1251", "CP1251", Form::bytes},
    {178, "WE8MSWIN1252", "CP1252", Form::bytes},
    {charset::kUtf8, "AL32UTF8", "UTF-8", Form::utf8},
    {871, "UTF8", "", Form::utf8},
    {1000, "UTF16", "", Form::utf16},
    {2000, "AL16UTF16", "", Form::utf16_high_first},
};
constexpr std::size_t kCount = std::size(kSets);

std::mutex tables_mutex;
std::array<std::atomic<const ByteTable*>, kCount> tables;    // made once, never freed

std::atomic<const ByteTable*>& TableOf(const CharacterSet& set) {
    return tables[static_cast<std::size_t>(&set - kSets)];
}

class Iconv {
public:
    explicit Iconv(const char* from) : descriptor_(iconv_open("UTF-16LE", from)) {}
    ~Iconv() { if (Opened()) iconv_close(descriptor_); }
    Iconv(const Iconv&) = delete;
    Iconv& operator=(const Iconv&) = delete;
    [[nodiscard]] bool Opened() const { return descriptor_ != reinterpret_cast<iconv_t>(-1); }

    [[nodiscard]] char16_t Character(char byte) const {
        char16_t unit = 0;
        char *input = &byte, *output = reinterpret_cast<char*>(&unit);
        std::size_t unread = 1, room = sizeof unit;
        iconv(descriptor_, &input, &unread, &output, &room);    // what stands for nothing leaves the room
        return room == 0 ? unit : kNone;
    }

private:
    iconv_t descriptor_;
};

bool MakeTable(const CharacterSet& set) {
    const std::lock_guard lock(tables_mutex);
    if (TableOf(set).load()) return true;
    const Iconv converter(set.code_set);
    if (!converter.Opened()) {
        if (errno == ENOMEM) throw std::bad_alloc();
        return false;
    }
    auto table = std::make_unique<ByteTable>();
    table->bytes.reserve(table->characters.size());
    for (unsigned byte = 0; byte < table->characters.size(); ++byte) {
        const char16_t unit = converter.Character(static_cast<char>(byte));
        table->characters[byte] = unit;
        if (unit != kNone) table->bytes.emplace_back(unit, static_cast<char>(byte));
    }
    std::sort(table->bytes.begin(), table->bytes.end());
    TableOf(set).store(table.release());
    return true;
}

bool BytesToUtf8(const ByteTable& table, std::string_view text, std::string& utf8) {
    for (const char byte : text) {
        const char16_t unit = table.characters[static_cast<unsigned char>(byte)];
        if (unit == kNone) return false;
        if (unit < 0x80) utf8 += static_cast<char>(unit);
        else utf::ToUtf8(&unit, sizeof unit, utf8);
    }
    return true;
}

char ByteFor(const ByteTable& table, char16_t unit) {
    const auto found = std::lower_bound(table.bytes.begin(), table.bytes.end(), std::pair(unit, '\x80'),
                                        [](const auto& left, const auto& right) { return left.first < right.first; });
    return found != table.bytes.end() && found->first == unit ? found->second : '?';
}

// One byte a character: the second half of a pair adds none.
void UnitsToBytes(const ByteTable& table, std::string_view units, std::string& text) {
    for (std::size_t at = 0; at < units.size(); at += 2) {
        const auto unit = static_cast<char16_t>(static_cast<unsigned char>(units[at]) |
                                                static_cast<unsigned char>(units[at + 1]) << 8);
        if ((unit & 0xFC00) != 0xDC00) text += ByteFor(table, unit);
    }
}

void SwapPairs(std::string& text, std::size_t from) {
    for (std::size_t at = from; at + 1 < text.size(); at += 2) std::swap(text[at], text[at + 1]);
}

}  // namespace

namespace charset {

const CharacterSet* Find(std::uint16_t id) {
    const auto* set = std::find_if(std::begin(kSets), std::end(kSets), [id](const auto& row) { return row.id == id; });
    if (set == std::end(kSets)) return nullptr;
    if (set->form == Form::bytes && !TableOf(*set).load() && !MakeTable(*set)) return nullptr;
    return set;
}

std::uint16_t IdOf(std::string_view name) noexcept {
    for (const CharacterSet& set : kSets) {
        const std::string_view known = set.name;
        if (known.size() == name.size() && strncasecmp(known.data(), name.data(), name.size()) == 0) return set.id;
    }
    return 0;
}

std::uint16_t IdOfLocale() noexcept {
    const locale_t locale = newlocale(LC_CTYPE_MASK, "", nullptr);
    if (!locale) return kUtf8;
    std::uint16_t id = kUtf8;
    for (const CharacterSet& set : kSets)
        if (set.id != 1 && strcasecmp(set.code_set, nl_langinfo_l(CODESET, locale)) == 0) id = set.id;
    freelocale(locale);
    return id;
}

std::uint16_t Id(const CharacterSet& set) noexcept { return set.id; }
std::string_view Name(const CharacterSet& set) noexcept { return set.name; }
int MostBytes(const CharacterSet& set) noexcept { return set.form == Form::bytes ? 1 : 4; }
bool IsFixedWidth(const CharacterSet& set) noexcept { return set.form == Form::bytes; }
bool IsUtf8(const CharacterSet& set) noexcept { return set.form == Form::utf8; }
bool IsUtf16(const CharacterSet& set) noexcept { return set.form == Form::utf16 || set.form == Form::utf16_high_first; }
std::string_view Blank(const CharacterSet& set) noexcept {
    constexpr std::string_view kHighFirst("\0 ", 2), kLowFirst(" \0", 2);
    return set.form == Form::utf16 ? kLowFirst : kHighFirst;
}

bool ToUtf8(const CharacterSet& set, std::string_view text, std::string& utf8) {
    switch (set.form) {
        case Form::utf8: utf8 += text; return true;
        case Form::utf16: return utf::ToUtf8(text.data(), text.size(), utf8);
        case Form::bytes: return BytesToUtf8(*TableOf(set).load(), text, utf8);
        case Form::utf16_high_first: break;
    }
    std::string swapped(text);
    SwapPairs(swapped, 0);
    return utf::ToUtf8(swapped.data(), swapped.size(), utf8);
}

bool FromUtf8(const CharacterSet& set, std::string_view utf8, std::string& text) {
    if (set.form == Form::utf8) return text += utf8, true;
    std::string units;
    std::string& into = set.form == Form::bytes ? units : text;
    const std::size_t before = into.size();
    const bool whole = utf::ToUtf16(utf8, into);
    if (!whole) into.resize(before), utf::ToUtf16Replacing(utf8, into);
    if (set.form == Form::utf16_high_first) SwapPairs(text, before);
    if (set.form == Form::bytes) UnitsToBytes(*TableOf(set).load(), units, text);
    return whole;
}

bool BeginsPair(const CharacterSet& set, std::string_view unit) noexcept {
    return (static_cast<unsigned char>(unit[set.form == Form::utf16 ? 1 : 0]) & 0xFC) == 0xD8;
}

bool PartToUtf8(const CharacterSet& set, std::string_view part, bool last, std::string& torn, std::string& utf8) {
    if (!IsUtf16(set)) return ToUtf8(set, part, utf8);
    torn.append(part);
    std::size_t taken = torn.size();
    if (!last) {
        taken = taken / 2 * 2;
        if (taken > 0 && BeginsPair(set, std::string_view(torn).substr(taken - 2))) taken -= 2;
    }
    const bool converted = ToUtf8(set, std::string_view(torn).substr(0, taken), utf8);
    torn.erase(0, taken);
    return converted;
}

std::size_t Whole(const CharacterSet& set, std::string_view text, std::size_t room) noexcept {
    if (text.size() <= room) return text.size();
    if (set.form == Form::bytes) return room;
    if (set.form == Form::utf8) return utf::WholeUtf8(text, room);
    room = room / 2 * 2;
    return room > 0 && BeginsPair(set, text.substr(room - 2)) ? room - 2 : room;
}

}  // namespace charset
