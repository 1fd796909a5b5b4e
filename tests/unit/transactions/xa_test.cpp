// The XA switch: arguments, threads of control, time, servers that lose a branch; what transcripts cannot show.
#include <future>
#include <thread>

#include "oci_legacy.h"
#include "support/call_fixture.h"

namespace {

// Two databases, opened as managers 1 and 2, the first of them the server's where the tests run there; statements of an
// environment of the test's own.
class XaCalls : public CallFixture {
protected:
    void SetUp() override {
        Folder();
        MakeDatabase("one");
        CallFixture::SetUp();
        stmt_ = New<OCIStmt>(OCI_HTYPE_STMT);
        ASSERT_EQ(Open(1, "DB=one"), XA_OK);
        ASSERT_EQ(Open(2, "DB=two"), XA_OK);
        ASSERT_EQ(Run("one", "create table t(n number)"), 0);
    }
    void TearDown() override {
        for (const int rmid : {1, 2}) EXPECT_EQ(rmXaSwitch.xa_close_entry(nullptr, rmid, TMNOFLAGS), XA_OK) << rmid;
        CallFixture::TearDown();
    }

    static int Open(int rmid, std::string info) { return rmXaSwitch.xa_open_entry(info.data(), rmid, TMNOFLAGS); }
    static XID Named(std::string_view global, std::string_view branch) {
        XID xid{9, static_cast<sb4>(global.size()), static_cast<sb4>(branch.size()), {}};
        (std::string(global) += branch).copy(xid.data, XIDDATASIZE);
        return xid;
    }
    static int Call(int (*xa_switch_t::*entry)(XID*, int, xa_long), XID xid, xa_long flags, int rmid = 1) {
        return (rmXaSwitch.*entry)(&xid, rmid, flags);
    }
    sb4 Run(const char* name, const char* sql) {
        EXPECT_EQ(OCIStmtPrepare(stmt_, err_, Text(sql), Length(sql), OCI_NTV_SYNTAX, OCI_DEFAULT), 0);
        return Answer(OCIStmtExecute(xaoSvcCtx(name ? Text(name) : nullptr), stmt_, err_, 1, 0, nullptr, nullptr, OCI_DEFAULT));
    }
    sb4 Change() { return Run("one", "insert into t values(1)"); }
    static sb4 Code(int rmid = 1) {
        SQLCA diagnostics{};
        EXPECT_EQ(XaGetInfo(rmid, &diagnostics), XA_OK);
        EXPECT_EQ(std::string(diagnostics.sqlcaid, 8) + std::string(diagnostics.sqlwarn, 11) +
                  std::to_string(diagnostics.sqlcabc), "SQLCA" + std::string(14, ' ') + "136");
        return diagnostics.sqlcode;
    }

    OCIStmt* stmt_ = nullptr;
};

constexpr auto kStart = &xa_switch_t::xa_start_entry;
constexpr auto kEnd = &xa_switch_t::xa_end_entry;
constexpr auto kPrepare = &xa_switch_t::xa_prepare_entry;
constexpr auto kCommit = &xa_switch_t::xa_commit_entry;
constexpr auto kRollback = &xa_switch_t::xa_rollback_entry;
constexpr auto kForget = &xa_switch_t::xa_forget_entry;

// A broken constraint that was deferred ends the branch in one phase and in two.
TEST_F(XaCalls, WhatWasDeferredIsChecked) {
    MUST(Run("one", "create table p(id integer primary key)"),
         Run("one", "create table c(id integer references p deferrable initially deferred)"));
    const XID xid = Named("deferred", "x");
    for (const bool one_phase : {false, true}) {
        MUST(Call(kStart, xid, TMNOFLAGS), Run("one", "insert into c values(7)"), Call(kEnd, xid, TMSUCCESS));
        const int code = one_phase ? Call(kCommit, xid, TMONEPHASE) : Call(kPrepare, xid, TMNOFLAGS);
        EXPECT_EQ(code, OnServer() && !one_phase ? XA_RBINTEGRITY : XA_RBROLLBACK);
        EXPECT_EQ(Call(kRollback, xid, TMNOFLAGS, 2), XAER_NOTA);    // another manager's failure is told beside it
        EXPECT_EQ(Code(), OnServer() && !one_phase ? -2291 : -2091);
        EXPECT_EQ(Call(kRollback, xid, TMNOFLAGS), XAER_NOTA);
    }
    SHOULD(Run("one", "insert into p select 1 / (case count(*) when 0 then 1 else 0 end) from c"),
           OCITransRollback(xaoSvcCtx(Text("one")), err_, OCI_DEFAULT));
}

TEST_F(XaCalls, NullArguments) {
    for (const auto entry : {kStart, kEnd, kPrepare, kCommit, kRollback, kForget})
        EXPECT_EQ((rmXaSwitch.*entry)(nullptr, 1, entry == kEnd ? TMSUCCESS : TMNOFLAGS), XAER_INVAL);
    for (const long count : {1, -1, 0})
        EXPECT_EQ(rmXaSwitch.xa_recover_entry(nullptr, count, 1, TMSTARTRSCAN), count == 0 ? 0 : XAER_INVAL);
    EXPECT_EQ(rmXaSwitch.xa_recover_entry(nullptr, 1, 1, TMASYNC), XAER_ASYNC);
    int handle = 0, result = 0;
    EXPECT_EQ(rmXaSwitch.xa_complete_entry(nullptr, &result, 1, TMNOFLAGS), XAER_INVAL);
    EXPECT_EQ(rmXaSwitch.xa_complete_entry(&handle, nullptr, 1, TMNOFLAGS), XAER_INVAL);
    EXPECT_EQ(rmXaSwitch.xa_complete_entry(&handle, &result, 1, TMNOFLAGS), XAER_PROTO);
    EXPECT_EQ(rmXaSwitch.xa_open_entry(nullptr, 3, TMNOFLAGS), XAER_INVAL);
    EXPECT_EQ(XaGetInfo(1, nullptr), XAER_INVAL);
    SQLCA unused;
    EXPECT_EQ(XaGetInfo(77, &unused), XAER_INVAL);
}

TEST_F(XaCalls, NamesAreInTheModeOfTheProcess) {
    EXPECT_EQ(OCIInitialize(OCI_UTF16, nullptr, nullptr, nullptr, nullptr), OCI_SUCCESS);
    EXPECT_EQ(Open(3, "DB=\xC4\x80z+SqlNet=three"), XA_OK);
    EXPECT_NE(xaoEnv(Text(u"\x100z")), nullptr);
    for (const char16_t* other : {u"\x100", u"\xD800"}) EXPECT_EQ(xaoEnv(Text(other)), nullptr);
    EXPECT_EQ(OCITerminate(OCI_DEFAULT), OCI_SUCCESS);
    EXPECT_EQ(rmXaSwitch.xa_close_entry(nullptr, 3, TMNOFLAGS), XA_OK);
}

// Who waits for a busy branch gets it, or is told to try again.
TEST_F(XaCalls, ThreadsOfControl) {
    const XID xid = Named("threads", "x");
    MUST(Call(kStart, xid, TMNOFLAGS), Change());
    std::promise<void> waits;
    std::thread other([&] {
        EXPECT_EQ(Open(5, "SqlNet=one+Threads=true"), XA_OK);
        EXPECT_EQ(Call(kStart, xid, TMJOIN | TMNOWAIT, 5), XA_RETRY);
        EXPECT_EQ(Call(kStart, xid, TMRESUME, 9), XAER_PROTO);
        waits.set_value();
        SHOULD(Call(kStart, xid, TMJOIN, 5), Call(kEnd, xid, TMSUSPEND | TMMIGRATE, 5), Open(6, "SqlNet=one"));
        EXPECT_NE(xaoSvcCtx(nullptr), nullptr) << "the thread's own goes before the process's";
        for (const int rmid : {6, 5}) EXPECT_EQ(rmXaSwitch.xa_close_entry(nullptr, rmid, TMNOFLAGS), XA_OK);
    });
    waits.get_future().wait();
    EXPECT_EQ(Call(kEnd, xid, TMSUCCESS), XA_OK);
    other.join();
    EXPECT_EQ(Call(kPrepare, xid, TMNOFLAGS, 5), XAER_PROTO) << "the other thread's";
    SHOULD(Call(kStart, xid, TMRESUME), Call(kEnd, xid, TMSUCCESS), Call(kPrepare, xid, TMNOFLAGS),
           Call(kCommit, xid, TMNOFLAGS),
           Run("one", "insert into t select 1 / (case count(*) when 1 then 1 else 0 end) from t"),
           OCITransCommit(xaoSvcCtx(Text("one")), err_, OCI_DEFAULT));
}

// The other manager's change waits for the lock of the branch that rests, and gets it when its time is over. What has
// prepared, and who works again, has all the time there is.
TEST_F(XaCalls, WhatRestsTooLongIsRolledBack) {
    for (const int rmid : {4, 5}) {
        const std::string name = std::to_string(rmid);
        MUST(Open(rmid, "SesTm=1+DB=" + name), Run(name.c_str(), "create table t(n number)"),
             Call(kStart, Named(name, "x"), TMNOFLAGS, rmid), Run(name.c_str(), "insert into t values(1)"),
             Call(kEnd, Named(name, "x"), TMSUCCESS, rmid));
    }
    MUST(Call(kPrepare, Named("4", "x"), TMNOFLAGS, 4), Call(kStart, Named("5", "x"), TMJOIN, 5),
         Open(3, "SqlNet=one+SesTm=1"));
    const XID xid = Named("time", "x");
    MUST(Call(kStart, xid, TMNOFLAGS, 3), Run(nullptr, "insert into t values(1)"));
    auto* named = New<OCITrans>(OCI_HTYPE_TRANS);
    XID name = xid;
    EXPECT_EQ(Answer(OCIAttrSet(named, OCI_HTYPE_TRANS, &name, sizeof name, OCI_ATTR_XID, err_)), 0);
    EXPECT_EQ(Answer(OCITransMultiPrepare(xaoSvcCtx(nullptr), 1, &named, &err_)), 2089) << "the manager's to prepare";
    ASSERT_EQ(Call(kEnd, xid, TMSUCCESS, 3), XA_OK);
    SHOULD(Change(), OCITransRollback(xaoSvcCtx(Text("one")), err_, OCI_DEFAULT));
    EXPECT_EQ(Call(kStart, xid, TMJOIN, 3), XA_RBTIMEOUT);
    EXPECT_EQ(Call(kPrepare, xid, TMNOFLAGS), XA_RBTIMEOUT);
    EXPECT_EQ(Code(), -2049);
    SHOULD(Call(kCommit, Named("4", "x"), TMNOFLAGS, 4), Call(kEnd, Named("5", "x"), TMSUCCESS, 5),
           Call(kCommit, Named("5", "x"), TMONEPHASE, 5));
    for (const int rmid : {3, 4, 5}) EXPECT_EQ(rmXaSwitch.xa_close_entry(nullptr, rmid, TMNOFLAGS), XA_OK);
}

// An area on a manager's session, by the manager's name: what is under way when the manager is closed is given up, and
// the session goes on where only the area ends.
TEST_F(XaCalls, VersionSevenOnTheSessionsOfManagers) {
    Lda_Def login{};
    Cda_Def cursor{};
    sb4 name_length = -1;
    const auto adopt = [&](const char* name) {
        sqlld2(&login, Text(name), &name_length);
        return login.rc;
    };
    const auto parse = [&](const char* sql) {
        EXPECT_EQ(oopen(&cursor, &login, nullptr, -1, -1, nullptr, -1), 0);
        return oparse(&cursor, Text(sql), -1, 1, 2);
    };
    SHOULD(adopt("one"), parse("insert into t values(1)"), oexec(&cursor), orol(&login), adopt("two"));
    EXPECT_EQ(oexec(&cursor), 1001) << "gone with its login";
    EXPECT_EQ(ologof(&login), 0);
    SHOULD(Change(), OCITransRollback(xaoSvcCtx(Text("one")), err_, OCI_DEFAULT));

    ASSERT_EQ(Open(3, "SqlNet=three"), XA_OK);
    sqllda(&login);
    SHOULD(parse("create table t(v varchar2(9))"), oexec(&cursor), parse("insert into t values(:v)"));
    EXPECT_EQ(obindps(&cursor, 0, Text(":v"), -1, nullptr, 10, SQLT_CHR, -1, nullptr, nullptr, nullptr, 0, 0, 0, 0, 0,
                      nullptr, nullptr, -1, -1), 0);
    EXPECT_EQ(oexn(&cursor, 2, 0), 3129);
    EXPECT_EQ(rmXaSwitch.xa_close_entry(nullptr, 3, TMNOFLAGS), XA_OK);
    EXPECT_EQ(ocan(&cursor), 0);
    EXPECT_EQ(oexec(&cursor), 1012);
    EXPECT_EQ(obreak(&login), 3114);
    EXPECT_EQ(ocom(&login), 1012);
    MUST(ologof(&login), olog(&login, nullptr, nullptr, 0, nullptr, 0, Text("three"), 5, 0));
    EXPECT_EQ(adopt("one"), 1015) << "no manager's: it stays what it is";
    EXPECT_EQ(ologof(&login), 0);
}

// A connection that was lost with its branch serves no other branch.
TEST_F(XaCalls, ABranchThatTheServerHasLost) {
    const XID xid = Named("lost", "x");
    for (const bool lost : {OnServer(), false}) {
        ASSERT_EQ(Call(kStart, xid, TMNOFLAGS), XA_OK);
        ASSERT_EQ(Change(), 0) << lost;
        ASSERT_EQ(Call(kEnd, xid, TMSUCCESS), XA_OK);
        if (lost) {
            EXPECT_EQ(server_->RunHere("select count(pg_terminate_backend(pid, 9000)) from pg_stat_activity"
                                       " where datname = current_database() and state = 'idle in transaction'"), "1");
        }
        EXPECT_EQ(Call(kRollback, xid, TMNOFLAGS), lost ? XAER_RMFAIL : XA_OK);
        EXPECT_EQ(Call(kRollback, xid, TMNOFLAGS), XAER_NOTA);
    }
}

}  // namespace
