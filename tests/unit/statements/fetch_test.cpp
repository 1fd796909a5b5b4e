// Fetching: arrays, indicators and codes, orientations, exact fetches, and the descriptions of columns.
#include "support/statement_fixture.h"

namespace {

class Fetching : public StatementTest {
protected:
    void SetUp() override {
        StatementTest::SetUp();
        MustRun("create table t(id number, name varchar2(40))",
                "insert into t values(1, 'row 1'), (2, 'row 2'), (3, null), (4, 'row 4'), (5, 'row 5'), (6, 'row 6'), "
                "(7, 'row 7')");
    }
    void Open(ub4 mode = OCI_DEFAULT) {
        ASSERT_EQ(Query("select id, name from t order by id",
                        {Int(ids_), Text(names_, indicators_, lengths_, codes_)}, 0, mode), 0);
    }

    sb4 ids_[10] = {};
    char names_[10][12] = {};
    sb2 indicators_[10] = {};
    ub2 lengths_[10] = {}, codes_[10] = {};
};

// The longest value whose length an indicator can tell, and the longest that a length can.
TEST_F(Fetching, LengthsAtTheirLimits) {
    const struct { int whole; sb4 room; sb4 answer; sb2 indicator; ub2 length; } cases[] = {
        {32766, 10, 24345, 32766, 10}, {32767, 10, 24345, 32767, 10}, {32768, 10, 24345, -2, 10},
        {65534, 200000, 0, 0, 65534}, {65535, 200000, 0, 0, 65535}, {65536, 200000, 0, 0, 65535},
        {100003, 200000, 0, 0, 65535}, {100003, 70000, 24345, -2, 65535}};
    for (const auto& c : cases) {
        std::string area(static_cast<std::size_t>(c.room), '#');
        sb2 indicator = 9;
        ub2 code = 0, length = 9;
        EXPECT_EQ(Query("select printf('%.*c', " + std::to_string(c.whole) + ", 'x') from dual",
                        {{area.data(), c.room, SQLT_CHR, &indicator, &length, &code}}), c.answer)
            << c.whole << " in " << c.room;
        EXPECT_EQ(indicator, c.indicator) << c.whole << " in " << c.room;
        EXPECT_EQ(length, c.length) << c.whole << " in " << c.room;
    }
}

TEST_F(Fetching, DefinesMayBeMadeAnewAndFreed) {
    Open();
    ASSERT_EQ(Fetch(1), 0);
    sb8 wide = 0;
    ASSERT_EQ(Define(1, Int(wide)), 0) << "another type between fetches";
    ASSERT_EQ(Fetch(1), 0);
    EXPECT_EQ(wide, 2);
    OCIDefine* define = nullptr;
    double real = 0;
    MUST(Define(&define, 1, {&real, 8, SQLT_FLT}), OCIHandleFree(define, OCI_HTYPE_DEFINE));
    wide = -1;
    ASSERT_EQ(Fetch(1), 0) << "the other column is still defined";
    EXPECT_EQ(wide, -1);
    EXPECT_EQ(real, 0);
}

// Of several columns, an error in one tells more than a truncation in another, whichever comes first.
TEST_F(Fetching, TheGravestOfARow) {
    for (const bool cut_first : {true, false}) {
        char text[3] = "";
        ub2 code = 0;
        sb1 small = 0;
        ASSERT_EQ(Prepare(cut_first ? "select 'abcdef', 1000 from dual" : "select 1000, 'abcdef' from dual"), 0);
        ASSERT_EQ(Define(cut_first ? 1 : 2, Text(text, nullptr, nullptr, &code)), 0);
        ASSERT_EQ(Define(cut_first ? 2 : 1, Int(small)), 0);
        EXPECT_EQ(Execute(1), 1455) << cut_first;
        EXPECT_EQ(code, 1406) << "the other column is stored all the same";
    }
}

// ---- Columns

TEST_F(Fetching, AColumnAskedForOftenLeavesNothingBehind) {
    ASSERT_EQ(Query("select id as \"Mixed\" from t", {}, 0, OCI_DESCRIBE_ONLY), 0);
    dvoid* const parameter = Column(1);
    EXPECT_EQ(ColumnName(parameter), "Mixed");
    EXPECT_EQ(Column(1), parameter);
    EXPECT_EQ(OCIDescriptorFree(parameter, OCI_DTYPE_PARAM), OCI_SUCCESS);
}

}  // namespace
