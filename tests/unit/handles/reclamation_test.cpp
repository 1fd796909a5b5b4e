// What becomes of objects that are freed while calls run: by callbacks of the call itself, by other threads, beside a
// call that waits for long. Memory must not go too early, and not stay too long.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <atomic>
#include <chrono>
#include <cstdlib>
#include <cstring>
#include <functional>
#include <string>
#include <thread>
#include <vector>

#include "kelpci.h"
#include "oci.h"

namespace {

using namespace std::chrono_literals;

const OraText* Text(const char* text) { return reinterpret_cast<const OraText*>(text); }

// The memory functions of an environment. The nth allocation calls `strike`, which frees the victim: its block must
// outlast that, since the call that allocates is not over. Freed blocks are overwritten.
struct StrikingMemory {
    int countdown = 0;    // 0: not armed
    std::function<void()> strike;
    const void* victim = nullptr;
    bool striking = false;
    int struck = 0;
    int too_early = 0;
    int out = 0;

    static dvoid* Allocate(dvoid* context, size_t size) {
        auto& memory = *static_cast<StrikingMemory*>(context);
        if (memory.countdown > 0 && --memory.countdown == 0) {
            ++memory.struck;
            memory.striking = true;
            memory.strike();
            memory.striking = false;
        }
        ++memory.out;
        auto* block = static_cast<char*>(std::malloc(size + sizeof size));
        std::memcpy(block, &size, sizeof size);
        return block + sizeof size;
    }
    static dvoid* Reallocate(dvoid*, dvoid*, size_t) { return nullptr; }
    static void Free(dvoid* context, dvoid* given) {
        auto& memory = *static_cast<StrikingMemory*>(context);
        --memory.out;
        size_t size = 0;
        char* block = static_cast<char*>(given) - sizeof size;
        std::memcpy(&size, block, sizeof size);
        const auto* victim = static_cast<const char*>(memory.victim);
        if (memory.striking && victim >= given && victim < static_cast<char*>(given) + size) ++memory.too_early;
        std::memset(block, 0xDD, size + sizeof size);
        std::free(block);
    }
};

// What a call of the cases works on. All of it may be freed by the strike.
struct Objects {
    StrikingMemory memory;
    OCIEnv* env = nullptr;
    OCIError* err = nullptr;
    OCISvcCtx* svc = nullptr;
    OCIStmt* stmt = nullptr;
    OCIString* string = nullptr;
    OCIString* source = nullptr;
    dvoid* cursor = nullptr;

    template <class Handle>
    void New(Handle*& handle, ub4 type) {
        ASSERT_EQ(OCIHandleAlloc(env, reinterpret_cast<dvoid**>(&handle), type, 0, nullptr), OCI_SUCCESS);
    }
    void Make() {
        ASSERT_EQ(OCIEnvCreate(&env, OCI_THREADED, &memory, StrikingMemory::Allocate, StrikingMemory::Reallocate,
                               StrikingMemory::Free, 0, nullptr), OCI_SUCCESS);
        New(err, OCI_HTYPE_ERROR);
        ASSERT_EQ(OCILogon(env, err, &svc, nullptr, 0, nullptr, 0, Text(":memory:"), 8), OCI_SUCCESS);
        New(stmt, OCI_HTYPE_STMT);
        ASSERT_EQ(OCIStringAssignText(env, err, Text("kelp"), 4, &string), OCI_SUCCESS);
        ASSERT_EQ(OCIStringAssignText(env, err, Text("a longer text"), 13, &source), OCI_SUCCESS);
        const char block[] = "begin open :c for select 1 from dual; end;";
        ASSERT_EQ(OCIStmtPrepare(stmt, err, Text(block), sizeof block - 1, OCI_NTV_SYNTAX, OCI_DEFAULT), OCI_SUCCESS);
        OCIBind* bind = nullptr;
        ASSERT_EQ(OCIBindByPos(stmt, &bind, err, 1, &cursor, 0, SQLT_RSET, nullptr, nullptr, nullptr, 0, nullptr,
                               OCI_DEFAULT), OCI_SUCCESS);
    }
};

const struct {
    const char* name;
    sword (*call)(Objects&);
} kCalls[] = {
    {"OCIHandleAlloc", [](Objects& o) {
         dvoid* made = nullptr;
         return OCIHandleAlloc(o.env, &made, OCI_HTYPE_STMT, 16, nullptr);
     }},
    {"OCIDefineByPos", [](Objects& o) {
         OCIDefine* define = nullptr;
         static sb4 value;
         return OCIDefineByPos(o.stmt, &define, o.err, 1, &value, sizeof value, SQLT_INT, nullptr, nullptr, nullptr,
                               OCI_DEFAULT);
     }},
    {"OCIBindByPos", [](Objects& o) {
         OCIBind* bind = nullptr;
         return OCIBindByPos(o.stmt, &bind, o.err, 1, &o.cursor, 0, SQLT_RSET, nullptr, nullptr, nullptr, 0, nullptr,
                             OCI_DEFAULT);
     }},
    {"OCIStringAssign", [](Objects& o) { return OCIStringAssign(o.env, o.err, o.source, &o.string); }},
    {"OCIStringResize", [](Objects& o) { return OCIStringResize(o.env, o.err, 100, &o.string); }},
    {"block with a result set", [](Objects& o) {
         return OCIStmtExecute(o.svc, o.stmt, o.err, 1, 0, nullptr, nullptr, OCI_DEFAULT);
     }},
};

const struct {
    const char* name;
    const void* (*victim)(const Objects&);
    void (*strike)(Objects&);
} kStrikes[] = {
    {"environment", [](const Objects& o) -> const void* { return o.env; },
     [](Objects& o) { OCIHandleFree(o.env, OCI_HTYPE_ENV); }},
    {"error handle", [](const Objects& o) -> const void* { return o.err; },
     [](Objects& o) { OCIHandleFree(o.err, OCI_HTYPE_ERROR); }},
    {"service context", [](const Objects& o) -> const void* { return o.svc; },
     [](Objects& o) { OCIHandleFree(o.svc, OCI_HTYPE_SVCCTX); }},
    {"statement", [](const Objects& o) -> const void* { return o.stmt; },
     [](Objects& o) { OCIHandleFree(o.stmt, OCI_HTYPE_STMT); }},
    {"nothing, but prepares anew", [](const Objects& o) -> const void* { return o.env; },
     [](Objects& o) {
         OCIError* own = nullptr;
         OCIHandleAlloc(o.env, reinterpret_cast<dvoid**>(&own), OCI_HTYPE_ERROR, 0, nullptr);
         OCIStmtPrepare(o.stmt, own, Text("begin null; end;"), 16, OCI_NTV_SYNTAX, OCI_DEFAULT);
     }},
    {"string", [](const Objects& o) -> const void* { return o.string; },
     [](Objects& o) {
         OCIString* string = o.string;
         OCIStringResize(o.env, o.err, 0, &string);
     }},
    {"the string that is read", [](const Objects& o) -> const void* { return o.source; },
     [](Objects& o) {
         OCIString* string = o.source;
         OCIStringResize(o.env, o.err, 0, &string);
     }},
};

TEST(Callbacks, MayFreeWhateverTheirCallWorksOn) {
    const sb4 before = OCI_memGetMemCount();
    int struck = 0;
    for (const auto& call : kCalls) {
        for (const auto& strike : kStrikes) {
            for (int nth = 1; nth <= 3; ++nth) {
                Objects objects;
                objects.Make();
                OCIEnv* const env = objects.env;
                objects.memory.victim = strike.victim(objects);
                objects.memory.strike = [&] { strike.strike(objects); };
                objects.memory.countdown = nth;
                const sword rc = call.call(objects);
                objects.memory.countdown = 0;
                struck += objects.memory.struck;
                EXPECT_TRUE(rc == OCI_SUCCESS || rc == OCI_ERROR) << call.name << " frees " << strike.name << ": " << rc;
                EXPECT_EQ(objects.memory.too_early, 0) << call.name << " frees " << strike.name;
                OCIHandleFree(env, OCI_HTYPE_ENV);
                EXPECT_EQ(objects.memory.out, 0) << call.name << " frees " << strike.name;
            }
        }
    }
    EXPECT_GE(struck, 30) << "callbacks that were called at all";
    EXPECT_EQ(OCI_memGetMemCount(), before);
}

// A string that the memory functions change while it is read or changed: what comes out is one of the two contents.
TEST(Callbacks, MayChangeTheStringsThatTheirCallWorksOn) {
    for (const bool source : {true, false}) {
        Objects objects;
        objects.Make();
        objects.memory.strike = [&] {
            OCIString*& changed = source ? objects.source : objects.string;
            OCIStringAssignText(objects.env, objects.err, Text("other content, longer than before"), 33, &changed);
        };
        objects.memory.countdown = 1;
        ASSERT_EQ(OCIStringAssign(objects.env, objects.err, objects.source, &objects.string), OCI_SUCCESS);
        const std::string seen(reinterpret_cast<char*>(OCIStringPtr(objects.env, objects.string)),
                               OCIStringSize(objects.env, objects.string));
        EXPECT_EQ(seen, source ? "other content" : "a longer text") << "no more than there was room for";
        EXPECT_EQ(OCIHandleFree(objects.env, OCI_HTYPE_ENV), OCI_SUCCESS);
        EXPECT_EQ(objects.memory.out, 0);
    }
}

// ---- Beside a call that waits

class BesideAWait : public testing::Test {
protected:
    void SetUp() override {
        ASSERT_EQ(OCIEnvCreate(&env_, OCI_THREADED, nullptr, nullptr, nullptr, nullptr, 0, nullptr), OCI_SUCCESS);
        err_ = NewError();
        ASSERT_EQ(OCIThreadInit(env_, err_), OCI_SUCCESS);
        wait_err_ = NewError();
    }
    void TearDown() override {
        EXPECT_EQ(OCIThreadTerm(env_, err_), OCI_SUCCESS);
        EXPECT_EQ(OCIHandleFree(env_, OCI_HTYPE_ENV), OCI_SUCCESS);
        EXPECT_EQ(OCI_memGetMemCount(), 0);
    }
    OCIError* NewError() {
        dvoid* made = nullptr;
        EXPECT_EQ(OCIHandleAlloc(env_, &made, OCI_HTYPE_ERROR, 0, nullptr), OCI_SUCCESS);
        return static_cast<OCIError*>(made);
    }
    // Makes and frees statements while `wait` runs in another thread, which `end` makes return; the wait is given time
    // to begin.
    void MakeAndFree(const std::function<void()>& wait, const std::function<void()>& end) {
        constexpr int kOld = 100, kRounds = 30'000;
        std::vector<dvoid*> old(kOld);
        for (dvoid*& handle : old) ASSERT_EQ(OCIHandleAlloc(env_, &handle, OCI_HTYPE_STMT, 8, nullptr), OCI_SUCCESS);
        const sb4 before = OCI_memGetMemCount();
        std::atomic<bool> over{false};
        std::thread waiting([&] {
            wait();
            over = true;
        });
        std::this_thread::sleep_for(100ms);
        sb4 most = 0;
        for (int round = 0; round < kRounds; ++round) {
            dvoid* handle = nullptr;
            ASSERT_EQ(OCIHandleAlloc(env_, &handle, OCI_HTYPE_STMT, 8, nullptr), OCI_SUCCESS);
            ASSERT_EQ(OCIHandleFree(handle, OCI_HTYPE_STMT), OCI_SUCCESS);
            most = std::max(most, OCI_memGetMemCount());
        }
        EXPECT_FALSE(over) << "the wait did not last";
        EXPECT_LE(most - before, 8) << "blocks that wait for the end of the wait";
        // What the waiting call might know waits for it, and for no longer.
        for (dvoid* handle : old) ASSERT_EQ(OCIHandleFree(handle, OCI_HTYPE_STMT), OCI_SUCCESS);
        end();
        waiting.join();
        EXPECT_LE(OCI_memGetMemCount(), before - 2 * kOld + 8);
    }

    OCIEnv* env_ = nullptr;
    OCIError* err_ = nullptr;
    OCIError* wait_err_ = nullptr;
};

TEST_F(BesideAWait, ForAThreadToEnd) {
    static std::atomic<bool> stop;
    stop = false;
    OCIThreadHandle* handle = nullptr;
    ASSERT_EQ(OCIThreadHndInit(env_, err_, &handle), OCI_SUCCESS);
    const auto routine = [](dvoid*) { while (!stop) std::this_thread::sleep_for(1ms); };
    ASSERT_EQ(OCIThreadCreate(env_, err_, routine, nullptr, nullptr, handle), OCI_SUCCESS);
    MakeAndFree([&] { EXPECT_EQ(OCIThreadJoin(env_, wait_err_, handle), OCI_SUCCESS); }, [] { stop = true; });
}

TEST_F(BesideAWait, ForAMutex) {
    OCIThreadMutex* mutex = nullptr;
    ASSERT_EQ(OCIThreadMutexInit(env_, err_, &mutex), OCI_SUCCESS);
    ASSERT_EQ(OCIThreadMutexAcquire(env_, err_, mutex), OCI_SUCCESS);
    MakeAndFree(
        [&] {
            EXPECT_EQ(OCIThreadMutexAcquire(env_, wait_err_, mutex), OCI_SUCCESS);
            EXPECT_EQ(OCIThreadMutexRelease(env_, wait_err_, mutex), OCI_SUCCESS);
        },
        [&] { EXPECT_EQ(OCIThreadMutexRelease(env_, err_, mutex), OCI_SUCCESS); });
}

TEST_F(BesideAWait, ForAPipe) {
    const std::string name = "/tmp/kelp-pipe-" + std::to_string(getpid());
    ASSERT_EQ(mkfifo(name.c_str(), 0600), 0);
    ASSERT_EQ(OCIFileInit(env_, err_), OCI_SUCCESS);
    OCIFileObject* file = nullptr;
    auto* path = reinterpret_cast<OraText*>(const_cast<char*>(name.c_str()));
    const int other_end = open(name.c_str(), O_RDWR);
    ASSERT_EQ(OCIFileOpen(env_, err_, &file, path, nullptr, OCI_FILE_READ_ONLY, OCI_FILE_EXIST, OCI_FILE_BIN), 0);
    MakeAndFree(
        [&] {
            char byte = 0;
            ub4 count = 0;
            EXPECT_EQ(OCIFileRead(env_, wait_err_, file, &byte, 1, &count), OCI_SUCCESS);
            EXPECT_EQ(byte, 'k');
        },
        [&] { EXPECT_EQ(write(other_end, "k", 1), 1); });
    EXPECT_EQ(OCIFileClose(env_, err_, file), OCI_SUCCESS);
    close(other_end);
    unlink(name.c_str());
    EXPECT_EQ(OCIFileTerm(env_, err_), OCI_SUCCESS);
}

// One thread runs the query, a second one waits for its turn on the same session.
TEST_F(BesideAWait, ForAQueryAndForItsSession) {
    OCISvcCtx* svc = nullptr;
    ASSERT_EQ(OCILogon(env_, err_, &svc, nullptr, 0, nullptr, 0, Text(":memory:"), 8), OCI_SUCCESS);
    const auto statement = [&](const char* sql) {
        dvoid* made = nullptr;
        EXPECT_EQ(OCIHandleAlloc(env_, &made, OCI_HTYPE_STMT, 0, nullptr), OCI_SUCCESS);
        auto* stmt = static_cast<OCIStmt*>(made);
        EXPECT_EQ(OCIStmtPrepare(stmt, err_, Text(sql), static_cast<ub4>(std::strlen(sql)), OCI_NTV_SYNTAX,
                                 OCI_DEFAULT), OCI_SUCCESS);
        return stmt;
    };
    OCIStmt* endless = statement("with recursive r(n) as (select 1 union all select n + 1 from r) "
                                 "select max(n) from r");
    OCIStmt* short_one = statement("select 1 from dual");
    OCIError* other_err = NewError();
    std::thread other;
    MakeAndFree(
        [&] {
            other = std::thread([&] {
                std::this_thread::sleep_for(20ms);
                EXPECT_EQ(OCIStmtExecute(svc, short_one, other_err, 0, 0, nullptr, nullptr, OCI_DEFAULT), OCI_SUCCESS);
            });
            EXPECT_EQ(OCIStmtExecute(svc, endless, wait_err_, 0, 0, nullptr, nullptr, OCI_DEFAULT), OCI_ERROR);
            other.join();
        },
        [&] { EXPECT_EQ(OCIBreak(svc, err_), OCI_SUCCESS); });
    EXPECT_EQ(OCILogoff(svc, err_), OCI_SUCCESS);
}

// ---- Everything at once

// Threads that make, use and free the same few handles and strings, now and then below a mutex that they wait for and
// below a memory function that frees.
TEST(Storm, HandlesMadeUsedAndFreedByAllThreads) {
    const sb4 before = OCI_memGetMemCount();
    OCIEnv* env = nullptr;
    ASSERT_EQ(OCIEnvCreate(&env, OCI_THREADED, nullptr, nullptr, nullptr, nullptr, 0, nullptr), OCI_SUCCESS);
    dvoid* made = nullptr;
    ASSERT_EQ(OCIHandleAlloc(env, &made, OCI_HTYPE_ERROR, 0, nullptr), OCI_SUCCESS);
    ASSERT_EQ(OCIThreadInit(env, static_cast<OCIError*>(made)), OCI_SUCCESS);
    constexpr int kThreads = 4, kPlaces = 6;
    std::atomic<OCIStmt*> statements[kPlaces] = {};
    std::atomic<OCIString*> strings[kPlaces] = {};
    OCIThreadMutex* mutex = nullptr;
    ASSERT_EQ(OCIThreadMutexInit(env, static_cast<OCIError*>(made), &mutex), OCI_SUCCESS);
    std::atomic<int> wrong{0};
    const auto end = std::chrono::steady_clock::now() + 1s;
    const auto work = [&](unsigned seed) {
        dvoid* handle = nullptr;
        OCIHandleAlloc(env, &handle, OCI_HTYPE_ERROR, 0, nullptr);
        auto* err = static_cast<OCIError*>(handle);
        const auto expect = [&wrong](sword rc, sword other) { wrong += rc != OCI_SUCCESS && rc != other; };
        while (std::chrono::steady_clock::now() < end) {
            seed = seed * 1664525 + 1013904223;
            const unsigned place = (seed >> 16) % kPlaces;
            OCIStmt* stmt = statements[place];
            OCIString* string = strings[place];
            ub4 value = 0;
            switch ((seed >> 24) % 8) {
                case 0: {
                    dvoid* fresh = nullptr;
                    expect(OCIHandleAlloc(env, &fresh, OCI_HTYPE_STMT, 32, nullptr), OCI_SUCCESS);
                    stmt = statements[place].exchange(static_cast<OCIStmt*>(fresh));
                    if (stmt) expect(OCIHandleFree(stmt, OCI_HTYPE_STMT), OCI_SUCCESS);
                    break;
                }
                case 1: {
                    OCIString* fresh = nullptr;
                    expect(OCIStringAssignText(env, err, Text("some text"), 9, &fresh), OCI_SUCCESS);
                    string = strings[place].exchange(fresh);
                    if (string) expect(OCIStringResize(env, err, 0, &string), OCI_SUCCESS);
                    break;
                }
                case 2:
                    expect(OCIThreadMutexAcquire(env, err, mutex), OCI_SUCCESS);
                    expect(OCIThreadMutexRelease(env, err, mutex), OCI_SUCCESS);
                    break;
                case 3: {
                    OCIString* copy = nullptr;
                    if (string) expect(OCIStringAssign(env, err, string, &copy), OCI_INVALID_HANDLE);
                    if (copy) expect(OCIStringResize(env, err, 0, &copy), OCI_SUCCESS);
                    break;
                }
                default:
                    if (stmt) expect(OCIAttrGet(stmt, OCI_HTYPE_STMT, &value, nullptr, OCI_ATTR_PREFETCH_ROWS, err),
                                     OCI_INVALID_HANDLE);
                    if (string) expect(OCIStringAllocSize(env, err, string, &value), OCI_INVALID_HANDLE);
            }
        }
    };
    std::vector<std::thread> threads;
    for (unsigned thread = 0; thread < kThreads; ++thread) threads.emplace_back(work, thread * 7919 + 1);
    for (std::thread& thread : threads) thread.join();
    EXPECT_EQ(wrong, 0);
    EXPECT_EQ(OCIThreadTerm(env, static_cast<OCIError*>(made)), OCI_SUCCESS);
    EXPECT_EQ(OCIHandleFree(env, OCI_HTYPE_ENV), OCI_SUCCESS);
    EXPECT_EQ(OCI_memGetMemCount(), before);
}

// A bind of the application's own, asked by one thread while another frees its statement.
TEST(Storm, BindHandleAskedWhileItsStatementIsFreed) {
    OCIEnv* env = nullptr;
    ASSERT_EQ(OCIEnvCreate(&env, OCI_THREADED, nullptr, nullptr, nullptr, nullptr, 0, nullptr), OCI_SUCCESS);
    const auto make = [env](ub4 type) {
        dvoid* made = nullptr;
        EXPECT_EQ(OCIHandleAlloc(env, &made, type, 0, nullptr), OCI_SUCCESS);
        return made;
    };
    auto* err = static_cast<OCIError*>(make(OCI_HTYPE_ERROR));
    auto* ask_err = static_cast<OCIError*>(make(OCI_HTYPE_ERROR));
    auto* bind = static_cast<OCIBind*>(make(OCI_HTYPE_BIND));
    OCISvcCtx* svc = nullptr;
    ASSERT_EQ(OCILogon(env, err, &svc, nullptr, 0, nullptr, 0, Text(":memory:"), 8), OCI_SUCCESS);
    std::atomic<bool> stop{false};
    std::thread asking([&, own = bind] {
        while (!stop) {
            OCIEnv* answer = nullptr;
            EXPECT_EQ(OCIAttrGet(own, OCI_HTYPE_BIND, &answer, nullptr, OCI_ATTR_ENV, ask_err), OCI_SUCCESS);
            EXPECT_EQ(answer, env);
        }
    });
    sb4 value = 1;
    const auto end = std::chrono::steady_clock::now() + 1s;
    while (std::chrono::steady_clock::now() < end) {
        auto* stmt = static_cast<OCIStmt*>(make(OCI_HTYPE_STMT));
        ASSERT_EQ(OCIStmtPrepare(stmt, err, Text("select :v from dual"), 19, OCI_NTV_SYNTAX, OCI_DEFAULT), OCI_SUCCESS);
        ASSERT_EQ(OCIBindByPos(stmt, &bind, err, 1, &value, sizeof value, SQLT_INT, nullptr, nullptr, nullptr, 0,
                               nullptr, OCI_DEFAULT), OCI_SUCCESS);
        ASSERT_EQ(OCIStmtExecute(svc, stmt, err, 0, 0, nullptr, nullptr, OCI_DEFAULT), OCI_SUCCESS);
        ASSERT_EQ(OCIHandleFree(stmt, OCI_HTYPE_STMT), OCI_SUCCESS);
    }
    stop = true;
    asking.join();
    EXPECT_EQ(OCIHandleFree(env, OCI_HTYPE_ENV), OCI_SUCCESS);
}

}  // namespace
