// Statements of one session in several threads, each with handles of its own.
#include <atomic>
#include <thread>

#include "support/statement_fixture.h"

namespace {

class Threads : public StatementTest {
protected:
    Threads() : StatementTest(OCI_THREADED) {}
};

TEST_F(Threads, StatementsOfOneSession) {
    MustRun("create table t(a number, b varchar2(10))");
    constexpr int kThreads = 4, kRows = 50;
    std::atomic<int> failures = 0;
    const auto work = [&](int thread) {
        OCIError* error = New<OCIError>(OCI_HTYPE_ERROR);
        for (int row = 0; row < kRows; ++row) {
            OCIStmt* statement = nullptr;
            OCIBind* bind = nullptr;
            OCIDefine* define = nullptr;
            sb4 value = thread * kRows + row, out = 0;
            const auto* insert = reinterpret_cast<const OraText*>("insert into t values(:1, 'x')");
            const auto* query = reinterpret_cast<const OraText*>("select a from t where a = :1");
            failures += OCIStmtPrepare2(svc, &statement, error, insert, 29, nullptr, 0, OCI_NTV_SYNTAX,
                                        OCI_DEFAULT) != OCI_SUCCESS;
            failures += OCIBindByPos(statement, &bind, error, 1, &value, 4, SQLT_INT, nullptr, nullptr, nullptr, 0,
                                     nullptr, OCI_DEFAULT);
            failures += OCIStmtExecute(svc, statement, error, 1, 0, nullptr, nullptr, OCI_DEFAULT) != OCI_SUCCESS;
            failures += OCIStmtRelease(statement, error, nullptr, 0, OCI_DEFAULT) != OCI_SUCCESS;
            bind = nullptr;
            failures += OCIStmtPrepare2(svc, &statement, error, query, 28, nullptr, 0, OCI_NTV_SYNTAX,
                                        OCI_DEFAULT) != OCI_SUCCESS;
            failures += OCIBindByPos(statement, &bind, error, 1, &value, 4, SQLT_INT, nullptr, nullptr, nullptr, 0,
                                     nullptr, OCI_DEFAULT);
            failures += OCIDefineByPos(statement, &define, error, 1, &out, 4, SQLT_INT, nullptr, nullptr, nullptr,
                                       OCI_DEFAULT);
            failures += OCIStmtExecute(svc, statement, error, 1, 0, nullptr, nullptr, OCI_DEFAULT) != OCI_SUCCESS;
            failures += OCIStmtRelease(statement, error, nullptr, 0, OCI_DEFAULT) != OCI_SUCCESS;
            failures += out != value;
        }
    };
    const ub4 cache = 3;
    ASSERT_EQ(Answer(OCIAttrSet(svc, OCI_HTYPE_SVCCTX, const_cast<ub4*>(&cache), 0, OCI_ATTR_STMTCACHESIZE, err)), 0);
    std::vector<std::thread> threads;
    for (int thread = 0; thread < kThreads; ++thread) threads.emplace_back(work, thread);
    for (std::thread& thread : threads) thread.join();
    EXPECT_EQ(failures, 0);
    EXPECT_EQ(One("select count(distinct a) from t"), "200");
}

}  // namespace
