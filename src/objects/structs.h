// Memory structs: named arrays of rows; a row holds, for each member in turn, its value area, indicator, length and
// return code.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>

struct StructMember {
    uint16_t type;
    uint32_t size;             // of the value area
    uint16_t precision;        // packed decimal only
    int16_t scale;
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

    unsigned char* Row(uint32_t index) const { return rows + size_t{index} * row_size; }
};

std::span<MemStruct> Structs();

// "Struct %s not found\n" (nothing for "null") and null when there is none.
MemStruct* FindStruct(const char* name);

// The member that a bind or define uses. An index not below the count prints "Invalid index into struct - %ld\n", a
// struct without rows "Invalid array index into struct - %ld\n"; both give null.
StructMember* SelectMember(MemStruct& record, long index);

// What a bind or define passes to the library for one value, whichever of the two supplies it.
struct DataTarget {
    void* value = nullptr;
    uint32_t size = 0;
    uint16_t type = 0;
    int16_t* indicator = nullptr;
    uint16_t* length = nullptr;
    uint16_t* return_code = nullptr;
    uint32_t* current_element = nullptr;
};
// Looks the word up among the buffers, then among the structs (of which `member` says which member). False when the
// command ends here: "null", an unknown name ("Struct %s not found\n") or a bad index, each with its message.
bool FindDataTarget(const char* word, long member, DataTarget& target);
