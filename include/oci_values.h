/* Functions on values: numbers, dates, datetimes, strings, raws, row ids. */
#ifndef OCI_VALUES_H
#define OCI_VALUES_H

#include "oci_types.h"

#ifdef __cplusplus
extern "C" {
#endif
#pragma GCC visibility push(default)

/* Numbers. The result is written on success only. */
sword OCINumberAbs(OCIError *err, CONST OCINumber *number, OCINumber *result);
sword OCINumberArcCos(OCIError *err, CONST OCINumber *number, OCINumber *result);
sword OCINumberArcSin(OCIError *err, CONST OCINumber *number, OCINumber *result);
sword OCINumberArcTan(OCIError *err, CONST OCINumber *number, OCINumber *result);
sword OCINumberAssign(OCIError *err, CONST OCINumber *number, OCINumber *result);
sword OCINumberCeil(OCIError *err, CONST OCINumber *number, OCINumber *result);
sword OCINumberCos(OCIError *err, CONST OCINumber *number, OCINumber *result);
sword OCINumberExp(OCIError *err, CONST OCINumber *number, OCINumber *result);
sword OCINumberFloor(OCIError *err, CONST OCINumber *number, OCINumber *result);
sword OCINumberHypCos(OCIError *err, CONST OCINumber *number, OCINumber *result);
sword OCINumberHypSin(OCIError *err, CONST OCINumber *number, OCINumber *result);
sword OCINumberHypTan(OCIError *err, CONST OCINumber *number, OCINumber *result);
sword OCINumberLn(OCIError *err, CONST OCINumber *number, OCINumber *result);
sword OCINumberNeg(OCIError *err, CONST OCINumber *number, OCINumber *result);
sword OCINumberSin(OCIError *err, CONST OCINumber *number, OCINumber *result);
sword OCINumberSqrt(OCIError *err, CONST OCINumber *number, OCINumber *result);
sword OCINumberTan(OCIError *err, CONST OCINumber *number, OCINumber *result);
sword OCINumberAdd(OCIError *err, CONST OCINumber *number1, CONST OCINumber *number2, OCINumber *result);
sword OCINumberArcTan2(OCIError *err, CONST OCINumber *number1, CONST OCINumber *number2, OCINumber *result);
sword OCINumberDiv(OCIError *err, CONST OCINumber *number1, CONST OCINumber *number2, OCINumber *result);
sword OCINumberLog(OCIError *err, CONST OCINumber *base, CONST OCINumber *number, OCINumber *result);
sword OCINumberMod(OCIError *err, CONST OCINumber *number1, CONST OCINumber *number2, OCINumber *result);
sword OCINumberMul(OCIError *err, CONST OCINumber *number1, CONST OCINumber *number2, OCINumber *result);
sword OCINumberPower(OCIError *err, CONST OCINumber *base, CONST OCINumber *exponent, OCINumber *result);
sword OCINumberSub(OCIError *err, CONST OCINumber *number1, CONST OCINumber *number2, OCINumber *result);
sword OCINumberIntPower(OCIError *err, CONST OCINumber *number, sword exponent, OCINumber *result);
sword OCINumberPrec(OCIError *err, CONST OCINumber *number, eword digits, OCINumber *result);
sword OCINumberRound(OCIError *err, CONST OCINumber *number, sword places, OCINumber *result);
sword OCINumberShift(OCIError *err, CONST OCINumber *number, sword digits, OCINumber *result);
sword OCINumberTrunc(OCIError *err, CONST OCINumber *number, sword places, OCINumber *result);
sword OCINumberInc(OCIError *err, OCINumber *number);
sword OCINumberDec(OCIError *err, OCINumber *number);
sword OCINumberSign(OCIError *err, CONST OCINumber *number, sword *result);
sword OCINumberCmp(OCIError *err, CONST OCINumber *number1, CONST OCINumber *number2, sword *result);
sword OCINumberIsInt(OCIError *err, CONST OCINumber *number, boolean *result);
sword OCINumberIsZero(OCIError *err, CONST OCINumber *number, boolean *result);
void OCINumberSetZero(OCIError *err, OCINumber *number);
void OCINumberSetPi(OCIError *err, OCINumber *number);
sword OCINumberFromInt(OCIError *err, CONST dvoid *value, uword length, uword sign, OCINumber *out);
sword OCINumberToInt(OCIError *err, CONST OCINumber *number, uword length, uword sign, dvoid *out);
sword OCINumberFromReal(OCIError *err, CONST dvoid *value, uword length, OCINumber *out);
sword OCINumberToReal(OCIError *err, CONST OCINumber *number, uword length, dvoid *out);
sword OCINumberToRealArray(OCIError *err, CONST OCINumber **numbers, uword elems, uword length, dvoid *out);
/* The length stored behind bufsize does not count the terminator. */
sword OCINumberFromText(OCIError *err, CONST OraText *str, ub4 strLen, CONST OraText *fmt, ub4 fmtLen,
                        CONST OraText *nls, ub4 nlsLen, OCINumber *out);
sword OCINumberToText(OCIError *err, CONST OCINumber *number, CONST OraText *fmt, ub4 fmtLen, CONST OraText *nls,
                      ub4 nlsLen, ub4 *bufsize, OraText *buf);

/* Dates. The length of a format is one byte wide. */
sword OCIDateAddDays(OCIError *err, CONST OCIDate *date, sb4 days, OCIDate *out);
sword OCIDateAddMonths(OCIError *err, CONST OCIDate *date, sb4 months, OCIDate *out);
sword OCIDateAssign(OCIError *err, CONST OCIDate *from, OCIDate *to);
sword OCIDateCheck(OCIError *err, CONST OCIDate *date, uword *flags);
sword OCIDateCompare(OCIError *err, CONST OCIDate *date1, CONST OCIDate *date2, sword *out);
sword OCIDateDaysBetween(OCIError *err, CONST OCIDate *date1, CONST OCIDate *date2, sb4 *days);
sword OCIDateFromText(OCIError *err, CONST OraText *str, ub4 strLen, CONST OraText *fmt, ub1 fmtLen,
                      CONST OraText *lang, ub4 langLen, OCIDate *out);
sword OCIDateLastDay(OCIError *err, CONST OCIDate *date, OCIDate *out);
sword OCIDateNextDay(OCIError *err, CONST OCIDate *date, CONST OraText *day, ub4 dayLen, OCIDate *out);
sword OCIDateSysDate(OCIError *err, OCIDate *out);
sword OCIDateToText(OCIError *err, CONST OCIDate *date, CONST OraText *fmt, ub1 fmtLen, CONST OraText *lang,
                    ub4 langLen, ub4 *bufsize, OraText *buf);

/* Datetimes; `hndl` is an environment or a session. Besides the published functions, the names of the driver that end
   in NS take the same arguments, and the two setters change one half of a descriptor. Fractions are nanoseconds. */
sword OCIDateTimeAssign(dvoid *hndl, OCIError *err, CONST OCIDateTime *from, OCIDateTime *to);
sword OCIDateTimeCheck(dvoid *hndl, OCIError *err, CONST OCIDateTime *date, ub4 *flags);
sword OCIDateTimeCompare(dvoid *hndl, OCIError *err, CONST OCIDateTime *date1, CONST OCIDateTime *date2, sword *out);
sword OCIDateTimeConstruct(dvoid *hndl, OCIError *err, OCIDateTime *date, sb2 year, ub1 month, ub1 day, ub1 hour,
                           ub1 min, ub1 sec, ub4 fsec, OraText *tz, size_t tzLen);
sword OCIDateTimeGetDate(dvoid *hndl, OCIError *err, CONST OCIDateTime *date, sb2 *year, ub1 *month, ub1 *day);
sword OCIDateTimeGetTime(dvoid *hndl, OCIError *err, OCIDateTime *date, ub1 *hour, ub1 *min, ub1 *sec, ub4 *fsec);
sword OCIDateTimeAssignNS(dvoid *hndl, OCIError *err, CONST OCIDateTime *from, OCIDateTime *to);
sword OCIDateTimeCheckNS(dvoid *hndl, OCIError *err, CONST OCIDateTime *date, ub4 *flags);
sword OCIDateTimeCompareNS(dvoid *hndl, OCIError *err, CONST OCIDateTime *date1, CONST OCIDateTime *date2, sword *out);
sword OCIDateTimeConstructNS(dvoid *hndl, OCIError *err, OCIDateTime *date, sb2 year, ub1 month, ub1 day, ub1 hour,
                             ub1 min, ub1 sec, ub4 fsec, OraText *tz, size_t tzLen);
sword OCIDateTimeGetDateNS(dvoid *hndl, OCIError *err, CONST OCIDateTime *date, sb2 *year, ub1 *month, ub1 *day);
sword OCIDateTimeGetTimeNS(dvoid *hndl, OCIError *err, OCIDateTime *date, ub1 *hour, ub1 *min, ub1 *sec, ub4 *fsec);
sword OCI_datetimeSetDate(dvoid *hndl, OCIError *err, OCIDateTime *date, sb2 year, ub1 month, ub1 day);
sword OCI_datetimeSetTime(dvoid *hndl, OCIError *err, OCIDateTime *date, ub1 hour, ub1 min, ub1 sec, ub4 fsec);

/* Strings and raws: made by assigning or resizing through a null pointer, freed by resizing to 0. Row ids as text. */
sword OCIStringAllocSize(OCIEnv *env, OCIError *err, CONST OCIString *string, ub4 *size);
sword OCIStringAssign(OCIEnv *env, OCIError *err, CONST OCIString *rhs, OCIString **lhs);
sword OCIStringAssignText(OCIEnv *env, OCIError *err, CONST OraText *rhs, ub4 rhsLen, OCIString **lhs);
sword OCIStringResize(OCIEnv *env, OCIError *err, ub4 newSize, OCIString **string);
OraText *OCIStringPtr(OCIEnv *env, CONST OCIString *string);
ub4 OCIStringSize(OCIEnv *env, CONST OCIString *string);
sword OCIRawAllocSize(OCIEnv *env, OCIError *err, CONST OCIRaw *raw, ub4 *size);
sword OCIRawAssignBytes(OCIEnv *env, OCIError *err, CONST ub1 *rhs, ub4 rhsLen, OCIRaw **lhs);
sword OCIRawAssignRaw(OCIEnv *env, OCIError *err, CONST OCIRaw *rhs, OCIRaw **lhs);
sword OCIRawResize(OCIEnv *env, OCIError *err, ub4 newSize, OCIRaw **raw);
ub1 *OCIRawPtr(OCIEnv *env, CONST OCIRaw *raw);
ub4 OCIRawSize(OCIEnv *env, CONST OCIRaw *raw);
sword OCIRowidToChar(OCIRowid *rid, OraText *buf, ub2 *len, OCIError *err);

#pragma GCC visibility pop
#ifdef __cplusplus
}
#endif

#endif
