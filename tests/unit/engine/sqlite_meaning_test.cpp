// How long SQL text on the embedded engine may take: statements of any length.
#include "support/statement_fixture.h"

namespace {

class SqliteMeaning : public StatementTest {};

// Lists without end; subqueries that double with each level, which are too many to find what is compared.
TEST_F(SqliteMeaning, LongStatementsTakeBoundedTime) {
    MustRun("create table t(id integer, d date)", "insert into t values(1, '03-FEB-24')", "insert into t values(2, '01-DEC-99')");
    std::string list = "select id from t where d in ('03-FEB-24'";
    for (int element = 0; element < 20000; ++element) list += ", '03-FEB-24'";
    EXPECT_EQ(One(list + ")"), "1");
    std::string doubled = "with x0 as (select d from t)";
    for (int level = 1; level < 11; ++level)
        doubled += ", x" + std::to_string(level) + " as (select * from x" + std::to_string(level - 1) + " a, x" +
                   std::to_string(level - 1) + " b where 1 = 0)";
    EXPECT_EQ(One(doubled + " select count(*) as n from x10 where d = '03-FEB-24'"), "!932");
}

}  // namespace
