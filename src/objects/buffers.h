// Memory buffers: named arrays of elements of one external data type, with an indicator, a length and a return code for
// each element. Binds and defines hand their addresses to the library; the listing shows what it wrote there. The
// blocks are the buffer's own; the pointers "for calls" are what commands pass on, and a script may set them to null.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>

// What a data block has behind its last element, so that a value of any fixed size may be read or written at any
// element even after a script has changed the type.
inline constexpr size_t kElementSlack = 64;

struct MemBuffer;

// What dynamic binds and defines keep with a buffer. The three blocks are the buffer's own, null until one is needed.
struct DynamicData {
    uint32_t* previous_lengths; // one an element each: the pieces that a callback has received,
    uint32_t* piece_lengths;    // and the piece under way
    uint32_t lengths_count;     // not 0: an element's length is the sum of its two entries above
    MemBuffer** list;           // the buffers that a bind hands out, one an iteration
    uint32_t list_count;
};

struct MemBuffer {
    bool in_use;
    void* statement;            // null: made without one
    unsigned char* data;        // element_size * array_size bytes
    void* call_data;
    uint32_t element_size;
    uint32_t call_length;       // the value size that calls pass
    uint32_t created_size;      // element_size as it was at creation
    uint16_t created_type;
    uint16_t type;
    uint16_t precision;         // packed decimal only
    int16_t scale;
    int16_t* indicators;
    int16_t* call_indicators;
    uint16_t* lengths;
    uint16_t* call_lengths;
    uint16_t* return_codes;
    uint16_t* call_return_codes;
    uint32_t array_size;
    char name[36];
    bool holds_pointers;        // elements are locators, descriptors or handles
    uint32_t current_element;   // of PL/SQL arrays: the count that calls read and write
    DynamicData dynamic;

    unsigned char* Element(uint32_t index) const { return data + size_t{index} * element_size; }
    // False when an allocation has failed half-way: elements must not be touched then.
    bool Complete() const { return data && indicators && lengths && return_codes; }
};

std::span<MemBuffer> Buffers();

// "Buffer %s not found\n" (nothing for "null") and null when there is none.
MemBuffer* FindBuffer(const char* name);
// The same without any message.
MemBuffer* FindBufferQuietly(const char* name);

// The size of one element of the type when `given` was asked for. Precision and scale are used for packed decimal only.
uint32_t ElementSize(int type, uint32_t given, uint32_t precision);

// Whether elements of the type hold a pointer.
bool HoldsPointers(int type);

// Allocates the blocks and fills the record as a new buffer. Returns 0, or -1 after a failed allocation, which has been
// complained about; blocks already there stay attached.
int AllocateBuffer(MemBuffer& buffer, void* statement, uint32_t element_size, uint32_t array_size, int type,
                   uint16_t precision, int16_t scale);
// Frees all blocks and nulls all pointers; the slot itself is the caller's.
void FreeBufferBlocks(MemBuffer& buffer);
