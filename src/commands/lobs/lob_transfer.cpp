// Reading and writing LOBs, piece by piece: by repeated calls, or through callbacks that the library calls. A callback
// learns from the state of the command under way what it may touch, whatever its context is. Library threads may call.
#include <algorithm>
#include <cstring>
#include <string>
#include <vector>

#include "commands/families.h"
#include "commands/shared/word_arguments.h"
#include "core/messages.h"
#include "core/state.h"
#include "objects/buffers.h"
#include "objects/lobs.h"
#include "objects/memory.h"
#include "platform/client_library.h"
#include "platform/code_page.h"
#include "report/trace.h"

namespace {

// The handles that both commands begin with: words[1] to words[3].
struct LobHandles {
    explicit LobHandles(char** words)
        : svc(Resolve<OCISvcCtx>(Kind::svc, words[1])),
          error(ResolveError<OCIError>(words[2])),
          lob(ResolveLob(words[3])) {}
    OCISvcCtx* svc;
    OCIError* error;
    LobReference lob;
};

// "csid csfrm", at words[0] and words[1].
struct CharacterSet {
    CharacterSet() = default;
    explicit CharacterSet(char** words)
        : id(static_cast<ub2>(DecodeKeywordOrNumber(words[0], CharsetIdKeywords))),
          form(static_cast<ub1>(DecodeKeywordOrNumber(words[1], CharsetFormKeywords))) {}
    bool IsUtf16() const { return form == SQLCS_NCHAR || id == OCI_UTF16ID || Utf16Mode; }

    ub2 id = 0;
    ub1 form = 0;
};

// A block of the driver's own. False without memory, which has been said.
bool Obtain(Memory<char>& area, size_t size) {
    area.reset(static_cast<char*>(GetMem(size)));
    if (area == nullptr) Message(kError, "Could not allocate memory\n");
    return area != nullptr;
}

// --- Reading ---------------------------------------------------------------------------------------------------------

// What the read under way is of: the callback shows its pieces by it.
struct ReadContext {
    uint16_t type = SQLT_CLOB;
    CharacterSet set;
};
ReadContext read_context;

// Adds a piece behind what the line holds, and prints the line. False after a failed conversion, which has been said.
bool PrintPiece(Line& line, const ReadContext& context, const void* data, size_t length) {
    bool shown = true;
    if (context.type == SQLT_BLOB) {
        line.Character('"').Hex(data, length);
    } else {
        const bool utf16 = context.set.IsUtf16();
        line.Text(utf16 ? "W\"" : "\"");
        if (utf16) shown = AddText(line, data, length, utf16, Quotes::never);
        else line.Text({static_cast<const char*>(data), length});
    }
    line.Text("\"\n").Print();
    return shown;
}

sb4 TakePiece(void*, const void* data, ub4 length, ub1 piece) {
    const char* const name = piece == OCI_FIRST_PIECE  ? "OCI_FIRST_PIECE"
                             : piece == OCI_NEXT_PIECE ? "OCI_NEXT_PIECE"
                             : piece == OCI_LAST_PIECE ? "OCI_LAST_PIECE"
                                                       : "Invalid";
    Line line;
    line.Format("bufl=%u, piece=%s, bufp=", length, name);
    return PrintPiece(line, read_context, data, data == nullptr ? 0 : length) ? OCI_CONTINUE : OCI_ERROR;
}

// A character of UTF-8 goes on at its second byte and those behind it, one of UTF-16 at the second of a pair.
bool GoesOn(const char* unit, size_t width) {
    const auto leading = static_cast<unsigned char>(unit[width - 1]);
    return width == 1 ? (leading & 0xC0) == 0x80 : (leading & 0xFC) == 0xDC;
}

// The bytes of the area that `amount` characters take, of UTF-8 or, two bytes wide, of UTF-16. The area was zeros before:
// where the amount counts bytes, the text ends before it.
size_t TextLength(const char* area, size_t size, ub4 amount, size_t width) {
    size -= size % width;
    while (size > 0 && area[size - 1] == '\0') --size;
    size += size % width;    // the upper half of the last one may be zero
    size_t position = 0;
    for (ub4 characters = 0; position < size && characters < amount; ++characters)
        do position += width;
        while (position < size && GoesOn(area + position, width));
    return position;
}

// How much of the area a read has filled: the library counts bytes of binary data, characters of others or, of pieces,
// bytes again.
size_t FilledLength(const ReadContext& context, const char* area, size_t size, ub4 amount) {
    if (context.type != SQLT_BLOB && context.set.IsUtf16()) return TextLength(area, size, amount, sizeof(char16_t));
    if (context.type != SQLT_BLOB && application_code_page == kCodePageUtf8) return TextLength(area, size, amount, 1);
    return std::min<size_t>(amount, size);
}

// What the words of a read make of its call, which is repeated while pieces come.
class Read {
public:
    bool Set(char** words);  // false when the command ends here, which has been said
    sword Fetch(const LobHandles& handles);
    void Print(sword rc) const;

private:
    ub4 amount_ = 0;
    ub4 offset_ = 0;
    Memory<char> area_;  // null where the script refuses it
    ub4 length_ = 0;
    void* context_ = nullptr;
    OCICallbackLobRead callback_ = nullptr;
};

bool Read::Set(char** words) {
    amount_ = DecodeCount(words[4]);
    offset_ = DecodeCount(words[5]);
    length_ = DecodeCount(words[7]);
    if (!IsNull(words[6]) && !Obtain(area_, length_)) return false;
    context_ = ContextOf(words[8]);
    callback_ = IsNull(words[9]) ? nullptr : TakePiece;
    return true;
}

sword Read::Fetch(const LobHandles& handles) {
    if (area_ != nullptr) std::memset(area_.get(), 0, length_);
    const CharacterSet& set = read_context.set;
    return Call(&ClientLibrary::OCILobRead, handles.svc, handles.error, handles.lob.locator, &amount_, offset_,
                area_.get(), length_, context_, callback_, set.id, set.form);
}

void Read::Print(sword rc) const {
    Line line;
    line.Format("rc=%d, amtp=%u", rc, amount_);
    if (callback_ != nullptr) return line.Character('\n').Print();
    line.Text(", bufp=");
    const size_t filled = area_ == nullptr ? 0 : FilledLength(read_context, area_.get(), length_, amount_);
    PrintPiece(line, read_context, area_.get(), filled);
}

// Each call that did not fail is shown; the trace line comes with the one that ends it.
void ReadLob(const CommandRow& row, int, char** words) {
    const LobHandles handles(words);
    Read read;
    if (!read.Set(words)) return;
    read_context = {handles.lob.Type(), CharacterSet(words + 10)};
    for (;;) {
        const sword rc = read.Fetch(handles);
        if (rc != OCI_NEED_DATA) TraceAndReport(row.code, words[3], handles.error, rc);
        if (rc != OCI_NEED_DATA && rc != OCI_SUCCESS) return;
        read.Print(rc);
        if (rc == OCI_SUCCESS) return;
    }
}

// --- Writing ---------------------------------------------------------------------------------------------------------

// The pieces of the write under way, in the order of its words.
class PieceList {
public:
    // False when a buffer is missing, which has been said.
    bool Fill(int count, char** names) {
        for (int index = 0; index < count; ++index) {
            const MemBuffer* const buffer = FindBuffer(names[index]);
            if (buffer == nullptr) return false;
            buffers_.push_back(buffer);
        }
        return true;
    }
    // The next piece, and what it is: null when all are taken.
    const MemBuffer* Take(ub1& piece) {
        if (next_ == buffers_.size()) return nullptr;
        piece = buffers_.size() == 1            ? OCI_ONE_PIECE
                : next_ == 0                    ? OCI_FIRST_PIECE
                : next_ == buffers_.size() - 1  ? OCI_LAST_PIECE
                                                : OCI_NEXT_PIECE;
        return buffers_[next_++];
    }
    size_t LongestPiece() const;
    void Clear() { *this = {}; }

private:
    std::vector<const MemBuffer*> buffers_;
    size_t next_ = 0;
};
PieceList pieces;

// The bytes of a buffer's first element that its length speaks of.
ub4 PieceLength(const MemBuffer& buffer) {
    return buffer.Complete() ? std::min<ub4>(LengthOf(buffer, 0), buffer.element_size) : 0;
}

size_t PieceList::LongestPiece() const {
    size_t longest = 0;
    for (const MemBuffer* buffer : buffers_) longest = std::max<size_t>(longest, PieceLength(*buffer));
    return longest;
}

const char* PieceName(ub1 piece) {    // one of these four
    constexpr const char* kNames[] = {"OCI_ONE_PIECE", "OCI_FIRST_PIECE", "OCI_NEXT_PIECE", "OCI_LAST_PIECE"};
    return kNames[piece];
}

void PrintWritten(ub4 length, ub1 piece) {
    Message(kOutput, "bufl=%u, piece=%s\n", length, PieceName(piece));
}

// The library tells how much its buffer takes, or has the length that the script gave it.
ub4 callback_room = 0;

sb4 GivePiece(void*, void* data, ub4* length, ub1* piece) {
    const MemBuffer* const buffer = pieces.Take(*piece);
    if (buffer == nullptr || data == nullptr) return OCI_ERROR;
    *length = std::min(PieceLength(*buffer), *length != 0 ? *length : callback_room);
    std::memcpy(data, buffer->Element(0), *length);
    PrintWritten(*length, *piece);
    return OCI_CONTINUE;
}

// What the words of a write make of its call, which is repeated while the library wants pieces.
class Write {
public:
    bool Set(char** words);  // false when the command ends here, which has been said
    sword Send(const LobHandles& handles);
    bool TakeNextPiece();    // false when there is none
    ub4 Amount() const { return amount_; }

private:
    void TakeFirstPiece();
    void Copy(const MemBuffer& buffer);

    ub4 amount_ = 0;
    ub4 offset_ = 0;
    Memory<char> area_;  // null where the script refuses it
    ub4 length_ = 0;
    ub1 piece_ = 0;
    void* context_ = nullptr;
    OCICallbackLobWrite callback_ = nullptr;
    CharacterSet set_;
};

bool Write::Set(char** words) {
    constexpr size_t kOwnArea = 100;
    amount_ = DecodeCount(words[4]);
    offset_ = DecodeCount(words[5]);
    length_ = callback_room = DecodeCount(words[7]);
    if (!IsNull(words[6]) && !Obtain(area_, std::max({kOwnArea, size_t{length_}, pieces.LongestPiece()}))) return false;
    piece_ = static_cast<ub1>(DecodeKeywordOrNumber(words[8], PieceKeywords));
    context_ = ContextOf(words[9]);
    callback_ = IsNull(words[10]) ? nullptr : GivePiece;
    set_ = CharacterSet(words + 11);
    if (callback_ == nullptr && area_ != nullptr) TakeFirstPiece();
    return true;
}

sword Write::Send(const LobHandles& handles) {
    return Call(&ClientLibrary::OCILobWrite, handles.svc, handles.error, handles.lob.locator, &amount_, offset_,
                area_.get(), length_, piece_, context_, callback_, set_.id, set_.form);
}

void Write::Copy(const MemBuffer& buffer) {
    length_ = PieceLength(buffer);
    if (area_ != nullptr) std::copy_n(buffer.Element(0), length_, area_.get());
}

// What kind of piece the first one is, the script has said.
void Write::TakeFirstPiece() {
    ub1 piece = 0;
    Copy(*pieces.Take(piece));
}

bool Write::TakeNextPiece() {
    ub1 piece = 0;
    const MemBuffer* const buffer = pieces.Take(piece);
    if (buffer == nullptr) return false;
    offset_ += length_;
    Copy(*buffer);
    piece_ = piece == OCI_LAST_PIECE || piece == OCI_ONE_PIECE ? OCI_LAST_PIECE : OCI_NEXT_PIECE;
    PrintWritten(length_, piece_);
    return true;
}

// The amount comes before the trace line.
void WritePieces(const CommandRow& row, char** words) {
    const LobHandles handles(words);
    Write write;
    if (!write.Set(words)) return;
    sword rc = write.Send(handles);
    while (rc == OCI_NEED_DATA && write.TakeNextPiece()) rc = write.Send(handles);
    if (rc == OCI_SUCCESS) Message(kOutput, "%ld\n", static_cast<long>(write.Amount()));
    TraceAndReport(row.code, words[3], handles.error, rc);
}

void WriteLob(const CommandRow& row, int count, char** words) {
    constexpr int kFirstBuffer = 14;
    const int buffers = DecodeNumber(words[kFirstBuffer - 1]);
    if (buffers == 0 || count - kFirstBuffer != buffers) return Message(kOutput, "Invalid value for #buffers\n");
    if (pieces.Fill(buffers, words + kFirstBuffer)) WritePieces(row, words);
    pieces.Clear();
}

constexpr PlainCommand kTransferCommands[] = {
    {{Code::ocilobread, Words(12), "OCILobRead hSvc hError hLob amtp offset bufp bufl ctxp cbfp csid csfrm"}, ReadLob},
    {{Code::ocilobwrite, WordsFrom(14),
      "OCILobWrite hSvc hError hLob amtp offset bufp bufl piece ctxp cbfp csid csfrm #buffers buf1 buf2 ..."},
     WriteLob},
};

}  // namespace

void AddLobTransferCommands(HandlerTable& handlers) {
    handlers.Add(kTransferCommands);
}
