// Binds and defines of cursors, and their pieces.
#include <algorithm>
#include <array>
#include <charconv>
#include <limits>

#include "legacy/cursors.h"
#include "legacy/options.h"
#include "legacy/types.h"

namespace legacy {
namespace {

constexpr sword kMostColumns = std::numeric_limits<ub2>::max();

int SetScale(Cursor& cursor, dvoid* handle, ub4 kind, const Place& place) {
    if (place.type != SQLT_PDN || place.scale < 0) return 0;
    auto scale = static_cast<sb2>(place.scale);
    return Outcome(OCIAttrSet(handle, kind, &scale, 0, OCI_ATTR_PDSCL, cursor.error), cursor);
}

constexpr ub1 kInPieces = 0;

// The mode of a bind or define, and what its arguments mean in it.
int Prepare(Place& place, const Steps* steps, ub4 pieces_mode, ub4& mode) {
    mode = OCI_DEFAULT;
    if (steps && steps->opcode > 1) return errors::kParameterOutOfRange;
    if (steps && std::min({steps->value, steps->indicator, steps->length, steps->code}) < 0) {
        return errors::kParameterOutOfRange;
    }
    const bool in_pieces = steps && steps->opcode == kInPieces;
    if (in_pieces) mode = pieces_mode;
    return CheckType(in_pieces ? nullptr : place.value, place.type, place.length);
}

// What follows a bind or define that succeeded. Pieces under way were given up with it.
template <class Handle>
int Finish(Cursor& cursor, Handle* handle, ub4 kind, const Place& place, const Steps* steps,
           sword (*set_steps)(Handle*, OCIError*, ub4, ub4, ub4, ub4)) {
    cursor.waits = Cursor::Waits::no;
    GiveUpExecute(cursor);
    if (steps && steps->opcode == kInPieces) {
        cursor.pieces[handle] = {place.value, place.indicator, place.codes, steps->indicator, steps->code};
    } else if (steps) {
        const int failed = Outcome(set_steps(handle, cursor.error, static_cast<ub4>(steps->value),
                                             static_cast<ub4>(steps->indicator), static_cast<ub4>(steps->length),
                                             static_cast<ub4>(steps->code)),
                                   cursor);
        if (failed != 0) return failed;
    }
    return SetScale(cursor, handle, kind, place);
}

int Bind(Cursor& cursor, Name name, Place place, Table table, const Steps* steps) {
    if (!name.begin) return errors::kParameterMissing;
    if (name.length < -1) return errors::kParameterOutOfRange;
    ub4 mode = OCI_DEFAULT;
    if (const int failed = Prepare(place, steps, OCI_DATA_AT_EXEC, mode)) return failed;
    OCIBind* bind = nullptr;
    const int result = Outcome(OCIBindByName(cursor.statement, &bind, cursor.error, name.begin, name.length,
                                             place.value, place.length, static_cast<ub2>(place.type), place.indicator,
                                             place.lengths, place.codes, table.most, table.current, mode),
                               cursor);
    return result != 0 ? result : Finish(cursor, bind, OCI_HTYPE_BIND, place, steps, OCIBindArrayOfStruct);
}

int DefineColumn(Cursor& cursor, sword position, Place place, const Steps* steps) {
    if (position < 1 || position > kMostColumns) return errors::kNoSuchColumn;
    if (cursor.compiled) {
        if (const int failed = Compile(cursor)) return failed;
        if (const int failed = CheckColumn(cursor, position)) return failed;
    }
    ub4 mode = OCI_DEFAULT;
    if (const int failed = Prepare(place, steps, OCI_DYNAMIC_FETCH, mode)) return failed;
    OCIDefine* define = nullptr;
    const int result = Outcome(OCIDefineByPos(cursor.statement, &define, cursor.error, static_cast<ub4>(position),
                                              place.value, place.length, static_cast<ub2>(place.type), place.indicator,
                                              place.lengths, place.codes, mode),
                               cursor);
    if (result != 0) return result;
    cursor.highest_define = std::max(cursor.highest_define, position);
    return Finish(cursor, define, OCI_HTYPE_DEFINE, place, steps, OCIDefineArrayOfStruct);
}

struct Wanted {
    dvoid* handle = nullptr;
    ub4 type = 0;
    ub4 iteration = 0;
    ub4 index = 0;
    ub1 piece = 0;
};

int FindWanted(Cursor& cursor, Wanted& wanted, PieceArea& area) {
    ub1 direction = 0;
    const int result = Outcome(OCIStmtGetPieceInfo(cursor.statement, cursor.error, &wanted.handle, &wanted.type,
                                                   &direction, &wanted.iteration, &wanted.index, &wanted.piece),
                               cursor);
    if (result != 0) return result;
    const auto found = cursor.pieces.find(wanted.handle);
    if (found == cursor.pieces.end()) return errors::kIllegalOperation;
    area = found->second;
    return 0;
}

template <class Value>
Value* Element(Value* first, ub4 index, sb4 skip) {
    return first ? reinterpret_cast<Value*>(reinterpret_cast<char*>(first) + std::size_t{index} * static_cast<ub4>(skip))
                 : nullptr;
}

template <class Value>
void Put(Value* place, Value value) {
    if (place) *place = value;
}

}  // namespace

sword Define(Cda_Def* area, Function function, sword position, Place place, const Steps* steps) {
    return OnStatement(area, function, [&](Cursor& cursor) { return DefineColumn(cursor, position, place, steps); });
}

sword BindName(Cda_Def* area, Function function, Name name, Place place, Table table, const Steps* steps) {
    return OnStatement(area, function, [&](Cursor& cursor) { return Bind(cursor, name, place, table, steps); });
}

sword BindNumber(Cda_Def* area, sword number, Place place) {
    return OnStatement(area, Function::obndrn, [&](Cursor& cursor) -> int {
        if (number < 1) return errors::kNoSuchBind;
        std::array<char, 16> name{':'};
        const auto end = std::to_chars(name.data() + 1, name.data() + name.size(), number).ptr;
        return Bind(cursor, {reinterpret_cast<const text*>(name.data()), static_cast<sb4>(end - name.data())}, place, {},
                    nullptr);
    });
}

sword GetPiece(Cda_Def* area, ub1* piece, dvoid** context, ub4* iteration, ub4* index) {
    return OnStatement(area, Function::ogetpi, [&](Cursor& cursor) {
        Wanted wanted;
        PieceArea given{};
        if (const int failed = FindWanted(cursor, wanted, given)) return failed;
        Put(piece, wanted.piece);
        Put(context, given.context);
        Put(iteration, wanted.iteration);
        Put(index, wanted.index);
        return 0;
    });
}

// Indicator and return code are those of the element.
sword SetPiece(Cda_Def* area, ub1 piece, dvoid* buffer, ub4* length) {
    return OnStatement(area, Function::osetpi, [&](Cursor& cursor) {
        Wanted wanted;
        PieceArea given{};
        if (const int failed = FindWanted(cursor, wanted, given)) return failed;
        return Outcome(OCIStmtSetPieceInfo(wanted.handle, wanted.type, cursor.error, buffer, length, piece,
                                           Element(given.indicator, wanted.iteration, given.indicator_skip),
                                           Element(given.code, wanted.iteration, given.code_skip)),
                       cursor);
    });
}

}  // namespace legacy
