// Memory structs: named arrays of rows; a row holds, for each member in turn, its value area, indicator, length and
// return code, each aligned as its type needs. Members can be seen as buffers, too: a view is an entry of the buffer
// table under the struct's name, "$$" and the member's index. Command thread only.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>

#include "objects/buffers.h"

struct StructMember {
    ElementShape shape;
    uint32_t value_offset;     // all four from the start of the row
    uint32_t indicator_offset;
    uint32_t length_offset;
    uint32_t return_code_offset;
    uint32_t current_element;
};

struct MemStruct {
    bool in_use;
    void* statement;
    char name[36];
    unsigned char* rows;       // row_size * array_size bytes
    uint32_t row_size;
    uint32_t array_size;
    StructMember* members;
    uint32_t member_count;

    std::span<const StructMember> Members() const { return {members, member_count}; }
    unsigned char* Row(uint32_t index) const { return rows + size_t{index} * row_size; }
};

std::span<MemStruct> Structs();

// Lays the members out and allocates the rows, numbers as zeros and all else zero-filled. False after a failed
// allocation, which has been complained about: the record then owns nothing.
bool AllocateStruct(MemStruct& record, void* statement, std::span<const ElementShape> members, uint32_t array_size);
// Frees the blocks and the views; the slot itself is the caller's.
void FreeStructBlocks(MemStruct& record);
// Moves the struct and its views to another statement.
void MoveToStatement(MemStruct& record, void* statement);

// "Struct %s not found\n" (nothing for "null") and null when there is none.
MemStruct* FindStruct(const char* name);

// Where the parts of a member lie in a row.
ViewPlaces PlacesOf(const MemStruct& record, const StructMember& member, uint32_t row);

// The member that a bind or define uses. An index not below the count prints "Invalid index into struct - %ld\n", a
// struct without the row "Invalid array index into struct - %ld\n"; both give null.
StructMember* SelectMember(MemStruct& record, long index, long row = 0);

// The view of a member if there is one.
MemBuffer* FindView(const MemStruct& record, const StructMember& member);
// The view of a member, found or made. Null when the buffer table is full, which has been said.
MemBuffer* ViewOf(MemStruct& record, const StructMember& member);

// The buffer that dynamic commands name: a buffer, a view by its name (made when it is not there yet), or a struct and
// the index of a member. Null when the command ends here, with the messages of FindDataTarget.
MemBuffer* FindDynamicBuffer(const char* word, long member);
// The same for a word that must not be a struct, and without any message.
MemBuffer* FindBufferOrView(const char* word);

// What a bind or define passes to the library for one value, whichever of the two supplies it.
struct DataTarget {
    void* value = nullptr;
    uint32_t size = 0;
    uint16_t type = 0;
    int16_t* indicator = nullptr;
    uint16_t* length = nullptr;
    uint16_t* return_code = nullptr;
    uint32_t* current_element = nullptr;
    int16_t scale = 0;        // of packed decimal
    uint32_t value_skip = 0;  // bytes from one element's value to the next,
    uint32_t field_skip = 0;  // and from one indicator, length or return code
};
// Looks the word up among the buffers, then among the structs (of which `member` says which member). False when the
// command ends here: "null", an unknown name ("Struct %s not found\n") or a bad index, each with its message.
bool FindDataTarget(const char* word, long member, DataTarget& target);
