// Values in pieces: what is told of each, where a character must not be torn, and what happens besides while a row
// waits.
#include "support/statement_fixture.h"

namespace {

class PieceByPiece : public StatementTest {
protected:
    explicit PieceByPiece(ub4 mode = OCI_DEFAULT) : StatementTest(mode) {}

    // Gives the place of the next piece.
    sb4 Set(void* buffer, ub4* length, ub1 piece, sb2* indicator = nullptr, ub2* code = nullptr) const {
        dvoid* handle = nullptr;
        ub4 type = 0;
        sb4 answer = Answer(OCIStmtGetPieceInfo(stmt, err, &handle, &type, nullptr, nullptr, nullptr, nullptr));
        if (answer != 0) return answer;
        return Answer(OCIStmtSetPieceInfo(handle, type, err, buffer, length, piece, indicator, code));
    }
    // One more piece of at most `room` bytes, and what the fetch that takes it answers.
    std::string Piece(ub4 room, sword& rc, ub1 piece = OCI_NEXT_PIECE, sb2* indicator = nullptr, ub2* code = nullptr) {
        std::string buffer(room + 1, '#');
        EXPECT_EQ(Set(buffer.data(), &room, piece, indicator, code), 0);
        rc = OCIStmtFetch(stmt, err, 1, OCI_FETCH_NEXT, OCI_DEFAULT);
        EXPECT_LE(room, buffer.size());
        return buffer.substr(0, room);
    }
    sword FetchOne() const { return OCIStmtFetch(stmt, err, 1, OCI_FETCH_NEXT, OCI_DEFAULT); }
};

// Other statements of the session insert, select and commit while a row waits for its next piece: its bytes stay.
TEST_F(PieceByPiece, ARowThatWaitsKeepsItsBytes) {
    MustRun("create table t(id number, a varchar2(4000), b varchar2(4000), c varchar2(40))");
    for (const char* row : {"1, 'a", "2, 'x"}) {
        const char* const letter = row + 4;
        MustRun("insert into t select " + std::string(row, 3) + "replace(hex(zeroblob(1000)), '0', '" + letter + "'), " +
                "replace(hex(zeroblob(1000)), '0', 'B" + letter + "'), 'plain" + std::string(letter) + "' from dual");
    }
    char plain[20] = "";
    ASSERT_EQ(Prepare("select c, a, b from t order by id"), 0);
    ASSERT_EQ(Define(1, {plain, sizeof plain, SQLT_STR}), 0);
    ASSERT_EQ(Define(2, {nullptr, 4000, SQLT_CHR}, OCI_DYNAMIC_FETCH), 0);
    ASSERT_EQ(Define(3, {nullptr, 4000, SQLT_CHR}, OCI_DYNAMIC_FETCH), 0);
    ASSERT_EQ(Execute(0), 0);
    OCIStmt* const query = stmt;
    OCIStmt* const other = New<OCIStmt>(OCI_HTYPE_STMT);
    for (const char letter : {'a', 'x'}) {
        ASSERT_EQ(FetchOne(), OCI_NEED_DATA);
        EXPECT_EQ(plain, std::string("plain") + letter);
        std::string values[2];
        for (std::string& value : values) {
            for (sword rc = OCI_NEED_DATA; rc == OCI_NEED_DATA && value.size() < (&value == values ? 2000u : 4000u);) {
                stmt = other;
                MustRun("insert into t values(9, 'other', 'other', 'other')");
                EXPECT_EQ(One("select count(*) from t where a = 'zzz'"), "0");
                MustRun("commit");
                stmt = query;
                value += Piece(700, rc);
                ASSERT_TRUE(rc == OCI_NEED_DATA || rc == OCI_SUCCESS) << rc;
            }
        }
        std::string pairs;
        for (int pair = 0; pair < 2000; ++pair) pairs += std::string("B") + letter;
        EXPECT_EQ(values[0], std::string(2000, letter));
        EXPECT_EQ(values[1], pairs);
    }
}

// A value is cut by LAST: the indicator tells its whole length as long as it can.
TEST_F(PieceByPiece, WhatIsToldOfAValueThatIsCut) {
    const struct { int whole; sb2 indicator; } cases[] = {{4, 4}, {32766, 32766}, {32767, 32767}, {32768, -2}};
    for (const auto& c : cases) {
        ASSERT_EQ(Prepare("select printf('%.*c', " + std::to_string(c.whole) + ", 'x') from dual"), 0);
        ASSERT_EQ(Define(1, {nullptr, 1, SQLT_CHR}, OCI_DYNAMIC_FETCH), 0);
        ASSERT_EQ(Execute(0), 0);
        ASSERT_EQ(FetchOne(), OCI_NEED_DATA);
        sb2 indicator = 9;
        ub2 code = 9;
        sword rc = 0;
        EXPECT_EQ(Piece(3, rc, OCI_LAST_PIECE, &indicator, &code), "xxx") << c.whole;
        EXPECT_EQ(rc, OCI_SUCCESS);
        EXPECT_EQ(indicator, c.indicator) << c.whole;
        EXPECT_EQ(code, 1406) << c.whole;
    }
}

// Where SetPieceInfo gives no indicator or code, those of the define are told; the rest of the row follows.
TEST_F(PieceByPiece, NullsAreToldThroughTheDefine) {
    MustRun("create table t(id number, a varchar2(10), b varchar2(10))");
    MustRun("insert into t values(1, null, 'one')");
    MustRun("insert into t values(2, 'a', null)");
    sb2 a = 9, b = 9;
    ub2 a_code = 9, b_code = 9;
    ASSERT_EQ(Prepare("select a, b from t order by id"), 0);
    ASSERT_EQ(Define(1, {nullptr, 10, SQLT_CHR, &a, nullptr, &a_code}, OCI_DYNAMIC_FETCH), 0);
    ASSERT_EQ(Define(2, {nullptr, 10, SQLT_CHR, &b, nullptr, &b_code}, OCI_DYNAMIC_FETCH), 0);
    ASSERT_EQ(Execute(0), 0);
    const struct { const char *a, *b; sb2 a_indicator, b_indicator; } rows[] = {{"", "one", -1, 0}, {"a", "", 0, -1}};
    for (const auto& row : rows) {
        ASSERT_EQ(FetchOne(), OCI_NEED_DATA);
        sword rc = 0;
        EXPECT_EQ(Piece(10, rc), row.a);
        EXPECT_EQ(rc, OCI_NEED_DATA) << "the rest of the row is not lost";
        EXPECT_EQ(a, row.a_indicator);
        EXPECT_EQ(a_code, row.a_indicator == 0 ? 0 : 1405);
        EXPECT_EQ(Piece(10, rc), row.b);
        EXPECT_EQ(rc, OCI_SUCCESS);
        EXPECT_EQ(b, row.b_indicator);
        EXPECT_EQ(b_code, row.b_indicator == 0 ? 0 : 1405);
    }
    ASSERT_EQ(Define(1, {nullptr, 10, SQLT_CHR}, OCI_DYNAMIC_FETCH), 0);
    ASSERT_EQ(Execute(0), 0);
    ASSERT_EQ(FetchOne(), OCI_NEED_DATA);
    sword rc = 0;
    EXPECT_EQ(Piece(10, rc), "");
    EXPECT_EQ(Answer(rc), 1405) << "there is no indicator at all";
}

// A buffer that takes no character is refused with 24307, and the value stays whole for the next.
// Rows that an execute delivers go into the elements from its offset on, whether values come in pieces or not.
TEST_F(PieceByPiece, AnExecuteDeliversFromItsOffset) {
    ASSERT_EQ(Prepare("select 7, 'ab' from dual union all select 8, 'cd' from dual"), 0);
    sb4 numbers[3] = {-1, -1, -1};
    ASSERT_EQ(Define(1, {numbers, sizeof numbers[0], SQLT_INT}), 0);
    ASSERT_EQ(Define(2, {nullptr, 10, SQLT_CHR}, OCI_DYNAMIC_FETCH), 0);
    const auto execute = [&] { return OCIStmtExecute(svc, stmt, err, 3, 1, nullptr, nullptr, OCI_DEFAULT); };
    EXPECT_EQ(execute(), OCI_NEED_DATA);
    for (ub4 element = 1; element < 3; ++element) {
        ub4 iteration = 0, length = 10;
        char value[10];
        ASSERT_EQ(Answer(OCIStmtGetPieceInfo(stmt, err, nullptr, nullptr, nullptr, &iteration, nullptr, nullptr)), 0);
        EXPECT_EQ(iteration, element);
        ASSERT_EQ(Set(value, &length, OCI_ONE_PIECE), 0);
        EXPECT_EQ(execute(), element == 1 ? OCI_NEED_DATA : OCI_SUCCESS);
        EXPECT_EQ(std::string(value, length), element == 1 ? "ab" : "cd");
    }
    EXPECT_EQ(numbers[0], -1);
    EXPECT_EQ(numbers[1], 7);
    EXPECT_EQ(numbers[2], 8);
}

TEST_F(PieceByPiece, BuffersThatAreTooSmall) {
    const struct { const char* value; ub2 type; ub4 too_small; ub4 enough; const char* first; } cases[] = {
        {"\xc3\xa4z", SQLT_CHR, 1, 2, "\xc3\xa4"},
        {"\xe2\x82\xacz", SQLT_CHR, 2, 3, "\xe2\x82\xac"},
        {"a\xe2\x82\xacz", SQLT_CHR, 0, 3, "a"},
        {"az", SQLT_STR, 0, 2, "a"},
        {"az", SQLT_STR, 1, 2, "a"},
        {"\xc3\xa4z", SQLT_STR, 2, 3, "\xc3\xa4"},
    };
    for (const auto& c : cases) {
        ASSERT_EQ(Prepare("select '" + std::string(c.value) + "' from dual"), 0);
        ASSERT_EQ(Define(1, {nullptr, 10, c.type}, OCI_DYNAMIC_FETCH), 0);
        ASSERT_EQ(Execute(0), 0);
        ASSERT_EQ(FetchOne(), OCI_NEED_DATA);
        char buffer[8] = "";
        ub4 length = c.too_small;
        sb2 indicator = 0;
        ASSERT_EQ(Set(buffer, &length, OCI_NEXT_PIECE, &indicator), 0);
        EXPECT_EQ(Fetch(), 24307) << c.value << " in " << c.too_small;
        EXPECT_EQ(Fetch(), 3131) << "and a buffer is wanted still";
        sword rc = 0;
        EXPECT_EQ(Piece(c.enough, rc), c.first) << c.value << " in " << c.enough;
        ASSERT_EQ(rc, OCI_NEED_DATA) << c.value;
        const std::string rest = std::string(c.value).substr(std::strlen(c.first));
        EXPECT_EQ(Piece(8, rc), rest);
        EXPECT_EQ(rc, OCI_SUCCESS);
    }
}

// The null of one row is not that of the next; text of a terminated type ends at its zero, other text does not.
TEST_F(PieceByPiece, ValuesGoInAsTheyAre) {
    MustRun("create table t(a varchar2(10), b raw(10))");
    ASSERT_EQ(Prepare("insert into t values(:1, :2)"), 0);
    ASSERT_EQ(Bind(1, {nullptr, 10, SQLT_STR}, OCI_DATA_AT_EXEC), 0);
    ASSERT_EQ(Bind(2, {nullptr, 10, SQLT_BIN}, OCI_DATA_AT_EXEC), 0);
    char zero_inside[] = {'a', 'b', 0, 'c'};
    sword rc = OCIStmtExecute(svc, stmt, err, 2, 0, nullptr, nullptr, OCI_DEFAULT);
    for (const sb2 given : {-1, 0}) {
        for (int column = 0; column < 2; ++column) {
            ASSERT_EQ(rc, OCI_NEED_DATA);
            sb2 indicator = given;
            ub4 length = 4;
            ASSERT_EQ(Set(zero_inside, &length, OCI_ONE_PIECE, &indicator), 0);
            rc = OCIStmtExecute(svc, stmt, err, 2, 0, nullptr, nullptr, OCI_DEFAULT);
        }
    }
    ASSERT_EQ(rc, OCI_SUCCESS);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROW_COUNT), 2u);
    EXPECT_EQ(One("select group_concat(coalesce(a, '-') || ':' || coalesce(hex(b), '-'), '/') from t"),
              "-:/ab:61620063");
}

// Of an execute in pieces that stops, the rows before are done and counted.
TEST_F(PieceByPiece, ARowThatFails) {
    MustRun("create table t(a varchar2(10) primary key)");
    ASSERT_EQ(Prepare("insert into t values(:1)"), 0);
    ASSERT_EQ(Bind(1, {nullptr, 10, SQLT_CHR}, OCI_DATA_AT_EXEC), 0);
    sword rc = OCIStmtExecute(svc, stmt, err, 3, 0, nullptr, nullptr, OCI_DEFAULT);
    for (const char* value : {"x", "x"}) {
        ASSERT_EQ(rc, OCI_NEED_DATA);
        ub4 length = 1;
        ASSERT_EQ(Set(const_cast<char*>(value), &length, OCI_ONE_PIECE), 0);
        rc = OCIStmtExecute(svc, stmt, err, 3, 0, nullptr, nullptr, OCI_DEFAULT);
    }
    EXPECT_EQ(Answer(rc), 1);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_ROW_COUNT), 1u);
    EXPECT_EQ(Attribute<ub4>(OCI_ATTR_DML_ROW_OFFSET, err, OCI_HTYPE_ERROR), 1u);
    EXPECT_EQ(One("select count(*) from t"), "1");
}

// What takes part in a waiting operation is freed: the operation is given up.
TEST_F(PieceByPiece, HandlesThatAreFreedMeanwhile) {
    ASSERT_EQ(Prepare("select 'abc' from dual"), 0);
    OCIDefine* define = nullptr;
    ASSERT_EQ(Answer(OCIDefineByPos(stmt, &define, err, 1, nullptr, 9, SQLT_CHR, nullptr, nullptr, nullptr,
                                    OCI_DYNAMIC_FETCH)), 0);
    ASSERT_EQ(Execute(0), 0);
    ASSERT_EQ(FetchOne(), OCI_NEED_DATA);
    ASSERT_EQ(OCIHandleFree(define, OCI_HTYPE_DEFINE), OCI_SUCCESS);
    EXPECT_EQ(Answer(OCIStmtGetPieceInfo(stmt, err, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr)), 24370);
    EXPECT_EQ(Fetch(), 24374);
    ASSERT_EQ(Prepare("select :1 from dual"), 0);
    OCIBind* bind = nullptr;
    ASSERT_EQ(Answer(OCIBindByPos(stmt, &bind, err, 1, nullptr, 9, SQLT_CHR, nullptr, nullptr, nullptr, 0, nullptr,
                                  OCI_DATA_AT_EXEC)), 0);
    ASSERT_EQ(OCIStmtExecute(svc, stmt, err, 0, 0, nullptr, nullptr, OCI_DEFAULT), OCI_NEED_DATA);
    ASSERT_EQ(OCIHandleFree(bind, OCI_HTYPE_BIND), OCI_SUCCESS);
    EXPECT_EQ(Execute(0), 1008);
}

class Utf16Pieces : public PieceByPiece {
protected:
    Utf16Pieces() : PieceByPiece(OCI_UTF16) {}
};

// Two zero bytes close a terminated piece; neither a unit nor a pair of them is torn.
TEST_F(Utf16Pieces, EndBetweenCharacters) {
    const struct { const char* value; ub2 type; ub4 room; std::u16string_view first; std::string_view closed; } cases[] = {
        {"'ab'", SQLT_STR, 4, u"a", std::string_view("\0\0", 2)},
        {"'ab'", SQLT_STR, 5, u"a", std::string_view("\0\0", 2)},
        {"'ab'", SQLT_CHR, 3, u"a", "#"},
        {"'a' || cast(x'F09F9880' as text) || 'b'", SQLT_CHR, 4, u"a", "#"},
        {"'a' || cast(x'F09F9880' as text) || 'b'", SQLT_CHR, 6, u"a\U0001F600", "#"},
    };
    for (const auto& c : cases) {
        ASSERT_EQ(Prepare(std::string("select ") + c.value + " from dual"), 0);
        ASSERT_EQ(Define(1, {nullptr, 10, c.type}, OCI_DYNAMIC_FETCH), 0);
        ASSERT_EQ(Execute(0), 0);
        ASSERT_EQ(FetchOne(), OCI_NEED_DATA);
        std::string buffer(10, '#');
        ub4 length = c.room;
        ASSERT_EQ(Set(buffer.data(), &length, OCI_NEXT_PIECE), 0);
        EXPECT_EQ(FetchOne(), OCI_NEED_DATA) << c.value;
        const std::string_view first(reinterpret_cast<const char*>(c.first.data()), c.first.size() * 2);
        EXPECT_EQ(buffer.substr(0, length), first) << c.value << " in " << c.room;
        EXPECT_EQ(buffer.substr(length, c.closed.size()), c.closed) << c.value << " in " << c.room;
    }
}

}  // namespace
