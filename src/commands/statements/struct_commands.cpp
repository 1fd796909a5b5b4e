// Making, changing, listing and freeing memory structs. Command thread only.
#include <algorithm>
#include <cstring>
#include <vector>

#include "commands/families.h"
#include "commands/shared/word_arguments.h"
#include "core/messages.h"
#include "core/state.h"
#include "objects/structs.h"
#include "objects/value_assignment.h"
#include "objects/value_display.h"
#include "report/return_code.h"

namespace {

// --- Making, moving and freeing --------------------------------------------------------------------------------------

constexpr int kFirstMember = 5;  // where the pairs of type and size begin

std::vector<ElementShape> ReadMembers(int count, char** words) {
    std::vector<ElementShape> members;
    for (int word = kFirstMember; word < count; word += 2)
        members.push_back(ReadElementShape(DecodeKeyword(words[word], SqltKeywords), words[word + 1]));
    return members;
}

bool AllocateNameless(void* statement, std::span<const ElementShape> members, uint32_t array_size) {
    MemStruct record{};
    const bool allocated = AllocateStruct(record, statement, members, array_size);
    FreeStructBlocks(record);
    return allocated;
}

bool AllocateNamed(const char* name, void* statement, std::span<const ElementShape> members, uint32_t array_size) {
    MemStruct* const record = OccupySlot(Kind::memory_struct, Structs(), name);
    if (record == nullptr) return false;
    record->in_use = AllocateStruct(*record, statement, members, array_size);
    return record->in_use;
}

void GetStruct(const CommandRow& row, int count, char** words) {
    if (count != kFirstMember + 2L * DecodeNumber(words[4])) return InvalidSyntax(row.usage);
    const char* const name = words[2];
    void* statement = nullptr;
    if (!ResolveOwner(words[1], statement)) return;
    if (FindSlot(Structs(), name) != nullptr) return Message(kError, "Name already in use %s\n", name);
    const std::vector<ElementShape> members = ReadMembers(count, words);
    const uint32_t array_size = DecodeCount(words[3]);
    const bool allocated = IsNull(name) ? AllocateNameless(statement, members, array_size)
                                        : AllocateNamed(name, statement, members, array_size);
    if (allocated) Message(kOutput, "GetMemStructOCI: memory struct %s allocated.\n", name);
}

void FreeStruct(const CommandRow&, int, char** words) {
    MemStruct* const record = FindStruct(words[1]);
    if (record == nullptr) return;
    record->in_use = false;
    FreeStructBlocks(*record);
    Message(kOutput, "FreeMemStructOCI: memory struct %s freed.\n", words[1]);
}

void AssignStatement(const CommandRow&, int, char** words) {
    void* statement = nullptr;
    if (!ResolveOwner(words[1], statement)) return;
    MemStruct* const record = FindStruct(words[2]);
    if (record == nullptr) return;
    MoveToStatement(*record, statement);
    Message(kOutput, "AssignStmtToStruct: memory struct %s assigned.\n", words[2]);
}

// --- Changing --------------------------------------------------------------------------------------------------------

void UpdateMember(const CommandRow&, int, char** words) {
    MemStruct* const record = FindStruct(words[1]);
    if (record == nullptr) return;
    const long row = DecodeLong(words[2]);
    const StructMember* const member = SelectMember(*record, DecodeLong(words[3]), row);
    if (member == nullptr) return;
    const ElementShape& shape = member->shape;
    const ViewPlaces places = PlacesOf(*record, *member, static_cast<uint32_t>(row));
    const ElementTarget target = {static_cast<uint16_t>(shape.type), places.value,       shape.size,
                                  places.indicator,                  places.length,      places.return_code,
                                  shape.precision,                   shape.scale};
    if (!AssignText(target, words[4], DecodeNumber(words[5]))) return;
    if (const MemBuffer* const view = FindView(*record, *member)) ForgetPieces(*view, static_cast<uint32_t>(row));
    Message(kOutput, "UpdateMemStructOCI: memory struct %s updated.\n", words[1]);
}

// --- Listing ---------------------------------------------------------------------------------------------------------

ElementView ViewMember(const MemStruct& record, const StructMember& member, uint32_t row, bool utf16) {
    constexpr uint32_t kPointerLength = 8;
    const ElementShape& shape = member.shape;
    const ViewPlaces places = PlacesOf(record, member, row);
    const MemBuffer* const view = FindView(record, member);
    const uint32_t length = view == nullptr ? *places.length : LengthOf(*view, row);
    return {.type = static_cast<uint16_t>(shape.type),
            .data = places.value,
            .size = shape.size,
            .indicator = *places.indicator,
            .return_code = *places.return_code,
            .length = HoldsPointers(shape.type) ? kPointerLength : length,
            .precision = shape.precision,
            .scale = shape.scale,
            .utf16 = utf16};
}

void ListRow(const MemStruct& record, uint32_t row, bool utf16) {
    Line line;
    line.Format("Row=%u\n", row + 1).Print();
    for (const StructMember& member : record.Members()) {
        const ElementView element = ViewMember(record, member, row, utf16);
        line.Format("Ind=%d,rcode=%d,len=%u,data=", element.indicator, element.return_code, element.length);
        ReturnCodeReport(DefaultErrorHandle, DisplayElement(line, element));
    }
}

// What members of the first row can hold, as their lengths: they are to be read as outputs.
void SetLengthsToSizes(const MemStruct& record) {
    if (record.array_size == 0) return;
    for (const StructMember& member : record.Members())
        *PlacesOf(record, member, 0).length = FieldOfLength(member.shape.size);
}

void ListStructs(const CommandRow&, int count, char** words) {
    void* statement = nullptr;
    if (!ResolveOwner(words[1], statement)) return;
    const bool output = count > 3 && std::strcmp(words[3], "out") == 0;
    const bool utf16 = StatementIsUtf16(statement);
    const char* const statement_name = statement == nullptr ? "null" : words[1];
    Message(kOutput, "hmemstruct hstmt  rowSize  elements\n");
    for (const MemStruct& record : Structs()) {
        if (!record.in_use || record.statement != statement) continue;
        if (count > 2 && !HasName(record, words[2])) continue;
        if (output) SetLengthsToSizes(record);
        Message(kOutput, "[%s]  %s  %ld  %ld\n", record.name, statement_name, static_cast<long>(record.row_size),
                static_cast<long>(record.member_count));
        for (uint32_t row = 0; row < record.array_size; ++row) ListRow(record, row, utf16);
    }
}

constexpr PlainCommand kStructCommands[] = {
    {{Code::getmemstructoci, WordsFrom(kFirstMember),
      "GetMemStructOCI hstmt hmemstruct arraysize #elements c_type1 size1 ... c_typeN sizeN"},
     GetStruct},
    {{Code::freememstructoci, Words(2), "FreeMemStructOCI hmemstruct"}, FreeStruct},
    {{Code::updatememstructoci, Words(6), "UpdateMemStructOCI memstructhandle row elementindex value len"},
     UpdateMember},
    {{Code::assignstmttostruct, Words(3), "AssignStmtToStruct hstmt hmemstruct"}, AssignStatement},
    {{Code::liststructoci, Words(2, 3, 4), "ListStructOCI hstmt [hmemstruct [in | out]]"}, ListStructs},
};

}  // namespace

void AddStructCommands(HandlerTable& handlers) {
    handlers.Add(kStructCommands);
}
