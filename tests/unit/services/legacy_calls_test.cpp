// The version-7 calls: the numbers that they answer, and what they leave in areas and elements. On a private database in
// memory or, with KELP_TEST_ENGINE=postgres, on the server of the test run.
#include <gtest/gtest.h>

#include <array>
#include <chrono>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <memory>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

#include "kelpci.h"
#include "oci.h"
#include "oci_legacy.h"
#include "support/at_once.h"
#include "support/must.h"
#include "support/postgres_database.h"

namespace {

using namespace std::chrono_literals;
using Clock = std::chrono::steady_clock;

text* T(const char* characters) { return reinterpret_cast<text*>(const_cast<char*>(characters)); }

class LegacyCalls : public ::testing::Test {
protected:
    void SetUp() override {
        std::memset(&unknown, 0x5A, sizeof unknown);
        const char* const engine = std::getenv("KELP_TEST_ENGINE");
        if (engine && std::string_view(engine) == "postgres") {
            server = std::make_unique<PostgresDatabase>();
            database = server->Url();
            user = server->Owner() + "/secret";
        }
        MUST(LogOn(lda), oopen(&cda, &lda, nullptr, -1, -1, nullptr, -1));
        ASSERT_EQ(Parse("create table t (n integer, c varchar2(10))", 0), 0);
    }
    void TearDown() override {
        EXPECT_EQ(ologof(&lda), 0);
        EXPECT_EQ(OCI_memGetMemCount(), 0) << "blocks left behind";
    }

    sword LogOn(Lda_Def& area, ub4 mode = 0) {
        return olog(&area, host.data(), T(user.c_str()), -1, nullptr, 0, T(database.c_str()), -1, mode);
    }
    sword Parse(const char* sql, sword deferred = 1) { return oparse(&cda, T(sql), -1, deferred, 2); }
    sword Run(const char* sql) {
        const sword parsed = Parse(sql);
        return parsed != 0 ? parsed : oexec(&cda);
    }
    // The first value of a query.
    int One(const char* sql) {
        int value = -1;
        SHOULD(Parse(sql), Define(1, &value, 4, SQLT_INT));
        EXPECT_EQ(oexfet(&cda, 1, 1, 0), 0) << sql;
        return value;
    }
    sword Bind(const char* name, void* value, sword length, sword type) {
        return obndrv(&cda, T(name), -1, static_cast<ub1*>(value), length, type, -1, nullptr, nullptr, -1, -1);
    }
    sword Define(sword position, void* value, sword length, sword type, sb2* ind = nullptr, ub2* codes = nullptr) {
        return odefin(&cda, position, static_cast<ub1*>(value), length, type, -1, ind, nullptr, -1, -1, nullptr, codes);
    }
    // Rows 1, 2, ... with texts "r1", "r2", ...
    void Fill(sword rows) {
        std::vector<int> numbers;
        std::vector<std::array<char, 4>> texts;
        for (int row = 1; row <= rows; ++row) {
            numbers.push_back(row);
            texts.push_back({'r', static_cast<char>('0' + row), 0, 0});
        }
        ASSERT_EQ(Parse("insert into t values (:1, :text)"), 0);
        ASSERT_EQ(obndrn(&cda, 1, reinterpret_cast<ub1*>(numbers.data()), 4, SQLT_INT, -1, nullptr, nullptr, -1, -1), 0);
        MUST(Bind("text", texts.data(), 4, SQLT_STR), oexn(&cda, rows, 0));
        ASSERT_EQ(cda.rpc, static_cast<ub4>(rows));
    }

    std::unique_ptr<PostgresDatabase> server;
    std::string database = ":memory:", user;
    std::array<ub1, HDA_SIZE> host{};
    Lda_Def lda{};
    Cda_Def cda{}, unknown;
    int number = 0;
    std::array<char, 8> characters{};
};

TEST_F(LegacyCalls, AreasThatAreNotKnownAreNeitherReadNorWritten) {
    const Cda_Def before = unknown;
    for (Cda_Def* area : {&unknown, &lda}) {
        EXPECT_EQ(oparse(area, T("select 1 from dual"), -1, 0, 2), 1001);
        for (auto* call : {oexec, ofetch, ocan, oclose}) EXPECT_EQ(call(area), 1001);
    }
    for (Lda_Def* area : {&unknown, &cda})
        for (auto* call : {ologof, ocom, orol, ocon, ocof, obreak, onbset, onbclr, onbtst}) EXPECT_EQ(call(area), 1001);
    EXPECT_EQ(std::memcmp(&before, &unknown, sizeof unknown), 0);
    EXPECT_EQ(oopen(&unknown, &cda, nullptr, -1, -1, nullptr, -1), 1001);    // a maker: clears, and leaves rc
    EXPECT_EQ(std::make_tuple(unknown.rc, unknown.ose), std::make_tuple(1001, 0));
    EXPECT_EQ(LogOn(lda), 1015);
    Lda_Def other{};
    EXPECT_EQ(opinit(1), 0);
    EXPECT_EQ(olog(&other, nullptr, nullptr, 0, nullptr, 0, T(":memory:"), 8, 0), 24301);
    EXPECT_EQ(olog(&other, host.data(), nullptr, -2, nullptr, 0, T(":memory:"), 8, 0), 1025);
    EXPECT_EQ(opinit(0), 0);
}

// Arguments and answers that scripts neither give nor see.
TEST_F(LegacyCalls, BesideTheTranscripts) {
    if (!server) {
        EXPECT_EQ(Run("insert into t (rowid, n) values (1 * 65536 * 65536 * 65536 + 131075, 1)"), 0);
        EXPECT_EQ(std::make_tuple(cda.rid.rd.rcs5, cda.rid.rcs7, cda.rid.rcs8), std::make_tuple(1, 2u, 3));
    }
    ub4 count = 5;
    EXPECT_EQ(odessp(&lda, T("p"), 1, nullptr, 0, nullptr, 0, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr,
                     nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, &count), 4043);
    EXPECT_EQ(count, 0u);
    ASSERT_EQ(Parse("select -987.65, 'abcdef' from dual where :v is null"), 0);
    for (const sword type : {65536 + SQLT_CHR, -1}) EXPECT_EQ(Bind("v", characters.data(), 8, type), 1024) << type;
    EXPECT_EQ(obindps(&cda, 1, T("v"), -1, nullptr, 10, SQLT_CHR, -1, nullptr, nullptr, nullptr, 0, 0, 0, -1, 0, nullptr,
                      nullptr, -1, -1), 1025);
    sb2 null = -1;
    EXPECT_EQ(obndrv(&cda, T("v"), -1, nullptr, 1, SQLT_CHR, -1, &null, nullptr, -1, -1), 0);
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
    MUST(obindps(&cda, 1, T("v"), -1, reinterpret_cast<ub1*>(values), 2, SQLT_CHR, -1, nulls.data(), lengths.data(),
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
    EXPECT_EQ(oerhms(&lda, 904, message.data(), 5), 0);
    EXPECT_STREQ(words, "[KEL");
    EXPECT_EQ(oerhms(nullptr, 942, message.data(), 0), 1009);
}

TEST_F(LegacyCalls, LocksAreWaitedForOrNot) {
    Lda_Def second{};
    Cda_Def holder{};
    const std::filesystem::path file =
        std::filesystem::temp_directory_path() / ("legacy_calls_" + std::to_string(getpid()));
    if (!server) {
        EXPECT_EQ(ologof(&lda), 0);
        database = file;
        MUST(LogOn(lda), oopen(&cda, &lda, nullptr, -1, -1, nullptr, -1));
        ASSERT_EQ(Run("create table t (n integer, c varchar2(10))"), 0);
    }
    MUST(Run("insert into t values (1, 'a')"), ocom(&lda), LogOn(second));
    ASSERT_EQ(oopen(&holder, &second, nullptr, -1, -1, nullptr, -1), 0);
    const auto hold = [&] {
        SHOULD(oparse(&holder, T("update t set c = 'b'"), -1, 1, 2), oexec(&holder));
    };
    hold();
    MUST(Parse("update t set c = 'c' where n = 1"), oopt(&cda, 2, 4));
    const auto start = Clock::now();
    EXPECT_EQ(oexec(&cda), 54);
    EXPECT_LT(Clock::now() - start, 1s);
    SHOULD(orol(&second), oexec(&cda));
    EXPECT_EQ(orol(&lda), 0);    // the wish is not taken back with it
    hold();
    EXPECT_EQ(oexec(&cda), 54);
    ASSERT_EQ(oopt(&cda, 2, 0), 0);
    EXPECT_EQ(cda.fc, 34);
    std::thread releasing([&] {
        std::this_thread::sleep_for(200ms);
        EXPECT_EQ(ocom(&second), 0);
    });
    EXPECT_EQ(oexec(&cda), 0);
    releasing.join();
    SHOULD(ocom(&lda), ologof(&second));
    if (server) return;
    for (const char* ending : {"", "-wal", "-shm", "-journal"}) std::filesystem::remove(file.string() + ending);
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
    ASSERT_EQ(OCILogon(env, err, &service, T(user.c_str()), static_cast<ub4>(server ? slash : 0), T("secret"),
                       server ? 6 : 0, T(database.c_str()), static_cast<ub4>(database.size())), 0);
    MUST(OCISvcCtxToLda(service, err, &lent), oopen(&cursor, &lent, nullptr, -1, -1, nullptr, -1));
    if (server) {
        MUST(oparse(&cursor, T("select pg_sleep(0.5)"), -1, 1, 2), onbset(&lent));
        EXPECT_EQ(oexec(&cursor), 3123);
        OCISvcCtx* back = nullptr;
        EXPECT_EQ(OCILdaToSvcCtx(&back, err, &lent), OCI_ERROR);
        EXPECT_EQ(lent.rc, 3127);
    }
    EXPECT_EQ(OCIHandleFree(service, OCI_HTYPE_SVCCTX), 0);
    EXPECT_EQ(oexec(&cursor), 1001);
    EXPECT_EQ(OCIHandleFree(env, OCI_HTYPE_ENV), 0);
}

// What an engine can leave unfinished is repeated until it is done; the embedded one ends every call.
TEST_F(LegacyCalls, CallsAreLeftUnfinished) {
    Fill(5);
    ASSERT_EQ(onbset(&lda), 0);
    int waits = 0;
    const auto finish = [&waits](auto call) {
        sword result = call();
        for (waits = 0; result == 3123; ++waits) result = call();
        return result;
    };
    int value = 0;
    ASSERT_EQ(Parse(server ? "select n from (select 7 as n, pg_sleep(0.3)) s" : "select max(n) + 2 from t"), 0);
    ASSERT_EQ(Define(1, &value, 4, SQLT_INT), 0);
    EXPECT_EQ(oexec(&cda), server ? 3123 : 0);
    if (server) {
        Cda_Def other{};
        EXPECT_EQ(cda.v2_rc, -3123);
        EXPECT_EQ(ofetch(&cda), 3127);
        EXPECT_EQ(ocan(&cda), 3127);
        EXPECT_EQ(oclose(&cda), 3127);
        EXPECT_EQ(oopen(&cda, &lda, nullptr, -1, -1, nullptr, -1), 3127) << "which would close it";
        EXPECT_EQ(oopen(&other, &lda, nullptr, -1, -1, nullptr, -1), 3127);
        for (auto* call : {ocom, orol, ologof, onbclr, onbtst}) EXPECT_EQ(call(&lda), 3127);
        EXPECT_EQ(finish([&] { return oexec(&cda); }), 0);
        EXPECT_GT(waits, 5);
    }
    EXPECT_EQ(finish([&] { return ofetch(&cda); }), 0);
    EXPECT_EQ(value, 7);
    EXPECT_EQ(finish([&] { return ofetch(&cda); }), 1403);
    EXPECT_EQ(cda.rpc, 1u);

    std::array<int, 5> numbers{};
    MUST(Parse("select n from t order by n"), Define(1, numbers.data(), 4, SQLT_INT));
    EXPECT_EQ(finish([&] { return oexfet(&cda, 5, 0, 1); }), 0);
    EXPECT_EQ(numbers, (std::array{1, 2, 3, 4, 5}));
    ASSERT_EQ(Parse("delete from t where n > :n"), 0);
    number = 3;
    MUST(Bind("n", &number, 4, SQLT_INT), finish([&] { return oexn(&cda, 1, 0); }));
    EXPECT_EQ(cda.rpc, 2u);
    if (!server) return;
    ASSERT_EQ(Parse("select 1 / 0 from t"), 0);
    EXPECT_EQ(finish([&] { return oexec(&cda); }), 1476);
    // A login whose connection is lost with its work ends all the same.
    ASSERT_EQ(Parse("delete from t where pg_terminate_backend(pg_backend_pid())"), 0);
    EXPECT_EQ(finish([&] { return oexec(&cda); }), 3113);
    EXPECT_EQ(ocom(&lda), 3114);
    EXPECT_EQ(ologof(&lda), 3114);
    EXPECT_EQ(ologof(&lda), 1001);
    ASSERT_EQ(LogOn(lda), 0);
}

TEST_F(LegacyCalls, ABreakEndsTheCallOnce) {
    const char* const kLong = server ? "select count(pg_sleep(20)) from t"
                                     : "with recursive r(n) as (select 1 union all select n + 1 from r) select count(*) from r";
    Fill(1);
    for (const bool blocks : {true, false}) {
        MUST((blocks ? onbclr : onbset)(&lda), Parse(kLong), Define(1, &number, 4, SQLT_INT));
        std::thread stopping([&] {
            std::this_thread::sleep_for(100ms);
            EXPECT_EQ(obreak(&lda), 0);
        });
        const auto start = Clock::now();
        sword result = 3123;
        while (result == 3123) result = oexfet(&cda, 1, 0, 0);
        EXPECT_EQ(result, 1013);
        EXPECT_LT(Clock::now() - start, 10s);
        stopping.join();
        ASSERT_EQ(onbclr(&lda), 0);
        EXPECT_EQ(One("select count(*) from t"), 1);
    }
}

// Logins share nothing.
TEST_F(LegacyCalls, AreasInTwoThreads) {
    AtOnce(4, [&](int thread) {
        std::array<ub1, HDA_SIZE> own_host{};
        Lda_Def login{};
        Cda_Def cursor{};
        int sum = 0;
        EXPECT_EQ(olog(&login, own_host.data(), T(user.c_str()), -1, nullptr, 0, T(database.c_str()), -1, thread % 2), 0);
        EXPECT_EQ(oopen(&cursor, &login, nullptr, -1, -1, nullptr, -1), 0);
        for (int round = 0; round < 20; ++round) {
            int value = 0;
            EXPECT_EQ(oparse(&cursor, T("select 1 + :n from dual"), -1, 1, 2), 0);
            EXPECT_EQ(obndrv(&cursor, T(":n"), -1, reinterpret_cast<ub1*>(&round), 4, SQLT_INT, -1, nullptr, nullptr, -1, -1), 0);
            EXPECT_EQ(odefin(&cursor, 1, reinterpret_cast<ub1*>(&value), 4, SQLT_INT, -1, nullptr, nullptr, -1, -1,
                             nullptr, nullptr), 0);
            sword result = 3123;
            while (result == 3123) result = oexfet(&cursor, 1, 0, 1);
            EXPECT_EQ(result, 0);
            sum += value;
        }
        EXPECT_EQ(sum, 210);
        SHOULD(oclose(&cursor), ologof(&login));
    });
}

}  // namespace
