// Sessions: what their end does to the work done in them, what attributes tell of them, and several threads that begin,
// use, break and end the same ones.
#include <atomic>
#include <chrono>
#include <functional>
#include <thread>

#include "support/at_once.h"
#include "support/call_fixture.h"

namespace {

using namespace std::chrono_literals;

// Two threads that wait for each other without sleeping, so that they go on in the same moment.
class Turn {
public:
    void Wait() {
        const int until = (came_.fetch_add(1) / 2 + 1) * 2;
        for (int spin = 0; came_ < until; ++spin)
            if (spin > 100'000) std::this_thread::yield();
    }

private:
    std::atomic<int> came_{0};
};

class Sessions : public CallFixture {
protected:
    Sessions() : CallFixture(OCI_THREADED) {}
    void SetUp() override {
        CallFixture::SetUp();
        Folder();
    }

    using CallFixture::LogOn;
    sb4 LogOn(OCISvcCtx** svc, const char* database, OCIError* err) const {
        return Answer(OCILogon(env_, err, svc, nullptr, 0, nullptr, 0, Text(database), Length(database)), err);
    }
    OCIServer* NewServer(const char* database) const {
        auto* server = New<OCIServer>(OCI_HTYPE_SERVER);
        EXPECT_EQ(Answer(OCIServerAttach(server, err_, Text(database), static_cast<sb4>(Length(database)), 0)), 0);
        return server;
    }
    OCISvcCtx* NewContext(OCIServer* server, OCISession* session) const {
        auto* svc = New<OCISvcCtx>(OCI_HTYPE_SVCCTX);
        EXPECT_EQ(Answer(OCIAttrSet(svc, OCI_HTYPE_SVCCTX, server, 0, OCI_ATTR_SERVER, err_)), 0);
        EXPECT_EQ(Answer(OCIAttrSet(svc, OCI_HTYPE_SVCCTX, session, 0, OCI_ATTR_SESSION, err_)), 0);
        return svc;
    }
    // work(index, error handle) in threads of their own.
    void AtOnce(int count, const std::function<void(int, OCIError*)>& work) const {
        ::AtOnce(count, [&](int index) {
            auto* err = New<OCIError>(OCI_HTYPE_ERROR);
            work(index, err);
            OCIHandleFree(err, OCI_HTYPE_ERROR);
        });
    }
};

TEST_F(Sessions, AServerIsBusyWhileACallRuns) {
    OCISvcCtx* svc = nullptr;
    MUST(LogOn(&svc, "here"), Run(svc, "create table t(n number)"));
    auto* server = Attribute<OCIServer*>(svc, OCI_HTYPE_SVCCTX, OCI_ATTR_SERVER);
    const auto busy = [&] { return Attribute<ub1>(server, OCI_HTYPE_SERVER, OCI_ATTR_SERVER_BUSY); };
    AtOnce(2, [&](int index, OCIError* err) {
        if (index == 0) {
            EXPECT_EQ(Run(svc, New<OCIStmt>(OCI_HTYPE_STMT), err, "insert into t with recursive r(n) as (select 1 union all"
                          " select n + 1 from r) select count(*) from r", 1), 1013);
            return;
        }
        while (busy() == 0) std::this_thread::yield();
        EXPECT_EQ(Answer(OCIBreak(svc, err), err), 0);
    });
    EXPECT_EQ(busy(), 0);
}

// ---- Several threads

// Two threads end each other's sessions; then one of the two begins a session that both want.
TEST_F(Sessions, BegunAndEndedByTwoThreads) {
    OCIServer* server = NewServer(":memory:");
    OCISession* sessions[] = {New<OCISession>(OCI_HTYPE_SESSION), New<OCISession>(OCI_HTYPE_SESSION)};
    OCISvcCtx* contexts[] = {NewContext(server, sessions[0]), NewContext(server, sessions[1])};
    OCISvcCtx* same[] = {contexts[0], NewContext(server, sessions[0])};
    Turn turn;
    sb4 answers[2];
    AtOnce(2, [&](int index, OCIError* err) {
        const auto begin = [&](OCISvcCtx* svc, OCISession* session) {
            return Answer(OCISessionBegin(svc, err, session, OCI_CRED_EXT, 0), err);
        };
        for (int round = 0; round < 400; ++round) {
            EXPECT_EQ(begin(contexts[index], sessions[index]), 0);
            turn.Wait();
            EXPECT_EQ(Answer(OCISessionEnd(contexts[index], err, sessions[1 - index], 0), err), 0);
            turn.Wait();
            answers[index] = begin(same[index], sessions[0]);
            turn.Wait();
            if (index == 0) {
                EXPECT_TRUE(std::minmax({answers[0], answers[1]}) == std::pair(0, 24313)) << "round " << round;
                EXPECT_EQ(Answer(OCIPing(same[1], err, 0), err), 0);
                EXPECT_EQ(Answer(OCISessionEnd(same[0], err, sessions[0], 0), err), 0);
            }
            turn.Wait();
        }
    });
}

// One thread logs on and off on a context, the others use it: whatever they find, it is one of the two states.
TEST_F(Sessions, UsedWhileAThreadLogsOnAndOff) {
    OCISvcCtx* svc = nullptr;
    ASSERT_EQ(LogOn(&svc, "here"), 0);
    std::atomic<bool> stop{false};
    const auto among = [](sb4 answer, std::initializer_list<sb4> allowed) {
        EXPECT_TRUE(std::find(allowed.begin(), allowed.end(), answer) != allowed.end()) << answer;
    };
    AtOnce(5, [&](int index, OCIError* err) {
        if (index == 0) {
            OCISvcCtx* own = svc;
            for (const auto end = std::chrono::steady_clock::now() + 1s; std::chrono::steady_clock::now() < end;) {
                among(Answer(OCILogoff(svc, err), err), {0, 1013});
                EXPECT_EQ(LogOn(&own, "here", err), 0);
                EXPECT_EQ(own, svc);
            }
            stop = true;
        }
        auto* stmt = New<OCIStmt>(OCI_HTYPE_STMT);
        while (!stop) {
            OCISession* session = nullptr;
            OCIStmt* prepared = nullptr;
            switch (index) {
                case 1:
                    among(Answer(OCIBreak(svc, err), err), {0, 1012, 3114});
                    among(Answer(OCIReset(svc, err), err), {0, 1012, 3114});
                    break;
                case 2: among(Run(svc, stmt, err, "select 1 from dual", 0), {0, 1012, 1013, 3114}); break;
                case 3:
                    EXPECT_EQ(Answer(OCIAttrGet(svc, OCI_HTYPE_SVCCTX, &session, nullptr, OCI_ATTR_SESSION, err), err),
                              0);
                    among(Answer(OCIPing(svc, err, 0), err), {0, 1012, 1013, 3114});
                    break;
                default:
                    among(Answer(OCIStmtPrepare2(svc, &prepared, err, Text("select 2 from dual"), 18, nullptr, 0,
                                                 OCI_NTV_SYNTAX, OCI_DEFAULT), err), {0, 1012, 3114});
                    if (prepared) OCIStmtRelease(prepared, err, nullptr, 0, OCI_DEFAULT);
            }
        }
    });
    SHOULD(Answer(OCIReset(svc, err_)), Answer(OCIPing(svc, err_, 0)), Answer(OCILogoff(svc, err_)));
}

TEST_F(Sessions, TwoThreadsLogOnAndOffOnOneContext) {
    OCISvcCtx* svc = nullptr;
    ASSERT_EQ(LogOn(&svc, "here"), 0);
    AtOnce(2, [&](int, OCIError* err) {
        OCISvcCtx* own = svc;
        for (int round = 0; round < 100; ++round) {
            EXPECT_EQ(LogOn(&own, "here", err), 0) << "round " << round;
            const sb4 answer = Answer(OCILogoff(own, err), err);
            EXPECT_TRUE(answer == 0 || answer == 3114) << answer << ": the other has";
        }
    });
    MUST(LogOn(&svc, "here"), Answer(OCIPing(svc, err_, 0)));
}

TEST_F(Sessions, AttachedDetachedAndAskedByThreads) {
    auto* server = New<OCIServer>(OCI_HTYPE_SERVER);
    AtOnce(3, [&](int index, OCIError* err) {
        for (int round = 0; round < 300; ++round) {
            const char* name = nullptr;
            ub4 status = 0;
            OraText version[200];
            switch (index) {
                case 0: OCIServerAttach(server, err, Text("here"), 4, 0); break;
                case 1: OCIServerDetach(server, err, 0); break;
                default:
                    EXPECT_EQ(OCIAttrGet(server, OCI_HTYPE_SERVER, &name, nullptr, OCI_ATTR_DBNAME, err), OCI_SUCCESS);
                    EXPECT_EQ(OCIAttrGet(server, OCI_HTYPE_SERVER, &status, nullptr, OCI_ATTR_SERVER_STATUS, err),
                              OCI_SUCCESS);
                    OCIServerVersion(server, err, version, sizeof version, OCI_HTYPE_SERVER);
            }
        }
    });
    OCIServerAttach(server, err_, Text("here"), 4, 0);
    EXPECT_STREQ(Attribute<const char*>(server, OCI_HTYPE_SERVER, OCI_ATTR_DBNAME), "here");
    EXPECT_EQ(Answer(OCIServerDetach(server, err_, OCI_DEFAULT)), 0);
    EXPECT_EQ(Attribute<const char*>(server, OCI_HTYPE_SERVER, OCI_ATTR_DBNAME), nullptr);
}

TEST_F(Sessions, OfOneServerBegunAndEndedByThreads) {
    OCIServer* server = NewServer(":memory:");
    AtOnce(4, [&](int, OCIError* err) {
        auto* session = New<OCISession>(OCI_HTYPE_SESSION);
        OCISvcCtx* svc = NewContext(server, session);
        for (int round = 0; round < 20; ++round) {
            EXPECT_EQ(OCISessionBegin(svc, err, session, OCI_CRED_EXT, OCI_DEFAULT), OCI_SUCCESS);
            OCIBreak(server, err);
            OCIReset(server, err);
            EXPECT_EQ(OCISessionEnd(svc, err, session, OCI_DEFAULT), OCI_SUCCESS);
        }
    });
}

TEST_F(Sessions, FreedWhileTheirServerIsBrokenAndDetached) {
    for (int round = 0; round < 200; ++round) {
        OCIServer* server = NewServer(":memory:");
        auto* session = New<OCISession>(OCI_HTYPE_SESSION);
        OCISvcCtx* svc = NewContext(server, session);
        ASSERT_EQ(Answer(OCISessionBegin(svc, err_, session, OCI_CRED_EXT, OCI_DEFAULT)), 0);
        AtOnce(3, [&](int index, OCIError* err) {
            if (index == 0) OCIHandleFree(session, OCI_HTYPE_SESSION);
            if (index == 1) OCIBreak(server, err);
            if (index == 2) OCIServerDetach(server, err, OCI_DEFAULT);
        });
        EXPECT_EQ(OCIHandleFree(session, OCI_HTYPE_SESSION), OCI_INVALID_HANDLE);
        EXPECT_EQ(OCIHandleFree(server, OCI_HTYPE_SERVER), OCI_SUCCESS);
    }
}

TEST_F(Sessions, FreedByOneOfTheThreadsThatFreeThem) {
    for (int round = 0; round < 200; ++round) {
        auto* session = New<OCISession>(OCI_HTYPE_SESSION);
        std::atomic<int> freed{0};
        AtOnce(3, [&](int, OCIError*) { freed += OCIHandleFree(session, OCI_HTYPE_SESSION) == OCI_SUCCESS; });
        ASSERT_EQ(freed, 1) << "round " << round;
    }
}

}  // namespace
