// How the application says where the pieces of values lie: by polling, or by the callbacks that it registered.
//
// Threads: under the statement's serial lock, callbacks included.
#pragma once

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
};

class PieceDriver {
public:
    virtual ~PieceDriver() = default;
    // Puts the place of the piece into its area. What is not Ok ends the call that is under way.
    virtual Status Supply(WantedPiece& wanted) = 0;
};

// Takes the places that OCIStmtSetPieceInfo gave, and waits for them: OCI_NEED_DATA until the call is made again. The
// piece stays wanted.
class PollingDriver final : public PieceDriver {
public:
    Status Supply(WantedPiece& wanted) override;
};

// Calls the application; polls where it registered nothing to call. 24343 when a callback answers anything but
// OCI_CONTINUE.
class CallbackDriver final : public PieceDriver {
public:
    Status Supply(WantedPiece& wanted) override;

private:
    sb4 Call(const WantedPiece& wanted, PieceBuffer& place);

    PollingDriver polling_;
    ub4 length_ = 0;    // that a callback told by value
};

// Whether the application says that the value is null.
bool SaysNull(const PieceBuffer& piece);
