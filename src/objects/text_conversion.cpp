// Conversion over the code-page service, with its messages; text arguments made ready for the library.
#include "objects/text_conversion.h"

#include <algorithm>
#include <cstring>

#include "core/keywords.h"
#include "core/state.h"
#include "objects/memory.h"
#include "platform/code_page.h"

namespace {

constexpr uint32_t kUcs2 = 13488;

uint32_t EffectiveCodePage() {
    const bool unicode = application_code_page == kCodePageUtf8 || application_code_page == kUcs2;
    return unicode ? second_code_page : application_code_page;
}

void SayConverted(uint32_t input_length, uint32_t output_length) {
    Message(kOutput, "convertToUTF16 succeeded - In length - %ld, Out length - %ld\n", static_cast<long>(input_length),
            static_cast<long>(output_length));
}

// A word W'...' stands for the bytes between its quotes.
bool IsUtf16Literal(const char* input, uint32_t length) {
    return length >= 3 && input[0] == 'W' && input[1] == '\'' && input[length - 1] == '\'';
}

// Converts without a message. Room for every code page: the largest takes four bytes for a UTF-16 unit of two.
int FromUtf16(const void* text, size_t length, std::string& output, size_t most = SIZE_MAX) {
    output.clear();
    if (text == nullptr || length == 0) return 0;
    output.resize(std::min(2 * length + 1, most));
    size_t unused = 0;
    const int rc = CodePageConvert(kCodePageUtf16, EffectiveCodePage(), text, length, nullptr, output.data(),
                                   output.size(), &unused);
    output.resize(output.size() - unused);
    return rc;
}

void SayNotConverted(int rc) {
    Message(kError, "convertFromUTF16 failed: rc = %ld\n", static_cast<long>(rc));
}

}  // namespace

bool IsTolerated(int result) {
    return result == kCodePageDone || result == kCodePageTruncated || result == kCodePageSubstituted;
}

int convertToUTF16(const char* input, uint32_t input_length, char* output, uint32_t capacity, uint32_t* output_length,
                   bool quiet) {
    constexpr int kBadArgument = -1;
    *output_length = 0;
    const char* complaint = output == nullptr  ? "pOut is NULL\n"
                            : input == nullptr ? "pIn is NULL\n"
                            : capacity == 0    ? "cbOutLen is zero\n"
                                               : nullptr;
    if (complaint != nullptr) {
        MessageText(kError, complaint);
        return kBadArgument;
    }
    if (input_length == 0) {
        std::memset(output, 0, capacity);
        return 0;
    }
    if (IsUtf16Literal(input, input_length)) {
        *output_length = std::min(input_length - 3, capacity);
        std::memcpy(output, input + 2, *output_length);
        SayConverted(input_length, *output_length);
        return 0;
    }
    size_t unused = 0;
    const int rc = CodePageConvert(EffectiveCodePage(), kCodePageUtf16, input, input_length, nullptr, output, capacity,
                                   &unused);
    if (!IsTolerated(rc)) {
        Message(kError, "CodePageConvert failed with rc - %ld\n", static_cast<long>(rc));
        return rc;
    }
    *output_length = static_cast<uint32_t>(capacity - unused);
    if (!quiet) SayConverted(input_length, *output_length);
    return rc;
}

bool convertFromUTF16(const void* text, size_t length, std::string& output, size_t most) {
    const int rc = FromUtf16(text, length, output, most);
    if (IsTolerated(rc)) return true;
    SayNotConverted(rc);
    return false;
}

bool AddText(Line& line, const void* text, size_t length, bool utf16, Quotes quotes) {
    if (!utf16) {
        const std::string_view mark = quotes == Quotes::always ? "\"" : "";
        line.Text(mark).Text({static_cast<const char*>(text), text == nullptr ? 0 : length}).Text(mark);
        return true;
    }
    std::string converted;
    const int rc = FromUtf16(text, length, converted);
    if (!IsTolerated(rc)) {
        line.Print();
        SayNotConverted(rc);
        return false;
    }
    const bool quoted = quotes != Quotes::never;
    line.Text(quoted ? "W\"" : "").Text(converted).Text(quoted ? "\"" : "");
    return true;
}

// --- Text arguments ------------------------------------------------------------------------------------------------

bool TextArgument::Set(const char* word, long length, TextArea area) {
    length_ = static_cast<uint32_t>(length);
    if (word == nullptr || IsNull(word)) return true;
    if (Utf16Mode) return Convert(word, length_, area);
    return Pass(word);
}

bool TextArgument::SetWords(char** words, TextArea area) {
    return Set(words[0], DecodeLong(words[1]), area);
}

bool TextArgument::SetBytes(const char* word, long length) {
    length_ = static_cast<uint32_t>(length);
    return word == nullptr || Pass(word);
}

// Words lie in token buffers. A length beyond those gets a block of its own, unless only the library can refuse it.
bool TextArgument::Pass(const char* word) {
    const char* readable = word;
    if (length_ > kTokenBufferSize && length_ <= kReadableText && !Pad(word, readable)) return false;
    text_ = reinterpret_cast<unsigned char*>(const_cast<char*>(readable));
    return true;
}

// A length beyond the token buffer.
bool TextArgument::Pad(const char* word, const char*& padded) {
    padded_.reset(static_cast<char*>(GetMem(length_)));
    if (padded_ == nullptr) {
        Message(kError, "Could not allocate memory\n");
        return false;
    }
    std::memcpy(padded_.get(), word, kTokenBufferSize);
    padded = padded_.get();
    return true;
}

bool TextArgument::Convert(const char* word, uint32_t length, TextArea area) {
    const uint64_t size = 4 * uint64_t{length} + (area == TextArea::four_times_and_one ? 1 : 0);
    if (size == 0) {
        Message(kError, "cbOutLen is zero\n");
        return false;
    }
    const char* input = word;
    if (length > kTokenBufferSize && !Pad(word, input)) return false;
    converted_.reset(static_cast<char*>(GetMem(size)));
    if (converted_ == nullptr) {
        Message(kError, "Could not allocate memory\n");
        return false;
    }
    const int rc = convertToUTF16(input, length, converted_.get(), static_cast<uint32_t>(size), &length_);
    text_ = reinterpret_cast<unsigned char*>(converted_.get());
    return IsTolerated(rc);
}
