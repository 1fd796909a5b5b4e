// Executing and fetching: rows that fail, index-table arguments at their limits, what comes back into binds.
#include "support/statement_fixture.h"

namespace {

class Executing : public StatementTest {};

// What holds one of the failures is another than the handle that has them, and forgets what it told before.
TEST_F(Executing, RowsThatFail) {
    MustRun("create table t(a number primary key)", "insert into t values(2)");
    sb4 numbers[5] = {1, 2, 3, 2, 5};
    ASSERT_EQ(Ready("insert into t values(:1)", {Int(numbers)}), 0);
    EXPECT_EQ(Execute(5, OCI_BATCH_ERRORS), 24381);
    dvoid* row = err;
    auto* const other = New<OCIError>(OCI_HTYPE_ERROR);
    for (const ub4 failure : {0u, 1u}) {
        EXPECT_EQ(OCIParamGet(err, OCI_HTYPE_ERROR, other, &row, failure), OCI_SUCCESS);
        EXPECT_NE(row, err);
        EXPECT_EQ(Attribute<ub4>(OCI_ATTR_DML_ROW_OFFSET, row, OCI_HTYPE_ERROR), 2 * failure + 1);
    }
    EXPECT_EQ(OCIErrorGet(row, 2, nullptr, nullptr, nullptr, 0, OCI_HTYPE_ERROR), OCI_NO_DATA);
    EXPECT_EQ(OCIParamGet(err, OCI_HTYPE_ERROR, other, &row, 2), OCI_ERROR) << "no more than these";
    EXPECT_EQ((StatementCalls{env, other}.Answer(OCIParamGet(err, OCI_HTYPE_ERROR, other, nullptr, 0))), 21560);
}

// Counts of elements around the room there is, in and out.
TEST_F(Executing, TablesAtTheirLimits) {
    MustRun("create table t(a number primary key)");
    sb4 in[8] = {1, 2, 3, 4, 5, 6, 7, 8};
    ub4 current = 6, shorter = 2;
    ASSERT_EQ(Prepare("insert into t values(:1)"), 0);
    EXPECT_EQ(Bind(1, Int(in), OCI_DEFAULT, 5, &current), 1414);
    current = 3;
    MUST(Bind(1, Int(in), OCI_DEFAULT, 5, &current));
    EXPECT_EQ(Execute(), 1484) << "in blocks only";
    MUST(Prepare("begin insert into t values(:1 + :2); end;"));
    MUST(Bind(1, Int(in), OCI_DEFAULT, 8, &current), Bind(2, Int(in), OCI_DEFAULT, 8, &shorter));
    EXPECT_EQ(Execute(), 6502) << "tables of two lengths";
    const struct { ub4 current; sb4 answer; const char* rows; } into[] = {
        {0, 0, "-"}, {2, 0, "1,2"}, {4, 1414, "-"}, {0xFFFFFFFF, 1414, "-"}, {3, 0, "1,2,3"}};
    for (const auto& c : into) {
        MustRun("delete from t");
        current = 0;
        MUST(Prepare("begin insert into t values(:1); end;"), Bind(1, Int(in), OCI_DEFAULT, 3, &current));
        current = c.current;    // as applications set it: before each execute
        EXPECT_EQ(Execute(), c.answer) << c.current;
        EXPECT_EQ(One("select group_concat(a) from (select a from t order by a)"), c.rows) << c.current;
    }
    sb4 plain = 0;
    const struct { ub4 most; sb4 answer; std::array<sb4, 4> got; ub4 current; } out[] = {
        {4, 0, {1, 2, 3, -1}, 3}, {3, 0, {1, 2, 3, -1}, 3}, {2, 1414, {1, 2, -1, -1}, 2}};
    for (const auto& c : out) {
        std::array<sb4, 4> got = {-1, -1, -1, -1};
        ASSERT_EQ(Prepare("begin select a into :1 from t order by a; end;"), 0);
        ASSERT_EQ(Bind(1, Int(got), OCI_DEFAULT, c.most, &(current = 0)), 0);
        EXPECT_EQ(Execute(), c.answer) << c.most;
        EXPECT_EQ(current, c.current) << c.most;
        EXPECT_EQ(got, c.got) << c.most;
        MUST(Prepare("begin select a, a into :1, :2 from t where a < 3 order by a; end;"), Bind(2, Int(plain)));
        MUST(Bind(1, Int(got), OCI_DEFAULT, c.most, &(current = 0)));
        EXPECT_EQ(Execute(), 1414) << "beside a plain bind a table takes one row";
    }
}

}  // namespace
