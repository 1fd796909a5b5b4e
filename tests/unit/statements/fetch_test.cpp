// Fetching: arrays, indicators and codes, orientations, exact fetches, pieces, and the descriptions of columns.
#include "support/statement_fixture.h"

namespace {

class Fetching : public StatementTest {
protected:
    void SetUp() override {
        StatementTest::SetUp();
        MustRun("create table t(id number, name varchar2(40))");
        for (int id = 1; id <= 7; ++id) {
            const std::string name = id == 3 ? "null" : "'row " + std::to_string(id) + "'";
            MustRun("insert into t values(" + std::to_string(id) + ", " + name + ")");
        }
    }
    void Open(ub4 mode = OCI_DEFAULT) {
        ASSERT_EQ(Prepare("select id, name from t order by id"), 0);
        ASSERT_EQ(Define(1, {ids_, 4, SQLT_INT}), 0);
        ASSERT_EQ(Define(2, {names_, sizeof names_[0], SQLT_STR, indicators_, lengths_, codes_}), 0);
        ASSERT_EQ(Execute(0, mode), 0);
    }
    // The rows that the last fetch delivered, like "1 row 1,2 row 2".
    std::string Delivered() {
        std::string rows;
        const ub4 count = Attribute<ub4>(OCI_ATTR_ROWS_FETCHED);
        for (ub4 row = 0; row < count; ++row) rows += (row ? "," : "") + std::to_string(ids_[row]);
        return rows;
    }

    sb4 ids_[10] = {};
    char names_[10][12] = {};
    sb2 indicators_[10] = {};
    ub2 lengths_[10] = {};
    ub2 codes_[10] = {};
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
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_STMT_STATE), 2u);
    EXPECT_EQ(OCIStmtFetch(stmt, err, 4, OCI_FETCH_NEXT, OCI_DEFAULT), OCI_NO_DATA);
    EXPECT_EQ(Delivered(), "5,6,7");
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROW_COUNT), 7u);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_STMT_STATE), 3u);
    EXPECT_EQ(Fetch(4), 1403) << "stays at the end";
    EXPECT_EQ(Delivered(), "");
}

TEST_F(Fetching, WhatIsWrongWithTheCall) {
    OCIStmt* const fresh = New<OCIStmt>(OCI_HTYPE_STMT);
    EXPECT_EQ(Answer(OCIStmtFetch(fresh, err, 1, OCI_FETCH_NEXT, OCI_DEFAULT)), 24338);
    Open();
    EXPECT_EQ(Fetch(1, OCI_FETCH_FIRST), 24391);
    EXPECT_EQ(Fetch(1, 0x77), 24391);
    EXPECT_EQ(Answer(OCIStmtFetch2(stmt, err, 1, OCI_FETCH_NEXT, 0, 8)), 24300);
    EXPECT_EQ(Fetch(0), 0) << "gives the rest up";
    EXPECT_EQ(Fetch(), 1002);
    ASSERT_EQ(Execute(0), 0);
    ASSERT_EQ(Define(3, {ids_, 4, SQLT_INT}), 0);
    EXPECT_EQ(Fetch(), 1007);
    ASSERT_EQ(Prepare("select id from t"), 0);
    ASSERT_EQ(Execute(0), 0);
    EXPECT_EQ(Fetch(), 24374) << "no defines";
    ASSERT_EQ(Prepare("select * from missing"), 0);
    EXPECT_EQ(Execute(0), 942);
    EXPECT_EQ(Fetch(), 24374);
    MustRun("delete from t");
    EXPECT_EQ(Fetch(), 1002);
}

// The published table: rows are null or truncated, columns are whether indicators and return codes are given.
TEST_F(Fetching, NullsAndTruncation) {
    const struct { bool truncated, indicators, codes; sword rc; sb4 number; sb2 indicator; ub2 code; } cases[] = {
        {false, false, false, OCI_ERROR, 1405, 9, 9},
        {false, false, true, OCI_ERROR, 1405, 9, 1405},
        {false, true, false, OCI_SUCCESS, 0, -1, 9},
        {false, true, true, OCI_SUCCESS, 0, -1, 1405},
        {true, false, false, OCI_ERROR, 1406, 9, 9},
        {true, true, false, OCI_ERROR, 1406, 5, 9},
        {true, false, true, OCI_SUCCESS_WITH_INFO, 24345, 9, 1406},
        {true, true, true, OCI_SUCCESS_WITH_INFO, 24345, 5, 1406},
    };
    for (const auto& c : cases) {
        const std::string shown = std::string(c.truncated ? "truncated" : "null") + (c.indicators ? " indicator" : "") +
                                  (c.codes ? " code" : "");
        char text[4] = "";
        sb2 indicator = 9;
        ub2 code = 9;
        ASSERT_EQ(Prepare(std::string("select name from t where id = ") + (c.truncated ? "1" : "3")), 0);
        sb2* const indicators = c.indicators ? &indicator : nullptr;
        ub2* const codes = c.codes ? &code : nullptr;
        ASSERT_EQ(Define(1, {text, 4, SQLT_STR, indicators, nullptr, codes}), 0);
        const sword rc = OCIStmtExecute(svc, stmt, err, 1, 0, nullptr, nullptr, OCI_DEFAULT);
        EXPECT_EQ(rc, c.rc) << shown;
        EXPECT_EQ(Answer(rc), c.number) << shown;
        EXPECT_EQ(indicator, c.indicator) << shown;
        EXPECT_EQ(code, c.code) << shown;
        EXPECT_STREQ(text, c.truncated ? "row" : "") << shown;
    }
}

TEST_F(Fetching, LongTruncationHasNoLengthToShow) {
    char text[4];
    sb2 indicator = 0;
    ub2 code = 0;
    ASSERT_EQ(Prepare("select printf('%.*c', 40000, 'x') from dual"), 0);
    ASSERT_EQ(Define(1, {text, 4, SQLT_CHR, &indicator, nullptr, &code}), 0);
    EXPECT_EQ(Execute(1), 24345);
    EXPECT_EQ(indicator, -2);
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
        ASSERT_EQ(Prepare("select printf('%.*c', " + std::to_string(c.whole) + ", 'x') from dual"), 0);
        ASSERT_EQ(Define(1, {area.data(), c.room, SQLT_CHR, &indicator, &length, &code}), 0);
        EXPECT_EQ(Execute(1), c.answer) << c.whole << " in " << c.room;
        EXPECT_EQ(indicator, c.indicator) << c.whole << " in " << c.room;
        EXPECT_EQ(length, c.length) << c.whole << " in " << c.room;
    }
}

TEST_F(Fetching, BadRowInTheMiddle) {
    ASSERT_EQ(Prepare("select name from t order by id"), 0);
    ASSERT_EQ(Define(1, {names_, sizeof names_[0], SQLT_STR}), 0);
    ASSERT_EQ(Execute(0), 0);
    EXPECT_EQ(Fetch(5), 1405) << "the third row is null and there is no indicator";
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROWS_FETCHED), 2u);
    EXPECT_EQ(Fetch(5), 1403);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROWS_FETCHED), 4u);
    EXPECT_STREQ(names_[0], "row 4");
}

TEST_F(Fetching, ExecuteDeliversRowsFromTheOffset) {
    ASSERT_EQ(Prepare("select id from t order by id"), 0);
    ASSERT_EQ(Define(1, {ids_, 4, SQLT_INT}), 0);
    ASSERT_EQ(Execute(5, OCI_DEFAULT, 2), 0);
    EXPECT_EQ(ids_[1], 0);
    EXPECT_EQ(ids_[2], 1);
    EXPECT_EQ(ids_[4], 3);
    EXPECT_EQ(Fetch(2), 0);
    EXPECT_EQ(ids_[0], 4);
    EXPECT_EQ(Execute(10), 1403) << "fewer rows than asked for";
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROWS_FETCHED), 7u);
}

TEST_F(Fetching, ExactFetch) {
    const struct { ub4 rows; sword rc; sb4 number; sb4 fetch; ub4 state; } cases[] = {
        {7, OCI_SUCCESS, 0, 1002, 3}, {6, OCI_ERROR, 1422, 24374, 3}, {8, OCI_NO_DATA, 1403, 1002, 3}};
    ASSERT_EQ(Prepare("select id from t order by id"), 0);
    ASSERT_EQ(Define(1, {ids_, 4, SQLT_INT}), 0);
    for (const auto& c : cases) {
        const sword rc = OCIStmtExecute(svc, stmt, err, c.rows, 0, nullptr, nullptr, OCI_EXACT_FETCH);
        EXPECT_EQ(rc, c.rc) << c.rows;
        EXPECT_EQ(Answer(rc), c.number) << c.rows;
        EXPECT_EQ(Attribute<ub4>(OCI_ATTR_STMT_STATE), c.state) << c.rows;
        EXPECT_EQ(Fetch(), c.fetch) << c.rows;
    }
}

TEST_F(Fetching, Scrolling) {
    Open(OCI_STMT_SCROLLABLE_READONLY);
    const struct { ub4 rows; ub2 orientation; sb4 offset; sb4 answer; const char* delivered; ub4 position; } cases[] = {
        {2, OCI_FETCH_NEXT, 0, 0, "1,2", 2},
        {1, OCI_FETCH_CURRENT, 0, 0, "2", 2},
        {1, OCI_FETCH_LAST, 99, 0, "7", 7},
        {1, OCI_FETCH_NEXT, 0, 1403, "", 8},
        {1, OCI_FETCH_PRIOR, 0, 0, "7", 7},
        {2, OCI_FETCH_ABSOLUTE, 3, 0, "3,4", 4},
        {2, OCI_FETCH_RELATIVE, -2, 0, "2,3", 3},
        {1, OCI_FETCH_RELATIVE, -3, 1403, "", 0},
        {1, OCI_DEFAULT, 0, 0, "1", 1},
        {1, OCI_FETCH_PRIOR, 0, 1403, "", 0},
        {3, OCI_FETCH_FIRST, 5, 0, "1,2,3", 3},
        {4, OCI_FETCH_ABSOLUTE, 6, 1403, "6,7", 7},
        {1, OCI_FETCH_ABSOLUTE, 0, 1403, "", 0},
        {1, OCI_FETCH_ABSOLUTE, -1, 24389, "", 0},
        {1, OCI_FETCH_ABSOLUTE, 2000000000, 1403, "", 8},
        {1, 0x80, 0, 24391, "", 8},
    };
    for (std::size_t index = 0; index < std::size(cases); ++index) {
        const auto& c = cases[index];
        EXPECT_EQ(Fetch(c.rows, c.orientation, c.offset), c.answer) << index;
        EXPECT_EQ(Delivered(), c.delivered) << index;
        EXPECT_EQ(Attribute<ub4>(OCI_ATTR_CURRENT_POSITION), c.position) << index;
    }
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROW_COUNT), 7u);
    EXPECT_EQ(Fetch(1, OCI_FETCH_ABSOLUTE, 3), 0);
    EXPECT_EQ(indicators_[0], -1);
}

TEST_F(Fetching, ArrayOfStructures) {
    struct Row {
        sb8 id;
        char name[8];
        sb2 indicator;
        ub2 length, code;
    } rows[3] = {};
    ASSERT_EQ(Prepare("select id, name from t order by id"), 0);
    OCIDefine* id = nullptr;
    OCIDefine* name = nullptr;
    ASSERT_EQ(Answer(OCIDefineByPos(stmt, &id, err, 1, &rows[0].id, 8, SQLT_INT, nullptr, nullptr, nullptr,
                                    OCI_DEFAULT)), 0);
    ASSERT_EQ(Answer(OCIDefineByPos(stmt, &name, err, 2, rows[0].name, 8, SQLT_CHR, &rows[0].indicator, &rows[0].length,
                                    &rows[0].code, OCI_DEFAULT)), 0);
    ASSERT_EQ(Answer(OCIDefineArrayOfStruct(id, err, sizeof(Row), 0, 0, 0)), 0);
    ASSERT_EQ(Answer(OCIDefineArrayOfStruct(name, err, sizeof(Row), sizeof(Row), sizeof(Row), sizeof(Row))), 0);
    ASSERT_EQ(Execute(3), 0);
    EXPECT_EQ(rows[2].id, 3);
    EXPECT_EQ(rows[2].indicator, -1);
    EXPECT_EQ(std::string(rows[1].name, rows[1].length), "row 2");
}

TEST_F(Fetching, DefinesMayBeMadeAnewAndFreed) {
    Open();
    ASSERT_EQ(Fetch(1), 0);
    sb8 wide = 0;
    ASSERT_EQ(Define(1, {&wide, 8, SQLT_INT}), 0) << "another type between fetches";
    ASSERT_EQ(Fetch(1), 0);
    EXPECT_EQ(wide, 2);
    OCIDefine* define = nullptr;
    double real = 0;
    ASSERT_EQ(Answer(OCIDefineByPos(stmt, &define, err, 1, &real, 8, SQLT_FLT, nullptr, nullptr, nullptr, OCI_DEFAULT)),
              0);
    EXPECT_EQ(OCIHandleFree(define, OCI_HTYPE_DEFINE), OCI_SUCCESS);
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
        ASSERT_EQ(Define(cut_first ? 1 : 2, {text, 3, SQLT_STR, nullptr, nullptr, &code}), 0);
        ASSERT_EQ(Define(cut_first ? 2 : 1, {&small, 1, SQLT_INT}), 0);
        EXPECT_EQ(Execute(1), 1455) << cut_first;
        EXPECT_EQ(code, 1406) << "the other column is stored all the same";
    }
}

// The rows of a fetch behind one that failed count on, and the count is that of the rows reached.
TEST_F(Fetching, CountsAroundABadRow) {
    ASSERT_EQ(Prepare("select name from t order by id"), 0);
    ASSERT_EQ(Define(1, {names_, sizeof names_[0], SQLT_STR}), 0);
    ASSERT_EQ(Execute(0), 0);
    EXPECT_EQ(Fetch(2), 0);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROW_COUNT), 2u);
    EXPECT_EQ(Fetch(2), 1405);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROWS_FETCHED), 0u);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROW_COUNT), 3u);
    EXPECT_EQ(Fetch(2), 0);
    EXPECT_STREQ(names_[0], "row 4");
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROW_COUNT), 5u);
    EXPECT_EQ(Fetch(2), 0);
    EXPECT_EQ(Fetch(2), 1403);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROW_COUNT), 7u);
}

// ---- Pieces

class Pieces : public Fetching {
protected:
    struct Wanted {
        dvoid* handle = nullptr;
        ub4 type = 0;
        ub1 direction = 0;
        ub4 iteration = 9, index = 9;
        ub1 piece = 9;
    };
    Wanted Get() const {
        Wanted wanted;
        EXPECT_EQ(Answer(OCIStmtGetPieceInfo(stmt, err, &wanted.handle, &wanted.type, &wanted.direction,
                                             &wanted.iteration, &wanted.index, &wanted.piece)), 0);
        return wanted;
    }
    sb4 Set(const Wanted& wanted, void* buffer, ub4* length, ub1 piece, sb2* indicator, ub2* code = nullptr) const {
        return Answer(OCIStmtSetPieceInfo(wanted.handle, wanted.type, err, buffer, length, piece, indicator, code));
    }
};

// The cycle of a program that prints whole rows: one piece a column, the last fetch of a row answers 0.
TEST_F(Pieces, OneCycleARow) {
    ASSERT_EQ(Prepare("select id, name from t where id in (2, 3) order by id"), 0);
    ASSERT_EQ(Execute(0), 0);
    OCIDefine* defines[2] = {};
    for (ub4 column = 0; column < 2; ++column)
        ASSERT_EQ(Answer(OCIDefineByPos(stmt, &defines[column], err, column + 1, names_, 1, SQLT_STR, nullptr, nullptr,
                                        nullptr, OCI_DYNAMIC_FETCH)), 0);
    const char* expected[2][2] = {{"2", "row 2"}, {"3", nullptr}};
    for (const auto& row : expected) {
        ASSERT_EQ(OCIStmtFetch(stmt, err, 1, OCI_FETCH_NEXT, OCI_DEFAULT), OCI_NEED_DATA);
        for (ub4 column = 0; column < 2; ++column) {
            const Wanted wanted = Get();
            EXPECT_EQ(wanted.handle, defines[column]);
            EXPECT_EQ(wanted.type, ub4{OCI_HTYPE_DEFINE});
            EXPECT_EQ(wanted.direction, OCI_PARAM_OUT);
            char buffer[1000];
            ub4 length = sizeof buffer;
            sb2 indicator = 9;
            ub2 code = 9;
            ASSERT_EQ(Set(wanted, buffer, &length, wanted.piece, &indicator, &code), 0);
            const sword expected_rc = column == 0 ? OCI_NEED_DATA : OCI_SUCCESS;
            EXPECT_EQ(OCIStmtFetch(stmt, err, 1, OCI_FETCH_NEXT, OCI_DEFAULT), expected_rc);
            EXPECT_EQ(indicator, row[column] ? 0 : -1);
            EXPECT_EQ(code, row[column] ? 0 : 1405);
            EXPECT_EQ(std::string(buffer, length), row[column] ? row[column] : "");
        }
        EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROWS_FETCHED), 1u);
    }
    EXPECT_EQ(OCIStmtFetch(stmt, err, 1, OCI_FETCH_NEXT, OCI_DEFAULT), OCI_NO_DATA);
}

TEST_F(Pieces, LongValueComesInSeveral) {
    ASSERT_EQ(Prepare("select 'abcdefgh' from dual"), 0);
    ASSERT_EQ(Define(1, {nullptr, 1, SQLT_CHR}, OCI_DYNAMIC_FETCH), 0);
    ASSERT_EQ(Execute(0), 0);
    std::string whole;
    ub1 asked = OCI_ONE_PIECE;
    sword rc = OCIStmtFetch2(stmt, err, 1, OCI_FETCH_NEXT, 0, OCI_DEFAULT);
    while (rc == OCI_NEED_DATA && whole.size() < 20) {
        EXPECT_EQ(Fetch(), 3131) << "no buffer was given";
        const Wanted wanted = Get();
        EXPECT_EQ(wanted.piece, asked);
        char buffer[3];
        ub4 length = sizeof buffer;
        sb2 indicator = 0;
        EXPECT_EQ(Set(wanted, nullptr, &length, wanted.piece, &indicator), 24306);
        EXPECT_EQ(Set(wanted, buffer, nullptr, wanted.piece, &indicator), 24307);
        EXPECT_EQ(Set(wanted, buffer, &length, 7, &indicator), 24370);
        ASSERT_EQ(Set(wanted, buffer, &length, wanted.piece, &indicator), 0);
        rc = OCIStmtFetch2(stmt, err, 1, OCI_FETCH_NEXT, 0, OCI_DEFAULT);
        whole.append(buffer, length);
        asked = OCI_NEXT_PIECE;
    }
    EXPECT_EQ(rc, OCI_SUCCESS);
    EXPECT_EQ(whole, "abcdefgh");
}

TEST_F(Pieces, LastPieceEndsTheValue) {
    ASSERT_EQ(Prepare("select 'abcdefgh', 'x' from dual"), 0);
    ASSERT_EQ(Define(1, {nullptr, 1, SQLT_LNG}, OCI_DYNAMIC_FETCH), 0);
    char other[4] = "";
    ASSERT_EQ(Define(2, {other, 4, SQLT_STR}), 0);
    ASSERT_EQ(OCIStmtExecute(svc, stmt, err, 1, 0, nullptr, nullptr, OCI_DEFAULT), OCI_NEED_DATA);
    char buffer[3];
    ub4 length = sizeof buffer;
    sb2 indicator = 0;
    ub2 code = 0;
    ASSERT_EQ(Set(Get(), buffer, &length, OCI_LAST_PIECE, &indicator, &code), 0);
    EXPECT_EQ(Execute(1), 0) << "the execute that began goes on";
    EXPECT_EQ(std::string(buffer, length), "abc");
    EXPECT_EQ(indicator, 8);
    EXPECT_EQ(code, 1406);
    EXPECT_STREQ(other, "x");
}

TEST_F(Pieces, OnlySomeTypes) {
    char area[8];
    for (const ub2 type : {SQLT_INT, SQLT_FLT, SQLT_VNU, SQLT_DAT, SQLT_VCS, SQLT_CUR}) {
        ASSERT_EQ(Prepare("select :1 from dual"), 0);
        EXPECT_EQ(Define(1, {area, 8, type}, OCI_DYNAMIC_FETCH), 24304) << type;
        EXPECT_EQ(Bind(1, {area, 8, type}, OCI_DATA_AT_EXEC), 24304) << type;
    }
}

TEST_F(Pieces, ExecuteAsksForEachValueOfEachRow) {
    MustRun("create table u(a number, b varchar2(100), c raw(10))");
    ASSERT_EQ(Prepare("insert into u values(:1, :2, :3)"), 0);
    sb4 numbers[2] = {1, 2};
    ASSERT_EQ(Bind(1, {numbers, 4, SQLT_INT}), 0);
    ASSERT_EQ(Bind(2, {nullptr, 100, SQLT_CHR}, OCI_DATA_AT_EXEC), 0);
    ASSERT_EQ(Bind(3, {nullptr, 100, SQLT_BIN}, OCI_DATA_AT_EXEC), 0);
    const struct { ub4 iteration; const char* data; ub1 piece; ub1 asked; } steps[] = {
        {0, "first", OCI_FIRST_PIECE, OCI_ONE_PIECE}, {0, " and last", OCI_LAST_PIECE, OCI_NEXT_PIECE},
        {0, "\x01\x02", OCI_ONE_PIECE, OCI_ONE_PIECE}, {1, nullptr, OCI_ONE_PIECE, OCI_ONE_PIECE},
        {1, "\x03", OCI_ONE_PIECE, OCI_ONE_PIECE}};
    sword rc = OCIStmtExecute(svc, stmt, err, 2, 0, nullptr, nullptr, OCI_DEFAULT);
    for (const auto& step : steps) {
        ASSERT_EQ(rc, OCI_NEED_DATA);
        EXPECT_EQ(Fetch(), 3127) << "an execute is not finished";
        const Wanted wanted = Get();
        EXPECT_EQ(wanted.type, ub4{OCI_HTYPE_BIND});
        EXPECT_EQ(wanted.direction, OCI_PARAM_IN);
        EXPECT_EQ(wanted.iteration, step.iteration);
        EXPECT_EQ(wanted.piece, step.asked);
        sb2 indicator = step.data ? 0 : -1;
        ub4 length = step.data ? static_cast<ub4>(std::strlen(step.data)) : 0;
        ASSERT_EQ(Set(wanted, const_cast<char*>(step.data), &length, step.piece, &indicator), 0);
        rc = OCIStmtExecute(svc, stmt, err, 2, 0, nullptr, nullptr, OCI_DEFAULT);
    }
    EXPECT_EQ(rc, OCI_SUCCESS);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROW_COUNT), 2u);
    EXPECT_EQ(One("select group_concat(a || ':' || coalesce(b, '-') || ':' || hex(c), '/') from u"),
              "1:first and last:0102/2:-:03");
}

TEST_F(Pieces, NothingIsWanted) {
    Open();
    ub4 length = 1;
    char buffer[1];
    EXPECT_EQ(Answer(OCIStmtGetPieceInfo(stmt, err, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr)), 24370);
    OCIDefine* define = nullptr;
    ASSERT_EQ(Answer(OCIDefineByPos(stmt, &define, err, 1, ids_, 4, SQLT_INT, nullptr, nullptr, nullptr, OCI_DEFAULT)),
              0);
    EXPECT_EQ(Answer(OCIStmtSetPieceInfo(define, OCI_HTYPE_DEFINE, err, buffer, &length, 0, nullptr, nullptr)), 24370);
    EXPECT_EQ(OCIStmtSetPieceInfo(define, OCI_HTYPE_BIND, err, buffer, &length, 0, nullptr, nullptr),
              OCI_INVALID_HANDLE);
    EXPECT_EQ(OCIStmtSetPieceInfo(define, 99, err, buffer, &length, 0, nullptr, nullptr), OCI_INVALID_HANDLE);
}

// ---- Columns

TEST_F(Fetching, DescriptionOfTheSelectList) {
    MustRun("create table c(n number(10,2), i integer not null, v varchar2(20), f char(3), d date, r raw(16), b clob)");
    ASSERT_EQ(Prepare("select n, i, v as \"Mixed\", f, d, r, b from c"), 0);
    ASSERT_EQ(Execute(0, OCI_DESCRIBE_ONLY), 0);
    const struct { const char* name; ub2 type, size; sb2 precision; sb1 scale; ub1 nullable; } columns[] = {
        {"N", SQLT_NUM, 22, 10, 2, 1}, {"I", SQLT_NUM, 22, 38, 0, 0}, {"Mixed", SQLT_CHR, 20, 0, 0, 1},
        {"F", SQLT_AFC, 3, 0, 0, 1}, {"D", SQLT_DAT, 7, 0, 0, 1}, {"R", SQLT_BIN, 16, 0, 0, 1},
        {"B", SQLT_CLOB, 4000, 0, 0, 1}};
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_PARAM_COUNT), std::size(columns));
    for (ub4 position = 1; position <= std::size(columns); ++position) {
        const auto& column = columns[position - 1];
        dvoid* parameter = nullptr;
        ASSERT_EQ(Answer(OCIParamGet(stmt, OCI_HTYPE_STMT, err, &parameter, position)), 0);
        OraText* name = nullptr;
        ub4 length = 0;
        ASSERT_EQ(Answer(OCIAttrGet(parameter, OCI_DTYPE_PARAM, &name, &length, OCI_ATTR_NAME, err)), 0);
        EXPECT_EQ(std::string(reinterpret_cast<char*>(name), length), column.name);
        EXPECT_EQ(Attribute<ub2>(OCI_ATTR_DATA_TYPE, parameter, OCI_DTYPE_PARAM), column.type) << column.name;
        EXPECT_EQ(Attribute<ub2>(OCI_ATTR_DATA_SIZE, parameter, OCI_DTYPE_PARAM), column.size) << column.name;
        EXPECT_EQ(Attribute<sb2>(OCI_ATTR_PRECISION, parameter, OCI_DTYPE_PARAM), column.precision) << column.name;
        EXPECT_EQ(Attribute<sb1>(OCI_ATTR_SCALE, parameter, OCI_DTYPE_PARAM), column.scale) << column.name;
        EXPECT_EQ(Attribute<ub1>(OCI_ATTR_IS_NULL, parameter, OCI_DTYPE_PARAM), column.nullable) << column.name;
        dvoid* again = nullptr;
        ASSERT_EQ(Answer(OCIParamGet(stmt, OCI_HTYPE_STMT, err, &again, position)), 0);
        EXPECT_EQ(again, parameter) << "asking often leaves nothing behind";
        EXPECT_EQ(OCIDescriptorFree(parameter, OCI_DTYPE_PARAM), OCI_SUCCESS);
    }
    dvoid* none = nullptr;
    EXPECT_EQ(Answer(OCIParamGet(stmt, OCI_HTYPE_STMT, err, &none, 0)), 24334);
    EXPECT_EQ(Answer(OCIParamGet(stmt, OCI_HTYPE_STMT, err, &none, 8)), 24334);
}

}  // namespace
