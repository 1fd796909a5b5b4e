/* Functions on intervals, and on datetimes as text, with their zones and with intervals. `hndl` is an environment or a
   session. An interval descriptor is OCI_DTYPE_INTERVAL_YM (years and months) or OCI_DTYPE_INTERVAL_DS (days to
   fractions, which are nanoseconds); all parts of one have the same sign. */
#ifndef OCI_INTERVALS_H
#define OCI_INTERVALS_H

#include "oci_types.h"

#ifdef __cplusplus
extern "C" {
#endif
#pragma GCC visibility push(default)

sword OCIIntervalSetDaySecond(dvoid *hndl, OCIError *err, sb4 day, sb4 hour, sb4 minute, sb4 second, sb4 fraction,
                              OCIInterval *result);
sword OCIIntervalSetYearMonth(dvoid *hndl, OCIError *err, sb4 year, sb4 month, OCIInterval *result);
sword OCIIntervalGetDaySecond(dvoid *hndl, OCIError *err, sb4 *day, sb4 *hour, sb4 *minute, sb4 *second, sb4 *fraction,
                              CONST OCIInterval *interval);
sword OCIIntervalGetYearMonth(dvoid *hndl, OCIError *err, sb4 *year, sb4 *month, CONST OCIInterval *interval);
/* "[+-]years[-months]" or "[+-]days[ hours[:minutes[:seconds[.fraction]]]]", by the descriptor's type; written with
   lfprec digits of years or days at least and fsprec of the fraction, at most nine each. */
sword OCIIntervalFromText(dvoid *hndl, OCIError *err, CONST OraText *text, size_t length, OCIInterval *result);
sword OCIIntervalToText(dvoid *hndl, OCIError *err, CONST OCIInterval *interval, ub1 lfprec, ub1 fsprec,
                        OraText *buffer, size_t buflen, size_t *resultlen);
sword OCIIntervalAdd(dvoid *hndl, OCIError *err, OCIInterval *addend1, OCIInterval *addend2, OCIInterval *result);
sword OCIIntervalSubtract(dvoid *hndl, OCIError *err, OCIInterval *minuend, OCIInterval *subtrahend,
                          OCIInterval *result);
sword OCIIntervalCompare(dvoid *hndl, OCIError *err, OCIInterval *inter1, OCIInterval *inter2, sword *result);
sword OCIIntervalAssign(dvoid *hndl, OCIError *err, CONST OCIInterval *from, OCIInterval *to);
sword OCIIntervalCheck(dvoid *hndl, OCIError *err, CONST OCIInterval *interval, ub4 *valid);

/* An area's size is told before, and set to the text's length in bytes; no terminator is written. */
sword OCIDateTimeFromText(dvoid *hndl, OCIError *err, CONST OraText *str, size_t strLen, CONST OraText *fmt, ub1 fmtLen,
                          CONST OraText *lang, size_t langLen, OCIDateTime *out);
sword OCIDateTimeToText(dvoid *hndl, OCIError *err, CONST OCIDateTime *date, CONST OraText *fmt, ub1 fmtLen, ub1 fsprec,
                        CONST OraText *lang, size_t langLen, ub4 *bufsize, OraText *buf);
sword OCIDateTimeGetTimeZoneOffset(dvoid *hndl, OCIError *err, CONST OCIDateTime *date, sb1 *hour, sb1 *minute);
sword OCIDateTimeGetTimeZoneName(dvoid *hndl, OCIError *err, CONST OCIDateTime *date, ub1 *buf, ub4 *buflen);
sword OCIDateTimeConvert(dvoid *hndl, OCIError *err, OCIDateTime *from, OCIDateTime *to);
sword OCIDateTimeSysTimeStamp(dvoid *hndl, OCIError *err, OCIDateTime *out);
sword OCIDateTimeSubtract(dvoid *hndl, OCIError *err, OCIDateTime *date1, OCIDateTime *date2, OCIInterval *result);
sword OCIDateTimeIntervalAdd(dvoid *hndl, OCIError *err, OCIDateTime *date, OCIInterval *interval, OCIDateTime *out);
sword OCIDateTimeIntervalSub(dvoid *hndl, OCIError *err, OCIDateTime *date, OCIInterval *interval, OCIDateTime *out);

#pragma GCC visibility pop
#ifdef __cplusplus
}
#endif

#endif
