// Bind, define and parameter handles: which place they serve, what becomes of them when they or their statement are
// freed, and what their attributes take.
#include <array>

#include "support/statement_fixture.h"

namespace {

class Handles : public StatementTest {
protected:
    sb4 DefineAt(OCIStmt* statement, ub4 position, OCIDefine** define, sb4* value) const {
        return Answer(OCIDefineByPos(statement, define, err, position, value, 4, SQLT_INT, nullptr, nullptr, nullptr,
                                     OCI_DEFAULT));
    }
    sb4 BindAt(OCIStmt* statement, ub4 position, OCIBind** bind, sb4* value) const {
        return Answer(OCIBindByPos(statement, bind, err, position, value, 4, SQLT_INT, nullptr, nullptr, nullptr, 0,
                                   nullptr, OCI_DEFAULT));
    }
};

// One variable for all handles: each keeps the place that it was made for.
TEST_F(Handles, OneVariableForAllPositions) {
    sb4 in[3] = {1, 2, 3}, out[3] = {};
    OCIBind* bind = nullptr;
    OCIDefine* define = nullptr;
    OCIBind* binds[3] = {};
    OCIDefine* defines[3] = {};
    ASSERT_EQ(Prepare("select :1 + 10, :2 + 20, :3 + 30 from dual"), 0);
    for (ub4 place = 0; place < 3; ++place) {
        ASSERT_EQ(BindAt(stmt, place + 1, &bind, &in[place]), 0);
        ASSERT_EQ(DefineAt(stmt, place + 1, &define, &out[place]), 0);
        binds[place] = bind;
        defines[place] = define;
        EXPECT_EQ(Attribute<ub4>(OCI_ATTR_HANDLE_POSITION, bind, OCI_HTYPE_BIND), place + 1);
        EXPECT_EQ(Attribute<ub4>(OCI_ATTR_HANDLE_POSITION, define, OCI_HTYPE_DEFINE), place + 1);
    }
    EXPECT_NE(binds[0], binds[1]);
    EXPECT_NE(defines[0], defines[1]);
    ASSERT_EQ(Execute(1), 0);
    EXPECT_EQ(out[0], 11);
    EXPECT_EQ(out[1], 22);
    EXPECT_EQ(out[2], 33);
    ASSERT_EQ(DefineAt(stmt, 3, &define, &out[0]), 0);
    EXPECT_EQ(define, defines[2]) << "the same place once more";
    ASSERT_EQ(BindAt(stmt, 3, &bind, &in[0]), 0);
    EXPECT_EQ(bind, binds[2]);
    ASSERT_EQ(Execute(1), 0);
    EXPECT_EQ(out[0], 31);
}

// The same variable for another statement: the first one keeps what it has.
TEST_F(Handles, OneVariableForTwoStatements) {
    OCIStmt* const first = stmt;
    OCIStmt* const second = New<OCIStmt>(OCI_HTYPE_STMT);
    auto* bind = New<OCIBind>(OCI_HTYPE_BIND);    // the application's own
    OCIBind* const own = bind;
    sb4 in[2] = {1, 2}, out[2] = {};
    OCIDefine* define = nullptr;
    for (OCIStmt* statement : {first, second}) {
        ASSERT_EQ(Prepare(statement, "select :1 * 10 from dual"), 0);
        ASSERT_EQ(BindAt(statement, 1, &bind, &in[statement == second]), 0);
        ASSERT_EQ(DefineAt(statement, 1, &define, &out[statement == second]), 0);
    }
    EXPECT_NE(bind, own);
    ASSERT_EQ(Execute(1), 0);
    stmt = second;
    ASSERT_EQ(Execute(1), 0);
    EXPECT_EQ(out[0], 10);
    EXPECT_EQ(out[1], 20);
    stmt = first;
    ASSERT_EQ(OCIHandleFree(second, OCI_HTYPE_STMT), OCI_SUCCESS);
    in[0] = 5;
    ASSERT_EQ(Execute(1), 0);
    EXPECT_EQ(out[0], 50);
    bind = own;
    ASSERT_EQ(Prepare("select :1 * 10, :2 from dual"), 0);
    ASSERT_EQ(BindAt(stmt, 2, &bind, &in[1]), 0);
    EXPECT_EQ(bind, own) << "free again, with its text gone";
    EXPECT_EQ(Execute(0), 1008);
    ASSERT_EQ(OCIHandleFree(first, OCI_HTYPE_STMT), OCI_SUCCESS);
    stmt = New<OCIStmt>(OCI_HTYPE_STMT);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_HANDLE_POSITION, own, OCI_HTYPE_BIND), 2u) << "lives on without its statement";
    EXPECT_EQ(Answer(OCIStmtSetPieceInfo(own, OCI_HTYPE_BIND, err, in, nullptr, 0, nullptr, nullptr)), 24370);
    ASSERT_EQ(Prepare("select :1 from dual"), 0);
    ASSERT_EQ(BindAt(stmt, 1, &bind, &in[1]), 0);
    EXPECT_EQ(bind, own);
}

// A bind by position replaces one by name that served two places, in one of them.
TEST_F(Handles, TheOneBeforeGoesWhenNothingElseHasIt) {
    ASSERT_EQ(Prepare("select :a + :a from dual"), 0);
    sb4 one = 1, two = 2, out = 0;
    OCIBind* by_name = nullptr;
    ASSERT_EQ(Answer(OCIBindByName(stmt, &by_name, err, reinterpret_cast<const OraText*>(":a"), 2, &one, 4, SQLT_INT,
                                   nullptr, nullptr, nullptr, 0, nullptr, OCI_DEFAULT)), 0);
    OCIBind* by_position = nullptr;
    ASSERT_EQ(BindAt(stmt, 2, &by_position, &two), 0);
    ASSERT_EQ(Define(1, {&out, 4, SQLT_INT}), 0);
    ASSERT_EQ(Execute(1), 0);
    EXPECT_EQ(out, 3);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_HANDLE_POSITION, by_name, OCI_HTYPE_BIND), 1u);
    OCIBind* other = nullptr;
    ASSERT_EQ(BindAt(stmt, 1, &other, &two), 0);
    EXPECT_EQ(OCIHandleFree(by_name, OCI_HTYPE_BIND), OCI_INVALID_HANDLE);
    ASSERT_EQ(Execute(1), 0);
    EXPECT_EQ(out, 4);
}

// Character data is in UTF-8 or UTF-16; another set is refused rather than taken and ignored.
TEST_F(Handles, CharacterSets) {
    const struct { ub2 id; sb4 answer; const char* shown; } cases[] = {
        {0, 0, "E282AC"}, {871, 0, "E282AC"}, {873, 0, "E282AC"}, {1000, 0, "AC20"},
        {1, 24329, "E282AC"}, {31, 24329, "E282AC"}, {178, 24329, "E282AC"}, {2000, 24329, "E282AC"}};
    for (const auto& c : cases) {
        std::array<unsigned char, 8> text{};
        ub2 length = 0;
        OCIDefine* define = nullptr;
        ASSERT_EQ(Prepare("select cast(x'E282AC' as text) from dual"), 0);
        ASSERT_EQ(Answer(OCIDefineByPos(stmt, &define, err, 1, text.data(), 8, SQLT_CHR, nullptr, &length, nullptr,
                                        OCI_DEFAULT)), 0);
        ub2 id = c.id;
        EXPECT_EQ(Answer(OCIAttrSet(define, OCI_HTYPE_DEFINE, &id, 0, OCI_ATTR_CHARSET_ID, err)), c.answer) << c.id;
        EXPECT_EQ(Attribute<ub2>(OCI_ATTR_CHARSET_ID, define, OCI_HTYPE_DEFINE), c.answer == 0 ? c.id : 0);
        ASSERT_EQ(Execute(1), 0);
        std::string hex;
        for (ub2 byte = 0; byte < length; ++byte) {
            char pair[3];
            std::snprintf(pair, sizeof pair, "%02X", text[byte]);
            hex += pair;
        }
        EXPECT_EQ(hex, c.shown) << c.id;
        OCIBind* bind = nullptr;
        ASSERT_EQ(Prepare("select hex(:1) from dual"), 0);
        ASSERT_EQ(Answer(OCIBindByPos(stmt, &bind, err, 1, text.data(), length, SQLT_CHR, nullptr, nullptr, nullptr, 0,
                                      nullptr, OCI_DEFAULT)), 0);
        EXPECT_EQ(Answer(OCIAttrSet(bind, OCI_HTYPE_BIND, &id, 0, OCI_ATTR_CHARSET_ID, err)), c.answer) << c.id;
        char seen[20] = "";
        ASSERT_EQ(Define(1, {seen, sizeof seen, SQLT_STR}), 0);
        ASSERT_EQ(Execute(1), 0);
        EXPECT_STREQ(seen, "E282AC") << c.id;
    }
}

// Numbers and dates that are bound without a size are nulls, whatever the pointer; other types have none.
TEST_F(Handles, ValuesOfNoSize) {
    char area[32];
    std::memset(area, 'x', sizeof area);
    for (const ub2 type : {SQLT_INT, SQLT_UIN, SQLT_FLT, SQLT_VNU, SQLT_DAT, SQLT_ODT}) {
        sb2 indicator = 0;
        sb4 out = 7;
        ASSERT_EQ(Prepare("select :1 from dual"), 0);
        ASSERT_EQ(Bind(1, {area, 0, type}), 0) << type;
        EXPECT_EQ(Define(1, {area, 0, type}), 1483) << type << " has no room for a value coming out";
        ASSERT_EQ(Define(1, {&out, 4, SQLT_INT, &indicator}), 0);
        ASSERT_EQ(Execute(1), 0) << type;
        EXPECT_EQ(indicator, -1) << type;
        ASSERT_EQ(Prepare("begin :1 := 5; end;"), 0);
        ASSERT_EQ(Bind(1, {area, 0, type}), 0);
        EXPECT_EQ(Execute(), 932) << type;
        EXPECT_EQ(area[0], 'x') << type;
    }
    for (const ub2 type : {SQLT_NUM, SQLT_PDN, SQLT_RID, SQLT_BFLOAT, SQLT_BDOUBLE})
        EXPECT_EQ(Bind(1, {area, 0, type}), 1483) << type;
}

// A name stays readable while the statement lives: when its parameter is freed or shows another column, too.
TEST_F(Handles, ColumnNamesStay) {
    const auto name_of = [&](dvoid* parameter, ub4& length) {
        OraText* name = nullptr;
        EXPECT_EQ(Answer(OCIAttrGet(parameter, OCI_DTYPE_PARAM, &name, &length, OCI_ATTR_NAME, err)), 0);
        return reinterpret_cast<const char*>(name);
    };
    dvoid* parameter = nullptr;
    ub4 first_length = 0, second_length = 0;
    ASSERT_EQ(Prepare("select 1 as a_name_longer_than_a_short_one from dual"), 0);
    ASSERT_EQ(Execute(0), 0);
    ASSERT_EQ(Answer(OCIParamGet(stmt, OCI_HTYPE_STMT, err, &parameter, 1)), 0);
    const char* const first = name_of(parameter, first_length);
    EXPECT_EQ(name_of(parameter, first_length), first) << "asking again keeps nothing more";
    ASSERT_EQ(Prepare("select 1 as another_name_that_is_long_too from dual"), 0);
    ASSERT_EQ(Execute(0), 0);
    ASSERT_EQ(Answer(OCIParamGet(stmt, OCI_HTYPE_STMT, err, &parameter, 1)), 0);
    const char* const second = name_of(parameter, second_length);
    ASSERT_EQ(OCIDescriptorFree(parameter, OCI_DTYPE_PARAM), OCI_SUCCESS);
    EXPECT_EQ(std::string(first, first_length), "A_NAME_LONGER_THAN_A_SHORT_ONE");
    EXPECT_EQ(std::string(second, second_length), "ANOTHER_NAME_THAT_IS_LONG_TOO");
}

// Each set toggles, a null as well; server and service context show the same.
TEST_F(Handles, NonBlockingModeToggles) {
    OCIServer* server = nullptr;
    ASSERT_EQ(Answer(OCIAttrGet(svc, OCI_HTYPE_SVCCTX, &server, nullptr, OCI_ATTR_SERVER, err)), 0);
    ub1 one = 1;
    const struct { dvoid* handle; ub4 type; ub1* value; ub1 mode; } cases[] = {
        {server, OCI_HTYPE_SERVER, nullptr, 1}, {server, OCI_HTYPE_SERVER, &one, 0}, {svc, OCI_HTYPE_SVCCTX, &one, 1},
        {svc, OCI_HTYPE_SVCCTX, nullptr, 0}};
    for (const auto& c : cases) {
        ASSERT_EQ(Answer(OCIAttrSet(c.handle, c.type, c.value, 0, OCI_ATTR_NONBLOCKING_MODE, err)), 0);
        EXPECT_EQ(Attribute<ub1>(OCI_ATTR_NONBLOCKING_MODE, server, OCI_HTYPE_SERVER), c.mode);
        EXPECT_EQ(Attribute<ub1>(OCI_ATTR_NONBLOCKING_MODE, svc, OCI_HTYPE_SVCCTX), c.mode);
    }
    auto* const bare = New<OCISvcCtx>(OCI_HTYPE_SVCCTX);
    EXPECT_EQ(Answer(OCIAttrSet(bare, OCI_HTYPE_SVCCTX, nullptr, 0, OCI_ATTR_NONBLOCKING_MODE, err)), 3114);
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

TEST(HandlesInMidCall, FreedByAMemoryFunction) {
    for (const bool statement_too : {false, true}) {
        Saboteur saboteur;
        OCIEnv* env = nullptr;
        ASSERT_EQ(OCIEnvCreate(&env, OCI_DEFAULT, &saboteur, Saboteur::Allocate, nullptr, Saboteur::Release, 0, nullptr),
                  OCI_SUCCESS);
        const auto text = [](const char* chars) { return reinterpret_cast<const OraText*>(chars); };
        OCIError* err = nullptr;
        OCISvcCtx* svc = nullptr;
        OCIStmt* stmt = nullptr;
        OCIDefine* define = nullptr;
        auto string = std::make_unique<OCIString*>(nullptr);
        auto indicator = std::make_unique<sb2>(sb2{0});
        OCIHandleAlloc(env, reinterpret_cast<dvoid**>(&err), OCI_HTYPE_ERROR, 0, nullptr);
        ASSERT_EQ(OCILogon(env, err, &svc, nullptr, 0, nullptr, 0, text(":memory:"), 8), OCI_SUCCESS);
        OCIHandleAlloc(env, reinterpret_cast<dvoid**>(&stmt), OCI_HTYPE_STMT, 0, nullptr);
        ASSERT_EQ(OCIStmtPrepare(stmt, err, text("select 'abc' from dual"), 22, OCI_NTV_SYNTAX, OCI_DEFAULT), OCI_SUCCESS);
        ASSERT_EQ(OCIStmtExecute(svc, stmt, err, 0, 0, nullptr, nullptr, OCI_DEFAULT), OCI_SUCCESS);
        ASSERT_EQ(OCIDefineByPos(stmt, &define, err, 1, string.get(), 8, SQLT_VST, indicator.get(), nullptr, nullptr,
                                 OCI_DEFAULT), OCI_SUCCESS);
        saboteur.type = statement_too ? OCI_HTYPE_STMT : OCI_HTYPE_DEFINE;
        saboteur.victim = statement_too ? static_cast<dvoid*>(stmt) : define;
        EXPECT_EQ(OCIStmtFetch(stmt, err, 1, OCI_FETCH_NEXT, OCI_DEFAULT), OCI_ERROR);
        EXPECT_EQ(*string, nullptr) << "the define's memory is the application's again";
        EXPECT_EQ(OCIStmtFetch(stmt, err, 1, OCI_FETCH_NEXT, OCI_DEFAULT), statement_too ? OCI_INVALID_HANDLE : OCI_ERROR);
        OCILogoff(svc, err);
        EXPECT_EQ(OCIHandleFree(env, OCI_HTYPE_ENV), OCI_SUCCESS);
        EXPECT_EQ(OCI_memGetMemCount(), 0);
    }
}

}  // namespace
