// The version-7 calls: the numbers that they answer, and what they leave in areas and elements.
#include <gtest/gtest.h>

#include <array>
#include <cstring>
#include <string>
#include <string_view>
#include <vector>

#include "kelpci.h"
#include "oci.h"
#include "oci_legacy.h"

namespace {

text* T(const char* characters) { return reinterpret_cast<text*>(const_cast<char*>(characters)); }

class LegacyCalls : public ::testing::Test {
protected:
    void SetUp() override {
        std::memset(&unknown, 0x5A, sizeof unknown);
        ASSERT_EQ(LogOn(lda), 0);
        ASSERT_EQ(oopen(&cda, &lda, nullptr, -1, -1, nullptr, -1), 0);
        ASSERT_EQ(Parse("create table t (n integer, c varchar2(10))", 0), 0);
    }
    void TearDown() override { EXPECT_EQ(ologof(&lda), 0); }

    sword LogOn(Lda_Def& area) {
        return olog(&area, host.data(), nullptr, 0, nullptr, 0, T(":memory:"), 8, 0);
    }
    sword Parse(const char* sql, sword deferred = 1) { return oparse(&cda, T(sql), -1, deferred, 2); }
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
        ASSERT_EQ(Bind("text", texts.data(), 4, SQLT_STR), 0);
        ASSERT_EQ(oexn(&cda, rows, 0), 0);
        ASSERT_EQ(cda.rpc, static_cast<ub4>(rows));
    }

    std::array<ub1, HDA_SIZE> host{};
    Lda_Def lda{};
    Cda_Def cda{};
    Cda_Def unknown;
    int number = 0;
    std::array<char, 8> characters{};
};

TEST_F(LegacyCalls, AreasThatAreNotKnownAreNeitherReadNorWritten) {
    const Cda_Def before = unknown;
    for (Cda_Def* area : {static_cast<Cda_Def*>(nullptr), &unknown, &lda}) {
        EXPECT_EQ(oparse(area, T("select 1 from dual"), -1, 0, 2), 1001);
        for (auto* call : {oexec, ofetch, ocan, oclose}) EXPECT_EQ(call(area), 1001);
    }
    for (Lda_Def* area : {static_cast<Lda_Def*>(nullptr), &unknown, &cda}) {
        for (auto* call : {ologof, ocom, orol, ocon, ocof, obreak, onbset, onbclr, onbtst}) EXPECT_EQ(call(area), 1001);
    }
    EXPECT_EQ(std::memcmp(&before, &unknown, sizeof unknown), 0);
    EXPECT_EQ(oopen(&unknown, &cda, nullptr, -1, -1, nullptr, -1), 1001);    // a maker: clears, and leaves rc
    EXPECT_EQ(unknown.rc, 1001);
    EXPECT_EQ(unknown.ose, 0);
    EXPECT_EQ(LogOn(lda), 1015);
    Lda_Def other{};
    EXPECT_EQ(olog(&other, nullptr, nullptr, 0, nullptr, 0, T(":memory:"), 8, 2), 24300);
    EXPECT_EQ(opinit(2), 24300);
    EXPECT_EQ(opinit(1), 0);
    EXPECT_EQ(olog(&other, nullptr, nullptr, 0, nullptr, 0, T(":memory:"), 8, 0), 24301);
    EXPECT_EQ(opinit(0), 0);
    sqllda(&other);
    EXPECT_EQ(other.rc, 1012);
    EXPECT_EQ(ocom(&other), 1001);
}

TEST_F(LegacyCalls, LoginsSwitchTheirModesAndEndTheirCursors) {
    EXPECT_EQ(onbtst(&lda), 3128);
    for (int times = 0; times < 2; ++times) EXPECT_EQ(onbset(&lda), 0);
    EXPECT_EQ(onbtst(&lda), 0);
    EXPECT_EQ(onbclr(&lda), 0);
    EXPECT_EQ(onbtst(&lda), 3128);
    EXPECT_EQ(lda.v2_rc, -3128);

    Fill(3);
    EXPECT_EQ(orol(&lda), 0);
    EXPECT_EQ(Parse("delete from t"), 0);
    EXPECT_EQ(oexec(&cda), 0);
    EXPECT_EQ(cda.rpc, 0u);
    EXPECT_EQ(ocon(&lda), 0);
    Fill(2);
    EXPECT_EQ(orol(&lda), 0);
    EXPECT_EQ(Parse("delete from t"), 0);
    EXPECT_EQ(oexec(&cda), 0);
    EXPECT_EQ(std::make_tuple(cda.rpc, cda.rid.rcs7, cda.rid.rcs8), std::make_tuple(2u, 0u, 0));
    ASSERT_EQ(Parse("insert into t (rowid, n) values (1 * 65536 * 65536 * 65536 + 131075, 1)"), 0);
    EXPECT_EQ(oexec(&cda), 0);
    EXPECT_EQ(std::make_tuple(cda.rid.rd.rcs5, cda.rid.rcs7, cda.rid.rcs8), std::make_tuple(1, 2u, 3));
    ub4 count = 5;
    EXPECT_EQ(odessp(&lda, T("p"), 1, nullptr, 0, nullptr, 0, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr,
                     nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, &count), 4043);
    EXPECT_EQ(count, 0u);

    EXPECT_EQ(ologof(&lda), 0);
    EXPECT_EQ(oexec(&cda), 1001);
    EXPECT_EQ(LogOn(lda), 0);
}

TEST_F(LegacyCalls, TextsAreParsedAtOnceOrLater) {
    EXPECT_EQ(oparse(&cda, nullptr, -1, 0, 2), 1009);
    EXPECT_EQ(oparse(&cda, T("select 1 from dual"), -1, 0, 3), 1025);
    EXPECT_EQ(oparse(&cda, T("select 1 from dual"), -2, 0, 2), 1025);
    EXPECT_EQ(oparse(&cda, T("select 1 from dual"), 0x7FFFFFFF, 0, 2), 0) << "its zero ends it";
    EXPECT_EQ(Parse("select n, x from t", 0), 904);
    EXPECT_EQ(cda.peo, 10);
    EXPECT_EQ(cda.v2_rc, -904);
    EXPECT_EQ(oexec(&cda), 1003);
    EXPECT_EQ(Parse("select x from t"), 0);
    EXPECT_EQ(cda.ft, 4);
    EXPECT_EQ(oexec(&cda), 904);
    EXPECT_EQ(cda.fc, 4);
    EXPECT_EQ(Parse("drop table t", 0), 0);    // runs, and the execute does not again
    EXPECT_EQ(oexec(&cda), 0);
    EXPECT_EQ(oexec(&cda), 942);
}

TEST_F(LegacyCalls, ColumnsAreDescribedUntilThereIsNone) {
    sb4 size = 0, display = 0, length = 1;
    sb2 type = 0, nulls = 0;
    std::array<sb1, 4> name{'#', '#', '#', '#'};
    ASSERT_EQ(Parse("select n, c as ce from t"), 0);
    EXPECT_EQ(odescr(&cda, 2, &size, &type, name.data(), &length, &display, nullptr, nullptr, &nulls), 0);
    EXPECT_EQ(std::make_tuple(size, type, length, name[0], name[1], display, nulls),
              std::make_tuple(10, 1, 1, 'C', '#', 10, 1));
    EXPECT_EQ(Define(3, &number, 4, SQLT_INT), 1007);    // at once, since it is compiled
    EXPECT_EQ(Define(1, &number, 4, SQLT_INT), 0);
    EXPECT_EQ(oexec(&cda), 0);
    EXPECT_EQ(ocan(&cda), 0);
    for (const sword position : {0, 3, 70000, -1}) {
        EXPECT_EQ(odescr(&cda, position, &size, &type, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr), 1007);
        EXPECT_EQ(Define(position, &number, 4, SQLT_INT), 1007);
    }
    EXPECT_EQ(odescr(&cda, 1, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr), 0);
    ASSERT_EQ(Parse("select n from t"), 0);
    EXPECT_EQ(Define(2, &number, 4, SQLT_INT), 0);       // nobody knows yet
    EXPECT_EQ(oexec(&cda), 1007);
}

TEST_F(LegacyCalls, FetchesCountAndEnd) {
    Fill(5);
    ASSERT_EQ(Parse("select n, c from t order by n"), 0);
    EXPECT_EQ(ofetch(&cda), 1002);
    EXPECT_EQ(oexec(&cda), 0);
    EXPECT_EQ(ofetch(&cda), 24374);
    std::array<int, 3> numbers{};
    EXPECT_EQ(Define(1, numbers.data(), 4, SQLT_INT), 0);
    EXPECT_EQ(ofen(&cda, 0), 24333);
    EXPECT_EQ(ofetch(&cda), 0);
    EXPECT_EQ(ofen(&cda, 3), 0);
    EXPECT_EQ(cda.rpc, 4u);
    EXPECT_EQ(numbers, (std::array{2, 3, 4}));
    EXPECT_EQ(ofen(&cda, 3), 1403);
    EXPECT_EQ(cda.v2_rc, 4);
    EXPECT_EQ(cda.rpc, 5u);
    EXPECT_EQ(ofetch(&cda), 1002);
    EXPECT_EQ(oexec(&cda), 0);
    EXPECT_EQ(ocan(&cda), 0);
    EXPECT_EQ(ofetch(&cda), 1002);
    struct { ub4 rows; sword cancel, exact, result; ub4 processed; sword next; } const kCases[] = {
        {0, 0, 0, 24333, 0, 1002}, {3, 0, 0, 0, 3, 0},    {3, 1, 0, 0, 3, 1002},
        {6, 0, 0, 1403, 5, 1002},  {3, 0, 1, 1422, 3, 1002}};
    numbers = {};
    std::array<int, 8> many{};
    EXPECT_EQ(Define(1, many.data(), 4, SQLT_INT), 0);
    for (const auto& c : kCases) {
        SCOPED_TRACE(c.rows);
        EXPECT_EQ(oexfet(&cda, c.rows, c.cancel, c.exact), c.result);
        EXPECT_EQ(cda.rpc, c.processed);
        EXPECT_EQ(ofetch(&cda), c.next);
    }
    EXPECT_EQ(oexfet(&cda, 5, 0, 1), 0);
    EXPECT_EQ(many[4], 5);
    ASSERT_EQ(Parse("delete from t"), 0);
    EXPECT_EQ(oexfet(&cda, 1, 0, 0), 1002);
}

TEST_F(LegacyCalls, RowsThatCannotBeStoredArePassedOver) {
    ASSERT_EQ(Parse("select 'abcdef', 1 from dual union all select null, 2 from dual union all select 'x', 3 from dual"), 0);
    sb2 indicator = 0;
    ub2 code = 0;
    EXPECT_EQ(Define(1, characters.data(), 3, SQLT_STR), 0);
    EXPECT_EQ(oexec(&cda), 0);
    for (const sword result : {1406, 1405, 0, 1403}) EXPECT_EQ(ofetch(&cda), result);
    EXPECT_EQ(cda.rpc, 1u);
    EXPECT_EQ(Define(1, characters.data(), 3, SQLT_STR, &indicator, &code), 0);
    EXPECT_EQ(oexec(&cda), 0);
    EXPECT_EQ(ofetch(&cda), 0);
    EXPECT_EQ(std::make_tuple(cda.wrn, code, indicator), std::make_tuple(3, 1406, 6));
    EXPECT_EQ(ofetch(&cda), 0);
    EXPECT_EQ(std::make_tuple(cda.wrn, code, indicator), std::make_tuple(0, 1405, -1));
}

TEST_F(LegacyCalls, BindsAreByNameOrNumberAndOfPlainTypes) {
    ASSERT_EQ(Parse("insert into t values (:1, :text)"), 0);
    EXPECT_EQ(oexec(&cda), 1008);
    EXPECT_EQ(Bind(":none", characters.data(), 8, SQLT_STR), 1036);
    for (const sword position : {0, 2}) {
        EXPECT_EQ(obndrn(&cda, position, host.data(), 4, SQLT_INT, -1, nullptr, nullptr, -1, -1), 1036);
    }
    for (const sword type : {SQLT_CLOB, SQLT_CUR, SQLT_RDD, SQLT_VST, 91, 70000, -1}) {
        EXPECT_EQ(Bind(":text", characters.data(), 8, type), 1024) << type;
    }
    for (const sword type : {SQLT_INT, SQLT_FLT, SQLT_CHR, SQLT_BFLOAT}) {
        EXPECT_EQ(Bind(":text", characters.data(), -1, type), 1025) << type;
    }
    for (const sword type : {SQLT_STR, SQLT_NUM, SQLT_VNU, SQLT_DAT, SQLT_ODT}) {
        EXPECT_EQ(Bind(":text", host.data(), -1, type), 0) << type;
    }
    EXPECT_EQ(obndrv(&cda, nullptr, 0, host.data(), 4, SQLT_INT, -1, nullptr, nullptr, -1, -1), 1009);
    EXPECT_EQ(oexn(&cda, 2, 2), 24333);
    ASSERT_EQ(Parse("create unique index u on t (n)", 0), 0);
    std::array<int, 4> numbers{7, 1, 2, 1};
    ASSERT_EQ(Parse("insert into t values (:n, null)"), 0);
    ASSERT_EQ(Bind("n", numbers.data(), 4, SQLT_INT), 0);
    EXPECT_EQ(oexn(&cda, 4, 1), 1);    // the third of its rows
    EXPECT_EQ(cda.rpc, 2u);
}

TEST_F(LegacyCalls, ValuesGoInPieces) {
    int context = 0;
    ub1 piece = 0;
    dvoid* told = nullptr;
    ub4 iteration = 9, index = 9, length = 3;
    ASSERT_EQ(Parse("insert into t values (1, :c)"), 0);
    EXPECT_EQ(ogetpi(&cda, &piece, &told, nullptr, nullptr), 24370);
    const auto bind = [&](ub1 opcode) {
        return obindps(&cda, opcode, T(":c"), -1, reinterpret_cast<ub1*>(&context), 10, SQLT_CHR, -1, nullptr, nullptr,
                       nullptr, 0, 0, 0, 0, 0, nullptr, nullptr, -1, -1);
    };
    EXPECT_EQ(bind(2), 1025);
    ASSERT_EQ(bind(0), 0);
    EXPECT_EQ(oexec(&cda), 3129);
    EXPECT_EQ(ofetch(&cda), 3127);
    EXPECT_EQ(ogetpi(&cda, &piece, &told, &iteration, &index), 0);
    EXPECT_EQ(std::make_tuple(told, iteration, index), std::make_tuple(static_cast<dvoid*>(&context), 0u, 0u));
    EXPECT_EQ(osetpi(&cda, OCI_FIRST_PIECE, T("abc"), &length), 0);
    EXPECT_EQ(oexec(&cda), 3129);
    EXPECT_EQ(osetpi(&cda, OCI_LAST_PIECE, T("def"), &length), 0);
    EXPECT_EQ(oexec(&cda), 0);
    EXPECT_EQ(cda.rpc, 1u);

    ASSERT_EQ(Parse("select c from t"), 0);
    ASSERT_EQ(odefinps(&cda, 0, 1, reinterpret_cast<ub1*>(&context), 10, SQLT_CHR, -1, nullptr, nullptr, -1, -1, nullptr,
                       nullptr, 0, 0, 0, 0), 0);
    ASSERT_EQ(oexec(&cda), 0);
    std::string whole;
    sword result = ofetch(&cda);
    for (int pieces = 0; result == 3130 && pieces < 3; ++pieces) {
        length = 4;
        EXPECT_EQ(ogetpi(&cda, &piece, &told, &iteration, &index), 0);
        EXPECT_EQ(osetpi(&cda, piece, characters.data(), &length), 0);
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
    EXPECT_EQ(oermsg(-1403, message.data()), 0);
    EXPECT_STREQ(words, "[KELP/CLIENT] ORA-01403: no data found\n");
    EXPECT_EQ(oermsg(1, nullptr), 1009);
    EXPECT_EQ(Parse("select x from t", 0), 904);
    EXPECT_EQ(oerhms(&lda, 904, message.data(), 512), 0);
    EXPECT_NE(std::string_view(words).find("no such column: x"), std::string_view::npos) << words;
    EXPECT_EQ(oerhms(&lda, 904, message.data(), 5), 0);
    EXPECT_STREQ(words, "[KEL");
    EXPECT_EQ(oerhms(nullptr, 942, message.data(), 0), 1009);
}

}  // namespace
