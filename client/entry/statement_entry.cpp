// Statements: prepare, release, execute, fetch, result sets, bind information, pieces.
#include "entry/call_text.h"
#include "handles/errors.h"
#include "handles/gate.h"
#include "sessions/service_context.h"
#include "statements/execute_locks.h"
#include "statements/result_set.h"
#include "statements/statement.h"
#include "statements/statement_cache.h"

namespace {

Status CheckSyntax(ub4 language) {
    const bool known = language == OCI_NTV_SYNTAX || language == OCI_V7_SYNTAX || language == OCI_V8_SYNTAX;
    return known ? Status() : Error(errors::kBadMode);
}

Status Prepare(Statement& statement, const OraText* sql, ub4 length, ub4 language, ub4 mode) {
    if (statement.from_prepare2) return Error(errors::kFromPrepare2);
    if (!sql || length == 0) return Error(errors::kNoText);
    if (Status status = CheckSyntax(language); !status.Ok()) return status;
    if (mode & ~ub4{OCI_UTF16}) return Error(errors::kBadMode);
    const CallText text(statement.Env(), sql, length, mode & OCI_UTF16);
    if (!text.Valid()) return Error(errors::kBadText);
    return text.View().empty() ? Error(errors::kNoText) : statement.Prepare(text.View());
}

Status Prepare2(ServiceContext& service, OCIStmt** out, const OraText* sql, ub4 length, const OraText* key,
                ub4 key_length, ub4 language, ub4 mode) {
    if (!out) return Error(errors::kNullArgument);
    if (Status status = CheckSyntax(language); !status.Ok()) return status;
    if (mode & ~ub4{OCI_PREP2_CACHE_SEARCHONLY | OCI_UTF16}) return Error(errors::kBadMode);
    const CallText text(service.Env(), sql, length, mode & OCI_UTF16);
    const CallText tag(service.Env(), key, key_length, mode & OCI_UTF16);
    if (!text.Valid() || !tag.Valid()) return Error(errors::kBadText);
    Statement* statement = nullptr;
    const bool search_only = mode & OCI_PREP2_CACHE_SEARCHONLY;
    Status status = PrepareThroughCache(service, {text.View(), tag.View(), search_only}, statement);
    if (!status.Failed()) *out = AsHandle<OCIStmt>(statement);
    return status;
}

Status ReleaseStatement(Statement& statement, const OraText* key, ub4 key_length, ub4 mode) {
    if (mode & ~ub4{OCI_STRLS_CACHE_DELETE}) return Error(errors::kBadMode);
    const CallText tag(statement.Env(), key, key_length, false);
    if (!tag.Valid()) return Error(errors::kBadText);
    return Release(statement, tag.View(), !(mode & OCI_STRLS_CACHE_DELETE));
}

sword Fetch(OCIStmt* stmt, OCIError* err, ub4 rows, ub2 orientation, sb4 offset, ub4 mode,
            const char* name = __builtin_FUNCTION()) {
    return EnterWithError<Statement>(stmt, err, [&](Statement& statement, ErrorHandle& error) {
        return mode == OCI_DEFAULT ? statement.Fetch(error, rows, orientation, offset) : Error(errors::kBadMode);
    }, name);
}

// A handle that a statement made serves no other, and lives no longer than it; one that the application allocated serves
// whoever took it.
template <class Handle>
Statement* StatementOf(const Handle& handle) {
    if (handle.Parent() != &handle.Env()) return static_cast<Statement*>(handle.Parent());
    const std::shared_ptr<StatementShare> owner = handle.area->Owner();
    return owner ? owner->Find() : nullptr;
}

// Holds the statement's lock alone, which the handle's is, too, as long as it belongs to it.
template <class Handle>
sword SetPiece(dvoid* object, OCIError* err, const PieceBuffer& piece, const char* name) {
    return EnterUnlocked<Handle>(object, err, [&](const Handle& handle) {
        Statement* const statement = StatementOf(handle);
        if (!statement) return Error(errors::kIllegalOperation);
        const SerialLock lock(*statement);
        // Without a session there is no lock, and nothing that could wait for a piece.
        const bool locked = !statement->Env().Threaded() || statement->Serial();
        return locked ? statement->SetPlace(*handle.area, piece) : Error(errors::kIllegalOperation);
    }, name);
}

}  // namespace

sword OCIStmtPrepare(OCIStmt* stmt, OCIError* err, const OraText* sql, ub4 sqlLen, ub4 language, ub4 mode) {
    return Enter<Statement>(stmt, err,
                            [&](Statement& statement) { return Prepare(statement, sql, sqlLen, language, mode); });
}

sword OCIStmtPrepare2(OCISvcCtx* svc, OCIStmt** stmtOut, OCIError* err, const OraText* sql, ub4 sqlLen,
                      const OraText* key, ub4 keyLen, ub4 language, ub4 mode) {
    return EnterUnlocked<ServiceContext>(svc, err, [&](ServiceContext& service) {
        return Prepare2(service, stmtOut, sql, sqlLen, key, keyLen, language, mode);
    });
}

sword OCIStmtRelease(OCIStmt* stmt, OCIError* err, const OraText* key, ub4 keyLen, ub4 mode) {
    return Enter<Statement>(stmt, err,
                            [&](Statement& statement) { return ReleaseStatement(statement, key, keyLen, mode); });
}

// Snapshots are not looked at: a query sees what is there when it is executed.
sword OCIStmtExecute(OCISvcCtx* svc, OCIStmt* stmt, OCIError* err, ub4 iters, ub4 rowoff, const OCISnapshot*,
                     OCISnapshot*, ub4 mode) {
    return EnterError(err, [&](ErrorHandle& error) {
        auto* service = Live<ServiceContext>(svc);
        auto* statement = service ? Live<Statement>(stmt) : nullptr;
        if (!statement) return InvalidHandle();
        const ExecuteArguments arguments{iters, rowoff, mode};
        const LongCall may_take_long;
        const ExecuteLocks locks(*service, *statement, arguments);
        return statement->Execute(locks.Target(), error, arguments);
    });
}

// Flat: with the gate in line, for it runs for every value that goes in pieces.
[[gnu::flatten]] sword OCIStmtFetch(OCIStmt* stmt, OCIError* err, ub4 rows, ub2 orientation, ub4 mode) {
    return Fetch(stmt, err, rows, orientation, 0, mode);
}

sword OCIStmtFetch2(OCIStmt* stmt, OCIError* err, ub4 rows, ub2 orientation, sb4 offset, ub4 mode) {
    return Fetch(stmt, err, rows, orientation, offset, mode);
}

// A cursor that a block opened is a statement already.
sword OCIResultSetToStmt(OCIResult* rset, OCIError* err) {
    return EnterError(err, [&](ErrorHandle&) {
        auto* result = Live<ResultSet>(rset);
        const Statement* statement = result ? result : Live<Statement>(rset);
        if (!statement) return InvalidHandle();
        if (!statement->HasResult()) return Error(errors::kBadResultSet);
        if (result) result->BecomeStatement();
        return Status();
    });
}

sword OCIStmtGetBindInfo(OCIStmt* stmt, OCIError* err, ub4 size, ub4 startloc, sb4* found, OraText* names[],
                         ub1 nameLens[], OraText* indNames[], ub1 indLens[], ub1 dups[], OCIBind* binds[]) {
    return Enter<Statement>(stmt, err, [&](Statement& statement) {
        return statement.GetBindInfo({size, startloc, found, names, nameLens, indNames, indLens, dups, binds});
    });
}

// No statement gives results beside its own rows and the cursors that it is handed.
sword OCIStmtGetNextResult(OCIStmt* stmt, OCIError* err, dvoid** result, ub4* rtype, ub4 mode) {
    return Enter<Statement>(stmt, err, [&](Statement&) {
        if (!result || !rtype) return Error(errors::kNullArgument);
        if (mode != OCI_DEFAULT) return Error(errors::kBadMode);
        *result = nullptr;
        *rtype = 0;
        return NoData();
    });
}

sword OCIStmtGetPieceInfo(OCIStmt* stmt, OCIError* err, dvoid** hndl, ub4* type, ub1* inOut, ub4* iter, ub4* idx,
                          ub1* piece) {
    return Enter<Statement>(stmt, err, [&](Statement& statement) {
        const WantedPiece* const wanted = statement.Wanted();
        if (!wanted) return Error(errors::kIllegalOperation);
        if (hndl) *hndl = wanted->area->Pointer();
        if (type) *type = wanted->area->HandleType();
        if (inOut) *inOut = wanted->out ? OCI_PARAM_OUT : OCI_PARAM_IN;
        if (iter) *iter = wanted->iteration;
        if (idx) *idx = wanted->index;
        if (piece) *piece = wanted->continued ? OCI_NEXT_PIECE : OCI_ONE_PIECE;
        return Status();
    });
}

sword OCIStmtSetPieceInfo(dvoid* hndl, ub4 type, OCIError* err, const dvoid* buf, ub4* len, ub1 piece, const dvoid* ind,
                          ub2* rcode) {
    const PieceBuffer buffer{const_cast<dvoid*>(buf), len, const_cast<dvoid*>(ind), rcode, piece, false};
    return type == OCI_HTYPE_BIND ? SetPiece<Bind>(hndl, err, buffer, __func__)
                                  : SetPiece<Define>(type == OCI_HTYPE_DEFINE ? hndl : nullptr, err, buffer, __func__);
}
