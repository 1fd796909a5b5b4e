// Large objects: everything but reading and writing. The wide forms do the same with 64-bit amounts.
#include <limits>

#include "entry/lob_calls.h"
#include "oci.h"
#include "values/lobs.h"

namespace {

using lobs::LargeObject;

// Calls on a locator that need no session: body(descriptor).
template <class Body>
sword EnterAlone(OCIEnv* env, OCIError* err, const OCILobLocator* pointer, const void* out, Body body,
                 const char* name = __builtin_FUNCTION()) {
    return EnterHandle(env, err, [&](Environment&) -> Status {
        LobDescriptor* descriptor = nullptr;
        if (Status status = FindLocator(pointer, descriptor); !status.Ok()) return status;
        return out ? body(*descriptor) : Error(errors::kNullArgument);
    }, name);
}

// The same of one that is filled: body(located).
template <class Body>
sword EnterFilled(OCIEnv* env, OCIError* err, const OCILobLocator* pointer, const void* out, Body body,
                 const char* name = __builtin_FUNCTION()) {
    return EnterAlone(env, err, pointer, out, [&](const LobDescriptor& descriptor) -> Status {
        const values::Located located = descriptor.Get();
        if (!located.lob) return Error(errors::kInvalidLocator);
        body(located);
        return {};
    }, name);
}

template <class Number>
sword GetLength(OCISvcCtx* svc, OCIError* err, OCILobLocator* lob, Number* out,
                const char* name = __builtin_FUNCTION()) {
    return EnterLob(svc, err, lob, [&](Link&, LargeObject& object) -> Status {
        if (!out) return Error(errors::kNullArgument);
        std::uint64_t units = 0;
        if (Status status = object.Length(units); status.Failed()) return status;
        if (units > std::numeric_limits<Number>::max()) return Error(errors::kPastLobLimit);
        *out = static_cast<Number>(units);
        return {};
    }, name);
}

sword Trim(OCISvcCtx* svc, OCIError* err, OCILobLocator* lob, std::uint64_t length,
                const char* name = __builtin_FUNCTION()) {
    return EnterLob(svc, err, lob, [&](Link& link, LargeObject& object) -> Status {
        Status status = lobs::CheckOpenForWriting(object, link);
        return status.Ok() ? object.Trim(length) : status;
    }, name);
}

template <class Number>
sword Erase(OCISvcCtx* svc, OCIError* err, OCILobLocator* lob, Number* amount, std::uint64_t offset,
                const char* name = __builtin_FUNCTION()) {
    return EnterLob(svc, err, lob, [&](Link& link, LargeObject& object) -> Status {
        if (!amount) return Error(errors::kNullArgument);
        if (offset == 0 || *amount == 0) return Error(errors::kBadLobParameter);
        if (Status status = lobs::CheckOpenForWriting(object, link); status.Failed()) return status;
        std::uint64_t units = *amount;
        Status status = object.Erase(offset - 1, units);
        if (status.Ok()) *amount = static_cast<Number>(units);
        return status;
    }, name);
}

sword Copy(OCISvcCtx* svc, OCIError* err, OCILobLocator* dst, OCILobLocator* src, std::uint64_t amount,
           std::uint64_t to_offset, std::uint64_t from_offset, const char* name = __builtin_FUNCTION()) {
    return EnterLobs(svc, err, dst, src, [&](Link& link, LargeObject& to, LargeObject& from) {
        return lobs::Copy(to, from, link, amount, to_offset, from_offset);
    }, name);
}

// The target may be given as a null pointer or hold one.
Status Assign(const OCILobLocator* src, OCILobLocator** dst) {
    LobDescriptor* from = nullptr;
    LobDescriptor* to = nullptr;
    Status status = FindLocator(src, from);
    if (status.Ok()) status = FindLocator(dst ? *dst : nullptr, to);
    return status.Ok() ? lobs::Assign(*to, *from) : status;
}

}  // namespace

// ---- What needs no session

sword OCILobIsEqual(OCIEnv* env, const OCILobLocator* x, const OCILobLocator* y, boolean* equal) {
    return EnterEnvironment(env, [&](Environment&) -> Status {
        LobDescriptor* one = nullptr;
        LobDescriptor* other = nullptr;
        Status status = FindLocator(x, one);
        if (status.Ok()) status = FindLocator(y, other);
        if (!status.Ok()) return status;
        if (!equal) return Error(errors::kNullArgument);
        const values::Located left = one->Get();
        const values::Located right = other->Get();
        *equal = left.lob && right.lob && left.lob->IsSame(*right.lob) ? TRUE : FALSE;
        return {};
    });
}

sword OCILobLocatorIsInit(OCIEnv* env, OCIError* err, const OCILobLocator* lob, boolean* flag) {
    return EnterAlone(env, err, lob, flag, [flag](const LobDescriptor& descriptor) -> Status {
        *flag = descriptor.Get().lob ? TRUE : FALSE;
        return {};
    });
}

sword OCILobIsTemporary(OCIEnv* env, OCIError* err, OCILobLocator* lob, boolean* flag) {
    return EnterFilled(env, err, lob, flag, [flag](const values::Located& located) {
        *flag = located.lob->IsTemporary() ? TRUE : FALSE;
    });
}

sword OCILobCharSetForm(OCIEnv* env, OCIError* err, const OCILobLocator* lob, ub1* csform) {
    return EnterFilled(env, err, lob, csform, [csform](const values::Located& located) {
        const bool binary = located.lob->Kind() == engine::LobKind::bytes;
        *csform = static_cast<ub1>(binary ? 0 : located.national ? SQLCS_NCHAR : SQLCS_IMPLICIT);
    });
}

sword OCILobCharSetId(OCIEnv* env, OCIError* err, const OCILobLocator* lob, ub2* csid) {
    constexpr ub2 kUtf8 = 873, kUtf16 = 2000;
    return EnterFilled(env, err, lob, csid, [csid](const values::Located& located) {
        const bool binary = located.lob->Kind() == engine::LobKind::bytes;
        *csid = binary ? ub2{0} : located.national ? kUtf16 : kUtf8;
    });
}

sword OCILobAssign(OCIEnv* env, OCIError* err, const OCILobLocator* src, OCILobLocator** dst) {
    return EnterHandle(env, err, [&](Environment&) { return Assign(src, dst); });
}

sword OCILobLocatorAssign(OCISvcCtx* svc, OCIError* err, const OCILobLocator* src, OCILobLocator** dst) {
    return EnterLocator(svc, err, src, [&](Link& link, const LobDescriptor& from) -> Status {
        const values::Located located = from.Get();
        if (located.session && located.session != link.lobs) return Error(errors::kForeignLocator);
        return Assign(src, dst);
    });
}

// ---- Temporary objects

sword OCILobCreateTemporary(OCISvcCtx* svc, OCIError* err, OCILobLocator* lob, ub2 csid, ub1 csform, ub1 lobtype,
                            boolean, OCIDuration dur) {
    return EnterLocator(svc, err, lob, [&](Link& link, LobDescriptor& descriptor) {
        return lobs::CreateTemporary(descriptor, link, {csid, csform, lobtype, dur});
    });
}

sword OCILobFreeTemporary(OCISvcCtx* svc, OCIError* err, OCILobLocator* lob) {
    return EnterLocator(svc, err, lob,
                        [](Link& link, LobDescriptor& descriptor) { return lobs::FreeTemporary(descriptor, link); });
}

// ---- Opening, buffering

sword OCILobOpen(OCISvcCtx* svc, OCIError* err, OCILobLocator* lob, ub1 mode) {
    return EnterLob(svc, err, lob, [mode](Link& link, LargeObject& object) { return lobs::Open(object, link, mode); });
}

sword OCILobClose(OCISvcCtx* svc, OCIError* err, OCILobLocator* lob) {
    return EnterLob(svc, err, lob, [](Link& link, LargeObject& object) { return lobs::Close(object, link); });
}

sword OCILobIsOpen(OCISvcCtx* svc, OCIError* err, OCILobLocator* lob, boolean* flag) {
    return EnterLob(svc, err, lob, [flag](Link& link, const LargeObject& object) -> Status {
        if (!flag) return Error(errors::kNullArgument);
        *flag = lobs::IsOpen(object, link) ? TRUE : FALSE;
        return {};
    });
}

sword OCILobEnableBuffering(OCISvcCtx* svc, OCIError* err, OCILobLocator* lob) {
    return EnterLob(svc, err, lob, [](Link& link, LargeObject& object) { return lobs::EnableBuffering(object, link); });
}

sword OCILobDisableBuffering(OCISvcCtx* svc, OCIError* err, OCILobLocator* lob) {
    return EnterLocator(svc, err, lob, [](Link& link, LobDescriptor& descriptor) -> Status {
        LargeObject object;
        Status status = lobs::Find(descriptor, link, object);
        return status.Ok() ? lobs::DisableBuffering(object, link) : status;
    });
}

sword OCILobFlushBuffer(OCISvcCtx* svc, OCIError* err, OCILobLocator* lob, ub4 flag) {
    return EnterLocator(svc, err, lob, [flag](Link& link, LobDescriptor& descriptor) -> Status {
        LargeObject object;
        Status status = lobs::Find(descriptor, link, object);
        return status.Ok() ? lobs::FlushBuffer(object, link, flag) : status;
    });
}

// ---- Lengths and copies

sword OCILobGetLength(OCISvcCtx* svc, OCIError* err, OCILobLocator* lob, ub4* len) {
    return GetLength(svc, err, lob, len);
}
sword OCILobGetLength2(OCISvcCtx* svc, OCIError* err, OCILobLocator* lob, oraub8* len) {
    return GetLength(svc, err, lob, len);
}
sword OCILobTrim(OCISvcCtx* svc, OCIError* err, OCILobLocator* lob, ub4 newLen) { return Trim(svc, err, lob, newLen); }
sword OCILobTrim2(OCISvcCtx* svc, OCIError* err, OCILobLocator* lob, oraub8 newLen) {
    return Trim(svc, err, lob, newLen);
}
sword OCILobErase(OCISvcCtx* svc, OCIError* err, OCILobLocator* lob, ub4* amount, ub4 offset) {
    return Erase(svc, err, lob, amount, offset);
}
sword OCILobErase2(OCISvcCtx* svc, OCIError* err, OCILobLocator* lob, oraub8* amount, oraub8 offset) {
    return Erase(svc, err, lob, amount, offset);
}
sword OCILobCopy(OCISvcCtx* svc, OCIError* err, OCILobLocator* dst, OCILobLocator* src, ub4 amount, ub4 dstOffset,
                 ub4 srcOffset) {
    return Copy(svc, err, dst, src, amount, dstOffset, srcOffset);
}
sword OCILobCopy2(OCISvcCtx* svc, OCIError* err, OCILobLocator* dst, OCILobLocator* src, oraub8 amount,
                  oraub8 dstOffset, oraub8 srcOffset) {
    return Copy(svc, err, dst, src, amount, dstOffset, srcOffset);
}

sword OCILobAppend(OCISvcCtx* svc, OCIError* err, OCILobLocator* dst, OCILobLocator* src) {
    return EnterLobs(svc, err, dst, src,
                     [](Link& link, LargeObject& to, LargeObject& from) { return lobs::Append(to, from, link); });
}

sword OCILobLoadFromFile(OCISvcCtx* svc, OCIError* err, OCILobLocator* dst, OCILobLocator*, ub4, ub4, ub4) {
    return EnterLob(svc, err, dst, [](Link&, LargeObject&) { return lobs::LoadFromFile(); });
}

sword OCILobGetChunkSize(OCISvcCtx* svc, OCIError* err, OCILobLocator* lob, ub4* size) {
    return EnterLob(svc, err, lob, [size](Link&, const LargeObject&) -> Status {
        if (!size) return Error(errors::kNullArgument);
        *size = static_cast<ub4>(lobs::kBlock);
        return {};
    });
}
