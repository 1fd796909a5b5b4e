// Values handed over while a statement runs: callbacks for binds and defines, and pieces that a script moves by hand.
// The context of a callback is the buffer that a command names; buffers are slots of a table that never moves, so a
// callback that comes after its buffer was freed finds an empty slot and refuses. Library threads may call; all else is
// the command thread's.
#include <algorithm>

#include "commands/families.h"
#include "commands/shared/pieces.h"
#include "commands/shared/word_arguments.h"
#include "core/messages.h"
#include "objects/buffers.h"
#include "objects/memory.h"
#include "objects/structs.h"
#include "platform/client_library.h"
#include "report/return_code.h"
#include "report/trace.h"

namespace {

// --- Buffers that callbacks and pieces use ---------------------------------------------------------------------------

bool HasRow(const MemBuffer* buffer, ub4 row) {
    return buffer != nullptr && buffer->in_use && buffer->Complete() && row < buffer->array_size;
}

// A context may have been refused where its callback was not.
sb4 RefuseIteration(const MemBuffer* buffer) {
    Message(kError, "Invalid iteration for buffer %s\n", buffer == nullptr ? "null" : buffer->name);
    return OCI_ERROR;
}

// A script may have taken a pointer away from calls.
void* DataFor(const MemBuffer& buffer, ub4 row, ub4 offset = 0) {
    return buffer.call_data == nullptr ? nullptr : buffer.Element(row) + offset;
}
int16_t* IndicatorFor(const MemBuffer& buffer, ub4 row) {
    return buffer.call_indicators == nullptr ? nullptr : buffer.Indicator(row);
}
uint16_t* ReturnCodeFor(const MemBuffer& buffer, ub4 row) {
    return buffer.call_return_codes == nullptr ? nullptr : buffer.ReturnCode(row);
}

// What the buffer has for the row, as the listing of inputs counts it.
ub4 LengthOfInput(const MemBuffer& buffer, ub4 row) {
    return std::min<ub4>(LengthOf(buffer, row), buffer.element_size);
}

// --- The list that a bind hands out ----------------------------------------------------------------------------------

// A buffer for the list of `target`; null, and the reason said, when the word names none.
MemBuffer* FindListed(const MemBuffer& target, const char* word) {
    if (IsNull(word) || IsInvalid(word)) {
        Message(kError, "Invalid memhandle - %s\n", word);
        return nullptr;
    }
    MemBuffer* const buffer = FindBufferOrView(word);
    if (buffer == nullptr) {
        Message(kError, "Buffer %s not found\n", word);
    } else if (buffer->type != target.type) {
        Message(kError, "memhandle %s data type does not match data type of memhandle %s\n", word, target.name);
        return nullptr;
    }
    return buffer;
}

void ReplaceList(MemBuffer& target, Memory<MemBuffer*>& list, ub4 list_count) {
    FreeMem(target.dynamic.list);
    target.dynamic.list = list.release();
    target.dynamic.list_count = list_count;
}

// Places of the list that no word fills stay empty.
void SetDynamicBuffers(const CommandRow& row, int count, char** words) {
    constexpr int kFirstName = 3;
    MemBuffer* const target = FindBufferOrView(words[1]);
    if (target == nullptr) {
        if (!IsNull(words[1])) Message(kError, "Buffer %s not found\n", words[1]);
        return;
    }
    const ub4 list_count = DecodeCount(words[2]);
    Memory<MemBuffer*> list(static_cast<MemBuffer**>(GetMem(size_t{list_count} * sizeof(MemBuffer*))));
    if (list == nullptr) return Message(kError, "Could not allocate memory\n");
    for (int word = kFirstName; word < count && word - kFirstName < static_cast<long>(list_count); ++word)
        list.get()[word - kFirstName] = FindListed(*target, words[word]);
    ReplaceList(*target, list, list_count);
    outputOCI(row.code, OCI_SUCCESS, words[1]);
}

// --- Callbacks -------------------------------------------------------------------------------------------------------

// Not what one would expect: of a longer list, the first buffer is a next piece and the second one a first.
ub1 PieceOfList(ub4 iteration, ub4 list_count) {
    if (list_count == 1) return OCI_ONE_PIECE;
    if (iteration == 1) return OCI_FIRST_PIECE;
    return iteration == list_count - 1 ? OCI_LAST_PIECE : OCI_NEXT_PIECE;
}

sb4 HandOut(void* context, OCIBind*, ub4 iteration, ub4 index, void** data, ub4* length, ub1* piece,
            void** indicator) {
    const auto* const target = static_cast<const MemBuffer*>(context);
    if (target == nullptr || !target->in_use) return RefuseIteration(target);
    const DynamicData& dynamic = target->dynamic;
    if (iteration >= dynamic.list_count) return RefuseIteration(target);
    const MemBuffer* const buffer = dynamic.list[iteration];
    if (!HasRow(buffer, index)) return RefuseIteration(target);
    *data = DataFor(*buffer, index);
    *length = LengthOfInput(*buffer, index);
    *indicator = IndicatorFor(*buffer, index);
    *piece = PieceOfList(iteration, dynamic.list_count);
    return OCI_CONTINUE;
}

// Where the library puts what it delivers.
struct PiecePlaces {
    void** data;
    ub4** length;
    void** indicator;
    ub2** return_code;
};

// Pieces of one value are laid behind each other; what has no room any more gets a length of 0.
sb4 TakeIn(void* context, ub4 row, ub1 piece, const PiecePlaces& places) {
    if (!HasRow(static_cast<MemBuffer*>(context), row)) return RefuseIteration(static_cast<MemBuffer*>(context));
    MemBuffer& buffer = *static_cast<MemBuffer*>(context);
    if (!AttachLengths(buffer)) return OCI_ERROR;
    uint32_t& previous = buffer.dynamic.previous_lengths[row];
    uint32_t& length = buffer.dynamic.piece_lengths[row];
    const bool begins = piece == OCI_ONE_PIECE || piece == OCI_FIRST_PIECE;
    const uint64_t received = begins ? 0 : uint64_t{previous} + length;
    previous = static_cast<uint32_t>(std::min<uint64_t>(received, buffer.element_size));
    length = buffer.element_size - previous;
    buffer.dynamic.lengths_count = 1;
    *places.data = DataFor(buffer, row, previous);
    *places.length = &length;
    *places.indicator = IndicatorFor(buffer, row);
    *places.return_code = ReturnCodeFor(buffer, row);
    return OCI_CONTINUE;
}

// Whatever the iteration: values come into the first row.
sb4 TakeBound(void* context, OCIBind*, ub4, ub4, void** data, ub4** length, ub1* piece, void** indicator,
              ub2** return_code) {
    return TakeIn(context, 0, *piece, {data, length, indicator, return_code});
}

sb4 TakeDefined(void* context, OCIDefine*, ub4 iteration, void** data, ub4** length, ub1* piece, void** indicator,
                ub2** return_code) {
    return TakeIn(context, iteration, *piece, {data, length, indicator, return_code});
}

// The four words "ictxp icbfp octxp ocbfp"; without them, the in side.
struct BindSides {
    bool in_context = true, in = true, out_context = false, out = false;

    BindSides() = default;
    explicit BindSides(char** words)
        : in_context(!IsNull(words[0])),
          in(!IsNull(words[1])),
          out_context(!IsNull(words[2])),
          out(!IsNull(words[3])) {}
};

void BindDynamic(const CommandRow& row, int count, char** words) {
    const bool has_sides = count > 5;
    const bool has_member = count == 5 || count == 9;
    auto* const bind = Resolve<OCIBind>(Kind::bind, words[1]);
    auto* const error = ResolveError<OCIError>(words[2]);
    MemBuffer* const buffer = FindDynamicBuffer(words[3], has_member ? DecodeLong(words[4]) : 0);
    if (buffer == nullptr) return;
    const BindSides sides = has_sides ? BindSides(words + count - 4) : BindSides();
    const sword rc = Call(&ClientLibrary::OCIBindDynamic, bind, error, sides.in_context ? buffer : nullptr,
                          sides.in ? HandOut : nullptr, sides.out_context ? buffer : nullptr,
                          sides.out ? TakeBound : nullptr);
    TraceAndReport(row.code, words[1], error, rc);
}

// "{memhandle | memstructhandle element} [cbfp]": a fifth word is the element of a struct, of a buffer the callback.
void DefineDynamic(const CommandRow& row, int count, char** words) {
    const bool has_member = count == 6 || (count == 5 && FindBufferOrView(words[3]) == nullptr);
    const char* const callback = count == 6 || (count == 5 && !has_member) ? words[count - 1] : nullptr;
    auto* const define = Resolve<OCIDefine>(Kind::define, words[1]);
    auto* const error = ResolveError<OCIError>(words[2]);
    MemBuffer* const buffer = FindDynamicBuffer(words[3], has_member ? DecodeLong(words[4]) : 0);
    if (buffer == nullptr) return;
    const bool refused = callback != nullptr && IsNull(callback);
    const sword rc = Call(&ClientLibrary::OCIDefineDynamic, define, error, buffer, refused ? nullptr : TakeDefined);
    if (rc == OCI_SUCCESS) buffer->dynamic.lengths_count = 1;
    TraceAndReport(row.code, words[1], error, rc);
}

// --- Pieces by hand --------------------------------------------------------------------------------------------------

// What the library last said about a piece. The handle is compared with, never used; one that lies where another was
// has been registered since.
struct {
    const void* handle = nullptr;
    uint32_t turn = 0;
    ub1 direction = 0;
} last_piece;

uint32_t TurnOfBind(const void* handle) {
    const NamedObject* const slot = FindNewestByPointer(Kind::bind, handle);
    return slot == nullptr ? 0 : slot->turn;
}

bool ComesOut(const void* handle) {
    return handle == last_piece.handle && TurnOfBind(handle) == last_piece.turn && last_piece.direction == OCI_PARAM_OUT;
}

struct PieceInfo {
    void* handle = nullptr;
    ub4 type = 0;
    ub1 direction = 0;
    ub4 iteration = 0;
    ub4 index = 0;
    ub1 piece = 0;
};

const char* NameOf(Kind kind, const void* handle) {
    const NamedObject* const slot = FindNewestByPointer(kind, handle);
    return slot == nullptr ? "unknown" : slot->name;
}

// The words of the longer form: each may refuse its output, which is not printed then.
enum PieceWord { kHandle = 3, kType, kDirection, kIteration, kIndex, kPiece };

class PieceWords {
public:
    PieceWords(int count, char** words) : count_(count), words_(words) {}
    bool Wants(PieceWord word) const { return count_ <= word || !IsNull(words_[word]); }
    template <class T> T* Place(T& output, PieceWord word) const { return Wants(word) ? &output : nullptr; }

private:
    int count_;
    char** words_;
};

void PrintPieceInfo(const PieceInfo& info, const PieceWords& words) {
    const bool is_define = info.type == OCI_HTYPE_DEFINE;
    if (words.Wants(kHandle))
        Message(kOutput, "hndlp=%s\n", NameOf(is_define ? Kind::define : Kind::bind, info.handle));
    if (words.Wants(kType)) Message(kOutput, "type=%s\n", is_define ? "OCI_HTYPE_DEFINE" : "OCI_HTYPE_BIND");
    if (words.Wants(kDirection))
        Message(kOutput, "in_out=%s\n", info.direction == OCI_PARAM_IN ? "OCI_PARAM_IN" : "OCI_PARAM_OUT");
    if (words.Wants(kIteration)) Message(kOutput, "iter=%ld\n", static_cast<long>(info.iteration));
    if (words.Wants(kIndex)) Message(kOutput, "idx=%ld\n", static_cast<long>(info.index));
    if (words.Wants(kPiece)) PrintPiece(info.piece);
}

// What was learned is printed before the trace line.
void GetPieceInfo(const CommandRow& row, int count, char** words) {
    auto* const statement = Resolve<OCIStmt>(Kind::stmt, words[1]);
    auto* const error = ResolveError<OCIError>(words[2]);
    const PieceWords asked(count, words);
    PieceInfo info;
    const sword rc = Call(&ClientLibrary::OCIStmtGetPieceInfo, statement, error, asked.Place(info.handle, kHandle),
                          asked.Place(info.type, kType), asked.Place(info.direction, kDirection),
                          asked.Place(info.iteration, kIteration), asked.Place(info.index, kIndex),
                          asked.Place(info.piece, kPiece));
    if (rc == OCI_SUCCESS) {
        last_piece = {info.handle, TurnOfBind(info.handle), info.direction};
        // Without its type, a handle is that of a define if one has it.
        if (!asked.Wants(kType) && FindByPointer(Kind::define, info.handle) != nullptr) info.type = OCI_HTYPE_DEFINE;
        PrintPieceInfo(info, asked);
    }
    TraceAndReport(row.code, words[1], error, rc);
}

void* ResolvePieceHandle(int type, char** words) {
    const std::optional<Kind> kind = KindOfHandleType(type);
    if (kind) return ResolveObject(*kind, words[1]);
    Message(kError, "Invalid handle type %s\n", words[2]);
    return nullptr;
}

// The place of the piece's length: what the buffer has, going in; its room, coming out, where the listing then tells
// what was stored.
uint32_t* PieceLength(MemBuffer& buffer, bool comes_out) {
    DynamicData& dynamic = buffer.dynamic;
    const ub4 length = comes_out ? buffer.element_size : LengthOfInput(buffer, 0);
    dynamic.previous_lengths[0] = 0;
    dynamic.piece_lengths[0] = length;
    if (comes_out) dynamic.lengths_count = 1;
    return dynamic.piece_lengths;
}

void SetPieceInfo(const CommandRow& row, int count, char** words) {
    const int type = DecodeKeyword(words[2], HandleTypeKeywords);
    void* const handle = ResolvePieceHandle(type, words);
    auto* const error = ResolveError<OCIError>(words[3]);
    const auto piece = static_cast<ub1>(DecodeKeywordOrNumber(words[4], PieceKeywords));
    MemBuffer* const buffer = FindDynamicBuffer(words[5], count == 7 ? DecodeLong(words[6]) : 0);
    if (buffer == nullptr || !buffer->Complete() || !AttachLengths(*buffer)) return;
    const FirstLengths before(buffer->dynamic);
    uint32_t* const length = PieceLength(*buffer, type == OCI_HTYPE_DEFINE || ComesOut(handle));
    const sword rc = Call(&ClientLibrary::OCIStmtSetPieceInfo, handle, static_cast<ub4>(type), error,
                          DataFor(*buffer, 0), buffer->call_lengths == nullptr ? nullptr : length, piece,
                          IndicatorFor(*buffer, 0), ReturnCodeFor(*buffer, 0));
    if (rc != OCI_SUCCESS) before.Restore();
    TraceAndReport(row.code, words[1], error, rc);
}

constexpr PlainCommand kDynamicCommands[] = {
    {{Code::setbinddynamicbuffers, WordsFrom(4),
      "SetBindDynamicBuffers { memhandle | memstructhandle elementindex } #buffers "
      "memhandle1 memhandle2 ... memhandleN"},
     SetDynamicBuffers},
    {{Code::ocibinddynamic, Words(4, 5, 8, 9),
      "OCIBindDynamic hBind hError [memhandle | memstructhandle elementindex] [ictxp icbfp octxp ocbfp]"},
     BindDynamic},
    {{Code::ocidefinedynamic, Words(4, 5, 6),
      "OCIDefineDynamic hDefine hError {memhandle | memstructhandle element} [cbfp]"},
     DefineDynamic},
    {{Code::ocistmtgetpieceinfo, Words(3, 9), "OCIStmtGetPieceInfo hStmt hError [hndlp type in_out iter idx piece]"},
     GetPieceInfo},
    {{Code::ocistmtsetpieceinfo, Words(6, 7),
      "OCIStmtSetPieceInfo hHandle {oci_htype_bind | oci_htype_define} hError "
      "{OCI_FIRST_PIECE | OCI_NEXT_PIECE | OCI_LAST_PIECE | OCI_ONE_PIECE } "
      "{memhandle | memstructhandle elementindex}"},
     SetPieceInfo},
};

}  // namespace

void AddDynamicCommands(HandlerTable& handlers) {
    handlers.Add(kDynamicCommands);
}
