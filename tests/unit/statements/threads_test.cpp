// Statements of one session in several threads, each with handles of its own.
#include <atomic>
#include <thread>

#include "support/at_once.h"
#include "support/statement_fixture.h"

namespace {

// What goes wrong in a thread is counted: calls answer 0 or a number.
class Threads : public StatementTest {
protected:
    Threads() : StatementTest(OCI_THREADED) {}
    void Note(sword answer) { failures += answer != 0; }
    std::atomic<int> failures = 0;
};

TEST_F(Threads, StatementsOfOneSession) {
    MustRun("create table t(a number, b varchar2(10))");
    constexpr int kThreads = 4, kRows = 50;
    const auto work = [&](int thread) {
        StatementCalls own = Another();
        const auto prepare = [&](std::string_view sql) {
            Note(OCIStmtPrepare2(svc, &own.stmt, own.err, Bytes(sql), Size(sql), nullptr, 0, OCI_NTV_SYNTAX, 0));
        };
        const auto release = [&] { Note(OCIStmtRelease(own.stmt, own.err, nullptr, 0, OCI_DEFAULT)); };
        for (int row = 0; row < kRows; ++row) {
            sb4 value = thread * kRows + row, out = 0;
            for (const char* sql : {"insert into t values(:1, 'x')", "select a from t where a = :1"}) {
                prepare(sql);
                Note(own.Bind(1, Int(value)));
                Note(*sql == 's' ? own.Define(1, Int(out)) : 0);
                Note(own.Execute());
                release();
            }
            Note(out != value);
        }
    };
    ub4 cache = 3;
    ASSERT_EQ(Answer(OCIAttrSet(svc, OCI_HTYPE_SVCCTX, &cache, 0, OCI_ATTR_STMTCACHESIZE, err)), 0);
    AtOnce(kThreads, work);
    EXPECT_EQ(failures, 0);
    EXPECT_EQ(One("select count(distinct a) from t"), "200");
}

// One thread asks the application's own bind and a parameter, while another frees their statement.
TEST_F(Threads, HandlesAskedWhileTheirStatementIsFreed) {
    constexpr int kRounds = 1000;
    // Even: the statement is being made. Odd: it is asked for and freed. The asker says how far it is.
    std::atomic<int> phase = 0, asked = 0;
    dvoid* parameter = nullptr;
    auto* const bind = New<OCIBind>(OCI_HTYPE_BIND);
    std::thread asking([&] {
        OCIError* error = New<OCIError>(OCI_HTYPE_ERROR);
        for (int round = 0; round < kRounds; ++round) {
            while (phase != 2 * round + 1) std::this_thread::yield();
            for (int times = 0; times < 3 || phase == 2 * round + 1; ++times) {
                ub4 position = 0;
                failures += OCIAttrGet(bind, OCI_HTYPE_BIND, &position, nullptr, OCI_ATTR_HANDLE_POSITION, error) ||
                            position != 1;
                sb4 value = 0;
                ub4 length = 4;
                (void)OCIStmtSetPieceInfo(bind, OCI_HTYPE_BIND, error, &value, &length, OCI_ONE_PIECE, nullptr,
                                          nullptr);
                ub2 type = 0;
                (void)OCIAttrGet(parameter, OCI_DTYPE_PARAM, &type, nullptr, OCI_ATTR_DATA_TYPE, error);
                asked = 2 * round + 1;
            }
            asked = 2 * round + 2;
        }
    });
    sb4 value = 1;
    for (int round = 0; round < kRounds; ++round) {
        stmt = New<OCIStmt>(OCI_HTYPE_STMT);
        OCIBind* own = bind;
        Note(Prepare("select :1 from dual"));
        Note(Bind(&own, 1, Int(value)));
        Note(own != bind);
        Note(Execute(0));
        Note(OCIParamGet(stmt, OCI_HTYPE_STMT, err, &parameter, 1));
        phase = 2 * round + 1;
        while (asked < 2 * round + 1) std::this_thread::yield();
        Note(OCIHandleFree(stmt, OCI_HTYPE_STMT));
        phase = 2 * round + 2;
        while (asked < 2 * round + 2) std::this_thread::yield();
    }
    asking.join();
    EXPECT_EQ(failures, 0);
}

// Statements move between two sessions in two threads, crosswise, and give each other's session's statements results.
TEST_F(Threads, StatementsMoveBetweenSessions) {
    OCISvcCtx* second = nullptr;
    ASSERT_EQ(Logon(&second), OCI_SUCCESS);
    OCIStmt* shared[2] = {New<OCIStmt>(OCI_HTYPE_STMT), New<OCIStmt>(OCI_HTYPE_STMT)};
    const auto work = [&](int thread) {
        StatementCalls own = Another(), block = Another();
        OCIStmt* target = shared[thread];
        Note(own.Prepare("select 1 from dual"));
        Note(block.Ready("begin open :c for select 2 from dual; end;", {{&target, 8, SQLT_CUR}}));
        for (int round = 0; round < 300; ++round) {
            own.svc = block.svc = (round + thread) % 2 ? svc : second;
            Note(own.Execute(0));
            for (const int of : {thread, thread + 1}) {    // the second may be of the session that the block is not on
                target = shared[(round / 2 + of) % 2];
                Note(block.Execute());
            }
        }
    };
    AtOnce(2, work);
    EXPECT_EQ(failures, 0);
    EXPECT_EQ(OCILogoff(second, err), OCI_SUCCESS);
}

}  // namespace
