// Numbers between words, buffers and the log.
#include "commands/values/number_values.h"

#include <algorithm>
#include <cstring>
#include <string_view>

#include "core/state.h"
#include "objects/buffers.h"
#include "objects/memory.h"
#include "objects/text_conversion.h"

namespace {

constexpr size_t kPrintedPlaces = 5;
constexpr size_t kNumberTextRoom = 200;
constexpr size_t kLocalFormat = 100;
const OraText kNoText[2] = {};

// A format as long as the literal, all nines. Most literals are short and need no block of their own.
class NinesFormat {
public:
    // Null when there is no memory for it.
    const char* OfLength(size_t length) {
        char* format = local_;
        if (length > kLocalFormat) {
            block_.reset(static_cast<char*>(GetMem(length + 1)));
            format = block_.get();
            if (format == nullptr) {
                Message(kError, "Could not allocate memory in ConvertStringToNumber\n");
                return nullptr;
            }
        }
        std::memset(format, '9', length);
        format[length] = '\0';
        return format;
    }

private:
    char local_[kLocalFormat + 1];
    Memory<char> block_;
};

sword ReadNumberText(OCIError* error, const void* text, ub4 length, const void* format, OCINumber& number) {
    const sword rc = Call(&ClientLibrary::OCINumberFromText, error, static_cast<const OraText*>(text), length,
                          static_cast<const OraText*>(format), length, kNoText, ub4{0}, &number);
    if (rc != OCI_SUCCESS) ReturnCodeReport(error, rc);
    return rc;
}

// The literal's converted length holds for the format too: both are converted, and a literal W'...' only gets shorter.
int Utf16LiteralToNumber(const char* literal, long length, const char* format, OCIError* error, OCINumber& number) {
    TextArgument wide_literal;
    TextArgument wide_format;
    if (!wide_literal.Set(literal, length, TextArea::four_times)) return -1;
    if (!wide_format.Set(format, length, TextArea::four_times)) return -1;
    return ReadNumberText(error, wide_literal.Text(), wide_literal.Length(), wide_format.Text(), number);
}

int LiteralToNumber(const char* literal, OCIError* error, OCINumber& number) {
    const size_t length = std::strlen(literal);
    if (length == 0) {
        Message(kError, "Number string is of zero length\n");
        return -1;
    }
    NinesFormat nines;
    const char* const format = nines.OfLength(length);
    if (format == nullptr) return -1;
    if (Utf16Mode) return Utf16LiteralToNumber(literal, static_cast<long>(length), format, error, number);
    return ReadNumberText(error, literal, static_cast<ub4>(length), format, number);
}

// Complains about a buffer of another type.
bool HoldsNumbers(const MemBuffer& buffer, const char* word) {
    if (buffer.type == SQLT_VNU && buffer.data != nullptr) return true;
    Message(kError, "Buffer %s is not of type SQLT_VNU\n", word);
    return false;
}

// At most five places after the point, and the exponent whole.
void AddNumberText(Line& line, std::string_view text) {
    const size_t point = std::min(text.find('.'), text.size());
    const size_t exponent = std::min(text.find('E', point), text.size());
    line.Text(text.substr(0, std::min(exponent, point + 1 + kPrintedPlaces))).Text(text.substr(exponent));
}

}  // namespace

int ConvertStringToNumber(const char* word, OCIError* error, OCINumber& number) {
    const MemBuffer* const buffer = FindBufferQuietly(word);
    if (buffer == nullptr) return LiteralToNumber(word, error, number);
    if (!HoldsNumbers(*buffer, word)) return -1;
    std::memcpy(&number, buffer->data, sizeof number);
    return 0;
}

void PrintNumber(const OCINumber& value, OCIError* error) {
    static Line line;  // keeps its room
    OCINumber rounded;
    OraText text[kNumberTextRoom] = {};
    ub4 length = sizeof text;
    sword rc = Call(&ClientLibrary::OCINumberRound, error, &value, static_cast<sword>(kPrintedPlaces), &rounded);
    if (rc == OCI_SUCCESS)
        rc = Call(&ClientLibrary::OCINumberToText, error, &rounded, kNoText, ub4{0}, kNoText, ub4{0}, &length, text);
    if (rc != OCI_SUCCESS) return ReturnCodeReport(error, rc);

    const size_t size = std::min<size_t>(length, sizeof text);
    if (Utf16Mode) {
        std::string converted;
        if (!convertFromUTF16(text, size, converted)) return;
        AddNumberText(line, converted);
    } else {
        AddNumberText(line, {reinterpret_cast<const char*>(text), size});
    }
    line.Character('\n').Print();
}

void StoreNumberResult(const char* word, const OCINumber& value) {
    const MemBuffer* const buffer = FindBuffer(word);
    if (buffer != nullptr && HoldsNumbers(*buffer, word)) std::memcpy(buffer->data, &value, sizeof value);
}
