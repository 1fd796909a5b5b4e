/* What applications name, compiled once as C and once as C++, and linked: functions that are called, types that are
   declared, constants that are read. Compiling and linking is the test; it answers the number of functions. */
#include <stdio.h>

#include "oci.h"

typedef void (*AnyFunction)(void);
#define F(name) (AnyFunction)name

static const AnyFunction kFunctions[] = {
    F(OCIEnvNlsCreate), F(OCINlsCharSetNameToId), F(OCINlsCharSetIdToName), F(OCINlsCharSetConvert),
    F(OCINlsEnvironmentVariableGet), F(OCINlsGetInfo), F(OCINlsNumericInfoGet), F(OCICharSetToUnicode),
    F(OCIUnicodeToCharSet), F(OCIDateTimeGetTimeZoneOffset), F(OCIDateTimeGetTimeZoneName), F(OCIDateTimeFromText),
    F(OCIDateTimeToText), F(OCIDateTimeConvert), F(OCIDateTimeSubtract), F(OCIDateTimeIntervalAdd),
    F(OCIDateTimeIntervalSub), F(OCIDateTimeSysTimeStamp), F(OCIIntervalSetDaySecond), F(OCIIntervalSetYearMonth),
    F(OCIIntervalGetDaySecond), F(OCIIntervalGetYearMonth), F(OCIIntervalFromText), F(OCIIntervalToText),
    F(OCIIntervalAdd), F(OCIIntervalSubtract), F(OCIIntervalCompare), F(OCIIntervalAssign), F(OCIDescribeAny),
    F(OCIAttrSet), F(OCIDateTimeConstruct), F(OCIServerVersion), F(OCIBindByName2), F(OCIBindByPos2), F(OCIDefineByPos2),
    F(OCILobRead2), F(OCILobWrite2), F(OCILobWriteAppend2), F(OCILobGetLength2), F(OCILobTrim2), F(OCILobErase2),
    F(OCILobCopy2), F(OCILobWriteAppend), F(OCILobCharSetForm), F(OCILobCharSetId), F(OCILobGetChunkSize), F(OCILobRead),
    F(OCILobWrite), F(OCILobGetLength), F(OCILobTrim), F(OCILobErase), F(OCILobCopy), F(OCILobAppend), F(OCILobAssign),
    F(OCILobLocatorAssign), F(OCILobIsEqual), F(OCILobIsOpen), F(OCILobIsTemporary), F(OCILobLocatorIsInit), F(OCILobOpen),
    F(OCILobClose), F(OCILobCreateTemporary), F(OCILobFreeTemporary), F(OCILobEnableBuffering), F(OCILobDisableBuffering),
    F(OCILobFlushBuffer), F(OCIStmtGetNextResult), F(OCITransStart), F(OCITransCommit), F(OCITransRollback)};

static const unsigned long long kConstants[] = {
    SQLCS_NCHAR, SQLCS_IMPLICIT, SQLT_INTERVAL_YM, SQLT_INTERVAL_DS, OCI_DTYPE_INTERVAL_YM, OCI_DTYPE_INTERVAL_DS,
    OCI_UTF16ID, OCI_NLS_MAXBUFSZ, OCI_NLS_CHARSET_ID, OCI_NLS_CHARSET_MAXBYTESZ, OCI_TYPECODE_BDOUBLE,
    OCI_TYPECODE_BFLOAT, UB4MAXVAL, SB4MAXVAL, UB2MAXVAL, SB2MAXVAL, UB1MAXVAL, SB1MAXVAL, OCI_FO_END, OCI_FO_ABORT,
    OCI_FO_REAUTH, OCI_FO_BEGIN, OCI_FO_ERROR, OCI_FO_RETRY, OCI_FO_NONE, OCI_FO_SESSION, OCI_FO_SELECT, OCI_FO_TXNAL,
    OCI_ATTR_CHARSET_FORM, OCI_ATTR_CHARSET_ID, OCI_ATTR_NONBLOCKING_MODE, OCI_ATTR_PREFETCH_ROWS,
    OCI_ATTR_PREFETCH_MEMORY, OCI_ATTR_FOCBK, OCI_DESCRIBE_ONLY, OCI_PREP2_CACHE_SEARCHONLY, SQLT_AFV, OCI_ATTR_MODULE,
    OCI_ATTR_ACTION, OCI_ATTR_CLIENT_IDENTIFIER, OCI_ATTR_STMTCACHESIZE, OCI_ATTR_CURRENT_SCHEMA};

static sb4 Failover(dvoid *svc, dvoid *env, dvoid *ctx, ub4 type, ub4 event) {
    return svc || env || ctx || type == event ? OCI_CONTINUE : OCI_CONTINUE;
}

int main(void) {
    const OCICallbackFailover callback = Failover;
    OCIFocbkStruct failover;
    OCIInterval *interval = NULL;
    OCIDate date;
    utext unit = 0xFFFF;
    sb2 year;
    ub1 month, day, hour, minute, second;
    failover.callback_function = callback;
    failover.fo_ctx = interval;
    OCIDateSetDate(&date, 2024, 2, 29);
    OCIDateSetTime(&date, 23, 59, 58);
    OCIDateGetDate(&date, &year, &month, &day);
    OCIDateGetTime(&date, &hour, &minute, &second);
    printf("%u functions, %u constants\n", (unsigned)(sizeof kFunctions / sizeof *kFunctions),
           (unsigned)(sizeof kConstants / sizeof *kConstants));
    return kFunctions[0] && failover.callback_function == callback && unit == UB2MAXVAL && sizeof unit == 2 &&
                   year == 2024 && month + day + hour + minute + second == 171 && kConstants[12] == 4294967295U
               ? 0
               : 1;
}
