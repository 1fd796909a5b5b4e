// Making, changing, listing and freeing memory buffers.
#include <algorithm>
#include <cstdlib>
#include <cstring>

#include "commands/families.h"
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

// The statement that a buffer belongs to. False when the command ends: an unknown name, which has been complained
// about.
bool ResolveStatement(const char* word, void*& statement) {
    statement = IsInvalid(word) ? InvalidObject() : nullptr;
    if (statement != nullptr || FindObject(Kind::stmt, word, statement) || IsNull(word)) return true;
    Message(kError, "Handle %s not found\n", word);
    return false;
}

// --- Making and freeing --------------------------------------------------------------------------------------------

// What a buffer's words ask for.
struct Request {
    void* statement;
    int type;
    uint32_t element_size;
    uint32_t array_size;
    uint16_t precision = 0;
    int16_t scale = 0;

    void ReadSize(const char* word);
};

// A number, but "precision,scale" for packed decimal. Without a comma the scale is 0.
void Request::ReadSize(const char* word) {
    char* end = nullptr;
    const auto given = static_cast<uint32_t>(std::strtol(word, &end, 10));
    if (type == SQLT_PDN) {
        precision = static_cast<uint16_t>(given);
        scale = static_cast<int16_t>(*end == '\0' ? 0 : DecodeLong(end + 1));
    }
    element_size = ElementSize(type, given, precision);
}

int AllocateNameless(const Request& request) {
    MemBuffer buffer{};
    const int rc = AllocateBuffer(buffer, request.statement, request.element_size, request.array_size, request.type,
                                  request.precision, request.scale);
    FreeBufferBlocks(buffer);
    return rc;
}

int AllocateNamed(const char* name, const Request& request) {
    MemBuffer* buffer = OccupySlot(Kind::buffer, Buffers(), name);
    if (buffer == nullptr) return -1;
    return AllocateBuffer(*buffer, request.statement, request.element_size, request.array_size, request.type,
                          request.precision, request.scale);
}

void GetBuffer(const CommandRow&, int, char** words) {
    const char* name = words[2];
    Request request{};
    if (!ResolveStatement(words[1], request.statement)) return;
    if (std::strncmp(name, "$$", 2) == 0) return Message(kError, "Cannot start buffer name with $$\n");
    // Of the binds, not of the buffers: a second buffer of the same name is not refused.
    if (CheckInUse(Kind::bind, name)) return;
    request.type = DecodeKeyword(words[3], SqltKeywords);
    request.ReadSize(words[4]);
    request.array_size = static_cast<uint32_t>(DecodeNumber(words[5]));
    const int rc = IsNull(name) ? AllocateNameless(request) : AllocateNamed(name, request);
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
    const ElementTarget target = {buffer->type,
                                  buffer->Element(static_cast<uint32_t>(index)),
                                  buffer->element_size,
                                  buffer->indicators + index,
                                  buffer->lengths + index,
                                  buffer->return_codes + index,
                                  buffer->precision,
                                  buffer->scale};
    if (!AssignText(target, words[3], DecodeNumber(words[4]))) return;
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
    if (!ResolveStatement(words[1], statement)) return;
    const char* name = count > 2 ? words[2] : nullptr;
    const bool output = count > 3 && std::strcmp(words[3], "out") == 0;
    const char* statement_name = statement == nullptr ? "null" : words[1];
    Message(kOutput, "hmembuf hstmt  bufSize  type\n");
    Line line;
    for (MemBuffer& buffer : Buffers()) {
        if (!buffer.in_use || buffer.statement != statement) continue;
        if (name != nullptr && !HasName(buffer, name)) continue;
        if (output && buffer.lengths != nullptr) buffer.lengths[0] = static_cast<uint16_t>(buffer.element_size);
        line.Format("[%s]  %s  %d  %d  ", buffer.name, statement_name,
                    static_cast<int>(buffer.holds_pointers ? 8 : buffer.element_size), buffer.created_type);
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
