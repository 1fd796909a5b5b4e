// Executing: modes, counts, array changes and their failures, transactions, blocks.
#include "support/statement_fixture.h"

namespace {

class Executing : public StatementTest {
protected:
    std::string Rows() { return One("select count(*) from t"); }
    // The rows that failed in the last execute with batch errors: "number in row, " for each.
    std::string BatchErrors() const {
        std::string all;
        auto* const other = New<OCIError>(OCI_HTYPE_ERROR);
        const auto count = Attribute<ub4>(OCI_ATTR_NUM_DML_ERRORS);
        for (ub4 index = 0; index < count; ++index) {
            dvoid* row = nullptr;
            sb4 number = 0;
            EXPECT_EQ(OCIParamGet(err, OCI_HTYPE_ERROR, other, &row, index), OCI_SUCCESS) << index;
            OCIErrorGet(row, 1, nullptr, &number, nullptr, 0, OCI_HTYPE_ERROR);
            const auto at = Attribute<ub4>(OCI_ATTR_DML_ROW_OFFSET, row, OCI_HTYPE_ERROR);
            all += std::to_string(number) + " in " + std::to_string(at) + ", ";
        }
        dvoid* none = nullptr;
        EXPECT_EQ(OCIParamGet(err, OCI_HTYPE_ERROR, other, &none, count), OCI_ERROR) << "no more than these";
        return all;
    }
};

TEST_F(Executing, TruncateEmptiesTheTableForGood) {
    MustRun("create table t(a number)", "insert into t values(1)");
    ASSERT_EQ(Prepare("truncate table t"), 0);
    EXPECT_EQ(Attribute<ub2>(OCI_ATTR_STMT_TYPE), 0);
    EXPECT_EQ(Execute(), 0);
    MustRun("rollback");
    EXPECT_EQ(Rows(), "0");
    EXPECT_EQ(Run("truncate table missing"), 942);
}

// Rows 1 and 3 break the constraint: the others are done and counted.
TEST_F(Executing, RowsThatFail) {
    MustRun("create table t(a number primary key)", "insert into t values(2)");
    sb4 numbers[5] = {1, 2, 3, 2, 5};
    ASSERT_EQ(Ready("insert into t values(:1)", {Int(numbers)}), 0);
    const sword rc = ExecuteCode(5, OCI_BATCH_ERRORS);
    EXPECT_EQ(rc, OCI_SUCCESS_WITH_INFO);
    EXPECT_EQ(Answer(rc), 24381);
    EXPECT_EQ(RowCount(), 3u);
    dvoid* row = err;    // which is no place for one of its own failures
    auto* const other = New<OCIError>(OCI_HTYPE_ERROR);
    EXPECT_EQ(OCIParamGet(err, OCI_HTYPE_ERROR, other, &row, 0), OCI_SUCCESS);
    EXPECT_NE(row, err);
    EXPECT_EQ(OCIParamGet(err, OCI_HTYPE_ERROR, other, &row, 1), OCI_SUCCESS);
    EXPECT_EQ(OCIErrorGet(row, 2, nullptr, nullptr, nullptr, 0, OCI_HTYPE_ERROR), OCI_NO_DATA) << "what it told before is gone";
    EXPECT_EQ((StatementCalls{env, other}.Answer(OCIParamGet(err, OCI_HTYPE_ERROR, other, nullptr, 0))), 21560);
    EXPECT_EQ(BatchErrors(), "1 in 1, 1 in 3, ");
}

TEST_F(Executing, ValueThatCannotBeReadFailsItsRow) {
    MustRun("create table t(a number)");
    char areas[3][4] = {{'1', 0, 0, 0}, {'1', '2', '3', '4'}, {'5', 0, 0, 0}};
    ASSERT_EQ(Ready("insert into t values(:1)", {Text(areas)}), 0);
    EXPECT_EQ(Execute(3), 1480) << "no terminator in the second area";
    EXPECT_EQ(Rows(), "1");
}

// What was compiled and opened on one session is left behind when the statement is executed on another.
TEST_F(Executing, ThroughAnotherSession) {
    OCISvcCtx* services[2] = {svc, nullptr};
    ASSERT_EQ(Logon(&services[1]), OCI_SUCCESS);
    for (const sb4 number : {1, 2}) {
        svc = services[number - 1];
        MustRun("create temporary table t(a number)", "insert into t values(" + std::to_string(number) + ")");
    }
    sb4 value = 0;
    ASSERT_EQ(Query("select a from t", {Int(value)}, 0), 0);
    for (const sb4 number : {2, 1, 2}) {
        svc = services[number - 1];
        MUST(Execute(0), Fetch());
        EXPECT_EQ(value, number);
        for (OCISvcCtx* service : services) {
            const auto* session = Attribute<OCISession*>(OCI_ATTR_SESSION, service, OCI_HTYPE_SVCCTX);
            EXPECT_EQ(Attribute<ub4>(OCI_ATTR_NUM_OPEN_STMTS, session, OCI_HTYPE_SESSION), service == svc ? 1u : 0u);
        }
    }
    EXPECT_EQ(OCILogoff(services[0], err), OCI_SUCCESS);
}

TEST_F(Executing, LogoffEndsWhatIsOpen) {
    sb4 value = 0;
    MUST(Query("select 1 from dual", {Int(value)}, 0), OCILogoff(svc, err));
    EXPECT_EQ(Fetch(), 3114);
    EXPECT_EQ(Execute(0), 3114);
    ASSERT_EQ(Prepare("select 2 from dual"), 0);
    EXPECT_EQ(Fetch(), 24338) << "a new text was never executed";
}

TEST_F(Executing, RowIdOfTheLastChange) {
    MustRun("create table t(a number)", "insert into t values(7)", "insert into t values(8)");
    auto* rowid = NewDescriptor<OCIRowid>(OCI_DTYPE_ROWID);
    ASSERT_EQ(Answer(OCIAttrGet(stmt, OCI_HTYPE_STMT, rowid, nullptr, OCI_ATTR_ROWID, err)), 0);
    MUST(Ready("update t set a = 9 where rowid = :r", {{&rowid, 8, SQLT_RDD}}), Execute());
    EXPECT_EQ(One("select group_concat(a) from t"), "7,9");
    EXPECT_EQ(One("select a from t where rowid = '" + One("select rowid from t where a = 9") + "'"), "9");
    char text[19] = "";
    ASSERT_EQ(Query("select rowid from t where a = 7", {Text(text)}), 0);
    sb4 length = 0;    // one bind is a row id there and a text here
    ASSERT_EQ(Prepare("select length(:r) from t where rowid = :r and a = 7"), 0);
    ASSERT_EQ(BindName("r", Text(text)) + Define(1, Int(length)) + Execute(1), 0);
    EXPECT_EQ(length, 18);
    MUST(Ready("delete from t where rowid = :r", {Text(text)}), Execute());
    EXPECT_EQ(RowCount(), 1u);
    EXPECT_EQ(Execute(), 0);
    EXPECT_EQ(RowCount(), 0u);
    EXPECT_EQ(Answer(OCIAttrGet(stmt, OCI_HTYPE_STMT, rowid, nullptr, OCI_ATTR_ROWID, err)), 1410) << "it is gone";
    std::strcpy(text, "not a row id");
    EXPECT_EQ(Execute(), 1410);
}

// ---- Blocks

// What the server says besides comes with a success, in its order; behind a truncation, which is told first.
TEST_F(Executing, NoticesAreInformation) {
    MustRun("create table b(a number)", "begin", "insert into b values(1)", "rollback");
    if (!OnServer()) return;
    MustRun("create function told() returns text language plpgsql as "
            "$$ begin raise warning 'one'; raise warning 'two'; return 'abc'; end $$");
    for (const bool cut : {false, true}) {
        char text[9] = "";
        ub2 code = 0;
        ASSERT_EQ(Prepare("select told() from dual") + Define(1, {text, cut ? 3 : 9, SQLT_STR, nullptr, nullptr, &code}), 0);
        EXPECT_EQ(ExecuteCode(), OCI_SUCCESS_WITH_INFO);
        std::string told;
        char words[200];
        sb4 number = 0;
        const auto get = [&](ub4 record) {
            return OCIErrorGet(err, record, nullptr, &number, reinterpret_cast<OraText*>(words), sizeof words, OCI_HTYPE_ERROR);
        };
        for (ub4 record = 1; get(record) == OCI_SUCCESS; ++record)
            told += std::to_string(number) + (std::strstr(words, "one") ? " one " : std::strstr(words, "two") ? " two " : " ");
        EXPECT_EQ(told, cut ? "24345 20000 one 20000 two " : "20000 one 20000 two ");
    }
}

// What the driver shows its decimal floats with.
TEST_F(Executing, ValuesIsAQueryOfOneRow) {
    EXPECT_EQ(One("values( cast( cast('1.50' as decfloat(34)) as varchar(100)))"), OnServer() ? "1.50" : "1.5");
    EXPECT_EQ(One("values(1, 2)"), "1");
}

}  // namespace
