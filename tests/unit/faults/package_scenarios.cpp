// Numbers, dates, strings and raws, files, threads.
#include <atomic>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <thread>

#include "faults/scenarios.h"

namespace faults {
namespace {

// ---- Numbers

OCINumber Number(World& w, std::string_view text, std::string format = {}) {
    OCINumber number{};
    if (format.empty()) format.assign(text.size(), '9');
    w.STEP(OCINumberFromText, w.err, World::Text(text), World::Size(text), World::Text(format), World::Size(format),
           nullptr, 0, &number);
    return number;
}

void SeeNumber(World& w, const OCINumber& number) {
    OraText text[60] = "";
    ub4 size = sizeof text;
    w.STEP(OCINumberToText, w.err, &number, World::Text("S99.999999EEEE"), 14, nullptr, 0, &size, text);
    w.See({reinterpret_cast<char*>(text), size});
}

void NumberArithmetic(World& w) {
    const OCINumber one = Number(w, "12345678901234567890.5"), other = Number(w, "987654321.25");
    using Function = sword (*)(OCIError*, const OCINumber*, const OCINumber*, OCINumber*);
    for (const Function function : {OCINumberAdd, OCINumberSub, OCINumberMul, OCINumberDiv, OCINumberMod}) {
        OCINumber result{};
        w.Step("a number function", [&] { return function(w.err, &one, &other, &result); });
        SeeNumber(w, result);
    }
}

void NumberFunctions(World& w) {
    const OCINumber half = Number(w, "0.5"), large = Number(w, "123.456"), exponent = Number(w, "7.25");
    using Unary = sword (*)(OCIError*, const OCINumber*, OCINumber*);
    for (const Unary function :
         {OCINumberAbs, OCINumberCeil, OCINumberFloor, OCINumberNeg, OCINumberArcCos, OCINumberArcSin,
          OCINumberArcTan, OCINumberCos, OCINumberExp, OCINumberHypCos, OCINumberHypSin, OCINumberHypTan, OCINumberLn,
          OCINumberSin, OCINumberSqrt, OCINumberTan}) {
        OCINumber result{};
        w.Step("a number function", [&] { return function(w.err, &half, &result); });
        SeeNumber(w, result);
    }
    // An argument whose last quarter turn takes 420 bits, a tie that takes all bits, and a result next to a tie.
    const OCINumber huge = Number(w, "9.876E125", "9.999EEEE"), root = Number(w, "3.00000000000000000005"),
                    two = Number(w, "2"), tiny = Number(w, "5E-39", "9EEEE");
    OCINumber result{};
    w.STEP(OCINumberSin, w.err, &huge, &result);
    SeeNumber(w, result);
    w.STEP(OCINumberPower, w.err, &root, &two, &result);
    SeeNumber(w, result);
    w.STEP(OCINumberExp, w.err, &tiny, &result);
    SeeNumber(w, result);
    using Binary = sword (*)(OCIError*, const OCINumber*, const OCINumber*, OCINumber*);
    for (const Binary function : {OCINumberPower, OCINumberLog, OCINumberArcTan2}) {
        w.Step("a number function", [&] { return function(w.err, &large, &exponent, &result); });
        SeeNumber(w, result);
    }
    w.STEP(OCINumberIntPower, w.err, &large, 17, &result);
    SeeNumber(w, result);
}

void NumberForms(World& w) {
    const double real = 1234.0625;
    OCINumber number{};
    w.STEP(OCINumberFromReal, w.err, &real, sizeof real, &number);
    long double back = 0;
    w.STEP(OCINumberToReal, w.err, &number, sizeof back, &back);
    w.See(static_cast<long>(back * 10000));
    w.STEP(OCINumberFromReal, w.err, &back, sizeof back, &number);
    OCINumber amount{};
    w.STEP(OCINumberFromText, w.err, World::Text("$1,234.5"), 8, World::Text("$9,999.9"), 8, nullptr, 0, &amount);
    SeeNumber(w, amount);
    for (const std::string_view format : {"L9G999D99", "TM9", "RN", "9.9EEEE", "FM0000V99", "XXXXXX"}) {
        OraText text[80] = "";
        ub4 size = sizeof text;
        constexpr std::string_view kSettings = "NLS_NUMERIC_CHARACTERS=',.' NLS_CURRENCY='EUR'";
        w.STEP(OCINumberToText, w.err, &number, World::Text(format), World::Size(format), World::Text(kSettings),
               World::Size(kSettings), &size, text);
        w.See({reinterpret_cast<char*>(text), size});
    }
}

// ---- Dates

void Dates(World& w) {
    OCIDate date{};
    w.STEP(OCIDateFromText, w.err, World::Text("Friday 29 FEBRUARY 2008 11:12:13"), 32,
           World::Text("DAY DD MONTH YYYY HH24:MI:SS"), 28, nullptr, 0, &date);
    w.STEP(OCIDateNextDay, w.err, &date, World::Text("MONDAY"), 6, &date);
    w.STEP(OCIDateAddMonths, w.err, &date, 11, &date);
    OCIDate now{}, this_century{};
    w.STEP(OCIDateSysDate, w.err, &now);
    EXPECT_GT(now.OCIDateYYYY, 2000);
    w.STEP(OCIDateFromText, w.err, World::Text("29-FEB-24"), 9, World::Text("DD-MON-RR"), 9, nullptr, 0, &this_century);
    w.See(this_century.OCIDateYYYY);
    OraText text[200] = "";
    ub4 size = sizeof text;
    constexpr std::string_view kFormat = "FMDay, DDTH \"of the month of\" Month YYYY, JSP, HH:MI:SS AM";
    w.STEP(OCIDateToText, w.err, &date, World::Text(kFormat), static_cast<ub1>(kFormat.size()), World::Text("FRENCH"),
           6, &size, text);
    w.See({reinterpret_cast<char*>(text), size});
}

// Regions are read once for a process: each run takes one of its own.
std::vector<std::string> regions;

void FindRegions(World&) {
    if (!regions.empty()) return;
    const std::filesystem::path all("/usr/share/zoneinfo");
    for (const char* part : {"Africa", "America", "Asia", "Europe"}) {
        for (const auto& entry : std::filesystem::directory_iterator(all / part)) {
            if (entry.is_regular_file()) regions.push_back(std::string(part) + '/' + entry.path().filename().string());
        }
    }
    EXPECT_GT(regions.size(), 200u);
}

void Datetimes(World& w) {
    auto* there = w.NewDescriptor<OCIDateTime>(OCI_DTYPE_TIMESTAMP_TZ);
    auto* here = w.NewDescriptor<OCIDateTime>(OCI_DTYPE_TIMESTAMP_TZ);
    static std::size_t next = 0;
    const std::string zone = regions[next++ % regions.size()];
    const auto construct = [&](OCIDateTime* value, std::string_view name) {
        return OCIDateTimeConstruct(w.env, w.err, value, 2024, 7, 15, 13, 14, 15, 5, World::Text(name), name.size());
    };
    w.Step("OCIDateTimeConstruct", [&] { return construct(there, zone); });
    w.Step("OCIDateTimeConstruct", [&] { return construct(here, "-12:00"); });
    sword order = 0;
    w.STEP(OCIDateTimeCompare, w.env, w.err, there, here, &order);
    w.See(order);
    w.Step("OCIDateTimeConstruct", [&] { return construct(here, ""); });
    w.STEP(OCIDateTimeAssign, w.env, w.err, there, here);
    ub1 hour = 0, minute = 0, second = 0;
    ub4 fraction = 0;
    w.STEP(OCIDateTimeGetTime, w.env, w.err, here, &hour, &minute, &second, &fraction);
    w.See(hour);
}

// Sets have their tables for the life of the process: each run takes one that none has asked for yet, while any is left.
void CharacterSets(World& w) {
    constexpr sb4 kUnknownSet = 24329;    // what the system answers for a table that it has no memory for
    static std::size_t next = 0;
    constexpr ub2 kSets[] = {31, 32, 46, 170, 171, 178};
    const ub2 set = kSets[next++ % std::size(kSets)];
    char text[8] = "";
    size_t length = 0;
    const struct { ub2 to, from; } ways[] = {{set, 873}, {873, set}};
    for (const auto& way : ways) {
        w.Step("OCINlsCharSetConvert", [&] {
            return OCINlsCharSetConvert(w.env, w.err, way.to, text, sizeof text, way.from, "ab", 2, &length);
        }, Told::error_handle, kUnknownSet);
        w.See({text, length});
    }
}

void Intervals(World& w) {
    auto* moment = w.NewDescriptor<OCIDateTime>(OCI_DTYPE_TIMESTAMP);
    auto* days = w.NewDescriptor<OCIInterval>(OCI_DTYPE_INTERVAL_DS);
    w.Step("OCIIntervalFromText", [&] { return OCIIntervalFromText(w.env, w.err, World::Text("-1 2:3:4.5"), 10, days); });
    w.Step("OCIDateTimeConstruct", [&] {
        return OCIDateTimeConstruct(w.env, w.err, moment, 2024, 7, 15, 13, 14, 15, 5, nullptr, 0);
    });
    w.Step("OCIDateTimeIntervalAdd", [&] { return OCIDateTimeIntervalAdd(w.env, w.err, moment, days, moment); });
    OraText text[60] = "";
    ub4 size = sizeof text;
    w.Step("OCIDateTimeToText", [&] {
        return OCIDateTimeToText(w.env, w.err, moment, nullptr, 0, 9, nullptr, 0, &size, text);
    });
    w.See({reinterpret_cast<char*>(text), size});
}

// The zone of the process, which is read once.
void ZoneOfTheProcess(World& w) {
    auto* zoned = w.NewDescriptor<OCIDateTime>(OCI_DTYPE_TIMESTAMP_TZ);
    auto* plain = w.NewDescriptor<OCIDateTime>(OCI_DTYPE_TIMESTAMP);
    auto* local = w.NewDescriptor<OCIDateTime>(OCI_DTYPE_TIMESTAMP_LTZ);
    const auto construct = [&](OCIDateTime* value, std::string_view zone) {
        w.STEP(OCIDateTimeConstruct, w.env, w.err, value, 2024, 7, 15, 13, 14, 15, 5, World::Text(zone), zone.size());
    };
    OCIDate now{};
    sword order = 0;
    ub1 hour = 0, minute = 0, second = 0;
    ub4 fraction = 0;
    w.STEP(OCIDateSysDate, w.err, &now);
    construct(plain, "");
    construct(zoned, "+05:30");
    w.STEP(OCIDateTimeCompare, w.env, w.err, plain, zoned, &order);
    w.See(order);
    w.STEP(OCIDateTimeAssign, w.env, w.err, zoned, local);
    w.STEP(OCIDateTimeAssign, w.env, w.err, plain, zoned);
    w.STEP(OCIDateTimeGetTime, w.env, w.err, zoned, &hour, &minute, &second, &fraction);
    w.See(hour);
}

void InStJohns(World&) { setenv("TZ", ":America/St_Johns", 1); }

// ---- Strings and raws

void Strings(World& w) {
    static OCIString *string, *copy;
    string = copy = nullptr;
    w.AtEnd([&w] {
        const sword code = copy ? OCIStringResize(w.env, w.err, 0, &copy) : OCI_SUCCESS;
        return string ? OCIStringResize(w.env, w.err, 0, &string) : code;
    });
    const auto contents = [&](OCIString* one) {
        return std::string_view(reinterpret_cast<char*>(OCIStringPtr(w.env, one)), OCIStringSize(w.env, one));
    };
    const auto assign = [&](std::string_view text) {
        return OCIStringAssignText(w.env, w.err, World::Text(text), World::Size(text), &string);
    };
    w.Step("OCIStringAssignText", [&] { return assign("hello"); });
    try {
        w.Step("OCIStringAssignText", [&] { return assign("a text that is too long for the room of the first"); });
        w.STEP(OCIStringResize, w.env, w.err, 1000, &string);
    } catch (const Stopped&) {
        EXPECT_TRUE(contents(string) == "hello" || contents(string).size() == 49) << contents(string);
        throw;
    }
    w.STEP(OCIStringAssign, w.env, w.err, string, &copy);
    w.See(contents(copy));
}

void Raws(World& w) {
    static OCIRaw *raw, *copy;
    raw = copy = nullptr;
    w.AtEnd([&w] {
        const sword code = copy ? OCIRawResize(w.env, w.err, 0, &copy) : OCI_SUCCESS;
        return raw ? OCIRawResize(w.env, w.err, 0, &raw) : code;
    });
    const ub1 bytes[100] = {1, 2, 3};
    w.STEP(OCIRawAssignBytes, w.env, w.err, bytes, 3, &raw);
    try {
        w.STEP(OCIRawAssignBytes, w.env, w.err, bytes, 100, &raw);
        w.STEP(OCIRawResize, w.env, w.err, 2000, &raw);
    } catch (const Stopped&) {
        EXPECT_EQ(OCIRawPtr(w.env, raw)[2], 3);
        throw;
    }
    w.STEP(OCIRawAssignRaw, w.env, w.err, raw, &copy);
    w.See(OCIRawSize(w.env, copy));
}

// ---- Files and threads

void Files(World& w) {
    const std::string folder = w.Folder();
    w.STEP(OCIFileInit, w.env, w.err);
    w.AtEnd([&w] { return OCIFileTerm(w.env, w.err); });
    const std::string path = folder + "/a file with a long name";
    std::ofstream(path) << "what was there";
    OCIFileObject* file = nullptr;
    const auto open = [&](ub4 create) {
        w.STEP(OCIFileOpen, w.env, w.err, &file, World::Text("a file with a long name"), World::Text(folder),
               OCI_FILE_READ_WRITE, create, OCI_FILE_BIN);
        w.AtEnd([&w, file] { return OCIFileClose(w.env, w.err, file); });
    };
    try {
        open(OCI_FILE_TRUNCATE);
    } catch (const Stopped&) {
        EXPECT_EQ(std::filesystem::file_size(path), 14u) << "emptied, though not opened";
        throw;
    }
    std::filesystem::remove(path);
    try {
        open(OCI_FILE_EXCL);
    } catch (const Stopped&) {
        EXPECT_FALSE(std::filesystem::exists(path)) << "made, though not opened";
        throw;
    }
    static char data[20000];
    std::memset(data, 'x', sizeof data);
    ub4 count = 0;
    w.STEP(OCIFileWrite, w.env, w.err, file, data, sizeof data, &count);
    w.See(count);
    w.STEP(OCIFileFlush, w.env, w.err, file);
    w.STEP(OCIFileSeek, w.env, w.err, file, OCI_FILE_SEEK_BEGINNING, 19990, OCI_FILE_FORWARD);
    w.STEP(OCIFileRead, w.env, w.err, file, data, sizeof data, &count);
    w.See(count);
    ubig_ora length = 0;
    ub1 there = 0;
    w.STEP(OCIFileGetLength, w.env, w.err, World::Text("a file with a long name"), World::Text(folder), &length);
    w.STEP(OCIFileExists, w.env, w.err, World::Text("a file with a long name"), World::Text(folder), &there);
    w.See(static_cast<long>(length) + there);
}

void Threads(World& w) {
    static OCIThreadMutex* mutex;
    static OCIThreadKey* key;
    static OCIThreadId* id;
    static OCIThreadHandle* handle;
    w.Surely("OCIThreadProcessInit", [] {
        OCIThreadProcessInit();
        return OCI_SUCCESS;
    });
    w.STEP(OCIThreadInit, w.env, w.err);
    w.AtEnd([&w] { return OCIThreadTerm(w.env, w.err); });
    w.STEP(OCIThreadMutexInit, w.env, w.err, &mutex);
    w.AtEnd([&w] { return OCIThreadMutexDestroy(w.env, w.err, &mutex); });
    w.STEP(OCIThreadMutexAcquire, w.env, w.err, mutex);
    w.SURELY(OCIThreadMutexRelease, w.env, w.err, mutex);
    w.STEP(OCIThreadKeyInit, w.env, w.err, &key, nullptr);
    w.AtEnd([&w] { return OCIThreadKeyDestroy(w.env, w.err, &key); });
    w.STEP(OCIThreadKeySet, w.env, w.err, key, &w);
    dvoid* value = nullptr;
    w.STEP(OCIThreadKeyGet, w.env, w.err, key, &value);
    w.See(value == &w);
    w.STEP(OCIThreadIdInit, w.env, w.err, &id);
    w.AtEnd([&w] { return OCIThreadIdDestroy(w.env, w.err, &id); });
    w.STEP(OCIThreadIdGet, w.env, w.err, id);
    w.STEP(OCIThreadHndInit, w.env, w.err, &handle);
    w.AtEnd([&w] { return OCIThreadHndDestroy(w.env, w.err, &handle); });
    static int ran;
    ran = 0;
    // The system does not say whether it was memory or the number of threads: 21500 for both.
    try {
        w.Step("OCIThreadCreate", [&] {
            return OCIThreadCreate(w.env, w.err, [](dvoid* count) { ++*static_cast<int*>(count); }, &ran, id, handle);
        }, Told::error_handle, 21500);
    } catch (const Stopped&) {
        EXPECT_EQ(OCIThreadJoin(w.env, w.err, handle), OCI_ERROR) << "there is no thread";
        throw;
    }
    try {
        w.STEP(OCIThreadJoin, w.env, w.err, handle);
    } catch (const Stopped&) {
        EXPECT_EQ(OCIThreadJoin(w.env, w.err, handle), OCI_SUCCESS) << "asked again";
        EXPECT_EQ(OCIThreadClose(w.env, w.err, handle), OCI_SUCCESS);
        throw;
    }
    w.SURELY(OCIThreadClose, w.env, w.err, handle);
    w.See(ran);
}

// Many at once: those that find no memory for what a thread keeps look handles up and free them as others do.
void ThreadsWithoutMemory(World& w) {
    constexpr int kThreads = 4, kHandles = 100;
    auto* const stmt = w.New<OCIStmt>(OCI_HTYPE_STMT);
    std::vector<std::vector<dvoid*>> handles(kThreads, std::vector<dvoid*>(kHandles));
    std::vector<OCIError*> errors(kThreads);
    for (OCIError*& error : errors) error = w.New<OCIError>(OCI_HTYPE_ERROR);
    for (auto& row : handles) {
        for (dvoid*& handle : row) OCIHandleAlloc(w.env, &handle, OCI_HTYPE_TRANS, 0, nullptr);
    }
    std::atomic<int> wrong{0};
    std::vector<std::thread> threads;
    for (int index = 0; index < kThreads; ++index) {
        threads.emplace_back([&, index] {
            const Armed armed;
            for (dvoid* handle : handles[index]) {
                ub4 rows = 0;
                wrong += OCIAttrGet(stmt, OCI_HTYPE_STMT, &rows, nullptr, OCI_ATTR_PREFETCH_ROWS, errors[index]) != 0;
                wrong += OCIHandleFree(handle, OCI_HTYPE_TRANS) != OCI_SUCCESS || rows != 1;
                wrong += OCIHandleFree(handle, OCI_HTYPE_TRANS) != OCI_INVALID_HANDLE;
            }
        });
    }
    for (std::thread& thread : threads) thread.join();
    w.See(wrong);
}

constexpr Scenario kScenarios[] = {
    {"NumberArithmetic", Ground::environment, nullptr, NumberArithmetic,
     "+1.234568E+19;+1.234568E+19;+1.219326E+28;+1.250000E+10;+1.774692E+08;"},
    {"NumberFunctions", Ground::environment, nullptr, NumberFunctions,
     "+5.000000E-01;+1.000000E+00;+0.000000E+00;-5.000000E-01;"
     "+1.047198E+00;+5.235988E-01;+4.636476E-01;+8.775826E-01;+1.648721E+00;+1.127626E+00;+5.210953E-01;"
     "+4.621172E-01;-6.931472E-01;+4.794255E-01;+7.071068E-01;+5.463025E-01;-9.977082E-01;"
     "+9.000000E+00;+1.000000E+00;+1.457013E+15;+4.113474E-01;+1.512138E+00;+3.595071E+35;"},
    {"NumberForms", Ground::environment, nullptr, NumberForms,
     "12340625;+1.234500E+03; EUR1.234,06;1234,0625;       MCCXXXIV; 1.2E+03;123406;    4D2;"},
    {"Dates", Ground::environment, nullptr, Dates,
     "2024;Mardi, 3RD of the month of Février 2009, TWO MILLION FOUR HUNDRED FIFTY-FOUR THOUSAND EIGHT HUNDRED "
     "SIXTY-SIX, 11:12:13 AM;"},
    {"Datetimes", Ground::environment, FindRegions, Datetimes, "-1;13;"},
    {"ZoneOfTheProcess", Ground::environment, InStJohns, ZoneOfTheProcess, "1;13;", OCI_DEFAULT, true},
    {"CharacterSets", Ground::environment, nullptr, CharacterSets, "ab;ab;"},
    {"Intervals", Ground::environment, nullptr, Intervals, "14-JUL-24 11.11.10.500000005 AM;"},
    {"Strings", Ground::environment, nullptr, Strings, "a text that is too long for the room of the first;"},
    {"Raws", Ground::environment, nullptr, Raws, "100;"},
    {"Files", Ground::environment, nullptr, Files, "20000;10;20001;"},
    {"ThreadsWithoutMemory", Ground::environment, nullptr, ThreadsWithoutMemory, "0;", OCI_THREADED},
    {"Threads", Ground::environment, nullptr, Threads, "1;1;"},
};

}  // namespace

std::span<const Scenario> PackageScenarios() { return kScenarios; }

}  // namespace faults
