// The table of memory structs, and what a buffer or a member supplies to binds and defines.
#include "objects/structs.h"

#include "core/keywords.h"
#include "core/messages.h"
#include "objects/buffers.h"
#include "objects/registry.h"

namespace {

MemStruct structs[256];

DataTarget TargetOf(MemBuffer& buffer) {
    return {buffer.call_data,
            buffer.call_length,
            buffer.type,
            buffer.call_indicators,
            buffer.call_lengths,
            buffer.call_return_codes,
            &buffer.current_element};
}

DataTarget TargetOf(MemStruct& record, StructMember& member) {
    unsigned char* row = record.Row(0);
    return {row + member.value_offset,
            member.size,
            member.type,
            reinterpret_cast<int16_t*>(row + member.indicator_offset),
            reinterpret_cast<uint16_t*>(row + member.length_offset),
            reinterpret_cast<uint16_t*>(row + member.return_code_offset),
            &member.current_element};
}

}  // namespace

std::span<MemStruct> Structs() {
    return structs;
}

MemStruct* FindStruct(const char* name) {
    MemStruct* record = FindSlot(Structs(), name);
    if (record == nullptr && !IsNull(name)) Message(kError, "Struct %s not found\n", name);
    return record;
}

StructMember* SelectMember(MemStruct& record, long index) {
    if (index < 0 || index >= long{record.member_count}) {
        Message(kError, "Invalid index into struct - %ld\n", index);
        return nullptr;
    }
    if (record.array_size == 0) {
        Message(kError, "Invalid array index into struct - %ld\n", 0L);
        return nullptr;
    }
    return &record.members[index];
}

bool FindDataTarget(const char* word, long member, DataTarget& target) {
    if (MemBuffer* buffer = FindBufferQuietly(word)) {
        target = TargetOf(*buffer);
        return true;
    }
    MemStruct* record = FindStruct(word);
    if (record == nullptr) return false;
    StructMember* selected = SelectMember(*record, member);
    if (selected == nullptr) return false;
    target = TargetOf(*record, *selected);
    return true;
}
