// The version-7 calls. Their gate is legacy/call.h: areas take the place of handles.
#include <string_view>

#include "legacy/bridges.h"
#include "legacy/cursors.h"
#include "legacy/options.h"
#include "legacy/logins.h"
#include "oci_legacy.h"
#include "sessions/service_context.h"
#include "xa/resource_manager.h"

sword olog(Lda_Def* lda, ub1* hda, text* user, sword userLen, text* pw, sword pwLen, text* db, sword dbLen, ub4 mode) {
    return legacy::LogOn(lda, hda != nullptr, {user, userLen}, {pw, pwLen}, {db, dbLen}, mode);
}

sword ologof(Lda_Def* lda) { return legacy::LogOff(lda); }
sword ocom(Lda_Def* lda) { return legacy::Commit(lda); }
sword orol(Lda_Def* lda) { return legacy::Rollback(lda); }
sword ocon(Lda_Def* lda) { return legacy::CommitEach(lda, true); }
sword ocof(Lda_Def* lda) { return legacy::CommitEach(lda, false); }
sword obreak(Lda_Def* lda) { return legacy::Break(lda); }
sword onbset(Lda_Def* lda) { return legacy::SetNonBlocking(lda, true); }
sword onbclr(Lda_Def* lda) { return legacy::SetNonBlocking(lda, false); }
sword onbtst(Lda_Def* lda) { return legacy::TestNonBlocking(lda); }

sword oopen(Cda_Def* cursor, Lda_Def* lda, text*, sword, sword, text*, sword) {
    return legacy::OpenCursor(cursor, lda);
}

sword oclose(Cda_Def* cursor) { return legacy::CloseCursor(cursor); }

sword oparse(Cda_Def* cursor, text* sql, sb4 sqlLen, sword deferred, ub4 language) {
    return legacy::Parse(cursor, sql, sqlLen, deferred != 0, language);
}

sword oexec(Cda_Def* cursor) { return legacy::Execute(cursor); }
sword oexn(Cda_Def* cursor, sword iters, sword rowoff) { return legacy::ExecuteRows(cursor, iters, rowoff); }
sword ofetch(Cda_Def* cursor) { return legacy::Fetch(cursor, 1); }
sword ofen(Cda_Def* cursor, sword rows) { return legacy::Fetch(cursor, rows); }
sword oopt(Cda_Def* cursor, sword rollbackOption, sword waitOption) {
    return legacy::SetOptions(cursor, rollbackOption, waitOption);
}

sword oflng(Cda_Def* cursor, sword pos, ub1* buf, sb4 bufLen, sword type, ub4* retLen, sb4 offset) {
    return legacy::ReadPart(cursor, pos, {buf, bufLen, type, retLen, offset});
}

sword ocan(Cda_Def* cursor) { return legacy::Cancel(cursor); }

sword odescr(Cda_Def* cursor, sword pos, sb4* dbSize, sb2* dbType, sb1* name, sb4* nameLen, sb4* dispSize, sb2* prec,
             sb2* scale, sb2* nullOk) {
    return legacy::Describe(cursor, pos, {dbSize, dbType, name, nameLen, dispSize, prec, scale, nullOk});
}

// Formats are for display types, which there are none of.
sword odefin(Cda_Def* cursor, sword pos, ub1* buf, sword bufLen, sword type, sword scale, sb2* ind, text*, sword, sword,
             ub2* rlen, ub2* rcode) {
    return legacy::Define(cursor, legacy::Function::odefin, pos, {buf, bufLen, type, scale, ind, rlen, rcode});
}

sword obndrv(Cda_Def* cursor, text* name, sword nameLen, ub1* value, sword valueLen, sword type, sword scale, sb2* ind,
             text*, sword, sword) {
    return legacy::BindName(cursor, legacy::Function::obndrv, {name, nameLen}, {value, valueLen, type, scale, ind}, {});
}

sword obndrn(Cda_Def* cursor, sword number, ub1* value, sword valueLen, sword type, sword scale, sb2* ind, text*, sword,
             sword) {
    return legacy::BindNumber(cursor, number, {value, valueLen, type, scale, ind});
}

sword obndra(Cda_Def* cursor, text* name, sword nameLen, ub1* value, sword valueLen, sword type, sword scale, sb2* ind,
             ub2* alen, ub2* rcode, ub4 maxElems, ub4* curElems, text*, sword, sword) {
    return legacy::BindName(cursor, legacy::Function::obndra, {name, nameLen},
                            {value, valueLen, type, scale, ind, alen, rcode}, {maxElems, curElems});
}

sword oermsg(sb2 code, text* buf) { return legacy::Message(nullptr, code, buf, 512); }
sword oerhms(Lda_Def* lda, sb2 code, text* buf, sword bufLen) { return legacy::Message(lda, code, buf, bufLen); }
sword opinit(ub4 mode) { return legacy::SetThreads(mode); }

sword oexfet(Cda_Def* cursor, ub4 rows, sword cancel, sword exact) {
    return legacy::ExecuteAndFetch(cursor, rows, cancel != 0, exact != 0);
}

sword odefinps(Cda_Def* cursor, ub1 opcode, sword pos, ub1* bufOrCtx, sb4 bufLen, sword type, sword scale, sb2* ind,
               text*, sb4, sword, ub2* rlen, ub2* rcode, sb4 valueSkip, sb4 indSkip, sb4 lenSkip, sb4 rcodeSkip) {
    const legacy::Steps steps{opcode, valueSkip, indSkip, lenSkip, rcodeSkip};
    return legacy::Define(cursor, legacy::Function::odefinps, pos, {bufOrCtx, bufLen, type, scale, ind, rlen, rcode},
                          &steps);
}

sword obindps(Cda_Def* cursor, ub1 opcode, text* name, sb4 nameLen, ub1* valueOrCtx, sb4 valueLen, sword type,
              sword scale, sb2* ind, ub2* alen, ub2* rcode, sb4 valueSkip, sb4 indSkip, sb4 lenSkip, sb4 rcodeSkip,
              ub4 maxElems, ub4* curElems, text*, sb4, sword) {
    const legacy::Steps steps{opcode, valueSkip, indSkip, lenSkip, rcodeSkip};
    return legacy::BindName(cursor, legacy::Function::obindps, {name, nameLen},
                            {valueOrCtx, valueLen, type, scale, ind, alen, rcode}, {maxElems, curElems}, &steps);
}

sword ogetpi(Cda_Def* cursor, ub1* piece, dvoid** ctx, ub4* iter, ub4* index) {
    return legacy::GetPiece(cursor, piece, ctx, iter, index);
}

sword osetpi(Cda_Def* cursor, ub1 piece, dvoid* buf, ub4* len) { return legacy::SetPiece(cursor, piece, buf, len); }

sword odessp(Lda_Def* lda, text* object, size_t, ub1*, size_t, ub1*, size_t, ub2*, ub2*, ub2*, text**, ub2*, ub2*, ub1*,
             ub1*, ub4*, sb2*, sb2*, ub1*, ub4*, ub4* arraySize) {
    return legacy::DescribeProcedure(lda, object, arraySize);
}

// Takes the locks that it needs itself: the session is lent under its own.
sword OCISvcCtxToLda(OCISvcCtx* svc, OCIError* err, Lda_Def* lda) {
    return EnterUnlocked<ServiceContext>(svc, err,
                                         [lda](ServiceContext& service) { return legacy::LendTo(lda, service); });
}

sword OCILdaToSvcCtx(OCISvcCtx** svcOut, OCIError* err, Lda_Def* lda) {
    return EnterError(err, [&](ErrorHandle& error) { return legacy::BringBack(lda, svcOut, error); });
}

void sqllda(Lda_Def* lda) { sqlld2(lda, nullptr, nullptr); }

// The connection of a name; a null one is that of the connection without a name.
void sqlld2(Lda_Def* lda, text* dbName, sb4* dbNameLen) {
    const CallInFlight call;
    OCISvcCtx* service = nullptr;
    (void)legacy::Guarded([&] {
        std::string_view name;
        const auto* const begin = reinterpret_cast<const char*>(dbName);
        if (dbName && dbNameLen && *dbNameLen < -1) return 0;
        if (dbName && dbNameLen && *dbNameLen >= 0) name = {begin, static_cast<std::size_t>(*dbNameLen)};
        else if (dbName) name = begin;
        if (const xa::ManagerPointer manager = xa::FindManager(name)) service = AsHandle<OCISvcCtx>(manager->GetService());
        return 0;
    });
    legacy::Borrow(lda, service);
}
