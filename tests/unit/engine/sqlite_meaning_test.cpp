// What SQL text means on the embedded engine, as an application sees it: values compared and stored where SQLite alone
// would take texts as they stand, what expressions are described as, what definitions say, what is refused.
#include <algorithm>
#include <functional>

#include "support/statement_fixture.h"

namespace {

class SqliteMeaning : public StatementTest {
protected:
    // All rows of a query: columns with ',', nulls as '-', rows with ';' behind them; "!" and a number for an error.
    // `bound` is the value of every placeholder.
    std::string Rows(std::string_view sql, const char* bound = nullptr) {
        if (const sb4 error = PrepareBound(sql, bound); error != 0) return "!" + std::to_string(error);
        if (const sb4 error = Execute(0); error != 0) return "!" + std::to_string(error);
        char text[4][200];
        sb2 indicators[4] = {};
        const ub4 columns = Attribute<ub4>(OCI_ATTR_PARAM_COUNT);
        for (ub4 column = 0; column < columns; ++column)
            EXPECT_EQ(Define(column + 1, {text[column], sizeof text[column], SQLT_STR, &indicators[column]}), 0);
        std::string rows;
        for (;;) {
            const sb4 error = Fetch();
            if (error == 1403) return rows;
            if (error != 0) return rows + "!" + std::to_string(error);
            for (ub4 column = 0; column < columns; ++column)
                rows.append(column ? "," : "").append(indicators[column] == -1 ? "-" : text[column]);
            rows += ';';
        }
    }
    // The number of the error, 0 for none.
    sb4 RunBound(std::string_view sql, const char* bound = nullptr) {
        const sb4 error = PrepareBound(sql, bound);
        return error != 0 ? error : Execute();
    }
    sb4 PrepareBound(std::string_view sql, const char* bound) {
        sb4 error = Prepare(sql);
        for (ub4 position = 1; bound && error == 0 && position <= Attribute<ub4>(OCI_ATTR_BIND_COUNT); ++position)
            error = Bind(position, {const_cast<char*>(bound), static_cast<sb4>(std::strlen(bound)), SQLT_CHR});
        return error;
    }
    static std::string With(std::string_view sql, const std::string& value) {
        std::string text(sql);
        for (std::size_t at; (at = text.find('%')) != std::string::npos;) text.replace(at, 1, value);
        return text;
    }
    void MakeTables() {
        MustRun("create table t(id integer, d date, c char(5), n number, r raw(2), v varchar2(9))");
        MustRun("create table u(id integer, e timestamp, d varchar2(20), c varchar2(9), n number)");
        MustRun("insert into t values(1, '03-FEB-24', 'ab', 5, '0A', 'x ')");
        MustRun("insert into t values(2, '01-DEC-99', 'abc', 10, '0B', 'x')");
        MustRun("insert into u values(1, '03-FEB-24 10.00.00 AM', '03-FEB-24', 'ab   ', 1)");
    }
};

// The same condition with its text as a literal and through a placeholder; rows are ids of t.
TEST_F(SqliteMeaning, TextsAreComparedAsTheColumnsValues) {
    MakeTables();
    const struct { const char* sql; const char* text; const char* rows; } cases[] = {
        {"select id from t where (d) = %", "03-FEB-24", "1;"},
        {"select id from t where ((t.d)) = (%)", "03-FEB-24", "1;"},
        {"select id from t where d = ( ( % ) ) or (1 = 0)", "03-FEB-24", "1;"},
        {"select id from t where not (d) = %", "03-FEB-24", "2;"},
        {"select id from t where % between d and d", "03-FEB-24", "1;"},
        {"select id from t where d between '01-JAN-24' and %", "31-DEC-24", "1;"},
        {"select id from t where % in (d, d)", "03-FEB-24", "1;"},
        {"select id from t where (id, d) = (1, %)", "03-FEB-24", "1;"},
        {"select id from t where trunc(d) = %", "03-FEB-24", "1;"},
        {"select id from t where last_day(d) > %", "28-FEB-24", "1;"},
        {"select id from t where % < add_months(d, 1)", "01-MAR-24", "1;"},
        {"select id from t where nvl(t.d, sysdate) = %", "03-FEB-24", "1;"},
        {"select id from t group by id having max(d) > %", "01-JAN-24", "1;"},
        {"select id from t where sysdate > % and id = 1", "01-JAN-24", "1;"},
        {"select id from t where d > % || '-24'", "01-JAN", "1;"},
        {"select id from t where d > case when id = 1 then % end", "01-JAN-24", "1;"},
        {"select id from t where case d when % then 1 end = 1", "03-FEB-24", "1;"},
        {"select case when d = % then 'x' else 'y' end as s from t", "03-FEB-24", "x;y;"},
        {"select (select count(*) from t where d = %) as n from dual", "03-FEB-24", "1;"},
        {"with x as (select id, d from t where d > %) select id from x", "01-JAN-24", "1;"},
        {"with x as (select id, d from t) select id from x where d > %", "01-JAN-24", "1;"},
        {"select id from (select id, d from t) x where x.d > %", "01-JAN-24", "1;"},
        {"select id from t where d = % union all select id from u where d = '03-FEB-24'", "03-FEB-24", "1;1;"},
        {"select id from t where d = % and exists (select 1 from u where d = '03-FEB-24')", "03-FEB-24", "1;"},
        {"select t.id from t, u where t.d = % and u.d = '03-FEB-24'", "03-FEB-24", "1;"},
        {"select t.id from t join u x on t.d = % where x.d = '03-FEB-24'", "03-FEB-24", "1;"},
        {"select id from t where c = % or c = 'it''s'", "ab ", "1;"},
        {"select id from t where c in (select c from t where c = %)", "ab ", "1;"},
        {"select id from t where v = %", "x", "2;"},
        {"select id from u where c = %", "ab", ""},
        {"select id from t where r = %", "0a", "1;"},
        {"select id from t where r = x'0A' and v > %", "a", "1;"},
        {"select id from t where n = %", "5.0", "1;"},
        {"select id from t where d > %", "today", "!1858"},
        {"select id from t where d = sysdate - length(%)", "x", "!932"},
        {"select id from t where d = 5 and v > %", "a", "!932"},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(Rows(With(c.sql, '\'' + std::string(c.text) + '\'')), c.rows) << c.sql;
        EXPECT_EQ(Rows(With(c.sql, ":x"), c.text), c.rows) << "bound: " << c.sql;
    }
}

// A condition means in a change or definition what it means in a query.
TEST_F(SqliteMeaning, ChangesFindTheRowsThatAQueryFinds) {
    MakeTables();
    const struct { const char* condition; const char* text; const char* id; } conditions[] = {
        {"d = %", "03-FEB-24", "1;"}, {"(d) = %", "03-FEB-24", "1;"}, {"c = %", "ab   ", "1;"},
        {"trunc(d) between '01-JAN-24' and %", "31-DEC-24", "1;"}, {"c in ('q', %)", "abc  ", "2;"}};
    const char* changes[] = {
        "insert into w(id) select id from t where ",
        "insert into w(id, d) select id, d from t where ",
        "insert into w(id, c) select id, c from t where id > 0 and ",
        "insert into w(id, d) with x as (select * from t) select id, d from x where ",
        "with x as (select * from t) insert into w(id, d) select id, d from x where ",
        "update w set id = (select id from t where t.d is not null and ",
    };
    for (const auto& c : conditions) {
        for (const std::string change : changes) {
            for (const bool bound : {false, true}) {
                const bool updates = change[0] == 'u';
                MustRun("create table w(id integer, d date, c char(9))");
                if (updates) MustRun("insert into w(id) values(9)");
                const std::string sql = With(change + c.condition, bound ? ":x" : '\'' + std::string(c.text) + '\'');
                EXPECT_EQ(RunBound(updates ? sql + ")" : sql, bound ? c.text : nullptr), 0) << sql;
                EXPECT_EQ(Rows("select id from w"), c.id) << sql;
                MustRun("drop table w");
            }
        }
        const std::string literal = With(c.condition, '\'' + std::string(c.text) + '\'');
        MustRun("create table w as select id from t where " + literal);
        MustRun("create view y as select id from t where " + literal);
        EXPECT_EQ(Rows("select id from w"), c.id) << literal;
        EXPECT_EQ(Rows("select id from y"), c.id) << literal;
        MustRun("drop table w");
        MustRun("drop view y");
    }
    EXPECT_EQ(Rows("select count(*) as n from sqlite_schema where sql like '%kelp_compare%'"), "0;");
    MustRun("delete from t where d = '03-FEB-24'");
    EXPECT_EQ(Rows("select id from t"), "2;");
}

TEST_F(SqliteMeaning, WhatCannotBeComparedRightlyIsRefused) {
    MakeTables();
    const struct { const char* sql; int number; } cases[] = {
        {"select id from t where c = 'ab' = c", 933},
        {"select id from t where id < 2 = 1", 933},
        {"insert into u(id) select id from t where d = '01-JAN-24' = c", 933},
        {"select id from t natural join u where d = '03-FEB-24'", 932},
        {"create view y as select id from t where d > 'today'", 1858},
    };
    for (const auto& c : cases) EXPECT_EQ(Run(c.sql), c.number) << c.sql;
    for (const char* right : {"select id from t where id = 1 and (n = 5) or n = 6",
                              "select case when id = 1 then 1 else 2 end from t where id = 1",
                              "select id from t where id = case id when 1 then 1 end order by id",
                              "select t.id from t join u on t.id = u.id where t.id = 1",
                              "select id from t where id = 1 group by id having count(*) = 1"})
        EXPECT_EQ(Rows(right), "1;") << right;
}

TEST_F(SqliteMeaning, ExpressionsKeepTheNamesThatTheyWereGiven) {
    MakeTables();
    ASSERT_EQ(Prepare("select case when d = '03-FEB-24' then 1 end, c = 'ab ', id from t"), 0);
    ASSERT_EQ(Execute(0), 0);
    const char* names[] = {"CASE WHEN D = '03-FEB-24' THEN 1 END", "C = 'ab '", "ID"};
    for (ub4 position = 1; position <= std::size(names); ++position) {
        dvoid* parameter = nullptr;
        ASSERT_EQ(OCIParamGet(stmt, OCI_HTYPE_STMT, err, &parameter, position), OCI_SUCCESS);
        OraText* name = nullptr;
        ub4 length = 0;
        ASSERT_EQ(OCIAttrGet(parameter, OCI_DTYPE_PARAM, &name, &length, OCI_ATTR_NAME, err), OCI_SUCCESS);
        EXPECT_EQ(std::string(reinterpret_cast<char*>(name), length), names[position - 1]);
        OCIDescriptorFree(parameter, OCI_DTYPE_PARAM);
    }
}

// Ways to store a value that are no plain values and no plain set.
TEST_F(SqliteMeaning, ValuesAreMadeToFitWhereverTheyAreStored) {
    const struct { const char* sql; const char* rows; } cases[] = {
        {"insert into w as x values(1, '03-FEB-24', 'ab')", "1,03-FEB-24,ab   ;"},
        {"insert into w as x(id, d) values(1, '03-FEB-24')", "1,03-FEB-24,-;"},
        {"insert into w select 1, '03-FEB-24', 'ab   '", "1,03-FEB-24,ab   ;"},
        {"insert into w select 1, '03-FEB-24', 'ab' returning id into :x", "1,03-FEB-24,ab   ;"},
        {"with s as (select '03-FEB-24' as d) insert into w(id, d) select 1, d from s", "1,03-FEB-24,-;"},
        {"insert into w values(0, null, 'q') on conflict(id) do update set d = '03-FEB-24', c = 'ab'",
         "0,03-FEB-24,ab   ;"},
        {"insert into w select 0, null, 'q' where 1 = 1 on conflict(id) do update set d = '03-FEB-24'",
         "0,03-FEB-24,-;"},
        {"update w set (d, c) = ('03-FEB-24', 'ab')", "0,03-FEB-24,ab   ;"},
        {"update w set (d, c) = (select '03-FEB-24', 'ab   ')", "0,03-FEB-24,ab   ;"},
        {"update w set d = (select '03-FEB-24')", "0,03-FEB-24,-;"},
        {"insert into w values(1, '30-FEB-24', 'ab')", "!1839"},
        {"with s as (select 'abcdef' as c) insert into w(id, c) select 1, c from s", "!12899"},
        {"update w set (d, c) = (select 'x', null)", "!1858"},
    };
    for (const auto& c : cases) {
        MustRun("create table w(id integer primary key, d date, c char(5))");
        const std::string sql = c.sql;
        const bool inserts = sql.find("insert") != std::string::npos && sql.find("conflict") == std::string::npos;
        if (!inserts) MustRun("insert into w(id) values(0)");
        char id[10] = "";
        sb4 error = Prepare(sql);
        if (error == 0 && sql.find(":x") != std::string::npos) error = Bind(1, {id, sizeof id, SQLT_STR});
        if (error == 0) error = Execute();
        EXPECT_EQ(error == 0 ? Rows("select id, d, c from w") : "!" + std::to_string(error), c.rows) << sql;
        MustRun("drop table w");
    }
}

}  // namespace
