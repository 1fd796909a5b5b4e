// What SQL text means on the embedded engine where transcripts cannot see it: statements of any length, objects of rows
// that are replaced.
#include "support/statement_fixture.h"

namespace {

class SqliteMeaning : public StatementTest {};

// Lists without end, and subqueries that double with each level.
TEST_F(SqliteMeaning, LongStatementsTakeBoundedTime) {
    MustRun("create table t(id integer, d date)", "insert into t values(1, '03-FEB-24')", "insert into t values(2, '01-DEC-99')");
    std::string list = "select id from t where d in ('03-FEB-24'";
    for (int element = 0; element < 20000; ++element) list += ", '03-FEB-24'";
    EXPECT_EQ(One(list + ")"), "1");
    std::string doubled = "with x0 as (select d from t)";
    for (int level = 1; level < 11; ++level)
        doubled += ", x" + std::to_string(level) + " as (select * from x" + std::to_string(level - 1) + " a, x" +
                   std::to_string(level - 1) + " b where 1 = 0)";
    EXPECT_EQ(One(doubled + " select count(*) as n from x10 where d = '03-FEB-24'"), "0");
}

// The object of the row that took another's place is in the table; that of the other is gone.
TEST_F(SqliteMeaning, ReplacedRowsReturnTheirObjects) {
    MustRun("create table l(k integer primary key, c clob)", "insert into l values(1, 'old')", "commit");
    auto* lob = NewDescriptor<OCILobLocator>(OCI_DTYPE_LOB);
    auto* old = NewDescriptor<OCILobLocator>(OCI_DTYPE_LOB);
    char data[] = "w";
    const auto write = [&](OCILobLocator* to) {
        ub4 amount = 1;
        return Answer(OCILobWrite(svc, err, to, &amount, 3, data, 1, OCI_ONE_PIECE, nullptr, nullptr, 0, 0));
    };
    for (const char* sql : {"insert or replace into l values(1, 'nee') returning c into :1",
                            "replace into l values(1, 'nee') returning c into :1",
                            "update or replace l set c = 'nee' where k = 1 returning c into :1"}) {
        MUST(Query("select c from l for update", {{&old, -1, SQLT_CLOB}}), write(old));
        MUST(Ready(sql, {{&lob, -1, SQLT_CLOB}}), Execute(), write(lob));
        EXPECT_EQ(One("select c from l"), "new") << sql;
        EXPECT_EQ(write(old), sql[0] == 'u' ? 0 : 22922) << sql;
    }
}

}  // namespace
