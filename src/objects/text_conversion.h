// Texts between the application code page and UTF-16, and the text arguments of commands. Any thread.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

#include "core/messages.h"
#include "objects/memory.h"

// Converts a text argument. Returns 0 (or a tolerated warning of the code-page service), -1 for a bad argument, else
// the service's code; says so by its messages. Lengths and capacity in bytes. A word W'...' is copied, not converted.
int convertToUTF16(const char* input, uint32_t input_length, char* output, uint32_t capacity, uint32_t* output_length,
                   bool quiet = false);

// Whether a result of convertToUTF16 counts as success: 0, or one of the service's warnings (truncated, substituted).
bool IsTolerated(int result);

// A UTF-16 text of the library as the application code page shows it: of one that takes more than `most` bytes, the whole
// characters that go into them. False after a failure, which has been printed.
bool convertFromUTF16(const void* text, size_t length, std::string& output, size_t most = SIZE_MAX);

// Adds a text of the library to a line, converted when `utf16`. After a failed conversion the line is printed as far as
// it goes, the failure after it, and false returned.
enum class Quotes {
    never,
    converted,  // W"..." around what was converted, nothing around what was not
    always      // W"..." and "..."
};
bool AddText(Line& line, const void* text, size_t length, bool utf16, Quotes quotes = Quotes::converted);

// How large the area for the UTF-16 form of an argument is.
enum class TextArea {
    four_times,          // of the typed length; a length of 0 is complained about and ends the command
    four_times_and_one   // one byte more; a length of 0 passes the zeroed area
};

// A text argument with the length typed for it, ready to be passed: in UTF-16 mode the converted text and its length,
// else the word and the length as typed. The length may be anything; what is passed can be read up to that length
// (behind a word comes what its token buffer held before, then zeros), unless the length is beyond kReadableText, where
// only the library can say no.
class TextArgument {
public:
    static constexpr uint32_t kTokenBufferSize = 10000;  // what may be read at a word, whatever its length
    static constexpr uint32_t kReadableText = 256u << 20;

    // Texts beside "null" that stand for a null pointer are for the caller to say: pass a null word then. False when
    // the command ends here (no memory, failed conversion): the message has been printed.
    bool Set(const char* word, long length, TextArea area);
    // The text at words[0], its length at words[1].
    bool SetWords(char** words, TextArea area = TextArea::four_times);
    // Bytes rather than a text: never converted, and "null" is no reserved word. A null word passes a null pointer.
    bool SetBytes(const char* word, long length);

    unsigned char* Text() const { return text_; }
    uint32_t Length() const { return length_; }

private:
    bool Pass(const char* word);
    bool Pad(const char* word, const char*& padded);
    bool Convert(const char* word, uint32_t length, TextArea area);
    unsigned char* text_ = nullptr;
    uint32_t length_ = 0;
    Memory<char> padded_;
    Memory<char> converted_;
};
