/* Scalar types, opaque handle types, the value structures with a public layout, and the types of callbacks.
   Sizes are those of a 64-bit system; no type here is a `long` but sbig_ora and ubig_ora. */
#ifndef OCI_TYPES_H
#define OCI_TYPES_H

#include <stddef.h>
#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

typedef int sword;  /* result of nearly every call */
typedef unsigned int uword;
typedef int eword;
typedef signed char sb1;
typedef unsigned char ub1;
typedef short sb2;
typedef unsigned short ub2;
typedef int sb4;
typedef unsigned int ub4;
typedef int64_t sb8;
typedef uint64_t ub8;
typedef sb8 orasb8;
typedef ub8 oraub8;
typedef long sbig_ora;  /* file lengths and offsets */
typedef unsigned long ubig_ora;
typedef int boolean;         /* TRUE or FALSE */
typedef unsigned char text;  /* also UTF-16 data; lengths are in bytes even then */
typedef ub2 utext;           /* a unit of UTF-16 data */

/* The ends of the scalar types. */
#define UB1MINVAL ((ub1)0)
#define UB1MAXVAL ((ub1)255)
#define SB1MINVAL ((sb1)-128)
#define SB1MAXVAL ((sb1)127)
#define UB2MINVAL ((ub2)0)
#define UB2MAXVAL ((ub2)65535)
#define SB2MINVAL ((sb2)-32768)
#define SB2MAXVAL ((sb2)32767)
#define UB4MINVAL ((ub4)0)
#define UB4MAXVAL ((ub4)4294967295u)
#define SB4MINVAL ((sb4)(-2147483647 - 1))
#define SB4MAXVAL ((sb4)2147483647)
#define UB8MINVAL ((ub8)0)
#define UB8MAXVAL ((ub8)UINT64_MAX)
#define SB8MINVAL ((sb8)INT64_MIN)
#define SB8MAXVAL ((sb8)INT64_MAX)
#define UWORDMINVAL ((uword)0)
#define UWORDMAXVAL ((uword)4294967295u)
#define SWORDMINVAL ((sword)(-2147483647 - 1))
#define SWORDMAXVAL ((sword)2147483647)
#define EWORDMINVAL ((eword)(-2147483647 - 1))
#define EWORDMAXVAL ((eword)2147483647)
typedef text OraText;
typedef text oratext;
typedef void dvoid;
#define CONST const

#ifndef TRUE
#define TRUE 1
#endif
#ifndef FALSE
#define FALSE 0
#endif

typedef ub2 OCIDuration;
typedef ub2 OCITypeCode;
typedef ub2 OCIPinOpt;
typedef sb4 OCITypeParamMode;
typedef sb2 OCIInd;
#define OCI_IND_NOTNULL 0
#define OCI_IND_NULL (-1)
#define OCI_IND_BADNULL (-2)
#define OCI_IND_NOTNULLABLE (-3)

/* Handles: made by OCIHandleAlloc and the calls that connect, prepare, bind and define; owned by the library. */
typedef struct OCIEnv OCIEnv;
typedef struct OCIError OCIError;
typedef struct OCISvcCtx OCISvcCtx;
typedef struct OCIStmt OCIStmt;
typedef struct OCIBind OCIBind;
typedef struct OCIDefine OCIDefine;
typedef struct OCIDescribe OCIDescribe;
typedef struct OCIServer OCIServer;
typedef struct OCISession OCISession;
typedef OCISession OCIAuthInfo;
typedef struct OCITrans OCITrans;
typedef struct OCIComplexObject OCIComplexObject;
typedef struct OCISecurity OCISecurity;
typedef struct OCISubscription OCISubscription;
typedef struct OCICPool OCICPool;
typedef struct OCISPool OCISPool;
typedef struct OCIAdmin OCIAdmin;
typedef struct OCIEvent OCIEvent;

/* Descriptors: made by OCIDescriptorAlloc. A file LOB is an OCILobLocator too. */
typedef struct OCILobLocator OCILobLocator;
typedef struct OCISnapshot OCISnapshot;
typedef struct OCIResult OCIResult;
typedef struct OCIParam OCIParam;
typedef struct OCIRowid OCIRowid;
typedef struct OCIDateTime OCIDateTime;
typedef struct OCIInterval OCIInterval;

/* Values and services whose layout is the library's own. */
typedef struct OCIString OCIString;
typedef struct OCIRaw OCIRaw;
typedef struct OCIFileObject OCIFileObject;
typedef struct OCIThreadMutex OCIThreadMutex;
typedef struct OCIThreadKey OCIThreadKey;
typedef struct OCIThreadId OCIThreadId;
typedef struct OCIThreadHandle OCIThreadHandle;

/* A decimal number. Byte 0: how many bytes follow; byte 1: sign and exponent; then at most 20 digits of base 100, most
   significant first. Positive: exponent byte 193 + e, digit bytes digit + 1. Negative: 62 - e, 101 - digit, and a
   closing byte 102 unless all 20 digits are used. Zero: 1, 128. */
#define OCI_NUMBER_SIZE 22
typedef struct OCINumber {
    ub1 OCINumberPart[OCI_NUMBER_SIZE];
} OCINumber;

/* A date and time of day, 8 bytes. Nothing checks the fields but OCIDateCheck. */
typedef struct OCITime {
    ub1 OCITimeHH;  /* 0 to 23 */
    ub1 OCITimeMI;  /* 0 to 59 */
    ub1 OCITimeSS;  /* 0 to 59 */
} OCITime;
typedef struct OCIDate {
    sb2 OCIDateYYYY;  /* -4712 to 9999, never 0 */
    ub1 OCIDateMM;    /* 1 to 12 */
    ub1 OCIDateDD;    /* 1 to 31 */
    OCITime OCIDateTime;
} OCIDate;

/* The parts of an OCIDate; each is a statement of its own. */
#define OCIDateGetTime(date, hour, min, sec) \
    { *(hour) = (date)->OCIDateTime.OCITimeHH; *(min) = (date)->OCIDateTime.OCITimeMI; \
      *(sec) = (date)->OCIDateTime.OCITimeSS; }
#define OCIDateGetDate(date, year, month, day) \
    { *(year) = (date)->OCIDateYYYY; *(month) = (date)->OCIDateMM; *(day) = (date)->OCIDateDD; }
#define OCIDateSetTime(date, hour, min, sec) \
    { (date)->OCIDateTime.OCITimeHH = (hour); (date)->OCIDateTime.OCITimeMI = (min); \
      (date)->OCIDateTime.OCITimeSS = (sec); }
#define OCIDateSetDate(date, year, month, day) \
    { (date)->OCIDateYYYY = (year); (date)->OCIDateMM = (month); (date)->OCIDateDD = (day); }

/* Callbacks answer OCI_CONTINUE to go on. The one for input stores a length; those for output the address of one. */
typedef sb4 (*OCICallbackInBind)(dvoid *ctx, OCIBind *bindp, ub4 iter, ub4 index,
                                 dvoid **bufpp, ub4 *alenp, ub1 *piecep, dvoid **indpp);
typedef sb4 (*OCICallbackOutBind)(dvoid *ctx, OCIBind *bindp, ub4 iter, ub4 index,
                                  dvoid **bufpp, ub4 **alenpp, ub1 *piecep, dvoid **indpp, ub2 **rcodepp);
typedef sb4 (*OCICallbackDefine)(dvoid *ctx, OCIDefine *defnp, ub4 iter,
                                 dvoid **bufpp, ub4 **alenpp, ub1 *piecep, dvoid **indpp, ub2 **rcodepp);
typedef sb4 (*OCICallbackLobRead)(dvoid *ctx, CONST dvoid *buf, ub4 len, ub1 piece);
typedef sb4 (*OCICallbackLobWrite)(dvoid *ctx, dvoid *buf, ub4 *lenp, ub1 *piecep);
typedef sb4 (*OCICallbackLobRead2)(dvoid *ctx, CONST dvoid *buf, oraub8 len, ub1 piece, dvoid **changedBuf,
                                   oraub8 *changedLen);
typedef sb4 (*OCICallbackLobWrite2)(dvoid *ctx, dvoid *buf, oraub8 *lenp, ub1 *piecep, dvoid **changedBuf,
                                    oraub8 *changedLen);

/* A failover callback may be registered with a server; there is no failover, so it is never called. */
typedef sb4 (*OCICallbackFailover)(dvoid *svc, dvoid *env, dvoid *ctx, ub4 type, ub4 event);
typedef struct OCIFocbkStruct {
    OCICallbackFailover callback_function;
    dvoid *fo_ctx;
} OCIFocbkStruct;

/* Memory functions of an environment, and the routines of the thread package. */
typedef dvoid *(*OCIAllocFunction)(dvoid *memctx, size_t size);
typedef dvoid *(*OCIReallocFunction)(dvoid *memctx, dvoid *memory, size_t size);
typedef void (*OCIFreeFunction)(dvoid *memctx, dvoid *memory);
typedef void (*OCIThreadKeyDestFunc)(dvoid *value);
typedef void (*OCIThreadStartFunction)(dvoid *arg);

#ifdef __cplusplus
}
#endif

#endif
