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

// One thread asks the application's own bind and a parameter, while another frees their statement.
TEST_F(Threads, HandlesAskedWhileTheirStatementIsFreed) {
    constexpr int kRounds = 1000;
    // Even: the statement is being made. Odd: it is asked for and freed. The asker says how far it is.
    std::atomic<int> phase = 0, asked = 0, failures = 0;
    dvoid* parameter = nullptr;
    auto* const bind = New<OCIBind>(OCI_HTYPE_BIND);
    std::thread asking([&] {
        OCIError* error = New<OCIError>(OCI_HTYPE_ERROR);
        for (int round = 0; round < kRounds; ++round) {
            while (phase != 2 * round + 1) std::this_thread::yield();
            for (int times = 0; times < 3 || phase == 2 * round + 1; ++times) {
                ub4 position = 0;
                failures +=
                    OCIAttrGet(bind, OCI_HTYPE_BIND, &position, nullptr, OCI_ATTR_HANDLE_POSITION, error) != OCI_SUCCESS;
                failures += position != 1;
                sb4 value = 0;
                ub4 length = 4;
                (void)OCIStmtSetPieceInfo(bind, OCI_HTYPE_BIND, error, &value, &length, OCI_ONE_PIECE, nullptr, nullptr);
                ub2 type = 0;
                (void)OCIAttrGet(parameter, OCI_DTYPE_PARAM, &type, nullptr, OCI_ATTR_DATA_TYPE, error);
                asked = 2 * round + 1;
            }
            asked = 2 * round + 2;
        }
    });
    sb4 value = 1;
    for (int round = 0; round < kRounds; ++round) {
        OCIStmt* statement = New<OCIStmt>(OCI_HTYPE_STMT);
        OCIBind* own = bind;
        failures += Prepare(statement, "select :1 from dual") != 0;
        failures += OCIBindByPos(statement, &own, err, 1, &value, 4, SQLT_INT, nullptr, nullptr, nullptr, 0, nullptr,
                                 OCI_DEFAULT);
        failures += own != bind;
        failures += OCIStmtExecute(svc, statement, err, 0, 0, nullptr, nullptr, OCI_DEFAULT);
        failures += OCIParamGet(statement, OCI_HTYPE_STMT, err, &parameter, 1);
        phase = 2 * round + 1;
        while (asked < 2 * round + 1) std::this_thread::yield();
        failures += OCIHandleFree(statement, OCI_HTYPE_STMT);
        phase = 2 * round + 2;
        while (asked < 2 * round + 2) std::this_thread::yield();
    }
    asking.join();
    EXPECT_EQ(failures, 0);
}

// Statements move between two sessions in two threads, crosswise, and give each other's session's statements results.
TEST_F(Threads, StatementsMoveBetweenSessions) {
    OCISvcCtx* second = nullptr;
    const auto* memory = reinterpret_cast<const OraText*>(":memory:");
    ASSERT_EQ(OCILogon(env, err, &second, nullptr, 0, nullptr, 0, memory, 8), OCI_SUCCESS);
    OCIStmt* shared[2] = {New<OCIStmt>(OCI_HTYPE_STMT), New<OCIStmt>(OCI_HTYPE_STMT)};
    std::atomic<int> failures = 0;
    const auto work = [&](int thread) {
        OCIError* error = New<OCIError>(OCI_HTYPE_ERROR);
        OCIStmt* const own = New<OCIStmt>(OCI_HTYPE_STMT);
        OCIStmt* const block = New<OCIStmt>(OCI_HTYPE_STMT);
        const auto prepare = [&](OCIStmt* statement, std::string_view text) {
            return OCIStmtPrepare(statement, error, reinterpret_cast<const OraText*>(text.data()),
                                  static_cast<ub4>(text.size()), OCI_NTV_SYNTAX, OCI_DEFAULT);
        };
        OCIBind* bind = nullptr;
        OCIStmt* target = shared[thread];
        failures += prepare(own, "select 1 from dual") + prepare(block, "begin open :c for select 2 from dual; end;");
        failures += OCIBindByPos(block, &bind, error, 1, &target, 8, SQLT_CUR, nullptr, nullptr, nullptr, 0, nullptr,
                                 OCI_DEFAULT);
        for (int round = 0; round < 300; ++round) {
            OCISvcCtx* const here = (round + thread) % 2 ? svc : second;
            target = shared[(round / 2 + thread) % 2];
            failures += OCIStmtExecute(here, own, error, 0, 0, nullptr, nullptr, OCI_DEFAULT);
            failures += OCIStmtExecute(here, block, error, 1, 0, nullptr, nullptr, OCI_DEFAULT);
        }
    };
    std::thread other(work, 1);
    work(0);
    other.join();
    EXPECT_EQ(failures, 0);
    EXPECT_EQ(OCILogoff(second, err), OCI_SUCCESS);
}

// A session ends and begins anew while statements execute on its context: each answers, none is torn.
TEST_F(Threads, ExecuteBesideLogoff) {
    std::atomic<bool> done = false;
    std::atomic<int> wrong = 0;
    OCISvcCtx* context = nullptr;
    const auto* memory = reinterpret_cast<const OraText*>(":memory:");
    ASSERT_EQ(OCILogon(env, err, &context, nullptr, 0, nullptr, 0, memory, 8), OCI_SUCCESS);
    std::thread executing([&] {
        OCIError* error = New<OCIError>(OCI_HTYPE_ERROR);
        OCIStmt* const statement = New<OCIStmt>(OCI_HTYPE_STMT);
        const auto* text = reinterpret_cast<const OraText*>("select 1 from dual");
        wrong += OCIStmtPrepare(statement, error, text, 18, OCI_NTV_SYNTAX, OCI_DEFAULT);
        while (!done) {
            const sword rc = OCIStmtExecute(context, statement, error, 0, 0, nullptr, nullptr, OCI_DEFAULT);
            sb4 number = 0;
            if (rc == OCI_ERROR) OCIErrorGet(error, 1, nullptr, &number, nullptr, 0, OCI_HTYPE_ERROR);
            wrong += rc != OCI_SUCCESS && number != 3114 && number != 1012;
        }
    });
    for (int round = 0; round < 200; ++round) {
        EXPECT_EQ(OCILogoff(context, err), OCI_SUCCESS);
        OCISvcCtx* same = context;
        EXPECT_EQ(OCILogon(env, err, &same, nullptr, 0, nullptr, 0, memory, 8), OCI_SUCCESS);
        EXPECT_EQ(same, context);
        if (::testing::Test::HasFailure()) break;
    }
    done = true;
    executing.join();
    EXPECT_EQ(wrong, 0);
}

}  // namespace
