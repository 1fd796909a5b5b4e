// Branches of OCITransStart between threads and sessions; what a transcript cannot show.
#include <atomic>
#include <thread>

#include "support/call_fixture.h"
#include "xa.h"

namespace {

class Transactions : public CallFixture {
protected:
    Transactions() : CallFixture(OCI_THREADED) {}
    void SetUp() override {
        Folder();
        CallFixture::SetUp();
        stmt_ = New<OCIStmt>(OCI_HTYPE_STMT);
        for (OCISvcCtx*& svc : svc_) {
            ASSERT_EQ(LogOn(&svc, "bank"), 0);
            auto* trans = New<OCITrans>(OCI_HTYPE_TRANS);
            XID xid{5, 2, 1, "txb"};
            ASSERT_EQ(Answer(OCIAttrSet(trans, OCI_HTYPE_TRANS, &xid, sizeof xid, OCI_ATTR_XID, err_)), 0);
            ASSERT_EQ(Answer(OCIAttrSet(svc, OCI_HTYPE_SVCCTX, trans, 0, OCI_ATTR_TRANS, err_)), 0);
        }
        ASSERT_EQ(Run(0, "create table t(n number)"), 0);
    }
    sb4 Run(int session, const char* sql) {
        EXPECT_EQ(OCIStmtPrepare(stmt_, err_, Text(sql), Length(sql), OCI_NTV_SYNTAX, OCI_DEFAULT), 0);
        return Answer(OCIStmtExecute(svc_[session], stmt_, err_, 1, 0, nullptr, nullptr, OCI_DEFAULT));
    }
    sb4 Start(int session, uword timeout, ub4 flags) {
        return Answer(OCITransStart(svc_[session], err_, timeout, flags));
    }

    OCIStmt* stmt_ = nullptr;
    OCISvcCtx* svc_[2] = {};
};

TEST_F(Transactions, ResumingWaitsForAnotherThread) {
    MUST(Start(0, 0, OCI_TRANS_NEW), Run(0, "insert into t values(1)"));
    std::atomic<int> refused{0};
    std::thread other([&] {
        auto* const err = NewHandle<OCIError>(env_, OCI_HTYPE_ERROR);
        for (; refused < 2; ++refused) EXPECT_EQ(Answer(OCITransStart(svc_[1], err, refused, OCI_TRANS_RESUME), err), 25351);
        EXPECT_EQ(Answer(OCITransStart(svc_[1], err, 30, OCI_TRANS_RESUME), err), 0);
        EXPECT_EQ(Answer(OCITransCommit(svc_[1], err, OCI_DEFAULT), err), 0);
    });
    while (refused < 2) std::this_thread::yield();
    std::this_thread::sleep_for(std::chrono::milliseconds(50));
    EXPECT_EQ(Answer(OCITransDetach(svc_[0], err_, OCI_DEFAULT)), 0);
    other.join();
    EXPECT_EQ(Run(0, "insert into t select 1 / (case count(*) when 1 then 1 else 0 end) from t"), 0);
    EXPECT_EQ(Answer(OCITransCommit(svc_[0], err_, OCI_DEFAULT)), 0);
    EXPECT_EQ(Start(0, 0, OCI_TRANS_RESUME), 24756);
}

TEST_F(Transactions, WhatRestsTooLongIsRolledBack) {
    MUST(Start(0, 1, OCI_TRANS_NEW), Run(0, "insert into t values(1)"));
    ASSERT_EQ(Answer(OCITransDetach(svc_[0], err_, OCI_DEFAULT)), 0);
    auto* branch = Attribute<OCITrans*>(svc_[1], OCI_HTYPE_SVCCTX, OCI_ATTR_TRANS);
    XID coupled{5, 2, 1, "txc"};
    ASSERT_EQ(Answer(OCIAttrSet(branch, OCI_HTYPE_TRANS, &coupled, sizeof coupled, OCI_ATTR_XID, err_)), 0);
    MUST(Start(1, 60, OCI_TRANS_NEW), Answer(OCITransDetach(svc_[1], err_, OCI_DEFAULT)));
    EXPECT_EQ(Run(1, "insert into t values(2)"), 0) << "waits for the lock";
    EXPECT_EQ(Answer(OCITransRollback(svc_[1], err_, OCI_DEFAULT)), 0);
    EXPECT_EQ(OCITransMultiPrepare(svc_[1], 1, &branch, &err_), OCI_ERROR);
    EXPECT_EQ(FirstCode(err_), 24761) << "with the one whose transaction it shares";
    EXPECT_EQ(Answer(OCITransRollback(svc_[0], err_, 1)), 24300);
    EXPECT_EQ(Start(0, 0, OCI_TRANS_RESUME), 24761);
    EXPECT_EQ(Start(0, 0, OCI_TRANS_RESUME), 24756);
}

// A statement that rolls all back by itself ends the branch's work, and the branch with its next call.
TEST_F(Transactions, WhatTheEngineUndoesIsLost) {
    ASSERT_EQ(Run(0, "create table u(n integer primary key)"), 0);
    for (const auto end : {OCITransPrepare, OCITransCommit}) {
        MUST(Start(0, 0, OCI_TRANS_NEW), Run(0, "insert into u values(1)"));
        EXPECT_EQ(Run(0, "insert or rollback into u values(1)"), 1);
        EXPECT_EQ(Run(0, "insert into u values(2)"), 24761);
        EXPECT_EQ(Answer(end(svc_[0], err_, OCI_DEFAULT)), 24761);
        EXPECT_EQ(Start(0, 0, OCI_TRANS_RESUME), 24756);
        SHOULD(Run(0, "insert into t select 1 / (case count(*) when 0 then 1 else 0 end) from u"),
               Answer(OCITransRollback(svc_[0], err_, OCI_DEFAULT)));
    }
    // So does a session that goes, for all that are coupled with its branch.
    MUST(Start(0, 60, OCI_TRANS_NEW), Run(0, "insert into u values(1)"), Answer(OCITransDetach(svc_[0], err_, OCI_DEFAULT)));
    auto* branch = Attribute<OCITrans*>(svc_[1], OCI_HTYPE_SVCCTX, OCI_ATTR_TRANS);
    XID coupled{5, 2, 1, "txc"};
    ASSERT_EQ(Answer(OCIAttrSet(branch, OCI_HTYPE_TRANS, &coupled, sizeof coupled, OCI_ATTR_XID, err_)), 0);
    ASSERT_EQ(Start(1, 60, OCI_TRANS_NEW), 0);
    EXPECT_EQ(OCIHandleFree(svc_[1], OCI_HTYPE_SVCCTX), OCI_SUCCESS);
    SHOULD(Answer(OCITransCommit(svc_[0], err_, OCI_DEFAULT)) - 24761, Start(0, 0, OCI_TRANS_RESUME) - 24756);
    EXPECT_EQ(Run(0, "insert into u values(1)"), 0);
}

}  // namespace
