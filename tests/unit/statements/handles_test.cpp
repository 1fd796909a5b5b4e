// Bind, define and parameter handles: which place they serve, what becomes of them when they or their statement are
// freed, and what their attributes take.
#include "support/statement_fixture.h"

namespace {

class Handles : public StatementTest {};

// The same variable for another statement: the first one keeps what it has.
TEST_F(Handles, OneVariableForTwoStatements) {
    OCIStmt* const first = stmt;
    OCIStmt* const second = New<OCIStmt>(OCI_HTYPE_STMT);
    auto* bind = New<OCIBind>(OCI_HTYPE_BIND);    // the application's own
    OCIBind* const own = bind;
    sb4 in[2] = {1, 2}, out[2] = {};
    OCIDefine* define = nullptr;
    for (const int which : {0, 1}) {
        stmt = which == 0 ? first : second;
        ASSERT_EQ(Prepare("select :1 * 10 from dual"), 0);
        ASSERT_EQ(Bind(&bind, 1, Int(in[which])) + Define(&define, 1, Int(out[which])), 0);
    }
    EXPECT_NE(bind, own);
    for (OCIStmt* statement : {second, first}) {
        stmt = statement;
        ASSERT_EQ(Execute(1), 0);
    }
    EXPECT_EQ(out[0], 10);
    EXPECT_EQ(out[1], 20);
    ASSERT_EQ(OCIHandleFree(second, OCI_HTYPE_STMT), OCI_SUCCESS);
    in[0] = 5;
    ASSERT_EQ(Execute(1), 0);
    EXPECT_EQ(out[0], 50);
    bind = own;
    MUST(Prepare("select :1 * 10, :2 from dual"), Bind(&bind, 2, Int(in[1])));
    EXPECT_EQ(bind, own) << "free again, with its text gone";
    EXPECT_EQ(Execute(0), 1008);
    ASSERT_EQ(OCIHandleFree(first, OCI_HTYPE_STMT), OCI_SUCCESS);
    stmt = New<OCIStmt>(OCI_HTYPE_STMT);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_HANDLE_POSITION, own, OCI_HTYPE_BIND), 2u) << "lives on without its statement";
    EXPECT_EQ(Answer(OCIStmtSetPieceInfo(own, OCI_HTYPE_BIND, err, in, nullptr, 0, nullptr, nullptr)), 24370);
    MUST(Prepare("select :1 from dual"), Bind(&bind, 1, Int(in[1])));
    EXPECT_EQ(bind, own);
}

// A bind by position replaces one by name that served two places, in one of them.
TEST_F(Handles, TheOneBeforeGoesWhenNothingElseHasIt) {
    ASSERT_EQ(Prepare("select :a + :a from dual"), 0);
    sb4 one = 1, two = 2, out = 0;
    OCIBind* by_name = nullptr;
    MUST(BindName(&by_name, ":a", Int(one)) + Bind(2, Int(two)) + Define(1, Int(out)), Execute(1));
    EXPECT_EQ(out, 3);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_HANDLE_POSITION, by_name, OCI_HTYPE_BIND), 1u);
    ASSERT_EQ(Bind(1, Int(two)), 0);
    EXPECT_EQ(OCIHandleFree(by_name, OCI_HTYPE_BIND), OCI_INVALID_HANDLE);
    ASSERT_EQ(Execute(1), 0);
    EXPECT_EQ(out, 4);
    OCIBind* by_place = nullptr;
    MUST(Bind(&by_place, 2, Int(two)), Prepare("select :a + :a from dual"));
    EXPECT_EQ(OCIHandleFree(by_place, OCI_HTYPE_BIND), OCI_INVALID_HANDLE) << "a new text lets all of them go";
}

// Numbers and dates that are bound without a size are nulls, whatever the pointer; other types have none.
TEST_F(Handles, ValuesOfNoSize) {
    char area[32];
    std::memset(area, 'x', sizeof area);
    for (const ub2 type : {SQLT_INT, SQLT_UIN, SQLT_FLT, SQLT_VNU, SQLT_DAT, SQLT_ODT}) {
        sb2 indicator = 0;
        sb4 out = 7;
        ASSERT_EQ(Ready("select :1 from dual", {{area, 0, type}}), 0) << type;
        EXPECT_EQ(Define(1, {area, 0, type}), 1483) << type << " has no room for a value coming out";
        ASSERT_EQ(Define(1, {&out, 4, SQLT_INT, &indicator}), 0);
        ASSERT_EQ(Execute(1), 0) << type;
        EXPECT_EQ(indicator, -1) << type;
        ASSERT_EQ(Ready("begin :1 := 5; end;", {{area, 0, type}}), 0);
        EXPECT_EQ(Execute(), 932) << type;
        EXPECT_EQ(area[0], 'x') << type;
    }
    for (const ub2 type : {SQLT_NUM, SQLT_PDN, SQLT_RID, SQLT_BFLOAT, SQLT_BDOUBLE})
        EXPECT_EQ(Bind(1, {area, 0, type}), 1483) << type;
}

// A memory function frees the define, or the whole statement, in the middle of the fetch that needs memory for it.
struct Saboteur {
    dvoid* victim = nullptr;
    ub4 type = 0;
    static dvoid* Allocate(dvoid* self, std::size_t size) {
        auto& saboteur = *static_cast<Saboteur*>(self);
        if (dvoid* victim = std::exchange(saboteur.victim, nullptr)) OCIHandleFree(victim, saboteur.type);
        return std::malloc(size);
    }
    static void Release(dvoid*, dvoid* memory) { std::free(memory); }
};

TEST_F(Handles, FreedByAMemoryFunction) {
    const StatementCalls outer = *this;
    for (const bool statement_too : {false, true}) {
        Saboteur saboteur;
        ASSERT_EQ(OCIEnvCreate(&env, 0, &saboteur, Saboteur::Allocate, nullptr, Saboteur::Release, 0, nullptr), 0);
        err = New<OCIError>(OCI_HTYPE_ERROR);
        ASSERT_EQ(Logon(&svc), OCI_SUCCESS);
        stmt = New<OCIStmt>(OCI_HTYPE_STMT);
        OCIDefine* define = nullptr;
        auto string = std::make_unique<OCIString*>(nullptr);
        auto indicator = std::make_unique<sb2>(sb2{0});
        ASSERT_EQ(Query("select 'abc' from dual", {}, 0), 0);
        ASSERT_EQ(Define(&define, 1, {string.get(), 8, SQLT_VST, indicator.get()}), 0);
        saboteur.type = statement_too ? OCI_HTYPE_STMT : OCI_HTYPE_DEFINE;
        saboteur.victim = statement_too ? static_cast<dvoid*>(stmt) : define;
        EXPECT_EQ(Fetch(), 24374);
        EXPECT_EQ(*string, nullptr) << "the define's memory is the application's again";
        EXPECT_EQ(FetchCode(), statement_too ? OCI_INVALID_HANDLE : OCI_ERROR);
        OCILogoff(svc, err);
        EXPECT_EQ(OCIHandleFree(env, OCI_HTYPE_ENV), OCI_SUCCESS);
    }
    static_cast<StatementCalls&>(*this) = outer;    // the end takes it down and counts the blocks left behind
}

}  // namespace
