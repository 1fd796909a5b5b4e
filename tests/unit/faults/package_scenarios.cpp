// Dates, strings and raws, files, threads. Functions of numbers take no memory.
#include <atomic>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <thread>

#include "faults/world.h"

namespace faults {
namespace {

// ---- Dates

SCENARIO(Dates, environment, nullptr,
         "2024;Mardi, 3RD of the month of Février 2009, TWO MILLION FOUR HUNDRED FIFTY-FOUR THOUSAND EIGHT HUNDRED "
         "SIXTY-SIX, 11:12:13 AM;") {
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
        for (const auto& entry : std::filesystem::directory_iterator(all / part))
            if (entry.is_regular_file()) regions.push_back(std::string(part) + '/' + entry.path().filename().string());
    }
    EXPECT_GT(regions.size(), 200u);
}

void Construct(World& w, OCIDateTime* value, std::string_view zone) {
    w.STEP(OCIDateTimeConstruct, w.env, w.err, value, 2024, 7, 15, 13, 14, 15, 5, World::Text(zone), zone.size());
}

void SeeHour(World& w, OCIDateTime* of) {
    ub1 hour = 0, minute = 0, second = 0;
    ub4 fraction = 0;
    w.STEP(OCIDateTimeGetTime, w.env, w.err, of, &hour, &minute, &second, &fraction);
    w.See(hour);
}

SCENARIO(Datetimes, environment, FindRegions, "-1;13;") {
    auto* there = w.NewDescriptor<OCIDateTime>(OCI_DTYPE_TIMESTAMP_TZ);
    auto* here = w.NewDescriptor<OCIDateTime>(OCI_DTYPE_TIMESTAMP_TZ);
    static std::size_t next = 0;
    const std::string zone = regions[next++ % regions.size()];
    Construct(w, there, zone);
    Construct(w, here, "-12:00");
    sword order = 0;
    w.STEP(OCIDateTimeCompare, w.env, w.err, there, here, &order);
    w.See(order);
    Construct(w, here, "");
    w.STEP(OCIDateTimeAssign, w.env, w.err, there, here);
    SeeHour(w, here);
}

// Sets have their tables for the life of the process: each run takes one that none has asked for yet, while any is left.
SCENARIO(CharacterSets, environment, nullptr, "ab;ab;") {
    constexpr sb4 kUnknownSet = 24329;    // what the system answers for a table that it has no memory for
    static std::size_t next = 0;
    constexpr ub2 kSets[] = {31, 32, 46, 170, 171, 178};
    const ub2 set = kSets[next++ % std::size(kSets)];
    char text[8] = "";
    size_t length = 0;
    const struct { ub2 to, from; } ways[] = {{set, 873}, {873, set}};
    for (const auto& way : ways) {
        w.STEP_OR(kUnknownSet, OCINlsCharSetConvert, w.env, w.err, way.to, text, sizeof text, way.from, "ab", 2,
                  &length);
        w.See({text, length});
    }
}

SCENARIO(Intervals, environment, nullptr, "14-JUL-24 11.11.10.500000005 AM;") {
    auto* moment = w.NewDescriptor<OCIDateTime>(OCI_DTYPE_TIMESTAMP);
    auto* days = w.NewDescriptor<OCIInterval>(OCI_DTYPE_INTERVAL_DS);
    w.STEP(OCIIntervalFromText, w.env, w.err, World::Text("-1 2:3:4.5"), 10, days);
    Construct(w, moment, "");
    w.STEP(OCIDateTimeIntervalAdd, w.env, w.err, moment, days, moment);
    OraText text[60] = "";
    ub4 size = sizeof text;
    w.STEP(OCIDateTimeToText, w.env, w.err, moment, nullptr, 0, 9, nullptr, 0, &size, text);
    w.See({reinterpret_cast<char*>(text), size});
}

void InStJohns(World&) { setenv("TZ", ":America/St_Johns", 1); }

// The zone of the process, which is read once.
SCENARIO(ZoneOfTheProcess, environment, InStJohns, "1;13;", OCI_DEFAULT, true) {
    auto* zoned = w.NewDescriptor<OCIDateTime>(OCI_DTYPE_TIMESTAMP_TZ);
    auto* plain = w.NewDescriptor<OCIDateTime>(OCI_DTYPE_TIMESTAMP);
    auto* local = w.NewDescriptor<OCIDateTime>(OCI_DTYPE_TIMESTAMP_LTZ);
    OCIDate now{};
    sword order = 0;
    w.STEP(OCIDateSysDate, w.err, &now);
    Construct(w, plain, "");
    Construct(w, zoned, "+05:30");
    w.STEP(OCIDateTimeCompare, w.env, w.err, plain, zoned, &order);
    w.See(order);
    w.STEP(OCIDateTimeAssign, w.env, w.err, zoned, local);
    w.STEP(OCIDateTimeAssign, w.env, w.err, plain, zoned);
    SeeHour(w, zoned);
}
// ---- Strings and raws

SCENARIO(Strings, environment, nullptr, "a text that is too long for the room of the first;") {
    OCIString *&string = NewString(w), *&copy = NewString(w);
    const auto contents = [&](OCIString* one) {
        return std::string_view(reinterpret_cast<char*>(OCIStringPtr(w.env, one)), OCIStringSize(w.env, one));
    };
    const auto assign = [&](std::string_view text) {
        w.STEP(OCIStringAssignText, w.env, w.err, World::Text(text), World::Size(text), &string);
    };
    assign("hello");
    Attempt([&] {
        assign("a text that is too long for the room of the first");
        w.STEP(OCIStringResize, w.env, w.err, 1000, &string);
    }, [&] { EXPECT_TRUE(contents(string) == "hello" || contents(string).size() == 49) << contents(string); });
    w.STEP(OCIStringAssign, w.env, w.err, string, &copy);
    w.See(contents(copy));
}

OCIRaw*& NewRaw(World& w) {
    OCIRaw*& raw = w.Kept<OCIRaw*>();
    w.AtEnd([&] { return raw ? OCIRawResize(w.env, w.err, 0, &raw) : OCI_SUCCESS; });
    return raw;
}

SCENARIO(Raws, environment, nullptr, "2100;") {
    OCIRaw *&raw = NewRaw(w), *&copy = NewRaw(w);
    const ub1 bytes[100] = {1, 2, 3};
    w.STEP(OCIRawAssignBytes, w.env, w.err, bytes, 3, &raw);
    Attempt([&] {
        w.STEP(OCIRawAssignBytes, w.env, w.err, bytes, 100, &raw);
        w.STEP(OCIRawResize, w.env, w.err, 2000, &raw);
    }, [&] { EXPECT_EQ(OCIRawPtr(w.env, raw)[2], 3); });
    ub4 room = 0;
    w.STEP(OCIRawAllocSize, w.env, w.err, raw, &room);
    w.STEP(OCIRawAssignRaw, w.env, w.err, raw, &copy);
    w.See(OCIRawSize(w.env, copy) + room);
}

// ---- Files and threads

SCENARIO(Files, environment, nullptr, "20000;10;20001;") {
    OraText *name = World::Text("a file with a long name"), *folder = World::Text(w.Folder());
    w.STEP(OCIFileInit, w.env, w.err);
    w.AtEnd([&w] { return OCIFileTerm(w.env, w.err); });
    const std::string path = w.Folder() + "/a file with a long name";
    std::ofstream(path) << "what was there";
    OCIFileObject* file = nullptr;
    const auto open = [&](ub4 create) {
        w.STEP(OCIFileOpen, w.env, w.err, &file, name, folder, OCI_FILE_READ_WRITE, create, OCI_FILE_BIN);
        w.AtEnd([&w, file] { return OCIFileClose(w.env, w.err, file); });
    };
    Attempt([&] { open(OCI_FILE_TRUNCATE); },
            [&] { EXPECT_EQ(std::filesystem::file_size(path), 14u) << "emptied, though not opened"; });
    std::filesystem::remove(path);
    Attempt([&] { open(OCI_FILE_EXCL); },
            [&] { EXPECT_FALSE(std::filesystem::exists(path)) << "made, though not opened"; });
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
    w.STEP(OCIFileGetLength, w.env, w.err, name, folder, &length);
    w.STEP(OCIFileExists, w.env, w.err, name, folder, &there);
    w.See(static_cast<long>(length) + there);
}

SCENARIO(Threads, environment, nullptr, "1;1;") {
    auto& mutex = w.Kept<OCIThreadMutex*>();
    auto& key = w.Kept<OCIThreadKey*>();
    auto& id = w.Kept<OCIThreadId*>();
    auto& handle = w.Kept<OCIThreadHandle*>();
    auto& ran = w.Kept(0);
    w.Surely("OCIThreadProcessInit", [] { return OCIThreadProcessInit(), OCI_SUCCESS; });
    w.STEP(OCIThreadInit, w.env, w.err);
    w.AtEnd([&w] { return OCIThreadTerm(w.env, w.err); });
    w.STEP(OCIThreadMutexInit, w.env, w.err, &mutex);
    w.AtEnd([&] { return OCIThreadMutexDestroy(w.env, w.err, &mutex); });
    w.STEP(OCIThreadMutexAcquire, w.env, w.err, mutex);
    w.SURELY(OCIThreadMutexRelease, w.env, w.err, mutex);
    w.STEP(OCIThreadKeyInit, w.env, w.err, &key, nullptr);
    w.AtEnd([&] { return OCIThreadKeyDestroy(w.env, w.err, &key); });
    w.STEP(OCIThreadKeySet, w.env, w.err, key, &w);
    dvoid* value = nullptr;
    w.STEP(OCIThreadKeyGet, w.env, w.err, key, &value);
    w.See(value == &w);
    w.STEP(OCIThreadIdInit, w.env, w.err, &id);
    w.AtEnd([&] { return OCIThreadIdDestroy(w.env, w.err, &id); });
    w.STEP(OCIThreadIdGet, w.env, w.err, id);
    w.STEP(OCIThreadHndInit, w.env, w.err, &handle);
    w.AtEnd([&] { return OCIThreadHndDestroy(w.env, w.err, &handle); });
    // The system does not say whether it was memory or the number of threads: 21500 for both.
    Attempt([&] {
        w.STEP_OR(21500, OCIThreadCreate, w.env, w.err, [](dvoid* count) { ++*static_cast<int*>(count); }, &ran, id,
                  handle);
    }, [&] { EXPECT_EQ(OCIThreadJoin(w.env, w.err, handle), OCI_ERROR) << "there is no thread"; });
    Attempt([&] { w.STEP(OCIThreadJoin, w.env, w.err, handle); }, [&] {
        EXPECT_EQ(OCIThreadJoin(w.env, w.err, handle), OCI_SUCCESS) << "asked again";
        EXPECT_EQ(OCIThreadClose(w.env, w.err, handle), OCI_SUCCESS);
    });
    w.SURELY(OCIThreadClose, w.env, w.err, handle);
    w.See(ran);
}

// Many at once: those that find no memory for what a thread keeps look handles up and free them as others do.
SCENARIO(ThreadsWithoutMemory, environment, nullptr, "0;", OCI_THREADED) {
    constexpr int kThreads = 4, kHandles = 100;
    auto* const stmt = w.New<OCIStmt>(OCI_HTYPE_STMT);
    std::vector<std::vector<dvoid*>> handles(kThreads, std::vector<dvoid*>(kHandles));
    std::vector<OCIError*> errors(kThreads);
    for (OCIError*& error : errors) error = w.New<OCIError>(OCI_HTYPE_ERROR);
    for (auto& row : handles)
        for (dvoid*& handle : row) OCIHandleAlloc(w.env, &handle, OCI_HTYPE_TRANS, 0, nullptr);
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

}  // namespace
}  // namespace faults
