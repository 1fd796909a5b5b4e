// The table of memory buffers: element sizes by type, the blocks of a buffer, numbers that begin as zero.
#include "objects/buffers.h"

#include <algorithm>
#include <cstdlib>
#include <utility>

#include "core/keywords.h"
#include "core/messages.h"
#include "objects/library_number.h"
#include "objects/memory.h"
#include "objects/registry.h"
#include "oci.h"
#include "platform/packed_decimal.h"

namespace {

MemBuffer buffers[256];
size_t used_slots = 0;  // those behind them have never held a buffer: a lookup need not go there

constexpr char kZeroText[] = "0.0";

// At least one element and one byte, so that commands may always touch the first element.
size_t BlockSize(size_t element_size, size_t array_size) {
    return std::max<size_t>(element_size, 1) * std::max<size_t>(array_size, 1);
}

template <class T> bool Obtain(T*& block, size_t size, const char* complaint) {
    block = static_cast<T*>(GetMem(size));
    if (block == nullptr) MessageText(kError, complaint);
    return block != nullptr;
}

bool ObtainBlocks(MemBuffer& buffer) {
    const size_t halves = BlockSize(sizeof(uint16_t), buffer.array_size);
    return Obtain(buffer.data, BlockSize(buffer.element_size, buffer.array_size) + kElementSlack,
                  "Could not allocate memory for buffer\n") &&
           Obtain(buffer.indicators, halves, "Could not allocate memory for null indicator\n") &&
           Obtain(buffer.lengths, halves, "Could not allocate memory for length value\n") &&
           Obtain(buffer.return_codes, halves, "Could not allocate memory for length rcode\n");
}

// The first zero that cannot be made ends it.
void InitialiseNumbers(const MemBuffer& buffer, const ElementShape& shape) {
    for (uint32_t index = 0; index < buffer.array_size; ++index)
        if (!SetZero(shape, buffer.Element(index))) return;
}

void NoteUse(const MemBuffer& buffer) {
    for (size_t slot = used_slots; slot < std::size(buffers); ++slot)
        if (&buffers[slot] == &buffer) used_slots = slot + 1;
}

// A record as a new one begins, without its blocks: those of the last one have been given back.
void BeginRecord(MemBuffer& buffer, void* statement, const ElementShape& shape, uint32_t array_size) {
    NoteUse(buffer);
    buffer.statement = statement;
    buffer.element_size = buffer.call_length = buffer.created_size = shape.size;
    buffer.created_type = buffer.type = static_cast<uint16_t>(shape.type);
    buffer.precision = shape.precision;
    buffer.scale = shape.scale;
    buffer.array_size = array_size;
    buffer.dynamic = {};
    buffer.current_element = 0;
}

void SetCallPointers(MemBuffer& buffer) {
    buffer.call_data = buffer.data;
    buffer.call_indicators = buffer.indicators;
    buffer.call_lengths = buffer.lengths;
    buffer.call_return_codes = buffer.return_codes;
}

template <class T> void FreeBlock(T*& block) {
    FreeMem(std::exchange(block, nullptr));
}

}  // namespace

std::span<MemBuffer> Buffers() {
    return buffers;
}

MemBuffer* FindBufferQuietly(const char* name) {
    return FindSlot(Buffers().first(used_slots), name);
}

MemBuffer* FindBuffer(const char* name) {
    MemBuffer* buffer = FindBufferQuietly(name);
    if (buffer == nullptr && !IsNull(name)) Message(kError, "Buffer %s not found\n", name);
    return buffer;
}

uint32_t LengthOf(const MemBuffer& buffer, uint32_t index) {
    const DynamicData& dynamic = buffer.dynamic;
    if (dynamic.lengths_count == 0) return *buffer.Length(index);
    const uint32_t previous = dynamic.previous_lengths == nullptr ? 0 : dynamic.previous_lengths[index];
    return previous + (dynamic.piece_lengths == nullptr ? 0 : dynamic.piece_lengths[index]);
}

void ForgetPieces(const MemBuffer& buffer, uint32_t index) {
    const DynamicData& dynamic = buffer.dynamic;
    if (dynamic.previous_lengths == nullptr || dynamic.piece_lengths == nullptr) return;
    dynamic.previous_lengths[index] = *buffer.Length(index);
    dynamic.piece_lengths[index] = 0;
}

bool HoldsPointers(int type) {
    constexpr int kTypes[] = {SQLT_LVB, SQLT_CUR, SQLT_CLOB, SQLT_BLOB, SQLT_RSET, SQLT_VST,
                              SQLT_DATE, SQLT_TIMESTAMP, SQLT_TIMESTAMP_TZ, SQLT_TIMESTAMP_LTZ};
    return std::ranges::find(kTypes, type) != std::end(kTypes);
}

uint32_t ElementSize(int type, uint32_t given, uint32_t precision) {
    switch (type) {
        case SQLT_NUM:
        case SQLT_VNU: return 22;
        case SQLT_INT: return given == 1 || given == 2 || given == 4 || given == 8 ? given : 4;
        case SQLT_FLT: return given == 4 || given == 8 || given == 16 ? given : 8;
        case SQLT_PDN: return static_cast<uint32_t>(PackedDecimalSize(precision));
        case SQLT_VCS:
        case SQLT_VBI:
        case SQLT_AVC: return given + 2;
        case SQLT_LVC: return given + 4;
        case SQLT_RID: return 10;
        case SQLT_DAT: return 7;
        case SQLT_BFLOAT:
        case SQLT_RDD:
        case SQLT_ODT: return 8;
        case SQLT_BDOUBLE: return 16;
        default: return HoldsPointers(type) ? 8 : given;
    }
}

ElementShape ReadElementShape(int type, const char* size_word) {
    char* end = nullptr;
    const auto given = static_cast<uint32_t>(std::strtol(size_word, &end, 10));
    ElementShape shape{.type = type};
    if (type == SQLT_PDN) {
        shape.precision = static_cast<uint16_t>(given);
        shape.scale = static_cast<int16_t>(*end == '\0' ? 0 : DecodeLong(end + 1));
    }
    shape.size = ElementSize(type, given, shape.precision);
    return shape;
}

bool SetZero(const ElementShape& shape, unsigned char* element) {
    if (shape.type == SQLT_PDN) return TextToDecimal(kZeroText, element, shape.precision, shape.scale) == kDecimalDone;
    if (shape.type != SQLT_NUM && shape.type != SQLT_VNU) return true;
    OCINumber zero;
    if (NumberFromText(kZeroText, zero) != OCI_SUCCESS) return false;
    std::copy_n(zero.OCINumberPart, sizeof zero, element);
    return true;
}

int AllocateBuffer(MemBuffer& buffer, void* statement, const ElementShape& shape, uint32_t array_size) {
    BeginRecord(buffer, statement, shape, array_size);
    buffer.value_stride = shape.size;
    buffer.field_stride = sizeof(uint16_t);
    if (!ObtainBlocks(buffer)) return -1;
    SetCallPointers(buffer);
    InitialiseNumbers(buffer, shape);
    return 0;
}

void ShowAsBuffer(MemBuffer& buffer, void* statement, const ElementShape& shape, uint32_t array_size,
                  const ViewPlaces& places, uint32_t stride) {
    BeginRecord(buffer, statement, shape, array_size);
    buffer.value_stride = buffer.field_stride = stride;
    buffer.data = places.value;
    buffer.indicators = places.indicator;
    buffer.lengths = places.length;
    buffer.return_codes = places.return_code;
    SetCallPointers(buffer);
}

void FreeBufferBlocks(MemBuffer& buffer) {
    if (buffer.viewed != nullptr) {
        buffer.viewed = nullptr;
        buffer.data = nullptr;
        buffer.indicators = nullptr;
        buffer.lengths = buffer.return_codes = nullptr;
    }
    FreeBlock(buffer.data);
    FreeBlock(buffer.indicators);
    FreeBlock(buffer.lengths);
    FreeBlock(buffer.return_codes);
    FreeBlock(buffer.dynamic.previous_lengths);
    FreeBlock(buffer.dynamic.piece_lengths);
    FreeBlock(buffer.dynamic.list);
    buffer.dynamic.list_count = 0;
    buffer.call_data = nullptr;
    buffer.call_indicators = nullptr;
    buffer.call_lengths = nullptr;
    buffer.call_return_codes = nullptr;
}
