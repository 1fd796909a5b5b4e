/* Attributes read by OCIAttrGet and set by OCIAttrSet. Behind each: the objects that have it, its shape, and R or W for
   readable or settable. Integers are passed by address; texts as characters with a length in bytes; handles by the
   address of a pointer when read, as the pointer itself when set. One number may serve several attributes: the object
   decides. */
#ifndef OCI_ATTRIBUTES_H
#define OCI_ATTRIBUTES_H

/* Of handles. */
#define OCI_ATTR_SERVER 6                       /* svcctx: OCIServer handle, RW */
#define OCI_ATTR_SESSION 7                      /* svcctx: OCISession handle, RW */
#define OCI_ATTR_TRANS 8                        /* svcctx: OCITrans handle, RW */
#define OCI_ATTR_ENV 5                          /* svcctx, server, stmt, session: OCIEnv handle, R */
#define OCI_ATTR_USERNAME 22                    /* session, authinfo: text, RW */
#define OCI_ATTR_PASSWORD 23                    /* session, authinfo: text, W */
#define OCI_ATTR_FNCODE 1                       /* env, error: ub4, R */
#define OCI_ATTR_OBJECT 2                       /* env: boolean, R */
#define OCI_ATTR_NONBLOCKING_MODE 3             /* server: ub1 (get); toggles on every set, RW */
#define OCI_ATTR_SQLCODE 4                      /* error: sb4, R */
#define OCI_ATTR_ROW_COUNT 9                    /* stmt: ub4, R */
#define OCI_ATTR_SQLFNCODE 10                   /* stmt: ub2, R */
#define OCI_ATTR_PREFETCH_ROWS 11               /* stmt: ub4, RW */
#define OCI_ATTR_NESTED_PREFETCH_ROWS 12        /* stmt: ub4, RW */
#define OCI_ATTR_PREFETCH_MEMORY 13             /* stmt: ub4, RW */
#define OCI_ATTR_NESTED_PREFETCH_MEMORY 14      /* stmt: ub4, RW */
#define OCI_ATTR_CHAR_COUNT 15                  /* bind, define: ub4, RW */
#define OCI_ATTR_PDSCL 16                       /* bind, define: sb2, RW */
#define OCI_ATTR_FSPRECISION 16                 /* bind, define, param (datetime): ub1, RW */
#define OCI_ATTR_PDPRC 17                       /* bind, define: ub2, RW */
#define OCI_ATTR_LFPRECISION 17                 /* bind, define, param (interval): ub1, RW */
#define OCI_ATTR_PARAM_COUNT 18                 /* stmt, describe: ub4, R */
#define OCI_ATTR_ROWID 19                       /* stmt: OCIRowid descriptor, R */
#define OCI_ATTR_CHARSET 20                     /* legacy: ub2 */
#define OCI_ATTR_NCHAR 21                       /* legacy: ub1 */
#define OCI_ATTR_STMT_TYPE 24                   /* stmt: ub2 (OCI_STMT_*), R */
#define OCI_ATTR_INTERNAL_NAME 25               /* server: text, RW */
#define OCI_ATTR_EXTERNAL_NAME 26               /* server: text, RW */
#define OCI_ATTR_XID 27                         /* trans: XID (by address, size of XID), RW */
#define OCI_ATTR_TRANS_LOCK 28                  /* trans: ub4, R */
#define OCI_ATTR_TRANS_NAME 29                  /* trans: text (1 to 64 bytes), RW */
#define OCI_ATTR_HEAPALLOC 30                   /* env: ub4, R */
#define OCI_ATTR_CHARSET_ID 31                  /* env (R), bind, define, param: ub2, RW */
#define OCI_ATTR_CHARSET_FORM 32                /* bind, define, param: ub1, RW */
#define OCI_ATTR_MAXDATA_SIZE 33                /* bind: sb4, RW */
#define OCI_ATTR_CACHE_OPT_SIZE 34              /* env: ub4, RW */
#define OCI_ATTR_CACHE_MAX_SIZE 35              /* env: ub4, RW */
#define OCI_ATTR_PINOPTION 36                   /* env: OCIPinOpt (ub2), RW */
#define OCI_ATTR_ALLOC_DURATION 37              /* env: OCIDuration (ub2), RW */
#define OCI_ATTR_PIN_DURATION 38                /* env: OCIDuration (ub2), RW */
#define OCI_ATTR_FDO 39                         /* stmt, describe: pointer, R */
#define OCI_ATTR_POSTPROCESSING_CALLBACK 40     /* bind: pointer, RW */
#define OCI_ATTR_POSTPROCESSING_CONTEXT 41      /* bind: pointer, RW */
#define OCI_ATTR_ROWS_RETURNED 42               /* bind: ub4, R */
#define OCI_ATTR_FOCBK 43                       /* server: failover callback structure, W */
#define OCI_ATTR_IN_V8_MODE 44                  /* svcctx, server: ub1, R */
#define OCI_ATTR_LOBEMPTY 45                    /* lob locator: ub4, value 0, W */
#define OCI_ATTR_SESSLANG 46                    /* session: pointer */
#define OCI_ATTR_NUM_DML_ERRORS 73              /* stmt: ub4, R */
#define OCI_ATTR_DML_ROW_OFFSET 74              /* error: ub4, R */
#define OCI_ATTR_DATEFORMAT 75                  /* direct path: text, RW */
#define OCI_ATTR_BUF_ADDR 76                    /* direct path stream: ub1 pointer, RW */
#define OCI_ATTR_BUF_SIZE 77                    /* direct path: ub4, RW */
#define OCI_ATTR_NUM_ROWS 81                    /* direct path: ub2 / ub4, RW */
#define OCI_ATTR_COL_COUNT 82                   /* direct path: ub2, R */
#define OCI_ATTR_STREAM_OFFSET 83               /* direct path stream: ub4, R */
#define OCI_ATTR_SHARED_HEAPALLOC 84            /* env: ub4, R */
#define OCI_ATTR_SERVER_GROUP 85                /* server: text (up to 30 characters), RW */
#define OCI_ATTR_MIGSESSION 86                  /* session: OCISession handle, W */
#define OCI_ATTR_NOCACHE 87                     /* temporary lob: ub1 */
#define OCI_ATTR_MEMPOOL_SIZE 88                /* process: ub4, RW */
#define OCI_ATTR_MEMPOOL_INSTNAME 89            /* process: text, RW */
#define OCI_ATTR_MEMPOOL_APPNAME 90             /* process: text, RW */
#define OCI_ATTR_MEMPOOL_HOMENAME 91            /* process: text, RW */
#define OCI_ATTR_MEMPOOL_MODEL 92               /* process: ub4, RW */
#define OCI_ATTR_MODES 93                       /* process: ub4, R */
#define OCI_ATTR_SUBSCR_NAME 94                 /* subscription: text, RW */
#define OCI_ATTR_SUBSCR_CALLBACK 95             /* subscription: pointer, RW */
#define OCI_ATTR_SUBSCR_CTX 96                  /* subscription: pointer, RW */
#define OCI_ATTR_SUBSCR_PAYLOAD 97              /* subscription: bytes, RW */
#define OCI_ATTR_SUBSCR_NAMESPACE 98            /* subscription: ub4, RW */
#define OCI_ATTR_PROXY_CREDENTIALS 99           /* session, authinfo: OCISession handle, W */
#define OCI_ATTR_INITIAL_CLIENT_ROLES 100       /* session, authinfo: text array, W */
#define OCI_ATTR_PARSE_ERROR_OFFSET 129         /* stmt: ub2, R */
#define OCI_ATTR_TRANS_TIMEOUT 142              /* trans: ub4, RW */
#define OCI_ATTR_SERVER_STATUS 143              /* server: ub4 (0 not connected, 1 normal), R */
#define OCI_ATTR_STATEMENT 144                  /* stmt: text, R */
#define OCI_ATTR_MAXCHAR_SIZE 163               /* bind, define: sb4, RW */
#define OCI_ATTR_CURRENT_POSITION 164           /* stmt (scrollable): ub4, R */
#define OCI_ATTR_DIGEST_ALGO 168                /* session: ub4, W */
#define OCI_ATTR_CERTIFICATE 169                /* session, authinfo: bytes, W */
#define OCI_ATTR_STMTCACHESIZE 176              /* svcctx: ub4, RW */
#define OCI_ATTR_CONN_NOWAIT 178                /* cpool: ub1, RW */
#define OCI_ATTR_CONN_BUSY_COUNT 179            /* cpool: ub4, R */
#define OCI_ATTR_CONN_OPEN_COUNT 180            /* cpool: ub4, R */
#define OCI_ATTR_CONN_TIMEOUT 181               /* cpool: ub4, RW */
#define OCI_ATTR_STMT_STATE 182                 /* stmt: ub4 (1 initialized, 2 executed, 3 end of fetch), R */
#define OCI_ATTR_CONN_MIN 183                   /* cpool: ub4, R */
#define OCI_ATTR_CONN_MAX 184                   /* cpool: ub4, R */
#define OCI_ATTR_CONN_INCR 185                  /* cpool: ub4, R */
#define OCI_ATTR_NUM_OPEN_STMTS 188             /* session: ub4, R */
#define OCI_ATTR_DESCRIBE_NATIVE 189            /* describe: ub1, RW */
#define OCI_ATTR_BIND_COUNT 190                 /* stmt: ub4, R */
#define OCI_ATTR_HANDLE_POSITION 191            /* bind, define: ub4, R */
#define OCI_ATTR_SERVER_BUSY 193                /* server: ub1, R */
#define OCI_ATTR_ROWS_FETCHED 197               /* stmt: ub4, R */
#define OCI_ATTR_SCN_BASE 198                   /* snapshot: ub4, RW */
#define OCI_ATTR_SCN_WRAP 199                   /* snapshot: ub4, RW */
#define OCI_ATTR_READONLY_TXN 201               /* session, trans: ub1, RW */
#define OCI_ATTR_ERRONEOUS_COLUMN 203           /* stmt: ub4, R */
#define OCI_ATTR_ASM_VOL_SPRT 205               /* server: ub1, R */
#define OCI_ATTR_INST_TYPE 207                  /* server: ub1, R */
#define OCI_ATTR_SPOOL_STMTCACHESIZE 208        /* spool: ub4, RW */
#define OCI_ATTR_ENV_UTF16 209                  /* env: ub1, R */
#define OCI_ATTR_NCHARSET_ID 262                /* env, database param: ub2, R */
#define OCI_ATTR_APPCTX_SIZE 273                /* session: ub4, W */
#define OCI_ATTR_APPCTX_LIST 274                /* session: OCIParam, R */
#define OCI_ATTR_APPCTX_NAME 275                /* app. context element: text, W */
#define OCI_ATTR_APPCTX_ATTR 276                /* app. context element: text, W */
#define OCI_ATTR_APPCTX_VALUE 277               /* app. context element: text, W */
#define OCI_ATTR_CLIENT_IDENTIFIER 278          /* session, authinfo: text, W */
#define OCI_ATTR_CURRENT_SCHEMA 224             /* session: text, RW */
#define OCI_ATTR_STMT_IS_RETURNING 218          /* stmt: ub1, R */
#define OCI_ATTR_EDITION 288                    /* session: text, RW */
#define OCI_ATTR_DISTINGUISHED_NAME 300         /* session, authinfo: text, W */
#define OCI_ATTR_KERBEROS_TICKET 301            /* session: text, W */
#define OCI_ATTR_ORA_DEBUG_JDWP 302             /* session: text, W */
#define OCI_ATTR_EVTCBK 304                     /* env: pointer, W */
#define OCI_ATTR_EVTCTX 305                     /* env: pointer, W */
#define OCI_ATTR_USER_MEMORY 306                /* any handle with user memory: pointer, R */
#define OCI_ATTR_ACCESS_BANNER 307              /* server: text, R */
#define OCI_ATTR_AUDIT_BANNER 308               /* server: text, R */
#define OCI_ATTR_SPOOL_TIMEOUT 308              /* spool: ub4, RW */
#define OCI_ATTR_SPOOL_GETMODE 309              /* spool: ub1, RW */
#define OCI_ATTR_SPOOL_BUSY_COUNT 310           /* spool: ub4, R */
#define OCI_ATTR_SPOOL_OPEN_COUNT 311           /* spool: ub4, R */
#define OCI_ATTR_SPOOL_MIN 312                  /* spool: ub4, R */
#define OCI_ATTR_SPOOL_MAX 313                  /* spool: ub4, R */
#define OCI_ATTR_SPOOL_INCR 314                 /* spool: ub4, R */
#define OCI_ATTR_MODULE 366                     /* session: text, W */
#define OCI_ATTR_ACTION 367                     /* session: text, W */
#define OCI_ATTR_CLIENT_INFO 368                /* session: text, W */
#define OCI_ATTR_COLLECT_CALL_TIME 369          /* session: boolean, RW */
#define OCI_ATTR_CALL_TIME 370                  /* session: ub8, R */
#define OCI_ATTR_DBNAME 391                     /* event, server: text, R */
#define OCI_ATTR_INSTNAME 392                   /* event, server: text, R */
#define OCI_ATTR_SERVICENAME 393                /* event, server: text, R */
#define OCI_ATTR_HOSTNAME 390                   /* event: text, R */
#define OCI_ATTR_DBDOMAIN 399                   /* event: text, R */
#define OCI_ATTR_DRIVER_NAME 424                /* session, authinfo: text, W */
#define OCI_ATTR_CONNECTION_CLASS 425           /* authinfo: text, RW */
#define OCI_ATTR_PURITY 426                     /* authinfo: ub4 (0 default, 1 new, 2 self), RW */
#define OCI_ATTR_SEND_TIMEOUT 435               /* server: ub4, RW */
#define OCI_ATTR_RECEIVE_TIMEOUT 436            /* server: ub4, RW */
#define OCI_ATTR_DEFAULT_LOBPREFETCH_SIZE 438   /* session: ub4, RW */
#define OCI_ATTR_LOBPREFETCH_SIZE 439           /* define: ub4, RW */
#define OCI_ATTR_LOBPREFETCH_LENGTH 440         /* define: boolean, RW */
#define OCI_ATTR_FETCH_ROWID 448                /* stmt: boolean, W */
#define OCI_ATTR_UB8_ROW_COUNT 457              /* stmt: ub8, R */
#define OCI_ATTR_SPOOL_WAIT_TIMEOUT 506         /* spool: ub4, RW */
#define OCI_ATTR_CALL_TIMEOUT 531               /* svcctx: ub4, RW */

/* Of parameters and described objects. */
#define OCI_ATTR_DATA_SIZE 1                    /* column, argument, type attribute: ub2, R */
#define OCI_ATTR_DATA_TYPE 2                    /* column, argument, type attribute: ub2 (internal type code), R */
#define OCI_ATTR_DISP_SIZE 3                    /* column: ub2 / ub4, R */
#define OCI_ATTR_NAME 4                         /* column, argument, any named object: text, R */
#define OCI_ATTR_PRECISION 5                    /* column, argument: ub1 explicit describe; sb2 implicit describe, R */
#define OCI_ATTR_SCALE 6                        /* column, argument: sb1, R */
#define OCI_ATTR_IS_NULL 7                      /* column, argument: ub1, R */
#define OCI_ATTR_TYPE_NAME 8                    /* column, argument, type: text, R */
#define OCI_ATTR_SCHEMA_NAME 9                  /* column, argument, type, synonym: text, R */
#define OCI_ATTR_SUB_NAME 10                    /* argument, synonym: text, R */
#define OCI_ATTR_POSITION 11                    /* column, argument: ub2, R */
#define OCI_ATTR_DISP_NAME 100                  /* column: text, R */
#define OCI_ATTR_ENCC_SIZE 101                  /* column: ub2, R */
#define OCI_ATTR_COL_ENC 102                    /* column: ub1, R */
#define OCI_ATTR_COL_ENC_SALT 103               /* column: ub1, R */
#define OCI_ATTR_UNK 101                        /* none (place holder) */
#define OCI_ATTR_NUM_COLS 102                   /* table, view: ub2, R */
#define OCI_ATTR_LIST_COLUMNS 103               /* table, view: OCIParam, R */
#define OCI_ATTR_RDBA 104                       /* table: ub4, R */
#define OCI_ATTR_CLUSTERED 105                  /* table: ub1, R */
#define OCI_ATTR_PARTITIONED 106                /* table: ub1, R */
#define OCI_ATTR_INDEX_ONLY 107                 /* table: ub1, R */
#define OCI_ATTR_LIST_ARGUMENTS 108             /* procedure, function, method: OCIParam, R */
#define OCI_ATTR_LIST_SUBPROGRAMS 109           /* package: OCIParam, R */
#define OCI_ATTR_REF_TDO 110                    /* type, column, argument: OCIRef, R */
#define OCI_ATTR_LINK 111                       /* synonym, argument: text, R */
#define OCI_ATTR_MIN 112                        /* sequence: NUMBER bytes (ub1*), R */
#define OCI_ATTR_MAX 113                        /* sequence: NUMBER bytes (ub1*), R */
#define OCI_ATTR_INCR 114                       /* sequence: NUMBER bytes (ub1*), R */
#define OCI_ATTR_CACHE 115                      /* sequence: NUMBER bytes (ub1*), R */
#define OCI_ATTR_ORDER 116                      /* sequence: ub1, R */
#define OCI_ATTR_HW_MARK 117                    /* sequence: NUMBER bytes (ub1*), R */
#define OCI_ATTR_TYPE_SCHEMA 118                /* legacy: text, R */
#define OCI_ATTR_TIMESTAMP 119                  /* any schema object: 7-byte DATE (ub1*), R */
#define OCI_ATTR_NUM_ATTRS 120                  /* legacy: ub2, R */
#define OCI_ATTR_NUM_PARAMS 121                 /* parameter list: ub2, R */
#define OCI_ATTR_OBJID 122                      /* table, view, sequence: ub4, R */
#define OCI_ATTR_PTYPE 123                      /* any param: ub1 (OCI_PTYPE_*), R */
#define OCI_ATTR_PARAM 124                      /* describe: OCIParam, R */
#define OCI_ATTR_OVERLOAD_ID 125                /* procedure, function in package: ub2, R */
#define OCI_ATTR_TABLESPACE 126                 /* table: sword, R */
#define OCI_ATTR_TDO 127                        /* type: OCIType pointer, R */
#define OCI_ATTR_LTYPE 128                      /* list: ub2 (OCI_LTYPE_*), R */
#define OCI_ATTR_IS_TEMPORARY 130               /* table: ub1, R */
#define OCI_ATTR_IS_TYPED 131                   /* table: ub1, R */
#define OCI_ATTR_DURATION 132                   /* temporary table: OCIDuration (ub2), R */
#define OCI_ATTR_IS_INVOKER_RIGHTS 133          /* procedure, function, package, type: ub1, R */
#define OCI_ATTR_OBJ_NAME 134                   /* any schema object: text, R */
#define OCI_ATTR_OBJ_SCHEMA 135                 /* any schema object: text, R */
#define OCI_ATTR_OBJ_ID 136                     /* any schema object: ub4, R */
#define OCI_ATTR_OVERLOAD 210                   /* argument: ub2, R */
#define OCI_ATTR_LEVEL 211                      /* argument: ub2, R */
#define OCI_ATTR_HAS_DEFAULT 212                /* argument: ub1, R */
#define OCI_ATTR_IOMODE 213                     /* argument: sb4 (0 in, 1 out, 2 in-out), R */
#define OCI_ATTR_RADIX 214                      /* argument: ub1, R */
#define OCI_ATTR_NUM_ARGS 215                   /* method: ub2, R */
#define OCI_ATTR_TYPECODE 216                   /* type, argument, type attribute: ub2, R */
#define OCI_ATTR_COLLECTION_TYPECODE 217        /* type: ub2, R */
#define OCI_ATTR_VERSION 218                    /* type, database: text, R */
#define OCI_ATTR_IS_INCOMPLETE_TYPE 219         /* type: ub1, R */
#define OCI_ATTR_IS_SYSTEM_TYPE 220             /* type: ub1, R */
#define OCI_ATTR_IS_PREDEFINED_TYPE 221         /* type: ub1, R */
#define OCI_ATTR_IS_TRANSIENT_TYPE 222          /* type: ub1, R */
#define OCI_ATTR_IS_SYSTEM_GENERATED_TYPE 223   /* type: ub1, R */
#define OCI_ATTR_HAS_NESTED_TABLE 224           /* type: ub1, R */
#define OCI_ATTR_HAS_LOB 225                    /* type: ub1, R */
#define OCI_ATTR_HAS_FILE 226                   /* type: ub1, R */
#define OCI_ATTR_COLLECTION_ELEMENT 227         /* collection type: OCIParam, R */
#define OCI_ATTR_NUM_TYPE_ATTRS 228             /* type: ub2, R */
#define OCI_ATTR_LIST_TYPE_ATTRS 229            /* type: OCIParam, R */
#define OCI_ATTR_NUM_TYPE_METHODS 230           /* type: ub2, R */
#define OCI_ATTR_LIST_TYPE_METHODS 231          /* type: OCIParam, R */
#define OCI_ATTR_MAP_METHOD 232                 /* type: OCIParam, R */
#define OCI_ATTR_ORDER_METHOD 233               /* type: OCIParam, R */
#define OCI_ATTR_NUM_ELEMS 234                  /* varray: ub4, R */
#define OCI_ATTR_ENCAPSULATION 235              /* method: ub2, R */
#define OCI_ATTR_IS_SELFISH 236                 /* method: ub1, R */
#define OCI_ATTR_IS_VIRTUAL 237                 /* method: ub1, R */
#define OCI_ATTR_IS_INLINE 238                  /* method: ub1, R */
#define OCI_ATTR_IS_CONSTANT 239                /* method: ub1, R */
#define OCI_ATTR_HAS_RESULT 240                 /* method: ub1, R */
#define OCI_ATTR_IS_CONSTRUCTOR 241             /* method: ub1, R */
#define OCI_ATTR_IS_DESTRUCTOR 242              /* method: ub1, R */
#define OCI_ATTR_IS_OPERATOR 243                /* method: ub1, R */
#define OCI_ATTR_IS_MAP 244                     /* method: ub1, R */
#define OCI_ATTR_IS_ORDER 245                   /* method: ub1, R */
#define OCI_ATTR_IS_RNDS 246                    /* method: ub1, R */
#define OCI_ATTR_IS_RNPS 247                    /* method: ub1, R */
#define OCI_ATTR_IS_WNDS 248                    /* method: ub1, R */
#define OCI_ATTR_IS_WNPS 249                    /* method: ub1, R */
#define OCI_ATTR_DESC_PUBLIC 250                /* describe: boolean, W */
#define OCI_ATTR_IS_SUBTYPE 258                 /* type: ub1, R */
#define OCI_ATTR_SUPERTYPE_SCHEMA_NAME 259      /* type: text, R */
#define OCI_ATTR_SUPERTYPE_NAME 260             /* type: text, R */
#define OCI_ATTR_LIST_OBJECTS 261               /* schema: OCIParam, R */
#define OCI_ATTR_LIST_SCHEMAS 263               /* database: OCIParam, R */
#define OCI_ATTR_MAX_PROC_LEN 264               /* database: ub4, R */
#define OCI_ATTR_MAX_COLUMN_LEN 265             /* database: ub4, R */
#define OCI_ATTR_CURSOR_COMMIT_BEHAVIOR 266     /* database: ub1 (0 open, 1 closed), R */
#define OCI_ATTR_MAX_CATALOG_NAMELEN 267        /* database: ub1, R */
#define OCI_ATTR_CATALOG_LOCATION 268           /* database: ub1 (0 start, 1 end), R */
#define OCI_ATTR_SAVEPOINT_SUPPORT 269          /* database: ub1 (0 yes, 1 no), R */
#define OCI_ATTR_NOWAIT_SUPPORT 270             /* database: ub1 (0 yes, 1 no), R */
#define OCI_ATTR_AUTOCOMMIT_DDL 271             /* database: ub1 (0 yes, 1 no), R */
#define OCI_ATTR_LOCKING_MODE 272               /* database: ub1 (0 immediate, 1 delayed), R */
#define OCI_ATTR_IS_FINAL_TYPE 279              /* type: ub1, R */
#define OCI_ATTR_IS_INSTANTIABLE_TYPE 280       /* type: ub1, R */
#define OCI_ATTR_IS_FINAL_METHOD 281            /* method: ub1, R */
#define OCI_ATTR_IS_INSTANTIABLE_METHOD 282     /* method: ub1, R */
#define OCI_ATTR_IS_OVERRIDING_METHOD 283       /* method: ub1, R */
#define OCI_ATTR_DESC_SYNBASE 284               /* describe: ub1, W */
#define OCI_ATTR_CHAR_USED 285                  /* column: ub1 (0 byte, 1 character semantics), R */
#define OCI_ATTR_CHAR_SIZE 286                  /* column: ub2, R */
#define OCI_ATTR_IS_JAVA_TYPE 287               /* type: ub1, R */
#define OCI_ATTR_IS_XMLTYPE 315                 /* column: ub1, R */
#define OCI_ATTR_XMLSCHEMA_NAME 316             /* column: text, R */
#define OCI_ATTR_XMLELEMENT_NAME 317            /* column: text, R */
#define OCI_ATTR_XMLSQLTYPSCH_NAME 318          /* column: text, R */
#define OCI_ATTR_XMLSQLTYPE_NAME 319            /* column: text, R */
#define OCI_ATTR_XMLTYPE_STORED_OBJ 320         /* column: ub1, R */

/* Of the object cache, complex objects and directories. */
#define OCI_ATTR_CACHE_ARRAYFLUSH 0x40
#define OCI_ATTR_OBJECT_NEWNOTNULL 0x10
#define OCI_ATTR_OBJECT_DETECTCHANGE 0x20
#define OCI_ATTR_COMPLEXOBJECTCOMP_TYPE 50
#define OCI_ATTR_COMPLEXOBJECTCOMP_TYPE_LEVEL 51
#define OCI_ATTR_COMPLEXOBJECT_LEVEL 52
#define OCI_ATTR_COMPLEXOBJECT_COLL_OUTOFLINE 53
#define OCI_ATTR_LDAP_HOST 153
#define OCI_ATTR_LDAP_PORT 154
#define OCI_ATTR_BIND_DN 155
#define OCI_ATTR_LDAP_CRED 156
#define OCI_ATTR_WALL_LOC 157
#define OCI_ATTR_LDAP_AUTH 158
#define OCI_ATTR_LDAP_CTX 159
#define OCI_ATTR_SERVER_DNS 160
#define OCI_ATTR_DN_COUNT 161
#define OCI_ATTR_SERVER_DN 162

#endif
