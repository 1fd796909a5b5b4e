// Executing: modes, counts, array changes and their failures, transactions, blocks.
#include "support/statement_fixture.h"

namespace {

class Executing : public StatementTest {};

TEST_F(Executing, TypeAndStateOfAStatement) {
    MustRun("create table t(a number)");
    EXPECT_EQ(Attribute<ub2>(OCI_ATTR_STMT_TYPE), OCI_STMT_CREATE);
    EXPECT_EQ(Attribute<ub2>(OCI_ATTR_SQLFNCODE), 1);
    ASSERT_EQ(Prepare("select a, a + 1 from t where a = :x or a = :y or a = :x"), 0);
    EXPECT_EQ(Attribute<ub2>(OCI_ATTR_STMT_TYPE), OCI_STMT_SELECT);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_STMT_STATE), 1u);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_BIND_COUNT), 3u);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_PARAM_COUNT), 0u);
    ASSERT_EQ(Execute(0, OCI_DESCRIBE_ONLY), 0);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_PARAM_COUNT), 2u);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_STMT_STATE), 1u) << "described, not executed";
    EXPECT_EQ(Fetch(), 24338);
}

TEST_F(Executing, WhatIsWrongWithTheCall) {
    MustRun("create table t(a number)");
    OCIStmt* const fresh = New<OCIStmt>(OCI_HTYPE_STMT);
    EXPECT_EQ(Answer(OCIStmtExecute(svc, fresh, err, 1, 0, nullptr, nullptr, OCI_DEFAULT)), 24337);
    const struct { const char* sql; ub4 iterations, first, mode; sb4 answer; } cases[] = {
        {"insert into t values(1)", 0, 0, OCI_DEFAULT, 24333},
        {"insert into t values(1)", 2, 2, OCI_DEFAULT, 24333},
        {"insert into t values(1)", 1, 3, OCI_DEFAULT, 24333},
        {"insert into t values(1)", 1, 0, 0x1000, 24300},
        {"insert into t values(1)", 1, 0, OCI_DESCRIBE_ONLY | OCI_PARSE_ONLY, 24380},
        {"insert into t values(:a)", 1, 0, OCI_DEFAULT, 1008},
        {"create table u(a number)", 2, 0, OCI_DEFAULT, 24969},
        {"create table u as select :a from t", 1, 0, OCI_DEFAULT, 1027},
        {"commit", 2, 0, OCI_DEFAULT, 24969},
        {"select * from t", 1, 0, OCI_DEFAULT, 24374},
        {"select * from missing", 0, 0, OCI_DEFAULT, 942},
        {"select 'x from t", 0, 0, OCI_DEFAULT, 1756},
        {"select 1; select 2", 0, 0, OCI_DEFAULT, 933},
    };
    for (const auto& c : cases) {
        ASSERT_EQ(Prepare(c.sql), 0) << c.sql;
        EXPECT_EQ(Execute(c.iterations, c.mode, c.first), c.answer) << c.sql;
    }
    EXPECT_EQ(One("select count(*) from t"), "0");
}

TEST_F(Executing, SyntaxErrorsPointIntoTheText) {
    ASSERT_EQ(Prepare("select :a, sysdate, from dual"), 0);
    char dummy[4] = "";
    ASSERT_EQ(Bind(1, {dummy, 4, SQLT_STR}), 0);
    EXPECT_NE(Execute(0), 0);
    EXPECT_EQ(Attribute<ub2>(OCI_ATTR_PARSE_ERROR_OFFSET), 20);
    ASSERT_EQ(Prepare("select 1 from dual"), 0);
    EXPECT_EQ(Attribute<ub2>(OCI_ATTR_PARSE_ERROR_OFFSET), 0);
}

TEST_F(Executing, TheMomentInDefaultsAndLists) {
    MustRun("create table t(a number, d date default sysdate, s timestamp default systimestamp)");
    MustRun("insert into t(a) values(1)");
    EXPECT_EQ(One("select count(*) from t where d <= sysdate and s is not null"), "1");
    EXPECT_EQ(One("select nvl(null, nvl2(a, 'there', 'null')) from t"), "there");
    ASSERT_EQ(Prepare("select sysdate, systimestamp from dual"), 0);
    ASSERT_EQ(Execute(0, OCI_DESCRIBE_ONLY), 0);
    const struct { ub4 position; const char* name; ub2 type; } columns[] = {
        {1, "SYSDATE", SQLT_DAT}, {2, "SYSTIMESTAMP", SQLT_TIMESTAMP_TZ}};
    for (const auto& c : columns) {
        OCIParam* column = nullptr;
        ASSERT_EQ(OCIParamGet(stmt, OCI_HTYPE_STMT, err, reinterpret_cast<void**>(&column), c.position), OCI_SUCCESS);
        OraText* name = nullptr;
        ub4 length = 0;
        ub2 type = 0;
        OCIAttrGet(column, OCI_DTYPE_PARAM, &name, &length, OCI_ATTR_NAME, err);
        OCIAttrGet(column, OCI_DTYPE_PARAM, &type, nullptr, OCI_ATTR_DATA_TYPE, err);
        EXPECT_EQ(std::string(reinterpret_cast<char*>(name), length), c.name);
        EXPECT_EQ(type, c.type) << c.name;
        OCIDescriptorFree(column, OCI_DTYPE_PARAM);
    }
}

TEST_F(Executing, TruncateEmptiesTheTableForGood) {
    MustRun("create table t(a number)");
    MustRun("insert into t values(1)");
    ASSERT_EQ(Prepare("truncate table t"), 0);
    EXPECT_EQ(Attribute<ub2>(OCI_ATTR_STMT_TYPE), 0);
    EXPECT_EQ(Execute(), 0);
    MustRun("rollback");
    EXPECT_EQ(One("select count(*) from t"), "0");
    ASSERT_EQ(Prepare("truncate table missing"), 0);
    EXPECT_EQ(Execute(), 942);
}

TEST_F(Executing, ParseOnlyRunsNothingAndComesFirst) {
    MustRun("create table t(a number)");
    ASSERT_EQ(Prepare("insert into t values(1)"), 0);
    EXPECT_EQ(Execute(1, OCI_PARSE_ONLY), 0);
    EXPECT_EQ(Execute(1, OCI_PARSE_ONLY), 0);
    EXPECT_EQ(One("select count(*) from t"), "0");
    EXPECT_EQ(Execute(), 0);
    EXPECT_EQ(Execute(1, OCI_PARSE_ONLY), 24382);
    ASSERT_EQ(Prepare("insert into missing values(1)"), 0);
    EXPECT_EQ(Execute(1, OCI_PARSE_ONLY), 942);
}

TEST_F(Executing, ArrayTakesItsRowsFromTheOffsetOn) {
    MustRun("create table t(a number, b varchar2(10))");
    sb4 numbers[5] = {10, 20, 30, 40, 50};
    char texts[5][4] = {"aa", "bb", "cc", "dd", "ee"};
    sb2 indicators[5] = {0, 0, -1, 0, 0};
    ASSERT_EQ(Prepare("insert into t values(:1, :2)"), 0);
    ASSERT_EQ(Bind(1, {numbers, 4, SQLT_INT}), 0);
    ASSERT_EQ(Bind(2, {texts, 4, SQLT_STR, indicators}), 0);
    ASSERT_EQ(Execute(4, OCI_DEFAULT, 1), 0);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROW_COUNT), 3u);
    EXPECT_EQ(One("select group_concat(a || coalesce(b, '-')) from t"), "20bb,30-,40dd");
    numbers[1] = 21;
    ASSERT_EQ(Execute(2, OCI_DEFAULT, 1), 0) << "the buffers are read when it runs";
    EXPECT_EQ(One("select max(a) from t where b = 'bb'"), "21");
}

// Rows 1 and 3 break the constraint; the others are done and counted.
TEST_F(Executing, RowsThatFail) {
    MustRun("create table t(a number primary key)");
    MustRun("insert into t values(2)");
    sb4 numbers[5] = {1, 2, 3, 2, 5};
    ASSERT_EQ(Prepare("insert into t values(:1)"), 0);
    ASSERT_EQ(Bind(1, {numbers, 4, SQLT_INT}), 0);

    EXPECT_EQ(Execute(5), 1);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROW_COUNT), 1u);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_DML_ROW_OFFSET, err, OCI_HTYPE_ERROR), 1u);
    EXPECT_EQ(One("select count(*) from t"), "2");

    MustRun("delete from t where a = 1");
    ASSERT_EQ(Prepare("insert into t values(:1)"), 0);
    ASSERT_EQ(Bind(1, {numbers, 4, SQLT_INT}), 0);
    const sword rc = OCIStmtExecute(svc, stmt, err, 5, 0, nullptr, nullptr, OCI_BATCH_ERRORS);
    EXPECT_EQ(rc, OCI_SUCCESS_WITH_INFO);
    EXPECT_EQ(Answer(rc), 24381);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROW_COUNT), 3u);
    ASSERT_EQ(Attribute<ub4>(OCI_ATTR_NUM_DML_ERRORS), 2u);
    for (ub4 index = 0; index < 3; ++index) {
        auto* const other = New<OCIError>(OCI_HTYPE_ERROR);
        dvoid* row_error = nullptr;
        const sword got = OCIParamGet(err, OCI_HTYPE_ERROR, other, &row_error, index);
        EXPECT_EQ(got, index < 2 ? OCI_SUCCESS : OCI_ERROR) << index;
        if (got != OCI_SUCCESS) continue;
        sb4 number = 0;
        OCIErrorGet(row_error, 1, nullptr, &number, nullptr, 0, OCI_HTYPE_ERROR);
        EXPECT_EQ(number, 1);
        ub4 offset = 0;
        OCIAttrGet(row_error, OCI_HTYPE_ERROR, &offset, nullptr, OCI_ATTR_DML_ROW_OFFSET, other);
        EXPECT_EQ(offset, index == 0 ? 1u : 3u);
    }
}

// What an error handle tells of rows is that of the last execute through it.
TEST_F(Executing, RowsThatFailAreForgotten) {
    MustRun("create table t(a number primary key)");
    sb4 numbers[4] = {1, 1, 2, 1};
    const struct { ub4 iterations; sb4 answer; ub4 failed; ub4 first_failed; } cases[] = {
        {4, 24381, 2, 1}, {3, 24381, 1, 1}, {1, 0, 0, 0}};
    for (const auto& c : cases) {
        MustRun("delete from t");
        ASSERT_EQ(Prepare("insert into t values(:1)"), 0);
        ASSERT_EQ(Bind(1, {numbers, 4, SQLT_INT}), 0);
        EXPECT_EQ(Execute(c.iterations, OCI_BATCH_ERRORS), c.answer);
        EXPECT_EQ(Attribute<ub4>(OCI_ATTR_NUM_DML_ERRORS), c.failed) << c.iterations;
        auto* const other = New<OCIError>(OCI_HTYPE_ERROR);
        dvoid* row_error = nullptr;
        EXPECT_EQ(OCIParamGet(err, OCI_HTYPE_ERROR, other, &row_error, c.failed), OCI_ERROR) << "no more than these";
        if (c.failed == 0) continue;
        ASSERT_EQ(OCIParamGet(err, OCI_HTYPE_ERROR, other, &row_error, 0), OCI_SUCCESS);
        ub4 offset = 9;
        OCIAttrGet(row_error, OCI_HTYPE_ERROR, &offset, nullptr, OCI_ATTR_DML_ROW_OFFSET, other);
        EXPECT_EQ(offset, c.first_failed);
    }
    MustRun("delete from t");
    ASSERT_EQ(Prepare("insert into t values(:1)"), 0);
    ASSERT_EQ(Bind(1, {numbers, 4, SQLT_INT}), 0);
    EXPECT_EQ(Execute(2), 1);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_DML_ROW_OFFSET, err, OCI_HTYPE_ERROR), 1u);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROW_COUNT), 1u);
    MustRun("delete from t");
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_DML_ROW_OFFSET, err, OCI_HTYPE_ERROR), 0u);
}

TEST_F(Executing, ValueThatCannotBeReadFailsItsRow) {
    MustRun("create table t(a number)");
    char areas[3][4] = {{'1', 0, 0, 0}, {'1', '2', '3', '4'}, {'5', 0, 0, 0}};
    ASSERT_EQ(Prepare("insert into t values(:1)"), 0);
    ASSERT_EQ(Bind(1, {areas, 4, SQLT_STR}), 0);
    EXPECT_EQ(Execute(3), 1480) << "no terminator in the second area";
    EXPECT_EQ(One("select count(*) from t"), "1");
}

TEST_F(Executing, Transactions) {
    MustRun("create table t(a number)");
    MustRun("insert into t values(1)");
    MustRun("rollback");
    EXPECT_EQ(One("select count(*) from t"), "0");
    MustRun("insert into t values(1)");
    MustRun("savepoint s");
    MustRun("insert into t values(2)");
    MustRun("rollback to s");
    MustRun("commit work");
    MustRun("rollback");
    EXPECT_EQ(One("select count(*) from t"), "1");
    MustRun("insert into t values(3)");
    MustRun("create table u(a number)");
    MustRun("rollback");
    EXPECT_EQ(One("select count(*) from t"), "2") << "a definition commits what came before";
    ASSERT_EQ(Prepare("insert into t values(4)"), 0);
    ASSERT_EQ(Execute(1, OCI_COMMIT_ON_SUCCESS), 0);
    MustRun("rollback");
    EXPECT_EQ(One("select count(*) from t"), "3");
}

TEST_F(Executing, DefinitionThatFailsToCompileCommitsNothing) {
    MustRun("create table t(a number)");
    MustRun("insert into t values(1)");
    EXPECT_NE(Run("create tabel u(a number)"), 0);
    MustRun("rollback");
    EXPECT_EQ(One("select count(*) from t"), "0");
}

// A definition commits what came before it, even if it fails when it runs.
TEST_F(Executing, DefinitionThatFailsInRunningHasCommitted) {
    MustRun("create table t(a number)");
    MustRun("insert into t values(1)");
    MustRun("insert into t values(1)");
    EXPECT_EQ(Run("create unique index i on t(a)"), 1);
    MustRun("rollback");
    EXPECT_EQ(One("select count(*) from t"), "2");
}

// The session counts the results that are open.
TEST_F(Executing, OpenStatementsAreCounted) {
    OCISession* session = nullptr;
    ASSERT_EQ(Answer(OCIAttrGet(svc, OCI_HTYPE_SVCCTX, &session, nullptr, OCI_ATTR_SESSION, err)), 0);
    const auto open = [&] { return Attribute<ub4>(OCI_ATTR_NUM_OPEN_STMTS, session, OCI_HTYPE_SESSION); };
    OCIStmt* statements[3];
    for (ub4 index = 0; index < 3; ++index) {
        stmt = statements[index] = New<OCIStmt>(OCI_HTYPE_STMT);
        ASSERT_EQ(Prepare("select 1 from dual"), 0);
        ASSERT_EQ(Execute(0), 0);
        EXPECT_EQ(open(), index + 1);
        ASSERT_EQ(Execute(0), 0) << "again: the former result is closed";
        EXPECT_EQ(open(), index + 1);
    }
    EXPECT_EQ(Fetch(0), 0);
    EXPECT_EQ(open(), 2u);
    OCIStmt* const block = New<OCIStmt>(OCI_HTYPE_STMT);
    stmt = block;
    ASSERT_EQ(Prepare("begin open :c for select 1 from dual; end;"), 0);
    ASSERT_EQ(Bind(1, {&statements[1], 8, SQLT_RSET}), 0);
    ASSERT_EQ(Execute(), 0);
    EXPECT_EQ(open(), 2u) << "one result took the place of another";
    OCIHandleFree(statements[1], OCI_HTYPE_STMT);
    EXPECT_EQ(open(), 1u);
    stmt = statements[0];
    ASSERT_EQ(Prepare("select 2 from dual"), 0);
    EXPECT_EQ(open(), 0u);
}

TEST_F(Executing, OpenQueryOutlivesCommitAndOtherStatements) {
    MustRun("create table t(a number)");
    MustRun("insert into t values(1)");
    MustRun("insert into t values(2)");
    OCIStmt* const query = New<OCIStmt>(OCI_HTYPE_STMT);
    OCIStmt* const other = stmt;
    sb4 value = 0;
    stmt = query;
    ASSERT_EQ(Prepare("select a from t order by a"), 0);
    ASSERT_EQ(Define(1, {&value, 4, SQLT_INT}), 0);
    ASSERT_EQ(Execute(0), 0);
    ASSERT_EQ(Fetch(), 0);
    stmt = other;
    MustRun("commit");
    MustRun("insert into t values(3)");
    stmt = query;
    EXPECT_EQ(Fetch(), 0);
    EXPECT_EQ(value, 2);
    ASSERT_EQ(Execute(0), 0) << "executing again begins anew";
    ASSERT_EQ(Fetch(), 0);
    EXPECT_EQ(value, 1);
}

TEST_F(Executing, LogoffEndsWhatIsOpen) {
    sb4 value = 0;
    ASSERT_EQ(Prepare("select 1 from dual"), 0);
    ASSERT_EQ(Define(1, {&value, 4, SQLT_INT}), 0);
    ASSERT_EQ(Execute(0), 0);
    ASSERT_EQ(OCILogoff(svc, err), OCI_SUCCESS);
    EXPECT_EQ(Fetch(), 3114);
    EXPECT_EQ(Execute(0), 3114);
    ASSERT_EQ(Prepare("select 2 from dual"), 0);
    EXPECT_EQ(Fetch(), 24338) << "a new text was never executed";
}

TEST_F(Executing, RowIdOfTheLastChange) {
    MustRun("create table t(a number)");
    MustRun("insert into t values(7)");
    MustRun("insert into t values(8)");
    auto* const rowid = NewDescriptor<OCIRowid>(OCI_DTYPE_ROWID);
    ASSERT_EQ(Answer(OCIAttrGet(stmt, OCI_HTYPE_STMT, rowid, nullptr, OCI_ATTR_ROWID, err)), 0);
    ASSERT_EQ(Prepare("update t set a = 9 where rowid = :r"), 0);
    ASSERT_EQ(Bind(1, {const_cast<OCIRowid**>(&rowid), 8, SQLT_RDD}), 0);
    ASSERT_EQ(Execute(), 0);
    EXPECT_EQ(One("select a from t where rowid = '" + One("select rowid from t where a = 9") + "'"), "9");
    char text[19] = "";
    ASSERT_EQ(Prepare("select rowid from t where a = 7"), 0);
    ASSERT_EQ(Define(1, {text, sizeof text, SQLT_STR}), 0);
    ASSERT_EQ(Execute(1), 0);
    ASSERT_EQ(Prepare("delete from t where rowid = :r"), 0);
    ASSERT_EQ(Bind(1, {text, sizeof text, SQLT_STR}), 0);
    ASSERT_EQ(Execute(), 0);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROW_COUNT), 1u);
    std::strcpy(text, "not a row id");
    EXPECT_EQ(Execute(), 1410);
}

TEST_F(Executing, ReturningGivesValuesBack) {
    MustRun("create table t(a number, b varchar2(10))");
    sb4 numbers[2] = {1, 2};
    char texts[2][8] = {"", ""};
    sb2 indicators[2] = {};
    ASSERT_EQ(Prepare("insert into t values(:a, 'n' || :a) returning b into :b"), 0);
    EXPECT_EQ(Attribute<ub1>(OCI_ATTR_STMT_IS_RETURNING), 1);
    ASSERT_EQ(BindName(":a", {numbers, 4, SQLT_INT}), 0);
    ASSERT_EQ(BindName(":b", {texts, 8, SQLT_STR, indicators}), 0);
    ASSERT_EQ(Execute(2), 0);
    EXPECT_STREQ(texts[0], "n1");
    EXPECT_STREQ(texts[1], "n2");
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROW_COUNT), 2u);
}

// ---- Blocks

TEST_F(Executing, BlockOpensResultSets) {
    MustRun("create table t(a number)");
    MustRun("insert into t values(5)");
    for (const bool descriptor : {true, false}) {
        OCIStmt* element = descriptor ? reinterpret_cast<OCIStmt*>(NewDescriptor<OCIResult>(OCI_DTYPE_RSET)) : nullptr;
        OCIResult* const result = reinterpret_cast<OCIResult*>(element);
        EXPECT_EQ(descriptor ? Answer(OCIResultSetToStmt(result, err)) : 24336, 24336) << "nothing was opened yet";
        ASSERT_EQ(Prepare("begin open :c for select a, :x from t; end;"), 0);
        sb4 x = 77;
        ASSERT_EQ(BindName("c", {&element, 8, static_cast<ub2>(descriptor ? SQLT_RSET : SQLT_CUR)}), 0);
        ASSERT_EQ(BindName("x", {&x, 4, SQLT_INT}), 0);
        ASSERT_EQ(Execute(), 0);
        ASSERT_NE(element, nullptr);
        ASSERT_EQ(Answer(OCIResultSetToStmt(reinterpret_cast<OCIResult*>(element), err)), 0);
        OCIStmt* const block = stmt;
        stmt = element;
        EXPECT_EQ(Attribute<ub2>(OCI_ATTR_STMT_TYPE), OCI_STMT_SELECT);
        EXPECT_EQ(Attribute<ub4>(OCI_ATTR_PARAM_COUNT), 2u);
        sb4 values[2] = {};
        ASSERT_EQ(Define(1, {&values[0], 4, SQLT_INT}), 0);
        ASSERT_EQ(Define(2, {&values[1], 4, SQLT_INT}), 0);
        EXPECT_EQ(Fetch(), 0);
        EXPECT_EQ(values[0], 5);
        EXPECT_EQ(values[1], 77);
        EXPECT_EQ(Fetch(), 1403);
        EXPECT_EQ(OCIHandleFree(stmt, OCI_HTYPE_STMT), OCI_SUCCESS);
        stmt = block;
    }
}

// What the driver shows its decimal floats with.
TEST_F(Executing, ValuesIsAQueryOfOneRow) {
    EXPECT_EQ(One("values( cast( cast('1.50' as decfloat(34)) as varchar(100)))"), "1.5");
    EXPECT_EQ(One("values(1, 2)"), "1");
}

TEST_F(Executing, BlockAssignsAndSelectsInto) {
    sb4 in = 20, out = 0;
    char text[6] = "";
    sb2 indicator = 0;
    ASSERT_EQ(Prepare("begin :out := :in * 2 + 1; select 'name' into :t from dual; null; end;"), 0);
    ASSERT_EQ(BindName(":IN", {&in, 4, SQLT_INT}), 0);
    ASSERT_EQ(BindName("out", {&out, 4, SQLT_INT}), 0);
    ASSERT_EQ(BindName(":t", {text, 6, SQLT_STR, &indicator}), 0);
    ASSERT_EQ(Execute(), 0);
    EXPECT_EQ(out, 41);
    EXPECT_STREQ(text, "name");
    ASSERT_EQ(Prepare("begin select 1 into :x from dual where 1 = 0; end;"), 0);
    ASSERT_EQ(Bind(1, {&out, 4, SQLT_INT}), 0);
    EXPECT_EQ(Execute(), 1403);
    ASSERT_EQ(Prepare("begin select a into :x from (select 1 as a union select 2); end;"), 0);
    ASSERT_EQ(Bind(1, {&out, 4, SQLT_INT}), 0);
    EXPECT_EQ(Execute(), 1422);
}

TEST_F(Executing, BlockThatFailsUndoesItself) {
    MustRun("create table t(a number primary key)");
    MustRun("insert into t values(1)");
    EXPECT_EQ(Run("begin insert into t values(2); insert into t values(1); end;"), 1);
    EXPECT_EQ(One("select group_concat(a) from t"), "1") << "but not the transaction";
    EXPECT_EQ(Run("begin insert into t values(2); commit; insert into t values(1); end;"), 1);
    MustRun("rollback");
    EXPECT_EQ(One("select count(*) from t"), "2");
    MustRun("begin insert into t values(3); insert into t values(4); end;");
    EXPECT_EQ(One("select count(*) from t"), "4");
}

TEST_F(Executing, IndexTableArguments) {
    MustRun("create table t(a number)");
    sb4 numbers[5] = {1, 2, 3, 4, 5};
    ub4 count = 3;
    ASSERT_EQ(Prepare("insert into t values(:1)"), 0);
    ASSERT_EQ(Bind(1, {numbers, 4, SQLT_INT}, OCI_DEFAULT, 5, &count), 0);
    EXPECT_EQ(Execute(), 1484) << "in blocks only";
    ASSERT_EQ(Prepare("begin insert into t values(:1); end;"), 0);
    ASSERT_EQ(Bind(1, {numbers, 4, SQLT_INT}, OCI_DEFAULT, 5, &count), 0);
    ASSERT_EQ(Execute(), 0);
    EXPECT_EQ(One("select group_concat(a) from t"), "1,2,3");

    sb4 doubled[4] = {};
    ub4 doubled_count = 0;
    ASSERT_EQ(Prepare("begin :2 := :1 * 2; end;"), 0);
    ASSERT_EQ(BindName("1", {numbers, 4, SQLT_INT}, 5, &count), 0);
    ASSERT_EQ(BindName("2", {doubled, 4, SQLT_INT}, 4, &doubled_count), 0);
    ASSERT_EQ(Execute(), 0);
    EXPECT_EQ(doubled_count, 3u);
    EXPECT_EQ(doubled[2], 6);
    count = 5;
    EXPECT_EQ(Execute(), 1414) << "more elements than the other table takes";

    ASSERT_EQ(Prepare("begin select a into :out from t order by a desc; end;"), 0);
    ASSERT_EQ(Bind(1, {doubled, 4, SQLT_INT}, OCI_DEFAULT, 4, &doubled_count), 0);
    ASSERT_EQ(Execute(), 0);
    EXPECT_EQ(doubled_count, 3u);
    EXPECT_EQ(doubled[0], 3);
    count = 6;
    EXPECT_EQ(Bind(1, {numbers, 4, SQLT_INT}, OCI_DEFAULT, 5, &count), 1414);
}

}  // namespace
