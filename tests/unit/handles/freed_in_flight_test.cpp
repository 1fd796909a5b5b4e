// Handles and whole environments that one thread frees while others are inside calls on them.
#include <gtest/gtest.h>

#include <atomic>
#include <barrier>
#include <cstdlib>
#include <thread>
#include <vector>

#include "kelpci.h"
#include "oci.h"

namespace {

const OraText* Text(const char* text) { return reinterpret_cast<const OraText*>(text); }

// What the threads share; each pointer may be freed at any time.
struct Shared {
    OCIEnv* env = nullptr;
    OCIError* err = nullptr;
    OCISvcCtx* svc = nullptr;
    OCIStmt* stmt = nullptr;
    OCIString* string = nullptr;

    template <class Handle>
    void New(Handle*& handle, ub4 type) {
        ASSERT_EQ(OCIHandleAlloc(env, reinterpret_cast<dvoid**>(&handle), type, 0, nullptr), OCI_SUCCESS);
    }
    void Make() {
        ASSERT_EQ(OCIEnvCreate(&env, OCI_THREADED, nullptr, nullptr, nullptr, nullptr, 0, nullptr), OCI_SUCCESS);
        New(err, OCI_HTYPE_ERROR);
        ASSERT_EQ(OCILogon(env, err, &svc, nullptr, 0, nullptr, 0, Text(":memory:"), 8), OCI_SUCCESS);
        New(stmt, OCI_HTYPE_STMT);
        ASSERT_EQ(OCIStmtPrepare(stmt, err, Text("select 1 from dual"), 18, OCI_NTV_SYNTAX, OCI_DEFAULT), OCI_SUCCESS);
        ASSERT_EQ(OCIStringAssignText(env, err, Text("kelp"), 4, &string), OCI_SUCCESS);
    }
};

// Answers how many of the calls found their handles.
int CallOnce(const Shared& shared, int round) {
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
        OCIStmtExecute(shared.svc, shared.stmt, shared.err, 0, 0, nullptr, nullptr, OCI_DEFAULT),
        OCIAttrGet(shared.stmt, OCI_HTYPE_STMT, &size, nullptr, OCI_ATTR_PARAM_COUNT, shared.err),
    };
    int found = 0;
    for (const sword rc : codes) found += rc != OCI_INVALID_HANDLE;
    return found;
}

class FreedInFlight : public testing::TestWithParam<void (*)(Shared&)> {};

TEST_P(FreedInFlight, CallsEndAndNothingIsLeft) {
    const sb4 before = OCI_memGetMemCount();
    constexpr int kRounds = 30, kThreads = 3;
    for (int round = 0; round < kRounds; ++round) {
        Shared shared;
        shared.Make();
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
    +[](Shared&) {},    // the environment, and all with it
    +[](Shared& shared) { OCIHandleFree(shared.err, OCI_HTYPE_ERROR); },
    +[](Shared& shared) { OCIHandleFree(shared.stmt, OCI_HTYPE_STMT); },
    +[](Shared& shared) {
        OCIHandleFree(shared.svc, OCI_HTYPE_SVCCTX);
        OCIHandleFree(shared.stmt, OCI_HTYPE_STMT);
    }));

TEST(ServerHandles, SessionsOfOneServerBeginAndEndInSeveralThreads) {
    Shared shared;
    shared.Make();
    OCIServer* server = nullptr;
    shared.New(server, OCI_HTYPE_SERVER);
    ASSERT_EQ(OCIServerAttach(server, shared.err, Text(":memory:"), 8, OCI_DEFAULT), OCI_SUCCESS);
    std::atomic<int> failures{0};
    std::vector<std::thread> threads;
    for (int index = 0; index < 4; ++index) {
        threads.emplace_back([&] {
            OCIError* err = nullptr;
            OCISvcCtx* svc = nullptr;
            OCISession* session = nullptr;
            shared.New(err, OCI_HTYPE_ERROR);
            shared.New(svc, OCI_HTYPE_SVCCTX);
            shared.New(session, OCI_HTYPE_SESSION);
            failures += OCIAttrSet(svc, OCI_HTYPE_SVCCTX, server, 0, OCI_ATTR_SERVER, err) != OCI_SUCCESS;
            failures += OCIAttrSet(svc, OCI_HTYPE_SVCCTX, session, 0, OCI_ATTR_SESSION, err) != OCI_SUCCESS;
            for (int round = 0; round < 20; ++round) {
                failures += OCISessionBegin(svc, err, session, OCI_CRED_EXT, OCI_DEFAULT) != OCI_SUCCESS;
                OCIBreak(server, err);
                OCIReset(server, err);
                failures += OCISessionEnd(svc, err, session, OCI_DEFAULT) != OCI_SUCCESS;
            }
        });
    }
    for (std::thread& thread : threads) thread.join();
    EXPECT_EQ(failures, 0);
    EXPECT_EQ(OCIHandleFree(shared.env, OCI_HTYPE_ENV), OCI_SUCCESS);
}

// What several threads do to the same handles at once: work(index), all let go together.
template <class Work>
void AtOnce(int count, Work work) {
    std::barrier start(count);
    std::vector<std::thread> threads;
    for (int index = 0; index < count; ++index) {
        threads.emplace_back([&, index] {
            start.arrive_and_wait();
            work(index);
        });
    }
    for (std::thread& thread : threads) thread.join();
}

TEST(FreedTwice, OneOfTheThreadsThatFreeAHandleDoes) {
    const sb4 before = OCI_memGetMemCount();
    Shared shared;
    shared.Make();
    for (int round = 0; round < 200; ++round) {
        OCIServer* server = nullptr;
        shared.New(server, OCI_HTYPE_SERVER);
        std::atomic<int> freed{0};
        AtOnce(3, [&](int) { freed += OCIHandleFree(server, OCI_HTYPE_SERVER) == OCI_SUCCESS; });
        ASSERT_EQ(freed, 1) << "round " << round;
    }
    EXPECT_EQ(OCIHandleFree(shared.env, OCI_HTYPE_ENV), OCI_SUCCESS);
    EXPECT_EQ(OCI_memGetMemCount(), before);
}

TEST(ServerHandles, BrokenAndDetachedWhileASessionIsFreed) {
    const sb4 before = OCI_memGetMemCount();
    Shared shared;
    shared.Make();
    for (int round = 0; round < 200; ++round) {
        OCIError* errors[3] = {};
        for (OCIError*& error : errors) shared.New(error, OCI_HTYPE_ERROR);
        OCIServer* server = nullptr;
        OCISession* session = nullptr;
        OCISvcCtx* svc = nullptr;
        shared.New(server, OCI_HTYPE_SERVER);
        shared.New(session, OCI_HTYPE_SESSION);
        shared.New(svc, OCI_HTYPE_SVCCTX);
        ASSERT_EQ(OCIServerAttach(server, shared.err, Text(":memory:"), 8, OCI_DEFAULT), OCI_SUCCESS);
        ASSERT_EQ(OCIAttrSet(svc, OCI_HTYPE_SVCCTX, server, 0, OCI_ATTR_SERVER, shared.err), OCI_SUCCESS);
        ASSERT_EQ(OCISessionBegin(svc, shared.err, session, OCI_CRED_EXT, OCI_DEFAULT), OCI_SUCCESS);
        AtOnce(3, [&](int index) {
            if (index == 0) OCIHandleFree(session, OCI_HTYPE_SESSION);
            if (index == 1) OCIBreak(server, errors[1]);
            if (index == 2) OCIServerDetach(server, errors[2], OCI_DEFAULT);
        });
        EXPECT_EQ(OCIHandleFree(session, OCI_HTYPE_SESSION), OCI_INVALID_HANDLE);
        EXPECT_EQ(OCIHandleFree(server, OCI_HTYPE_SERVER), OCI_SUCCESS);
    }
    EXPECT_EQ(OCIHandleFree(shared.env, OCI_HTYPE_ENV), OCI_SUCCESS);
    EXPECT_EQ(OCI_memGetMemCount(), before);
}

// The memory functions of an environment in which an allocation waits until it may go on: a call that is in.
struct Gate {
    std::atomic<bool> armed{false}, in{false}, open{false};

    static dvoid* Allocate(dvoid* context, size_t size) {
        auto& gate = *static_cast<Gate*>(context);
        if (gate.armed) {
            gate.in = true;
            while (!gate.open) std::this_thread::yield();
        }
        return std::malloc(size);
    }
    static void Free(dvoid*, dvoid* memory) { std::free(memory); }
};

// A statement with open rows is freed while a call elsewhere is in, so that the end of that call destroys it, in its own
// thread, beside a thread that works on the statement's session and then logs off.
TEST(FreedElsewhere, StatementOfASessionThatOthersWorkOn) {
    const sb4 before = OCI_memGetMemCount();
    for (int round = 0; round < 100; ++round) {
        Shared shared;
        shared.Make();
        OCIStmt* other = nullptr;
        shared.New(other, OCI_HTYPE_STMT);
        const OraText* sql = Text("select 1 from dual union all select 2 from dual");
        ASSERT_EQ(OCIStmtPrepare(shared.stmt, shared.err, sql, 47, OCI_NTV_SYNTAX, OCI_DEFAULT), OCI_SUCCESS);
        ASSERT_EQ(OCIStmtPrepare(other, shared.err, sql, 47, OCI_NTV_SYNTAX, OCI_DEFAULT), OCI_SUCCESS);
        ASSERT_EQ(OCIStmtExecute(shared.svc, shared.stmt, shared.err, 0, 0, nullptr, nullptr, OCI_DEFAULT), 0);
        Gate gate;
        OCIEnv* elsewhere = nullptr;
        ASSERT_EQ(OCIEnvCreate(&elsewhere, OCI_THREADED, &gate, Gate::Allocate, nullptr, Gate::Free, 0, nullptr), 0);
        gate.armed = true;
        std::thread in([&] {
            dvoid* handle = nullptr;
            EXPECT_EQ(OCIHandleAlloc(elsewhere, &handle, OCI_HTYPE_ERROR, 0, nullptr), OCI_SUCCESS);
        });
        while (!gate.in) std::this_thread::yield();
        EXPECT_EQ(OCIHandleFree(shared.stmt, OCI_HTYPE_STMT), OCI_SUCCESS);
        std::thread working([&] {
            gate.open = true;
            for (int call = 0; call < round % 10; ++call)
                EXPECT_EQ(OCIStmtExecute(shared.svc, other, shared.err, 0, 0, nullptr, nullptr, OCI_DEFAULT), 0);
            EXPECT_EQ(OCILogoff(shared.svc, shared.err), OCI_SUCCESS);
        });
        in.join();
        working.join();
        EXPECT_EQ(OCIHandleFree(elsewhere, OCI_HTYPE_ENV), OCI_SUCCESS);
        EXPECT_EQ(OCIHandleFree(shared.env, OCI_HTYPE_ENV), OCI_SUCCESS);
        ASSERT_EQ(OCI_memGetMemCount(), before) << "round " << round;
    }
}

}  // namespace
