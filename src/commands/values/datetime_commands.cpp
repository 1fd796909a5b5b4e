// The commands on datetimes, which are named descriptors. All take an environment and an error handle first.
// Command thread only.
#include "commands/families.h"
#include "commands/shared/word_arguments.h"
#include "commands/values/date_values.h"
#include "core/state.h"

namespace {

OCIDateTime* FindDateTime(const char* word) {
    return Resolve<OCIDateTime>(Kind::datetime, word);
}

// A failing read is reported against the default error handle, with which it is read.
void PrintOrReport(OCIDateTime* datetime) {
    ReturnCodeReport(DefaultErrorHandle, PrintDateTime(datetime));
}

void RunAssign(const CommandRow& row, int, char** words) {
    const EnvironmentAndError handles(words);
    OCIDateTime* const from = FindDateTime(words[3]);
    OCIDateTime* const to = FindDateTime(words[4]);
    const sword rc = Call(&ClientLibrary::OCIDateTimeAssignNS, handles.environment, handles.error, from, to);
    TraceAndReport(row.code, "", handles.error, rc);
    if (rc == OCI_SUCCESS) PrintOrReport(to);
}

void RunCheck(const CommandRow& row, int count, char** words) {
    const EnvironmentAndError handles(words);
    OCIDateTime* const datetime = FindDateTime(words[3]);
    ResultPlace<uword> flags(count, words, 4);
    const sword rc = Call(&ClientLibrary::OCIDateTimeCheckNS, handles.environment, handles.error, datetime,
                          flags.Pointer());
    Conclude(row.code, handles.error, rc, flags);
}

void RunCompare(const CommandRow& row, int count, char** words) {
    const EnvironmentAndError handles(words);
    OCIDateTime* const left = FindDateTime(words[3]);
    OCIDateTime* const right = FindDateTime(words[4]);
    int order = 0;
    const sword rc = Call(&ClientLibrary::OCIDateTimeCompareNS, handles.environment, handles.error, left, right,
                          Place(order, count, words, 5));
    TraceAndReport(row.code, "", handles.error, rc);
    if (rc == OCI_SUCCESS) Message(kOutput, "%d\n", order);
}

void RunConstruct(const CommandRow& row, int, char** words) {
    const EnvironmentAndError handles(words);
    OCIDateTime* const datetime = FindDateTime(words[3]);
    TextArgument zone;
    if (!SetTextWords(zone, words + 11)) return;
    const sword rc = Call(&ClientLibrary::OCIDateTimeConstructNS, handles.environment, handles.error, datetime,
                          static_cast<sb2>(DecodeNumber(words[4])), static_cast<ub1>(DecodeNumber(words[5])),
                          static_cast<ub1>(DecodeNumber(words[6])), static_cast<ub1>(DecodeNumber(words[7])),
                          static_cast<ub1>(DecodeNumber(words[8])), static_cast<ub1>(DecodeNumber(words[9])),
                          static_cast<ub4>(DecodeNumber(words[10])), zone.Text(), zone.Length());
    TraceAndReport(row.code, "", handles.error, rc);
    if (rc == OCI_SUCCESS) PrintOrReport(datetime);
}

void RunGetDate(const CommandRow& row, int count, char** words) {
    const EnvironmentAndError handles(words);
    OCIDateTime* const datetime = FindDateTime(words[3]);
    sb2 year = 0;
    ub1 month = 0;
    ub1 day = 0;
    const sword rc = Call(&ClientLibrary::OCIDateTimeGetDateNS, handles.environment, handles.error, datetime,
                          Place(year, count, words, 4), Place(month, count, words, 5), Place(day, count, words, 6));
    TraceAndReport(row.code, "", handles.error, rc);
    if (rc == OCI_SUCCESS) Message(kOutput, "year-%d, month-%d, day-%d\n", year, month, day);
}

struct TimeOfDay {
    ub1 hour = 0;
    ub1 minute = 0;
    ub1 second = 0;
    ub4 fraction = 0;
};

void RunGetTime(const CommandRow& row, int count, char** words) {
    const EnvironmentAndError handles(words);
    OCIDateTime* const datetime = FindDateTime(words[3]);
    TimeOfDay time;
    const sword rc = Call(&ClientLibrary::OCIDateTimeGetTimeNS, handles.environment, handles.error, datetime,
                          Place(time.hour, count, words, 4), Place(time.minute, count, words, 5),
                          Place(time.second, count, words, 6), Place(time.fraction, count, words, 7));
    TraceAndReport(row.code, "", handles.error, rc);
    if (rc != OCI_SUCCESS) return;
    Message(kOutput, "hour-%d, minute-%d, second-%d, fraction-%d\n", time.hour, time.minute, time.second,
            static_cast<int>(time.fraction));
}

void RunSetDate(const CommandRow& row, int, char** words) {
    const EnvironmentAndError handles(words);
    OCIDateTime* const datetime = FindDateTime(words[3]);
    const sword rc = Call(&ClientLibrary::OCI_datetimeSetDate, handles.environment, handles.error, datetime,
                          static_cast<sb2>(DecodeNumber(words[4])), static_cast<ub1>(DecodeNumber(words[5])),
                          static_cast<ub1>(DecodeNumber(words[6])));
    TraceAndReport(row.code, "", handles.error, rc);
    if (rc == OCI_SUCCESS) PrintOrReport(datetime);
}

// What was set is read back and printed, in a form that differs from that of getting in its blanks.
void RunSetTime(const CommandRow& row, int, char** words) {
    const EnvironmentAndError handles(words);
    OCIDateTime* const datetime = FindDateTime(words[3]);
    sword rc = Call(&ClientLibrary::OCI_datetimeSetTime, handles.environment, handles.error, datetime,
                    static_cast<ub1>(DecodeNumber(words[4])), static_cast<ub1>(DecodeNumber(words[5])),
                    static_cast<ub1>(DecodeNumber(words[6])), static_cast<ub4>(DecodeNumber(words[7])));
    TraceAndReport(row.code, "", handles.error, rc);
    if (rc != OCI_SUCCESS) return;
    TimeOfDay time;
    rc = Call(&ClientLibrary::OCIDateTimeGetTimeNS, handles.environment, handles.error, datetime, &time.hour,
              &time.minute, &time.second, &time.fraction);
    if (rc != OCI_SUCCESS) return ReturnCodeReport(handles.error, rc);
    Message(kOutput, "hour - %d, minute - %d, second - %d, fraction - %d\n", time.hour, time.minute, time.second,
            static_cast<int>(time.fraction));
}

constexpr PlainCommand kDateTimeCommands[] = {
    {{Code::ocidatetimeassign, Words(5), "OCIDateTimeAssign hEnv hError from to"}, RunAssign},
    {{Code::ocidatetimecheck, WordsBetween(4, 5), "OCIDateTimeCheck hEnv hError date [valid]"}, RunCheck},
    {{Code::ocidatetimecompare, WordsBetween(5, 6), "OCIDateTimeCompare hEnv hError date1 date2 [result]"}, RunCompare},
    {{Code::ocidatetimeconstruct, Words(13),
      "OCIDateTimeConstruct hEnv hError hDate year month day hour min sec frac timezone timezone_len"},
     RunConstruct},
    {{Code::ocidatetimegetdate, Words(4, 7), "OCIDateTimeGetDate hEnv hError hDate [year month day]"}, RunGetDate},
    {{Code::ocidatetimegettime, Words(4, 8), "OCIDateTimeGetTime hEnv hError hDate [hour minute second fraction]"},
     RunGetTime},
    {{Code::ocidatetimesetdate, Words(7), "OCIDateTimeSetDate hEnv hError hDate year month day"}, RunSetDate},
    {{Code::ocidatetimesettime, Words(8), "OCIDateTimeSetTime hEnv hError hDate hour min sec frac"}, RunSetTime},
};

}  // namespace

void AddDateTimeCommands(HandlerTable& handlers) {
    handlers.Add(kDateTimeCommands);
}
