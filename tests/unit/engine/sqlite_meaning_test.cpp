// How long SQL text on the embedded engine may take: statements of any length.
#include "support/statement_fixture.h"

namespace {

class SqliteMeaning : public StatementTest {};

// Lists without end.
TEST_F(SqliteMeaning, LongStatementsTakeBoundedTime) {
    MustRun("create table t(id integer, d date)", "insert into t values(1, '03-FEB-24')", "insert into t values(2, '01-DEC-99')");
    std::string list = "select id from t where d in ('03-FEB-24'";
    for (int element = 0; element < 20000; ++element) list += ", '03-FEB-24'";
    EXPECT_EQ(One(list + ")"), "1");
}

}  // namespace
