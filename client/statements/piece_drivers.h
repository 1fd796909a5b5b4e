// How the application says where the pieces of values lie: by polling, or by the callbacks that it registered.
//
// Threads: under the statement's serial lock, callbacks included.
#pragma once

#include <utility>

#include "statements/data_area.h"

// The piece that is wanted next.
struct WantedPiece {
    DataArea* area = nullptr; // one of the stream's binds or of the active defines; null while no value is at hand
    bool out = false;         // to the application
    ub4 iteration = 0;        // or row, from 0
    ub4 index = 0;            // of an element within the iteration, from 0
    bool continued = false;   // the value has begun
    bool asked = false;       // the application knows

    [[nodiscard]] bool ByCallback() const { return area->AsksBy().Serve(out); }
    // By polling: takes the place that OCIStmtSetPieceInfo put into the area, once. False when it gave none.
    [[nodiscard]] bool TakePlace() const { return std::exchange(area->piece.is_set, false); }
};

// What a call answers that has no place for a polled piece: OCI_NEED_DATA until it is made again. The piece stays
// wanted.
Status Poll(WantedPiece& wanted);

// Calls the application.
class CallbackDriver {
public:
    // Puts the place of the piece into its area. 24343 when the callback answers anything but OCI_CONTINUE.
    Status Supply(WantedPiece& wanted);

private:
    sb4 Call(const WantedPiece& wanted, PieceBuffer& place);

    ub4 length_ = 0;    // that a callback told by value
};

// Whether the application says that the value is null.
bool SaysNull(const PieceBuffer& piece);
