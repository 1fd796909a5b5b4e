/* Character sets and the names of a language: environments in other sets than UTF-8, conversions, settings. Sets are
   known by their published numbers: 1, 31, 32, 46, 170, 171, 178, 871, 873, OCI_UTF16ID and 2000. */
#ifndef OCI_NLS_H
#define OCI_NLS_H

#include "oci_types.h"

/* Items of OCINlsGetInfo (texts), OCINlsNumericInfoGet (those of character sets) and OCINlsEnvironmentVariableGet (the
   two ids). Names of days, months and their short forms are numbered on from the first. */
#define OCI_NLS_DAYNAME1 1
#define OCI_NLS_DAYNAME2 2
#define OCI_NLS_DAYNAME3 3
#define OCI_NLS_DAYNAME4 4
#define OCI_NLS_DAYNAME5 5
#define OCI_NLS_DAYNAME6 6
#define OCI_NLS_DAYNAME7 7
#define OCI_NLS_ABDAYNAME1 8
#define OCI_NLS_ABDAYNAME2 9
#define OCI_NLS_ABDAYNAME3 10
#define OCI_NLS_ABDAYNAME4 11
#define OCI_NLS_ABDAYNAME5 12
#define OCI_NLS_ABDAYNAME6 13
#define OCI_NLS_ABDAYNAME7 14
#define OCI_NLS_MONTHNAME1 15
#define OCI_NLS_MONTHNAME2 16
#define OCI_NLS_MONTHNAME3 17
#define OCI_NLS_MONTHNAME4 18
#define OCI_NLS_MONTHNAME5 19
#define OCI_NLS_MONTHNAME6 20
#define OCI_NLS_MONTHNAME7 21
#define OCI_NLS_MONTHNAME8 22
#define OCI_NLS_MONTHNAME9 23
#define OCI_NLS_MONTHNAME10 24
#define OCI_NLS_MONTHNAME11 25
#define OCI_NLS_MONTHNAME12 26
#define OCI_NLS_ABMONTHNAME1 27
#define OCI_NLS_ABMONTHNAME12 38
#define OCI_NLS_AM 41
#define OCI_NLS_PM 42
#define OCI_NLS_AD 43
#define OCI_NLS_BC 44
#define OCI_NLS_DECIMAL 45
#define OCI_NLS_GROUP 46
#define OCI_NLS_DATEFORMAT 49
#define OCI_NLS_INT_CURRENCY 50
#define OCI_NLS_LOC_CURRENCY 51
#define OCI_NLS_LANGUAGE 52
#define OCI_NLS_TERRITORY 54
#define OCI_NLS_CHARACTER_SET 55
#define OCI_NLS_CHARSET_MAXBYTESZ 91
#define OCI_NLS_CHARSET_FIXEDWIDTH 92
#define OCI_NLS_CHARSET_ID 93
#define OCI_NLS_NCHARSET_ID 94
#define OCI_NLS_MAXBUFSZ 100

#ifdef __cplusplus
extern "C" {
#endif
#pragma GCC visibility push(default)

/* OCIEnvCreate with the sets of texts and of national ones; 0 is the locale's, and for national ones the other's. */
sword OCIEnvNlsCreate(OCIEnv **envOut, ub4 mode, CONST dvoid *memctx, OCIAllocFunction allocate,
                      OCIReallocFunction reallocate, OCIFreeFunction release, size_t extra, dvoid **extraOut,
                      ub2 charset, ub2 ncharset);

/* Names are NUL-terminated and in the environment's set. An unknown name is 0. */
ub2 OCINlsCharSetNameToId(dvoid *env, CONST OraText *name);
sword OCINlsCharSetIdToName(dvoid *env, OraText *buf, size_t buflen, ub2 id);
/* Lengths are bytes. What does not fit is left out whole, and the answer OCI_ERROR. */
sword OCINlsCharSetConvert(dvoid *env, OCIError *err, ub2 dstid, dvoid *dst, size_t dstlen, ub2 srcid, CONST dvoid *src,
                           size_t srclen, size_t *rsize);
sword OCINlsEnvironmentVariableGet(dvoid *value, size_t size, ub2 item, ub2 charset, size_t *rsize);
sword OCINlsGetInfo(dvoid *env, OCIError *err, OraText *buf, size_t buflen, ub2 item);
sword OCINlsNumericInfoGet(dvoid *env, OCIError *err, sb4 *value, ub2 item);
/* Between the environment's set and UTF-16 in native order, whose lengths are units; rsize is that of what was
   written. */
sword OCICharSetToUnicode(dvoid *env, ub2 *dst, size_t dstlen, CONST OraText *src, size_t srclen, size_t *rsize);
sword OCIUnicodeToCharSet(dvoid *env, OraText *dst, size_t dstlen, CONST ub2 *src, size_t srclen, size_t *rsize);

#pragma GCC visibility pop
#ifdef __cplusplus
}
#endif

#endif
