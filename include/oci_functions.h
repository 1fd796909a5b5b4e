/* Functions on environments, handles, connections, statements, binds and defines, and attributes.

   Rules of all functions here and in oci_values.h and oci_services.h: a `sword` result is a return code of
   oci_constants.h; what went wrong is read from the error handle with OCIErrorGet. A handle that is null or no living
   object of its kind is answered with OCI_INVALID_HANDLE and nothing is recorded. Lengths are in bytes and texts need
   no terminator where a length is given. What a function hands out through a pointer to a pointer stays the
   library's. */
#ifndef OCI_FUNCTIONS_H
#define OCI_FUNCTIONS_H

#include "oci_types.h"

#ifdef __cplusplus
extern "C" {
#endif
/* What is declared in these headers is what a library built with hidden symbols exports. */
#pragma GCC visibility push(default)

/* Environments, handles, descriptors. `extra` bytes of user memory come with the handle through `extraOut`. */
sword OCIEnvCreate(OCIEnv **envOut, ub4 mode, CONST dvoid *memctx, OCIAllocFunction allocate,
                   OCIReallocFunction reallocate, OCIFreeFunction release, size_t extra, dvoid **extraOut);
sword OCIEnvInit(OCIEnv **envOut, ub4 mode, size_t extra, dvoid **extraOut);
sword OCIInitialize(ub4 mode, CONST dvoid *memctx, OCIAllocFunction allocate, OCIReallocFunction reallocate,
                    OCIFreeFunction release);
sword OCITerminate(ub4 mode);
sword OCIHandleAlloc(CONST dvoid *parent, dvoid **out, ub4 type, size_t extra, dvoid **extraOut);
sword OCIHandleFree(dvoid *hndl, ub4 type);
sword OCIDescriptorAlloc(CONST dvoid *parent, dvoid **out, ub4 type, size_t extra, dvoid **extraOut);
sword OCIDescriptorFree(dvoid *desc, ub4 type);
sword OCIArrayDescriptorAlloc(CONST dvoid *parent, dvoid **array, ub4 type, ub4 count, size_t extra,
                              dvoid **extraOut);
sword OCIArrayDescriptorFree(dvoid **array, ub4 type);

/* Error records (recordno counts from 1; OCI_NO_DATA after the last), versions, breaking a running call.
   Five characters are stored at `sqlstate`, 10 bytes in a UTF-16 environment, without a terminator; callers give room
   for one. Null skips an output. A text that `bufsize` bytes do not hold is cut, and the answer OCI_ERROR. */
sword OCIErrorGet(dvoid *hndl, ub4 recordno, OraText *sqlstate, sb4 *code, OraText *buf, ub4 bufsize, ub4 type);
sword OCIServerVersion(dvoid *hndl, OCIError *err, OraText *buf, ub4 bufsize, ub1 type);
void OCIClientVersion(sword *major, sword *minor, sword *update, sword *patch, sword *port);
sword OCIPing(OCISvcCtx *svc, OCIError *err, ub4 mode);
sword OCIBreak(dvoid *svcOrServer, OCIError *err);
sword OCIReset(dvoid *svcOrServer, OCIError *err);

/* Servers, sessions, logon. */
sword OCILogon(OCIEnv *env, OCIError *err, OCISvcCtx **svcOut, CONST OraText *user, ub4 userLen,
               CONST OraText *pw, ub4 pwLen, CONST OraText *db, ub4 dbLen);
sword OCILogon2(OCIEnv *env, OCIError *err, OCISvcCtx **svcOut, CONST OraText *user, ub4 userLen,
                CONST OraText *pw, ub4 pwLen, CONST OraText *db, ub4 dbLen, ub4 mode);
sword OCILogoff(OCISvcCtx *svc, OCIError *err);
sword OCIServerAttach(OCIServer *srv, OCIError *err, CONST OraText *db, sb4 dbLen, ub4 mode);
sword OCIServerDetach(OCIServer *srv, OCIError *err, ub4 mode);
sword OCISessionBegin(OCISvcCtx *svc, OCIError *err, OCISession *ses, ub4 credentials, ub4 mode);
sword OCISessionEnd(OCISvcCtx *svc, OCIError *err, OCISession *ses, ub4 mode);
sword OCIPasswordChange(OCISvcCtx *svc, OCIError *err, CONST OraText *user, ub4 userLen, CONST OraText *oldPw,
                        ub4 oldLen, CONST OraText *newPw, sb4 newLen, ub4 mode);

/* Pools. The name handed out belongs to the pool handle. */
sword OCIConnectionPoolCreate(OCIEnv *env, OCIError *err, OCICPool *pool, OraText **nameOut, sb4 *nameLenOut,
                              CONST OraText *db, sb4 dbLen, ub4 min, ub4 max, ub4 incr, CONST OraText *user,
                              sb4 userLen, CONST OraText *pw, sb4 pwLen, ub4 mode);
sword OCIConnectionPoolDestroy(OCICPool *pool, OCIError *err, ub4 mode);
sword OCISessionPoolCreate(OCIEnv *env, OCIError *err, OCISPool *pool, OraText **nameOut, ub4 *nameLenOut,
                           CONST OraText *db, ub4 dbLen, ub4 min, ub4 max, ub4 incr, OraText *user, ub4 userLen,
                           OraText *pw, ub4 pwLen, ub4 mode);
sword OCISessionPoolDestroy(OCISPool *pool, OCIError *err, ub4 mode);
sword OCISessionGet(OCIEnv *env, OCIError *err, OCISvcCtx **svcOut, OCIAuthInfo *auth, OraText *poolOrDb,
                    ub4 poolLen, CONST OraText *tag, ub4 tagLen, OraText **tagOut, ub4 *tagLenOut, boolean *found,
                    ub4 mode);
sword OCISessionRelease(OCISvcCtx *svc, OCIError *err, OraText *tag, ub4 tagLen, ub4 mode);

/* Statements. */
sword OCIStmtPrepare(OCIStmt *stmt, OCIError *err, CONST OraText *sql, ub4 sqlLen, ub4 language, ub4 mode);
sword OCIStmtPrepare2(OCISvcCtx *svc, OCIStmt **stmtOut, OCIError *err, CONST OraText *sql, ub4 sqlLen,
                      CONST OraText *key, ub4 keyLen, ub4 language, ub4 mode);
sword OCIStmtRelease(OCIStmt *stmt, OCIError *err, CONST OraText *key, ub4 keyLen, ub4 mode);
sword OCIStmtExecute(OCISvcCtx *svc, OCIStmt *stmt, OCIError *err, ub4 iters, ub4 rowoff, CONST OCISnapshot *in,
                     OCISnapshot *out, ub4 mode);
sword OCIStmtFetch(OCIStmt *stmt, OCIError *err, ub4 rows, ub2 orientation, ub4 mode);
sword OCIStmtFetch2(OCIStmt *stmt, OCIError *err, ub4 rows, ub2 orientation, sb4 offset, ub4 mode);
sword OCIResultSetToStmt(OCIResult *rset, OCIError *err);
sword OCIStmtGetBindInfo(OCIStmt *stmt, OCIError *err, ub4 size, ub4 startloc, sb4 *found, OraText *names[],
                         ub1 nameLens[], OraText *indNames[], ub1 indLens[], ub1 dups[], OCIBind *binds[]);
sword OCIStmtGetNextResult(OCIStmt *stmt, OCIError *err, dvoid **result, ub4 *rtype, ub4 mode);
sword OCIStmtGetPieceInfo(OCIStmt *stmt, OCIError *err, dvoid **hndl, ub4 *type, ub1 *inOut, ub4 *iter, ub4 *idx,
                          ub1 *piece);
sword OCIStmtSetPieceInfo(dvoid *hndl, ub4 type, OCIError *err, CONST dvoid *buf, ub4 *len, ub1 piece,
                          CONST dvoid *ind, ub2 *rcode);

/* Binds and defines. Value, indicator, length and return-code areas stay the caller's and must live until the
   statement has run. */
sword OCIBindByName(OCIStmt *stmt, OCIBind **bind, OCIError *err, CONST OraText *name, sb4 nameLen, dvoid *value,
                    sb4 valueSize, ub2 type, dvoid *ind, ub2 *alen, ub2 *rcode, ub4 maxArrayLen, ub4 *curElements,
                    ub4 mode);
sword OCIBindByPos(OCIStmt *stmt, OCIBind **bind, OCIError *err, ub4 pos, dvoid *value, sb4 valueSize, ub2 type,
                   dvoid *ind, ub2 *alen, ub2 *rcode, ub4 maxArrayLen, ub4 *curElements, ub4 mode);
sword OCIDefineByPos(OCIStmt *stmt, OCIDefine **def, OCIError *err, ub4 pos, dvoid *value, sb4 valueSize, ub2 type,
                     dvoid *ind, ub2 *rlen, ub2 *rcode, ub4 mode);
/* The same with wide sizes and lengths. */
sword OCIBindByName2(OCIStmt *stmt, OCIBind **bind, OCIError *err, CONST OraText *name, sb4 nameLen, dvoid *value,
                     sb8 valueSize, ub2 type, dvoid *ind, ub4 *alen, ub2 *rcode, ub4 maxArrayLen, ub4 *curElements,
                     ub4 mode);
sword OCIBindByPos2(OCIStmt *stmt, OCIBind **bind, OCIError *err, ub4 pos, dvoid *value, sb8 valueSize, ub2 type,
                    dvoid *ind, ub4 *alen, ub2 *rcode, ub4 maxArrayLen, ub4 *curElements, ub4 mode);
sword OCIDefineByPos2(OCIStmt *stmt, OCIDefine **def, OCIError *err, ub4 pos, dvoid *value, sb8 valueSize, ub2 type,
                      dvoid *ind, ub4 *rlen, ub2 *rcode, ub4 mode);
sword OCIBindArrayOfStruct(OCIBind *b, OCIError *err, ub4 valueSkip, ub4 indSkip, ub4 lenSkip, ub4 rcodeSkip);
sword OCIDefineArrayOfStruct(OCIDefine *d, OCIError *err, ub4 valueSkip, ub4 indSkip, ub4 lenSkip, ub4 rcodeSkip);
sword OCIBindDynamic(OCIBind *b, OCIError *err, dvoid *inCtx, OCICallbackInBind in, dvoid *outCtx,
                     OCICallbackOutBind out);
sword OCIDefineDynamic(OCIDefine *d, OCIError *err, dvoid *ctx, OCICallbackDefine cb);

/* Describing, parameters (positions count from 1), attributes. */
sword OCIDescribeAny(OCISvcCtx *svc, OCIError *err, dvoid *object, ub4 objectLen, ub1 pointerType, ub1 infoLevel,
                     ub1 objectType, OCIDescribe *dsc);
sword OCIParamGet(CONST dvoid *hndl, ub4 type, OCIError *err, dvoid **paramOut, ub4 pos);
sword OCIAttrGet(CONST dvoid *hndl, ub4 type, dvoid *value, ub4 *size, ub4 attr, OCIError *err);
sword OCIAttrSet(dvoid *hndl, ub4 type, dvoid *value, ub4 size, ub4 attr, OCIError *err);

#pragma GCC visibility pop
#ifdef __cplusplus
}
#endif

#endif
