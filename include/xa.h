/* The XA interface between a transaction manager and a resource manager, and the client library's bridge from an XA
   connection to its call-interface handles. */
#ifndef XA_H
#define XA_H

#include "oci_types.h"

#ifdef __cplusplus
extern "C" {
#endif

#define XIDDATASIZE 128
#define MAXGTRIDSIZE 64
#define MAXBQUALSIZE 64
#define RMNAMESZ 32
#define MAXINFOSIZE 256

/* A transaction branch: gtrid_length bytes of `data` name the global transaction, the bqual_length bytes behind them
   the branch. The three fields have 32 bits on every system, so that an XID is 140 bytes everywhere. */
struct xid_t {
    sb4 formatID;  /* -1: null XID */
    sb4 gtrid_length;
    sb4 bqual_length;
    char data[XIDDATASIZE];
};
typedef struct xid_t XID;

/* The `long` of the switch, as a library compiled from the published declaration has it. */
typedef long xa_long;

struct xa_switch_t {
    char name[RMNAMESZ];
    xa_long flags;
    xa_long version;  /* 0 */
    int (*xa_open_entry)(char *info, int rmid, xa_long flags);
    int (*xa_close_entry)(char *info, int rmid, xa_long flags);
    int (*xa_start_entry)(XID *xid, int rmid, xa_long flags);
    int (*xa_end_entry)(XID *xid, int rmid, xa_long flags);
    int (*xa_rollback_entry)(XID *xid, int rmid, xa_long flags);
    int (*xa_prepare_entry)(XID *xid, int rmid, xa_long flags);
    int (*xa_commit_entry)(XID *xid, int rmid, xa_long flags);
    int (*xa_recover_entry)(XID *xids, xa_long count, int rmid, xa_long flags);
    int (*xa_forget_entry)(XID *xid, int rmid, xa_long flags);
    int (*xa_complete_entry)(int *handle, int *retval, int rmid, xa_long flags);
};

/* Flags of the switch. */
#define TMNOFLAGS 0x00000000L
#define TMREGISTER 0x00000001L
#define TMNOMIGRATE 0x00000002L
#define TMUSEASYNC 0x00000004L

/* Flags of a call. */
#define TMASYNC 0x80000000L
#define TMONEPHASE 0x40000000L
#define TMFAIL 0x20000000L
#define TMNOWAIT 0x10000000L
#define TMRESUME 0x08000000L
#define TMSUCCESS 0x04000000L
#define TMSUSPEND 0x02000000L
#define TMSTARTRSCAN 0x01000000L
#define TMENDRSCAN 0x00800000L
#define TMMULTIPLE 0x00400000L
#define TMJOIN 0x00200000L
#define TMMIGRATE 0x00100000L

/* Results of ax_reg and ax_unreg. */
#define TM_JOIN 2
#define TM_RESUME 1
#define TM_OK 0
#define TMER_TMERR (-1)
#define TMER_INVAL (-2)
#define TMER_PROTO (-3)

/* Results of a call: rolled back, otherwise done, errors. */
#define XA_RBBASE 100
#define XA_RBROLLBACK 100
#define XA_RBCOMMFAIL 101
#define XA_RBDEADLOCK 102
#define XA_RBINTEGRITY 103
#define XA_RBOTHER 104
#define XA_RBPROTO 105
#define XA_RBTIMEOUT 106
#define XA_RBTRANSIENT 107
#define XA_RBEND 107
#define XA_NOMIGRATE 9
#define XA_HEURHAZ 8
#define XA_HEURCOM 7
#define XA_HEURRB 6
#define XA_HEURMIX 5
#define XA_RETRY 4
#define XA_RDONLY 3
#define XA_OK 0
#define XAER_ASYNC (-2)
#define XAER_RMERR (-3)
#define XAER_NOTA (-4)
#define XAER_INVAL (-5)
#define XAER_PROTO (-6)
#define XAER_RMFAIL (-7)
#define XAER_DUPID (-8)
#define XAER_OUTSIDE (-9)

/* Supplied by the transaction manager. */
int ax_reg(int rmid, XID *xid, xa_long flags);
int ax_unreg(int rmid, xa_long flags);

#pragma GCC visibility push(default)

/* The handles of the connection opened under a name (the DB field of its open string; null: the default one). They stay
   the library's. */
OCIEnv *xaoEnv(OraText *dbname);
OCISvcCtx *xaoSvcCtx(OraText *dbname);
/* The XA result that stands for an error number. */
int xaosterr(OCISvcCtx *svc, sb4 error);

#pragma GCC visibility pop
#ifdef __cplusplus
}
#endif

#endif
