// Binds: calls with pointers and numbers that no application should pass, and their wide forms.
#include "support/statement_fixture.h"

namespace {

class Binds : public StatementTest {};

// Null, foreign, freed and unsuitable pointers in each place; numbers at their ends. Each call comes back with a code,
// an error for all but the few that are right by chance.
TEST_F(Binds, HostileArguments) {
    ASSERT_EQ(Prepare("select :a from dual"), 0);
    OCIStmt* const freed = New<OCIStmt>(OCI_HTYPE_STMT);
    OCIHandleFree(freed, OCI_HTYPE_STMT);
    char foreign[16] = "Invalid handle";
    dvoid* const pointers[] = {nullptr, foreign, freed, env, err, svc, stmt};
    char area[64] = "";
    const OraText* const text = Bytes("select 1 from dual");
    int refused = 0;
    const auto note = [&](auto... codes) { refused += (... + (codes != OCI_SUCCESS)); };
    constexpr std::nullptr_t null = nullptr;
    const auto call = [&](dvoid* a, dvoid* b, ub4 number) {
        auto* const statement = static_cast<OCIStmt*>(a);
        auto* const error = static_cast<OCIError*>(b);
        auto* const context = static_cast<OCISvcCtx*>(a);
        const auto size = static_cast<sb4>(number);
        const auto type = static_cast<ub2>(number);
        OCIBind* bind = static_cast<OCIBind*>(a);
        OCIDefine* define = static_cast<OCIDefine*>(b);
        OCIStmt* made = null;
        dvoid* out = b;
        ub4 length = 8;
        if (a == stmt && b == err)
            note(OCIStmtPrepare(statement, error, text, 18, number, OCI_DEFAULT),
                 OCIStmtPrepare(statement, error, text, 18, OCI_NTV_SYNTAX, number));
        note(OCIStmtPrepare(statement, error, null, number, OCI_NTV_SYNTAX, 0));
        note(OCIStmtPrepare2(context, &made, error, null, number, null, number, OCI_NTV_SYNTAX, 0));
        note(OCIStmtPrepare2(context, null, error, text, 18, null, 0, OCI_NTV_SYNTAX, 0));
        note(OCIStmtRelease(statement, error, null, number, OCI_DEFAULT));
        note(OCIStmtExecute(context, static_cast<OCIStmt*>(b), err, number, 0, null, null, number));
        note(OCIStmtExecute(static_cast<OCISvcCtx*>(b), statement, err, 0, number, null, null, OCI_DEFAULT));
        note(OCIStmtFetch(statement, error, number, type, OCI_DEFAULT));
        note(OCIStmtFetch2(statement, error, 1, OCI_FETCH_NEXT, size, number));
        note(OCIBindByName(statement, &bind, error, null, size, area, 8, SQLT_INT, null, null, null, 0, null, 0));
        note(OCIBindByName(statement, null, error, text, 1, area, 8, SQLT_INT, null, null, null, 0, null, 0));
        note(OCIBindByPos(statement, &bind, error, number, area, size, type, null, null, null, number, null, number));
        note(OCIBindByPos(statement, null, error, 1, null, 0, SQLT_CHR, null, null, null, 0, null, 0));
        note(OCIDefineByPos(statement, &define, error, number, null, size, SQLT_CHR, null, null, null, 0));
        note(OCIDefineByPos(statement, null, error, 1, area, 8, SQLT_INT, null, null, null, number));
        note(OCIBindArrayOfStruct(static_cast<OCIBind*>(a), error, number, number, number, number));
        note(OCIDefineArrayOfStruct(static_cast<OCIDefine*>(a), error, number, number, number, number));
        note(OCIResultSetToStmt(static_cast<OCIResult*>(a), error));
        note(OCIStmtGetBindInfo(statement, error, number, number, null, null, null, null, null, null, null));
        note(OCIStmtGetPieceInfo(statement, error, null, null, null, null, null, null));
        note(OCIStmtSetPieceInfo(a, number, error, null, &length, static_cast<ub1>(number), null, null));
        note(OCIStmtSetPieceInfo(a, OCI_HTYPE_BIND, error, area, null, 0, null, null));
        note(OCIParamGet(a, number, error, &out, number));
        for (const ub4 kind : {OCI_HTYPE_ERROR, OCI_HTYPE_STMT}) note(OCIParamGet(a, kind, error, null, number));
    };
    for (dvoid* a : pointers)
        for (dvoid* b : pointers)
            for (const ub4 number : {0u, 1u, 2u, 0x7FFFFFFFu, 0x80000000u, 0xFFFFFFFFu}) call(a, b, number);
    EXPECT_GT(refused, 5000);
    EXPECT_EQ(Answer(OCIBindByName(stmt, null, err, text, 1, area, 8, SQLT_INT, null, null, null, 0, null, 0)), 21560);
    EXPECT_EQ(Answer(OCIBindByPos(stmt, null, err, 1, area, 8, SQLT_INT, null, null, null, 0, null, 0)), 21560);
    EXPECT_EQ(Answer(OCIDefineByPos(stmt, null, err, 1, area, 8, SQLT_INT, null, null, null, 0)), 21560);
    ASSERT_EQ(Prepare("select 1 from dual"), 0) << "the statement still works";
    EXPECT_EQ(Execute(0), 0);
}

// Lengths of more than 16 bits, in arrays with steps of their own; sizes of more than 32.
TEST_F(Binds, WideForms) {
    MustRun("create table t(a varchar2(80000))");
    std::string in(140000, 'x'), out(160000, '#');
    ub4 lengths[2] = {70000, 65536}, stored[3] = {9, 9, 9};
    OCIBind *bind = nullptr, *told = nullptr;
    OCIDefine* define = nullptr;
    for (const bool by_name : {true, false}) {
        ASSERT_EQ(Prepare("insert into t values(:1)"), 0);
        const auto bound = [&](sb8 size) {
            return Answer(by_name ? OCIBindByName2(stmt, &bind, err, Bytes(":1"), 2, in.data(), size, SQLT_CHR, nullptr,
                                                   lengths, nullptr, 0, nullptr, OCI_DEFAULT)
                                  : OCIBindByPos2(stmt, &bind, err, 1, in.data(), size, SQLT_CHR, nullptr, lengths,
                                                  nullptr, 0, nullptr, OCI_DEFAULT));
        };
        EXPECT_EQ(bound(sb8{1} << 32), 1459);
        EXPECT_EQ(bound(-1), 1459);
        MUST(bound(70000), Execute(2));
        MUST(Answer(OCIStmtGetBindInfo(stmt, err, 1, 1, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, &told)));
        EXPECT_EQ(told, bind);
    }
    EXPECT_EQ(One("select min(length(a)) || ',' || max(length(a)) || ',' || sum(length(a)) from t"),
              "65536,70000,271072");
    ASSERT_EQ(Prepare("select a from t"), 0);
    ASSERT_EQ(Answer(OCIDefineByPos2(stmt, &define, err, 1, out.data(), 80000, SQLT_STR, nullptr, stored, nullptr, OCI_DEFAULT)), 0);
    ASSERT_EQ(Execute(2), 0);
    EXPECT_EQ(stored[0], 70000u);
    EXPECT_EQ(stored[1], 65536u);
    EXPECT_EQ(stored[2], 9u);
    EXPECT_EQ(Answer(OCIDefineByPos2(stmt, &define, err, 1, nullptr, sb8{1} << 40, SQLT_LNG, nullptr, stored, nullptr,
                                     OCI_DYNAMIC_FETCH)), 0) << "of pieces";
    dvoid* result = &in;
    ub4 type = 9;
    EXPECT_EQ(Answer(OCIStmtGetNextResult(stmt, err, &result, &type, OCI_DEFAULT)), 1403);
    EXPECT_EQ(result, nullptr);
    EXPECT_EQ(Answer(OCIStmtGetNextResult(stmt, err, &result, &type, 1)), 24300);
    EXPECT_EQ(Answer(OCIStmtGetNextResult(stmt, err, &result, nullptr, OCI_DEFAULT)), 21560);
    EXPECT_EQ(Answer(OCIStmtGetNextResult(stmt, err, nullptr, &type, OCI_DEFAULT)), 21560);
    EXPECT_EQ(OCIStmtGetNextResult(nullptr, err, &result, &type, OCI_DEFAULT), OCI_INVALID_HANDLE);
}

}  // namespace
