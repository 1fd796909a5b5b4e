/* Constants: return codes, handle, descriptor and data types, modes and flags. Attributes are in oci_attributes.h. */
#ifndef OCI_CONSTANTS_H
#define OCI_CONSTANTS_H

/* Return codes. */
#define OCI_SUCCESS 0
#define OCI_SUCCESS_WITH_INFO 1
#define OCI_NEED_DATA 99
#define OCI_NO_DATA 100
#define OCI_RESERVED_FOR_INT_USE 200
#define OCI_ERROR (-1)
#define OCI_INVALID_HANDLE (-2)
#define OCI_STILL_EXECUTING (-3123)
#define OCI_CONTINUE (-24200)
#define OCI_ROWCBK_DONE (-24201)

/* Every mode argument. */
#define OCI_DEFAULT 0

/* Handle types. */
#define OCI_HTYPE_FIRST 1
#define OCI_HTYPE_ENV 1
#define OCI_HTYPE_ERROR 2
#define OCI_HTYPE_SVCCTX 3
#define OCI_HTYPE_STMT 4
#define OCI_HTYPE_BIND 5
#define OCI_HTYPE_DEFINE 6
#define OCI_HTYPE_DESCRIBE 7
#define OCI_HTYPE_SERVER 8
#define OCI_HTYPE_SESSION 9
#define OCI_HTYPE_TRANS 10
#define OCI_HTYPE_COMPLEXOBJECT 11
#define OCI_HTYPE_SECURITY 12
#define OCI_HTYPE_SUBSCRIPTION 13
#define OCI_HTYPE_DIRPATH_CTX 14
#define OCI_HTYPE_DIRPATH_COLUMN_ARRAY 15
#define OCI_HTYPE_DIRPATH_STREAM 16
#define OCI_HTYPE_PROC 17
#define OCI_HTYPE_DIRPATH_FN_CTX 18
#define OCI_HTYPE_DIRPATH_FN_COL_ARRAY 19
#define OCI_HTYPE_XADSESSION 20
#define OCI_HTYPE_XADTABLE 21
#define OCI_HTYPE_XADFIELD 22
#define OCI_HTYPE_XADGRANULE 23
#define OCI_HTYPE_XADRECORD 24
#define OCI_HTYPE_XADIO 25
#define OCI_HTYPE_CPOOL 26
#define OCI_HTYPE_SPOOL 27
#define OCI_HTYPE_ADMIN 28
#define OCI_HTYPE_EVENT 29
#define OCI_HTYPE_AUTHINFO 9
#define OCI_HTYPE_LAST 29

/* Descriptor types. */
#define OCI_DTYPE_FIRST 50
#define OCI_DTYPE_LOB 50
#define OCI_DTYPE_SNAP 51
#define OCI_DTYPE_RSET 52
#define OCI_DTYPE_PARAM 53
#define OCI_DTYPE_ROWID 54
#define OCI_DTYPE_COMPLEXOBJECTCOMP 55
#define OCI_DTYPE_FILE 56
#define OCI_DTYPE_AQENQ_OPTIONS 57
#define OCI_DTYPE_AQDEQ_OPTIONS 58
#define OCI_DTYPE_AQMSG_PROPERTIES 59
#define OCI_DTYPE_AQAGENT 60
#define OCI_DTYPE_LOCATOR 61
#define OCI_DTYPE_INTERVAL_YM 62
#define OCI_DTYPE_INTERVAL_DS 63
#define OCI_DTYPE_AQNFY_DESCRIPTOR 64
#define OCI_DTYPE_DATE 65
#define OCI_DTYPE_TIME 66
#define OCI_DTYPE_TIME_TZ 67
#define OCI_DTYPE_TIMESTAMP 68
#define OCI_DTYPE_TIMESTAMP_TZ 69
#define OCI_DTYPE_TIMESTAMP_LTZ 70
#define OCI_DTYPE_UCB 71
#define OCI_DTYPE_SRVDN 72
#define OCI_DTYPE_SIGNATURE 73
#define OCI_DTYPE_RESERVED_1 74
#define OCI_DTYPE_AQLIS_OPTIONS 75
#define OCI_DTYPE_AQLIS_MSG_PROPERTIES 76
#define OCI_DTYPE_CHDES 77
#define OCI_DTYPE_TABLE_CHDES 78
#define OCI_DTYPE_ROW_CHDES 79
#define OCI_DTYPE_CQDES 80
#define OCI_DTYPE_LOB_REGION 81
#define OCI_DTYPE_LAST 81

/* Data types: how a value lies at the address given to a bind or define. */
#define SQLT_CHR 1              /* characters, no terminator */
#define SQLT_NUM 2              /* OCINumber: 22 bytes, byte 0 the count */
#define SQLT_INT 3              /* signed integer of 1, 2, 4 or 8 bytes */
#define SQLT_FLT 4              /* float or double */
#define SQLT_STR 5              /* NUL-terminated characters */
#define SQLT_VNU 6              /* OCINumber */
#define SQLT_PDN 7              /* packed decimal */
#define SQLT_LNG 8              /* long characters */
#define SQLT_VCS 9              /* ub2 length, then characters */
#define SQLT_NON 10             /* none */
#define SQLT_RID 11             /* binary row id, 10 bytes */
#define SQLT_DAT 12             /* 7-byte date */
#define SQLT_VBI 15             /* ub2 length, then bytes */
#define SQLT_BFLOAT 21          /* decimal floating point of 16 digits, 8 bytes */
#define SQLT_BDOUBLE 22         /* decimal floating point of 34 digits, 16 bytes */
#define SQLT_BIN 23             /* bytes */
#define SQLT_LBI 24             /* long bytes */
#define SQLT_UIN 68             /* unsigned integer of 1, 2, 4 or 8 bytes */
#define SQLT_SLS 91             /* digits with a leading sign */
#define SQLT_LVC 94             /* sb4 length, then characters */
#define SQLT_LVB 95             /* address of an OCIRaw * */
#define SQLT_AFC 96             /* characters, padded with blanks */
#define SQLT_AVC 97             /* ub2 length, then characters; trailing blanks kept */
#define SQLT_AFV 97             /* another name of it */
#define SQLT_IBFLOAT 100        /* canonical float */
#define SQLT_IBDOUBLE 101       /* canonical double */
#define SQLT_CUR 102            /* address of an OCIStmt * */
#define SQLT_RDD 104            /* address of an OCIRowid * */
#define SQLT_LAB 105            /* label */
#define SQLT_OSL 106            /* label */
#define SQLT_NTY 108            /* named object */
#define SQLT_REF 110            /* reference */
#define SQLT_CLOB 112           /* address of an OCILobLocator *, as the LOB and file types below */
#define SQLT_BLOB 113
#define SQLT_BFILEE 114
#define SQLT_BFILE 114
#define SQLT_FILE 114
#define SQLT_CFILEE 115
#define SQLT_CFILE 115
#define SQLT_RSET 116           /* address of an OCIStmt * */
#define SQLT_NCO 122            /* collection */
#define SQLT_VST 155            /* address of an OCIString * */
#define SQLT_ODT 156            /* OCIDate */
#define SQLT_DATE 184           /* address of an OCIDateTime *, as the time types below */
#define SQLT_TIME 185
#define SQLT_TIME_TZ 186
#define SQLT_TIMESTAMP 187
#define SQLT_TIMESTAMP_TZ 188
#define SQLT_INTERVAL_YM 189    /* address of an OCIInterval * */
#define SQLT_INTERVAL_DS 190    /* address of an OCIInterval * */
#define SQLT_TIMESTAMP_LTZ 232  /* address of an OCIDateTime * */
#define SQLT_PNTY 241           /* named object in a block */
#define SQLT_DBCLOB 1112        /* not published: a locator of double-byte characters, a word of the driver */

/* Forms and ids of character sets; id 0 is the one of the environment. */
#define SQLCS_IMPLICIT 1
#define SQLCS_NCHAR 2
#define SQLCS_EXPLICIT 3
#define SQLCS_FLEXIBLE 4
#define SQLCS_LIT_NULL 5
#define OCI_UTF16ID 1000
#define OCI_UCS2ID 1000
#define OCI_TYPECODE_BFLOAT SQLT_IBFLOAT
#define OCI_TYPECODE_BDOUBLE SQLT_IBDOUBLE
#define OCI_TYPECODE_VARRAY 247
#define OCI_TYPECODE_TABLE 248
#define OCI_TYPECODE_OBJECT 108
#define OCI_TYPECODE_NAMEDCOLLECTION 122
#define OCI_TYPECODE_SMALLINT 246
#define OCI_TYPECODE_INTEGER 3
#define OCI_TYPECODE_NUMBER SQLT_NUM
#define OCI_TYPECODE_FLOAT 4
#define OCI_TYPECODE_VARCHAR SQLT_CHR
#define OCI_TYPECODE_VARCHAR2 9
#define OCI_TYPECODE_CHAR SQLT_AFC
#define OCI_TYPECODE_RAW SQLT_LVB
#define OCI_TYPECODE_DATE SQLT_DAT
#define OCI_TYPECODE_TIMESTAMP SQLT_TIMESTAMP
#define OCI_TYPECODE_TIMESTAMP_TZ SQLT_TIMESTAMP_TZ
#define OCI_TYPECODE_TIMESTAMP_LTZ SQLT_TIMESTAMP_LTZ
#define OCI_TYPECODE_INTERVAL_YM SQLT_INTERVAL_YM
#define OCI_TYPECODE_INTERVAL_DS SQLT_INTERVAL_DS
#define OCI_TYPECODE_BLOB SQLT_BLOB
#define OCI_TYPECODE_CLOB SQLT_CLOB
#define OCI_TYPECODE_BFILE SQLT_BFILE

/* Environment modes. */
#define OCI_THREADED 0x1
#define OCI_OBJECT 0x2
#define OCI_EVENTS 0x4
#define OCI_SHARED 0x10
#define OCI_NO_UCB 0x40
#define OCI_NO_MUTEX 0x80
#define OCI_SHARED_EXT 0x100
#define OCI_ALWAYS_BLOCKING 0x400
#define OCI_USE_LDAP 0x1000
#define OCI_REG_LDAPONLY 0x2000
#define OCI_UTF16 0x4000
#define OCI_AFC_PAD_ON 0x8000
#define OCI_NEW_LENGTH_SEMANTICS 0x20000
#define OCI_NO_MUTEX_STMT 0x40000
#define OCI_MUTEX_ENV_ONLY 0x80000
#define OCI_ENV_NO_UCB 0x1
#define OCI_ENV_NO_MUTEX 0x8

/* Credentials and modes of OCISessionBegin. */
#define OCI_CRED_RDBMS 1
#define OCI_CRED_EXT 2
#define OCI_CRED_PROXY 3
#define OCI_MIGRATE 0x1
#define OCI_SYSDBA 0x2
#define OCI_SYSOPER 0x4
#define OCI_PRELIM_AUTH 0x8
#define OCI_STMT_CACHE 0x40

/* Logon, attach, password change; the server status attribute. */
#define OCI_LOGON2_SPOOL 0x1
#define OCI_LOGON2_STMTCACHE 0x4
#define OCI_LOGON2_PROXY 0x8
#define OCI_LOGON2_CPOOL 0x200
#define OCI_CPOOL 0x200
#define OCI_AUTH 0x8
#define OCI_SERVER_NOT_CONNECTED 0
#define OCI_SERVER_NORMAL 1

/* Pools. */
#define OCI_CPOOL_REINITIALIZE 0x111
#define OCI_SPC_REINITIALIZE 0x1
#define OCI_SPC_HOMOGENEOUS 0x2
#define OCI_SPC_STMTCACHE 0x4
#define OCI_SPC_NO_RLB 0x8
#define OCI_SPD_FORCE 0x1
#define OCI_SPOOL_ATTRVAL_WAIT 0
#define OCI_SPOOL_ATTRVAL_NOWAIT 1
#define OCI_SPOOL_ATTRVAL_FORCEGET 2
#define OCI_SPOOL_ATTRVAL_TIMEDWAIT 3

/* Getting and releasing a session. */
#define OCI_SESSGET_SPOOL 0x1
#define OCI_SESSGET_STMTCACHE 0x4
#define OCI_SESSGET_CREDPROXY 0x8
#define OCI_SESSGET_CREDEXT 0x10
#define OCI_SESSGET_SPOOL_MATCHANY 0x20
#define OCI_SESSGET_PURITY_NEW 0x40
#define OCI_SESSGET_PURITY_SELF 0x80
#define OCI_SESSGET_SYSDBA 0x100
#define OCI_SESSGET_CPOOL 0x200
#define OCI_SESSRLS_DROPSESS 0x1
#define OCI_SESSRLS_RETAG 0x2

/* Sizes in bytes. */
#define OCI_ERROR_MAXMSG_SIZE 1024
#define OCI_ROWID_LEN 23

/* Statements: syntax, statement cache. */
#define OCI_NTV_SYNTAX 1
#define OCI_V7_SYNTAX 2
#define OCI_V8_SYNTAX 3
#define OCI_PREP2_CACHE_SEARCHONLY 0x10
#define OCI_STRLS_CACHE_DELETE 0x10

/* Execute modes. */
#define OCI_BATCH_MODE 0x1
#define OCI_EXACT_FETCH 0x2
#define OCI_STMT_SCROLLABLE_READONLY 0x8
#define OCI_DESCRIBE_ONLY 0x10
#define OCI_COMMIT_ON_SUCCESS 0x20
#define OCI_NON_BLOCKING 0x40
#define OCI_BATCH_ERRORS 0x80
#define OCI_PARSE_ONLY 0x100
#define OCI_SHOW_DML_WARNINGS 0x400

/* Fetch orientations. */
#define OCI_FETCH_CURRENT 0x1
#define OCI_FETCH_NEXT 0x2
#define OCI_FETCH_FIRST 0x4
#define OCI_FETCH_LAST 0x8
#define OCI_FETCH_PRIOR 0x10
#define OCI_FETCH_ABSOLUTE 0x20
#define OCI_FETCH_RELATIVE 0x40

/* Modes of binds and defines, pieces, directions. */
#define OCI_SB2_IND_PTR 0x1
#define OCI_DATA_AT_EXEC 0x2
#define OCI_DYNAMIC_FETCH 0x2
#define OCI_PIECEWISE 0x4
#define OCI_BIND_SOFT 0x40
#define OCI_DEFINE_SOFT 0x80
#define OCI_IOV 0x200
#define OCI_ONE_PIECE 0
#define OCI_FIRST_PIECE 1
#define OCI_NEXT_PIECE 2
#define OCI_LAST_PIECE 3
#define OCI_PARAM_IN 1
#define OCI_PARAM_OUT 2

/* Kinds and states of a statement. */
#define OCI_STMT_UNKNOWN 0
#define OCI_STMT_SELECT 1
#define OCI_STMT_UPDATE 2
#define OCI_STMT_DELETE 3
#define OCI_STMT_INSERT 4
#define OCI_STMT_CREATE 5
#define OCI_STMT_DROP 6
#define OCI_STMT_ALTER 7
#define OCI_STMT_BEGIN 8
#define OCI_STMT_DECLARE 9
#define OCI_STMT_CALL 10
#define OCI_STMT_MERGE 16
#define OCI_STMT_STATE_INITIALIZED 1
#define OCI_STMT_STATE_EXECUTED 2
#define OCI_STMT_STATE_END_OF_FETCH 3

/* Describing: how the object is given, parameter types, list types, argument modes. */
#define OCI_OTYPE_UNK 0
#define OCI_OTYPE_NAME 1
#define OCI_OTYPE_REF 2
#define OCI_OTYPE_PTR 3
#define OCI_PTYPE_UNK 0
#define OCI_PTYPE_TABLE 1
#define OCI_PTYPE_VIEW 2
#define OCI_PTYPE_PROC 3
#define OCI_PTYPE_FUNC 4
#define OCI_PTYPE_PKG 5
#define OCI_PTYPE_TYPE 6
#define OCI_PTYPE_SYN 7
#define OCI_PTYPE_SEQ 8
#define OCI_PTYPE_COL 9
#define OCI_PTYPE_ARG 10
#define OCI_PTYPE_LIST 11
#define OCI_PTYPE_TYPE_ATTR 12
#define OCI_PTYPE_TYPE_COLL 13
#define OCI_PTYPE_TYPE_METHOD 14
#define OCI_PTYPE_TYPE_ARG 15
#define OCI_PTYPE_TYPE_RESULT 16
#define OCI_PTYPE_SCHEMA 17
#define OCI_PTYPE_DATABASE 18
#define OCI_PTYPE_RULE 19
#define OCI_PTYPE_RULE_SET 20
#define OCI_PTYPE_EVALUATION_CONTEXT 21
#define OCI_PTYPE_TABLE_ALIAS 22
#define OCI_PTYPE_VARIABLE_TYPE 23
#define OCI_PTYPE_NAME_VALUE 24
#define OCI_LTYPE_UNK 0
#define OCI_LTYPE_COLUMN 1
#define OCI_LTYPE_ARG_PROC 2
#define OCI_LTYPE_ARG_FUNC 3
#define OCI_LTYPE_SUBPRG 4
#define OCI_LTYPE_TYPE_ATTR 5
#define OCI_LTYPE_TYPE_METHOD 6
#define OCI_LTYPE_TYPE_ARG_PROC 7
#define OCI_LTYPE_TYPE_ARG_FUNC 8
#define OCI_LTYPE_SCH_OBJ 9
#define OCI_LTYPE_DB_SCH 10
#define OCI_LTYPE_TYPE_SUBTYPE 11
#define OCI_LTYPE_TABLE_ALIAS 12
#define OCI_LTYPE_VARIABLE_TYPE 13
#define OCI_LTYPE_NAME_VALUE 14
#define OCI_TYPEPARAM_IN 0
#define OCI_TYPEPARAM_OUT 1
#define OCI_TYPEPARAM_INOUT 2

/* Answers of a described database. */
#define OCI_CURSOR_OPEN 0
#define OCI_CURSOR_CLOSED 1
#define OCI_CL_START 0
#define OCI_CL_END 1
#define OCI_SP_SUPPORTED 0
#define OCI_SP_UNSUPPORTED 1
#define OCI_NW_SUPPORTED 0
#define OCI_NW_UNSUPPORTED 1
#define OCI_AC_DDL 0
#define OCI_NO_AC_DDL 1
#define OCI_LOCK_IMMEDIATE 0
#define OCI_LOCK_DELAYED 1

/* Pin and lock options. */
#define OCI_PIN_DEFAULT 1
#define OCI_PIN_ANY 3
#define OCI_PIN_RECENT 4
#define OCI_PIN_LATEST 5
#define OCI_LOCK_NONE 1
#define OCI_LOCK_X 2
#define OCI_LOCK_X_NOWAIT 3

/* Transactions: kind of start, isolation, coupling, the rest; commit. */
#define OCI_TRANS_NEW 0x1
#define OCI_TRANS_JOIN 0x2
#define OCI_TRANS_RESUME 0x4
#define OCI_TRANS_PROMOTE 0x8
#define OCI_TRANS_STARTMASK 0xff
#define OCI_TRANS_READONLY 0x100
#define OCI_TRANS_READWRITE 0x200
#define OCI_TRANS_SERIALIZABLE 0x400
#define OCI_TRANS_ISOLMASK 0xff00
#define OCI_TRANS_LOOSE 0x10000
#define OCI_TRANS_TIGHT 0x20000
#define OCI_TRANS_TYPEMASK 0xf0000
#define OCI_TRANS_NOMIGRATE 0x100000
#define OCI_TRANS_SEPARABLE 0x200000
#define OCI_TRANS_OTSRESUME 0x400000
#define OCI_TRANS_OTHRMASK 0xfff00000
#define OCI_TRANS_TWOPHASE 0x1000000
#define OCI_TRANS_WRITEBATCH 0x1
#define OCI_TRANS_WRITEIMMED 0x2
#define OCI_TRANS_WRITEWAIT 0x4
#define OCI_TRANS_WRITENOWAIT 0x8

/* LOBs. */
#define OCI_LOB_READONLY 1
#define OCI_FILE_READONLY 1
#define OCI_LOB_READWRITE 2
#define OCI_LOB_WRITEONLY 3
#define OCI_TEMP_BLOB 1
#define OCI_TEMP_CLOB 2
#define OCI_TEMP_NCLOB 3
#define OCI_LOB_BUFFER_FREE 1
#define OCI_LOB_BUFFER_NOFREE 2
#define OCI_LOBMAXSIZE 4294967295U

/* Durations. */
#define OCI_DURATION_BEGIN 10
#define OCI_DURATION_SESSION 10
#define OCI_DURATION_TRANS 11
#define OCI_DURATION_CALL 12
#define OCI_DURATION_STATEMENT 13
#define OCI_DURATION_CALLOUT 14
#define OCI_DURATION_LAST 14
#define OCI_DURATION_NULL 9
#define OCI_DURATION_DEFAULT 8
#define OCI_DURATION_USER_CALLBACK 7
#define OCI_DURATION_NEXT 6
#define OCI_DURATION_PROCESS 5
#define OCI_DURATION_INVALID 0xFFFF

/* Files: access, creation, type, origin and direction of a seek. */
#define OCI_FILE_READ_ONLY 1
#define OCI_FILE_WRITE_ONLY 2
#define OCI_FILE_READ_WRITE 3
#define OCI_FILE_EXIST 0
#define OCI_FILE_CREATE 1
#define OCI_FILE_EXCL 2
#define OCI_FILE_TRUNCATE 4
#define OCI_FILE_APPEND 8
#define OCI_FILE_BIN 0
#define OCI_FILE_TEXT 1
#define OCI_FILE_STDIN 2
#define OCI_FILE_STDOUT 3
#define OCI_FILE_STDERR 4
#define OCI_FILE_SEEK_BEGINNING 1
#define OCI_FILE_SEEK_CURRENT 2
#define OCI_FILE_SEEK_END 3
#define OCI_FILE_FORWARD 1
#define OCI_FILE_BACKWARD 2

/* Sign argument of number and integer conversions. */
#define OCI_NUMBER_UNSIGNED 0
#define OCI_NUMBER_SIGNED 2

/* Flags of OCIDateCheck. INVALID: the field is wrong; BELOW, with it: too low rather than too high. */
#define OCI_DATE_INVALID_DAY 0x1
#define OCI_DATE_DAY_BELOW_VALID 0x2
#define OCI_DATE_INVALID_MONTH 0x4
#define OCI_DATE_MONTH_BELOW_VALID 0x8
#define OCI_DATE_INVALID_YEAR 0x10
#define OCI_DATE_YEAR_BELOW_VALID 0x20
#define OCI_DATE_INVALID_HOUR 0x40
#define OCI_DATE_HOUR_BELOW_VALID 0x80
#define OCI_DATE_INVALID_MINUTE 0x100
#define OCI_DATE_MINUTE_BELOW_VALID 0x200
#define OCI_DATE_INVALID_SECOND 0x400
#define OCI_DATE_SECOND_BELOW_VALID 0x800
#define OCI_DATE_DAY_MISSING_FROM_1582 0x1000
#define OCI_DATE_YEAR_ZERO 0x2000
#define OCI_DATE_INVALID_FORMAT 0x8000

/* The same of OCIDateTimeCheck. */
#define OCI_DT_INVALID_DAY 0x1
#define OCI_DT_DAY_BELOW_VALID 0x2
#define OCI_DT_INVALID_MONTH 0x4
#define OCI_DT_MONTH_BELOW_VALID 0x8
#define OCI_DT_INVALID_YEAR 0x10
#define OCI_DT_YEAR_BELOW_VALID 0x20
#define OCI_DT_INVALID_HOUR 0x40
#define OCI_DT_HOUR_BELOW_VALID 0x80
#define OCI_DT_INVALID_MINUTE 0x100
#define OCI_DT_MINUTE_BELOW_VALID 0x200
#define OCI_DT_INVALID_SECOND 0x400
#define OCI_DT_SECOND_BELOW_VALID 0x800
#define OCI_DT_DAY_MISSING_FROM_1582 0x1000
#define OCI_DT_YEAR_ZERO 0x2000
#define OCI_DT_INVALID_TIMEZONE 0x4000
#define OCI_DT_INVALID_FORMAT 0x8000

/* Version-7 calls: opinit, olog, oparse. */
#define OCI_EV_DEF 0
#define OCI_EV_TSF 1
#define OCI_LM_DEF 0
#define OCI_LM_NBL 1

/* Failover: events, and kinds. */
#define OCI_FO_END 0x1
#define OCI_FO_ABORT 0x2
#define OCI_FO_REAUTH 0x4
#define OCI_FO_BEGIN 0x8
#define OCI_FO_ERROR 0x10
#define OCI_FO_RETRY 25410
#define OCI_FO_NONE 0x1
#define OCI_FO_SESSION 0x2
#define OCI_FO_SELECT 0x4
#define OCI_FO_TXNAL 0x8

#endif
