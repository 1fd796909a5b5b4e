// The thread package: its objects, their misuse, and many threads at once.
#include <pthread.h>

#include <atomic>
#include <thread>
#include <vector>

#include "support/call_fixture.h"

namespace {

std::atomic<int> destroyed{0};
void CountDestroyed(dvoid*) { ++destroyed; }

class ThreadCalls : public CallFixture {
protected:
    void SetUp() override {
        CallFixture::SetUp();
        OCIThreadProcessInit();
        EXPECT_EQ(OCIThreadIsMulti(), TRUE);
        ASSERT_EQ(OCIThreadInit(env_, err_), OCI_SUCCESS);
        destroyed = 0;
    }
    void TearDown() override {
        EXPECT_EQ(OCIThreadTerm(env_, err_), OCI_SUCCESS);
        CallFixture::TearDown();
    }

    template <class T>
    T* Made(sword (*init)(dvoid*, OCIError*, T**)) {
        T* made = nullptr;
        EXPECT_EQ(init(env_, err_, &made), OCI_SUCCESS);
        return made;
    }
    OCIThreadMutex* NewMutex() { return Made(OCIThreadMutexInit); }
    OCIThreadId* NewId() { return Made(OCIThreadIdInit); }
    OCIThreadHandle* NewHandle() { return Made(OCIThreadHndInit); }
    OCIThreadKey* NewKey(OCIThreadKeyDestFunc destroy = nullptr) {
        OCIThreadKey* key = nullptr;
        EXPECT_EQ(OCIThreadKeyInit(env_, err_, &key, destroy), OCI_SUCCESS);
        return key;
    }
    boolean Same(OCIThreadId* left, OCIThreadId* right) {
        boolean same = 9;
        EXPECT_EQ(OCIThreadIdSame(env_, err_, left, right, &same), OCI_SUCCESS);
        return same;
    }
};

// What a thread of the tests works with, and what went wrong in it.
struct Work {
    OCIEnv* env;
    OCIError* err;
    OCIThreadKey* key = nullptr;
    OCIThreadMutex* mutex = nullptr;
    OCIThreadId* id = nullptr;
    OCIThreadHandle* handle = nullptr;
    long counter = 0;
    std::atomic<int> failures{0};
};

TEST_F(ThreadCalls, NothingIsMadeWhereSomethingLives) {
    OCIThreadMutex* mutex = NewMutex();
    EXPECT_EQ(Answer(OCIThreadMutexInit(env_, err_, &mutex)), 21560);
}

TEST_F(ThreadCalls, AThreadThatNobodyKnows) {
    EXPECT_EQ(Answer(OCIThreadCreate(env_, err_, CountDestroyed, nullptr, nullptr, nullptr)), 0);
    while (destroyed == 0) std::this_thread::yield();
}

// A value that is set anew by the function that takes it away is taken away a few times, then no more.
TEST_F(ThreadCalls, ValuesThatComeBack) {
    static Work work{env_, err_};
    work.key = NewKey([](dvoid* value) { OCIThreadKeySet(work.env, work.err, work.key, value), ++destroyed; });
    std::thread([] { OCIThreadKeySet(work.env, work.err, work.key, &work); }).join();
    EXPECT_EQ(destroyed, 4);
}

// Without room for its stack there is no thread, and what was to become its id and handle stay what they were.
TEST_F(ThreadCalls, AThreadThatCannotStart) {
    OCIThreadHandle* handle = NewHandle();
    OCIThreadId *id = NewId(), *own = NewId();
    MUST(Answer(OCIThreadIdGet(env_, err_, id)), Answer(OCIThreadIdGet(env_, err_, own)));
    pthread_attr_t usual, huge;
    pthread_getattr_default_np(&usual);
    pthread_attr_init(&huge);
    pthread_attr_setstacksize(&huge, std::size_t{1} << 60);
    ASSERT_EQ(pthread_setattr_default_np(&huge), 0);
    EXPECT_EQ(Answer(OCIThreadCreate(env_, err_, CountDestroyed, nullptr, id, handle)), 21500);
    EXPECT_EQ(Answer(OCIThreadCreate(env_, err_, CountDestroyed, nullptr, nullptr, nullptr)), 21500);
    pthread_setattr_default_np(&usual);
    EXPECT_EQ(destroyed, 0);
    EXPECT_TRUE(Same(id, own));
    EXPECT_EQ(Answer(OCIThreadClose(env_, err_, handle)), 21560) << "no thread yet";
}

// In threads of the application's own, too: each ends with a value of its own, without one, or without the key.
TEST_F(ThreadCalls, KeysHoldAValueForEachThread) {
    OCIThreadKey* key = NewKey(CountDestroyed);
    OCIThreadKey* plain = NewKey();
    ASSERT_EQ(Answer(OCIThreadKeySet(env_, err_, key, this)), 0);
    const auto in_a_thread = [&](OCIThreadKey* of, auto end) {
        std::thread([&] {
            dvoid *before = this, *after = nullptr;
            EXPECT_EQ(OCIThreadKeyGet(env_, err_, of, &before), OCI_SUCCESS);
            EXPECT_EQ(before, nullptr);
            SHOULD(OCIThreadKeySet(env_, err_, of, &after), OCIThreadKeyGet(env_, err_, of, &after));
            EXPECT_EQ(after, &after);
            end();
        }).join();
        return destroyed.load();
    };
    EXPECT_EQ(in_a_thread(key, [] {}), 1);
    EXPECT_EQ(in_a_thread(plain, [] {}), 1);
    EXPECT_EQ(in_a_thread(key, [&] { OCIThreadKeySet(env_, err_, key, nullptr); }), 1);
    dvoid* value = nullptr;
    EXPECT_EQ(Answer(OCIThreadKeyGet(env_, err_, key, &value)), 0);
    EXPECT_EQ(value, this);
    EXPECT_EQ(in_a_thread(key, [&] { EXPECT_EQ(OCIThreadKeyDestroy(env_, err_, &key), OCI_SUCCESS); }), 1);
    EXPECT_EQ(key, nullptr);
}

// A key's function that uses the package while its thread ends: it is still that thread.
TEST_F(ThreadCalls, KeyFunctionsMayUseThePackage) {
    static Work* the_work;
    Work work{env_, err_};
    the_work = &work;
    work.id = NewId();
    work.key = NewKey([](dvoid*) {
        the_work->failures += OCIThreadIdGet(the_work->env, the_work->err, the_work->id) != OCI_SUCCESS;
        if (++the_work->counter < 3) OCIThreadKeySet(the_work->env, the_work->err, the_work->key, the_work);
    });
    OCIThreadId* id = NewId();
    OCIThreadHandle* handle = NewHandle();
    const auto routine = [](dvoid*) { OCIThreadKeySet(the_work->env, the_work->err, the_work->key, the_work); };
    ASSERT_EQ(Answer(OCIThreadCreate(env_, err_, routine, nullptr, id, handle)), 0);
    ASSERT_EQ(Answer(OCIThreadJoin(env_, err_, handle)), 0);
    EXPECT_EQ(work.failures, 0);
    EXPECT_EQ(work.counter, 3);
    EXPECT_TRUE(Same(id, work.id));
}

// Sixty-four threads with one environment and one error handle, some of whose calls fail.
TEST_F(ThreadCalls, ManyThreadsAtOnce) {
    constexpr int kThreads = 64, kRounds = 50;
    Work work{env_, err_};
    work.key = NewKey(CountDestroyed);
    work.mutex = NewMutex();
    MUST(Answer(OCIThreadMutexAcquire(env_, err_, work.mutex)));
    std::thread([&] { EXPECT_EQ(OCIThreadMutexRelease(env_, err_, work.mutex), OCI_ERROR) << "another's"; }).join();
    MUST(Answer(OCIThreadMutexRelease(env_, err_, work.mutex)));
    const auto routine = [](dvoid* given) {
        auto& shared = *static_cast<Work*>(given);
        OCIThreadId* id = nullptr;
        shared.failures += OCIThreadIdInit(shared.env, shared.err, &id) != OCI_SUCCESS;
        shared.failures += OCIThreadKeySet(shared.env, shared.err, shared.key, id) != OCI_SUCCESS;
        for (int i = 0; i < kRounds; ++i) {
            shared.failures += OCIThreadMutexAcquire(shared.env, shared.err, shared.mutex) != OCI_SUCCESS;
            ++shared.counter;
            shared.failures += OCIThreadMutexAcquire(shared.env, shared.err, shared.mutex) != OCI_ERROR;
            shared.failures += OCIThreadMutexRelease(shared.env, shared.err, shared.mutex) != OCI_SUCCESS;
            sb4 number = 0;
            OCIErrorGet(shared.err, 1, nullptr, &number, nullptr, 0, OCI_HTYPE_ERROR);
        }
        dvoid* value = nullptr;
        shared.failures += OCIThreadKeyGet(shared.env, shared.err, shared.key, &value) != OCI_SUCCESS || value != id;
        shared.failures += OCIThreadIdDestroy(shared.env, shared.err, &id) != OCI_SUCCESS;
    };
    std::vector<OCIThreadHandle*> handles;
    for (int i = 0; i < kThreads; ++i) {
        handles.push_back(NewHandle());
        ASSERT_EQ(OCIThreadCreate(env_, err_, routine, &work, NewId(), handles.back()), OCI_SUCCESS);
    }
    for (OCIThreadHandle* handle : handles) {
        SHOULD(OCIThreadJoin(env_, err_, handle), OCIThreadClose(env_, err_, handle));
        EXPECT_EQ(OCIThreadHndDestroy(env_, err_, &handle), 0);
    }
    EXPECT_EQ(work.failures, 0);
    EXPECT_EQ(work.counter, kThreads * kRounds);
    EXPECT_EQ(destroyed, kThreads);
}

}  // namespace
