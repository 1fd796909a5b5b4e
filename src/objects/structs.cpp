// The table of memory structs, and what a buffer or a member supplies to binds and defines.
#include "objects/structs.h"

#include <algorithm>
#include <bit>
#include <string>
#include <string_view>
#include <utility>

#include "core/keywords.h"
#include "core/messages.h"
#include "objects/memory.h"
#include "objects/registry.h"
#include "oci.h"

namespace {

MemStruct structs[256];

DataTarget TargetOf(MemBuffer& buffer) {
    return {buffer.call_data,
            buffer.call_length,
            buffer.type,
            buffer.call_indicators,
            buffer.call_lengths,
            buffer.call_return_codes,
            &buffer.current_element,
            buffer.scale,
            buffer.viewed == nullptr ? buffer.call_length : buffer.value_stride,
            buffer.field_stride};
}

DataTarget TargetOf(MemStruct& record, StructMember& member) {
    const ViewPlaces places = PlacesOf(record, member, 0);
    return {places.value,      member.shape.size,
            static_cast<uint16_t>(member.shape.type),
            places.indicator,  places.length,
            places.return_code, &member.current_element,
            member.shape.scale, record.row_size,
            record.row_size};
}

// --- Layout ----------------------------------------------------------------------------------------------------------

// Of what needs more than the even places that all members lie at.
uint32_t AlignmentOf(const ElementShape& shape) {
    constexpr uint32_t kPointer = 8;
    switch (shape.type) {
        case SQLT_INT:
        case SQLT_UIN:
        case SQLT_FLT: return std::min(std::bit_floor(std::max(shape.size, 1u)), kPointer);
        case SQLT_LVC: return 4;
        case SQLT_BFLOAT:
        case SQLT_BDOUBLE:
        case SQLT_RDD: return 8;
        default: return HoldsPointers(shape.type) ? kPointer : 1;
    }
}

// Takes places in a row one after another.
class Layout {
public:
    uint32_t Take(uint64_t size, uint32_t alignment) {
        end_ = RoundedUp(alignment);
        const uint64_t place = end_;
        end_ += size;
        return static_cast<uint32_t>(place);
    }
    uint64_t RowSize() const { return RoundedUp(8); }

private:
    uint64_t RoundedUp(uint64_t unit) const { return (end_ + unit - 1) / unit * unit; }
    uint64_t end_ = 0;
};

// Returns the row's size; beyond 32 bits, the places are of no use.
uint64_t LayOut(std::span<const ElementShape> shapes, StructMember* members) {
    Layout layout;
    for (const ElementShape& shape : shapes) {
        StructMember& member = *members++;
        member.shape = shape;
        member.value_offset = layout.Take(shape.size, AlignmentOf(shape));
        member.indicator_offset = layout.Take(sizeof(int16_t), alignof(int16_t));
        member.length_offset = layout.Take(sizeof(uint16_t), alignof(uint16_t));
        member.return_code_offset = layout.Take(sizeof(uint16_t), alignof(uint16_t));
    }
    return layout.RowSize();
}

// Rows without members count as a byte each: senseless numbers of them are refused, too.
unsigned char* AllocateRows(uint64_t row_size, uint32_t array_size) {
    const bool within_reason = row_size <= UINT32_MAX;
    const uint64_t size = std::max<uint64_t>(row_size, 1) * array_size + kElementSlack;
    return static_cast<unsigned char*>(GetMem(within_reason ? size : SIZE_MAX));
}

void InitialiseNumbers(const MemStruct& record) {
    for (uint32_t row = 0; row < record.array_size; ++row)
        for (const StructMember& member : record.Members())
            if (!SetZero(member.shape, PlacesOf(record, member, row).value)) return;
}

// --- Views -----------------------------------------------------------------------------------------------------------

constexpr char kViewMark[] = "$$";

// Of a long name the beginning, so that mark and index have room: cut at its end it could be the struct's own name.
std::string ViewName(const MemStruct& record, long index) {
    const std::string ending = kViewMark + std::to_string(index);
    return std::string(record.name).substr(0, sizeof record.name - 1 - ending.size()) + ending;
}

MemBuffer* MakeView(MemStruct& record, uint32_t index) {
    MemBuffer* const view = OccupySlot(Kind::buffer, Buffers(), ViewName(record, index).c_str());
    if (view == nullptr) return nullptr;
    const StructMember& member = record.members[index];
    ShowAsBuffer(*view, record.statement, member.shape, record.array_size, PlacesOf(record, member, 0),
                 record.row_size);
    view->viewed = &record;
    view->viewed_member = index;
    return view;
}

// The struct and the index that a view's name is made of. Null when it is no such name.
MemStruct* SplitViewName(const char* word, long& index) {
    const std::string_view name = word;
    const size_t mark = name.rfind(kViewMark);
    if (mark == std::string_view::npos || mark + 2 == name.size()) return nullptr;
    if (name.find_first_not_of("0123456789", mark + 2) != std::string_view::npos) return nullptr;
    index = DecodeLong(word + mark + 2);
    return FindSlot(Structs(), std::string(name.substr(0, mark)).c_str());
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

bool AllocateStruct(MemStruct& record, void* statement, std::span<const ElementShape> members, uint32_t array_size) {
    record.statement = statement;
    record.array_size = array_size;
    record.member_count = static_cast<uint32_t>(members.size());
    record.members = static_cast<StructMember*>(GetMem(members.size() * sizeof(StructMember)));
    if (record.members != nullptr) {
        const uint64_t row_size = LayOut(members, record.members);
        record.row_size = static_cast<uint32_t>(row_size);
        record.rows = AllocateRows(row_size, array_size);
    }
    if (record.rows == nullptr) {
        Message(kError, "Could not allocate memory\n");
        FreeStructBlocks(record);
        return false;
    }
    InitialiseNumbers(record);
    return true;
}

void FreeStructBlocks(MemStruct& record) {
    for (MemBuffer& buffer : Buffers()) {
        if (!buffer.in_use || buffer.viewed != &record) continue;
        buffer.in_use = false;
        FreeBufferBlocks(buffer);
    }
    FreeMem(std::exchange(record.rows, nullptr));
    FreeMem(std::exchange(record.members, nullptr));
    record.member_count = 0;
}

void MoveToStatement(MemStruct& record, void* statement) {
    record.statement = statement;
    for (MemBuffer& buffer : Buffers())
        if (buffer.in_use && buffer.viewed == &record) buffer.statement = statement;
}

ViewPlaces PlacesOf(const MemStruct& record, const StructMember& member, uint32_t row) {
    unsigned char* const first = record.Row(row);
    return {first + member.value_offset, reinterpret_cast<int16_t*>(first + member.indicator_offset),
            reinterpret_cast<uint16_t*>(first + member.length_offset),
            reinterpret_cast<uint16_t*>(first + member.return_code_offset)};
}

StructMember* SelectMember(MemStruct& record, long index, long row) {
    if (index < 0 || index >= long{record.member_count}) {
        Message(kError, "Invalid index into struct - %ld\n", index);
        return nullptr;
    }
    if (row < 0 || row >= long{record.array_size}) {
        Message(kError, "Invalid array index into struct - %ld\n", row);
        return nullptr;
    }
    return &record.members[index];
}

MemBuffer* FindView(const MemStruct& record, const StructMember& member) {
    const auto index = static_cast<uint32_t>(&member - record.members);
    for (MemBuffer& buffer : Buffers())
        if (buffer.in_use && buffer.viewed == &record && buffer.viewed_member == index) return &buffer;
    return nullptr;
}

MemBuffer* ViewOf(MemStruct& record, const StructMember& member) {
    MemBuffer* const view = FindView(record, member);
    return view != nullptr ? view : MakeView(record, static_cast<uint32_t>(&member - record.members));
}

MemBuffer* FindBufferOrView(const char* word) {
    if (MemBuffer* const buffer = FindBufferQuietly(word)) return buffer;
    long index = 0;
    MemStruct* const record = SplitViewName(word, index);
    if (record == nullptr || index >= long{record->member_count} || record->array_size == 0) return nullptr;
    return ViewOf(*record, record->members[index]);
}

MemBuffer* FindDynamicBuffer(const char* word, long member) {
    if (MemBuffer* const buffer = FindBufferOrView(word)) return buffer;
    MemStruct* const record = FindStruct(word);
    if (record == nullptr) return nullptr;
    const StructMember* const selected = SelectMember(*record, member);
    return selected == nullptr ? nullptr : ViewOf(*record, *selected);
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
