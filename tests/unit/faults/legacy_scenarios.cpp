// The version-7 calls, and the ways between their logins and service contexts.
#include <algorithm>
#include <array>
#include <memory>

#include "faults/scenarios.h"
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

// A call that answers a number: one of those, or 1019 without memory.
template <class Call>
sword Number(World& w, const char* name, Call call, std::initializer_list<sword> expected = {0}) {
    sword number = 0;
    w.Step(name, [&] {
        number = call();
        return number == kOutOfMemory ? OCI_ERROR : OCI_SUCCESS;
    }, Told::code);
    EXPECT_NE(std::find(expected.begin(), expected.end(), number), expected.end()) << name << " answers " << number;
    return number;
}

std::shared_ptr<Areas> LogOn(World& w) {
    auto areas = std::make_shared<Areas>();
    Number(w, "olog", [&] {
        return olog(&areas->login, areas->host.data(), nullptr, 0, nullptr, 0, Words(":memory:"), -1, 0);
    });
    w.AtEnd([areas] {
        const sword answer = ologof(&areas->login);
        return answer == 1001 ? OCI_SUCCESS : answer;
    });
    Number(w, "oopen", [&] { return oopen(&areas->cursor, &areas->login, nullptr, -1, -1, nullptr, -1); });
    return areas;
}

void Parse(World& w, Areas& areas, const char* sql, sword deferred = 1) {
    Number(w, "oparse", [&] { return oparse(&areas.cursor, Words(sql), -1, deferred, 2); });
}

void BindValue(World& w, Areas& areas, const char* name, void* value, sword size, sword type) {
    Number(w, "obndrv", [&] {
        return obndrv(&areas.cursor, Words(name), -1, static_cast<ub1*>(value), size, type, -1, nullptr, nullptr, -1, -1);
    });
}

void DefineValue(World& w, Areas& areas, sword position, void* value, sword size, sword type) {
    Number(w, "odefin", [&] {
        return odefin(&areas.cursor, position, static_cast<ub1*>(value), size, type, -1, nullptr, nullptr, -1, -1,
                      nullptr, nullptr);
    });
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

void CursorCalls(World& w) {
    const auto areas = LogOn(w);
    Parse(w, *areas, "create table t (n integer unique, c long)", 0);
    int numbers[] = {1, 2, 3, 2};
    char texts[][4] = {"one", "two", "thr", "two"};
    Parse(w, *areas, "insert into t values (:n, :c)");
    BindValue(w, *areas, "n", numbers, 4, SQLT_INT);
    BindValue(w, *areas, "c", texts, 4, SQLT_STR);
    Number(w, "oexn", [&] { return oexn(&areas->cursor, 3, 0); });
    Number(w, "ocom", [&] { return ocom(&areas->login); });
    Parse(w, *areas, "select n, c from t order by n");
    sb4 length = 9;
    sb1 name[9];
    Number(w, "odescr", [&] {
        return odescr(&areas->cursor, 2, nullptr, nullptr, name, &length, nullptr, nullptr, nullptr, nullptr);
    });
    DefineValue(w, *areas, 1, numbers, 4, SQLT_INT);
    Number(w, "oexec", [&] { return oexec(&areas->cursor); });
    Number(w, "ofen", [&] { return ofen(&areas->cursor, 4); }, {1403});
    ub1 part[3];
    Number(w, "oflng", [&] { return oflng(&areas->cursor, 2, part, 3, SQLT_LNG, nullptr, 1); });
    w.See(std::string_view(reinterpret_cast<char*>(part), 2));
    Number(w, "oclose", [&] { return oclose(&areas->cursor); });
    Number(w, "ologof", [&] { return ologof(&areas->login); });
}

// All rows or none, whatever it is that fails.
void UndoneWhole(World& w) {
    const auto areas = LogOn(w);
    Parse(w, *areas, "create table t (n integer unique, c long)", 0);
    Parse(w, *areas, "insert into t values (9, null)");
    Number(w, "oexec", [&] { return oexec(&areas->cursor); });
    int numbers[] = {1, 2, 3, 2};
    Parse(w, *areas, "insert into t values (:n, null)");
    Number(w, "oopt", [&] { return oopt(&areas->cursor, 0, 4); });
    BindValue(w, *areas, "n", numbers, 4, SQLT_INT);
    for (const sword rows : {4, 3}) {
        Attempt([&] { Number(w, "oexn", [&] { return oexn(&areas->cursor, rows, 0); }, {rows == 4 ? 1 : 0}); }, [&] {
            EXPECT_EQ(areas->cursor.rpc, 0u);
            EXPECT_LE(Count(*areas), 1);    // 0: the engine had to roll the transaction back
        });
        w.See(areas->cursor.rpc);
    }
    w.See(Count(*areas));
    ub4 length = 2;
    Parse(w, *areas, "insert into t values (8, :c)");
    Number(w, "obindps", [&] {
        return obindps(&areas->cursor, 0, Words("c"), -1, reinterpret_cast<ub1*>(&length), 10, SQLT_CHR, -1, nullptr,
                       nullptr, nullptr, 0, 0, 0, 0, 0, nullptr, nullptr, -1, -1);
    });
    Attempt([&] {
        for (int row = 0; row < 2; ++row) {
            Number(w, "oexn", [&] { return oexn(&areas->cursor, 2, 0); }, {3129});
            Number(w, "osetpi", [&] { return osetpi(&areas->cursor, OCI_ONE_PIECE, Words("ab"), &length); });
        }
        Number(w, "oexn", [&] { return oexn(&areas->cursor, 2, 0); }, {1});
    }, [&] {
        EXPECT_EQ(ocan(&areas->cursor), 0);
        const int left = Count(*areas);
        EXPECT_TRUE(left == 4 || left == 0) << left;
    });
    w.See(Count(*areas));
}

// The area tells of the failure, too.
template <class Call>
void Bridged(const Areas& areas, Call call) {
    Attempt([&] { call(); }, [&] { EXPECT_EQ(areas.login.rc, kOutOfMemory); });
}

void LoginToContext(World& w) {
    const auto areas = LogOn(w);
    OCISvcCtx* service = nullptr;
    Bridged(*areas, [&] { w.STEP(OCILdaToSvcCtx, &service, w.err, &areas->login); });
    w.AtEnd([service, &w] { return OCILogoff(service, w.err); });
    w.STEP(OCITransCommit, service, w.err, OCI_DEFAULT);
    w.See(areas->login.rc);
}

void ContextToLogin(World& w) {
    auto areas = std::make_shared<Areas>();
    OCISvcCtx* service = nullptr;
    const char* const database = ":memory:";
    w.STEP(OCILogon, w.env, w.err, &service, nullptr, 0, nullptr, 0, World::Text(database), 8);
    w.AtEnd([service, areas, &w] {
        OCISvcCtx* back = nullptr;
        (void)OCILdaToSvcCtx(&back, w.err, &areas->login);
        return OCILogoff(service, w.err);
    });
    Bridged(*areas, [&] { w.STEP(OCISvcCtxToLda, service, w.err, &areas->login); });
    Number(w, "oopen", [&] { return oopen(&areas->cursor, &areas->login, nullptr, -1, -1, nullptr, -1); });
    Parse(w, *areas, "create table t (n integer)", 0);
    OCISvcCtx* back = nullptr;
    Bridged(*areas, [&] { w.STEP(OCILdaToSvcCtx, &back, w.err, &areas->login); });
    w.STEP(OCITransCommit, service, w.err, OCI_DEFAULT);
    w.See(back == service);
}

constexpr Scenario kScenarios[] = {
    {"CursorCalls", Ground::environment, nullptr, CursorCalls, "hr;"},
    {"UndoneWhole", Ground::environment, nullptr, UndoneWhole, "0;3;4;4;"},
    {"LoginToContext", Ground::environment, nullptr, LoginToContext, "0;"},
    {"ContextToLogin", Ground::environment, nullptr, ContextToLogin, "1;"},
};

}  // namespace

std::span<const Scenario> LegacyScenarios() { return kScenarios; }

}  // namespace faults
