// The gate of the version-7 calls: is the area known, whose turn is it, what does the body answer or throw, and the
// fields of the area that say so. Bodies answer an error number, 0 for success.
#pragma once

#include <algorithm>
#include <new>
#include <utility>

#include "legacy/areas.h"

namespace legacy {

// The values of `fc`.
enum class Function : ub1 {
    none = 0, oexec = 4, odefin = 8, ofetch = 12, oopen = 14, oclose = 16, obndrv = 28, obndrn = 30, oopt = 34,
    ocan = 52, oparse = 54, oexfet = 56, oflng = 58, odescr = 60, obndra = 62, obindps = 63, odefinps = 64,
    ogetpi = 65, osetpi = 66
};

// What a call on the handles answered, as a number; it is kept for oerhms. 3129 or 3130 is for the caller to tell.
int Outcome(sword code, OCIError* error, Login& login) noexcept;
int Outcome(sword code, Cursor& cursor) noexcept;    // notes values that were cut, too

template <class Body>
int Guarded(Body&& body) noexcept try {
    return body();
} catch (const std::bad_alloc&) {
    return errors::kOutOfMemory;
} catch (...) {
    return errors::kInternalError;
}

inline sword SetResult(Cda_Def& area, Function function, int result) noexcept {
    area.rc = static_cast<ub2>(result);
    area.v2_rc = static_cast<sb2>(result == errors::kNoRows ? 4 : std::max(-result, -32768));
    area.fc = static_cast<ub1>(function);
    area.wrn = 0;
    return result;
}

// body(Login&)
template <class Body>
sword OnLogin(Lda_Def* area, Body&& body) noexcept {
    const std::shared_ptr<Login> login = FindLogin(area);
    if (!login) return errors::kInvalidCursor;
    const std::lock_guard turn(login->turn);
    if (login->ended) return errors::kInvalidCursor;
    return SetResult(*area, Function::none, login->IsBusy() ? errors::kOperationActive : Guarded([&] { return body(*login); }));
}

// Whether a call on the cursor has to wait for another call's end.
bool IsRefused(const Cursor& cursor, Function function) noexcept;

// body(Cursor&)
template <class Body>
sword OnCursor(Cda_Def* area, Function function, Body&& body) noexcept {
    const std::shared_ptr<Cursor> cursor = FindCursor(area);
    if (!cursor) return errors::kInvalidCursor;
    const std::lock_guard turn(cursor->login->turn);
    if (cursor->ended) return errors::kInvalidCursor;
    if (IsRefused(*cursor, function)) return SetResult(*area, function, errors::kOperationActive);
    const sword result = SetResult(*area, function, Guarded([&] { return body(*cursor); }));
    if (result != errors::kStillExecuting && std::exchange(cursor->truncated, false)) area->wrn = 3;
    return result;
}

// The same for the calls that want a statement: else 1003.
template <class Body>
sword OnStatement(Cda_Def* area, Function function, Body&& body) noexcept {
    return OnCursor(area, function, [&](Cursor& cursor) { return cursor.parsed ? body(cursor) : errors::kNotParsed; });
}

}  // namespace legacy
