#include "statements/piece_drivers.h"

#include <cstring>

#include "handles/errors.h"

bool SaysNull(const PieceBuffer& piece) {
    std::int16_t indicator = 0;
    if (piece.indicator) std::memcpy(&indicator, piece.indicator, sizeof indicator);
    return indicator == values::kNullIndicator;
}

Status Poll(WantedPiece& wanted) {
    if (wanted.asked) return Error(errors::kNoBuffer);
    wanted.asked = true;
    return NeedData(wanted.out ? errors::kWantsBuffer : errors::kWantsPiece);
}

sb4 CallbackDriver::Call(const WantedPiece& wanted, PieceBuffer& place) {
    const Callbacks ask = wanted.area->AsksBy();    // it may register others
    dvoid* const handle = wanted.area->Pointer();
    if (!wanted.out) {
        length_ = 0;
        place.length = &length_;
        return ask.in(ask.in_context, static_cast<OCIBind*>(handle), wanted.iteration, wanted.index, &place.buffer,
                      &length_, &place.piece, &place.indicator);
    }
    if (ask.define)
        return ask.define(ask.out_context, static_cast<OCIDefine*>(handle), wanted.iteration, &place.buffer,
                          &place.length, &place.piece, &place.indicator, &place.code);
    return ask.out(ask.out_context, static_cast<OCIBind*>(handle), wanted.iteration, wanted.index, &place.buffer,
                   &place.length, &place.piece, &place.indicator, &place.code);
}

Status CallbackDriver::Supply(WantedPiece& wanted) {
    DataArea& area = *wanted.area;
    PieceBuffer place;
    place.piece = wanted.continued ? OCI_NEXT_PIECE : OCI_ONE_PIECE;
    if (Call(wanted, place) != OCI_CONTINUE) return Error(errors::kCallbackFailed);
    area.piece = place;
    return {};
}
