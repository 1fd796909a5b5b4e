// The calls on cursor areas: text, execute, fetch, describe (cursors.cpp), places of values (places.cpp).
#pragma once

#include "legacy/call.h"

namespace legacy {

sword OpenCursor(Cda_Def* area, Lda_Def* login);
sword CloseCursor(Cda_Def* area);
// Of cursors that the register no longer knows; under their login's turn.
void EndResults(const std::vector<std::shared_ptr<Cursor>>& cursors);
sword Parse(Cda_Def* area, const text* sql, sb4 length, bool deferred, ub4 language);
sword Execute(Cda_Def* area);
sword ExecuteRows(Cda_Def* area, sword iterations, sword first);
sword ExecuteAndFetch(Cda_Def* area, ub4 rows, bool cancel, bool exact);
sword Fetch(Cda_Def* area, sword rows);
sword Cancel(Cda_Def* area);

struct ColumnPlaces {
    sb4* size;
    sb2* type;
    sb1* name;
    sb4* name_length;
    sb4* display_size;
    sb2* precision;
    sb2* scale;
    sb2* null_ok;
};
sword Describe(Cda_Def* area, sword position, const ColumnPlaces& places);

// Where an application keeps values: what the bind and define calls share.
struct Place {
    dvoid* value;
    sb4 length;
    sword type;
    sword scale;
    sb2* indicator;
    ub2* lengths = nullptr;
    ub2* codes = nullptr;
};
struct Name {
    const text* begin;
    sb4 length;
};
struct Table {
    ub4 most = 0;
    ub4* current = nullptr;
};
// How the elements of arrays follow each other, or pieces: then the value is a context that ogetpi hands back.
struct Steps {
    ub1 opcode;
    sb4 value;
    sb4 indicator;
    sb4 length;
    sb4 code;
};
// `steps` null: plain arrays.
sword Define(Cda_Def* area, Function function, sword position, Place place, const Steps* steps = nullptr);
sword BindName(Cda_Def* area, Function function, Name name, Place place, Table table, const Steps* steps = nullptr);
sword BindNumber(Cda_Def* area, sword number, Place place);
sword GetPiece(Cda_Def* area, ub1* piece, dvoid** context, ub4* iteration, ub4* index);
sword SetPiece(Cda_Def* area, ub1 piece, dvoid* buffer, ub4* length);
// Part of a text or of bytes in the row fetched last, as they are (parts.cpp).
struct Part {
    dvoid* buffer;
    sb4 room;
    sword type;
    ub4* length;
    sb4 offset;
};
sword ReadPart(Cda_Def* area, sword position, const Part& part);
// Gets the columns of a query that is compiled.
int Compile(Cursor& cursor);
int CheckColumn(Cursor& cursor, sword position);    // 1007 when it is past the last one of those

}  // namespace legacy
