/* Functions on LOBs, files, threads and transactions. */
#ifndef OCI_SERVICES_H
#define OCI_SERVICES_H

#include "oci_types.h"

#ifdef __cplusplus
extern "C" {
#endif
#pragma GCC visibility push(default)

/* LOBs. Amounts and offsets are characters for character LOBs, bytes for the others; offsets count from 1. */
sword OCILobAppend(OCISvcCtx *svc, OCIError *err, OCILobLocator *dst, OCILobLocator *src);
sword OCILobAssign(OCIEnv *env, OCIError *err, CONST OCILobLocator *src, OCILobLocator **dst);
sword OCILobLocatorAssign(OCISvcCtx *svc, OCIError *err, CONST OCILobLocator *src, OCILobLocator **dst);
sword OCILobClose(OCISvcCtx *svc, OCIError *err, OCILobLocator *lob);
sword OCILobCopy(OCISvcCtx *svc, OCIError *err, OCILobLocator *dst, OCILobLocator *src, ub4 amount, ub4 dstOffset,
                 ub4 srcOffset);
sword OCILobCreateTemporary(OCISvcCtx *svc, OCIError *err, OCILobLocator *lob, ub2 csid, ub1 csform, ub1 lobtype,
                            boolean cache, OCIDuration duration);
sword OCILobDisableBuffering(OCISvcCtx *svc, OCIError *err, OCILobLocator *lob);
sword OCILobEnableBuffering(OCISvcCtx *svc, OCIError *err, OCILobLocator *lob);
sword OCILobErase(OCISvcCtx *svc, OCIError *err, OCILobLocator *lob, ub4 *amount, ub4 offset);
sword OCILobFlushBuffer(OCISvcCtx *svc, OCIError *err, OCILobLocator *lob, ub4 flag);
sword OCILobFreeTemporary(OCISvcCtx *svc, OCIError *err, OCILobLocator *lob);
sword OCILobGetLength(OCISvcCtx *svc, OCIError *err, OCILobLocator *lob, ub4 *len);
sword OCILobIsEqual(OCIEnv *env, CONST OCILobLocator *x, CONST OCILobLocator *y, boolean *equal);
sword OCILobIsOpen(OCISvcCtx *svc, OCIError *err, OCILobLocator *lob, boolean *flag);
sword OCILobIsTemporary(OCIEnv *env, OCIError *err, OCILobLocator *lob, boolean *flag);
sword OCILobLocatorIsInit(OCIEnv *env, OCIError *err, CONST OCILobLocator *lob, boolean *flag);
sword OCILobOpen(OCISvcCtx *svc, OCIError *err, OCILobLocator *lob, ub1 mode);
sword OCILobRead(OCISvcCtx *svc, OCIError *err, OCILobLocator *lob, ub4 *amount, ub4 offset, dvoid *buf, ub4 bufLen,
                 dvoid *ctx, OCICallbackLobRead cb, ub2 csid, ub1 csform);
sword OCILobTrim(OCISvcCtx *svc, OCIError *err, OCILobLocator *lob, ub4 newLen);
sword OCILobWrite(OCISvcCtx *svc, OCIError *err, OCILobLocator *lob, ub4 *amount, ub4 offset, dvoid *buf, ub4 bufLen,
                  ub1 piece, dvoid *ctx, OCICallbackLobWrite cb, ub2 csid, ub1 csform);

sword OCILobWriteAppend(OCISvcCtx *svc, OCIError *err, OCILobLocator *lob, ub4 *amount, dvoid *buf, ub4 bufLen,
                        ub1 piece, dvoid *ctx, OCICallbackLobWrite cb, ub2 csid, ub1 csform);
sword OCILobCharSetForm(OCIEnv *env, OCIError *err, CONST OCILobLocator *lob, ub1 *csform);
sword OCILobCharSetId(OCIEnv *env, OCIError *err, CONST OCILobLocator *lob, ub2 *csid);
sword OCILobGetChunkSize(OCISvcCtx *svc, OCIError *err, OCILobLocator *lob, ub4 *size);
sword OCILobLoadFromFile(OCISvcCtx *svc, OCIError *err, OCILobLocator *dst, OCILobLocator *src, ub4 amount,
                         ub4 dstOffset, ub4 srcOffset);

/* Wide forms. An amount of characters counts before one of bytes; both are told of what was transferred. */
sword OCILobCopy2(OCISvcCtx *svc, OCIError *err, OCILobLocator *dst, OCILobLocator *src, oraub8 amount,
                  oraub8 dstOffset, oraub8 srcOffset);
sword OCILobErase2(OCISvcCtx *svc, OCIError *err, OCILobLocator *lob, oraub8 *amount, oraub8 offset);
sword OCILobGetLength2(OCISvcCtx *svc, OCIError *err, OCILobLocator *lob, oraub8 *len);
sword OCILobRead2(OCISvcCtx *svc, OCIError *err, OCILobLocator *lob, oraub8 *bytes, oraub8 *characters, oraub8 offset,
                  dvoid *buf, oraub8 bufLen, ub1 piece, dvoid *ctx, OCICallbackLobRead2 cb, ub2 csid, ub1 csform);
sword OCILobTrim2(OCISvcCtx *svc, OCIError *err, OCILobLocator *lob, oraub8 newLen);
sword OCILobWrite2(OCISvcCtx *svc, OCIError *err, OCILobLocator *lob, oraub8 *bytes, oraub8 *characters, oraub8 offset,
                   dvoid *buf, oraub8 bufLen, ub1 piece, dvoid *ctx, OCICallbackLobWrite2 cb, ub2 csid, ub1 csform);
sword OCILobWriteAppend2(OCISvcCtx *svc, OCIError *err, OCILobLocator *lob, oraub8 *bytes, oraub8 *characters,
                         dvoid *buf, oraub8 bufLen, ub1 piece, dvoid *ctx, OCICallbackLobWrite2 cb, ub2 csid,
                         ub1 csform);

/* Files; `hndl` is an environment or a session. Names and paths are NUL-terminated. */
sword OCIFileInit(dvoid *hndl, OCIError *err);
sword OCIFileTerm(dvoid *hndl, OCIError *err);
sword OCIFileOpen(dvoid *hndl, OCIError *err, OCIFileObject **out, OraText *name, OraText *path, ub4 mode, ub4 create,
                  ub4 type);
sword OCIFileClose(dvoid *hndl, OCIError *err, OCIFileObject *file);
sword OCIFileFlush(dvoid *hndl, OCIError *err, OCIFileObject *file);
sword OCIFileRead(dvoid *hndl, OCIError *err, OCIFileObject *file, dvoid *buf, ub4 bufLen, ub4 *bytesRead);
sword OCIFileWrite(dvoid *hndl, OCIError *err, OCIFileObject *file, dvoid *buf, ub4 bufLen, ub4 *bytesWritten);
sword OCIFileSeek(dvoid *hndl, OCIError *err, OCIFileObject *file, uword origin, ubig_ora offset, sb1 direction);
sword OCIFileExists(dvoid *hndl, OCIError *err, OraText *name, OraText *path, ub1 *flag);
sword OCIFileGetLength(dvoid *hndl, OCIError *err, OraText *name, OraText *path, ubig_ora *len);

/* Threads; `hndl` is an environment or a session. */
void OCIThreadProcessInit(void);
boolean OCIThreadIsMulti(void);
sword OCIThreadInit(dvoid *hndl, OCIError *err);
sword OCIThreadTerm(dvoid *hndl, OCIError *err);
sword OCIThreadMutexInit(dvoid *hndl, OCIError *err, OCIThreadMutex **mutex);
sword OCIThreadMutexDestroy(dvoid *hndl, OCIError *err, OCIThreadMutex **mutex);
sword OCIThreadMutexAcquire(dvoid *hndl, OCIError *err, OCIThreadMutex *mutex);
sword OCIThreadMutexRelease(dvoid *hndl, OCIError *err, OCIThreadMutex *mutex);
sword OCIThreadKeyInit(dvoid *hndl, OCIError *err, OCIThreadKey **key, OCIThreadKeyDestFunc destroy);
sword OCIThreadKeyDestroy(dvoid *hndl, OCIError *err, OCIThreadKey **key);
sword OCIThreadKeySet(dvoid *hndl, OCIError *err, OCIThreadKey *key, dvoid *value);
sword OCIThreadKeyGet(dvoid *hndl, OCIError *err, OCIThreadKey *key, dvoid **value);
sword OCIThreadIdInit(dvoid *hndl, OCIError *err, OCIThreadId **id);
sword OCIThreadIdDestroy(dvoid *hndl, OCIError *err, OCIThreadId **id);
sword OCIThreadIdSet(dvoid *hndl, OCIError *err, OCIThreadId *dst, OCIThreadId *src);
sword OCIThreadIdSetNull(dvoid *hndl, OCIError *err, OCIThreadId *id);
sword OCIThreadIdGet(dvoid *hndl, OCIError *err, OCIThreadId *id);
sword OCIThreadIdSame(dvoid *hndl, OCIError *err, OCIThreadId *a, OCIThreadId *b, boolean *same);
sword OCIThreadIdNull(dvoid *hndl, OCIError *err, OCIThreadId *id, boolean *isNull);
sword OCIThreadHndInit(dvoid *hndl, OCIError *err, OCIThreadHandle **handle);
sword OCIThreadHndDestroy(dvoid *hndl, OCIError *err, OCIThreadHandle **handle);
sword OCIThreadCreate(dvoid *hndl, OCIError *err, OCIThreadStartFunction start, dvoid *arg, OCIThreadId *id,
                      OCIThreadHandle *handle);
sword OCIThreadJoin(dvoid *hndl, OCIError *err, OCIThreadHandle *handle);
sword OCIThreadClose(dvoid *hndl, OCIError *err, OCIThreadHandle *handle);
sword OCIThreadHandleGet(dvoid *hndl, OCIError *err, OCIThreadHandle *handle);

/* Transactions; timeouts are seconds. OCITransMultiPrepare takes `branches` transactions and as many error handles. */
sword OCITransStart(OCISvcCtx *svc, OCIError *err, uword timeout, ub4 flags);
sword OCITransDetach(OCISvcCtx *svc, OCIError *err, ub4 flags);
sword OCITransPrepare(OCISvcCtx *svc, OCIError *err, ub4 flags);
sword OCITransForget(OCISvcCtx *svc, OCIError *err, ub4 flags);
sword OCITransCommit(OCISvcCtx *svc, OCIError *err, ub4 flags);
sword OCITransRollback(OCISvcCtx *svc, OCIError *err, ub4 flags);
sword OCITransMultiPrepare(OCISvcCtx *svc, ub4 branches, OCITrans **txns, OCIError **errs);

#pragma GCC visibility pop
#ifdef __cplusplus
}
#endif

#endif
