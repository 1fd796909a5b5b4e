/* Client services beside the call interface: memory statistics and XA. */
#ifndef KELPCI_H
#define KELPCI_H

#include "oci_types.h"
#include "xa.h"

#ifdef __cplusplus
extern "C" {
#endif

/* The diagnostics of the last XA call of a resource manager: 136 bytes, texts padded with blanks and not terminated. */
typedef struct SQLCA {
    char sqlcaid[8];      /* "SQLCA   " */
    sb4 sqlcabc;          /* size of this structure */
    sb4 sqlcode;          /* 0 done, 100 no data, below 0 the negative error number, else a warning */
    sb2 sqlerrml;         /* bytes used of sqlerrmc */
    char sqlerrmc[70];    /* the words behind the number's own text, cut */
    char sqlerrp[8];      /* who says it */
    sb4 sqlerrd[6];
    char sqlwarn[11];
    char sqlstate[5];
} SQLCA;

#pragma GCC visibility push(default)

/* Blocks of memory that the library still holds, in all environments. */
sb4 OCI_memGetMemCount(void);

/* Fills `*out` for the last XA call of this thread about the resource manager `rmid`. XA_OK; XAER_INVAL when `out` is null
   or there was no such call. */
int XaGetInfo(int rmid, SQLCA *out);

/* The XA switch. */
extern struct xa_switch_t rmXaSwitch;

#pragma GCC visibility pop
#ifdef __cplusplus
}
#endif

#endif
