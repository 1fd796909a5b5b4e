// Long values of cursors: parts of a column fetched, and pieces that a script moves by hand. Command thread only.
#include <algorithm>

#include "commands/families.h"
#include "commands/legacy/area_words.h"
#include "commands/shared/pieces.h"
#include "core/messages.h"
#include "objects/buffers.h"
#include "objects/structs.h"
#include "platform/client_library.h"

namespace {

// --- Parts of a column -----------------------------------------------------------------------------------------------

// What came in is the first element's now.
void NoteLength(const MemBuffer& buffer, ub4 length) {
    if (!buffer.Complete()) return;
    *buffer.Length(0) = FieldOfLength(length);
    *buffer.Indicator(0) = 0;
    *buffer.ReturnCode(0) = 0;
    ForgetPieces(buffer, 0);
}

void FetchPart(const CommandRow& row, int count, char** words) {
    const AreaArgument cursor = ResolveArea(Kind::cursor, words[1]);
    const MemBuffer* const buffer = FindBuffer(words[3]);
    if (buffer == nullptr && !IsNull(words[3])) return;
    void* const data = buffer == nullptr ? nullptr : buffer->call_data;
    const ub4 room = buffer == nullptr ? 0 : buffer->call_length;
    const ub2 type = buffer == nullptr ? SQLT_LNG : buffer->type;
    ub4 length = 0;
    ub4* const place = Place(length, count, words, 5);
    const sword rc = Call(&ClientLibrary::oflng, cursor.area, DecodeNumber(words[2]),
                          static_cast<ub1*>(data), static_cast<sb4>(room), type, place, DecodeNumber(words[4]));
    TraceAndReportAreas(row.code, words[1], CalledCursor(cursor), rc);
    if (rc != OCI_SUCCESS || place == nullptr) return;
    Message(kOutput, "retl=%ld\n", static_cast<long>(length));
    if (buffer != nullptr) NoteLength(*buffer, length);
}

// --- Pieces ----------------------------------------------------------------------------------------------------------

// What a bind or define in pieces was given: the record of a buffer.
const char* NameOfContext(const void* context) {
    if (context == nullptr) return "null";
    for (const MemBuffer& buffer : Buffers())
        if (buffer.in_use && &buffer == context) return buffer.name;
    return "unknown";
}

void ShowWantedPiece(const CommandRow& row, int count, char** words) {
    const AreaArgument cursor = ResolveArea(Kind::cursor, words[1]);
    ub1 piece = 0;
    void* context = nullptr;
    ub4 iteration = 0;
    ub4 index = 0;
    ub1* const piece_place = Place(piece, count, words, 2);
    void** const context_place = Place(context, count, words, 3);
    ub4* const iteration_place = Place(iteration, count, words, 4);
    ub4* const index_place = Place(index, count, words, 5);
    const sword rc = Call(&ClientLibrary::ogetpi, cursor.area, piece_place, context_place, iteration_place, index_place);
    TraceAndReportAreas(row.code, words[1], CalledCursor(cursor), rc);
    if (rc != OCI_SUCCESS) return;
    if (context_place != nullptr) Message(kOutput, "ctxp=%s\n", NameOfContext(context));
    if (iteration_place != nullptr) Message(kOutput, "iter=%ld\n", static_cast<long>(iteration));
    if (index_place != nullptr) Message(kOutput, "idx=%ld\n", static_cast<long>(index));
    if (piece_place != nullptr) PrintPiece(piece);
}

// The place of a piece's length, which the listing adds up with nothing. Null where the word refuses it.
ub4* PieceLength(DynamicData& dynamic, const char* word) {
    dynamic.previous_lengths[0] = 0;
    dynamic.lengths_count = 1;
    if (IsNull(word)) return nullptr;
    dynamic.piece_lengths[0] = DecodeCount(word);
    return dynamic.piece_lengths;
}

// The block of data itself goes out, whatever a script has taken from calls.
void GivePiece(const CommandRow& row, int count, char** words) {
    const AreaArgument cursor = ResolveArea(Kind::cursor, words[1]);
    const auto piece = static_cast<ub1>(DecodeKeywordOrNumber(words[2], PieceKeywords));
    MemBuffer* const buffer = FindDynamicBuffer(words[3], count == 6 ? DecodeLong(words[4]) : 0);
    if (buffer == nullptr || !buffer->Complete() || !AttachLengths(*buffer)) return;
    const FirstLengths before(buffer->dynamic);
    const sword rc = Call(&ClientLibrary::osetpi, cursor.area, piece, buffer->data,
                          PieceLength(buffer->dynamic, words[count - 1]));
    if (rc != OCI_SUCCESS) before.Restore();
    TraceAndReportAreas(row.code, words[1], CalledCursor(cursor), rc);
}

constexpr PlainCommand kLongCommands[] = {
    {{Code::oflng, Words(5, 6), "oflng cda pos memhandle offset [retl]"}, FetchPart},
    {{Code::ogetpi, Words(2, 6), "ogetpi cda [piece ctxp iter index]"}, ShowWantedPiece},
    {{Code::osetpi, Words(5, 6),
      "osetpi cda {OCI_FIRST_PIECE | OCI_NEXT_PIECE | OCI_LAST_PIECE | OCI_ONE_PIECE} "
      "{memhandle | memstructhandle elementindex} len"},
     GivePiece},
};

}  // namespace

void AddLegacyLongCommands(HandlerTable& handlers) {
    handlers.Add(kLongCommands);
}
