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
    // The numbers of the rows that the last fetch delivered.
    std::string Delivered() {
        std::string rows;
        const ub4 count = RowsFetched();
        for (ub4 row = 0; row < count; ++row) rows += (row ? "," : "") + std::to_string(ids_[row]);
        return rows;
    }

    sb4 ids_[10] = {};
    char names_[10][12] = {};
    sb2 indicators_[10] = {};
    ub2 lengths_[10] = {}, codes_[10] = {};
};

TEST_F(Fetching, ArraysToTheEnd) {
    Open();
    EXPECT_EQ(Fetch(4), 0);
    EXPECT_EQ(Delivered(), "1,2,3,4");
    EXPECT_STREQ(names_[1], "row 2");
    EXPECT_EQ(lengths_[1], 5);
    EXPECT_EQ(indicators_[2], -1);
    EXPECT_EQ(codes_[2], 1405);
    EXPECT_EQ(lengths_[2], 0);
    EXPECT_EQ(State(), 2u);
    EXPECT_EQ(FetchCode(4), OCI_NO_DATA);
    EXPECT_EQ(Delivered(), "5,6,7");
    EXPECT_EQ(RowCount(), 7u);
    EXPECT_EQ(State(), 3u);
    EXPECT_EQ(Fetch(4), 1403) << "stays at the end";
    EXPECT_EQ(Delivered(), "");
}

TEST_F(Fetching, WhatIsWrongWithTheCall) {
    stmt = New<OCIStmt>(OCI_HTYPE_STMT);
    EXPECT_EQ(Answer(FetchCode()), 24338);
    EXPECT_EQ(Define(1, Int(ids_)), 24337);
    EXPECT_EQ(Bind(1, Int(ids_)), 24337);
    EXPECT_EQ(BindName(":a", Int(ids_)), 24337);
    Open();
    EXPECT_EQ(Fetch(1, OCI_FETCH_FIRST), 24391);
    EXPECT_EQ(Fetch(1, 0x77), 24391);
    EXPECT_EQ(Answer(OCIStmtFetch2(stmt, err, 1, OCI_FETCH_NEXT, 0, 8)), 24300);
    EXPECT_EQ(Fetch(0), 0) << "gives the rest up";
    EXPECT_EQ(Fetch(), 1002);
    MUST(Execute(0), Define(65535, Int(ids_)));
    EXPECT_EQ(Fetch(), 1007);
    for (const ub4 position : {0u, 65536u}) EXPECT_EQ(Define(position, Int(ids_)), 24308) << position;
    ASSERT_EQ(Query("select id from t", {}, 0), 0);
    EXPECT_EQ(Fetch(), 24374) << "no defines";
    EXPECT_EQ(Query("select * from missing", {}, 0), 942);
    EXPECT_EQ(Fetch(), 24374);
    MustRun("delete from t");
    EXPECT_EQ(Fetch(), 1002);
}

// The published table: rows are null or truncated, columns are whether indicators and return codes are given.
TEST_F(Fetching, NullsAndTruncation) {
    const struct { bool truncated, indicators, codes; sword rc; sb4 number; sb2 indicator; ub2 code; } cases[] = {
        {false, false, false, OCI_ERROR, 1405, 9, 9}, {false, false, true, OCI_ERROR, 1405, 9, 1405},
        {false, true, false, OCI_SUCCESS, 0, -1, 9}, {false, true, true, OCI_SUCCESS, 0, -1, 1405},
        {true, false, false, OCI_ERROR, 1406, 9, 9}, {true, true, false, OCI_ERROR, 1406, 5, 9},
        {true, false, true, OCI_SUCCESS_WITH_INFO, 24345, 9, 1406},
        {true, true, true, OCI_SUCCESS_WITH_INFO, 24345, 5, 1406}};
    for (const auto& c : cases) {
        const std::string shown = std::string(c.truncated ? "truncated" : "null") + (c.indicators ? " indicator" : "") +
                                  (c.codes ? " code" : "");
        char text[4] = "";
        sb2 indicator = 9;
        ub2 code = 9;
        ASSERT_EQ(Prepare(std::string("select name from t where id = ") + (c.truncated ? "1" : "3")), 0);
        ASSERT_EQ(Define(1, Text(text, c.indicators ? &indicator : nullptr, nullptr, c.codes ? &code : nullptr)), 0);
        const sword rc = ExecuteCode();
        EXPECT_EQ(rc, c.rc) << shown;
        EXPECT_EQ(Answer(rc), c.number) << shown;
        EXPECT_EQ(indicator, c.indicator) << shown;
        EXPECT_EQ(code, c.code) << shown;
        EXPECT_STREQ(text, c.truncated ? "row" : "") << shown;
    }
}

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

// The third row is null and there is no indicator: it fails, the rows before are delivered, those behind count on.
TEST_F(Fetching, BadRowInTheMiddle) {
    const struct { bool anew; ub4 rows; sb4 answer; ub4 fetched; ub4 count; const char* first; } cases[] = {
        {true, 2, 0, 2, 2, "row 1"}, {false, 2, 1405, 0, 3, "row 1"}, {false, 2, 0, 2, 5, "row 4"},
        {false, 2, 0, 2, 7, "row 6"}, {false, 2, 1403, 0, 7, "row 6"},
        {true, 5, 1405, 2, 3, "row 1"}, {false, 5, 1403, 4, 7, "row 4"}};
    for (const auto& c : cases) {
        ASSERT_EQ(c.anew ? Query("select name from t order by id", {Text(names_)}, 0) : 0, 0);
        EXPECT_EQ(Fetch(c.rows), c.answer) << c.rows << " to " << c.count;
        EXPECT_EQ(RowsFetched(), c.fetched) << c.rows << " to " << c.count;
        EXPECT_EQ(RowCount(), c.count) << c.rows;
        EXPECT_STREQ(names_[0], c.first) << c.rows << " to " << c.count;
    }
}

TEST_F(Fetching, ExactFetch) {
    const struct { ub4 rows; sword rc; sb4 number; sb4 fetch; } cases[] = {
        {7, OCI_SUCCESS, 0, 1002}, {6, OCI_ERROR, 1422, 24374}, {8, OCI_NO_DATA, 1403, 1002}};
    ASSERT_EQ(Query("select id from t order by id", {Int(ids_)}, 0), 0);
    for (const auto& c : cases) {
        const sword rc = ExecuteCode(c.rows, OCI_EXACT_FETCH);
        EXPECT_EQ(rc, c.rc) << c.rows;
        EXPECT_EQ(Answer(rc), c.number) << c.rows;
        EXPECT_EQ(State(), 3u) << c.rows;
        EXPECT_EQ(Fetch(), c.fetch) << c.rows;
    }
    MustRun("update t set name = case when id = 1 then '5' else 'x' end");
    EXPECT_EQ(Query("select to_number(name) from t where id < 3", {Int(ids_)}, 1, OCI_EXACT_FETCH), 1722) << "no row is told to be the last";
}

TEST_F(Fetching, Scrolling) {
    Open(OCI_STMT_SCROLLABLE_READONLY);
    const struct { ub4 rows; ub2 orientation; sb4 offset; sb4 answer; const char* delivered; ub4 position; } cases[] = {
        {2, OCI_FETCH_NEXT, 0, 0, "1,2", 2}, {1, OCI_FETCH_CURRENT, 0, 0, "2", 2}, {1, OCI_FETCH_LAST, 99, 0, "7", 7},
        {1, OCI_FETCH_NEXT, 0, 1403, "", 8}, {1, OCI_FETCH_PRIOR, 0, 0, "7", 7},
        {2, OCI_FETCH_ABSOLUTE, 3, 0, "3,4", 4}, {2, OCI_FETCH_RELATIVE, -2, 0, "2,3", 3},
        {1, OCI_FETCH_RELATIVE, -3, 1403, "", 0}, {1, OCI_DEFAULT, 0, 0, "1", 1}, {1, OCI_FETCH_PRIOR, 0, 1403, "", 0},
        {3, OCI_FETCH_FIRST, 5, 0, "1,2,3", 3}, {4, OCI_FETCH_ABSOLUTE, 6, 1403, "6,7", 7},
        {1, OCI_FETCH_ABSOLUTE, 0, 1403, "", 0}, {1, OCI_FETCH_ABSOLUTE, -1, 24389, "", 0},
        {1, OCI_FETCH_ABSOLUTE, 2000000000, 1403, "", 8}, {1, 0x80, 0, 24391, "", 8}};
    for (std::size_t index = 0; index < std::size(cases); ++index) {
        const auto& c = cases[index];
        EXPECT_EQ(Fetch(c.rows, c.orientation, c.offset), c.answer) << index;
        EXPECT_EQ(Delivered(), c.delivered) << index;
        EXPECT_EQ(Attribute<ub4>(OCI_ATTR_CURRENT_POSITION), c.position) << index;
        EXPECT_EQ(RowCount(), index < 2 ? 2u : 7u) << "as far as it went " << index;
    }
    EXPECT_EQ(Fetch(1, OCI_FETCH_ABSOLUTE, 3), 0);
    EXPECT_EQ(RowCount(), 7u);
    EXPECT_EQ(indicators_[0], -1);
    ASSERT_EQ(Query("select id from t order by id", {Int(ids_)}, 2, OCI_STMT_SCROLLABLE_READONLY), 0);
    EXPECT_EQ(Delivered(), "1,2") << "by the execute";
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

TEST_F(Fetching, DescriptionOfTheSelectList) {
    MustRun("create table c(n number(10,2), i integer not null, v varchar2(20), f char(3), d date, r raw(16), b clob)");
    ASSERT_EQ(Query("select n, i, v as \"Mixed\", f, d, r, b from c", {}, 0, OCI_DESCRIBE_ONLY), 0);
    const struct { const char* name; ub2 type, size; sb2 precision; sb1 scale; ub1 nullable; } columns[] = {
        {"N", SQLT_NUM, 22, 10, 2, 1}, {"I", SQLT_NUM, 22, 38, 0, 0}, {"Mixed", SQLT_CHR, OnServer() ? ub2{80} : ub2{20}, 0, 0, 1},
        {"F", SQLT_AFC, OnServer() ? ub2{12} : ub2{3}, 0, 0, 1}, {"D", SQLT_DAT, 7, 0, 0, 1}, {"R", SQLT_BIN, OnServer() ? ub2{4000} : ub2{16}, 0, 0, 1},
        {"B", SQLT_CLOB, 4000, 0, 0, 1}};
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_PARAM_COUNT), std::size(columns));
    for (ub4 position = 1; position <= std::size(columns); ++position) {
        const auto& column = columns[position - 1];
        dvoid* const parameter = Column(position);
        const auto told = [&](auto value, ub4 attribute) {
            EXPECT_EQ(Attribute<decltype(value)>(attribute, parameter, OCI_DTYPE_PARAM), value) << column.name;
        };
        EXPECT_EQ(ColumnName(parameter), column.name);
        told(column.type, OCI_ATTR_DATA_TYPE);
        told(column.size, OCI_ATTR_DATA_SIZE);
        told(column.precision, OCI_ATTR_PRECISION);
        told(column.scale, OCI_ATTR_SCALE);
        told(column.nullable, OCI_ATTR_IS_NULL);
        EXPECT_EQ(Column(position), parameter) << "asking often leaves nothing behind";
        EXPECT_EQ(OCIDescriptorFree(parameter, OCI_DTYPE_PARAM), OCI_SUCCESS);
    }
    dvoid* none = nullptr;
    for (const ub4 position : {0u, 8u})
        EXPECT_EQ(Answer(OCIParamGet(stmt, OCI_HTYPE_STMT, err, &none, position)), 24334);
}

}  // namespace
