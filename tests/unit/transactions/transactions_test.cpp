// Branches of OCITransStart between threads and sessions; what a transcript cannot show.
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
    std::thread other([&] {
        auto* const err = NewHandle<OCIError>(env_, OCI_HTYPE_ERROR);
        EXPECT_EQ(Answer(OCITransStart(svc_[1], err, 0, OCI_TRANS_RESUME), err), 25351);
        EXPECT_EQ(Answer(OCITransStart(svc_[1], err, 30, OCI_TRANS_RESUME), err), 0);
        EXPECT_EQ(Answer(OCITransCommit(svc_[1], err, OCI_DEFAULT), err), 0);
    });
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
    EXPECT_EQ(Start(0, 0, OCI_TRANS_RESUME), 24761);
    EXPECT_EQ(Start(0, 0, OCI_TRANS_RESUME), 24756);
}

TEST_F(Transactions, OfAnotherUser) {
    MUST(Start(0, 0, OCI_TRANS_NEW | OCI_TRANS_LOOSE), Answer(OCITransDetach(svc_[0], err_, OCI_DEFAULT)));
    auto* branch = Attribute<OCITrans*>(svc_[1], OCI_HTYPE_SVCCTX, OCI_ATTR_TRANS);
    ASSERT_EQ(Answer(OCILogoff(svc_[1], err_)), 0);
    ASSERT_EQ(LogOn(&svc_[1], "bank", "ann", "secret"), 0) << "the owner from now on";
    ASSERT_EQ(Answer(OCIAttrSet(svc_[1], OCI_HTYPE_SVCCTX, branch, 0, OCI_ATTR_TRANS, err_)), 0);
    EXPECT_EQ(Start(1, 0, OCI_TRANS_RESUME), 24774);
    XID xid{5, 2, 1, "txb"};
    char info[] = "SqlNet=bank+Acc=P/ann/secret";
    ASSERT_EQ(rmXaSwitch.xa_open_entry(info, 1, TMNOFLAGS), XA_OK);
    EXPECT_EQ(rmXaSwitch.xa_start_entry(&xid, 1, TMJOIN), XAER_RMERR);
    SQLCA diagnostics{};
    EXPECT_EQ(XaGetInfo(1, &diagnostics), XA_OK);
    EXPECT_EQ(diagnostics.sqlcode, -24774);
    EXPECT_EQ(rmXaSwitch.xa_close_entry(nullptr, 1, TMNOFLAGS), XA_OK);
    EXPECT_EQ(Start(0, 0, OCI_TRANS_RESUME), 0);
}

// A session that goes without a word takes its branch with it; a result does not outlive the connection.
TEST_F(Transactions, SessionsThatGo) {
    MUST(Start(0, 0, OCI_TRANS_NEW), Run(0, "insert into t values(1)"));
    EXPECT_EQ(Answer(OCILogoff(svc_[0], err_)), 2089);
    EXPECT_EQ(OCIHandleFree(svc_[0], OCI_HTYPE_SVCCTX), OCI_SUCCESS);
    EXPECT_EQ(Start(1, 0, OCI_TRANS_RESUME), 24756);
    EXPECT_EQ(Start(1, 0, OCI_TRANS_NEW), 0);
    EXPECT_EQ(Run(1, "insert into t values(1)"), 0) << "the lock is free";
    EXPECT_EQ(Run(1, "create table u(n number)"), 2089);
    ub4 number = 0;
    OCIDefine* define = nullptr;
    const char* const query = "select n from t";
    EXPECT_EQ(OCIStmtPrepare(stmt_, err_, Text(query), Length(query), OCI_NTV_SYNTAX, OCI_DEFAULT), 0);
    EXPECT_EQ(Answer(OCIDefineByPos(stmt_, &define, err_, 1, &number, 4, SQLT_UIN, nullptr, nullptr, nullptr, 0)), 0);
    EXPECT_EQ(Answer(OCIStmtExecute(svc_[1], stmt_, err_, 0, 0, nullptr, nullptr, OCI_DEFAULT)), 0);
    EXPECT_EQ(Answer(OCITransDetach(svc_[1], err_, OCI_DEFAULT)), 0);
    EXPECT_EQ(Answer(OCIStmtFetch2(stmt_, err_, 1, OCI_FETCH_NEXT, 0, OCI_DEFAULT)), 1002);
    EXPECT_EQ(Answer(OCITransRollback(svc_[1], err_, OCI_DEFAULT)), 0);
}

TEST_F(Transactions, BranchesInMemoryStayWhereTheyAre) {
    MUST(Answer(OCILogoff(svc_[0], err_)), LogOn(&svc_[0], ":memory:"), Run(0, "create table t(n number)"));
    MUST(Start(0, 0, OCI_TRANS_NEW), Run(0, "insert into t values(1)"));
    EXPECT_EQ(Answer(OCITransDetach(svc_[0], err_, OCI_DEFAULT)), 24782);
    EXPECT_EQ(Answer(OCITransPrepare(svc_[0], err_, OCI_DEFAULT)), 24782);
    EXPECT_EQ(Answer(OCITransCommit(svc_[0], err_, OCI_TRANS_TWOPHASE)), 24768);
    EXPECT_EQ(Answer(OCITransCommit(svc_[0], err_, OCI_DEFAULT)), 0);
}

// Each branch has its own answer; those of one global transaction alone are prepared together.
TEST_F(Transactions, SeveralAreReadiedInOneCall) {
    OCITrans* branches[2] = {};
    OCIError* errors[2] = {err_, New<OCIError>(OCI_HTYPE_ERROR)};
    for (int index : {0, 1}) branches[index] = Attribute<OCITrans*>(svc_[index], OCI_HTYPE_SVCCTX, OCI_ATTR_TRANS);
    const auto name = [&](const char* data) {
        XID xid{5, 2, 1, {}};
        std::memcpy(xid.data, data, 3);
        EXPECT_EQ(Answer(OCIAttrSet(branches[1], OCI_HTYPE_TRANS, &xid, sizeof xid, OCI_ATTR_XID, err_)), 0);
    };
    const auto prepare = [&] { return OCITransMultiPrepare(svc_[1], 2, branches, errors); };
    name("txc");
    MUST(Start(0, 60, OCI_TRANS_NEW | OCI_TRANS_LOOSE), Run(0, "insert into t values(1)"));
    ASSERT_EQ(Start(1, 60, OCI_TRANS_NEW | OCI_TRANS_LOOSE), 0);
    EXPECT_EQ(prepare(), OCI_ERROR);
    EXPECT_EQ(FirstCode(errors[0]), 25351) << "another session works in it";
    EXPECT_EQ(FirstCode(errors[1]), 24767) << "the other one is ready all the same: it has changed nothing";
    ASSERT_EQ(Start(1, 60, OCI_TRANS_NEW | OCI_TRANS_LOOSE), 0);
    std::swap(branches[0], branches[1]);
    EXPECT_EQ(prepare(), OCI_ERROR) << "whichever of them fails";
    std::swap(branches[0], branches[1]);
    MUST(Start(1, 60, OCI_TRANS_NEW | OCI_TRANS_LOOSE), Answer(OCITransDetach(svc_[0], err_, OCI_DEFAULT)));
    EXPECT_EQ(prepare(), OCI_SUCCESS_WITH_INFO) << "ready, and changed nothing";
    MUST(Answer(OCITransRollback(svc_[0], err_, OCI_DEFAULT)), Start(0, 60, OCI_TRANS_NEW | OCI_TRANS_LOOSE));
    MUST(Run(0, "insert into t values(1)"), Answer(OCITransDetach(svc_[0], err_, OCI_DEFAULT)));
    name("tyc");
    EXPECT_EQ(prepare(), OCI_ERROR);
    EXPECT_EQ(FirstCode(errors[0]), 0);
    EXPECT_EQ(FirstCode(errors[1]), 24781);
    EXPECT_EQ(OCITransMultiPrepare(svc_[1], 1, branches, errors), OCI_ERROR);
    EXPECT_EQ(FirstCode(errors[0]), 24768) << "it is ready";
    branches[1] = New<OCITrans>(OCI_HTYPE_TRANS);
    EXPECT_EQ(prepare(), OCI_ERROR);
    EXPECT_EQ(FirstCode(errors[1]), 24771) << "without a name";
    std::swap(branches[0], branches[1]);
    EXPECT_EQ(prepare(), OCI_ERROR);
    EXPECT_EQ(FirstCode(errors[1]), 24781) << "the first has none";
    OCITrans* one_missing[2] = {branches[0], nullptr};
    EXPECT_EQ(OCITransMultiPrepare(svc_[1], 2, one_missing, errors), OCI_INVALID_HANDLE);
    EXPECT_EQ(OCITransMultiPrepare(svc_[1], 0, branches, errors), OCI_INVALID_HANDLE);
    EXPECT_EQ(OCITransMultiPrepare(svc_[1], 2, branches, nullptr), OCI_INVALID_HANDLE);
    EXPECT_EQ(Answer(OCITransCommit(svc_[0], err_, OCI_TRANS_TWOPHASE)), 0);
    EXPECT_EQ(Run(1, "insert into t select 1 / count(*) from t"), 0);
}

// A deferred foreign key that is broken ends the branch, in the first phase as in the only one.
TEST_F(Transactions, WhatWasDeferredIsChecked) {
    MUST(Run(0, "create table p(id integer primary key)"),
         Run(0, "create table c(id integer references p deferrable initially deferred)"));
    for (const auto end : {OCITransPrepare, OCITransCommit}) {
        MUST(Start(0, 0, OCI_TRANS_NEW), Run(0, "insert into c values(7)"));
        EXPECT_EQ(Answer(end(svc_[0], err_, OCI_DEFAULT)), 2091);
        EXPECT_EQ(Answer(OCITransCommit(svc_[1], err_, OCI_TRANS_TWOPHASE)), 24756);
        EXPECT_EQ(Answer(OCITransDetach(svc_[0], err_, OCI_DEFAULT)), 25352);
        SHOULD(Run(0, "insert into p select 1 / (case count(*) when 0 then 1 else 0 end) from c"),
               Answer(OCITransRollback(svc_[0], err_, OCI_DEFAULT)));
    }
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
    for (const sb4 answer : {24761, 24756}) EXPECT_EQ(Start(0, 0, OCI_TRANS_RESUME), answer);
    EXPECT_EQ(Run(0, "insert into u values(1)"), 0);
}

}  // namespace
