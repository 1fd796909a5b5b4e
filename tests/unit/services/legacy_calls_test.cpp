// The version-7 calls: the numbers that they answer, and what they leave in areas and elements. On a private database in
// memory or, with KELP_TEST_ENGINE=postgres, on the server of the test run.
#include <array>
#include <chrono>
#include <thread>

#include "oci_legacy.h"
#include "support/at_once.h"
#include "support/call_fixture.h"

namespace {

using namespace std::chrono_literals;
using Clock = std::chrono::steady_clock;

// A login with a cursor.
struct Login {
    sword LogOn(const std::string& user, const std::string& database, ub4 mode = 0) {
        return olog(&lda, host.data(), Text(user), -1, nullptr, 0, Text(database), -1, mode);
    }
    sword Open() { return oopen(&cda, &lda, nullptr, -1, -1, nullptr, -1); }
    sword Parse(const char* sql, sword deferred = 1) { return oparse(&cda, Text(sql), -1, deferred, 2); }
    sword Run(const char* sql) {
        const sword parsed = Parse(sql);
        return parsed != 0 ? parsed : oexec(&cda);
    }
    sword Bind(const char* name, void* value, sword length, sword type) {
        return obndrv(&cda, Text(name), -1, static_cast<ub1*>(value), length, type, -1, nullptr, nullptr, -1, -1);
    }
    sword Define(sword position, void* value, sword length, sword type) {
        return odefin(&cda, position, static_cast<ub1*>(value), length, type, -1, nullptr, nullptr, -1, -1, nullptr,
                      nullptr);
    }
    // Until it is done, with the number of times that it was not.
    template <class Call>
    sword Finish(Call call) {
        sword result = call();
        for (waits = 0; result == 3123; ++waits) result = call();
        return result;
    }

    std::array<ub1, HDA_SIZE> host{};
    Lda_Def lda{};
    Cda_Def cda{};
    int waits = 0;
};

class LegacyCalls : public ::testing::Test, protected Login {
protected:
    void SetUp() override {
        std::memset(&unknown, 0x5A, sizeof unknown);
        const char* const engine = std::getenv("KELP_TEST_ENGINE");
        if (engine && std::string_view(engine) == "postgres") {
            server = std::make_unique<PostgresDatabase>();
            database = server->Url();
            user = server->Owner() + "/secret";
        }
        MUST(LogOn(user, database), Open(), Parse("create table t (n integer, c varchar2(10))", 0));
    }
    void TearDown() override {
        EXPECT_EQ(ologof(&lda), 0);
        EXPECT_EQ(OCI_memGetMemCount(), 0) << "blocks left behind";
    }
    using Login::Run;    // and not the base's

    std::unique_ptr<PostgresDatabase> server;
    std::string database = ":memory:", user;
    Cda_Def unknown;
    int number = 0;
    std::array<char, 8> characters{};
};

TEST_F(LegacyCalls, AreasThatAreNotKnownAreNeitherReadNorWritten) {
    const Cda_Def before = unknown;
    for (Cda_Def* area : {&unknown, &lda}) {
        EXPECT_EQ(oparse(area, Text("select 1 from dual"), -1, 0, 2), 1001);
        for (auto* call : {oexec, ofetch, ocan, oclose}) EXPECT_EQ(call(area), 1001);
    }
    for (Lda_Def* area : {&unknown, &cda})
        for (auto* call : {ologof, ocom, orol, ocon, ocof, obreak, onbset, onbclr, onbtst}) EXPECT_EQ(call(area), 1001);
    EXPECT_EQ(std::memcmp(&before, &unknown, sizeof unknown), 0);
    EXPECT_EQ(oopen(&lda, &lda, nullptr, -1, -1, nullptr, -1), 1001);
    EXPECT_EQ(LogOn(user, database), 1015);
    EXPECT_EQ(olog(&cda, reinterpret_cast<ub1*>(&unknown), Text(""), 0, nullptr, -1, nullptr, -1, 0), 1001);
    EXPECT_EQ(oopen(&unknown, &cda, nullptr, -1, -1, nullptr, -1), 1001);    // a maker: clears, and leaves rc
    EXPECT_EQ(std::make_tuple(unknown.rc, unknown.ose), std::make_tuple(1001, 0));
}

// Arguments and answers that scripts neither give nor see.
TEST_F(LegacyCalls, BesideTheTranscripts) {
    if (!server) {
        EXPECT_EQ(Run("insert into t (rowid, n) values (72623859790382856, 1)"), 0);
        EXPECT_EQ(std::make_tuple(cda.rid.rd.rcs5, cda.rid.rcs7, cda.rid.rcs8), std::make_tuple(0x0102, 0x03040506u, 0x0708));
    }
    ub4 count = 5;
    for (ub4* place : {&count, static_cast<ub4*>(nullptr)})
        EXPECT_EQ(odessp(&lda, Text("p"), 1, nullptr, 0, nullptr, 0, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr,
                         nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, place), 4043);
    EXPECT_EQ(count, 0u);
    ASSERT_EQ(Parse("select -987.65, 'abcdef' from dual where :v is null"), 0);
    for (const sword type : {65536 + SQLT_CHR, -1}) EXPECT_EQ(Bind("v", characters.data(), 8, type), 1024) << type;
    EXPECT_EQ(obindps(&cda, 1, Text("v"), -1, nullptr, 10, SQLT_CHR, -1, nullptr, nullptr, nullptr, 0, 0, 0, -1, 0, nullptr,
                      nullptr, -1, -1), 1025);
    EXPECT_EQ(obndrv(&cda, Text("v"), -1, nullptr, -1, SQLT_STR, -1, nullptr, nullptr, -1, -1), 1025);
    sb2 null = -1;
    EXPECT_EQ(obndrv(&cda, Text("v"), -1, nullptr, 1, SQLT_CHR, -1, &null, nullptr, -1, -1), 0);
    std::array<ub1, 3> packed{};
    EXPECT_EQ(odefin(&cda, 1, packed.data(), 3, SQLT_PDN, -1, nullptr, nullptr, -1, -1, nullptr, nullptr), 0);
    EXPECT_EQ(oexfet(&cda, 1, 0, 0), 0);
    EXPECT_EQ(packed, (std::array<ub1, 3>{0x00, 0x98, 0x8D})) << "without a scale";
    characters.fill('#');
    EXPECT_EQ(oflng(&cda, 2, reinterpret_cast<ub1*>(characters.data()), 4, SQLT_CHR, nullptr, 4), 0);
    EXPECT_EQ(std::string_view(characters.data(), 3), "ef#");
    EXPECT_EQ(oflng(&cda, 2, nullptr, 1, SQLT_CHR, nullptr, 0), 1009);
    sb4 length = 2;
    EXPECT_EQ(odescr(&cda, 2, nullptr, nullptr, reinterpret_cast<sb1*>(characters.data()), &length, nullptr, nullptr,
                     nullptr, nullptr), 0);
    EXPECT_EQ(characters[2], '#') << "not terminated";
    // Arrays whose values, indicators, lengths and codes lie at distances of their own.
    char values[] = "abcdef", fetched[] = "###############";
    std::array<sb2, 9> nulls{0, 7, 7, -1, -1, 7, 0, 7, 7};
    std::array<ub2, 9> lengths{1, 9, 2, 9, 2, 9, 9, 9, 9}, codes{};
    MUST(Run("delete from t"), Parse("insert into t (n, c) select count(*), :v from t"));
    MUST(obindps(&cda, 1, Text("v"), -1, reinterpret_cast<ub1*>(values), 2, SQLT_CHR, -1, nulls.data(), lengths.data(),
                 codes.data(), 2, 6, 4, 2, 0, nullptr, nullptr, -1, -1), oexn(&cda, 3, 0), Parse("select c from t order by n"));
    MUST(odefinps(&cda, 1, 1, reinterpret_cast<ub1*>(fetched), 2, SQLT_CHR, -1, nulls.data(), nullptr, -1, -1,
                  lengths.data(), codes.data(), 5, 4, 6, 8), oexfet(&cda, 3, 0, 0));
    EXPECT_STREQ(fetched, "a#########ef###");
    EXPECT_EQ(nulls, (std::array<sb2, 9>{0, 7, -1, -1, 0, 7, 0, 7, 7}));
    EXPECT_EQ(lengths, (std::array<ub2, 9>{1, 9, 2, 0, 2, 9, 2, 9, 9}));
    EXPECT_EQ(codes, (std::array<ub2, 9>{0, 0, 0, 0, 1405, 0, 0, 0, 0}));
}

TEST_F(LegacyCalls, TextsOfNumbers) {
    std::array<text, 512> message{};
    const auto* const words = reinterpret_cast<const char*>(message.data());
    EXPECT_EQ(Parse("select x from t", 0), 904);
    const std::string_view told = server ? "column \"x\" does not exist" : "no such column: x";
    for (const int code : {904, -904, 942}) {    // the last one, or another
        EXPECT_EQ(oerhms(&lda, code, message.data(), 512), 0);
        EXPECT_EQ(std::string_view(words).find(told) != std::string_view::npos, code != 942) << words;
    }
    EXPECT_EQ(Parse("select  x from t", 1), 0);
    cda.peo = 0;
    EXPECT_EQ(oexec(&cda), 904);
    EXPECT_EQ(cda.peo, 8);
    for (const sword size : {5, 1}) {
        EXPECT_EQ(oerhms(&lda, 904, message.data(), size), 0);
        EXPECT_STREQ(words, size == 5 ? "[KEL" : "");
    }
    EXPECT_EQ(oerhms(nullptr, 942, message.data(), 0), 1009);
}

// A context that goes while its session is lent waits for what is left unfinished.
TEST_F(LegacyCalls, AContextThatLendsItsSessionGoes) {
    OCIEnv* env = nullptr;
    ASSERT_EQ(OCIEnvCreate(&env, OCI_THREADED, nullptr, nullptr, nullptr, nullptr, 0, nullptr), 0);
    const auto make = [env](ub4 type) {
        dvoid* handle = nullptr;
        EXPECT_EQ(OCIHandleAlloc(env, &handle, type, 0, nullptr), 0);
        return handle;
    };
    auto* const err = static_cast<OCIError*>(make(OCI_HTYPE_ERROR));
    OCISvcCtx* service = nullptr;
    Lda_Def lent{};
    Cda_Def cursor{};
    EXPECT_EQ(OCISvcCtxToLda(static_cast<OCISvcCtx*>(make(OCI_HTYPE_SVCCTX)), err, &unknown), OCI_ERROR);
    EXPECT_EQ(unknown.rc, 3114);
    const std::size_t slash = user.find('/');
    ASSERT_EQ(OCILogon(env, err, &service, Text(user), static_cast<ub4>(server ? slash : 0), Text("secret"),
                       server ? 6 : 0, Text(database), static_cast<ub4>(database.size())), 0);
    for (const auto& [area, number] : {std::pair{static_cast<Lda_Def*>(nullptr), 21560}, {&cda, 1001}, {&lda, 1015}})
        EXPECT_EQ(OCISvcCtxToLda(service, err, area) == OCI_ERROR ? FirstCode(err) : 0, number);
    MUST(OCISvcCtxToLda(service, err, &lent), oopen(&cursor, &lent, nullptr, -1, -1, nullptr, -1));
    if (server) {
        MUST(oparse(&cursor, Text("select pg_sleep(0.5)"), -1, 1, 2), onbset(&lent));
        EXPECT_EQ(oexec(&cursor), 3123);
        OCISvcCtx* back = nullptr;
        EXPECT_EQ(OCILdaToSvcCtx(&back, err, &lent), OCI_ERROR);
        EXPECT_EQ(lent.rc, 3127);
    }
    EXPECT_EQ(OCIHandleFree(service, OCI_HTYPE_SVCCTX), 0);
    EXPECT_EQ(oexec(&cursor), 1001);
    EXPECT_EQ(OCIHandleFree(env, OCI_HTYPE_ENV), 0);
}

// What the server leaves unfinished is repeated until it is done; the embedded engine ends every call.
TEST_F(LegacyCalls, CallsAreLeftUnfinished) {
    int value = 0;
    MUST(Run("insert into t (n) values (1), (2), (3), (4), (5)"), onbset(&lda));
    if (!server) {
        MUST(Parse("select n from t"), Define(1, &value, 4, SQLT_INT), oexec(&cda), ofetch(&cda), ocom(&lda));
        return;
    }
    Cda_Def beside{};
    MUST(oopen(&beside, &lda, nullptr, -1, -1, nullptr, -1), oparse(&beside, Text("select 1"), -1, 1, 2));
    MUST(Parse("select n from (select 7 as n, pg_sleep(0.3)) s"), Define(1, &value, 4, SQLT_INT));
    EXPECT_EQ(oexec(&cda), 3123);
    EXPECT_EQ(oexec(&beside), 3127) << "which is another";
    EXPECT_EQ(cda.v2_rc, -3123);
    for (auto* call : {ofetch, ocan, oclose}) EXPECT_EQ(call(&cda), 3127);
    EXPECT_EQ(Open(), 3127) << "which would close it";
    Cda_Def other{};
    EXPECT_EQ(oopen(&other, &lda, nullptr, -1, -1, nullptr, -1), 3127);
    for (auto* call : {ocom, orol, ologof, onbclr, onbtst}) EXPECT_EQ(call(&lda), 3127);
    EXPECT_EQ(Finish([&] { return oexec(&cda); }), 0);
    EXPECT_GT(waits, 5);
    EXPECT_EQ(Finish([&] { return ofetch(&cda); }), 0);
    EXPECT_EQ(value, 7);
    EXPECT_EQ(Finish([&] { return ofetch(&cda); }), 1403);
    EXPECT_EQ(cda.rpc, 1u);
    std::array<int, 5> numbers{};
    MUST(Parse("select n from t order by n"), Define(1, numbers.data(), 4, SQLT_INT));
    EXPECT_EQ(Finish([&] { return oexfet(&cda, 5, 0, 1); }), 0);
    EXPECT_EQ(numbers, (std::array{1, 2, 3, 4, 5}));
    MUST(Parse("delete from t where n > 3"), Finish([&] { return oexn(&cda, 1, 0); }));
    EXPECT_EQ(cda.rpc, 2u);
    ASSERT_EQ(Parse("select 1 / 0 from t"), 0);
    EXPECT_EQ(Finish([&] { return oexec(&cda); }), 1476);
    ASSERT_EQ(Parse("select n,  x from t"), 0);
    EXPECT_EQ(Finish([&] { return oexec(&cda); }), 904);
    EXPECT_EQ(cda.peo, 11);
    // A login whose connection is lost with its work ends all the same.
    ASSERT_EQ(Parse("delete from t where pg_terminate_backend(pg_backend_pid())"), 0);
    EXPECT_EQ(Finish([&] { return oexec(&cda); }), 3113);
    EXPECT_EQ(ocom(&lda), 3114);
    EXPECT_EQ(ologof(&lda), 3114);
    EXPECT_EQ(ologof(&lda), 1001);
    ASSERT_EQ(LogOn(user, database), 0);
}

TEST_F(LegacyCalls, ABreakEndsTheCallOnce) {
    const char* const kLong = server ? "select count(pg_sleep(20)) from t"
                                     : "with recursive r(n) as (select 1 union all select n + 1 from r) select count(*) from r";
    MUST(Run("insert into t (n) values (1)"), ocom(&lda));
    for (const bool blocks : {true, false}) {
        MUST((blocks ? onbclr : onbset)(&lda), Parse(kLong), Define(1, &number, 4, SQLT_INT));
        std::thread stopping([&] {
            std::this_thread::sleep_for(100ms);
            EXPECT_EQ(obreak(&lda), 0);
        });
        const auto start = Clock::now();
        EXPECT_EQ(Finish([&] { return oexfet(&cda, 1, 0, 0); }), 1013);
        EXPECT_LT(Clock::now() - start, 10s);
        stopping.join();
        ASSERT_EQ(onbclr(&lda), 0);
        MUST(Parse("select n from t"), Define(1, &number, 4, SQLT_INT));
        EXPECT_EQ(oexfet(&cda, 1, 1, 0), 0);
    }
}

// Logins share nothing.
TEST_F(LegacyCalls, AreasInTwoThreads) {
    AtOnce(4, [&](int thread) {
        Login own;
        int sum = 0;
        SHOULD(own.LogOn(user, database, thread % 2), own.Open());
        for (int round = 0; round < 20; ++round) {
            int value = 0;
            SHOULD(own.Parse("select 1 + :n from dual"), own.Bind(":n", &round, 4, SQLT_INT),
                   own.Define(1, &value, 4, SQLT_INT));
            EXPECT_EQ(own.Finish([&] { return oexfet(&own.cda, 1, 0, 1); }), 0);
            sum += value;
        }
        EXPECT_EQ(sum, 210);
        SHOULD(oclose(&own.cda), ologof(&own.lda));
    });
}

}  // namespace
