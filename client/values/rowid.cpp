// Row ids as text and bytes.
#include "values/rowid.h"

namespace rowid {
namespace {

constexpr std::string_view kDigits = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
constexpr std::size_t kTableDigits = 6;
constexpr std::size_t kRowDigits = 12;

void PutDigits(std::uint64_t value, std::size_t count, char* text) {
    for (std::size_t i = count; i-- > 0; value >>= 6) text[i] = kDigits[value & 63];
}

// False for a character that is no digit, and for more than `bits` bits.
bool TakeDigits(std::string_view text, unsigned bits, std::uint64_t* value) {
    *value = 0;
    for (const char c : text) {
        const std::size_t digit = kDigits.find(c);
        if (digit == std::string_view::npos || *value >> (bits - 6) != 0) return false;
        *value = *value << 6 | digit;
    }
    return true;
}

std::string_view WithoutBlanks(std::string_view text) {
    while (text.starts_with(' ')) text.remove_prefix(1);
    while (text.ends_with(' ')) text.remove_suffix(1);
    return text;
}

}  // namespace

std::size_t ToText(const RowId& value, char* text) noexcept {
    PutDigits(value.table, kTableDigits, text);
    PutDigits(static_cast<std::uint64_t>(value.row), kRowDigits, text + kTableDigits);
    return kTextLength;
}

bool FromText(std::string_view text, RowId* value) noexcept {
    text = WithoutBlanks(text);
    std::uint64_t table = 0, row = 0;
    if (text.size() != kTextLength) return false;
    if (!TakeDigits(text.substr(0, kTableDigits), 32, &table)) return false;
    if (!TakeDigits(text.substr(kTableDigits), 64, &row)) return false;
    *value = {static_cast<std::uint32_t>(table), static_cast<std::int64_t>(row)};
    return true;
}

bool ToBytes(const RowId& value, std::uint8_t* bytes) noexcept {
    if (value.table > 0xFFFF) return false;
    bytes[0] = static_cast<std::uint8_t>(value.table >> 8);
    bytes[1] = static_cast<std::uint8_t>(value.table);
    const auto row = static_cast<std::uint64_t>(value.row);
    for (unsigned i = 0; i < 8; ++i) bytes[2 + i] = static_cast<std::uint8_t>(row >> (56 - 8 * i));
    return true;
}

RowId FromBytes(const std::uint8_t* bytes) noexcept {
    std::uint64_t row = 0;
    for (unsigned i = 0; i < 8; ++i) row = row << 8 | bytes[2 + i];
    return {bytes[0] * 256U + bytes[1], static_cast<std::int64_t>(row)};
}

}  // namespace rowid
