// The version-7 calls, and the ways between their logins and service contexts.
#include <array>

#include "faults/world.h"
#include "oci_legacy.h"

namespace faults {
namespace {

text* Words(const char* words) { return reinterpret_cast<text*>(const_cast<char*>(words)); }

// They live until the scenario is over.
struct Areas {
    std::array<ub1, HDA_SIZE> host{};
    Lda_Def login{};
    Cda_Def cursor{};
};

// A call that answers a number: that, or 1019 without memory.
template <class Call>
void Number(World& w, const char* name, Call call, sword expected = 0) {
    sword number = 0;
    w.Step(name, [&] { return (number = call()) == kOutOfMemory ? OCI_ERROR : OCI_SUCCESS; }, Told::code);
    EXPECT_EQ(number, expected) << name;
}
#define NUMBER(expected, function, ...) Number(w, #function, [&] { return function(__VA_ARGS__); }, expected)

Areas& LogOn(World& w) {
    auto& areas = w.Kept<Areas>();
    NUMBER(0, olog, &areas.login, areas.host.data(), nullptr, 0, nullptr, 0, Words(":memory:"), -1, 0);
    w.AtEnd([&areas] {
        const sword answer = ologof(&areas.login);
        return answer == 1001 ? OCI_SUCCESS : answer;
    });
    NUMBER(0, oopen, &areas.cursor, &areas.login, nullptr, -1, -1, nullptr, -1);
    return areas;
}

void Parse(World& w, Areas& areas, const char* sql, sword deferred = 1) {
    NUMBER(0, oparse, &areas.cursor, Words(sql), -1, deferred, 2);
}

void BindValue(World& w, Areas& areas, const char* name, void* value, sword size, sword type) {
    NUMBER(0, obndrv, &areas.cursor, Words(name), -1, static_cast<ub1*>(value), size, type, -1, nullptr, nullptr, -1,
           -1);
}

// Undisturbed.
int Count(Areas& areas) {
    int count = -1;
    EXPECT_EQ(oparse(&areas.cursor, Words("select count(*) from t"), -1, 1, 2), 0);
    EXPECT_EQ(odefin(&areas.cursor, 1, reinterpret_cast<ub1*>(&count), 4, SQLT_INT, -1, nullptr, nullptr, -1, -1,
                     nullptr, nullptr), 0);
    EXPECT_EQ(oexfet(&areas.cursor, 1, 1, 0), 0);
    return count;
}

// The area tells of the failure, too.
template <class Call>
void Bridged(const Areas& areas, Call call) {
    Attempt([&] { call(); }, [&] { EXPECT_EQ(areas.login.rc, kOutOfMemory); });
}

SCENARIO(CursorCalls, environment, nullptr, "hr;") {
    Areas& areas = LogOn(w);
    Parse(w, areas, "create table t (n integer unique, c long)", 0);
    int numbers[] = {1, 2, 3, 2};
    char texts[][4] = {"one", "two", "thr", "two"};
    Parse(w, areas, "insert into t values (:n, :c)");
    BindValue(w, areas, "n", numbers, 4, SQLT_INT);
    BindValue(w, areas, "c", texts, 4, SQLT_STR);
    NUMBER(0, oexn, &areas.cursor, 3, 0);
    NUMBER(0, ocom, &areas.login);
    Parse(w, areas, "select n, c from t order by n");
    sb4 length = 9;
    sb1 name[9];
    NUMBER(0, odescr, &areas.cursor, 2, nullptr, nullptr, name, &length, nullptr, nullptr, nullptr, nullptr);
    NUMBER(0, odefin, &areas.cursor, 1, reinterpret_cast<ub1*>(numbers), 4, SQLT_INT, -1, nullptr, nullptr, -1, -1,
           nullptr, nullptr);
    NUMBER(0, oexec, &areas.cursor);
    NUMBER(1403, ofen, &areas.cursor, 4);
    ub1 part[3];
    NUMBER(0, oflng, &areas.cursor, 2, part, 3, SQLT_LNG, nullptr, 1);
    w.See(std::string_view(reinterpret_cast<char*>(part), 2));
    NUMBER(0, oclose, &areas.cursor);
    NUMBER(0, ologof, &areas.login);
}

// All rows or none, whatever it is that fails.
SCENARIO(UndoneWhole, environment, nullptr, "0;3;4;4;") {
    Areas& areas = LogOn(w);
    Parse(w, areas, "create table t (n integer unique, c long)", 0);
    Parse(w, areas, "insert into t values (9, null)");
    NUMBER(0, oexec, &areas.cursor);
    int numbers[] = {1, 2, 3, 2};
    Parse(w, areas, "insert into t values (:n, null)");
    NUMBER(0, oopt, &areas.cursor, 0, 4);
    BindValue(w, areas, "n", numbers, 4, SQLT_INT);
    for (const sword rows : {4, 3}) {
        Attempt([&] { NUMBER(rows == 4, oexn, &areas.cursor, rows, 0); }, [&] {
            EXPECT_EQ(areas.cursor.rpc, 0u);
            EXPECT_LE(Count(areas), 1);    // 0: the engine had to roll the transaction back
        });
        w.See(areas.cursor.rpc);
    }
    w.See(Count(areas));
    ub4 length = 2;
    Parse(w, areas, "insert into t values (8, :c)");
    NUMBER(0, obindps, &areas.cursor, 0, Words("c"), -1, reinterpret_cast<ub1*>(&length), 10, SQLT_CHR, -1, nullptr,
           nullptr, nullptr, 0, 0, 0, 0, 0, nullptr, nullptr, -1, -1);
    Attempt([&] {
        for (int row = 0; row < 2; ++row) {
            NUMBER(3129, oexn, &areas.cursor, 2, 0);
            NUMBER(0, osetpi, &areas.cursor, OCI_ONE_PIECE, Words("ab"), &length);
        }
        NUMBER(1, oexn, &areas.cursor, 2, 0);
    }, [&] {
        EXPECT_EQ(ocan(&areas.cursor), 0);
        const int left = Count(areas);
        EXPECT_TRUE(left == 4 || left == 0) << left;
    });
    w.See(Count(areas));
}

SCENARIO(LoginToContext, environment, nullptr, "0;") {
    Areas& areas = LogOn(w);
    auto* service = w.New<OCISvcCtx>(OCI_HTYPE_SVCCTX);
    w.AtEnd([service, &w] {
        OCISvcCtx* again = service;    // a failure leaves it as it was
        return OCILogon(w.env, w.err, &again, nullptr, 0, nullptr, 0, World::Text(":memory:"), 8) + OCILogoff(service, w.err);
    });
    Bridged(areas, [&] { w.STEP(OCILdaToSvcCtx, &service, w.err, &areas.login); });
    w.STEP(OCITransCommit, service, w.err, OCI_DEFAULT);
    w.See(areas.login.rc);
}

SCENARIO(ContextToLogin, environment, nullptr, "1;") {
    auto& areas = w.Kept<Areas>();
    OCISvcCtx *service = nullptr, *back = nullptr;
    w.STEP(OCILogon, w.env, w.err, &service, nullptr, 0, nullptr, 0, World::Text(":memory:"), 8);
    w.AtEnd([&areas, service, &w] {
        OCISvcCtx* again = nullptr;
        (void)OCILdaToSvcCtx(&again, w.err, &areas.login);
        return OCILogoff(service, w.err);
    });
    Bridged(areas, [&] { w.STEP(OCISvcCtxToLda, service, w.err, &areas.login); });
    NUMBER(0, oopen, &areas.cursor, &areas.login, nullptr, -1, -1, nullptr, -1);
    Parse(w, areas, "create table t (n integer)", 0);
    Bridged(areas, [&] { w.STEP(OCILdaToSvcCtx, &back, w.err, &areas.login); });
    w.STEP(OCITransCommit, service, w.err, OCI_DEFAULT);
    w.See(back == service);
}

}  // namespace
}  // namespace faults
