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

TEST_F(LegacyCalls, AreasTellOfTheirCall) {
    EXPECT_EQ(onbtst(&lda), 3128);
    EXPECT_EQ(lda.v2_rc, -3128);
    Fill(2);
    EXPECT_EQ(Run("delete from t"), 0);
    EXPECT_EQ(std::make_tuple(cda.rpc, cda.rid.rcs7, cda.rid.rcs8), std::make_tuple(2u, 0u, 0));
    if (!server) {
        EXPECT_EQ(Run("insert into t (rowid, n) values (1 * 65536 * 65536 * 65536 + 131075, 1)"), 0);
        EXPECT_EQ(std::make_tuple(cda.rid.rd.rcs5, cda.rid.rcs7, cda.rid.rcs8), std::make_tuple(1, 2u, 3));
    }
    ub4 count = 5;
    EXPECT_EQ(odessp(&lda, T("p"), 1, nullptr, 0, nullptr, 0, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr,
                     nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, &count), 4043);
    EXPECT_EQ(count, 0u);
}

TEST_F(LegacyCalls, TextsAreParsedAtOnceOrLater) {
    EXPECT_EQ(oparse(&cda, T("select 1 from dual"), 0x7FFFFFFF, 0, 2), 0) << "its zero ends it";
    EXPECT_EQ(Parse("select n, x from t", 0), 904);
    EXPECT_EQ(std::make_tuple(cda.peo, cda.v2_rc), std::make_tuple(10, -904));
    EXPECT_EQ(oexec(&cda), 1003);
    EXPECT_EQ(Parse("select x from t"), 0);
    EXPECT_EQ(std::make_tuple(cda.ft, cda.peo), std::make_tuple(4, 0)) << "of this text";
    EXPECT_EQ(oexec(&cda), 904);
    EXPECT_EQ(cda.fc, 4);
    EXPECT_EQ(Parse("drop table t", 0), 0);    // runs, and the execute does not again
    EXPECT_EQ(oexec(&cda), 0);
    EXPECT_EQ(oexec(&cda), 942);
}

TEST_F(LegacyCalls, ColumnsAreDescribedUntilThereIsNone) {
    const sb4 bytes = server ? 40 : 10;    // the server counts characters
    sb4 size = 0, display = 0, length = 1;
    sb2 type = 0, nulls = 0;
    std::array<sb1, 4> name{'#', '#', '#', '#'};
    ASSERT_EQ(Parse("select n, c as ce from t"), 0);
    EXPECT_EQ(odescr(&cda, 2, &size, &type, name.data(), &length, &display, nullptr, nullptr, &nulls), 0);
    EXPECT_EQ(std::make_tuple(size, type, length, name[0], name[1], display, nulls),
              std::make_tuple(bytes, 1, 1, 'C', '#', bytes, 1));
    EXPECT_EQ(Define(3, &number, 4, SQLT_INT), 1007);    // at once, since it is compiled
    SHOULD(Define(1, &number, 4, SQLT_INT), oexec(&cda), ocan(&cda));
    EXPECT_EQ(Define(3, &number, 4, SQLT_INT), 1007);
    EXPECT_EQ(odescr(&cda, 1, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr), 0);
    sb2 scale = 0;
    SHOULD(Parse("select cast(n as number) from t"),
           odescr(&cda, 1, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, &scale, nullptr));
    EXPECT_EQ(scale, -127);
    ASSERT_EQ(Parse("select n from t"), 0);
    EXPECT_EQ(Define(2, &number, 4, SQLT_INT), 0);       // nobody knows yet
    EXPECT_EQ(oexec(&cda), 1007);
}

TEST_F(LegacyCalls, FetchesCountAndEnd) {
    Fill(5);
    ASSERT_EQ(Parse("select n, c from t order by n"), 0);
    EXPECT_EQ(ofetch(&cda), 1002);
    EXPECT_EQ(oexec(&cda), 0);
    std::array<int, 3> numbers{};
    SHOULD(Define(1, numbers.data(), 4, SQLT_INT), ofetch(&cda), ofen(&cda, 3));
    EXPECT_EQ(cda.rpc, 4u);
    EXPECT_EQ(numbers, (std::array{2, 3, 4}));
    EXPECT_EQ(ofen(&cda, 3), 1403);
    EXPECT_EQ(cda.v2_rc, 4);
    EXPECT_EQ(cda.rpc, 5u);
    SHOULD(oexec(&cda), ocan(&cda));
    EXPECT_EQ(ofetch(&cda), 1002);
    EXPECT_EQ(oexfet(&cda, 3, 0, 1), 1422);
    EXPECT_EQ(cda.rpc, 3u) << "as many as were asked for";
    EXPECT_EQ(ofetch(&cda), 1002);
    SHOULD(oexfet(&cda, 3, 0, 0), ofetch(&cda));
    EXPECT_EQ(numbers, (std::array{4, 2, 3})) << "the fourth, behind the first three";
}

TEST_F(LegacyCalls, RowsThatCannotBeStoredArePassedOver) {
    ASSERT_EQ(Parse("select 'abcdef', 1 from dual union all select null, 2 from dual union all select 'x', 3 from dual"), 0);
    sb2 indicator = 0;
    ub2 code = 0;
    SHOULD(Define(1, characters.data(), 3, SQLT_STR), oexec(&cda));
    for (const sword result : {1406, 1405, 0, 1403}) EXPECT_EQ(ofetch(&cda), result);
    EXPECT_EQ(cda.rpc, 1u);
    SHOULD(Define(1, characters.data(), 3, SQLT_STR, &indicator, &code), oexec(&cda), ofetch(&cda));
    EXPECT_EQ(std::make_tuple(cda.wrn, code, indicator), std::make_tuple(3, 1406, 6));
    EXPECT_EQ(ofetch(&cda), 0);
    EXPECT_EQ(std::make_tuple(cda.wrn, code, indicator), std::make_tuple(0, 1405, -1));
}

TEST_F(LegacyCalls, PackedDecimalsHaveAScale) {
    std::array<ub1, 3> packed{};
    ASSERT_EQ(Parse("select :v from dual"), 0);
    ASSERT_EQ(obndrv(&cda, T("v"), -1, packed.data(), 3, SQLT_PDN, 2, nullptr, nullptr, -1, -1), 0);
    for (const auto& [scale, digits] : {std::pair{2, 0x98765D}, {1, 0x09877D}, {0, 0x00988D}, {-1, 0x00988D}}) {
        packed = {0x98, 0x76, 0x5D};    // -987.65
        EXPECT_EQ(odefin(&cda, 1, packed.data(), 3, SQLT_PDN, scale, nullptr, nullptr, -1, -1, nullptr, nullptr), 0);
        EXPECT_EQ(oexfet(&cda, 1, 0, 0), 0);
        EXPECT_EQ(packed[0] << 16 | packed[1] << 8 | packed[2], digits) << scale;
    }
}

TEST_F(LegacyCalls, BindsAreByNameOrNumberAndOfPlainTypes) {
    ASSERT_EQ(Parse("insert into t values (:1, :text)"), 0);
    for (const sword type : {SQLT_CLOB, SQLT_CUR, SQLT_RDD, SQLT_VST, 91, 65536 + SQLT_CHR, -1}) {
        EXPECT_EQ(Bind(":text", characters.data(), 8, type), 1024) << type;
    }
    for (const sword type : {SQLT_INT, SQLT_FLT, SQLT_CHR, SQLT_BFLOAT}) {
        EXPECT_EQ(Bind(":text", characters.data(), -1, type), 1025) << type;
    }
    for (const sword type : {SQLT_STR, SQLT_NUM, SQLT_VNU, SQLT_DAT, SQLT_ODT}) {
        EXPECT_EQ(Bind(":text", host.data(), -1, type), 0) << type;
    }
    EXPECT_EQ(Bind(":text", nullptr, -1, SQLT_STR), 1025);
}

TEST_F(LegacyCalls, ValuesGoInPieces) {
    int context = 0;
    ub1 piece = 0;
    dvoid* told = nullptr;
    ub4 iteration = 9, index = 9, length = 3;
    ASSERT_EQ(Parse("insert into t values (1, :c)"), 0);
    const auto bind = [&](ub1 opcode, sb4 skip = 0) {
        return obindps(&cda, opcode, T(":c"), -1, reinterpret_cast<ub1*>(&context), 10, SQLT_CHR, -1, nullptr, nullptr,
                       nullptr, 0, 0, 0, skip, 0, nullptr, nullptr, -1, -1);
    };
    EXPECT_EQ(bind(1, -1), 1025);
    ASSERT_EQ(bind(0), 0);
    EXPECT_EQ(oexec(&cda), 3129);
    EXPECT_EQ(ofetch(&cda), 3127);
    EXPECT_EQ(ogetpi(&cda, &piece, &told, &iteration, &index), 0);
    EXPECT_EQ(std::make_tuple(told, iteration, index), std::make_tuple(static_cast<dvoid*>(&context), 0u, 0u));
    EXPECT_EQ(osetpi(&cda, OCI_FIRST_PIECE, T("abc"), &length), 0);
    EXPECT_EQ(oexec(&cda), 3129);
    SHOULD(osetpi(&cda, OCI_LAST_PIECE, T("def"), &length), oexec(&cda));
    EXPECT_EQ(cda.rpc, 1u);

    ASSERT_EQ(Parse("select c from t"), 0);
    ASSERT_EQ(odefinps(&cda, 0, 1, reinterpret_cast<ub1*>(&context), 10, SQLT_CHR, -1, nullptr, nullptr, -1, -1, nullptr,
                       nullptr, 0, 0, 0, 0), 0);
    ASSERT_EQ(oexec(&cda), 0);
    std::string whole;
    sword result = ofetch(&cda);
    for (int pieces = 0; result == 3130 && pieces < 3; ++pieces) {
        length = 4;
        SHOULD(ogetpi(&cda, &piece, &told, &iteration, &index), osetpi(&cda, piece, characters.data(), &length));
        result = ofetch(&cda);
        whole.append(characters.data(), length);
    }
    EXPECT_EQ(result, 0);
    EXPECT_EQ(whole, "abcdef");
    ASSERT_EQ(oexec(&cda), 0);
    EXPECT_EQ(ofetch(&cda), 3130);
    EXPECT_EQ(ocan(&cda), 0);
    EXPECT_EQ(ogetpi(&cda, &piece, &told, nullptr, nullptr), 24370);
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

TEST_F(LegacyCalls, PartsOfLongValues) {
    ASSERT_EQ(Run("create table l (n integer, c long, r raw(10))"), 0);
    ASSERT_EQ(Run("insert into l values (1, 'abcdefghij', hextoraw('00FF41'))"), 0);
    MUST(Run("insert into l values (2, null, null)"), Parse("select n, c, r from l order by n"));
    ub4 length = 9;
    std::string part(4, '#');
    const auto read = [&](sword position, sb4 offset, sb4 room = 4, sword type = 8) {
        part.assign(4, '#');
        return oflng(&cda, position, reinterpret_cast<ub1*>(part.data()), room, type, &length, offset);
    };
    EXPECT_EQ(read(2, 0), 1002);
    std::array<int, 2> numbers{};
    MUST(Define(1, numbers.data(), 4, SQLT_INT), oexec(&cda));
    EXPECT_EQ(read(2, 0), 1002);
    ASSERT_EQ(ofetch(&cda), 0);
    const struct { sword position; sb4 offset; std::string_view expected; } kParts[] = {
        {2, 0, "abcd"}, {2, 8, "ij##"}, {2, 10, "####"}, {2, 70000, "####"}, {3, 0, {"\0\xFF" "A#", 4}}, {3, 1, "\xFF" "A##"}};
    for (const auto& [position, offset, expected] : kParts) {
        EXPECT_EQ(read(position, offset), 0);
        EXPECT_EQ(part, expected);
        EXPECT_EQ(length, std::min<std::size_t>(4, expected.find('#')));
    }
    EXPECT_EQ(oflng(&cda, 2, nullptr, 0, 8, nullptr, 0), 0);
    const struct { sword position; sb4 offset, room; sword type, result; } kRefused[] = {
        {0, 0, 4, 8, 1007}, {4, 0, 4, 8, 1007}, {2, -1, 4, 8, 1025}, {2, 0, -1, 8, 1025}, {2, 0, 4, 112, 1024}};
    for (const auto& c : kRefused) EXPECT_EQ(read(c.position, c.offset, c.room, c.type), c.result) << c.position;
    EXPECT_EQ(cda.fc, 58);
    EXPECT_EQ(ofetch(&cda), 0);
    EXPECT_EQ(read(2, 0), 1405);
    EXPECT_EQ(ofetch(&cda), 1403);
    EXPECT_EQ(read(2, 0), 1002);
    EXPECT_EQ(oexec(&cda), 0);
    EXPECT_EQ(ofen(&cda, 2), 0);    // of several the last
    EXPECT_EQ(read(3, 0), 1405);
    EXPECT_EQ(oexec(&cda), 0);
    EXPECT_EQ(read(3, 0), 1002) << "of the former result";
    SHOULD(ofetch(&cda), ocan(&cda));
    EXPECT_EQ(read(3, 0), 1002);
}

TEST_F(LegacyCalls, ExecutesThatFailUndoARowOrAll) {
    MUST(Run("create unique index u on t (n)"), Run("insert into t values (9, null)"));
    std::array<int, 5> numbers{7, 1, 2, 1, 3};    // of which the first is passed over
    const auto insert = [&](sword rollback) {
        SHOULD(Parse("insert into t values (:n, null)"), oopt(&cda, rollback, 0));
        EXPECT_EQ(Bind("n", numbers.data(), 4, SQLT_INT), 0);
        return oexn(&cda, 5, 1);
    };
    EXPECT_EQ(insert(0), 1);
    EXPECT_EQ(cda.rpc, 0u);
    EXPECT_EQ(One("select count(*) from t"), 1);
    EXPECT_EQ(insert(2), 1);
    EXPECT_EQ(cda.rpc, 2u);
    EXPECT_EQ(One("select count(*) from t"), 3);
    EXPECT_EQ(orol(&lda), 0);
    EXPECT_EQ(insert(0), 1);    // the first of its transaction
    EXPECT_EQ(orol(&lda), 0);
    numbers[3] = 4;
    SHOULD(ocon(&lda), insert(0));
    EXPECT_EQ(cda.rpc, 4u);
    SHOULD(ocof(&lda), orol(&lda));
    EXPECT_EQ(One("select count(*) from t"), 4);

    // Values in pieces: the first row is done when the last one fails; nothing else runs in between.
    ASSERT_EQ(Parse("insert into t values (5, :c)"), 0);
    ASSERT_EQ(obindps(&cda, 0, T("c"), -1, reinterpret_cast<ub1*>(&number), 10, SQLT_CHR, -1, nullptr, nullptr, nullptr,
                      0, 0, 0, 0, 0, nullptr, nullptr, -1, -1), 0);
    Cda_Def other{};
    ASSERT_EQ(oopen(&other, &lda, nullptr, -1, -1, nullptr, -1), 0);
    ub4 length = 3;
    for (const bool given_up : {false, true}) {
        EXPECT_EQ(oexn(&cda, 2, 0), 3129);
        EXPECT_EQ(osetpi(&cda, OCI_ONE_PIECE, T("abc"), &length), 0);
        EXPECT_EQ(oexn(&cda, 2, 0), 3129);
        EXPECT_EQ(ocom(&lda), 3127);
        EXPECT_EQ(oparse(&other, T("delete from t"), -1, 1, 2), 3127);
        EXPECT_EQ(osetpi(&cda, OCI_ONE_PIECE, T("abc"), &length), 0);
        EXPECT_EQ(given_up ? ocan(&cda) : oexn(&cda, 2, 0), given_up ? 0 : 1);
        EXPECT_EQ(ocom(&lda), 0);
    }
    EXPECT_EQ(One("select count(*) from t"), 4);
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

// A session with handles: a context that lends it, or takes it over.
class LegacyBridges : public LegacyCalls {
protected:
    void SetUp() override {
        LegacyCalls::SetUp();
        ASSERT_EQ(OCIEnvCreate(&env, OCI_THREADED, nullptr, nullptr, nullptr, nullptr, 0, nullptr), 0);
        err = static_cast<OCIError*>(New(OCI_HTYPE_ERROR));
        stmt = static_cast<OCIStmt*>(New(OCI_HTYPE_STMT));
    }
    void TearDown() override {
        EXPECT_EQ(OCIHandleFree(env, OCI_HTYPE_ENV), 0);
        LegacyCalls::TearDown();
    }
    dvoid* New(ub4 type) {
        dvoid* handle = nullptr;
        EXPECT_EQ(OCIHandleAlloc(env, &handle, type, 0, nullptr), 0);
        return handle;
    }
    // The number of what a call on the handles answered.
    sword Number(sword code) {
        sb4 number = 0;
        if (code == OCI_SUCCESS || code == OCI_INVALID_HANDLE) return code;
        OCIErrorGet(err, 1, nullptr, &number, nullptr, 0, OCI_HTYPE_ERROR);
        return number;
    }
    sword ExecuteOn(OCISvcCtx* service, std::string_view sql) {
        EXPECT_EQ(OCIStmtPrepare(stmt, err, T(sql.data()), static_cast<ub4>(sql.size()), OCI_NTV_SYNTAX, 0), 0);
        return Number(OCIStmtExecute(service, stmt, err, 1, 0, nullptr, nullptr, 0));
    }
    int CountOn(OCISvcCtx* service) {
        int count = -1;
        OCIDefine* define = nullptr;
        EXPECT_EQ(OCIStmtPrepare(stmt, err, T("select count(*) from t"), 22, OCI_NTV_SYNTAX, 0), 0);
        EXPECT_EQ(OCIDefineByPos(stmt, &define, err, 1, &count, 4, SQLT_INT, nullptr, nullptr, nullptr, 0), 0);
        EXPECT_EQ(Number(OCIStmtExecute(service, stmt, err, 1, 0, nullptr, nullptr, 0)), 0);
        return count;
    }

    OCIEnv* env = nullptr;
    OCIError* err = nullptr;
    OCIStmt* stmt = nullptr;
    OCISvcCtx* none = nullptr;
};

TEST_F(LegacyBridges, ALoginBecomesAContext) {
    Fill(3);
    ASSERT_EQ(onbset(&lda), 0);
    EXPECT_EQ(OCILdaToSvcCtx(&none, err, &cda), OCI_INVALID_HANDLE);
    EXPECT_EQ(Number(OCILdaToSvcCtx(nullptr, err, &lda)), 21560);
    EXPECT_EQ(lda.rc, 21560);
    OCISvcCtx* taken = nullptr;
    ASSERT_EQ(OCILdaToSvcCtx(&taken, err, &lda), OCI_SUCCESS);
    EXPECT_EQ(lda.rc, 0);
    EXPECT_EQ(ocom(&lda), 1001);
    EXPECT_EQ(CountOn(taken), 3);
    ub1 mode = 0;
    EXPECT_EQ(OCIAttrGet(taken, OCI_HTYPE_SVCCTX, &mode, nullptr, OCI_ATTR_NONBLOCKING_MODE, err), 0);
    EXPECT_EQ(mode, 1);
    EXPECT_EQ(OCITransRollback(taken, err, 0), 0);
    EXPECT_EQ(CountOn(taken), 0);

    // Another's session moves into the living context, which ends the one that it had.
    ASSERT_EQ(LogOn(lda), 0);
    OCISvcCtx* const same = taken;
    EXPECT_EQ(OCILdaToSvcCtx(&taken, err, &lda), OCI_SUCCESS);
    EXPECT_EQ(taken, same);
    MUST(ExecuteOn(taken, "create table made (n integer)"), OCILogoff(taken, err), LogOn(lda));
}

TEST_F(LegacyBridges, AContextLendsItsSession) {
    OCISvcCtx* service = nullptr;
    Lda_Def lent{};
    const auto name = [&](OCISvcCtx** out) {
        const std::size_t slash = user.find('/');
        return OCILogon(env, err, out, T(user.c_str()), static_cast<ub4>(server ? slash : 0), T("secret"), server ? 6 : 0,
                        T(database.c_str()), static_cast<ub4>(database.size()));
    };
    auto* const idle = static_cast<OCISvcCtx*>(New(OCI_HTYPE_SVCCTX));
    EXPECT_EQ(Number(OCISvcCtxToLda(idle, err, &unknown)), 3114);
    EXPECT_EQ(unknown.rc, 3114);
    ASSERT_EQ(name(&service), 0);
    if (!server) {
        ASSERT_EQ(ExecuteOn(service, "create table t (n integer, c varchar2(10))"), 0);
    }
    EXPECT_EQ(Number(OCISvcCtxToLda(service, err, &lda)), 1015);
    MUST(ExecuteOn(service, "insert into t values (1, null)"), OCISvcCtxToLda(service, err, &lent));
    OCISession* session = nullptr;
    EXPECT_EQ(OCIAttrGet(service, OCI_HTYPE_SVCCTX, &session, nullptr, OCI_ATTR_SESSION, err), 0);
    EXPECT_EQ(Number(OCISessionEnd(service, err, static_cast<OCISession*>(New(OCI_HTYPE_SESSION)), 0)), 1012);
    for (const sword number : {Number(OCISvcCtxToLda(service, err, &unknown)), ExecuteOn(service, "delete from t"),
                               Number(OCITransCommit(service, err, 0)), Number(OCITransRollback(service, err, 0)),
                               Number(OCIPing(service, err, 0)), Number(OCIBreak(service, err)),
                               Number(OCILogoff(service, err)), Number(name(&service)),
                               Number(OCISessionEnd(service, err, session, 0)),
                               Number(OCIPasswordChange(service, err, T("u"), 1, T("o"), 1, T("n"), 1, OCI_AUTH))}) {
        EXPECT_EQ(number, 24406);
    }
    ub1 current = 9;
    EXPECT_EQ(OCIAttrGet(service, OCI_HTYPE_SVCCTX, &current, nullptr, OCI_ATTR_IN_V8_MODE, err), 0);
    EXPECT_EQ(current, 0);
    Cda_Def cursor{};
    ASSERT_EQ(oopen(&cursor, &lent, nullptr, -1, -1, nullptr, -1), 0);
    MUST(oparse(&cursor, T("insert into t values (2, null)"), -1, 1, 2), oexec(&cursor));
    OCISvcCtx* back = nullptr;
    EXPECT_EQ(OCILdaToSvcCtx(&back, err, &lent), 0);
    EXPECT_EQ(back, service);
    EXPECT_EQ(oexec(&cursor), 1001);
    EXPECT_EQ(CountOn(service), 2);
    EXPECT_EQ(OCITransRollback(service, err, 0), 0);
    EXPECT_EQ(CountOn(service), 0);
    // The end of the context is the end of the login.
    MUST(OCISvcCtxToLda(service, err, &lent), oopen(&cursor, &lent, nullptr, -1, -1, nullptr, -1));
    if (server) {    // which waits for what is left unfinished
        MUST(oparse(&cursor, T("select pg_sleep(0.5)"), -1, 1, 2), onbset(&lent));
        EXPECT_EQ(oexec(&cursor), 3123);
        EXPECT_EQ(Number(OCILdaToSvcCtx(&back, err, &lent)), 3127);
    }
    EXPECT_EQ(OCIHandleFree(service, OCI_HTYPE_SVCCTX), 0);
    EXPECT_EQ(oexec(&cursor), 1001);
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
