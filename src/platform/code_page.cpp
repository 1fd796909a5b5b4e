// Conversion between code pages through iconv. Each thread keeps the converters it has opened.
//
// iconv stops at a character that it cannot convert. Its length is then found by decoding it alone, a substitute is
// written, and the conversion goes on behind it. Two pages (1255, 1258) hold a letter back until they see whether an
// accent follows, so that the end of a text is a step of its own.
#include "platform/code_page.h"

#include <iconv.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <memory>
#include <string>
#include <vector>

#include "platform/code_page_table.h"
#include "platform/utf.h"

namespace {

using utf::Conversion;

class Converter {
public:
    Converter(const char* target, const char* source) : handle_(iconv_open(target, source)) {}
    ~Converter() { if (IsOpen()) iconv_close(handle_); }
    Converter(const Converter&) = delete;
    Converter& operator=(const Converter&) = delete;

    [[nodiscard]] bool IsOpen() const { return handle_ != reinterpret_cast<iconv_t>(-1); }

    // Converts as far as it goes: 0, E2BIG, EILSEQ or EINVAL.
    int Run(Conversion& conversion) {
        auto* input = reinterpret_cast<char*>(const_cast<unsigned char*>(conversion.input));
        auto* output = reinterpret_cast<char*>(conversion.output);
        std::size_t unread = conversion.Unread();
        std::size_t room = conversion.Room();
        const std::size_t result = iconv(handle_, &input, &unread, &output, &room);
        const int error = result == static_cast<std::size_t>(-1) ? errno : 0;
        if (error == 0 && result > 0) conversion.substituted = true;
        conversion.input = conversion.input_end - unread;
        conversion.output = conversion.output_end - room;
        return error;
    }

    // Writes what is held back. False when it does not fit.
    bool Finish(Conversion& conversion) {
        auto* output = reinterpret_cast<char*>(conversion.output);
        std::size_t room = conversion.Room();
        const bool done = iconv(handle_, nullptr, nullptr, &output, &room) != static_cast<std::size_t>(-1);
        conversion.output = conversion.output_end - room;
        return done;
    }

    void Reset() { iconv(handle_, nullptr, nullptr, nullptr, nullptr); }

private:
    iconv_t handle_;
};

// Converts a short text whole; empty when it cannot be.
std::string ConvertShort(Converter& converter, const void* text, std::size_t length) {
    unsigned char area[16];
    const auto* input = static_cast<const unsigned char*>(text);
    Conversion conversion{input, input + length, area, std::end(area)};
    if (!converter.IsOpen()) return {};
    converter.Reset();
    if (converter.Run(conversion) != 0 || !converter.Finish(conversion)) return {};
    return std::string(reinterpret_cast<char*>(area), static_cast<std::size_t>(conversion.output - area));
}

// From one code page to another.
class PagePair {
public:
    PagePair(const CodePage& source, const CodePage& target)
        : source_(source), target_(target), converter_(target.name, source.name), decoder_("UTF-16LE", source.name) {
        Converter from_unicode(target.name, "UTF-8");
        substitute_ = ConvertShort(from_unicode, "\xEF\xBF\xBD", 3);
        if (substitute_.empty()) substitute_ = ConvertShort(from_unicode, "?", 1);
    }

    [[nodiscard]] bool IsOpen() const { return converter_.IsOpen() && decoder_.IsOpen() && !substitute_.empty(); }
    [[nodiscard]] bool Joins(const CodePage& source, const CodePage& target) const {
        return &source_ == &source && &target_ == &target;
    }

    void Convert(Conversion& conversion) {
        Conversion attempt = conversion;
        unsigned char* fits = conversion.output_end;
        while (!Attempt(attempt, fits)) {
            // A letter held back did not fit, alone or joined with its accent: the same again without it.
            const unsigned char* const end = attempt.input - 1;
            attempt = conversion;
            attempt.input_end = end;
            attempt.truncated = true;
        }
        attempt.input_end = conversion.input_end;
        conversion = attempt;
    }

private:
    // False when a letter that was read does not fit; `fits` is then set before it. Nothing is written beyond `fits`.
    bool Attempt(Conversion& conversion, unsigned char*& fits) {
        converter_.Reset();
        for (;;) {
            const int error = converter_.Run(conversion);
            unsigned char* const before = conversion.output;
            const bool finished = converter_.Finish(conversion) && conversion.output <= fits;
            // Where the area is full, a letter that was held back and fits alone has an accent to be joined with.
            if (!finished || (error == E2BIG && conversion.output > before)) {
                fits = std::min(fits, before);
                return false;
            }
            if (error == 0) return true;
            if (error == E2BIG) conversion.truncated = true;
            if (error == E2BIG || !Substitute(conversion)) return true;
        }
    }

    bool Substitute(Conversion& conversion) {
        if (conversion.Room() < substitute_.size()) {
            conversion.truncated = true;
            return false;
        }
        std::memcpy(conversion.output, substitute_.data(), substitute_.size());
        conversion.output += substitute_.size();
        conversion.input += CharacterLength(conversion);
        conversion.substituted = true;
        return true;
    }

    // Bytes of the next character, or of the smallest unit where there is none.
    std::size_t CharacterLength(const Conversion& conversion) {
        constexpr std::size_t kLongest = 4;
        const std::size_t unread = conversion.Unread();
        for (std::size_t length = source_.unit; length <= std::min(kLongest, unread); length += source_.unit)
            if (!ConvertShort(decoder_, conversion.input, length).empty()) return length;
        return std::min(source_.unit, unread);
    }

    const CodePage& source_;
    const CodePage& target_;
    Converter converter_;
    Converter decoder_;
    std::string substitute_;
};

PagePair& Pair(const CodePage& source, const CodePage& target) {
    static thread_local std::vector<std::unique_ptr<PagePair>> pairs;
    for (const auto& pair : pairs)
        if (pair->Joins(source, target)) return *pair;
    return *pairs.emplace_back(std::make_unique<PagePair>(source, target));
}

int Convert(std::uint32_t source, std::uint32_t target, Conversion& conversion) {
    const CodePage* const from = FindCodePage(source);
    const CodePage* const to = FindCodePage(target);
    if (!from || !to) return kCodePageUnknown;
    if (source == kCodePageUtf8 && target == kCodePageUtf16) {
        utf::ConvertUtf8ToUtf16(conversion);
    } else if (source == kCodePageUtf16 && target == kCodePageUtf8) {
        utf::ConvertUtf16ToUtf8(conversion);
    } else {
        PagePair& pair = Pair(*from, *to);
        if (!pair.IsOpen()) return kCodePageFailed;
        pair.Convert(conversion);
    }
    if (conversion.truncated) return kCodePageTruncated;
    return conversion.substituted ? kCodePageSubstituted : kCodePageDone;
}

}  // namespace

int CodePageConvert(std::uint32_t source, std::uint32_t target, const void* input, std::size_t input_length,
                    std::size_t* unused_input, void* output, std::size_t capacity, std::size_t* unused_output) {
    if (unused_input) *unused_input = input_length;
    if (unused_output) *unused_output = capacity;
    if ((!input && input_length > 0) || (!output && capacity > 0)) return kCodePageBadArgument;
    unsigned char none = 0;    // stands in for areas of no length
    const unsigned char* const from = input ? static_cast<const unsigned char*>(input) : &none;
    unsigned char* const to = output ? static_cast<unsigned char*>(output) : &none;
    Conversion conversion{from, from + input_length, to, to + capacity};
    const int result = Convert(source, target, conversion);
    if (unused_input) *unused_input = conversion.Unread();
    if (unused_output) *unused_output = conversion.Room();
    return result;
}
