/* The callback for a server that fails over, which may be registered (OCI_ATTR_FOCBK of a server) and is never called:
   no session goes on anywhere else. */
#ifndef OCI_FAILOVER_H
#define OCI_FAILOVER_H

#include "oci_types.h"

/* What the session that is lost was about, and what happens: arguments of the callback. */
#define OCI_FO_NONE 1
#define OCI_FO_SESSION 2
#define OCI_FO_SELECT 4
#define OCI_FO_TXNAL 8
#define OCI_FO_END 1
#define OCI_FO_ABORT 2
#define OCI_FO_REAUTH 4
#define OCI_FO_BEGIN 8
#define OCI_FO_ERROR 16
#define OCI_FO_RETRY 25410 /* the callback's answer to OCI_FO_ERROR: try again */

typedef sb4 (*OCICallbackFailover)(dvoid *svcctx, dvoid *envctx, dvoid *fo_ctx, ub4 fo_type, ub4 fo_event);
typedef struct OCIFocbkStruct {
    OCICallbackFailover callback_function;
    dvoid *fo_ctx;
} OCIFocbkStruct;

#endif
