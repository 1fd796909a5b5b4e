// Values in pieces: what is told of each, where a character must not be torn, and what happens besides while a row
// waits.
#include "support/statement_fixture.h"

namespace {

class PieceByPiece : public StatementTest {
protected:
    explicit PieceByPiece(ub4 mode = OCI_DEFAULT) : StatementTest(mode) {}

    struct Wanted { dvoid* handle = nullptr; ub4 type = 0; };
    sb4 Get(Wanted& wanted) const {
        ub1 direction = 0, piece = 0;
        ub4 iteration = 0, index = 0;
        return Answer(OCIStmtGetPieceInfo(stmt, err, &wanted.handle, &wanted.type, &direction, &iteration, &index,
                                          &piece));
    }
    // Gives the place of the next piece.
    sb4 Set(const void* buffer, ub4* length, ub1 piece, sb2* indicator = nullptr, ub2* code = nullptr) const {
        Wanted wanted;
        const sb4 answer = Get(wanted);
        return answer != 0 ? answer : Answer(OCIStmtSetPieceInfo(wanted.handle, wanted.type, err, buffer, length, piece,
                                                                 indicator, code));
    }
    // One more piece of at most `room` bytes, and what the fetch that takes it answers.
    std::string Piece(ub4 room, sword& rc, ub1 piece = OCI_NEXT_PIECE, sb2* indicator = nullptr, ub2* code = nullptr) {
        std::string buffer(room + 1, '#');
        EXPECT_EQ(Set(buffer.data(), &room, piece, indicator, code), 0);
        rc = FetchCode();
        EXPECT_LE(room, buffer.size());
        return buffer.substr(0, room);
    }
    // A query whose first row waits for a piece.
    void Begin(const std::string& sql, std::initializer_list<Area> columns) {
        ASSERT_EQ(Query(sql, columns, 0), 0) << sql;
        ASSERT_EQ(FetchCode(), OCI_NEED_DATA) << sql;
    }
};

// Other statements of the session insert, select and commit while a row waits for its next piece: its bytes stay.
TEST_F(PieceByPiece, ARowThatWaitsKeepsItsBytes) {
    MustRun("create table t(id number, a varchar2(4000), b varchar2(4000), c varchar2(40))");
    for (const char* row : {"1, 'a", "2, 'x"}) {
        const char* const letter = row + 4;
        const std::string filled = "replace(hex(zeroblob(1000)), '0', '";
        MustRun("insert into t select " + std::string(row, 3) + filled + letter + "'), " + filled + "B" + letter +
                "'), 'plain" + letter + "' from dual");
    }
    char plain[20] = "";
    ASSERT_EQ(Query("select c, a, b from t order by id", {Text(plain), InPieces(SQLT_CHR), InPieces(SQLT_CHR)}, 0), 0);
    OCIStmt* const query = stmt;
    OCIStmt* const other = New<OCIStmt>(OCI_HTYPE_STMT);
    for (const char letter : {'a', 'x'}) {
        ASSERT_EQ(FetchCode(), OCI_NEED_DATA);
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

// What takes part in a waiting operation is freed: the operation is given up.
TEST_F(PieceByPiece, HandlesThatAreFreedMeanwhile) {
    ASSERT_EQ(Prepare("select 'abc' from dual"), 0);
    OCIDefine* define = nullptr;
    MUST(Define(&define, 1, InPieces(SQLT_CHR)), Execute(0));
    ASSERT_EQ(FetchCode(), OCI_NEED_DATA);
    ASSERT_EQ(OCIHandleFree(define, OCI_HTYPE_DEFINE), OCI_SUCCESS);
    Wanted wanted;
    EXPECT_EQ(Get(wanted), 24370);
    EXPECT_EQ(Fetch(), 24374);
    OCIBind* bind = nullptr;
    MUST(Prepare("select :1 from dual"), Bind(&bind, 1, InPieces(SQLT_CHR)));
    ASSERT_EQ(ExecuteCode(0), OCI_NEED_DATA);
    ASSERT_EQ(OCIHandleFree(bind, OCI_HTYPE_BIND), OCI_SUCCESS);
    EXPECT_EQ(Execute(0), 1008);
}

// The pieces of one value go out while the define of the next, which the application allocated, is freed: its turn never
// comes, and the row is taken without it.
TEST_F(PieceByPiece, ADefineFreedBeforeItsTurn) {
    ASSERT_EQ(Prepare("select 'abc', 'def' from dual union all select 'ghi', 'jkl' from dual"), 0);
    OCIDefine* first = nullptr;
    OCIDefine* second = New<OCIDefine>(OCI_HTYPE_DEFINE);
    MUST(Define(&first, 1, InPieces(SQLT_CHR)), Define(&second, 2, InPieces(SQLT_CHR)), Execute(0));
    ASSERT_EQ(FetchCode(), OCI_NEED_DATA);
    sword rc = 0;
    EXPECT_EQ(Piece(2, rc), "ab");
    EXPECT_EQ(Piece(2, rc), "c");
    EXPECT_EQ(rc, OCI_NEED_DATA);
    EXPECT_EQ(Piece(2, rc), "de");    // through a handle that no statement made
    EXPECT_EQ(Piece(2, rc), "f");
    EXPECT_EQ(rc, OCI_SUCCESS);
    ASSERT_EQ(FetchCode(), OCI_NEED_DATA);
    EXPECT_EQ(Piece(2, rc), "gh");
    ASSERT_EQ(OCIHandleFree(second, OCI_HTYPE_DEFINE), OCI_SUCCESS);
    EXPECT_EQ(Piece(2, rc), "i");
    EXPECT_EQ(rc, OCI_SUCCESS);
    EXPECT_EQ(FetchCode(), OCI_NO_DATA);
}

class Utf16Pieces : public PieceByPiece {
protected:
    Utf16Pieces() : PieceByPiece(OCI_UTF16) {}
};

// Two zero bytes close a terminated piece; neither a unit nor a pair of them is torn.
TEST_F(Utf16Pieces, EndBetweenCharacters) {
    using std::string_view;
    const std::string pair = std::string("'a' || ") + (OnServer() ? "chr" : "char") + "(128512) || 'b'";
    const struct { std::string value; ub2 type; ub4 room; std::u16string_view first; string_view closed; } cases[] = {
        {"'ab'", SQLT_STR, 4, u"a", string_view("\0\0", 2)}, {"'ab'", SQLT_STR, 5, u"a", string_view("\0\0", 2)},
        {"'ab'", SQLT_CHR, 3, u"a", "#"}, {pair, SQLT_CHR, 4, u"a", "#"},
        {pair, SQLT_CHR, 6, u"a\U0001F600", "#"}};
    for (const auto& c : cases) {
        Begin(std::string("select ") + c.value + " from dual", {InPieces(c.type)});
        std::string buffer(10, '#');
        ub4 length = c.room;
        ASSERT_EQ(Set(buffer.data(), &length, OCI_NEXT_PIECE), 0);
        EXPECT_EQ(FetchCode(), OCI_NEED_DATA) << c.value;
        const std::string_view first(reinterpret_cast<const char*>(c.first.data()), c.first.size() * 2);
        EXPECT_EQ(buffer.substr(0, length), first) << c.value << " in " << c.room;
        EXPECT_EQ(buffer.substr(length, c.closed.size()), c.closed) << c.value << " in " << c.room;
    }
}

}  // namespace
