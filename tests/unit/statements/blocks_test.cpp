// Blocks: what is left of one that fails, index-table arguments at their limits, what comes back into binds.
#include "support/statement_fixture.h"

namespace {

constexpr ub4 kHugeCount = 0xFFFFFFFF;

class Blocks : public StatementTest {
protected:
    void SetUp() override {
        StatementTest::SetUp();
        MustRun("create table t(a number primary key)");
    }
    std::string Rows() {
        const std::string rows = One("select group_concat(a) from (select a from t order by a)");
        return rows == "-" ? "" : rows;
    }
};

// Savepoints of the application: one from before the block takes the block's own mark with it when the block goes back
// to it, and what follows is undone all the same; one set in the block is there after it.
TEST_F(Blocks, CommitsThatFail) {
    MustRun("create table c(id integer references t deferrable initially deferred)", "commit");
    EXPECT_EQ(Run("begin insert into c values(77); commit; insert into c values(88); end;"), 2091);
    EXPECT_EQ(One("select count(*) from c"), "0");
}

// Counts of elements around the room there is, in and out.
TEST_F(Blocks, TablesAtTheirLimits) {
    sb4 in[8] = {1, 2, 3, 4, 5, 6, 7, 8};
    ub4 current = 3;
    MUST(Prepare("insert into t values(:1)"), Bind(1, Int(in), OCI_DEFAULT, 5, &current));
    EXPECT_EQ(Execute(), 1484) << "in blocks only";
    current = 6;
    EXPECT_EQ(Bind(1, Int(in), OCI_DEFAULT, 5, &current), 1414);
    const struct { ub4 current; sb4 answer; const char* rows; } into[] = {
        {0, 0, ""}, {2, 0, "1,2"}, {3, 0, "1,2,3"}, {4, 1414, ""}, {kHugeCount, 1414, ""}};
    for (const auto& c : into) {
        MustRun("delete from t");
        current = 0;
        MUST(Prepare("begin insert into t values(:1); end;"), Bind(1, Int(in), OCI_DEFAULT, 3, &current));
        current = c.current;    // as applications set it: before each execute
        EXPECT_EQ(Execute(), c.answer) << c.current;
        EXPECT_EQ(Rows(), c.rows) << c.current;
    }
    MustRun("delete from t", "insert into t values(1), (2), (3)");
    const struct { ub4 most; sb4 answer; std::array<sb4, 4> got; ub4 current; } out[] = {
        {4, 0, {1, 2, 3, -1}, 3}, {3, 0, {1, 2, 3, -1}, 3}, {2, 1414, {1, 2, -1, -1}, 2}};
    for (const auto& c : out) {
        std::array<sb4, 4> got = {-1, -1, -1, -1};
        ASSERT_EQ(Prepare("begin select a into :1 from t order by a; end;"), 0);
        ASSERT_EQ(Bind(1, Int(got), OCI_DEFAULT, c.most, &(current = 0)), 0);
        EXPECT_EQ(Execute(), c.answer) << c.most;
        EXPECT_EQ(current, c.current) << c.most;
        EXPECT_EQ(got, c.got) << c.most;
    }
    // Beside a plain bind a table takes one row.
    sb4 wide[4] = {}, plain = 0;
    ASSERT_EQ(Prepare("begin select a, a into :1, :2 from t order by a; end;"), 0);
    ASSERT_EQ(Bind(1, Int(wide), OCI_DEFAULT, 4, &(current = 0)) + Bind(2, Int(plain)), 0);
    EXPECT_EQ(Execute(), 1414);
    sb4 by_row[2] = {};
    ASSERT_EQ(Prepare("begin select a, a into :1, :2 from t where a = 2; end;"), 0);
    ASSERT_EQ(Bind(1, Int(wide), OCI_DEFAULT, 4, &(current = 0)) + Bind(2, Int(by_row)), 0);
    EXPECT_EQ(Execute(2), 0);
    EXPECT_EQ(by_row[0] * 10 + by_row[1], 22);
    ub4 shorter = 2;
    current = 3;
    ASSERT_EQ(Prepare("begin insert into t values(:1 + :2); end;"), 0);
    ASSERT_EQ(Bind(1, Int(in), OCI_DEFAULT, 8, &current) + Bind(2, Int(in), OCI_DEFAULT, 8, &shorter), 0);
    EXPECT_EQ(Execute(), 6502) << "tables of two lengths";
    ASSERT_EQ(Prepare("begin update t set a = a + 10 where a = :1 returning a into :2; end;"), 0);
    MUST(Bind(1, Int(in), OCI_DEFAULT, 8, &current) + Bind(2, Int(plain)), Execute());
    EXPECT_EQ(plain, 13) << "of the last element";
    // From one table into another that is just full, and one element short.
    for (const ub4 most : {3u, 2u}) {
        sb4 got[4] = {-1, -1, -1, -1};
        ub4 given = 3;
        ASSERT_EQ(Prepare("begin :out := :in + 10; end;"), 0);
        ASSERT_EQ(BindName("in", Int(in), 3, &given) + BindName("out", Int(got), most, &(current = 0)), 0);
        EXPECT_EQ(Execute(), most == 3 ? 0 : 1414);
        EXPECT_EQ(got[2], most == 3 ? 13 : -1);
        EXPECT_TRUE(most == 2 || current == 3) << current;
    }
}

// A value that does not fit its place undoes the row that gave it.
TEST_F(Blocks, ReturningWhatDoesNotFit) {
    const struct { ub4 mode; sb4 answer; ub4 done; const char* rows; sb1 third; } cases[] = {
        {OCI_DEFAULT, 1455, 1, "1", 0}, {OCI_BATCH_ERRORS, 24381, 2, "1,3", 3}};
    for (const auto& c : cases) {
        sb4 in[3] = {1, 1000, 3};
        sb1 out[3] = {};
        MustRun("delete from t");
        ASSERT_EQ(Ready("insert into t values(:a) returning a into :b", {Int(in), Int(out)}), 0);
        EXPECT_EQ(Execute(3, c.mode), c.answer);
        EXPECT_EQ(RowCount(), c.done);
        EXPECT_TRUE(c.mode == OCI_BATCH_ERRORS || FailedRow() == 1) << FailedRow();
        EXPECT_EQ(Rows(), c.rows);
        EXPECT_EQ(out[2], c.third);
    }
}

TEST_F(Blocks, RowsReturnedByTheLastExecution) {
    MustRun("insert into t values(1), (2), (3)");
    sb4 limits[2] = {3, 2}, out[2] = {};
    ASSERT_EQ(Prepare("update t set a = a + 100 where a < :lim returning a into :b"), 0);
    OCIBind* bind = nullptr;
    ASSERT_EQ(BindName("lim", Int(limits)) + BindName(&bind, ":b", Int(out)), 0);
    for (const ub4 execution : {0u, 1u}) {
        ASSERT_EQ(Execute(execution + 1, OCI_DEFAULT, execution), 0);
        EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROWS_RETURNED, bind, OCI_HTYPE_BIND), execution == 0 ? 2u : 0u);
    }
    ASSERT_EQ(Prepare("begin update t set a = a + 0 where a = 3 returning a into :b; end;") + BindName(&bind, "b", Int(out)), 0);
    EXPECT_EQ(Execute(), 0);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROWS_RETURNED, bind, OCI_HTYPE_BIND), 1u);
    // The last that succeeds, whatever fails behind it.
    const struct { std::array<sb4, 3> in; ub4 mode; sb4 answer; ub4 returned; } cases[] = {
        {{7, 8, 7}, OCI_BATCH_ERRORS, 24381, 1}, {{7, 7, 7}, OCI_BATCH_ERRORS, 24381, 1},
        {{3, 3, 3}, OCI_BATCH_ERRORS, 24381, 0}, {{7, 7, 8}, OCI_DEFAULT, 1, 1}};
    for (const auto& c : cases) {
        MustRun("delete from t where a > 3");
        std::array<sb4, 3> in = c.in, back = {};
        ASSERT_EQ(Prepare("insert into t values(:a) returning a into :b"), 0);
        ASSERT_EQ(BindName("a", Int(in)) + BindName(&(bind = nullptr), "b", Int(back)), 0);
        EXPECT_EQ(Execute(3, c.mode), c.answer);
        EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROWS_RETURNED, bind, OCI_HTYPE_BIND), c.returned) << in[0] << in[1] << in[2];
        EXPECT_NE(Execute(3, c.mode), 0) << "again: all of them are there";
        EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROWS_RETURNED, bind, OCI_HTYPE_BIND), 0u) << in[0] << in[1] << in[2];
    }
}

}  // namespace
