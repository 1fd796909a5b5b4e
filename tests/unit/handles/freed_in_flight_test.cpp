// What becomes of objects that are freed while calls run: by callbacks of the call itself, by other threads, beside a
// call that waits for long. Memory must not go too early, and not stay too long.
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <atomic>
#include <chrono>
#include <functional>
#include <thread>

#include "support/at_once.h"
#include "support/call_fixture.h"
#include "support/own_memory.h"

namespace {

using namespace std::chrono_literals;

// What calls work on, in an environment of its own; each may be freed at any time.
struct Objects {
    OCIEnv* env = nullptr;
    OCIError* err = nullptr;
    OCISvcCtx* svc = nullptr;
    OCIStmt* stmt = nullptr;
    OCIString* string = nullptr;

    void Make(const char* sql, OwnMemory* memory = nullptr) {
        const sword made = memory ? memory->Open(&env, OCI_THREADED)
                                  : OCIEnvCreate(&env, OCI_THREADED, nullptr, nullptr, nullptr, nullptr, 0, nullptr);
        ASSERT_EQ(made, OCI_SUCCESS);
        err = NewHandle<OCIError>(env, OCI_HTYPE_ERROR);
        ASSERT_EQ(OCILogon(env, err, &svc, nullptr, 0, nullptr, 0, Text(":memory:"), 8), OCI_SUCCESS);
        stmt = NewStatement(sql);
        ASSERT_EQ(OCIStringAssignText(env, err, Text("kelp"), 4, &string), OCI_SUCCESS);
    }
    OCIStmt* NewStatement(const char* sql) const {
        auto* made = NewHandle<OCIStmt>(env, OCI_HTYPE_STMT);
        EXPECT_EQ(OCIStmtPrepare(made, err, Text(sql), Length(sql), OCI_NTV_SYNTAX, OCI_DEFAULT), OCI_SUCCESS);
        return made;
    }
    sword Execute(OCIStmt* of, ub4 iterations = 0) const {
        return OCIStmtExecute(svc, of, err, iterations, 0, nullptr, nullptr, OCI_DEFAULT);
    }
};

// ---- By callbacks

// What a call of the cases works on. The nth allocation of a call calls `strike`, which frees the victim: its block must
// outlast that, since the call that allocates is not over.
struct Struck : Objects {
    OwnMemory memory;
    int countdown = 0;    // 0: not armed
    std::function<void()> strike;
    const void* victim = nullptr;
    bool striking = false;
    int struck = 0, too_early = 0;
    OCIString* source = nullptr;
    dvoid* cursor = nullptr;

    Struck() {
        memory.before_allocating = [this] {
            if (countdown == 0 || --countdown > 0) return;
            ++struck;
            striking = true;
            strike();
            striking = false;
        };
        memory.before_freeing = [this](const char* block, size_t size) {
            too_early += striking && victim >= block && victim < block + size;
        };
        Make("begin open :c for select 1 from dual; end;", &memory);
        SHOULD(OCIStringAssignText(env, err, Text("a longer text"), 13, &source), Bind());
    }
    sword Bind() {
        OCIBind* bind = nullptr;
        return OCIBindByPos(stmt, &bind, err, 1, &cursor, 0, SQLT_RSET, nullptr, nullptr, nullptr, 0, nullptr,
                            OCI_DEFAULT);
    }
    void FreeString(OCIString* which) { OCIStringResize(env, err, 0, &which); }
};

const struct { const char* name; sword (*call)(Struck&); } kCalls[] = {
    {"OCIHandleAlloc", [](Struck& o) {
         dvoid* made = nullptr;
         return OCIHandleAlloc(o.env, &made, OCI_HTYPE_STMT, 16, nullptr);
     }},
    {"OCIDefineByPos", [](Struck& o) {
         OCIDefine* define = nullptr;
         static sb4 value;
         return OCIDefineByPos(o.stmt, &define, o.err, 1, &value, sizeof value, SQLT_INT, nullptr, nullptr, nullptr,
                               OCI_DEFAULT);
     }},
    {"OCIBindByPos", [](Struck& o) { return o.Bind(); }},
    {"OCIStringAssign", [](Struck& o) { return OCIStringAssign(o.env, o.err, o.source, &o.string); }},
    {"OCIStringResize", [](Struck& o) { return OCIStringResize(o.env, o.err, 100, &o.string); }},
    {"block with a result set", [](Struck& o) { return o.Execute(o.stmt, 1); }},
};

// Frees a handle of the type or, where there is none, strikes in its own way.
const struct { const char* name; dvoid* (*victim)(const Struck&); ub4 type; void (*strike)(Struck&); } kStrikes[] = {
    {"environment", [](const Struck& o) -> dvoid* { return o.env; }, OCI_HTYPE_ENV, nullptr},
    {"error handle", [](const Struck& o) -> dvoid* { return o.err; }, OCI_HTYPE_ERROR, nullptr},
    {"service context", [](const Struck& o) -> dvoid* { return o.svc; }, OCI_HTYPE_SVCCTX, nullptr},
    {"statement", [](const Struck& o) -> dvoid* { return o.stmt; }, OCI_HTYPE_STMT, nullptr},
    {"nothing, but prepares anew", [](const Struck& o) -> dvoid* { return o.env; }, 0,
     [](Struck& o) {
         auto* own = NewHandle<OCIError>(o.env, OCI_HTYPE_ERROR);
         OCIStmtPrepare(o.stmt, own, Text("begin null; end;"), 16, OCI_NTV_SYNTAX, OCI_DEFAULT);
     }},
    {"string", [](const Struck& o) -> dvoid* { return o.string; }, 0, [](Struck& o) { o.FreeString(o.string); }},
    {"the string that is read", [](const Struck& o) -> dvoid* { return o.source; }, 0,
     [](Struck& o) { o.FreeString(o.source); }},
};

TEST(Callbacks, MayFreeWhateverTheirCallWorksOn) {
    const sb4 before = OCI_memGetMemCount();
    int struck = 0;
    for (const auto& call : kCalls) {
        for (const auto& strike : kStrikes) {
            for (int nth = 1; nth <= 3; ++nth) {
                Struck objects;
                OCIEnv* const env = objects.env;
                dvoid* const victim = strike.victim(objects);
                objects.victim = victim;
                objects.strike = [&] {
                    if (strike.strike) strike.strike(objects);
                    else OCIHandleFree(victim, strike.type);
                };
                objects.countdown = nth;
                const sword rc = call.call(objects);
                objects.countdown = 0;
                struck += objects.struck;
                OCIHandleFree(env, OCI_HTYPE_ENV);
                EXPECT_TRUE((rc == OCI_SUCCESS || rc == OCI_ERROR) && objects.too_early + objects.memory.out == 0)
                    << call.name << " frees " << strike.name << ": " << rc << ", " << objects.too_early
                    << " blocks too early, " << objects.memory.out << " never";
            }
        }
    }
    EXPECT_GE(struck, 30) << "callbacks that were called at all";
    EXPECT_EQ(OCI_memGetMemCount(), before);
}

// A string that the memory functions change while it is read or changed: what comes out is one of the two contents.
TEST(Callbacks, MayChangeTheStringsThatTheirCallWorksOn) {
    for (const bool source : {true, false}) {
        Struck objects;
        objects.strike = [&] {
            OCIString*& changed = source ? objects.source : objects.string;
            OCIStringAssignText(objects.env, objects.err, Text("other content, longer than before"), 33, &changed);
        };
        objects.countdown = 1;
        ASSERT_EQ(OCIStringAssign(objects.env, objects.err, objects.source, &objects.string), OCI_SUCCESS);
        const std::string seen(reinterpret_cast<char*>(OCIStringPtr(objects.env, objects.string)),
                               OCIStringSize(objects.env, objects.string));
        EXPECT_EQ(seen, source ? "other content" : "a longer text") << "no more than there was room for";
        EXPECT_EQ(OCIHandleFree(objects.env, OCI_HTYPE_ENV), OCI_SUCCESS);
        EXPECT_EQ(objects.memory.out, 0);
    }
}

// ---- By other threads

// Answers how many of the calls found their handles.
int CallOnce(const Objects& shared, int round) {
    OCINumber number{};
    sb4 code = 0;
    ub4 size = 0;
    OraText text[200];
    OCIString* string = shared.string;
    const sword codes[] = {
        OCINumberFromInt(shared.err, &round, sizeof round, OCI_NUMBER_SIGNED, &number),
        OCINumberSqrt(shared.err, &number, nullptr),    // leaves a record
        OCIErrorGet(shared.err, 1, nullptr, &code, text, sizeof text, OCI_HTYPE_ERROR),
        OCIStringAllocSize(shared.env, shared.err, string, &size),
        shared.Execute(shared.stmt),
        OCIAttrGet(shared.stmt, OCI_HTYPE_STMT, &size, nullptr, OCI_ATTR_PARAM_COUNT, shared.err),
    };
    int found = 0;
    for (const sword rc : codes) found += rc != OCI_INVALID_HANDLE;
    return found;
}

class FreedInFlight : public testing::TestWithParam<void (*)(Objects&)> {};

TEST_P(FreedInFlight, CallsEndAndNothingIsLeft) {
    const sb4 before = OCI_memGetMemCount();
    constexpr int kRounds = 30, kThreads = 3;
    for (int round = 0; round < kRounds; ++round) {
        Objects shared;
        shared.Make("select 1 from dual");
        std::atomic<int> started{0};
        std::atomic<bool> stop{false};
        std::vector<std::thread> threads;
        for (int index = 0; index < kThreads; ++index) {
            threads.emplace_back([&, copy = shared] {
                int found = CallOnce(copy, 1);
                ++started;
                for (int call = 2; found > 0 || !stop; ++call) found = CallOnce(copy, call);
            });
        }
        while (started < kThreads) std::this_thread::yield();
        GetParam()(shared);
        stop = true;
        OCIHandleFree(shared.env, OCI_HTYPE_ENV);
        for (std::thread& thread : threads) thread.join();
        ASSERT_EQ(OCI_memGetMemCount(), before) << "round " << round;
    }
}

INSTANTIATE_TEST_SUITE_P(Order, FreedInFlight, testing::Values(
    +[](Objects&) {},    // the environment, and all with it
    +[](Objects& shared) { OCIHandleFree(shared.err, OCI_HTYPE_ERROR); },
    +[](Objects& shared) { OCIHandleFree(shared.stmt, OCI_HTYPE_STMT); },
    +[](Objects& shared) {
        OCIHandleFree(shared.svc, OCI_HTYPE_SVCCTX);
        OCIHandleFree(shared.stmt, OCI_HTYPE_STMT);
    }));

// A statement with open rows is freed while a call elsewhere is in, so that the end of that call destroys it, in its own
// thread, beside a thread that works on the statement's session and then logs off; in every other round that end comes
// while a call holds the session.
TEST(FreedElsewhere, StatementOfASessionThatOthersWorkOn) {
    const sb4 before = OCI_memGetMemCount();
    for (int round = 0; round < 100; ++round) {
        const char* const sql = "select 1 from dual union all select 2 from dual";
        Objects shared;
        shared.Make(sql);
        OCIStmt* other = shared.NewStatement(sql);
        dvoid* made = nullptr;
        MUST(shared.Execute(shared.stmt), OCIDescriptorAlloc(shared.env, &made, OCI_DTYPE_LOB, 0, nullptr));
        auto* const lob = static_cast<OCILobLocator*>(made);
        MUST(OCILobCreateTemporary(shared.svc, shared.err, lob, 0, 0, OCI_TEMP_CLOB, FALSE, OCI_DURATION_SESSION));
        OwnMemory gate;    // an allocation waits in it until it may go on: a call that is in
        OCIEnv* elsewhere = nullptr;
        ASSERT_EQ(gate.Open(&elsewhere, OCI_THREADED), OCI_SUCCESS);
        std::atomic<bool> is_in{false}, open{false};
        gate.before_allocating = [&] {
            for (is_in = true; !open;) std::this_thread::yield();
        };
        std::thread in([&] {
            dvoid* handle = nullptr;
            EXPECT_EQ(OCIHandleAlloc(elsewhere, &handle, OCI_HTYPE_ERROR, 0, nullptr), OCI_SUCCESS);
        });
        while (!is_in) std::this_thread::yield();
        EXPECT_EQ(OCIHandleFree(shared.stmt, OCI_HTYPE_STMT), OCI_SUCCESS);
        std::function<void()> leave = [&] {
            open = true;
            if (round % 2 == 0) in.join();
        };
        const auto gives = [](dvoid* context, dvoid*, ub4* length, ub1* piece) -> sb4 {
            (*static_cast<std::function<void()>*>(context))();
            *length = 1, *piece = OCI_LAST_PIECE;
            return OCI_CONTINUE;
        };
        std::thread working([&] {
            ub4 amount = 0;
            if (round % 2 != 0) leave();
            else SHOULD(OCILobWrite(shared.svc, shared.err, lob, &amount, 1, nullptr, 4, OCI_FIRST_PIECE, &leave, gives,
                                    0, 0));
            for (int call = 0; call < round % 10; ++call) EXPECT_EQ(shared.Execute(other), OCI_SUCCESS);
            EXPECT_EQ(OCILogoff(shared.svc, shared.err), OCI_SUCCESS);
        });
        working.join();
        if (in.joinable()) in.join();
        SHOULD(OCIHandleFree(elsewhere, OCI_HTYPE_ENV), OCIHandleFree(shared.env, OCI_HTYPE_ENV));
        ASSERT_EQ(OCI_memGetMemCount(), before) << "round " << round;
    }
}

// ---- Beside a call that waits

class BesideAWait : public CallFixture {
protected:
    BesideAWait() : CallFixture(OCI_THREADED) {}
    void SetUp() override {
        CallFixture::SetUp();
        ASSERT_EQ(OCIThreadInit(env_, err_), OCI_SUCCESS);
        wait_err_ = New<OCIError>(OCI_HTYPE_ERROR);
    }
    void TearDown() override {
        EXPECT_EQ(OCIThreadTerm(env_, err_), OCI_SUCCESS);
        CallFixture::TearDown();
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

    OCIError* wait_err_ = nullptr;
};

TEST_F(BesideAWait, ForAThreadAMutexAPipe) {
    static std::atomic<bool> stop;
    stop = false;
    OCIThreadHandle* handle = nullptr;
    const auto routine = [](dvoid*) { while (!stop) std::this_thread::sleep_for(1ms); };
    MUST(OCIThreadHndInit(env_, err_, &handle), OCIThreadCreate(env_, err_, routine, nullptr, nullptr, handle));
    MakeAndFree([&] { EXPECT_EQ(OCIThreadJoin(env_, wait_err_, handle), OCI_SUCCESS); }, [] { stop = true; });

    OCIThreadMutex* mutex = nullptr;
    MUST(OCIThreadMutexInit(env_, err_, &mutex), OCIThreadMutexAcquire(env_, err_, mutex));
    MakeAndFree(
        [&] { SHOULD(OCIThreadMutexAcquire(env_, wait_err_, mutex), OCIThreadMutexRelease(env_, wait_err_, mutex)); },
        [&] { EXPECT_EQ(OCIThreadMutexRelease(env_, err_, mutex), OCI_SUCCESS); });

    const std::string name = Folder() + "/pipe";
    OCIFileObject* file = nullptr;
    MUST(mkfifo(name.c_str(), 0600), OCIFileInit(env_, err_));
    const int other_end = open(name.c_str(), O_RDWR);
    ASSERT_EQ(OCIFileOpen(env_, err_, &file, Text(name), nullptr, OCI_FILE_READ_ONLY, OCI_FILE_EXIST, OCI_FILE_BIN), 0);
    char byte = 0;
    ub4 count = 0;
    MakeAndFree([&] { EXPECT_EQ(OCIFileRead(env_, wait_err_, file, &byte, 1, &count), OCI_SUCCESS); },
                [&] { EXPECT_EQ(write(other_end, "k", 1), 1); });
    EXPECT_EQ(byte, 'k');
    SHOULD(OCIFileClose(env_, err_, file), OCIFileTerm(env_, err_), close(other_end));
}

// One thread runs the query, a second one waits for its turn on the same session.
TEST_F(BesideAWait, ForAQueryAndForItsSession) {
    Objects objects;
    objects.Make("with recursive r(n) as (select 1 union all select n + 1 from r) select max(n) from r");
    OCIStmt* short_one = objects.NewStatement("select 1 from dual");
    auto* other_err = NewHandle<OCIError>(objects.env, OCI_HTYPE_ERROR);
    std::thread other;
    MakeAndFree(
        [&] {
            other = std::thread([&] {
                std::this_thread::sleep_for(20ms);
                EXPECT_EQ(OCIStmtExecute(objects.svc, short_one, other_err, 0, 0, nullptr, nullptr, OCI_DEFAULT),
                          OCI_SUCCESS);
            });
            EXPECT_EQ(objects.Execute(objects.stmt), OCI_ERROR);
            other.join();
        },
        [&] { EXPECT_EQ(OCIBreak(objects.svc, wait_err_), OCI_SUCCESS); });
    EXPECT_EQ(OCIHandleFree(objects.env, OCI_HTYPE_ENV), OCI_SUCCESS);
}

// ---- Everything at once

// Threads that make, use and free the same few handles and strings, now and then below a mutex that they wait for and
// below a memory function that frees.
TEST_F(BesideAWait, HandlesMadeUsedAndFreedByAllThreads) {
    constexpr int kThreads = 4, kPlaces = 6;
    std::atomic<OCIStmt*> statements[kPlaces] = {};
    std::atomic<OCIString*> strings[kPlaces] = {};
    OCIThreadMutex* mutex = nullptr;
    ASSERT_EQ(OCIThreadMutexInit(env_, err_, &mutex), OCI_SUCCESS);
    std::atomic<int> wrong{0};
    const auto end = std::chrono::steady_clock::now() + 1s;
    AtOnce(kThreads, [&](int thread) {
        unsigned seed = static_cast<unsigned>(thread) * 7919 + 1;
        auto* err = New<OCIError>(OCI_HTYPE_ERROR);
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
                    expect(OCIHandleAlloc(env_, &fresh, OCI_HTYPE_STMT, 32, nullptr), OCI_SUCCESS);
                    stmt = statements[place].exchange(static_cast<OCIStmt*>(fresh));
                    if (stmt) expect(OCIHandleFree(stmt, OCI_HTYPE_STMT), OCI_SUCCESS);
                    break;
                }
                case 1: {
                    OCIString* fresh = nullptr;
                    expect(OCIStringAssignText(env_, err, Text("some text"), 9, &fresh), OCI_SUCCESS);
                    string = strings[place].exchange(fresh);
                    if (string) expect(OCIStringResize(env_, err, 0, &string), OCI_SUCCESS);
                    break;
                }
                case 2:
                    expect(OCIThreadMutexAcquire(env_, err, mutex), OCI_SUCCESS);
                    expect(OCIThreadMutexRelease(env_, err, mutex), OCI_SUCCESS);
                    break;
                case 3: {
                    OCIString* copy = nullptr;
                    if (string) expect(OCIStringAssign(env_, err, string, &copy), OCI_INVALID_HANDLE);
                    if (copy) expect(OCIStringResize(env_, err, 0, &copy), OCI_SUCCESS);
                    break;
                }
                default:
                    if (stmt) expect(OCIAttrGet(stmt, OCI_HTYPE_STMT, &value, nullptr, OCI_ATTR_PREFETCH_ROWS, err),
                                     OCI_INVALID_HANDLE);
                    if (string) expect(OCIStringAllocSize(env_, err, string, &value), OCI_INVALID_HANDLE);
            }
        }
    });
    EXPECT_EQ(wrong, 0);
}

}  // namespace
