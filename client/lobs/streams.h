// Reading and writing large objects: at once, in pieces that the application takes or gives call by call, or through its
// callbacks. A session has one stream at a time. Data of the application are bytes, or characters of any set that the
// library knows.
//
// Threads: under the serial lock of the session; callbacks may call the library, which finds the stream going on.
#pragma once

#include <cstdint>
#include <functional>

#include "lobs/object.h"
#include "oci.h"
#include "sessions/link.h"

namespace lobs {

// Whether a read or write waits for its next call; one whose locator is gone or holds another object is forgotten.
bool StreamGoesOn(Link& link);

// How much is meant, and how much it was: in units of the object or, of characters, in bytes of the application's form.
struct Amount {
    std::uint64_t value = 0;    // 0: all that there is
    bool in_bytes = false;
};

// What the last call transferred, both ways of counting.
struct Transferred {
    std::uint64_t units = 0;
    std::uint64_t bytes = 0;
    bool tells_bytes = false;   // a piece of a stream whose characters differ in width
};

struct TransferArguments {
    Amount amount;
    std::uint64_t offset = 1;
    char* buffer = nullptr;
    std::uint64_t length = 0;     // of the buffer, or of what it holds
    std::uint8_t piece = OCI_ONE_PIECE;
    bool never_polls = false;     // one piece takes what fits
    bool appends = false;         // the offset is the end
    std::uint16_t character_set = 0;
    std::uint8_t form = 0;
};

// The application's callbacks; empty: none. A buffer and its length may be changed for the next piece.
using TakePiece = std::function<sb4(const char* data, std::uint64_t length, ub1 piece, char*& next, std::uint64_t& room)>;
using GivePiece = std::function<sb4(char* room, std::uint64_t& length, ub1& piece, char*& next, std::uint64_t& next_room)>;

Status Read(LobDescriptor& descriptor, Link& link, const TransferArguments& arguments, const TakePiece& take,
            Transferred& done);
Status Write(LobDescriptor& descriptor, Link& link, const TransferArguments& arguments, const GivePiece& give,
             Transferred& done);

}  // namespace lobs
