#include "lobs/streams.h"

#include <algorithm>
#include <cstring>

#include "handles/character_set.h"
#include "handles/environment.h"
#include "handles/errors.h"
#include "lobs/operations.h"

namespace lobs {
namespace {

enum class Form : std::uint8_t { bytes, utf8, other };

struct Stream {
    bool reads = false;
    bool in_callback = false;            // goes on by itself
    const LobDescriptor* descriptor = nullptr;
    LargeObject object;
    Form form = Form::bytes;
    const CharacterSet* set = nullptr;   // of the data, where it is neither bytes nor UTF-8
    Amount amount;                       // announced
    std::uint64_t at = 0;                // the next unit
    std::uint64_t byte = 0;              // where it is read
    std::uint64_t units = 0;             // transferred so far
    std::uint64_t bytes = 0;             // in the application's form
    std::string block;                   // read last; kept for its room
    std::string torn;                    // of units of two bytes: what the last piece began of a character
};

std::shared_ptr<Stream> StreamOf(const Link& link) { return std::static_pointer_cast<Stream>(link.lobs->stream); }

// Characters of the national form are UTF-16 where neither the call nor the environment names a set.
Status FindForm(const LobDescriptor& descriptor, const TransferArguments& arguments, Stream& stream) {
    if (!stream.object.HasCharacters()) return {};
    if (arguments.form > SQLCS_NCHAR) return Error(errors::kBadLobForm);
    const Environment::CharacterSets& sets = descriptor.Env().Sets();
    const bool national = arguments.form == SQLCS_NCHAR;
    stream.set = arguments.character_set != 0                 ? charset::Find(arguments.character_set)
                 : national && sets.national == sets.text ? charset::Find(OCI_UTF16ID)
                 : national                                   ? sets.national
                                                              : sets.text;
    if (!stream.set) return Error(errors::kBadCharacterSet);
    stream.form = charset::IsUtf8(*stream.set) ? Form::utf8 : Form::other;
    return {};
}

// The stream that a call goes on with; none where it begins one.
Status FindStream(Link& link, const LobDescriptor& descriptor, bool reads, std::shared_ptr<Stream>& stream) {
    if (!StreamGoesOn(link)) return {};
    stream = StreamOf(link);
    if (stream->reads != reads || stream->descriptor != &descriptor || stream->in_callback)
        return Error(errors::kStreamInProgress);
    return link.TakeCancel() ? Error(errors::kCancelled) : Status();
}

// A stream that a call works on shows as long as it waits or calls back, and ends with a failure.
class Working {
public:
    Working(Link& link, std::shared_ptr<Stream> stream) : lobs_(link.lobs), stream_(std::move(stream)) {
        lobs_->stream = stream_;
    }
    ~Working() {
        if (!waits_ && lobs_->stream == stream_) lobs_->stream = nullptr;
    }
    Working(const Working&) = delete;
    Working& operator=(const Working&) = delete;
    void Waits() { waits_ = true; }
    [[nodiscard]] bool Shows() const { return lobs_->stream == stream_; }    // the session goes on

private:
    const std::shared_ptr<values::LobSession> lobs_;
    const std::shared_ptr<Stream> stream_;
    bool waits_ = false;
};

// ---- Reading

std::uint64_t Left(const Stream& stream) {
    const std::uint64_t done = stream.amount.in_bytes ? stream.bytes : stream.units;
    return stream.amount.value == 0 ? ~std::uint64_t{0} : stream.amount.value - done;
}

// One block into the room; nothing where the next character does not fit. Of sets of their own so many characters as
// surely do, or one.
Status ReadBlock(Stream& stream, char* out, std::uint64_t room, Transferred& done) {
    const std::uint64_t left = Left(stream);
    if (stream.amount.in_bytes) room = std::min(room, left);
    std::uint64_t most_units = stream.amount.in_bytes ? room : left;
    std::uint64_t most_bytes = std::min<std::uint64_t>(room, kBlock);
    if (stream.form == Form::other) {
        const auto widest = static_cast<std::uint64_t>(charset::MostBytes(*stream.set));
        most_units = std::min(most_units, std::max<std::uint64_t>(room / widest, 1));
        most_bytes = kBlock;
    }
    std::string& block = stream.block;
    std::string converted;
    done = {};
    Status status = stream.object.Read(stream.byte, static_cast<std::size_t>(most_bytes), most_units, block, done.units);
    if (status.Failed()) return status;
    const std::size_t taken = block.size();
    if (stream.form == Form::other) {
        if (!charset::FromUtf8(*stream.set, block, converted)) return Error(errors::kConversionFailed);
        if (converted.size() > room) return done = {}, Status();
        block.swap(converted);
    }
    done.bytes = block.size();
    if (!block.empty()) std::memcpy(out, block.data(), block.size());
    stream.byte += taken;
    return status;
}

// Fills the room with what is wanted; `ends` when nothing is behind it.
Status ReadPiece(Stream& stream, char* out, std::uint64_t room, Transferred& piece, bool& ends) {
    piece = {};
    for (;;) {
        Transferred block;
        Status status = ReadBlock(stream, out + piece.bytes, room - piece.bytes, block);
        if (status.Failed()) return status;
        piece.units += block.units;
        piece.bytes += block.bytes;
        stream.units += block.units;
        stream.bytes += block.bytes;
        std::uint64_t length = 0;
        if (status = stream.object.Lob().Length(length); status.Failed()) return status;
        ends = stream.byte >= length || Left(stream) == 0;
        stream.object.Remember(stream.at + stream.units, stream.byte);
        if (ends || (block.bytes == 0 && piece.bytes > 0)) return status;
        if (block.bytes == 0) return Error(errors::kAmountTooLarge);
        if (piece.bytes == room) return status;
    }
}

Status StartReading(LobDescriptor& descriptor, Link& link, const TransferArguments& arguments, Stream& stream) {
    if (Status status = Find(descriptor, link, stream.object); status.Failed()) return status;
    if (arguments.offset == 0) return Error(errors::kBadLobParameter);
    if (Status status = FindForm(descriptor, arguments, stream); status.Failed()) return status;
    if (Status status = Flush(stream.object); status.Failed()) return status;
    stream.reads = true;
    stream.descriptor = &descriptor;
    stream.amount = arguments.amount;
    std::uint64_t length = 0;
    if (Status status = stream.object.Seek(arguments.offset - 1, stream.byte, stream.at); status.Failed()) return status;
    if (Status status = stream.object.Lob().Length(length); status.Failed()) return status;
    return stream.at < arguments.offset - 1 || stream.byte == length ? NoData() : Status();
}

Status ReadThroughCallback(Stream& stream, Working& working, Link& link, const TransferArguments& arguments,
                           const TakePiece& take, Transferred& done) {
    std::string own(arguments.buffer ? 0 : arguments.length > 0 ? arguments.length : kBlock, '\0');
    char* buffer = arguments.buffer ? arguments.buffer : own.data();
    std::uint64_t room = arguments.buffer ? arguments.length : own.size();
    stream.in_callback = true;
    for (bool ends = false, first = true; !ends; first = false) {
        Transferred piece;
        if (link.TakeCancel()) return Error(errors::kCancelled);
        if (Status status = ReadPiece(stream, buffer, room, piece, ends); status.Failed()) return status;
        const ub1 kind = ends ? OCI_LAST_PIECE : first ? OCI_FIRST_PIECE : OCI_NEXT_PIECE;
        if (take(buffer, piece.bytes, kind, buffer, room) != OCI_CONTINUE) return Error(errors::kReadCallbackFailed);
        if (!working.Shows()) return Error(errors::kNotConnected);
    }
    done = {stream.units, stream.bytes, false};
    return {};
}

// ---- Writing

// Data of the application as the object keeps them, with how many units they are.
Status Incoming(Stream& stream, std::string_view data, bool last, std::string& converted, std::string_view& kept) {
    kept = data;
    if (stream.form != Form::other) return {};
    if (!charset::PartToUtf8(*stream.set, data, last, stream.torn, converted)) return Error(errors::kConversionFailed);
    kept = converted;
    return {};
}

// Of an announced amount.
Status CheckAnnounced(const Stream& stream, std::uint64_t units, std::uint64_t bytes, bool last) {
    const std::uint64_t announced = stream.amount.value;
    if (announced == 0) return {};
    const bool fits = stream.bytes + bytes <= announced || (!stream.amount.in_bytes && stream.units + units <= announced);
    if (!fits) return Error(errors::kMoreThanAnnounced);
    const bool matches = stream.bytes + bytes == announced || stream.units + units == announced;
    return last && !matches ? Error(errors::kLessThanAnnounced) : Status();
}

Status WritePiece(Stream& stream, std::string_view data, bool last) {
    std::string converted;
    std::string_view kept;
    if (Status status = Incoming(stream, data, last, converted, kept); status.Failed()) return status;
    const std::uint64_t units = stream.form == Form::bytes ? kept.size() : CountCharacters(kept);
    const Status announced = CheckAnnounced(stream, units, data.size(), last);
    if (announced.Number() == errors::kMoreThanAnnounced) return announced;
    Status status = stream.object.State().buffer ? WriteIntoBuffer(stream.object, stream.at, kept, units)
                    : kept.empty()               ? stream.object.Lob().CheckWrite()
                                                 : stream.object.Replace(stream.at, kept, units);
    if (status.Failed()) return status;
    stream.at += units;
    stream.units += units;
    stream.bytes += data.size();
    return announced;
}

Status StartWriting(LobDescriptor& descriptor, Link& link, const TransferArguments& arguments, Stream& stream) {
    if (Status status = Find(descriptor, link, stream.object); status.Failed()) return status;
    if (arguments.offset == 0) return Error(errors::kBadLobParameter);
    if (Status status = FindForm(descriptor, arguments, stream); status.Failed()) return status;
    if (Status status = CheckOpenForWriting(stream.object, link); status.Failed()) return status;
    if (Status status = stream.object.Lob().CheckWrite(); status.Failed()) return status;
    stream.descriptor = &descriptor;
    stream.amount = arguments.amount;
    stream.at = arguments.offset - 1;
    return arguments.appends ? stream.object.Length(stream.at) : Status();
}

// What of the buffer is meant by a write of one piece: an amount of more than its characters counts bytes.
Status CutToAmount(const Stream& stream, const TransferArguments& arguments, std::string_view& data) {
    const std::uint64_t amount = arguments.amount.value;
    if (amount > data.size()) return Error(errors::kInputTooShort);
    if (amount == 0) return {};
    if (stream.form == Form::bytes || arguments.amount.in_bytes) {
        data = data.substr(0, static_cast<std::size_t>(amount));
    } else if (stream.form == Form::utf8) {
        std::size_t end = 0;
        for (std::uint64_t units = 0; end < data.size(); ++end) {
            const bool begins = (static_cast<unsigned char>(data[end]) & 0xC0) != 0x80;
            if (begins && units++ == amount) break;
        }
        data = data.substr(0, end);
    } else {
        const bool pairs = charset::IsUtf16(*stream.set);
        const std::size_t width = pairs ? 2 : 1;
        std::size_t end = 0;
        for (std::uint64_t units = 0; end + width <= data.size() && units < amount; ++units)
            end += pairs && charset::BeginsPair(*stream.set, data.substr(end)) ? 2 * width : width;
        data = data.substr(0, end);
    }
    return {};
}

Status WriteThroughCallback(Stream& stream, Working& working, Link& link, const TransferArguments& arguments,
                            const GivePiece& give) {
    std::string own(arguments.buffer ? 0 : arguments.length > 0 ? arguments.length : kBlock, '\0');
    char* buffer = arguments.buffer ? arguments.buffer : own.data();
    std::uint64_t room = arguments.buffer ? arguments.length : own.size();
    stream.in_callback = true;
    for (bool last = false; !last;) {
        if (link.TakeCancel()) return Error(errors::kCancelled);
        std::uint64_t length = room;
        ub1 piece = OCI_NEXT_PIECE;
        char* next = buffer;
        std::uint64_t next_room = room;
        if (give(buffer, length, piece, next, next_room) != OCI_CONTINUE) return Error(errors::kReadCallbackFailed);
        if (!working.Shows()) return Error(errors::kNotConnected);
        if (length > room || piece > OCI_LAST_PIECE) return Error(errors::kBadLobParameter);
        last = piece == OCI_LAST_PIECE || piece == OCI_ONE_PIECE;
        if (Status status = WritePiece(stream, {buffer, static_cast<std::size_t>(length)}, last); status.Failed()) return status;
        buffer = next;
        room = next_room;
    }
    return {};
}

}  // namespace

bool StreamGoesOn(Link& link) {
    const std::shared_ptr<Stream> stream = StreamOf(link);
    if (!stream) return false;
    if (stream->in_callback) return true;
    const auto* descriptor = Live<LobDescriptor>(stream->descriptor);
    if (descriptor && descriptor->Get().lob == stream->object.Located().lob) return true;
    link.lobs->stream = nullptr;
    return false;
}

Status Read(LobDescriptor& descriptor, Link& link, const TransferArguments& arguments, const TakePiece& take,
            Transferred& done) {
    std::shared_ptr<Stream> stream;
    if (Status status = FindStream(link, descriptor, true, stream); status.Failed()) {
        if (status.Number() == errors::kCancelled) link.lobs->stream = nullptr;
        return status;
    }
    const bool goes_on = stream != nullptr;
    if (!goes_on) {
        stream = std::make_shared<Stream>();
        if (Status status = StartReading(descriptor, link, arguments, *stream); !status.Ok()) return status;
    }
    if (!take && (!arguments.buffer || arguments.length == 0)) return Error(errors::kBadReadParameter);
    const bool buffers = stream->object.State().buffer.has_value();
    if (take && buffers) return Error(errors::kNoStreamWhenBuffered);
    Working working(link, stream);
    if (take) return ReadThroughCallback(*stream, working, link, arguments, take, done);
    bool ends = false;
    Status status = ReadPiece(*stream, arguments.buffer, arguments.length, done, ends);
    ends |= arguments.never_polls;
    done.tells_bytes = stream->form == Form::utf8 && (goes_on || !ends);
    if (status.Failed() || ends) return status;
    if (buffers) return Error(errors::kNoStreamWhenBuffered);
    working.Waits();
    return NeedData(errors::kWantsBuffer);
}

Status Write(LobDescriptor& descriptor, Link& link, const TransferArguments& arguments, const GivePiece& give,
             Transferred& done) {
    std::shared_ptr<Stream> stream;
    if (Status status = FindStream(link, descriptor, false, stream); status.Failed()) {
        if (status.Number() == errors::kCancelled) link.lobs->stream = nullptr;
        return status;
    }
    const bool one = !give && arguments.piece == OCI_ONE_PIECE;
    if (stream && arguments.piece != OCI_NEXT_PIECE && arguments.piece != OCI_LAST_PIECE)
        return Error(errors::kStreamInProgress);
    if (!stream) {
        stream = std::make_shared<Stream>();
        if (Status status = StartWriting(descriptor, link, arguments, *stream); status.Failed()) return status;
        if (!give && !one && arguments.piece != OCI_FIRST_PIECE) return Error(errors::kBadLobParameter);
    }
    if (!give && !arguments.buffer) return Error(errors::kBadLobParameter);
    if (stream->object.State().buffer && !one) return Error(errors::kNoStreamWhenBuffered);
    Working working(link, stream);
    Status status;
    const bool last = one || arguments.piece == OCI_LAST_PIECE;
    if (give) {
        status = WriteThroughCallback(*stream, working, link, arguments, give);
    } else {
        std::string_view data(arguments.buffer, static_cast<std::size_t>(arguments.length));
        if (one) {
            status = CutToAmount(*stream, arguments, data);
            stream->amount = {};
        }
        if (status.Ok()) status = WritePiece(*stream, data, last);
    }
    if (status.Failed()) return status;
    done = {stream->units, stream->bytes, false};
    if (give || last) return status;
    working.Waits();
    return NeedData(errors::kWantsPiece);
}

}  // namespace lobs
