// Values in pieces: what takes part in an operation that waits is freed, and the operation is given up.
#include "support/statement_fixture.h"

namespace {

class PieceByPiece : public StatementTest {
protected:
    sb4 AskedFor() const {
        dvoid* handle = nullptr;
        ub1 direction = 0, piece = 0;
        ub4 type = 0, iteration = 0, index = 0;
        return Answer(OCIStmtGetPieceInfo(stmt, err, &handle, &type, &direction, &iteration, &index, &piece));
    }
};

TEST_F(PieceByPiece, HandlesThatAreFreedMeanwhile) {
    ASSERT_EQ(Prepare("select 'abc' from dual"), 0);
    OCIDefine* define = nullptr;
    MUST(Define(&define, 1, InPieces(SQLT_CHR)), Execute(0));
    ASSERT_EQ(FetchCode(), OCI_NEED_DATA);
    ASSERT_EQ(OCIHandleFree(define, OCI_HTYPE_DEFINE), OCI_SUCCESS);
    EXPECT_EQ(AskedFor(), 24370);
    EXPECT_EQ(Fetch(), 24374);
    OCIBind* bind = nullptr;
    MUST(Prepare("select :1 from dual"), Bind(&bind, 1, InPieces(SQLT_CHR)));
    ASSERT_EQ(ExecuteCode(0), OCI_NEED_DATA);
    ASSERT_EQ(OCIHandleFree(bind, OCI_HTYPE_BIND), OCI_SUCCESS);
    EXPECT_EQ(Execute(0), 1008);
}

}  // namespace
