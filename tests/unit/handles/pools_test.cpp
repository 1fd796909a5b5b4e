// Pools: what rests and what ends, and many threads at once. Sizes, refusals and tags stand in transcripts/pool_states
// and walk_pools.
#include <atomic>
#include <chrono>
#include <mutex>
#include <thread>

#include "support/at_once.h"
#include "support/call_fixture.h"

namespace {

using namespace std::chrono_literals;

constexpr ub4 kHomogeneous = OCI_SPC_HOMOGENEOUS;

class Pools : public CallFixture {
protected:
    Pools() : CallFixture(OCI_THREADED) {}
    void SetUp() override {
        CallFixture::SetUp();
        MakeDatabase();
        pool_ = New<OCISPool>(OCI_HTYPE_SPOOL);
    }

    sb4 Create(ub4 least, ub4 most, ub4 step, ub4 mode = kHomogeneous) {
        OraText* name = nullptr;
        ub4 length = 0;
        const sword code = OCISessionPoolCreate(env_, err_, pool_, &name, &length, Text("work"), 4, least, most, step,
                                                Text(ann_), Length(ann_.c_str()), Text("secret"), 6, mode);
        if (code == OCI_SUCCESS) name_.assign(reinterpret_cast<char*>(name), length);
        return Answer(code);
    }
    sb4 Get(OCISvcCtx** svc, OCIError* err, std::string_view name) const {
        OraText* tag = nullptr;
        const sword code = OCISessionGet(env_, err, svc, nullptr, Text(name), static_cast<ub4>(name.size()), nullptr, 0,
                                         &tag, nullptr, nullptr, OCI_SESSGET_SPOOL);
        EXPECT_EQ(tag, nullptr);
        return Answer(code, err);
    }
    sb4 Get(OCISvcCtx** svc, OCIError* err) const { return Get(svc, err, name_); }
    sb4 Release(OCISvcCtx* svc, ub4 mode = OCI_DEFAULT) {
        return Answer(OCISessionRelease(svc, err_, nullptr, 0, mode));
    }
    sb4 Destroy(ub4 mode = OCI_DEFAULT) { return Answer(OCISessionPoolDestroy(pool_, err_, mode)); }
    ub4 OpenCount() { return Attribute<ub4>(pool_, OCI_HTYPE_SPOOL, OCI_ATTR_SPOOL_OPEN_COUNT); }
    ub4 Busy() { return Attribute<ub4>(pool_, OCI_HTYPE_SPOOL, OCI_ATTR_SPOOL_BUSY_COUNT); }
    template <class T>
    sb4 Set(ub4 attribute, T value) {
        return Answer(OCIAttrSet(pool_, OCI_HTYPE_SPOOL, &value, 0, attribute, err_));
    }
    OCISPool* pool_ = nullptr;
    std::string name_;
};

// The idle go when somebody looks, down to the least.
TEST_F(Pools, TheIdleGo) {
    ASSERT_EQ(Create(0, 1, 1), 0);
    OCISvcCtx *svc = nullptr, *second = nullptr;
    MUST(Get(&svc, err_), Release(svc), Set<ub4>(OCI_ATTR_SPOOL_TIMEOUT, 1));
    EXPECT_EQ(OpenCount(), 1u);
    std::this_thread::sleep_for(1100ms);
    EXPECT_EQ(OpenCount(), 0u);
    MUST(Create(2, 2, 0, OCI_SPC_REINITIALIZE), Get(&svc, err_), Get(&second, err_), Release(svc));
    std::this_thread::sleep_for(1100ms);
    EXPECT_EQ(OpenCount(), 2u) << "no fewer than the least";
    MUST(Set<ub4>(OCI_ATTR_SPOOL_TIMEOUT, 0), Create(1, 2, 1, OCI_SPC_REINITIALIZE));
    MUST(Set<ub4>(OCI_ATTR_SPOOL_TIMEOUT, 1), Release(second));
    EXPECT_EQ(OpenCount(), 1u) << "that which rested long, though the other has just come";
}

// A newcomer stands behind who waits, though a session has just come back; a pool that grows has room for who waits.
TEST_F(Pools, WhoWaitsComesFirst) {
    MUST(Create(1, 1, 1), Set<ub1>(OCI_ATTR_SPOOL_GETMODE, OCI_SPOOL_ATTRVAL_TIMEDWAIT));
    ASSERT_EQ(Set<ub4>(OCI_ATTR_SPOOL_WAIT_TIMEOUT, 20000), 0);
    auto* err = New<OCIError>(OCI_HTYPE_ERROR);
    int overtaken = 0;
    for (int round = 0; round <= 20; ++round) {
        OCISvcCtx *held = nullptr, *again = nullptr;
        ASSERT_EQ(Get(&held, err_), 0);
        std::atomic<bool> begins = false, came = false;
        std::thread waits([&] {
            OCISvcCtx* svc = nullptr;
            begins = true;
            EXPECT_EQ(Get(&svc, err), 0);
            came = true;
            EXPECT_EQ(OCISessionRelease(svc, err, nullptr, 0, OCI_DEFAULT), 0);
        });
        while (!begins) std::this_thread::yield();
        std::this_thread::sleep_for(20ms);
        if (round == 20) {
            const auto grown = std::chrono::steady_clock::now();
            EXPECT_EQ(Create(1, 2, 1, OCI_SPC_REINITIALIZE), 0);
            waits.join();
            EXPECT_LT(std::chrono::steady_clock::now() - grown, 15s);
            again = held;
        } else {
            SHOULD(Release(held), Get(&again, err_));
            overtaken += !came;
        }
        EXPECT_EQ(Release(again), 0);
        if (waits.joinable()) waits.join();
    }
    EXPECT_LT(overtaken, 6) << "it may not have waited yet on a busy machine; without an order nearly all are";
}

TEST_F(Pools, ManyThreadsShareAFewSessions) {
    ASSERT_EQ(Create(1, 3, 1), 0);
    std::atomic<int> in_use = 0, failures = 0;
    AtOnce(8, [&](int index) {
        auto* err = New<OCIError>(OCI_HTYPE_ERROR);
        for (int round = 0; round < 60; ++round) {
            OCISvcCtx* svc = nullptr;
            failures += Get(&svc, err) != 0;
            failures += ++in_use > 3;
            failures += OCIPing(svc, err, OCI_DEFAULT) != OCI_SUCCESS;
            --in_use;
            failures += OCISessionRelease(svc, err, nullptr, 0, round % 16 == index ? OCI_SESSRLS_DROPSESS : 0) != 0;
        }
    });
    EXPECT_EQ(failures, 0);
    EXPECT_EQ(Busy(), 0u);
    EXPECT_LE(OpenCount(), 3u);
    EXPECT_EQ(Destroy(), 0);
}

// However a pool ends, nobody waits in it for ever, and what was in use is given up without harm.
TEST_F(Pools, WhoWaitsIsToldWhenThePoolGoes) {
    for (const bool freed : {false, true}) {
        ASSERT_EQ(Create(1, 1, 1), 0);
        OCISvcCtx* svc = nullptr;
        ASSERT_EQ(Get(&svc, err_), 0);
        std::atomic<int> waiting = 0;
        AtOnce(4, [&](int index) {
            auto* err = NewHandle<OCIError>(env_, OCI_HTYPE_ERROR);
            OCISvcCtx* own = nullptr;
            if (index > 0) {
                ++waiting;
                const sb4 answer = Get(&own, err);
                EXPECT_TRUE(freed || answer == 24416) << answer;
                EXPECT_EQ(own, nullptr);
                return;
            }
            while (waiting < 3) std::this_thread::yield();
            std::this_thread::sleep_for(30ms);
            if (freed) {
                EXPECT_EQ(OCIHandleFree(env_, OCI_HTYPE_ENV), OCI_SUCCESS);
                return;
            }
            EXPECT_EQ(Answer(OCISessionPoolDestroy(pool_, err, OCI_SPD_FORCE), err), 0);
        });
        EXPECT_TRUE(freed || Release(svc) == 1012);
    }
    Open(OCI_THREADED);
}

TEST_F(Pools, DestroyedAndMadeAnewUnderLoad) {
    std::atomic<bool> done = false;
    std::atomic<int> odd = 0;
    std::mutex naming;
    ASSERT_EQ(Create(1, 2, 1), 0);
    AtOnce(5, [&](int index) {
        auto* err = New<OCIError>(OCI_HTYPE_ERROR);
        for (int round = 0; index == 0 && round < 15; ++round) {
            odd += Destroy(OCI_SPD_FORCE) != 0;
            const std::lock_guard lock(naming);
            odd += Create(1, 2, 1) != 0;
        }
        if (index == 0) done = true;
        while (!done) {
            std::string name;
            {
                const std::lock_guard lock(naming);
                name = name_;
            }
            OCISvcCtx* svc = nullptr;
            const sb4 got = Get(&svc, err, name);
            odd += got != 0 && got != 24416 && got != 3114;
            if (got != 0) continue;
            (void)OCIPing(svc, err, OCI_DEFAULT);
            const sb4 released = Answer(OCISessionRelease(svc, err, nullptr, 0, 0), err);
            odd += released != 0 && released != 1012;
        }
    });
    EXPECT_EQ(odd, 0);
    EXPECT_EQ(Busy(), 0u);
}

}  // namespace
