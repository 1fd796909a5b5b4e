// Row ids as text. Command thread only.
#include <algorithm>
#include <string>

#include "commands/families.h"
#include "commands/shared/word_arguments.h"
#include "core/messages.h"
#include "core/state.h"
#include "objects/buffers.h"
#include "platform/client_library.h"
#include "report/trace.h"

namespace {

constexpr int kClosingZero = 2;  // of a UTF-16 text
constexpr size_t kShownCharacters = 8;

// Whether the length typed for the buffer leaves room for the closing zero.
bool Fits(ub2 length, const MemBuffer& buffer) {
    if (length <= static_cast<long>(buffer.element_size) - kClosingZero) return true;
    Message(kError, "Length (%u) is greater than allocated size (%u)\n", length, buffer.element_size);
    return false;
}

bool IsTextBuffer(const MemBuffer& buffer) {
    if (buffer.type == SQLT_STR && buffer.Complete()) return true;
    Message(kError, "Buffer must be of type SQLT_STR\n");
    return false;
}

// Only the beginning is shown: the rest differs from run to run. A text that is shorter is filled up with zeros.
void PrintRowid(const void* text, ub2 length) {
    std::string shown;
    if (!Utf16Mode) shown.assign(static_cast<const char*>(text), length);
    else if (!convertFromUTF16(text, length, shown)) return;
    shown.resize(kShownCharacters);
    Line line;
    line.Format("Length - %u Rowid ", length).Text(shown).Text("...\n").Print();
}

void RunRowidToChar(const CommandRow& row, int, char** words) {
    auto* const rowid = Resolve<OCIRowid>(Kind::rowid, words[1]);
    auto* const error = ResolveError<OCIError>(words[4]);
    MemBuffer* const buffer = FindBuffer(words[2]);
    if (buffer == nullptr && !IsNull(words[2])) return;
    const ub2 typed = static_cast<ub2>(DecodeNumber(words[3]));
    if (buffer != nullptr && (!IsTextBuffer(*buffer) || !Fits(typed, *buffer))) return;

    unsigned char* const text = buffer == nullptr ? nullptr : buffer->data;
    ub2 length = typed;
    const sword rc = Call(&ClientLibrary::OCIRowidToChar, rowid, text, &length, error);
    TraceAndReport(row.code, words[1], error, rc);
    if (rc != OCI_SUCCESS || buffer == nullptr) return;
    length = std::min(length, typed);
    std::fill_n(text + length, kClosingZero, static_cast<unsigned char>(0));
    PrintRowid(text, length);
    buffer->lengths[0] = length;
    Message(kOutput, "Buffer %s updated\n", words[2]);
}

constexpr PlainCommand kRowidCommands[] = {
    {{Code::ocirowidtochar, Words(5), "OCIRowidToChar hRowid buf bufl errhp"}, RunRowidToChar},
};

}  // namespace

void AddRowidCommands(HandlerTable& handlers) {
    handlers.Add(kRowidCommands);
}
