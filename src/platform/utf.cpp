// UTF-8 and UTF-16 by hand. Any thread.
#include "platform/utf.h"

#include <bit>
#include <cstdint>
#include <cstring>

namespace utf {
namespace {

constexpr char32_t kReplacement = 0xFFFD;

struct Decoded {
    char32_t character;
    std::size_t length;    // bytes read
    bool valid;
};

bool Continues(unsigned char byte) {
    return (byte & 0xC0) == 0x80;
}

// One character of UTF-8 above ASCII. Overlong forms, surrogates and what lies above U+10FFFF are malformed.
Decoded DecodeUtf8(const unsigned char* input, std::size_t size) {
    const unsigned char lead = input[0];
    const std::size_t length = lead >= 0xF0 ? 4 : lead >= 0xE0 ? 3 : 2;
    constexpr Decoded kMalformed = {kReplacement, 1, false};
    if (lead < 0xC2 || lead > 0xF4 || size < length) return kMalformed;
    char32_t character = lead & (0x7Fu >> length);
    for (std::size_t index = 1; index < length; ++index) {
        if (!Continues(input[index])) return kMalformed;
        character = character << 6 | (input[index] & 0x3F);
    }
    const bool overlong = (length == 3 && character < 0x800) || (length == 4 && character < 0x10000);
    if (overlong || character > 0x10FFFF || (character >= 0xD800 && character < 0xE000)) return kMalformed;
    return {character, length, true};
}

char32_t Unit(const unsigned char* input) {
    return static_cast<char32_t>(input[0] | input[1] << 8);
}

// One character of UTF-16. A lone surrogate and an odd last byte are malformed.
Decoded DecodeUtf16(const unsigned char* input, std::size_t size) {
    if (size < 2) return {kReplacement, size, false};
    const char32_t first = Unit(input);
    if (first < 0xD800 || first >= 0xE000) return {first, 2, true};
    if (first >= 0xDC00 || size < 4) return {kReplacement, 2, false};
    const char32_t second = Unit(input + 2);
    if (second < 0xDC00 || second >= 0xE000) return {kReplacement, 2, false};
    return {0x10000 + ((first - 0xD800) << 10) + (second - 0xDC00), 4, true};
}

std::size_t EncodeUtf8(char32_t character, unsigned char* output) {
    const std::size_t length = character < 0x80 ? 1 : character < 0x800 ? 2 : character < 0x10000 ? 3 : 4;
    constexpr unsigned char kLeads[] = {0, 0, 0xC0, 0xE0, 0xF0};
    for (std::size_t index = length; index-- > 1; character >>= 6)
        output[index] = static_cast<unsigned char>(0x80 | (character & 0x3F));
    output[0] = static_cast<unsigned char>(kLeads[length] | character);
    return length;
}

std::size_t EncodeUtf16(char32_t character, unsigned char* output) {
    const auto put = [&](std::size_t at, char32_t unit) {
        output[at] = static_cast<unsigned char>(unit & 0xFF);
        output[at + 1] = static_cast<unsigned char>(unit >> 8);
    };
    if (character < 0x10000) {
        put(0, character);
        return 2;
    }
    put(0, 0xD800 + ((character - 0x10000) >> 10));
    put(2, 0xDC00 + ((character - 0x10000) & 0x3FF));
    return 4;
}

enum class Malformed { becomes_replacement, ends_it };

// Decodes one character and encodes it. False when the output is full, or what was read is to end the conversion.
template <Malformed malformed, auto decode, auto encode>
bool ConvertOne(Conversion& conversion) {
    const Decoded decoded = decode(conversion.input, conversion.Unread());
    if (!decoded.valid) conversion.substituted = true;
    if (!decoded.valid && malformed == Malformed::ends_it) return false;
    unsigned char encoded[4];
    const std::size_t length = encode(decoded.character, encoded);
    if (length > conversion.Room()) {
        conversion.truncated = true;
        return false;
    }
    std::memcpy(conversion.output, encoded, length);
    conversion.output += length;
    conversion.input += decoded.length;
    return true;
}

// Eight bytes of ASCII at a time, as far as they go; what is left is for ConvertOne and its like.
constexpr std::size_t kBlock = 8;
static_assert(std::endian::native == std::endian::little, "units are written as the machine holds them");

std::uint64_t LoadEight(const void* bytes) {
    std::uint64_t eight;
    std::memcpy(&eight, bytes, sizeof eight);
    return eight;
}

void WidenAscii(Conversion& conversion) {
    while (conversion.Unread() >= kBlock && conversion.Room() >= 2 * kBlock) {
        unsigned char block[kBlock];
        std::memcpy(block, conversion.input, sizeof block);
        if ((LoadEight(block) & 0x8080808080808080) != 0) return;
        std::uint16_t units[kBlock];
        for (std::size_t index = 0; index < kBlock; ++index) units[index] = block[index];
        std::memcpy(conversion.output, units, sizeof units);
        conversion.input += kBlock;
        conversion.output += 2 * kBlock;
    }
}

void NarrowAscii(Conversion& conversion) {
    while (conversion.Unread() >= 2 * kBlock && conversion.Room() >= kBlock) {
        std::uint16_t units[kBlock];
        std::memcpy(units, conversion.input, sizeof units);
        if (((LoadEight(units) | LoadEight(units + 4)) & 0xFF80FF80FF80FF80) != 0) return;
        unsigned char block[kBlock];
        for (std::size_t index = 0; index < kBlock; ++index) block[index] = static_cast<unsigned char>(units[index]);
        std::memcpy(conversion.output, block, sizeof block);
        conversion.input += 2 * kBlock;
        conversion.output += kBlock;
    }
}

template <Malformed malformed>
void Utf8ToUtf16(Conversion& conversion) {
    for (;;) {
        WidenAscii(conversion);
        while (conversion.Unread() > 0 && conversion.input[0] < 0x80 && conversion.Room() >= 2) {
            conversion.output[0] = *conversion.input++;
            conversion.output[1] = 0;
            conversion.output += 2;
        }
        if (conversion.Unread() == 0) return;
        constexpr auto decode = [](const unsigned char* input, std::size_t size) {
            return input[0] < 0x80 ? Decoded{input[0], 1, true} : DecodeUtf8(input, size);
        };
        if (!ConvertOne<malformed, decode, EncodeUtf16>(conversion)) return;
    }
}

template <Malformed malformed>
void Utf16ToUtf8(Conversion& conversion) {
    for (;;) {
        NarrowAscii(conversion);
        while (conversion.Unread() >= 2 && Unit(conversion.input) < 0x80 && conversion.Room() >= 1) {
            *conversion.output++ = conversion.input[0];
            conversion.input += 2;
        }
        if (conversion.Unread() == 0) return;
        if (!ConvertOne<malformed, DecodeUtf16, EncodeUtf8>(conversion)) return;
    }
}

// Appends to `out`, which is given room for `most` bytes. False when something malformed was met.
bool Append(void (*convert)(Conversion&), const void* text, std::size_t size, std::size_t most, std::string& out) {
    const std::size_t before = out.size();
    out.resize(before + most);
    auto* const output = reinterpret_cast<unsigned char*>(out.data());
    const auto* const input = static_cast<const unsigned char*>(text);
    Conversion conversion{input, input + size, output + before, output + out.size()};
    convert(conversion);
    out.resize(static_cast<std::size_t>(conversion.output - output));
    return !conversion.substituted;
}

}  // namespace

void ConvertUtf8ToUtf16(Conversion& conversion) {
    Utf8ToUtf16<Malformed::becomes_replacement>(conversion);
}

void ConvertUtf16ToUtf8(Conversion& conversion) {
    Utf16ToUtf8<Malformed::becomes_replacement>(conversion);
}

bool ToUtf8(const void* utf16, std::size_t bytes, std::string& out) {
    constexpr std::size_t kMostOfAUnit = 3;
    return Append(Utf16ToUtf8<Malformed::ends_it>, utf16, bytes, bytes / 2 * kMostOfAUnit, out);
}

bool ToUtf16(std::string_view utf8, std::string& out) {
    return Append(Utf8ToUtf16<Malformed::ends_it>, utf8.data(), utf8.size(), 2 * utf8.size(), out);
}

void ToUtf16Replacing(std::string_view utf8, std::string& out) {
    Append(ConvertUtf8ToUtf16, utf8.data(), utf8.size(), 2 * utf8.size(), out);
}

}  // namespace utf
