// Making, changing, listing and freeing memory buffers. Command thread only.
#include <algorithm>
#include <cstdlib>
#include <cstring>

#include "commands/families.h"
#include "commands/shared/word_arguments.h"
#include "core/keywords.h"
#include "core/messages.h"
#include "core/state.h"
#include "objects/buffers.h"
#include "objects/registry.h"
#include "objects/value_assignment.h"
#include "objects/value_display.h"
#include "oci.h"
#include "report/return_code.h"

namespace {

// --- Making and freeing --------------------------------------------------------------------------------------------

int AllocateNameless(void* statement, const ElementShape& shape, uint32_t array_size) {
    MemBuffer buffer{};
    const int rc = AllocateBuffer(buffer, statement, shape, array_size);
    FreeBufferBlocks(buffer);
    return rc;
}

int AllocateNamed(const char* name, void* statement, const ElementShape& shape, uint32_t array_size) {
    MemBuffer* buffer = OccupySlot(Kind::buffer, Buffers(), name);
    return buffer == nullptr ? -1 : AllocateBuffer(*buffer, statement, shape, array_size);
}

void GetBuffer(const CommandRow&, int, char** words) {
    const char* name = words[2];
    void* statement = nullptr;
    if (!ResolveOwner(words[1], statement)) return;
    if (std::strncmp(name, "$$", 2) == 0) return Message(kError, "Cannot start buffer name with $$\n");
    // Of the binds, not of the buffers: a second buffer of the same name is not refused.
    if (CheckInUse(Kind::bind, name)) return;
    const ElementShape shape = ReadElementShape(DecodeKeyword(words[3], SqltKeywords), words[4]);
    const uint32_t array_size = DecodeCount(words[5]);
    const int rc = IsNull(name) ? AllocateNameless(statement, shape, array_size)
                                : AllocateNamed(name, statement, shape, array_size);
    if (rc == 0) Message(kOutput, "GetMemOCI: memory buffer %s allocated.\n", name);
}

void FreeBuffer(const CommandRow&, int, char** words) {
    MemBuffer* buffer = FindBuffer(words[1]);
    if (buffer == nullptr) return;
    buffer->in_use = false;
    FreeBufferBlocks(*buffer);
    Message(kOutput, "FreeMemOCI: memory buffer %s freed.\n", words[1]);
}

// --- Changing ------------------------------------------------------------------------------------------------------

void UpdateElement(const CommandRow&, int, char** words) {
    MemBuffer* buffer = FindBuffer(words[1]);
    if (buffer == nullptr) return;
    const long index = DecodeLong(words[2]);
    if (index < 0 || index >= long{buffer->array_size} || !buffer->Complete())
        return Message(kError, "Invalid elem value\n");
    const auto element = static_cast<uint32_t>(index);
    const ElementTarget target = {buffer->type,
                                  buffer->Element(element),
                                  buffer->element_size,
                                  buffer->Indicator(element),
                                  buffer->Length(element),
                                  buffer->ReturnCode(element),
                                  buffer->precision,
                                  buffer->scale};
    if (!AssignText(target, words[3], DecodeNumber(words[4]))) return;
    ForgetPieces(*buffer, element);
    Message(kOutput, "UpdateMemOCI: memory buffer %s updated.\n", words[1]);
}

// One field that UpdateBuffer changes. With a complaint the value must be "null" or "-1": the field is a pointer, taken
// away from later calls.
struct FieldUpdate {
    int field;  // as in BufferFieldKeywords
    const char* complaint;
    void (*apply)(MemBuffer& buffer, const char* value);
};

constexpr FieldUpdate kFieldUpdates[] = {
    {1, nullptr, [](MemBuffer& buffer, const char* value) {
         buffer.type = static_cast<uint16_t>(DecodeKeyword(value, SqltKeywords));
     }},
    {2, "Invalid value of pInfo\n", [](MemBuffer& buffer, const char*) { buffer.call_data = nullptr; }},
    {3, nullptr, [](MemBuffer& buffer, const char* value) {
         buffer.call_length = static_cast<uint32_t>(DecodeLong(value));
     }},
    {4, "Invalid value of pNullInd\n", [](MemBuffer& buffer, const char*) { buffer.call_indicators = nullptr; }},
    {5, "Invalid value of pcbValue\n", [](MemBuffer& buffer, const char*) { buffer.call_lengths = nullptr; }},
    {6, "Invalid value of prcode\n", [](MemBuffer& buffer, const char*) { buffer.call_return_codes = nullptr; }},
};

void UpdateField(const CommandRow&, int, char** words) {
    MemBuffer* buffer = FindBuffer(words[1]);
    if (buffer == nullptr) return;
    const int field = DecodeKeyword(words[2], BufferFieldKeywords);
    const auto update = std::ranges::find(kFieldUpdates, field, &FieldUpdate::field);
    if (update == std::end(kFieldUpdates)) return Message(kOutput, "Invalid operation %s\n", words[2]);
    if (update->complaint != nullptr && OutputName(words[3]) != nullptr)
        return MessageText(kOutput, update->complaint);
    update->apply(*buffer, words[3]);
    Message(kOutput, "memhandle %s updated\n", words[1]);
}

// --- Listing -------------------------------------------------------------------------------------------------------

// All elements, each on a line of its own behind its frame. What the line already holds stands before the first.
void ListElements(Line& line, const MemBuffer& buffer) {
    const bool utf16 = StatementIsUtf16(buffer.statement);
    for (uint32_t index = 0; buffer.Complete() && index < buffer.array_size; ++index) {
        const ElementView element = ElementOf(buffer, index, utf16);
        line.Format("Row=%u,Ind=%d,rcode=%d,len=%u,data=", index + 1, element.indicator, element.return_code,
                    element.length);
        ReturnCodeReport(DefaultErrorHandle, DisplayElement(line, element));
    }
    if (!line.Empty()) line.Print();
}

void ListBuffers(const CommandRow&, int count, char** words) {
    void* statement = nullptr;
    if (!ResolveOwner(words[1], statement)) return;
    const char* name = count > 2 ? words[2] : nullptr;
    const bool output = count > 3 && std::strcmp(words[3], "out") == 0;
    const char* statement_name = statement == nullptr ? "null" : words[1];
    Message(kOutput, "hmembuf hstmt  bufSize  type\n");
    Line line;
    for (MemBuffer& buffer : Buffers()) {
        if (!buffer.in_use || buffer.statement != statement) continue;
        if (name != nullptr && !HasName(buffer, name)) continue;
        if (output && buffer.lengths != nullptr) buffer.lengths[0] = FieldOfLength(buffer.element_size);
        line.Format("[%s]  %s  %d  %d  ", buffer.name, statement_name, static_cast<int>(buffer.element_size),
                    buffer.created_type);
        ListElements(line, buffer);
    }
}

constexpr PlainCommand kBufferCommands[] = {
    {{Code::getmemoci, Words(6), "GetMemOCI hstmt hmembuf c_type size arraysize"}, GetBuffer},
    {{Code::freememoci, Words(2), "FreeMemOCI hmembuf"}, FreeBuffer},
    {{Code::listoci, Words(2, 3, 4), "ListOCI hstmt [hmembuf [in | out]]"}, ListBuffers},
    {{Code::updatememoci, Words(5), "UpdateMemOCI memhandle elem value len"}, UpdateElement},
    {{Code::updatebuffer, Words(4),
      "UpdateBuffer memhandle "
      "{ CTYPE type | pinfo null | cbInfo value | pNullInd null | pcbValue null | prcode null  }"},
     UpdateField},
};

}  // namespace

void AddBufferCommands(HandlerTable& handlers) {
    handlers.Add(kBufferCommands);
}
