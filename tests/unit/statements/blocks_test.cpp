// Blocks: what is left of one that fails, index-table arguments at their limits, what comes back into binds.
#include <array>

#include "support/statement_fixture.h"

namespace {

constexpr ub4 kHugeCount = 0xFFFFFFFF;

class Blocks : public StatementTest {
protected:
    void SetUp() override {
        StatementTest::SetUp();
        MustRun("create table t(a number primary key)");
    }
    std::string Rows() { return One("select coalesce(group_concat(a), '') from (select a from t order by a)"); }
};

// A block that fails undoes what it did since it last ended the transaction, and not what was before it.
TEST_F(Blocks, ThatFail) {
    const struct { const char* block; sb4 answer; const char* left; const char* after_rollback; } cases[] = {
        {"begin insert into t values(2); insert into t values(1); end;", 1, "1,9", "1"},
        {"begin insert into t values(2); insert into t values(1); commit; end;", 1, "1,9", "1"},
        {"begin insert into t values(2); commit; insert into t values(3); insert into t values(1); end;", 1, "1,2,9",
         "1,2,9"},
        {"begin insert into t values(2); rollback; insert into t values(3); insert into t values(1); end;", 1, "1", "1"},
        {"begin insert into t values(2); commit; insert into t values(3); commit; insert into t values(4); "
         "insert into t values(1); end;", 1, "1,2,3,9", "1,2,3,9"},
        {"begin insert into t values(2); commit; insert into t values(3); end;", 0, "1,2,3,9", "1,2,9"},
        {"begin insert into t values(2); select a into :x from t where a = 7; end;", 1008, "1,9", "1"},
    };
    for (const auto& c : cases) {
        MustRun("delete from t");
        MustRun("insert into t values(1)");
        MustRun("commit");
        MustRun("insert into t values(9)");
        EXPECT_EQ(Run(c.block), c.answer) << c.block;
        EXPECT_EQ(Rows(), c.left) << c.block;
        MustRun("rollback");
        EXPECT_EQ(Rows(), c.after_rollback) << c.block;
    }
}

// Savepoints of the application: one from before the block takes the block's own mark with it when the block goes back
// to it, and what follows is undone all the same; one set in the block is there after it.
TEST_F(Blocks, GoBackToSavepoints) {
    const struct { const char* block; sb4 answer; const char* left; sb4 to_inner; const char* then; } cases[] = {
        {"begin insert into t values(9); rollback to a; insert into t values(3); insert into t values(3); end;", 1, "1",
         1086, "1"},
        {"begin insert into t values(9); savepoint b; insert into t values(3); rollback to savepoint B; "
         "insert into t values(3); insert into t values(3); end;", 1, "1,2", 1086, "1,2"},
        {"begin savepoint b; insert into t values(3); savepoint c; rollback to b; rollback to a; "
         "insert into t values(5); insert into t values(5); end;", 1, "1", 1086, "1"},
        {"begin insert into t values(9); savepoint \"a\"; rollback to A; insert into t values(1); end;", 1, "1,2", 1086,
         "1,2"},
        {"begin insert into t values(9); savepoint b; insert into t values(10); end;", 0, "1,2,9,10", 0, "1,2,9"},
        {"begin insert into t values(9); rollback to b; end;", 1086, "1,2", 1086, "1,2"},
    };
    for (const auto& c : cases) {
        for (const char* sql : {"rollback", "delete from t", "commit", "insert into t values(1)", "savepoint a",
                                "insert into t values(2)"})
            MustRun(sql);
        EXPECT_EQ(Run(c.block), c.answer) << c.block;
        EXPECT_EQ(Rows(), c.left) << c.block;
        EXPECT_EQ(Run("rollback to b"), c.to_inner) << c.block;
        EXPECT_EQ(Rows(), c.then) << c.block;
        EXPECT_EQ(Run("rollback to a"), 0) << c.block;
        EXPECT_EQ(Rows(), "1") << c.block;
    }
}

TEST_F(Blocks, RunOnceForEachRow) {
    std::array<sb4, 4> numbers = {1, 2, 3, 3};
    ASSERT_EQ(Prepare("begin insert into t values(:1); end;"), 0);
    ASSERT_EQ(Bind(1, {numbers.data(), 4, SQLT_INT}), 0);
    EXPECT_EQ(Execute(4), 1);
    EXPECT_EQ(Rows(), "") << "all iterations are one block";
    for (const ub4 rows : {3u, 2u}) {
        MustRun("delete from t");
        ASSERT_EQ(Prepare("begin insert into t values(:1); end;"), 0);
        ASSERT_EQ(Bind(1, {numbers.data(), 4, SQLT_INT}), 0);
        ASSERT_EQ(Execute(rows), 0);
        EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROW_COUNT), rows);
    }
    numbers = {5, 6, 7, 8};
    ASSERT_EQ(Execute(1), 0);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROW_COUNT), 1u) << "the former execute's rows are not counted again";
}

// Counts of elements around the room there is, in and out.
TEST_F(Blocks, TablesAtTheirLimits) {
    std::array<sb4, 8> in = {1, 2, 3, 4, 5, 6, 7, 8};
    const struct { ub4 most, current; sb4 answer; const char* rows; } into[] = {
        {3, 0, 0, ""}, {3, 2, 0, "1,2"}, {3, 3, 0, "1,2,3"}, {3, 4, 1414, ""}, {3, kHugeCount, 1414, ""}};
    for (const auto& c : into) {
        MustRun("delete from t");
        ub4 current = 0;
        ASSERT_EQ(Prepare("begin insert into t values(:1); end;"), 0);
        ASSERT_EQ(Bind(1, {in.data(), 4, SQLT_INT}, OCI_DEFAULT, c.most, &current), 0);
        current = c.current;    // as applications set it: before each execute
        EXPECT_EQ(Execute(), c.answer) << c.current;
        EXPECT_EQ(Rows(), c.rows) << c.current;
    }
    MustRun("delete from t");
    MustRun("insert into t values(1)");
    MustRun("insert into t values(2)");
    MustRun("insert into t values(3)");
    const struct { ub4 most; sb4 answer; ub4 current; } out[] = {{4, 0, 3}, {3, 0, 3}, {2, 1414, 2}};
    for (const auto& c : out) {
        std::array<sb4, 5> got = {-1, -1, -1, -1, -1};
        ub4 current = 0;
        ASSERT_EQ(Prepare("begin select a into :1 from t order by a; end;"), 0);
        ASSERT_EQ(Bind(1, {got.data(), 4, SQLT_INT}, OCI_DEFAULT, c.most, &current), 0);
        EXPECT_EQ(Execute(), c.answer) << c.most;
        EXPECT_EQ(current, c.current) << c.most;
        EXPECT_EQ(got[c.current - 1], static_cast<sb4>(c.current)) << c.most;
        EXPECT_EQ(got[c.current], -1) << c.most;
    }
    // From one table into another that is just full, and one element short.
    for (const ub4 most : {3u, 2u}) {
        std::array<sb4, 4> got = {-1, -1, -1, -1};
        ub4 given = 3, current = 0;
        ASSERT_EQ(Prepare("begin :out := :in + 10; end;"), 0);
        ASSERT_EQ(BindName("in", {in.data(), 4, SQLT_INT}, 3, &given), 0);
        ASSERT_EQ(BindName("out", {got.data(), 4, SQLT_INT}, most, &current), 0);
        EXPECT_EQ(Execute(), most == 3 ? 0 : 1414);
        EXPECT_EQ(got[2], most == 3 ? 13 : -1);
    }
}

// A plain bind is one element, however many a table beside it has.
TEST_F(Blocks, PlainBindBesideATable) {
    std::array<sb4, 3> in = {4, 5, 6};
    std::array<sb4, 3> out = {-1, -1, -1};
    ub4 current = 3;
    ASSERT_EQ(Prepare("begin :out := :in; end;"), 0);
    ASSERT_EQ(BindName("in", {in.data(), 4, SQLT_INT}, 3, &current), 0);
    ASSERT_EQ(BindName("out", {out.data(), 4, SQLT_INT}), 0);
    ASSERT_EQ(Execute(), 0);
    EXPECT_EQ(out, (std::array<sb4, 3>{6, -1, -1}));
}

TEST_F(Blocks, ReturningIntoTables) {
    std::array<sb4, 3> in = {4, 5, 6};
    std::array<sb4, 3> out = {-1, -1, -1};
    ub4 current = 3, returned = 0;
    ASSERT_EQ(Prepare("begin insert into t values(:in) returning a * 2 into :out; end;"), 0);
    ASSERT_EQ(BindName("in", {in.data(), 4, SQLT_INT}, 3, &current), 0);
    ASSERT_EQ(BindName("out", {out.data(), 4, SQLT_INT}, 3, &returned), 0);
    ASSERT_EQ(Execute(), 0);
    EXPECT_EQ(out, (std::array<sb4, 3>{8, 10, 12}));
    EXPECT_EQ(returned, 3u);
}

// A value that does not fit its place undoes the row that gave it.
TEST_F(Blocks, ReturningWhatDoesNotFit) {
    std::array<sb4, 3> in = {1, 1000, 3};
    std::array<char, 3> out = {};
    ASSERT_EQ(Prepare("insert into t values(:a) returning a into :b"), 0);
    ASSERT_EQ(BindName("a", {in.data(), 4, SQLT_INT}), 0);
    ASSERT_EQ(BindName("b", {out.data(), 1, SQLT_INT}), 0);
    EXPECT_EQ(Execute(3), 1455);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROW_COUNT), 1u);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_DML_ROW_OFFSET, err, OCI_HTYPE_ERROR), 1u);
    EXPECT_EQ(Rows(), "1");
    MustRun("delete from t");
    ASSERT_EQ(Prepare("insert into t values(:a) returning a into :b"), 0);
    ASSERT_EQ(BindName("a", {in.data(), 4, SQLT_INT}), 0);
    ASSERT_EQ(BindName("b", {out.data(), 1, SQLT_INT}), 0);
    EXPECT_EQ(Execute(3, OCI_BATCH_ERRORS), 24381);
    EXPECT_EQ(Rows(), "1,3");
    EXPECT_EQ(out[2], 3);
}

TEST_F(Blocks, RowsReturnedByTheLastExecution) {
    for (const char* a : {"1", "2", "3"}) MustRun("insert into t values(" + std::string(a) + ")");
    std::array<sb4, 2> limits = {3, 2};
    std::array<sb4, 2> out = {};
    ASSERT_EQ(Prepare("update t set a = a + 100 where a < :lim returning a into :b"), 0);
    OCIBind* bind = nullptr;
    ASSERT_EQ(BindName("lim", {limits.data(), 4, SQLT_INT}), 0);
    ASSERT_EQ(Answer(OCIBindByName(stmt, &bind, err, reinterpret_cast<const OraText*>(":b"), 2, out.data(), 4, SQLT_INT, nullptr, nullptr, nullptr, 0,
                                   nullptr, OCI_DEFAULT)), 0);
    const struct { ub4 iterations, first; ub4 rows; } cases[] = {{1, 0, 2}, {2, 1, 0}};
    for (const auto& c : cases) {
        ASSERT_EQ(Execute(c.iterations, OCI_DEFAULT, c.first), 0);
        EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROWS_RETURNED, bind, OCI_HTYPE_BIND), c.rows) << c.first;
    }
}

}  // namespace
