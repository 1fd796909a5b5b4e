// Memory buffers: named arrays of elements of one external data type, with an indicator, a length and a return code for
// each element. Binds and defines hand their addresses to the library; the listing shows what it wrote there. The
// blocks are the buffer's own; the pointers "for calls" are what commands pass on, and a script may set them to null.
// Command thread only.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <span>

// What a data block has behind its last element, so that a value of any fixed size may be read or written at any
// element even after a script has changed the type.
inline constexpr size_t kElementSlack = 64;

struct MemBuffer;
struct MemStruct;

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
    uint32_t current_element;   // of PL/SQL arrays: the count that calls read and write
    DynamicData dynamic;

    // A view shows one member of a struct as a buffer: all blocks above but the dynamic ones are the struct's, and its
    // elements lie a row apart. Freeing the struct ends it.
    const MemStruct* viewed;    // null: no view
    uint32_t viewed_member;
    uint32_t value_stride;      // bytes from one element to the next,
    uint32_t field_stride;      // and from one indicator, length or return code

    unsigned char* Element(uint32_t index) const { return data + size_t{index} * value_stride; }
    int16_t* Indicator(uint32_t index) const { return Field(indicators, index); }
    uint16_t* Length(uint32_t index) const { return Field(lengths, index); }
    uint16_t* ReturnCode(uint32_t index) const { return Field(return_codes, index); }
    // False when an allocation has failed half-way: elements must not be touched then.
    bool Complete() const { return data && indicators && lengths && return_codes; }

private:
    template <class T> T* Field(T* first, uint32_t index) const {
        return reinterpret_cast<T*>(reinterpret_cast<char*>(first) + size_t{index} * field_stride);
    }
};

std::span<MemBuffer> Buffers();

// "Buffer %s not found\n" (nothing for "null") and null when there is none.
MemBuffer* FindBuffer(const char* name);
// The same without any message.
MemBuffer* FindBufferQuietly(const char* name);

// What an element is made as. Precision and scale are those of packed decimal only.
struct ElementShape {
    int type = 0;
    uint32_t size = 0;
    uint16_t precision = 0;
    int16_t scale = 0;
};
// The shape that a type and the word for its size ask for: a number, but "precision,scale" for packed decimal. Without
// a comma the scale is 0.
ElementShape ReadElementShape(int type, const char* size_word);

// The size of one element of the type when `given` was asked for.
uint32_t ElementSize(int type, uint32_t given, uint32_t precision);

// Makes an element of a number type zero; those of other types stay as they are. False when that failed.
bool SetZero(const ElementShape& shape, unsigned char* element);

// A length as an element's field tells it: no more than the field holds.
inline uint16_t FieldOfLength(uint32_t length) {
    return static_cast<uint16_t>(std::min<uint32_t>(length, UINT16_MAX));
}
// How long an element is: what its length says or, where values come in pieces, the sum of what came in.
uint32_t LengthOf(const MemBuffer& buffer, uint32_t index);
// Pieces that came in before no longer tell how long an element is.
void ForgetPieces(const MemBuffer& buffer, uint32_t index);

// Whether elements of the type hold a pointer.
bool HoldsPointers(int type);

// Allocates the blocks and fills the record as a new buffer. Returns 0, or -1 after a failed allocation, which has been
// complained about; blocks already there stay attached.
int AllocateBuffer(MemBuffer& buffer, void* statement, const ElementShape& shape, uint32_t array_size);
// Makes the record of a view: the addresses are of its first element, `stride` bytes lead to the next.
struct ViewPlaces {
    unsigned char* value;
    int16_t* indicator;
    uint16_t* length;
    uint16_t* return_code;
};
void ShowAsBuffer(MemBuffer& buffer, void* statement, const ElementShape& shape, uint32_t array_size,
                  const ViewPlaces& places, uint32_t stride);
// Frees all blocks that are the buffer's own and nulls all pointers; the slot itself is the caller's.
void FreeBufferBlocks(MemBuffer& buffer);
