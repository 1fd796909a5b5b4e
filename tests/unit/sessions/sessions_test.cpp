// Sessions as an application begins and ends them, on a file and in memory: what is committed, what is still there,
// who is let in, what breaks stop.
#include <filesystem>

#include "support/statement_fixture.h"

namespace {

class Sessions : public testing::Test {
protected:
    void SetUp() override {
        char name[] = "/tmp/kelp-sessions-XXXXXX";
        folder_ = mkdtemp(name);
        ASSERT_EQ(OCIEnvCreate(&env_, OCI_DEFAULT, nullptr, nullptr, nullptr, nullptr, 0, nullptr), OCI_SUCCESS);
        err_ = New<OCIError>(OCI_HTYPE_ERROR);
    }
    void TearDown() override {
        EXPECT_EQ(OCIHandleFree(env_, OCI_HTYPE_ENV), OCI_SUCCESS);
        EXPECT_EQ(OCI_memGetMemCount(), 0) << "blocks left behind";
        std::filesystem::remove_all(folder_);
    }

    template <class T>
    T* New(ub4 type) const {
        dvoid* handle = nullptr;
        EXPECT_EQ(OCIHandleAlloc(env_, &handle, type, 0, nullptr), OCI_SUCCESS) << type;
        return static_cast<T*>(handle);
    }
    static const OraText* Bytes(std::string_view text) { return reinterpret_cast<const OraText*>(text.data()); }
    static ub4 Size(std::string_view text) { return static_cast<ub4>(text.size()); }
    sb4 Answer(sword rc) const {
        sb4 number = 0;
        if (rc == OCI_SUCCESS) return 0;
        return OCIErrorGet(err_, 1, nullptr, &number, nullptr, 0, OCI_HTYPE_ERROR) == OCI_SUCCESS ? number : rc;
    }
    sb4 LogOn(std::string_view user, std::string_view password, std::string_view database) {
        return Answer(OCILogon(env_, err_, &svc_, Bytes(user), Size(user), Bytes(password), Size(password),
                               Bytes(database), Size(database)));
    }
    sb4 Run(std::string_view sql) const {
        OCIStmt* stmt = New<OCIStmt>(OCI_HTYPE_STMT);
        sb4 answer = Answer(OCIStmtPrepare(stmt, err_, Bytes(sql), Size(sql), OCI_NTV_SYNTAX, OCI_DEFAULT));
        if (answer == 0) answer = Answer(OCIStmtExecute(svc_, stmt, err_, 1, 0, nullptr, nullptr, OCI_DEFAULT));
        OCIHandleFree(stmt, OCI_HTYPE_STMT);
        return answer;
    }
    // The number that a query answers in its first row; the negative of an error's.
    sb4 Number(std::string_view sql) const {
        OCIStmt* stmt = New<OCIStmt>(OCI_HTYPE_STMT);
        OCIDefine* define = nullptr;
        sb4 value = -1;
        sb4 answer = Answer(OCIStmtPrepare(stmt, err_, Bytes(sql), Size(sql), OCI_NTV_SYNTAX, OCI_DEFAULT));
        OCIDefineByPos(stmt, &define, err_, 1, &value, sizeof value, SQLT_INT, nullptr, nullptr, nullptr, OCI_DEFAULT);
        if (answer == 0) answer = Answer(OCIStmtExecute(svc_, stmt, err_, 1, 0, nullptr, nullptr, OCI_DEFAULT));
        OCIHandleFree(stmt, OCI_HTYPE_STMT);
        return answer == 0 ? value : -answer;
    }
    sb4 ChangePassword(std::string_view user, std::string_view before, std::string_view after) const {
        return Answer(OCIPasswordChange(svc_, err_, Bytes(user), Size(user), Bytes(before), Size(before), Bytes(after),
                                        static_cast<sb4>(after.size()), OCI_DEFAULT));
    }
    // A context put together by hand: server, session, both in it.
    void Attach(std::string_view database) {
        svc_ = New<OCISvcCtx>(OCI_HTYPE_SVCCTX);
        server_ = New<OCIServer>(OCI_HTYPE_SERVER);
        session_ = New<OCISession>(OCI_HTYPE_SESSION);
        ASSERT_EQ(Answer(OCIServerAttach(server_, err_, Bytes(database), static_cast<sb4>(database.size()), OCI_DEFAULT)), 0);
        ASSERT_EQ(Answer(OCIAttrSet(svc_, OCI_HTYPE_SVCCTX, server_, 0, OCI_ATTR_SERVER, err_)), 0);
    }
    sb4 Begin(std::string user, std::string password) {
        const auto set = [&](std::string& text, ub4 attribute) {
            OCIAttrSet(session_, OCI_HTYPE_SESSION, text.data(), Size(text), attribute, err_);
        };
        set(user, OCI_ATTR_USERNAME);
        set(password, OCI_ATTR_PASSWORD);
        const sb4 answer = Answer(OCISessionBegin(svc_, err_, session_, OCI_CRED_RDBMS, OCI_DEFAULT));
        if (answer == 0) {
            EXPECT_EQ(Answer(OCIAttrSet(svc_, OCI_HTYPE_SVCCTX, session_, 0, OCI_ATTR_SESSION, err_)), 0);
        }
        return answer;
    }

    std::string folder_;
    OCIEnv* env_ = nullptr;
    OCIError* err_ = nullptr;
    OCISvcCtx* svc_ = nullptr;
    OCIServer* server_ = nullptr;
    OCISession* session_ = nullptr;
};

TEST_F(Sessions, EndOfASessionCommitsAndLossOfItDoesNot) {
    const std::string file = folder_ + "/x.db";
    ASSERT_EQ(LogOn("", "", file), 0);
    ASSERT_EQ(Run("create table t(n integer)"), 0);
    ASSERT_EQ(Run("insert into t values(1)"), 0);
    ASSERT_EQ(Answer(OCILogoff(svc_, err_)), 0);
    ASSERT_EQ(LogOn("", "", file), 0);
    EXPECT_EQ(Number("select count(*) from t"), 1);
    ASSERT_EQ(Run("insert into t values(2)"), 0);
    OCIHandleFree(svc_, OCI_HTYPE_SVCCTX);
    svc_ = nullptr;
    ASSERT_EQ(LogOn("", "", file), 0);
    EXPECT_EQ(Number("select count(*) from t"), 1) << "a context that is freed rolls back";
    ASSERT_EQ(Answer(OCILogoff(svc_, err_)), 0);
}

// What fails outside of a transaction leaves none behind: nobody has to wait for it.
TEST_F(Sessions, FailureOutsideATransactionHoldsNoLock) {
    const std::string file = folder_ + "/x.db";
    ASSERT_EQ(LogOn("", "", file), 0);
    ASSERT_EQ(Run("create table t(a number unique)"), 0);
    OCISvcCtx* const first = std::exchange(svc_, nullptr);
    ASSERT_EQ(LogOn("", "", file), 0);
    OCISvcCtx* const second = svc_;
    const struct { const char* sql; sb4 answer; } cases[] = {
        {"rollback to nowhere", 1086}, {"release nowhere", 1086}, {"insert into t values('x')", 1722},
        {"begin insert into t values(1); insert into t values(1); end;", 1}, {"begin rollback to nowhere; end;", 1086},
    };
    for (const auto& c : cases) {
        svc_ = first;
        EXPECT_EQ(Run(c.sql), c.answer) << c.sql;
        svc_ = second;
        EXPECT_EQ(Run("insert into t values(9)"), 0) << c.sql;
        EXPECT_EQ(Run("rollback"), 0);
    }
    for (OCISvcCtx* svc : {first, second}) EXPECT_EQ(Answer(OCILogoff(svc, err_)), 0);
}

TEST_F(Sessions, ServerInMemoryKeepsItsTablesFromSessionToSession) {
    Attach(":memory:");
    ASSERT_EQ(Begin("ann", "secret"), 0);
    ASSERT_EQ(Run("create table t(n integer)"), 0);
    ASSERT_EQ(Run("insert into t values(1)"), 0);
    ASSERT_EQ(Answer(OCISessionEnd(svc_, err_, session_, OCI_DEFAULT)), 0);
    EXPECT_EQ(Begin("ann", "wrong"), 1017);
    EXPECT_EQ(Begin("ann", std::string("secret\0x", 8)), 1017);
    ASSERT_EQ(Begin("ann", "secret"), 0);
    EXPECT_EQ(Number("select count(*) from t"), 1);
    ASSERT_EQ(Answer(OCIServerDetach(server_, err_, OCI_DEFAULT)), 0);
}

TEST_F(Sessions, PasswordIsChangedForGoodOrNotAtAll) {
    const std::string file = folder_ + "/x.db";
    ASSERT_EQ(LogOn("ann", "secret", file), 0);
    ASSERT_EQ(Run("create table t(n integer)"), 0);
    ASSERT_EQ(Run("insert into t values(1)"), 0);
    EXPECT_EQ(ChangePassword("ann", "secret", "new"), 24754);
    EXPECT_EQ(Run("update kelp_accounts set password = ''"), 1031);
    ASSERT_EQ(Run("rollback"), 0);
    EXPECT_EQ(ChangePassword("ann", "secret", "new"), 0);
    ASSERT_EQ(Run("rollback"), 0);
    ASSERT_EQ(Answer(OCILogoff(svc_, err_)), 0);
    EXPECT_EQ(LogOn("ann", "secret", file), 1017);
    ASSERT_EQ(LogOn("ann", "new", file), 0);
    ASSERT_EQ(Answer(OCILogoff(svc_, err_)), 0);
}

TEST_F(Sessions, BreakMeetsOneCall) {
    ASSERT_EQ(LogOn("", "", ":memory:"), 0);
    ASSERT_EQ(Run("create table t(n integer)"), 0);
    EXPECT_EQ(Answer(OCIBreak(svc_, err_)), 0);
    EXPECT_EQ(Number("select 1 from dual"), -1013);
    EXPECT_EQ(Number("select 1 from dual"), 1);
    EXPECT_EQ(Answer(OCIBreak(svc_, err_)), 0);
    EXPECT_EQ(Answer(OCIReset(svc_, err_)), 0);
    EXPECT_EQ(Run("insert into t values(1)"), 0);
    EXPECT_EQ(Answer(OCIBreak(svc_, err_)), 0);
    EXPECT_EQ(Run("commit"), 0) << "what ends a transaction is not stopped";
    EXPECT_EQ(Run("insert into t values(2)"), 1013);
    EXPECT_EQ(Number("select count(*) from t"), 1);
    ASSERT_EQ(Answer(OCILogoff(svc_, err_)), 0);
}

TEST_F(Sessions, VersionBeginsWithARelease) {
    Attach(":memory:");
    OraText text[200] = {};
    ASSERT_EQ(Answer(OCIServerVersion(server_, err_, text, sizeof text, OCI_HTYPE_SERVER)), 0);
    EXPECT_TRUE(std::string_view(reinterpret_cast<char*>(text)).starts_with("23.1 KELP embedded engine, SQLite 3."));
    ASSERT_EQ(Answer(OCIServerDetach(server_, err_, OCI_DEFAULT)), 0);
}

}  // namespace
