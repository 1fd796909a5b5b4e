// Values in pieces, for the families that move them. Command thread and, where said so there, callbacks of the library.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <iterator>

#include "core/messages.h"
#include "objects/buffers.h"
#include "objects/memory.h"
#include "oci.h"

// Makes the arrays of 32-bit lengths when they are missing. False without memory, which has been said.
inline bool AttachLengths(MemBuffer& buffer) {
    const size_t size = std::max<size_t>(buffer.array_size, 1) * sizeof(uint32_t);
    DynamicData& dynamic = buffer.dynamic;
    if (dynamic.previous_lengths == nullptr) dynamic.previous_lengths = static_cast<uint32_t*>(GetMem(size));
    if (dynamic.piece_lengths == nullptr) dynamic.piece_lengths = static_cast<uint32_t*>(GetMem(size));
    return dynamic.previous_lengths != nullptr && dynamic.piece_lengths != nullptr;
}

// What the first element's lengths are before a call: one that fails leaves them so, for the listing and for a library that
// still holds their place. The arrays must be there.
class FirstLengths {
public:
    explicit FirstLengths(DynamicData& dynamic)
        : dynamic_(dynamic),
          previous_(dynamic.previous_lengths[0]),
          piece_(dynamic.piece_lengths[0]),
          count_(dynamic.lengths_count) {}
    void Restore() const {
        dynamic_.previous_lengths[0] = previous_;
        dynamic_.piece_lengths[0] = piece_;
        dynamic_.lengths_count = count_;
    }

private:
    DynamicData& dynamic_;
    uint32_t previous_, piece_, count_;
};

// Nothing for what is no piece.
inline void PrintPiece(ub1 piece) {
    constexpr const char* kLines[] = {"piece=OCI_ONE_PIECE\n", "piece=OCI_FIRST_PIECE\n", "piece=OCI_NEXT_PIECE\n",
                                      "piece=OCI_LAST_PIECE\n"};
    if (piece < std::size(kLines)) MessageText(kOutput, kLines[piece]);
}
