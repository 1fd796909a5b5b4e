// Reading and writing large objects: the amounts of each call as the rooms count them, and back.
#include "entry/lob_calls.h"
#include "lobs/streams.h"
#include "oci.h"

namespace {

using lobs::TransferArguments;
using lobs::Transferred;

// One amount, in units: of a piece of a stream in UTF-8 it tells bytes.
struct Narrow {
    ub4* amount;

    [[nodiscard]] bool Given() const { return amount != nullptr; }
    [[nodiscard]] lobs::Amount Announced(bool) const { return {*amount, false}; }
    void Tell(const Transferred& done) const {
        *amount = static_cast<ub4>(done.tells_bytes ? done.bytes : done.units);
    }
};

// Bytes and characters; of characters what is not 0 counts, that of characters first.
struct Wide {
    oraub8* bytes;
    oraub8* characters;

    [[nodiscard]] bool Given() const { return bytes || characters; }
    [[nodiscard]] lobs::Amount Announced(bool has_characters) const {
        if (has_characters && characters && *characters != 0) return {*characters, false};
        return {bytes ? *bytes : 0, true};
    }
    void Tell(const Transferred& done) const {
        if (bytes) *bytes = done.bytes;
        if (characters) *characters = done.units;
    }
};

using Transfer = Status (*)(LobDescriptor& descriptor, Link& link, const TransferArguments& arguments, const void* callback,
                            Transferred& done);

Status Read(LobDescriptor& descriptor, Link& link, const TransferArguments& arguments, const void* callback, Transferred& done) {
    return lobs::Read(descriptor, link, arguments, *static_cast<const lobs::TakePiece*>(callback), done);
}
Status Write(LobDescriptor& descriptor, Link& link, const TransferArguments& arguments, const void* callback, Transferred& done) {
    return lobs::Write(descriptor, link, arguments, *static_cast<const lobs::GivePiece*>(callback), done);
}

// The amount tells what was transferred, 0 where there was nothing to be read.
template <class Amounts>
sword Run(OCISvcCtx* svc, OCIError* err, OCILobLocator* lob, const Amounts& amounts, TransferArguments arguments,
          Transfer transfer, const void* callback, const char* name = __builtin_FUNCTION()) {
    return EnterLocator(svc, err, lob, [&](Link& link, LobDescriptor& descriptor) -> Status {
        if (!amounts.Given()) return Error(errors::kNullArgument);
        const values::Located located = descriptor.Get();
        const bool has_characters = located.lob && located.lob->Kind() == engine::LobKind::characters;
        arguments.amount = amounts.Announced(has_characters);
        Transferred done;
        Status status = transfer(descriptor, link, arguments, callback, done);
        const bool is_write_that_waits = transfer == Write && status.Code() == OCI_NEED_DATA;
        if (!status.Failed() && !is_write_that_waits) amounts.Tell(done);
        return status;
    }, name);
}

TransferArguments Arguments(std::uint64_t offset, void* buffer, std::uint64_t length, ub1 piece, ub2 csid, ub1 csform) {
    TransferArguments arguments;
    arguments.offset = offset;
    arguments.buffer = static_cast<char*>(buffer);
    arguments.length = length;
    arguments.piece = piece;
    arguments.character_set = csid;
    arguments.form = csform;
    return arguments;
}

lobs::TakePiece Taking(void* context, OCICallbackLobRead callback) {
    if (!callback) return {};
    return [=](const char* data, std::uint64_t length, ub1 piece, char*&, std::uint64_t&) {
        return callback(context, data, static_cast<ub4>(length), piece);
    };
}
lobs::TakePiece Taking(void* context, OCICallbackLobRead2 callback) {
    if (!callback) return {};
    return [=](const char* data, std::uint64_t length, ub1 piece, char*& next, std::uint64_t& room) {
        void* changed = nullptr;
        oraub8 changed_length = 0;
        const sb4 code = callback(context, data, length, piece, &changed, &changed_length);
        if (changed) next = static_cast<char*>(changed), room = changed_length;
        return code;
    };
}
lobs::GivePiece Giving(void* context, OCICallbackLobWrite callback) {
    if (!callback) return {};
    return [=](char* data, std::uint64_t& length, ub1& piece, char*&, std::uint64_t&) {
        auto narrow = static_cast<ub4>(length);
        const sb4 code = callback(context, data, &narrow, &piece);
        length = narrow;
        return code;
    };
}
lobs::GivePiece Giving(void* context, OCICallbackLobWrite2 callback) {
    if (!callback) return {};
    return [=](char* data, std::uint64_t& length, ub1& piece, char*& next, std::uint64_t& room) {
        void* changed = nullptr;
        oraub8 changed_length = 0;
        oraub8 wide = length;
        const sb4 code = callback(context, data, &wide, &piece, &changed, &changed_length);
        length = wide;
        if (changed) next = static_cast<char*>(changed), room = changed_length;
        return code;
    };
}

}  // namespace

sword OCILobRead(OCISvcCtx* svc, OCIError* err, OCILobLocator* lob, ub4* amount, ub4 offset, dvoid* buf, ub4 bufLen,
                 dvoid* ctx, OCICallbackLobRead cb, ub2 csid, ub1 csform) {
    const lobs::TakePiece take = Taking(ctx, cb);
    return Run(svc, err, lob, Narrow{amount}, Arguments(offset, buf, bufLen, OCI_ONE_PIECE, csid, csform), Read, &take);
}

sword OCILobRead2(OCISvcCtx* svc, OCIError* err, OCILobLocator* lob, oraub8* bytes, oraub8* characters, oraub8 offset,
                  dvoid* buf, oraub8 bufLen, ub1 piece, dvoid* ctx, OCICallbackLobRead2 cb, ub2 csid, ub1 csform) {
    const lobs::TakePiece take = Taking(ctx, cb);
    TransferArguments arguments = Arguments(offset, buf, bufLen, piece, csid, csform);
    arguments.never_polls = piece == OCI_ONE_PIECE;
    return Run(svc, err, lob, Wide{bytes, characters}, arguments, Read, &take);
}

sword OCILobWrite(OCISvcCtx* svc, OCIError* err, OCILobLocator* lob, ub4* amount, ub4 offset, dvoid* buf, ub4 bufLen,
                  ub1 piece, dvoid* ctx, OCICallbackLobWrite cb, ub2 csid, ub1 csform) {
    const lobs::GivePiece give = Giving(ctx, cb);
    return Run(svc, err, lob, Narrow{amount}, Arguments(offset, buf, bufLen, piece, csid, csform), Write, &give);
}

sword OCILobWrite2(OCISvcCtx* svc, OCIError* err, OCILobLocator* lob, oraub8* bytes, oraub8* characters, oraub8 offset,
                   dvoid* buf, oraub8 bufLen, ub1 piece, dvoid* ctx, OCICallbackLobWrite2 cb, ub2 csid, ub1 csform) {
    const lobs::GivePiece give = Giving(ctx, cb);
    return Run(svc, err, lob, Wide{bytes, characters}, Arguments(offset, buf, bufLen, piece, csid, csform), Write, &give);
}

sword OCILobWriteAppend(OCISvcCtx* svc, OCIError* err, OCILobLocator* lob, ub4* amount, dvoid* buf, ub4 bufLen,
                        ub1 piece, dvoid* ctx, OCICallbackLobWrite cb, ub2 csid, ub1 csform) {
    const lobs::GivePiece give = Giving(ctx, cb);
    TransferArguments arguments = Arguments(1, buf, bufLen, piece, csid, csform);
    arguments.appends = true;
    return Run(svc, err, lob, Narrow{amount}, arguments, Write, &give);
}

sword OCILobWriteAppend2(OCISvcCtx* svc, OCIError* err, OCILobLocator* lob, oraub8* bytes, oraub8* characters,
                         dvoid* buf, oraub8 bufLen, ub1 piece, dvoid* ctx, OCICallbackLobWrite2 cb, ub2 csid,
                         ub1 csform) {
    const lobs::GivePiece give = Giving(ctx, cb);
    TransferArguments arguments = Arguments(1, buf, bufLen, piece, csid, csform);
    arguments.appends = true;
    return Run(svc, err, lob, Wide{bytes, characters}, arguments, Write, &give);
}
