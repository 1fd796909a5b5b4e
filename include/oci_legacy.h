/* The version-7 calls over login and cursor data areas. The caller owns the areas; a result is 0 or a nonzero code that
   is also left in the area's `rc`. A text length of -1 means NUL-terminated. */
#ifndef OCI_LEGACY_H
#define OCI_LEGACY_H

#include "oci_types.h"

#ifdef __cplusplus
extern "C" {
#endif

/* One layout for logins and cursors, 88 bytes. */
typedef struct Cda_Def {
    sb2 v2_rc;      /* negative return code of the oldest form */
    ub2 ft;         /* function type of the statement */
    ub4 rpc;        /* rows processed */
    ub2 peo;        /* offset of a parse error */
    ub1 fc;         /* code of the last call */
    ub1 rcs1;
    ub2 rc;         /* return code; 1403 at the end of a fetch */
    ub1 wrn;        /* 1 some warning, 2 value truncated, 4 null ignored, 16 no where clause, 32 stored with errors */
    ub1 rcs2;
    sword rcs3;
    struct {
        struct {
            ub4 rcs4;
            ub2 rcs5;
            ub1 rcs6;
        } rd;
        ub4 rcs7;
        ub2 rcs8;
    } rid;          /* row id of the last row */
    sword ose;      /* error of the operating system */
    ub1 chk;
    dvoid *rcsp;    /* the library's own */
    ub1 rcs9[32];   /* fills the area to its size */
} Cda_Def;
typedef Cda_Def Lda_Def;
#define HDA_SIZE 512  /* bytes of a host data area */

#pragma GCC visibility push(default)

sword olog(Lda_Def *lda, ub1 *hda, text *user, sword userLen, text *pw, sword pwLen, text *db, sword dbLen, ub4 mode);
sword ologof(Lda_Def *lda);
sword oopen(Cda_Def *cursor, Lda_Def *lda, text *db, sword dbLen, sword areaSize, text *user, sword userLen);
sword oclose(Cda_Def *cursor);
sword oparse(Cda_Def *cursor, text *sql, sb4 sqlLen, sword deferred, ub4 language);
sword odescr(Cda_Def *cursor, sword pos, sb4 *dbSize, sb2 *dbType, sb1 *name, sb4 *nameLen, sb4 *dispSize, sb2 *prec,
             sb2 *scale, sb2 *nullOk);
sword odefin(Cda_Def *cursor, sword pos, ub1 *buf, sword bufLen, sword type, sword scale, sb2 *ind, text *fmt,
             sword fmtLen, sword fmtType, ub2 *rlen, ub2 *rcode);
sword odefinps(Cda_Def *cursor, ub1 opcode, sword pos, ub1 *bufOrCtx, sb4 bufLen, sword type, sword scale, sb2 *ind,
               text *fmt, sb4 fmtLen, sword fmtType, ub2 *rlen, ub2 *rcode, sb4 valueSkip, sb4 indSkip, sb4 lenSkip,
               sb4 rcodeSkip);
sword obndrv(Cda_Def *cursor, text *name, sword nameLen, ub1 *value, sword valueLen, sword type, sword scale, sb2 *ind,
             text *fmt, sword fmtLen, sword fmtType);
sword obndrn(Cda_Def *cursor, sword number, ub1 *value, sword valueLen, sword type, sword scale, sb2 *ind, text *fmt,
             sword fmtLen, sword fmtType);
sword obndra(Cda_Def *cursor, text *name, sword nameLen, ub1 *value, sword valueLen, sword type, sword scale, sb2 *ind,
             ub2 *alen, ub2 *rcode, ub4 maxElems, ub4 *curElems, text *fmt, sword fmtLen, sword fmtType);
sword obindps(Cda_Def *cursor, ub1 opcode, text *name, sb4 nameLen, ub1 *valueOrCtx, sb4 valueLen, sword type,
              sword scale, sb2 *ind, ub2 *alen, ub2 *rcode, sb4 valueSkip, sb4 indSkip, sb4 lenSkip, sb4 rcodeSkip,
              ub4 maxElems, ub4 *curElems, text *fmt, sb4 fmtLen, sword fmtType);
sword oexec(Cda_Def *cursor);
sword oexn(Cda_Def *cursor, sword iters, sword rowoff);
sword oexfet(Cda_Def *cursor, ub4 rows, sword cancel, sword exact);
sword ofetch(Cda_Def *cursor);
sword ofen(Cda_Def *cursor, sword rows);
sword ocan(Cda_Def *cursor);
sword oflng(Cda_Def *cursor, sword pos, ub1 *buf, sb4 bufLen, sword type, ub4 *retLen, sb4 offset);
sword ogetpi(Cda_Def *cursor, ub1 *piece, dvoid **ctx, ub4 *iter, ub4 *index);
sword osetpi(Cda_Def *cursor, ub1 piece, dvoid *buf, ub4 *len);
sword oopt(Cda_Def *cursor, sword rollbackOption, sword waitOption);
sword ocom(Lda_Def *lda);
sword orol(Lda_Def *lda);
sword ocon(Lda_Def *lda);
sword ocof(Lda_Def *lda);
sword obreak(Lda_Def *lda);
sword onbset(Lda_Def *lda);
sword onbclr(Lda_Def *lda);
sword onbtst(Lda_Def *lda);
sword odessp(Lda_Def *lda, text *object, size_t objectLen, ub1 *rsv1, size_t rsv1Len, ub1 *rsv2, size_t rsv2Len,
             ub2 *overload, ub2 *pos, ub2 *level, text **argName, ub2 *argNameLen, ub2 *type, ub1 *hasDefault,
             ub1 *mode, ub4 *size, sb2 *prec, sb2 *scale, ub1 *radix, ub4 *spare, ub4 *arraySize);
sword oermsg(sb2 code, text *buf);  /* the buffer has at least 512 bytes */
sword oerhms(Lda_Def *lda, sb2 code, text *buf, sword bufLen);
sword opinit(ub4 mode);
void sqllda(Lda_Def *lda);
void sqlld2(Lda_Def *lda, text *dbName, sb4 *dbNameLen);
sword OCISvcCtxToLda(OCISvcCtx *svc, OCIError *err, Lda_Def *lda);
sword OCILdaToSvcCtx(OCISvcCtx **svcOut, OCIError *err, Lda_Def *lda);

#pragma GCC visibility pop
#ifdef __cplusplus
}
#endif

#endif
